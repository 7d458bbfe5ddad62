// Object paths and single values, read from the texts that a person writes.
#pragma once

#include "objects/Records.h"

#include <memory>
#include <string>

namespace oxahv {

// What Request::objectPathFromText and Request::valueFromText read; both throw BrokerError with the column.
std::unique_ptr<ObjectPath> readPath(Core& core, const std::string& text, const std::string& nameSpace);
Value readValue(Core& core, const std::string& text, CMPIType type);

} // namespace oxahv
