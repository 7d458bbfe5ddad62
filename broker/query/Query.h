// Select statements in WQL and in the basic CIM query language: what a text says, and whether a value source
// fulfils it. Knows classes and CMPI values, but none of CMPI's records for queries.
#pragma once

#include "classes/Classes.h"
#include "query/LikePattern.h"
#include "text/Integers.h"

#include <memory>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace oxahv {

class Instance;

// DSP0200 numbers it; the tables of CMPI's codes before version 2.1 end below it.
constexpr auto queryFeatureNotSupported = static_cast<CMPIrc>(29);

// A property, by way of embedded instances: `SourceInstance.Name`.
struct QueryProperty {
    // `Name` or, where the instance must be of a class to have it, `Class::Name`.
    struct Step {
        std::string scope;
        std::string name;
    };
    std::string text;        // without the class that the statement names; its name alone for the instance
    std::vector<Step> steps; // none: the instance itself
    std::size_t column = 0;
};

// A constant; the first alternative is NULL.
using QueryLiteral = std::variant<std::monostate, bool, WideInteger, double, std::string>;

// One comparison. `NOT` is part of the operation.
struct QueryPredicate {
    CMPIPredOp operation = CMPI_PredOp_Equals;
    QueryProperty left;
    // A class name of ISA, a pattern of LIKE; nothing of IS NULL.
    std::variant<QueryLiteral, QueryProperty> right;
    LikePattern pattern; // of LIKE
};

// A WHERE clause. NOT is moved into its predicates while it is read, which the three values of its logic
// allow: what is unknown stays so.
struct QueryCondition {
    enum class Kind { predicate, conjunction, disjunction };
    Kind kind = Kind::conjunction;
    std::shared_ptr<const QueryPredicate> predicate;
    std::vector<QueryCondition> parts; // a conjunction of none is true
};

// Where the values of properties come from.
class QuerySource {
public:
    QuerySource() = default;
    QuerySource(const QuerySource&) = delete;
    QuerySource& operator=(const QuerySource&) = delete;
    virtual ~QuerySource() = default;
    // NULL where there is no value. What it points to has to live until the next call.
    virtual CMPIData valueOf(const QueryProperty& property) const = 0;
};

// A parsed statement; constant, so that every object made of it shares it.
class Query {
public:
    // A query, and each of its normal forms, has no more predicates.
    static constexpr std::size_t mostPredicates = 1000;

    // The languages are "WQL", "DMTF:CQL" and "CIM:CQL", in any case. Throws Failure with a text that names
    // the column: CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, CMPI_RC_ERR_INVALID_QUERY, and
    // queryFeatureNotSupported for what the language has beyond its basic level.
    static std::shared_ptr<const Query> parse(std::string_view text, std::string_view language);

    const std::string& text() const { return text_; }
    const std::string& className() const { return className_; }
    bool selectsAll() const { return selected_.empty(); }
    // The select list; empty for `*`.
    const std::vector<QueryProperty>& selected() const { return selected_; }
    const QueryCondition& condition() const { return condition_; }

    // Checks the names and types that the FROM class declares, as far as any class is declared. Throws
    // Failure: CMPI_RC_ERR_INVALID_CLASS, CMPI_RC_ERR_INVALID_QUERY.
    void check(const Classes& classes) const;
    // Whether the instance is of the FROM class and fulfils the WHERE clause, which what is unknown does not.
    // Throws Failure, CMPI_RC_ERR_TYPE_MISMATCH, where two values cannot be compared.
    bool accepts(const Instance& instance) const;
    // Leaves of an instance its keys and what the select list names.
    void project(Instance& instance) const;

private:
    friend class QueryParser;
    std::string text_;
    std::string className_;
    std::vector<QueryProperty> selected_;
    QueryCondition condition_;
};

// Whether a source fulfils a condition or a predicate. Both throw as Query::accepts does.
bool fulfils(const Classes& classes, const QueryCondition& condition, const QuerySource& source);
bool fulfils(const Classes& classes, const QueryPredicate& predicate, const QuerySource& source);

// A literal as text, without quotes, and its type: `CMPI_sint64` for integers, `CMPI_uint64` where that is
// too narrow.
std::string textOf(const QueryLiteral& literal);
CMPIType typeOf(const QueryLiteral& literal);

} // namespace oxahv
