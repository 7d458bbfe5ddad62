// The example provider on a machine of the test's own, served by the embedded broker in a process that stays
// in the "C" locale, as many CIM servers' do.
#include "HostProvider.h"
#include "AssetTag.h"
#include "EmbeddedBroker.h"
#include "FailingMemory.h"
#include "HVLogger.h"
#include "HostTime.h"
#include "Keys.h"

#include <atomic>
#include <clocale>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <iterator>
#include <set>
#include <sstream>
#include <sys/resource.h>
#include <thread>
#include <unistd.h>

using oxahv::AssociationFilter;
using oxahv::KeyMode;
using oxahv::Reply;
using oxahv::Request;

namespace {

const char* const systemPath =
    "root/cimv2:OXATK_ComputerSystem.CreationClassName=\"OXATK_ComputerSystem\",Name=\"machine\"";
const char* const osPath =
    "root/cimv2:OXATK_OperatingSystem.CSCreationClassName=\"OXATK_ComputerSystem\",CSName=\"machine\","
    "CreationClassName=\"OXATK_OperatingSystem\",Name=\"Prüf-OS \\\\ 1 €\"";
const char* const portPath =
    "root/cimv2:OXATK_EthernetPort.SystemCreationClassName=\"OXATK_ComputerSystem\","
    "SystemName=\"machine\",CreationClassName=\"OXATK_EthernetPort\",DeviceID=\"eth0\"";
const char* const sensorPath =
    "root/cimv2:OXATK_NumericSensor.SystemCreationClassName=\"OXATK_ComputerSystem\","
    "SystemName=\"machine\",CreationClassName=\"OXATK_NumericSensor\",SensorNumber=";
const char* const detailsPath = "root/cimv2:OXATK_AssetIDDetails.InstanceID=\"OXATK:AssetIDDetails:machine\"";

class TheHostProvider : public testing::Test {
public:
    TheHostProvider() {
        std::setlocale(LC_MESSAGES, "C"); // whatever the environment's language: texts are compared
        write("/proc/sys/kernel/hostname", "machine");
        write("/proc/sys/kernel/osrelease", "6.1.0-test");
        write("/proc/stat", "cpu 1 2\nbtime 1700000000\nprocesses 1");
        write("/proc/loadavg", "0.25 1.50 2 1/80 11206");
        write("/proc/1/stat", "");
        write("/proc/22/stat", "");
        write("/proc/meminfo", "MemTotal:       16 kB\nMemFree:        8 kB\nSwapTotal:      x kB\n");
        write("/etc/os-release", "NAME=\"Test\"\nPRETTY_NAME=\"Prüf-OS \\ 1 €\"\n");
        writePort("eth0", "1", "up", "1000", "full");
        write("/sys/class/net/eth0/addr_assign_type", "0");
        write("/sys/class/net/eth0/ifalias", "Büro ☂");
        write("/sys/class/net/eth0/device/power/wakeup", "enabled");
        writePort("eth1", "1", "down", "-1", "unknown");
        writePort("lo", "772", "unknown", "", "");
        ::setenv("TZ", "XST-5:30", 1);
        ::tzset();
        setHostRoot(root_);
        broker_.setContextEntry("OXAHostStateFile", stateFile_);
        host(broker_);
    }
    ~TheHostProvider() override {
        setHostRoot("");
        ::unsetenv("TZ");
        std::filesystem::remove_all(root_);
    }

    static void host(oxahv::EmbeddedBroker& broker) {
        broker.host("OXAHostProvider",
                    {OXAHostProvider_Create_InstanceMI, OXAHostProvider_Create_AssociationMI,
                     OXAHostProvider_Create_MethodMI});
    }

    static void compileClasses(oxahv::EmbeddedBroker& broker) {
        broker.compileMof(MOF_FOLDER "/CIMSuperclasses.mof");
        broker.compileMof(MOF_FOLDER "/OXAHost.mof");
    }

