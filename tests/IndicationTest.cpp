// Subscriptions: what the broker calls of indication providers, and which indications reach whom.
#include "EmbeddedBroker.h"

#include <atomic>
#include <gtest/gtest.h>
#include <optional>
#include <stdexcept>
#include <thread>

using oxahv::ClassDeclaration;
using oxahv::EmbeddedBroker;
using oxahv::Request;
using oxahv::Subscription;
using oxahv::SubscriptionError;

namespace {

// Two providers alike, each with a log of its calls.
template <int number>
struct Provider {
    static inline std::string log;
    static inline CMPIrc authorization = CMPI_RC_OK;
    static inline CMPIrc activation = CMPI_RC_OK;
    static inline const CMPISelectExp* filter = nullptr; // of the last activation
    static inline void (*atDeactivation)(const CMPIContext*) = nullptr;

    static std::string text(const CMPIString* string) { return CMGetCharsPtr(string, nullptr); }
    static void note(const std::string& call) { log += call + ' '; }

    static CMPIStatus authorizeFilter(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp* given,
                                      const char* className, const CMPIObjectPath* path, const char* owner) {
        note(std::string("authorize(") + className + ',' + text(CMGetNameSpace(path, nullptr)) + ':' +
             text(CMGetClassName(path, nullptr)) + ',' + owner + ')');
        filter = given;
        CMReturn(authorization);
    }
    static CMPIStatus mustPoll(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*, const char*,
                               const CMPIObjectPath*) {
        note("poll");
        CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
    }
    static CMPIStatus activateFilter(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp* given,
                                     const char*, const CMPIObjectPath*, CMPIBoolean isFirst) {
        note(isFirst != 0 ? "activate(first)" : "activate");
        EXPECT_EQ(given, filter);
        CMReturn(activation);
    }
    static CMPIStatus deActivateFilter(CMPIIndicationMI*, const CMPIContext* context, const CMPISelectExp*,
                                       const char*, const CMPIObjectPath*, CMPIBoolean isLast) {
        note(isLast != 0 ? "deactivate(last)" : "deactivate");
        if (atDeactivation != nullptr) {
            atDeactivation(context);
        }
        CMReturn(CMPI_RC_OK);
    }
    static CMPIStatus enableIndications(CMPIIndicationMI*, const CMPIContext*) {
        note("enable");
        CMReturn(CMPI_RC_OK);
    }
    static CMPIStatus disableIndications(CMPIIndicationMI*, const CMPIContext*) {
        note("disable");
        CMReturn(CMPI_RC_OK);
    }
    static CMPIStatus cleanup(CMPIIndicationMI*, const CMPIContext*, CMPIBoolean) {
        note("cleanup");
        CMReturn(CMPI_RC_OK);
    }

    static CMPIIndicationMI* create(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
        static CMPIIndicationMIFT table = {};
        static CMPIIndicationMI mi = {nullptr, &table};
        table.cleanup = cleanup;
        table.authorizeFilter = authorizeFilter;
        table.mustPoll = mustPoll;
        table.activateFilter = activateFilter;
        table.deActivateFilter = deActivateFilter;
        table.enableIndications = enableIndications;
        table.disableIndications = disableIndications;
        log.clear();
        authorization = activation = CMPI_RC_OK;
        atDeactivation = nullptr;
        return &mi;
    }
    static oxahv::ProviderFactories factories() {
        oxahv::ProviderFactories factories;
        factories.indication = create;
        return factories;
    }
    static std::string takeLog() { return std::exchange(log, {}); }
};
using First = Provider<1>;
using Second = Provider<2>;

constexpr std::chrono::milliseconds atOnce(0);

class SubscriptionTest : public testing::Test {
protected:
    SubscriptionTest() {
        broker_.declare(ClassDeclaration("Demo_Indication")
                            .property("Source", CMPI_string)
                            .property("SourceInstance", CMPI_string));
        broker_.declare(
            ClassDeclaration("Demo_Alert").superclass("Demo_Indication").property("Level", CMPI_uint8));
        broker_.host("First", First::factories(), {"Demo_Alert"});
    }

