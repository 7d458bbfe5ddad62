// `oxahv-provider new`: the first draft of a provider, as a project that can be built and tested.
#pragma once

#include "Options.h"

#include <functional>
#include <string>
#include <vector>

namespace oxahv::runner {

struct DraftOptions {
    std::vector<std::string> classes;
    std::string provider; // the MI name; empty: after the first class
    std::string folder;
};

// Writes the project, and the names of its files on the standard output. Returns the exit status; throws
// std::runtime_error, one line, when it has written nothing.
int runNew(const Options& options, const DraftOptions& draftOptions);

// The verb `new`: declares its options on the command line, and returns what runs it.
std::function<int(const Options&)> declareNew(CLI::App& command);

} // namespace oxahv::runner
