// The logger: what a program has set, and the sinks that write lines.
#include "HVLogger.h"

#include <Descriptor.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <csignal>
#include <fcntl.h>
#include <map>
#include <memory>
#include <mutex>
#include <new>
#include <pthread.h>
#include <sys/stat.h>
#include <system_error>
#include <unistd.h>

namespace HVLog {

namespace {

// What a program has set. Whoever changes it holds both locks, so that either is enough to read it.
struct Settings {
    std::mutex sinkMutex;   // held while a sink runs: one thread at a time
    std::mutex changeMutex; // held for moments and never while a sink runs, so that a fork can wait for it
    std::function<void(const Message&)> sink;
    int threshold = HVLogger::off;
    std::map<int, bool> exceptions; // level code -> written, whatever the threshold says
};

Settings& settings();

// Set while this thread runs the sink.
thread_local bool insideSink = false;

// A child has the locks that other threads of its parent held, and not those threads. A fork waits until the
// settings are whole, but not for a sink, which may itself wait for the thread that forks; the child gets a
// new lock for the sink, unless its own thread holds the old one.
void beforeFork() {
    settings().changeMutex.lock();
}
void afterForkInParent() {
    settings().changeMutex.unlock();
}
void afterForkInChild() {
    Settings& now = settings();
    now.changeMutex.unlock();
    if (!insideSink) {
        new (&now.sinkMutex) std::mutex;
    }
}

// Lives for ever: other libraries log while the process ends, after static objects are gone. The C library
// drops the handlers when this library is unloaded.
Settings& settings() {
    static auto* const instance = [] {
        auto* const created = new Settings;
        ::pthread_atfork(beforeFork, afterForkInParent, afterForkInChild);
        return created;
    }();
    return *instance;
}

// The lowest level code that can be written at all. It is read without the lock, so that a message below it
// costs nothing; the rest is looked up under the lock.
std::atomic<int> lowestWritten{HVLogger::off};

void publishLowest(const Settings& now) {
    int lowest = now.sink ? now.threshold : HVLogger::off;
    if (now.sink) {
        for (const auto& [level, written] : now.exceptions) {
            if (written) {
                lowest = std::min(lowest, level);
            }
        }
    }
    lowestWritten.store(lowest, std::memory_order_relaxed);
}

bool isWritten(const Settings& now, int level) {
    const auto exception = now.exceptions.find(level);
    if (exception != now.exceptions.end()) {
        return exception->second;
    }
    return now.threshold != HVLogger::off && level >= now.threshold;
}

void dispatch(const Message& message) {
    if (insideSink) {
        return;
    }
    Settings& now = settings();
    const std::lock_guard<std::mutex> lock(now.sinkMutex);
    if (!now.sink || !isWritten(now, message.level)) {
        return;
    }
    struct InsideSink {
        InsideSink() { insideSink = true; }
        ~InsideSink() { insideSink = false; }
    } const inside;
    now.sink(message);
}

template <class Change>
void change(Change&& apply) {
    Settings& now = settings();
    const std::scoped_lock locks(now.sinkMutex, now.changeMutex);
    apply(now);
    publishLowest(now);
}

// Keeps the signals of a failed write from a thread. A closed pipe and a file that has reached its limit
// would end the process, although a log that cannot be written must not fail a request.
class WithoutWriteSignals {
public:
    WithoutWriteSignals() {
        ::sigemptyset(&signals_);
        ::sigaddset(&signals_, SIGPIPE);
        ::sigaddset(&signals_, SIGXFSZ);
        ::sigpending(&pending_);
        ::pthread_sigmask(SIG_BLOCK, &signals_, &earlierMask_);
    }
    ~WithoutWriteSignals() { ::pthread_sigmask(SIG_SETMASK, &earlierMask_, nullptr); }
    WithoutWriteSignals(const WithoutWriteSignals&) = delete;
    WithoutWriteSignals& operator=(const WithoutWriteSignals&) = delete;

