#include "check/Examination.h"

#include "check/Associations.h"
#include "check/MethodArguments.h"
#include "check/Results.h"
#include "check/Writing.h"
#include "show/Text.h"
#include "show/Values.h"

#include <algorithm>
#include <set>

namespace oxahv::runner {

namespace {

bool isInteger(CMPIType type) {
    return (type & (CMPI_UINT | CMPI_ARRAY)) == CMPI_UINT; // signed ones have the bit too
}

// The text of a key that no instance has, made from one that an instance has; empty when there is none.
std::string absentKey(const PlainData& key, const std::vector<Result>& names, const std::string& name) {
    if (isInteger(key.type)) {
        std::set<std::string> taken;
        for (const Result& result : names) {
            const auto found = result.keys.find(name);
            taken.insert(found != result.keys.end() ? found->second.text : "");
        }
        unsigned int number = 0;
        while (taken.count(std::to_string(number)) != 0) {
            ++number;
        }
        return std::to_string(number);
    }
    const bool isQuoted = key.text.size() > 1 && key.text.back() == '"';
    if (isQuoted && key.type != CMPI_ref && key.type != CMPI_dateTime) {
        return key.text.substr(0, key.text.size() - 1) + "-absent\"";
    }
    // A reference to an instance whose last key, a text, is another. Within a text, \" stands for a quote.
    if (isQuoted && key.type == CMPI_ref && key.text.size() > 2 &&
        key.text.compare(key.text.size() - 3, 3, R"(\"")") == 0) {
        return key.text.substr(0, key.text.size() - 3) + R"(-absent\"")";
    }
    return "";
}

// The path of an instance that does not exist, by one that does; empty when none can be made.
std::string absentPath(const std::vector<Result>& names, const std::string& nameSpace) {
    const Result& example = names.front();
    std::string path = nameSpace + ':' + example.className;
    char separator = '.';
    bool isAbsent = false;
    for (const auto& [name, key] : example.keys) {
        const std::string other = isAbsent ? "" : absentKey(key, names, name);
        isAbsent = isAbsent || !other.empty();
        path += separator + name + '=' + (other.empty() ? key.text : other);
        separator = ',';
    }
    return isAbsent ? path : "";
}

// The same for a class without instances, by its declaration.
std::string absentPath(const std::vector<PropertyDeclaration>& properties, const std::string& nameSpace,
                       const std::string& className) {
    std::string path = nameSpace + ':' + className;
    char separator = '.';
    for (const PropertyDeclaration& property : properties) {
        if (property.isKey) {
            if (property.type != CMPI_string && !isInteger(property.type)) {
                return "";
            }
            path += separator + property.name + (property.type == CMPI_string ? "=\"absent\"" : "=0");
            separator = ',';
        }
    }
    return separator == ',' ? path : "";
}

// A property that only one of two instances has a value of; empty if there is none.
std::string onlyIn(const NamedData& one, const NamedData& other) {
    const auto found = std::find_if(one.begin(), one.end(), [&](const auto& property) {
        return !property.second.isNull && !hasValue(other, property.first);
    });
    return found != one.end() ? found->first : "";
}

std::string propertyDifference(const Result& got, const Result& listed) {
    const std::string one = onlyIn(got.properties, listed.properties);
    const std::string other = onlyIn(listed.properties, got.properties);
    return !one.empty()     ? "only gi has a value of " + one
           : !other.empty() ? "only ei has a value of " + other
                            : "";
}

// At most that many of the results, from the first to the last at equal distances.
std::vector<const Result*> sampleOf(const std::vector<Result>& results, std::size_t most) {
    std::vector<const Result*> sample;
    const std::size_t count = std::min(results.size(), most);
    for (std::size_t i = 0; i < count; ++i) {
        sample.push_back(&results[count > 1 ? i * (results.size() - 1) / (count - 1) : 0]);
    }
    return sample;
}

const Result* findResult(const std::vector<Result>& results, const std::string& identity) {
    const auto found = std::find_if(results.begin(), results.end(),
                                    [&](const Result& result) { return result.identity == identity; });
    return found != results.end() ? &*found : nullptr;
}

} // namespace

