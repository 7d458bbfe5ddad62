/**
 * @file
 * The uniform trace of a module: entry to and exit from an operation, the value of a variable, a message.
 *
 * A trace point is one of the macros at the end of this header. It takes the category of the module that it
 * stands in, a `std::string`; function name, file name and line are those of the place where it stands.
 *
 * @code
 * namespace { const std::string logger("Demo.Ports"); }
 *
 * void readPort(const CMPIBroker* broker, const char* name) {
 *     TK_TRACE_ENTERING_PARAMETERS(logger, " broker=" << broker << " name=" << name);
 *     TK_TRACE_VARIABLE(logger, "speed", speed);
 *     TK_TRACE_EXITING(logger);
 * }
 * @endcode
 *
 * **What a trace point does.** It formats its text and hands it to HVLog::HVLogger::logLevelMessage, then
 * formats it once more and hands it to HVLog::HVLogger::traceLevelMessage. It tests no level: what is written
 * where is the logger's business. Text, name, value and insertions are therefore evaluated twice, and must
 * mean the same both times; the category is evaluated twice too. Every macro is one statement.
 *
 * **Parameter lists.** `insertions` starts with a C string: a blank, the parameter's name, an equals sign.
 * Pointers appear as addresses, texts as text. A null C string ends the list there.
 *
 * **Threads.** A trace point may be passed by any number of threads at once. Each thread formats in buffers
 * of its own, so nothing is locked and no text is mixed up with another thread's.
 *
 * **Bounds.** A text is cut at 511 bytes. Texts are bytes in any encoding; none is used as a format.
 *
 * **What is thrown.** What the logger and the insertions throw, and `std::bad_alloc`.
 *
 * **Symbols.** The buffers are static objects of inline functions, exported from every library that includes
 * this header, so that a process has one set of them. GCC makes them unique global objects, which the dynamic
 * linker shares even between libraries loaded with local symbols; the price is that the first library to
 * bring them stays loaded after `dlclose`. Clang makes them weak: a library can be unloaded, but one that is
 * loaded with local symbols may have a set of its own. A provider that exports its factories alone, as
 * `oxahv_add_provider` makes it, has a set of its own too and is unloaded. None of this changes what is
 * traced. The buffers have no destructor, so a thread may outlive the library.
 */
#pragma once

#include "HVLogger.h"
#include "HVMessageBuffer.h"
#include "StringConversion.h"
#include "TKExport.h"

#include <algorithm>
#include <charconv>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <limits>
#include <locale>
#include <ostream>
#include <sstream>
#include <string>
#include <type_traits>

