// The function tables of CMPI over the classes of the kit.
#pragma once

#include "Answer.h"

namespace oxahv::detail {

// Ends the object when its last kind has been cleaned up.
inline CMPIStatus release(Hosted& hosted) {
    Module& module = hosted.module;
    {
        const std::lock_guard<std::mutex> lock(module.mutex);
        if (--hosted.users != 0) {
            return {CMPI_RC_OK, nullptr};
        }
        Hosted** place = &module.first;
        while (*place != &hosted) {
            place = &(*place)->next;
        }
        *place = hosted.next;
    }
    const CMPIBroker* const broker = hosted.broker;
    const std::string category = std::move(hosted.category);
    try {
        const std::unique_ptr<Hosted> owner(&hosted);
        const Utf8Thread utf8(hosted.locale);
        hosted.destroy(hosted.object);
        return {CMPI_RC_OK, nullptr};
    } catch (...) {
        return statusOfException(broker, category, "cleanup");
    }
}

// Instances

inline CMPIStatus cleanupInstances(CMPIInstanceMI* mi, const CMPIContext* /*context*/, CMPIBoolean /*ends*/) {
    return release(hostedOf(mi));
}

inline CMPIStatus enumerateInstanceNames(CMPIInstanceMI* mi, const CMPIContext* context,
                                         const CMPIResult* result, const CMPIObjectPath* path) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer({hosted, __func__, context, result, path},
                           [&](const Operation& operation, Names& reply) {
                               hosted.instances->enumerateNames(operation, reply);
                           });
}

inline CMPIStatus enumerateInstances(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                                     const CMPIObjectPath* path, const char** properties) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer({hosted, __func__, context, result, path, properties},
                           [&](const Operation& operation, Names& reply) {
                               Service::list(*hosted.instances, operation, reply);
                           });
}

inline CMPIStatus getInstance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                              const CMPIObjectPath* path, const char** properties) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer(
        {hosted, __func__, context, result, path, properties},
        [&](const Operation& operation, Names& reply) { Service::get(*hosted.instances, operation, reply); });
}

inline CMPIStatus createInstance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                                 const CMPIObjectPath* path, const CMPIInstance* instance) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer({hosted, __func__, context, result, path},
                           [&](const Operation& operation, Names& reply) {
                               reply.add(hosted.instances->create(operation, {hosted.broker, instance}));
                           });
}

inline CMPIStatus modifyInstance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                                 const CMPIObjectPath* path, const CMPIInstance* instance,
                                 const char** properties) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer({hosted, __func__, context, result, path, properties},
                           [&](const Operation& operation, Names& /*reply*/) {
                               hosted.instances->modify(operation, {hosted.broker, instance});
                           });
}

inline CMPIStatus deleteInstance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                                 const CMPIObjectPath* path) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer(
        {hosted, __func__, context, result, path},
        [&](const Operation& operation, Names& /*reply*/) { hosted.instances->remove(operation); });
}

inline CMPIStatus execQuery(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                            const CMPIObjectPath* path, const char* query, const char* language) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer({hosted, __func__, context, result, path},
                           [&](const Operation& operation, Names& reply) {
                               Service::query(*hosted.instances, operation, query, language, reply);
                           });
}

// Associations. Of a request for references, the result class is the association's.

inline CMPIStatus cleanupAssociations(CMPIAssociationMI* mi, const CMPIContext* /*context*/,
                                      CMPIBoolean /*ends*/) {
    return release(hostedOf(mi));
}

inline CMPIStatus associate(const ServerCall& call) {
    return Service::answer(call, [&](const Operation& operation, Names& reply) {
        Service::associate(*call.hosted.associations, operation, reply);
    });
}

inline CMPIStatus associators(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                              const CMPIObjectPath* path, const char* associationClass,
                              const char* resultClass, const char* role, const char* resultRole,
                              const char** properties) {
    EndFilter filter = Service::filter(associationClass, resultClass, role, resultRole);
    return associate(
        {hostedOf(mi), __func__, context, result, path, properties, Wanted::associators, &filter});
}

inline CMPIStatus associatorNames(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                                  const CMPIObjectPath* path, const char* associationClass,
                                  const char* resultClass, const char* role, const char* resultRole) {
    EndFilter filter = Service::filter(associationClass, resultClass, role, resultRole);
    return associate(
        {hostedOf(mi), __func__, context, result, path, nullptr, Wanted::associatorNames, &filter});
}

inline CMPIStatus references(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                             const CMPIObjectPath* path, const char* resultClass, const char* role,
                             const char** properties) {
    EndFilter filter = Service::filter(resultClass, nullptr, role, nullptr);
    return associate(
        {hostedOf(mi), __func__, context, result, path, properties, Wanted::references, &filter});
}

