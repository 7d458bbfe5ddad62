#include "show/ProgressLine.h"

#include "show/Text.h"

#include <iostream>
#include <unistd.h>

namespace oxahv::runner {

ProgressLine::ProgressLine() : isTerminal_(::isatty(STDERR_FILENO) == 1) {}

ProgressLine::~ProgressLine() {
    if (isShown_) {
        std::cerr << "\r\033[K" << std::flush; // erases the line
    }
}

void ProgressLine::show(const std::string& text) {
    constexpr std::size_t width = 79;
    const auto now = std::chrono::steady_clock::now();
    if (isTerminal_ && now >= due_) {
        due_ = now + std::chrono::milliseconds(200);
        isShown_ = true;
        std::cerr << '\r' << printable(text, width) << "\033[K" << std::flush;
    }
}

} // namespace oxahv::runner
