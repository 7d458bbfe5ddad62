// The function tables of select expressions, conditions and predicates.

#include "tables/Slots.h"

namespace oxahv {

namespace {

// Asks a provider's function for the values.
class AccessorSource : public QuerySource {
public:
    AccessorSource(CMPIAccessor* accessor, void* parameter) : accessor_(accessor), parameter_(parameter) {
        if (accessor == nullptr) {
            throw Failure{CMPI_RC_ERR_INVALID_PARAMETER};
        }
    }
    CMPIData valueOf(const QueryProperty& property) const override {
        return accessor_(property.text.c_str(), parameter_);
    }

private:
    CMPIAccessor* accessor_;
    void* parameter_;
};

// Select expressions

CMPIBoolean evaluate(const SelectExpression& expression, const CMPIInstance* handle) {
    const Instance* const instance = Instance::of(handle);
    if (instance == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    return expression.query->accepts(*instance) ? 1 : 0;
}

CMPIBoolean evaluateUsingAccessor(const SelectExpression& expression, CMPIAccessor* accessor,
                                  void* parameter) {
    const AccessorSource source(accessor, parameter);
    return fulfils(expression.core().classes, expression.query->condition(), source) ? 1 : 0;
}

CMPIString* getString(const SelectExpression& expression) {
    return newText(expression.core(), expression.query->text());
}

template <CMPISelectCondType type>
CMPISelectCond* getCondition(const SelectExpression& expression) {
    return handOut(std::make_unique<SelectCondition>(
        expression.core(), std::make_shared<const NormalForm>(expression.query, type)));
}

// Conditions

CMPICount getCountAndType(const SelectCondition& condition, int* type) {
    if (type != nullptr) {
        *type = condition.form->type;
    }
    return static_cast<CMPICount>(condition.form->groups.size());
}

CMPISubCond* getSubCondAt(const SelectCondition& condition, CMPICount index) {
    if (index >= condition.form->groups.size()) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return handOut(std::make_unique<SubCondition>(condition.core(), condition.form, index));
}

CMPICount getCount(const SubCondition& condition) {
    return static_cast<CMPICount>(condition.predicates().size());
}

CMPIPredicate* newPredicate(const SubCondition& condition,
                            const std::shared_ptr<const QueryPredicate>& which) {
    return handOut(std::make_unique<Predicate>(condition.core(), condition.form->query, which));
}

CMPIPredicate* getPredicateAt(const SubCondition& condition, CMPICount index) {
    if (index >= condition.predicates().size()) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return newPredicate(condition, condition.predicates()[index]);
}

// The first whose property has the name.
CMPIPredicate* getPredicate(const SubCondition& condition, const char* name) {
    required(name);
    for (const auto& predicate : condition.predicates()) {
        if (sameName(predicate->left.text, name)) {
            return newPredicate(condition, predicate);
        }
    }
    throw Failure{CMPI_RC_ERR_NOT_FOUND};
}

// Predicates

// The type of the property, where it is declared; else that of what it is compared with.
CMPIType typeOf(const Predicate& predicate) {
    const QueryPredicate& which = *predicate.predicate;
    const auto declared = predicate.core().classes.find(predicate.query->className());
    const PropertyDeclaration* const property = declared != nullptr && which.left.steps.size() == 1
                                                    ? declared->find(which.left.steps.front().name)
                                                    : nullptr;
    const auto* const literal = std::get_if<QueryLiteral>(&which.right);
    return property != nullptr  ? valueType(property->type, property->qualifiers)
           : literal != nullptr ? typeOf(*literal)
                                : static_cast<CMPIType>(CMPI_null);
}

void getData(const Predicate& predicate, CMPIType* type, CMPIPredOp* operation, CMPIString** left,
             CMPIString** right) {
    const QueryPredicate& which = *predicate.predicate;
    if (type != nullptr) {
        *type = typeOf(predicate);
    }
    if (operation != nullptr) {
        *operation = which.operation;
    }
    if (left != nullptr) {
        *left = newText(predicate.core(), which.left.text);
    }
    if (right != nullptr) {
        const auto* const property = std::get_if<QueryProperty>(&which.right);
        *right = newText(predicate.core(),
                         property != nullptr ? property->text : textOf(std::get<QueryLiteral>(which.right)));
    }
}

CMPIBoolean evaluatePredicate(const Predicate& predicate, CMPIAccessor* accessor, void* parameter) {
    const AccessorSource source(accessor, parameter);
    return fulfils(predicate.core().classes, *predicate.predicate, source) ? 1 : 0;
}

} // namespace

const CMPISelectExpFT SelectExpression::table = {
    CMPICurrentVersion,
    SLOT(CMPISelectExpFT, release, releaseObject<SelectExpression>),
    SLOT(CMPISelectExpFT, clone, cloneObject<SelectExpression>),
    SLOT(CMPISelectExpFT, evaluate, evaluate),
    SLOT(CMPISelectExpFT, getString, getString),
    SLOT(CMPISelectExpFT, getDOC, getCondition<CMPI_COND_DOC>),
    SLOT(CMPISelectExpFT, getCOD, getCondition<CMPI_COND_COD>),
    SLOT(CMPISelectExpFT, evaluateUsingAccessor, evaluateUsingAccessor),
};

const CMPISelectCondFT SelectCondition::table = {
    CMPICurrentVersion,
    SLOT(CMPISelectCondFT, release, releaseObject<SelectCondition>),
    SLOT(CMPISelectCondFT, clone, cloneObject<SelectCondition>),
    SLOT(CMPISelectCondFT, getCountAndType, getCountAndType),
    SLOT(CMPISelectCondFT, getSubCondAt, getSubCondAt),
};

const CMPISubCondFT SubCondition::table = {
    CMPICurrentVersion,
    SLOT(CMPISubCondFT, release, releaseObject<SubCondition>),
    SLOT(CMPISubCondFT, clone, cloneObject<SubCondition>),
    SLOT(CMPISubCondFT, getCount, getCount),
    SLOT(CMPISubCondFT, getPredicateAt, getPredicateAt),
    SLOT(CMPISubCondFT, getPredicate, getPredicate),
};

const CMPIPredicateFT Predicate::table = {
    CMPICurrentVersion,
    SLOT(CMPIPredicateFT, release, releaseObject<Predicate>),
    SLOT(CMPIPredicateFT, clone, cloneObject<Predicate>),
    SLOT(CMPIPredicateFT, getData, getData),
    SLOT(CMPIPredicateFT, evaluateUsingAccessor, evaluatePredicate),
};

} // namespace oxahv
