// The operations that providers serve. Each is a slot of an MI's function table with the arguments that
// follow the object path; what a request has to know of it, its type says. Clients and upcalls name it by the
// slot.
#pragma once

#include "hosting/HostedProvider.h"
#include "objects/Records.h"

#include <string_view>
#include <tuple>
#include <type_traits>

namespace oxahv {

// One request of an operation, whichever it is. Two are of the same operation if they are of the same type.
class Operation {
public:
    virtual ~Operation() = default;

    // Whether the handles among the arguments are of their kinds.
    virtual bool isValid() const = 0;
    // Whether the provider has the MI.
    virtual bool isOfferedBy(const HostedProvider& provider) const = 0;
    // Whether it goes along associations, which are served by providers of their own.
    virtual bool isAlongAssociations() const = 0;
    // The class of the associations that it goes along; empty for associations of any class.
    virtual std::string_view associationClass() const = 0;
    // Calls the provider's function.
    virtual CMPIStatus call(const HostedProvider& provider, const CMPIContext* context,
                            const CMPIResult* result, const CMPIObjectPath* path) const = 0;
};

template <auto slot>
class OperationOf;

template <class Table, class MI, class... Rest,
          CMPIStatus (*Table::*slot)(MI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                                     Rest...)>
class OperationOf<slot> : public Operation {
public:
    explicit OperationOf(Rest... rest) : arguments_(given(rest)...) {}

    bool isValid() const override {
        return std::apply([](auto... argument) { return (isOfItsKind(argument) && ...); }, arguments_);
    }
    bool isOfferedBy(const HostedProvider& provider) const override { return provider.mi<MI>() != nullptr; }
    bool isAlongAssociations() const override { return isOfAssociations; }
    std::string_view associationClass() const override {
        if constexpr (isOfAssociations) { // in all four of these slots it comes first
            const char* const name = std::get<0>(arguments_);
            return name != nullptr ? name : std::string_view();
        } else {
            return {};
        }
    }
    CMPIStatus call(const HostedProvider& provider, const CMPIContext* context, const CMPIResult* result,
                    const CMPIObjectPath* path) const override {
        MI* const mi = provider.mi<MI>();
        const auto function = mi->ft->*slot;
        if (function == nullptr) {
            return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
        }
        return std::apply([&](auto... rest) { return function(mi, context, result, path, rest...); },
                          arguments_);
    }

private:
    static constexpr bool isOfAssociations = std::is_same_v<MI, CMPIAssociationMI>;

    static bool isOfItsKind(const CMPIInstance* handle) { return Instance::of(handle) != nullptr; }
    template <class Other>
    static bool isOfItsKind(const Other& /*argument*/) {
        return true;
    }
    // An empty filter is none, and providers expect a null there.
    template <class Argument>
    static Argument given(Argument argument) {
        if constexpr (isOfAssociations && std::is_same_v<Argument, const char*>) {
            return argument != nullptr && *argument != '\0' ? argument : nullptr;
        } else {
            return argument;
        }
    }

    std::tuple<Rest...> arguments_;
};

} // namespace oxahv
