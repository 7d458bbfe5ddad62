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
 * loaded with local symbols may have a set of its own. Neither changes what is traced. The buffers have no
 * destructor, so a thread may outlive the library.
 */
#pragma once

#include "HVLogger.h"
#include "HVMessageBuffer.h"
#include "StringConversion.h"
#include "TKExport.h"

#include <cstddef>
#include <cstdio>
#include <cstring>
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

/** The level codes that the trace points hand to the logger. */
constexpr int parametersLevelCode = 3000;
constexpr int flowLevelCode = 4000;
constexpr int messageLevelCode = 6000;

/** A C string for formatting: "(null)" in the place of a null pointer. Thread-safe. */
inline const char* traceText(const char* text) {
    return text != nullptr ? text : "(null)";
}

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
 * @param subject the function's name; for #MESSAGE the message's text.
 * @return the text; empty for a value outside the enumeration.
 */
inline TK_EXPORT char* trace(const char* subject, const char* file, unsigned int line, MessageType type) {
    static thread_local char messageBuffer[traceBufferSize];
    std::memset(messageBuffer, 0, sizeof messageBuffer);
    if (type == MESSAGE) {
        std::snprintf(messageBuffer, sizeof messageBuffer, "MESSAGE [File: %s, Line: %d]: %s",
                      traceText(file), static_cast<int>(line), traceText(subject));
    } else if (type == ENTERING || type == EXITING) {
        std::snprintf(messageBuffer, sizeof messageBuffer, "%s: %s() in %s [Line: %d]",
                      type == ENTERING ? "ENTERING" : "EXITING", traceText(subject), traceText(file),
                      static_cast<int>(line));
    }
    return messageBuffer;
}

/**
 * The value of a number.
 * @param name the variable's name.
 * @param value the 32 bits of the number, shown as signed decimal.
 */
inline TK_EXPORT char* trace(const char* name, const char* file, unsigned int line, unsigned int value) {
    static thread_local char messageBuffer[traceBufferSize];
    std::memset(messageBuffer, 0, sizeof messageBuffer);
    std::snprintf(messageBuffer, sizeof messageBuffer, "VARIABLE: '%s' has Value '%d' at line %d in %s",
                  traceText(name), static_cast<int>(value), static_cast<int>(line), traceText(file));
    return messageBuffer;
}

/**
 * The value of a text.
 * @param name the variable's name.
 * @param value the text.
 */
inline TK_EXPORT char* trace(const char* name, const char* file, unsigned int line, const char* value) {
    static thread_local char messageBuffer[traceBufferSize];
    std::memset(messageBuffer, 0, sizeof messageBuffer);
    std::snprintf(messageBuffer, sizeof messageBuffer, "VARIABLE: '%s' has Value '%s' at line %d in %s",
                  traceText(name), traceText(value), static_cast<int>(line), traceText(file));
    return messageBuffer;
}

/**
 * Entry or exit with the operation's parameters.
 * @param function the function's name.
 * @param parameters the parameter list; it starts with a blank.
 * @param type #ENTERING or #EXITING.
 * @return the text; empty for any other `type`.
 */
inline TK_EXPORT char* tracepara(const char* function, const char* file, unsigned int line,
                                 const char* parameters, MessageType type) {
    static thread_local char messageBuffer[traceBufferSize];
    std::memset(messageBuffer, 0, sizeof messageBuffer);
    if (type == ENTERING || type == EXITING) {
        std::snprintf(messageBuffer, sizeof messageBuffer, "%s: %s() in %s [Line: %d],Parameters List: %s",
                      type == ENTERING ? "ENTERING" : "EXITING", traceText(function), traceText(file),
                      static_cast<int>(line), traceText(parameters));
    }
    return messageBuffer;
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
template <class Number, std::enable_if_t<std::is_integral_v<Number> || std::is_enum_v<Number>, int> = 0>
constexpr unsigned int traceValue(Number value) {
    return static_cast<unsigned int>(value);
}
constexpr const char* traceValue(const char* value) {
    return value;
}
inline const char* traceValue(const std::string& value) {
    return value.c_str();
}
/** @} */

} // namespace TK

/** Makes the two logger calls of one trace point; `text` is formatted for each. Used by the macros below
 * alone. */
#define TK_TRACE_POINT_(category, level, text)                                                            \
    ::HVLog::HVLogger::logLevelMessage(__func__, tkTraceFile, __LINE__, category, level, nullptr, 0, 0,   \
                                       tkTraceMessage.str(tkTraceMessage << (text)));                     \
    ::HVLog::HVLogger::traceLevelMessage(__func__, tkTraceFile, __LINE__, category, level, nullptr, 0, 0, \
                                         tkTraceMessage.str(tkTraceMessage << (text)))

/** A trace point without parameter list. Used by the macros below alone. */
#define TK_TRACE_TEXT_(category, level, text)                              \
    do {                                                                   \
        constexpr const char* tkTraceFile = ::TK::traceFileName(__FILE__); \
        ::HVLog::HVMessageBuffer tkTraceMessage;                           \
        TK_TRACE_POINT_(category, level, text);                            \
    } while (false)

/** A trace point with parameter list. Used by the macros below alone. */
#define TK_TRACE_PARAMETERS_(category, insertions, type)                                                \
    do {                                                                                                \
        constexpr const char* tkTraceFile = ::TK::traceFileName(__FILE__);                              \
        ::HVLog::HVMessageBuffer tkTraceParameters;                                                     \
        ::HVLog::HVMessageBuffer tkTraceMessage;                                                        \
        TK_TRACE_POINT_(category, ::TK::parametersLevelCode,                                            \
                        ::TK::tracepara(__func__, tkTraceFile, __LINE__,                                \
                                        tkTraceParameters.str(tkTraceParameters << insertions).c_str(), \
                                        type));                                                         \
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
