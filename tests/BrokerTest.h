// What the tests of the library need of a broker: one of their own, with a request, and a log of an
// operation.
#pragma once

#include "LoggerCalls.h"

#include "EmbeddedBroker.h"
#include "ProviderUtilities.h"

#include <functional>
#include <gtest/gtest.h>
#include <string>
#include <tuple>
#include <type_traits>
#include <utility>
#include <vector>

// A broker or an object of it whose function in a slot answers otherwise: it does its work, and `alter`
// changes what comes of it, by default into an answer that comes with an error, as no correct broker's does.
template <auto slot>
class Otherwise;
template <class Table, class Result, class Handle, class... Rest, Result (*Table::*slot)(Handle*, Rest...)>
class Otherwise<slot> {
public:
    using Object = std::remove_const_t<Handle>;

    explicit Otherwise(
        const Object* real, std::function<void(Result&, CMPIStatus&)> alter =
                                [](Result& /*result*/, CMPIStatus& status) {
                                    status = {CMPI_RC_ERR_FAILED, nullptr};
                                })
        : object_(*real), table_(*tableOf(object_)) {
        real_ = real;
        alter_ = std::move(alter);
        table_.*slot = [](Handle* /*object*/, Rest... rest) {
            Object* const object = const_cast<Object*>(real_);
            Result result = (tableOf(*object)->*slot)(object, rest...);
            alter_(result, *std::get<CMPIStatus*>(std::make_tuple(rest...)));
            return result;
        };
        tableOf(object_) = &table_;
    }
    Otherwise(const Otherwise&) = delete;
    Otherwise& operator=(const Otherwise&) = delete;
    ~Otherwise() { real_ = nullptr; } // may be a local variable of the test's

    Object* handle() { return &object_; }

private:
    static auto& tableOf(Object& object) {
        if constexpr (std::is_same_v<Object, CMPIBroker>) {
            return object.eft;
        } else {
            return object.ft;
        }
    }

    Object object_;
    Table table_;
    static inline const Object* real_;
    static inline std::function<void(Result&, CMPIStatus&)> alter_;
};

// Leaves something on the stack, so that a variable without a value is not zero by chance.
[[gnu::noinline]] inline void soilStack() {
    volatile char bytes[8192];
    for (volatile char& byte : bytes) {
        byte = 'x';
    }
}

class BrokerTest : public testing::Test {
protected:
    BrokerTest() { takeTraces(); }

    // What an operation does, in order, a line each: the calls of the broker with what they are given, the
    // trace points, and the message of its exception. The broker finds a fresh status at every call.
    template <class Operation>
    std::string logOf(const Operation& operation) {
        std::string log;
        std::vector<std::size_t> places; // of the logger's calls in it
        const auto takeCalls = [&] {
            for (const oxahv::Call& call : broker_.stopRecording()) {
                EXPECT_TRUE(call.hasStatus && call.entryStatus.rc == CMPI_RC_OK && !call.entryStatus.msg);
                log += lineOf(call);
            }
            broker_.startRecording();
            places.push_back(log.size());
        };
        takeTraces();
        broker_.startRecording();
        atLoggerCalls(takeCalls);
        std::string failure;
        soilStack();
        try {
            operation();
        } catch (const TK::FrameworkException& exception) {
            failure = std::string("throws ") + exception.what() + '\n';
        }
        takeCalls();
        broker_.stopRecording();
        broker_.clearFaults();
        atLoggerCalls({});
        const std::string traces = takeTraces();
        for (std::size_t i = 0, inserted = 0, end = 0; i + 1 < places.size(); i += 2, inserted = end) {
            EXPECT_EQ(places[i], places[i + 1]) << "a call of the broker within a trace point";
            end = traces.find('\n', inserted) + 1;
            log.insert(places[i] + inserted, traces, inserted, end - inserted);
        }
        return log + failure;
    }

    // The same with a fault: at the n-th call of a slot, or of any ("*").
    template <class Operation>
    std::string logOf(const Operation& operation, const std::string& slot, const oxahv::Fault& fault) {
        broker_.injectFault(slot, fault);
        return logOf(operation);
    }

    // What createObjectPath does, whether the broker makes the path or not.
    static std::string creating(const CMPIBroker* broker, const std::string& className,
                                const std::string& nameSpace, bool isMade) {
        const auto trace = [](const std::string& name, const std::string& value) {
            return variable(providerUtilities, "createObjectPath", name, value);
        };
        const std::string list =
            " broker=" + address(broker) + " classname=" + className + " nameSpace=" + nameSpace;
        const std::string own = "ProviderUtilities::createObjectPath";
        return entering(providerUtilities, "createObjectPath", list) + trace("classname", className) +
               "newObjectPath " + nameSpace + ' ' + className + '\n' +
               (isMade ? "setNameSpace " + nameSpace + '\n' + trace('"' + own + '"', own) : "") +
               exiting(providerUtilities, "createObjectPath", list);
    }

    CMPIString* newString(const char* text) { return CMNewString(broker_.handle(), text, nullptr); }

    oxahv::EmbeddedBroker broker_;
    oxahv::Request request_{broker_};

private:
    // The caller's own characters may be gone by now.
    static std::string lineOf(const oxahv::Call& call) {
        const std::string member = call.slot.substr(call.slot.find('.') + 1);
        const auto begins = [&member](const char* word) { return member.rfind(word, 0) == 0; };
        std::string text = member;
        for (const std::string& name : {call.name, call.secondName}) {
            text += name.empty() ? "" : ' ' + name;
        }
        if (begins("newArray") || member.find("At") != std::string::npos) {
            text += ' ' + std::to_string(call.index);
        }
        if (call.type != CMPI_null) {
            text += call.type == CMPI_chars ? " chars" : ' ' + oxahv::typeName(call.type);
            text += (call.type & CMPI_ARRAY) != 0 ? "[]" : "";
        }
        if ((begins("set") || begins("add")) && call.type != CMPI_null && call.type != CMPI_chars) {
            text += " = " + oxahv::valueText({call.type, CMPI_goodValue, call.value});
        }
        return text + '\n';
    }
};

// The faults of a call: an error, and nothing in spite of success.
inline const oxahv::Fault anError = {CMPI_RC_ERR_FAILED};
inline const oxahv::Fault nothing = {CMPI_RC_OK, true};