inline CMPIStatus referenceNames(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                                 const CMPIObjectPath* path, const char* resultClass, const char* role) {
    EndFilter filter = Service::filter(resultClass, nullptr, role, nullptr);
    return associate(
        {hostedOf(mi), __func__, context, result, path, nullptr, Wanted::referenceNames, &filter});
}

// Methods

inline CMPIStatus cleanupMethods(CMPIMethodMI* mi, const CMPIContext* /*context*/, CMPIBoolean /*ends*/) {
    return release(hostedOf(mi));
}

inline CMPIStatus invokeMethod(CMPIMethodMI* mi, const CMPIContext* context, const CMPIResult* result,
                               const CMPIObjectPath* path, const char* method, const CMPIArgs* in,
                               CMPIArgs* out) {
    const Hosted& hosted = hostedOf(mi);
    ServerCall call = {hosted, __func__, context, result, path};
    call.method = method;
    return Service::answer(call, [&](const Operation& operation, Names& /*reply*/) {
        Service::invoke(*hosted.methods, {operation, method, result, in, out});
    });
}

// Single properties

inline CMPIStatus cleanupProperties(CMPIPropertyMI* mi, const CMPIContext* /*context*/,
                                    CMPIBoolean /*ends*/) {
    return release(hostedOf(mi));
}

inline CMPIStatus setProperty(CMPIPropertyMI* mi, const CMPIContext* context, const CMPIResult* result,
                              const CMPIObjectPath* path, const char* name, const CMPIData data) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer({hosted, __func__, context, result, path},
                           [&](const Operation& operation, Names& /*reply*/) {
                               Service::setProperty(*hosted.properties, operation, name, data);
                           });
}

inline CMPIStatus getProperty(CMPIPropertyMI* mi, const CMPIContext* context, const CMPIResult* result,
                              const CMPIObjectPath* path, const char* name) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer({hosted, __func__, context, result, path},
                           [&](const Operation& operation, Names& /*reply*/) {
                               Service::getProperty(*hosted.properties, operation, result, name);
                           });
}

// Indications

inline CMPIStatus cleanupIndications(CMPIIndicationMI* mi, const CMPIContext* /*context*/,
                                     CMPIBoolean /*ends*/) {
    return release(hostedOf(mi));
}

inline CMPIStatus authorizeFilter(CMPIIndicationMI* mi, const CMPIContext* context,
                                  const CMPISelectExp* filter, const char* className,
                                  const CMPIObjectPath* path, const char* owner) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer(
        {hosted, __func__, context, nullptr, path}, [&](const Operation& operation, Names& /*reply*/) {
            hosted.indications->authorize(operation, {filter, className}, owner != nullptr ? owner : "");
        });
}

inline CMPIStatus mustPoll(CMPIIndicationMI* /*mi*/, const CMPIContext* /*context*/,
                           const CMPISelectExp* /*filter*/, const char* /*className*/,
                           const CMPIObjectPath* /*path*/) {
    return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

inline CMPIStatus activateFilter(CMPIIndicationMI* mi, const CMPIContext* context,
                                 const CMPISelectExp* filter, const char* className,
                                 const CMPIObjectPath* path, CMPIBoolean isFirst) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer({hosted, __func__, context, nullptr, path},
                           [&](const Operation& operation, Names& /*reply*/) {
                               hosted.indications->activate(operation, {filter, className}, isFirst != 0);
                           });
}

inline CMPIStatus deactivateFilter(CMPIIndicationMI* mi, const CMPIContext* context,
                                   const CMPISelectExp* filter, const char* className,
                                   const CMPIObjectPath* path, CMPIBoolean isLast) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answer({hosted, __func__, context, nullptr, path},
                           [&](const Operation& operation, Names& /*reply*/) {
                               hosted.indications->deactivate(operation, {filter, className}, isLast != 0);
                           });
}

inline CMPIStatus enableIndications(CMPIIndicationMI* mi, const CMPIContext* context) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answerWithoutObject(hosted, __func__,
                                        [&] { hosted.indications->enable(Context(hosted.broker, context)); });
}

inline CMPIStatus disableIndications(CMPIIndicationMI* mi, const CMPIContext* context) {
    const Hosted& hosted = hostedOf(mi);
    return Service::answerWithoutObject(
        hosted, __func__, [&] { hosted.indications->disable(Context(hosted.broker, context)); });
}