void Examination::run() {
    if (!enumerate()) {
        return;
    }
    compareNames();
    const std::size_t sample = client_.task().sample;
    for (const Result* const name : sampleOf(names_, sample)) {
        lookUp(*name);
    }
    lookUpAbsent();
    askForProperties();
    const bool isAll = names_.size() <= sample;
    bool isThorough = client_.task().isFirst; // filters do not depend on how keys come
    for (const Result* const name : sampleOf(names_, isAll ? sample : (sample + 9) / 10)) {
        Associations(client_, name->path, name->identity).run(isThorough);
        isThorough = false;
    }
    callMethods();
    if (client_.task().writes) {
        write();
    }
}

// The names and the instances; whether the class is served at all.
bool Examination::enumerate() {
    const std::string& className = client_.task().className;
    const std::optional<Answer> names = client_.ask(queryOf("ein", className));
    const std::optional<Answer> instances = client_.ask(queryOf("ei", className));
    const bool isRefused = names && instances && isRefusal(names->code) && isRefusal(instances->code);
    if (isRefused) {
        client_.tell({Message::Kind::classRefused, 0, wordsOf(*names)});
        if (client_.task().isNamed) {
            client_.find(CheckKind::notServed, textOf(queryOf("ein", className)), wordsOf(*names));
        }
        return false;
    }
    const auto take = [&](const char* verb, const std::optional<Answer>& answer, Results& results) {
        const std::string request = textOf(queryOf(verb, className));
        if (answer && !answer->ok() && answer->code != CMPI_RC_ERR_NOT_SUPPORTED) {
            client_.fail(request, verb, *answer);
        }
        if (!answer || !answer->ok()) {
            return false;
        }
        results = answer->results;
        for (const Result& result : results) {
            checkResult(client_, request, result, className);
        }
        checkDuplicates(client_, request, results);
        return true;
    };
    hasNames_ = take("ein", names, names_);
    hasInstances_ = take("ei", instances, instances_);
    if (!hasNames_) {
        names_ = instances_;
    }
    client_.tell({Message::Kind::classServed, std::max(names_.size(), instances_.size()), ""});
    return true;
}

std::optional<Examination::Results> Examination::list(const char* verb) {
    const std::optional<Answer> answer = client_.askPlainly(queryOf(verb, client_.task().className));
    return answer && answer->ok() ? std::optional<Results>(answer->results) : std::nullopt;
}

// Between the two requests instances may have come or gone: only what is so a second time counts.
void Examination::compareNames() {
    if (!hasNames_ || !hasInstances_) {
        return;
    }
    if (!differenceOf(names_, "the names", instances_, "the instances").empty()) {
        const std::optional<Results> names = list("ein");
        const std::optional<Results> instances = list("ei");
        const std::string difference =
            names && instances ? differenceOf(*names, "the names", *instances, "the instances") : "";
        if (!difference.empty()) {
            client_.find(CheckKind::namesDiffer, textOf(queryOf("ein", client_.task().className)),
                         difference);
        }
    }
}

void Examination::lookUp(const Result& name) {
    const Query query = queryOf("gi", name.path);
    const std::string request = textOf(query);
    const std::optional<Answer> answer = client_.ask(query);
    if (!answer || answer->code == CMPI_RC_ERR_NOT_SUPPORTED) {
        return;
    }
    if (!answer->ok()) {
        const std::optional<Results> now = list(hasNames_ ? "ein" : "ei");
        if (!now || findResult(*now, name.identity) != nullptr) { // it is still there
            client_.fail(request, "gi of a listed name", *answer);
        }
        return;
    }
    if (answer->results.size() != 1) {
        client_.find(CheckKind::notOne, request,
                     "instances returned: " + std::to_string(answer->results.size()));
        return;
    }
    const Result& got = answer->results.front();
    checkResult(client_, request, got, client_.task().className);
    if (got.identity != name.identity) {
        client_.find(CheckKind::otherPath, request, "the instance is " + got.path);
    } else {
        compareProperties(request, got);
    }
}

// A value may have come or gone meanwhile.
void Examination::compareProperties(const std::string& request, const Result& got) {
    const Result* const listed = findResult(instances_, got.identity);
    if (listed == nullptr || propertyDifference(got, *listed).empty()) {
        return;
    }
    const std::optional<Results> now = list("ei");
    const Result* const again = now ? findResult(*now, got.identity) : nullptr;
    const std::string difference = again != nullptr ? propertyDifference(got, *again) : "";
    if (!difference.empty()) {
        client_.find(CheckKind::getDiffers, request, difference);
    }
}

