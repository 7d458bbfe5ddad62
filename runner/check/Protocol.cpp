#include "check/Protocol.h"

#include <nlohmann/json.hpp>

namespace oxahv::runner {

namespace {

using Json = nlohmann::json;

} // namespace

std::string lineOf(const Message& message) {
    const Finding& finding = message.finding;
    const Json json = {static_cast<int>(message.kind),
                       message.number,
                       message.text,
                       static_cast<int>(finding.kind),
                       finding.className,
                       finding.pass,
                       finding.request,
                       finding.text};
    return json.dump(-1, ' ', false, Json::error_handler_t::replace);
}

Message messageOf(const std::string& line) {
    const Json json = Json::parse(line);
    Message message;
    message.kind = static_cast<Message::Kind>(json[0].get<int>());
    message.number = json[1];
    message.text = json[2];
    message.finding = {static_cast<CheckKind>(json[3].get<int>()), json[4], json[5], json[6], json[7]};
    return message;
}

} // namespace oxahv::runner
