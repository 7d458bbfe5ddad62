/**
 * @file
 * oxahv::PropertyProvider, a provider of single properties.
 */
#pragma once

#include "Operation.h"

namespace oxahv {

/** A value that a client sent for a property. Good as long as the provider's function runs. */
class SentValue {
public:
    /**
     * Reads it.
     * @tparam T as of Instance::get.
     * @throws Refusal `CMPI_RC_ERR_INVALID_PARAMETER` naming the property when it is NULL, out of range or of
     * another type; else the broker's status.
     * @throws std::bad_alloc
     */
    template <class T>
    T as() const {
        return detail::as<T>(found_);
    }

private:
    friend struct detail::Service;
    explicit SentValue(const detail::Found& found) : found_(found) {}
    detail::Found found_;
};

/** Takes the value of a property for the client. */
class ValueReply {
public:
    ValueReply(const ValueReply&) = delete;
    ValueReply& operator=(const ValueReply&) = delete;
    /** Returns the value; see Value.h. @throws Refusal with the broker's status @throws std::bad_alloc */
    void give(const Value& value) {
        detail::ValueAccess::giveResult(operation_.broker(), result_, name_, value);
    }

private:
    friend struct detail::Service;
    ValueReply(const Operation& operation, const CMPIResult* result, const char* name)
        : operation_(operation), result_(result), name_(name) {}
    const Operation& operation_;
    const CMPIResult* result_;
    const char* name_;
};

/**
 * A provider of single properties, of the object that the request's path names. What it leaves out answers
 * `CMPI_RC_ERR_NOT_SUPPORTED`. Threads, failure and locale are as of InstanceProvider.
 */
class PropertyProvider {
public:
    /** A provider that serves nothing yet. */
    PropertyProvider() = default;
    virtual ~PropertyProvider() = default;
    PropertyProvider(const PropertyProvider&) = delete;
    PropertyProvider& operator=(const PropertyProvider&) = delete;

    /** Returns a property. @param name as the client wrote it, in any case */
    virtual void getProperty(const Operation& operation, const char* name, ValueReply& reply);
    /** Sets a property. @param name as the client wrote it, in any case @param value what it becomes */
    virtual void setProperty(const Operation& operation, const char* name, const SentValue& value);
};

inline void PropertyProvider::getProperty(const Operation& /*operation*/, const char* /*name*/,
                                          ValueReply& /*reply*/) {
    throw Refusal(CMPI_RC_ERR_NOT_SUPPORTED, "this provider returns no single properties");
}

inline void PropertyProvider::setProperty(const Operation& /*operation*/, const char* /*name*/,
                                          const SentValue& /*value*/) {
    throw Refusal(CMPI_RC_ERR_NOT_SUPPORTED, "this provider sets no single properties");
}

} // namespace oxahv
