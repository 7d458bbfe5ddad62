#include "Results.h"

#include "Operations.h"

namespace cimxml {

Results::Results(Environment& environment, bool onceEach, oxahv::InstanceHandler instances,
                 oxahv::PathHandler paths)
    : environment_(environment), onceEach_(onceEach) {
    oxahv::InstanceHandler takeInstance;
    if (instances) {
        takeInstance = [this, write = std::move(instances)](const CMPIInstance* instance) {
            take(pathOf(instance), [&] { write(instance); });
        };
    }
    oxahv::PathHandler takePath;
    if (paths) {
        takePath = [this, write = std::move(paths)](const CMPIObjectPath* path) {
            take(path, [&] { write(path); });
        };
    }
    environment.request.setResultHandlers(std::move(takeInstance), std::move(takePath));
}

Results::~Results() {
    environment_.request.setResultHandlers(nullptr, nullptr);
}

// The handlers run one after the other, though not all on one thread.
template <class Write>
void Results::take(const CMPIObjectPath* path, const Write& write) {
    ++count_;
    try {
        if (!onceEach_ || seen_.insert(oxahv::pathText(path)).second) {
            write();
        }
    } catch (...) {
        failure_ = std::current_exception();
        throw;
    }
}

void Results::require(const oxahv::Reply& reply) const {
    if (failure_) {
        std::rethrow_exception(failure_);
    }
    cimxml::require(reply);
}

} // namespace cimxml
