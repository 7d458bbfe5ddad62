// Wide and narrow texts: everything that the C library converts, and nothing that it does not.
#include "Utility.h"

#include "Allocations.h"
#include "LoggerCalls.h"
#include "TestLocales.h"

#include <algorithm>
#include <cwchar>
#include <functional>
#include <gtest/gtest.h>
#include <new>
#include <optional>
#include <random>
#include <stdexcept>
#include <thread>

using TK::CUtility;

namespace {

constexpr auto refused = static_cast<std::size_t>(-1);
constexpr wchar_t lastCodePoint = 0x10FFFF;

// What the C library makes of a text in one piece, with room for it all.
std::optional<std::string> expected(const std::wstring& text) {
    std::string bytes((text.size() + 1) * 16, '\0');
    std::mbstate_t state{};
    const wchar_t* from = text.c_str();
    const std::size_t size = std::wcsrtombs(bytes.data(), &from, bytes.size(), &state);
    return size != refused ? std::make_optional(bytes.substr(0, size)) : std::nullopt;
}

std::optional<std::wstring> expected(const std::string& text) {
    std::wstring characters(text.size() + 1, L'\0');
    std::mbstate_t state{};
    const char* from = text.c_str();
    const std::size_t size = std::mbsrtowcs(characters.data(), &from, characters.size(), &state);
    return size != refused ? std::make_optional(characters.substr(0, size)) : std::nullopt;
}

// The library's four operations, told apart by their types.
bool convert(const std::wstring& in, std::string& out) {
    return CUtility::WStringToAString(in, out);
}
bool convert(const std::string& in, std::wstring& out) {
    return CUtility::AStringToWString(in, out);
}
bool convert(const std::vector<std::wstring>& in, std::vector<std::string>& out) {
    return CUtility::WStringArrToAStringArr(in, out);
}
bool convert(const std::vector<std::string>& in, std::vector<std::wstring>& out) {
    return CUtility::AStringArrToWStringArr(in, out);
}

// Whether the library does with a text what the C library does.
template <class To, class From>
testing::AssertionResult convertsAsTheCLibrary(const From& text) {
    const To untouched(3, 'u');
    To out = untouched;
    const bool converted = convert(text, out);
    forgetLoggerCalls();
    const std::optional<To> wanted = expected(text);
    if (converted == wanted.has_value() && out == wanted.value_or(untouched)) {
        return testing::AssertionSuccess();
    }
    return testing::AssertionFailure()
           << testing::PrintToString(text) << " became " << testing::PrintToString(out);
}

const char* const locales[] = {"C", "C.UTF-8", "de_DE.ISO-8859-1", "zh_HK.BIG5-HKSCS", "en_US.ISO-2022-KR"};

class Conversion : public testing::TestWithParam<const char*> {
protected:
    Conversion() : locale_(GetParam(), LC_CTYPE_MASK) { forgetLoggerCalls(); }

private:
    const ThreadLocale locale_;
};

class ATextConversion : public testing::Test {
protected:
    ATextConversion() { forgetLoggerCalls(); }

    const ThreadLocale plain_{"C"};
};

} // namespace

INSTANTIATE_TEST_SUITE_P(InLocales, Conversion, testing::ValuesIn(locales));

