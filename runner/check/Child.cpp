#include "check/Child.h"

#include "check/Processes.h"

#include <Descriptor.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <fcntl.h>
#include <optional>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <system_error>
#include <unistd.h>

namespace oxahv::runner {

namespace {

using files::Descriptor;

constexpr char finishedMark = '.'; // no message begins with it

[[noreturn]] void fail(const char* what) {
    throw std::system_error(errno, std::generic_category(), what);
}

struct Pipe {
    Pipe() : Pipe(makePipe()) {}
    Descriptor input;
    Descriptor output;

private:
    explicit Pipe(const std::array<int, 2>& ends) : input(ends[0]), output(ends[1]) {}
    static std::array<int, 2> makePipe() {
        std::array<int, 2> ends{};
        if (::pipe2(ends.data(), O_CLOEXEC) != 0) {
            fail("pipe");
        }
        return ends;
    }
};

// What child and keeper write to the parent.
struct Pipes {
    Pipe messages;
    Pipe errors;
    Pipe status; // the keeper's alone: how the child has ended
};

// Dies with the parent, however early that dies. False when it is dead already.
bool endsWithParent(pid_t parent, int signal) {
    ::prctl(PR_SET_PDEATHSIG, signal);
    return ::getppid() == parent;
}

// In the child

// An exception must not unwind into what the parent was doing. Nothing that the parent began is ended here:
// no destructors, no handlers of exit.
[[noreturn]] void runTask(const std::function<void(ChildOutput&)>& task, Pipes& pipes,
                          pid_t keeper) noexcept {
    if (!endsWithParent(keeper, SIGKILL)) {
        ::_exit(1);
    }
    const rlimit noCore = {1, 1}; // 1 keeps a handler of core dumps from being started too, unlike 0
    ::setrlimit(RLIMIT_CORE, &noCore);
    ::dup2(pipes.errors.output.get(), STDERR_FILENO);
    ::dup2(STDERR_FILENO, STDOUT_FILENO);
    pipes.errors.output.close();
    pipes.status.output.close();
    ChildOutput out(pipes.messages.output.get());
    task(out);
    out.send(std::string(1, finishedMark));
    ::_exit(0);
}

// In the keeper

// The signals that the keeper waits for in place of being struck by them.
sigset_t keeperSignals() {
    sigset_t signals;
    ::sigemptyset(&signals);
    for (const int number : {SIGCHLD, SIGTERM, SIGINT, SIGHUP, SIGQUIT}) {
        ::sigaddset(&signals, number);
    }
    return signals;
}

// The status of a child that has ended, also of an orphan.
std::optional<int> statusWhenEnded(pid_t child) {
    std::optional<int> result;
    int status = 0;
    for (pid_t ended = 0; (ended = ::waitpid(-1, &status, WNOHANG)) > 0;) {
        result = ended == child ? std::optional<int>(status) : result;
    }
    return result;
}

// Waits for the child's end. Killed by then are those below it, also when another signal ends the waiting:
// the parent's death, or its order to stop.
[[noreturn]] void keep(pid_t child, const sigset_t& signals, Pipes& pipes) {
    std::optional<int> status;
    int number = SIGCHLD;
    while (!(status = statusWhenEnded(child)) && number == SIGCHLD) {
        if (::sigwait(&signals, &number) != 0) {
            break;
        }
    }
    killDescendants();
    const int known = status.value_or(0);
    [[maybe_unused]] const ssize_t size = ::write(pipes.status.output.get(), &known, sizeof known);
    ::_exit(0);
}

// The group of its own keeps a terminal's Ctrl-C from the keeper and the child: what the user interrupts is
// the parent, and its end is theirs.
[[noreturn]] void runKeeper(const std::function<void(ChildOutput&)>& task, Pipes& pipes,
                            pid_t parent) noexcept {
    ::setpgid(0, 0);
    ::prctl(PR_SET_CHILD_SUBREAPER, 1);
    const sigset_t signals = keeperSignals();
    sigset_t before;
    ::sigprocmask(SIG_BLOCK, &signals, &before);
    const pid_t keeper = ::getpid();
    if (!endsWithParent(parent, SIGTERM)) {
        ::_exit(1);
    }
    const pid_t child = ::fork();
    if (child == 0) {
        ::sigprocmask(SIG_SETMASK, &before, nullptr);
        runTask(task, pipes, keeper);
    }
    if (child < 0) {
        ::_exit(1);
    }
    pipes.messages.output.close();
    pipes.errors.output.close();
    keep(child, signals, pipes);
}

// In the parent

// Ends and reaps the keeper, and with it all below, whatever happens here.
class Keeper {
public:
    explicit Keeper(pid_t id) : id_(id) {}
    ~Keeper() {
        if (id_ > 0) {
            end();
        }
    }
    Keeper(const Keeper&) = delete;
    Keeper& operator=(const Keeper&) = delete;

