// The example provider on a machine of the test's own, served by the embedded broker in a process that is in
// the "C" locale, as one that never calls setlocale.
#include "HostProvider.h"
#include "AssetTag.h"
#include "ErrorOf.h"
#include "FailureWays.h"
#include "HostTime.h"
#include "ScratchFolder.h"
#include "TestLocales.h"

#include <clocale>
#include <csignal>
#include <ctime>
#include <future>
#include <sys/resource.h>

using oxahv::KeyMode;
using oxahv::Reply;
using oxahv::Request;

namespace {

const std::string systemPath =
    R"(root/cimv2:OXATK_ComputerSystem.CreationClassName="OXATK_ComputerSystem",Name="machine")";
const std::string osPath =
    R"(root/cimv2:OXATK_OperatingSystem.CSCreationClassName="OXATK_ComputerSystem",CSName="machine",)"
    R"(CreationClassName="OXATK_OperatingSystem",Name="Prüf-OS \\ 1 €")";
const std::string portPath =
    R"(root/cimv2:OXATK_EthernetPort.SystemCreationClassName="OXATK_ComputerSystem",SystemName="machine",)"
    R"(CreationClassName="OXATK_EthernetPort",DeviceID="eth0")";
const std::string sensorPath =
    R"(root/cimv2:OXATK_NumericSensor.SystemCreationClassName="OXATK_ComputerSystem",SystemName="machine",)"
    R"(CreationClassName="OXATK_NumericSensor",SensorNumber=5)";
const std::string detailsPath =
    R"(root/cimv2:OXATK_AssetIDDetails.InstanceID="OXATK:AssetIDDetails:machine")";

class HostProviderTest : public testing::Test, protected ScratchFolder {
public:
    HostProviderTest() {
        std::setlocale(LC_ALL, "C"); // the test program's main function has taken the environment's
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
        setZone("XST-5:30");
        setHostRoot(folder_);
        ::unsetenv("LOCPATH"); // for the provider's own locale, of which the C library would lose the path
        broker_.setContextEntry("OXAHostStateFile", ScratchFolder::path(stateFile_));
        host(broker_);
    }
    ~HostProviderTest() override {
        setHostRoot("");
        ::unsetenv("TZ");
    }

    static void host(oxahv::EmbeddedBroker& broker) {
        broker.host("OXAHostProvider",
                    {OXAHostProvider_Create_InstanceMI, OXAHostProvider_Create_AssociationMI,
                     OXAHostProvider_Create_MethodMI});
    }