    // Takes the signal of a write that has failed with `error`, unless it was waiting before.
    void take(int error) const {
        const int number = error == EPIPE ? SIGPIPE : SIGXFSZ;
        if ((error == EPIPE || error == EFBIG) && ::sigismember(&pending_, number) == 0) {
            ::sigset_t one;
            ::sigemptyset(&one);
            ::sigaddset(&one, number);
            const ::timespec noTime{};
            ::sigtimedwait(&one, nullptr, &noTime);
        }
    }

private:
    ::sigset_t signals_{};
    ::sigset_t pending_{};
    ::sigset_t earlierMask_{};
};

// Writes lines to an open file. Each is one write, so that lines of several processes in one file stay apart.
class LineWriter {
public:
    LineWriter(int descriptor, bool isLineOpen) : descriptor_(descriptor), isLineOpen_(isLineOpen) {}

    void write(std::string line) {
        line += '\n';
        if (isLineOpen_) {
            line.insert(line.begin(), '\n');
        }
        const WithoutWriteSignals guard;
        for (std::size_t begin = 0; begin < line.size();) {
            const ssize_t written = ::write(descriptor_, &line[begin], line.size() - begin);
            if (written > 0) {
                begin += static_cast<std::size_t>(written);
                isLineOpen_ = line[begin - 1] != '\n';
            } else if (written == 0 || errno != EINTR) {
                guard.take(written == 0 ? 0 : errno);
                return;
            }
        }
    }

private:
    int descriptor_;
    bool isLineOpen_; // the last line was cut, as on a full disk
};

// Whether a file ends in the middle of a line. One that cannot be read, or is no regular file, is taken to be
// whole.
bool endsInsideLine(const std::string& path) {
    struct stat status {};
    if (::stat(path.c_str(), &status) != 0 || !S_ISREG(status.st_mode) || status.st_size == 0) {
        return false;
    }
    const files::Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    char last = '\n';
    return ::pread(file.get(), &last, 1, status.st_size - 1) == 1 && last != '\n';
}

int openLog(const std::string& path) {
    const int file = ::open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, 0640);
    if (file < 0) {
        const int error = errno;
        throw std::system_error(error, std::generic_category(), "cannot open log file '" + path + "'");
    }
    return file;
}

// A log file, shared by the copies of its sink.
struct LogFile {
    explicit LogFile(const std::string& path)
        : file(openLog(path)), lines(file.get(), endsInsideLine(path)) {}

    files::Descriptor file;
    LineWriter lines;
};

} // namespace

void HVLogger::logLevelMessage(const char* function, const char* file, int line, const std::string& category,
                               int level, char* /*reserved*/, int /*reserved1*/, int /*reserved2*/,
                               const std::string& text) {
    if (level >= lowestWritten.load(std::memory_order_relaxed)) {
        dispatch({Channel::log, function, file, line, category, level, text});
    }
}

void HVLogger::traceLevelMessage(const char* function, const char* file, int line,
                                 const std::string& category, int level, char* /*reserved*/,
                                 int /*reserved1*/, int /*reserved2*/, const std::string& text) {
    if (level >= lowestWritten.load(std::memory_order_relaxed)) {
        dispatch({Channel::trace, function, file, line, category, level, text});
    }
}

void HVLogger::setSink(std::function<void(const Message&)> sink) {
    change([&](Settings& now) { now.sink.swap(sink); });
}

void HVLogger::setStderrSink() {
    setSink([lines = LineWriter(STDERR_FILENO, false)](const Message& message) mutable {
        lines.write(lineOf(message));
    });
}

void HVLogger::setFileSink(const std::string& path) {
    const auto log = std::make_shared<LogFile>(path);
    setSink([log](const Message& message) { log->lines.write(lineOf(message)); });
}

void HVLogger::setThreshold(int level) {
    change([&](Settings& now) { now.threshold = level; });
}

void HVLogger::setLevel(int level, bool written) {
    change([&](Settings& now) { now.exceptions[level] = written; });
}

void HVLogger::reset() {
    std::function<void(const Message&)> sink;
    change([&](Settings& now) {
        now.sink.swap(sink);
        now.threshold = off;
        now.exceptions.clear();
    });
}

std::string HVLogger::lineOf(const Message& message) {
    std::string line = message.channel == Channel::log ? "log " : "trace ";
    line += std::to_string(message.level);
    line += ' ';
    line += message.category;
    line += ' ';
    line += message.text;
    std::replace_if(
        line.begin(), line.end(), [](char c) { return static_cast<unsigned char>(c) < 0x20; }, ' ');
    return line;
}

} // namespace HVLog
