// The accessors of single values: what each calls the broker for, in which order, and what becomes of every
// answer.
#include "BrokerTest.h"
#include "TestLocales.h"

#ifdef __cdecl
#error "ProviderUtilities.h leaves a macro of its own defined"
#endif

using PU = TK::ProviderUtilities;

namespace {

const std::string dateText = "20090307050409.000123-300";
const std::string untouched = "untouched";
const std::string widening = passing(utility, "AStringToWString");
const std::string chars = "getCharPtr\n";
const std::string noConversion = "throws String Conversion Failed !!\n";
const std::string conversionFailed = "Failed to convert the data to Multi byte";

template <class Value>
std::string textOf(const Value& value) {
    if constexpr (std::is_same_v<Value, CMPIString*>) {
        CMPIValue record = {};
        record.string = value;
        return oxahv::valueText({CMPI_string, CMPI_goodValue, record});
    } else if constexpr (std::is_same_v<Value, CMPIObjectPath*>) {
        return oxahv::pathText(value);
    } else {
        return testing::PrintToString(value);
    }
}

// The getters differ in the types of what they read from and to.
template <class Object, class Value>
bool read(const Object* from, const char* name, Value& out) {
    if constexpr (std::is_same_v<Object, CMPIObjectPath> && std::is_pointer_v<Value>) {
        return PU::getKeyProperty(from, name, &out);
    } else if constexpr (std::is_same_v<Object, CMPIObjectPath>) {
        return PU::getKeyProperty(from, name, out);
    } else if constexpr (std::is_pointer_v<Value>) {
        return PU::getProperty(from, name, &out);
    } else if constexpr (std::is_same_v<Object, CMPIInstance> && std::is_same_v<Value, std::string>) {
        return PU::getProperty(from, name, out, name == std::string("Date"));
    } else {
        return PU::getProperty(from, name, out);
    }
}

// A getter: the call of the broker that it begins with, what it does behind it, and what it reads.
struct Getter {
    std::string slot;
    std::string name;
    std::string rest;
    std::string value;
    std::function<std::string(const char* name)> get;
};

// What getters read from.
struct Objects {
    const CMPIInstance* instance;
    const CMPIArgs* args;
    const CMPIObjectPath* path;
};

class AccessorsTest : public BrokerTest {
protected:
    AccessorsTest() {
        CMPIValue value = {};
        store("Null", nullptr, CMPI_string);
        store("Text", "text", CMPI_chars);
        value.uint16 = 60000;
        store("Short", &value, CMPI_uint16);
        value.uint32 = 4000000000U;
        store("Int", &value, CMPI_uint32);
        value.boolean = 2; // any nonzero byte is true
        store("Flag", &value, CMPI_boolean);
        value.ref = request_.objectPath("root", "Other");
        store("Path", &value, CMPI_ref);
        value.dateTime = CMNewDateTimeFromChars(broker_.handle(), dateText.c_str(), nullptr);
        store("Date", &value, CMPI_dateTime);
    }

    void store(const char* name, const void* value, CMPIType type) {
        CMSetProperty(instance_, name, value, type);
        CMAddKey(path_, name, value, type);
        CMAddArg(args_, name, value, type);
    }

    template <class Value, class Object>
    static Getter getter(const Object* from, const std::string& name, const std::string& value,
                         const std::string& rest = "") {
        const auto get = [from](const char* wanted) {
            const Value before{};
            Value out = before;
            return read(from, wanted, out) ? textOf(out) : out == before ? untouched : "changed";
        };
        const char* const slot = std::is_same_v<Object, CMPIInstance> ? "getProperty"
                                 : std::is_same_v<Object, CMPIArgs>   ? "getArg"
                                                                      : "getKey";
        return {slot, name, rest, value, get};
    }
    template <class Text>
    static std::vector<Getter> textGetters(const Objects& from, const std::string& value,
                                           const std::string& rest) {
        return {getter<Text>(from.instance, "Text", value, rest),
                getter<Text>(from.args, "Text", value, rest), getter<Text>(from.path, "Text", value, rest)};
    }
    static Getter dateGetter(const CMPIInstance* from) {
        return getter<std::string>(from, "Date", '"' + dateText + '"', "getStringFormat\n" + chars);
    }
    static std::vector<Getter> allGetters(const Objects& from) {
        std::vector<Getter> all = {dateGetter(from.instance),
                                   getter<CMPIString*>(from.instance, "Text", "\"text\""),
                                   getter<CMPIString*>(from.path, "Text", "\"text\""),
                                   getter<CMPIObjectPath*>(from.path, "Path", "root:Other"),
                                   getter<unsigned short>(from.instance, "Short", "60000"),
                                   getter<unsigned short>(from.args, "Short", "60000"),
                                   getter<unsigned int>(from.instance, "Int", "4000000000"),
                                   getter<unsigned int>(from.args, "Int", "4000000000"),
                                   getter<bool>(from.instance, "Flag", "true"),
                                   getter<bool>(from.args, "Flag", "true")};
        for (const std::vector<Getter>& texts :
             {textGetters<std::string>(from, "\"text\"", chars),
              textGetters<std::wstring>(from, "L\"text\"", chars + widening)}) {
            all.insert(all.end(), texts.begin(), texts.end());
        }
        return all;
    }

