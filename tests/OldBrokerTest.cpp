// The example provider, and so the library, in a CIM server of CMPI 1.0: what later versions have added to
// the broker's tables is memory that cannot be read.
#include "EmbeddedBroker.h"
#include "HostProvider.h"

#include <cstddef>
#include <cstring>
#include <gtest/gtest.h>
#include <set>
#include <sys/mman.h>
#include <unistd.h>

using oxahv::Reply;
using oxahv::Request;

namespace {

// The beginning of a record, at the end of a page that an unreadable one follows.
template <class Record>
class Cut {
public:
    Cut(const Record& whole, std::size_t size)
        : page_(static_cast<std::size_t>(::sysconf(_SC_PAGESIZE))),
          memory_(static_cast<char*>(
              ::mmap(nullptr, 2 * page_, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0))) {
        begin_ = memory_ + page_ - size;
        std::memcpy(begin_, &whole, size);
        ::mprotect(memory_ + page_, page_, PROT_NONE);
    }
    ~Cut() { ::munmap(memory_, 2 * page_); }
    Cut(const Cut&) = delete;
    Cut& operator=(const Cut&) = delete;

    const Record* get() const { return reinterpret_cast<const Record*>(begin_); }

private:
    std::size_t page_;
    char* memory_;
    char* begin_;
};

const CMPIBroker* wholeBroker = nullptr;
const CMPIBroker* oldBroker = nullptr;

// A slot of the old broker: the whole one's, which takes its own handle alone.
template <auto slot>
struct Old;
template <class Return, class... Rest, Return (*CMPIBrokerEncFT::*slot)(const CMPIBroker*, Rest...)>
struct Old<slot> {
    static Return call(const CMPIBroker* broker, Rest... rest) {
        EXPECT_EQ(broker, oldBroker);
        return (wholeBroker->eft->*slot)(wholeBroker, rest...);
    }
};

CMPIBrokerEncFT oldEncapsulation() {
    CMPIBrokerEncFT table = {}; // what is not named here is called by nobody
    table.ftVersion = CMPIVersion100;
    table.newInstance = Old<&CMPIBrokerEncFT::newInstance>::call;
    table.newObjectPath = Old<&CMPIBrokerEncFT::newObjectPath>::call;
    table.newString = Old<&CMPIBrokerEncFT::newString>::call;
    table.newArray = Old<&CMPIBrokerEncFT::newArray>::call;
    table.newDateTimeFromChars = Old<&CMPIBrokerEncFT::newDateTimeFromChars>::call;
    table.classPathIsA = Old<&CMPIBrokerEncFT::classPathIsA>::call;
    return table;
}

template <auto create>
auto* createForOldBroker(const CMPIBroker* /*broker*/, const CMPIContext* context, CMPIStatus* rc) {
    return create(oldBroker, context, rc);
}

class TheHostProviderInAnOldServer : public testing::Test {
public:
    TheHostProviderInAnOldServer() {
        wholeBroker = server.handle();
        oldBroker = record_.get();
        server.compileMof(MOF_FOLDER "/CIMSuperclasses.mof");
        server.compileMof(MOF_FOLDER "/OXAHost.mof");
        server.setContextEntry("OXAHostStateFile", stateFile_);
        server.host("OXAHostProvider", {createForOldBroker<OXAHostProvider_Create_InstanceMI>,
                                        createForOldBroker<OXAHostProvider_Create_AssociationMI>,
                                        createForOldBroker<OXAHostProvider_Create_MethodMI>});
    }
    ~TheHostProviderInAnOldServer() override {
        server.unload("OXAHostProvider");
        ::unlink(stateFile_.c_str());
    }

    oxahv::EmbeddedBroker server;

private:
    const std::string stateFile_ =
        testing::TempDir() + "old-broker-" + std::to_string(::getpid()) + ".properties";
    const Cut<CMPIBrokerFT> requests_{*server.handle()->bft,
                                      offsetof(CMPIBrokerFT, enumerateInstancesFiltered)};
    const Cut<CMPIBrokerEncFT> encapsulation_{oldEncapsulation(), offsetof(CMPIBrokerEncFT, newCMPIError)};
    const Cut<CMPIBrokerExtFT> system_{*server.handle()->xft, offsetof(CMPIBrokerExtFT, destroyMutex2)};
    const Cut<CMPIBroker> record_{
        CMPIBroker{server.handle()->hdl, requests_.get(), encapsulation_.get(), system_.get(), nullptr},
        offsetof(CMPIBroker, mft)};
};

TEST_F(TheHostProviderInAnOldServer, ServesEveryKindOfRequest) {
    server.startRecording();
    Request request(server);
    for (const char* name : {"OXATK_ComputerSystem", "OXATK_OperatingSystem", "OXATK_EthernetPort",
                             "OXATK_NumericSensor", "OXATK_AssetIDDetails", "OXATK_RunningOS"}) {
        SCOPED_TRACE(name);
        const CMPIObjectPath* const classPath = request.objectPath("root/cimv2", name);
        const Reply names = request.enumerateInstanceNames(classPath);
        const Reply instances = request.enumerateInstances(classPath);
        EXPECT_TRUE(names.ok() && instances.ok()) << names.message << instances.message;
        EXPECT_EQ(names.objectPaths.size(), instances.instances.size());
        for (const CMPIObjectPath* path : names.objectPaths) {
            EXPECT_EQ(request.getInstance(path).instances.size(), 1U);
        }
    }
    const Reply systems =
        request.enumerateInstanceNames(request.objectPath("root/cimv2", "OXATK_ComputerSystem"));
    ASSERT_EQ(systems.objectPaths.size(), 1U);
    const CMPIObjectPath* const system = systems.objectPaths[0];
    EXPECT_EQ(request.associators(system).instances.size(), 1U);
    EXPECT_EQ(request.associatorNames(system).objectPaths.size(), 1U);
    EXPECT_EQ(request.references(system).instances.size(), 1U);
    EXPECT_EQ(request.referenceNames(system).objectPaths.size(), 1U);
    CMPIArgs* const arguments = CMNewArgs(server.handle(), nullptr);
    const CMPIData tag = request.valueFromText("\"R 12\"", CMPI_string);
    CMAddArg(arguments, "Tag", &tag.value, tag.type);
    const Reply method = request.invokeMethod(system, "SetAssetTag", arguments);
    ASSERT_TRUE(method.ok() && method.data.size() == 1) << method.message;
    EXPECT_EQ(method.data[0].value.uint32, 0U);

    // The objects' tables are whole.
    const std::set<std::string> later = {"CMPIInstanceFT.setPropertyWithOrigin", "CMPIStringFT.newCharsCP",
                                         "CMPIResultFT.returnError"};
    for (const oxahv::Call& call : server.stopRecording()) {
        EXPECT_EQ(later.count(call.slot), 0U) << call.slot;
    }
}

} // namespace
