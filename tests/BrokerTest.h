// What the tests of the library need of a broker: one of their own, with a request.
#pragma once

#include "LoggerCalls.h"

#include "EmbeddedBroker.h"
#include "ProviderUtilities.h"

#include <gtest/gtest.h>
#include <string>
#include <vector>

class BrokerTest : public testing::Test {
protected:
    BrokerTest() { forgetLoggerCalls(); }

    // The calls of the broker's slots that an operation makes.
    template <class Operation>
    std::vector<oxahv::Call> recorded(const Operation& operation) {
        broker_.startRecording();
        operation();
        return broker_.stopRecording();
    }

    // The message of the exception that an operation throws.
    template <class Operation>
    static std::string failureOf(const Operation& operation) {
        try {
            operation();
        } catch (const TK::FrameworkException& exception) {
            return exception.what();
        }
        return "no exception";
    }

    // The names of the slots that were called, without their tables.
    static std::vector<std::string> members(const std::vector<oxahv::Call>& calls) {
        std::vector<std::string> names;
        for (const oxahv::Call& call : calls) {
            names.push_back(call.slot.substr(call.slot.find('.') + 1));
        }
        return names;
    }

    oxahv::EmbeddedBroker broker_;
    oxahv::Request request_{broker_};
};