TEST_P(Conversion, TakesEveryCodePointThatTheCLibraryTakes) {
    std::wstring encodable;
    std::vector<std::wstring> texts;
    std::vector<std::string> wantedTexts;
    for (wchar_t c = 1; c <= lastCodePoint; ++c) {
        const std::wstring text(1, c);
        const std::optional<std::string> wanted = expected(text);
        if (wanted) {
            encodable += c;
            texts.push_back(text);
            wantedTexts.push_back(*wanted);
        } else {
            std::string out = "as it was";
            ASSERT_FALSE(CUtility::WStringToAString(text, out)) << std::hex << static_cast<unsigned int>(c);
            ASSERT_EQ(out, "as it was");
            forgetLoggerCalls();
        }
    }
    ASSERT_GE(encodable.size(), 127U);
    EXPECT_TRUE(convertsAsTheCLibrary<std::string>(encodable));
    EXPECT_TRUE(convertsAsTheCLibrary<std::wstring>(expected(encodable).value_or("")));
    std::vector<std::string> narrow;
    EXPECT_TRUE(CUtility::WStringArrToAStringArr(texts, narrow));
    EXPECT_TRUE(narrow == wantedTexts);
    std::vector<std::wstring> wide;
    EXPECT_TRUE(CUtility::AStringArrToWStringArr(wantedTexts, wide));
    ASSERT_EQ(wide.size(), wantedTexts.size());
    for (std::size_t i = 0; i < wide.size(); ++i) {
        ASSERT_EQ(wide[i], expected(wantedTexts[i])) << i;
    }
}

TEST_P(Conversion, TakesEveryByteSequenceThatTheCLibraryTakes) {
    for (unsigned int first = 1; first < 256; ++first) {
        for (unsigned int second = 0; second < 256; ++second) {
            const char bytes[] = {static_cast<char>(first), static_cast<char>(second), '\0'};
            ASSERT_TRUE(convertsAsTheCLibrary<std::wstring>(std::string(bytes)));
        }
    }
    // Longer ones: any bytes, and characters with one byte changed.
    std::mt19937 random(1); // NOLINT: the same texts in every run
    for (int round = 0; round < 5000; ++round) {
        std::string bytes(random() % 40, '\0');
        std::generate(bytes.begin(), bytes.end(), [&random] { return static_cast<char>(random()); });
        ASSERT_TRUE(convertsAsTheCLibrary<std::wstring>(bytes));

        std::wstring text(random() % 20, L'\0');
        std::generate(text.begin(), text.end(), [&random] {
            const wchar_t limits[] = {0x80, 0x100, 0x800, 0xD900, 0x10000, lastCodePoint + 3, -1};
            const wchar_t limit = limits[random() % 7];
            return limit > 0 ? static_cast<wchar_t>(random() % static_cast<unsigned int>(limit))
                             : static_cast<wchar_t>(random());
        });
        ASSERT_TRUE(convertsAsTheCLibrary<std::string>(text));

        std::string changed = expected(text).value_or("");
        ASSERT_TRUE(convertsAsTheCLibrary<std::wstring>(changed));
        if (!changed.empty()) {
            changed[random() % changed.size()] = static_cast<char>(random());
            ASSERT_TRUE(convertsAsTheCLibrary<std::wstring>(changed));
        }
    }
}

// Texts are converted block by block on the way to narrow text, so a character of several bytes, or a change
// of the shift state, can come to stand on the edge of a block of any power of two.
TEST_P(Conversion, TakesLongTextsWhole) {
    for (const wchar_t character : {L'\u00E4', L'\u4E00', L'\uAC00', L'\U0001F600'}) {
        for (const std::size_t around : {256U, 4096U, 8192U}) {
            for (std::size_t lead = around - 20; lead < around + 4; ++lead) {
                std::wstring text(lead, L'x');
                for (int i = 0; i < 5000; ++i) {
                    text += character;
                    text.append(static_cast<std::size_t>(i) % 3, L'y');
                }
                ASSERT_TRUE(convertsAsTheCLibrary<std::string>(text)) << lead;
                ASSERT_TRUE(convertsAsTheCLibrary<std::wstring>(expected(text).value_or("")));
            }
        }
    }
}

