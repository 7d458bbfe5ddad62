// Instances within instances: where classes allow them, in arguments of methods, and as texts.
#include "EmbeddedBroker.h"
#include "ErrorOf.h"

#include <gtest/gtest.h>

using oxahv::EmbeddedBroker;
using oxahv::Reply;
using oxahv::Request;

namespace {

const char* const mof = R"(
class Demo_Inner { [Key] string Name; uint8 Size = 7; };
class Demo_Derived : Demo_Inner { real32 Part; boolean Flags[]; datetime Day = "00000001000000.000000:000"; };
class Demo_Other { string Text; };
class Demo_Outer {
    [Key] uint32 Id;
    [EmbeddedInstance("Demo_Inner")] string One;
    [EmbeddedInstance("Demo_Inner")] string Many[];
    [EmbeddedObject] string Any;
    Demo_Inner REF Ref;
    uint32 Take([In, Out, EmbeddedInstance("Demo_Inner")] string One,
                [In, Out, EmbeddedInstance("Demo_Inner")] string Many[], [In, Out] uint8 Numbers[],
                [In, Out] string Text);
};
)";

// Gives back the arguments that it gets.
CMPIStatus giveBack(CMPIMethodMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                    const char*, const CMPIArgs* in, CMPIArgs* out) {
    for (CMPICount i = 0; i < CMGetArgCount(in, nullptr); ++i) {
        CMPIString* name = nullptr;
        const CMPIData data = CMGetArgAt(in, i, &name, nullptr);
        CMAddArg(out, CMGetCharsPtr(name, nullptr), CMIsNullValue(data) ? nullptr : &data.value, data.type);
    }
    return CMReturnDone(result);
}

CMPIMethodMI* createProvider(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
    static CMPIMethodMIFT table = {};
    static CMPIMethodMI mi = {nullptr, &table};
    table.invokeMethod = giveBack;
    return &mi;
}

class EmbeddedInstances : public testing::Test {
protected:
    EmbeddedInstances() {
        broker_.compileMofText(mof, "demo.mof");
        broker_.host("Demo", {nullptr, nullptr, createProvider});
        outer_ = newInstance("Demo_Outer");
    }

    CMPIInstance* newInstance(const char* className) {
        return CMNewInstance(handle_, request_.objectPath("root", className), nullptr);
    }
    CMPIData read(const std::string& text) { return request_.valueFromText(text, CMPI_instance); }

    CMPIData arrayOf(std::initializer_list<CMPIInstance*> instances) {
        CMPIData data = {CMPI_instanceA, CMPI_goodValue, {}};
        data.value.array =
            CMNewArray(handle_, static_cast<CMPICount>(instances.size()), CMPI_instance, nullptr);
        CMPICount i = 0;
        for (CMPIInstance* const instance : instances) {
            CMPIValue value = {};
            value.inst = instance;
            CMSetArrayElementAt(data.value.array, i++, &value, CMPI_instance);
        }
        return data;
    }
    CMPIData instance(CMPIInstance* instance) {
        CMPIData data = {CMPI_instance, CMPI_goodValue, {}};
        data.value.inst = instance;
        return data;
    }
    CMPIrc set(const char* name, const CMPIData& data) {
        return CMSetProperty(outer_, name, &data.value, data.type).rc;
    }
    std::string get(const char* name) { return oxahv::valueText(CMGetProperty(outer_, name, nullptr)); }

    Reply take(const char* name, const CMPIData* data, CMPIType type) {
        CMPIArgs* const arguments = CMNewArgs(handle_, nullptr);
        CMAddArg(arguments, name, data != nullptr ? &data->value : nullptr, type);
        return request_.invokeMethod(request_.objectPath("root", "Demo_Outer"), "Take", arguments);
    }

    EmbeddedBroker broker_;
    const CMPIBroker* const handle_ = broker_.handle();
    Request request_{broker_};
    CMPIInstance* outer_ = nullptr;
};

} // namespace

