// What the values in a MOF text mean.
#pragma once

#include "mof/MofParser.h"

namespace oxahv {

// The value as one of a type; throws BrokerError at what does not fit into it.
DeclaredValue mofValueOf(const MofSource& source, const MofValue& value, CMPIType type);

// The type that a value has by itself: the integers are `CMPI_sint64`, or `CMPI_uint64` where that is too
// narrow; a NULL and an empty array count as texts.
CMPIType mofTypeOf(const MofValue& value);

} // namespace oxahv
