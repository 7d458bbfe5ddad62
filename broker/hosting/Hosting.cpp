#include "hosting/Hosting.h"

#include "Core.h"
#include "hosting/ProviderCall.h"

#include <algorithm>
#include <iterator>
#include <typeinfo>

namespace oxahv {

Reply Hosting::refused(CMPIrc code, std::string message) {
    Reply reply;
    reply.code = code;
    reply.message = std::move(message);
    return reply;
}

namespace {

Reply unserved(CMPIrc code, std::string message) {
    Reply reply = Hosting::refused(code, std::move(message));
    reply.isServed = false;
    return reply;
}

// How much an answer says: of several, the first of those that say most counts.
enum class Weight { none, refusal, notFound, success, failure };

Weight weightOf(const Result& answer) {
    const Reply& reply = answer.reply;
    if (reply.ok() || answer.count > 0) {
        return reply.ok() ? Weight::success : Weight::failure;
    }
    switch (reply.code) {
    case CMPI_RC_ERR_NOT_SUPPORTED: // a provider says that the class is not its own
    case CMPI_RC_ERR_INVALID_CLASS:
        return Weight::refusal;
    case CMPI_RC_ERR_NOT_FOUND: // that the instance is not, which another's may be
        return Weight::notFound;
    default:
        return Weight::failure;
    }
}

template <class Element>
void append(std::vector<Element>& list, const std::vector<Element>& more) {
    list.insert(list.end(), more.begin(), more.end());
}

// The answers of the providers that are asked for one request.
class Answers {
public:
    explicit Answers(Reply unserved) : reply_(std::move(unserved)) {}

    Weight weight() const { return weight_; }
    std::size_t results() const { return results_; }
    Reply take() { return std::move(reply_); }

    void add(const HostedProvider& provider, const Result& result) {
        const Reply& answer = result.reply;
        const Weight weight = weightOf(result);
        results_ += result.count;
        reply_.answers.push_back({provider.name(), answer.code, answer.message, result.count});
        append(reply_.instances, answer.instances);
        append(reply_.objectPaths, answer.objectPaths);
        append(reply_.data, answer.data);
        append(reply_.errors, answer.errors);
        reply_.isServed = reply_.isServed || !provider.servesAll() || weight != Weight::refusal;
        if (weight > weight_) {
            weight_ = weight;
            reply_.code = answer.code;
            reply_.message = answer.message;
            reply_.done = answer.done;
        } else if (weight == weight_) {
            reply_.done = reply_.done && answer.done;
        }
    }

private:
    Reply reply_;
    Weight weight_ = Weight::none;
    std::size_t results_ = 0;
};

// What the thread is inside of. A provider that calls up for a class of another may be the only one that is
// asked, and would call up for ever.
class Ongoing {
public:
    static constexpr std::size_t deepest = 1000;

    Ongoing(const HostedProvider* provider, const std::type_info& operation, const std::string& className)
        : provider_(provider), operation_(operation), className_(className), outer_(innermost),
          depth_(depth() + 1) {
        innermost = this;
    }
    ~Ongoing() { innermost = outer_; }
    Ongoing(const Ongoing&) = delete;
    Ongoing& operator=(const Ongoing&) = delete;

    static std::size_t depth() { return innermost != nullptr ? innermost->depth_ : 0; }
    static bool includes(const HostedProvider* provider) {
        return any([&](const Ongoing& one) { return one.provider_ == provider; });
    }
    static bool includes(const HostedProvider* provider, const std::type_info& operation,
                         const std::string& className) {
        return any([&](const Ongoing& one) {
            return one.provider_ == provider && one.operation_ == operation &&
                   sameName(one.className_, className);
        });
    }

private:
    template <class Predicate>
    static bool any(const Predicate& is) {
        for (const Ongoing* one = innermost; one != nullptr; one = one->outer_) {
            if (is(*one)) {
                return true;
            }
        }
        return false;
    }

