#include "query/QueryParser.h"

#include <algorithm>
#include <iterator>

namespace oxahv {

namespace {

// Conditions nest on the stack.
constexpr std::size_t mostParentheses = 100;

constexpr std::string_view reserved[] = {"SELECT", "FROM", "WHERE", "AND",  "OR",   "NOT",
                                         "IS",     "LIKE", "ISA",   "NULL", "TRUE", "FALSE"};
// What may follow the class in the whole of one of the languages.
constexpr std::string_view beyondBasicQueries[] = {"ORDER", "GROUP", "HAVING", "WITHIN", "INNER", "JOIN"};

struct Operator {
    std::string_view symbol;
    CMPIPredOp operation;
};
constexpr Operator operators[] = {
    {"=", CMPI_PredOp_Equals},
    {"<>", CMPI_PredOp_NotEquals},
    {"!=", CMPI_PredOp_NotEquals},
    {"<", CMPI_PredOp_LessThan},
    {"<=", CMPI_PredOp_LessThanOrEquals},
    {">", CMPI_PredOp_GreaterThan},
    {">=", CMPI_PredOp_GreaterThanOrEquals},
};

struct OperatorPair {
    CMPIPredOp one;
    CMPIPredOp other;
};
constexpr OperatorPair opposites[] = {
    {CMPI_PredOp_Equals, CMPI_PredOp_NotEquals},
    {CMPI_PredOp_LessThan, CMPI_PredOp_GreaterThanOrEquals},
    {CMPI_PredOp_GreaterThan, CMPI_PredOp_LessThanOrEquals},
    {CMPI_PredOp_Isa, CMPI_PredOp_NotIsa},
    {CMPI_PredOp_Like, CMPI_PredOp_NotLike},
    {CMPI_PredOp_Null, CMPI_PredOp_Not_Null},
};
constexpr OperatorPair mirrorImages[] = {
    {CMPI_PredOp_LessThan, CMPI_PredOp_GreaterThan},
    {CMPI_PredOp_LessThanOrEquals, CMPI_PredOp_GreaterThanOrEquals},
};

// The other one of the operation's pair; the operation itself where it is in none.
template <std::size_t count>
CMPIPredOp partner(const OperatorPair (&pairs)[count], CMPIPredOp operation) {
    for (const OperatorPair& pair : pairs) {
        if (operation == pair.one || operation == pair.other) {
            return operation == pair.one ? pair.other : pair.one;
        }
    }
    return operation;
}

template <std::size_t count>
bool isOneOf(const std::string_view (&words)[count], const QueryToken& token) {
    return std::any_of(std::begin(words), std::end(words),
                       [&](std::string_view word) { return token.isWord(word); });
}

std::string textOf(const std::vector<QueryProperty::Step>& steps) {
    std::string text;
    for (const QueryProperty::Step& step : steps) {
        text += text.empty() ? "" : ".";
        text += step.scope.empty() ? step.name : step.scope + "::" + step.name;
    }
    return text;
}

} // namespace

QueryParser::QueryParser(std::string_view text, QueryLanguage language) : lexer_(text), language_(language) {
    token_ = lexer_.next();
}

void QueryParser::failExpecting(const std::string& what) const {
    const std::string found =
        token_.kind == QueryTokenKind::end ? std::string("the end") : std::string(token_.spelling);
    failInQuery(CMPI_RC_ERR_INVALID_QUERY, token_.column, "expected " + what + " and not " + found);
}

QueryToken QueryParser::take() {
    QueryToken taken = std::move(token_);
    token_ = lexer_.next();
    return taken;
}

bool QueryParser::takeSymbol(std::string_view symbol) {
    const bool isNext = token_.isSymbol(symbol);
    if (isNext) {
        take();
    }
    return isNext;
}

bool QueryParser::takeWord(std::string_view word) {
    const bool isNext = token_.isWord(word);
    if (isNext) {
        take();
    }
    return isNext;
}

bool QueryParser::isName() const {
    return token_.kind == QueryTokenKind::word && !isOneOf(reserved, token_);
}

std::string QueryParser::readName(const char* what) {
    if (!isName()) {
        failExpecting(what);
    }
    return std::string(take().spelling);
}

void QueryParser::readInto(Query& query) {
    if (token_.isWord("ASSOCIATORS") || token_.isWord("REFERENCES")) {
        failInQuery(queryFeatureNotSupported, token_.column,
                    "no basic query begins with " + std::string(token_.spelling));
    }
    if (!takeWord("SELECT")) {
        failExpecting("SELECT");
    }
    readSelectList(query);
    readFrom(query);
    query.className_ = className_;
    for (QueryProperty& property : query.selected_) {
        resolve(property);
    }
    const auto isWhole = [](const QueryProperty& property) { return property.steps.empty(); };
    if (std::any_of(query.selected_.begin(), query.selected_.end(), isWhole)) {
        query.selected_.clear();
    }
    if (takeWord("WHERE")) {
        query.condition_ = readDisjunction(false);
    }
    if (isOneOf(beyondBasicQueries, token_) || token_.isSymbol(",")) {
        failInQuery(queryFeatureNotSupported, token_.column,
                    "no basic query has " + std::string(token_.spelling) + " here");
    }
    if (token_.kind != QueryTokenKind::end) {
        failExpecting("the end");
    }
}

void QueryParser::readSelectList(Query& query) {
    if (takeSymbol("*")) {
        return;
    }
    do {
        query.selected_.push_back(readProperty());
        if (token_.kind == QueryTokenKind::word && !isOneOf(reserved, token_)) {
            failInQuery(queryFeatureNotSupported, query.selected_.back().column,
                        "no basic query has " + query.selected_.back().text + " here");
        }
    } while (takeSymbol(","));
}

void QueryParser::readFrom(Query& query) {
    if (!takeWord("FROM")) {
        failExpecting(query.selected_.empty() ? "FROM" : "a comma or FROM");
    }
    className_ = readName("a class name");
    const bool hasAlias = language_ == QueryLanguage::cql && !isOneOf(beyondBasicQueries, token_);
    if (hasAlias && (takeWord("AS") || isName())) {
        alias_ = readName("another name of the class");
    }
}

// The names of a property, in the select list also `Class.*`, which leaves the class alone.
QueryProperty QueryParser::readProperty() {
    QueryProperty property;
    property.column = token_.column;
    property.steps.push_back(readStep());
    while (takeSymbol(".")) {
        if (className_.empty() && property.steps.size() == 1 && takeSymbol("*")) {
            property.text = property.steps.front().name + ".*";
            return property;
        }
        property.steps.push_back(readStep());
    }
    property.text = textOf(property.steps);
    if (token_.isSymbol("(")) {
        failInQuery(queryFeatureNotSupported, property.column,
                    "no basic query has the function " + property.text);
    }
    return property;
}

QueryProperty::Step QueryParser::readStep() {
    QueryProperty::Step step;
    step.name = readName("a property name");
    if (language_ == QueryLanguage::cql && takeSymbol("::")) {
        step.scope = std::move(step.name);
        step.name = readName("a property name");
    }
    return step;
}

// Takes the statement's class, or its other name, off the front of a property.
void QueryParser::resolve(QueryProperty& property) const {
    const bool isStar = property.text.back() == '*';
    const QueryProperty::Step& first = property.steps.front();
    const bool isInstance = first.scope.empty() && (sameName(first.name, className_) ||
                                                    (!alias_.empty() && sameName(first.name, alias_)));
    if (isInstance) {
        property.steps.erase(property.steps.begin());
        property.text = property.steps.empty() ? className_ : textOf(property.steps);
    } else if (isStar) {
        failInQuery(CMPI_RC_ERR_INVALID_QUERY, property.column,
                    first.name + " is not the class " + className_);
    }
}

// By De Morgan's laws what is negated becomes the other kind of condition, of negated parts.
QueryCondition QueryParser::readDisjunction(bool isNegated) {
    QueryCondition condition;
    condition.kind = isNegated ? QueryCondition::Kind::conjunction : QueryCondition::Kind::disjunction;
    do {
        condition.parts.push_back(readConjunction(isNegated));
    } while (takeWord("OR"));
    return condition.parts.size() == 1 ? std::move(condition.parts.front()) : std::move(condition);
}

QueryCondition QueryParser::readConjunction(bool isNegated) {
    QueryCondition condition;
    condition.kind = isNegated ? QueryCondition::Kind::disjunction : QueryCondition::Kind::conjunction;
    do {
        condition.parts.push_back(readTerm(isNegated));
    } while (takeWord("AND"));
    return condition.parts.size() == 1 ? std::move(condition.parts.front()) : std::move(condition);
}

QueryCondition QueryParser::readTerm(bool isNegated) {
    while (takeWord("NOT")) {
        isNegated = !isNegated;
    }
    const std::size_t column = token_.column;
    if (!takeSymbol("(")) {
        return readPredicate(isNegated);
    }
    if (++depth_ > mostParentheses) {
        failInQuery(queryFeatureNotSupported, column,
                    "more than " + std::to_string(mostParentheses) + " parentheses within each other");
    }
    QueryCondition condition = readDisjunction(isNegated);
    if (!takeSymbol(")")) {
        failExpecting("AND, OR or )");
    }
    --depth_;
    return condition;
}

QueryCondition QueryParser::readPredicate(bool isNegated) {
    if (++predicates_ > Query::mostPredicates) {
        failInQuery(queryFeatureNotSupported, token_.column,
                    "more than " + std::to_string(Query::mostPredicates) + " comparisons");
    }
    auto predicate = std::make_shared<QueryPredicate>();
    const std::size_t column = token_.column;
    Operand left = readOperand();
    if (auto* const property = std::get_if<QueryProperty>(&left)) {
        predicate->left = std::move(*property);
        readTest(*predicate);
    } else {
        readMirrored(*predicate, std::get<QueryLiteral>(std::move(left)), column);
    }
    if (isNegated) {
        predicate->operation = partner(opposites, predicate->operation);
    }
    QueryCondition condition;
    condition.kind = QueryCondition::Kind::predicate;
    condition.predicate = std::move(predicate);
    return condition;
}

// What follows a property.
void QueryParser::readTest(QueryPredicate& predicate) {
    if (takeWord("IS")) {
        predicate.operation = takeWord("NOT") ? CMPI_PredOp_Not_Null : CMPI_PredOp_Null;
        if (!takeWord("NULL")) {
            failExpecting("NULL");
        }
        return;
    }
    const bool isNot = takeWord("NOT");
    if (takeWord("LIKE")) {
        predicate.operation = isNot ? CMPI_PredOp_NotLike : CMPI_PredOp_Like;
        if (token_.kind != QueryTokenKind::text) {
            failExpecting("a pattern in quotes");
        }
        QueryToken pattern = take();
        predicate.pattern = LikePattern(pattern.text, language_, pattern.column);
        predicate.right = QueryLiteral(std::move(pattern.text));
    } else if (takeWord("ISA")) {
        predicate.operation = isNot ? CMPI_PredOp_NotIsa : CMPI_PredOp_Isa;
        const bool isQuoted = token_.kind == QueryTokenKind::text;
        predicate.right = QueryLiteral(isQuoted ? take().text : readName("a class name"));
    } else if (isNot) {
        failExpecting("LIKE or ISA");
    } else {
        predicate.operation = readOperator();
        Operand right = readOperand();
        if (auto* const property = std::get_if<QueryProperty>(&right)) {
            predicate.right = std::move(*property);
        } else {
            predicate.right = std::get<QueryLiteral>(std::move(right));
        }
    }
}

// A comparison whose constant comes first, as one whose property does.
void QueryParser::readMirrored(QueryPredicate& predicate, QueryLiteral literal, std::size_t column) {
    predicate.operation = partner(mirrorImages, readOperator());
    Operand right = readOperand();
    auto* const property = std::get_if<QueryProperty>(&right);
    if (property == nullptr) {
        failInQuery(CMPI_RC_ERR_INVALID_QUERY, column, "a comparison needs a property");
    }
    predicate.left = std::move(*property);
    predicate.right = std::move(literal);
}

CMPIPredOp QueryParser::readOperator() {
    for (const Operator& known : operators) {
        if (takeSymbol(known.symbol)) {
            return known.operation;
        }
    }
    failExpecting("a comparison");
}

QueryParser::Operand QueryParser::readOperand() {
    if (isName()) {
        QueryProperty property = readProperty();
        resolve(property);
        return property;
    }
    return readLiteral();
}

QueryLiteral QueryParser::readLiteral() {
    if (token_.kind == QueryTokenKind::word) {
        if (takeWord("NULL")) {
            return std::monostate();
        }
        const bool isTrue = token_.isWord("TRUE");
        if (!isTrue && !token_.isWord("FALSE")) {
            failExpecting("a property or a value");
        }
        take();
        return isTrue;
    }
    switch (token_.kind) {
    case QueryTokenKind::integer: {
        const WideInteger number = {token_.magnitude, token_.isNegative()};
        take();
        return number;
    }
    case QueryTokenKind::real:
        return take().real;
    case QueryTokenKind::text:
        return take().text;
    default:
        failExpecting("a property or a value");
    }
}

} // namespace oxahv