    void expect(const Getter& getter, const std::string& name, const std::string& rest,
                const std::string& value) {
        EXPECT_EQ(logOf([&] { EXPECT_EQ(getter.get(name.c_str()), value) << getter.slot << name; }),
                  getter.slot + ' ' + name + '\n' + rest);
    }
    void expectValue(const Getter& getter) { expect(getter, getter.name, getter.rest, getter.value); }
    void expectNothing(const Getter& getter, const std::string& name) { expect(getter, name, "", untouched); }

    // A setter's one call, with the value's text also from what is set then.
    template <class Set>
    void expectSet(const Set& set, const std::string& slot, const std::string& type, const std::string& text,
                   const std::string& traces = "") {
        const std::string log =
            traces + slot + " Name " + type + (type == "chars" ? "" : " = " + text) + '\n';
        EXPECT_EQ(logOf(set, "*", anError), log) << "the broker's status is dropped";
        EXPECT_EQ(logOf(set), log);
        EXPECT_EQ(oxahv::valueText(slot == "addKey" ? CMGetKey(path_, "Name", nullptr)
                                                    : CMGetProperty(instance_, "Name", nullptr)),
                  text);
    }

    const ThreadLocale plain_{"C"};
    CMPIObjectPath* const path_ = request_.objectPath("root/cimv2", "Demo_Class");
    CMPIInstance* const instance_ = PU::createInstance(broker_.handle(), path_);
    CMPIArgs* const args_ = CMNewArgs(broker_.handle(), nullptr);
    const Objects objects_{instance_, args_, path_};
};

} // namespace

TEST_F(AccessorsTest, GettersReadTheValueOrKeepTheOutput) {
    for (const Getter& getter : allGetters(objects_)) {
        expectValue(getter);
        expectNothing(getter, "Missing");
        expectNothing(getter, "Null");
        broker_.injectFault("*", {CMPI_RC_OK, false, CMPI_nullValue});
        expectNothing(getter, getter.name);
        broker_.injectFault("*", {CMPI_RC_OK, false, CMPI_keyValue | CMPI_notFound | CMPI_badValue});
        expectValue(getter); // only the NULL bit counts
    }
}

TEST_F(AccessorsTest, GettersConvertWideTexts) {
    store("Text", "", CMPI_chars);
    for (const Getter& getter : textGetters<std::wstring>(objects_, "L\"\"", chars)) {
        expectValue(getter);
    }
    store("Text", "t\xC3\xA4", CMPI_chars);
    for (const Getter& getter : textGetters<std::wstring>(objects_, untouched, chars + widening)) {
        expect(getter, "Text",
               getter.rest + message(providerUtilities,
                                     getter.slot == "getKey" ? "getKeyProperty" : "getProperty",
                                     conversionFailed),
               untouched);
    }
    const ThreadLocale utf8("C.UTF-8");
    for (const Getter& getter : textGetters<std::wstring>(objects_, "L\"t\\xE4\"", chars + widening)) {
        expectValue(getter);
    }
}

