// The queries of a class again, under harder conditions: from several threads at once, and with each of the
// broker's calls failing.
#pragma once

#include "check/Client.h"

namespace oxahv::runner {

// Compares the answers about single instances with those that come when the broker delivers their paths as
// they are.
void strainByConduct(Client& client);

// Compares what several threads at once get with what one got before and after. What changes from one time to
// the next by itself, such as the free memory, is left out.
void strainByThreads(Client& client);

// Lets each call fail that the provider makes of the broker in turn, of each slot the first hundred ones and
// the last, for one query of each shape. The answer may be anything that a code stands for.
void strainByFaults(Client& client);

} // namespace oxahv::runner
