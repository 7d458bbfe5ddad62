#include "Locale.h"
#include "ResourceString.h"
#include "TestLocales.h"

#include <future>
#include <string>

using TK::Locale;
using TK::ResourceString;

namespace {

std::wstring library() {
    return Locale::getResourceLibrary(2, Locale::getLanguageId());
}

std::wstring localised(const std::wstring& key) {
    std::wstring text = ResourceString(library(), key);
    EXPECT_EQ(text, ResourceString(library(), key).getString());
    return text;
}

const std::wstring english = L"The asset tag holds characters that are not allowed.";
const std::wstring german = L"Das Inventarkennzeichen enth\u00E4lt unzul\u00E4ssige Zeichen.";

} // namespace

TEST(TheLanguage, IsThatOfTheThreadsMessages) {
    {
        const ThreadLocale locale("C");
        EXPECT_EQ(Locale::getLanguageId(), "en");
        EXPECT_EQ(localised(english), english);
    }
    {
        const ThreadLocale locale("de_DE.UTF-8");
        EXPECT_EQ(Locale::getLanguageId(), "de_DE");
        EXPECT_EQ(localised(english), german);
        EXPECT_EQ(localised(L"Operating system"), L"Betriebssystem");
    }
    {
        const ThreadLocale locale("C.UTF-8");
        EXPECT_EQ(Locale::getLanguageId(), "en");
        EXPECT_EQ(localised(english), english);
    }
    const ThreadLocale locale("tr_TR.ISO-8859-9");
    EXPECT_EQ(Locale::getLanguageId(), "tr_TR");
    EXPECT_EQ(localised(english), english); // there is no such catalogue
}

TEST(ALocalisedText, DoesNotDependOnTheCharacterTypes) {
    {
        const ThreadLocale locale("de_DE.UTF-8", LC_MESSAGES_MASK);
        EXPECT_EQ(localised(english), german);
    }
    const ThreadLocale locale("de_DE.ISO-8859-1");
    EXPECT_EQ(Locale::getLanguageId(), "de_DE");
    EXPECT_EQ(localised(english), german);
}

TEST(ALocalisedText, IsTheKeyWhenThereIsNone) {
    const ThreadLocale locale("de_DE.UTF-8");
    // Under the empty key a catalogue holds its header, and a NUL would cut a key down to one that exists.
    for (const std::wstring& key :
         {std::wstring(), std::wstring(L"no such text"), std::wstring(L"\u00E4\u20AC\U0001F600"),
          std::wstring(L"\xD800"), std::wstring(1, static_cast<wchar_t>(-1)),
          std::wstring(L"Operating system\0", 17), std::wstring(L"\0", 1)}) {
        EXPECT_EQ(localised(key), key);
    }
    for (const unsigned long number : {0UL, 1UL, 3UL, ~0UL}) {
        EXPECT_EQ(Locale::getResourceLibrary(number, "de_DE"), L"");
    }
    for (const std::wstring& name : {std::wstring(), std::wstring(L"other"), library() + L'x'}) {
        EXPECT_EQ(ResourceString(name, L"Operating system").getString(), L"Operating system");
    }
}

TEST(ALocalisedText, CanDifferBetweenThreadsAtOneTime) {
    const auto lookUpIn = [](const char* name) {
        return std::async(std::launch::async, [name] {
            const ThreadLocale locale(name);
            std::wstring all;
            for (int i = 0; i < 1000; ++i) {
                const std::wstring text = localised(english);
                if (text != all) {
                    all += text;
                }
            }
            return all;
        });
    };
    auto first = lookUpIn("de_DE.UTF-8");
    auto second = lookUpIn("C");
    EXPECT_EQ(first.get(), german);
    EXPECT_EQ(second.get(), english);
}
