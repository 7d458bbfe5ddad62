// What the broker says, as texts for tests to compare.
#pragma once

#include "EmbeddedBroker.h"

#include <string>

// Why the broker refuses to do something.
template <class Operation>
std::string errorOf(const Operation& operation) {
    try {
        operation();
    } catch (const oxahv::BrokerError& error) {
        return error.what();
    }
    return "no error";
}

// The code and the message of a reply.
inline std::string failureOf(const oxahv::Reply& reply) {
    return oxahv::codeName(reply.code) + ' ' + reply.message;
}

// The value of a property, an argument or a context entry.
inline std::string textOf(const CMPIInstance* instance, const char* property) {
    return oxahv::valueText(CMGetProperty(instance, property, nullptr));
}
inline std::string textOf(const CMPIArgs* arguments, const char* name) {
    return oxahv::valueText(CMGetArg(arguments, name, nullptr));
}
inline std::string textOf(const CMPIContext* context, const char* entry) {
    return oxahv::valueText(CMGetContextEntry(context, entry, nullptr));
}
