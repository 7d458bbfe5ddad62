#include "show/Output.h"

#include "show/Text.h"
#include "show/Values.h"

#include <algorithm>
#include <cmath>
#include <nlohmann/json.hpp>
#include <string_view>

namespace oxahv::runner {

namespace {

using Json = nlohmann::json;

// Writes JSON as it comes; a tree of a result would cost several times the request.
class JsonWriter {
public:
    JsonWriter(std::string& out, std::size_t depth) : out_(out), depth_(depth) {}

    void add(const CMPIData& data);
    // What the library leaves of control characters, a terminal obeys. What is no UTF-8 is replaced.
    void addText(std::string_view text) {
        const bool isPlain = std::all_of(
            text.begin(), text.end(), [](char c) { return c >= ' ' && c < '\x7F' && c != '"' && c != '\\'; });
        out_ += isPlain ? '"' + std::string(text) + '"'
                        : escaped(Json(text).dump(-1, ' ', false, Json::error_handler_t::replace), 'u');
    }
    void addMember(std::string_view name) {
        nextElement();
        addText(name);
        out_ += ": ";
    }
    void open(char bracket) {
        out_ += bracket;
        isFirst_ = true;
        ++depth_;
    }
    void close(char bracket) {
        --depth_;
        if (!isFirst_) {
            addLine();
        }
        out_ += bracket;
        isFirst_ = false;
    }
    void nextElement() {
        out_ += isFirst_ ? "" : ",";
        addLine();
        isFirst_ = false;
    }
    void addMembers(const std::vector<NamedValue>& values) {
        open('{');
        for (const NamedValue& value : values) {
            addMember(value.name);
            add(value.data);
        }
        close('}');
    }
    void addObject(const CMPIObjectPath* path, const std::vector<NamedValue>& values) {
        open('{');
        addMember("class");
        addText(textOf(CMGetClassName(path, nullptr)));
        addMember("namespace");
        addText(textOf(CMGetNameSpace(path, nullptr)));
        addMember("path");
        addText(pathText(path));
        addMember("properties");
        addMembers(values);
        close('}');
    }

private:
    void addLine() { out_.append(1, '\n').append(2 * depth_, ' '); }

    void addArray(const CMPIArray* array) {
        open('[');
        const CMPICount size = CMGetArrayCount(array, nullptr);
        for (CMPICount i = 0; i < size; ++i) {
            nextElement();
            add(CMGetArrayElementAt(array, i, nullptr));
        }
        close(']');
    }

    // JSON knows no infinity.
    void addReal(const CMPIData& data, double number) {
        out_ += std::isfinite(number) ? valueText(data) : "null";
    }

    std::string& out_;
    std::size_t depth_;
    bool isFirst_ = true;
};

void JsonWriter::add(const CMPIData& data) {
    if (CMIsNullValue(data)) {
        out_ += "null";
        return;
    }
    if (CMIsArray(data)) {
        addArray(data.value.array);
        return;
    }
    switch (data.type) {
    case CMPI_boolean:
        out_ += data.value.boolean != 0 ? "true" : "false";
        break;
    case CMPI_real32:
        addReal(data, static_cast<double>(data.value.real32));
        break;
    case CMPI_real64:
        addReal(data, data.value.real64);
        break;
    case CMPI_string:
        addText(textOf(data.value.string));
        break;
    case CMPI_chars:
        addText(data.value.chars);
        break;
    case CMPI_dateTime:
        addText(textOf(CMGetStringFormat(data.value.dateTime, nullptr)));
        break;
    case CMPI_ref:
        addText(pathText(data.value.ref));
        break;
    case CMPI_instance: // it has no path of its own
        open('{');
        addMember("class");
        addText(textOf(CMGetClassName(CMGetObjectPath(data.value.inst, nullptr), nullptr)));
        addMember("properties");
        addMembers(propertiesOf(data.value.inst));
        close('}');
        break;
    default: {
        const std::string text = valueText(data); // numbers, and what has no form of its own
        const bool isNumber = data.type == CMPI_char16 || (data.type & CMPI_INTEGER) != 0;
        isNumber ? void(out_ += text) : addText(text);
    }
    }
}

// As MOF writes it, in a form that a terminal shows and does not obey.
std::string mofText(const CMPIData& data) {
    return escaped(valueText(data), 'x');
}

} // namespace

std::string& ResultPrinter::begin() {
    text_.clear();
    if (format_ == Format::json) {
        text_ = count_ == 0 ? "[\n  " : ",\n  ";
    }
    ++count_;
    return text_;
}

void ResultPrinter::write() {
    out_.write(text_.data(), static_cast<std::streamsize>(text_.size()));
}

void ResultPrinter::print(const CMPIInstance* instance) {
    std::string& text = begin();
    const CMPIObjectPath* const path = CMGetObjectPath(instance, nullptr);
    const std::vector<NamedValue> properties = propertiesOf(instance);
    if (format_ == Format::json) {
        JsonWriter(text, 1).addObject(path, properties);
    } else {
        text += "instance of " + escaped(textOf(CMGetClassName(path, nullptr)), 'x') + " {\n";
        for (const NamedValue& property : properties) {
            text += "  " + escaped(property.name, 'x') + " = " + mofText(property.data) + ";\n";
        }
        text += "};\n";
    }
    write();
}

void ResultPrinter::print(const CMPIObjectPath* path) {
    std::string& text = begin();
    if (format_ == Format::json) {
        JsonWriter(text, 1).addObject(path, keysOf(path));
    } else {
        text += escaped(pathText(path), 'x') + '\n';
    }
    write();
}

void ResultPrinter::end() {
    if (format_ == Format::json) {
        out_ << (isEmpty() ? "[]\n" : "\n]\n");
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
        std::string text;
        JsonWriter writer(text, 0);
        writer.open('[');
        writer.nextElement();
        writer.open('{');
        writer.addMember("path");
        writer.addText(pathText(path));
        writer.addMember("method");
        writer.addText(method);
        writer.addMember("returnValue");
        writer.add(returned);
        writer.addMember("parameters");
        writer.addMembers(arguments);
        writer.close('}');
        writer.close(']');
        out << text << '\n';
        return;
    }
    out << "ReturnValue = " << mofText(returned) << ";\n";
    for (const NamedValue& argument : arguments) {
        out << escaped(argument.name, 'x') << " = " << mofText(argument.data) << ";\n";
    }
}

} // namespace oxahv::runner