TEST_F(ATextConversion, EndsAtTheFirstNul) {
    std::string narrow = "earlier";
    EXPECT_TRUE(CUtility::WStringToAString(std::wstring(L"abc\0\x110000", 5), narrow));
    EXPECT_EQ(narrow, "abc");
    EXPECT_TRUE(CUtility::WStringToAString(L"", narrow));
    EXPECT_EQ(narrow, "");
    std::wstring wide = L"earlier";
    EXPECT_TRUE(CUtility::AStringToWString(std::string("abc\0\xFF", 5), wide));
    EXPECT_EQ(wide, L"abc");
    EXPECT_TRUE(CUtility::AStringToWString("", wide));
    EXPECT_EQ(wide, L"");
    std::vector<std::string> narrows;
    EXPECT_TRUE(CUtility::WStringArrToAStringArr({std::wstring(L"ab\0c", 4), L"", L"d"}, narrows));
    EXPECT_EQ(narrows, std::vector<std::string>({"ab", "", "d"}));
    std::vector<std::wstring> wides;
    EXPECT_TRUE(CUtility::AStringArrToWStringArr({std::string("ab\0c", 4), "", "d"}, wides));
    EXPECT_EQ(wides, std::vector<std::wstring>({L"ab", L"", L"d"}));
}

// A failure in the middle of a shifted run must not shift the next text.
TEST_F(ATextConversion, StartsInTheInitialShiftState) {
    const ThreadLocale korean("en_US.ISO-2022-KR", LC_CTYPE_MASK);
    const std::wstring text = L"a\uAC00b";
    for (int i = 0; i < 3; ++i) {
        std::string out;
        EXPECT_FALSE(CUtility::WStringToAString(L"\uAC00\U0001F600", out));
        EXPECT_TRUE(convertsAsTheCLibrary<std::string>(text));
        EXPECT_NE(expected(text).value_or("").find('\x0E'), std::string::npos) << "not shifted at all";
    }
}

namespace {

// A vector operation with texts that "C" converts and one that it does not.
template <class To, class From>
void checkVectors(const char* function, const From& a, const From& b, const From& bad, const To& wideA,
                  const To& wideB) {
    const To c(1, 'c');
    const To d(1, 'd');
    struct {
        std::vector<From> in;
        bool converted;
        std::vector<To> out;
    } const rows[] = {
        {{}, true, {c, d}}, {{From()}, true, {c, d, To()}}, {{a, b, a}, true, {c, d, wideA, wideB, wideA}},
        {{bad}, false, {}}, {{a, bad, b}, false, {}},       {{a, b, bad}, false, {}},
    };
    for (const auto& row : rows) {
        std::vector<To> out = {c, d};
        EXPECT_EQ(convert(row.in, out), row.converted) << function;
        EXPECT_EQ(out, row.out) << function;
        EXPECT_EQ(takeTraces(),
                  std::vector<std::string>({entering(utility, function), exiting(utility, function)}));
    }
}

// An operation under the n-th failing allocation, for every n that it reaches. `check` sees what the
// failure leaves.
template <class To, class From>
void checkMemory(const From& in, const To& earlier, const To& result,
                 const std::function<void(const To&)>& check) {
    bool reached = true;
    unsigned int failures = 0;
    for (unsigned int n = 1; reached; ++n) {
        forgetLoggerCalls();
        To out = earlier;
        bool converted = false;
        failAllocation(n);
        try {
            converted = convert(in, out);
        } catch (const std::bad_alloc&) {
            ++failures;
        }
        reached = failAllocation(0);
        if (converted) {
            EXPECT_EQ(out, result);
        } else {
            check(out);
        }
    }
    EXPECT_GE(failures, 4U);
}

} // namespace

TEST_F(ATextConversion, OfAVectorAppendsOrEmpties) {
    checkVectors<std::wstring, std::string>("AStringArrToWStringArr", "a", "bb", "\xFF", L"a", L"bb");
    checkVectors<std::string, std::wstring>("WStringArrToAStringArr", L"a", L"bb", L"\u00E4", "a", "bb");
}

