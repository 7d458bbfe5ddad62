#include "check/MethodArguments.h"

#include "check/Ranges.h"
#include "show/Text.h"
#include "show/Values.h"

#include <algorithm>

namespace oxahv::runner {

namespace {

using Values = std::vector<std::string>;

bool isOf(const std::string& value, const std::string& parameter) {
    return sameName(value.substr(0, value.find('=')), parameter);
}

// The values without those of a parameter.
Values without(const Values& values, const std::string& parameter) {
    Values rest;
    std::copy_if(values.begin(), values.end(), std::back_inserter(rest),
                 [&](const std::string& value) { return !isOf(value, parameter); });
    return rest;
}

Values with(const Values& values, const std::string& parameter, const std::string& value) {
    Values all = without(values, parameter);
    all.push_back(parameter + '=' + value);
    return all;
}

// A method whose return value is a number answers 0 for a success.
bool isSuccess(const Answer& answer) {
    return answer.ok() && (answer.data.size() != 1 || answer.data.front().type == CMPI_boolean ||
                           answer.data.front().text == "0");
}

// Sends the call and reports a success; an empty `accepted` says that it may be one.
void callWith(Client& client, const std::string& target, const MethodCall& call, const Values& values,
              const std::string& accepted) {
    Operands operands;
    operands.target = target;
    operands.method = call.method;
    operands.values = values;
    const Query query = queryOf("cm", std::move(operands));
    const std::optional<Answer> answer = client.askPlainly(query);
    if (answer && isSuccess(*answer) && !accepted.empty()) {
        client.find(CheckKind::argumentAccepted, textOf(query), "method " + call.method + ": " + accepted);
    }
}

// A text where a number, boolean or reference is declared, and a number for all others.
std::string wrongValue(CMPIType type) {
    const bool isText = type == CMPI_string || type == CMPI_dateTime;
    return isText ? "5" : "\"no such value\"";
}

} // namespace

void callWithWrongArguments(Client& client, const std::string& target, const MethodCall& call) {
    const auto method = findMethod(client.broker(), call.className, call.method);
    for (const ParameterDeclaration& parameter : method->parameters) {
        if (!parameter.isIn) {
            continue;
        }
        const std::string required =
            parameter.qualifiers.isTrue("Required") ? parameter.name + ", which is Required" : "";
        callWith(client, target, call, without(call.arguments, parameter.name),
                 required.empty() ? "" : "succeeds without " + required);
        callWith(client, target, call, with(call.arguments, parameter.name, "NULL"),
                 required.empty() ? "" : "succeeds with NULL for " + required);
        for (const OutsideValue& value : valuesOutside(parameter.type, parameter.qualifiers)) {
            callWith(client, target, call, with(call.arguments, parameter.name, value.text),
                     "succeeds although " + parameter.name + ' ' + value.complaint);
        }
    }
}

void callWithWrongTypes(Client& client, const EmbeddedBroker& declared, const std::string& target,
                        const MethodCall& call) {
    const auto method = findMethod(declared, call.className, call.method);
    for (const ParameterDeclaration& parameter : method->parameters) {
        if (parameter.isIn) {
            callWith(client, target, call, with(call.arguments, parameter.name, wrongValue(parameter.type)),
                     "succeeds with a value of another type for " + parameter.name);
        }
    }
}

} // namespace oxahv::runner
