// The C++ of a draft.
#pragma once

#include "drafts/Model.h"

#include <string>

namespace oxahv::runner {

// The header with the structs.
std::string classesHeader(const DraftProvider& provider);

// The provider itself. `broker` knows which class derives from which.
std::string providerSource(const EmbeddedBroker& broker, const DraftProvider& provider);

} // namespace oxahv::runner
