#include "HVMessageBuffer.h"

#include <new>

namespace HVLog {

HVMessageBuffer::HVMessageBuffer() = default;
HVMessageBuffer::~HVMessageBuffer() = default;

HVMessageBuffer& HVMessageBuffer::operator<<(const char* text) {
    if (stream_) {
        *stream_ << text;
    } else if (text == nullptr) {
        ended_ = true;
    } else if (!ended_) {
        sink_.text += text;
    }
    return *this;
}

HVMessageBuffer::operator std::ostream&() {
    if (!stream_) {
        stream_.emplace(&sink_);
        if (ended_) {
            stream_->setstate(std::ios_base::badbit);
        }
    }
    return *stream_;
}

const std::string& HVMessageBuffer::str(HVMessageBuffer& /*inserted*/) {
    return take();
}

const std::string& HVMessageBuffer::str(std::ostream& /*inserted*/) {
    return take();
}

const std::string& HVMessageBuffer::take() {
    if (stream_) {
        // The stream stays where it is: its user may hold on to it between two messages.
        stream_->exceptions(std::ios_base::goodbit);
        stream_->clear();
        stream_->flags(std::ios_base::skipws | std::ios_base::dec);
        stream_->precision(6);
        stream_->width(0);
        stream_->fill(' ');
    }
    ended_ = false;
    taken_.swap(sink_.text);
    sink_.text.clear();
    if (sink_.outOfMemory) {
        sink_.outOfMemory = false;
        throw std::bad_alloc();
    }
    return taken_;
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
        text.append(characters, count);
        return true;
    } catch (const std::bad_alloc&) {
        outOfMemory = true;
        return false;
    }
}

} // namespace HVLog
