// The passes of a check, and what the child does in each of them.
#pragma once

#include "check/Client.h"

#include <string>
#include <vector>

namespace oxahv::runner {

struct Pass {
    const char* name;
    Conduct conduct;
    // Sends everything that clients send. A pass without takes the queries of the first one.
    bool examines;
    void (*strain)(Client& client); // what else is done; null: nothing
};

// In their order. The first one is as most servers do it.
const std::vector<Pass>& passes();

// Those that come after them, of which a check calls for each its own function.
constexpr const char* argumentsPass = "argument types";
constexpr const char* residuePass = "residue";
constexpr const char* unloadingPass = "unloading";

// The names under which the child does what is no query.
constexpr const char* loading = "loading the provider";
constexpr const char* cleaningUp = "the provider's cleanup";

void runPass(EmbeddedBroker& broker, const Options& options, const CheckTask& task, const Pass& pass,
             ChildOutput& output);

// Calls the task's methods with arguments of other types, in a broker that does not know the declarations.
void runArguments(const EmbeddedBroker& declared, const Options& options, const CheckTask& task,
                  ChildOutput& output);

// Looks for what the provider leaves in its process.
void runResidue(EmbeddedBroker& broker, const Options& options, const CheckTask& task, ChildOutput& output);

// Sends a few requests, unloads the libraries and looks whether they are gone.
void runUnloading(EmbeddedBroker& broker, const Options& options, const CheckTask& task,
                  const std::vector<std::string>& classes, ChildOutput& output);

} // namespace oxahv::runner
