#include "Trace.h"

#include "LoggerCalls.h"

#include <gtest/gtest.h>
#include <limits>
#include <locale>
#include <stdexcept>
#include <string>
#include <vector>

namespace {

const std::string category("Test.Trace");

constexpr TracingModule module = {"Test.Trace", "TraceTest.cpp"};

class TraceTest : public testing::Test {
protected:
    TraceTest() { takeTraces(); }
};

// What a test body traces as its parameters.
std::string parameters(const std::string& list) {
    return entering(module, "TestBody", list);
}

enum class Colour { red, blue };

// A type of the caller's own, with an insertion of its own.
struct Speed {
    int value;
};
std::ostream& operator<<(std::ostream& stream, const Speed& speed) {
    return stream << speed.value << " Mbit/s";
}

class GroupedDigits : public std::numpunct<char> {
    char do_thousands_sep() const override { return ','; }
    std::string do_grouping() const override { return "\3"; }
};

// The message buffers made and destroyed since the last test; the program's definitions take the logger's
// place.
std::vector<const void*> made;
std::vector<const void*> destroyed;

} // namespace

HVLog::HVMessageBuffer::HVMessageBuffer() {
    made.push_back(this);
}
HVLog::HVMessageBuffer::~HVMessageBuffer() {
    destroyed.push_back(this);
}

TEST_F(TraceTest, CallsBothFunctionsOfTheLogger) {
    const void* const pointer = &category;
    const int line = __LINE__ + 1;
    TK_TRACE_ENTERING(category);
    EXPECT_EQ(loggerCalls().at(0).line, line);
    EXPECT_EQ(loggerCalls().at(0).file, "TraceTest.cpp");
    TK_TRACE_EXITING(category);
    TK_TRACE_ENTERING_PARAMETERS(category, " p=" << pointer << " t=" << category);
    TK_TRACE_EXITING_PARAMETERS(category, " p=" << pointer << " n=" << 7);
    TK_TRACE_MESSAGE(category, "something happened");
    EXPECT_EQ(takeTraces(), passing(module, "TestBody") +
                                parameters(" p=" + address(pointer) + " t=Test.Trace") +
                                exiting(module, "TestBody", " p=" + address(pointer) + " n=7") +
                                message(module, "TestBody", "something happened"));
}

TEST_F(TraceTest, ShowsNumbersAndTexts) {
    const std::string text("text");
    const char* const none = nullptr;
    char array[] = "array";
    TK_TRACE_VARIABLE(category, "v", true);
    TK_TRACE_VARIABLE(category, "v", Colour::blue);
    TK_TRACE_VARIABLE(category, "v", 4294967295U);
    TK_TRACE_VARIABLE(category, "v", static_cast<unsigned short>(65535));
    TK_TRACE_VARIABLE(category, "v", 0x1'0000'0007ULL);
    TK_TRACE_VARIABLE(category, "v", std::numeric_limits<long long>::min());
    TK_TRACE_VARIABLE(category, "v", -2147483647 - 1);
    TK_TRACE_VARIABLE(category, "v", text);
    TK_TRACE_VARIABLE(category, "v", array);
    TK_TRACE_VARIABLE(category, "v", none);
    TK_TRACE_VARIABLE(category, "v", "100%n%s");
    std::string expected;
    for (const char* const value :
         {"1", "1", "-1", "65535", "7", "0", "-2147483648", "text", "array", "(null)", "100%n%s"}) {
        expected += variable(module, "TestBody", "v", value);
    }
    EXPECT_EQ(takeTraces(), expected);
}

TEST_F(TraceTest, ListEndsAtANullText) {
    const int object = 0;
    int* const nowhere = nullptr;
    const char* const none = nullptr;
    const std::string text("te%xt");
    TK_TRACE_ENTERING_PARAMETERS(category, " object=" << &object << " null=" << nowhere << " text=" << text);
    TK_TRACE_ENTERING_PARAMETERS(category, " a=" << Speed{100} << " b=" << std::hex << 255);
    TK_TRACE_ENTERING_PARAMETERS(category, " nothing");
    TK_TRACE_ENTERING_PARAMETERS(category, " object=" << &object << " text=" << none << " more=" << 1);
    TK_TRACE_ENTERING_PARAMETERS(category, " text=" << none << " more=" << text);
    EXPECT_EQ(takeTraces(), parameters(" object=" + address(&object) + " null=0 text=te%xt") +
                                parameters(" a=100 Mbit/s b=ff") + parameters(" nothing") +
                                parameters(" object=" + address(&object) + " text=") + parameters(" text="));
}

