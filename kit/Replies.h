/**
 * @file
 * oxahv::Instances and oxahv::Names, where a provider puts its results one by one.
 */
#pragma once

#include "Operation.h"

namespace oxahv {

class AssociationProvider;

/** Takes the paths of a reply. Each goes to the client at once; nothing is collected. */
class Names {
public:
    Names(const Names&) = delete;
    Names& operator=(const Names&) = delete;
    /** Returns a path to the client. @throws Refusal with the broker's status */
    void add(const Path& path) {
        detail::require(CMReturnObjectPath(result_, path.handle()), "return a path");
        ++count_;
    }

private:
    friend struct detail::Service;
    friend class Instances;
    explicit Names(const CMPIResult* result) : result_(detail::writable(result)) {}

    CMPIResult* result_;
    std::size_t count_ = 0;
};

/**
 * Takes the instances of a reply. Each goes to the client at once; nothing is collected. What the client gets
 * depends on the request: the instance, its name, or nothing when it is not the one asked for.
 */
class Instances {
public:
    Instances(const Instances&) = delete;
    Instances& operator=(const Instances&) = delete;
    /**
     * Returns an instance to the client, or what the client asks for in its place.
     * @throws Refusal with the broker's status
     * @throws std::bad_alloc
     */
    void add(const Instance& instance);
    /** Whether the client has all that it wants: a loop may then end early. */
    bool isComplete() const { return isOne_ && names_.count_ > 0; }

private:
    friend struct detail::Service;
    friend class InstanceProvider;
    // The instance at an end of an association.
    using End = Instance (*)(AssociationProvider& provider, const Operation& operation, const Path& path);

    Instances(const Operation& operation, Names& names, bool isOne = false)
        : operation_(&operation), names_(names), isOne_(isOne) {}

    void give(const Instance& instance) {
        detail::require(CMReturnInstance(names_.result_, instance.handle_), "return an instance");
        ++names_.count_;
    }
    std::vector<Instance::End> endsOf(const Instance& instance) const;
    void giveEnds(const std::vector<Instance::End>& ends);
    void addAssociation(const Instance& instance);

    const Operation* operation_;
    Names& names_;
    bool isOne_; // whether the client asks for one instance
    // Of a request for associations alone.
    AssociationProvider* provider_ = nullptr;
    End end_ = nullptr;
    void (Instances::*addAssociation_)(const Instance& instance) = nullptr;
};

// Of an instance that the kit has made, its ends were noted when it was made.
inline std::vector<Instance::End> Instances::endsOf(const Instance& instance) const {
    if (instance.path_ != nullptr) {
        return instance.ends_;
    }
    std::vector<Instance::End> ends;
    detail::Status status;
    const CMPICount count = CMGetPropertyCount(instance.handle_, &status);
    detail::require(status, "count the properties");
    for (CMPICount i = 0; i < count; ++i) {
        CMPIString* name = nullptr;
        const CMPIData data = CMGetPropertyAt(instance.handle_, i, &name, &status);
        detail::require(status, "list the properties");
        if (data.type == CMPI_ref && !detail::isNull(data) && data.value.ref != nullptr) {
            ends.push_back({detail::requiredChars(name, "tell the name of a property"), data.value.ref});
        }
    }
    return ends;
}

// An association may lead from an object to itself, which is returned once then.
inline void Instances::giveEnds(const std::vector<Instance::End>& ends) {
    std::vector<Path> given;
    for (std::size_t i = 0; i < ends.size(); ++i) {
        const Path end(operation_->broker(), ends[i].path);
        bool isGiven = !operation_->isFarEnd(ends, i);
        for (std::size_t earlier = 0; earlier < given.size() && !isGiven; ++earlier) {
            isGiven = given[earlier].names(end);
        }
        if (isGiven) {
            continue;
        }
        if (operation_->wanted_ == detail::Wanted::associators) {
            give(end_(*provider_, *operation_, end));
        } else {
            names_.add(end);
        }
        given.push_back(end);
    }
}

inline void Instances::addAssociation(const Instance& instance) {
    const std::vector<Instance::End> ends = endsOf(instance);
    const bool isForeign = instance.path_ == nullptr;
    if (isForeign &&
        !operation_->passes(operation_->filter_->associationClass, instance.path().className())) {
        return;
    }
    switch (operation_->wanted_) {
    case detail::Wanted::references:
    case detail::Wanted::referenceNames:
        if (!operation_->isAsked(ends)) {
            return;
        }
        if (operation_->wanted_ == detail::Wanted::references) {
            give(instance);
        } else {
            names_.add(instance.path());
        }
        return;
    default:
        giveEnds(ends);
    }
}

inline void Instances::add(const Instance& instance) {
    if (!instance.isWanted_ || isComplete()) {
        return;
    }
    switch (operation_->wanted_) {
    case detail::Wanted::oneInstance:
        if (instance.path_ == nullptr && !instance.path().names(operation_->path())) {
            return;
        }
        give(instance);
        return;
    case detail::Wanted::instances:
        give(instance);
        return;
    case detail::Wanted::names:
        names_.add(instance.path());
        return;
    default:
        (this->*addAssociation_)(instance);
    }
}

} // namespace oxahv
