#include "Progress.h"

#include <iostream>
#include <unistd.h>

Progress::Progress(oxahv::Request& request) : request_(request) {
    if (::isatty(STDERR_FILENO) == 1) {
        request_.setProgressHandler([this](std::size_t results) { show(results); });
    }
}

Progress::~Progress() {
    request_.setProgressHandler(nullptr);
    if (isShown_) {
        std::cerr << "\r\033[K" << std::flush; // erases the line
    }
}

void Progress::show(std::size_t results) {
    const auto now = std::chrono::steady_clock::now();
    if (now >= due_) {
        due_ = now + std::chrono::milliseconds(200);
        isShown_ = true;
        std::cerr << '\r' << results << " results so far" << std::flush;
    }
}
