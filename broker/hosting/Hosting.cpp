#include "hosting/Hosting.h"

#include "Core.h"
#include "text/Integers.h"

#include <algorithm>
#include <dlfcn.h>
#include <future>
#include <iterator>

namespace oxahv {

// A provider with its MIs. It dies with its last user, which may be a request that is inside it.
class HostedProvider {
public:
    HostedProvider(Core& core, std::string name, std::vector<std::string> classes)
        : core_(core), name_(std::move(name)), classes_(std::move(classes)) {}
    ~HostedProvider();
    HostedProvider(const HostedProvider&) = delete;
    HostedProvider& operator=(const HostedProvider&) = delete;

    const std::string& name() const { return name_; }
    std::future<void> gone() { return gone_.get_future(); }

    // Makes the MIs; throws BrokerError when a factory fails.
    void create(const ProviderFactories& factories);
    // Loads the provider's library, which is unloaded with this object.
    void open(const std::string& file);
    // Makes the MIs by the library's factory functions.
    void createFromLibrary(const std::string& file);

    bool serves(const Classes& declared, std::string_view className) const;
    bool servesAll() const { return classes_.empty(); }

    template <class MI>
    MI* mi() const {
        if constexpr (std::is_same_v<MI, CMPIInstanceMI>) {
            return instance_;
        } else if constexpr (std::is_same_v<MI, CMPIAssociationMI>) {
            return association_;
        } else {
            return method_;
        }
    }

private:
    template <class MI>
    MI* createFromLibrary(const char* kind, bool& found);
    void* function(const std::string& symbol) const;
    template <class MI, class Factory>
    MI* made(const Factory& factory) const;

