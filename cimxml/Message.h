// A request message of CIM-XML (DSP0201), taken apart into the operations that it asks for.
#pragma once

#include "Http.h"
#include "Xml.h"

#include <string>
#include <vector>

namespace cimxml {

// One operation. The elements are the message's.
struct Call {
    bool isMethod = false;           // a method of a class, not an operation of the server
    std::string name;                // as "GetInstance"
    std::string nameSpace;           // as "root/cimv2"
    const Element* target = nullptr; // of a method: LOCALCLASSPATH or LOCALINSTANCEPATH
    std::vector<const Element*> parameters;
};

struct Message {
    std::string id;
    bool isMultiple = false;
    std::vector<Call> calls;
};

// Reads a message whose root this is, and compares it with the headers that announce it. Throws HttpError.
Message readMessage(const Element& root, const CimHeaders& headers);

// The namespace of a LOCALNAMESPACEPATH, as "root/cimv2"; empty for null.
std::string nameSpaceOf(const Element* localNameSpacePath);

} // namespace cimxml
