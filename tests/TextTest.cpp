// Texts: converted, and which texts of users are refused.
#include "BrokerTest.h"
#include "Obvious.h"
#include "TestLocales.h"

#include <atomic>
#include <dlfcn.h>

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

// Every entry with each of its characters replaced in turn, and every exemption.
template <class Char>
void checkScreen(const std::basic_string<Char>& characters) {
    for (const std::string& entry : entries) {
        for (std::size_t i = 0; i < entry.size(); ++i) {
            for (const Char character : characters) {
                std::basic_string<Char> text = widened<Char>(entry);
                text[i] = character;
                for (const std::string& exempt : entries) {
                    const std::basic_string<Char> exemption = widened<Char>(exempt);
                    ASSERT_EQ(ProviderUtilities::ValidateInput(text, exemption),
                              isAcceptable(text, exemption))
                        << testing::PrintToString(text) << " with " << exempt;
                }
            }
        }
    }
}

} // namespace

// First the answers of the obvious version that users build on. A fuzz target tries other texts.
TEST_F(TextTest, ScreensTextsOfUsers) {
    EXPECT_TRUE(isAcceptable<char>("a\\b<", "<"));
    EXPECT_FALSE(isAcceptable<char>("WWW.x", ":"));
    EXPECT_TRUE(isAcceptable<char>("a:b", ":"));
    EXPECT_FALSE(isAcceptable<char>("sftp:", "sftp:")); // "ftp:" comes first
    foldings = 0;
    strayFoldings = 0;
    std::string bytes;
    for (int byte = 0; byte < 256; ++byte) {
        bytes += static_cast<char>(byte);
    }
    checkScreen(bytes);
    // Wide characters whose low byte is that of an entry's character are other characters.
    std::wstring characters = widened<wchar_t>(bytes) + L"\u0157\u013C\u013A\U0001003A\u0125\u0124\u0100";
    for (const unsigned int code : {0xFFFFFF3CU, 0x8000003AU, 0xFFFFFFFFU}) {
        characters += static_cast<wchar_t>(code);
    }
    checkScreen(characters);
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
