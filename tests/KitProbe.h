// A provider of the kit whose functions a test gives it, hosted in a broker that has declared its classes.
#pragma once

#include "EmbeddedBroker.h"
#include "ProviderKit.h"

#include <functional>
#include <gtest/gtest.h>
#include <string>
#include <vector>

// What the provider does; nothing leaves it to the kit.
struct Probe {
    std::function<void(const oxahv::Context& context)> construct;
    std::function<void(const oxahv::Operation& operation, oxahv::Instances& reply)> enumerate;
    std::function<void(const oxahv::Operation& operation, oxahv::Instances& reply)> associations;
    std::function<oxahv::Path(const oxahv::Operation& operation, const oxahv::Instance& wanted)> create;
    std::function<void(const oxahv::Operation& operation, const oxahv::Instance& wanted)> modify;
    std::function<void(const oxahv::Operation& operation)> remove;
    std::function<void(const oxahv::Operation& operation, const char* query, const char* language,
                       oxahv::Instances& reply)>
        query;
    unsigned int objects = 0; // of the provider, alive
};
extern Probe probe;

// Factories of the kinds that the provider has.
extern const oxahv::ProviderFactories probeFactories;

// The types of a value, with the name of the property of class Kit_Value that has it and, behind "A", of the
// array of it.
struct ValueType {
    const char* name;
    CMPIType type;
};
extern const std::vector<ValueType> valueTypes;

class KitTest : public testing::Test {
protected:
    KitTest();
    ~KitTest() override;

    CMPIObjectPath* path(const std::string& text) { return request_.objectPathFromText(text, "root/cimv2"); }

    // Runs a function of the provider, on behalf of a request for all instances of a class.
    oxahv::Reply enumerate(const std::function<void(const oxahv::Operation&, oxahv::Instances&)>& function,
                           const std::string& className = "Kit_Value");

    // The code and the text of a reply.
    static std::string failureOf(const oxahv::Reply& reply) {
        return oxahv::codeName(reply.code) + ' ' + reply.message;
    }

    oxahv::EmbeddedBroker broker_;
    oxahv::Request request_{broker_};
};
