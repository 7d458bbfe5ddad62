#include "Operations.h"

#include "ClassElements.h"
#include "Failure.h"
#include "Objects.h"
#include "Parameters.h"
#include "Results.h"
#include "Values.h"

#include <Names.h>

#include <algorithm>
#include <optional>

namespace cimxml {

namespace {

using encoding::sameName;
using oxahv::Reply;

// What a request for instances says of what is to be shown of them. Without LocalOnly the inherited
// properties are shown too: the default of the standard, TRUE, would hide the keys of most classes, and the
// parameter is deprecated for instances.
struct Selection {
    explicit Selection(const Parameters& parameters) : names(parameters.names("PropertyList")) {
        shown.localOnly = parameters.boolean("LocalOnly", false);
        shown.includesQualifiers = parameters.boolean("IncludeQualifiers", false);
        shown.includesClassOrigin = parameters.boolean("IncludeClassOrigin", false);
        shown.properties = list();
    }
    Selection(const Selection&) = delete;
    Selection& operator=(const Selection&) = delete;

    const std::vector<std::string>* list() const { return names ? &*names : nullptr; }

    std::optional<std::vector<std::string>> names;
    Shown shown;
};

CMPIObjectPath* classPath(const Parameters& parameters, const std::string& className) {
    const Environment& environment = parameters.environment();
    return environment.request.objectPath(environment.nameSpace, className);
}

const CMPIInstance* onlyInstance(const Reply& reply) {
    require(reply);
    if (reply.instances.size() != 1) {
        throw CimError(CMPI_RC_ERR_FAILED, "the provider returned " + std::to_string(reply.instances.size()) +
                                               " instances in place of one");
    }
    return reply.instances.front();
}

// Enumerations

bool isRefusal(const Reply& reply) {
    return !reply.isServed || reply.code == CMPI_RC_ERR_NOT_SUPPORTED ||
           reply.code == CMPI_RC_ERR_INVALID_CLASS;
}

// Enumerates a class and the classes that derive from it, each of which may have a provider of its own. A
// provider of the superclass may have returned some of their instances already. `ask` sends the request for
// one class.
template <class Ask>
void enumerate(const Parameters& parameters, const std::string& className,
               const oxahv::InstanceHandler& writeInstances, const oxahv::PathHandler& writePaths,
               const Ask& ask) {
    Environment& environment = parameters.environment();
    std::vector<std::string> classes = environment.schema.subclassesOf(className, true);
    classes.insert(classes.begin(), className);
    Results results(environment, classes.size() > 1, writeInstances, writePaths);
    std::optional<Reply> refusal; // the first one
    bool isServed = false;
    for (const std::string& name : classes) {
        const std::size_t before = results.count();
        const Reply reply = ask(classPath(parameters, name));
        if (!isRefusal(reply) || results.count() > before) {
            results.require(reply);
            isServed = true;
        } else if (!refusal) {
            refusal = reply;
        }
    }
    if (!isServed) {
        results.require(*refusal);
    }
}

void enumerateInstances(const Parameters& parameters, XmlWriter& writer) {
    const std::string className = parameters.requiredClassName("ClassName");
    Environment& environment = parameters.environment();
    Selection selection(parameters);
    if (!parameters.boolean("DeepInheritance", true)) {
        selection.shown.declaredBy = className;
    }
    const auto write = [&](const CMPIInstance* instance) {
        writer.element("VALUE.NAMEDINSTANCE", {}, [&] {
            writeInstanceName(writer, environment, pathOf(instance));
            writeInstance(writer, environment, instance, selection.shown);
        });
    };
    enumerate(parameters, className, write, nullptr, [&](const CMPIObjectPath* path) {
        return environment.request.enumerateInstances(path, selection.list());
    });
}

void enumerateInstanceNames(const Parameters& parameters, XmlWriter& writer) {
    Environment& environment = parameters.environment();
    const auto write = [&](const CMPIObjectPath* path) { writeInstanceName(writer, environment, path); };
    enumerate(parameters, parameters.requiredClassName("ClassName"), nullptr, write,
              [&](const CMPIObjectPath* path) { return environment.request.enumerateInstanceNames(path); });
}

// Single instances

void getInstance(const Parameters& parameters, XmlWriter& writer) {
    const CMPIObjectPath* const path = parameters.instanceName("InstanceName");
    const Selection selection(parameters);
    Environment& environment = parameters.environment();
    const Reply reply = environment.request.getInstance(path, selection.list());
    writeInstance(writer, environment, onlyInstance(reply), selection.shown);
}

const Element& instanceIn(const Element& parent) {
    const Element* const instance = parent.child("INSTANCE");
    if (instance == nullptr) {
        throw CimError(CMPI_RC_ERR_INVALID_PARAMETER, parent.name + " without INSTANCE");
    }
    return *instance;
}

void createInstance(const Parameters& parameters, XmlWriter& writer) {
    Environment& environment = parameters.environment();
    const CMPIInstance* const instance = readInstance(
        environment, instanceIn(parameters.required("NewInstance")), nullptr, CMPI_RC_ERR_INVALID_PARAMETER);
    const CMPIObjectPath* const path = pathOf(instance);
    const Reply reply = environment.request.createInstance(path, instance);
    require(reply);
    // Of a provider that returns no path, the new instance has the one that the client gave it.
    writeInstanceName(writer, environment, reply.objectPaths.empty() ? path : reply.objectPaths.front());
}

void modifyInstance(const Parameters& parameters, XmlWriter& /*writer*/) {
    Environment& environment = parameters.environment();
    const Element* const named = parameters.required("ModifiedInstance").child("VALUE.NAMEDINSTANCE");
    const Element* const name = named != nullptr ? named->child("INSTANCENAME") : nullptr;
    if (name == nullptr) {
        throw CimError(CMPI_RC_ERR_INVALID_PARAMETER, "parameter ModifiedInstance is no VALUE.NAMEDINSTANCE");
    }
    const CMPIObjectPath* const path = readInstanceName(environment, *name, environment.nameSpace);
    const CMPIInstance* const instance =
        readInstance(environment, instanceIn(*named), path, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    const auto names = parameters.names("PropertyList");
    require(environment.request.modifyInstance(path, instance, names ? &*names : nullptr));
}

void deleteInstance(const Parameters& parameters, XmlWriter& /*writer*/) {
    require(parameters.environment().request.deleteInstance(parameters.instanceName("InstanceName")));
}

// Single properties

void getProperty(const Parameters& parameters, XmlWriter& writer) {
    Environment& environment = parameters.environment();
    const CMPIObjectPath* const path = parameters.instanceName("InstanceName");
    const Reply reply = environment.request.getProperty(path, parameters.requiredText("PropertyName"));
    if (!require(reply).data.empty()) {
        writeValue(writer, environment, reply.data.front());
    }
}

void setProperty(const Parameters& parameters, XmlWriter& /*writer*/) {
    Environment& environment = parameters.environment();
    const CMPIObjectPath* const path = parameters.instanceName("InstanceName");
    const std::string name = parameters.requiredText("PropertyName");
    const auto declared = environment.schema.find(classNameOf(path));
    const oxahv::PropertyDeclaration* const property = declared != nullptr ? declared->find(name) : nullptr;
    const CMPIType type = property != nullptr ? valueTypeOf(property->type, property->qualifiers)
                                              : static_cast<CMPIType>(CMPI_null);
    const Element* const value = parameters.find("NewValue");
    CMPIData data = {type, CMPI_nullValue, {}};
    if (value != nullptr) {
        data = readValue(environment, *value, type, "property " + name);
    }
    require(environment.request.setProperty(path, name, data));
}

// Several instances

// `ask` sends the request.
template <class Ask>
void writeObjects(const Parameters& parameters, XmlWriter& writer, const Shown& shown, const Ask& ask) {
    Environment& environment = parameters.environment();
    const auto write = [&](const CMPIInstance* instance) {
        writer.element("VALUE.OBJECTWITHPATH", {}, [&] {
            writeInstancePath(writer, environment, pathOf(instance));
            writeInstance(writer, environment, instance, shown);
        });
    };
    const Results results(environment, false, write, nullptr);
    results.require(ask(environment.request));
}

template <class Ask>
void writePaths(const Parameters& parameters, XmlWriter& writer, const Ask& ask) {
    Environment& environment = parameters.environment();
    const auto write = [&](const CMPIObjectPath* path) {
        writer.element("OBJECTPATH", {}, [&] { writeInstancePath(writer, environment, path); });
    };
    const Results results(environment, false, nullptr, write);
    results.require(ask(environment.request));
}

// The instance at one end of associations.
CMPIObjectPath* objectName(const Parameters& parameters) {
    if (parameters.required("ObjectName").child("CLASSNAME") != nullptr) {
        throw CimError(CMPI_RC_ERR_NOT_SUPPORTED, "associations between classes are not supported");
    }
    return parameters.instanceName("ObjectName");
}

oxahv::AssociationFilter filterOf(const Parameters& parameters) {
    return {parameters.className("AssocClass"), parameters.className("ResultClass"), parameters.text("Role"),
            parameters.text("ResultRole")};
}

void associators(const Parameters& parameters, XmlWriter& writer) {
    const Selection selection(parameters);
    const CMPIObjectPath* const path = objectName(parameters);
    const oxahv::AssociationFilter filter = filterOf(parameters);
    writeObjects(parameters, writer, selection.shown, [&](oxahv::Request& request) {
        return request.associators(path, filter, selection.list());
    });
}

void associatorNames(const Parameters& parameters, XmlWriter& writer) {
    const CMPIObjectPath* const path = objectName(parameters);
    const oxahv::AssociationFilter filter = filterOf(parameters);
    writePaths(parameters, writer,
               [&](oxahv::Request& request) { return request.associatorNames(path, filter); });
}

void references(const Parameters& parameters, XmlWriter& writer) {
    const Selection selection(parameters);
    const CMPIObjectPath* const path = objectName(parameters);
    const oxahv::AssociationFilter filter = filterOf(parameters);
    writeObjects(parameters, writer, selection.shown,
                 [&](oxahv::Request& request) { return request.references(path, filter, selection.list()); });
}

void referenceNames(const Parameters& parameters, XmlWriter& writer) {
    const CMPIObjectPath* const path = objectName(parameters);
    const oxahv::AssociationFilter filter = filterOf(parameters);
    writePaths(parameters, writer,
               [&](oxahv::Request& request) { return request.referenceNames(path, filter); });
}

// The class that a query is about, which decides who is asked: the word after FROM.
std::string classInQuery(const std::string& query) {
    constexpr const char* space = " \t\r\n";
    std::string before;
    for (std::size_t begin = query.find_first_not_of(space); begin != std::string::npos;) {
        const std::size_t end = std::min(query.find_first_of(space, begin), query.size());
        std::string word = query.substr(begin, end - begin);
        if (sameName(before, "from")) {
            return word;
        }
        before = std::move(word);
        begin = query.find_first_not_of(space, end);
    }
    throw CimError(CMPI_RC_ERR_INVALID_QUERY, "the query names no class: there is no FROM in it");
}

void execQuery(const Parameters& parameters, XmlWriter& writer) {
    const std::string language = parameters.requiredText("QueryLanguage");
    const std::string query = parameters.requiredText("Query");
    const CMPIObjectPath* const path = classPath(parameters, classInQuery(query));
    writeObjects(parameters, writer, {},
                 [&](oxahv::Request& request) { return request.execQuery(path, query, language); });
}

// Classes and qualifiers

std::shared_ptr<const DeclaredClass> declaredClass(const Parameters& parameters, const std::string& name,
                                                   CMPIrc otherwise) {
    auto declared = parameters.environment().schema.find(name);
    if (declared == nullptr) {
        throw CimError(otherwise, "class " + name + " is not declared");
    }
    return declared;
}

Shown classSelection(const Parameters& parameters, const std::vector<std::string>* properties) {
    Shown shown;
    shown.localOnly = parameters.boolean("LocalOnly", true);
    shown.includesQualifiers = parameters.boolean("IncludeQualifiers", true);
    shown.includesClassOrigin = parameters.boolean("IncludeClassOrigin", false);
    shown.properties = properties;
    return shown;
}

void getClass(const Parameters& parameters, XmlWriter& writer) {
    const std::string name = parameters.requiredClassName("ClassName");
    const auto names = parameters.names("PropertyList");
    writeClass(writer, *declaredClass(parameters, name, CMPI_RC_ERR_NOT_FOUND),
               classSelection(parameters, names ? &*names : nullptr));
}

std::vector<std::string> enumeratedClasses(const Parameters& parameters) {
    const std::string name = parameters.className("ClassName");
    if (!name.empty()) {
        declaredClass(parameters, name, CMPI_RC_ERR_INVALID_CLASS);
    }
    return parameters.environment().schema.subclassesOf(name, parameters.boolean("DeepInheritance", false));
}

void enumerateClasses(const Parameters& parameters, XmlWriter& writer) {
    const Shown shown = classSelection(parameters, nullptr);
    for (const std::string& name : enumeratedClasses(parameters)) {
        writeClass(writer, *declaredClass(parameters, name, CMPI_RC_ERR_FAILED), shown);
    }
}

void enumerateClassNames(const Parameters& parameters, XmlWriter& writer) {
    for (const std::string& name : enumeratedClasses(parameters)) {
        writer.element("CLASSNAME", {{"NAME", name}});
    }
}

void getQualifier(const Parameters& parameters, XmlWriter& writer) {
    const std::string name = parameters.requiredText("QualifierName");
    for (const auto& type : parameters.environment().broker.qualifierTypes()) {
        if (sameName(type.name, name)) {
            writeQualifierType(writer, type);
            return;
        }
    }
    throw CimError(CMPI_RC_ERR_NOT_FOUND, "qualifier " + name + " is not declared");
}

void enumerateQualifiers(const Parameters& parameters, XmlWriter& writer) {
    for (const auto& type : parameters.environment().broker.qualifierTypes()) {
        writeQualifierType(writer, type);
    }
}

struct Operation {
    const char* name;
    void (*perform)(const Parameters& parameters, XmlWriter& writer);
    bool hasResult; // an IRETURNVALUE, which may be empty
    std::vector<const char*> parameters;
};

const std::vector<Operation>& operations() {
    static const std::vector<Operation> all = {
        {"GetInstance",
         getInstance,
         true,
         {"InstanceName", "LocalOnly", "IncludeQualifiers", "IncludeClassOrigin", "PropertyList"}},
        {"EnumerateInstances",
         enumerateInstances,
         true,
         {"ClassName", "LocalOnly", "DeepInheritance", "IncludeQualifiers", "IncludeClassOrigin",
          "PropertyList"}},
        {"EnumerateInstanceNames", enumerateInstanceNames, true, {"ClassName"}},
        {"CreateInstance", createInstance, true, {"NewInstance"}},
        {"ModifyInstance", modifyInstance, false, {"ModifiedInstance", "IncludeQualifiers", "PropertyList"}},
        {"DeleteInstance", deleteInstance, false, {"InstanceName"}},
        {"GetProperty", getProperty, true, {"InstanceName", "PropertyName"}},
        {"SetProperty", setProperty, false, {"InstanceName", "PropertyName", "NewValue"}},
        {"Associators",
         associators,
         true,
         {"ObjectName", "AssocClass", "ResultClass", "Role", "ResultRole", "IncludeQualifiers",
          "IncludeClassOrigin", "PropertyList"}},
        {"AssociatorNames",
         associatorNames,
         true,
         {"ObjectName", "AssocClass", "ResultClass", "Role", "ResultRole"}},
        {"References",
         references,
         true,
         {"ObjectName", "ResultClass", "Role", "IncludeQualifiers", "IncludeClassOrigin", "PropertyList"}},
        {"ReferenceNames", referenceNames, true, {"ObjectName", "ResultClass", "Role"}},
        {"ExecQuery", execQuery, true, {"QueryLanguage", "Query"}},
        {"GetClass",
         getClass,
         true,
         {"ClassName", "LocalOnly", "IncludeQualifiers", "IncludeClassOrigin", "PropertyList"}},
        {"EnumerateClasses",
         enumerateClasses,
         true,
         {"ClassName", "DeepInheritance", "LocalOnly", "IncludeQualifiers", "IncludeClassOrigin"}},
        {"EnumerateClassNames", enumerateClassNames, true, {"ClassName", "DeepInheritance"}},
        {"GetQualifier", getQualifier, true, {"QualifierName"}},
        {"EnumerateQualifiers", enumerateQualifiers, true, {}},
    };
    return all;
}

} // namespace

const Reply& require(const Reply& reply) {
    if (!reply.ok()) {
        throw CimError(reply.code, reply.message);
    }
    return reply;
}

void performOperation(Environment& environment, const Call& call, XmlWriter& writer) {
    const auto operation =
        std::find_if(operations().begin(), operations().end(),
                     [&](const Operation& candidate) { return sameName(candidate.name, call.name); });
    if (operation == operations().end()) {
        throw CimError(CMPI_RC_ERR_NOT_SUPPORTED, "operation " + call.name + " is not supported");
    }
    const Parameters parameters(environment, call, operation->parameters);
    if (operation->hasResult) {
        writer.element("IRETURNVALUE", {}, [&] { operation->perform(parameters, writer); });
    } else {
        operation->perform(parameters, writer);
    }
}

} // namespace cimxml
