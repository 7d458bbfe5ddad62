#include "StringConversion.h"
#include "TestLocales.h"

#include <algorithm>
#include <random>
#include <sstream>

using TK::make_string;
using TK::make_wstring;
using namespace std::string_literals;

namespace {

const char* const stateful = "en_US.ISO-2022-KR";

} // namespace

TEST(NarrowTextTest, HasTheEncodingOfTheThread) {
    const struct {
        const char* locale;
        std::wstring wide;
        std::string narrow;
    } rows[] = {
        {"C", L""s, ""s},
        {"C", L"plain\0text"s, "plain\0text"s},
        {"C.UTF-8", L"\u00FC\u0130\u20AC\0\U0001F600"s, "\xC3\xBC\xC4\xB0\xE2\x82\xAC\0\xF0\x9F\x98\x80"s},
        {"tr_TR.ISO-8859-9", L"\u00FC\0\u015F\u0130"s, "\xFC\0\xFE\xDD"s},
        // The two characters stand for one byte sequence, and the first is held back until the next is seen.
        {"zh_HK.BIG5-HKSCS", L"\u00CA\u0304\0\u00CA\0\u00CA\u0304"s, "\x88\x62\0\x88\x66\0\x88\x62"s},
        // Text goes back to ASCII before a NUL and at the end.
        {stateful, L"A\uAC00B\uAC00\0\uAC00"s, "A\x0E\x30\x21\x0F"s + "B\x0E\x30\x21\x0F\0\x0E\x30\x21\x0F"s},
        // Invalid bytes become characters of their own,
        {"C.UTF-8", L"a\xDCFF\0b"s, "a\xFF\0b"s},
        {"C.UTF-8", L"\xDCE2\xDC82\0"s, "\xE2\x82\0"s},
        {"C.UTF-8", L"\xDCE2(\xDCAC"s, "\xE2(\xAC"s},
        {"C.UTF-8", L"\xDC80\u00FC\xDCC0\xDC80\xDCED\xDCB2\xDC80"s, "\x80\xC3\xBC\xC0\x80\xED\xB2\x80"s},
        // behind a character that the encoding held back, too.
        {"zh_HK.BIG5-HKSCS", L"\u00CA\u0304\xDCFF"s, "\x88\x62\xFF"s},
    };
    for (const auto& row : rows) {
        const ThreadLocale locale(row.locale);
        EXPECT_EQ(make_string(row.wide), row.narrow) << row.locale;
        EXPECT_EQ(make_wstring(row.narrow), row.wide) << row.locale;
    }
    {
        const ThreadLocale locale("zh_HK.BIG5-HKSCS");
        EXPECT_EQ(make_string(L"\u00CA\xDCFF"), "\x88\x66\xFF");
    }
    const ThreadLocale locale(stateful);
    EXPECT_EQ(make_string(L"\uAC00\xDCFFz"), "\x0E\x30\x21\x0F\xFFz");
    EXPECT_EQ(make_wstring("\x0E\x30\x21\xFF\x30\x21\x0Fz\xFFz"), L"\uAC00\xDCFF\uAC00z\xDCFFz");
}

TEST(NarrowTextTest, ReplacesUnknownCharactersByQuestionMarks) {
    const std::pair<const char*, std::string> rows[] = {{"C", "a????\0b"s},
                                                        {"C.UTF-8", "a\xC4\xB0\xEA\xB0\x80??\0b"s},
                                                        {"tr_TR.ISO-8859-9", "a\xDD???\0b"s},
                                                        {stateful, "a?\x0E\x30\x21\x0F??\0b"s}};
    for (const auto& [name, narrow] : rows) {
        const ThreadLocale locale(name);
        const std::wstring text = L"a\u0130\uAC00"s + static_cast<wchar_t>(0xD800) + static_cast<wchar_t>(-2);
        EXPECT_EQ(make_string(text + L"\0b"s), narrow) << name;
    }
}

TEST(StringConversionTest, RandomTextsReadBack) {
    std::mt19937 random(3);
    // Parts of valid, incomplete and overlong sequences among plain characters and NULs.
    const std::string alphabet("ab\0\xC3\xBC\xE2\x82\xAC\xF0\x9F\x98\x80\xFF\xED\xA0\x1B\x0E", 17);
    for (const std::string name : {"C", "C.UTF-8", "tr_TR.ISO-8859-9", "zh_HK.BIG5-HKSCS", stateful}) {
        const ThreadLocale locale(name.c_str());
        for (int i = 0; i < 20000; ++i) {
            std::string bytes;
            std::wstring characters;
            for (auto left = random() % 12; left > 0; --left) {
                bytes += (random() & 1U) != 0 ? alphabet[random() % alphabet.size()]
                                              : static_cast<char>(random() & 0xFFU);
                characters += static_cast<wchar_t>(random() >> (random() % 32));
            }
            const std::string narrow = make_string(characters + L"\0end"s);
            ASSERT_EQ(narrow.substr(std::max<std::size_t>(narrow.size(), 4) - 4), "\0end"s) << name;
            // In the other encodings a character has more than one byte sequence.
            if (name != "zh_HK.BIG5-HKSCS" && name != stateful) {
                ASSERT_EQ(make_string(make_wstring(bytes)), bytes) << name;
            }
        }
    }
}

TEST(StringConversionTest, TakesCTextsAndNull) {
    EXPECT_EQ(make_string(static_cast<const char*>(nullptr)), "");
    EXPECT_EQ(make_string("\xFFtext"), "\xFFtext");
    std::ostringstream stream;
    stream.width(5);
    TK::operator<<(stream, std::string("ab"));
    EXPECT_EQ(stream.str(), "   ab");
}
