// The object that a draft serves until its author knows better, so that it can be asked for something.
#pragma once

#include "drafts/Model.h"

#include <string>
#include <vector>

namespace oxahv::runner {

// The statements that make an example of the class and return it; none when there can be none, since the
// class has a reference to what the provider does not serve.
std::vector<std::string> exampleOf(const EmbeddedBroker& broker, const DraftProvider& provider,
                                   const DraftClass& drafted);

} // namespace oxahv::runner