    void write(const std::string& path, const std::string& content) {
        std::filesystem::create_directories(std::filesystem::path(root_ + path).parent_path());
        std::ofstream(root_ + path) << content << '\n';
    }

    void writePort(const std::string& name, const std::string& type, const std::string& state,
                   const std::string& speed, const std::string& duplex) {
        const std::string folder = "/sys/class/net/" + name + '/';
        write(folder + "type", type);
        write(folder + "operstate", state);
        write(folder + "speed", speed);
        write(folder + "duplex", duplex);
        write(folder + "mtu", "1500");
        write(folder + "address", "02:00:00:00:00:0a");
    }

    CMPIObjectPath* path(const std::string& text) { return request_.objectPathFromText(text, "root/cimv2"); }

    // The properties of an instance that are not NULL, as texts; but the present time without its digits.
    static std::string textOf(const CMPIInstance* instance) {
        std::string text;
        for (CMPICount i = 0; i < CMGetPropertyCount(instance, nullptr); ++i) {
            CMPIString* name = nullptr;
            const CMPIData data = CMGetPropertyAt(instance, i, &name, nullptr);
            if (!CMIsNullValue(data)) {
                text += std::string(CMGetCharsPtr(name, nullptr)) + '=' + oxahv::valueText(data) + ' ';
            }
        }
        const std::string present = "LocalDateTime=\"";
        if (const std::size_t found = text.find(present); found != std::string::npos) {
            text.replace(found + present.size(), sizeof "20261231235959.000000" - 1, "now");
        }
        return text;
    }

    // What a reply holds, or its code.
    static std::string textOf(const Reply& reply) {
        std::string text = reply.ok() ? "" : oxahv::codeName(reply.code);
        for (const CMPIInstance* const instance : reply.instances) {
            text += textOf(instance);
        }
        for (const CMPIObjectPath* const objectPath : reply.objectPaths) {
            text += oxahv::pathText(objectPath) + ' ';
        }
        return text;
    }

    CMPIArgs* tagArguments(const std::string& tag) {
        CMPIArgs* const in = CMNewArgs(broker_.handle(), nullptr);
        CMPIValue value = {};
        value.string = CMNewString(broker_.handle(), tag.c_str(), nullptr);
        CMAddArg(in, "Tag", &value, CMPI_string);
        return in;
    }

    Reply setTag(Request& request, const std::string& tag, const char* method = "SetAssetTag") {
        return request.invokeMethod(request.objectPathFromText(systemPath, ""), method, tagArguments(tag));
    }

    // The method's return value, or the code that the request failed with.
    std::string setTag(const std::string& tag) {
        const Reply reply = setTag(request_, tag);
        return reply.ok() ? std::to_string(reply.data.at(0).value.uint32) : oxahv::codeName(reply.code);
    }

    std::string details() {
        const std::string text = textOf(request_.getInstance(path(detailsPath)));
        return text.substr(text.find("AssetTagChanges"));
    }

    std::string stateFileContent() const {
        std::stringstream content;
        content << std::ifstream(stateFile_).rdbuf();
        return content.str();
    }

    const std::string root_ = testing::TempDir() + "oxahv-host-" + std::to_string(::getpid());
    const std::string stateFile_ = root_ + "/var/lib/asset.properties";
    oxahv::EmbeddedBroker broker_;
    Request request_{broker_};
};

} // namespace

