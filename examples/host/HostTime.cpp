#include "HostTime.h"

#include <utils.h>

#include <cerrno>
#include <system_error>

namespace {

TK::DateTime dateOf(const std::tm& time, short offset) {
    TK::DateTime date;
    date.setYear(static_cast<unsigned short>(time.tm_year + 1900));
    date.setMonth(static_cast<unsigned char>(time.tm_mon + 1));
    date.setDay(static_cast<unsigned char>(time.tm_mday));
    date.setHour(static_cast<unsigned char>(time.tm_hour));
    date.setMinute(static_cast<unsigned char>(time.tm_min));
    date.setSecond(static_cast<unsigned char>(time.tm_sec));
    date.setOffset(offset);
    return date;
}

std::time_t instantOf(const TK::DateTime& date) {
    std::tm time = {};
    time.tm_year = date.getYear() - 1900;
    time.tm_mon = date.getMonth() - 1;
    time.tm_mday = date.getDay();
    time.tm_hour = date.getHour();
    time.tm_min = date.getMinute() - date.getOffset();
    time.tm_sec = date.getSecond();
    return ::timegm(&time);
}

} // namespace

TK::DateTime localTime(std::time_t instant) {
    std::tm time = {};
    if (::localtime_r(&instant, &time) == nullptr) {
        throw std::system_error(errno, std::generic_category(), "local time");
    }
    return dateOf(time, static_cast<short>(time.tm_gmtoff / 60));
}

std::string cimText(const TK::DateTime& date) {
    const int hours = date.getOffset() / 60;
    const std::time_t shifted = instantOf(date) + hours * 3600L;
    std::tm time = {};
    if (::gmtime_r(&shifted, &time) == nullptr) {
        throw std::system_error(errno, std::generic_category(), "date");
    }
    TK::DateTime whole = dateOf(time, static_cast<short>(hours));
    whole.setMillisecond(date.getMillisecond());
    return TK::Utils::convertCIMDateTime(whole);
}
