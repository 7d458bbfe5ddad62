// The results of a request, written as the provider returns them, so that the broker need not keep them.
#pragma once

#include "Environment.h"

#include <exception>
#include <set>
#include <string>

namespace cimxml {

// Takes the results of a request's operations while this object lives. The handlers write them.
class Results {
public:
    // With `onceEach`, what has the same path as an earlier result is left out. Results without a handler are
    // left in the reply.
    Results(Environment& environment, bool onceEach, oxahv::InstanceHandler instances,
            oxahv::PathHandler paths);
    ~Results();
    Results(const Results&) = delete;
    Results& operator=(const Results&) = delete;

    // How many have come so far.
    std::size_t count() const { return count_; }
    // Throws what a handler has thrown; else CimError, unless the reply's code is CMPI_RC_OK.
    void require(const oxahv::Reply& reply) const;

private:
    template <class Write>
    void take(const CMPIObjectPath* path, const Write& write);

    Environment& environment_;
    const bool onceEach_;
    std::set<std::string> seen_; // the paths
    std::size_t count_ = 0;
    std::exception_ptr failure_; // of a handler, which the provider may have swallowed
};

} // namespace cimxml
