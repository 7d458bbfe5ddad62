/**
 * @file
 * oxahv::Path, the name of an object: a namespace, a class and keys.
 */
#pragma once

#include "Value.h"
#include "detail/Read.h"

#include <string>

namespace oxahv {

/**
 * An object path of the request that is being answered. A handle: copies name the same path, which belongs to
 * the request and dies with it. Used by the thread that serves the request.
 */
class Path {
public:
    /**
     * A path that the broker made or handed out.
     * @param handle not null; may be a class's path, which has no keys.
     */
    Path(const CMPIBroker* broker, const CMPIObjectPath* handle)
        : broker_(broker), handle_(detail::writable(handle)) {}

    /** The CMPI handle, which belongs to the request. */
    CMPIObjectPath* handle() const { return handle_; }
    /** The class's name, which belongs to the request. @throws Refusal with the broker's status */
    const char* className() const { return detail::classNameOf(handle_); }
    /** The namespace, which belongs to the request. @throws Refusal with the broker's status */
    const char* nameSpace() const { return detail::nameSpaceOf(handle_); }
    /** Whether the class has this name, in any case. @throws Refusal with the broker's status */
    bool isClass(const char* name) const { return detail::sameName(className(), name); }

    /**
     * Reads a key, however the server delivers it: a number in any integer type or as decimal text, a text as
     * `CMPI_string` or `CMPI_chars`, a boolean or a date also as text.
     * @tparam T `bool`, an integer, an enumeration, `float`, `double`, `std::string`, `std::wstring`,
     * `std::chrono::system_clock::time_point`, a `std::chrono::duration`, TK::DateTime, Path, or a
     * `std::optional` of one of these, which is empty when the key is missing or NULL.
     * @param name the key's name, in any case.
     * @throws Refusal `CMPI_RC_ERR_INVALID_PARAMETER` naming the key when it is missing, NULL, out of range
     * or of another type; else the broker's status.
     * @throws std::bad_alloc
     */
    template <class T>
    T key(const char* name) const {
        return detail::as<T>(detail::keyOf(broker_, handle_, name));
    }

    /**
     * Adds a key.
     * @return this path.
     * @throws Refusal with the broker's status, or `CMPI_RC_ERR_FAILED` for a value that is NULL.
     * @throws std::bad_alloc
     */
    Path& addKey(const char* name, const Value& value);

    /**
     * Whether another path names the same object: the same class and keys, in any order, names in any case,
     * numbers in any type. Namespaces are not compared: a client may leave them out of a reference.
     * @throws Refusal `CMPI_RC_ERR_INVALID_PARAMETER` when a key cannot be compared: NULL, or of a type that
     * no server makes of the other path's, such as a text for a reference; else the broker's status.
     */
    bool names(const Path& other) const;

private:
    const CMPIBroker* broker_;
    CMPIObjectPath* handle_;
};

inline Value::Value(const Path& value) : Value(value.handle()) {}

} // namespace oxahv

#include "detail/Write.h" // the members that hand values over; after the class, which it needs
