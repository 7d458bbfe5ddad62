#include "HVLogger.h"

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <fcntl.h>
#include <map>
#include <memory>
#include <mutex>
#include <system_error>
#include <unistd.h>

namespace HVLog {

namespace {

// What a program has set. The lock also keeps the sink to one thread at a time.
struct Settings {
    std::mutex mutex;
    std::function<void(const Message&)> sink;
    int threshold = HVLogger::off;
    std::map<int, bool> exceptions; // level code -> written, whatever the threshold says
};

// Lives for ever: other libraries log while the process ends, after static objects are gone.
Settings& settings() {
    static auto* const instance = new Settings;
    return *instance;
}

// The lowest level code that can be written at all. It is read without the lock, so that a message below it
// costs nothing; the rest is looked up under the lock.
std::atomic<int> lowestWritten{HVLogger::off};

// Set while this thread runs the sink.
thread_local bool insideSink = false;

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
    const std::lock_guard<std::mutex> lock(now.mutex);
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
    const std::lock_guard<std::mutex> lock(now.mutex);
    apply(now);
    publishLowest(now);
}

// Writes one whole line, so that lines of several processes in one file stay apart too.
void writeLine(int descriptor, std::string line) {
    line += '\n';
    const char* rest = line.data();
    std::size_t size = line.size();
    while (size > 0) {
        const ssize_t written = ::write(descriptor, rest, size);
        if (written < 0) {
            if (errno == EINTR) {
                continue;
            }
            return; // a log that cannot be written stops nobody's request
        }
        rest += written;
        size -= static_cast<std::size_t>(written);
    }
}

// Closes what it holds when the last copy of a sink goes.
struct OpenFile {
    OpenFile() = default;
    ~OpenFile() {
        if (descriptor >= 0) {
            ::close(descriptor);
        }
    }
    OpenFile(const OpenFile&) = delete;
    OpenFile& operator=(const OpenFile&) = delete;

    int descriptor = -1;
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
    setSink([](const Message& message) { writeLine(STDERR_FILENO, lineOf(message)); });
}

void HVLogger::setFileSink(const std::string& path) {
    const auto file = std::make_shared<OpenFile>();
    file->descriptor = ::open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, 0640);
    if (file->descriptor < 0) {
        const int error = errno;
        throw std::system_error(error, std::generic_category(), "cannot open log file '" + path + "'");
    }
    setSink([file](const Message& message) { writeLine(file->descriptor, lineOf(message)); });
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
