// A getInstance by the kit, and the same one in a function table written by hand.
#pragma once

#include "TKExport.h"

namespace kit {

/** Serves the thin broker's path through the kit's function table. */
TK_EXPORT void serveByKit();
/** The same through a table written by hand, with the library. */
TK_EXPORT void serveByHand();

} // namespace kit
