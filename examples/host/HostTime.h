// Points in time, in this machine's time zone.
#pragma once

#include <DateTime.h>

#include <ctime>
#include <string>

// The local time of an instant, with its offset from UTC in minutes.
TK::DateTime localTime(std::time_t instant);

// The date as CIM date/time text. The library's formatter takes offsets in whole hours, so a date of a zone
// such as UTC+05:30 is written as the same instant with the next whole hour towards UTC.
std::string cimText(const TK::DateTime& date);
