// Counts the texts that a provider loses because the locale cannot convert them.
#pragma once

#include <cstddef>

namespace oxahv::runner {

// Takes the logger's sink for it, from now on.
void countLostTexts();

// How many there were since the last call. Thread-safe.
std::size_t takeLostTexts();

} // namespace oxahv::runner
