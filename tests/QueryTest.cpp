// Queries: what WQL and the basic CIM query language accept, what they refuse and where, and the parts of a
// query that providers take apart.
#include "EmbeddedBroker.h"
#include "FailingMemory.h"

#include <cmath>
#include <gtest/gtest.h>
#include <map>
#include <random>

using oxahv::ClassDeclaration;
using oxahv::EmbeddedBroker;
using oxahv::Request;

namespace {

enum class Truth { no, unknown, yes };

class AQuery : public testing::Test {
protected:
    CMPIInstance* instanceOf(const char* className) {
        return CMNewInstance(handle_, request_.objectPath("root", className), nullptr);
    }

    // Sets a property of the instance by its text.
    void set(CMPIInstance* instance, const char* name, CMPIType type, const std::string& text) {
        const CMPIData data = request_.valueFromText(text, type);
        ASSERT_EQ(CMSetProperty(instance, name, &data.value, type).rc, CMPI_RC_OK) << name;
    }

    static std::string answerOf(const CMPIStatus& status) {
        const char* const message = status.msg != nullptr ? CMGetCharsPtr(status.msg, nullptr) : "";
        return oxahv::codeName(status.rc).substr(8) + ' ' + message;
    }

    // "1", "0", or the code and the text of a refusal.
    std::string ask(const std::string& query, const char* language, const CMPIInstance* instance) {
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        CMPISelectExp* const expression = CMNewSelectExp(handle_, query.c_str(), language, nullptr, &status);
        if (expression == nullptr) {
            return answerOf(status);
        }
        const bool isAccepted = CMEvaluateSelExp(expression, instance, &status) != 0;
        return status.rc != CMPI_RC_OK ? answerOf(status) : isAccepted ? "1" : "0";
    }

    // What a condition says of an instance; what is unknown is accepted neither way.
    std::string truthOf(const std::string& condition, const char* language, const CMPIInstance* instance) {
        const std::string query = "SELECT * FROM Demo WHERE ";
        const std::string is = ask(query + condition, language, instance);
        const std::string isNot = ask(query + "NOT (" + condition + ")", language, instance);
        return is == "1" && isNot == "0"   ? "yes"
               : is == "0" && isNot == "1" ? "no"
               : is == "0" && isNot == "0" ? "unknown"
                                           : is + '/' + isNot;
    }

    // One of everything.
    CMPIInstance* demo() {
        CMPIInstance* const demo = instanceOf("Demo");
        set(demo, "U8", CMPI_uint8, "200");
        set(demo, "U64", CMPI_uint64, "18446744073709551615");
        set(demo, "S64", CMPI_sint64, "-9223372036854775808");
        set(demo, "S8", CMPI_sint8, "-1");
        set(demo, "Big", CMPI_sint64, "9007199254740993"); // 2 to the 53rd and 1: no real64
        set(demo, "R32", CMPI_real32, "0.1");
        set(demo, "R64", CMPI_real64, "9007199254740992.0");
        set(demo, "Yes", CMPI_boolean, "TRUE");
        set(demo, "Text", CMPI_string, "a%b_ä.c*");
        set(demo, "Day", CMPI_dateTime, "19690720201740.000000+060");
        set(demo, "Span", CMPI_dateTime, "00000001000000.000000:000");
        set(demo, "Letter", CMPI_char16, "228");
        set(demo, "Ref", CMPI_ref, "Other.Id=1");
        CMSetProperty(demo, "None", nullptr, CMPI_uint32);
        CMPIInstance* const inner = instanceOf("Inner");
        set(inner, "Deep", CMPI_uint8, "7");
        CMPIValue value = {};
        value.inst = inner;
        CMSetProperty(demo, "Source", &value, CMPI_instance);
        value.array = CMNewArray(handle_, 1, CMPI_uint8, nullptr);
        CMSetProperty(demo, "List", &value, CMPI_uint8A);
        value.real64 = std::nan("");
        CMSetProperty(demo, "Nan", &value, CMPI_real64);
        return demo;
    }

    EmbeddedBroker broker_;
    const CMPIBroker* const handle_ = broker_.handle();
    Request request_{broker_};
};

struct Condition {
    const char* truth;
    const char* condition;
};

} // namespace

