// Uses of what has died, and results that are handed on and freed.
#include "EmbeddedBroker.h"

#include <gtest/gtest.h>
#include <memory>
#include <optional>
#include <thread>

using oxahv::EmbeddedBroker;
using oxahv::Misuse;
using oxahv::Reply;
using oxahv::Request;

namespace {

const CMPIBroker* broker = nullptr;

constexpr int many = 5000;

// Returns as many instances as `many` says and releases nothing. Uses its first one, and one made before, to
// the end.
CMPIStatus enumerate(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                     const CMPIObjectPath* path, const char**) {
    CMPIInstance* const before = CMNewInstance(broker, path, nullptr);
    CMPIInstance* first = nullptr;
    for (CMPIUint32 i = 0; i < many; ++i) {
        CMPIInstance* const instance = CMNewInstance(broker, path, nullptr);
        CMSetProperty(instance, "Name", "some text", CMPI_chars);
        first = first != nullptr ? first : instance;
        CMPIStatus status = CMReturnInstance(result, instance);
        if (status.rc == CMPI_RC_OK) {
            status = CMSetProperty(first, "Number", reinterpret_cast<CMPIValue*>(&i), CMPI_uint32);
        }
        if (status.rc != CMPI_RC_OK) {
            return status;
        }
    }
    CMPIStatus status = CMSetProperty(before, "Name", "x", CMPI_chars);
    return status;
}

CMPIInstanceMI* createMI(const CMPIBroker* theBroker, const CMPIContext*, CMPIStatus*) {
    static CMPIInstanceMIFT table = {};
    static CMPIInstanceMI mi = {nullptr, &table};
    table.enumerateInstances = enumerate;
    broker = theBroker;
    return &mi;
}

class ADeadObject : public testing::Test {
protected:
    CMPIString* string(const char* text) { return CMNewString(broker_.handle(), text, nullptr); }

    void expectMisuse(const char* slot, const void* handle) {
        const std::vector<Misuse> misuses = broker_.takeMisuses();
        ASSERT_EQ(misuses.size(), 1U) << slot;
        EXPECT_EQ(misuses.front().slot, slot);
        EXPECT_EQ(misuses.front().handle, handle);
        EXPECT_EQ(misuses.front().thread, std::this_thread::get_id());
    }

    EmbeddedBroker broker_;
    std::optional<Request> request_{std::in_place, broker_};
};

} // namespace

TEST_F(ADeadObject, IsReportedWhenItIsReleasedAgain) {
    CMPIString* const text = string("text");
    EXPECT_EQ(CMRelease(text).rc, CMPI_RC_OK);
    EXPECT_EQ(CMRelease(text).rc, CMPI_RC_ERR_INVALID_HANDLE);
    expectMisuse("CMPIStringFT.release", text);
}

TEST_F(ADeadObject, IsReportedAcrossRequestsAsHandleArgumentAndValue) {
    CMPIObjectPath* const path = request_->objectPath("root", "Demo");
    CMPIInstance* const instance = CMNewInstance(broker_.handle(), path, nullptr);
    CMPIValue value = {};
    value.string = string("text");
    CMSetProperty(instance, "Name", &value, CMPI_string);
    const CMPIString* const part = CMGetProperty(instance, "Name", nullptr).value.string;
    request_.reset();
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    EXPECT_EQ(CMGetProperty(instance, "Name", &status).state & CMPI_nullValue, CMPI_nullValue);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_HANDLE);
    expectMisuse("CMPIInstanceFT.getProperty", instance);
    EXPECT_EQ(CMGetCharsPtr(part, &status), nullptr);
    expectMisuse("CMPIStringFT.getCharPtr", part);
    request_.emplace(broker_);
    EXPECT_EQ(CMNewInstance(broker_.handle(), path, &status), nullptr);
    expectMisuse("CMPIBrokerEncFT.newInstance", path);
    CMPIObjectPath* const fresh = request_->objectPath("root", "Demo");
    EXPECT_EQ(CMAddKey(fresh, "Name", &value, CMPI_string).rc, CMPI_RC_ERR_INVALID_HANDLE);
    expectMisuse("CMPIObjectPathFT.addKey", value.string);
}

TEST_F(ADeadObject, TakesItsTextAlong) {
    for (const char* const content : {"short", "a text that is longer than a string keeps within itself"}) {
        CMPIString* const text = string(content);
        const char* const chars = CMGetCharsPtr(text, nullptr);
        CMPIObjectPath* const path = request_->objectPath("root", "Demo");
        EXPECT_EQ(CMAddKey(path, "A", chars, CMPI_chars).rc, CMPI_RC_OK);
        CMRelease(text);
        EXPECT_EQ(CMAddKey(path, "B", chars, CMPI_chars).rc, CMPI_RC_ERR_INVALID_HANDLE);
        expectMisuse("CMPIObjectPathFT.addKey", chars);
        EXPECT_EQ(CMNewString(broker_.handle(), chars, nullptr), nullptr);
        expectMisuse("CMPIBrokerEncFT.newString", chars);
    }
    for (int i = 0; i < 10000; ++i) { // their memory is used again, and is nobody's mistake
        CMPIString* const text = string("text");
        EXPECT_NE(CMNewString(broker_.handle(), CMGetCharsPtr(text, nullptr), nullptr), nullptr);
        CMRelease(text);
    }
    EXPECT_TRUE(broker_.takeMisuses().empty());
}

TEST_F(ADeadObject, IsReportedByEachThreadThatUsesIt) {
    CMPIString* const text = string("text");
    CMRelease(text);
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&] {
            const Request request(broker_);
            for (int j = 0; j < 500; ++j) {
                CMPIString* const own = string("own");
                EXPECT_EQ(CMRelease(text).rc, CMPI_RC_ERR_INVALID_HANDLE);
                CMRelease(own);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(broker_.takeMisuses().size(), 1000U) << "no more are kept";
}

TEST(Results, AreHandedOnAndFreed) {
    EmbeddedBroker hosting;
    hosting.host("Many", {createMI});
    Request request(hosting);
    CMPIObjectPath* const path = request.objectPath("root", "Demo");
    int count = 0;
    std::size_t most = 0;
    request.setResultHandlers(
        [&](const CMPIInstance* instance) {
            count += CMIsNullValue(CMGetProperty(instance, "Name", nullptr)) ? 0 : 1;
            most = std::max(most, hosting.liveObjects().total());
        },
        nullptr);
    hosting.injectFault("CMPIInstanceFT.getProperty", {});
    const Reply reply = request.enumerateInstances(path);
    EXPECT_TRUE(reply.ok() && reply.instances.empty());
    EXPECT_EQ(count, many) << "no fault strikes the handler's calls";
    EXPECT_LT(most, static_cast<std::size_t>(many)) << "what the provider has done with is freed";
    hosting.clearFaults();
    request.setResultHandlers(nullptr, nullptr);
    EXPECT_EQ(request.enumerateInstances(path).instances.size(), static_cast<std::size_t>(many));
}

TEST(Results, WhoseHandlerThrowsFailTheProvider) {
    EmbeddedBroker hosting;
    hosting.host("Many", {createMI});
    Request request(hosting);
    request.setResultHandlers([](const CMPIInstance*) { throw std::runtime_error("full"); }, nullptr);
    EXPECT_EQ(request.enumerateInstances(request.objectPath("root", "Demo")).code, CMPI_RC_ERR_FAILED);
}
