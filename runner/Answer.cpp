#include "Answer.h"

#include <algorithm>
#include <strings.h>

namespace {

std::string textOf(const CMPIString* string) {
    const char* const chars = string != nullptr ? CMGetCharsPtr(string, nullptr) : nullptr;
    return chars != nullptr ? chars : "";
}

PlainData plainOf(const CMPIData& data, const std::string& nameSpace);

// The values of an instance, an object path or arguments: `count` and `at` are the slots that tell them.
template <class Object, class Count, class At>
NamedData valuesOf(const Object* object, Count count, At at, const std::string& nameSpace) {
    NamedData values;
    const CMPICount size = object != nullptr ? count(object, nullptr) : 0;
    for (CMPICount i = 0; i < size; ++i) {
        CMPIString* name = nullptr;
        const CMPIData data = at(object, i, &name, nullptr);
        values[textOf(name)] = plainOf(data, nameSpace);
    }
    return values;
}

Result resultOf(const CMPIObjectPath* path, const std::string& nameSpace) {
    Result result;
    result.className = textOf(CMGetClassName(path, nullptr));
    result.path = oxahv::pathText(path);
    result.keys = valuesOf(path, CMGetKeyCount, CMGetKeyAt, nameSpace);
    const std::string own = lowerCase(textOf(CMGetNameSpace(path, nullptr)));
    result.identity = (own != lowerCase(nameSpace) ? own : "") + ':' + lowerCase(result.className);
    for (const auto& [name, key] : result.keys) {
        result.identity += ',' + lowerCase(name) + '=' + key.identity;
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
    return !isText(data) ||
           isUtf8(data.type == CMPI_chars ? std::string(data.value.chars) : textOf(data.value.string));
}

PlainData plainOf(const CMPIData& data, const std::string& nameSpace) {
    PlainData plain;
    plain.type = data.type;
    plain.isNull = CMIsNullValue(data);
    plain.isUtf8 = hasUtf8(data);
    plain.text = oxahv::valueText(data);
    plain.identity = plain.text;
    if (!plain.isNull && data.type == CMPI_ref) {
        const Result referred = resultOf(data.value.ref, nameSpace);
        plain.identity = referred.identity;
        plain.referredClass = referred.className;
        plain.referredPath = referred.path;
    }
    return plain;
}

} // namespace

bool NameLess::operator()(const std::string& a, const std::string& b) const {
    return ::strcasecmp(a.c_str(), b.c_str()) < 0;
}

bool hasValue(const NamedData& values, const std::string& name) {
    const auto found = values.find(name);
    return found != values.end() && !found->second.isNull;
}

bool operator==(const PlainData& a, const PlainData& b) {
    return a.type == b.type && a.isNull == b.isNull && a.identity == b.identity;
}

Answer answerOf(const oxahv::Reply& reply, const std::string& nameSpace) {
    Answer answer;
    answer.code = reply.code;
    answer.message = reply.message;
    answer.isDone = reply.done;
    for (const CMPIInstance* const instance : reply.instances) {
        answer.results.push_back(resultOf(CMGetObjectPath(instance, nullptr), nameSpace));
        answer.results.back().properties = valuesOf(instance, CMGetPropertyCount, CMGetPropertyAt, nameSpace);
    }
    for (const CMPIObjectPath* const path : reply.objectPaths) {
        answer.results.push_back(resultOf(path, nameSpace));
    }
    for (const CMPIData& data : reply.data) {
        answer.data.push_back(plainOf(data, nameSpace));
    }
    answer.out = valuesOf(reply.out, CMGetArgCount, CMGetArgAt, nameSpace);
    return answer;
}

std::string lowerCase(std::string text) {
    std::transform(text.begin(), text.end(), text.begin(),
                   [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; });
    return text;
}

std::string typeText(CMPIType type) {
    return oxahv::typeName(type) + ((type & CMPI_ARRAY) != 0 ? "[]" : "");
}

std::string wordsOf(const Answer& answer) {
    return oxahv::codeName(answer.code) + (answer.message.empty() ? "" : ": " + answer.message);
}

bool isUtf8(const std::string& text) {
    struct Form {
        unsigned char first; // the range of the first byte
        unsigned char last;
        unsigned char secondFirst; // the range of the second
        unsigned char secondLast;
        unsigned int length;
    };
    constexpr Form forms[] = {
        {0x00, 0x7f, 0x80, 0xbf, 1}, {0xc2, 0xdf, 0x80, 0xbf, 2}, {0xe0, 0xe0, 0xa0, 0xbf, 3},
        {0xe1, 0xec, 0x80, 0xbf, 3}, {0xed, 0xed, 0x80, 0x9f, 3}, {0xee, 0xef, 0x80, 0xbf, 3},
        {0xf0, 0xf0, 0x90, 0xbf, 4}, {0xf1, 0xf3, 0x80, 0xbf, 4}, {0xf4, 0xf4, 0x80, 0x8f, 4}};
    const auto byteAt = [&](std::size_t i) { return static_cast<unsigned char>(text[i]); };
    for (std::size_t i = 0; i < text.size();) {
        const Form* const form = std::find_if(std::begin(forms), std::end(forms), [&](const Form& f) {
            return byteAt(i) >= f.first && byteAt(i) <= f.last;
        });
        if (form == std::end(forms) || text.size() - i < form->length) {
            return false;
        }
        for (std::size_t k = 1; k < form->length; ++k) {
            const unsigned char low = k == 1 ? form->secondFirst : 0x80;
            const unsigned char high = k == 1 ? form->secondLast : 0xbf;
            if (byteAt(i + k) < low || byteAt(i + k) > high) {
                return false;
            }
        }
        i += form->length;
    }
    return true;
}
