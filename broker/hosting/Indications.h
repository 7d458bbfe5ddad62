// The filters of subscriptions: where they are active, and which of them a delivered indication passes.
#pragma once

#include "Subscription.h"
#include "hosting/HostedProvider.h"
#include "query/SelectExpression.h"

#include <condition_variable>
#include <deque>
#include <memory>
#include <mutex>
#include <shared_mutex>
#include <string>
#include <vector>

namespace oxahv {

struct Outcome;

// The filter of one subscription, with the indications that wait for its client.
class ActiveFilter {
public:
    // Throws Failure for a faulty query.
    ActiveFilter(Core& core, const IndicationFilter& filter);

    const std::string& fromClass() const { return expression_->query->className(); }
    const std::string& nameSpace() const { return nameSpace_; }
    const std::string& owner() const { return owner_; }
    const CMPISelectExp* expression() const { return expression_.get(); }
    // The class whose instances are to be watched.
    const std::string& watchedClass() const { return watchedClass_; }

    // Keeps a copy of the indication if it passes.
    void offer(const std::string& nameSpace, const Instance& indication);
    CMPIInstance* next(std::chrono::milliseconds timeout);
    std::size_t waiting() const;
    // Nothing is kept any more. False if that was so already.
    bool close();
    bool isClosed() const;

private:
    friend class Indications;

    Core& core_;
    Exposed<SelectExpression> expression_; // nobody's: a provider that releases it does no harm
    std::string nameSpace_;
    std::string owner_;
    std::string watchedClass_;
    std::vector<std::shared_ptr<HostedProvider>> providers_; // Indications locks it
    mutable std::mutex mutex_;
    std::condition_variable arrival_;
    Owner kept_;
    std::deque<Instance*> waiting_; // what kept_ has, in order
    bool isClosed_ = false;
};

class Indications {
public:
    explicit Indications(Core& core) : core_(core) {}

    // Throws SubscriptionError when no provider activates the filter.
    void activate(const std::shared_ptr<ActiveFilter>& filter);
    void deactivate(ActiveFilter& filter);
    // Deactivates all filters at a provider that is about to end.
    void leave(const std::shared_ptr<HostedProvider>& provider);
    std::vector<std::string> providersOf(const ActiveFilter& filter) const;

    void deliver(const std::string& nameSpace, const Instance& indication) const;

private:
    using Filters = std::vector<std::shared_ptr<ActiveFilter>>;

    Filters active() const;
    void remove(const ActiveFilter& filter);
    bool isActiveAt(const HostedProvider& provider, const std::string* fromClass) const;
    Outcome activateAt(const HostedProvider& provider, const ActiveFilter& filter) const;
    void deactivateAt(const HostedProvider& provider, const ActiveFilter& filter) const;

    Core& core_;
    // Held while providers are called, so that their first and last filters are known. Deliveries do not take
    // it: a provider may wait in deActivateFilter for the thread that delivers.
    mutable std::mutex changing_;
    mutable std::shared_mutex mutex_; // of the list
    Filters active_;
};

} // namespace oxahv
