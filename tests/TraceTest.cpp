#include "Trace.h"

#include "LoggerCalls.h"

#include <gtest/gtest.h>
#include <stdexcept>
#include <thread>

namespace {

const std::string category("Test.Trace");

std::string onLine(const std::string& before, int line, const std::string& after) {
    return before + std::to_string(line) + after;
}

// The parameter list of the only trace point that has been passed.
std::string parameterList() {
    const std::vector<std::string> texts = tracedTexts();
    EXPECT_EQ(texts.size(), 1U);
    const std::string label = "Parameters List: ";
    return texts.empty() ? "" : texts[0].substr(texts[0].find(label) + label.size());
}

class ATracePoint : public testing::Test {
protected:
    void SetUp() override { forgetLoggerCalls(); }
};

enum class Colour { red, blue };

// A type of the caller's own, with an insertion of its own.
struct Speed {
    int value;
};
std::ostream& operator<<(std::ostream& stream, const Speed& speed) {
    return stream << speed.value << " Mbit/s";
}

} // namespace

TEST_F(ATracePoint, HandsItsTextToBothFunctionsOfTheLogger) {
    const void* const pointer = &category;
    const int line = __LINE__ + 1;
    TK_TRACE_ENTERING(category);
    TK_TRACE_EXITING(category);
    TK_TRACE_ENTERING_PARAMETERS(category, " p=" << pointer << " t=" << category);
    TK_TRACE_EXITING_PARAMETERS(category, " p=" << pointer << " n=" << 7);
    TK_TRACE_MESSAGE(category, "something happened");
    TK_TRACE_VARIABLE(category, "size", -1);
    TK_TRACE_VARIABLE(category, "name", "eth0");

    const std::vector<std::string> expected = {
        onLine("ENTERING: TestBody() in TraceTest.cpp [Line: ", line, "]"),
        onLine("EXITING: TestBody() in TraceTest.cpp [Line: ", line + 1, "]"),
        onLine("ENTERING: TestBody() in TraceTest.cpp [Line: ", line + 2,
               "],Parameters List:  p=" + address(pointer) + " t=Test.Trace"),
        onLine("EXITING: TestBody() in TraceTest.cpp [Line: ", line + 3,
               "],Parameters List:  p=" + address(pointer) + " n=7"),
        onLine("MESSAGE [File: TraceTest.cpp, Line: ", line + 4, "]: something happened"),
        onLine("VARIABLE: 'size' has Value '-1' at line ", line + 5, " in TraceTest.cpp"),
        onLine("VARIABLE: 'name' has Value 'eth0' at line ", line + 6, " in TraceTest.cpp"),
    };
    EXPECT_EQ(tracedTexts(), expected);

    const std::vector<int> levels = {4000, 4000, 3000, 3000, 6000, 4000, 4000};
    const std::vector<LoggerCall> calls = loggerCalls();
    ASSERT_EQ(calls.size(), 2 * levels.size());
    for (std::size_t i = 0; i < levels.size(); ++i) {
        const LoggerCall& call = calls[2 * i];
        EXPECT_EQ(call.level, levels[i]);
        EXPECT_EQ(call.line, line + static_cast<int>(i));
        EXPECT_EQ(call.function, "TestBody");
        EXPECT_EQ(call.file, "TraceTest.cpp");
        EXPECT_EQ(call.category, "Test.Trace");
    }
}

TEST_F(ATracePoint, ShowsAVariableAsANumberOrATextByItsType) {
    const std::string text("text");
    const char* const none = nullptr;
    char array[] = "array";
    TK_TRACE_VARIABLE(category, "v", true);
    TK_TRACE_VARIABLE(category, "v", Colour::blue);
    TK_TRACE_VARIABLE(category, "v", 4294967295U);
    TK_TRACE_VARIABLE(category, "v", static_cast<unsigned short>(65535));
    TK_TRACE_VARIABLE(category, "v", text);
    TK_TRACE_VARIABLE(category, "v", array);
    TK_TRACE_VARIABLE(category, "v", none);
    TK_TRACE_VARIABLE(category, "v", "100%n%s");
    const std::vector<std::string> values = {"1", "1", "-1", "65535", "text", "array", "(null)", "100%n%s"};
    const std::vector<std::string> texts = tracedTexts();
    ASSERT_EQ(texts.size(), values.size());
    for (std::size_t i = 0; i < values.size(); ++i) {
        EXPECT_EQ(texts[i].rfind("VARIABLE: 'v' has Value '" + values[i] + "' at line ", 0), 0U) << texts[i];
    }
}