namespace TK {

/** Selects the text that TK::trace and TK::tracepara format. */
enum MessageType {
    ENTERING, ///< entry to an operation
    EXITING,  ///< exit from an operation
    MESSAGE   ///< a fixed text
};

/** Size of a message buffer in bytes, the terminating NUL included. */
constexpr std::size_t traceBufferSize = 512;

/** @name Level codes that the trace points hand to the logger */
/** @{ */
constexpr int parametersLevelCode = 3000; ///< entry and exit with parameters
constexpr int flowLevelCode = 4000;       ///< entry, exit and variables
constexpr int messageLevelCode = 6000;    ///< messages
/** @} */

/** @name Putting a text together
 * The pieces of a trace's text, copied one behind the other: what `snprintf` would make of them, at a
 * fraction of its cost. They are inlined where a trace point stands, since most pieces are constants there:
 * then the compiler knows their lengths, and a piece is a few moves. Each copies as much as fits before `end`
 * and returns where the next piece begins.
 */
/** @{ */
/** A text of known size. */
[[gnu::always_inline]] inline char* tracePiece(char* to, const char* end, const char* text,
                                               std::size_t size) {
    const auto room = static_cast<std::size_t>(end - to);
    if (size > room) {
        std::memcpy(to, text, room);
        return to + room;
    }
    std::memcpy(to, text, size);
    return to + size;
}
/** A C text; null appears as "(null)". */
[[gnu::always_inline]] inline char* tracePiece(char* to, const char* end, const char* text) {
    if (text == nullptr) {
        text = "(null)";
    }
    return tracePiece(to, end, text, std::strlen(text));
}
/** A number in decimal digits. */
inline char* tracePiece(char* to, const char* end, int number) {
    char digits[std::numeric_limits<int>::digits10 + 2]; // NOLINT(*-member-init): written next
    const char* const last = std::to_chars(digits, digits + sizeof digits, number).ptr;
    const std::size_t size =
        std::min(static_cast<std::size_t>(last - digits), static_cast<std::size_t>(end - to));
    std::memcpy(to, digits, size);
    return to + size;
}
/** Fills a buffer with the pieces, up to its last byte but one, and the rest of it with zeros. */
template <class... Pieces>
[[gnu::always_inline]] inline char* traceText(char (&buffer)[traceBufferSize], Pieces... pieces) {
    char* const end = buffer + sizeof buffer;
    char* to = buffer;
    ((to = tracePiece(to, end - 1, pieces)), ...);
    std::memset(to, 0, static_cast<std::size_t>(end - to));
    return buffer;
}
/** @} */

/** @name Formatting functions
 * Each zeroes its own buffer, formats its text into it and returns the buffer. The buffer is the calling
 * thread's; it holds the text until that thread calls the same function again. Null texts appear as "(null)".
 * A text is cut at 511 bytes. Nothing is thrown.
 *
 * @param file the name of the source file, without directories.
 * @param line the line in it.
 */
/** @{ */

/**
 * Entry, exit or message.
 * @param subject the function's name; for `MESSAGE` the message's text.
 * @return the text; empty for a value outside the enumeration.
 */
[[gnu::always_inline]] inline TK_EXPORT char* trace(const char* subject, const char* file, unsigned int line,
                                                    MessageType type) {
    static thread_local char messageBuffer[traceBufferSize];
    const auto shownLine = static_cast<int>(line);
    switch (type) {
    case ENTERING:
        return traceText(messageBuffer, "ENTERING: ", subject, "() in ", file, " [Line: ", shownLine, "]");
    case EXITING:
        return traceText(messageBuffer, "EXITING: ", subject, "() in ", file, " [Line: ", shownLine, "]");
    case MESSAGE:
        return traceText(messageBuffer, "MESSAGE [File: ", file, ", Line: ", shownLine, "]: ", subject);
    }
    return traceText(messageBuffer, "");
}

/**
 * The value of a number.
 * @param name the variable's name.
 * @param value the 32 bits of the number, shown as signed decimal.
 */
[[gnu::always_inline]] inline TK_EXPORT char* trace(const char* name, const char* file, unsigned int line,
                                                    unsigned int value) {
    static thread_local char messageBuffer[traceBufferSize];
    return traceText(messageBuffer, "VARIABLE: '", name, "' has Value '", static_cast<int>(value),
                     "' at line ", static_cast<int>(line), " in ", file);
}

/**
 * The value of a text.
 * @param name the variable's name.
 * @param value the text.
 */
[[gnu::always_inline]] inline TK_EXPORT char* trace(const char* name, const char* file, unsigned int line,
                                                    const char* value) {
    static thread_local char messageBuffer[traceBufferSize];
    return traceText(messageBuffer, "VARIABLE: '", name, "' has Value '", value, "' at line ",
                     static_cast<int>(line), " in ", file);
}

/**
 * Entry or exit with the operation's parameters.
 * @param function the function's name.
 * @param parameters the parameter list; it starts with a blank.
 * @param type `ENTERING` or `EXITING`.
 * @return the text; empty for any other `type`.
 */
[[gnu::always_inline]] inline TK_EXPORT char* tracepara(const char* function, const char* file,
                                                        unsigned int line, const char* parameters,
                                                        MessageType type) {
    static thread_local char messageBuffer[traceBufferSize];
    const auto shownLine = static_cast<int>(line);
    switch (type) {
    case ENTERING:
        return traceText(messageBuffer, "ENTERING: ", function, "() in ", file, " [Line: ", shownLine,
                         "],Parameters List: ", parameters);
    case EXITING:
        return traceText(messageBuffer, "EXITING: ", function, "() in ", file, " [Line: ", shownLine,
                         "],Parameters List: ", parameters);
    case MESSAGE:
        break;
    }
    return traceText(messageBuffer, "");
}
/** @} */

/**
 * Puts a parameter list together for a message buffer. Texts and addresses, which is what most lists are made
 * of, are collected here, as far as a trace can show them; the buffer's stream, which is dear to build, is
 * asked for only when something else is inserted, and from there on everything goes through it. The list
 * reads the same either way.
 */
class TraceParameters {
public:
    /** An empty list. @param buffer empty; has to outlive this object. */
    explicit TraceParameters(HVLog::HVMessageBuffer& buffer) : buffer_(buffer) {}

