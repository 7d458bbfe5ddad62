// Normal forms of conditions.

#include "query/SelectExpression.h"

#include "query/QueryLexer.h"

namespace oxahv {

namespace {

using Groups = std::vector<std::vector<std::shared_ptr<const QueryPredicate>>>;

std::size_t predicatesIn(const Groups& groups) {
    std::size_t count = 0;
    for (const auto& group : groups) {
        count += group.size();
    }
    return count;
}

// A condition of nested ANDs and ORs can grow by the power of its size: it is measured before it is made.
void requireSize(std::size_t predicates) {
    if (predicates > Query::mostPredicates) {
        failWith(queryFeatureNotSupported, "this form of the query has more than " +
                                               std::to_string(Query::mostPredicates) + " comparisons");
    }
}

// Each group of one with each of the other.
Groups product(const Groups& one, const Groups& other) {
    requireSize(other.size() * predicatesIn(one) + one.size() * predicatesIn(other));
    Groups groups;
    for (const auto& left : one) {
        for (const auto& right : other) {
            groups.push_back(left);
            groups.back().insert(groups.back().end(), right.begin(), right.end());
        }
    }
    return groups;
}

// Groups of the kind `inner`, which the other kind joins.
Groups groupsOf(const QueryCondition& condition, QueryCondition::Kind inner) {
    if (condition.kind == QueryCondition::Kind::predicate) {
        return {{condition.predicate}};
    }
    if (condition.kind == inner) {
        Groups groups = {{}};
        for (const QueryCondition& part : condition.parts) {
            groups = product(groups, groupsOf(part, inner));
        }
        return groups;
    }
    Groups groups;
    for (const QueryCondition& part : condition.parts) {
        Groups others = groupsOf(part, inner);
        groups.insert(groups.end(), others.begin(), others.end());
        requireSize(predicatesIn(groups));
    }
    return groups;
}

} // namespace

NormalForm::NormalForm(std::shared_ptr<const Query> itsQuery, CMPISelectCondType itsType)
    : query(std::move(itsQuery)), type(itsType),
      groups(groupsOf(query->condition(), itsType == CMPI_COND_DOC ? QueryCondition::Kind::conjunction
                                                                   : QueryCondition::Kind::disjunction)) {}

} // namespace oxahv
