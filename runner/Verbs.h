// The table of the command's verbs: one row for each, whatever it does.
#pragma once

#include "Options.h"

#include <functional>
#include <vector>

namespace oxahv::runner {

// Does what the verb says. Returns the exit status; throws std::exception for what makes it impossible.
using Action = std::function<int(const Options&)>;

struct Verb {
    const char* name;
    const char* help;  // its operands and what it does
    bool needsLibrary; // whether a command line without --library is refused
    // Declares operands, options and footer on the verb's part of the command line, which is read before the
    // action is called and outlives it.
    std::function<Action(CLI::App& command)> declare;
};

// In the order in which the help shows them.
const std::vector<Verb>& verbs();

} // namespace oxahv::runner
