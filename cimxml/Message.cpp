#include "Message.h"

namespace cimxml {

namespace {

[[noreturn]] void refuse(const std::string& text) {
    throw HttpError(400, "request-not-valid", text);
}

const Element& required(const Element& parent, const char* name) {
    const Element* const child = parent.child(name);
    if (child == nullptr) {
        refuse("there is no " + std::string(name) + " in " + parent.name);
    }
    return *child;
}

// The value of an attribute that may not be missing.
std::string required(const std::string* value, const Element& element, const char* attribute) {
    if (value == nullptr || value->empty()) {
        refuse(element.name + " has no attribute " + attribute);
    }
    return *value;
}

void requireVersion(const Element& element, const char* attribute, const char* major, const char* cimError) {
    const std::string version = required(element.find(attribute), element, attribute);
    if (version.compare(0, 2, major) != 0) {
        throw HttpError(501, cimError, std::string(attribute) + " is " + version);
    }
}

Call readCall(const Element& request) {
    Call call;
    const Element* element = request.child("IMETHODCALL");
    if (element == nullptr) {
        call.isMethod = true;
        element = &required(request, "METHODCALL");
        call.target = element->child("LOCALINSTANCEPATH");
        if (call.target == nullptr) {
            call.target = &required(*element, "LOCALCLASSPATH");
        }
    }
    call.name = required(element->find("NAME"), *element, "NAME");
    call.nameSpace = nameSpaceOf(&required(call.isMethod ? *call.target : *element, "LOCALNAMESPACEPATH"));
    for (const Element& child : element->children) {
        if (child.name == (call.isMethod ? "PARAMVALUE" : "IPARAMVALUE")) {
            required(child.find("NAME"), child, "NAME");
            call.parameters.push_back(&child);
        }
    }
    return call;
}

// What the header CIMObject names.
std::string objectOf(const Call& call) {
    if (!call.isMethod) {
        return call.nameSpace;
    }
    const bool isClass = call.target->name == "LOCALCLASSPATH";
    const Element& named = required(*call.target, isClass ? "CLASSNAME" : "INSTANCENAME");
    const char* const attribute = isClass ? "NAME" : "CLASSNAME";
    return call.nameSpace + ':' + required(named.find(attribute), named, attribute);
}

} // namespace

std::string nameSpaceOf(const Element* localNameSpacePath) {
    std::string path;
    if (localNameSpacePath != nullptr) {
        for (const Element& part : localNameSpacePath->children) {
            path += (path.empty() ? "" : "/") + part.attribute("NAME");
        }
    }
    return path;
}

Message readMessage(const Element& root, const CimHeaders& headers) {
    if (root.name != "CIM") {
        refuse("the document is no CIM, but " + root.name);
    }
    requireVersion(root, "CIMVERSION", "2.", "unsupported-cim-version");
    requireVersion(root, "DTDVERSION", "2.", "unsupported-dtd-version");
    const Element& element = required(root, "MESSAGE");
    requireVersion(element, "PROTOCOLVERSION", "1.", "unsupported-protocol-version");
    Message message;
    message.id = required(element.find("ID"), element, "ID");
    if (element.child("SIMPLEEXPREQ") != nullptr || element.child("MULTIEXPREQ") != nullptr) {
        throw HttpError(501, "unsupported-operation", "export requests are for listeners of indications");
    }
    const Element* const multiple = element.child("MULTIREQ");
    if (multiple == nullptr) {
        message.calls.push_back(readCall(required(element, "SIMPLEREQ")));
        headers.requireSingle(message.calls.front().name, objectOf(message.calls.front()));
        return message;
    }
    headers.requireBatch();
    message.isMultiple = true;
    for (const Element& request : multiple->children) {
        message.calls.push_back(readCall(request));
    }
    if (message.calls.size() < 2) {
        refuse("a MULTIREQ holds two requests or more");
    }
    return message;
}

} // namespace cimxml
