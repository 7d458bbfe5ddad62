// Values of the kit: set, read back, and read from what a client sends.

#include "KitProbe.h"
#include "TestLocales.h"

#include <array>
#include <chrono>
#include <limits>

using oxahv::Instance;
using oxahv::Instances;
using oxahv::Operation;
using oxahv::Path;
using oxahv::Reply;
using namespace std::chrono_literals;

namespace {

using Micros = std::chrono::duration<long long, std::micro>;
using Instant = std::chrono::time_point<std::chrono::system_clock, Micros>;

constexpr Instant instant = Instant(1'700'000'000'123'456us);
constexpr const char* utcText = "20231114221320.123456+000";

TK::DateTime zonedDate() {
    TK::DateTime date("2023-11-15 03:58:20", 3);
    date.setMillisecond(123456);
    date.setOffset(345);
    return date;
}

// Adds a key to what a client sends.
using Sent = std::function<void(CMPIObjectPath* path, const char* name)>;

template <class T>
Sent sent(CMPIType type, T CMPIValue::*member, T value) {
    return [=](CMPIObjectPath* path, const char* name) {
        CMPIValue record = {};
        record.*member = value;
        CMAddKey(path, name, &record, type);
    };
}

Sent sent(const char* text, CMPIType type = CMPI_chars) {
    return [=](CMPIObjectPath* path, const char* name) { CMAddKey(path, name, text, type); };
}

std::string textOf(const std::string& value) {
    return value;
}
std::string textOf(const std::wstring& value) {
    return TK::make_string(value);
}
std::string textOf(Instant value) {
    return std::to_string(value.time_since_epoch().count());
}
std::string textOf(std::chrono::hours value) {
    return std::to_string(value.count()) + " h";
}
std::string textOf(const TK::DateTime& value) {
    return value;
}
std::string textOf(const Path& value) {
    return value.className();
}
template <class Number, std::enable_if_t<std::is_arithmetic_v<Number>, int> = 0>
std::string textOf(Number value) {
    return std::to_string(value);
}
template <class T>
std::string textOf(const std::optional<T>& value) {
    return value ? textOf(*value) : "nothing";
}

} // namespace

class KitValues : public KitTest {
protected:
    // Sets a property in the provider, and expects what the client gets of it, and what the kit reads back.
    template <class Read, class T>
    void expect(const char* property, const T& value, const std::string& text, const Read& read) {
        SCOPED_TRACE(property);
        const Reply reply = enumerate([&](const Operation& operation, Instances& instances) {
            instances.add(operation.instance("Kit_Value", {{"Id", 1}}).set(property, value));
        });
        ASSERT_TRUE(reply.ok()) << failureOf(reply);
        const CMPIData data = CMGetProperty(reply.instances.at(0), property, nullptr);
        EXPECT_EQ(oxahv::valueText(data), text);
        const ThreadLocale utf8("C.UTF-8"); // as the provider's functions have
        EXPECT_EQ(Instance(broker_.handle(), reply.instances[0]).get<Read>(property), read);
        EXPECT_FALSE(Instance(broker_.handle(), reply.instances[0]).get<std::optional<Read>>("char16A"));
    }
    template <class T>
    void expect(const char* property, const T& value, const std::string& text) {
        expect(property, value, text, value);
    }

