// What the fuzz targets share: how an input is taken apart, and what becomes of a wrong answer.
//
// Inputs are read front to back, texts up to a line feed, so that the seeds in corpus/ can be written and
// read by people.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <utility>

// The one function of a target: asks the library about an input, and ends the process when the answer is
// wrong.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

// What is to be done once before; a target need not have it.
extern "C" __attribute__((weak, visibility("default"))) int LLVMFuzzerInitialize(int* argc, char*** argv);

#define FUZZ_REQUIRE(condition) ((condition) ? (void)0 : fuzz::fail(#condition, __FILE__, __LINE__))

namespace fuzz {

[[noreturn]] inline void fail(const char* condition, const char* file, int line) {
    std::fprintf(stderr, "%s:%d: wrong: %s\n", file, line, condition);
    std::abort();
}

// Bytes as wide characters, as many bytes a character as it has.
inline std::wstring wide(const std::string& bytes) {
    std::wstring text(bytes.size() / sizeof(wchar_t), L'\0');
    std::memcpy(text.data(), bytes.data(), text.size() * sizeof(wchar_t));
    return text;
}

class Input {
public:
    Input(const std::uint8_t* data, std::size_t size) : text_(reinterpret_cast<const char*>(data), size) {}
    explicit Input(std::string text) : text_(std::move(text)) {}

    bool isEmpty() const { return position_ == text_.size(); }

    // The bytes up to the next line feed, which is taken too.
    std::string line() {
        const std::size_t end = std::min(text_.find('\n', position_), text_.size());
        const std::string line = text_.substr(position_, end - position_);
        position_ = std::min(end + 1, text_.size());
        return line;
    }

    std::string rest() {
        const std::string rest = text_.substr(position_);
        position_ = text_.size();
        return rest;
    }

    // A value of the next bytes; missing ones are zero.
    template <class Number>
    Number number() {
        Number number{};
        const std::size_t size = std::min(sizeof number, text_.size() - position_);
        std::memcpy(&number, text_.data() + position_, size);
        position_ += size;
        return number;
    }

private:
    std::string text_;
    std::size_t position_ = 0;
};

} // namespace fuzz