TEST_F(ATextConversion, TracesEntryAndExitAlsoWhenItFails) {
    for (const wchar_t character : {L'a', L'\u4E00'}) {
        std::string out;
        EXPECT_EQ(CUtility::WStringToAString(std::wstring(1, character), out), character == L'a');
        EXPECT_EQ(takeTraces(), std::vector<std::string>({entering(utility, "WStringToAString"),
                                                          exiting(utility, "WStringToAString")}));
    }
    for (const char character : {'a', '\xFF'}) {
        std::wstring out;
        EXPECT_EQ(CUtility::AStringToWString(std::string(1, character), out), character == 'a');
        EXPECT_EQ(takeTraces(), std::vector<std::string>({entering(utility, "AStringToWString"),
                                                          exiting(utility, "AStringToWString")}));
    }
}

TEST_F(ATextConversion, LeavesItsOutputAloneWhenMemoryRunsOut) {
    const std::string narrow(10000, 'x');
    const std::wstring wide(10000, L'x');
    checkMemory<std::wstring>(narrow, std::wstring(L"earlier"), wide,
                              [](const std::wstring& out) { EXPECT_EQ(out, L"earlier"); });
    checkMemory<std::string>(wide, std::string("earlier"), narrow,
                             [](const std::string& out) { EXPECT_EQ(out, "earlier"); });
    // A vector keeps what it held, and what was converted until then.
    checkMemory<std::vector<std::string>>(std::vector<std::wstring>{wide, wide}, {"earlier"},
                                          std::vector<std::string>{"earlier", narrow, narrow},
                                          [&](const std::vector<std::string>& out) {
                                              ASSERT_GE(out.size(), 1U);
                                              EXPECT_EQ(out[0], "earlier");
                                              for (std::size_t i = 1; i < out.size(); ++i) {
                                                  EXPECT_EQ(out[i], narrow);
                                              }
                                          });
    checkMemory<std::vector<std::wstring>>(std::vector<std::string>{narrow, narrow}, {L"earlier"},
                                           std::vector<std::wstring>{L"earlier", wide, wide},
                                           [&](const std::vector<std::wstring>& out) {
                                               ASSERT_GE(out.size(), 1U);
                                               EXPECT_EQ(out[0], L"earlier");
                                           });
}

TEST_F(ATextConversion, PassesOnWhatTheLoggerThrows) {
    for (int call = 1; call <= 4; ++call) {
        std::string narrow = "earlier";
        failLoggerCall(call);
        EXPECT_THROW(CUtility::WStringToAString(L"text", narrow), std::runtime_error);
        EXPECT_EQ(narrow, "earlier") << call;
        std::wstring wide = L"earlier";
        failLoggerCall(call);
        EXPECT_THROW(CUtility::AStringToWString("text", wide), std::runtime_error);
        EXPECT_EQ(wide, L"earlier") << call;
    }
    failLoggerCall(0);
}

TEST(TextConversions, OfThreadsDoNotMeet) {
    const char* const names[] = {"en_US.ISO-2022-KR", "en_US.ISO-2022-KR", "C.UTF-8", "de_DE.ISO-8859-1"};
    std::vector<std::thread> threads;
    for (const char* const name : names) {
        threads.emplace_back([name] {
            const ThreadLocale locale(name, LC_CTYPE_MASK);
            std::wstring text = std::string(name) == "de_DE.ISO-8859-1" ? L"a\u00E4b" : L"a\uAC00b";
            for (int i = 0; i < 8; ++i) {
                text += text;
            }
            const std::string wanted = expected(text).value_or("");
            EXPECT_FALSE(wanted.empty()) << name;
            for (int i = 0; i < 300; ++i) {
                std::string narrow;
                std::wstring wide;
                EXPECT_TRUE(CUtility::WStringToAString(text, narrow));
                EXPECT_TRUE(CUtility::AStringToWString(narrow, wide));
                ASSERT_EQ(narrow, wanted);
                ASSERT_EQ(wide, text);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    forgetLoggerCalls();
}
