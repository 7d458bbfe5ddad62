// Shows on a terminal how far a long request has come.
#pragma once

#include <EmbeddedBroker.h>

#include <chrono>

// Writes a count to the standard error stream, over and over in one line, once a request takes longer than a
// second; nothing when that stream is no terminal. The line is gone when this object is.
class Progress {
public:
    explicit Progress(oxahv::Request& request);
    ~Progress();
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

private:
    void show(std::size_t results);

    oxahv::Request& request_;
    std::chrono::steady_clock::time_point due_ = std::chrono::steady_clock::now() + std::chrono::seconds(1);
    bool isShown_ = false;
};
