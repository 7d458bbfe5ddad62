// A method's arguments, from the words of a command line.
#pragma once

#include <EmbeddedBroker.h>

#include <string>
#include <vector>

namespace oxahv::runner {

// The input arguments that texts of the form name=value stand for. The declaration of the path's class, if
// there is one, says which there are and of what type; of an array, each name=value adds one element. Without
// declaration a value is what it looks like. Throws BrokerError, one line, for what does not fit.
CMPIArgs* argumentsFrom(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* path,
                        const std::string& method, const std::vector<std::string>& texts);

} // namespace oxahv::runner
