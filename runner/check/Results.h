// Checks single results and lists of results, whatever request yielded them.
#pragma once

#include "check/Client.h"

#include <string>
#include <vector>

namespace oxahv::runner {

// Looks at one result of a query for `className`: class, keys, texts. An empty name: any class.
void checkResult(Client& client, const std::string& request, const Result& result,
                 const std::string& className);

// Reports paths that stand twice.
void checkDuplicates(Client& client, const std::string& request, const std::vector<Result>& results);

// What only one of two lists holds: "only among WHAT: PATH", empty if nothing.
std::string differenceOf(const std::vector<Result>& first, const std::string& firstName,
                         const std::vector<Result>& second, const std::string& secondName);

// Looks at what a method yielded.
void checkMethodResult(Client& client, const Query& query, const Answer& answer);

// Whether a provider may answer so to say that it does not do such a thing.
bool isRefusal(CMPIrc code);

} // namespace oxahv::runner
