// Runs a task in a child process, so that whatever ends or blocks it leaves this one alive.
#pragma once

#include <chrono>
#include <functional>
#include <mutex>
#include <string>

namespace oxahv::runner {

// The child's way to its parent: one line a message.
class ChildOutput {
public:
    explicit ChildOutput(int descriptor) : descriptor_(descriptor) {}
    // Thread-safe. Ends the process when the parent is gone.
    void send(const std::string& line);

private:
    std::mutex mutex_;
    int descriptor_;
};

enum class ChildEnd {
    finished, // the task has returned
    crashed,  // the process ended before
    hung      // nothing came for too long, and the process was killed
};

struct ChildResult {
    ChildEnd end = ChildEnd::finished;
    std::string text; // of a crash: "killed by signal 11 (Segmentation fault)" or "exit status 3"
};

// What the parent does with the child's lines; both may throw, which ends the child.
struct ChildReceiver {
    std::function<void(const std::string& line)> message; // that the task has sent
    std::function<void(const std::string& line)> error;   // of its standard error stream
};

// Forks, and runs the task in the child, whose standard output becomes its standard error stream: what a
// provider prints belongs to no report. The parent gets each line that the task sends and each that it writes
// to its standard error stream. A child that sends none for `timeout` is killed.
//
// Between the two is a keeper, a process that inherits all orphans below it. When the child ends, or this
// process does, however it is killed, the keeper kills what the provider has started, also in sessions of
// their own. Only for a process of one thread. Throws std::system_error when no child can be made, and
// whatever the receiver throws.
ChildResult runInChild(const std::function<void(ChildOutput&)>& task, const ChildReceiver& receiver,
                       std::chrono::milliseconds timeout);

} // namespace oxahv::runner
