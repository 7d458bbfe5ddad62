/**
 * @file
 * TK::DateTime, the agent's date and time of day.
 *
 * @code
 * const TK::DateTime date("2026-03-29 01:30:00.250+060", 3);
 * const std::string text = date; // the same text again
 * @endcode
 *
 * **Threads.** A value: one object is used by one thread at a time, objects share nothing.
 *
 * **Encoding.** Texts are ASCII; no locale has a say.
 */
#pragma once

#include "TKExport.h"

#include <string>

namespace TK {

/**
 * Eight numbers. Nothing checks that they make up a date of the calendar: each setter takes every value of
 * its type, and the getter returns what was set.
 */
class TK_EXPORT DateTime {
public:
    /** The first second of 1970, with millisecond and offset 0. */
    DateTime();

    /**
     * Reads a date from a text.
     * @param text ASCII, see @p format.
     * @param format the code of the text's form. There is one, 3: the text that the conversion to
     * `std::string` writes, each number with at least the digits shown there.
     * @throws std::invalid_argument when the text does not have the form, a number does not fit into its
     * field, or the code is none; what() holds the text or the code.
     * @throws std::bad_alloc
     */
    DateTime(const std::string& text, unsigned int format);

    /**
     * The date as text, `YYYY-MM-DD hh:mm:ss`. A millisecond other than 0 follows as a point and at least
     * three digits, an offset other than 0 as its sign and at least three digits: `1970-01-01 00:00:00`,
     * `2026-03-29 01:30:00.250+060`. A number with more digits than shown is written whole, so that format
     * code 3 reads every date back unchanged.
     * @throws std::bad_alloc
     */
    operator std::string() const; // NOLINT(google-explicit-constructor,hicpp-explicit-conversions): callers
                                  // assign dates to texts

    /** @name Fields */
    /** @{ */
    /** The year. */
    unsigned short getYear() const;
    /** The month, January being 1. */
    unsigned char getMonth() const;
    /** The day of the month, from 1. */
    unsigned char getDay() const;
    /** The hour, from 0. */
    unsigned char getHour() const;
    /** The minute, from 0. */
    unsigned char getMinute() const;
    /** The second, from 0. */
    unsigned char getSecond() const;
    /** The millisecond, from 0. */
    unsigned int getMillisecond() const;
    /** The local time's distance from UTC in minutes. */
    short getOffset() const;
    /** Sets it. */
    void setYear(unsigned short year);
    /** Sets it. */
    void setMonth(unsigned char month);
    /** Sets it. */
    void setDay(unsigned char day);
    /** Sets it. */
    void setHour(unsigned char hour);
    /** Sets it. */
    void setMinute(unsigned char minute);
    /** Sets it. */
    void setSecond(unsigned char second);
    /** Sets it. */
    void setMillisecond(unsigned int millisecond);
    /** Sets it. */
    void setOffset(short offset);
    /** @} */

private:
    unsigned short year_ = 1970;
    unsigned char month_ = 1;
    unsigned char day_ = 1;
    unsigned char hour_ = 0;
    unsigned char minute_ = 0;
    unsigned char second_ = 0;
    short offset_ = 0;
    unsigned int millisecond_ = 0;
};

/** @name Comparison
 * Two dates are equal when their eight fields are: one point in time written with two offsets is two dates.
 */
/** @{ */
/** Whether all fields are equal. */
TK_EXPORT bool operator==(const DateTime& left, const DateTime& right);
/** Whether a field differs. */
TK_EXPORT bool operator!=(const DateTime& left, const DateTime& right);
/** @} */

} // namespace TK
