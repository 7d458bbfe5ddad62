#include "hosting/HostedProvider.h"

#include "Core.h"
#include "hosting/ProviderCall.h"

#include <algorithm>
#include <dlfcn.h>

namespace oxahv {

namespace {

template <class MI>
using Factory = MI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
template <class MI>
using GenericFactory = MI* (*)(const CMPIBroker*, const CMPIContext*, const char*, CMPIStatus*);

// Where a program and where a library have the factory of an MI.
template <class MI>
struct FactoryOf;
template <>
struct FactoryOf<CMPIInstanceMI> {
    static constexpr auto member = &ProviderFactories::instance;
    static constexpr const char* symbol = "_Create_InstanceMI";
};
template <>
struct FactoryOf<CMPIAssociationMI> {
    static constexpr auto member = &ProviderFactories::association;
    static constexpr const char* symbol = "_Create_AssociationMI";
};
template <>
struct FactoryOf<CMPIMethodMI> {
    static constexpr auto member = &ProviderFactories::method;
    static constexpr const char* symbol = "_Create_MethodMI";
};
template <>
struct FactoryOf<CMPIPropertyMI> {
    static constexpr auto member = &ProviderFactories::property;
    static constexpr const char* symbol = "_Create_PropertyMI";
};
template <>
struct FactoryOf<CMPIIndicationMI> {
    static constexpr auto member = &ProviderFactories::indication;
    static constexpr const char* symbol = "_Create_IndicationMI";
};

// A status as words for a person.
std::string wordsOf(const CMPIStatus& status) {
    const String* const text = String::of(status.msg);
    return codeName(status.rc) + (text == nullptr || text->text.empty() ? "" : ": " + text->text);
}

// A provider that fails to end has ended all the same, but the program is told.
template <class MI>
void cleanUp(Core& core, const std::string& name, MI* mi, const CMPIContext* context) {
    Owner own(core); // what the provider makes while it ends
    const Owner::Scope scope(own);
    try {
        const Outcome outcome = callProvider([&] { return mi->ft->cleanup(mi, context, 1); });
        if (outcome.isThrown) {
            const std::string text = "provider " + name + ": its cleanup threw an " + outcome.message;
            core.tell({false, CMPI_SEV_ERROR, name, text, true});
        }
    } catch (const std::exception&) { // NOLINT(bugprone-empty-catch): no memory, or the program's handler
    }
}

} // namespace

HostedProvider::~HostedProvider() {
    cleanUp();
    if (library_ != nullptr) {
        dlclose(library_);
    }
    gone_.set_value();
}

void HostedProvider::cleanUp() {
    Context context(core_);
    try {
        core_.addContextEntries(context);
    } catch (const std::bad_alloc&) { // NOLINT(bugprone-empty-catch): it ends with the entries that fit
    }
    const auto end = [&](auto* mi) {
        if (mi != nullptr && mi->ft->cleanup != nullptr) {
            runOnThread([&] { oxahv::cleanUp(core_, name_, mi, &context); });
        }
    };
    std::apply([&](auto*... mis) { (end(mis), ...); }, mis_);
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
        passOnTheEndOfAThread();
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

// Makes each MI that there is a factory for. Objects that a factory makes die with the end of the last one.
template <class Make>
void HostedProvider::createEach(const Make& make) {
    Owner own(core_);
    const Owner::Scope scope(own);
    std::apply([&](auto*&... mis) { (make(mis), ...); }, mis_);
}

void HostedProvider::create(const ProviderFactories& factories) {
    bool isAny = false;
    createEach([&](auto*& mi) {
        using MI = std::remove_pointer_t<std::remove_reference_t<decltype(mi)>>;
        if (const auto factory = factories.*FactoryOf<MI>::member) {
            isAny = true;
            mi = made<MI>(factory);
        }
    });
    if (!isAny) {
        throw BrokerError("provider " + name_ + " has no factory");
    }
}

template <class MI>
MI* HostedProvider::createFromLibrary() const {
    const std::string symbol = FactoryOf<MI>::symbol;
    if (void* const own = dlsym(library_, (name_ + symbol).c_str())) {
        return made<MI>(reinterpret_cast<Factory<MI>>(own));
    }
    if (void* const generic = dlsym(library_, ("_Generic" + symbol).c_str())) {
        return made<MI>([&](const CMPIBroker* broker, const CMPIContext* context, CMPIStatus* status) {
            return reinterpret_cast<GenericFactory<MI>>(generic)(broker, context, name_.c_str(), status);
        });
    }
    return nullptr;
}

void HostedProvider::load(const std::string& file) {
    library_ = dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (library_ == nullptr) {
        throw BrokerError(std::string("cannot load provider library: ") + dlerror());
    }
    bool isAny = false;
    createEach([&](auto*& mi) {
        mi = createFromLibrary<std::remove_pointer_t<std::remove_reference_t<decltype(mi)>>>();
        isAny = isAny || mi != nullptr;
    });
    if (!isAny) {
        throw BrokerError("library " + file + " has no factory for a provider " + name_ + ", such as " +
                          name_ + "_Create_InstanceMI");
    }
}

bool HostedProvider::serves(const Classes& declared, std::string_view className) const {
    return std::any_of(classes_.begin(), classes_.end(),
                       [&](const std::string& served) { return declared.isA(className, served); });
}

bool HostedProvider::servesPartOf(const Classes& declared, std::string_view className) const {
    return std::any_of(classes_.begin(), classes_.end(),
                       [&](const std::string& served) { return declared.isA(served, className); });
}

bool HostedProvider::mayAssociate(const Classes& declared, std::string_view className) const {
    bool isKnown = false; // whether a class of the provider's is an association
    for (const std::string& served : classes_) {
        const auto association = declared.find(served);
        if (association == nullptr || !association->qualifiers.isTrue("Association")) {
            continue;
        }
        isKnown = true;
        for (const PropertyDeclaration& end : association->properties) {
            if (end.type == CMPI_ref &&
                (end.referenceClass.empty() || declared.find(end.referenceClass) == nullptr ||
                 declared.isA(className, end.referenceClass) ||
                 declared.isA(end.referenceClass, className))) {
                return true;
            }
        }
    }
    return !isKnown;
}

} // namespace oxahv