    /** Appends a C text; a null pointer ends the list. */
    [[gnu::always_inline]] TraceParameters& operator<<(const char* text) {
        if (text == nullptr) {
            ended_ = true;
        } else if (!ended_) {
            end_ = tracePiece(end_, list_ + sizeof list_ - 1, text);
        }
        return *this;
    }

    /** Appends a text. What follows a NUL would be cut off where the list is read as a C string: the list
     * ends there. */
    TraceParameters& operator<<(const std::string& text) {
        *this << text.c_str();
        ended_ = ended_ || std::strlen(text.c_str()) != text.size();
        return *this;
    }

    /** Appends the text that a pointer to characters leads to, of any other pointer the address. */
    template <class T, std::enable_if_t<!std::is_function_v<T>, int> = 0>
    [[gnu::always_inline]] decltype(auto) operator<<(T* pointer) {
        using Pointee = std::remove_cv_t<T>;
        if constexpr (std::is_same_v<Pointee, char>) {
            return *this << static_cast<const char*>(pointer);
        } else if constexpr (std::is_same_v<Pointee, signed char> || std::is_same_v<Pointee, unsigned char>) {
            return stream() << pointer;
        } else {
            return address(pointer);
        }
    }

    /** Appends any other value, as a standard stream writes it. */
    template <class T, std::enable_if_t<!std::is_pointer_v<T> && !std::is_array_v<T>, int> = 0>
    std::ostream& operator<<(const T& value) {
        return stream() << value;
    }

    /** The list, when all of it was collected here; valid until the next insertion. */
    const char* text() {
        *end_ = '\0';
        return list_;
    }

private:
    TraceParameters& address(const void* pointer) {
        if (!digitsArePlain_) {
            // A stream knows how.
            std::ostringstream digits;
            digits.exceptions(std::ios_base::badbit); // or lack of memory would cut the address short
            digits << pointer;
            return *this << digits.str();
        }
        if (pointer == nullptr) {
            return *this << "0";
        }
        char digits[sizeof "0x" + 2 * sizeof pointer] = {'0', 'x'};
        std::to_chars(digits + 2, digits + sizeof digits - 1, reinterpret_cast<std::uintptr_t>(pointer), 16);
        return *this << static_cast<const char*>(digits);
    }

    std::ostream& stream() {
        std::ostream& stream = buffer_ << text();
        if (ended_) {
            stream.setstate(std::ios_base::badbit);
        }
        return stream;
    }

    HVLog::HVMessageBuffer& buffer_;
    bool digitsArePlain_ = std::locale() == std::locale::classic(); // another locale may group them
    bool ended_ = false;                                            // by a null text
    char* end_ = list_;
    char list_[traceBufferSize]; // NOLINT(*-member-init): written as far as it is read
};

/** @name The text of a parameter list, from the result of its last insertion */
/** @{ */
/** Of a list that was collected whole; valid as long as the list. */
inline const char* traceList(HVLog::HVMessageBuffer& /*buffer*/, TraceParameters& inserted) {
    return inserted.text();
}
/** Of a list that went through the buffer's stream; belongs to the buffer. */
inline const char* traceList(HVLog::HVMessageBuffer& buffer, std::ostream& inserted) {
    return buffer.str(inserted).c_str();
}
/** @} */

/** The part of a path after its last slash; a constant for a constant path. */
constexpr const char* traceFileName(const char* path) {
    const char* name = path;
    for (const char* c = path; *c != '\0'; ++c) {
        if (*c == '/') {
            name = c + 1;
        }
    }
    return name;
}

/** @name The value of a VARIABLE trace: 32 bits for a number, a `bool` or an enumeration, else a text. */
/** @{ */
/** The lower 32 bits of a number. */
template <class Number, std::enable_if_t<std::is_integral_v<Number> || std::is_enum_v<Number>, int> = 0>
constexpr unsigned int traceValue(Number value) {
    return static_cast<unsigned int>(value);
}
/** A C text. */
constexpr const char* traceValue(const char* value) {
    return value;
}
/** A text, as far as its first NUL. */
inline const char* traceValue(const std::string& value) {
    return value.c_str();
}
/** @} */

} // namespace TK

