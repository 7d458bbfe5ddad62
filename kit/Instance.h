/**
 * @file
 * oxahv::Instance, an instance that is returned to a client, or that a client sent.
 */
#pragma once

#include "Path.h"

#include <vector>

namespace oxahv {

class Operation;

/**
 * An instance of the request that is being answered, which it belongs to. A handle: copies are the same
 * instance. Used by the thread that serves the request.
 *
 * Operation::instance makes one with its keys. Where the request does not want this instance, or wants its
 * name alone, there is none behind the handle, and what is set is dropped unseen.
 */
class Instance {
public:
    /** An instance that the broker made or handed out. @param handle not null */
    Instance(const CMPIBroker* broker, const CMPIInstance* handle)
        : broker_(broker), handle_(detail::writable(handle)) {}

    /** The CMPI handle, which belongs to the request; null when the request does not want the instance. */
    CMPIInstance* handle() const { return handle_; }
    /** Its path. @throws Refusal with the broker's status */
    Path path() const;
    /** Whether the client will see what is set. It saves a provider what is dear to find out: false where the
     * request does not want this instance, or its name alone. */
    bool isVisible() const { return handle_ != nullptr; }

    /**
     * Sets a property.
     * @param name as the class declares it.
     * @param value see Value.h; an empty `std::optional` sets NULL.
     * @return this instance.
     * @throws Refusal with the broker's status, or `CMPI_RC_ERR_FAILED` for what CIM cannot represent.
     * @throws std::bad_alloc
     */
    Instance& set(const char* name, const Value& value);

    /**
     * Reads a property.
     * @tparam T as of Path::key, and also `char16_t`, Instance, and `std::vector` of any of them.
     * @param name the property's name, in any case.
     * @throws Refusal `CMPI_RC_ERR_INVALID_PARAMETER` naming the property when it is missing, NULL, out of
     * range or of another type; else the broker's status.
     * @throws std::bad_alloc
     */
    template <class T>
    T get(const char* name) const {
        return detail::as<T>(detail::propertyOf(broker_, handle_, name));
    }

private:
    friend class Operation;
    friend class Instances;

    // A reference of an association, to one of its ends.
    struct End {
        std::string role;
        CMPIObjectPath* path;
    };

    Instance(const CMPIBroker* broker, CMPIInstance* handle, CMPIObjectPath* path)
        : broker_(broker), handle_(handle), path_(path) {}

    const CMPIBroker* broker_;
    CMPIInstance* handle_;
    CMPIObjectPath* path_ = nullptr; // null for one that Operation::instance has not made
    bool isWanted_ = true;
    bool isAssociation_ = false; // whether its references are noted, since a client asks by them
    std::vector<End> ends_;
};

inline Value::Value(const Instance& value) : Value(value.handle()) {}

inline Path Instance::path() const {
    if (path_ != nullptr) {
        return {broker_, path_};
    }
    detail::Status status;
    return {broker_, detail::made(CMGetObjectPath(handle_, &status), status, "tell the path of an instance")};
}

inline Instance& Instance::set(const char* name, const Value& value) {
    if (CMPIObjectPath* const end = isAssociation_ ? detail::ValueAccess::referenceIn(value) : nullptr) {
        ends_.push_back({name, end});
    }
    if (handle_ != nullptr) {
        detail::ValueAccess::giveProperty(broker_, handle_, name, value);
    }
    return *this;
}

} // namespace oxahv
