// The texts of CIM's datetime type to and from microseconds: points in time, yyyymmddhhmmss.mmmmmmsutc, and
// intervals, ddddddddhhmmss.mmmmmm:000.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace oxahv::detail {

constexpr std::size_t dateSize = 25;
using DateText = char[dateSize + 1];

constexpr std::int64_t second = 1'000'000;
constexpr std::int64_t minute = 60 * second;
constexpr std::int64_t hour = 60 * minute;
constexpr std::int64_t day = 24 * hour;

struct Date {
    bool isInterval;
    std::int64_t micros; // of an interval its length, of a point in time those since 1970 in UTC
};

inline void writeDigits(char* to, std::size_t width, std::int64_t number) {
    for (; width > 0; number /= 10) {
        to[--width] = static_cast<char>('0' + number % 10);
    }
}

// The digits at a place of the text; -1 when there is anything else, such as the asterisk of a wildcard.
inline std::int64_t readDigits(const char* from, std::size_t width) {
    std::int64_t number = 0;
    for (; width > 0; --width, ++from) {
        if (*from < '0' || *from > '9') {
            return -1;
        }
        number = number * 10 + (*from - '0');
    }
    return number;
}

// Days since 1970 of a date in the Gregorian calendar, and back. A year begins in March here, so that the day
// that some years lack is its last one.
inline std::int64_t daysOf(std::int64_t year, std::int64_t month, std::int64_t dayOfMonth) {
    const std::int64_t shifted = month <= 2 ? year + 399 : year + 400;
    const std::int64_t era = shifted / 400;
    const std::int64_t yearOfEra = shifted % 400;
    const std::int64_t dayOfYear = (153 * ((month + 9) % 12) + 2) / 5 + dayOfMonth - 1;
    return (era - 1) * 146097 + yearOfEra * 365 + yearOfEra / 4 - yearOfEra / 100 + dayOfYear - 719468;
}

inline void writeDay(char* to, std::int64_t daysSince1970) {
    const std::int64_t days = daysSince1970 + 719468;
    const std::int64_t era = days / 146097;
    const std::int64_t dayOfEra = days % 146097;
    const std::int64_t yearOfEra = (dayOfEra - dayOfEra / 1460 + dayOfEra / 36524 - dayOfEra / 146096) / 365;
    const std::int64_t dayOfYear = dayOfEra - (365 * yearOfEra + yearOfEra / 4 - yearOfEra / 100);
    const std::int64_t shiftedMonth = (5 * dayOfYear + 2) / 153;
    const std::int64_t month = shiftedMonth < 10 ? shiftedMonth + 3 : shiftedMonth - 9;
    writeDigits(to, 4, yearOfEra + era * 400 + (month <= 2 ? 1 : 0));
    writeDigits(to + 4, 2, month);
    writeDigits(to + 6, 2, dayOfYear - (153 * shiftedMonth + 2) / 5 + 1);
}

inline void writeTimeOfDay(char* to, std::int64_t micros) {
    writeDigits(to, 2, micros / hour);
    writeDigits(to + 2, 2, micros / minute % 60);
    writeDigits(to + 4, 2, micros / second % 60);
    to[6] = '.';
    writeDigits(to + 7, 6, micros % second);
}

// False for what the text cannot say.
inline bool writeDate(const Date& date, DateText& text) {
    const std::int64_t days = date.micros / day - (date.micros % day < 0 ? 1 : 0);
    writeTimeOfDay(text + 8, date.micros - days * day);
    if (date.isInterval) {
        writeDigits(text, 8, days);
        std::memcpy(text + 21, ":000", sizeof ":000");
        return days >= 0 && days <= 99'999'999;
    }
    constexpr std::int64_t first = -719528; // of the year 0
    constexpr std::int64_t last = 2932896;  // of the year 9999
    if (days < first || days > last) {
        return false;
    }
    writeDay(text, days);
    std::memcpy(text + 21, "+000", sizeof "+000");
    return true;
}

// False for what is no date/time, or one with wildcards.
inline bool readDate(const char* text, Date& date) {
    if (std::strlen(text) != dateSize || text[14] != '.') {
        return false;
    }
    const std::int64_t hours = readDigits(text + 8, 2);
    const std::int64_t minutes = readDigits(text + 10, 2);
    const std::int64_t seconds = readDigits(text + 12, 2);
    const std::int64_t fraction = readDigits(text + 15, 6);
    const std::int64_t zone = readDigits(text + 22, 3);
    if (hours < 0 || hours > 23 || minutes < 0 || minutes > 59 || seconds < 0 || seconds > 60 ||
        fraction < 0 || zone < 0) {
        return false;
    }
    const std::int64_t time = hours * hour + minutes * minute + seconds * second + fraction;
    date.isInterval = text[21] == ':';
    if (date.isInterval) {
        const std::int64_t days = readDigits(text, 8);
        date.micros = days * day + time;
        return days >= 0 && zone == 0;
    }
    const std::int64_t year = readDigits(text, 4);
    const std::int64_t month = readDigits(text + 4, 2);
    const std::int64_t dayOfMonth = readDigits(text + 6, 2);
    const std::int64_t offset = (text[21] == '-' ? -zone : zone) * minute;
    date.micros = daysOf(year, month, dayOfMonth) * day + time - offset;
    return year >= 0 && month >= 1 && month <= 12 && dayOfMonth >= 1 && dayOfMonth <= 31 &&
           (text[21] == '+' || text[21] == '-');
}

} // namespace oxahv::detail
