// The example provider, and so the library, in a CIM server of CMPI 1.0: it reads nothing behind the record
// of such a broker, and calls no slot of a later version.
#include "EmbeddedBroker.h"
#include "HostProvider.h"

#include <cstddef>
#include <cstring>
#include <gtest/gtest.h>
#include <sys/mman.h>
#include <unistd.h>

namespace {

const char* const laterSlots[] = {"MemFT.",
                                  "ErrorFT.",
                                  "PropertyListFT.",
                                  "Filtered",
                                  "newCMPIError",
                                  "openMessageFile",
                                  "closeMessageFile",
                                  "getMessage2",
                                  "newPropertyList",
                                  "newStringCP",
                                  "newCharsCP",
                                  "returnError",
                                  "newEnumerationFilter",
                                  "setPropertyWithOrigin"};

const CMPIBroker* oldBroker = nullptr;

template <auto create>
auto* createForOldBroker(const CMPIBroker* /*broker*/, const CMPIContext* context, CMPIStatus* rc) {
    return create(oldBroker, context, rc);
}

// At the end of a page that an unreadable one follows.
void placeOldBroker(const CMPIBroker* broker) {
    const auto page = static_cast<std::size_t>(::sysconf(_SC_PAGESIZE));
    auto* const memory = static_cast<char*>(
        ::mmap(nullptr, 2 * page, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0));
    ::mprotect(memory + page, page, PROT_NONE);
    constexpr std::size_t size = offsetof(CMPIBroker, mft);
    oldBroker = static_cast<CMPIBroker*>(std::memcpy(memory + page - size, broker, size));
}

} // namespace

TEST(TheHostProviderInAnOldServer, ServesEveryKindOfRequest) {
    oxahv::EmbeddedBroker server;
    placeOldBroker(server.handle());
    server.compileMof(MOF_FOLDER "/CIMSuperclasses.mof");
    server.compileMof(MOF_FOLDER "/OXAHost.mof");
    const std::string stateFile =
        testing::TempDir() + "old-broker-" + std::to_string(::getpid()) + ".properties";
    server.setContextEntry("OXAHostStateFile", stateFile);
    server.startRecording();
    server.host("OXAHostProvider", {createForOldBroker<OXAHostProvider_Create_InstanceMI>,
                                    createForOldBroker<OXAHostProvider_Create_AssociationMI>,
                                    createForOldBroker<OXAHostProvider_Create_MethodMI>});
    oxahv::Request request(server);
    for (const char* const name : {"OXATK_OperatingSystem", "OXATK_EthernetPort", "OXATK_NumericSensor",
                                   "OXATK_AssetIDDetails", "OXATK_RunningOS"}) {
        EXPECT_TRUE(request.enumerateInstances(request.objectPath("root/cimv2", name)).ok()) << name;
    }
    const oxahv::Reply systems =
        request.enumerateInstanceNames(request.objectPath("root/cimv2", "OXATK_ComputerSystem"));
    const CMPIObjectPath* const system = systems.objectPaths.at(0);
    EXPECT_EQ(request.getInstance(system).instances.size(), 1U);
    EXPECT_EQ(request.associators(system).instances.size(), 1U);
    EXPECT_EQ(request.associatorNames(system).objectPaths.size(), 1U);
    EXPECT_EQ(request.references(system).instances.size(), 1U);
    EXPECT_EQ(request.referenceNames(system).objectPaths.size(), 1U);
    CMPIArgs* const arguments = CMNewArgs(server.handle(), nullptr);
    CMAddArg(arguments, "Tag", "R 12", CMPI_chars);
    EXPECT_TRUE(request.invokeMethod(system, "SetAssetTag", arguments).ok());
    server.unload("OXAHostProvider");
    ::unlink(stateFile.c_str());

    for (const oxahv::Call& call : server.stopRecording()) {
        for (const char* const later : laterSlots) {
            EXPECT_EQ(call.slot.find(later), std::string::npos) << call.slot;
        }
    }
}