    static thread_local const Ongoing* innermost;
    const HostedProvider* provider_;
    const std::type_info& operation_;
    const std::string& className_;
    const Ongoing* outer_;
    std::size_t depth_;
};
thread_local const Ongoing* Ongoing::innermost = nullptr;

} // namespace

Hosting::~Hosting() { // NOLINT(bugprone-exception-escape): nothing that it names is missing
    // In the order in which they came; each may still send requests to those after it.
    while (!providers_.empty()) {
        take(providers_.front()->name());
    }
}

// The provider leaves the list under the lock, but ends without it: its cleanup may send requests.
std::shared_ptr<HostedProvider> Hosting::take(const std::string& name) {
    const std::unique_lock<ShardedMutex> lock(mutex_);
    const auto found = std::find_if(providers_.begin(), providers_.end(),
                                    [&](const auto& provider) { return provider->name() == name; });
    if (found == providers_.end()) {
        throw BrokerError("no provider " + name + " is hosted");
    }
    std::shared_ptr<HostedProvider> taken = std::move(*found);
    providers_.erase(found);
    return taken;
}

void Hosting::requireFreeName(const std::string& name) const {
    const std::shared_lock<ShardedMutex> lock(mutex_);
    requireFreeNameLocked(name);
}

void Hosting::requireFreeNameLocked(const std::string& name) const {
    for (const std::shared_ptr<HostedProvider>& provider : providers_) {
        if (provider->name() == name) {
            throw BrokerError("a provider " + name + " is hosted already");
        }
    }
}

void Hosting::add(std::shared_ptr<HostedProvider> provider) {
    const std::unique_lock<ShardedMutex> lock(mutex_);
    requireFreeNameLocked(provider->name()); // another thread may have been faster
    providers_.push_back(std::move(provider));
}

void Hosting::host(const std::string& name, const ProviderFactories& factories,
                   std::vector<std::string> classes) {
    requireFreeName(name);
    auto provider = std::make_shared<HostedProvider>(core_, name, std::move(classes));
    provider->create(factories);
    add(std::move(provider));
}

void Hosting::load(const std::string& file, const std::string& name, std::vector<std::string> classes) {
    requireFreeName(name);
    auto provider = std::make_shared<HostedProvider>(core_, name, std::move(classes));
    provider->load(file);
    add(std::move(provider));
}

void Hosting::unload(const std::string& name) {
    std::shared_ptr<HostedProvider> provider = take(name);
    core_.indications.leave(provider);
    const std::future<void> gone = provider->gone();
    provider.reset();
    gone.wait();
}

template <class Predicate>
Hosting::Providers Hosting::providersThat(const Predicate& match) const {
    const std::shared_lock<ShardedMutex> lock(mutex_);
    Providers found;
    std::copy_if(providers_.begin(), providers_.end(), std::back_inserter(found),
                 [&](const auto& provider) { return match(*provider); });
    return found;
}

Hosting::Providers Hosting::find(const ObjectPath& path, const Operation& operation) const {
    const std::string_view association = operation.associationClass();
    const bool isOfAnyAssociation = operation.isAlongAssociations() && association.empty();
    const std::string_view wanted = association.empty() ? path.className : association;
    Providers found;
    if (!isOfAnyAssociation) {
        found = providersThat([&](const HostedProvider& p) {
            return operation.isOfferedBy(p) &&
                   (p.serves(core_.classes, wanted) ||
                    (!association.empty() && p.servesPartOf(core_.classes, wanted)));
        });
    }
    using Kept = Repository::Kept;
    const std::shared_ptr<HostedProvider> repository = core_.repository.provider();
    const bool isKept = repository != nullptr && operation.isOfferedBy(*repository);
    const Kept kept = isKept && !isOfAnyAssociation ? core_.repository.kept(wanted) : Kept::no;
    if (found.empty() && kept == Kept::itself) {
        return {repository}; // before those that may serve any class: they do not name this one
    }
    if (found.empty()) {
        found = providersThat([&](const HostedProvider& p) {
            return operation.isOfferedBy(p) &&
                   (p.servesAll() || (isOfAnyAssociation && p.mayAssociate(core_.classes, path.className)));
        });
    }
    // One that calls up for a class of another is to get that call last.
    std::stable_partition(found.begin(), found.end(),
                          [](const auto& provider) { return !Ongoing::includes(provider.get()); });
    if (isKept && (kept == Kept::inPart || (isOfAnyAssociation && core_.repository.keepsAssociations()))) {
        found.push_back(repository);
    }
    return found;
}

Hosting::Providers Hosting::findForIndications(const std::string& className) const {
    return providersThat([&](const HostedProvider& p) {
        return p.mi<CMPIIndicationMI>() != nullptr && (p.servesAll() || p.serves(core_.classes, className) ||
                                                       p.servesPartOf(core_.classes, className));
    });
}

// Has a provider serve a request; its results and its status come to be the reply of `result`.
void Hosting::ask(const HostedProvider& provider, const CMPIContext* context, const CMPIObjectPath* path,
                  const Operation& operation, Result& result) const {
    const CMPIObjectPath* const delivered = core_.delivery.deliver(path);
    const Outcome outcome =
        callProvider([&] { return operation.call(provider, context, &result, delivered); });
    Reply& reply = result.reply;
    if (outcome.code != CMPI_RC_OK) { // else an error that the provider returned as a result is kept
        reply.code = outcome.code;
        reply.message = outcome.message.empty() ? reply.message : outcome.message;
    }
}

Reply Hosting::serve(const CMPIContext* context, const CMPIObjectPath* handle, const Operation& operation) {
    const ObjectPath* const path = ObjectPath::of(handle);
    Context* const own = Context::of(context);
    if (path == nullptr || own == nullptr || !operation.isValid()) {
        return refused(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (core_.classes.any() && core_.classes.find(path->className) == nullptr) {
        return unserved(CMPI_RC_ERR_INVALID_CLASS, "class " + path->className + " is not declared");
    }
    if (Ongoing::depth() >= Ongoing::deepest) {
        return refused(CMPI_RC_ERR_FAILED, "requests are nested " + std::to_string(Ongoing::deepest) +
                                               " deep; the last is for class " + path->className);
    }
    const Receiver* const receiver = std::exchange(own->receiver, nullptr);
    Answers answers(
        unserved(CMPI_RC_ERR_NOT_SUPPORTED, "no provider serves this for class " + path->className));
    for (const std::shared_ptr<HostedProvider>& provider : find(*path, operation)) {
        if (provider->servesAll() && Ongoing::includes(provider.get(), typeid(operation), path->className)) {
            continue;
        }
        const Ongoing ongoing(provider.get(), typeid(operation), path->className);
        const Exposed<Result> result(new Result(core_, Owner::current(core_)));
        result->receiver = receiver;
        result->earlier = answers.results();
        ask(*provider, context, handle, operation, *result);
        answers.add(*provider, *result);
        // Associations may be of several providers; an instance is of one.
        if (!operation.isAlongAssociations() && answers.weight() > Weight::refusal) {
            break;
        }
    }
    return answers.take();
}

} // namespace oxahv
