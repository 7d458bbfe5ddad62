// The way of the instances in MOF texts into the repository.
#pragma once

#include "mof/MofCompiler.h"

#include <vector>

namespace oxahv {

// Keeps instances, and their classes from now on: all of them or, when it throws BrokerError, none.
void keepInstances(Core& core, std::vector<MofCompiler::WrittenInstance>& written);

} // namespace oxahv
