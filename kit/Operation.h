/**
 * @file
 * oxahv::Operation, what a client asked for, and the maker of the objects that answer it.
 */
#pragma once

#include "Context.h"
#include "Instance.h"

#include <algorithm>
#include <string>

namespace oxahv {

class Operation;

namespace detail {
// Whether classes are related to the one that a client filters by, which most candidates share: the last
// answer is kept.
struct ClassFilter {
    const char* ancestor; // null or empty: every class passes
    std::string last{};
    bool lastPasses = false;
};

// The filters of an association request; null or empty is none. The code that applies them is called through
// this record, so that a provider without associations does not compile it.
struct EndFilter {
    ClassFilter associationClass;
    ClassFilter resultClass;
    const char* role;
    const char* resultRole;
    // Whether the client may want an association of this class, whose ends are known as far as they are keys.
    bool (*mayWant)(const Operation& operation, const char* className, const Instance& association);
};

inline bool isGiven(const char* filter) {
    return filter != nullptr && *filter != '\0';
}

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
struct Service;
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
    const std::string& category() const { return category_; }
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

private:
    friend struct detail::Service;
    friend class InstanceProvider;
    friend class AssociationProvider;
    friend class Instances;

    Operation(const std::string& category, const Context& context, const CMPIObjectPath* path,
              const char** properties, detail::Wanted wanted, detail::EndFilter* filter = nullptr)
        : category_(category), context_(context), path_(context.broker(), path), properties_(properties),
          nameSpace_(path_.nameSpace()), className_(path_.className()), wanted_(wanted), filter_(filter) {}
    // The same request, from which other objects are wanted.
    Operation(const Operation& other, detail::Wanted wanted) : Operation(other) { wanted_ = wanted; }
    Operation(const Operation&) = default;

    bool isOfAssociations() const { return wanted_ >= detail::Wanted::associators; }
    bool returnsInstances() const {
        return wanted_ == detail::Wanted::instances || wanted_ == detail::Wanted::oneInstance ||
               wanted_ == detail::Wanted::references;
    }
    bool hasKeys(const char* className, Keys keys) const;
    bool passes(detail::ClassFilter& filter, const char* className) const;
    bool isNearEnd(const Instance::End& end) const;
    bool isFarEnd(const std::vector<Instance::End>& ends, std::size_t index) const;
    bool isAsked(const std::vector<Instance::End>& ends) const;
    static bool mayWant(const Operation& operation, const char* className, const Instance& association);
    Instance unwanted() const;
    Instance complete(const char* className, CMPIObjectPath* path, const Keys* keys) const;
    void fill(Instance& instance, const char* className, const Keys* keys) const;