// The tables are filled by the order of their members, whose names differ between headers. Slots that are
// newer than CMPI 1.0 come last and stay empty.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wmissing-field-initializers"
inline CMPIInstanceMIFT instanceTable(const char* name) {
    return {CMPICurrentVersion,     CMPICurrentVersion, name,        cleanupInstances,
            enumerateInstanceNames, enumerateInstances, getInstance, createInstance,
            modifyInstance,         deleteInstance,     execQuery};
}
inline CMPIAssociationMIFT associationTable(const char* name) {
    return {CMPICurrentVersion, CMPICurrentVersion, name,       cleanupAssociations,
            associators,        associatorNames,    references, referenceNames};
}
inline CMPIMethodMIFT methodTable(const char* name) {
    return {CMPICurrentVersion, CMPICurrentVersion, name, cleanupMethods, invokeMethod};
}
inline CMPIPropertyMIFT propertyTable(const char* name) {
    return {CMPICurrentVersion, CMPICurrentVersion, name, cleanupProperties, setProperty, getProperty};
}
inline CMPIIndicationMIFT indicationTable(const char* name) {
    return {CMPICurrentVersion, CMPICurrentVersion, name,           cleanupIndications,
            authorizeFilter,    mustPoll,           activateFilter, deactivateFilter,
            enableIndications,  disableIndications};
}
#pragma GCC diagnostic pop

// Factories

// Makes the object of a provider's class.
using Construct = void (*)(Hosted& hosted, const Context& context);

template <class Provider>
void construct(Hosted& hosted, const Context& context) {
    static_assert(
        std::is_convertible_v<Provider*, InstanceProvider*> ||
            std::is_convertible_v<Provider*, AssociationProvider*> ||
            std::is_convertible_v<Provider*, MethodProvider*> ||
            std::is_convertible_v<Provider*, PropertyProvider*> ||
            std::is_convertible_v<Provider*, IndicationProvider*>,
        "a provider derives publicly from InstanceProvider or another of the kit's provider classes");
    Provider* object = nullptr;
    if constexpr (std::is_constructible_v<Provider, const Context&>) {
        object = new Provider(context);
    } else {
        object = new Provider();
    }
    hosted.object = object;
    hosted.destroy = [](void* provider) { delete static_cast<Provider*>(provider); };
    // The code of a kind that the class does not have is not compiled.
    const char* const name = hosted.module.name;
    if constexpr (std::is_convertible_v<Provider*, InstanceProvider*>) {
        hosted.instances = object;
        hosted.instanceTable = instanceTable(name);
    }
    if constexpr (std::is_convertible_v<Provider*, AssociationProvider*>) {
        hosted.associations = object;
        hosted.associationTable = associationTable(name);
    }
    if constexpr (std::is_convertible_v<Provider*, MethodProvider*>) {
        hosted.methods = object;
        hosted.methodTable = methodTable(name);
    }
    if constexpr (std::is_convertible_v<Provider*, PropertyProvider*>) {
        hosted.properties = object;
        hosted.propertyTable = propertyTable(name);
    }
    if constexpr (std::is_convertible_v<Provider*, IndicationProvider*>) {
        hosted.indications = object;
        hosted.indicationTable = indicationTable(name);
    }
}

inline Hosted& find(Module& module, const CMPIBroker* broker, const CMPIContext* context,
                    const char* category, Construct construct) {
    for (Hosted* hosted = module.first; hosted != nullptr; hosted = hosted->next) {
        if (hosted->broker == broker) {
            return *hosted;
        }
    }
    auto hosted = std::make_unique<Hosted>(module, broker, category);
    const Utf8Thread utf8(hosted->locale);
    construct(*hosted, Context(broker, context));
    hosted->next = module.first;
    module.first = hosted.get();
    return *hosted.release();
}

// The object for a broker, made where it is not there yet; null with a status when it cannot be.
inline Hosted* acquire(Module& module, const CMPIBroker* broker, const CMPIContext* context,
                       const char* category, Construct construct, CMPIStatus* status) {
    CMPIStatus own = {CMPI_RC_OK, nullptr};
    Hosted* hosted = nullptr;
    try {
        const std::lock_guard<std::mutex> lock(module.mutex);
        hosted = &find(module, broker, context, category, construct);
        ++hosted->users;
    } catch (...) {
        own = statusOfException(broker, category, "create");
    }
    if (status != nullptr) {
        *status = own;
    }
    return hosted;
}

template <class Provider, class = void>
struct CategoryOf {
    static const char* of(const Module& module) { return module.name; }
};
template <class Provider>
struct CategoryOf<Provider, std::void_t<decltype(Provider::traceCategory)>> {
    static const char* of(const Module& /*module*/) { return Provider::traceCategory; }
};

// The record of one kind.
template <class Provider, class MI>
MI* makeMI(Module& module, const CMPIBroker* broker, const CMPIContext* context, CMPIStatus* status,
           MI Hosted::*record) {
    Hosted* const hosted =
        acquire(module, broker, context, CategoryOf<Provider>::of(module), construct<Provider>, status);
    return hosted != nullptr ? &(hosted->*record) : nullptr;
}

} // namespace oxahv::detail
