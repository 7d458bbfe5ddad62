#include "Values.h"

#include "Failure.h"
#include "Objects.h"

#include <Names.h>
#include <Utf8.h>

#include <algorithm>
#include <charconv>
#include <cmath>
#include <limits>
#include <optional>

namespace cimxml {

namespace {

using encoding::sameName;

constexpr CMPIType plainTypes[] = {CMPI_boolean, CMPI_char16, CMPI_uint8,  CMPI_uint16,   CMPI_uint32,
                                   CMPI_uint64,  CMPI_sint8,  CMPI_sint16, CMPI_sint32,   CMPI_sint64,
                                   CMPI_real32,  CMPI_real64, CMPI_string, CMPI_dateTime, CMPI_ref};

constexpr CMPIType elementType(CMPIType type) {
    return static_cast<CMPIType>(type & ~CMPI_ARRAY);
}
constexpr CMPIType arrayOf(CMPIType type) {
    return static_cast<CMPIType>(type | CMPI_ARRAY);
}

// Reading

[[noreturn]] void refuse(const std::string& what, const std::string& text, CMPIType type) {
    throw CimError(CMPI_RC_ERR_INVALID_PARAMETER, what + ": '" + text + "' is no " + typeNameOf(type));
}

std::string_view trimmed(std::string_view text) {
    constexpr std::string_view space = " \t\r\n";
    const std::size_t first = text.find_first_not_of(space);
    return first != std::string_view::npos ? text.substr(first, text.find_last_not_of(space) - first + 1)
                                           : std::string_view();
}

template <class Integer>
std::optional<Integer> integerIn(std::string_view text) {
    // "+5" and "0x1F" are integers too, which from_chars does not take.
    const bool isNegative = !text.empty() && text.front() == '-';
    std::string digits(text.substr(!text.empty() && (isNegative || text.front() == '+') ? 1 : 0));
    int base = 10;
    if (digits.size() > 2 && digits[0] == '0' && (digits[1] == 'x' || digits[1] == 'X')) {
        digits.erase(0, 2);
        base = 16;
    }
    if (digits.empty() || digits.front() == '-') {
        return std::nullopt;
    }
    digits.insert(0, isNegative ? "-" : "");
    if (!std::is_signed_v<Integer> && isNegative && digits.find_first_not_of("-0") == std::string::npos) {
        digits = "0";
    }
    Integer number = 0;
    const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), number, base);
    return error == std::errc() && end == digits.data() + digits.size() ? std::optional<Integer>(number)
                                                                        : std::nullopt;
}

template <class Integer>
bool assignInteger(std::string_view text, Integer& member) {
    const std::optional<Integer> number = integerIn<Integer>(text);
    member = number.value_or(Integer{0});
    return number.has_value();
}

template <class Real>
bool assignReal(std::string_view text, Real& member) {
    if (sameName(text, "INF") || sameName(text, "-INF") || sameName(text, "NaN")) {
        const Real infinity = std::numeric_limits<Real>::infinity();
        member = sameName(text, "NaN") ? std::numeric_limits<Real>::quiet_NaN()
                 : text.front() == '-' ? -infinity
                                       : infinity;
        return true;
    }
    const std::string_view digits = text.substr(!text.empty() && text.front() == '+' ? 1 : 0);
    const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), member);
    return error == std::errc() && end == digits.data() + digits.size() && std::isfinite(member);
}

// One character of the basic plane, which is all that a char16 holds.
bool assignCharacter(std::string_view text, CMPIChar16& member) {
    const std::optional<char32_t> code = !text.empty() ? encoding::takeUtf8(text) : std::nullopt;
    member = static_cast<CMPIChar16>(code.value_or(0));
    return code && text.empty() && *code <= 0xFFFF;
}

bool assignBoolean(std::string_view text, CMPIBoolean& member) {
    member = sameName(text, "true") ? 1 : 0;
    return member != 0 || sameName(text, "false");
}

// Whether the text is a value of the number type.
bool assignNumber(std::string_view text, CMPIType type, CMPIValue& value) {
    switch (type) {
    case CMPI_boolean:
        return assignBoolean(text, value.boolean);
    case CMPI_uint8:
        return assignInteger(text, value.uint8);
    case CMPI_uint16:
        return assignInteger(text, value.uint16);
    case CMPI_uint32:
        return assignInteger(text, value.uint32);
    case CMPI_uint64:
        return assignInteger(text, value.uint64);
    case CMPI_sint8:
        return assignInteger(text, value.sint8);
    case CMPI_sint16:
        return assignInteger(text, value.sint16);
    case CMPI_sint32:
        return assignInteger(text, value.sint32);
    case CMPI_sint64:
        return assignInteger(text, value.sint64);
    case CMPI_real32:
        return assignReal(text, value.real32);
    case CMPI_real64:
        return assignReal(text, value.real64);
    default:
        return false;
    }
}

