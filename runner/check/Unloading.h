// Whether a library that was unloaded is gone, and what keeps one that is not.
#pragma once

#include <string>

// Empty when the library is mapped no more; else why it is, for a person. Knows ELF files of this machine.
std::string whyStillMapped(const std::string& library);