TEST_F(AQuery, ComparesValuesOfEveryType) {
    const CMPIInstance* const instance = demo();
    for (const auto& [truth, condition] : std::initializer_list<Condition>{
             {"yes", "U8 = 200 AND u8 >= 200 AND 0xC8 = U8 AND 199 < U8 AND U8 <> -56"},
             {"yes", "U64 > S64 AND S64 < U8 AND S8 < U64 AND U64 <> S8 AND U64 = 18446744073709551615"},
             {"yes", "S64 = -9223372036854775808 AND S64 <= S8"},
             {"yes", "Big > R64 AND R64 < Big AND Big <> R64 AND Big > 9007199254740992.5 AND U64 < 1e300"},
             {"yes", "S64 > -1e300 AND S8 < -0.5 AND S8 > -1.5 AND U64 < 18446744073709551616.0"},
             {"no", "Big = 9007199254740992.0 OR Big < R64"},
             {"yes", "R32 = 0.1 AND R32 <= 0.1 AND R32 >= .1 AND R32 < 1"},
             {"yes", "Yes = TRUE AND Yes <> false AND TRUE = yes"},
             {"yes", "Text = 'a%b_\\u00e4.c*' AND Text > \"a\" AND Text < 'b' AND Text <> 'A%B_\\u00e4.C*'"},
             {"yes", "Day < '19700101000000.000000+000' AND Day = '19690720191740.000000+000'"},
             {"yes", "Day > '19690720191739.999999+000' AND Span < '00000001000000.000001:000'"},
             {"yes", "Letter = '\\u00e4' AND Letter = 228 AND 'z' < Letter"},
             {"yes", "Ref = 'Other.Id=1' AND Ref ISA Other AND NOT Ref ISA 'Demo'"},
             {"yes", "Source.Deep = 7 AND source.deep < 8 AND Source ISA Inner AND Source IS NOT NULL"},
             {"no", "Source ISA Demo"},
             {"yes", "Demo ISA Demo AND Demo.U8 = 200"},
             {"yes", "S64 < U64 AND Text = Text AND Letter < U64 AND Yes = Yes AND Day = Day"},
             {"unknown", "None = 1"},
             {"unknown", "Nothing = 'x' OR None LIKE '%' OR Nothing ISA Demo OR Nothing.Inner > 1"},
             {"unknown", "Yes = TRUE AND None <> 1"},
             {"unknown", "Nan = 1.0 OR Nan = Nan OR Nan <> 1"},
             {"unknown", "U8 = NULL"},
             {"yes", "None = 1 OR Yes = TRUE"},
             {"no", "None = 1 AND Yes = FALSE"},
             {"yes", "None IS NULL AND Nothing IS NULL AND Yes IS NOT NULL AND List IS NOT NULL"},
             {"no", "Yes = FALSE OR Yes = TRUE AND Yes = FALSE"},
             {"no", "(Yes = FALSE OR Yes = TRUE) AND Yes = FALSE"},
             {"yes", "NOT Yes = FALSE OR Yes = FALSE"},
             {"yes", "NOT NOT (Yes = TRUE) AND NOT (Yes = FALSE OR None IS NOT NULL)"},
         }) {
        EXPECT_EQ(truthOf(condition, "WQL", instance), truth) << condition;
        EXPECT_EQ(truthOf(condition, "CIM:CQL", instance), truth) << condition;
    }
    for (const char* const condition :
         {"U8 = 'x'", "Text = 1", "Yes < TRUE", "Yes = 1", "List = 1", "Day = 'x'", "Day = Span",
          "Text ISA Demo", "U8 LIKE 'x'", "Ref < 'x'", "U8.Deep = 1", "Yes = TRUE OR Text = 1"}) {
        EXPECT_EQ(ask(std::string("SELECT * FROM Demo WHERE ") + condition, "wql", instance)
                      .rfind("ERR_TYPE_MISMATCH query, column ", 0),
                  0U)
            << condition;
    }
    EXPECT_EQ(ask("SELECT * FROM Other", "WQL", instance), "0");
}

