// The ways in which what lies below an operation fails, for sweeps: for n = 1, 2, 3 … the n-th call of the
// broker, the n-th allocation or the n-th call of the logger fails.
#pragma once

#include "EmbeddedBroker.h"
#include "FailingMemory.h"
#include "HVLogger.h"

#include <functional>
#include <gtest/gtest.h>
#include <string>
#include <vector>

enum class Thrown { nothing, badAlloc, byTheLogger };

struct LoggerFailure {};

struct Way {
    std::string name;
    Thrown thrown; // by what fails
    bool isHarmless;
    std::function<void(unsigned int n)> begin;
    std::function<bool(unsigned int n)> end; // whether there was an n-th occasion
};

// Recording sees what is called, and that nothing of the broker's is released.
inline std::vector<Way> waysOfTheBroker(oxahv::EmbeddedBroker& broker) {
    constexpr CMPIValueState others = CMPI_keyValue | CMPI_badValue | CMPI_notFound;
    std::vector<Way> ways;
    for (const auto& [name, kind] : {std::pair("error code", oxahv::Fault{CMPI_RC_ERR_FAILED}),
                                     {"error code from then on", {CMPI_RC_ERR_FAILED, false, 0, 1, 0}},
                                     {"null with OK", {CMPI_RC_OK, true}},
                                     {"NULL state", {CMPI_RC_OK, false, CMPI_nullValue}},
                                     {"extra state bits", {CMPI_RC_OK, false, others}}}) {
        ways.push_back({name, Thrown::nothing, kind.stateBits == others,
                        [&broker, fault = kind](unsigned int n) mutable {
                            fault.firstCall = n;
                            broker.injectFault("*", fault);
                            broker.startRecording();
                        },
                        [&broker](unsigned int n) {
                            const std::vector<oxahv::Call> calls = broker.stopRecording();
                            broker.clearFaults();
                            for (const oxahv::Call& call : calls) {
                                EXPECT_EQ(call.slot.find("elease"), std::string::npos) << call.slot;
                                EXPECT_EQ(call.slot.find("free"), std::string::npos) << call.slot;
                            }
                            return calls.size() >= n;
                        }});
    }
    return ways;
}

inline std::vector<Way> waysOfMemory() {
    const auto end = [](unsigned int /*n*/) { return failing::ended(); };
    return {{"allocation", Thrown::badAlloc, false, failing::allocation, end},
            {"allocations from", Thrown::badAlloc, false, failing::allocationsFrom, end}};
}

// The logger takes every trace up to the one at which it throws.
inline Way wayOfTheLogger() {
    static unsigned int calls;
    return {"call of the logger", Thrown::byTheLogger, false,
            [](unsigned int n) {
                calls = 0;
                HVLog::HVLogger::setSink([n](const HVLog::Message& /*message*/) {
                    if (++calls == n) {
                        throw LoggerFailure();
                    }
                });
                HVLog::HVLogger::setThreshold(0);
            },
            [](unsigned int n) {
                HVLog::HVLogger::reset();
                return calls >= n;
            }};
}
