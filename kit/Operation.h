/**
 * @file
 * oxahv::Operation, what a client asked for, and the maker of the objects that answer it.
 */
#pragma once

#include "Context.h"
#include "Instance.h"

#include <string>

namespace oxahv {

namespace detail {
struct Hosted;
struct AssociationFilter;

// What becomes of the instances that a provider makes while it serves an operation.
enum class Wanted {
    instances,       // each is returned
    names,           // its path is returned
    oneInstance,     // it is returned when it has the request's keys
    associators,     // of an association: the instances at its other ends
    associatorNames, // of an association: their paths
    references,      // the association is returned when the request's path is one of its ends
    referenceNames   // its path is
};
} // namespace detail

/**
 * A request of a client. It is good as long as the provider's function runs, in its thread.
 *
 * Everything that a reply is made of is made here: paths and instances in the request's namespace, with the
 * property list already applied.
 */
class Operation {
public:
    Operation& operator=(const Operation&) = delete;

    /** @name The request */
    /** @{ */
    /** Names the object that the request is about; of an enumeration the class alone. */
    const Path& path() const { return path_; }
    /** The class's name, which belongs to the request. */
    const char* className() const { return className_; }
    /** The namespace, which belongs to the request. */
    const char* nameSpace() const { return nameSpace_; }
    /** Whether the request is for a class of this name, in any case. */
    bool isFor(const char* className) const { return detail::sameName(className_, className); }
    /** Reads a key of the request's path; see Path::key. */
    template <class T>
    T key(const char* name) const {
        return path_.key<T>(name);
    }
    /** Whether the client wants a property: it is in the property list, in any case, or there is no list.
     * Saves a provider what is dear to find out; what is set without being wanted is dropped. */
    bool wants(const char* property) const;
    /** The property list as CMPI has it, ended by a null pointer; null when there is none. */
    const char** propertyList() const { return properties_; }
    /** The request's context, with the broker. */
    const Context& context() const { return context_; }
    /** The CIM server. */
    const CMPIBroker* broker() const { return context_.broker(); }
    /** The category of the provider's traces, for its own: `TK_TRACE_MESSAGE(operation.category(), "…")`. */
    const std::string& category() const;
    /** @} */

    /** @name Objects of the reply
     * They belong to the request.
     * @throws Refusal with the broker's status; see Value.h for what a value may be refused for.
     * @throws std::bad_alloc
     */
    /** @{ */
    /** A path in the request's namespace. @param className the class's name. @param keys may also be added
     * later, by Path::addKey. */
    Path path(const char* className, Keys keys = {}) const;
    /**
     * An instance with its keys, which are properties too.
     * @code
     * reply.add(operation.instance("Demo_Port", {{"Name", port.name}}).set("Speed", port.speed));
     * @endcode
     */
    Instance instance(const char* className, Keys keys) const;
    /** An instance that a path names. */
    Instance instance(const Path& path) const;
    /** @} */

    /** @name Questions to the CIM server
     * @throws Refusal with the broker's status.
     * @throws std::bad_alloc
     */
    /** @{ */
    /** Whether a class is another or derives from it. */
    bool isRelated(const char* className, const char* ancestor) const;
    /** The instance that a path names, from the provider that serves it, with the request's property list. */
    Instance fetch(const Path& path) const;
    /** @} */
};

} // namespace oxahv