TEST_F(TheHostProvider, ShowsTheMachine) {
    const Reply names = request_.enumerateInstanceNames(path("OXATK_EthernetPort"));
    ASSERT_EQ(names.objectPaths.size(), 2U);
    EXPECT_EQ(oxahv::pathText(names.objectPaths[0]), portPath);
    EXPECT_TRUE(names.done);

    const Reply ports = request_.enumerateInstances(path("oxatk_ethernetport"));
    ASSERT_EQ(ports.instances.size(), 2U);
    EXPECT_EQ(
        textOf(ports.instances[0]),
        "SystemCreationClassName=\"OXATK_ComputerSystem\" SystemName=\"machine\" "
        "CreationClassName=\"OXATK_EthernetPort\" DeviceID=\"eth0\" Name=\"eth0\" ElementName=\"Ethernet "
        "port eth0\" EnabledState=2 OperationalStatus={2} StatusDescriptions={\"up\"} LinkTechnology=2 "
        "NetworkAddresses={\"02000000000a\"} PermanentAddress=\"02000000000a\" Capabilities={3} "
        "OtherIdentifyingInfo={\"Büro ☂\"} IdentifyingDescriptions={\"Alias\"} Speed=1000000000 "
        "FullDuplex=TRUE ActiveMaximumTransmissionUnit=1500 ");
    const std::string down = textOf(ports.instances[1]);
    EXPECT_NE(down.find("OperationalStatus={10} StatusDescriptions={\"down\"}"), std::string::npos);
    for (const char* const unknown : {"Speed", "FullDuplex", "PermanentAddress", "Capabilities", "OtherId"}) {
        EXPECT_EQ(down.find(unknown), std::string::npos) << "what is not known stays NULL";
    }

    EXPECT_EQ(textOf(request_.enumerateInstances(path("OXATK_OperatingSystem"))),
              "CSCreationClassName=\"OXATK_ComputerSystem\" CSName=\"machine\" "
              "CreationClassName=\"OXATK_OperatingSystem\" Name=\"Prüf-OS \\\\ 1 €\" "
              "ElementName=\"Operating system machine\" Caption=\"Prüf-OS \\\\ 1 €\" OSType=36 "
              "Version=\"6.1.0-test\" EnabledState=2 OperationalStatus={2} StatusDescriptions={\"running\"} "
              "LastBootUpTime=\"20231115031320.000000+300\" LocalDateTime=\"now+300\" CurrentTimeZone=330 "
              "Distributed=FALSE NumberOfProcesses=2 TotalVisibleMemorySize=16 FreePhysicalMemory=8 ");
    EXPECT_EQ(request_.enumerateInstances(path("OXATK_ComputerSystem")).instances.size(), 1U);
}

TEST_F(TheHostProvider, GetsTheInstanceThatIsNamed) {
    for (const KeyMode mode : {KeyMode::exact, KeyMode::untyped}) {
        broker_.setKeyMode(mode);
        for (const std::string& text : {std::string(systemPath), std::string(osPath), std::string(portPath),
                                        std::string(detailsPath), sensorPath + std::string("5")}) {
            const Reply reply = request_.getInstance(path(text));
            ASSERT_EQ(reply.instances.size(), 1U) << text << reply.message;
            EXPECT_EQ(oxahv::pathText(CMGetObjectPath(reply.instances[0], nullptr)), text);
        }
    }
    const std::vector<std::string> wanted = {"speed"};
    EXPECT_EQ(CMGetPropertyCount(request_.getInstance(path(portPath), &wanted).instances.at(0), nullptr), 5U);
}

