// Values and object paths as MOF writes them.

#include "Text.h"
#include "objects/Records.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>

namespace oxahv {

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

// On one line: it is part of another instance's text.
std::string instanceText(const Instance& instance) {
    std::string text = "instance of " + instance.path->className + " {";
    for (const NamedValue& property : instance.properties) {
        text += ' ' + property.name + " = " + valueText(property.value.data()) + ';';
    }
    return text + " }";
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
    if (const Instance* const instance = Instance::of(data.value.inst)) {
        return instanceText(*instance);
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

} // namespace oxahv
