// Indications and single properties by the kit: subscriptions, delivery from a thread of the provider's own,
// and properties that are read and set one by one.

#include "EmbeddedBroker.h"
#include "ProviderKit.h"

#include <gtest/gtest.h>
#include <thread>

namespace {

std::string calls; // of the server, in their order

class Alerts : public oxahv::IndicationProvider, public oxahv::PropertyProvider {
public:
    void authorize(const oxahv::Operation& operation, const oxahv::SubscriptionFilter& filter,
                   const char* owner) override {
        calls += std::string("authorize ") + operation.className() + ' ' + filter.className() + ' ' + owner +
                 " [" + filter.query() + "] ";
        if (std::string(owner) == "nobody") {
            throw oxahv::Refusal(CMPI_RC_ERR_ACCESS_DENIED, "not for you");
        }
    }
    void activate(const oxahv::Operation& /*operation*/, const oxahv::SubscriptionFilter& /*filter*/,
                  bool isFirst) override {
        calls += isFirst ? "activate first " : "activate ";
    }
    void deactivate(const oxahv::Operation& /*operation*/, const oxahv::SubscriptionFilter& /*filter*/,
                    bool isLast) override {
        calls += isLast ? "deactivate last " : "deactivate ";
    }
    void enable(const oxahv::Context& context) override {
        calls += "enable ";
        thread_ = std::thread([indications = oxahv::Indications(context)]() mutable {
            for (int level = 1; level <= 3; ++level) {
                indications.deliver("root/cimv2", "Kit_Alert", [&](oxahv::Instance& alert) {
                    alert.set("Level", level).set("Text", L"\u00fc");
                });
            }
        });
    }
    void disable(const oxahv::Context& /*context*/) override {
        thread_.join();
        calls += "disable ";
    }

    void getProperty(const oxahv::Operation& operation, const char* name, oxahv::ValueReply& reply) override {
        operation.key<int>("Id");
        if (!oxahv::detail::sameName(name, "Level")) {
            throw oxahv::Refusal(CMPI_RC_ERR_NO_SUCH_PROPERTY, name);
        }
        reply.give(level_);
    }
    void setProperty(const oxahv::Operation& /*operation*/, const char* /*name*/,
                     const oxahv::SentValue& value) override {
        level_ = value.as<std::uint8_t>();
    }

private:
    std::thread thread_;
    std::uint8_t level_ = 7;
};

} // namespace

OXAHV_PROVIDER(KitAlerts, Alerts);

class KitEvents : public testing::Test {
protected:
    KitEvents() {
        calls.clear();
        broker_.declare(
            oxahv::ClassDeclaration("Kit_Alert").property("Level", CMPI_uint8).property("Text", CMPI_string));
        broker_.declare(
            oxahv::ClassDeclaration("Kit_Light").key("Id", CMPI_uint16).property("Level", CMPI_uint8));
        oxahv::ProviderFactories factories;
        factories.indication = KitAlerts_Create_IndicationMI;
        factories.property = KitAlerts_Create_PropertyMI;
        broker_.host("KitAlerts", factories);
    }

    oxahv::EmbeddedBroker broker_;
};

TEST_F(KitEvents, IndicationsArriveFromTheProvidersOwnThread) {
    const oxahv::LiveObjects before = broker_.liveObjects();
    {
        oxahv::Request request(broker_);
        const oxahv::IndicationFilter filter = {"SELECT * FROM Kit_Alert WHERE Level > 1", "WQL",
                                                "root/cimv2", "me"};
        oxahv::Subscription subscription(broker_, filter);
        std::string arrived;
        for (int i = 0; i < 2; ++i) {
            CMPIInstance* const alert = subscription.next(std::chrono::seconds(20));
            ASSERT_NE(alert, nullptr);
            const oxahv::Instance instance(broker_.handle(), alert);
            arrived += std::to_string(instance.get<int>("Level")) + instance.get<std::string>("Text") + ' ';
        }
        EXPECT_EQ(arrived, "2\u00fc 3\u00fc ");
        oxahv::Subscription second(broker_, filter);
        second.end();
        subscription.end();
        const std::string authorize =
            "authorize Kit_Alert Kit_Alert me [SELECT * FROM Kit_Alert WHERE Level > 1] ";
        EXPECT_EQ(calls, authorize + "activate first enable " + authorize +
                             "activate deactivate deactivate last disable ");
    }
    EXPECT_EQ(broker_.liveObjects().instances, before.instances) << "they die with each delivery";
    EXPECT_EQ(broker_.liveObjects().objectPaths, before.objectPaths);
    try {
        const oxahv::Subscription refused(broker_,
                                          {"SELECT * FROM Kit_Alert", "WQL", "root/cimv2", "nobody"});
        ADD_FAILURE();
    } catch (const oxahv::SubscriptionError& error) {
        EXPECT_EQ(error.code(), CMPI_RC_ERR_ACCESS_DENIED);
    }
}

TEST_F(KitEvents, SinglePropertiesAreReadAndSetByType) {
    oxahv::Request request(broker_);
    const CMPIObjectPath* const light = request.objectPathFromText("Kit_Light.Id=1", "root/cimv2");
    CMPIData data = {CMPI_uint8, CMPI_goodValue, {}};
    data.value.uint8 = 9;
    EXPECT_TRUE(request.setProperty(light, "Level", data).ok());
    const oxahv::Reply reply = request.getProperty(light, "level");
    ASSERT_EQ(reply.data.size(), 1U) << reply.message;
    EXPECT_EQ(reply.data[0].value.uint8, 9);
    data.type = CMPI_uint16;
    data.value.uint16 = 256;
    const oxahv::Reply tooLarge = request.setProperty(light, "Level", data);
    EXPECT_FALSE(tooLarge.ok());
    EXPECT_EQ(request.getProperty(light, "Level").data.at(0).value.uint8, 9);
}
