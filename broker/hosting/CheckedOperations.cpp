// The operations for which Hosting does more than to ask a provider: it checks methods and single properties
// against the class's declaration, and answers queries that providers leave to it.
#include "Core.h"
#include "query/Query.h"

#include <algorithm>

namespace oxahv {

namespace {

// Why a declared method does not take its arguments; empty when it does.
std::string complaintAbout(const Classes& classes, const MethodDeclaration& method, const Arguments& in) {
    for (const NamedValue& argument : in.values) {
        const ParameterDeclaration* const parameter = method.find(argument.name);
        if (parameter == nullptr || !parameter->isIn) {
            return "method " + method.name + " takes no argument " + argument.name;
        }
        const ValueType type = valueTypeOf(*parameter);
        if (!argument.value.isNull() && !hasType(classes, argument.value, type)) {
            return "argument " + argument.name + " of method " + method.name + " is no " +
                   declaredTypeName(type.type) +
                   (type.embeddedClass.empty() ? "" : " of " + std::string(type.embeddedClass));
        }
    }
    return {};
}

// The declaration of a path's class; null where there is none, or no path.
const DeclaredClass* declarationOf(const Core& core, const CMPIObjectPath* handle) {
    const ObjectPath* const path = ObjectPath::of(handle);
    return path != nullptr ? core.classes.find(path->className) : nullptr;
}

// Why there is no such property; empty where there may be.
std::string complaintAbout(const DeclaredClass* declared, const char* property) {
    return declared != nullptr && declared->find(property) == nullptr
               ? "class " + declared->name + " has no property " + property
               : "";
}

// Whether a property is to be read from its instance, or written by it, or a query to be answered from all
// instances: no MI does it itself.
bool isLeftToInstances(const Reply& reply) {
    return !reply.isServed || reply.code == CMPI_RC_ERR_NOT_SUPPORTED;
}

// The instances' answer, where they have one.
Reply either(Reply ofProperty, Reply ofInstance) {
    return ofProperty.isServed && !ofInstance.isServed ? std::move(ofProperty) : std::move(ofInstance);
}

// Puts a property of the instance that a reply holds into its data.
void takeProperty(Reply& reply, const char* name) {
    if (!reply.ok()) {
        return;
    }
    if (reply.instances.empty()) {
        reply.code = CMPI_RC_ERR_NOT_FOUND;
        return;
    }
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    reply.data = {CMGetProperty(reply.instances.front(), name, &status)};
    reply.code = status.rc;
    reply.instances.clear();
}

} // namespace

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
    const std::string complaint =
        wanted != nullptr ? complaintAbout(core_.classes, *wanted, *Arguments::of(given)) : "";
    Reply reply;
    if (declared != nullptr && wanted == nullptr) {
        reply = refused(CMPI_RC_ERR_METHOD_NOT_FOUND, "class " + declared->name + " has no method " + method);
    } else if (!complaint.empty()) {
        reply = refused(CMPI_RC_ERR_INVALID_PARAMETER, complaint);
    } else {
        reply = serve<&CMPIMethodMIFT::invokeMethod>(context, path, method, given, out);
    }
    reply.out = out;
    return reply;
}

Reply Hosting::getProperty(const CMPIContext* context, const CMPIObjectPath* path, const char* name) {
    const std::string complaint = complaintAbout(declarationOf(core_, path), name);
    if (!complaint.empty()) {
        return refused(CMPI_RC_ERR_NO_SUCH_PROPERTY, complaint);
    }
    Reply reply = serve<&CMPIPropertyMIFT::getProperty>(context, path, name);
    if (!isLeftToInstances(reply)) {
        return reply;
    }
    const char* properties[] = {name, nullptr};
    Reply ofInstance = serve<&CMPIInstanceMIFT::getInstance>(context, path, properties);
    takeProperty(ofInstance, name);
    return either(std::move(reply), std::move(ofInstance));
}

Reply Hosting::setProperty(const CMPIContext* context, const CMPIObjectPath* path, const char* name,
                           const CMPIValue* value, CMPIType type) {
    const auto declared = declarationOf(core_, path);
    const std::string complaint = complaintAbout(declared, name);
    if (!complaint.empty()) {
        return refused(CMPI_RC_ERR_NO_SUCH_PROPERTY, complaint);
    }
    CMPIData data = {};
    try {
        data = keep(core_, declared != nullptr
                               ? checkedValue(core_, value, type, valueTypeOf(*declared->find(name)))
                               : Value::from(core_, value, type));
    } catch (const Failure& failure) {
        return refused(failure.code, std::string("the value does not fit property ") + name);
    }
    Reply reply = serve<&CMPIPropertyMIFT::setProperty>(context, path, name, data);
    return isLeftToInstances(reply) ? either(std::move(reply), modifyProperty(context, path, name, data))
                                    : reply;
}

// Leaves of the instances those that the query accepts, with the properties that it selects.
static void apply(const Query& query, Reply& reply) {
    const auto isRefused = [&](const CMPIInstance* instance) {
        return !query.accepts(*Instance::of(instance));
    };
    reply.instances.erase(std::remove_if(reply.instances.begin(), reply.instances.end(), isRefused),
                          reply.instances.end());
    for (const CMPIInstance* const instance : reply.instances) {
        query.project(*Instance::of(instance));
    }
}

Reply Hosting::execQuery(const CMPIContext* context, const CMPIObjectPath* path, const char* query,
                         const char* language) {
    Reply reply = serve<&CMPIInstanceMIFT::execQuery>(context, path, query, language);
    const ObjectPath* const asked = ObjectPath::of(path);
    if (!isLeftToInstances(reply) || reply.code != CMPI_RC_ERR_NOT_SUPPORTED || asked == nullptr ||
        query == nullptr || language == nullptr) {
        return reply;
    }
    try {
        const std::shared_ptr<const Query> parsed = Query::parse(query, language);
        parsed->check(core_.classes);
        auto from = std::make_unique<ObjectPath>(core_, asked->nameSpace, parsed->className());
        Reply all = serve<&CMPIInstanceMIFT::enumerateInstances>(context, handOut(std::move(from)),
                                                                 static_cast<const char**>(nullptr));
        if (all.ok()) {
            apply(*parsed, all);
        }
        return either(std::move(reply), std::move(all));
    } catch (const Failure& failure) {
        return refused(failure.code, failure.text != nullptr ? *failure.text : "");
    }
}

Reply Hosting::modifyProperty(const CMPIContext* context, const CMPIObjectPath* path, const char* name,
                              const CMPIData& data) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIInstance* const instance = CMNewInstance(&core_.record, path, &status);
    if (status.rc == CMPI_RC_OK) {
        const bool isNull = (data.state & CMPI_nullValue) != 0;
        status = CMSetProperty(instance, name, isNull ? nullptr : &data.value, data.type);
    }
    if (status.rc != CMPI_RC_OK) {
        return refused(status.rc);
    }
    const char* properties[] = {name, nullptr};
    return serve<&CMPIInstanceMIFT::modifyInstance>(context, path, instance, properties);
}

} // namespace oxahv
