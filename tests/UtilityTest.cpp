// Wide and narrow texts: everything that the C library converts, and nothing that it does not.
#include "Utility.h"

#include "LoggerCalls.h"
#include "Obvious.h"
#include "TestLocales.h"

#include <algorithm>
#include <gtest/gtest.h>
#include <optional>
#include <random>

using TK::CUtility;

namespace {

constexpr wchar_t lastCodePoint = 0x10FFFF;

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
    takeTraces();
    const std::optional<To> wanted = obvious::converted(text);
    if (converted == wanted.has_value() && out == wanted.value_or(untouched)) {
        return testing::AssertionSuccess();
    }
    return testing::AssertionFailure()
           << testing::PrintToString(text) << " became " << testing::PrintToString(out);
}

class ConversionTest : public testing::TestWithParam<const char*> {
    const ThreadLocale locale_{GetParam(), LC_CTYPE_MASK};
};

class ConversionStateTest : public testing::Test {
protected:
    ConversionStateTest() { takeTraces(); }

    const ThreadLocale plain_{"C"};
};

} // namespace

INSTANTIATE_TEST_SUITE_P(InLocales, ConversionTest,
                         testing::Values("C", "C.UTF-8", "de_DE.ISO-8859-1", "zh_HK.BIG5-HKSCS",
                                         "en_US.ISO-2022-KR"));

TEST_P(ConversionTest, ConvertsEveryCodePointOfTheCLibrary) {
    std::vector<std::wstring> texts;
    std::vector<std::string> wanted;
    for (wchar_t c = 1; c <= lastCodePoint; ++c) {
        const std::wstring text(1, c);
        if (const std::optional<std::string> bytes = obvious::converted(text)) {
            texts.push_back(text);
            wanted.push_back(*bytes);
        } else {
            ASSERT_TRUE(convertsAsTheCLibrary<std::string>(text));
        }
    }
    ASSERT_GE(texts.size(), 127U);
    std::vector<std::string> narrow;
    EXPECT_TRUE(convert(texts, narrow));
    EXPECT_TRUE(narrow == wanted);
    std::vector<std::wstring> wide;
    EXPECT_TRUE(convert(narrow, wide));
    for (std::size_t i = 0; i < wide.size(); ++i) {
        ASSERT_EQ(wide[i], obvious::converted(wanted[i])) << i;
    }
    EXPECT_EQ(wide.size(), wanted.size());
}

TEST_P(ConversionTest, ConvertsEveryByteSequenceOfTheCLibrary) {
    for (unsigned int first = 1; first < 256; ++first) {
        for (unsigned int second = 0; second < 256; ++second) {
            const char bytes[] = {static_cast<char>(first), static_cast<char>(second), '\0'};
            ASSERT_TRUE(convertsAsTheCLibrary<std::wstring>(std::string(bytes)));
        }
    }
    // Longer ones: characters, and with one byte changed.
    std::mt19937 random(1); // NOLINT: the same texts in every run
    for (int round = 0; round < 5000; ++round) {
        std::wstring text(random() % 20, L'\0');
        std::generate(text.begin(), text.end(), [&random] {
            const wchar_t limits[] = {0x80, 0x100, 0x800, 0xD900, 0x10000, lastCodePoint + 3, 0};
            const wchar_t limit = limits[random() % 7];
            return limit > 0 ? static_cast<wchar_t>(random() % static_cast<unsigned int>(limit))
                             : static_cast<wchar_t>(random());
        });
        ASSERT_TRUE(convertsAsTheCLibrary<std::string>(text));

        std::string changed = obvious::converted(text).value_or("");
        ASSERT_TRUE(convertsAsTheCLibrary<std::wstring>(changed));
        if (!changed.empty()) {
            changed[random() % changed.size()] = static_cast<char>(random());
            ASSERT_TRUE(convertsAsTheCLibrary<std::wstring>(changed));
        }
    }
}

// Texts are converted block by block on the way to narrow text, so a character of several bytes, or a change
// of the shift state, can come to stand on the edge of a block of any power of two.
TEST_P(ConversionTest, ConvertsLongTexts) {
    for (const wchar_t character : {L'\u00E4', L'\u4E00', L'\uAC00', L'\U0001F600'}) {
        for (const std::size_t around : {256U, 4096U, 8192U}) {
            for (std::size_t lead = around - 20; lead < around + 4; ++lead) {
                std::wstring text(lead, L'x');
                for (int i = 0; i < 5000; ++i) {
                    text += character;
                    text.append(static_cast<std::size_t>(i) % 3, L'y');
                }
                ASSERT_TRUE(convertsAsTheCLibrary<std::string>(text)) << lead;
                ASSERT_TRUE(convertsAsTheCLibrary<std::wstring>(obvious::converted(text).value_or("")));
            }
        }
    }
}

// A failure in the middle of a shifted run must not shift the next text.
TEST_F(ConversionStateTest, StartsInTheInitialShiftState) {
    const ThreadLocale korean("en_US.ISO-2022-KR", LC_CTYPE_MASK);
    for (int i = 0; i < 3; ++i) {
        std::string out;
        EXPECT_FALSE(convert(L"\uAC00\U0001F600", out));
        EXPECT_TRUE(convert(L"a\uAC00b", out));
        EXPECT_EQ(out, "a\x0E\x30\x21\x0F"
                       "b");
    }
}

namespace {

// A vector operation with a text that "C" converts up to its NUL and one that it does not.
template <class To, class From>
void checkVectors(const char* function, const From& a, const From& bad, const To& wideA) {
    const To c(1, 'c');
    const struct {
        std::vector<From> in;
        std::vector<To> out; // none after a failure
    } rows[] = {{{}, {c}}, {{From(), a}, {c, To(), wideA}}, {{bad, a}, {}}, {{a, bad}, {}}};
    for (const auto& row : rows) {
        std::vector<To> out = {c};
        EXPECT_EQ(convert(row.in, out), !row.out.empty()) << function;
        EXPECT_EQ(out, row.out) << function;
        EXPECT_EQ(takeTraces(), passing(utility, function));
    }
}

} // namespace

TEST_F(ConversionStateTest, VectorsEndUpWholeOrEmpty) {
    checkVectors<std::wstring, std::string>("AStringArrToWStringArr", {"aa\0\xFF", 4}, "\xFF", L"aa");
    checkVectors<std::string, std::wstring>("WStringArrToAStringArr", {L"aa\0\x110000", 4}, L"\u00E4", "aa");
}
