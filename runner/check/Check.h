// The check of a provider: which classes in which passes, each in a child process.
#pragma once

#include "Options.h"

#include <functional>
#include <string>
#include <vector>

namespace oxahv::runner {

struct CheckOptions {
    std::vector<std::string> classes; // empty: all concrete ones
    std::vector<std::string> methods; // CLASS.METHOD name=value ...
    unsigned int threads = 4;
    unsigned int timeoutSeconds = 30; // for one request
    unsigned int repetitions = 1;     // of the threads' requests
    bool isExhaustive = false;        // whether all instances are asked for by name
    bool isStrict = false;            // whether what was not tested is a finding
    bool writes = false;              // whether instances are created, changed and deleted
};

// Checks the provider and prints the report on the standard output. Returns the exit status, 1 when anything
// is found; throws BrokerError for what makes the check impossible.
int runCheck(const Options& options, const CheckOptions& checkOptions);

// The verb `check`: declares its options on the command line, and returns what runs it.
std::function<int(const Options&)> declareCheck(CLI::App& command);

} // namespace oxahv::runner
