// CMPIBrokerFT: a provider's threads, and its requests to other providers, which run in the request that it
// serves.

#include "tables/Slots.h"

namespace oxahv {

namespace {

// Threads

// The new thread's context; it outlives the request that the provider is in.
CMPIContext* prepareAttachThread(Core& /*core*/, const CMPIContext* handle) {
    const Context* const context = Context::of(handle);
    if (context == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    return cloneObject(*context);
}

void requireContext(const CMPIContext* handle) {
    if (Context::of(handle) == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
}

void attachThread(Core& core, const CMPIContext* context) {
    requireContext(context);
    core.attachedThreads.attach(core);
}

void detachThread(Core& core, const CMPIContext* context) {
    requireContext(context);
    AttachedThreads::detach(core);
}

void deliverIndication(Core& core, const CMPIContext* context, const char* nameSpace,
                       const CMPIInstance* handle) {
    requireContext(context);
    const Instance* const indication = Instance::of(handle);
    if (indication == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    core.indications.deliver(required(nameSpace), *indication);
}

// What a request yielded, or its failure.

const Reply& succeeded(const Reply& reply) {
    if (!reply.ok() && reply.message.empty()) {
        throw Failure{reply.code};
    }
    if (!reply.ok()) {
        failWith(reply.code, reply.message);
    }
    return reply;
}

// What a server without a provider for the class answers. The program may want to know: few providers
// expect it.
void tellUnserved(Core& core, Reply& reply, const CMPIObjectPath* handle, CMPIrc code) {
    if (reply.isServed) {
        return;
    }
    const std::string& className = ObjectPath::of(handle)->className;
    core.tellUnserved(className);
    if (!core.classes.any() || core.classes.find(className) != nullptr) {
        reply.code = code;
    }
}

CMPIEnumeration* enumerationOf(Core& core, Reply reply, const CMPIObjectPath* asked, CMPIType type) {
    tellUnserved(core, reply, asked, CMPI_RC_OK);
    succeeded(reply);
    auto enumeration = std::make_unique<Enumeration>(core, type);
    CMPIValue value = {};
    for (CMPIInstance* const instance : reply.instances) {
        value.inst = instance;
        enumeration->elements.push_back(Value::from(core, &value, CMPI_instance));
    }
    for (CMPIObjectPath* const path : reply.objectPaths) {
        value.ref = path;
        enumeration->elements.push_back(Value::from(core, &value, CMPI_ref));
    }
    return handOut(std::move(enumeration));
}

template <class Handle>
Handle* firstOf(const Reply& reply, const std::vector<Handle*>& handles) {
    succeeded(reply);
    if (handles.empty()) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return handles.front();
}

// The upcall for an operation of an MI, by what comes back of it. It has the arguments of the MI's slot.
template <auto slot>
struct Upcall;
template <class Table, class MI, class... Rest,
          CMPIStatus (*Table::*slot)(MI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                                     Rest...)>
struct Upcall<slot> {
    static CMPIEnumeration* instances(Core& core, const CMPIContext* context, const CMPIObjectPath* path,
                                      Rest... rest) {
        return enumerationOf(core, core.hosting.serve<slot>(context, path, rest...), path, CMPI_instance);
    }
    static CMPIEnumeration* paths(Core& core, const CMPIContext* context, const CMPIObjectPath* path,
                                  Rest... rest) {
        return enumerationOf(core, core.hosting.serve<slot>(context, path, rest...), path, CMPI_ref);
    }
    static CMPIInstance* instance(Core& core, const CMPIContext* context, const CMPIObjectPath* path,
                                  Rest... rest) {
        Reply reply = core.hosting.serve<slot>(context, path, rest...);
        tellUnserved(core, reply, path, CMPI_RC_ERR_NOT_FOUND);
        return firstOf(reply, reply.instances);
    }
    static CMPIObjectPath* path(Core& core, const CMPIContext* context, const CMPIObjectPath* path,
                                Rest... rest) {
        Reply reply = core.hosting.serve<slot>(context, path, rest...);
        tellUnserved(core, reply, path, CMPI_RC_ERR_NOT_SUPPORTED);
        return firstOf(reply, reply.objectPaths);
    }
    static void nothing(Core& core, const CMPIContext* context, const CMPIObjectPath* path, Rest... rest) {
        Reply reply = core.hosting.serve<slot>(context, path, rest...);
        tellUnserved(core, reply, path, CMPI_RC_ERR_NOT_SUPPORTED);
        succeeded(reply);
    }
};

CMPIEnumeration* execQuery(Core& core, const CMPIContext* context, const CMPIObjectPath* path,
                           const char* query, const char* language) {
    return enumerationOf(core, core.hosting.execQuery(context, path, query, language), path, CMPI_instance);
}

CMPIData invokeMethod(Core& core, const CMPIContext* context, const CMPIObjectPath* path, const char* method,
                      const CMPIArgs* in, CMPIArgs* out) {
    Arguments* const wanted = Arguments::of(out);
    if (out != nullptr && wanted == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    Reply reply = core.hosting.invokeMethod(context, path, required(method), in);
    tellUnserved(core, reply, path, CMPI_RC_ERR_METHOD_NOT_AVAILABLE);
    succeeded(reply);
    if (wanted != nullptr) {
        wanted->values = Arguments::of(reply.out)->values;
    }
    return reply.data.empty() ? Value().data() : reply.data.front();
}

CMPIData getProperty(Core& core, const CMPIContext* context, const CMPIObjectPath* path, const char* name) {
    Reply reply = core.hosting.getProperty(context, path, required(name));
    tellUnserved(core, reply, path, CMPI_RC_ERR_NOT_FOUND);
    succeeded(reply);
    return reply.data.empty() ? Value().data() : reply.data.front();
}

void setProperty(Core& core, const CMPIContext* context, const CMPIObjectPath* path, const char* name,
                 const CMPIValue* value, CMPIType type) {
    Reply reply = core.hosting.setProperty(context, path, required(name), value, type);
    tellUnserved(core, reply, path, CMPI_RC_ERR_NOT_SUPPORTED);
    succeeded(reply);
}

// There is no query language.

CMPIEnumeration* enumerateFiltered(Core& /*core*/, const CMPIContext* /*context*/,
                                   const CMPIObjectPath* /*path*/, const char** /*properties*/,
                                   const char* /*language*/, const char* /*query*/) {
    throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
}

CMPIEnumeration* associatorsFiltered(Core& /*core*/, const CMPIContext* /*context*/,
                                     const CMPIObjectPath* /*path*/, const char* /*associationClass*/,
                                     const char* /*resultClass*/, const char* /*role*/,
                                     const char* /*resultRole*/, const char** /*properties*/,
                                     const char* /*language*/, const char* /*query*/) {
    throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
}

CMPIEnumeration* referencesFiltered(Core& /*core*/, const CMPIContext* /*context*/,
                                    const CMPIObjectPath* /*path*/, const char* /*resultClass*/,
                                    const char* /*role*/, const char** /*properties*/,
                                    const char* /*language*/, const char* /*query*/) {
    throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
}

} // namespace

const CMPIBrokerFT requestTable = {
    CMPI_MB_InstanceManipulation | CMPI_MB_AssociationTraversal | CMPI_MB_QueryExecution |
        CMPI_MB_QueryNormalization | CMPI_MB_BasicQualifierSupport | CMPI_MB_Indications |
        CMPI_MB_OSEncapsulationSupport | CMPI_MB_Supports_PropertyMI | CMPI_MB_Supports_IndicationMI |
        CMPI_MB_Supports_QueryNormalization | CMPI_MB_Supports_Qualifier | CMPI_MB_Supports_MemEnhancements |
        CMPI_MB_Supports_Extended_Error | CMPI_MB_Logging | CMPI_MB_Tracing | CMPI_MB_PropertyFiltering,
    CMPICurrentVersion,
    "oxahvbroker",
    SLOT(CMPIBrokerFT, prepareAttachThread, prepareAttachThread),
    SLOT(CMPIBrokerFT, attachThread, attachThread),
    SLOT(CMPIBrokerFT, detachThread, detachThread),
    SLOT(CMPIBrokerFT, deliverIndication, deliverIndication),
    SLOT(CMPIBrokerFT, enumerateInstanceNames, Upcall<&CMPIInstanceMIFT::enumerateInstanceNames>::paths),
    SLOT(CMPIBrokerFT, getInstance, Upcall<&CMPIInstanceMIFT::getInstance>::instance),
    SLOT(CMPIBrokerFT, createInstance, Upcall<&CMPIInstanceMIFT::createInstance>::path),
    SLOT(CMPIBrokerFT, modifyInstance, Upcall<&CMPIInstanceMIFT::modifyInstance>::nothing),
    SLOT(CMPIBrokerFT, deleteInstance, Upcall<&CMPIInstanceMIFT::deleteInstance>::nothing),
    SLOT(CMPIBrokerFT, execQuery, execQuery),
    SLOT(CMPIBrokerFT, enumerateInstances, Upcall<&CMPIInstanceMIFT::enumerateInstances>::instances),
    SLOT(CMPIBrokerFT, associators, Upcall<&CMPIAssociationMIFT::associators>::instances),
    SLOT(CMPIBrokerFT, associatorNames, Upcall<&CMPIAssociationMIFT::associatorNames>::paths),
    SLOT(CMPIBrokerFT, references, Upcall<&CMPIAssociationMIFT::references>::instances),
    SLOT(CMPIBrokerFT, referenceNames, Upcall<&CMPIAssociationMIFT::referenceNames>::paths),
    SLOT(CMPIBrokerFT, invokeMethod, invokeMethod),
    SLOT(CMPIBrokerFT, setProperty, setProperty),
    SLOT(CMPIBrokerFT, getProperty, getProperty),
    SLOT(CMPIBrokerFT, enumerateInstancesFiltered, enumerateFiltered),
    SLOT(CMPIBrokerFT, associatorsFiltered, associatorsFiltered),
    SLOT(CMPIBrokerFT, referencesFiltered, referencesFiltered),
};

} // namespace oxahv
