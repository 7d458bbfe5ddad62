// The verb watch, which subscribes for indications and prints them.
#pragma once

#include "Verbs.h"

namespace oxahv::runner {

// Declares the verb's operands; the action prints what is delivered until Ctrl-C or the last that is asked
// for.
Action declareWatch(CLI::App& command);

} // namespace oxahv::runner
