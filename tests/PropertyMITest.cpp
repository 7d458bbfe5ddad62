// Requests for single properties, to a provider with a property MI that reads and does not write.
#include "Factory.h"

#include <gtest/gtest.h>

using oxahv::EmbeddedBroker;
using oxahv::Reply;
using oxahv::Request;

namespace {

std::string asked; // by the MIs

CMPIStatus readProperty(CMPIPropertyMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                        const char* name) {
    asked += std::string("get ") + name + ' ';
    CMPIValue seven = {};
    seven.uint8 = 7;
    return CMReturnData(result, &seven, CMPI_uint8);
}

CMPIStatus writeProperty(CMPIPropertyMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                         const char* name, const CMPIData data) {
    asked += std::string("set ") + name + '=' + oxahv::valueText(data) + ' ';
    CMReturn(data.type == CMPI_uint8 ? CMPI_RC_OK : CMPI_RC_ERR_TYPE_MISMATCH);
}

CMPIStatus modify(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                  const CMPIInstance* instance, const char** properties) {
    asked += std::string("modify ") + properties[0] + '=' +
             oxahv::valueText(CMGetProperty(instance, properties[0], nullptr)) + ' ';
    CMReturn(CMPI_RC_OK);
}

const CMPIPropertyMIFT reading = {0, 0, "", {}, {}, readProperty, {}};
const CMPIPropertyMIFT writing = {0, 0, "", {}, writeProperty, readProperty, {}};
const CMPIInstanceMIFT modifying = {0, 0, "", {}, {}, {}, {}, {}, modify, {}, {}, {}};

class PropertyMITest : public testing::Test {
protected:
    PropertyMITest() {
        asked.clear();
        broker_.declare(oxahv::ClassDeclaration("Demo").key("K", CMPI_uint8).property("Speed", CMPI_uint8));
    }

    void host(decltype(oxahv::ProviderFactories::property) factory) {
        oxahv::ProviderFactories factories;
        factories.instance = create<modifying>;
        factories.property = factory;
        broker_.host("Tested", factories, {"Demo"});
    }
    CMPIObjectPath* path() { return request_.objectPathFromText("root:Demo.K=1", ""); }
    CMPIrc set(const char* text, CMPIType type) {
        return request_.setProperty(path(), "speed", request_.valueFromText(text, type)).code;
    }

    EmbeddedBroker broker_;
    Request request_{broker_};
};

} // namespace

TEST_F(PropertyMITest, ServesItsProperties) {
    host(create<writing>);
    EXPECT_EQ(request_.getProperty(path(), "Speed").data.at(0).value.uint8, 7);
    EXPECT_EQ(set("9", CMPI_uint8), CMPI_RC_OK);
    EXPECT_EQ(set("9", CMPI_string), CMPI_RC_ERR_TYPE_MISMATCH);
    const Reply unknown = request_.getProperty(path(), "None");
    EXPECT_EQ(oxahv::codeName(unknown.code) + ' ' + unknown.message,
              "CMPI_RC_ERR_NO_SUCH_PROPERTY class Demo has no property None");
    const CMPIBroker* const b = broker_.handle();
    CMPIValue three = {};
    three.uint8 = 3;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    EXPECT_EQ(b->bft->setProperty(b, request_.context(), path(), "Speed", &three, CMPI_uint8).rc, CMPI_RC_OK);
    EXPECT_EQ(b->bft->getProperty(b, request_.context(), path(), "Speed", &status).value.uint8, 7);
    EXPECT_EQ(asked, "get Speed set speed=9 set Speed=3 get Speed ");
}

TEST_F(PropertyMITest, WritesThroughTheInstanceWhereItOnlyReads) {
    host(create<reading>);
    EXPECT_EQ(set("9", CMPI_uint8), CMPI_RC_OK);
    CMPIData none = {};
    none.type = CMPI_uint8;
    none.state = CMPI_nullValue;
    EXPECT_EQ(request_.setProperty(path(), "Speed", none).code, CMPI_RC_OK);
    EXPECT_EQ(asked, "modify speed=9 modify Speed=NULL ");
}