TEST_F(AQuery, MatchesThePatternsOfItsLanguage) {
    CMPIInstance* const instance = instanceOf("Demo");
    struct Match {
        const char* language;
        const char* pattern;
        std::vector<const char*> yes;
        std::vector<const char*> no;
    };
    const std::string aLot(2000, 'a');
    for (const Match& match : std::initializer_list<Match>{
             {"WQL", "", {""}, {"a"}},
             {"WQL", "%", {"", "a", "äö"}, {}},
             {"WQL", "a%", {"a", "ab", "a%"}, {"", "ba", "A"}},
             {"WQL", "%b%c", {"bc", "abbcc", "bcbc"}, {"b", "bcb"}},
             {"WQL", "_\\\\_", {"a_", "ä_"}, {"ab", "_"}},
             {"WQL", ".*[x]", {".*[x]"}, {"x"}},
             {"WQL", "%a%a%a%a%a%a%a%a%a%a%b", {"aaaaaaaaaab"}, {aLot.c_str()}},
             {"DMTF:CQL", "a.c", {"abc", "aäc"}, {"ac", "a.cd"}},
             {"DMTF:CQL", "ab*c", {"ac", "abc", "abbbc"}, {"a", "abxc", "aBc"}},
             {"DMTF:CQL", ".*", {"", "%_"}, {}},
             {"DMTF:CQL", "a\\\\.\\\\*%_", {"a.*%_"}, {"ab", "a.*xx"}},
             {"DMTF:CQL", "ä*b**", {"ääbb", ""}, {"a"}},
             {"DMTF:CQL", "a*a*a*a*a*a*a*a*b", {"b", "aab"}, {aLot.c_str()}},
         }) {
        const std::string condition = std::string("Text LIKE '") + match.pattern + '\'';
        for (const char* const text : match.yes) {
            set(instance, "Text", CMPI_string, text);
            EXPECT_EQ(truthOf(condition, match.language, instance), "yes") << condition << ": " << text;
        }
        for (const char* const text : match.no) {
            set(instance, "Text", CMPI_string, text);
            EXPECT_EQ(truthOf(condition, match.language, instance), "no") << condition << ": " << text;
        }
    }
}

TEST_F(AQuery, KnowsTheClassByItsOtherNamesInTheCimQueryLanguage) {
    const CMPIInstance* const instance = demo();
    for (const auto& [truth, query] : std::initializer_list<Condition>{
             {"1", "SELECT Demo.* FROM Demo WHERE Demo.U8 = 200"},
             {"1", "select d.U8, d.Source.Deep from Demo as d where d.U8 = 200 and d isa Demo"},
             {"1", "SELECT d.* FROM Demo d WHERE d.Demo::U8 = 200 AND d.Source.Inner::Deep = 7"},
             {"0", "SELECT * FROM Demo d WHERE Other::U8 = 200 OR Source.Other::Deep = 7"},
         }) {
        EXPECT_EQ(ask(query, "CIM:CQL", instance), truth) << query;
    }
}

