#include "check/CrashLine.h"

#include "show/Text.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <csignal>
#include <cstring>
#include <initializer_list>
#include <mutex>
#include <unistd.h>

namespace oxahv::runner {

namespace {

// What a signal handler may read: no line is longer.
std::array<char, 512> unserved;
std::atomic<std::size_t> unservedSize{0};
std::array<char, 512> crashed; // the request, written before the handler is there
std::size_t crashedSize = 0;

// A line that cannot be written is lost: the process is at its end.
void write(const char* text, std::size_t size) {
    [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, text, size);
}

const char* nameOf(int number) {
    switch (number) {
    case SIGSEGV:
        return "segmentation fault";
    case SIGABRT:
        return "aborted";
    case SIGBUS:
        return "bus error";
    case SIGFPE:
        return "arithmetic error";
    default:
        return "illegal instruction";
    }
}

void tell(int number) {
    constexpr const char* begin = "oxahv-provider: the provider crashed: ";
    write(begin, std::strlen(begin));
    const std::array<char, 2> digits = {static_cast<char>('0' + number / 10),
                                        static_cast<char>('0' + number % 10)};
    write("signal ", std::strlen("signal "));
    write(number < 10 ? &digits[1] : digits.data(), number < 10 ? 1 : 2);
    write(" (", 2);
    write(nameOf(number), std::strlen(nameOf(number)));
    write(")", 1);
    write(crashed.data(), crashedSize);
    write(unserved.data(), unservedSize.load());
    write("\n", 1);
    ::_exit(1);
}

void noteUnserved(const std::string& className) {
    static std::mutex mutex;
    const std::lock_guard<std::mutex> lock(mutex);
    const std::string words = " after " + printable(unservedWords(className), unserved.size() / 2);
    unservedSize = 0;
    const std::size_t size = std::min(words.size(), unserved.size());
    std::copy_n(words.begin(), size, unserved.begin());
    unservedSize = size;
}

} // namespace

std::string unservedWords(const std::string& className) {
    return "it asked for class " + className +
           ", which no loaded library serves; load that one too, with a further --library";
}

// An overflow of the stack leaves no room on it. A handler that is there already, a sanitizer's, says more.
void tellCrashesInOneLine(EmbeddedBroker& broker, const std::string& request) {
    const std::string words = request.empty() ? "" : " in " + printable(request, crashed.size() / 4);
    crashedSize = std::min(words.size(), crashed.size());
    std::copy_n(words.begin(), crashedSize, crashed.begin());
    static std::array<char, 65536> stack;
    stack_t own = {};
    own.ss_sp = stack.data();
    own.ss_size = stack.size();
    ::sigaltstack(&own, nullptr);
    for (const int number : {SIGSEGV, SIGABRT, SIGBUS, SIGFPE, SIGILL}) {
        struct sigaction action = {};
        ::sigaction(number, nullptr, &action);
        if (action.sa_handler == SIG_DFL) {
            action.sa_handler = tell;
            action.sa_flags = static_cast<int>(SA_ONSTACK | SA_RESETHAND | SA_NODEFER);
            ::sigaction(number, &action, nullptr);
        }
    }
    broker.setUnservedHandler(noteUnserved);
}

} // namespace oxahv::runner
