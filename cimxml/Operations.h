// The operations of CIM (DSP0200), performed by the broker.
#pragma once

#include "Environment.h"
#include "Message.h"
#include "Xml.h"

namespace cimxml {

// Performs an operation of the server and writes the content of its IMETHODRESPONSE. Throws CimError.
void performOperation(Environment& environment, const Call& call, XmlWriter& writer);

// Calls a method and writes the content of its METHODRESPONSE. Throws CimError.
void performMethod(Environment& environment, const Call& call, XmlWriter& writer);

// Throws CimError with the reply's code and message, unless the code is CMPI_RC_OK.
const oxahv::Reply& require(const oxahv::Reply& reply);

} // namespace cimxml
