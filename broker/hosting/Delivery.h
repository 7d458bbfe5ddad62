// What the object path of a request looks like to a provider. CIM servers and clients differ in the types of
// keys, in the order and case of names, and in hosts. Knows nothing of providers.
#pragma once

#include "EmbeddedBroker.h"
#include "objects/Shards.h"

#include <atomic>
#include <shared_mutex>

namespace oxahv {

class Delivery {
public:
    void setKeyMode(KeyMode mode) { keyMode_.store(mode, std::memory_order_relaxed); }
    void setPathDelivery(PathDelivery pathDelivery);

    // A copy of a path as the modes say; the current owner's. Null for a handle that is no path's.
    CMPIObjectPath* deliver(const CMPIObjectPath* handle) const;

private:
    PathDelivery pathDelivery() const;

    std::atomic<KeyMode> keyMode_{KeyMode::exact};
    mutable ShardedMutex mutex_;
    PathDelivery pathDelivery_;
};

} // namespace oxahv
