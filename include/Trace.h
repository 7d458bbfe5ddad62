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

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <ios>
#include <ostream>
#include <string>
#include <string_view>
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
 * What `snprintf` would make of the pieces, at a fraction of its cost. One copy of this code serves all trace
 * points of a module.
 */
/** @{ */
/** A C text; null appears as "(null)". Only functions that are not inlined use it, or compilers would
 * conclude in a caller that its text may be null. */
inline std::string_view traceView(const char* text) {
    return text != nullptr ? std::string_view(text) : std::string_view("(null)");
}
/** A number in decimal digits. */
class TK_HIDDEN TraceNumber {
public:
    /** Of a signed number. */
    explicit TraceNumber(int number)
        : isNegative_(number < 0),
          rest_(isNegative_ ? 0U - static_cast<unsigned int>(number) : static_cast<unsigned int>(number)) {
        size_ = isNegative_ ? 2 : 1;
        for (unsigned int rest = rest_; rest >= 10; rest /= 10) {
            ++size_;
        }
    }
    /** The number of characters. */
    std::size_t size() const { return size_; }
    /** Writes them where they belong, since the processor waits for bytes that are copied at once. */
    [[gnu::noinline]] void write(char* to) const {
        *to = '-';
        char* end = to + size_;
        unsigned int rest = rest_;
        do {
            *--end = static_cast<char>('0' + rest % 10);
            rest /= 10;
        } while (rest != 0);
    }

    static constexpr std::size_t mostSize = sizeof "-2147483648" - 1; ///< of the longest number

private:
    bool isNegative_;
    unsigned int rest_;
    std::size_t size_;
};
/** Copies a text to a place that has room for it; returns where the next piece begins. */
inline char* tracePiece(char* to, std::string_view text) {
    std::memcpy(to, text.data(), text.size());
    return to + text.size();
}
/** Writes a number likewise. */
inline char* tracePiece(char* to, const TraceNumber& number) {
    number.write(to);
    return to + number.size();
}
/** Copies as much of a text as fits before `end`. */
[[gnu::noinline]] TK_HIDDEN inline char* tracePiece(char* to, const char* end, std::string_view text) {
    return to + text.copy(to, static_cast<std::size_t>(end - to));
}
/** Writes as much of a number as fits before `end`. */
inline char* tracePiece(char* to, const char* end, const TraceNumber& number) {
    char digits[TraceNumber::mostSize]; // NOLINT(*-member-init): written next
    number.write(digits);
    return tracePiece(to, end, {digits, number.size()});
}
/** Fills a buffer with the pieces, up to its last byte but one, and the rest of it with zeros. Inlined into
 * the few functions below, where the compiler knows the sizes of most pieces; otherwise each is a call. */
template <class... Pieces>
[[gnu::always_inline]] inline char* traceText(char (&buffer)[traceBufferSize], const Pieces&... pieces) {
    char* const end = buffer + sizeof buffer;
    char* to = buffer;
    if ((pieces.size() + ...) < sizeof buffer) {
        ((to = tracePiece(to, pieces)), ...);
    } else {
        ((to = tracePiece(to, end - 1, pieces)), ...);
    }
    std::memset(to, 0, static_cast<std::size_t>(end - to));
    return buffer;
}
/** The text of an entry, an exit or a message. */
[[gnu::noinline]] TK_HIDDEN inline char* traceFlow(char (&buffer)[traceBufferSize], const char* subjectText,
                                                   const char* fileName, int line, MessageType type) {
    using View = std::string_view;
    const View subject = traceView(subjectText);
    const View file = traceView(fileName);
    switch (type) {
    case ENTERING:
    case EXITING:
        return traceText(buffer, type == ENTERING ? View("ENTERING: ") : View("EXITING: "), subject,
                         View("() in "), file, View(" [Line: "), TraceNumber(line), View("]"));
    case MESSAGE:
        return traceText(buffer, View("MESSAGE [File: "), file, View(", Line: "), TraceNumber(line),
                         View("]: "), subject);
    }
    return traceText(buffer, View(""));
}
/** The text of a variable, whose value is a piece. */
template <class Value>
inline char* traceValueText(char (&buffer)[traceBufferSize], const char* name, const char* file, int line,
                            const Value& value) {
    using View = std::string_view;
    return traceText(buffer, View("VARIABLE: '"), traceView(name), View("' has Value '"), value,
                     View("' at line "), TraceNumber(line), View(" in "), traceView(file));
}
/** The text of a variable that is a number. */
[[gnu::noinline]] TK_HIDDEN inline char* traceVariable(char (&buffer)[traceBufferSize], const char* name,
                                                       const char* file, int line, int value) {
    return traceValueText(buffer, name, file, line, TraceNumber(value));
}
/** The text of a variable that is a text. */
[[gnu::noinline]] TK_HIDDEN inline char* traceVariable(char (&buffer)[traceBufferSize], const char* name,
                                                       const char* file, int line, const char* value) {
    return traceValueText(buffer, name, file, line, traceView(value));
}
/** The text of an entry or an exit with parameters. */
[[gnu::noinline]] TK_HIDDEN inline char* traceParameters(char (&buffer)[traceBufferSize],
                                                         const char* function, const char* file, int line,
                                                         const char* parameters, MessageType type) {
    using View = std::string_view;
    if (type != ENTERING && type != EXITING) {
        return traceText(buffer, View(""));
    }
    return traceText(buffer, type == ENTERING ? View("ENTERING: ") : View("EXITING: "), traceView(function),
                     View("() in "), traceView(file), View(" [Line: "), TraceNumber(line),
                     View("],Parameters List: "), traceView(parameters));
}
/** @} */

