// One request of a check, and how it is sent.
#pragma once

#include "Runner.h"
#include "check/Answer.h"

#include <string>
#include <vector>

namespace oxahv::runner {

struct Query {
    const Operation* operation;
    Operands operands;
};

// A query of the verb of that name.
Query queryOf(const std::string& verb, Operands operands);
Query queryOf(const std::string& verb, const std::string& target);

// The verb and its operands, as the shell takes them behind the command's options.
std::string textOf(const Query& query);

// What a query without the values of its operands is: queries of one shape go the same way through a
// provider.
std::string shapeOf(const Query& query);

// A query that the provider has answered before, in another process.
struct KnownQuery {
    Query query;
    CMPIrc code = CMPI_RC_OK;
    bool leavesObjects = false;
};

// A slot's call that fails: the `--fault` of the command line.
struct FailingCall {
    std::string slot;
    unsigned int number = 1;
    std::string name{}; // of the property, key or argument that the call is about; empty for other calls
};

// "gi with CMPIInstanceFT.setProperty of Speed failing", and without the name and what follows.
std::string wordsOf(const Query& query, const FailingCall& failing);
std::string groupOf(const Query& query, const FailingCall& failing);

// A slot's call that the provider made. The number counts all calls of the slot from the request's beginning.
struct ProviderCall {
    Call call;
    unsigned int number = 1;
};

// Sends the query. Throws BrokerError when it cannot be sent. Thread-safe without a failing call.
Answer send(EmbeddedBroker& broker, const Options& options, const Query& query,
            const FailingCall* failing = nullptr);

// The same, and notes the calls of slots. For one thread at a time.
Answer sendRecorded(EmbeddedBroker& broker, const Options& options, const Query& query,
                    std::vector<ProviderCall>& calls);

} // namespace oxahv::runner
