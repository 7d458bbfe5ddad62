// Providers leave the process when they are unloaded, as their servers expect, even while a thread that was
// inside one ends. This program links the broker alone, so that what a provider brings along may leave too.
#include "EmbeddedBroker.h"

#include <fstream>
#include <future>
#include <gtest/gtest.h>
#include <string>
#include <thread>
#include <vector>

namespace {

bool isMapped(const std::string& file) {
    std::ifstream maps("/proc/self/maps");
    for (std::string line; std::getline(maps, line);) {
        if (line.find(file) != std::string::npos) {
            return true;
        }
    }
    return false;
}

// The libraries that leave with the last provider.
std::vector<std::string> broughtAlong() {
#ifdef __clang__
    return {"liboxahvproviderutilities", "liboxahvlogger"};
#else
    // GCC makes the library's exported message buffers unique in the process, so it stays; see Trace.h.
    return {};
#endif
}

void expectUnmapped(const std::string& library) {
    EXPECT_FALSE(isMapped(library)) << library;
    for (const std::string& other : broughtAlong()) {
        EXPECT_FALSE(isMapped(other)) << other;
    }
}

#ifdef HOST_PROVIDER
struct Provider {
    const char* library;
    const char* name;
    const char* className;
    std::vector<const char*> mofs;
};

void askEverything(oxahv::EmbeddedBroker& broker, const char* className) {
    oxahv::Request request(broker);
    CMPIObjectPath* const path = request.objectPath("root/cimv2", className);
    const oxahv::Reply names = request.enumerateInstanceNames(path);
    ASSERT_FALSE(names.objectPaths.empty());
    EXPECT_EQ(request.enumerateInstances(path).instances.size(), names.objectPaths.size());
    EXPECT_EQ(request.getInstance(names.objectPaths[0]).instances.size(), 1U);
}
#endif

} // namespace

TEST(UnloadTest, CanHappenWhileThreadsEnd) {
    oxahv::EmbeddedBroker broker;
    for (int round = 0; round < 1000 && !HasFailure(); ++round) {
        broker.load(ROAD_PROVIDER, "Road");
        ASSERT_TRUE(isMapped("liboxahvproviderutilities"));
        std::promise<CMPIrc> answered;
        std::thread thread([&] {
            oxahv::Request request(broker);
            answered.set_value(
                request.getInstance(request.objectPathFromText("Road.Name=\"x\",Number=7", "root/x")).code);
        });
        ASSERT_EQ(answered.get_future().get(), CMPI_RC_OK);
        broker.unload("Road"); // the thread is on its way out
        thread.join();
        expectUnmapped("libRoad.so");
    }
    EXPECT_EQ(broker.liveObjects().total(), 0U);
}

#ifdef HOST_PROVIDER
TEST(UnloadTest, UnmapsTheLibraryAfterRequests) {
    const Provider providers[] = {{HOST_PROVIDER,
                                   "OXAHostProvider",
                                   "OXATK_OperatingSystem",
                                   {MOF_FOLDER "/CIMSuperclasses.mof", MOF_FOLDER "/OXAHost.mof"}},
                                  {FIRST_PROVIDER, "DemoFileSystem", "Demo_FileSystem", {FIRST_MOF}}};
    for (const Provider& provider : providers) {
        SCOPED_TRACE(provider.name);
        oxahv::EmbeddedBroker broker;
        for (const char* const mof : provider.mofs) {
            broker.compileMof(mof);
        }
        for (int round = 0; round < 3; ++round) {
            broker.load(provider.library, provider.name);
            ASSERT_TRUE(isMapped(provider.library));
            // What a thread keeps of the libraries, it keeps to its end.
            std::thread([&] { askEverything(broker, provider.className); }).join();
            broker.unload(provider.name);
            expectUnmapped(provider.library);
        }
    }
}
#endif
