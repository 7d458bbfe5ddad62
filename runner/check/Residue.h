// What a provider leaves in the process of its server: after its requests, and after its end.
#pragma once

#include "check/Client.h"

#include <functional>

namespace oxahv::runner {

// Loads the provider by `load`, sends the known queries, one of each shape, again and again, ends the
// provider by `unload`, and looks at the process after each step. Takes the standard output meanwhile.
void findResidue(Client& client, const std::function<void()>& load, const std::function<void()>& unload);

} // namespace oxahv::runner
