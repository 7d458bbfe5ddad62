// How a request fails: as an operation, which CIM answers with a code, or as a whole, which HTTP does.
#pragma once

#include <cmpidt.h>

#include <stdexcept>
#include <string>

namespace cimxml {

// An operation that cannot be done. The other operations of the same request go on.
class CimError : public std::runtime_error {
public:
    CimError(CMPIrc code, const std::string& description) : std::runtime_error(description), code_(code) {}
    CMPIrc code() const { return code_; }

private:
    CMPIrc code_;
};

// A request that cannot be read. `cimError` is the value of the header CIMError; none when it is empty.
class HttpError : public std::runtime_error {
public:
    HttpError(int status, std::string cimError, const std::string& text)
        : std::runtime_error(text), status_(status), cimError_(std::move(cimError)) {}
    int status() const { return status_; }
    const std::string& cimError() const { return cimError_; }

private:
    int status_;
    std::string cimError_;
};

} // namespace cimxml
