// How a failed system call becomes an exception.
#pragma once

#include <cerrno>
#include <string>
#include <system_error>

namespace TK {

// Throws the failure that errno holds.
[[noreturn]] inline void fail(const char* action, const std::string& path) {
    const int code = errno;
    throw std::system_error(code, std::generic_category(), std::string(action) + " '" + path + "'");
}

} // namespace TK