TEST_F(AccessorsTest, GettersIgnoreTheTypeOfTheValue) {
    const auto retype = [](CMPIData& data, CMPIStatus& /*status*/) { data.type = CMPI_sint8; };
    Otherwise<&CMPIInstanceFT::getProperty> instance(instance_, retype);
    Otherwise<&CMPIArgsFT::getArg> args(args_, retype);
    Otherwise<&CMPIObjectPathFT::getKey> path(path_, retype);
    for (const Getter& getter : allGetters({instance.handle(), args.handle(), path.handle()})) {
        expectValue(getter);
    }
    unsigned int wide = 0;
    EXPECT_TRUE(PU::getProperty(instance_, "Short", wide));
    EXPECT_EQ(wide & 0xFFFFU, 60000U);
}

TEST_F(AccessorsTest, GettersRejectAValueWithAnError) {
    Otherwise<&CMPIInstanceFT::getProperty> instance(instance_);
    Otherwise<&CMPIArgsFT::getArg> args(args_);
    Otherwise<&CMPIObjectPathFT::getKey> path(path_);
    for (const Getter& getter : allGetters({instance.handle(), args.handle(), path.handle()})) {
        expectNothing(getter, getter.name);
    }
    Otherwise<&CMPIObjectPathFT::getClassName> unnamed(path_);
    EXPECT_EQ(PU::getClassName(unnamed.handle()), "");
    Otherwise<&CMPIObjectPathFT::getNameSpace> homeless(path_);
    EXPECT_EQ(PU::getNamespace(homeless.handle()), "");
    Otherwise<&CMPIStringFT::getCharPtr> string(newString("text"));
    EXPECT_EQ(logOf([&] { PU::convertToString(string.handle()); }), chars + noConversion);
    Otherwise<&CMPIBrokerEncFT::newInstance> broker(broker_.handle());
    EXPECT_EQ(PU::createInstance(broker.handle(), path_), nullptr);
}

// Of a text's characters the status counts, but not with an argument; of a date's text it never does.
TEST_F(AccessorsTest, TwoGettersAcceptATextWithAnError) {
    Otherwise<&CMPIStringFT::getCharPtr> string(newString("text"));
    const auto alter = [&](CMPIData& data, CMPIStatus& /*status*/) { data.value.string = string.handle(); };
    Otherwise<&CMPIInstanceFT::getProperty> instance(instance_, alter);
    Otherwise<&CMPIArgsFT::getArg> args(args_, alter);
    Otherwise<&CMPIObjectPathFT::getKey> path(path_, alter);
    for (const Getter& getter : allGetters({instance.handle(), args.handle(), path.handle()})) {
        if (getter.slot == "getArg" && getter.rest == chars) {
            expectValue(getter);
        } else if (getter.rest.rfind(chars, 0) == 0) {
            expect(getter, "Text", chars, untouched);
        }
    }

    Otherwise<&CMPIDateTimeFT::getStringFormat> date(
        CMGetProperty(instance_, "Date", nullptr).value.dateTime);
    Otherwise<&CMPIInstanceFT::getProperty> dated(
        instance_, [&](CMPIData& data, CMPIStatus& /*status*/) { data.value.dateTime = date.handle(); });
    expectValue(dateGetter(dated.handle()));
}

TEST_F(AccessorsTest, ConvertsStringsAndCreatesInstances) {
    CMPIString* const string = newString("text");
    EXPECT_EQ(logOf([&] { EXPECT_EQ(PU::convertToString(string), "text"); }), chars);
    EXPECT_EQ(logOf([&] { PU::convertToString(nullptr); }), noConversion);
    EXPECT_EQ(logOf([&] { EXPECT_EQ(PU::getClassName(path_), "Demo_Class"); }), "getClassName\n" + chars);
    EXPECT_EQ(logOf([&] { EXPECT_EQ(PU::getNamespace(path_), "root/cimv2"); }), "getNameSpace\n" + chars);
    EXPECT_EQ(logOf([&] { EXPECT_NE(PU::createInstance(broker_.handle(), path_), nullptr); }),
              "newInstance\n");
    for (const oxahv::Fault& fault : {anError, nothing}) {
        const auto getNamespace = [&] { EXPECT_EQ(PU::getNamespace(path_), ""); };
        EXPECT_EQ(logOf(getNamespace, "*", fault), "getNameSpace\n");
        EXPECT_EQ(logOf(getNamespace, "CMPIStringFT.getCharPtr", fault), "getNameSpace\n" + chars);
        broker_.injectFault("*", fault);
        EXPECT_EQ(PU::createInstance(broker_.handle(), path_), nullptr);
    }
}