TEST_F(AQuery, IsRefusedWithThePlaceOfTheFault) {
    const std::string invalid = "ERR_INVALID_QUERY query, column ";
    const std::string unsupported = "ERR_QUERY_FEATURE_NOT_SUPPORTED query, column ";
    struct Refusal {
        const char* language;
        std::string query;
        std::string answer;
    };
    const std::string all = "SELECT * FROM D WHERE ";
    std::string many = all + "a=1";
    for (int i = 0; i < 1000; ++i) {
        many += " OR a=1";
    }
    for (const Refusal& refusal : std::initializer_list<Refusal>{
             {"XQL", "SELECT",
              "ERR_QUERY_LANGUAGE_NOT_SUPPORTED the query language XQL is neither WQL nor DMTF:CQL"},
             {"WQL", "", invalid + "1: expected SELECT and not the end"},
             {"WQL", "SELECT FROM D", invalid + "8: expected a property name and not FROM"},
             {"WQL", "SELECT a b FROM D", unsupported + "8: no basic query has a here"},
             {"WQL", "SELECT a, FROM D", invalid + "11: expected a property name and not FROM"},
             {"WQL", "SELECT * FROM", invalid + "14: expected a class name and not the end"},
             {"WQL", "SELECT * FROM D WHERE", invalid + "22: expected a property or a value and not the end"},
             {"WQL", "SELECT * FROM D x", invalid + "17: expected the end and not x"},
             {"WQL", "SELECT * FROM D, E", unsupported + "16: no basic query has , here"},
             {"WQL", "SELECT * FROM D WITHIN 5", unsupported + "17: no basic query has WITHIN here"},
             {"WQL", "ASSOCIATORS OF {D}", unsupported + "1: no basic query begins with ASSOCIATORS"},
             {"CIM:CQL", "SELECT COUNT(*) FROM D", unsupported + "8: no basic query has the function COUNT"},
             {"CIM:CQL", "SELECT * FROM D ORDER BY a", unsupported + "17: no basic query has ORDER here"},
             {"CIM:CQL", "SELECT E.* FROM D", invalid + "8: E is not the class D"},
             {"CIM:CQL", all + "a[0] = 1", unsupported + "24: no basic query has the operator ["},
             {"CIM:CQL", all + "a LIKE 'x|y'", unsupported + "30: no basic pattern has a |"},
             {"CIM:CQL", all + "a LIKE '*x'", invalid + "30: the pattern's first * follows nothing"},
             {"WQL", all + "a LIKE 'x\\\\'", invalid + "30: the pattern ends with a backslash"},
             {"WQL", all + "a LIKE 7", invalid + "30: expected a pattern in quotes and not 7"},
             {"WQL", all + "1 = 2", invalid + "23: a comparison needs a property"},
             {"WQL", all + "a ~ 2", invalid + "25: no query has this character"},
             {"WQL", all + "a", invalid + "24: expected a comparison and not the end"},
             {"WQL", all + "a IS 7", invalid + "28: expected NULL and not 7"},
             {"WQL", all + "a NOT = 7", invalid + "29: expected LIKE or ISA and not ="},
             {"WQL", all + "(a = 1", invalid + "29: expected AND, OR or ) and not the end"},
             {"WQL", all + "a = 1)", invalid + "28: expected the end and not )"},
             {"WQL", all + "ä = 'ö' x", invalid + "31: expected the end and not x"},
             {"WQL", all + "a = 'x", invalid + "27: the quote is not closed"},
             {"WQL", all + "a = '\\q'",
              invalid + "28: expected b, t, n, f, r, u, U, a quote or a backslash after this backslash"},
             {"WQL", all + "a = '\\ud800'", invalid + "28: this escape sequence is not a character's"},
             {"WQL", all + "a = 12x", invalid + "27: 12x is no number"},
             {"WQL", all + "a = 1.2.3", invalid + "27: 1.2.3 is no number"},
             {"WQL", all + "a = -9223372036854775809",
              invalid + "27: -9223372036854775809 does not fit into 64 bits"},
             {"WQL", all + "a = 1e400", invalid + "27: 1e400 does not fit into a real64"},
             {"WQL", all + std::string(101, '(') + "a=1",
              unsupported + "123: more than 100 parentheses within each other"},
             {"WQL", many, unsupported + std::to_string(many.size() - 2) + ": more than 1000 comparisons"},
         }) {
        EXPECT_EQ(ask(refusal.query, refusal.language, nullptr), refusal.answer) << refusal.query;
    }
    broker_.declare(ClassDeclaration("D").property("a", CMPI_uint8).property("Source", CMPI_instance));
    for (const Refusal& refusal : std::initializer_list<Refusal>{
             {"WQL", "SELECT * FROM E", "ERR_INVALID_CLASS class E is not declared"},
             {"WQL", "SELECT b FROM D", invalid + "8: class D has no property b"},
             {"WQL", all + "a = 1 OR b = 1", invalid + "32: class D has no property b"},
             {"WQL", all + "a = 'x'",
              invalid + "23: property a is a uint8 and cannot be compared with this value"},
             {"WQL", all + "a LIKE 'x'",
              invalid + "23: property a is a uint8 and cannot be compared with this value"},
             {"WQL", all + "a = 1.0 AND Source.Anything = 'x'", "ERR_INVALID_HANDLE "},
         }) {
        EXPECT_EQ(ask(refusal.query, refusal.language, nullptr), refusal.answer) << refusal.query;
    }
}

