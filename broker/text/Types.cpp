// The names of CIM's types.

#include "Text.h"

#include <string_view>

namespace oxahv {

namespace {

struct TypeEntry {
    CMPIType type;
    std::string_view name;
};

constexpr TypeEntry types[] = {
    {CMPI_boolean, "boolean"}, {CMPI_char16, "char16"},     {CMPI_real32, "real32"},
    {CMPI_real64, "real64"},   {CMPI_uint8, "uint8"},       {CMPI_uint16, "uint16"},
    {CMPI_uint32, "uint32"},   {CMPI_uint64, "uint64"},     {CMPI_sint8, "sint8"},
    {CMPI_sint16, "sint16"},   {CMPI_sint32, "sint32"},     {CMPI_sint64, "sint64"},
    {CMPI_string, "string"},   {CMPI_chars, "string"},      {CMPI_dateTime, "datetime"},
    {CMPI_ref, "reference"},   {CMPI_instance, "instance"},
};

} // namespace

std::string typeName(CMPIType type) {
    const auto element = static_cast<CMPIType>(type & ~CMPI_ARRAY);
    for (const TypeEntry& entry : types) {
        if (entry.type == element) {
            return std::string(entry.name);
        }
    }
    return "type " + std::to_string(element);
}

} // namespace oxahv
