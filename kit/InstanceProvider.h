/**
 * @file
 * oxahv::InstanceProvider, a provider of instances.
 */
#pragma once

#include "Replies.h"
#include "detail/MemberFunction.h"

#include <vector>

namespace oxahv {

/**
 * A provider of instances. It overrides `enumerate`, from which the names of all instances, one instance by
 * its keys, and property lists follow; or registers a function for each class that it serves. What it leaves
 * out answers `CMPI_RC_ERR_NOT_SUPPORTED`.
 *
 * @code
 * class Ports : public oxahv::InstanceProvider {
 *     void enumerate(const oxahv::Operation& operation, oxahv::Instances& reply) override {
 *         for (const Port& port : ports()) {
 *             reply.add(operation.instance("Demo_Port", {{"Name", port.name}}).set("Speed", port.speed));
 *         }
 *     }
 * };
 * OXAHV_PROVIDER(DemoPort, Ports);
 * @endcode
 *
 * **Threads.** A CIM server calls these functions from any number of threads at once, on one object: what
 * they share is guarded by the provider. The constructor runs before, the destructor after all of them.
 *
 * **Failure.** A function ends its request by throwing: a Refusal with its code and text,
 * TK::FrameworkException with `CMPI_RC_ERR_INVALID_PARAMETER`, anything else with `CMPI_RC_ERR_FAILED`.
 *
 * **Locale.** They run under a thread locale whose character type is "C.UTF-8"; its other categories are
 * those of the server.
 */
class InstanceProvider {
public:
    /** A provider that serves nothing yet. */
    InstanceProvider() = default;
    virtual ~InstanceProvider() = default;
    InstanceProvider(const InstanceProvider&) = delete;
    InstanceProvider& operator=(const InstanceProvider&) = delete;

    /** Returns all instances of the request's class. As it comes, calls the function that `serve` registered
     * for the class; a class without one is `CMPI_RC_ERR_INVALID_CLASS`. */
    virtual void enumerate(const Operation& operation, Instances& reply);
    /** Returns the paths of all instances. As it comes, those of what `enumerate` returns, whose properties
     * are then not set. */
    virtual void enumerateNames(const Operation& operation, Names& reply);
    /** Returns the instance that the request's path names; returning none is `CMPI_RC_ERR_NOT_FOUND`. As it
     * comes, the one of what `enumerate` returns that has the same keys. */
    virtual void get(const Operation& operation, Instances& reply);
    /** Makes an instance. @param wanted what the client sent. @return the new instance's path */
    virtual Path create(const Operation& operation, const Instance& wanted);
    /** Changes the instance that the request's path names. @param wanted what the client sent; where the
     * request has a property list (Operation::wants), the listed properties alone count. */
    virtual void modify(const Operation& operation, const Instance& wanted);
    /** Deletes the instance that the request's path names. */
    virtual void remove(const Operation& operation);
    /** Returns the instances that a query selects. @param query its text. @param language its language, for
     * example "WQL" */
    virtual void query(const Operation& operation, const char* query, const char* language, Instances& reply);

protected:
    /**
     * Registers the function that returns all instances of a class. For the constructor of a provider that
     * serves several classes: `serve("Demo_Port", &Demo::ports);`
     * @param className a literal, or what lives as long as the provider.
     * @param function a member function of the provider's class.
     */
    template <class Class>
    void serve(const char* className, void (Class::*function)(const Operation&, Instances&)) {
        classes_.push_back({className, detail::memberOfBase<Function>(function)});
    }

private:
    using Function = void (InstanceProvider::*)(const Operation&, Instances&);
    struct Served {
        const char* className;
        Function function;
    };
    std::vector<Served> classes_;
};

inline void InstanceProvider::enumerate(const Operation& operation, Instances& reply) {
    for (const Served& served : classes_) {
        if (operation.isFor(served.className)) {
            return detail::callMember(*this, served.function, operation, reply);
        }
    }
    if (classes_.empty()) {
        throw Refusal(CMPI_RC_ERR_NOT_SUPPORTED, "this provider lists no instances");
    }
    throw Refusal(CMPI_RC_ERR_INVALID_CLASS,
                  std::string("this provider does not serve class ") + operation.className());
}

inline void InstanceProvider::enumerateNames(const Operation& operation, Names& reply) {
    const Operation names(operation, detail::Wanted::names);
    Instances instances(names, reply);
    enumerate(names, instances);
}

inline void InstanceProvider::get(const Operation& operation, Instances& reply) {
    const Operation one(operation, detail::Wanted::oneInstance);
    Instances matching(one, reply.names_, true);
    enumerate(one, matching);
}

inline Path InstanceProvider::create(const Operation& /*operation*/, const Instance& /*wanted*/) {
    throw Refusal(CMPI_RC_ERR_NOT_SUPPORTED, "this provider makes no instances");
}

inline void InstanceProvider::modify(const Operation& /*operation*/, const Instance& /*wanted*/) {
    throw Refusal(CMPI_RC_ERR_NOT_SUPPORTED, "this provider changes no instances");
}

inline void InstanceProvider::remove(const Operation& /*operation*/) {
    throw Refusal(CMPI_RC_ERR_NOT_SUPPORTED, "this provider deletes no instances");
}

inline void InstanceProvider::query(const Operation& /*operation*/, const char* /*query*/,
                                    const char* /*language*/, Instances& /*reply*/) {
    throw Refusal(CMPI_RC_ERR_NOT_SUPPORTED, "this provider knows no query language");
}

} // namespace oxahv
