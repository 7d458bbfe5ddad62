// Date texts: CIM's, read and written, and the common library's.
#include "Fuzz.h"

#include "../tests/Obvious.h"

#include "DateTime.h"
#include "utils.h"

#include <stdexcept>

namespace {

void readCimText(const std::string& text) {
    bool isRefused = false;
    TK::DateTime date;
    try {
        date = TK::Utils::convertStringToDateTime(text);
    } catch (const std::out_of_range&) {
        isRefused = true;
    }
    FUZZ_REQUIRE(isRefused == (text.size() < 21));
    if (!isRefused) {
        FUZZ_REQUIRE(date == obvious::parsed(text));
        FUZZ_REQUIRE(TK::Utils::convertCIMDateTime(date) == obvious::formatted(date));
    }
}

void readCommonText(const std::string& text) {
    try {
        const TK::DateTime date(text, 3);
        FUZZ_REQUIRE(TK::DateTime(static_cast<std::string>(date), 3) == date);
    } catch (const std::invalid_argument&) {
        return;
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    readCimText(text);
    readCommonText(text);

    // The same bytes as the fields of a date.
    fuzz::Input input(data, size);
    const auto year = input.number<unsigned short>();
    const auto month = input.number<unsigned char>();
    const auto day = input.number<unsigned char>();
    const auto hour = input.number<unsigned char>();
    const auto minute = input.number<unsigned char>();
    const auto second = input.number<unsigned char>();
    const auto millisecond = input.number<unsigned int>();
    const auto offset = input.number<short>();
    const TK::DateTime date = obvious::date(year, month, day, hour, minute, second, millisecond, offset);
    FUZZ_REQUIRE(TK::Utils::convertCIMDateTime(date) == obvious::formatted(date));
    FUZZ_REQUIRE(TK::DateTime(static_cast<std::string>(date), 3) == date);
    return 0;
}
