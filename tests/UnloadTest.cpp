// A provider library that is unloaded while a thread that was inside it ends. This program links the broker
// alone, so that the library, and what it brings along, leaves the process.
#include "EmbeddedBroker.h"

#include <cstring>
#include <future>
#include <gtest/gtest.h>
#include <link.h>
#include <string>
#include <thread>

namespace {

bool isLoaded(const char* name) {
    const auto compare = [](dl_phdr_info* info, std::size_t /*size*/, void* wanted) {
        return std::strstr(info->dlpi_name, static_cast<const char*>(wanted)) != nullptr ? 1 : 0;
    };
    return ::dl_iterate_phdr(compare, const_cast<char*>(name)) != 0;
}

} // namespace

TEST(AProviderLibrary, IsUnloadedWhileItsThreadsEnd) {
    oxahv::EmbeddedBroker broker;
    for (int round = 0; round < 1000; ++round) {
        broker.load(ROAD_PROVIDER, "Road");
        ASSERT_TRUE(isLoaded("oxahvproviderutilities"));
        std::promise<CMPIrc> answered;
        std::thread thread([&] {
            oxahv::Request request(broker);
            answered.set_value(
                request.getInstance(request.objectPathFromText("Road.Name=\"x\",Number=7", "root/x")).code);
        });
        ASSERT_EQ(answered.get_future().get(), CMPI_RC_OK);
        broker.unload("Road"); // the thread is on its way out
        thread.join();
#ifdef __clang__
        // GCC's unique symbols keep a library loaded; see Trace.h.
        for (const char* const name : {"TestRoadProvider", "oxahvproviderutilities", "oxahvlogger"}) {
            ASSERT_FALSE(isLoaded(name)) << name << " in round " << round;
        }
#endif
    }
    EXPECT_EQ(broker.liveObjects().total(), 0U);
}
