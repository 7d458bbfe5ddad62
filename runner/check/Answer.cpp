#include "check/Answer.h"

#include "show/Text.h"
#include "show/Values.h"

#include <Utf8.h>

namespace oxahv::runner {

namespace {

PlainData plainOf(const CMPIData& data, const std::string& nameSpace);

NamedData plainOf(const std::vector<NamedValue>& values, const std::string& nameSpace) {
    NamedData plain;
    for (const NamedValue& value : values) {
        plain[value.name] = plainOf(value.data, nameSpace);
    }
    return plain;
}

Result resultOf(const CMPIObjectPath* path, const std::string& nameSpace) {
    Result result;
    result.className = textOf(CMGetClassName(path, nullptr));
    result.path = pathText(path);
    result.keys = plainOf(keysOf(path), nameSpace);
    result.nameSpace = textOf(CMGetNameSpace(path, nullptr));
    const std::string own = foldedName(result.nameSpace);
    result.identity = (own != foldedName(nameSpace) ? own : "") + ':' + foldedName(result.className);
    for (const auto& [name, key] : result.keys) {
        result.identity += ',' + foldedName(name) + '=' + key.identity;
    }
    return result;
}

bool isText(const CMPIData& data) {
    return data.type == CMPI_string || data.type == CMPI_chars;
}

bool hasUtf8(const CMPIData& data) {
    if (CMIsNullValue(data)) {
        return true;
    }
    if (CMIsArray(data)) {
        const CMPICount size = CMGetArrayCount(data.value.array, nullptr);
        bool all = true;
        for (CMPICount i = 0; i < size; ++i) {
            all = all && hasUtf8(CMGetArrayElementAt(data.value.array, i, nullptr));
        }
        return all;
    }
    return !isText(data) || encoding::isUtf8(data.type == CMPI_chars ? std::string(data.value.chars)
                                                                     : textOf(data.value.string));
}

// What ranges are about: the numbers and texts of a value.
std::vector<std::string> elementsOf(const CMPIData& data) {
    if (CMIsNullValue(data)) {
        return {};
    }
    if (CMIsArray(data)) {
        std::vector<std::string> elements;
        const CMPICount size = CMGetArrayCount(data.value.array, nullptr);
        for (CMPICount i = 0; i < size; ++i) {
            for (std::string& element : elementsOf(CMGetArrayElementAt(data.value.array, i, nullptr))) {
                elements.push_back(std::move(element));
            }
        }
        return elements;
    }
    if (isText(data)) {
        return {data.type == CMPI_chars ? std::string(data.value.chars) : textOf(data.value.string)};
    }
    return {valueText(data)};
}

PlainData plainOf(const CMPIData& data, const std::string& nameSpace) {
    PlainData plain;
    plain.type = data.type;
    plain.isNull = CMIsNullValue(data);
    plain.isUtf8 = hasUtf8(data);
    plain.text = valueText(data);
    plain.identity = plain.text;
    plain.elements = elementsOf(data);
    if (!plain.isNull && data.type == CMPI_ref) {
        const Result referred = resultOf(data.value.ref, nameSpace);
        plain.identity = referred.identity;
        plain.referredClass = referred.className;
        plain.referredPath = referred.path;
    }
    return plain;
}

} // namespace

bool hasValue(const NamedData& values, const std::string& name) {
    const auto found = values.find(name);
    return found != values.end() && !found->second.isNull;
}

bool operator==(const PlainData& a, const PlainData& b) {
    return a.type == b.type && a.isNull == b.isNull && a.identity == b.identity;
}

Answer answerOf(const Reply& reply, const std::string& nameSpace) {
    Answer answer;
    answer.code = reply.code;
    answer.message = reply.message;
    answer.isDone = reply.done;
    for (const CMPIInstance* const instance : reply.instances) {
        answer.results.push_back(resultOf(CMGetObjectPath(instance, nullptr), nameSpace));
        answer.results.back().isInstance = true;
        answer.results.back().properties = plainOf(propertiesOf(instance), nameSpace);
    }
    for (const CMPIObjectPath* const path : reply.objectPaths) {
        answer.results.push_back(resultOf(path, nameSpace));
    }
    for (const CMPIData& data : reply.data) {
        answer.data.push_back(plainOf(data, nameSpace));
    }
    answer.out = plainOf(argumentsOf(reply.out), nameSpace);
    return answer;
}

std::string typeText(CMPIType type) {
    return typeName(type) + ((type & CMPI_ARRAY) != 0 ? "[]" : "");
}

std::string wordsOf(const Answer& answer) {
    return codeName(answer.code) + (answer.message.empty() ? "" : ": " + answer.message);
}

} // namespace oxahv::runner