TEST_F(EmbeddedInstances, AreOfTheClassThatTheDeclarationNames) {
    EXPECT_EQ(CMGetProperty(outer_, "One", nullptr).type, CMPI_instance);
    EXPECT_EQ(CMGetProperty(outer_, "Many", nullptr).type, CMPI_instanceA);
    const CMPIData inner = instance(newInstance("Demo_Inner"));
    const CMPIData derived = instance(newInstance("Demo_Derived"));
    const CMPIData other = instance(newInstance("Demo_Other"));
    EXPECT_EQ(set("One", inner), CMPI_RC_OK);
    EXPECT_EQ(set("One", derived), CMPI_RC_OK);
    EXPECT_EQ(set("One", other), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(set("One", arrayOf({})), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(CMSetProperty(outer_, "One", "instance of Demo_Inner { };", CMPI_chars).rc,
              CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(set("Any", other), CMPI_RC_OK);
    EXPECT_EQ(set("Many", arrayOf({derived.value.inst, inner.value.inst, nullptr})), CMPI_RC_OK);
    EXPECT_EQ(set("Many", arrayOf({inner.value.inst, other.value.inst})), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(set("Id", inner), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(get("Any"), "instance of Demo_Other { Text = NULL; }");
    EXPECT_EQ(get("Many").substr(0, 27), "{instance of Demo_Derived {");
    EXPECT_EQ(CMSetProperty(outer_, "One", nullptr, CMPI_instance).rc, CMPI_RC_OK);
    EXPECT_EQ(get("One"), "NULL");
}

TEST_F(EmbeddedInstances, AreReadFromMofAndWrittenAsTheyAreRead) {
    const char* const texts[][2] = {
        {"instance of demo_inner { NAME = \"a\\\"b\"; };",
         "instance of demo_inner { Name = \"a\\\"b\"; Size = 7; }"},
        {"instance of Demo_Derived { Size = NULL; [Old] Part = 1.5; Flags = {true, NULL}; };",
         "instance of Demo_Derived { Name = NULL; Size = NULL; Part = 1.5; Flags = {TRUE, NULL}; "
         "Day = \"00000001000000.000000:000\"; }"},
        {"instance of Demo_Outer { One = instance of Demo_Inner { Size = 1; }; Many = {NULL, instance of "
         "Demo_Inner { }}; Any = \"instance of \" \"Demo_Other { };\"; Ref = \"Demo_Inner.Name=\\\"x\\\"\"; "
         "}",
         "instance of Demo_Outer { Id = NULL; One = instance of Demo_Inner { Name = NULL; Size = 1; }; Many "
         "= "
         "{NULL, instance of Demo_Inner { Name = NULL; Size = 7; }}; Any = instance of Demo_Other { Text = "
         "NULL; }; Ref = \"Demo_Inner.Name=\\\"x\\\"\"; }"},
        {"instance of Demo_Outer { Many = { }; One = NULL; }",
         "instance of Demo_Outer { Id = NULL; One = NULL; Many = {}; Any = NULL; Ref = NULL; }"},
    };
    for (const auto& [text, written] : texts) {
        EXPECT_EQ(oxahv::valueText(read(text)), written);
        EXPECT_EQ(oxahv::valueText(read(written)), written);
    }
    const CMPIData keyed = read("instance of Demo_Inner { Name = \"x\"; }");
    EXPECT_EQ(oxahv::pathText(CMGetObjectPath(keyed.value.inst, nullptr)), "Demo_Inner.Name=\"x\"");
    std::string deep = "NULL";
    for (int i = 0; i < 65; ++i) {
        deep = "instance of Demo_Outer { Any = " + deep + "; }";
    }
    const std::string errors[][2] = {
        {"instance of Nowhere { }", "1:13: class Nowhere is not declared"},
        {"instance of Demo_Inner { Color = 1; }", "1:26: class Demo_Inner has no property Color"},
        {"instance of Demo_Inner { Size = 256; }", "1:33: 256 does not fit into uint8"},
        {"instance of Demo_Inner { Size = 1; } x", "1:38: expected the end, found 'x'"},
        {"instance of Demo_Outer { One = instance of Demo_Other { }; }",
         "1:32: expected an instance of Demo_Inner"},
        {"instance of Demo_Outer { One = 5; }", "1:32: expected an instance"},
        {"instance of Demo_Outer { One = { }; }", "1:32: expected one instance"},
        {"instance of Demo_Outer { Many = instance of Demo_Inner { }; }",
         "1:33: expected an array in braces"},
        {"instance of Demo_Outer { Id = instance of Demo_Inner { }; }",
         "1:31: expected a value of type uint32"},
        {"instance of Demo_Outer { Any = \"what\"; }",
         "1:32: its text:1:1: expected 'instance', found 'what'"},
        {deep, "1:" + std::to_string(64 * 31 + 1) + ": instances are nested more than 64 deep"},
    };
    for (const auto& [text, error] : errors) {
        const std::string& wrong = text;
        EXPECT_EQ(errorOf([&] { read(wrong); }), "embedded instance:" + error);
    }
}

TEST_F(EmbeddedInstances, AndNullsAndEmptyArraysPassAsArguments) {
    const CMPIData inner = read("instance of Demo_Inner { Size = 1; }");
    const CMPIData other = read("instance of Demo_Other { }");
    const Reply one = take("One", &inner, CMPI_instance);
    EXPECT_EQ(oxahv::valueText(CMGetArg(one.out, "One", nullptr)), oxahv::valueText(inner));
    const CMPIData many = arrayOf({inner.value.inst, nullptr});
    EXPECT_EQ(oxahv::valueText(CMGetArg(take("Many", &many, CMPI_instanceA).out, "Many", nullptr)),
              '{' + oxahv::valueText(inner) + ", NULL}");
    EXPECT_EQ(take("One", &other, CMPI_instance).message,
              "argument One of method Take is no instance of Demo_Inner");
    EXPECT_EQ(take("Many", &inner, CMPI_instance).message,
              "argument Many of method Take is no instance[] of Demo_Inner");
    CMPIData numbers = {CMPI_uint8A, CMPI_goodValue, {}};
    numbers.value.array = CMNewArray(handle_, 0, CMPI_uint8, nullptr);
    EXPECT_EQ(oxahv::valueText(CMGetArg(take("Numbers", &numbers, CMPI_uint8A).out, "Numbers", nullptr)),
              "{}");
    for (const auto& [name, type] :
         std::initializer_list<std::pair<const char*, CMPIType>>{{"One", CMPI_instance},
                                                                 {"Many", CMPI_instanceA},
                                                                 {"Numbers", CMPI_uint8A},
                                                                 {"Text", CMPI_string}}) {
        const Reply reply = take(name, nullptr, type);
        EXPECT_EQ(reply.code, CMPI_RC_OK) << name;
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        EXPECT_TRUE(CMIsNullValue(CMGetArg(reply.out, name, &status)) && status.rc == CMPI_RC_OK) << name;
    }
}

TEST_F(EmbeddedInstances, DoNotNestWithoutEnd) {
    CMPIInstance* nested = newInstance("Demo_Outer");
    int depth = 0;
    for (CMPIrc code = CMPI_RC_OK; code == CMPI_RC_OK && depth < 1000; ++depth) {
        outer_ = newInstance("Demo_Outer");
        code = set("Any", instance(nested));
        nested = outer_;
    }
    EXPECT_EQ(depth, 201);
}
