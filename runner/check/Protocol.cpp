#include "check/Protocol.h"

#include <nlohmann/json.hpp>

namespace oxahv::runner {

namespace {

using Json = nlohmann::json;

Json jsonOf(const Finding& finding) {
    return {static_cast<int>(finding.kind), finding.className, finding.pass, finding.request, finding.text};
}

Finding findingOf(const Json& json) {
    return {static_cast<CheckKind>(json[0].get<int>()), json[1], json[2], json[3], json[4]};
}

Json jsonOf(const KnownQuery& known) {
    const Operands& operands = known.query.operands;
    const AssociationFilter& filter = operands.filter;
    Json json = {known.query.operation->name,
                 operands.target,
                 filter.associationClass,
                 filter.resultClass,
                 filter.role,
                 filter.resultRole,
                 operands.method,
                 operands.values,
                 operands.query,
                 operands.language,
                 static_cast<int>(known.code),
                 known.leavesObjects};
    if (operands.properties) {
        json.push_back(*operands.properties);
    }
    return json;
}

KnownQuery knownOf(const Json& json) {
    constexpr std::size_t fixed = 12;
    Operands operands;
    operands.target = json[1];
    operands.filter = {json[2], json[3], json[4], json[5]};
    operands.method = json[6];
    operands.values = json[7].get<std::vector<std::string>>();
    operands.query = json[8];
    operands.language = json[9];
    if (json.size() > fixed) {
        operands.properties = json[fixed].get<std::vector<std::string>>();
    }
    return {queryOf(json[0].get<std::string>(), std::move(operands)),
            static_cast<CMPIrc>(json[10].get<int>()), json[11]};
}

} // namespace

std::string lineOf(const Message& message) {
    Json json = {static_cast<int>(message.kind), message.number, message.text, message.summary,
                 message.group};
    if (message.kind == Message::Kind::finding) {
        json.push_back(jsonOf(message.finding));
    } else if (message.kind == Message::Kind::asked) {
        json.push_back(jsonOf(message.known));
    }
    return json.dump(-1, ' ', false, Json::error_handler_t::replace);
}

Message messageOf(const std::string& line) {
    const Json json = Json::parse(line);
    Message message;
    message.kind = static_cast<Message::Kind>(json[0].get<int>());
    message.number = json[1];
    message.text = json[2];
    message.summary = json[3];
    message.group = json[4];
    if (message.kind == Message::Kind::finding) {
        message.finding = findingOf(json[5]);
    } else if (message.kind == Message::Kind::asked) {
        message.known = knownOf(json[5]);
    }
    return message;
}

} // namespace oxahv::runner
