#include "check/Child.h"

#include <Descriptor.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
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

// An exception must not unwind into what the parent was doing.
[[noreturn]] void live(const std::function<void(ChildOutput&)>& task, int output, pid_t parent) noexcept {
    ::setpgid(0, 0);
    // The child must not outlive a parent that is killed, however early; nor one that a terminal interrupts,
    // which does not reach this group.
    ::prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (::getppid() != parent) {
        ::_exit(1);
    }
    ::dup2(STDERR_FILENO, STDOUT_FILENO);
    ChildOutput out(output);
    task(out);
    out.send(std::string(1, finishedMark));
    ::_exit(0); // what the parent's objects do at its end is the parent's
}

// Kills and reaps the child, whatever happens to its parent. What the provider has started goes with it.
class Process {
public:
    // Both processes make the group, so that it is there for whichever needs it first.
    explicit Process(pid_t id) : id_(id) { ::setpgid(id, id); }
    ~Process() {
        if (id_ > 0) {
            end();
        }
    }
    Process(const Process&) = delete;
    Process& operator=(const Process&) = delete;

    // Returns the status of a process that has ended by itself, or of the end that it meets here. The group
    // keeps its number until the process is reaped.
    int end() {
        ::kill(-id_, SIGKILL);
        int status = 0;
        while (::waitpid(id_, &status, 0) < 0 && errno == EINTR) {
        }
        id_ = -1;
        return status;
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

// Reads lines until the mark, the end of the child, or silence. Of the end, the process itself tells: a pipe
// stays open in what the child has started, and a child can close it and go on.
class Reader {
public:
    Reader(int descriptor, int process, const std::function<void(const std::string&)>& receive)
        : descriptor_(descriptor), process_(process), receive_(receive) {}

    ChildEnd read(std::chrono::milliseconds timeout) {
        std::array<pollfd, 2> waiting = {{{descriptor_, POLLIN, 0}, {process_, POLLIN, 0}}};
        while (!isFinished_) {
            const int ready = ::poll(waiting.data(), waiting.size(), static_cast<int>(timeout.count()));
            if (ready < 0 && errno != EINTR) {
                fail("poll");
            }
            if (ready == 0) {
                return ChildEnd::hung;
            }
            if (ready < 0) {
                continue;
            }
            if (waiting[0].revents == 0) { // then all is read
                return ChildEnd::crashed;
            }
            if (!readBlock()) {
                waiting[0].fd = -1; // is polled no more
            }
        }
        return ChildEnd::finished;
    }

private:
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
            take(pending_.substr(begin, end - begin));
        }
        pending_.erase(0, begin);
        return size != 0;
    }

    void take(const std::string& line) {
        if (!line.empty() && line.front() == finishedMark) {
            isFinished_ = true;
        } else {
            receive_(line);
        }
    }

    int descriptor_;
    int process_;
    const std::function<void(const std::string&)>& receive_;
    std::string pending_;
    bool isFinished_ = false;
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

ChildResult runInChild(const std::function<void(ChildOutput&)>& task,
                       const std::function<void(const std::string&)>& receive,
                       std::chrono::milliseconds timeout) {
    std::array<int, 2> ends{};
    if (::pipe2(ends.data(), O_CLOEXEC) != 0) {
        fail("pipe");
    }
    const Descriptor input(ends[0]);
    Descriptor output(ends[1]);
    const pid_t parent = ::getpid();
    const pid_t id = ::fork();
    if (id < 0) {
        fail("fork");
    }
    if (id == 0) {
        live(task, output.get(), parent);
    }
    Process child(id);
    output.close();
    const Descriptor process(static_cast<int>(::syscall(SYS_pidfd_open, id, 0)));
    if (process.get() < 0) {
        fail("pidfd_open");
    }
    const ChildEnd end = Reader(input.get(), process.get(), receive).read(timeout);
    if (end == ChildEnd::crashed) {
        return {end, wordsOf(child.end())};
    }
    return {end, ""};
}

} // namespace oxahv::runner
