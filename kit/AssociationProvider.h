/**
 * @file
 * oxahv::AssociationProvider, a provider of associations.
 */
#pragma once

#include "Replies.h"
#include "detail/MemberFunction.h"

#include <vector>

namespace oxahv {

/**
 * A provider of associations. It overrides `associations`, which returns every instance of its association
 * class, each with its references as keys or properties; or registers a function for each association class.
 * From that follow associators, associatorNames, references and referenceNames, from either end, with the
 * filters of both classes and both roles.
 *
 * @code
 * class PortsOfSystem : public oxahv::AssociationProvider {
 *     void associations(const oxahv::Operation& operation, oxahv::Instances& reply) override {
 *         for (const Port& port : ports()) {
 *             reply.add(operation.instance("Demo_SystemPort", {{"GroupComponent", system(operation)},
 *                                                              {"PartComponent", name(operation, port)}}));
 *         }
 *     }
 * };
 * @endcode
 *
 * A class that derives from InstanceProvider too serves the association's instances by the same function.
 * Threads, failure and locale are as of InstanceProvider.
 */
class AssociationProvider {
public:
    /** A provider that serves nothing yet. */
    AssociationProvider() = default;
    virtual ~AssociationProvider() = default;
    AssociationProvider(const AssociationProvider&) = delete;
    AssociationProvider& operator=(const AssociationProvider&) = delete;

    /** Returns all associations, or at least those that the request's path is an end of. As it comes, calls
     * the functions that `associate` registered, but for classes that the client filters out. */
    virtual void associations(const Operation& operation, Instances& reply);
    /** The instance at an end of an association, for associators. As it comes, asks the CIM server, which
     * knows the provider of its class (Operation::fetch). */
    virtual Instance end(const Operation& operation, const Path& path);

protected:
    /**
     * Registers the function that returns all associations of a class. For the constructor:
     * `associate("Demo_SystemPort", &Demo::portsOfSystem);`
     * @param className a literal, or what lives as long as the provider.
     * @param function a member function of the provider's class.
     */
    template <class Class>
    void associate(const char* className, void (Class::*function)(const Operation&, Instances&)) {
        classes_.push_back({className, detail::memberOfBase<Function>(function)});
    }

private:
    using Function = void (AssociationProvider::*)(const Operation&, Instances&);
    struct Served {
        const char* className;
        Function function;
    };
    std::vector<Served> classes_;
};

inline void AssociationProvider::associations(const Operation& operation, Instances& reply) {
    if (classes_.empty()) {
        throw Refusal(CMPI_RC_ERR_NOT_SUPPORTED, "this provider lists no associations");
    }
    for (const Served& served : classes_) {
        if (operation.filter_ == nullptr ||
            operation.passes(operation.filter_->associationClass, served.className)) {
            detail::callMember(*this, served.function, operation, reply);
        }
    }
}

inline Instance AssociationProvider::end(const Operation& operation, const Path& path) {
    return operation.fetch(path);
}

} // namespace oxahv
