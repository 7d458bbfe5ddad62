#include "utils.h"

#include "StringConversion.h"
#include "Trace.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <charconv>
#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <system_error>

namespace TK {

static const std::string loggerUtils("Hovara.Utils");

Mutex _fileMutex;

Utils::Utils() = default;
Utils::~Utils() = default;

// CIM date/time texts

namespace {

// Where a number stands in a CIM date/time text. The offset's sign belongs to its number.
struct Field {
    std::size_t position;
    std::size_t width;
};

constexpr Field yearField = {0, 4};
constexpr Field monthField = {4, 2};
constexpr Field dayField = {6, 2};
constexpr Field hourField = {8, 2};
constexpr Field minuteField = {10, 2};
constexpr Field secondField = {12, 2};
constexpr Field millisecondField = {15, 6};
constexpr Field offsetField = {21, 4};

constexpr unsigned short defaultYear = 1970;
constexpr unsigned char defaultMonthOrDay = 1;
constexpr int minutesPerHour = 60;

// The number in a field, cut to its type. Throws std::out_of_range when the text ends before the field
// begins.
template <class Number>
Number read(const std::string& text, Field field) {
    std::array<char, millisecondField.width + 1> characters{};
    const std::size_t size = text.copy(characters.data(), field.width, field.position);
    // Most fields are digits alone; what else there may be in one, strtol knows.
    long number = 0;
    for (std::size_t i = 0; i < size; ++i) {
        if (characters[i] < '0' || characters[i] > '9') {
            number = std::strtol(characters.data(), nullptr, 10);
            break;
        }
        number = number * 10 + (characters[i] - '0');
    }
    return static_cast<Number>(number);
}

template <class Number>
Number orDefault(Number number, Number whenZero) {
    return number != 0 ? number : whenZero;
}

// Writes a number with leading zeros up to a width; digits beyond it are written too. Returns the end.
char* write(char* to, unsigned int number, std::ptrdiff_t width) {
    std::array<char, std::numeric_limits<unsigned int>::digits10 + 1>
        digits; // NOLINT(*-member-init): written next
    const char* const end = std::to_chars(digits.data(), digits.data() + digits.size(), number).ptr;
    to = std::fill_n(to, std::max<std::ptrdiff_t>(width - (end - digits.data()), 0), '0');
    return std::copy(static_cast<const char*>(digits.data()), end, to);
}

} // namespace

TK::DateTime Utils::convertStringToDateTime(std::string text) {
    TK_TRACE_ENTERING(loggerUtils);
    TK::DateTime date;
    // All fields are read before any is set: reading is what can throw.
    const auto year = orDefault(read<unsigned short>(text, yearField), defaultYear);
    const auto month = orDefault(read<unsigned char>(text, monthField), defaultMonthOrDay);
    const auto day = orDefault(read<unsigned char>(text, dayField), defaultMonthOrDay);
    const auto hour = read<unsigned char>(text, hourField);
    const auto minute = read<unsigned char>(text, minuteField);
    const auto second = read<unsigned char>(text, secondField);
    const auto millisecond = read<unsigned int>(text, millisecondField);
    const auto offset = read<short>(text, offsetField);
    date.setYear(year);
    date.setMonth(month);
    date.setDay(day);
    date.setHour(hour);
    date.setMinute(minute);
    date.setSecond(second);
    date.setMillisecond(millisecond);
    date.setOffset(offset);
    TK_TRACE_EXITING(loggerUtils);
    return date;
}

std::string Utils::convertCIMDateTime(TK::DateTime value) {
    TK_TRACE_ENTERING(loggerUtils);
    const int minutes = value.getOffset() * minutesPerHour;
    // The widest: a year of 5 digits, five fields of 3, a millisecond of 10, an offset of 7, the point and
    // the sign.
    std::array<char, 48> text; // NOLINT(cppcoreguidelines-pro-type-member-init): written from the start
    char* end = text.data();
    end = write(end, orDefault(value.getYear(), defaultYear), yearField.width);
    end = write(end, orDefault(value.getMonth(), defaultMonthOrDay), monthField.width);
    end = write(end, orDefault(value.getDay(), defaultMonthOrDay), dayField.width);
    end = write(end, value.getHour(), hourField.width);
    end = write(end, value.getMinute(), minuteField.width);
    end = write(end, value.getSecond(), secondField.width);
    *end++ = '.';
    end = write(end, value.getMillisecond(), millisecondField.width);
    *end++ = minutes < 0 ? '-' : '+';
    end = write(end, static_cast<unsigned int>(std::abs(minutes)), offsetField.width - 1);
    std::string result(text.data(), end);
    TK_TRACE_EXITING(loggerUtils);
    return result;
}

std::string Utils::stripSpaces(std::string text) {
    // Without a NUL the position is the largest one of 16 bits.
    text.resize(std::min<std::size_t>(text.size(), static_cast<unsigned short>(text.find('\0'))));
    return text;
}

std::string Utils::addZero(unsigned char count) {
    // NOLINTNEXTLINE(modernize-return-braced-init-list): braces would list two characters
    return std::string(count, '0');
}

// Property files

namespace {

constexpr unsigned int dateTextFormat = 3;
constexpr const char* noDate = "0000-00-00";
constexpr const char* defaultDate = "1970-01-01 00:00:00";

std::string readText(TK::PropertyFile& file, const std::string& key) {
    return make_string(file.getEntry(make_wstring(key)));
}

void writeText(TK::PropertyFile& file, const std::string& key, const std::string& value) {
    const std::wstring wideValue = make_wstring(value);
    file.setEntry(make_wstring(key), wideValue);
}

// strtoul of a system whose unsigned long has 32 bits: a wider one does not notice that a number is too
// large, and negates more bits than there are.
unsigned int toUint32(const char* text) {
    while (std::isspace(static_cast<unsigned char>(*text)) != 0) {
        ++text;
    }
    const bool negative = *text == '-';
    if (negative || *text == '+') {
        ++text;
    }
    if (std::isdigit(static_cast<unsigned char>(*text)) == 0) {
        return 0;
    }
    unsigned int number = 0;
    if (std::from_chars(text, text + std::strlen(text), number).ec != std::errc()) {
        return std::numeric_limits<unsigned int>::max();
    }
    return negative ? 0U - number : number;
}

// A number's decimal text, filled up with NULs to a fixed length.
std::string paddedText(int number, std::size_t length) {
    std::string text(length, '\0');
    std::to_chars(text.data(), text.data() + length, number);
    return text;
}

} // namespace

std::string Utils::ReadStringFromFile(TK::PropertyFile& file, const std::string& key) {
    return readText(file, key);
}

unsigned char Utils::ReadUint8FromFile(TK::PropertyFile& file, const std::string& key) {
    return static_cast<unsigned char>(ReadUint32FromFile(file, key));
}

unsigned int Utils::ReadUint32FromFile(TK::PropertyFile& file, const std::string& key) {
    return toUint32(readText(file, key).c_str());
}

TK::DateTime Utils::ReadDateFromFile(TK::PropertyFile& file, const std::string& key) {
    const std::string text = readText(file, key);
    const bool usable = !text.empty() && text.find(noDate) == std::string::npos;
    return {usable ? text : defaultDate, dateTextFormat};
}

void Utils::WriteStringToFile(TK::PropertyFile& file, const std::string& key, const std::string& value) {
    writeText(file, key, value);
}

void Utils::WriteUint8ToFile(TK::PropertyFile& file, const std::string& key, unsigned char value) {
    writeText(file, key, paddedText(value, 4));
}

void Utils::WriteUint32ToFile(TK::PropertyFile& file, const std::string& key, unsigned int value) {
    writeText(file, key, paddedText(static_cast<int>(value), 16));
}

void Utils::WriteDateToFile(TK::PropertyFile& file, const std::string& key, const TK::DateTime& value) {
    writeText(file, key, static_cast<std::string>(value));
}

} // namespace TK
