// A call of a provider's function. What the function throws ends here, since a provider must not take its
// server along.
#pragma once

#include "objects/Records.h"

#include <exception>
#include <string>
#include <thread>

namespace oxahv {

// What came of a call.
struct Outcome {
    CMPIrc code = CMPI_RC_OK;
    std::string message; // the status's text, or what was thrown
    bool isThrown = false;
};

// The same as words for a person.
inline std::string wordsOf(const Outcome& outcome) {
    return codeName(outcome.code) + (outcome.message.empty() ? "" : ": " + outcome.message);
}

// Calls a function that returns a CMPIStatus. Throws std::bad_alloc where there is no room for the message.
template <class Function>
Outcome callProvider(const Function& function) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    try {
        status = function();
    } catch (const std::exception& exception) {
        return {CMPI_RC_ERR_FAILED, std::string("exception: ") + exception.what(), true};
    } catch (...) {
        passOnTheEndOfAThread();
        return {CMPI_RC_ERR_FAILED, "exception of an unknown kind", true};
    }
    const String* const text = String::of(status.msg);
    return {status.rc, text != nullptr ? text->text : std::string()};
}

// Runs calls that may end their thread on one of their own: the broker makes them in destructors, which no
// thread's end can leave.
template <class Function>
void runOnThread(const Function& function) {
    std::thread thread;
    try {
        thread = std::thread(function);
    } catch (const std::exception&) { // no memory, or too many threads
        function();
        return;
    }
    thread.join();
}

} // namespace oxahv
