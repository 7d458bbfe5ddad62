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

// Of queries that go the same way through a provider, and were answered alike, the first.
std::vector<KnownQuery> oneOfEachShape(const std::vector<KnownQuery>& known);

// Lets each call fail that the provider makes of the broker in turn, of each slot the first two for a name
// and the last, for one query of each shape. The answer may be any code but OK, or the one without failing
// call.
void strainByFaults(Client& client);

} // namespace oxahv::runner
