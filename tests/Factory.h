// Factories of MIs whose functions are a test's own.
#pragma once

#include "EmbeddedBroker.h"

inline const CMPIBroker* broker = nullptr; // of the MI that was made last

// A factory of an MI with a table of functions.
template <auto& table, class MI>
MI* create(const CMPIBroker* theBroker, const CMPIContext* /*context*/, CMPIStatus* /*status*/) {
    static MI mi = {nullptr, &table};
    broker = theBroker;
    return &mi;
}
