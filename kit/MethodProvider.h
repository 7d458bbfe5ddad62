/**
 * @file
 * oxahv::MethodProvider, a provider of methods.
 */
#pragma once

#include "Operation.h"
#include "detail/Methods.h"

#include <cstddef>
#include <memory>
#include <vector>

namespace oxahv {

/**
 * A provider of methods. Its constructor registers a member function for each method, with the names of the
 * method's parameters in the function's order.
 *
 * @code
 * class Systems : public oxahv::MethodProvider {
 * public:
 *     Systems() { method("Demo_System.SetSpeed", &Systems::setSpeed, {"Port", "Speed", "Earlier"}); }
 *
 * private:
 *     std::uint32_t setSpeed(const oxahv::Operation& operation, const std::string& port,
 *                            std::optional<std::uint64_t> speed, std::uint64_t& earlier);
 * };
 * @endcode
 *
 * - A parameter by value or by const reference is an input argument, of the types of Instance::get. One that
 * is missing, NULL, out of range or of another type answers `CMPI_RC_ERR_INVALID_PARAMETER`, unless it is a
 *   `std::optional`.
 * - A parameter by reference is an output argument, of the types of Value.h. It begins with the client's
 * value, if one was sent, else as a value of its type begins. An empty `std::optional` is left out of the
 * reply.
 * - A first parameter `const Operation&`, which may be left out, is the request; its path names the object.
 * - The result is the method's return value; its C++ type has to be that of the CIM type that the method
 *   declares. `void` returns none.
 *
 * A method that is not registered answers `CMPI_RC_ERR_METHOD_NOT_FOUND`, an argument that the method does
 * not have `CMPI_RC_ERR_INVALID_PARAMETER` with its name. Threads, failure and locale are as of
 * InstanceProvider.
 */
class MethodProvider {
public:
    /** A provider that serves nothing yet. */
    MethodProvider() = default;
    virtual ~MethodProvider() = default;
    MethodProvider(const MethodProvider&) = delete;
    MethodProvider& operator=(const MethodProvider&) = delete;

protected:
    /**
     * Registers a method.
     * @param name the method's name in any case; with a class and a point before it, it is found for that
     * class and those derived from it alone. A literal, or what lives as long as the provider.
     * @param function a member function of the provider's class.
     * @param parameters their names, as many as the function has parameters beside the request; literals, or
     * what lives as long as the provider.
     * @throws std::bad_alloc
     */
    template <class Function, std::size_t count>
    void method(const char* name, Function function, const char* const (&parameters)[count]) {
        using Signature = detail::Signature<Function>;
        static_assert(count == Signature::named, "a name for each parameter beside the request");
        methods_.push_back(std::make_unique<detail::BoundMethod<Function>>(name, function, parameters));
    }
    /** Registers a method without parameters. */
    template <class Function>
    void method(const char* name, Function function) {
        static_assert(detail::Signature<Function>::named == 0,
                      "a name for each parameter beside the request");
        methods_.push_back(std::make_unique<detail::BoundMethod<Function>>(name, function, nullptr));
    }

private:
    friend struct detail::Service;
    void invoke(const detail::MethodCall& call);

    std::vector<std::unique_ptr<detail::Method>> methods_;
};

inline void MethodProvider::invoke(const detail::MethodCall& call) {
    for (const std::unique_ptr<detail::Method>& method : methods_) {
        if (method->isFor(call)) {
            method->refuseUnknown(call);
            return method->call(*this, call);
        }
    }
    throw Refusal(CMPI_RC_ERR_METHOD_NOT_FOUND,
                  std::string("class ") + call.operation.className() + " has no method " + call.name);
}

} // namespace oxahv
