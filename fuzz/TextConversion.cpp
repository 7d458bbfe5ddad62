// Conversions between wide and narrow text, compared with the C library's; under the locale of the
// environment.
#include "Fuzz.h"

#include "../tests/Obvious.h"

#include "StringConversion.h"
#include "Utility.h"

#include <clocale>
#include <vector>

namespace {

template <class To, class From>
void check(const From& in, bool (*convert)(From, To&)) {
    const To before(1, '#');
    To converted = before;
    FUZZ_REQUIRE(convert(in, converted) == obvious::converted(in).has_value());
    FUZZ_REQUIRE(converted == obvious::converted(in).value_or(before));
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    std::setlocale(LC_ALL, "");
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    fuzz::Input input(data, size);
    const std::string narrow = input.rest();
    check(narrow, &TK::CUtility::AStringToWString);
    check(fuzz::wide(narrow), &TK::CUtility::WStringToAString);

    // Lines as many texts: all or none.
    std::vector<std::string> texts;
    for (fuzz::Input lines(data, size); !lines.isEmpty();) {
        texts.push_back(lines.line());
    }
    std::vector<std::wstring> wanted = {L"before"};
    bool isConvertible = true;
    for (const std::string& text : texts) {
        isConvertible = isConvertible && obvious::converted(text);
        wanted.push_back(obvious::converted(text).value_or(L""));
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
