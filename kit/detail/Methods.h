// A CIM method as a member function: arguments read before the call, output arguments and the result handed
// over after it.
#pragma once

#include "../Operation.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <strings.h>
#include <tuple>
#include <type_traits>
#include <utility>
#include <vector>

namespace oxahv {

class MethodProvider;

namespace detail {

struct MethodCall {
    const Operation& operation;
    const char* name;
    const CMPIResult* result;
    const CMPIArgs* in; // null where a server has none to hand over
    CMPIArgs* out;

    Found argument(const char* argument) const {
        if (in == nullptr) {
            return {operation.broker(), "argument", argument, false, false, {}};
        }
        return argumentOf(operation.broker(), in, argument);
    }
    // What the client sent, by its place.
    CMPICount count() const {
        Status status;
        const CMPICount count = CMGetArgCount(writable(in), &status);
        require(status, "count the arguments of", name);
        return count;
    }
    const char* nameAt(CMPICount index) const {
        Status status;
        CMPIString* argument = nullptr;
        CMGetArgAt(writable(in), index, &argument, &status);
        require(status, "list the arguments of", name);
        return requiredChars(argument, "tell the name of an argument");
    }
};

// A registered method, whatever its signature.
class Method {
public:
    Method(const char* name, const char* const* parameters, std::size_t count)
        : name_(name), parameters_(parameters, parameters + count) {}
    virtual ~Method() = default;
    Method(const Method&) = delete;
    Method& operator=(const Method&) = delete;

    virtual void call(MethodProvider& provider, const MethodCall& call) const = 0;

    bool isFor(const MethodCall& call) const {
        const char* const point = std::strrchr(name_, '.');
        if (!sameName(point != nullptr ? point + 1 : name_, call.name)) {
            return false;
        }
        return point == nullptr ||
               call.operation.isRelated(call.operation.className(), std::string(name_, point).c_str());
    }

    // CIM has a client told about an argument that the method does not have.
    void refuseUnknown(const MethodCall& call) const {
        const CMPICount count = call.in != nullptr ? call.count() : 0;
        for (CMPICount i = 0; i < count; ++i) {
            const char* const argument = call.nameAt(i);
            if (std::none_of(parameters_.begin(), parameters_.end(),
                             [&](const char* parameter) { return sameName(parameter, argument); })) {
                throw Refusal(CMPI_RC_ERR_INVALID_PARAMETER,
                              std::string("method ") + call.name + " has no argument " + argument);
            }
        }
    }

protected:
    const char* const* parameters() const { return parameters_.data(); }

private:
    const char* name_;
    std::vector<const char*> parameters_;
};

// An input argument.
template <class Parameter>
class Argument {
public:
    static constexpr std::size_t names = 1;
    Argument(const MethodCall& call, const char* const* name) : value_(as<Type>(call.argument(*name))) {}
    const auto& pass() const { return value_; }
    void handOver(const MethodCall& /*call*/, const char* const* /*name*/) const {}

private:
    using Type = std::decay_t<Parameter>;
    Type value_;
};
template <class T>
class Argument<const T&> : public Argument<T> {
public:
    using Argument<T>::Argument;
};

// An output argument, which may be an input as well.
template <class T>
class Argument<T&> {
public:
    static constexpr std::size_t names = 1;
    Argument(const MethodCall& call, const char* const* name) : value_(initial(call.argument(*name))) {}
    T& pass() { return value_; }
    void handOver(const MethodCall& call, const char* const* name) const {
        if constexpr (IsOptional<T>::value) {
            if (!value_) {
                return;
            }
        }
        ValueAccess::giveArgument(call.operation.broker(), call.out, *name, value_);
    }

private:
    static T initial(const Found& found) { return found.isNull() ? T() : as<T>(found); }
    T value_;
};

// The request itself.
template <>
class Argument<const Operation&> {
public:
    static constexpr std::size_t names = 0;
    Argument(const MethodCall& call, const char* const* /*name*/) : operation_(call.operation) {}
    const Operation& pass() const { return operation_; }
    void handOver(const MethodCall& /*call*/, const char* const* /*name*/) const {}

private:
    const Operation& operation_;
};

template <class Function>
struct Signature;
template <class C, class R, class... Parameters>
struct Signature<R (C::*)(Parameters...)> {
    using Class = C;
    using Return = R;
    using Arguments = std::tuple<Argument<Parameters>...>;
    static constexpr std::size_t named = (Argument<Parameters>::names + ... + 0);
    // The place of a parameter's name: the request, which has none and asks for none, can only be the first.
    template <std::size_t index>
    static constexpr std::size_t nameAt = index + named < sizeof...(Parameters)
                                              ? 0
                                              : index + named - sizeof...(Parameters);
};
template <class C, class R, class... Parameters>
struct Signature<R (C::*)(Parameters...) const> : Signature<R (C::*)(Parameters...)> {};

template <class Function>
class BoundMethod : public Method {
    using Form = Signature<Function>;
    static constexpr std::size_t count = std::tuple_size_v<typename Form::Arguments>;

public:
    BoundMethod(const char* name, Function function, const char* const* parameters)
        : Method(name, parameters, Form::named), function_(function) {}

    void call(MethodProvider& provider, const MethodCall& call) const override {
        run(provider, call, std::make_index_sequence<count>());
    }

private:
    template <std::size_t... index>
    void run(MethodProvider& provider, const MethodCall& call, std::index_sequence<index...> /*all*/) const {
        // In braces: the first argument that is wrong is the one that the client is told about.
        typename Form::Arguments arguments{std::tuple_element_t<index, typename Form::Arguments>(
            call, parameters() + Form::template nameAt<index>)...};
        auto& own = static_cast<typename Form::Class&>(provider);
        if constexpr (std::is_void_v<typename Form::Return>) {
            (own.*function_)(std::get<index>(arguments).pass()...);
        } else {
            const typename Form::Return result = (own.*function_)(std::get<index>(arguments).pass()...);
            ValueAccess::giveResult(call.operation.broker(), call.result, call.name, result);
        }
        (std::get<index>(arguments).handOver(call, parameters() + Form::template nameAt<index>), ...);
    }

    Function function_;
};

} // namespace detail
} // namespace oxahv