    void end() {
        ::kill(id_, SIGTERM);
        while (::waitpid(id_, nullptr, 0) < 0 && errno == EINTR) {
        }
        id_ = -1;
    }

private:
    pid_t id_;
};

std::string wordsOf(int status) {
    if (WIFSIGNALED(status)) {
        const int number = WTERMSIG(status);
        return "killed by signal " + std::to_string(number) + " (" + ::strsignal(number) + ')';
    }
    return "exit status " + std::to_string(WEXITSTATUS(status));
}

// Hands over the lines that come through a pipe.
class LineReader {
public:
    LineReader(int descriptor, std::function<void(const std::string&)> take)
        : descriptor_(descriptor), take_(std::move(take)) {}

    // False at the end of the file.
    bool readBlock() {
        std::array<char, 65536> block{};
        const ssize_t size = ::read(descriptor_, block.data(), block.size());
        if (size < 0 && errno != EINTR) {
            fail("read");
        }
        pending_.append(block.data(), size > 0 ? static_cast<std::size_t>(size) : 0);
        std::size_t begin = 0;
        for (std::size_t end = 0; (end = pending_.find('\n', begin)) != std::string::npos; begin = end + 1) {
            take_(pending_.substr(begin, end - begin));
        }
        pending_.erase(0, begin);
        return size != 0;
    }

    void finish() {
        if (!pending_.empty()) {
            take_(pending_);
            pending_.clear();
        }
    }

private:
    int descriptor_;
    std::function<void(const std::string&)> take_;
    std::string pending_;
};

// Reads until the mark, the end of the child, or silence. The keeper's status marks the end of the child:
// what the child has started may hold its pipes open, and the child may close them and go on.
class Reader {
public:
    Reader(Pipes& pipes, const ChildReceiver& receiver)
        : waiting_({{{pipes.messages.input.get(), POLLIN, 0},
                     {pipes.errors.input.get(), POLLIN, 0},
                     {pipes.status.input.get(), POLLIN, 0}}}),
          messages_(pipes.messages.input.get(),
                    [this, &receiver](const std::string& line) {
                        isFinished_ = isFinished_ || (!line.empty() && line.front() == finishedMark);
                        if (!isFinished_) {
                            receiver.message(line);
                        }
                    }),
          errors_(pipes.errors.input.get(), receiver.error) {}

    // The status is of a child that has crashed. Only messages put the end of the time off: a child may write
    // errors for ever.
    ChildEnd read(std::chrono::milliseconds timeout, int& status) {
        using Clock = std::chrono::steady_clock;
        Clock::time_point end = Clock::now() + timeout;
        while (!isFinished_) {
            const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(end - Clock::now());
            const int ready =
                ::poll(waiting_.data(), waiting_.size(), static_cast<int>(std::max<long>(left.count(), 0)));
            if (ready < 0 && errno != EINTR) {
                fail("poll");
            }
            if (left.count() <= 0 && (ready == 0 || waiting_[0].revents == 0)) {
                return ChildEnd::hung;
            }
            if (ready <= 0) {
                continue;
            }
            const bool hasMessages = take(0, messages_);
            end = hasMessages ? Clock::now() + timeout : end;
            const bool hasErrors = take(1, errors_);
            // The status comes last of all that is written, so the pipes are emptied first.
            if (!hasMessages && !hasErrors && waiting_[2].revents != 0) {
                [[maybe_unused]] const ssize_t size = ::read(waiting_[2].fd, &status, sizeof status);
                return ChildEnd::crashed;
            }
        }
        return ChildEnd::finished;
    }

    // What is still to be read on the standard error stream, once nobody writes any more.
    void readErrors() {
        while (waiting_[1].fd >= 0 && ::poll(&waiting_[1], 1, 0) > 0 && take(1, errors_)) {
        }
        errors_.finish();
    }

private:
    bool take(std::size_t index, LineReader& lines) {
        if (waiting_.at(index).revents == 0) {
            return false;
        }
        if (!lines.readBlock()) {
            waiting_.at(index).fd = -1; // is polled no more
        }
        return true;
    }

    std::array<pollfd, 3> waiting_;
    bool isFinished_ = false;
    LineReader messages_;
    LineReader errors_;
};

} // namespace

void ChildOutput::send(const std::string& line) {
    const std::lock_guard<std::mutex> lock(mutex_);
    const std::string text = line + '\n';
    for (std::size_t sent = 0; sent < text.size();) {
        const ssize_t size = ::write(descriptor_, text.data() + sent, text.size() - sent);
        if (size < 0 && errno != EINTR) {
            ::_exit(1);
        }
        sent += size > 0 ? static_cast<std::size_t>(size) : 0;
    }
}

ChildResult runInChild(const std::function<void(ChildOutput&)>& task, const ChildReceiver& receiver,
                       std::chrono::milliseconds timeout) {
    Pipes pipes;
    const pid_t parent = ::getpid();
    const pid_t id = ::fork();
    if (id < 0) {
        fail("fork");
    }
    if (id == 0) {
        runKeeper(task, pipes, parent);
    }
    Keeper keeper(id);
    pipes.messages.output.close();
    pipes.errors.output.close();
    pipes.status.output.close();
    Reader reader(pipes, receiver);
    int status = 0;
    const ChildEnd end = reader.read(timeout, status);
    keeper.end();
    reader.readErrors();
    return {end, end == ChildEnd::crashed ? wordsOf(status) : ""};
}

} // namespace oxahv::runner