// An embedded instance comes as the text of its element.
CMPIInstance* embeddedInstance(Environment& environment, const std::string& text, const std::string& what) {
    try {
        const Element root = parseXml(text);
        if (root.name != "INSTANCE") {
            throw CimError(CMPI_RC_ERR_INVALID_PARAMETER,
                           what + ": an embedded " + root.name + " is not supported, only an INSTANCE");
        }
        return readInstance(environment, root, nullptr, CMPI_RC_ERR_INVALID_PARAMETER);
    } catch (const XmlError& error) {
        throw CimError(CMPI_RC_ERR_INVALID_PARAMETER, what + ": no embedded instance: " + error.what());
    }
}

CMPIData readArray(Environment& environment, const Element& array, CMPIType type, const std::string& what) {
    CMPIData data = {arrayOf(type), CMPI_goodValue, {}};
    data.value.array = checked(what, CMNewArray, environment.broker.handle(),
                               static_cast<CMPICount>(array.children.size()), type);
    CMPICount index = 0;
    for (const Element& child : array.children) {
        if (child.name != "VALUE.NULL") { // elements are NULL at first
            CMPIData element = {type, CMPI_goodValue, {}};
            if (type == CMPI_ref) {
                element.value.ref = readReference(environment, child);
            } else {
                element = valueFromText(environment, child.text, type, what);
            }
            require(CMSetArrayElementAt(data.value.array, index, &element.value, type), what);
        }
        ++index;
    }
    return data;
}

// Writing

template <class Real>
std::string realText(Real number, const CMPIData& data) {
    if (std::isnan(number)) {
        return "NaN";
    }
    return std::isinf(number) ? (number < 0 ? "-INF" : "INF") : oxahv::valueText(data);
}

std::string characterText(CMPIChar16 code) {
    std::string text;
    encoding::appendUtf8(text, encoding::isUnicodeScalar(code) ? code : 0xFFFD);
    return text;
}

// A broken provider or broker may hand out a value that is not NULL by its state, with a null handle.
void requireHandle(const CMPIData& data) {
    const bool hasHandle = (data.type & CMPI_ARRAY) != 0 || data.type == CMPI_string ||
                           data.type == CMPI_chars || data.type == CMPI_dateTime || data.type == CMPI_ref ||
                           data.type == CMPI_instance;
    if (hasHandle && data.value.string == nullptr) { // all handles lie at the same place
        throw CimError(CMPI_RC_ERR_FAILED, "the broker returned no " + typeNameOf(data.type));
    }
}

void writeElement(XmlWriter& writer, Environment& environment, const CMPIData& data) {
    requireHandle(data);
    if (data.type == CMPI_ref) {
        writer.element("VALUE.REFERENCE", {}, [&] { writeReference(writer, environment, data.value.ref); });
    } else if (data.type == CMPI_instance) {
        XmlWriter embedded;
        writeInstance(embedded, environment, data.value.inst, {});
        writer.element("VALUE", {}, [&] { writer.text(embedded.written()); });
    } else {
        writer.element("VALUE", {}, [&] { writer.text(plainText(data)); });
    }
}

struct PlainWriter {
    std::string operator()(std::monostate /*null*/) const { return ""; }
    std::string operator()(bool value) const { return value ? "TRUE" : "FALSE"; }
    std::string operator()(unsigned long long value) const {
        return type == CMPI_char16 ? characterText(static_cast<CMPIChar16>(value)) : std::to_string(value);
    }
    std::string operator()(long long value) const { return std::to_string(value); }
    std::string operator()(double value) const {
        CMPIData data = {CMPI_real64, CMPI_goodValue, {}};
        data.value.real64 = value;
        return plainText(data);
    }
    std::string operator()(const std::string& value) const { return value; }

    CMPIType type;
};

} // namespace

CMPIType typeFromName(const std::string& name) {
    const auto* const found = std::find_if(std::begin(plainTypes), std::end(plainTypes),
                                           [&](CMPIType type) { return sameName(name, typeNameOf(type)); });
    return found != std::end(plainTypes) ? *found : static_cast<CMPIType>(CMPI_null);
}

std::string typeNameOf(CMPIType type) {
    switch (elementType(type)) {
    case CMPI_ref:
        return "reference";
    case CMPI_null: // a NULL of a property that no class declares
    case CMPI_instance:
    case CMPI_chars:
        return "string";
    default:
        return oxahv::typeName(type);
    }
}

CMPIType valueTypeOf(CMPIType declared, const oxahv::Qualifiers& qualifiers) {
    const bool isEmbedded =
        qualifiers.find("EmbeddedInstance") != nullptr || qualifiers.isTrue("EmbeddedObject");
    return isEmbedded && elementType(declared) == CMPI_string
               ? static_cast<CMPIType>(CMPI_instance | (declared & CMPI_ARRAY))
               : declared;
}

CMPIType announcedType(const Element& element) {
    const bool isArray = element.name == "PROPERTY.ARRAY" || element.child("VALUE.ARRAY") != nullptr ||
                         element.child("VALUE.REFARRAY") != nullptr;
    const std::string* name = element.find("TYPE");
    name = name != nullptr ? name : element.find("PARAMTYPE");
    CMPIType type = typeFromName(name != nullptr ? *name : "");
    if (element.find("EmbeddedObject") != nullptr || element.find("EMBEDDEDOBJECT") != nullptr) {
        type = CMPI_instance;
    } else if (element.name == "PROPERTY.REFERENCE" || element.child("VALUE.REFERENCE") != nullptr ||
               element.child("VALUE.REFARRAY") != nullptr) {
        type = CMPI_ref;
    }
    return isArray && type != CMPI_null ? arrayOf(type) : type;
}