TEST_F(ATracePoint, WritesPointersAsAddressesAndTextsAsText) {
    const int object = 0;
    int* const variable = nullptr;
    const std::string text("te%xt");
    TK_TRACE_ENTERING_PARAMETERS(category, " object=" << &object << " null=" << variable << " text=" << text);
    EXPECT_EQ(parameterList(), " object=" + address(&object) + " null=0 text=te%xt");
}

TEST_F(ATracePoint, TakesAnyFirstValue) {
    const std::string text("text");
    const char* const chars = "chars";
    TK_TRACE_ENTERING_PARAMETERS(category, " a=" << chars << " b=" << text);
    EXPECT_EQ(parameterList(), " a=chars b=text");
    forgetLoggerCalls();
    TK_TRACE_ENTERING_PARAMETERS(category, " a=" << text);
    EXPECT_EQ(parameterList(), " a=text");
    forgetLoggerCalls();
    TK_TRACE_ENTERING_PARAMETERS(category, " a=" << Speed{100} << " b=" << std::hex << 255);
    EXPECT_EQ(parameterList(), " a=100 Mbit/s b=ff");
    forgetLoggerCalls();
    TK_TRACE_ENTERING_PARAMETERS(category, " nothing");
    EXPECT_EQ(parameterList(), " nothing");
}

TEST_F(ATracePoint, EndsAParameterListAtANullText) {
    const char* const none = nullptr;
    const int object = 0;
    TK_TRACE_ENTERING_PARAMETERS(category, " object=" << &object << " text=" << none << " more=" << 1);
    EXPECT_EQ(parameterList(), " object=" + address(&object) + " text=");
    forgetLoggerCalls();
    TK_TRACE_ENTERING_PARAMETERS(category, " text=" << none << " more=" << 1);
    EXPECT_EQ(parameterList(), " text=");
    forgetLoggerCalls();
    TK_TRACE_ENTERING_PARAMETERS(category, " text=" << none << " more="
                                                    << "text");
    EXPECT_EQ(parameterList(), " text=");
}

TEST_F(ATracePoint, EvaluatesItsArgumentsForEachOfTheTwoCalls) {
    int categories = 0;
    int names = 0;
    int values = 0;
    int insertions = 0;
    const auto count = [](int& counter, const auto& value) -> const auto& {
        ++counter;
        return value;
    };
    const std::string name("n");
    const int seven = 7;
    TK_TRACE_VARIABLE(count(categories, category), count(names, name).c_str(), count(values, seven));
    EXPECT_EQ(std::tie(categories, names, values), std::make_tuple(2, 2, 2));
    TK_TRACE_ENTERING_PARAMETERS(category, " n=" << count(insertions, seven));
    EXPECT_EQ(insertions, 2);
}

TEST_F(ATracePoint, IsOneStatement) {
    const bool never = loggerCalls().size() > 100;
    if (never)
        TK_TRACE_ENTERING(category);
    else
        TK_TRACE_VARIABLE(category, "else", 1);
    for (int i = 0; i < 2; ++i)
        TK_TRACE_ENTERING_PARAMETERS(category, " i=" << i);
    EXPECT_EQ(tracedTexts().size(), 3U);
}

