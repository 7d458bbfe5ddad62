// What the tests of the library need of a broker: one of their own, with a request.
#pragma once

#include "LoggerCalls.h"

#include "EmbeddedBroker.h"
#include "ProviderUtilities.h"

#include <gtest/gtest.h>
#include <string>
#include <tuple>
#include <vector>

// A broker's object that answers every name with one value and one status, as no correct broker would.
template <class Object, class Table>
class Answering {
public:
    template <class Handle>
    Answering(const Object* real, CMPIData (*Table::*getter)(Handle*, const char*, CMPIStatus*),
              const CMPIData& data, CMPIrc code)
        : table_(*real->ft), object_(*real) {
        object_.ft = &table_;
        table_.*getter = &answer<Handle>;
        data_ = data;
        code_ = code;
    }
    Answering(const Answering&) = delete;
    Answering& operator=(const Answering&) = delete;

    Object* handle() { return &object_; }

private:
    template <class Handle>
    static CMPIData answer(Handle* /*object*/, const char* /*name*/, CMPIStatus* status) {
        *status = {code_, nullptr};
        return data_;
    }

    Table table_;
    Object object_;
    static inline CMPIData data_;
    static inline CMPIrc code_;
};

// A string whose characters come with a status that is no success.
class StringWithAnError {
public:
    explicit StringWithAnError(const CMPIString* real) : table_(*real->ft), string_(*real) {
        string_.ft = &table_;
        setGetter(&CMPIStringFT::getCharPtr);
    }
    CMPIString* handle() { return &string_; }

private:
    // The headers of CIM servers differ in what is const.
    template <class Chars, class Handle>
    void setGetter(Chars* (*CMPIStringFT::*getter)(Handle*, CMPIStatus*)) {
        table_.*getter = [](Handle* /*string*/, CMPIStatus* status) -> Chars* {
            static char characters[] = "characters";
            *status = {CMPI_RC_ERR_FAILED, nullptr};
            return characters;
        };
    }

    CMPIStringFT table_;
    CMPIString string_;
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
