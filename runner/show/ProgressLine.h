// Shows on a terminal how far something long has come.
#pragma once

#include <chrono>
#include <string>

namespace oxahv::runner {

// One line of the standard error stream, written over and over once this object is older than a second;
// nothing when that stream is no terminal. The line is gone when this object is.
class ProgressLine {
public:
    ProgressLine();
    ~ProgressLine();
    ProgressLine(const ProgressLine&) = delete;
    ProgressLine& operator=(const ProgressLine&) = delete;

    // Writes the text, unless the last one is too fresh. What does not fit into 79 characters is cut off.
    void show(const std::string& text);

private:
    bool isTerminal_;
    bool isShown_ = false;
    std::chrono::steady_clock::time_point due_ = std::chrono::steady_clock::now() + std::chrono::seconds(1);
};

} // namespace oxahv::runner
