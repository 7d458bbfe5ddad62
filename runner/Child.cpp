#include "Child.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <system_error>
#include <unistd.h>

namespace {

constexpr char finishedMark = '.'; // no message begins with it

[[noreturn]] void fail(const char* what) {
    throw std::system_error(errno, std::generic_category(), what);
}

// An exception must not unwind into what the parent was doing.
[[noreturn]] void live(const std::function<void(ChildOutput&)>& task, int output, pid_t parent) noexcept {
    // The child must not outlive a parent that is killed, however early.
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

// Kills and reaps the child, whatever happens to its parent.
class Process {
public:
    explicit Process(pid_t id) : id_(id) {}
    ~Process() {
        if (id_ > 0) {
            ::kill(id_, SIGKILL);
            wait();
        }
    }
    Process(const Process&) = delete;
    Process& operator=(const Process&) = delete;

    int wait() {
        int status = 0;
        while (::waitpid(id_, &status, 0) < 0 && errno == EINTR) {
        }
        id_ = -1;
        return status;
    }

private:
    pid_t id_;
};

class Descriptor {
public:
    explicit Descriptor(int number) : number_(number) {}
    ~Descriptor() { close(); }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;
    int get() const { return number_; }
    void close() {
        if (number_ >= 0) {
            ::close(number_);
            number_ = -1;
        }
    }

private:
    int number_;
};

std::string wordsOf(int status) {
    if (WIFSIGNALED(status)) {
        const int number = WTERMSIG(status);
        return "killed by signal " + std::to_string(number) + " (" + ::strsignal(number) + ')';
    }
    return "exit status " + std::to_string(WEXITSTATUS(status));
}

// Reads lines until the mark, the end of the child, or silence.
class Reader {
public:
    Reader(int descriptor, const std::function<void(const std::string&)>& receive)
        : descriptor_(descriptor), receive_(receive) {}

    ChildEnd read(std::chrono::milliseconds timeout) {
        while (!isFinished_) {
            pollfd waiting = {descriptor_, POLLIN, 0};
            const int ready = ::poll(&waiting, 1, static_cast<int>(timeout.count()));
            if (ready == 0) {
                return ChildEnd::hung;
            }
            if (ready < 0 && errno != EINTR) {
                fail("poll");
            }
            if (ready > 0 && !readBlock()) {
                return ChildEnd::crashed;
            }
        }
        return ChildEnd::finished;
    }

private:
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
    const ChildEnd end = Reader(input.get(), receive).read(timeout);
    if (end == ChildEnd::crashed) {
        return {end, wordsOf(child.wait())};
    }
    return {end, ""};
}
