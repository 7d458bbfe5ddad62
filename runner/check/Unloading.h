// Whether a library that was unloaded is gone, and what keeps one that is not.
#pragma once

#include <string>

namespace oxahv::runner {

// Empty once the library is unmapped; otherwise a sentence that explains why it still is mapped. Reads ELF
// files of this machine.
std::string whyStillMapped(const std::string& library);

} // namespace oxahv::runner