    static void setZone(const char* zone) {
        ::setenv("TZ", zone, 1);
        ::tzset();
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

    CMPIrc codeOf(const std::string& text) { return request_.getInstance(path(text)).code; }

    // A value, with "now" for the present time.
    static std::string textOf(const CMPIData& data) {
        std::string text = oxahv::valueText(data);
        if (data.type == CMPI_dateTime) {
            const auto time =
                static_cast<std::time_t>(CMGetBinaryFormat(data.value.dateTime, nullptr) / 1'000'000);
            const std::time_t age = std::time(nullptr) - time;
            if (age >= 0 && age < 60) {
                text.replace(1, sizeof "20261231235959.000000" - 1, "now");
            }
        }
        return text;
    }

    // The properties of the instances that are not NULL, and the paths.
    static std::string textOf(const Reply& reply) {
        std::string text;
        for (const CMPIInstance* const instance : reply.instances) {
            for (CMPICount i = 0; i < CMGetPropertyCount(instance, nullptr); ++i) {
                CMPIString* name = nullptr;
                const CMPIData data = CMGetPropertyAt(instance, i, &name, nullptr);
                if (!CMIsNullValue(data)) {
                    text += std::string(CMGetCharsPtr(name, nullptr)) + '=' + textOf(data) + ' ';
                }
            }
        }
        for (const CMPIObjectPath* const objectPath : reply.objectPaths) {
            text += oxahv::pathText(objectPath) + ' ';
        }
        return text;
    }

    CMPIArgs* argument(const CMPIData& tag) {
        CMPIArgs* const in = CMNewArgs(broker_.handle(), nullptr);
        CMAddArg(in, "Tag", &tag.value, tag.type);
        return in;
    }

    CMPIArgs* argument(const std::string& tag) { return argument(request_.valueFromText(tag, CMPI_string)); }

    Reply setTag(Request& request, const std::string& tag, const char* method = "SetAssetTag") {
        return request.invokeMethod(request.objectPathFromText(systemPath, ""), method, argument(tag));
    }

    // The method's return value, or the code that the request failed with.
    std::string setTag(const std::string& tag) {
        const Reply reply = setTag(request_, tag);
        return reply.ok() ? std::to_string(reply.data.at(0).value.uint32) : oxahv::codeName(reply.code);
    }

    // How often the tag was changed, and the tag.
    std::string tag() {
        const CMPIInstance* const details = request_.getInstance(path(detailsPath)).instances.at(0);
        return ::textOf(details, "AssetTagChanges") + ' ' + ::textOf(details, "AssetTag");
    }

    const std::string stateFile_ = "var/lib/asset.properties";
    oxahv::EmbeddedBroker broker_;
    Request request_{broker_};
};

} // namespace

TEST_F(HostProviderTest, ShowsTheMachine) {
    // A property that its class lacks, or that has another type there, would be dropped.
    broker_.compileMof(MOF_FOLDER "/CIMSuperclasses.mof");
    broker_.compileMof(MOF_FOLDER "/OXAHost.mof");
    broker_.setKeyMode(KeyMode::untyped);
    const std::string noTag = textOf(request_.getInstance(path(detailsPath)));
    ASSERT_EQ(setTag("tag"), "0");
    const std::string device =
        R"(SystemCreationClassName="OXATK_ComputerSystem" SystemName="machine" CreationClassName=)";
    const auto sensor = [&](const std::string& minutes, const std::string& reading) {
        return R"(Caption="Processes that are ready to run" ElementName="Numeric sensor )" + minutes + "\" " +
               device + "\"OXATK_NumericSensor\" SensorNumber=" + minutes + " Reading=" + reading + ' ';
    };
    const std::pair<const char*, std::string> cases[] = {
        {"oxatk_computersystem", R"(ElementName="Computer system machine" Name="machine" EnabledState=2 )"
                                 R"(CreationClassName="OXATK_ComputerSystem" NameFormat="HostName" )"},
        {"OXATK_OperatingSystem",
         R"(Caption="Prüf-OS \\ 1 €" ElementName="Operating system machine" Name="Prüf-OS \\ 1 €" )"
         R"(OperationalStatus={2} StatusDescriptions={"running"} EnabledState=2 )"
         R"(CSCreationClassName="OXATK_ComputerSystem" CSName="machine" )"
         R"(CreationClassName="OXATK_OperatingSystem" OSType=36 Version="6.1.0-test" )"
         R"(LastBootUpTime="20231115031320.000000+300" LocalDateTime="now+300" CurrentTimeZone=330 )"
         "NumberOfProcesses=2 FreePhysicalMemory=8 TotalVisibleMemorySize=16 Distributed=FALSE "},
        {"OXATK_EthernetPort",
         R"(ElementName="Ethernet port eth0" Name="eth0" OperationalStatus={2} StatusDescriptions={"up"} )"
         "EnabledState=2 " +
             device +
             R"("OXATK_EthernetPort" DeviceID="eth0" OtherIdentifyingInfo={"Büro ☂"} )"
             R"(IdentifyingDescriptions={"Alias"} Speed=1000000000 PermanentAddress="02000000000a" )"
             R"(NetworkAddresses={"02000000000a"} LinkTechnology=2 FullDuplex=TRUE )"
             R"(ActiveMaximumTransmissionUnit=1500 Capabilities={3} ElementName="Ethernet port eth1" )"
             R"(Name="eth1" OperationalStatus={10} StatusDescriptions={"down"} EnabledState=3 )" +
             device +
             R"("OXATK_EthernetPort" DeviceID="eth1" NetworkAddresses={"02000000000a"} LinkTechnology=2 )"
             "ActiveMaximumTransmissionUnit=1500 "},
        {"OXATK_NumericSensor", sensor("1", "0.25") + sensor("5", "1.5") + sensor("15", "2.0")},
        {"OXATK_AssetIDDetails", noTag.substr(0, noTag.find("AssetTagChanges=0 ")) +
                                     R"(AssetTag="tag" AssetTagDate="now+300" AssetTagChanges=1 )"},
    };
    for (const auto& [className, text] : cases) {
        EXPECT_EQ(textOf(request_.enumerateInstances(path(className))), text);
    }
    write("/sys/class/net/eth1/operstate", "unknown");
    const std::string port = textOf(request_.enumerateInstances(path("OXATK_EthernetPort")));
    EXPECT_NE(port.find(R"(OperationalStatus={0} StatusDescriptions={"unknown"} EnabledState=0 )"),
              std::string::npos)
        << port;
    const std::vector<std::string> wanted = {"Dependent", "NameFormat"};
    EXPECT_EQ(textOf(request_.associators(path(osPath), {}, &wanted)),
              R"(Name="machine" CreationClassName="OXATK_ComputerSystem" NameFormat="HostName" )");
    write("/etc/os-release", "PRETTY_NAME='It\"s an OS'");
    const std::string os = textOf(request_.enumerateInstances(path("OXATK_OperatingSystem")));
    EXPECT_EQ(os.rfind(R"(Caption="It\"s an OS" )", 0), 0U) << os;
}

TEST_F(HostProviderTest, ReadsNumberKeysOfEveryType) {
    const auto reading = [&](CMPIType type, const std::string& number) {
        CMPIObjectPath* const sensor = path(sensorPath);
        const CMPIData key = request_.valueFromText(number, type);
        CMAddKey(sensor, "SensorNumber", &key.value, type);
        const Reply reply = request_.getInstance(sensor);
        return reply.ok() ? ::textOf(reply.instances.at(0), "Reading") : oxahv::codeName(reply.code);
    };
    const std::string notFound = "CMPI_RC_ERR_NOT_FOUND";
    for (const CMPIType type :
         std::vector<CMPIType>{CMPI_uint8, CMPI_uint16, CMPI_uint32, CMPI_uint64, CMPI_sint8, CMPI_sint16,
                               CMPI_sint32, CMPI_sint64, CMPI_string}) {
        EXPECT_EQ(reading(type, "15"), "2.0") << type;
        EXPECT_EQ(reading(type, "2"), notFound) << type;
        if (type == CMPI_string || (type & CMPI_SINT) == CMPI_SINT) {
            EXPECT_EQ(reading(type, "-5"), notFound) << type;
        }
    }
    EXPECT_EQ(reading(CMPI_uint8, "251"), notFound) << "not read as -5";
    for (const CMPIType type : std::vector<CMPIType>{CMPI_uint32, CMPI_sint64, CMPI_string}) {
        EXPECT_EQ(reading(type, "65541"), notFound) << "not cut to 16 bits";
    }
    for (const char* const text : {"", "5x", " 5", "18446744073709551621"}) {
        EXPECT_EQ(reading(CMPI_string, text), notFound) << text;
    }
}

TEST_F(HostProviderTest, KeepsTheLocaleOfTheServer) {
    const std::string before = std::setlocale(LC_ALL, nullptr);
    ASSERT_EQ(::uselocale(nullptr), LC_GLOBAL_LOCALE);
    EXPECT_EQ(codeOf(osPath), CMPI_RC_OK) << "its name is no ASCII";
    EXPECT_EQ(::uselocale(nullptr), LC_GLOBAL_LOCALE);
    EXPECT_EQ(codeOf("OXATK_Fan"), CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(::uselocale(nullptr), LC_GLOBAL_LOCALE);
    {
        ::setenv("LOCPATH", TEST_LOCALES, 1);
        const ThreadLocale german("de_DE.ISO-8859-1");
        ::unsetenv("LOCPATH");
        const locale_t own = ::uselocale(nullptr);
        EXPECT_EQ(setTag("ä"), "0");
        EXPECT_EQ(::uselocale(nullptr), own);
        const std::string os = textOf(request_.getInstance(path(osPath)));
        EXPECT_NE(os.find(R"(ElementName="Betriebssystem machine" Caption="Prüf-OS)"), std::string::npos)
            << os;
    }
    EXPECT_EQ(std::setlocale(LC_ALL, nullptr), before);
}

TEST_F(HostProviderTest, StoresOnlyAcceptableAssetTags) {
    // What the declaration says to be taken.
    EXPECT_EQ(setTag("/etc/a|b;`c` d> 'e' & \"f\""), "0");
    EXPECT_EQ(tag(), R"(1 "/etc/a|b;`c` d> 'e' & \"f\"")");
    EXPECT_EQ(setTag("Prüfstand 7 = €"), "0");
    for (const std::string& refused :
         {std::string(), std::string(65, 'x'), std::string("<b>"), std::string("a\nb"), std::string("\xff"),
          std::string(" a"), std::string("a "), std::string("a\u3000"), std::string("a%b"),
          std::string("a\\b"), std::string("a$b"), std::string("a:b"), std::string("wWw.a"),
          std::string("a WAP.b")}) {
        EXPECT_EQ(setTag(refused), "5") << refused;
        EXPECT_EQ(tag(), "2 \"Prüfstand 7 = €\"");
    }
    std::string umlauts; // counted in characters
    for (int i = 0; i < 64; ++i) {
        umlauts += "ä";
    }
    EXPECT_EQ(setTag(umlauts), "0");
    EXPECT_EQ(tag(), "3 \"" + umlauts + '"');
}

TEST_F(HostProviderTest, ReportsWhyATagCannotBeSaved) {
    EXPECT_EQ(setTag("first"), "0");
    const std::string saved = content(stateFile_);
    std::signal(SIGXFSZ, SIG_IGN);
    rlimit earlier = {};
    ::getrlimit(RLIMIT_FSIZE, &earlier);
    const rlimit nothing = {0, earlier.rlim_max};
    ::setrlimit(RLIMIT_FSIZE, &nothing);
    const Reply reply = setTag(request_, "second");
    ::setrlimit(RLIMIT_FSIZE, &earlier);
    EXPECT_EQ(reply.code, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(reply.message.rfind("The asset tag could not be saved. ", 0), 0U) << reply.message;
    EXPECT_EQ(content(stateFile_), saved);
    EXPECT_EQ(setTag("third"), "0");
    EXPECT_EQ(tag(), "2 \"third\"");

    oxahv::EmbeddedBroker withoutFile;
    withoutFile.setContextEntry("OXAHostStateFile", "");
    host(withoutFile);
    Request request(withoutFile);
    const Reply nowhere = setTag(request, "fourth");
    EXPECT_EQ(nowhere.code, CMPI_RC_ERR_FAILED);
    EXPECT_NE(nowhere.message.find("OXAHostStateFile names no file"), std::string::npos) << nowhere.message;
    EXPECT_TRUE(request.getInstance(request.objectPathFromText(detailsPath, "")).ok());
}

TEST_F(HostProviderTest, WritesDatesAsTheSameInstant) {
    const struct {
        const char* zone;
        const char* text; // of 1700000000, 22:13:20 in UTC
    } cases[] = {
        {"UTC0", "20231114221320.000000+000"},     {"XST-1", "20231114231320.000000+060"},
        {"XST-5:45", "20231115031320.000000+300"}, {"XST3:30", "20231114191320.000000-180"},
        {"XST0:30", "20231114221320.000000+000"},  {"XST11", "20231114111320.000000-660"},
    };
    for (const auto& c : cases) {
        setZone(c.zone);
        EXPECT_EQ(cimText(localTime(1700000000)), c.text) << c.zone;
    }
}

TEST_F(HostProviderTest, RefusesRequestsWithTheRightCode) {
    std::string other = systemPath;
    other.replace(other.rfind("machine"), 7, "others");
    for (const std::string& unknown :
         {std::string("OXATK_EthernetPort.DeviceID=\"eth0\""), portPath + ",Other=1", other}) {
        EXPECT_EQ(codeOf(unknown), CMPI_RC_ERR_NOT_FOUND) << unknown;
    }
    EXPECT_EQ(request_.associators(path(other)).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(request_.invokeMethod(path(other), "SetAssetTag", argument("x")).code, CMPI_RC_ERR_NOT_FOUND);
    CMPIObjectPath* const swapped = path("OXATK_RunningOS");
    for (const auto& [role, end] : {std::pair("Antecedent", systemPath), std::pair("Dependent", osPath)}) {
        CMPIValue value = {};
        value.ref = path(end);
        CMAddKey(swapped, role, &value, CMPI_ref);
    }
    EXPECT_EQ(request_.getInstance(swapped).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(request_.getInstance(path("OXATK_RunningOS.Antecedent=\"x\"")).message,
              "key Antecedent is no reference");

    const CMPIObjectPath* const port = path(portPath);
    const CMPIInstance* const instance = CMNewInstance(broker_.handle(), port, nullptr);
    for (const Reply& reply : {request_.createInstance(port, instance),
                               request_.modifyInstance(port, instance), request_.deleteInstance(port)}) {
        EXPECT_EQ(reply.code, CMPI_RC_ERR_NOT_SUPPORTED);
    }

    EXPECT_EQ(setTag(request_, "x", "Reboot").code, CMPI_RC_ERR_METHOD_NOT_FOUND);
    EXPECT_EQ(request_.invokeMethod(port, "SetAssetTag", argument("x")).code, CMPI_RC_ERR_METHOD_NOT_FOUND);
    EXPECT_TRUE(setTag(request_, "x", "setassettag").ok());
    const CMPIArgs* const number = argument(request_.valueFromText("5", CMPI_uint64));
    EXPECT_EQ(request_.invokeMethod(path(systemPath), "SetAssetTag", number).message,
              "argument Tag is no text");
    const CMPIArgs* const none = CMNewArgs(broker_.handle(), nullptr);
    EXPECT_EQ(failureOf(request_.invokeMethod(path(systemPath), "SetAssetTag", none)),
              "CMPI_RC_ERR_INVALID_PARAMETER The asset tag is missing.");

    oxahv::EmbeddedBroker faulty;
    faulty.setContextEntry("OXAHostStateFile", "x");
    faulty.injectFault("CMPIContextFT.getEntry", {CMPI_RC_OK, true});
    EXPECT_THROW(host(faulty), oxahv::BrokerError);
}

TEST_F(HostProviderTest, SurvivesEveryFailureOfBrokerMemoryAndLogger) {
    const std::size_t before = broker_.liveObjects().total();
    using Sender = Reply (*)(Request & request, const CMPIObjectPath* path, const CMPIArgs* in);
    const std::pair<std::string, Sender> operations[] = {
        {portPath, [](auto& request, auto* port, auto*) { return request.getInstance(port); }},
        {"OXATK_OperatingSystem",
         [](auto& request, auto* system, auto*) { return request.enumerateInstances(system); }},
        {osPath, [](auto& request, auto* system, auto*) { return request.associators(system); }},
        {systemPath, [](auto& request, auto* system,
                        auto* in) { return request.invokeMethod(system, "SetAssetTag", in); }},
    };
    std::vector<Way> ways = waysOfTheBroker(broker_);
    for (const Way& way : waysOfMemory()) {
        ways.push_back(way);
    }
    ways.push_back(wayOfTheLogger());
    for (const auto& [name, send] : operations) {
        SCOPED_TRACE(name);
        Request caller(broker_);
        const CMPIObjectPath* const target = caller.objectPathFromText(name, "root/cimv2");
        const CMPIArgs* const in = argument("tag");
        const std::string whole = textOf(send(caller, target, in));
        unsigned int failures = 0;
        for (const Way& way : ways) {
            bool isReached = true;
            for (unsigned int n = 1; isReached; ++n) {
                SCOPED_TRACE(way.name + ' ' + std::to_string(n));
                Request request(broker_);
                Reply reply;
                way.begin(n);
                try {
                    reply = send(request, target, in);
                } catch (const std::bad_alloc&) { // the broker itself had no room for the reply
                    reply.code = CMPI_RC_ERR_FAILED;
                }
                isReached = way.end(n);
                const std::string shown = textOf(reply);
                EXPECT_NE(reply.message.rfind("exception", 0), 0U) << reply.message;
                EXPECT_TRUE(isReached || (reply.ok() && shown == whole));
                failures += reply.ok() ? 0 : 1;
                if (way.thrown == Thrown::badAlloc && reply.ok() && !failing::failedIn("oxahvbroker")) {
                    EXPECT_EQ(shown, whole) << "a failed allocation was swallowed";
                }
                if (way.thrown == Thrown::byTheLogger && isReached) {
                    EXPECT_EQ(reply.code, CMPI_RC_ERR_FAILED);
                }
            }
        }
        EXPECT_GT(failures, 15U) << "what a reply cannot do without";
    }
    EXPECT_EQ(broker_.liveObjects().total(), before) << "nothing outlives its request";
}

TEST_F(HostProviderTest, ServesSeveralRequestsAtOnce) {
    std::vector<std::future<void>> clients;
    for (int client = 0; client < 4; ++client) {
        clients.push_back(std::async(std::launch::async, [this] {
            for (int round = 0; round < 10; ++round) {
                Request request(broker_);
                EXPECT_TRUE(setTag(request, "Büro").ok());
                EXPECT_TRUE(request.getInstance(request.objectPathFromText(detailsPath, "")).ok());
                EXPECT_TRUE(request.associatorNames(request.objectPathFromText(osPath, "")).ok());
            }
        }));
    }
    clients.clear();
    EXPECT_EQ(tag(), "40 \"Büro\"");
}
