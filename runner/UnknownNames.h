// Names in a request's operands that the MOF files do not declare.
#pragma once

#include "Operations.h"

#include <EmbeddedBroker.h>

#include <string>
#include <vector>

namespace oxahv::runner {

// A sentence for each property of the list and each class of the filter that is not declared. A client may
// send such a request, and a provider answers it; most often the name is misspelt. None without declarations.
std::vector<std::string> unknownNames(const EmbeddedBroker& broker, const std::string& className,
                                      const Operands& operands);

} // namespace oxahv::runner
