#include "check/Results.h"

#include "check/Ranges.h"
#include "show/Text.h"
#include "show/Values.h"

#include <algorithm>
#include <set>

namespace oxahv::runner {

namespace {

// The path of a result that the others lack; empty if there is none.
std::string onlyAmong(const std::vector<Result>& results, const std::vector<Result>& others) {
    std::set<std::string> identities;
    for (const Result& other : others) {
        identities.insert(other.identity);
    }
    const auto found = std::find_if(results.begin(), results.end(), [&](const Result& result) {
        return identities.count(result.identity) == 0;
    });
    return found != results.end() ? found->path : "";
}

void checkTexts(Client& client, const std::string& request, const char* what, const NamedData& values) {
    for (const auto& [name, value] : values) {
        if (!value.isUtf8) {
            client.find(CheckKind::encoding, request, what + (' ' + name));
        }
    }
}

void checkKeys(Client& client, const std::string& request, const Result& result) {
    for (const PropertyDeclaration& property : client.broker().propertiesOf(result.className)) {
        if (!property.isKey) {
            continue;
        }
        const auto key = result.keys.find(property.name);
        const auto value = result.properties.find(property.name);
        if (key == result.keys.end()) {
            client.find(CheckKind::keyMissing, request, "key " + property.name);
        } else if (key->second.isNull) {
            client.find(CheckKind::nullKey, request, "key " + property.name);
        } else if (result.isInstance && (value == result.properties.end() || value->second.isNull)) {
            client.find(CheckKind::nullKey, request,
                        "property " + property.name + " is a key and has no value in the instance");
        }
    }
}

// What an instance is associated with may be in another namespace.
void checkNameSpace(Client& client, const std::string& request, const Result& result,
                    const std::string& className) {
    const std::string& nameSpace = client.options().nameSpace;
    if (!className.empty() && !result.nameSpace.empty() && !sameName(result.nameSpace, nameSpace)) {
        client.find(CheckKind::otherNameSpace, request, "the path's namespace is " + result.nameSpace);
    }
}

void checkRanges(Client& client, const std::string& request, const Result& result) {
    if (result.properties.empty()) {
        return;
    }
    for (const PropertyDeclaration& property : client.broker().propertiesOf(result.className)) {
        const auto found = result.properties.find(property.name);
        const std::string complaint =
            found != result.properties.end() ? rangeComplaint(property.qualifiers, found->second) : "";
        if (!complaint.empty()) {
            client.find(CheckKind::range, request, "property " + property.name + ": " + complaint);
        }
    }
}

} // namespace

bool isRefusal(CMPIrc code) {
    return code == CMPI_RC_ERR_NOT_SUPPORTED || code == CMPI_RC_ERR_INVALID_CLASS ||
           code == CMPI_RC_ERR_INVALID_NAMESPACE;
}

void checkResult(Client& client, const std::string& request, const Result& result,
                 const std::string& className) {
    if (!className.empty() && !client.broker().isA(result.className, className)) {
        client.find(CheckKind::otherClass, request,
                    "class " + result.className + " does not derive from " + className);
    }
    checkNameSpace(client, request, result, className);
    checkKeys(client, request, result);
    checkRanges(client, request, result);
    checkTexts(client, request, "key", result.keys);
    checkTexts(client, request, "property", result.properties);
}

void checkDuplicates(Client& client, const std::string& request, const std::vector<Result>& results) {
    std::set<std::string> seen;
    for (const Result& result : results) {
        if (!seen.insert(result.identity).second) {
            client.find(CheckKind::duplicate, request, result.path);
        }
    }
}

std::string differenceOf(const std::vector<Result>& first, const std::string& firstName,
                         const std::vector<Result>& second, const std::string& secondName) {
    const std::string onlyFirst = onlyAmong(first, second);
    const std::string onlySecond = onlyAmong(second, first);
    return !onlyFirst.empty()    ? "only among " + firstName + ": " + onlyFirst
           : !onlySecond.empty() ? "only among " + secondName + ": " + onlySecond
                                 : "";
}

// Only what the broker lets through is of a declared type: it takes output arguments as they come.
void checkMethodResult(Client& client, const Query& query, const Answer& answer) {
    const std::string request = textOf(query);
    if (!answer.ok()) {
        client.fail(request, "method " + query.operands.method, answer);
        return;
    }
    const auto method = findMethod(client.broker(), client.task().className, query.operands.method);
    if (!method) {
        return;
    }
    const auto report = [&](const std::string& text) {
        client.find(CheckKind::methodResult, request, "method " + method->name + ": " + text);
    };
    if (answer.data.size() != 1) {
        report("return values: " + std::to_string(answer.data.size()));
    } else if (answer.data.front().type != method->returnType) {
        report("the return value is of type " + typeText(answer.data.front().type));
    } else if (!rangeComplaint(method->qualifiers, answer.data.front()).empty()) {
        report("return value: " + rangeComplaint(method->qualifiers, answer.data.front()));
    }
    for (const auto& [name, value] : answer.out) {
        const ParameterDeclaration* const parameter = method->find(name);
        if (parameter == nullptr || !parameter->isOut) {
            report(name + " is no output parameter");
        } else if (parameter->type != value.type) {
            report("output argument " + name + " is of type " + typeText(value.type));
        } else if (!rangeComplaint(parameter->qualifiers, value).empty()) {
            report("output argument " + name + ": " + rangeComplaint(parameter->qualifiers, value));
        }
    }
    checkTexts(client, request, "output argument", answer.out);
}

} // namespace oxahv::runner
