/**
 * @file
 * TK::Utils, dates in CIM's text form and typed fields of property files.
 *
 * A CIM date/time text is a point in time as the CIM infrastructure standard writes it, 25 characters at
 * fixed positions: `yyyymmddhhmmss.mmmmmmsutc`, with the offset from UTC as a sign and three digits of
 * minutes.
 *
 * **Threads.** Every operation may run on any number of threads at once; one property file is used by one
 * thread at a time. The library locks nothing: threads that share a file lock TK::_fileMutex, or a mutex of
 * their own, around their calls.
 *
 * **Encoding and ownership.** Keys and narrow values are in the multibyte encoding of `LC_CTYPE`, as
 * TK::make_wstring takes them. Everything is copied; results belong to the caller.
 *
 * **Failures.** `std::bad_alloc` passes through everywhere.
 *
 * **Traces.** The two conversions emit an ENTERING and an EXITING trace under the category "Hovara.Utils";
 * the others do not trace. An operation that throws emits no EXITING trace.
 */
#pragma once

#include "DateTime.h"
#include "Mutex.h"
#include "PropertyFile.h"
#include "TKExport.h"

#include <string>

namespace TK {

/** For callers that use one property file from several threads. Unlocked at first; the library never locks
 * it. */
extern TK_EXPORT Mutex _fileMutex;

/** A family of static operations; the top of utils.h says what holds for all of them. No object of it is
 * ever needed. */
class TK_EXPORT Utils {
public:
    Utils();
    ~Utils(); // NOLINT(performance-trivially-destructible): out of line, for those who link against it

    /** @name CIM date/time texts
     * Mind the offset: the parser stores the text's minutes, while the formatter reads hours and writes their
     * number times 60. A text that is parsed and formatted again comes back with 60 times its offset, so
     * divide the offset by 60 in between.
     * @{ */
    /** Reads a CIM date/time text. Each field is read as `strtol` (C) reads its characters: what is no number
     * counts as 0, the asterisks of a wildcard included. Year 0 becomes 1970, month and day 0 become 1; the
     * other fields stay. Nothing is compared with a range: month 13 is handed on. Numbers that are too large
     * for their field lose their upper bits, so that a month of -1 becomes 255.
     * @param text at least 21 characters; without those behind them the offset is 0. What follows the 25th
     * character is ignored, and so is the character in the place of the point.
     * @return the date, its millisecond holding the six digits as they stand, its offset the minutes with
     * their sign.
     * @throws std::out_of_range when the text is shorter than 21 characters. */
    static TK::DateTime convertStringToDateTime(std::string text);

    /** Writes a CIM date/time text.
     * @param value its millisecond is written as the six digits, its offset is taken as **hours**. Year 0 is
     * written as 1970, month and day 0 as 01.
     * @return the text; longer than 25 characters when a number has more digits than its place. */
    static std::string convertCIMDateTime(TK::DateTime value);

    /** The part of a text before its first NUL character; removes no blanks, whatever its name says.
     * @param text at most 65,535 characters: positions are kept in 16 bits. */
    static std::string stripSpaces(std::string text);

    static std::string addZero(unsigned char count); ///< As many characters "0" as are asked for.
    ///@}

    /** @name Reading a field of a property file
     * One call of the file's `getEntry` each. A key without a value reads as the empty text, 0, or 1970-01-01
     * 00:00:00; a value that is no number as 0.
     * @param file the file.
     * @param key the key; any text.
     * @throws what the file throws
     * @{ */
    static std::string ReadStringFromFile(TK::PropertyFile& file,
                                          const std::string& key); ///< The text as it is stored.
    /** The number that ReadUint32FromFile reads, its low 8 bits. */
    static unsigned char ReadUint8FromFile(TK::PropertyFile& file, const std::string& key);
    /** The decimal number at the beginning of the text, read as `strtoul` (C) reads it into 32 bits: a number
     * that is too large gives 4,294,967,295, one with a minus sign is negated modulo 2^32. */
    static unsigned int ReadUint32FromFile(TK::PropertyFile& file, const std::string& key);
    /** The date; 1970-01-01 00:00:00 also when the text holds "0000-00-00" anywhere.
     * @throws std::invalid_argument what TK::DateTime throws for a text that is no date. */
    static TK::DateTime ReadDateFromFile(TK::PropertyFile& file, const std::string& key);
    ///@}

    /** @name Writing a field of a property file
     * One call of the file's `setEntry` each. Numbers are handed over in texts of fixed length, 4 characters
     * for 8 bits and 16 for 32, filled up with NUL characters.
     * @param file the file.
     * @param key the key; any text.
     * @param value what to store.
     * @throws what the file throws
     * @{ */
    static void WriteStringToFile(TK::PropertyFile& file, const std::string& key,
                                  const std::string& value); ///< The text.
    static void WriteUint8ToFile(TK::PropertyFile& file, const std::string& key,
                                 unsigned char value); ///< The number.
    /** Written as a signed number, so that 4,294,967,295 is stored as -1; ReadUint32FromFile reads it back.
     */
    static void WriteUint32ToFile(TK::PropertyFile& file, const std::string& key, unsigned int value);
    static void WriteDateToFile(TK::PropertyFile& file, const std::string& key,
                                const TK::DateTime& value); ///< The date, as TK::DateTime's text.
    ///@}
};

} // namespace TK
