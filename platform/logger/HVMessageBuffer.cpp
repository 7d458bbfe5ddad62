#include "HVMessageBuffer.h"

#include <cstring>
#include <new>

namespace HVLog {

HVMessageBuffer::HVMessageBuffer() = default;
HVMessageBuffer::~HVMessageBuffer() = default;

HVMessageBuffer& HVMessageBuffer::operator<<(const char* text) {
    if (stream_) {
        stream_->stream << text;
    } else if (text == nullptr) {
        ended_ = true;
    } else if (!ended_) {
        append(text, std::strlen(text));
    }
    return *this;
}

HVMessageBuffer::operator std::ostream&() {
    if (!stream_) {
        stream_.emplace(*this);
        if (ended_) {
            stream_->stream.setstate(std::ios_base::badbit);
        }
    }
    return stream_->stream;
}

const std::string& HVMessageBuffer::str(HVMessageBuffer& /*inserted*/) {
    return take();
}

const std::string& HVMessageBuffer::str(std::ostream& /*inserted*/) {
    return take();
}

void HVMessageBuffer::append(const char* characters, std::size_t count) {
    if (taken_) {
        taken_ = false;
        text_.assign(characters, count);
        return;
    }
    // Most messages come in several pieces; they get room for all of them at once.
    constexpr std::size_t usualSize = 255;
    if (const std::size_t size = text_.size() + count; size > text_.capacity() && size < usualSize) {
        text_.reserve(usualSize);
    }
    text_.append(characters, count);
}

const std::string& HVMessageBuffer::take() {
    if (taken_) {
        text_.clear(); // nothing was inserted since
    }
    taken_ = true;
    ended_ = false;
    if (stream_) {
        // The stream stays where it is: its user may hold on to it between two messages.
        std::ostream& stream = stream_->stream;
        stream.exceptions(std::ios_base::goodbit);
        stream.clear();
        stream.flags(std::ios_base::skipws | std::ios_base::dec);
        stream.precision(6);
        stream.width(0);
        stream.fill(' ');
        if (stream_->sink.outOfMemory) {
            stream_->sink.outOfMemory = false;
            throw std::bad_alloc();
        }
    }
    return text_;
}

HVMessageBuffer::Sink::int_type HVMessageBuffer::Sink::overflow(int_type character) {
    if (traits_type::eq_int_type(character, traits_type::eof())) {
        return traits_type::not_eof(character);
    }
    const char c = traits_type::to_char_type(character);
    return append(&c, 1) ? character : traits_type::eof();
}

std::streamsize HVMessageBuffer::Sink::xsputn(const char* characters, std::streamsize count) {
    return append(characters, static_cast<std::size_t>(count)) ? count : 0;
}

bool HVMessageBuffer::Sink::append(const char* characters, std::size_t count) {
    try {
        buffer_.append(characters, count);
        return true;
    } catch (const std::bad_alloc&) {
        outOfMemory = true;
        return false;
    }
}

} // namespace HVLog
