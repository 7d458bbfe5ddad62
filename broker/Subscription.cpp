#include "Subscription.h"

#include "Core.h"
#include "hosting/ProviderCall.h"

namespace oxahv {

namespace {

std::shared_ptr<ActiveFilter> filterOf(Core& core, const IndicationFilter& filter) {
    try {
        return std::make_shared<ActiveFilter>(core, filter);
    } catch (const Failure& failure) {
        const std::string text = failure.text != nullptr ? *failure.text : codeName(failure.code);
        throw SubscriptionError(failure.code, "the filter's query: " + text);
    }
}

} // namespace

SubscriptionError::SubscriptionError(CMPIrc code, const std::string& message)
    : BrokerError(message), code_(code) {}
SubscriptionError::~SubscriptionError() = default;

class Subscription::Impl {
public:
    Impl(Core& itsCore, const IndicationFilter& itsFilter)
        : core(itsCore), filter(filterOf(itsCore, itsFilter)) {}
    ~Impl() {
        if (!filter->isClosed()) {
            runOnThread([this] { core.indications.deactivate(*filter); });
        }
    }
    Impl(const Impl&) = delete;
    Impl& operator=(const Impl&) = delete;

    Core& core;
    std::shared_ptr<ActiveFilter> filter;
};

Subscription::Subscription(EmbeddedBroker& broker, const IndicationFilter& filter)
    : impl_(std::make_unique<Impl>(broker.impl(), filter)) {
    impl_->core.indications.activate(impl_->filter);
}

Subscription::~Subscription() = default;

CMPIInstance* Subscription::next(std::chrono::milliseconds timeout) {
    return impl_->filter->next(timeout);
}

std::size_t Subscription::waiting() const {
    return impl_->filter->waiting();
}

std::vector<std::string> Subscription::providers() const {
    return impl_->core.indications.providersOf(*impl_->filter);
}

void Subscription::end() {
    impl_->core.indications.deactivate(*impl_->filter);
}

} // namespace oxahv