/** Makes the two logger calls of one trace point; `text` is formatted for each. Used by the macros below
 * alone. */
#define TK_TRACE_POINT_(category, level, text)                                 \
    ::HVLog::HVLogger::logLevelMessage(                                        \
        __func__, tkTraceFile, __LINE__, category, level, nullptr, 0, 0,       \
        tkTraceMessage.str(tkTraceMessage << static_cast<const char*>(text))); \
    ::HVLog::HVLogger::traceLevelMessage(                                      \
        __func__, tkTraceFile, __LINE__, category, level, nullptr, 0, 0,       \
        tkTraceMessage.str(tkTraceMessage << static_cast<const char*>(text)))

/** A trace point without parameter list. Used by the macros below alone. */
#define TK_TRACE_TEXT_(category, level, text)                              \
    do {                                                                   \
        constexpr const char* tkTraceFile = ::TK::traceFileName(__FILE__); \
        ::HVLog::HVMessageBuffer tkTraceMessage;                           \
        TK_TRACE_POINT_(category, level, text);                            \
    } while (false)

/** A trace point with parameter list. Used by the macros below alone. */
#define TK_TRACE_PARAMETERS_(category, insertions, type)                                                    \
    do {                                                                                                    \
        constexpr const char* tkTraceFile = ::TK::traceFileName(__FILE__);                                  \
        ::HVLog::HVMessageBuffer tkTraceParameters;                                                         \
        ::HVLog::HVMessageBuffer tkTraceMessage;                                                            \
        TK_TRACE_POINT_(                                                                                    \
            category, ::TK::parametersLevelCode,                                                            \
            ::TK::tracepara(                                                                                \
                __func__, tkTraceFile, __LINE__,                                                            \
                ::TK::traceList(tkTraceParameters, ::TK::TraceParameters(tkTraceParameters) << insertions), \
                type));                                                                                     \
    } while (false)

/**
 * @name Trace points
 * See the top of this file. `category` is a `std::string` (or what converts to one), evaluated twice.
 */
/** @{ */
/** Entry to the operation that it stands in. */
#define TK_TRACE_ENTERING(category)               \
    TK_TRACE_TEXT_(category, ::TK::flowLevelCode, \
                   ::TK::trace(__func__, tkTraceFile, __LINE__, ::TK::ENTERING))
/** Exit from the operation that it stands in. */
#define TK_TRACE_EXITING(category) \
    TK_TRACE_TEXT_(category, ::TK::flowLevelCode, ::TK::trace(__func__, tkTraceFile, __LINE__, ::TK::EXITING))
/** Entry with parameters: `TK_TRACE_ENTERING_PARAMETERS(category, " broker=" << broker << " name=" << name)`.
 */
#define TK_TRACE_ENTERING_PARAMETERS(category, insertions) \
    TK_TRACE_PARAMETERS_(category, insertions, ::TK::ENTERING)
/** Exit with parameters. */
#define TK_TRACE_EXITING_PARAMETERS(category, insertions) \
    TK_TRACE_PARAMETERS_(category, insertions, ::TK::EXITING)
/** A message: a C string. */
#define TK_TRACE_MESSAGE(category, text) \
    TK_TRACE_TEXT_(category, ::TK::messageLevelCode, ::TK::trace(text, tkTraceFile, __LINE__, ::TK::MESSAGE))
/** The value of a variable: `name` is a C string, `value` an integer, `bool`, enumeration, C string or
 * `std::string`. */
#define TK_TRACE_VARIABLE(category, name, value)  \
    TK_TRACE_TEXT_(category, ::TK::flowLevelCode, \
                   ::TK::trace(name, tkTraceFile, __LINE__, ::TK::traceValue(value)))
/** @} */
