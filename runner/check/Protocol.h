// What goes over the pipe from a check's child to its parent: one message a line.
#pragma once

#include "check/Findings.h"

#include <cstddef>
#include <string>

namespace oxahv::runner {

// Messages of the child, as its parent reads them.
struct Message {
    enum class Kind { begin, end, finding, classServed, classRefused, unserved, unusable };
    Kind kind = Kind::begin;
    std::size_t number = 0; // of a query; of a class that is served, its instances
    std::string text; // of a query; of a refusal, the answer; the class of an upcall that found no provider;
                      // of what makes the check impossible, why
    Finding finding{};
};
std::string lineOf(const Message& message);
Message messageOf(const std::string& line);

} // namespace oxahv::runner
