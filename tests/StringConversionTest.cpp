#include "StringConversion.h"
#include "TestLocales.h"

#include <array>
#include <random>
#include <sstream>

using TK::make_string;
using TK::make_wstring;
using namespace std::string_literals;

namespace {

// Encodings in which a character has one byte sequence.
const std::array<const char*, 4> unambiguous{"C", "C.UTF-8", "de_DE.ISO-8859-1", "tr_TR.ISO-8859-9"};
const char* const stateful = "en_US.ISO-2022-KR";

} // namespace

TEST(NarrowText, IsInTheEncodingOfTheThreadsLocale) {
    const struct {
        const char* locale;
        std::wstring wide;
        std::string narrow;
    } rows[] = {
        {"C", L"plain\0text"s, "plain\0text"s},
        {"C.UTF-8", L"\u00FC\u0130\u20AC\0\U0001F600"s, "\xC3\xBC\xC4\xB0\xE2\x82\xAC\0\xF0\x9F\x98\x80"s},
        {"de_DE.ISO-8859-1", L"\u00FC\0\u00FE"s, "\xFC\0\xFE"s},
        {"tr_TR.ISO-8859-9", L"\u00FC\0\u015F\u0130"s, "\xFC\0\xFE\xDD"s},
        // The two characters stand for one byte sequence, and the first is held back until the next is seen.
        {"zh_HK.BIG5-HKSCS", L"\u00CA\u0304\0\u00CA\0\u00CA\u0304"s, "\x88\x62\0\x88\x66\0\x88\x62"s},
        // Text goes back to ASCII before a NUL and at the end.
        {stateful, L"A\uAC00B\uAC00\0\uAC00"s, "A\x0E\x30\x21\x0F"s + "B\x0E\x30\x21\x0F\0\x0E\x30\x21\x0F"s},
    };
    for (const auto& row : rows) {
        const ThreadLocale locale(row.locale);
        EXPECT_EQ(make_string(row.wide), row.narrow) << row.locale;
        EXPECT_EQ(make_wstring(row.narrow), row.wide) << row.locale;
        EXPECT_TRUE(make_string(L"").empty() && make_wstring("").empty()) << row.locale;
    }
}

TEST(NarrowText, HasAQuestionMarkForWhatTheEncodingLacks) {
    const struct {
        const char* locale;
        std::string narrow;
    } rows[] = {{"C", "a????\0b"s},
                {"C.UTF-8", "a\xC4\xB0\xEA\xB0\x80??\0b"s},
                {"tr_TR.ISO-8859-9", "a\xDD???\0b"s},
                {stateful, "a?\x0E\x30\x21\x0F??\0b"s}};
    for (const auto& row : rows) {
        const ThreadLocale locale(row.locale);
        const std::wstring text = L"a\u0130\uAC00"s + static_cast<wchar_t>(0xD800) + static_cast<wchar_t>(-2);
        EXPECT_EQ(make_string(text + L"\0b"s), row.narrow) << row.locale;
    }
}

TEST(InvalidBytes, BecomeCharactersOfTheirOwn) {
    const ThreadLocale locale("C.UTF-8");
    const struct {
        std::string narrow;
        std::wstring wide;
    } rows[] = {{"a\xFF\0b"s, L"a\xDCFF\0b"s},       {"\xE2\x82"s, L"\xDCE2\xDC82"s},
                {"\xE2\x82\0"s, L"\xDCE2\xDC82\0"s}, {"\xE2(\xAC"s, L"\xDCE2(\xDCAC"s},
                {"\xC0\x80"s, L"\xDCC0\xDC80"s},     {"\xED\xB2\x80"s, L"\xDCED\xDCB2\xDC80"s},
                {"\x80\xC3\xBC"s, L"\xDC80\u00FC"s}};
    for (const auto& row : rows) {
        EXPECT_EQ(make_wstring(row.narrow), row.wide) << row.narrow;
        EXPECT_EQ(make_string(row.wide), row.narrow) << row.narrow;
    }
}

TEST(InvalidBytes, StandBehindACharacterThatTheEncodingHeldBack) {
    {
        const ThreadLocale locale("zh_HK.BIG5-HKSCS");
        EXPECT_EQ(make_string(L"\u00CA\xDCFF"), "\x88\x66\xFF");
        EXPECT_EQ(make_wstring("\x88\x62\xFF"), L"\u00CA\u0304\xDCFF");
    }
    const ThreadLocale locale(stateful);
    EXPECT_EQ(make_string(L"\uAC00\xDCFFz"), "\x0E\x30\x21\x0F\xFFz");
    EXPECT_EQ(make_wstring("\x0E\x30\x21\xFF\x30\x21\x0Fz\xFFz"), L"\uAC00\xDCFF\uAC00z\xDCFFz");
}

TEST(AnyBytes, SurviveTheWayToWideTextAndBack) {
    std::mt19937 random(3);
    // Parts of valid, incomplete and overlong sequences among plain characters and NULs.
    const std::string alphabet("ab\0\xC3\xBC\xE2\x82\xAC\xF0\x9F\x98\x80\xFF\xED\xA0\x1B\x0E", 17);
    for (const char* const name : unambiguous) {
        const ThreadLocale locale(name);
        for (int i = 0; i < 20000; ++i) {
            std::string text;
            for (auto left = random() % 12; left > 0; --left) {
                text += (random() & 1U) != 0 ? alphabet[random() % alphabet.size()]
                                             : static_cast<char>(random() & 0xFFU);
            }
            ASSERT_EQ(make_string(make_wstring(text)), text) << name << ' ' << testing::PrintToString(text);
        }
    }
}

TEST(AnyWideText, ConvertsWhole) {
    std::mt19937 random(4);
    for (const char* const name : {"C", "C.UTF-8", "zh_HK.BIG5-HKSCS", stateful}) {
        const ThreadLocale locale(name);
        for (int i = 0; i < 20000; ++i) {
            std::wstring text;
            for (int j = 0; j < 6; ++j) {
                text += static_cast<wchar_t>(random() >> (random() % 32));
            }
            const std::string narrow = make_string(text + L"\0end"s);
            ASSERT_GE(narrow.size(), 4U);
            ASSERT_EQ(narrow.substr(narrow.size() - 4), "\0end"s) << name;
        }
    }
}

TEST(ACText, IsCopiedAndNullIsEmpty) {
    EXPECT_EQ(make_string(static_cast<const char*>(nullptr)), "");
    EXPECT_EQ(make_string("\xFFtext"), "\xFFtext");
    std::ostringstream stream;
    stream.width(5);
    TK::operator<<(stream, std::string("ab"));
    EXPECT_EQ(stream.str(), "   ab");
}
