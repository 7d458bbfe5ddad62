#include "serve/Signals.h"

#include <cerrno>
#include <csignal>
#include <fcntl.h>
#include <poll.h>
#include <stdexcept>
#include <unistd.h>

namespace oxahv::runner {

namespace {

// A handler may write, and little else. A blocked signal with a thread that waits for it would do as well,
// but the programs that a provider starts would inherit the block.
int ends[2] = {-1, -1};

void handle(int /*number*/) {
    const int error = errno;
    const char byte = 0;
    if (::write(ends[1], &byte, 1) < 0) {
        // full: the wish is there already
    }
    errno = error;
}

void setHandlers(void (*handler)(int)) {
    struct sigaction action = {};
    action.sa_handler = handler;
    action.sa_flags = SA_RESTART | static_cast<int>(SA_RESETHAND);
    ::sigaction(SIGINT, &action, nullptr);
    ::sigaction(SIGTERM, &action, nullptr);
}

} // namespace

EndingSignals::EndingSignals() {
    if (::pipe2(ends, O_CLOEXEC | O_NONBLOCK) != 0) {
        throw std::runtime_error("cannot make a pipe");
    }
    setHandlers(handle);
}

EndingSignals::~EndingSignals() {
    setHandlers(SIG_DFL);
    ::close(ends[0]);
    ::close(ends[1]);
}

bool EndingSignals::wait(std::chrono::milliseconds time) const {
    pollfd readable = {ends[0], POLLIN, 0};
    return ::poll(&readable, 1, static_cast<int>(time.count())) == 1;
}

} // namespace oxahv::runner
