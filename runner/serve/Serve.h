// The verb serve: a front for CIM clients.
#pragma once

#include <functional>

namespace CLI {
class App;
}

namespace oxahv::runner {

struct Options;

// Declares the verb's options on its part of the command line, and returns what it does.
std::function<int(const Options&)> declareServe(CLI::App& command);

} // namespace oxahv::runner
