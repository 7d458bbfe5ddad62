// CMPI as the kit calls it: each call with a status, and each status looked at.
//
// TK::ProviderUtilities drops the status of what it sets and makes, and reads values without a look at their
// type. A provider of the kit answers with the broker's own code and text, and with a text about the key that
// has the wrong type; where the library cannot say, the kit therefore asks CMPI itself.
//
// The CMPI headers of CIM servers differ in their `const`s: handles are stripped of it, and go through the
// CM… names alone. A status is reset before each call, since a broker need not touch it on success.
#pragma once

#include "../Refusal.h"

#include <cmpimacs.h>
#include <strings.h>

namespace oxahv::detail {

template <class Handle>
Handle* writable(const Handle* handle) {
    return const_cast<Handle*>(handle);
}

struct Status : CMPIStatus {
    Status() : CMPIStatus() {
        rc = CMPI_RC_OK;
        msg = nullptr;
    }
    Status(const CMPIStatus& status) : CMPIStatus(status) {} // NOLINT(*-explicit-*): the broker's is one
    bool failed() const { return rc != CMPI_RC_OK; }
};

inline bool isNull(const CMPIData& data) {
    return (data.state & CMPI_nullValue) != 0;
}

inline bool sameName(const char* a, const char* b) {
    return ::strcasecmp(a, b) == 0;
}

// The characters of a string, which belong to it; null when there are none to read.
inline const char* charsOf(const CMPIString* string) {
    Status status;
    const char* const chars = string != nullptr ? CMGetCharsPtr(writable(string), &status) : nullptr;
    return status.failed() ? nullptr : chars;
}

// Throws the broker's own code and text; where it gave no text, `what` and `name` say what failed.
[[noreturn, gnu::cold, gnu::noinline]] inline void refuse(const CMPIStatus& status, const char* what,
                                                          const char* name = nullptr) {
    const char* const own = charsOf(status.msg);
    const CMPIrc code = status.rc != CMPI_RC_OK ? status.rc : CMPI_RC_ERR_FAILED;
    if (own != nullptr && *own != '\0') {
        throw Refusal(code, own);
    }
    throw Refusal(code, std::string("the broker did not ") + what + (name != nullptr ? " " : "") +
                            (name != nullptr ? name : ""));
}

inline void require(const CMPIStatus& status, const char* what, const char* name = nullptr) {
    if (status.rc != CMPI_RC_OK) {
        refuse(status, what, name);
    }
}

// An object that the broker made or handed out: null with CMPI_RC_OK is a failure as well.
template <class Object>
Object* made(Object* object, const Status& status, const char* what, const char* name = nullptr) {
    if (status.failed() || object == nullptr) {
        refuse(status, what, name);
    }
    return object;
}

// A text that a request is about.
inline const char* requiredChars(const CMPIString* string, const char* what) {
    Status status;
    const char* const chars =
        CMGetCharsPtr(writable(made(string, status, what)), &status); // belongs to the string
    return made(chars, status, what);
}

inline const char* nameSpaceOf(const CMPIObjectPath* path) {
    Status status;
    const CMPIString* const name = CMGetNameSpace(writable(path), &status);
    require(status, "tell the namespace");
    return requiredChars(name, "tell the namespace");
}

inline const char* classNameOf(const CMPIObjectPath* path) {
    Status status;
    const CMPIString* const name = CMGetClassName(writable(path), &status);
    require(status, "tell the class");
    return requiredChars(name, "tell the class");
}

} // namespace oxahv::detail
