// Texts: converted, and which texts of users are refused.
#include "BrokerTest.h"
#include "Obvious.h"
#include "TestLocales.h"

#include <atomic>
#include <dlfcn.h>
#include <random>

using obvious::entries;
using obvious::isAcceptable;
using obvious::widened;
using TK::ProviderUtilities;

// Stands in the place of the C library's, which may be asked about 0 to 255 and EOF alone.
static std::atomic<int> foldings{0};
static std::atomic<int> strayFoldings{0};
extern "C" __attribute__((visibility("default"))) int tolower(int c) noexcept {
    static const auto real = reinterpret_cast<int (*)(int)>(::dlsym(RTLD_NEXT, "tolower"));
    ++foldings;
    strayFoldings += c < 0 || c > 255 ? 1 : 0;
    return real(c);
}

namespace {

class TextTest : public BrokerTest {
protected:
    const ThreadLocale plain_{"C"};
};

} // namespace

TEST_F(TextTest, ConvertsTextsThatAreNotEmpty) {
    std::string narrow = "earlier";
    std::wstring wide = L"earlier";
    const auto convert = [&](const std::wstring& wideIn, const std::string& narrowIn, bool result) {
        return logOf([&] {
            EXPECT_EQ(ProviderUtilities::ConvertWideCharToMultiByte(wideIn, narrow), result);
            EXPECT_EQ(ProviderUtilities::ConvertMultiByteToWideChar(narrowIn, wide), result);
        });
    };
    const std::string traces = passing(utility, "WStringToAString") + passing(utility, "AStringToWString");
    EXPECT_EQ(convert(L"\u00E4", "\xE4", false), traces);
    EXPECT_EQ(narrow + std::string(wide.begin(), wide.end()), "earlierearlier");
    EXPECT_EQ(convert(L"", "", true), "");
    EXPECT_EQ(narrow + std::string(wide.begin(), wide.end()), "");
}

namespace {

// Random texts over an alphabet, with every exemption and some that are none.
template <class Char>
void checkScreen(const std::basic_string<Char>& alphabet) {
    std::vector<std::basic_string<Char>> exemptions = {widened<Char>(""), widened<Char>("HTTP:"),
                                                       widened<Char>("http"), widened<Char>("<<"),
                                                       widened<Char>(std::string(":\0", 2))};
    for (const std::string& entry : entries) {
        exemptions.push_back(widened<Char>(entry));
    }
    std::mt19937 random(1); // NOLINT: the same texts in every run
    int accepted = 0;
    for (int round = 0; round < 5000; ++round) {
        std::basic_string<Char> text;
        for (std::size_t parts = random() % 5; parts > 0; --parts) {
            if (random() % 8 == 0) { // an entry, perhaps with a letter cut off and some in upper case
                std::string entry = entries[random() % entries.size()].substr(random() % 8 == 0 ? 1 : 0);
                for (char& c : entry) {
                    c = random() % 2 == 0 && c >= 'a' && c <= 'z' ? static_cast<char>(c - 32) : c;
                }
                text += widened<Char>(entry);
            } else {
                text.append(1 + random() % 2, alphabet[random() % alphabet.size()]);
            }
        }
        for (const std::basic_string<Char>& exemption : exemptions) {
            const bool expected = isAcceptable(text, exemption);
            accepted += expected ? 1 : 0;
            ASSERT_EQ(ProviderUtilities::ValidateInput(text, exemption), expected)
                << testing::PrintToString(text) << " with " << testing::PrintToString(exemption);
        }
    }
    EXPECT_GT(accepted, 5000);
    EXPECT_LT(accepted, 5000 * static_cast<int>(exemptions.size()) - 5000);
}

} // namespace

// The obvious version's answers that users build on, then all that it answers.
TEST_F(TextTest, ScreensTextsOfUsers) {
    EXPECT_TRUE(isAcceptable<char>("a\\b<", "<"));
    EXPECT_FALSE(isAcceptable<char>("WWW.x", ":"));
    EXPECT_TRUE(isAcceptable<char>("a:b", ":"));
    EXPECT_FALSE(isAcceptable<char>("sftp:", "sftp:")); // "ftp:" comes first
    foldings = 0;
    strayFoldings = 0;
    checkScreen<char>(std::string("<htps:%$\\w.afHTPSWAF xyz\0\x7F\x80\xBC\xFF\xD7", 30));
    // Wide characters whose low byte is that of an entry's character stand for themselves.
    std::wstring alphabet(
        L"<htps:%$\\w.afHTPSWAF xyz\0\u00BC\u00FF\u0157\u013C\u013A\U0001003A\u0125\u0124\u0100", 34);
    alphabet += static_cast<wchar_t>(-0xC4);
    alphabet += static_cast<wchar_t>(0x8000003A);
    alphabet += static_cast<wchar_t>(-1);
    checkScreen<wchar_t>(alphabet);
    EXPECT_GT(foldings, 100000);
    EXPECT_EQ(strayFoldings, 0);
}

// Long texts are looked through block by block: an entry is found wherever it stands, across the blocks'
// edges too.
TEST_F(TextTest, ScreensLongTexts) {
    constexpr std::size_t length = 3 * 4096 + 100;
    const auto accepted = [](const std::string& text) {
        const bool narrow = ProviderUtilities::ValidateInput(text, "");
        EXPECT_EQ(ProviderUtilities::ValidateInput(widened<wchar_t>(text), L""), narrow);
        return narrow;
    };
    // What looks like an entry, in every block or in none.
    for (const std::string filling : {"Row w. Rack p. App. aap. wwp. waw. wa. ww ", "x"}) {
        std::string clean;
        while (clean.size() < length) {
            clean += filling;
        }
        clean.resize(length);
        EXPECT_TRUE(accepted(clean));
        for (const std::string entry : {"www.", "WaP.", "wWW.", "<", ":"}) {
            for (std::size_t position = 0; position + entry.size() <= length; ++position) {
                if ((position + 10) % 4096 < 20 || position + entry.size() == length) {
                    EXPECT_FALSE(accepted(std::string(clean).replace(position, entry.size(), entry)))
                        << entry << " at " << position;
                }
            }
        }
    }
}