TEST_F(ATracePoint, CutsItsTextAt511BytesAndLeavesNothingOfALongerOne) {
    const std::string longText(1U << 20U, 'x');
    TK_TRACE_VARIABLE(category, "long", longText);
    TK_TRACE_VARIABLE(category, "short", "s");
    TK_TRACE_MESSAGE(category, longText.c_str());
    TK_TRACE_EXITING_PARAMETERS(category, longText.c_str());
    const std::vector<std::string> texts = tracedTexts();
    ASSERT_EQ(texts.size(), 4U);
    EXPECT_EQ(texts[0], "VARIABLE: 'long' has Value '" + std::string(511 - 28, 'x'));
    EXPECT_EQ(texts[1].rfind("VARIABLE: 'short' has Value 's' at line ", 0), 0U);
    EXPECT_EQ(texts[2].size(), 511U);
    EXPECT_EQ(texts[3].size(), 511U);

    const char* const buffer = TK::trace("short", "f", 1, "s");
    EXPECT_EQ(std::string(buffer, 512), std::string(buffer) + std::string(512 - std::strlen(buffer), '\0'));
}

TEST_F(ATracePoint, PassesOnWhatInsertionsAndLoggerThrow) {
    const auto fail = []() -> int { throw std::logic_error("insertion"); };
    EXPECT_THROW(TK_TRACE_ENTERING_PARAMETERS(category, " n=" << fail()), std::logic_error);
    for (int call = 1; call <= 2; ++call) {
        failLoggerCall(call);
        EXPECT_THROW(TK_TRACE_ENTERING(category), std::runtime_error);
    }
    forgetLoggerCalls();
    TK_TRACE_ENTERING(category);
    EXPECT_EQ(tracedTexts().size(), 1U);
}

TEST_F(ATracePoint, KeepsTheTextsOfThreadsApart) {
    constexpr int threadCount = 8;
    constexpr int rounds = 500;
    std::vector<std::thread> threads;
    for (int t = 0; t < threadCount; ++t) {
        threads.emplace_back([t] {
            const std::string own(40, static_cast<char>('a' + t));
            for (int i = 0; i < rounds; ++i) {
                TK_TRACE_VARIABLE(category, own.c_str(), own);
                TK_TRACE_VARIABLE(category, own.c_str(), t);
                TK_TRACE_MESSAGE(category, own.c_str());
                TK_TRACE_ENTERING_PARAMETERS(category, " own=" << own);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    const std::vector<LoggerCall> calls = loggerCalls();
    EXPECT_EQ(calls.size(), std::size_t{2} * 4 * threadCount * rounds);
    for (const LoggerCall& call : calls) {
        // Of the eight letters' runs a whole text holds those of one thread alone.
        int runs = 0;
        for (int t = 0; t < threadCount; ++t) {
            runs += call.text.find(std::string(40, static_cast<char>('a' + t))) != std::string::npos ? 1 : 0;
        }
        ASSERT_EQ(runs, 1) << call.text;
        ASSERT_TRUE(call.text.back() == ']' || call.text.size() > 60) << call.text;
    }
}

TEST(TheFormattingFunctions, TellTheKindOfATextByItsType) {
    EXPECT_STREQ(TK::trace("f", "F.cpp", 3, TK::ENTERING), "ENTERING: f() in F.cpp [Line: 3]");
    EXPECT_STREQ(TK::trace("f", "F.cpp", 3, TK::EXITING), "EXITING: f() in F.cpp [Line: 3]");
    EXPECT_STREQ(TK::trace("m", "F.cpp", 3, TK::MESSAGE), "MESSAGE [File: F.cpp, Line: 3]: m");
    EXPECT_STREQ(TK::trace(nullptr, nullptr, 3, TK::MESSAGE), "MESSAGE [File: (null), Line: 3]: (null)");
    EXPECT_STREQ(TK::trace("v", "F.cpp", 3, 0x80000000U),
                 "VARIABLE: 'v' has Value '-2147483648' at line 3 in F.cpp");
    EXPECT_STREQ(TK::tracepara("f", "F.cpp", 3, " a=1", TK::ENTERING),
                 "ENTERING: f() in F.cpp [Line: 3],Parameters List:  a=1");
    EXPECT_STREQ(TK::tracepara("f", "F.cpp", 3, " a=1", TK::EXITING),
                 "EXITING: f() in F.cpp [Line: 3],Parameters List:  a=1");
    EXPECT_STREQ(TK::tracepara("f", "F.cpp", 3, " a=1", TK::MESSAGE), "");
}
