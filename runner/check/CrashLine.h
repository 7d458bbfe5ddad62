// Reports a crash of the provider in a plain request. The crash ends this process, so its signal handler
// writes the report, which is one line.
#pragma once

#include <EmbeddedBroker.h>

#include <string>

namespace oxahv::runner {

// From now on a crash of this process writes one line on the standard error stream, with the signal and the
// request, and ends it with status 1: ended by a signal, the shell would add a line of its own. An empty
// request is not named. Takes the broker's handler of upcalls that find no provider: what a provider does not
// expect of those is the likeliest cause.
void tellCrashesInOneLine(EmbeddedBroker& broker, const std::string& request = "");

// What an upcall for the class has to do with a crash.
std::string unservedWords(const std::string& className);

} // namespace oxahv::runner
