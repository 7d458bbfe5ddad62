// CMPI's records of a query: the select expression, its condition in a normal form, and the parts of that.
//
// A select expression for a provider, and the same question within the broker:
//
//     const std::shared_ptr<const Query> query = Query::parse("SELECT * FROM Demo WHERE Speed > 7", "WQL");
//     query->check(core.classes);
//     SelectExpression* const filter = handOut(std::make_unique<SelectExpression>(core, query));
//     ... filter is a CMPISelectExp ...
//     if (query->accepts(*Instance::of(indication))) { ... }
#pragma once

#include "objects/Records.h"
#include "query/Query.h"

namespace oxahv {

// A WHERE clause as a disjunction of conjunctions or a conjunction of disjunctions.
struct NormalForm {
    // Throws Failure, queryFeatureNotSupported, where it would take more than Query::mostPredicates.
    NormalForm(std::shared_ptr<const Query> query, CMPISelectCondType type);

    std::shared_ptr<const Query> query;
    CMPISelectCondType type;
    std::vector<std::vector<std::shared_ptr<const QueryPredicate>>> groups;
};

class SelectExpression : public RecordedObject<CMPISelectExp, Kind::other, SelectExpression> {
public:
    static const CMPISelectExpFT table;

    SelectExpression(Core& core, std::shared_ptr<const Query> itsQuery)
        : RecordedObject(core), query(std::move(itsQuery)) {}
    std::unique_ptr<Object> clone() const override {
        return std::make_unique<SelectExpression>(core(), query);
    }

    std::shared_ptr<const Query> query;
};

class SelectCondition : public RecordedObject<CMPISelectCond, Kind::other, SelectCondition> {
public:
    static const CMPISelectCondFT table;

    SelectCondition(Core& core, std::shared_ptr<const NormalForm> itsForm)
        : RecordedObject(core), form(std::move(itsForm)) {}
    std::unique_ptr<Object> clone() const override { return std::make_unique<SelectCondition>(core(), form); }

    std::shared_ptr<const NormalForm> form;
};

// One conjunction or disjunction of a condition.
class SubCondition : public RecordedObject<CMPISubCond, Kind::other, SubCondition> {
public:
    static const CMPISubCondFT table;

    SubCondition(Core& core, std::shared_ptr<const NormalForm> itsForm, std::size_t itsGroup)
        : RecordedObject(core), form(std::move(itsForm)), group(itsGroup) {}
    std::unique_ptr<Object> clone() const override {
        return std::make_unique<SubCondition>(core(), form, group);
    }
    const auto& predicates() const { return form->groups[group]; }

    std::shared_ptr<const NormalForm> form;
    std::size_t group;
};

class Predicate : public RecordedObject<CMPIPredicate, Kind::other, Predicate> {
public:
    static const CMPIPredicateFT table;

    Predicate(Core& core, std::shared_ptr<const Query> itsQuery, std::shared_ptr<const QueryPredicate> which)
        : RecordedObject(core), query(std::move(itsQuery)), predicate(std::move(which)) {}
    std::unique_ptr<Object> clone() const override {
        return std::make_unique<Predicate>(core(), query, predicate);
    }

    std::shared_ptr<const Query> query;
    std::shared_ptr<const QueryPredicate> predicate;
};

} // namespace oxahv
