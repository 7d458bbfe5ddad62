#include "hosting/Indications.h"

#include "Core.h"
#include "hosting/ProviderCall.h"

#include <algorithm>

namespace oxahv {

namespace {

std::string_view withoutSlash(std::string_view nameSpace) {
    return nameSpace.substr(std::min(nameSpace.find_first_not_of('/'), nameSpace.size()));
}

// The class of `SourceInstance ISA class`, which every instance that passes is of; null where there is none.
const std::string* sourceClassOf(const QueryCondition& condition) {
    if (condition.kind == QueryCondition::Kind::predicate) {
        const QueryPredicate& predicate = *condition.predicate;
        const auto* const literal = std::get_if<QueryLiteral>(&predicate.right);
        const bool isSource = predicate.operation == CMPI_PredOp_Isa && literal != nullptr &&
                              sameName(predicate.left.text, "SourceInstance");
        return isSource ? std::get_if<std::string>(literal) : nullptr;
    }
    if (condition.kind == QueryCondition::Kind::conjunction) {
        for (const QueryCondition& part : condition.parts) {
            if (const std::string* const found = sourceClassOf(part)) {
                return found;
            }
        }
    }
    return nullptr;
}

std::shared_ptr<const Query> parsed(const Core& core, const IndicationFilter& filter) {
    auto query = Query::parse(filter.query, filter.language);
    query->check(core.classes);
    return query;
}

// The calls of one provider's indication MI for one filter.
class Calls {
public:
    Calls(Core& core, const HostedProvider& provider, const ActiveFilter& filter)
        : core_(core), provider_(provider), filter_(filter), context_(new Context(core)) {
        core.addContextEntries(*context_);
        core.addClientEntries(*context_, filter.owner(), 0);
        context_->values.set(CMPIInitNameSpace, Value::text(core, filter.nameSpace()));
    }

    // Calls a function that gets the filter and more behind the class path. One that the provider lacks is
    // not supported.
    template <class... Rest, class... Given>
    Outcome call(CMPIStatus (*CMPIIndicationMIFT::*slot)(CMPIIndicationMI*, const CMPIContext*,
                                                         const CMPISelectExp*, const char*,
                                                         const CMPIObjectPath*, Rest...),
                 Given... given) const {
        CMPIIndicationMI* const mi = provider_.mi<CMPIIndicationMI>();
        const auto function = mi->ft->*slot;
        if (function == nullptr) {
            return {CMPI_RC_ERR_NOT_SUPPORTED, {}};
        }
        Owner own(core_);
        const Owner::Scope scope(own);
        const CMPIObjectPath* const path =
            handOut(std::make_unique<ObjectPath>(core_, filter_.nameSpace(), filter_.watchedClass()));
        return callProvider([&] {
            return function(mi, context_.get(), filter_.expression(), filter_.fromClass().c_str(), path,
                            given...);
        });
    }

    // Calls a function without a filter. Its status is not looked at: tables of older versions of the
    // standard have functions here that return none.
    Outcome call(CMPIStatus (*CMPIIndicationMIFT::*slot)(CMPIIndicationMI*, const CMPIContext*)) const {
        CMPIIndicationMI* const mi = provider_.mi<CMPIIndicationMI>();
        if (mi->ft->*slot == nullptr) {
            return {};
        }
        Owner own(core_);
        const Owner::Scope scope(own);
        return callProvider([&] {
            (mi->ft->*slot)(mi, context_.get());
            return CMPIStatus{CMPI_RC_OK, nullptr};
        });
    }

    // Has the program know of a call whose failure changes nothing.
    void tell(const char* function, const Outcome& outcome) const {
        if (outcome.code != CMPI_RC_OK) {
            core_.tell({false, CMPI_SEV_ERROR, provider_.name(),
                        "provider " + provider_.name() + ": " + function + " answered " + wordsOf(outcome),
                        true});
        }
    }

private:
    Core& core_;
    const HostedProvider& provider_;
    const ActiveFilter& filter_;
    Exposed<Context> context_;
};

} // namespace

ActiveFilter::ActiveFilter(Core& core, const IndicationFilter& filter)
    : core_(core), expression_(new SelectExpression(core, parsed(core, filter))),
      nameSpace_(filter.nameSpace), owner_(filter.owner), kept_(core) {
    const std::string* const source = sourceClassOf(expression_->query->condition());
    watchedClass_ = source != nullptr ? *source : fromClass();
}

void ActiveFilter::offer(const std::string& nameSpace, const Instance& indication) {
    if (!sameName(withoutSlash(nameSpace), withoutSlash(nameSpace_))) {
        return;
    }
    try {
        if (!expression_->query->accepts(indication)) {
            return;
        }
    } catch (const Failure&) { // values that do not compare
        return;
    }
    std::unique_ptr<Object> copy = indication.clone();
    auto* const kept = static_cast<Instance*>(copy.get());
    expression_->query->project(*kept);
    const std::lock_guard<std::mutex> lock(mutex_);
    if (!isClosed_) {
        waiting_.push_back(kept);
        kept_.adopt(std::move(copy));
        arrival_.notify_one();
    }
}

CMPIInstance* ActiveFilter::next(std::chrono::milliseconds timeout) {
    std::unique_lock<std::mutex> lock(mutex_);
    if (!arrival_.wait_for(lock, timeout, [this] { return !waiting_.empty(); })) {
        return nullptr;
    }
    Instance* const first = waiting_.front();
    waiting_.pop_front();
    Owner::current(core_).adopt(kept_.detach(*first));
    return first;
}

std::size_t ActiveFilter::waiting() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return waiting_.size();
}

