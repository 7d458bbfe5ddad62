/**
 * @file
 * HVLog::HVLogger, the logger that every trace point hands its text to.
 *
 * Off at first, and then nearly free: a message costs a load and a comparison. A program that wants to see
 * messages sets a sink and a threshold:
 *
 * @code
 * HVLog::HVLogger::setStderrSink();
 * HVLog::HVLogger::setThreshold(3000);
 * @endcode
 *
 * **Level codes.** The higher, the more important: 3000 for calls with their parameters, 4000 for calls and
 * variables, 6000 for messages.
 *
 * **Threads.** Everything here may be called from any thread at any time. The sink is run by one thread at a
 * time, so lines never mix. A message that the sink itself causes is dropped. A sink calls none of the
 * setters and not reset(), which wait until it has ended. A child that is forked at any time can log.
 *
 * **Encoding.** Texts are bytes in any encoding and are written as they are.
 */
#pragma once

#include "TKExport.h"

#include <functional>
#include <limits>
#include <string>

namespace HVLog {

/** The two ways in which each message reaches the logger. */
enum class Channel {
    log,  ///< HVLogger::logLevelMessage
    trace ///< HVLogger::traceLevelMessage
};

/** One message as a sink sees it. What it points to is valid while the sink runs. */
struct Message {
    Channel channel;             ///< the way that it came
    const char* function;        ///< the function's name; may be null
    const char* file;            ///< the source file's name, without directories; may be null
    int line;                    ///< the line in it
    const std::string& category; ///< the name of the channel, such as "Hovara.Utils"
    int level;                   ///< the level code
    const std::string& text;     ///< the message
};

/** The logger. All members are static. */
class TK_EXPORT HVLogger {
public:
    HVLogger() = delete;

    /** @name Logging
     * Hands one message to the sink, when there is one and the message's level code is written.
     *
     * @param function the name of the function that logs.
     * @param file the name of its source file.
     * @param line the line in it.
     * @param category the channel's name, for example "Hovara.Utils".
     * @param level the level code.
     * @param reserved always null.
     * @param reserved1 always 0.
     * @param reserved2 always 0.
     * @param text the message.
     * @throws what the sink throws.
     */
    /** @{ */
    /** On Channel::log. */
    static void logLevelMessage(const char* function, const char* file, int line, const std::string& category,
                                int level, char* reserved, int reserved1, int reserved2,
                                const std::string& text);
    /** On Channel::trace. */
    static void traceLevelMessage(const char* function, const char* file, int line,
                                  const std::string& category, int level, char* reserved, int reserved1,
                                  int reserved2, const std::string& text);
    /** @} */

    /** @name Where messages go
     * One sink at a time; a new one takes the earlier one's place, which no thread runs any more when these
     * return. The two sinks for lines drop what they cannot write, on a full disk or to a closed pipe, and
     * send no signal; a line that was cut ends before the next one begins.
     */
    /** @{ */
    /**
     * Hands messages to a function.
     * @param sink called for each message; an empty function switches logging off.
     */
    static void setSink(std::function<void(const Message&)> sink);
    /** Writes a line per message to the standard error stream. */
    static void setStderrSink();
    /**
     * Appends a line per message to a file, which is created when it is missing.
     * @throws std::system_error when the file cannot be opened; the earlier sink then stays.
     * @throws std::bad_alloc likewise.
     */
    static void setFileSink(const std::string& path);
    /** @} */

    /** @name Which messages are written */
    /** @{ */
    /** Messages whose level code is at least `level` are written; the threshold is #off at first. */
    static void setThreshold(int level);
    /** Writes, or does not write, the messages of one level code, whatever the threshold says. */
    static void setLevel(int level, bool written);
    /** Sets everything back: no sink, threshold #off, no exceptions to it. */
    static void reset();
    /** The threshold that lets nothing through. */
    static constexpr int off = std::numeric_limits<int>::max();
    /** @} */

    /**
     * The line that the stderr and the file sink write: channel, level code, category and text, without line
     * end.
     * @throws std::bad_alloc
     */
    static std::string lineOf(const Message& message);
};

} // namespace HVLog