    Core& core_;
    std::string name_;
    std::vector<std::string> classes_;
    void* library_ = nullptr;
    CMPIInstanceMI* instance_ = nullptr;
    CMPIAssociationMI* association_ = nullptr;
    CMPIMethodMI* method_ = nullptr;
    std::promise<void> gone_;
};

namespace {

template <class MI>
void cleanUp(MI* mi, const CMPIContext* context) {
    if (mi != nullptr && mi->ft->cleanup != nullptr) {
        try {
            mi->ft->cleanup(mi, context, 1);
        } catch (...) { // NOLINT(bugprone-empty-catch): a provider that fails to end has ended all the same
        }
    }
}

std::string messageOf(const CMPIStatus& status) {
    const String* const text = String::of(status.msg);
    return text != nullptr ? text->text : "";
}

// A status as words for a person.
std::string wordsOf(const CMPIStatus& status) {
    const std::string message = messageOf(status);
    return codeName(status.rc) + (message.empty() ? "" : ": " + message);
}

const char* orNull(const std::string& text) {
    return text.empty() ? nullptr : text.c_str();
}

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
    message = messageOf(status); // what this throws is not the provider's
    return status;
}

Reply refused(CMPIrc code, std::string message = {}) {
    Reply reply;
    reply.code = code;
    reply.message = std::move(message);
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
    Ongoing(const HostedProvider* provider, const void* operation, const std::string& className)
        : provider_(provider), operation_(operation), className_(className), outer_(innermost) {
        innermost = this;
    }
    ~Ongoing() { innermost = outer_; }
    Ongoing(const Ongoing&) = delete;
    Ongoing& operator=(const Ongoing&) = delete;

    static bool includes(const HostedProvider* provider) {
        return any([&](const Ongoing& one) { return one.provider_ == provider; });
    }
    static bool includes(const HostedProvider* provider, const void* operation,
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
    const void* operation_;
    const std::string& className_;
    const Ongoing* outer_;
};
thread_local const Ongoing* Ongoing::innermost = nullptr;

// Calls a slot of an MI; a provider may leave one empty.
template <class MI, class... Parameters, class... Given>
CMPIStatus callSlot(CMPIStatus (*slot)(MI*, Parameters...), MI* mi, Given... arguments) {
    return slot != nullptr ? slot(mi, arguments...) : CMPIStatus{CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

Value changedInteger(Core& core, const Value& value, KeyMode mode) {
    const WideInteger number = value.integer();
    if (mode == KeyMode::text) {
        return Value::text(core, (number.isNegative ? "-" : "") + std::to_string(number.magnitude));
    }
    CMPIValue wide = {};
    wide.uint64 = number.bits();
    const bool isSigned = mode == KeyMode::signedIntegers || integerType(value.type())->isSigned;
    return Value::number(wide, isSigned ? CMPI_sint64 : CMPI_uint64);
}

void changeKey(Core& core, Value& value, KeyMode mode) {
    if (mode == KeyMode::chars) {
        if (value.type() == CMPI_string) {
            value.retype(CMPI_chars);
        }
    } else if (mode != KeyMode::exact && integerType(value.type()) != nullptr) {
        value = changedInteger(core, value, mode);
    }
}

std::string otherCase(std::string name) {
    for (char& c : name) {
        const bool isLetter = (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z');
        c = isLetter ? static_cast<char>(c ^ ('a' ^ 'A')) : c;
    }
    return name;
}

// Changes a path as a server or a client does, and the paths among its keys.
void change(ObjectPath& path, KeyMode mode, const PathDelivery& delivery) {
    if (!delivery.hostName.empty()) {
        path.hostName = delivery.hostName;
    }
    if (delivery.reversesKeys) {
        std::reverse(path.keys.begin(), path.keys.end());
    }
    for (NamedValue& key : path.keys) {
        if (delivery.changesCase) {
            key.name = otherCase(std::move(key.name));
        }
        if (key.value.isNull()) {
            continue;
        }
        if (key.value.type() == CMPI_ref) {
            change(*ObjectPath::of(key.value.data().value.ref), mode, delivery);
        } else {
            changeKey(path.core(), key.value, mode);
        }
    }
}

} // namespace

PropertyArray::PropertyArray(const std::vector<std::string>* names) {
    if (names != nullptr) {
        for (const std::string& name : *names) {
            pointers_.push_back(name.c_str());
        }
        pointers_.push_back(nullptr);
    }
}

HostedProvider::~HostedProvider() {
    {
        Owner own(core_); // what the provider makes while it ends
        const Owner::Scope scope(own);
        Context context(core_);
        try {
            core_.addContextEntries(context);
        } catch (const std::bad_alloc&) { // NOLINT(bugprone-empty-catch): it ends with the entries there is
                                          // room for
        }
        cleanUp(instance_, &context);
        cleanUp(association_, &context);
        cleanUp(method_, &context);
    }
    if (library_ != nullptr) {
        dlclose(library_);
    }
    gone_.set_value();
}

// The MI that a factory makes. What the factory throws ends here: its code may be unloaded next.
template <class MI, class Factory>
MI* HostedProvider::made(const Factory& factory) const {
    Context* const context = handOut(std::make_unique<Context>(core_));
    core_.addContextEntries(*context);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    MI* mi = nullptr;
    try {
        mi = factory(&core_.record, context, &status);
    } catch (const std::exception& exception) {
        throw BrokerError("provider " + name_ + ": its factory threw: " + exception.what());
    } catch (...) {
        throw BrokerError("provider " + name_ + ": its factory threw an exception of an unknown kind");
    }
    if (status.rc != CMPI_RC_OK) {
        throw BrokerError("provider " + name_ + ": its factory answered " + wordsOf(status));
    }
    if (mi == nullptr || mi->ft == nullptr) {
        throw BrokerError("provider " + name_ + ": its factory made no function table");
    }
    return mi;
}

void HostedProvider::create(const ProviderFactories& factories) {
    Owner own(core_);
    const Owner::Scope scope(own);
    const auto make = [&](auto factory, auto*& mi) {
        if (factory != nullptr) {
            mi = made<std::remove_reference_t<decltype(*mi)>>(factory);
        }
    };
    make(factories.instance, instance_);
    make(factories.association, association_);
    make(factories.method, method_);
}

void HostedProvider::open(const std::string& file) {
    library_ = dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (library_ == nullptr) {
        throw BrokerError(std::string("cannot load provider library: ") + dlerror());
    }
}

void* HostedProvider::function(const std::string& symbol) const {
    return dlsym(library_, symbol.c_str());
}

template <class MI>
MI* HostedProvider::createFromLibrary(const char* kind, bool& found) {
    using Factory = MI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
    using GenericFactory = MI* (*)(const CMPIBroker*, const CMPIContext*, const char*, CMPIStatus*);
    if (void* const own = function(name_ + "_Create_" + kind)) {
        found = true;
        return made<MI>(reinterpret_cast<Factory>(own));
    }
    if (void* const generic = function(std::string("_Generic_Create_") + kind)) {
        found = true;
        return made<MI>([&](const CMPIBroker* broker, const CMPIContext* context, CMPIStatus* status) {
            return reinterpret_cast<GenericFactory>(generic)(broker, context, name_.c_str(), status);
        });
    }
    return nullptr;
}

void HostedProvider::createFromLibrary(const std::string& file) {
    Owner own(core_);
    const Owner::Scope scope(own);
    bool found = false;
    instance_ = createFromLibrary<CMPIInstanceMI>("InstanceMI", found);
    association_ = createFromLibrary<CMPIAssociationMI>("AssociationMI", found);
    method_ = createFromLibrary<CMPIMethodMI>("MethodMI", found);
    if (!found) {
        throw BrokerError("library " + file + " has no factory for a provider " + name_ + ", such as " +
                          name_ + "_Create_InstanceMI");
    }
}

bool HostedProvider::serves(const Classes& declared, std::string_view className) const {
    return std::any_of(classes_.begin(), classes_.end(),
                       [&](const std::string& served) { return declared.isA(className, served); });
}

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
    if (factories.instance == nullptr && factories.association == nullptr && factories.method == nullptr) {
        throw BrokerError("provider " + name + " has no factory");
    }
    auto provider = std::make_shared<HostedProvider>(core_, name, std::move(classes));
    provider->create(factories);
    add(std::move(provider));
}

void Hosting::load(const std::string& file, const std::string& name, std::vector<std::string> classes) {
    requireFreeName(name);
    auto provider = std::make_shared<HostedProvider>(core_, name, std::move(classes));
    provider->open(file);
    provider->createFromLibrary(file);
    add(std::move(provider));
}

void Hosting::unload(const std::string& name) {
    std::shared_ptr<HostedProvider> provider = take(name);
    const std::future<void> gone = provider->gone();
    provider.reset();
    gone.wait();
}

template <class MI>
std::vector<std::shared_ptr<HostedProvider>> Hosting::find(const ObjectPath& path,
                                                           std::string_view associationClass) const {
    const std::shared_lock<std::shared_mutex> lock(mutex_);
    const auto have = [&](const auto& matches) {
        std::vector<std::shared_ptr<HostedProvider>> found;
        std::copy_if(providers_.begin(), providers_.end(), std::back_inserter(found),
                     [&](const auto& provider) {
                         return provider->template mi<MI>() != nullptr && matches(*provider);
                     });
        return found;
    };
    const std::string_view wanted = associationClass.empty() ? path.className : associationClass;
    auto found = have([&](const HostedProvider& p) { return p.serves(core_.classes, wanted); });
    if (!found.empty()) {
        found.resize(1);
        return found;
    }
    const bool isOfAny = std::is_same_v<MI, CMPIAssociationMI> && associationClass.empty();
    // An association's provider lists its own class, not those of its ends.
    found = have([&](const HostedProvider& p) { return isOfAny || p.servesAll(); });
    std::stable_partition(found.begin(), found.end(),
                          [](const auto& provider) { return !Ongoing::includes(provider.get()); });
    return found;
}

CMPIObjectPath* Hosting::deliver(const CMPIObjectPath* handle) const {
    const ObjectPath* const path = ObjectPath::of(handle);
    if (path == nullptr) {
        return nullptr;
    }
    std::unique_ptr<ObjectPath> copy = path->copy();
    change(*copy, core_.keyMode.load(std::memory_order_relaxed), core_.pathDelivery());
    return handOut(std::move(copy));
}

template <class MI, class Function>
Reply Hosting::request(const CMPIContext* context, const CMPIObjectPath* handle, const Function& function,
                       std::string_view associationClass) {
    const ObjectPath* const path = ObjectPath::of(handle);
    Context* const own = Context::of(context);
    if (path == nullptr || own == nullptr) {
        return refused(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (core_.classes.any() && core_.classes.find(path->className) == nullptr) {
        Reply unknown = refused(CMPI_RC_ERR_INVALID_CLASS, "class " + path->className + " is not declared");
        unknown.isServed = false;
        return unknown;
    }
    static const char operation = 0; // its address is another for each MI function
    const std::function<void(std::size_t)>* const progress = std::exchange(own->progress, nullptr);
    Reply reply = refused(CMPI_RC_ERR_NOT_SUPPORTED, "no provider serves this for class " + path->className);
    reply.isServed = false;
    bool isAsked = false;
    for (const std::shared_ptr<HostedProvider>& provider : find<MI>(*path, associationClass)) {
        if (provider->servesAll() && Ongoing::includes(provider.get(), &operation, path->className)) {
            continue;
        }
        const Ongoing ongoing(provider.get(), &operation, path->className);
        Result result(core_, Owner::current(core_));
        result.progress = progress;
        const CMPIObjectPath* const delivered = deliver(handle);
        std::string message;
        const CMPIStatus status =
            guarded([&] { return function(provider->mi<MI>(), &result, delivered); }, message);
        if (status.rc != CMPI_RC_OK) { // else an error that the provider returned as a result stands
            result.reply.code = status.rc;
            result.reply.message = message;
        }
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

Reply Hosting::enumerateInstances(const CMPIContext* context, const CMPIObjectPath* path,
                                  const char** properties) {
    return request<CMPIInstanceMI>(
        context, path, [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
            return callSlot(mi->ft->enumerateInstances, mi, context, result, delivered, properties);
        });
}

Reply Hosting::enumerateInstanceNames(const CMPIContext* context, const CMPIObjectPath* path) {
    return request<CMPIInstanceMI>(
        context, path, [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
            return callSlot(mi->ft->enumerateInstanceNames, mi, context, result, delivered);
        });
}

Reply Hosting::getInstance(const CMPIContext* context, const CMPIObjectPath* path, const char** properties) {
    return request<CMPIInstanceMI>(
        context, path, [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
            return callSlot(mi->ft->getInstance, mi, context, result, delivered, properties);
        });
}

Reply Hosting::createInstance(const CMPIContext* context, const CMPIObjectPath* path,
                              const CMPIInstance* instance) {
    if (Instance::of(instance) == nullptr) {
        return refused(CMPI_RC_ERR_INVALID_HANDLE);
    }
    return request<CMPIInstanceMI>(
        context, path, [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
            return callSlot(mi->ft->createInstance, mi, context, result, delivered, instance);
        });
}

Reply Hosting::modifyInstance(const CMPIContext* context, const CMPIObjectPath* path,
                              const CMPIInstance* instance, const char** properties) {
    if (Instance::of(instance) == nullptr) {
        return refused(CMPI_RC_ERR_INVALID_HANDLE);
    }
    return request<CMPIInstanceMI>(
        context, path, [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
            return callSlot(mi->ft->modifyInstance, mi, context, result, delivered, instance, properties);
        });
}

Reply Hosting::deleteInstance(const CMPIContext* context, const CMPIObjectPath* path) {
    return request<CMPIInstanceMI>(
        context, path, [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
            return callSlot(mi->ft->deleteInstance, mi, context, result, delivered);
        });
}

Reply Hosting::execQuery(const CMPIContext* context, const CMPIObjectPath* path, const char* query,
                         const char* language) {
    return request<CMPIInstanceMI>(
        context, path, [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
            return callSlot(mi->ft->execQuery, mi, context, result, delivered, query, language);
        });
}

Reply Hosting::associators(const CMPIContext* context, const CMPIObjectPath* path,
                           const AssociationFilter& filter, const char** properties) {
    return request<CMPIAssociationMI>(
        context, path,
        [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
            return callSlot(mi->ft->associators, mi, context, result, delivered,
                            orNull(filter.associationClass), orNull(filter.resultClass), orNull(filter.role),
                            orNull(filter.resultRole), properties);
        },
        filter.associationClass);
}

Reply Hosting::associatorNames(const CMPIContext* context, const CMPIObjectPath* path,
                               const AssociationFilter& filter) {
    return request<CMPIAssociationMI>(
        context, path,
        [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
            return callSlot(mi->ft->associatorNames, mi, context, result, delivered,
                            orNull(filter.associationClass), orNull(filter.resultClass), orNull(filter.role),
                            orNull(filter.resultRole));
        },
        filter.associationClass);
}

Reply Hosting::references(const CMPIContext* context, const CMPIObjectPath* path,
                          const AssociationFilter& filter, const char** properties) {
    return request<CMPIAssociationMI>(
        context, path,
        [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
            return callSlot(mi->ft->references, mi, context, result, delivered, orNull(filter.resultClass),
                            orNull(filter.role), properties);
        },
        filter.resultClass);
}

Reply Hosting::referenceNames(const CMPIContext* context, const CMPIObjectPath* path,
                              const AssociationFilter& filter) {
    return request<CMPIAssociationMI>(
        context, path,
        [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
            return callSlot(mi->ft->referenceNames, mi, context, result, delivered,
                            orNull(filter.resultClass), orNull(filter.role));
        },
        filter.resultClass);
}

// Why a declared method does not take its arguments; empty when it does.
static std::string complaintAbout(const MethodDeclaration& method, const Arguments& in) {
    for (const NamedValue& argument : in.values) {
        const ParameterDeclaration* const parameter = method.find(argument.name);
        if (parameter == nullptr || !parameter->isIn) {
            return "method " + method.name + " takes no argument " + argument.name;
        }
        if (!argument.value.isNull() && argument.value.type() != storedType(parameter->type)) {
            return "argument " + argument.name + " of method " + method.name + " is no " +
                   declaredTypeName(parameter->type);
        }
    }
    return {};
}

Reply Hosting::invokeMethod(const CMPIContext* context, const CMPIObjectPath* path, const char* method,
                            const CMPIArgs* in) {
    if (in != nullptr && Arguments::of(in) == nullptr) {
        return refused(CMPI_RC_ERR_INVALID_HANDLE);
    }
    const CMPIArgs* const given = in != nullptr ? in : handOut(std::make_unique<Arguments>(core_));
    CMPIArgs* const out = handOut(std::make_unique<Arguments>(core_));
    const ObjectPath* const target = ObjectPath::of(path);
    const auto declared = target != nullptr ? core_.classes.find(target->className) : nullptr;
    const MethodDeclaration* const wanted = declared != nullptr ? declared->findMethod(method) : nullptr;
    const std::string complaint = wanted != nullptr ? complaintAbout(*wanted, *Arguments::of(given)) : "";
    Reply reply;
    if (declared != nullptr && wanted == nullptr) {
        reply = refused(CMPI_RC_ERR_METHOD_NOT_FOUND, "class " + declared->name + " has no method " + method);
    } else if (!complaint.empty()) {
        reply = refused(CMPI_RC_ERR_INVALID_PARAMETER, complaint);
    } else {
        reply = request<CMPIMethodMI>(
            context, path, [&](auto* mi, const CMPIResult* result, const CMPIObjectPath* delivered) {
                return callSlot(mi->ft->invokeMethod, mi, context, result, delivered, method, given, out);
            });
    }
    reply.out = out;
    return reply;
}

} // namespace oxahv
