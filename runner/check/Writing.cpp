#include "check/Writing.h"

#include "check/Results.h"

#include <algorithm>

namespace oxahv::runner {

namespace {

bool isScalar(const PlainData& data) {
    return !data.isNull && (data.type & CMPI_ARRAY) == 0;
}

// Another value of the same type, as the command line takes it; empty for types of which none is made.
std::string otherValue(const PlainData& data) {
    if (data.type == CMPI_string) {
        return data.text == "\"other\"" ? "\"another\"" : "\"other\"";
    }
    if (data.type == CMPI_boolean) {
        return data.text == "TRUE" ? "FALSE" : "TRUE";
    }
    return (data.type & CMPI_UINT) == CMPI_UINT ? (data.text == "1" ? "2" : "1") : "";
}

} // namespace

void Writing::run() {
    createAndDelete();
    modify();
    sendQueries();
}

Query Writing::write(const char* verb, const std::string& path,
                     const std::vector<std::string>& values) const {
    Operands operands;
    operands.target = path;
    operands.values = values;
    return queryOf(verb, std::move(operands));
}

// What a provider refuses, for whatever reason, is not tested.
bool Writing::isDone(const Query& query, const std::optional<Answer>& answer) {
    if (answer && !answer->ok()) {
        client_.tell({Message::Kind::untested, 0,
                      client_.task().className + ": " + query.operation->name + " is answered " +
                          codeName(answer->code)});
    }
    return answer && answer->ok();
}

void Writing::require(bool isRight, const Query& query, const std::string& what) {
    if (!isRight) {
        client_.find(CheckKind::writing, textOf(query), what);
    }
}

std::optional<CMPIrc> Writing::codeOfGet(const std::string& path) {
    const std::optional<Answer> answer = client_.askPlainly(queryOf("gi", path));
    return answer ? std::optional<CMPIrc>(answer->code) : std::nullopt;
}

// The new instance is like the first one, but for its keys.
void Writing::createAndDelete() {
    if (absent_.empty()) {
        client_.tell({Message::Kind::untested, 0,
                      client_.task().className + ": ci and di, since no new path can be made"});
        return;
    }
    std::vector<std::string> values;
    if (!instances_.empty()) {
        for (const auto& [name, value] : instances_.front().properties) {
            const bool isKey = instances_.front().keys.count(name) != 0;
            if (isScalar(value) && !isKey) {
                values.push_back(name + '=' + value.text);
            }
        }
    }
    const Query absent = queryOf("di", absent_);
    const std::optional<Answer> none = client_.ask(absent);
    require(!none || !none->ok(), absent, "di of an instance that does not exist is answered OK");
    const Query creation = write("ci", absent_, values);
    const std::optional<Answer> created = client_.ask(creation);
    if (isDone(creation, created)) {
        require(created->results.size() == 1, creation,
                "ci yields " + std::to_string(created->results.size()) + " paths in place of one");
        checkNew(creation, created->results.size() == 1 ? created->results.front().path : absent_);
    }
}

void Writing::checkNew(const Query& creation, const std::string& path) {
    require(codeOfGet(path).value_or(CMPI_RC_OK) == CMPI_RC_OK, creation,
            "gi does not find what ci has created");
    const std::optional<Answer> again = client_.askPlainly(creation);
    require(!again || again->code == CMPI_RC_ERR_ALREADY_EXISTS || again->code == CMPI_RC_ERR_NOT_SUPPORTED,
            creation, "ci of an instance that exists is not answered ALREADY_EXISTS");
    deleteAgain(path);
}

void Writing::deleteAgain(const std::string& path) {
    const Query deletion = queryOf("di", path);
    if (isDone(deletion, client_.ask(deletion))) {
        require(codeOfGet(path).value_or(CMPI_RC_ERR_NOT_FOUND) == CMPI_RC_ERR_NOT_FOUND, deletion,
                "gi still finds what di has deleted");
    }
}

// A property that its declaration lets a client write comes first.
void Writing::modify() {
    const std::string& className = client_.task().className;
    std::string chosen;
    for (const PropertyDeclaration& property : client_.broker().propertiesOf(className)) {
        const bool isChangeable = !instances_.empty() && !property.isKey &&
                                  hasValue(instances_.front().properties, property.name) &&
                                  !otherValue(instances_.front().properties.at(property.name)).empty();
        if (isChangeable && (chosen.empty() || property.qualifiers.isTrue("Write"))) {
            chosen = property.name;
        }
    }
    if (chosen.empty()) {
        client_.tell(
            {Message::Kind::untested, 0, className + ": mi, since no instance has a property to change"});
        return;
    }
    const Result& example = instances_.front();
    const PlainData& before = example.properties.at(chosen);
    if (modifyTo(example.path, chosen, otherValue(before))) {
        modifyTo(example.path, chosen, before.text);
    }
}

bool Writing::modifyTo(const std::string& path, const std::string& property, const std::string& value) {
    const Query change = write("mi", path, {property + '=' + value});
    if (!isDone(change, client_.ask(change))) {
        return false;
    }
    const std::optional<Answer> answer = client_.askPlainly(queryOf("gi", path));
    const bool isChanged = !answer || (answer->ok() && answer->results.size() == 1 &&
                                       hasValue(answer->results.front().properties, property) &&
                                       answer->results.front().properties.at(property).text == value);
    require(isChanged, change, "mi is answered OK, and gi does not show the new value of " + property);
    return true;
}

void Writing::sendQueries() {
    const std::string& className = client_.task().className;
    Operands operands;
    operands.target = className;
    operands.query = "SELECT * FROM " + className;
    const Query all = queryOf("xq", operands);
    const std::optional<Answer> answer = client_.ask(all);
    if (!isDone(all, answer)) {
        return;
    }
    const std::optional<Answer> listed = client_.askPlainly(queryOf("ei", className));
    const std::string difference =
        listed && listed->ok()
            ? runner::differenceOf(answer->results, "the results of xq", listed->results, "the instances")
            : "";
    require(difference.empty(), all, "xq: " + difference);
    operands.query = "SELECT * FROM";
    const Query broken = queryOf("xq", operands);
    const std::optional<Answer> refused = client_.ask(broken);
    require(!refused || !refused->ok(), broken, "xq of a query that is not complete is answered OK");
}

} // namespace oxahv::runner
