// The grammar of queries.
#pragma once

#include "query/Query.h"
#include "query/QueryLexer.h"

namespace oxahv {

class QueryParser {
public:
    // The text has to outlive the parser.
    QueryParser(std::string_view text, QueryLanguage language);

    // Reads the whole text into a query. Throws Failure.
    void readInto(Query& query);

private:
    using Operand = std::variant<QueryLiteral, QueryProperty>;

    [[noreturn]] void failExpecting(const std::string& what) const;
    QueryToken take();
    bool takeSymbol(std::string_view symbol);
    bool takeWord(std::string_view word);
    bool isName() const;
    std::string readName(const char* what);

    void readSelectList(Query& query);
    void readFrom(Query& query);
    QueryProperty readProperty();
    QueryProperty::Step readStep();
    void resolve(QueryProperty& property) const;

    QueryCondition readDisjunction(bool isNegated);
    QueryCondition readConjunction(bool isNegated);
    QueryCondition readTerm(bool isNegated);
    QueryCondition readPredicate(bool isNegated);
    void readTest(QueryPredicate& predicate);
    void readMirrored(QueryPredicate& predicate, QueryLiteral literal, std::size_t column);
    CMPIPredOp readOperator();
    Operand readOperand();
    QueryLiteral readLiteral();

    QueryLexer lexer_;
    QueryLanguage language_;
    QueryToken token_; // the one that is looked at, not taken yet
    std::string className_;
    std::string alias_;
    std::size_t depth_ = 0;
    std::size_t predicates_ = 0;
};

} // namespace oxahv
