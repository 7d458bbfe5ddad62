// What goes over the pipe from a check's child to its parent: one message a line.
#pragma once

#include "check/Findings.h"
#include "check/Query.h"

#include <cstddef>
#include <string>

namespace oxahv::runner {

struct Message {
    enum class Kind {
        begin,        // of what is done under a name, before it is done
        end,          // of the same; without it the parent knows what was at work when the process ended
        finding,      // something is wrong
        classServed,  // with the number of its instances
        classRefused, // with the answer
        unserved,     // an upcall for a class that no provider serves
        unusable,     // what makes the check impossible
        asked,        // a query that later passes send again
        queriesLeft,  // of those, how many are still to come
        untested      // what could not be tried
    };
    Kind kind = Kind::begin;
    std::size_t number = 0;
    std::string text;
    std::string summary{}; // of what is begun: what it does, without its operands
    std::string group{};   // of a query with a failing call: what it has in common with others
    Finding finding{};
    KnownQuery known{};
};
std::string lineOf(const Message& message);
Message messageOf(const std::string& line);

} // namespace oxahv::runner