namespace {

// Values for an accessor: of the names that it has.
using Values = std::map<std::string, CMPIData>;

CMPIData valueNamed(const char* name, void* parm) {
    const auto& values = *static_cast<const Values*>(parm);
    const auto found = values.find(name);
    return found != values.end() ? found->second : CMPIData{CMPI_null, CMPI_nullValue | CMPI_notFound, {}};
}

// What a normal form says, by the rules of its type.
bool isTrue(const CMPISelectCond* condition, Values& values) {
    int type = -1;
    const CMPICount count = CMGetSubCondCountAndType(condition, &type, nullptr);
    const bool isDoc = type == CMPI_COND_DOC;
    bool whole = !isDoc;
    for (CMPICount i = 0; i < count; ++i) {
        CMPISubCond* const sub = CMGetSubCondAt(condition, i, nullptr);
        bool group = isDoc;
        for (CMPICount j = 0; j < CMGetPredicateCount(sub, nullptr); ++j) {
            const bool is = CMEvaluatePredicateUsingAccessor(CMGetPredicateAt(sub, j, nullptr), valueNamed,
                                                             &values, nullptr) != 0;
            group = isDoc ? group && is : group || is;
        }
        whole = isDoc ? whole || group : whole && group;
    }
    return whole;
}

// A random condition as text, and what it says of the values by the plain rules of three-valued logic.
class RandomCondition {
public:
    RandomCondition(std::mt19937& random, const Values& values) : random_(random), values_(values) {}

    std::pair<std::string, Truth> make(int depth) {
        switch (depth == 0 ? 0 : random_() % 4) {
        case 0:
            return comparison();
        case 1: {
            const auto [text, truth] = make(depth - 1);
            return {"NOT (" + text + ')', static_cast<Truth>(2 - static_cast<int>(truth))};
        }
        case 2: {
            const auto a = make(depth - 1);
            const auto b = make(depth - 1);
            return {'(' + a.first + " AND " + b.first + ')', std::min(a.second, b.second)};
        }
        default: {
            const auto a = make(depth - 1);
            const auto b = make(depth - 1);
            return {'(' + a.first + " OR " + b.first + ')', std::max(a.second, b.second)};
        }
        }
    }

private:
    std::pair<std::string, Truth> comparison() {
        const auto value = std::next(values_.begin(), random_() % 4);
        const int number = static_cast<int>(random_() % 3);
        const bool isNull = value->second.state != CMPI_goodValue;
        const int is = value->second.value.sint32;
        struct Operator {
            const char* text;
            bool holds;
        };
        const Operator operators[] = {{"=", is == number},  {"<>", is != number}, {"<", is < number},
                                      {"<=", is <= number}, {">", is > number},   {">=", is >= number}};
        const Operator& chosen = operators[random_() % 6];
        return {value->first + ' ' + chosen.text + ' ' + std::to_string(number), isNull ? Truth::unknown
                                                                                 : chosen.holds ? Truth::yes
                                                                                                : Truth::no};
    }

    std::mt19937& random_;
    const Values& values_;
};

} // namespace

TEST_F(AQuery, SaysTheSameInItsNormalForms) {
    std::mt19937 random(7); // NOLINT(cert-msc51-cpp): the same conditions in every run
    int accepted = 0;
    for (int i = 0; i < 1000; ++i) {
        const Request request(broker_);
        Values values;
        CMPIInstance* const instance = instanceOf("Demo");
        for (const char* const name : {"a", "b", "c", "d"}) {
            CMPIData data = {CMPI_sint32, CMPI_goodValue, {}};
            data.state = random() % 4 == 0 ? CMPI_nullValue : CMPI_goodValue;
            data.value.sint32 = static_cast<CMPISint32>(random() % 3);
            values[name] = data;
            CMSetProperty(instance, name, data.state == CMPI_goodValue ? &data.value : nullptr, CMPI_sint32);
        }
        const auto [text, truth] = RandomCondition(random, values).make(4);
        CMPISelectExp* const query =
            CMNewSelectExp(handle_, ("SELECT * FROM Demo WHERE " + text).c_str(), "WQL", nullptr, nullptr);
        ASSERT_NE(query, nullptr) << text;
        EXPECT_EQ(CMEvaluateSelExp(query, instance, nullptr) != 0, truth == Truth::yes) << text;
        EXPECT_EQ(CMEvaluateSelExpUsingAccessor(query, valueNamed, &values, nullptr) != 0,
                  truth == Truth::yes)
            << text;
        EXPECT_EQ(isTrue(CMGetDoc(query, nullptr), values), truth == Truth::yes) << text;
        EXPECT_EQ(isTrue(CMGetCod(query, nullptr), values), truth == Truth::yes) << text;
        accepted += truth == Truth::yes ? 1 : 0;
    }
    EXPECT_TRUE(accepted > 200 && accepted < 800) << accepted;
}

