// The texts of CIM's datetime type: points in time, yyyymmddhhmmss.mmmmmmsutc, and intervals,
// ddddddddhhmmss.mmmmmm:000.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace oxahv {

// Whether a text is one of the two forms. Digits may be asterisks from the least significant on: whole
// fields, and of the fraction single ones.
bool isDateTimeText(std::string_view text);
bool isIntervalText(std::string_view text);

// Microseconds: of an interval its length, of a point in time those since 1970-01-01 00:00:00 UTC. Asterisks
// count as the lowest value of their field. A time before 1970 is 0.
std::uint64_t binaryOf(std::string_view text);
// The same, where a time before 1970 is negative.
std::int64_t microsecondsOf(std::string_view text);

// The text of microseconds, a point in time in UTC. Longer ones than a text can say give the empty text.
std::string dateTimeText(std::uint64_t microseconds, bool isInterval);

} // namespace oxahv
