#include "Locale.h"
#include "ResourceString.h"
#include "TestLocales.h"

#include <string>
#include <thread>
#include <vector>

using TK::Locale;
using TK::ResourceString;

namespace {

std::wstring localised(const std::wstring& key) {
    const std::wstring library = Locale::getResourceLibrary(2, Locale::getLanguageId());
    std::wstring text = ResourceString(library, key);
    EXPECT_EQ(text, ResourceString(library, key).getString());
    return text;
}

const std::wstring english = L"The asset tag holds characters that are not allowed.";
const std::wstring german = L"Das Inventarkennzeichen enth\u00E4lt unzul\u00E4ssige Zeichen.";

} // namespace

TEST(LocaleTest, TextIsInTheLanguageOfTheThread) {
    const struct {
        const char* locale;
        int mask;
        const char* language;
        const std::wstring& text;
    } rows[] = {
        {"C", LC_ALL_MASK, "en", english},
        {"C.UTF-8", LC_ALL_MASK, "en", english},
        {"de_DE.UTF-8", LC_ALL_MASK, "de_DE", german},
        {"de_DE.UTF-8", LC_MESSAGES_MASK, "de_DE", german}, // whatever the character types
        {"de_DE.ISO-8859-1", LC_ALL_MASK, "de_DE", german},
        {"tr_TR.ISO-8859-9", LC_ALL_MASK, "tr_TR", english}, // there is no such catalogue
    };
    std::vector<std::thread> threads;
    for (const auto& row : rows) {
        threads.emplace_back([&row] {
            const ThreadLocale locale(row.locale, row.mask);
            EXPECT_EQ(Locale::getLanguageId(), row.language);
            for (int i = 0; i < 1000; ++i) {
                EXPECT_EQ(localised(english), row.text) << row.locale;
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
}

TEST(LocaleTest, UnknownTextIsItsKey) {
    const ThreadLocale locale("de_DE.UTF-8");
    // Under the empty key a catalogue holds its header, and a NUL would cut a key down to one that exists.
    for (const std::wstring& key :
         {std::wstring(), std::wstring(L"no such text \u00E4\u20AC\U0001F600"), std::wstring(L"\xD800"),
          std::wstring(1, static_cast<wchar_t>(-1)), std::wstring(L"Operating system\0", 17)}) {
        EXPECT_EQ(localised(key), key);
    }
    for (const unsigned long number : {1UL, 3UL}) {
        EXPECT_EQ(Locale::getResourceLibrary(number, "de_DE"), L"");
    }
    for (const wchar_t* const name : {L"", L"other"}) {
        EXPECT_EQ(ResourceString(name, english).getString(), english);
    }
}