TEST_F(TheHostProvider, ReadsNumberKeysOfEveryUnsignedWidth) {
    const auto reading = [&](unsigned long long number, CMPIType type) {
        CMPIObjectPath* const sensor = path(std::string(sensorPath) + "5");
        CMPIValue value = {};
        value.uint64 = number;
        CMAddKey(sensor, "SensorNumber", &value, type);
        const Reply reply = request_.getInstance(sensor);
        return reply.ok() ? oxahv::valueText(CMGetProperty(reply.instances.at(0), "Reading", nullptr))
                          : oxahv::codeName(reply.code);
    };
    for (const KeyMode mode : {KeyMode::exact, KeyMode::untyped}) {
        broker_.setKeyMode(mode);
        for (const CMPIType type :
             {CMPIType{CMPI_uint8}, CMPIType{CMPI_uint16}, CMPIType{CMPI_uint32}, CMPIType{CMPI_uint64}}) {
            EXPECT_EQ(reading(1, type), "0.25");
            EXPECT_EQ(reading(15, type), "2.0");
            EXPECT_EQ(reading(2, type), "CMPI_RC_ERR_NOT_FOUND");
        }
        EXPECT_EQ(reading(65536 + 5, CMPI_uint32), "CMPI_RC_ERR_NOT_FOUND") << "not cut to 16 bits";
        EXPECT_EQ(reading(5, CMPI_sint64), "CMPI_RC_ERR_INVALID_PARAMETER") << "no moniker holds a sign";
    }
    TK::Moniker keys;
    keys.addKey("Wide", 65536ULL);
    keys.addKey("Blank", static_cast<unsigned char>(32));
    keys.addKey("Text", "7");
    EXPECT_EQ(keyNumber<unsigned short>(keys, "wide"), std::nullopt);
    EXPECT_EQ(keyNumber<unsigned int>(keys, "wide"), 65536U);
    EXPECT_EQ(keyNumber<unsigned int>(keys, "Blank"), std::nullopt) << "a moniker cannot read it back";
    EXPECT_EQ(keyNumber<unsigned int>(keys, "Text"), std::nullopt);
    EXPECT_EQ(keyText(keys, "Wide"), std::nullopt);
}

TEST_F(TheHostProvider, LeavesTheServersLocaleAsItIs) {
    const std::string before = std::setlocale(LC_ALL, nullptr);
    ASSERT_EQ(::uselocale(nullptr), LC_GLOBAL_LOCALE);
    broker_.setKeyMode(KeyMode::untyped);
    EXPECT_NE(textOf(request_.getInstance(path(osPath))).find("Caption=\"Prüf-OS \\\\ 1 €\""),
              std::string::npos);
    EXPECT_EQ(::uselocale(nullptr), LC_GLOBAL_LOCALE);
    EXPECT_FALSE(request_.getInstance(path("OXATK_Fan")).ok());
    EXPECT_EQ(::uselocale(nullptr), LC_GLOBAL_LOCALE);

    const locale_t own = ::newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr);
    ::uselocale(own);
    EXPECT_EQ(setTag("ä"), "0");
    EXPECT_EQ(::uselocale(LC_GLOBAL_LOCALE), own);
    ::freelocale(own);
    EXPECT_EQ(std::setlocale(LC_ALL, nullptr), before);
}

