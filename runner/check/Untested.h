// What a check has not tried, so that nobody takes its silence for an approval.
#pragma once

#include "check/Report.h"

#include <EmbeddedBroker.h>

#include <string>
#include <vector>

namespace oxahv::runner {

// Sentences, in the order of the report's classes. `methods` are those that were called, as Class.Method;
// `sample` is how many instances of a class were asked for.
std::vector<std::string> untestedBy(const EmbeddedBroker& broker, const CheckReport& report,
                                    const std::vector<std::string>& methods, std::size_t sample, bool writes);

} // namespace oxahv::runner