TEST_F(TraceTest, WritesAddressesByTheGlobalLocale) {
    const std::locale earlier = std::locale::global(std::locale(std::locale::classic(), new GroupedDigits));
    const int object = 0;
    const char* const none = nullptr;
    const std::string shown = address(&object);
    TK_TRACE_ENTERING_PARAMETERS(category, " a=" << &object << " b=" << std::string("x") << " c=" << &object);
    TK_TRACE_ENTERING_PARAMETERS(category, " a=" << &object << " b=" << none << " c=" << &object << 1);
    std::locale::global(earlier);
    EXPECT_NE(shown.find(','), std::string::npos);
    EXPECT_EQ(takeTraces(),
              parameters(" a=" + shown + " b=x c=" + shown) + parameters(" a=" + shown + " b="));
}

TEST_F(TraceTest, DestroysTheBufferOfItsParametersLast) {
    made.clear();
    destroyed.clear();
    TK_TRACE_EXITING_PARAMETERS(category, " n=" << 1);
    ASSERT_EQ(made.size(), 2U);
    EXPECT_EQ(destroyed, std::vector<const void*>({made[1], made[0]}));
}

TEST_F(TraceTest, EvaluatesArgumentsForEachCall) {
    int evaluations = 0;
    const auto counted = [&evaluations](const auto& value) -> const auto& {
        ++evaluations;
        return value;
    };
    const std::string name("n");
    const int seven = 7;
    TK_TRACE_VARIABLE(counted(category), counted(name).c_str(), counted(seven));
    EXPECT_EQ(evaluations, 6);
    TK_TRACE_ENTERING_PARAMETERS(category, " n=" << counted(seven));
    EXPECT_EQ(evaluations, 8);
    TK_TRACE_MESSAGE(category, counted(name).c_str());
    EXPECT_EQ(evaluations, 10);
}

TEST_F(TraceTest, IsOneStatement) {
    const bool never = loggerCalls().size() > 100;
    if (never)
        TK_TRACE_ENTERING(category);
    else
        TK_TRACE_VARIABLE(category, "else", 1);
    for (int i = 0; i < 2; ++i)
        TK_TRACE_ENTERING_PARAMETERS(category, " i=" << i);
    EXPECT_EQ(loggerCalls().size(), 6U);
}

TEST_F(TraceTest, PassesOnExceptionsOfInsertions) {
    const auto fail = []() -> int { throw std::logic_error("insertion"); };
    EXPECT_THROW(TK_TRACE_ENTERING_PARAMETERS(category, " n=" << fail()), std::logic_error);
    TK_TRACE_ENTERING(category);
    EXPECT_EQ(takeTraces(), entering(module, "TestBody"));
}

TEST(TraceTextTest, AcceptsNullTextsAndUnknownTypes) {
    EXPECT_STREQ(TK::trace(nullptr, nullptr, 3, TK::MESSAGE), "MESSAGE [File: (null), Line: 3]: (null)");
    EXPECT_STREQ(TK::trace("f", "F.cpp", 3, static_cast<TK::MessageType>(3)), "");
    EXPECT_STREQ(TK::tracepara("f", "F.cpp", 3, " a=1", TK::MESSAGE), "");
}

TEST(TraceTextTest, EachFunctionHasItsOwnBuffer) {
    const char* const flow = TK::trace("f", "F.cpp", 1, TK::ENTERING);
    const char* const number = TK::trace("n", "F.cpp", 2, 7U);
    const char* const text = TK::trace("t", "F.cpp", 3, "x");
    TK::tracepara("f", "F.cpp", 4, " a=1", TK::ENTERING);
    EXPECT_STREQ(flow, "ENTERING: f() in F.cpp [Line: 1]");
    EXPECT_STREQ(number, "VARIABLE: 'n' has Value '7' at line 2 in F.cpp");
    EXPECT_STREQ(text, "VARIABLE: 't' has Value 'x' at line 3 in F.cpp");
}