std::string Examination::pathOfAbsent() const {
    const std::string& nameSpace = client_.options().nameSpace;
    const std::string& className = client_.task().className;
    return names_.empty() ? absentPath(client_.broker().propertiesOf(className), nameSpace, className)
                          : absentPath(names_, nameSpace);
}

void Examination::lookUpAbsent() {
    const std::string path = pathOfAbsent();
    const std::optional<Answer> answer = path.empty() ? std::nullopt : client_.ask(queryOf("gi", path));
    const bool isRight =
        !answer || answer->code == CMPI_RC_ERR_NOT_FOUND || answer->code == CMPI_RC_ERR_NOT_SUPPORTED;
    if (!isRight) {
        client_.find(CheckKind::absent, textOf(queryOf("gi", path)), "the answer is " + wordsOf(*answer));
    }
}

// One property that is no key, one that there is not, and none.
void Examination::askForProperties() {
    if (instances_.empty()) {
        return;
    }
    std::vector<std::vector<std::string>> lists = {{"NoSuchProperty"}, {}};
    const Result& example = instances_.front();
    for (const PropertyDeclaration& property : client_.broker().propertiesOf(example.className)) {
        if (!property.isKey && hasValue(example.properties, property.name)) {
            lists.push_back({property.name});
            break;
        }
    }
    for (const std::vector<std::string>& wanted : lists) {
        for (const bool isOne : {true, false}) {
            Operands operands;
            operands.target = isOne ? example.path : client_.task().className;
            operands.properties = wanted;
            checkList(queryOf(isOne ? "gi" : "ei", std::move(operands)), wanted);
        }
    }
}

void Examination::checkList(const Query& query, const std::vector<std::string>& wanted) {
    const std::string request = textOf(query);
    const std::optional<Answer> answer = client_.ask(query);
    if (!answer || isRefusal(answer->code)) {
        return;
    }
    if (!answer->ok()) {
        client_.fail(request, query.operation->name + std::string(" with a property list"), *answer);
        return;
    }
    for (const Result& result : answer->results) {
        const Result* const whole = findResult(instances_, result.identity);
        for (const std::string& name : wanted) {
            if (whole != nullptr && hasValue(whole->properties, name) && !hasValue(result.properties, name)) {
                client_.find(CheckKind::propertyList, request, "property " + name);
            }
        }
        if (yieldsMore(result, wanted)) {
            client_.find(CheckKind::listIgnored, request,
                         query.operation->name + std::string(" yields more than the list"));
        }
    }
}

// NULLs do no harm: some brokers fill instances with them.
bool Examination::yieldsMore(const Result& result, const std::vector<std::string>& wanted) const {
    const auto properties = client_.broker().propertiesOf(result.className);
    const auto isExpected = [&](const std::string& name) {
        const auto isName = [&](const std::string& other) { return sameName(other, name); };
        return std::any_of(wanted.begin(), wanted.end(), isName) ||
               std::any_of(properties.begin(), properties.end(), [&](const PropertyDeclaration& property) {
                   return property.isKey && isName(property.name);
               });
    };
    return std::any_of(result.properties.begin(), result.properties.end(), [&](const auto& property) {
        return !property.second.isNull && !isExpected(property.first);
    });
}

void Examination::callMethods() {
    for (const MethodCall& call : client_.task().methods) {
        Operands operands;
        operands.target = methodTarget();
        operands.method = call.method;
        operands.values = call.arguments;
        const Query query = queryOf("cm", std::move(operands));
        const std::optional<Answer> answer = client_.ask(query);
        if (answer) {
            checkMethodResult(client_, query, *answer);
        }
        if (client_.task().isFirst) {
            callWithWrongArguments(client_, methodTarget(), call);
        }
    }
}

const std::string& Examination::methodTarget() const {
    return names_.empty() ? client_.task().className : names_.front().path;
}

void Examination::write() {
    Writing(client_, instances_, pathOfAbsent()).run();
}

} // namespace oxahv::runner