    // Delivers an indication, as a provider does.
    CMPIStatus deliver(const CMPIContext* context, const char* nameSpace, const char* className, int level) {
        const CMPIBroker* const b = broker_.handle();
        CMPIInstance* const indication =
            CMNewInstance(b, CMNewObjectPath(b, nameSpace, className, nullptr), nullptr);
        CMPIValue value = {};
        value.uint8 = static_cast<CMPIUint8>(level);
        CMSetProperty(indication, "Level", &value, CMPI_uint8);
        CMSetProperty(indication, "Source", className, CMPI_chars);
        return CBDeliverIndication(b, context, nameSpace, indication);
    }
    // The levels of what has come.
    static std::string levels(Subscription& subscription) {
        std::string levels;
        while (CMPIInstance* const next = subscription.next(atOnce)) {
            levels += oxahv::valueText(CMGetProperty(next, "Level", nullptr)) + ' ';
        }
        return levels;
    }

    EmbeddedBroker broker_;
    Request request_{broker_};
};

const oxahv::IndicationFilter alerts = {"SELECT * FROM Demo_Alert", "WQL", "root/demo", "me"};

} // namespace

TEST_F(SubscriptionTest, CallsItsProviderLikeAServer) {
    std::optional<Subscription> one(std::in_place, broker_, alerts);
    EXPECT_EQ(First::takeLog(), "authorize(Demo_Alert,root/demo:Demo_Alert,me) poll activate(first) enable ");
    EXPECT_EQ(First::text(CMGetSelExpString(First::filter, nullptr)), alerts.query);
    std::optional<Subscription> same(std::in_place, broker_, alerts);
    EXPECT_EQ(First::takeLog(), "authorize(Demo_Alert,root/demo:Demo_Alert,me) poll activate ");
    Subscription above(broker_, {"SELECT * FROM Demo_Indication WHERE SourceInstance ISA Demo_Alert",
                                 "DMTF:CQL", "root/demo"});
    EXPECT_EQ(First::takeLog(), "authorize(Demo_Indication,root/demo:Demo_Alert,) poll activate(first) ");
    one.reset();
    EXPECT_EQ(First::takeLog(), "deactivate ");
    above.end();
    above.end();
    EXPECT_EQ(First::takeLog(), "deactivate(last) ");
    same.reset();
    EXPECT_EQ(First::takeLog(), "deactivate(last) disable ");
}