TEST_F(AQuery, IsTakenApart) {
    broker_.declare(ClassDeclaration("Demo").property("Number", CMPI_uint8).property("Text", CMPI_string));
    const char* const text =
        "SELECT Number, Text FROM Demo WHERE NOT (Number < 7 OR 'x' = Text AND Text IS NULL)"
        " AND NOT Text LIKE 'a%' AND Demo ISA 'Demo' AND Number <> -1.5";
    const std::size_t live = broker_.liveObjects().total();
    CMPIArray* projection = nullptr;
    CMPISelectExp* const query = CMNewSelectExp(handle_, text, "WQL", &projection, nullptr);
    CMPIData selected = {CMPI_stringA, CMPI_goodValue, {}};
    selected.value.array = projection;
    EXPECT_EQ(oxahv::valueText(selected), "{\"Number\", \"Text\"}");
    CMPISelectExp* const copy = CMClone(query, nullptr);
    CMFreeSelectExp(handle_, query);
    EXPECT_STREQ(CMGetCharsPtr(CMGetSelExpString(copy, nullptr), nullptr), text);

    CMPISelectCond* const condition = CMClone(CMGetDoc(copy, nullptr), nullptr);
    CMRelease(copy);
    std::string parts;
    for (CMPICount i = 0; i < CMGetSubCondCountAndType(condition, nullptr, nullptr); ++i) {
        CMPISubCond* const sub = CMClone(CMGetSubCondAt(condition, i, nullptr), nullptr);
        for (CMPICount j = 0; j < CMGetPredicateCount(sub, nullptr); ++j) {
            CMPIType type = CMPI_null;
            auto operation = CMPI_PredOp_Equals;
            CMPIString* left = nullptr;
            CMPIString* right = nullptr;
            EXPECT_EQ(
                CMGetPredicateData(CMGetPredicateAt(sub, j, nullptr), &type, &operation, &left, &right).rc,
                CMPI_RC_OK);
            parts += std::string(CMGetCharsPtr(left, nullptr)) + ':' +
                     (type != CMPI_null ? oxahv::typeName(type) : "") + ' ' + std::to_string(operation) +
                     ' ' + CMGetCharsPtr(right, nullptr) + "; ";
        }
        parts += "or ";
        CMPIPredicate* const named = CMGetPredicate(sub, "TEXT", nullptr);
        EXPECT_EQ(CMGetPredicateData(named, nullptr, nullptr, nullptr, nullptr).rc, CMPI_RC_OK);
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        EXPECT_EQ(CMGetPredicate(sub, "Other", &status), nullptr);
        EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_FOUND);
        CMRelease(sub);
    }
    const std::string rest = "Text:string 10 a%; Demo:string 7 Demo; Number:uint8 2 -1.5; or ";
    EXPECT_EQ(parts, "Number:uint8 4 7; Text:string 2 x; " + rest +
                         "Number:uint8 4 7; Text:string 11 NULL; " + rest);
    CMRelease(condition);
    EXPECT_GT(broker_.liveObjects().total(), live) << "what the request has";
}

TEST_F(AQuery, WithoutAConditionIsAnEmptyConjunction) {
    CMPIArray* projection = CMNewArray(handle_, 1, CMPI_string, nullptr);
    const CMPISelectExp* const query =
        CMNewSelectExp(handle_, "SELECT * FROM Demo", "WQL", &projection, nullptr);
    EXPECT_EQ(projection, nullptr);
    EXPECT_EQ(CMGetSubCondCountAndType(CMGetDoc(query, nullptr), nullptr, nullptr), 1U);
    EXPECT_EQ(CMGetPredicateCount(CMGetSubCondAt(CMGetDoc(query, nullptr), 0, nullptr), nullptr), 0U);
    EXPECT_EQ(CMGetSubCondCountAndType(CMGetCod(query, nullptr), nullptr, nullptr), 0U);
}

TEST_F(AQuery, DoesNotExplodeInANormalForm) {
    std::string text = "SELECT * FROM Demo WHERE a = 0";
    for (int i = 0; i < 400; ++i) {
        text += " AND (a = 1 OR b = 2)";
    }
    const CMPISelectExp* const query = CMNewSelectExp(handle_, text.c_str(), "WQL", nullptr, nullptr);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    EXPECT_EQ(CMGetDoc(query, &status), nullptr);
    EXPECT_EQ(answerOf(status),
              "ERR_QUERY_FEATURE_NOT_SUPPORTED this form of the query has more than 1000 comparisons");
    EXPECT_EQ(CMGetSubCondCountAndType(CMGetCod(query, &status), nullptr, nullptr), 401U);
}

