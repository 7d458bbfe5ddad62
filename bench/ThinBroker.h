// A CMPI broker whose functions do next to nothing: they keep nothing and hand out prepared objects. What a
// call takes beyond this broker's own few nanoseconds is the caller's cost.
//
// Only the slots that a provider reaches through the library are filled. Everything may be used by any number
// of threads at once, since nothing changes.
#pragma once

#include "ProviderUtilities.h"

namespace thin {

// The keys of a path, each of another type.
constexpr CMPICount keyKinds = 5;

// The elements of each array that is read, all the same.
constexpr CMPICount arraySize = 64;

struct Objects {
    CMPIBroker broker;
    CMPIObjectPath path;          // five keys
    CMPIObjectPath longPath;      // 65,535 keys, the five again and again
    CMPIInstance instance;        // each property is the number 7
    CMPIInstance textInstance;    // each property is a text
    CMPIInstance dateInstance;    // each property is a date
    CMPIInstance numbersInstance; // each property is an array of numbers
    CMPIInstance textsInstance;   // each property is an array of texts
    CMPIArgs args;                // each argument is the number 7
    CMPIArgs textArgs;            // each argument is a text
    CMPIString text;              // what the broker makes of any text
    CMPIArray array;              // what it makes of any array
    CMPIDateTime dateTime;        // what it makes of any date
    CMPIResult result;            // takes everything
};

// The prepared objects. Their function tables may be exchanged while no other thread uses them.
TK_EXPORT Objects& objects();

} // namespace thin
