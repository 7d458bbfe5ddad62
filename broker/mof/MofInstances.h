// Instances of the broker, from those in a MOF text.
#pragma once

#include "mof/MofParser.h"
#include "objects/Records.h"

#include <memory>
#include <string>

namespace oxahv {

// The instance with its path, whose keys its properties are. Properties that it does not name have their
// declared defaults, or are NULL. Values of properties that embed instances are instances, or texts of them.
// Throws BrokerError at what its class does not have.
std::unique_ptr<Instance> instanceOf(Core& core, const MofSource& source, const MofInstance& written,
                                     const std::string& nameSpace);

// The same of a text that is one instance.
std::unique_ptr<Instance> readInstance(Core& core, const MofSource& source, const std::string& nameSpace);

} // namespace oxahv