TEST_F(AQuery, SurvivesOutOfMemory) {
    const CMPIInstance* const instance = demo();
    const std::string text =
        "SELECT a FROM Demo WHERE NOT (U8 = 200 OR Text LIKE 'a long pattern%') OR a = 1";
    {
        const Request request(broker_);
        ask(text, "WQL", instance); // its values have their objects from now on
    }
    const std::size_t live = broker_.liveObjects().total();
    unsigned int failures = 0;
    for (unsigned int n = 1; n < 10000; ++n) {
        const Request request(broker_);
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        CMPIArray* projection = nullptr;
        failing::allocationsFrom(n);
        const CMPISelectExp* const query = CMNewSelectExp(handle_, text.c_str(), "WQL", &projection, &status);
        if (status.rc == CMPI_RC_OK) {
            CMGetDoc(query, &status);
        }
        if (status.rc == CMPI_RC_OK) {
            CMEvaluateSelExp(query, instance, &status);
        }
        failing::ended();
        if (failing::allocations() < n) {
            break;
        }
        ++failures;
        EXPECT_EQ(status.rc, CMPI_RC_ERROR_SYSTEM) << n;
    }
    EXPECT_GT(failures, 20U);
    EXPECT_EQ(broker_.liveObjects().total(), live);
}

namespace {

const CMPIBroker* theBroker = nullptr;

// Three instances, which another query function would have to be asked for.
CMPIStatus enumerateThree(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                          const CMPIObjectPath* path, const char**) {
    for (CMPIUint32 i = 1; i <= 3; ++i) {
        CMPIInstance* const instance = CMNewInstance(theBroker, path, nullptr);
        CMPIValue value = {};
        value.uint32 = i;
        CMSetProperty(instance, "Id", &value, CMPI_uint32);
        CMSetProperty(instance, "Size", &value, CMPI_uint32);
        CMSetProperty(instance, "Text", "x", CMPI_chars);
        CMReturnInstance(result, instance);
    }
    return CMReturnDone(result);
}

CMPIInstanceMI* createThree(const CMPIBroker* broker, const CMPIContext*, CMPIStatus*) {
    static CMPIInstanceMIFT table = {};
    static CMPIInstanceMI mi = {nullptr, &table};
    table.enumerateInstances = enumerateThree;
    theBroker = broker;
    return &mi;
}

} // namespace

TEST_F(AQuery, IsAppliedToAllInstancesWhereTheProviderDoesNone) {
    broker_.declare(ClassDeclaration("Demo")
                        .key("Id", CMPI_uint32)
                        .property("Size", CMPI_uint32)
                        .property("Text", CMPI_string));
    const CMPIObjectPath* const path = request_.objectPath("root", "Demo");
    EXPECT_EQ(request_.execQuery(path, "SELECT * FROM Demo", "WQL").code, CMPI_RC_ERR_NOT_SUPPORTED);
    broker_.host("Three", {createThree});
    const auto ask = [&](const char* query) {
        const oxahv::Reply reply = request_.execQuery(path, query, "WQL");
        std::string answer = reply.ok() ? "" : oxahv::codeName(reply.code) + ' ' + reply.message;
        for (CMPIInstance* const instance : reply.instances) {
            CMPIData data = {CMPI_instance, CMPI_goodValue, {}};
            data.value.inst = instance;
            answer += oxahv::valueText(data) + '\n';
        }
        return answer;
    };
    EXPECT_EQ(ask("SELECT Text FROM Demo WHERE Size >= 2 AND Id <> 3"),
              "instance of Demo { Id = 2; Text = \"x\"; }\n");
    EXPECT_EQ(ask("SELECT * FROM Demo WHERE Id = 1"),
              "instance of Demo { Id = 1; Size = 1; Text = \"x\"; }\n");
    EXPECT_EQ(ask("SELECT Color FROM Demo"),
              "CMPI_RC_ERR_INVALID_QUERY query, column 8: class Demo has no property Color");
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIEnumeration* const upcall = handle_->bft->execQuery(
        handle_, request_.context(), path, "SELECT * FROM Demo WHERE Size < 3", "WQL", &status);
    EXPECT_EQ(CMGetArrayCount(CMToArray(upcall, nullptr), nullptr), 2U);
}
