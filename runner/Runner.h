// Performs one request on a provider.
#pragma once

#include "Operations.h"
#include "Options.h"

#include <EmbeddedBroker.h>

namespace oxahv::runner {

// Puts the conduct on the broker, from the next request on.
void apply(EmbeddedBroker& broker, const Conduct& conduct);

// The path that the operation is about. Throws BrokerError for a text that is none.
CMPIObjectPath* targetOf(Request& request, const Options& options, const Operation& operation,
                         const Operands& operands);

// Gives the broker the classes and the context entries. Throws BrokerError.
void prepare(EmbeddedBroker& broker, const Options& options);

// Loads the providers. Throws BrokerError.
void loadProviders(EmbeddedBroker& broker, const Options& options);

// Loads the provider and performs the operation. Prints results on the standard output and errors on the
// standard error stream. Returns the exit status; throws BrokerError for what keeps the request from being
// sent.
int run(const Options& options, const Operation& operation, const Operands& operands);

} // namespace oxahv::runner
