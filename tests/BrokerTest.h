// What the tests of the library need of a broker: one of their own, with a request.
#pragma once

#include "LoggerCalls.h"

#include "EmbeddedBroker.h"
#include "ProviderUtilities.h"

#include <gtest/gtest.h>
#include <string>
#include <tuple>
#include <vector>

// A broker's object one of whose getters has one answer and one status, as no correct broker's would.
template <class Object, class Table, class Answer = CMPIData>
class Answering {
public:
    template <class Handle, class... Rest>
    Answering(const Object* real, Answer (*Table::*getter)(Handle*, Rest...), const Answer& answer,
              CMPIrc code)
        : table_(*real->ft), object_(*real) {
        object_.ft = &table_;
        table_.*getter = [](Handle* /*object*/, Rest... rest) {
            *std::get<CMPIStatus*>(std::make_tuple(rest...)) = {code_, nullptr};
            return answer_;
        };
        answer_ = answer;
        code_ = code;
    }
    Answering(const Answering&) = delete;
    Answering& operator=(const Answering&) = delete;

    Object* handle() { return &object_; }

private:
    Table table_;
    Object object_;
    static inline Answer answer_;
    static inline CMPIrc code_;
};

// The headers of CIM servers differ in whether the characters are const.
using Characters = decltype(CMPIStringFT().getCharPtr(nullptr, nullptr));

// A string whose characters come with a status that is no success.
class StringWithAnError : public Answering<CMPIString, CMPIStringFT, Characters> {
public:
    explicit StringWithAnError(const CMPIString* real)
        : Answering(real, &CMPIStringFT::getCharPtr, characters_, CMPI_RC_ERR_FAILED) {}

private:
    static inline char characters_[] = "characters";
};

// A broker that makes every object and reports an error nevertheless.
class ErringBroker {
public:
    explicit ErringBroker(const CMPIBroker* real) : table_(*real->eft), broker_(*real) {
        broker_.eft = &table_;
        real_ = real;
        replace<&CMPIBrokerEncFT::newInstance>();
        replace<&CMPIBrokerEncFT::newObjectPath>();
        replace<&CMPIBrokerEncFT::newString>();
        replace<&CMPIBrokerEncFT::newArray>();
        replace<&CMPIBrokerEncFT::newDateTimeFromChars>();
        replace<&CMPIBrokerEncFT::classPathIsA>();
    }
    // Makes one kind alone err.
    template <class Slot>
    ErringBroker(const CMPIBroker* real, Slot CMPIBrokerEncFT::*slot) : ErringBroker(real) {
        const Slot only = table_.*slot;
        table_ = *real->eft;
        table_.*slot = only;
    }
    ErringBroker(const ErringBroker&) = delete;
    ErringBroker& operator=(const ErringBroker&) = delete;

    const CMPIBroker* handle() const { return &broker_; }

private:
    template <auto slot>
    void replace() {
        table_.*slot = erring<slot>(table_.*slot);
    }
    template <auto slot, class Result, class Handle, class... Rest>
    static auto erring(Result (* /*real*/)(Handle*, Rest...)) {
        return [](Handle* /*broker*/, Rest... rest) {
            const Result result = (real_->eft->*slot)(real_, rest...);
            *std::get<CMPIStatus*>(std::make_tuple(rest...)) = {CMPI_RC_ERR_FAILED, nullptr};
            return result;
        };
    }

    CMPIBrokerEncFT table_;
    CMPIBroker broker_;
    static inline const CMPIBroker* real_;
};

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