TEST_F(SubscriptionTest, GetsIndicationsThatPassItsFilter) {
    Subscription all(broker_, {"SELECT * FROM Demo_Indication", "WQL", "/root/demo"});
    Subscription high(broker_, {"SELECT Level FROM Demo_Alert WHERE Level > 3", "WQL", "Root/Demo"});
    const std::pair<const char*, int> rows[] = {{"root/demo", 5}, {"root/demo", 2}, {"root/other", 9}};
    for (const auto& [nameSpace, level] : rows) {
        EXPECT_EQ(deliver(request_.context(), nameSpace, "Demo_Alert", level).rc, CMPI_RC_OK);
    }
    EXPECT_EQ(deliver(request_.context(), "root/demo", "Demo_Indication", 0).rc, CMPI_RC_OK);
    EXPECT_EQ(all.waiting(), 3U);
    EXPECT_EQ(levels(all), "5 2 NULL ");
    const CMPIInstance* const alert = high.next(atOnce);
    EXPECT_EQ(CMGetProperty(alert, "Level", nullptr).value.uint8, 5);
    EXPECT_TRUE(CMIsNullValue(CMGetProperty(alert, "Source", nullptr))) << "not selected";
    EXPECT_EQ(high.waiting(), 0U);
    high.end();
    deliver(request_.context(), "root/demo", "Demo_Alert", 7);
    EXPECT_EQ(levels(high), "");
    EXPECT_EQ(levels(all), "7 ");
    const CMPIBroker* const b = broker_.handle();
    EXPECT_EQ(CBDeliverIndication(b, nullptr, "root/demo", alert).rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(CBDeliverIndication(b, request_.context(), "root/demo", nullptr).rc,
              CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(SubscriptionTest, GetsIndicationsOfAnAttachedThread) {
    Subscription subscription(broker_, alerts);
    const CMPIBroker* const b = broker_.handle();
    CMPIContext* const prepared = b->bft->prepareAttachThread(b, request_.context());
    std::thread thread([&] {
        CBAttachThread(b, prepared);
        for (int level = 1; level <= 3; ++level) {
            deliver(prepared, "root/demo", "Demo_Alert", level);
        }
        CBDetachThread(b, prepared);
    });
    const CMPIInstance* const first = subscription.next(std::chrono::seconds(60));
    thread.join();
    EXPECT_EQ(CMGetProperty(first, "Level", nullptr).value.uint8, 1);
    EXPECT_EQ(levels(subscription), "2 3 ");
    CMRelease(prepared);
}

TEST_F(SubscriptionTest, ReportsWhyItFails) {
    const auto codeOf = [&](const char* query, const char* language) {
        try {
            const Subscription subscription(broker_, {query, language});
            return CMPI_RC_OK;
        } catch (const SubscriptionError& error) {
            EXPECT_STRNE(error.what(), "");
            return error.code();
        }
    };
    broker_.declare(ClassDeclaration("Other"));
    EXPECT_EQ(codeOf("SELECT * FROM Other", "WQL"), CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(codeOf("SELECT * FROM None", "WQL"), CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(codeOf("SELECT", "WQL"), CMPI_RC_ERR_INVALID_QUERY);
    EXPECT_EQ(codeOf("SELECT * FROM Demo_Alert", "SQL"), CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED);
    EXPECT_EQ(First::takeLog(), "");
    First::authorization = CMPI_RC_ERR_ACCESS_DENIED;
    EXPECT_EQ(codeOf("SELECT * FROM Demo_Alert", "WQL"), CMPI_RC_ERR_ACCESS_DENIED);
    EXPECT_EQ(First::takeLog(), "authorize(Demo_Alert,root/cimv2:Demo_Alert,) ");
    First::authorization = CMPI_RC_OK;
    First::activation = CMPI_RC_ERR_FAILED;
    EXPECT_EQ(codeOf("SELECT * FROM Demo_Alert", "WQL"), CMPI_RC_ERR_FAILED);
    EXPECT_EQ(First::takeLog(), "authorize(Demo_Alert,root/cimv2:Demo_Alert,) poll activate(first) ");
}

TEST_F(SubscriptionTest, LastsUntilItsProvidersAreUnloaded) {
    broker_.host("Second", Second::factories());
    Second::authorization = CMPI_RC_ERR_NOT_SUPPORTED;
    Subscription one(broker_, alerts);
    Second::authorization = CMPI_RC_OK;
    Subscription both(broker_, alerts);
    EXPECT_EQ(one.providers(), std::vector<std::string>({"First"}));
    EXPECT_EQ(both.providers(), std::vector<std::string>({"First", "Second"}));
    First::log.clear();
    broker_.unload("First");
    EXPECT_EQ(First::takeLog(), "deactivate deactivate(last) disable cleanup ");
    EXPECT_EQ(one.providers(), std::vector<std::string>());
    Second::log.clear();
    one.end();
    both.end();
    EXPECT_EQ(Second::takeLog(), "deactivate(last) disable ");
}

// A destructor that no thread's end and no exception can leave.
TEST_F(SubscriptionTest, EndsWhateverItsProviderDoes) {
    std::string told;
    broker_.setMessageHandler([&](const oxahv::BrokerMessage& message) { told = message.text; });
    {
        const Subscription subscription(broker_, alerts);
        First::atDeactivation = [](const CMPIContext*) { throw std::runtime_error("lost"); };
    }
    EXPECT_EQ(told, "provider First: deActivateFilter answered CMPI_RC_ERR_FAILED: exception: lost");
    {
        const Subscription subscription(broker_, alerts);
        static const CMPIBroker* const b = broker_.handle();
        First::atDeactivation = [](const CMPIContext*) { b->xft->exitThread(nullptr); };
    }
    First::atDeactivation = nullptr;
    First::log.clear();
    const Subscription another(broker_, alerts);
    EXPECT_EQ(First::takeLog(), "authorize(Demo_Alert,root/demo:Demo_Alert,me) poll activate(first) enable ");
}

// For the thread sanitizer: deliveries while subscriptions come and go.
TEST_F(SubscriptionTest, MayEndWhileAnotherThreadDelivers) {
    std::atomic<bool> isOver{false};
    std::thread thread([&] {
        while (!isOver) {
            Request request(broker_);
            deliver(request.context(), "root/demo", "Demo_Alert", 1);
        }
    });
    for (int i = 0; i < 50; ++i) {
        Subscription subscription(broker_, alerts);
        const Request request(broker_);
        EXPECT_NE(subscription.next(std::chrono::seconds(60)), nullptr);
    }
    isOver = true;
    thread.join();
}