CMPIData valueFromText(Environment& environment, const std::string& text, CMPIType type,
                       const std::string& what) {
    CMPIData data = {type, CMPI_goodValue, {}};
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    switch (type) {
    case CMPI_string:
        data.value.string = checked(what, CMNewString, environment.broker.handle(), text.c_str());
        return data;
    case CMPI_dateTime:
        data.value.dateTime =
            CMNewDateTimeFromChars(environment.broker.handle(), std::string(trimmed(text)).c_str(), &status);
        if (status.rc != CMPI_RC_OK || data.value.dateTime == nullptr) {
            refuse(what, text, type);
        }
        return data;
    case CMPI_instance:
        data.value.inst = embeddedInstance(environment, text, what);
        return data;
    case CMPI_char16:
        if (!assignCharacter(text, data.value.char16)) {
            refuse(what, text, type);
        }
        return data;
    default:
        if (!assignNumber(trimmed(text), type, data.value)) {
            refuse(what, text, type);
        }
        return data;
    }
}

CMPIData readValue(Environment& environment, const Element& element, CMPIType type, const std::string& what) {
    const auto isNamed = [](const Element& child) { return child.name.compare(0, 5, "VALUE") == 0; };
    const auto value = std::find_if(element.children.begin(), element.children.end(), isNamed);
    if (value == element.children.end()) {
        return {type, CMPI_nullValue, {}};
    }
    const bool isArray = value->name == "VALUE.ARRAY" || value->name == "VALUE.REFARRAY";
    const bool isReference = value->name == "VALUE.REFERENCE" || value->name == "VALUE.REFARRAY";
    CMPIType wanted = type;
    if (type == CMPI_null) {
        wanted = isReference ? CMPI_ref : CMPI_string;
        wanted = isArray ? arrayOf(wanted) : wanted;
    }
    if (isArray != ((wanted & CMPI_ARRAY) != 0) || isReference != (elementType(wanted) == CMPI_ref)) {
        throw CimError(CMPI_RC_ERR_INVALID_PARAMETER, what + ": a " + value->name + " is no " +
                                                          oxahv::typeName(wanted) +
                                                          ((wanted & CMPI_ARRAY) != 0 ? " array" : ""));
    }
    if (isArray) {
        return readArray(environment, *value, elementType(wanted), what);
    }
    if (isReference) {
        CMPIData data = {CMPI_ref, CMPI_goodValue, {}};
        data.value.ref = readReference(environment, *value);
        return data;
    }
    return valueFromText(environment, value->text, wanted, what);
}

void writeValue(XmlWriter& writer, Environment& environment, const CMPIData& data) {
    if (CMIsNullValue(data)) {
        return;
    }
    if ((data.type & CMPI_ARRAY) == 0) {
        writeElement(writer, environment, data);
        return;
    }
    requireHandle(data);
    const bool isReference = elementType(data.type) == CMPI_ref;
    writer.element(isReference ? "VALUE.REFARRAY" : "VALUE.ARRAY", {}, [&] {
        const CMPICount count = checked("array", CMGetArrayCount, data.value.array);
        for (CMPICount i = 0; i < count; ++i) {
            const CMPIData element = checked("array element", CMGetArrayElementAt, data.value.array, i);
            if (CMIsNullValue(element)) {
                writer.element("VALUE.NULL", {});
            } else {
                writeElement(writer, environment, element);
            }
        }
    });
}

void writeDeclaredValue(XmlWriter& writer, const oxahv::DeclaredValue& value) {
    if (value.type == CMPI_null || value.isNull) {
        return;
    }
    const auto writeAll = [&] {
        for (const oxahv::PlainValue& element : value.elements) {
            if (std::holds_alternative<std::monostate>(element)) {
                writer.element("VALUE.NULL", {});
            } else {
                const std::string text = std::visit(PlainWriter{elementType(value.type)}, element);
                writer.element("VALUE", {}, [&] { writer.text(text); });
            }
        }
    };
    if ((value.type & CMPI_ARRAY) != 0) {
        writer.element("VALUE.ARRAY", {}, writeAll);
    } else {
        writeAll();
    }
}

std::string plainText(const CMPIData& data) {
    requireHandle(data);
    switch (data.type) {
    case CMPI_char16:
        return characterText(data.value.char16);
    case CMPI_real32:
        return realText(data.value.real32, data);
    case CMPI_real64:
        return realText(data.value.real64, data);
    case CMPI_string:
        return textOf(data.value.string);
    case CMPI_chars:
        return data.value.chars;
    case CMPI_dateTime:
        return textOf(checked("date", CMGetStringFormat, data.value.dateTime));
    default:
        return oxahv::valueText(data); // MOF writes booleans and integers the same way
    }
}

} // namespace cimxml