/** @name Formatting functions
 * Each zeroes its own buffer, formats its text into it and returns the buffer. The buffer is the calling
 * thread's; it holds the text until that thread calls the same function again. Null texts appear as "(null)".
 * A text is cut at 511 bytes. Nothing is thrown.
 *
 * They are always inlined, so that a library exports their buffers alone.
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
    alignas(64) static thread_local char messageBuffer[traceBufferSize];
    return traceFlow(messageBuffer, subject, file, static_cast<int>(line), type);
}

/**
 * The value of a number.
 * @param name the variable's name.
 * @param value the 32 bits of the number, shown as signed decimal.
 */
[[gnu::always_inline]] inline TK_EXPORT char* trace(const char* name, const char* file, unsigned int line,
                                                    unsigned int value) {
    alignas(64) static thread_local char messageBuffer[traceBufferSize];
    return traceVariable(messageBuffer, name, file, static_cast<int>(line), static_cast<int>(value));
}

/**
 * The value of a text.
 * @param name the variable's name.
 * @param value the text.
 */
[[gnu::always_inline]] inline TK_EXPORT char* trace(const char* name, const char* file, unsigned int line,
                                                    const char* value) {
    alignas(64) static thread_local char messageBuffer[traceBufferSize];
    return traceVariable(messageBuffer, name, file, static_cast<int>(line), value);
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
    alignas(64) static thread_local char messageBuffer[traceBufferSize];
    return traceParameters(messageBuffer, function, file, static_cast<int>(line), parameters, type);
}
/** @} */

/**
 * Puts a parameter list together for a message buffer. Texts and addresses, which most lists consist of, are
 * collected here, as far as a trace can show them. The buffer's stream, which costs more than all the rest,
 * is built only when something else is inserted, and then takes everything that follows. The list reads the
 * same either way.
 */
class TK_HIDDEN TraceParameters {
public:
    /** An empty list. @param buffer empty; has to outlive this object. */
    explicit TraceParameters(HVLog::HVMessageBuffer& buffer) : buffer_(buffer) {}

    /** Appends a C text; a null pointer ends the list. */
    [[gnu::noinline]] TraceParameters& operator<<(const char* text) {
        if (text != nullptr) {
            return append(text);
        }
        if (streaming_) {
            stream().setstate(std::ios_base::badbit);
        }
        ended_ = true;
        return *this;
    }

    /** Appends a text. What follows a NUL would be cut off where the list is read as a C string: the list
     * ends there. */
    [[gnu::noinline]] TraceParameters& operator<<(const std::string& text) {
        const std::size_t size = std::strlen(text.c_str());
        append({text.data(), size});
        return size == text.size() ? *this : *this << static_cast<const char*>(nullptr);
    }

