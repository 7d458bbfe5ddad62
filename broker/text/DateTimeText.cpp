#include "text/DateTimeText.h"

#include <algorithm>
#include <array>
#include <cstdio>

namespace oxahv {

namespace {

constexpr std::size_t textLength = 25;
constexpr std::size_t pointPosition = 14;
constexpr std::size_t fractionPosition = 15;
constexpr std::size_t signPosition = 21;
constexpr std::int64_t second = 1'000'000;
constexpr std::int64_t day = 86'400 * second;

struct Field {
    std::size_t position;
    std::size_t width;
    int lowest;
    int highest;
};
constexpr std::array<Field, 7> timestampFields = {{{0, 4, 0, 9999},
                                                   {4, 2, 1, 12},
                                                   {6, 2, 1, 31},
                                                   {8, 2, 0, 23},
                                                   {10, 2, 0, 59},
                                                   {12, 2, 0, 59},
                                                   {15, 6, 0, 999'999}}};
constexpr std::array<Field, 5> intervalFields = {
    {{0, 8, 0, 99'999'999}, {8, 2, 0, 23}, {10, 2, 0, 59}, {12, 2, 0, 59}, {15, 6, 0, 999'999}}};

bool isDigits(std::string_view text) {
    return std::all_of(text.begin(), text.end(), [](char c) { return c >= '0' && c <= '9'; });
}

bool isAsterisks(std::string_view text) {
    return text.find_first_not_of('*') == std::string_view::npos;
}

int numberOf(std::string_view text) {
    int number = 0;
    for (const char c : text) {
        number = number * 10 + (c - '0');
    }
    return number;
}

// A field's number; its lowest one for asterisks.
int valueOf(std::string_view text, const Field& field) {
    const std::string_view digits = text.substr(field.position, field.width);
    return isAsterisks(digits) ? field.lowest : numberOf(digits);
}

// The fraction may lose digits one by one from its end, every other field goes as a whole.
bool isFraction(std::string_view text) {
    const std::size_t firstAsterisk = std::min(text.find('*'), text.size());
    return isDigits(text.substr(0, firstAsterisk)) && isAsterisks(text.substr(firstAsterisk));
}

bool isNumberIn(std::string_view digits, const Field& field) {
    return isDigits(digits) && numberOf(digits) >= field.lowest && numberOf(digits) <= field.highest;
}

template <std::size_t count>
bool areFields(std::string_view text, const std::array<Field, count>& fields) {
    bool isOpen = false; // once a field is left open, all that follow are
    for (const Field& field : fields) {
        const std::string_view digits = text.substr(field.position, field.width);
        if (isAsterisks(digits)) {
            isOpen = true;
        } else if (isOpen ||
                   !(field.position == fractionPosition ? isFraction(digits) : isNumberIn(digits, field))) {
            return false;
        }
    }
    return true;
}

int daysOfMonth(int year, int month) {
    const bool isLeapYear = year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
    constexpr std::array<int, 12> days = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    return month == 2 && isLeapYear ? 29 : days.at(static_cast<std::size_t>(month - 1));
}

// Whether the fields, each in its own range, name a day that its month has.
bool isDayOfItsMonth(std::string_view text) {
    const auto& f = timestampFields;
    return valueOf(text, f[2]) <= daysOfMonth(valueOf(text, f[0]), valueOf(text, f[1]));
}

// Days since 1970-01-01 of a date in the Gregorian calendar, which repeats itself every 400 years.
std::int64_t daysSinceEpoch(int year, int month, int dayOfMonth) {
    const std::int64_t y = year - (month <= 2 ? 1 : 0);
    const std::int64_t era = (y >= 0 ? y : y - 399) / 400;
    const std::int64_t yearOfEra = y - era * 400;
    const std::int64_t dayOfYear = (153 * (month + (month > 2 ? -3 : 9)) + 2) / 5 + dayOfMonth - 1;
    return era * 146'097 + yearOfEra * 365 + yearOfEra / 4 - yearOfEra / 100 + dayOfYear - 719'468;
}

struct Date {
    std::int64_t year;
    int month;
    int day;
};

Date dateOf(std::int64_t daysAfterEpoch) {
    const std::int64_t days = daysAfterEpoch + 719'468;
    const std::int64_t era = days / 146'097;
    const std::int64_t dayOfEra = days - era * 146'097;
    const std::int64_t yearOfEra =
        (dayOfEra - dayOfEra / 1'460 + dayOfEra / 36'524 - dayOfEra / 146'096) / 365;
    const std::int64_t dayOfYear = dayOfEra - (365 * yearOfEra + yearOfEra / 4 - yearOfEra / 100);
    const std::int64_t shifted = (5 * dayOfYear + 2) / 153; // months from March on
    const int month = static_cast<int>(shifted < 10 ? shifted + 3 : shifted - 9);
    return {yearOfEra + era * 400 + (month <= 2 ? 1 : 0), month,
            static_cast<int>(dayOfYear - (153 * shifted + 2) / 5 + 1)};
}

std::int64_t fractionOf(std::string_view text) {
    std::string digits(text.substr(fractionPosition, 6));
    std::replace(digits.begin(), digits.end(), '*', '0');
    return numberOf(digits);
}

std::int64_t timeOfDay(int hour, int minute, int seconds) {
    return ((hour * 60 + minute) * 60 + seconds) * second;
}

} // namespace

bool isIntervalText(std::string_view text) {
    return text.size() == textLength && text[signPosition] == ':';
}

bool isDateTimeText(std::string_view text) {
    if (text.size() != textLength || text[pointPosition] != '.') {
        return false;
    }
    const std::string_view offset = text.substr(signPosition + 1);
    if (text[signPosition] == ':') {
        return offset == "000" && areFields(text, intervalFields);
    }
    return (text[signPosition] == '+' || text[signPosition] == '-') &&
           (isDigits(offset) || isAsterisks(offset)) && areFields(text, timestampFields) &&
           isDayOfItsMonth(text);
}

std::int64_t microsecondsOf(std::string_view text) {
    const auto& f = timestampFields;
    if (isIntervalText(text)) {
        const auto& i = intervalFields;
        return valueOf(text, i[0]) * day +
               timeOfDay(valueOf(text, i[1]), valueOf(text, i[2]), valueOf(text, i[3])) + fractionOf(text);
    }
    const std::int64_t local =
        daysSinceEpoch(valueOf(text, f[0]), valueOf(text, f[1]), valueOf(text, f[2])) * day +
        timeOfDay(valueOf(text, f[3]), valueOf(text, f[4]), valueOf(text, f[5])) + fractionOf(text);
    const std::string_view minutes = text.substr(signPosition + 1);
    const std::int64_t offset = (isAsterisks(minutes) ? 0 : numberOf(minutes)) * (60 * second);
    return text[signPosition] == '-' ? local + offset : local - offset;
}

std::uint64_t binaryOf(std::string_view text) {
    return static_cast<std::uint64_t>(std::max<std::int64_t>(microsecondsOf(text), 0));
}

std::string dateTimeText(std::uint64_t microseconds, bool isInterval) {
    constexpr auto dayLength = static_cast<std::uint64_t>(day);
    const std::uint64_t days = microseconds / dayLength;
    const auto rest = static_cast<std::int64_t>(microseconds % dayLength);
    const int hour = static_cast<int>(rest / (3'600 * second));
    const int minute = static_cast<int>(rest / (60 * second) % 60);
    const int seconds = static_cast<int>(rest / second % 60);
    const int fraction = static_cast<int>(rest % second);
    std::array<char, 64> text{};
    if (isInterval) {
        if (days > 99'999'999) {
            return {};
        }
        (void)std::snprintf(text.data(), text.size(), "%08d%02d%02d%02d.%06d:000", static_cast<int>(days),
                            hour, minute, seconds, fraction);
        return text.data();
    }
    const Date date = dateOf(static_cast<std::int64_t>(days));
    if (date.year > 9999) {
        return {};
    }
    (void)std::snprintf(text.data(), text.size(), "%04d%02d%02d%02d%02d%02d.%06d+000",
                        static_cast<int>(date.year), date.month, date.day, hour, minute, seconds, fraction);
    return text.data();
}

} // namespace oxahv
