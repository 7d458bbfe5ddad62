// The end of the command on Ctrl-C or by a supervisor.
#pragma once

#include <chrono>

namespace oxahv::runner {

// Takes SIGINT and SIGTERM as wishes to end, from its making on. A second one ends the process at once, for a
// provider that never returns. There is one such object in a process.
class EndingSignals {
public:
    EndingSignals();
    ~EndingSignals();
    EndingSignals(const EndingSignals&) = delete;
    EndingSignals& operator=(const EndingSignals&) = delete;

    // Waits for a signal. Returns whether one has come in this time.
    bool wait(std::chrono::milliseconds time) const;
};

} // namespace oxahv::runner
