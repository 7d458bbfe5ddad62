// The example provider on a machine of the test's own, served by the embedded broker.
#include "HostProvider.h"
#include "EmbeddedBroker.h"

#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <unistd.h>

using oxahv::Reply;

namespace {

class TheHostProvider : public testing::Test {
protected:
    TheHostProvider() {
        write("/proc/sys/kernel/hostname", "machine");
        write("/proc/sys/kernel/osrelease", "6.1.0-test");
        write("/proc/1/stat", "");
        write("/proc/22/stat", "");
        write("/proc/meminfo", "MemTotal:       16 kB\nMemFree:        8 kB\nSwapTotal:      x kB\n");
        write("/etc/os-release", "NAME=\"Test\"\nPRETTY_NAME=\"Test \\ OS 1\"\n");
        writePort("eth0", "1", "up", "1000", "full");
        writePort("eth1", "1", "down", "-1", "unknown");
        writePort("lo", "772", "unknown", "", "");
        setHostRoot(root_);
        broker_.host("OXAHostProvider", {OXAHostProvider_Create_InstanceMI});
    }
    ~TheHostProvider() override {
        setHostRoot("");
        std::filesystem::remove_all(root_);
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

    // The properties of an instance that are not NULL, as texts.
    static std::string textOf(const CMPIInstance* instance) {
        std::string text;
        for (CMPICount i = 0; i < CMGetPropertyCount(instance, nullptr); ++i) {
            CMPIString* name = nullptr;
            const CMPIData data = CMGetPropertyAt(instance, i, &name, nullptr);
            text += std::string(CMGetCharsPtr(name, nullptr)) + '=' + oxahv::valueText(data) + ' ';
        }
        return text;
    }

    const std::string root_ = testing::TempDir() + "oxahv-host-" + std::to_string(::getpid());
    oxahv::EmbeddedBroker broker_;
    oxahv::Request request_{broker_};
};

const char* const portPath =
    "root/cimv2:OXATK_EthernetPort.SystemCreationClassName=\"OXATK_ComputerSystem\","
    "SystemName=\"machine\",CreationClassName=\"OXATK_EthernetPort\",DeviceID=\"eth0\"";

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
        "CreationClassName=\"OXATK_EthernetPort\" DeviceID=\"eth0\" Name=\"eth0\" ElementName=\"eth0\" "
        "EnabledState=2 LinkTechnology=2 PermanentAddress=\"02000000000a\" Speed=1000000000 FullDuplex=TRUE "
        "ActiveMaximumTransmissionUnit=1500 ");
    EXPECT_EQ(textOf(ports.instances[1]).find("Speed"), std::string::npos)
        << "a speed that is not known stays NULL";

    EXPECT_EQ(
        textOf(request_.enumerateInstances(path("OXATK_OperatingSystem")).instances.at(0)),
        "CSCreationClassName=\"OXATK_ComputerSystem\" CSName=\"machine\" "
        "CreationClassName=\"OXATK_OperatingSystem\" Name=\"Test \\\\ OS 1\" ElementName=\"Test \\\\ OS 1\" "
        "OSType=36 Version=\"6.1.0-test\" EnabledState=2 Distributed=FALSE NumberOfProcesses=2 "
        "TotalVisibleMemorySize=16 FreePhysicalMemory=8 ");
    EXPECT_EQ(request_.enumerateInstances(path("OXATK_ComputerSystem")).instances.size(), 1U);
}

TEST_F(TheHostProvider, GetsTheInstanceThatIsNamed) {
    for (const oxahv::KeyMode mode : {oxahv::KeyMode::exact, oxahv::KeyMode::untyped}) {
        broker_.setKeyMode(mode);
        const Reply reply = request_.getInstance(path(portPath));
        ASSERT_EQ(reply.instances.size(), 1U);
        EXPECT_EQ(oxahv::pathText(CMGetObjectPath(reply.instances[0], nullptr)), portPath);
    }
    const std::vector<std::string> wanted = {"speed"};
    EXPECT_EQ(CMGetPropertyCount(request_.getInstance(path(portPath), &wanted).instances.at(0), nullptr), 5U);
}

TEST_F(TheHostProvider, AnswersEveryOtherRequestWithItsCode) {
    std::string other = portPath;
    other.replace(other.rfind("eth0"), 4, "eth9");
    EXPECT_EQ(request_.getInstance(path(other)).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(request_.getInstance(path("OXATK_EthernetPort.DeviceID=\"eth0\"")).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(request_.getInstance(path("OXATK_Fan")).code, CMPI_RC_ERR_INVALID_CLASS);
    broker_.setKeyMode(oxahv::KeyMode::chars);
    EXPECT_EQ(request_.getInstance(path(portPath)).code, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(request_.getInstance(path(portPath)).message, "Moniker component for data type not available.");

    const CMPIObjectPath* const port = path(portPath);
    const CMPIInstance* const instance = CMNewInstance(broker_.handle(), port, nullptr);
    EXPECT_EQ(request_.createInstance(port, instance).code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(request_.modifyInstance(port, instance).code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(request_.deleteInstance(port).code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(request_.execQuery(port, "select", "WQL").code, CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_F(TheHostProvider, AnswersWithACodeWhateverFailsBelowIt) {
    const oxahv::LiveObjects before = broker_.liveObjects();
    unsigned int points = 0;
    for (const oxahv::Fault& kind : {oxahv::Fault{CMPI_RC_ERR_FAILED}, oxahv::Fault{CMPI_RC_OK, true},
                                     oxahv::Fault{CMPI_RC_OK, false, CMPI_nullValue}}) {
        for (unsigned int call = 1; call < 200; ++call) {
            oxahv::Fault fault = kind;
            fault.firstCall = call;
            oxahv::Request request(broker_);
            CMPIObjectPath* const port = request.objectPathFromText(portPath, "");
            broker_.injectFault("*", fault);
            const Reply reply = request.getInstance(port);
            broker_.clearFaults();
            EXPECT_TRUE(reply.ok() || reply.instances.empty() || reply.code == CMPI_RC_ERR_FAILED);
            ++points;
        }
    }
    EXPECT_EQ(points, 3U * 199U);
    EXPECT_EQ(broker_.liveObjects().total(), before.total());
}
