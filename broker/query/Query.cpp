// Queries as a whole: which language a text is in, and what the classes say of its names.

#include "query/Query.h"

#include "objects/Records.h"
#include "query/QueryParser.h"

#include <algorithm>

namespace oxahv {

namespace {

struct Language {
    std::string_view name;
    QueryLanguage language;
};
constexpr Language languages[] = {
    {"WQL", QueryLanguage::wql},
    {"DMTF:CQL", QueryLanguage::cql},
    {"CIM:CQL", QueryLanguage::cql},
};

QueryLanguage languageOf(std::string_view name) {
    for (const Language& known : languages) {
        if (sameName(known.name, name)) {
            return known.language;
        }
    }
    failWith(CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED,
             "the query language " + std::string(name) + " is neither WQL nor DMTF:CQL");
}

[[noreturn]] void failAt(const QueryProperty& property, const std::string& message) {
    failInQuery(CMPI_RC_ERR_INVALID_QUERY, property.column, message);
}

// The declaration of a property of the statement's class itself. Of others, which embedded instances and
// subclasses have, none is known here.
const PropertyDeclaration* declarationOf(const DeclaredClass& declared, const QueryProperty& property) {
    const bool isOwn = !property.steps.empty() && property.steps.front().scope.empty();
    if (!isOwn) {
        return nullptr;
    }
    const std::string& name = property.steps.front().name;
    const PropertyDeclaration* const found = declared.find(name);
    if (found == nullptr) {
        failAt(property, "class " + declared.name + " has no property " + name);
    }
    return property.steps.size() == 1 ? found : nullptr;
}

// Whether values of a declared type can be compared with a literal.
bool areComparable(CMPIType declared, const QueryLiteral& literal) {
    if (std::holds_alternative<std::monostate>(literal)) {
        return true;
    }
    if (std::holds_alternative<bool>(literal)) {
        return declared == CMPI_boolean;
    }
    const bool isText = std::holds_alternative<std::string>(literal);
    switch (declared) {
    case CMPI_char16:
        return true;
    case CMPI_string:
    case CMPI_dateTime:
    case CMPI_ref:
        return isText;
    case CMPI_real32:
    case CMPI_real64:
        return !isText;
    default:
        return !isText && integerType(declared) != nullptr;
    }
}

void checkPredicate(const DeclaredClass& declared, const QueryPredicate& predicate) {
    const PropertyDeclaration* const left = declarationOf(declared, predicate.left);
    if (const auto* const right = std::get_if<QueryProperty>(&predicate.right)) {
        declarationOf(declared, *right);
        return;
    }
    const auto& literal = std::get<QueryLiteral>(predicate.right);
    switch (predicate.operation) {
    case CMPI_PredOp_Isa:
    case CMPI_PredOp_NotIsa:
    case CMPI_PredOp_Null:
    case CMPI_PredOp_Not_Null:
        return;
    default:
        if (left != nullptr && !areComparable(valueType(left->type, left->qualifiers), literal)) {
            failAt(predicate.left, "property " + left->name + " is a " + declaredTypeName(left->type) +
                                       " and cannot be compared with this value");
        }
    }
}

void checkCondition(const DeclaredClass& declared, const QueryCondition& condition) {
    if (condition.predicate != nullptr) {
        checkPredicate(declared, *condition.predicate);
    }
    for (const QueryCondition& part : condition.parts) {
        checkCondition(declared, part);
    }
}

struct LiteralText {
    std::string operator()(std::monostate /*null*/) const { return "NULL"; }
    std::string operator()(bool value) const { return value ? "TRUE" : "FALSE"; }
    std::string operator()(const WideInteger& number) const {
        return (number.isNegative ? "-" : "") + std::to_string(number.magnitude);
    }
    std::string operator()(double number) const {
        CMPIData data = {CMPI_real64, CMPI_goodValue, {}};
        data.value.real64 = number;
        return valueText(data);
    }
    std::string operator()(const std::string& text) const { return text; }
};

struct LiteralType {
    CMPIType operator()(std::monostate /*null*/) const { return CMPI_null; }
    CMPIType operator()(bool /*value*/) const { return CMPI_boolean; }
    CMPIType operator()(const WideInteger& number) const {
        const bool isSigned = integerType(CMPI_sint64)->holds(number.magnitude, number.isNegative);
        return isSigned ? CMPI_sint64 : CMPI_uint64;
    }
    CMPIType operator()(double /*number*/) const { return CMPI_real64; }
    CMPIType operator()(const std::string& /*text*/) const { return CMPI_string; }
};

} // namespace

std::string textOf(const QueryLiteral& literal) {
    return std::visit(LiteralText(), literal);
}

CMPIType typeOf(const QueryLiteral& literal) {
    return std::visit(LiteralType(), literal);
}

std::shared_ptr<const Query> Query::parse(std::string_view text, std::string_view language) {
    auto query = std::make_shared<Query>();
    QueryParser parser(text, languageOf(language));
    parser.readInto(*query);
    query->text_ = text;
    return query;
}

void Query::check(const Classes& classes) const {
    if (!classes.any()) {
        return;
    }
    const DeclaredClass* const declared = classes.find(className_);
    if (declared == nullptr) {
        failWith(CMPI_RC_ERR_INVALID_CLASS, "class " + className_ + " is not declared");
    }
    for (const QueryProperty& property : selected_) {
        declarationOf(*declared, property);
    }
    checkCondition(*declared, condition_);
}

void Query::project(Instance& instance) const {
    if (selectsAll()) {
        return;
    }
    std::vector<std::string> names;
    for (const QueryProperty& property : selected_) {
        names.push_back(property.steps.front().name);
    }
    instance.setFilter(std::move(names));
}

} // namespace oxahv