TEST_F(AccessorsTest, SettersPassEveryTypeWithItsCode) {
    const auto checkProperty = [&](auto value, const std::string& type, const std::string& text) {
        expectSet([&] { PU::setProperty(instance_, "Name", value); }, "setProperty", type, text);
    };
    const auto check = [&](auto value, const std::string& type, const std::string& text) {
        expectSet([&] { PU::setKeyProperty(path_, "Name", value); }, "addKey", type, text);
        checkProperty(value, type, text);
    };
    check(static_cast<unsigned char>(200), "uint8", "200");
    check(static_cast<unsigned short>(60000), "uint16", "60000");
    check(4000000000U, "uint32", "4000000000");
    check(~0ULL, "uint64", "18446744073709551615");
    check("chars", "chars", "\"chars\"");
    check(std::string("text"), "chars", "\"text\"");
    check(newString("string"), "string", "\"string\"");
    check(request_.objectPath("root", "Other"), "reference", "\"root:Other\"");
    std::string own = "its own characters are handed over, not a copy's";
    broker_.startRecording();
    PU::setKeyProperty(path_, "Name", own);
    PU::setProperty(instance_, "Name", own);
    for (const oxahv::Call& call : broker_.stopRecording()) {
        EXPECT_EQ(call.value.chars, own.c_str());
    }
    checkProperty(true, "boolean", "TRUE");
    checkProperty(false, "boolean", "FALSE");
    checkProperty(static_cast<short>(-2), "sint16", "-2");
    checkProperty(1.5F, "real32", "1.5");
    checkProperty(-0.25, "real64", "-0.25");
}

TEST_F(AccessorsTest, SettersPassTextsOrDates) {
    const auto set = [&](std::string value, bool isDate, const oxahv::Fault& fault = {CMPI_RC_OK}) {
        return logOf([&] { PU::setProperty(broker_.handle(), instance_, "Name", value, isDate); }, "*",
                     fault);
    };
    const auto asked = [](const std::string& text) {
        return variable(providerUtilities, "setProperty", "isDate", "1") +
               variable(providerUtilities, "setProperty", "Date", text) + "newDateTimeFromChars " + text +
               '\n';
    };
    const std::string made = asked(dateText);
    std::string text = dateText;
    expectSet([&] { PU::setProperty(broker_.handle(), instance_, "Name", text, false); }, "setProperty",
              "chars", '"' + dateText + '"');
    EXPECT_EQ(set(dateText, true), made + "setProperty Name datetime = \"" + dateText + "\"\n");
    EXPECT_EQ(set("yesterday", true), asked("yesterday"));
    EXPECT_EQ(set(dateText, true, anError), made);
    EXPECT_EQ(set(dateText, true, nothing), made);
    Otherwise<&CMPIBrokerEncFT::newDateTimeFromChars> erring(broker_.handle());
    EXPECT_EQ(logOf([&] { PU::setProperty(erring.handle(), instance_, "Name", text, true); }), made);
}

TEST_F(AccessorsTest, SettersConvertWideTexts) {
    const std::string converted = passing(utility, "WStringToAString");
    const auto check = [&](std::wstring value, const std::string& traces, const std::string& text) {
        expectSet([&] { PU::setKeyProperty(path_, "Name", value); }, "addKey", "chars", text, traces);
        expectSet([&] { PU::setProperty(instance_, "Name", value); }, "setProperty", "chars", text, traces);
    };
    check(L"wide", converted, "\"wide\"");
    check(std::wstring(L"cut\0off", 7), converted, "\"cut\"");
    check(L"", "", "\"\"");
    std::wstring umlaut = L"\u00E4";
    EXPECT_EQ(logOf([&] { PU::setKeyProperty(path_, "Name", umlaut); }),
              converted + message(providerUtilities, "setKeyProperty", conversionFailed));
    EXPECT_EQ(logOf([&] { PU::setProperty(instance_, "Name", umlaut); }),
              converted + message(providerUtilities, "setProperty", conversionFailed));
    const ThreadLocale utf8("C.UTF-8");
    check(umlaut, converted, "\"\xC3\xA4\"");
}