bool ActiveFilter::close() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return !std::exchange(isClosed_, true);
}

bool ActiveFilter::isClosed() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return isClosed_;
}

Indications::Filters Indications::active() const {
    const std::shared_lock<std::shared_mutex> lock(mutex_);
    return active_;
}

void Indications::remove(const ActiveFilter& filter) {
    const std::unique_lock<std::shared_mutex> lock(mutex_);
    active_.erase(
        std::remove_if(active_.begin(), active_.end(), [&](const auto& one) { return one.get() == &filter; }),
        active_.end());
}

// Whether a filter is active at a provider: one of a FROM class, or any.
bool Indications::isActiveAt(const HostedProvider& provider, const std::string* fromClass) const {
    const Filters filters = active();
    return std::any_of(filters.begin(), filters.end(), [&](const auto& filter) {
        return (fromClass == nullptr || sameName(filter->fromClass(), *fromClass)) &&
               std::any_of(filter->providers_.begin(), filter->providers_.end(),
                           [&](const auto& one) { return one.get() == &provider; });
    });
}

Outcome Indications::activateAt(const HostedProvider& provider, const ActiveFilter& filter) const {
    const Calls calls(core_, provider, filter);
    const bool isFirst = !isActiveAt(provider, nullptr);
    const bool isFirstOfClass = !isActiveAt(provider, &filter.fromClass());
    calls.call(&CMPIIndicationMIFT::mustPoll);
    Outcome outcome = calls.call(&CMPIIndicationMIFT::activateFilter, CMPIBoolean{isFirstOfClass});
    if (outcome.code == CMPI_RC_OK && isFirst) {
        calls.tell("enableIndications", calls.call(&CMPIIndicationMIFT::enableIndications));
    }
    return outcome;
}

void Indications::deactivateAt(const HostedProvider& provider, const ActiveFilter& filter) const {
    const Calls calls(core_, provider, filter);
    const bool isLastOfClass = !isActiveAt(provider, &filter.fromClass());
    calls.tell("deActivateFilter",
               calls.call(&CMPIIndicationMIFT::deActivateFilter, CMPIBoolean{isLastOfClass}));
    if (!isActiveAt(provider, nullptr)) {
        calls.tell("disableIndications", calls.call(&CMPIIndicationMIFT::disableIndications));
    }
}

void Indications::activate(const std::shared_ptr<ActiveFilter>& filter) {
    const std::lock_guard<std::mutex> lock(changing_);
    SubscriptionError refusal(CMPI_RC_ERR_NOT_SUPPORTED,
                              "no provider serves indications of class " + filter->fromClass());
    bool isRefused = false;
    const auto hasAccepted = [&](const HostedProvider& provider, const Outcome& outcome) {
        if (outcome.code != CMPI_RC_OK && !std::exchange(isRefused, true)) {
            refusal = SubscriptionError(outcome.code, "provider " + provider.name() +
                                                          " refuses the filter: " + wordsOf(outcome));
        }
        return outcome.code == CMPI_RC_OK;
    };
    std::vector<std::shared_ptr<HostedProvider>> authorized;
    for (const auto& provider : core_.hosting.findForIndications(filter->fromClass())) {
        const Calls calls(core_, *provider, *filter);
        if (hasAccepted(*provider,
                        calls.call(&CMPIIndicationMIFT::authorizeFilter, filter->owner().c_str()))) {
            authorized.push_back(provider);
        }
    }
    { // before a provider is told that it may deliver
        const std::unique_lock<std::shared_mutex> listLock(mutex_);
        active_.push_back(filter);
    }
    for (const auto& provider : authorized) {
        if (hasAccepted(*provider, activateAt(*provider, *filter))) {
            filter->providers_.push_back(provider);
        }
    }
    if (filter->providers_.empty()) {
        remove(*filter);
        filter->close();
        throw refusal;
    }
}

void Indications::deactivate(ActiveFilter& filter) {
    if (!filter.close()) {
        return;
    }
    const std::lock_guard<std::mutex> lock(changing_);
    remove(filter);
    for (const auto& provider : std::exchange(filter.providers_, {})) {
        deactivateAt(*provider, filter);
    }
}

void Indications::leave(const std::shared_ptr<HostedProvider>& provider) {
    const std::lock_guard<std::mutex> lock(changing_);
    for (const std::shared_ptr<ActiveFilter>& filter : active()) {
        auto& providers = filter->providers_;
        const auto found = std::find(providers.begin(), providers.end(), provider);
        if (found != providers.end()) {
            providers.erase(found);
            deactivateAt(*provider, *filter);
        }
    }
}

std::vector<std::string> Indications::providersOf(const ActiveFilter& filter) const {
    const std::lock_guard<std::mutex> lock(changing_);
    std::vector<std::string> names;
    for (const auto& provider : filter.providers_) {
        names.push_back(provider->name());
    }
    return names;
}

void Indications::deliver(const std::string& nameSpace, const Instance& indication) const {
    for (const std::shared_ptr<ActiveFilter>& filter : active()) {
        filter->offer(nameSpace, indication);
    }
}

} // namespace oxahv
