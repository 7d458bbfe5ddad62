// The broker behind its public class.
#pragma once

#include "classes/Classes.h"
#include "hosting/AttachedThreads.h"
#include "hosting/Delivery.h"
#include "hosting/Hosting.h"
#include "hosting/Indications.h"
#include "objects/Quarantine.h"
#include "objects/Records.h"
#include "repository/Repository.h"
#include "tables/Hooks.h"

#include <array>
#include <atomic>
#include <functional>
#include <map>

namespace oxahv {

extern const CMPIBrokerFT requestTable;
extern const CMPIBrokerEncFT encapsulationTable;
extern const CMPIBrokerExtFT systemTable;
extern const CMPIBrokerMemFT memoryTable;

class EmbeddedBroker::Impl {
public:
    void countObject(Kind kind, int change) {
        counts_[shardOfThread()].part[static_cast<std::size_t>(kind)].fetch_add(change,
                                                                                std::memory_order_relaxed);
    }
    LiveObjects liveObjects() const;

    // Passes a provider's message on to the program.
    void tell(const BrokerMessage& message) const;
    void setMessageHandler(std::function<void(const BrokerMessage&)> handler);

    // Says that an upcall found no provider.
    void tellUnserved(const std::string& className) const;
    void setUnservedHandler(std::function<void(const std::string&)> handler);

    void setContextEntry(const std::string& name, const std::string& text);
    // Puts the program's entries into a new context.
    void addContextEntries(Context& context);
    // And what it says of the client.
    void addClientEntries(Context& context, const std::string& principal, CMPIFlags flags);

private:
    // Before the owner, whose objects are counted to the last. What one thread makes another may free: a
    // single part may fall below zero, the sum is exact.
    Shards<std::array<std::atomic<int>, kindCount>> counts_{};
    mutable ShardedMutex handlerMutex_;
    std::function<void(const BrokerMessage&)> handler_;
    std::function<void(const std::string&)> unservedHandler_;
    ShardedMutex contextMutex_;
    std::map<std::string, std::string> contextEntries_;

public:
    CMPIBroker record = {this, &requestTable, &encapsulationTable, &systemTable, &memoryTable};
    Quarantine quarantine;
    Classes classes; // before the owners, whose instances have its names
    Owner owner{*this};
    Owner clones{*this}; // apart from what a memory mark frees: they are their callers'
    Delivery delivery;
    Hooks hooks;
    Repository repository{*this};
    AttachedThreads attachedThreads; // after the owners and before the providers, which may leave threads
    Indications indications{*this};
    Hosting hosting{*this};
    std::atomic<NewInstances> newInstances{NewInstances::full};
};

// The broker of a handle; null for a null handle and for another broker's.
inline Core* coreOf(const CMPIBroker* handle) {
    return handle != nullptr && handle->bft == &requestTable
               ? static_cast<Core*>(const_cast<void*>(handle->hdl))
               : nullptr;
}

} // namespace oxahv
