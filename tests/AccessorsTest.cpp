// The accessors of single values: what each calls the broker for, in which order, and what becomes of every
// answer.
#include "BrokerTest.h"
#include "StringConversion.h"
#include "TestLocales.h"

using PU = TK::ProviderUtilities;

namespace {

const std::string dateText = "20090307050409.000123-300";
const std::string untouched = "untouched";

template <class Value>
std::string textOf(const Value& value) {
    if constexpr (std::is_same_v<Value, std::wstring>) {
        return TK::make_string(value);
    } else if constexpr (std::is_same_v<Value, CMPIString*>) {
        CMPIValue record = {};
        record.string = value;
        return oxahv::valueText({CMPI_string, CMPI_goodValue, record});
    } else if constexpr (std::is_same_v<Value, CMPIObjectPath*>) {
        return oxahv::pathText(value);
    } else if constexpr (std::is_arithmetic_v<Value>) {
        return std::to_string(value);
    } else {
        return value;
    }
}

// The getter of a value from an object, told apart by their types.
template <class Object, class Value>
bool get(const Object* from, const char* name, Value& out) {
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

// An operation that reads something: the calls of the broker that it makes one by one, what it traces behind
// them, and its result; when a call fails, it makes no other, and `failure` is its result.
struct Reading {
    std::string calls;
    std::string traces;
    std::string value;
    std::function<std::string(const char* name)> read;
    std::string name = {};
    std::string failure = untouched;
    std::string failureLog = {};
};

class Accessors : public BrokerTest {
protected:
    Accessors() {
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

    // The row of a getter that reads a value by a name.
    template <class Value, class Object>
    Reading getter(const Object* const& from, const char* slot, const char* name, const std::string& value,
                   const std::string& moreCalls = "", const std::string& traces = "") {
        const auto read = [&from](const char* wanted) {
            const Value before{};
            Value out = before;
            const bool isRead = get(from, wanted, out);
            return isRead ? textOf(out) : out == before ? untouched : "changed";
        };
        return {slot + std::string(" ") + name + '\n' + moreCalls, traces, value, read, name};
    }
    std::vector<Reading> plainGetters() {
        return {getter<unsigned short>(fromInstance_, "getProperty", "Short", "60000"),
                getter<unsigned int>(fromInstance_, "getProperty", "Int", "4000000000"),
                getter<bool>(fromInstance_, "getProperty", "Flag", "1"),
                getter<CMPIString*>(fromInstance_, "getProperty", "Text", "\"text\""),
                getter<unsigned short>(fromArgs_, "getArg", "Short", "60000"),
                getter<unsigned int>(fromArgs_, "getArg", "Int", "4000000000"),
                getter<bool>(fromArgs_, "getArg", "Flag", "1"),
                getter<CMPIString*>(fromPath_, "getKey", "Text", "\"text\""),
                getter<CMPIObjectPath*>(fromPath_, "getKey", "Path", "root:Other")};
    }
    std::vector<Reading> wideGetters(const std::string& value, const std::string& traces) {
        return {getter<std::wstring>(fromInstance_, "getProperty", "Text", value, "getCharPtr\n", traces),
                getter<std::wstring>(fromArgs_, "getArg", "Text", value, "getCharPtr\n", traces),
                getter<std::wstring>(fromPath_, "getKey", "Text", value, "getCharPtr\n", traces)};
    }
    std::vector<Reading> textGetters() {
        std::vector<Reading> all = wideGetters("text", passing(utility, "AStringToWString"));
        all.push_back(getter<std::string>(fromInstance_, "getProperty", "Text", "text", "getCharPtr\n"));
        all.push_back(getter<std::string>(fromPath_, "getKey", "Text", "text", "getCharPtr\n"));
        all.push_back(getter<std::string>(fromArgs_, "getArg", "Text", "text", "getCharPtr\n")); // the last
        return all;
    }
    Reading dateGetter() {
        return getter<std::string>(fromInstance_, "getProperty", "Date", dateText,
                                   "getStringFormat\ngetCharPtr\n");
    }

    // What a reading does in the face of the faults that are injected.
    void expect(const Reading& reading, const std::string& value, const std::string& log,
                const std::string& name) {
        std::string result;
        EXPECT_EQ(logOf([&] { result = reading.read(name.c_str()); }), log);
        EXPECT_EQ(result, value) << log;
    }
    void expectAll(const Reading& reading) {
        expect(reading, reading.value, reading.calls + reading.traces, reading.name);
    }
    void expectNothing(const Reading& reading) {
        expect(reading, untouched, reading.calls.substr(0, reading.calls.find('\n') + 1), reading.name);
    }

    // A reading in every way in which its calls can fail.
    void checkCalls(const Reading& reading, bool alsoNull) {
        expectAll(reading);
        unsigned int call = 1;
        for (std::size_t end = reading.calls.find('\n'); end != std::string::npos;
             end = reading.calls.find('\n', end + 1), ++call) {
            for (oxahv::Fault fault : {anError, nothing}) {
                fault.firstCall = call;
                if (fault.code != CMPI_RC_OK || alsoNull) {
                    SCOPED_TRACE(call);
                    broker_.injectFault("*", fault);
                    expect(reading, reading.failure, reading.calls.substr(0, end + 1) + reading.failureLog,
                           reading.name);
                }
            }
        }
    }

    void checkGetter(const Reading& getter, bool alsoNull) {
        checkCalls(getter, alsoNull);
        const std::string slot = getter.calls.substr(0, getter.calls.find(' '));
        for (const char* const name : {"Missing", "Null"}) {
            expect(getter, untouched, slot + ' ' + name + '\n', name);
        }
        broker_.injectFault("*", {CMPI_RC_OK, false, CMPI_nullValue});
        expectNothing(getter);
        broker_.injectFault("*", {CMPI_RC_OK, false, CMPI_keyValue | CMPI_notFound | CMPI_badValue});
        expectAll(getter); // only the NULL bit counts
    }

    // A setter's one call, with the value's text also from what is set then.
    template <class Set>
    void expectSet(const Set& set, const std::string& slot, const std::string& type, const std::string& text,
                   const std::string& traces = "") {
        EXPECT_EQ(logOf(set), traces + slot + " Name " + type + (type == "chars" ? "" : " = " + text) + '\n');
        EXPECT_EQ(oxahv::valueText(slot == "addKey" ? CMGetKey(path_, "Name", nullptr)
                                                    : CMGetProperty(instance_, "Name", nullptr)),
                  text);
    }

    const ThreadLocale plain_{"C"};
    CMPIObjectPath* const path_ = request_.objectPath("root/cimv2", "Demo_Class");
    CMPIInstance* const instance_ = PU::createInstance(broker_.handle(), path_);
    CMPIArgs* const args_ = CMNewArgs(broker_.handle(), nullptr);
    // What the getters read from.
    const CMPIObjectPath* fromPath_ = path_;
    const CMPIInstance* fromInstance_ = instance_;
    const CMPIArgs* fromArgs_ = args_;
};

} // namespace

TEST_F(Accessors, ReadAValueOrLeaveTheOutputAlone) {
    for (const Reading& getter : plainGetters()) {
        checkGetter(getter, false);
    }
    for (const Reading& getter : textGetters()) {
        checkGetter(getter, true);
    }
    checkGetter(dateGetter(), true);
}

TEST_F(Accessors, ReadWideTextsThatTheLocaleHas) {
    store("Text", "", CMPI_chars);
    for (const Reading& getter : wideGetters("", "")) {
        expectAll(getter);
    }
    store("Text", "t\xC3\xA4", CMPI_chars);
    const std::string traces = passing(utility, "AStringToWString");
    {
        const ThreadLocale utf8("C.UTF-8");
        for (const Reading& getter : wideGetters("t\xC3\xA4", traces)) {
            expectAll(getter);
        }
    }
    for (const Reading& getter : wideGetters(untouched, traces)) {
        const bool isKey = getter.calls.rfind("getKey", 0) == 0;
        expect(getter, untouched,
               getter.calls + traces +
                   message(providerUtilities, isKey ? "getKeyProperty" : "getProperty",
                           "Failed to convert the data to Multi byte"),
               "Text");
    }
}

TEST_F(Accessors, ReadTheMemberAskedForWhateverTheType) {
    unsigned int wide = 0;
    EXPECT_TRUE(PU::getProperty(instance_, "Short", wide));
    EXPECT_EQ(wide & 0xFFFFU, 60000U);
}

TEST_F(Accessors, DoNotTakeAValueThatComesWithAnError) {
    Otherwise<&CMPIInstanceFT::getProperty> instance(instance_);
    Otherwise<&CMPIArgsFT::getArg> args(args_);
    Otherwise<&CMPIObjectPathFT::getKey> path(path_);
    fromInstance_ = instance.handle();
    fromArgs_ = args.handle();
    fromPath_ = path.handle();
    for (const std::vector<Reading>& getters : {plainGetters(), textGetters()}) {
        for (const Reading& getter : getters) {
            expectNothing(getter);
        }
    }
    expectNothing(dateGetter());

    Otherwise<&CMPIObjectPathFT::getClassName> unnamed(path_);
    EXPECT_EQ(PU::getClassName(unnamed.handle()), "");
    Otherwise<&CMPIObjectPathFT::getNameSpace> homeless(path_);
    EXPECT_EQ(PU::getNamespace(homeless.handle()), "");
    Otherwise<&CMPIStringFT::getCharPtr> string(newString("text"));
    EXPECT_EQ(logOf([&] { PU::convertToString(string.handle()); }),
              "getCharPtr\nthrows String Conversion Failed !!\n");
    Otherwise<&CMPIBrokerEncFT::newInstance> broker(broker_.handle());
    EXPECT_EQ(PU::createInstance(broker.handle(), path_), nullptr);
}

// Of a text's characters the status counts, but not with an argument; of a date's text it never does.
TEST_F(Accessors, TakeATextThatComesWithAnErrorInTwoPlaces) {
    Otherwise<&CMPIStringFT::getCharPtr> string(newString("text"));
    const auto alter = [&](CMPIData& data, CMPIStatus& /*status*/) { data.value.string = string.handle(); };
    Otherwise<&CMPIInstanceFT::getProperty> instance(instance_, alter);
    Otherwise<&CMPIArgsFT::getArg> args(args_, alter);
    Otherwise<&CMPIObjectPathFT::getKey> path(path_, alter);
    fromInstance_ = instance.handle();
    fromArgs_ = args.handle();
    fromPath_ = path.handle();
    std::vector<Reading> getters = textGetters();
    expectAll(getters.back());
    getters.pop_back();
    for (const Reading& getter : getters) {
        expect(getter, untouched, getter.calls, "Text");
    }

    CMPIDateTime* const real = CMGetProperty(instance_, "Date", nullptr).value.dateTime;
    Otherwise<&CMPIDateTimeFT::getStringFormat> date(real);
    Otherwise<&CMPIInstanceFT::getProperty> dated(
        instance_, [&](CMPIData& data, CMPIStatus& /*status*/) { data.value.dateTime = date.handle(); });
    fromInstance_ = dated.handle();
    expectAll(dateGetter());
}

TEST_F(Accessors, TellTheTextsOfHandlesAndMakeInstances) {
    CMPIString* const string = newString("text");
    const Reading readings[] = {
        {"getClassName\ngetCharPtr\n", "", "Demo_Class",
         [&](const char* /*name*/) { return PU::getClassName(path_); }, "", ""},
        {"getNameSpace\ngetCharPtr\n", "", "root/cimv2",
         [&](const char* /*name*/) { return PU::getNamespace(path_); }, "", ""},
        {"getCharPtr\n", "", "text", [&](const char* /*name*/) { return PU::convertToString(string); }, "",
         "", "throws String Conversion Failed !!\n"},
        {"newInstance\n", "", "made",
         [&](const char* /*name*/) {
             return PU::createInstance(broker_.handle(), path_) != nullptr ? "made" : "none";
         },
         "", "none"},
    };
    for (const Reading& reading : readings) {
        checkCalls(reading, true);
    }
    EXPECT_EQ(logOf([] { PU::convertToString(nullptr); }), "throws String Conversion Failed !!\n");
}

TEST_F(Accessors, HandEveryTypeOverWithItsCode) {
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
    checkProperty(true, "boolean", "TRUE");
    checkProperty(false, "boolean", "FALSE");
    checkProperty(static_cast<short>(-2), "sint16", "-2");
    checkProperty(1.5F, "real32", "1.5");
    checkProperty(-0.25, "real64", "-0.25");
    // The broker's status is dropped.
    EXPECT_EQ(logOf([&] { PU::setKeyProperty(path_, "Name", 1U); }, "*", anError),
              "addKey Name uint32 = 1\n");
    EXPECT_EQ(logOf([&] { PU::setProperty(instance_, "Name", 1U); }, "*", anError),
              "setProperty Name uint32 = 1\n");
}

TEST_F(Accessors, SetTextsAsTheyAreOrAsDates) {
    const auto set = [&](std::string value, bool isDate, const oxahv::Fault& fault = {CMPI_RC_OK}) {
        return logOf([&] { PU::setProperty(broker_.handle(), instance_, "Name", value, isDate); }, "*",
                     fault);
    };
    EXPECT_EQ(set(dateText, false), "setProperty Name chars\n");
    const auto traces = [](const std::string& text) {
        return variable(providerUtilities, "setProperty", "isDate", "1") +
               variable(providerUtilities, "setProperty", "Date", text);
    };
    const std::string made = traces(dateText) + "newDateTimeFromChars " + dateText + '\n';
    EXPECT_EQ(set(dateText, true), made + "setProperty Name datetime = \"" + dateText + "\"\n");
    EXPECT_EQ(set("yesterday", true), traces("yesterday") + "newDateTimeFromChars yesterday\n");
    EXPECT_EQ(set(dateText, true, anError), made);
    EXPECT_EQ(set(dateText, true, nothing), made);
    Otherwise<&CMPIBrokerEncFT::newDateTimeFromChars> erring(broker_.handle());
    std::string text = dateText;
    EXPECT_EQ(logOf([&] { PU::setProperty(erring.handle(), instance_, "Name", text, true); }), made);
}

TEST_F(Accessors, SetWideTextsThatTheLocaleHas) {
    const std::string converted = passing(utility, "WStringToAString");
    const auto check = [&](std::wstring value, const std::string& traces, const std::string& text) {
        expectSet([&] { PU::setKeyProperty(path_, "Name", value); }, "addKey", "chars", text, traces);
        expectSet([&] { PU::setProperty(instance_, "Name", value); }, "setProperty", "chars", text, traces);
    };
    check(L"wide", converted, "\"wide\"");
    check(std::wstring(L"cut\0off", 7), converted, "\"cut\"");
    check(L"", "", "\"\"");
    const std::string failed = "Failed to convert the data to Multi byte";
    std::wstring umlaut = L"\u00E4";
    EXPECT_EQ(logOf([&] { PU::setKeyProperty(path_, "Name", umlaut); }),
              converted + message(providerUtilities, "setKeyProperty", failed));
    EXPECT_EQ(logOf([&] { PU::setProperty(instance_, "Name", umlaut); }),
              converted + message(providerUtilities, "setProperty", failed));
    const ThreadLocale utf8("C.UTF-8");
    check(umlaut, converted, "\"\xC3\xA4\"");
}