    /** Appends the text that a pointer to characters leads to, of any other pointer the address. */
    template <class T, std::enable_if_t<!std::is_function_v<T>, int> = 0>
    decltype(auto) operator<<(T* pointer) {
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

    /** @name The list's text, from the result of its last insertion
     * Valid until the next insertion or reset.
     */
    /** @{ */
    /** Of a list that ends here. */
    const char* text(TraceParameters& /*inserted*/) { return streaming_ ? text(stream()) : collected(); }
    /** Of a list that ends in the buffer's stream. */
    const char* text(std::ostream& inserted) { return buffer_.str(inserted).c_str(); }
    /** @} */

    /** Makes the list empty. */
    void reset() {
        end_ = list_;
        digits_ = Digits::unknown;
        ended_ = false;
        streaming_ = false;
    }

private:
    [[gnu::noinline]] TraceParameters& append(std::string_view text) {
        if (streaming_) {
            stream() << text;
        } else if (!ended_) {
            const std::size_t size = text.size() < room() ? text.size() : room();
            std::memcpy(end_, text.data(), size);
            end_ += size;
        }
        return *this;
    }

    std::size_t room() const { return static_cast<std::size_t>(list_ + sizeof list_ - 1 - end_); }

    const char* collected() {
        *end_ = '\0';
        return list_;
    }

    [[gnu::noinline]] TraceParameters& address(const void* pointer) {
        if (digits_ == Digits::unknown) {
            digits_ = std::locale() == std::locale::classic() ? Digits::plain : Digits::ofLocale;
        }
        if (streaming_ || digits_ == Digits::ofLocale) {
            stream() << pointer; // the locale may group the digits
            return *this;
        }
        if (!ended_ && room() >= addressSize) {
            end_ = writeAddress(end_, pointer); // at once: copying bytes just written is slow
            return *this;
        }
        char digits[addressSize]; // NOLINT(*-member-init): written next
        return append({digits, static_cast<std::size_t>(writeAddress(digits, pointer) - digits)});
    }

    static constexpr std::size_t addressSize = sizeof "0x" - 1 + 2 * sizeof(void*); // of the longest

    static char* writeAddress(char* to, const void* pointer) {
        const auto number = reinterpret_cast<std::uintptr_t>(pointer);
        if (number != 0) {
            *to++ = '0';
            *to++ = 'x';
        }
        unsigned int shift = 0;
        for (std::uintptr_t rest = number; rest > 0xF; rest >>= 4U) {
            shift += 4;
        }
        for (; shift != 0; shift -= 4) {
            *to++ = "0123456789abcdef"[(number >> shift) & 0xFU];
        }
        *to++ = "0123456789abcdef"[number & 0xFU];
        return to;
    }

    [[gnu::noinline]] std::ostream& stream() {
        if (streaming_) {
            return buffer_;
        }
        std::ostream& stream = buffer_ << collected();
        if (ended_) {
            stream.setstate(std::ios_base::badbit);
        }
        streaming_ = true;
        return stream;
    }

    enum class Digits { unknown, plain, ofLocale }; // as the global locale writes numbers

    HVLog::HVMessageBuffer& buffer_;
    Digits digits_ = Digits::unknown;
    bool ended_ = false;     // by a null text
    bool streaming_ = false; // through the buffer's stream
    char* end_ = list_;
    char list_[traceBufferSize]; // NOLINT(*-member-init): written as far as it is read
};

/** Where the part of a path after its last slash begins. */
constexpr std::size_t traceFileNameAt(const char* path) {
    std::size_t begin = 0;
    for (std::size_t i = 0; path[i] != '\0'; ++i) {
        if (path[i] == '/') {
            begin = i + 1;
        }
    }
    return begin;
}

/** The part of a path after its last slash. */
constexpr const char* traceFileName(const char* path) {
    return path + traceFileNameAt(path);
}

/** A number that the compiler works out, however little it optimizes. */
template <std::size_t number>
constexpr std::size_t traceConstant = number;

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

/**
 * One pass of a trace point. Each of its functions formats the text and makes the next of the two logger
 * calls; it returns whether there is another to make, so that a trace point is a loop whose body, the
 * evaluation of its arguments, is compiled once. Used by the macros below alone.
 */
class TK_HIDDEN TracePoint {
public:
    /** At a place in the source. */
    [[gnu::noinline]] TracePoint(const char* function, const char* file, int line)
        : function_(function), file_(file), line_(line) {}
    [[gnu::noinline]] ~TracePoint() = default;
    TracePoint(const TracePoint&) = delete;
    TracePoint& operator=(const TracePoint&) = delete;

