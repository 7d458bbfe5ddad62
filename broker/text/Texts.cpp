// Codes, types, values and paths as texts.

#include "EmbeddedBroker.h"
#include "objects/Records.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>

namespace oxahv {

namespace {

struct CodeEntry {
    CMPIrc code;
    std::string_view name;
};

constexpr std::string_view prefix = "CMPI_RC_";

constexpr CodeEntry codes[] = {
    {CMPI_RC_OK, "OK"},
    {CMPI_RC_ERR_FAILED, "ERR_FAILED"},
    {CMPI_RC_ERR_ACCESS_DENIED, "ERR_ACCESS_DENIED"},
    {CMPI_RC_ERR_INVALID_NAMESPACE, "ERR_INVALID_NAMESPACE"},
    {CMPI_RC_ERR_INVALID_PARAMETER, "ERR_INVALID_PARAMETER"},
    {CMPI_RC_ERR_INVALID_CLASS, "ERR_INVALID_CLASS"},
    {CMPI_RC_ERR_NOT_FOUND, "ERR_NOT_FOUND"},
    {CMPI_RC_ERR_NOT_SUPPORTED, "ERR_NOT_SUPPORTED"},
    {CMPI_RC_ERR_CLASS_HAS_CHILDREN, "ERR_CLASS_HAS_CHILDREN"},
    {CMPI_RC_ERR_CLASS_HAS_INSTANCES, "ERR_CLASS_HAS_INSTANCES"},
    {CMPI_RC_ERR_INVALID_SUPERCLASS, "ERR_INVALID_SUPERCLASS"},
    {CMPI_RC_ERR_ALREADY_EXISTS, "ERR_ALREADY_EXISTS"},
    {CMPI_RC_ERR_NO_SUCH_PROPERTY, "ERR_NO_SUCH_PROPERTY"},
    {CMPI_RC_ERR_TYPE_MISMATCH, "ERR_TYPE_MISMATCH"},
    {CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, "ERR_QUERY_LANGUAGE_NOT_SUPPORTED"},
    {CMPI_RC_ERR_INVALID_QUERY, "ERR_INVALID_QUERY"},
    {CMPI_RC_ERR_METHOD_NOT_AVAILABLE, "ERR_METHOD_NOT_AVAILABLE"},
    {CMPI_RC_ERR_METHOD_NOT_FOUND, "ERR_METHOD_NOT_FOUND"},
    {CMPI_RC_DO_NOT_UNLOAD, "DO_NOT_UNLOAD"},
    {CMPI_RC_NEVER_UNLOAD, "NEVER_UNLOAD"},
    {CMPI_RC_ERR_INVALID_HANDLE, "ERR_INVALID_HANDLE"},
    {CMPI_RC_ERR_INVALID_DATA_TYPE, "ERR_INVALID_DATA_TYPE"},
    {CMPI_RC_ERROR_SYSTEM, "ERROR_SYSTEM"},
    {CMPI_RC_ERROR, "ERROR"},
};

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

std::string codeName(CMPIrc code) {
    for (const CodeEntry& entry : codes) {
        if (entry.code == code) {
            return std::string(prefix) + std::string(entry.name);
        }
    }
    return std::string(prefix) + std::to_string(static_cast<int>(code));
}

CMPIrc codeFromName(const std::string& name) {
    const std::string_view wanted =
        sameName(name.substr(0, prefix.size()), prefix) ? std::string_view(name).substr(prefix.size()) : name;
    for (const CodeEntry& entry : codes) {
        if (sameName(entry.name, wanted)) {
            return entry.code;
        }
    }
    const bool isNumber = !wanted.empty() && wanted.size() < 4 &&
                          wanted.find_first_not_of("0123456789") == std::string_view::npos;
    const int number = isNumber ? std::stoi(std::string(wanted)) : -1;
    if (number < 0 || number > CMPI_RC_ERROR) {
        throw BrokerError("there is no CMPI return code " + name);
    }
    return static_cast<CMPIrc>(number);
}

namespace {

// A text in quotes, as MOF writes it.
std::string quoted(std::string_view text) {
    std::string result = "\"";
    for (const char c : text) {
        switch (c) {
        case '"':
        case '\\':
            result += {'\\', c};
            break;
        case '\n':
            result += "\\n";
            break;
        case '\r':
            result += "\\r";
            break;
        case '\t':
            result += "\\t";
            break;
        default:
            result += c;
        }
    }
    return result + '"';
}

std::string arrayText(const Array& array) {
    std::string text = "{";
    for (const Value& element : array.elements) {
        text += (text.size() > 1 ? ", " : "") + valueText(element.data());
    }
    return text + "}";
}

// The shortest text that reads back as the same number. MOF wants a point in it, whatever the locale says.
template <class Real>
std::string realText(Real value) {
    std::array<char, 40> buffer{};
    std::string text(buffer.data(), std::to_chars(buffer.data(), buffer.data() + buffer.size(), value).ptr);
    if (std::isfinite(value) && text.find('.') == std::string::npos) {
        text.insert(std::min(text.find('e'), text.size()), ".0");
    }
    return text;
}

std::string objectText(const CMPIData& data) {
    if (const Array* const array = Array::of(data.value.array)) {
        return arrayText(*array);
    }
    if (const String* const string = String::of(data.value.string)) {
        return quoted(string->text);
    }
    if (const DateTime* const dateTime = DateTime::of(data.value.dateTime)) {
        return quoted(dateTime->text);
    }
    if (ObjectPath::of(data.value.ref) != nullptr) {
        return quoted(pathText(data.value.ref));
    }
    return "?";
}

} // namespace

std::string valueText(const CMPIData& data) {
    if (CMIsNullValue(data)) {
        return "NULL";
    }
    switch (data.type) {
    case CMPI_boolean:
        return data.value.boolean != 0 ? "TRUE" : "FALSE";
    case CMPI_uint8:
        return std::to_string(data.value.uint8);
    case CMPI_char16:
    case CMPI_uint16:
        return std::to_string(data.value.uint16);
    case CMPI_uint32:
        return std::to_string(data.value.uint32);
    case CMPI_uint64:
        return std::to_string(data.value.uint64);
    case CMPI_sint8:
        return std::to_string(data.value.sint8);
    case CMPI_sint16:
        return std::to_string(data.value.sint16);
    case CMPI_sint32:
        return std::to_string(data.value.sint32);
    case CMPI_sint64:
        return std::to_string(data.value.sint64);
    case CMPI_real32:
        return realText(data.value.real32);
    case CMPI_real64:
        return realText(data.value.real64);
    case CMPI_chars:
        return data.value.chars != nullptr ? quoted(data.value.chars) : "?";
    default:
        return objectText(data);
    }
}

std::string pathText(const CMPIObjectPath* handle) {
    const ObjectPath* const path = ObjectPath::of(handle);
    if (path == nullptr) {
        return {};
    }
    std::string text = path->nameSpace.empty() ? path->className : path->nameSpace + ':' + path->className;
    char separator = '.';
    for (const NamedValue& key : path->keys) {
        text += separator + key.name + '=' + valueText(key.value.data());
        separator = ',';
    }
    return text;
}

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
