// Methods of classes: arguments in, return value and arguments out.

#include "Failure.h"
#include "Objects.h"
#include "Operations.h"
#include "Values.h"

namespace cimxml {

namespace {

// The type that the method's declaration gives an argument; else the one that the client announces.
CMPIType argumentType(const oxahv::MethodDeclaration* method, const std::string& name,
                      const Element& argument) {
    const oxahv::ParameterDeclaration* const parameter = method != nullptr ? method->find(name) : nullptr;
    return parameter != nullptr ? valueTypeOf(parameter->type, parameter->qualifiers)
                                : announcedType(argument);
}

CMPIArgs* readArguments(Environment& environment, const Call& call, const oxahv::MethodDeclaration* method) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIArgs* const arguments = checked("arguments", CMNewArgs, environment.broker.handle());
    for (const Element* const argument : call.parameters) {
        const std::string name = argument->attribute("NAME");
        const std::string what = "argument " + name;
        CMGetArg(arguments, name.c_str(), &status);
        if (status.rc == CMPI_RC_OK) {
            throw CimError(CMPI_RC_ERR_INVALID_PARAMETER, what + " appears twice");
        }
        const CMPIData data = readValue(environment, *argument, argumentType(method, name, *argument), what);
        const CMPIType type = data.type != CMPI_null ? data.type : static_cast<CMPIType>(CMPI_string);
        require(CMAddArg(arguments, name.c_str(), CMIsNullValue(data) ? nullptr : &data.value, type), what);
    }
    return arguments;
}

// What a value's element says of it.
std::vector<Attribute> attributesOf(const CMPIData& data) {
    std::vector<Attribute> attributes = {{"PARAMTYPE", typeNameOf(data.type)}};
    if ((data.type & ~CMPI_ARRAY) == CMPI_instance) {
        attributes.emplace_back("EmbeddedObject", "instance");
    }
    return attributes;
}

void writeArguments(XmlWriter& writer, Environment& environment, const CMPIArgs* arguments) {
    const CMPICount count = arguments != nullptr ? checked("arguments", CMGetArgCount, arguments) : 0;
    for (CMPICount i = 0; i < count; ++i) {
        const NamedData argument = argumentAt(arguments, i);
        std::vector<Attribute> attributes = attributesOf(argument.data);
        attributes.insert(attributes.begin(), {"NAME", argument.name});
        writer.element("PARAMVALUE", attributes, [&] { writeValue(writer, environment, argument.data); });
    }
}

} // namespace

void performMethod(Environment& environment, const Call& call, XmlWriter& writer) {
    const CMPIObjectPath* const path = readObjectPath(environment, *call.target);
    const auto declared = environment.schema.find(classNameOf(path));
    const oxahv::MethodDeclaration* const method =
        declared != nullptr ? declared->findMethod(call.name) : nullptr;
    if (declared != nullptr && method == nullptr) {
        throw CimError(CMPI_RC_ERR_METHOD_NOT_FOUND,
                       "class " + declared->name + " has no method " + call.name);
    }
    const oxahv::Reply reply = environment.request.invokeMethod(
        path, method != nullptr ? method->name : call.name, readArguments(environment, call, method));
    require(reply);
    if (!reply.data.empty() && !CMIsNullValue(reply.data.front())) {
        writer.element("RETURNVALUE", attributesOf(reply.data.front()),
                       [&] { writeValue(writer, environment, reply.data.front()); });
    }
    writeArguments(writer, environment, reply.out);
}

} // namespace cimxml
