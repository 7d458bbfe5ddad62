#include "show/Output.h"

#include "show/Text.h"
#include "show/Values.h"

#include <charconv>
#include <nlohmann/json.hpp>

namespace oxahv::runner {

namespace {

using Json = nlohmann::ordered_json;

Json jsonOf(const CMPIData& data);
Json jsonOf(const CMPIInstance* embedded);

// The double that is written as shortly as the number is: 0.1, not 0.10000000149011612.
double shortest(const CMPIData& real) {
    const std::string text = valueText(real);
    double number = 0;
    std::from_chars(text.data(), text.data() + text.size(), number);
    return number;
}

Json jsonOfArray(const CMPIArray* array) {
    Json elements = Json::array();
    const CMPICount size = CMGetArrayCount(array, nullptr);
    for (CMPICount i = 0; i < size; ++i) {
        elements.push_back(jsonOf(CMGetArrayElementAt(array, i, nullptr)));
    }
    return elements;
}

Json jsonOf(const CMPIData& data) {
    if (CMIsNullValue(data)) {
        return nullptr;
    }
    if (CMIsArray(data)) {
        return jsonOfArray(data.value.array);
    }
    switch (data.type) {
    case CMPI_boolean:
        return data.value.boolean != 0;
    case CMPI_uint8:
        return data.value.uint8;
    case CMPI_char16:
    case CMPI_uint16:
        return data.value.uint16;
    case CMPI_uint32:
        return data.value.uint32;
    case CMPI_uint64:
        return data.value.uint64;
    case CMPI_sint8:
        return data.value.sint8;
    case CMPI_sint16:
        return data.value.sint16;
    case CMPI_sint32:
        return data.value.sint32;
    case CMPI_sint64:
        return data.value.sint64;
    case CMPI_real32:
        return shortest(data);
    case CMPI_real64:
        return data.value.real64;
    case CMPI_string:
        return textOf(data.value.string);
    case CMPI_chars:
        return data.value.chars;
    case CMPI_dateTime:
        return textOf(CMGetStringFormat(data.value.dateTime, nullptr));
    case CMPI_instance:
        return jsonOf(data.value.inst);
    case CMPI_ref:
        return pathText(data.value.ref);
    default:
        return valueText(data);
    }
}

Json jsonOf(const std::vector<NamedValue>& values) {
    Json object = Json::object();
    for (const NamedValue& value : values) {
        object[value.name] = jsonOf(value.data);
    }
    return object;
}

// An embedded instance has no path of its own.
Json jsonOf(const CMPIInstance* embedded) {
    return {{"class", textOf(CMGetClassName(CMGetObjectPath(embedded, nullptr), nullptr))},
            {"properties", jsonOf(propertiesOf(embedded))}};
}

Json jsonOf(const CMPIObjectPath* path, const std::vector<NamedValue>& values) {
    return {{"class", textOf(CMGetClassName(path, nullptr))},
            {"namespace", textOf(CMGetNameSpace(path, nullptr))},
            {"path", pathText(path)},
            {"properties", jsonOf(values)}};
}

// A provider's texts need not be UTF-8; what is not is replaced. The library leaves DEL and the second set of
// control characters as they are, which a terminal obeys.
void print(std::ostream& out, const Json& json) {
    out << escaped(json.dump(2, ' ', false, Json::error_handler_t::replace), 'u') << '\n';
}

// As MOF writes it, in a form that a terminal shows and does not obey.
std::string mofText(const CMPIData& data) {
    return escaped(valueText(data), 'x');
}

} // namespace

void printInstances(std::ostream& out, Format format, const std::vector<CMPIInstance*>& instances) {
    Json array = Json::array();
    for (const CMPIInstance* const instance : instances) {
        const CMPIObjectPath* const path = CMGetObjectPath(instance, nullptr);
        const std::vector<NamedValue> properties = propertiesOf(instance);
        if (format == Format::json) {
            array.push_back(jsonOf(path, properties));
            continue;
        }
        out << "instance of " << escaped(textOf(CMGetClassName(path, nullptr)), 'x') << " {\n";
        for (const NamedValue& property : properties) {
            out << "  " << escaped(property.name, 'x') << " = " << mofText(property.data) << ";\n";
        }
        out << "};\n";
    }
    if (format == Format::json) {
        print(out, array);
    }
}

void printPaths(std::ostream& out, Format format, const std::vector<CMPIObjectPath*>& paths) {
    Json array = Json::array();
    for (const CMPIObjectPath* const path : paths) {
        if (format == Format::json) {
            array.push_back(jsonOf(path, keysOf(path)));
        } else {
            out << escaped(pathText(path), 'x') << '\n';
        }
    }
    if (format == Format::json) {
        print(out, array);
    }
}

void printMethodResult(std::ostream& out, Format format, const CMPIObjectPath* path,
                       const std::string& method, const Reply& reply) {
    CMPIData returned = {CMPI_null, CMPI_nullValue, {}};
    if (!reply.data.empty()) {
        returned = reply.data.front();
    }
    const std::vector<NamedValue> arguments = argumentsOf(reply.out);
    if (format == Format::json) {
        print(out, Json::array({{{"path", pathText(path)},
                                 {"method", method},
                                 {"returnValue", jsonOf(returned)},
                                 {"parameters", jsonOf(arguments)}}}));
        return;
    }
    out << "ReturnValue = " << mofText(returned) << ";\n";
    for (const NamedValue& argument : arguments) {
        out << escaped(argument.name, 'x') << " = " << mofText(argument.data) << ";\n";
    }
}

} // namespace oxahv::runner
