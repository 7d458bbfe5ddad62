// Calls the methods that the user named with arguments that they should refuse.
#pragma once

#include "check/Client.h"

namespace oxahv::runner {

// Each argument missing, NULL, and outside of what its qualifiers allow. A success is a finding where the
// declaration forbids the argument; a missing one it forbids by the qualifier Required.
void callWithWrongArguments(Client& client, const std::string& target, const MethodCall& call);

// The arguments as values of other types, which a server that checks types does not let through. For a broker
// without declarations, to which `declared` gives the parameters.
void callWithWrongTypes(Client& client, const EmbeddedBroker& declared, const std::string& target,
                        const MethodCall& call);

} // namespace oxahv::runner
