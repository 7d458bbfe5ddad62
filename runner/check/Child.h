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

// Forks, and runs the task in the child, whose standard output becomes its standard error stream: what a
// provider prints belongs to no report. The parent's `receive` gets each line that the task sends. A child
// that sends none for `timeout` is killed. In the end, the processes that the child has started are killed as
// well. Only for a process of one thread. Throws std::system_error when no
// child can be made, and whatever `receive` throws.
ChildResult runInChild(const std::function<void(ChildOutput&)>& task,
                       const std::function<void(const std::string&)>& receive,
                       std::chrono::milliseconds timeout);

} // namespace oxahv::runner