    const std::string& category_;
    Context context_;
    Path path_;
    const char** properties_;
    const char* nameSpace_;
    const char* className_;
    detail::Wanted wanted_;
    detail::EndFilter* filter_;
};

namespace detail {
// Goes through the keys of a provider's list or, where there is none, of the path.
template <class Function>
void eachKey(const Keys* keys, const CMPIObjectPath* path, const Function& function) {
    if (keys != nullptr) {
        for (const Key& key : *keys) {
            function(key.name, key.value);
        }
        return;
    }
    Status status;
    const CMPICount count = CMGetKeyCount(writable(path), &status);
    require(status, "count the keys");
    for (CMPICount i = 0; i < count; ++i) {
        const NamedKey key(path, i);
        function(key.name, Value(key.data));
    }
}
} // namespace detail

inline bool Operation::wants(const char* property) const {
    if (properties_ == nullptr) {
        return true;
    }
    const char** name = properties_;
    while (*name != nullptr && !detail::sameName(*name, property)) {
        ++name;
    }
    return *name != nullptr;
}

inline Path Operation::path(const char* className, Keys keys) const {
    detail::Status status;
    Path made(broker(),
              detail::made(CMNewObjectPath(detail::writable(broker()), nameSpace_, className, &status),
                           status, "make a path of class", className));
    for (const Key& key : keys) {
        made.addKey(key.name, key.value);
    }
    return made;
}

inline bool Operation::hasKeys(const char* className, Keys keys) const {
    detail::Status status;
    const CMPICount count = CMGetKeyCount(path_.handle(), &status);
    detail::require(status, "count the keys");
    if (!isFor(className)) {
        return false;
    }
    const bool areSame = std::all_of(keys.begin(), keys.end(), [this](const Key& key) {
        const detail::Found sent = detail::keyOf(broker(), path_.handle(), key.name);
        return sent.isThere && detail::ValueAccess::isSame(key.value, sent);
    });
    return areSame && count == keys.size();
}

inline Instance Operation::instance(const char* className, Keys keys) const {
    if (wanted_ == detail::Wanted::oneInstance && !hasKeys(className, keys)) {
        return unwanted();
    }
    return complete(className, path(className, keys).handle(), &keys);
}

inline Instance Operation::instance(const Path& path) const {
    if (wanted_ == detail::Wanted::oneInstance && !path.names(path_)) {
        return unwanted();
    }
    return complete(path.className(), path.handle(), nullptr);
}

inline Instance Operation::unwanted() const {
    Instance none(broker(), nullptr, nullptr);
    none.isWanted_ = false;
    return none;
}

// Makes no object that the client will not see: of an association whose keys are its references, they already
// decide.
inline Instance Operation::complete(const char* className, CMPIObjectPath* path, const Keys* keys) const {
    Instance instance(broker(), nullptr, path);
    if (isOfAssociations()) {
        instance.isAssociation_ = true;
        detail::eachKey(keys, path, [&](const char* name, const Value& value) { instance.set(name, value); });
        if (!filter_->mayWant(*this, className, instance)) {
            return unwanted();
        }
    }
    if (returnsInstances()) {
        fill(instance, className, keys);
    }
    return instance;
}

inline void Operation::fill(Instance& instance, const char* className, const Keys* keys) const {
    detail::Status status;
    instance.handle_ = detail::made(CMNewInstance(detail::writable(broker()), instance.path_, &status),
                                    status, "make an instance of", className);
    if (properties_ != nullptr) {
        // The client asked for some properties only: the broker then drops the others. Keys stay.
        std::vector<const char*> names;
        detail::eachKey(keys, instance.path_,
                        [&](const char* name, const Value& /*value*/) { names.push_back(name); });
        names.push_back(nullptr);
        detail::require(CMSetPropertyFilter(instance.handle_, properties_, names.data()),
                        "apply the property list to", className);
    }
    // Not every broker makes properties of the keys.
    detail::eachKey(keys, instance.path_, [&](const char* name, const Value& value) {
        detail::ValueAccess::giveProperty(broker(), instance.handle_, name, value);
    });
}

inline bool Operation::isRelated(const char* className, const char* ancestor) const {
    if (detail::sameName(className, ancestor) ||
        TK::ProviderUtilities::areClassesRelated(broker(), nameSpace_, ancestor, className)) {
        return true;
    }
    // The library counts a failure of the broker as "not related", so a no is asked for again, with the
    // status.
    detail::Status status;
    const CMPIBoolean isRelated =
        CMClassPathIsA(detail::writable(broker()), path(className).handle(), ancestor, &status);
    detail::require(status, "look up the superclasses of", className);
    return isRelated != 0;
}

inline Instance Operation::fetch(const Path& path) const {
    detail::Status status;
    CMPIInstance* const instance = broker()->bft->getInstance(
        detail::writable(broker()), detail::writable(context_.handle()), path.handle(), properties_, &status);
    return {broker(), detail::made(instance, status, "find the instance of", path.className())};
}

// Associations

inline bool Operation::passes(detail::ClassFilter& filter, const char* className) const {
    if (!detail::isGiven(filter.ancestor)) {
        return true;
    }
    if (filter.last != className) {
        filter.lastPasses = isRelated(className, filter.ancestor);
        filter.last = className;
    }
    return filter.lastPasses;
}

// Whether an end of an association is the object that the client asks about.
inline bool Operation::isNearEnd(const Instance::End& end) const {
    return (!detail::isGiven(filter_->role) || detail::sameName(filter_->role, end.role.c_str())) &&
           Path(broker(), end.path).names(path_);
}

// Whether an end is one that the client asks for.
inline bool Operation::isFarEnd(const std::vector<Instance::End>& ends, std::size_t index) const {
    const Instance::End& end = ends[index];
    if (detail::isGiven(filter_->resultRole) && !detail::sameName(filter_->resultRole, end.role.c_str())) {
        return false;
    }
    for (std::size_t i = 0; i < ends.size(); ++i) {
        if (i != index && isNearEnd(ends[i])) {
            return !detail::isGiven(filter_->resultClass.ancestor) ||
                   passes(filter_->resultClass, Path(broker(), end.path).className());
        }
    }
    return false;
}

// Whether an association with these ends has anything that the client asks for.
inline bool Operation::isAsked(const std::vector<Instance::End>& ends) const {
    const bool isReference =
        wanted_ == detail::Wanted::references || wanted_ == detail::Wanted::referenceNames;
    for (std::size_t i = 0; i < ends.size(); ++i) {
        if (isReference ? isNearEnd(ends[i]) : isFarEnd(ends, i)) {
            return true;
        }
    }
    return false;
}

inline bool Operation::mayWant(const Operation& operation, const char* className,
                               const Instance& association) {
    return operation.passes(operation.filter_->associationClass, className) &&
           (association.ends_.size() < 2 || operation.isAsked(association.ends_));
}

} // namespace oxahv
