// Conversions between wide and narrow text, compared with the C library's; under the locale of the
// environment.
#include "Fuzz.h"

#include "StringConversion.h"
#include "Utility.h"

#include <clocale>
#include <cwchar>
#include <vector>

namespace {

constexpr auto failed = static_cast<std::size_t>(-1);

bool toWide(const std::string& in, std::wstring& out) {
    std::mbstate_t state{};
    std::vector<wchar_t> wide(in.size() + 1);
    const char* rest = in.c_str();
    const std::size_t size = std::mbsrtowcs(wide.data(), &rest, wide.size(), &state);
    if (size != failed) {
        out.assign(wide.data(), size);
    }
    return size != failed;
}

bool toNarrow(const std::wstring& in, std::string& out) {
    std::mbstate_t state{};
    std::vector<char> narrow(in.size() * 16 + 16);
    const wchar_t* rest = in.c_str();
    const std::size_t size = std::wcsrtombs(narrow.data(), &rest, narrow.size(), &state);
    if (size != failed) {
        out.assign(narrow.data(), size);
    }
    return size != failed;
}

template <class From, class To>
void check(const From& in, bool (*expected)(const From&, To&), bool (*convert)(From, To&)) {
    const To before(1, '#');
    To wanted = before;
    To converted = before;
    FUZZ_REQUIRE(convert(in, converted) == expected(in, wanted));
    FUZZ_REQUIRE(converted == wanted);
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    std::setlocale(LC_ALL, "");
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    fuzz::Input input(data, size);
    const std::string narrow = input.rest();
    std::wstring wide(narrow.size() / sizeof(wchar_t), L'\0');
    std::memcpy(wide.data(), narrow.data(), wide.size() * sizeof(wchar_t));
    check(narrow, &toWide, &TK::CUtility::AStringToWString);
    check(wide, &toNarrow, &TK::CUtility::WStringToAString);

    // Lines as many texts: all or none.
    std::vector<std::string> texts;
    for (fuzz::Input lines(data, size); !lines.isEmpty();) {
        texts.push_back(lines.line());
    }
    std::vector<std::wstring> wanted = {L"before"};
    bool isConvertible = true;
    for (const std::string& text : texts) {
        std::wstring converted;
        isConvertible = isConvertible && toWide(text, converted);
        wanted.push_back(converted);
    }
    if (!isConvertible) {
        wanted.clear();
    }
    std::vector<std::wstring> converted = {L"before"};
    FUZZ_REQUIRE(TK::CUtility::AStringArrToWStringArr(texts, converted) == isConvertible);
    FUZZ_REQUIRE(converted == wanted);

    // The common library's keep bytes that are no text.
    FUZZ_REQUIRE(TK::make_string(TK::make_wstring(narrow)) == narrow);
    return 0;
}