    // What becomes of a key that a client sends when the provider reads it as T; of a refusal, its text.
    template <class T>
    std::string read(const Sent& key) {
        oxahv::EmbeddedBroker lenient; // without classes, it takes what comes
        lenient.host("KitProbe", probeFactories);
        oxahv::Request request(lenient);
        CMPIObjectPath* const item = request.objectPath("root/cimv2", "Kit_Item");
        if (key) {
            key(item, "KEY");
        }
        std::string text;
        probe.enumerate = [&](const Operation& operation, Instances& /*reply*/) {
            text = textOf(operation.key<T>("Key"));
        };
        const Reply reply = request.enumerateInstances(item);
        EXPECT_EQ(reply.code, reply.message.empty() ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_PARAMETER);
        return text + reply.message;
    }
};

TEST_F(KitValues, OfEveryTypeAreSetAndReadBack) {
    expect("boolean", true, "TRUE");
    expect("char16", u'\u20ac', "8364");
    expect("uint8", std::uint8_t{255}, "255");
    expect("uint16", std::uint16_t{65535}, "65535");
    expect("uint32", std::uint32_t{4294967295}, "4294967295");
    expect("uint64", std::numeric_limits<std::uint64_t>::max(), "18446744073709551615");
    expect("uint64", std::numeric_limits<unsigned long>::max(), "18446744073709551615");
    expect("sint8", std::int8_t{-128}, "-128");
    expect("sint16", std::int16_t{-32768}, "-32768");
    expect("sint32", std::numeric_limits<std::int32_t>::min(), "-2147483648");
    expect("sint64", std::numeric_limits<std::int64_t>::min(), "-9223372036854775808");
    expect("real32", 0.25F, "0.25");
    expect("real64", -1.5, "-1.5");
    expect("string", std::string("ü\"x"), "\"ü\\\"x\"");
    expect("string", std::wstring(L"\u20ac"), "\"\u20ac\"");
    expect("datetime", instant, std::string("\"") + utcText + '"');
    expect("datetime", zonedDate(), "\"20231115035820.123456+345\"");
    expect("datetime", zonedDate(), "\"20231115035820.123456+345\"", instant);
    expect("datetime", Instant(-1us), "\"19691231235959.999999+000\"");
    expect("datetime", Micros(25h + 1us), "\"00000001010000.000001:000\"");

    expect("booleanA", std::vector<bool>{true, false}, "{TRUE, FALSE}");
    expect("uint8A", std::vector<std::uint8_t>{}, "{}");
    expect("sint64A", std::vector<std::int64_t>{-1, 2}, "{-1, 2}");
    expect("real64A", std::vector<double>{0.5}, "{0.5}");
    expect("stringA", std::vector<std::string>{"a", "ü"}, "{\"a\", \"ü\"}");
    expect("stringA", std::vector<std::wstring>{L"ü"}, "{\"ü\"}");
    expect("stringA", std::array<const char*, 2>{"a", nullptr}, "{\"a\", NULL}",
           std::vector<std::optional<std::string>>{"a", std::nullopt});
    expect("datetimeA", std::vector<Instant>{instant}, std::string("{\"") + utcText + "\"}");
}

TEST_F(KitValues, AreTakenFromWhateverTheProviderHas) {
    enum class State : std::uint16_t { enabled = 2 };
    const std::string text = "text";
    expect("uint16", State::enabled, "2");
    expect("uint16A", std::vector<State>{State::enabled}, "{2}");
    expect("string", "literal", "\"literal\"", std::string("literal"));
    expect("string", std::string_view(text).substr(1, 2), "\"ex\"", std::string("ex"));
    expect("string", L"wide", "\"wide\"", std::wstring(L"wide"));
    expect("string", std::optional<std::string>("there"), "\"there\"");
    // Without a type of their own, literals are of the one that the class declares.
    for (const char* number :
         {"uint8", "uint16", "uint32", "uint64", "sint8", "sint16", "sint32", "sint64"}) {
        expect(number, 42, "42", std::int64_t{42});
    }
    expect("sint8", -1L, "-1");
    expect("uint16A", std::vector<int>{1, 2}, "{1, 2}");
    expect("real32", 0.5, "0.5");
    expect("real64", 0.5F, "0.5");
}

TEST_F(KitValues, AreNullWhereThereIsNone) {
    const Reply reply = enumerate([](const Operation& operation, Instances& instances) {
        Instance value = operation.instance("Kit_Value", {{"Id", 1U}});
        value.set("uint16", 7).set("uint16", std::optional<std::uint16_t>());
        value.set("string", "x").set("string", static_cast<const char*>(nullptr));
        value.set("uint8A", std::vector<std::uint8_t>{1}).set("uint8A", nullptr);
        value.set("sint32", 1).set("sint32", std::optional<double>());
        instances.add(value);
    });
    ASSERT_TRUE(reply.ok()) << failureOf(reply);
    for (const char* name : {"uint16", "string", "uint8A", "sint32"}) {
        EXPECT_TRUE(CMIsNullValue(CMGetProperty(reply.instances.at(0), name, nullptr))) << name;
    }
}

TEST_F(KitValues, MayBeObjects) {
    const Reply reply = enumerate([](const Operation& operation, Instances& instances) {
        const Path item = operation.path("Kit_Item", {{"Name", "one"}, {"Number", 1}});
        instances.add(operation.instance("Kit_Value", {{"Id", 1}})
                          .set("ref", item)
                          .set("refA", std::vector<Path>{item, item})
                          .set("embedded", operation.instance(item).set("Size", 5))
                          .set("embeddedA", std::vector<Instance>(2, operation.instance(item))));
    });
    ASSERT_TRUE(reply.ok()) << failureOf(reply);
    const Instance value(broker_.handle(), reply.instances.at(0));
    EXPECT_EQ(value.get<Path>("ref").key<std::string>("name"), "one");
    EXPECT_EQ(value.get<std::vector<Path>>("refA").at(1).key<int>("Number"), 1);
    EXPECT_EQ(value.get<Instance>("embedded").get<std::uint64_t>("size"), 5U);
    EXPECT_EQ(value.get<std::vector<Instance>>("embeddedA").at(1).path().key<int>("Number"), 1);
    EXPECT_EQ(value.get<Instance>("embedded").path().key<std::string>("Name"), "one");
}

TEST_F(KitValues, ThatCimCannotRepresentAreRefused) {
    const auto failure = [&](const char* property, const oxahv::Value& value) {
        return failureOf(enumerate([&](const Operation& operation, Instances& /*reply*/) {
            operation.instance("Kit_Value", {{"Id", 1}}).set(property, value);
        }));
    };
    const std::string failed = "CMPI_RC_ERR_FAILED cannot set property ";
    EXPECT_EQ(failure("string", std::string("a\0b", 3)), failed + "string: the text holds a NUL character");
    EXPECT_EQ(failure("stringA", std::vector<std::string>{std::string("\0", 1)}),
              failed + "stringA: the text holds a NUL character");
    EXPECT_EQ(failure("string", std::wstring(1, wchar_t(0xD800))),
              failed + "string: UTF-8 cannot represent the text");
    EXPECT_EQ(failure("datetime", Micros(-1us)), failed + "datetime: CIM cannot represent the date");
    EXPECT_EQ(failure("datetime", Instant(Micros(253402300800s))), // the first second of the year 10000
              failed + "datetime: CIM cannot represent the date");
    const std::string mismatch = "CMPI_RC_ERR_TYPE_MISMATCH the broker did not set property ";
    EXPECT_EQ(failure("uint8", 256), mismatch + "uint8");
    EXPECT_EQ(failure("uint64", -1), mismatch + "uint64");
    EXPECT_EQ(failure("real32", 0.1), mismatch + "real32");
    EXPECT_EQ(failure("string", 1), mismatch + "string");
    EXPECT_EQ(failure("uint8A", std::vector<int>{1, 256}), mismatch + "uint8A");
    EXPECT_EQ(failure("Misspelt", 1),
              "CMPI_RC_ERR_NO_SUCH_PROPERTY the broker did not set property Misspelt");
}

TEST_F(KitValues, OfRequestsAreReadInAnyWidthWithinTheirRange) {
    const char* const outside = "key Key is out of range";
    const char* const none = "key Key is no integer";
    const struct {
        Sent sent;
        const char* asUnsigned16;
        const char* asSigned8;
        const char* asSigned64;
    } cases[] = {
        {sent(CMPI_uint8, &CMPIValue::uint8, CMPIUint8{200}), "200", outside, "200"},
        {sent(CMPI_uint16, &CMPIValue::uint16, CMPIUint16{127}), "127", "127", "127"},
        {sent(CMPI_uint32, &CMPIValue::uint32, 65536U), outside, outside, "65536"},
        {sent(CMPI_uint64, &CMPIValue::uint64, ~0ULL), outside, outside, outside},
        {sent(CMPI_sint8, &CMPIValue::sint8, CMPISint8{-128}), outside, "-128", "-128"},
        {sent(CMPI_sint16, &CMPIValue::sint16, CMPISint16{-129}), outside, outside, "-129"},
        {sent(CMPI_sint32, &CMPIValue::sint32, 65535), "65535", outside, "65535"},
        {sent(CMPI_sint64, &CMPIValue::sint64, 5LL), "5", "5", "5"},
        {sent("0"), "0", "0", "0"},
        {sent("-128"), outside, "-128", "-128"},
        {sent("-9223372036854775808"), outside, outside, "-9223372036854775808"},
        {sent("9223372036854775807"), outside, outside, "9223372036854775807"},
        {sent("9223372036854775808"), outside, outside, outside},
        {sent("-9223372036854775809"), outside, outside, outside},
        {sent("18446744073709551616"), outside, outside, outside},
        {sent("99999999999999999999x"), none, none, none},
        {sent(""), none, none, none},
        {sent("-"), none, none, none},
        {sent("+1"), none, none, none},
        {sent("1 "), none, none, none},
        {sent(CMPI_boolean, &CMPIValue::boolean, CMPIBoolean{1}), none, none, none},
        {sent(CMPI_char16, &CMPIValue::char16, CMPIChar16{1}), none, none, none},
        {sent(CMPI_real64, &CMPIValue::real64, 1.0), none, none, none},
        {nullptr, "key Key is missing", "key Key is missing", "key Key is missing"},
        {sent(nullptr, CMPI_uint16), "key Key is NULL", "key Key is NULL", "key Key is NULL"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(&c - cases);
        EXPECT_EQ(read<std::uint16_t>(c.sent), c.asUnsigned16);
        EXPECT_EQ(read<std::int8_t>(c.sent), c.asSigned8);
        EXPECT_EQ(read<long>(c.sent), c.asSigned64);
    }
}

TEST_F(KitValues, OfRequestsAreReadByTheirType) {
    const Sent text = sent("\u00fc");
    const Sent number = sent(CMPI_uint8, &CMPIValue::uint8, CMPIUint8{7});
    const Sent real = sent(CMPI_real64, &CMPIValue::real64, 1e300);
    const Sent date = sent("20231114231320.123456+060");
    EXPECT_EQ(read<std::string>(text), "\u00fc");
    EXPECT_EQ(read<std::wstring>(sent("x")), "x");
    EXPECT_EQ(read<std::wstring>(sent("\xff")), "key Key is no text in UTF-8");
    EXPECT_EQ(read<std::string>(number), "key Key is no text");
    EXPECT_EQ(read<bool>(sent("true")), "1");
    EXPECT_EQ(read<bool>(sent("FALSE")), "0");
    EXPECT_EQ(read<bool>(sent("yes")), "key Key is no boolean");
    EXPECT_EQ(read<bool>(number), "key Key is no boolean");
    EXPECT_EQ(read<char16_t>(sent(CMPI_char16, &CMPIValue::char16, CMPIChar16{65})), "65");
    EXPECT_EQ(read<char16_t>(number), "key Key is no character");
    EXPECT_EQ(read<double>(sent(CMPI_real32, &CMPIValue::real32, 0.5F)), "0.500000");
    EXPECT_EQ(read<float>(real), "key Key is out of range");
    EXPECT_EQ(read<float>(number), "key Key is no real number");
    EXPECT_EQ(read<Instant>(date), "1700000000123456");
    EXPECT_EQ(read<Instant>(sent("20240229000000.000000-001")), "1709164860000000");
    EXPECT_EQ(read<TK::DateTime>(date), "2023-11-14 23:13:20.123456+060");
    for (const char* wrong :
         {"20231314231320.123456+060", "20231114241320.123456+060", "2023111423132*.******+060",
          "20231114231320.123456+06", "00000001010000.000000:000", "x"}) {
        EXPECT_EQ(read<Instant>(sent(wrong)), "key Key is no point in time") << wrong;
        EXPECT_EQ(read<TK::DateTime>(sent(wrong)), "key Key is no point in time") << wrong;
    }
    EXPECT_EQ(read<Instant>(number), "key Key is no date/time");
    EXPECT_EQ(read<std::chrono::hours>(sent("00000001010000.000000:000")), "25 h");
    EXPECT_EQ(read<std::chrono::hours>(date), "key Key is no interval");
    EXPECT_EQ(read<std::optional<Path>>(nullptr), "nothing");
    EXPECT_EQ(read<std::optional<int>>(sent(nullptr, CMPI_sint32)), "nothing");
    EXPECT_EQ(read<std::optional<int>>(sent("x")), "key Key is no integer");
    EXPECT_EQ(read<Path>(text), "key Key is no reference");
    const auto year9999 = sent("99991231235959.000000+000");
    probe.enumerate = nullptr;
    EXPECT_EQ(read<Instant>(year9999), "253402300799000000");
    CMPIObjectPath* const item = path("Kit_Item");
    CMAddKey(item, "Name", "99991231235959.000000+000", CMPI_chars);
    EXPECT_THROW(Path(broker_.handle(), item).key<std::chrono::system_clock::time_point>("Name"),
                 oxahv::Refusal)
        << "nanoseconds do not reach that far";
}
