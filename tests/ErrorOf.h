// What the broker says when it refuses to do something.
#pragma once

#include "EmbeddedBroker.h"

template <class Operation>
std::string errorOf(const Operation& operation) {
    try {
        operation();
    } catch (const oxahv::BrokerError& error) {
        return error.what();
    }
    return "no error";
}
