#include "HVMessageBuffer.h"

#include <array>
#include <atomic>
#include <cstdint>
#include <cstring>
#include <new>
#include <utility>

namespace HVLog {

namespace {

// Messages get room for this much at once, since most come in several pieces.
constexpr std::size_t usualSize = 255;
// No more than this is kept for the next message.
constexpr std::size_t largestKept = 4096;

// A place that keeps the memory of a message that is gone for one that is to come. Nobody waits for it: who
// finds it busy goes to the heap.
class alignas(64) SpareText {
public:
    // What the state says until a place is used first, so that it needs no construction when the library is
    // loaded, and after the library's end.
    constexpr SpareText() : none_() {}
    ~SpareText() {
        if (state_.exchange(State::busy, std::memory_order_acquire) == State::kept) {
            text_.~basic_string();
        }
    }
    SpareText(const SpareText&) = delete;
    SpareText& operator=(const SpareText&) = delete;

    // Hands the memory that is kept, if any, to `text`, which is empty and owns none.
    void take(std::string& text) {
        State expected = State::kept;
        if (state_.compare_exchange_strong(expected, State::busy, std::memory_order_acquire)) {
            text = std::move(text_); // which owns nothing then
            state_.store(State::empty, std::memory_order_release);
        }
    }

    // Keeps the memory of `text`, when there is none yet.
    void give(std::string& text) {
        State expected = State::empty;
        if (state_.compare_exchange_strong(expected, State::busy, std::memory_order_acquire)) {
            text.clear();
            new (&text_) std::string(std::move(text));
            state_.store(State::kept, std::memory_order_release);
        }
    }

private:
    enum class State : unsigned char { empty, busy, kept };

    std::atomic<State> state_{State::empty};
    union {
        char none_;
        std::string text_;
    };
};

std::array<SpareText, 32> spareTexts;

// Threads find different places by where their stacks lie, so that they rarely meet at one.
SpareText& spareText(const void* onStack) {
    const auto address = static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(onStack));
    return spareTexts[(address >> 16U) * 0x9E3779B97F4A7C15U >> 59U];
}

} // namespace

HVMessageBuffer::HVMessageBuffer() = default;
HVMessageBuffer::~HVMessageBuffer() {
    if (text_.capacity() >= usualSize && text_.capacity() <= largestKept) {
        spareText(this).give(text_);
    }
}

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
    if (const std::size_t size = text_.size() + count; size > text_.capacity()) {
        if (text_.empty()) {
            spareText(this).take(text_);
        }
        if (size < usualSize && text_.capacity() < usualSize) {
            text_.reserve(usualSize);
        }
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
