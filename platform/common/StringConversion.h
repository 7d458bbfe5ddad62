/**
 * @file
 * Texts of the agent.
 *
 * **Threads.** Everything here may be called from any thread at any time.
 */
#pragma once

#include "TKExport.h"

#include <ostream>
#include <string>

namespace TK {

/**
 * Writes a text to a stream, with the stream's width and fill, as the standard library does.
 * @return the stream.
 */
TK_EXPORT std::ostream& operator<<(std::ostream& stream, const std::string& text);

} // namespace TK
