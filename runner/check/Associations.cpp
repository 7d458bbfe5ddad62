#include "check/Associations.h"

#include "check/Results.h"
#include "show/Text.h"

#include <algorithm>
#include <set>

namespace oxahv::runner {

namespace {

bool isNone(const AssociationFilter& filter) {
    return filter.associationClass.empty() && filter.resultClass.empty() && filter.role.empty() &&
           filter.resultRole.empty();
}

bool isOfReferences(const Query& query) {
    return query.operation->takes == Takes::referenceFilter;
}

} // namespace

void Associations::run(bool isThorough) {
    const Replies references = askBoth("ri", "rn", {});
    if (references.objects && references.objects->ok()) {
        knowsWays_ = references.areSame;
        readWays(*references.objects);
    }
    const Replies associated = askBoth("ai", "an", {});
    knowsWays_ = knowsWays_ && associated.areSame;
    knowsWays_ = compareWithWays("an", associated.names, {}); // else a filter's results say nothing
    if (client_.broker().isAssociation(client_.task().className)) {
        checkOwnEnds();
    }
    if (isThorough) {
        checkOtherEnds();
        runFilters();
    }
}

void Associations::readWays(const Answer& references) {
    const std::string request = textOf(query("ri", {}));
    for (const Result& association : references.results) {
        Way way;
        way.associationClass = association.className;
        way.associationPath = association.path;
        way.associationIdentity = association.identity;
        bool isHere = false;
        for (const auto& [role, end] : association.properties) {
            if (end.type != CMPI_ref || end.identity != identity_) {
                continue;
            }
            isHere = true;
            way.role = role;
            const std::size_t before = ways_.size();
            for (const auto& [otherRole, other] : association.properties) {
                if (other.type == CMPI_ref && !other.isNull && otherRole != role) {
                    way.resultRole = otherRole;
                    way.otherClass = other.referredClass;
                    way.otherIdentity = other.identity;
                    way.otherPath = other.referredPath;
                    ways_.push_back(way);
                }
            }
            if (ways_.size() == before) { // it leads nowhere, and yet refers to the instance
                ways_.push_back(way);
            }
        }
        if (!isHere) {
            knowsWays_ = false;
            client_.find(CheckKind::associationEnd, request, association.path);
        }
    }
}

// An association's instance has to be seen from each instance that it refers to.
void Associations::checkOwnEnds() {
    const std::optional<Answer> whole = client_.askPlainly(queryOf("gi", path_));
    if (!whole || whole->results.size() != 1) {
        return;
    }
    for (const auto& [role, end] : whole->results.front().properties) {
        if (end.type != CMPI_ref || end.isNull) {
            continue;
        }
        const std::optional<Answer> seen = client_.askPlainly(queryOf("rn", end.referredPath));
        const bool isSeen = !seen || seen->code == CMPI_RC_ERR_NOT_SUPPORTED ||
                            std::any_of(seen->results.begin(), seen->results.end(),
                                        [&](const Result& result) { return result.identity == identity_; });
        if (!isSeen) {
            client_.find(CheckKind::oneSided, textOf(queryOf("rn", end.referredPath)),
                         "from " + role + ", the association is not to be seen");
        }
    }
}

// From what is associated with the instance, the way leads back.
void Associations::checkOtherEnds() {
    constexpr std::size_t most = 20;
    std::set<std::string> asked;
    for (const Way& way : ways_) {
        if (way.otherIdentity.empty() || asked.size() == most || !asked.insert(way.otherIdentity).second) {
            continue;
        }
        const Query back = queryOf("an", way.otherPath);
        const std::optional<Answer> answer = client_.askPlainly(back);
        const bool isBack = !answer || isRefusal(answer->code) ||
                            std::any_of(answer->results.begin(), answer->results.end(),
                                        [&](const Result& result) { return result.identity == identity_; });
        if (!isBack) {
            client_.find(CheckKind::oneSided, textOf(back),
                         "no way by " + way.associationClass + " from " + way.resultRole + " back to " +
                             way.role);
        }
    }
}

// With each filter alone, once so that it selects and once so that it does not, and with all of them.
std::vector<AssociationFilter> Associations::filters() const {
    std::vector<AssociationFilter> all;
    std::set<std::string> kinds;
    for (const Way& way : ways_) {
        const std::string kind =
            way.associationClass + ' ' + way.role + ' ' + way.resultRole + ' ' + way.otherClass;
        if (!kinds.insert(foldedName(kind)).second) {
            continue;
        }
        for (const std::string& name :
             {way.associationClass, superclass(way.associationClass), unrelatedClass(way.associationClass)}) {
            all.push_back({name, "", "", ""});
        }
        for (const std::string& name :
             {way.otherClass, superclass(way.otherClass), unrelatedClass(way.otherClass)}) {
            all.push_back({"", name, "", ""});
        }
        for (const std::string& name : {way.role, way.resultRole, std::string("NoSuchRole")}) {
            all.push_back({"", "", name, ""});
            all.push_back({"", "", "", name});
        }
        all.push_back({way.associationClass, way.otherClass, way.role, way.resultRole});
    }
    all.erase(std::remove_if(all.begin(), all.end(), isNone), all.end());
    return all;
}

void Associations::runFilters() {
    for (const AssociationFilter& filter : filters()) {
        for (const char* const verb : {"an", "ai"}) {
            compareWithWays(verb, ask(verb, filter), filter);
        }
        // Of references, the result class is the association's.
        if (filter.resultClass.empty() && filter.resultRole.empty()) {
            const AssociationFilter own = {"", filter.associationClass, filter.role, ""};
            for (const char* const verb : {"rn", "ri"}) {
                compareWithWays(verb, ask(verb, own), own);
            }
        }
    }
}

// A declared class from which the class derives; empty if none.
std::string Associations::superclass(const std::string& className) const {
    for (const std::string& other : client_.broker().declaredClasses()) {
        if (!sameName(other, className) && client_.broker().isA(className, other)) {
            return other;
        }
    }
    return "";
}

// A declared class that is neither above nor below the wanted one; empty if none.
std::string Associations::unrelatedClass(const std::string& wanted) const {
    for (const std::string& declared : client_.broker().declaredClasses()) {
        if (!passesClass(declared, wanted) && !passesClass(wanted, declared)) {
            return declared;
        }
    }
    return "";
}

bool Associations::passesClass(const std::string& className, const std::string& filter) const {
    return filter.empty() || client_.broker().isA(className, filter);
}

bool Associations::passes(const Way& way, const AssociationFilter& filter) const {
    const auto isRole = [](const std::string& wanted, const std::string& role) {
        return wanted.empty() || sameName(wanted, role);
    };
    return passesClass(way.associationClass, filter.associationClass) &&
           passesClass(way.otherClass, filter.resultClass) && isRole(filter.role, way.role) &&
           isRole(filter.resultRole, way.resultRole);
}

Query Associations::query(const char* verb, const AssociationFilter& filter) const {
    Operands operands;
    operands.target = path_;
    operands.filter = filter;
    return queryOf(verb, std::move(operands));
}

// None for what the provider does not do, or not for such an instance.
std::optional<Answer> Associations::ask(const char* verb, const AssociationFilter& filter) {
    const Query asked = query(verb, filter);
    const std::string request = textOf(asked);
    std::optional<Answer> answer = client_.ask(asked);
    if (!answer || isRefusal(answer->code)) {
        return std::nullopt;
    }
    if (!answer->ok()) {
        client_.fail(request, verb, *answer);
        return std::nullopt;
    }
    for (const Result& result : answer->results) {
        checkResult(client_, request, result, "");
    }
    checkDuplicates(client_, request, answer->results);
    return answer;
}

Associations::Replies Associations::askBoth(const char* objects, const char* names,
                                            const AssociationFilter& filter) {
    Replies replies = {ask(objects, filter), ask(names, filter)};
    if (replies.objects && replies.names) {
        const std::string difference =
            differenceOf(replies.objects->results, objects, replies.names->results, names);
        replies.areSame = difference.empty();
        if (!replies.areSame) {
            client_.find(CheckKind::associationsDiffer, textOf(query(objects, filter)), difference);
        }
    }
    return replies;
}

// What the ways say that the filter lets through. Without filter, a difference is no filter's.
bool Associations::compareWithWays(const char* verb, const std::optional<Answer>& answer,
                                   const AssociationFilter& filter) {
    if (!knowsWays_ || !answer) {
        return knowsWays_;
    }
    const Query asked = query(verb, filter);
    AssociationFilter wanted = filter;
    if (isOfReferences(asked)) {
        std::swap(wanted.associationClass, wanted.resultClass);
    }
    std::vector<Result> expected;
    for (const Way& way : ways_) {
        const bool isResult = isOfReferences(asked) || !way.otherIdentity.empty();
        if (isResult && passes(way, wanted)) {
            Result result;
            result.path = isOfReferences(asked) ? way.associationPath : way.otherPath;
            result.identity = isOfReferences(asked) ? way.associationIdentity : way.otherIdentity;
            expected.push_back(std::move(result));
        }
    }
    const std::string difference =
        differenceOf(answer->results, std::string("the results of ") + verb, expected,
                     isNone(filter) ? "what ri leads to" : "what the filter selects");
    if (!difference.empty()) {
        client_.find(isNone(filter) ? CheckKind::associationsDiffer : CheckKind::filter, textOf(asked),
                     difference);
    }
    return difference.empty();
}

} // namespace oxahv::runner
