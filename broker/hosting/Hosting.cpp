#include "hosting/Hosting.h"

#include "Core.h"

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

// Runs a provider's function. What it throws becomes a status: a provider must not take its server along.
template <class Function>
CMPIStatus guarded(const Function& function, std::string& message) {
    constexpr CMPIStatus thrown = {CMPI_RC_ERR_FAILED, nullptr};
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    try {
        status = function();
    } catch (const std::exception& exception) {
        message = std::string("exception: ") + exception.what();
        return thrown;
    } catch (...) {
        passOnTheEndOfAThread();
        message = "exception of an unknown kind";
        return thrown;
    }
    const String* const text = String::of(status.msg);
    message = text != nullptr ? text->text : std::string(); // what this throws is not the provider's
    return status;
}

// Has a provider serve a request; its results and its status come to be the reply of `result`.
void ask(const HostedProvider& provider, const Operation& operation, const CMPIContext* context,
         const CMPIObjectPath* path, Result& result) {
    std::string message;
    const CMPIStatus status =
        guarded([&] { return operation.call(provider, context, &result, path); }, message);
    if (status.rc != CMPI_RC_OK) { // else an error that the provider returned as a result is kept
        result.reply.code = status.rc;
        result.reply.message = message;
    }
}

Reply unserved(CMPIrc code, std::string message) {
    Reply reply = Hosting::refused(code, std::move(message));
    reply.isServed = false;
    return reply;
}

// Whether a provider has said that the class is not its own.
bool isRefusal(const Reply& reply) {
    return (reply.code == CMPI_RC_ERR_NOT_SUPPORTED || reply.code == CMPI_RC_ERR_INVALID_CLASS) &&
           reply.instances.empty() && reply.objectPaths.empty();
}

// What the thread is inside of. A provider that calls up for a class of another may be the only one that is
// asked, and would call up for ever.
class Ongoing {
public:
    Ongoing(const HostedProvider* provider, const std::type_info& operation, const std::string& className)
        : provider_(provider), operation_(operation), className_(className), outer_(innermost) {
        innermost = this;
    }
    ~Ongoing() { innermost = outer_; }
    Ongoing(const Ongoing&) = delete;
    Ongoing& operator=(const Ongoing&) = delete;

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
    const std::unique_lock<std::shared_mutex> lock(mutex_);
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
    const std::shared_lock<std::shared_mutex> lock(mutex_);
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
    const std::unique_lock<std::shared_mutex> lock(mutex_);
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
    const std::future<void> gone = provider->gone();
    provider.reset();
    gone.wait();
}

Hosting::Providers Hosting::find(const ObjectPath& path, const Operation& operation) const {
    const std::shared_lock<std::shared_mutex> lock(mutex_);
    const auto have = [&](const auto& matches) {
        Providers found;
        std::copy_if(
            providers_.begin(), providers_.end(), std::back_inserter(found),
            [&](const auto& provider) { return operation.isOfferedBy(*provider) && matches(*provider); });
        return found;
    };
    const std::string_view association = operation.associationClass();
    const std::string_view wanted = association.empty() ? path.className : association;
    Providers found = have([&](const HostedProvider& p) { return p.serves(core_.classes, wanted); });
    if (!found.empty()) {
        found.resize(1);
        return found;
    }
    // An association's provider lists its own class, not those of its ends.
    const bool isOfAny = operation.isAlongAssociations() && association.empty();
    found = have([&](const HostedProvider& p) { return isOfAny || p.servesAll(); });
    std::stable_partition(found.begin(), found.end(),
                          [](const auto& provider) { return !Ongoing::includes(provider.get()); });
    return found;
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
    const std::function<void(std::size_t)>* const progress = std::exchange(own->progress, nullptr);
    Reply reply = unserved(CMPI_RC_ERR_NOT_SUPPORTED, "no provider serves this for class " + path->className);
    bool isAsked = false;
    for (const std::shared_ptr<HostedProvider>& provider : find(*path, operation)) {
        if (provider->servesAll() && Ongoing::includes(provider.get(), typeid(operation), path->className)) {
            continue;
        }
        const Ongoing ongoing(provider.get(), typeid(operation), path->className);
        Result result(core_, Owner::current(core_));
        result.progress = progress;
        ask(*provider, operation, context, core_.delivery.deliver(handle), result);
        const bool isRefused = provider->servesAll() && isRefusal(result.reply);
        if (!isRefused || !isAsked) { // the first refusal is the one to tell
            reply = std::move(result.reply);
            reply.isServed = !isRefused;
        }
        if (!isRefused) {
            break;
        }
        isAsked = true;
    }
    return reply;
}

} // namespace oxahv
