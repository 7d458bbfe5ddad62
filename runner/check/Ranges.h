// What the qualifiers MinValue, MaxValue, MaxLen and ValueMap allow, and what they do not.
#pragma once

#include "check/Answer.h"

#include <EmbeddedBroker.h>

#include <string>
#include <vector>

namespace oxahv::runner {

// Why the qualifiers do not allow the value, such as "7 is more than MaxValue 5"; empty when they do.
std::string rangeComplaint(const Qualifiers& qualifiers, const PlainData& data);

// A value that its type allows and the qualifiers do not.
struct OutsideValue {
    std::string text; // as the command line takes it
    std::string complaint;
};

// One for each qualifier that forbids something.
std::vector<OutsideValue> valuesOutside(CMPIType type, const Qualifiers& qualifiers);

} // namespace oxahv::runner
