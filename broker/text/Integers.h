// CIM's integer types, and which numbers that are written in a text fit into them.
#pragma once

#include <cmpidt.h>

#include <limits>

namespace oxahv {

// A number of any integer type.
struct WideInteger {
    unsigned long long magnitude = 0;
    bool isNegative = false;

    // As `CMPI_uint64` and `CMPI_sint64` hold it. Narrower members of a CMPIValue share the low bytes.
    constexpr unsigned long long bits() const { return isNegative ? 0U - magnitude : magnitude; }
};
static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__);

struct IntegerType {
    CMPIType type;
    bool isSigned;
    unsigned int bits;

    // A number of sign and magnitude; zero is never negative.
    constexpr bool holds(unsigned long long magnitude, bool isNegative) const {
        const unsigned long long highest =
            std::numeric_limits<unsigned long long>::max() >> (64U - bits + (isSigned ? 1U : 0U));
        return isNegative ? isSigned && magnitude <= highest + 1U : magnitude <= highest;
    }
};

constexpr IntegerType integerTypes[] = {
    {CMPI_uint8, false, 8}, {CMPI_uint16, false, 16}, {CMPI_uint32, false, 32}, {CMPI_uint64, false, 64},
    {CMPI_sint8, true, 8},  {CMPI_sint16, true, 16},  {CMPI_sint32, true, 32},  {CMPI_sint64, true, 64},
};

// Null for a type that is no integer.
constexpr const IntegerType* integerType(CMPIType type) {
    for (const IntegerType& entry : integerTypes) {
        if (entry.type == type) {
            return &entry;
        }
    }
    return nullptr;
}

} // namespace oxahv