TEST_F(TheHostProvider, LeadsFromOneSideOfTheAssociationToTheOther) {
    const struct {
        const char* source;
        AssociationFilter filter; // association class, result class, role, result role
        const char* target;       // null: nothing
    } cases[] = {
        {systemPath, {}, osPath},
        {osPath, {}, systemPath},
        {osPath, {"oxatk_runningos", "OXATK_ComputerSystem", "antecedent", "DEPENDENT"}, systemPath},
        {osPath, {"CIM_Dependency", "CIM_System", "", ""}, systemPath},
        {osPath, {"", "OXATK_OperatingSystem", "", ""}, nullptr},
        {osPath, {"OXATK_InstalledOS", "", "", ""}, nullptr},
        {osPath, {"", "", "Dependent", ""}, nullptr},
        {osPath, {"", "", "", "Antecedent"}, nullptr},
        {systemPath, {"", "", "Dependent", "Antecedent"}, osPath},
        {portPath, {}, nullptr},
    };
    compileClasses(broker_);
    for (const auto& c : cases) {
        SCOPED_TRACE(c.source + c.filter.associationClass + c.filter.resultClass + c.filter.role);
        const Reply names = request_.associatorNames(path(c.source), c.filter);
        EXPECT_EQ(textOf(names), c.target != nullptr ? c.target + std::string(" ") : "");
        EXPECT_TRUE(names.done);
        const Reply instances = request_.associators(path(c.source), c.filter);
        ASSERT_EQ(instances.instances.size(), names.objectPaths.size());
        if (c.target != nullptr) {
            EXPECT_EQ(textOf(instances), textOf(request_.getInstance(path(c.target))));
        }
        const AssociationFilter filter = {"", c.filter.associationClass, c.filter.role, ""};
        const bool refers =
            c.target != nullptr || !c.filter.resultClass.empty() || !c.filter.resultRole.empty();
        EXPECT_EQ(request_.references(path(c.source), filter).instances.size(), refers ? 1U : 0U);
        EXPECT_EQ(request_.referenceNames(path(c.source), filter).objectPaths.size(), refers ? 1U : 0U);
    }
    const std::vector<std::string> wanted = {"Dependent", "NameFormat"};
    EXPECT_EQ(textOf(request_.associators(path(osPath), {}, &wanted)),
              "Name=\"machine\" CreationClassName=\"OXATK_ComputerSystem\" NameFormat=\"HostName\" ");

    std::string other = systemPath;
    other.replace(other.rfind("machine"), 7, "others");
    EXPECT_EQ(request_.associators(path(other)).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(request_.referenceNames(path(other)).code, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(TheHostProvider, ServesTheAssociationsInstance) {
    const Reply names = request_.enumerateInstanceNames(path("OXATK_RunningOS"));
    ASSERT_EQ(names.objectPaths.size(), 1U);
    const Reply instance = request_.getInstance(names.objectPaths[0]);
    ASSERT_EQ(instance.instances.size(), 1U) << instance.message;
    EXPECT_EQ(textOf(instance), textOf(request_.enumerateInstances(path("OXATK_RunningOS"))));
    const CMPIData dependent = CMGetProperty(instance.instances[0], "Dependent", nullptr);
    EXPECT_EQ(dependent.type, CMPI_ref);
    EXPECT_EQ(oxahv::pathText(dependent.value.ref), systemPath);

    CMPIObjectPath* const swapped = path("OXATK_RunningOS");
    for (const auto& [role, end] : {std::pair("Antecedent", systemPath), std::pair("Dependent", osPath)}) {
        CMPIValue value = {};
        value.ref = path(end);
        CMAddKey(swapped, role, &value, CMPI_ref);
    }
    EXPECT_EQ(request_.getInstance(swapped).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(request_.getInstance(path("OXATK_RunningOS.Antecedent=\"x\"")).message,
              "key Antecedent is no reference");
}

TEST_F(TheHostProvider, StoresAcceptableAssetTagsAlone) {
    EXPECT_EQ(details(), "AssetTagChanges=0 ");
    EXPECT_EQ(setTag("Prüfstand 7 = €"), "0");
    EXPECT_EQ(details().rfind("AssetTagChanges=1 AssetTag=\"Prüfstand 7 = €\" AssetTagDate=\"2", 0), 0U);
    const std::string stored = stateFileContent();
    EXPECT_NE(stored.find("Prüfstand"), std::string::npos);
    const std::string longest(64, 'x');
    for (const std::string& refused :
         {std::string(""), longest + 'x', std::string("<b>"), std::string("a:b"), std::string("C\\D"),
          std::string("WWW.x"), std::string("a\nb"), std::string("\xff"), std::string("50%")}) {
        EXPECT_EQ(setTag(refused), "5") << refused;
        EXPECT_EQ(stateFileContent(), stored);
    }
    std::string umlauts; // counted in characters
    for (int i = 0; i < 64; ++i) {
        umlauts += "ä";
    }
    EXPECT_EQ(setTag(umlauts), "0");
    EXPECT_EQ(details().rfind("AssetTagChanges=2 AssetTag=\"" + umlauts + "\" ", 0), 0U);
}

TEST_F(TheHostProvider, AnswersMethodsThatItCannotRunWithACode) {
    EXPECT_EQ(setTag(request_, "x", "Reboot").code, CMPI_RC_ERR_METHOD_NOT_FOUND);
    EXPECT_TRUE(setTag(request_, "x", "setassettag").ok());
    CMPIObjectPath* const system = path(systemPath);
    EXPECT_EQ(request_.invokeMethod(system, "SetAssetTag", nullptr).code, CMPI_RC_ERR_INVALID_PARAMETER);
    CMPIArgs* const number = CMNewArgs(broker_.handle(), nullptr);
    CMPIValue value = {};
    value.uint64 = 5;
    CMAddArg(number, "Tag", &value, CMPI_uint64);
    EXPECT_EQ(request_.invokeMethod(system, "SetAssetTag", number).message, "The asset tag is missing.");
    EXPECT_EQ(request_.invokeMethod(path(portPath), "SetAssetTag", number).code,
              CMPI_RC_ERR_METHOD_NOT_FOUND);
    EXPECT_EQ(request_.invokeMethod(path("OXATK_ComputerSystem"), "SetAssetTag", number).code,
              CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(TheHostProvider, KeepsTheAssetTagWhenANewOneCannotBeSaved) {
    ASSERT_EQ(setTag("first"), "0");
    const std::string stored = stateFileContent();
    // No file may grow, as on a full disk.
    rlimit unlimited = {};
    ::getrlimit(RLIMIT_FSIZE, &unlimited);
    rlimit none = {0, unlimited.rlim_max};
    ::signal(SIGXFSZ, SIG_IGN);
    ::setrlimit(RLIMIT_FSIZE, &none);
    const Reply reply = setTag(request_, "second");
    ::setrlimit(RLIMIT_FSIZE, &unlimited);
    EXPECT_EQ(reply.code, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(reply.message.rfind("The asset tag could not be saved. ", 0), 0U) << reply.message;
    EXPECT_EQ(stateFileContent(), stored);
    EXPECT_EQ(details().rfind("AssetTagChanges=1 AssetTag=\"first\" ", 0), 0U);
    EXPECT_EQ(setTag("third"), "0");
    EXPECT_EQ(details().rfind("AssetTagChanges=2 AssetTag=\"third\" ", 0), 0U);
}

TEST_F(TheHostProvider, WritesDatesAsTheSameInstant) {
    const struct {
        const char* zone;
        const char* text; // of 1700000000, 22:13:20 in UTC
    } cases[] = {
        {"UTC0", "20231114221320.000000+000"},     {"XST-1", "20231114231320.000000+060"},
        {"XST-5:45", "20231115031320.000000+300"}, {"XST3:30", "20231114191320.000000-180"},
        {"XST0:30", "20231114221320.000000+000"},  {"XST11", "20231114111320.000000-660"},
    };
    for (const auto& c : cases) {
        ::setenv("TZ", c.zone, 1);
        ::tzset();
        EXPECT_EQ(cimText(localTime(1700000000)), c.text) << c.zone;
    }
}

TEST_F(TheHostProvider, ServesWhatItsMofDeclares) {
    const char* const classes[] = {"OXATK_ComputerSystem", "OXATK_OperatingSystem", "OXATK_EthernetPort",
                                   "OXATK_NumericSensor",  "OXATK_AssetIDDetails",  "OXATK_RunningOS"};
    ASSERT_EQ(setTag("tag"), "0");
    // A property that a class lacks, or that has another type there, would be dropped.
    const auto sorted = [](const std::string& text) {
        std::istringstream words(text);
        std::multiset<std::string> properties{std::istream_iterator<std::string>(words), {}};
        return properties;
    };
    std::vector<std::multiset<std::string>> undeclared;
    for (const char* const className : classes) {
        undeclared.push_back(sorted(textOf(request_.enumerateInstances(path(className)))));
    }
    compileClasses(broker_);
    for (std::size_t i = 0; i < std::size(classes); ++i) {
        const Reply reply = request_.enumerateInstances(path(classes[i]));
        EXPECT_EQ(sorted(textOf(reply)), undeclared[i]) << reply.message;
    }
    EXPECT_EQ(setTag("another"), "0");
}

TEST_F(TheHostProvider, AnswersEveryOtherRequestWithItsCode) {
    std::string other = portPath;
    other.replace(other.rfind("eth0"), 4, "eth9");
    EXPECT_EQ(request_.getInstance(path(other)).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(request_.getInstance(path("OXATK_EthernetPort.DeviceID=\"eth0\"")).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(request_.getInstance(path("OXATK_Fan")).code, CMPI_RC_ERR_INVALID_CLASS);
    broker_.setKeyMode(KeyMode::chars);
    EXPECT_EQ(request_.getInstance(path(portPath)).code, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(request_.getInstance(path(portPath)).message, "Moniker component for data type not available.");

    const CMPIObjectPath* const port = path(portPath);
    const CMPIInstance* const instance = CMNewInstance(broker_.handle(), port, nullptr);
    EXPECT_EQ(request_.createInstance(port, instance).code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(request_.modifyInstance(port, instance).code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(request_.deleteInstance(port).code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(request_.execQuery(port, "select", "WQL").code, CMPI_RC_ERR_NOT_SUPPORTED);

    oxahv::EmbeddedBroker faulty;
    faulty.setContextEntry("OXAHostStateFile", "x");
    faulty.injectFault("CMPIContextFT.getEntry", {CMPI_RC_OK, true});
    EXPECT_THROW(host(faulty), oxahv::BrokerError);
}

TEST_F(TheHostProvider, AnswersWithACodeWhateverFailsBelowIt) {
    const oxahv::LiveObjects before = broker_.liveObjects();
    const struct {
        const char* path;
        Reply (*send)(Request& request, const CMPIObjectPath* path, const CMPIArgs* in);
    } operations[] = {
        {portPath, [](auto& request, auto* port, auto*) { return request.getInstance(port); }},
        {"OXATK_NumericSensor",
         [](auto& request, auto* sensor, auto*) { return request.enumerateInstances(sensor); }},
        {"OXATK_OperatingSystem",
         [](auto& request, auto* system, auto*) { return request.enumerateInstances(system); }},
        {"OXATK_RunningOS",
         [](auto& request, auto* association, auto*) { return request.enumerateInstanceNames(association); }},
        {detailsPath, [](auto& request, auto* asset, auto*) { return request.getInstance(asset); }},
        {osPath,
         [](auto& request, auto* system, auto*) {
             return request.associators(system, {"OXATK_RunningOS", "OXATK_ComputerSystem", "", ""});
         }},
        {systemPath, [](auto& request, auto* system, auto*) { return request.references(system); }},
        {systemPath, [](auto& request, auto* system,
                        auto* in) { return request.invokeMethod(system, "SetAssetTag", in); }},
    };
    unsigned int points = 0;
    for (const auto& operation : operations) {
        SCOPED_TRACE(operation.path);
        std::string shown;
        // The code that the operation answers, between `prepare` and `finish`.
        const auto sendWith = [&](const auto& prepare, const auto& finish) {
            Request request(broker_);
            const CMPIObjectPath* const target = request.objectPathFromText(operation.path, "root/cimv2");
            const CMPIArgs* const in = tagArguments("tag");
            prepare();
            try {
                const Reply reply = operation.send(request, target, in);
                finish();
                shown = textOf(reply);
                EXPECT_NE(reply.message.rfind("exception", 0), 0U) << reply.message;
                return reply.code;
            } catch (const std::bad_alloc&) {
                finish();
                return CMPI_RC_ERROR_SYSTEM; // the broker itself had no room for the reply
            }
        };
        // One call of a slot fails that the provider makes.
        std::size_t calls = 0;
        const auto sendWithFault = [&](const oxahv::Fault* fault) {
            return sendWith(
                [&] {
                    if (fault != nullptr) {
                        broker_.injectFault("*", *fault);
                    }
                    broker_.startRecording();
                },
                [&] {
                    calls = broker_.stopRecording().size();
                    broker_.clearFaults();
                });
        };
        unsigned int failures = 0;
        EXPECT_EQ(sendWithFault(nullptr), CMPI_RC_OK);
        EXPECT_GT(calls, 10U);
        const std::string whole = shown;
        for (const oxahv::Fault& kind : {oxahv::Fault{CMPI_RC_ERR_FAILED}, oxahv::Fault{CMPI_RC_OK, true},
                                         oxahv::Fault{CMPI_RC_OK, false, CMPI_nullValue},
                                         oxahv::Fault{CMPI_RC_OK, false, CMPI_badValue}}) {
            bool isReached = true;
            for (oxahv::Fault fault = kind; isReached; ++fault.firstCall) {
                failures += sendWithFault(&fault) != CMPI_RC_OK ? 1U : 0U;
                isReached = calls >= fault.firstCall;
                points += isReached ? 1U : 0U;
            }
        }
        EXPECT_GT(failures, 5U) << "what a reply cannot do without";
        // Memory runs out, once and for good.
        for (const bool once : {true, false}) {
            bool isReached = true;
            for (unsigned int n = 1; isReached; ++n) {
                SCOPED_TRACE((once ? "allocation " : "allocations from ") + std::to_string(n));
                const CMPIrc code =
                    sendWith([&] { once ? failing::allocation(n) : failing::allocationsFrom(n); },
                             [&] { isReached = failing::ended(); });
                points += isReached ? 1U : 0U;
                EXPECT_TRUE(isReached || code == CMPI_RC_OK);
                if (code == CMPI_RC_OK && !failing::failedIn("oxahvbroker")) {
                    EXPECT_EQ(shown, whole) << "a failed allocation was swallowed";
                }
            }
        }
        // The logger throws.
        bool isReached = true;
        for (unsigned int n = 1; isReached; ++n) {
            unsigned int logged = 0;
            HVLog::HVLogger::setSink([&](const HVLog::Message& /*message*/) {
                if (++logged == n) {
                    throw std::runtime_error("logger");
                }
            });
            HVLog::HVLogger::setThreshold(0);
            const CMPIrc code = sendWith([] {}, [] { HVLog::HVLogger::reset(); });
            isReached = logged >= n;
            points += isReached ? 1U : 0U;
            EXPECT_EQ(code, isReached ? CMPI_RC_ERR_FAILED : CMPI_RC_OK);
        }
        const oxahv::Fault noDone = {CMPI_RC_ERR_ACCESS_DENIED};
        broker_.injectFault("CMPIResultFT.returnDone", noDone);
        EXPECT_EQ(sendWithFault(nullptr), CMPI_RC_ERR_ACCESS_DENIED);
    }
    std::cerr << points << " failures below the provider\n";
    EXPECT_EQ(broker_.liveObjects().total(), before.total()) << "nothing outlives its request";
}

TEST_F(TheHostProvider, ServesSeveralRequestsAtOnce) {
    constexpr unsigned int threadCount = 4;
    constexpr unsigned int rounds = 10;
    std::atomic<unsigned int> failures{0};
    std::vector<std::thread> threads;
    for (unsigned int i = 0; i < threadCount; ++i) {
        threads.emplace_back([&, i] {
            for (unsigned int round = 0; round < rounds; ++round) {
                Request request(broker_);
                const std::string tag = "Büro " + std::to_string(i);
                const Reply set = setTag(request, tag);
                const Reply got = request.getInstance(request.objectPathFromText(detailsPath, ""));
                const Reply all =
                    request.enumerateInstances(request.objectPath("root/cimv2", "OXATK_EthernetPort"));
                const Reply ends = request.associatorNames(request.objectPathFromText(osPath, ""));
                const bool isWhole = set.ok() && got.ok() &&
                                     textOf(got).find("\"Büro ") != std::string::npos &&
                                     all.instances.size() == 2 && ends.objectPaths.size() == 1;
                failures += isWhole ? 0U : 1U;
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(failures, 0U);
    EXPECT_EQ(details().rfind("AssetTagChanges=" + std::to_string(threadCount * rounds) + ' ', 0), 0U);
}
