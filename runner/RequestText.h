// A request as the command line takes it.
#pragma once

#include "Operations.h"

#include <string>

namespace oxahv::runner {

// The verb and its operands, as the shell takes them after the command's options.
std::string requestText(const Operation& operation, const Operands& operands);

} // namespace oxahv::runner