    /** Entry. */
    [[gnu::noinline]] bool entering(const std::string& category) {
        return log(category, flowLevelCode, trace(function_, file_, line(), ENTERING));
    }
    /** Exit. */
    [[gnu::noinline]] bool exiting(const std::string& category) {
        return log(category, flowLevelCode, trace(function_, file_, line(), EXITING));
    }
    /** A message. */
    [[gnu::noinline]] bool message(const std::string& category, const char* text) {
        return log(category, messageLevelCode, trace(text, file_, line(), MESSAGE));
    }
    /** The value of a number. */
    [[gnu::noinline]] bool variable(const std::string& category, const char* name, unsigned int value) {
        return log(category, flowLevelCode, trace(name, file_, line(), value));
    }
    /** The value of a text. */
    [[gnu::noinline]] bool variable(const std::string& category, const char* name, const char* value) {
        return log(category, flowLevelCode, trace(name, file_, line(), value));
    }
    /** Entry or exit with parameters. */
    bool parameters(const std::string& category, const char* list, MessageType type) {
        return log(category, parametersLevelCode, tracepara(function_, file_, line(), list, type));
    }

private:
    unsigned int line() const { return static_cast<unsigned int>(line_); }

    [[gnu::noinline]] bool log(const std::string& category, int level, const char* text) {
        const std::string& message = message_.str(message_ << text);
        logged_ = !logged_;
        if (logged_) {
            HVLog::HVLogger::logLevelMessage(function_, file_, line_, category, level, nullptr, 0, 0,
                                             message);
        } else {
            HVLog::HVLogger::traceLevelMessage(function_, file_, line_, category, level, nullptr, 0, 0,
                                               message);
        }
        return logged_;
    }

    const char* function_;
    const char* file_;
    int line_;
    bool logged_ = false; // the first of the two calls was made
    HVLog::HVMessageBuffer message_;
};

/** One pass of a trace point with parameter list. Used by the macros below alone. */
class TK_HIDDEN TraceListPoint {
public:
    /** At a place in the source, on entry or exit. */
    [[gnu::noinline]] TraceListPoint(const char* function, const char* file, int line, MessageType type)
        : list(buffer_), type_(type), point_(function, file, line) {}
    [[gnu::noinline]] ~TraceListPoint() = default;
    TraceListPoint(const TraceListPoint&) = delete;
    TraceListPoint& operator=(const TraceListPoint&) = delete;

    /** As those of TracePoint. @param inserted the result of the last insertion into `list`. */
    template <class Inserted>
    [[gnu::noinline]] bool log(const std::string& category, Inserted& inserted) {
        const bool more = point_.parameters(category, list.text(inserted), type_);
        list.reset();
        return more;
    }

private:
    HVLog::HVMessageBuffer buffer_; // made before the message's, and destroyed after it

public:
    TraceParameters list; ///< what the insertions go to

private:
    MessageType type_;
    TracePoint point_;
};

} // namespace TK

/** A trace point: an object of a class, and a loop that repeats `step` while it returns true. Used by the
 * macros below alone. */
#define TK_TRACE_POINT_(step, Class, ...)                                                                    \
    for (::TK::Class tkTracePoint(__func__, &__FILE__[::TK::traceConstant<::TK::traceFileNameAt(__FILE__)>], \
                                  __VA_ARGS__);                                                              \
         tkTracePoint.step;)                                                                                 \
    static_cast<void>(0)

/** A trace point with parameter list. Used by the macros below alone. */
#define TK_TRACE_PARAMETERS_(category, insertions, type) \
    TK_TRACE_POINT_(log(category, tkTracePoint.list << insertions), TraceListPoint, __LINE__, type)

/**
 * @name Trace points
 * See the top of this file. `category` is a `std::string` (or what converts to one), evaluated twice.
 */
/** @{ */
/** Entry to the function that contains it. */
#define TK_TRACE_ENTERING(category) TK_TRACE_POINT_(entering(category), TracePoint, __LINE__)
/** Exit from the function that contains it. */
#define TK_TRACE_EXITING(category) TK_TRACE_POINT_(exiting(category), TracePoint, __LINE__)
/** Entry with parameters: `TK_TRACE_ENTERING_PARAMETERS(category, " broker=" << broker << " name=" << name)`.
 */
#define TK_TRACE_ENTERING_PARAMETERS(category, insertions) \
    TK_TRACE_PARAMETERS_(category, insertions, ::TK::ENTERING)
/** Exit with parameters. */
#define TK_TRACE_EXITING_PARAMETERS(category, insertions) \
    TK_TRACE_PARAMETERS_(category, insertions, ::TK::EXITING)
/** A message: a C string. */
#define TK_TRACE_MESSAGE(category, text) TK_TRACE_POINT_(message(category, text), TracePoint, __LINE__)
/** The value of a variable: `name` is a C string, `value` an integer, `bool`, enumeration, C string or
 * `std::string`. */
#define TK_TRACE_VARIABLE(category, name, value) \
    TK_TRACE_POINT_(variable(category, name, ::TK::traceValue(value)), TracePoint, __LINE__)
/** @} */
