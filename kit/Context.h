/**
 * @file
 * oxahv::Context, what the CIM server says about itself and about a request.
 */
#pragma once

#include "detail/Read.h"

namespace oxahv {

/**
 * The context of a factory call or of a request, with the broker. A handle, good as long as the call lasts:
 * the broker alone may be kept.
 */
class Context {
public:
    /** The context of a call. */
    Context(const CMPIBroker* broker, const CMPIContext* handle) : broker_(broker), handle_(handle) {}

    /** The CIM server; good until the provider's object is destroyed. */
    const CMPIBroker* broker() const { return broker_; }
    /** The CMPI handle. */
    const CMPIContext* handle() const { return handle_; }

    /**
     * Reads an entry, such as `CMPIPrincipal`, or one of the server's configuration.
     * @tparam T as of Path::key.
     * @throws Refusal `CMPI_RC_ERR_INVALID_PARAMETER` naming the entry when it is missing, NULL, out of range
     * or of another type; else the broker's status.
     * @throws std::bad_alloc
     */
    template <class T>
    T get(const char* name) const {
        return detail::as<T>(detail::entryOf(broker_, handle_, name));
    }

private:
    const CMPIBroker* broker_;
    const CMPIContext* handle_;
};

} // namespace oxahv
