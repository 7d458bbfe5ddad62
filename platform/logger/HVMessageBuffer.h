/**
 * @file
 * HVLog::HVMessageBuffer, the accumulator in which a log message is put together.
 *
 * @code
 * HVLog::HVMessageBuffer buffer;
 * const std::string& text = buffer.str(buffer << "speed=" << speed);
 * @endcode
 *
 * **Threads.** A buffer is used by one thread; buffers share nothing.
 *
 * **Encoding and ownership.** Texts are bytes in any encoding; the buffer copies them.
 */
#pragma once

#include "TKExport.h"

#include <optional>
#include <ostream>
#include <streambuf>
#include <string>

namespace HVLog {

/** Collects the pieces of one message. A buffer that gets C strings alone never builds a stream. */
class TK_EXPORT HVMessageBuffer {
public:
    HVMessageBuffer();
    ~HVMessageBuffer();
    HVMessageBuffer(const HVMessageBuffer&) = delete;
    HVMessageBuffer& operator=(const HVMessageBuffer&) = delete;

    /**
     * Appends a text.
     * @param text NUL-terminated. A null pointer ends the message: nothing that follows is appended until str
     * is called.
     * @return this buffer.
     * @throws std::bad_alloc
     */
    HVMessageBuffer& operator<<(const char* text);

    /** The stream that writes into this buffer; it belongs to the buffer. */
    operator std::ostream&(); // NOLINT(google-explicit-constructor,hicpp-explicit-conversions): insertions
                              // rely on it

    /** @name Taking the text
     * Hands out the message that was put together since the last call and makes the buffer ready for the next
     * one: empty, with its stream's error state and formats as at the start.
     *
     * The argument is the result of the last insertion. It says by its type alone that the insertions are
     * done.
     *
     * @return the text; it belongs to the buffer and is valid until the next insertion or call.
     * @throws std::bad_alloc also when memory ran out while the text was written through the stream.
     */
    /** @{ */
    /** After a last insertion that was a C string. */
    const std::string& str(HVMessageBuffer& inserted);
    /** After any other last insertion. */
    const std::string& str(std::ostream& inserted);
    /** @} */

private:
    // Appends what a stream writes to the text of a buffer. A stream turns a failed allocation into a state
    // bit and goes on with a short text, so it is remembered here.
    class Sink : public std::streambuf {
    public:
        explicit Sink(HVMessageBuffer& buffer) : buffer_(buffer) {}
        bool outOfMemory = false;

    protected:
        int_type overflow(int_type character) override;
        std::streamsize xsputn(const char* characters, std::streamsize count) override;

    private:
        bool append(const char* characters, std::size_t count);
        HVMessageBuffer& buffer_;
    };

    // Most messages need no stream, and building one costs more than all the rest.
    struct Stream {
        explicit Stream(HVMessageBuffer& buffer) : sink(buffer), stream(&sink) {}
        Sink sink;
        std::ostream stream;
    };

    TK_HIDDEN void append(const char* characters, std::size_t count);
    TK_HIDDEN const std::string& take();

    std::string text_;
    bool taken_ = false; // the text was handed out: the next insertion begins a new one in its memory
    bool ended_ = false; // by a null text, before there was a stream
    std::optional<Stream> stream_;
};

/**
 * Writes the address of an object into the buffer, never the object.
 * @return the buffer's stream, for the insertions that follow.
 */
template <class T>
std::ostream& operator<<(HVMessageBuffer& buffer, const T* pointer) {
    return static_cast<std::ostream&>(buffer) << static_cast<const void*>(pointer);
}

/**
 * Writes a value into the buffer as a standard stream does.
 * @return the buffer's stream, for the insertions that follow.
 */
template <class T>
std::ostream& operator<<(HVMessageBuffer& buffer, const T& value) {
    return static_cast<std::ostream&>(buffer) << value;
}

} // namespace HVLog
