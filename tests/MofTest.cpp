// Classes from MOF: every construct of the language, and the errors. A fuzz target tries damaged texts.
#include "TestLocales.h"

#include "EmbeddedBroker.h"
#include "ErrorOf.h"

#include <fstream>
#include <gtest/gtest.h>
#include <iterator>
#include <sstream>

using oxahv::ClassDeclaration;
using oxahv::DeclaredValue;
using oxahv::EmbeddedBroker;

namespace {

const std::string folder = MOF_FIXTURES;

std::string errorOfText(EmbeddedBroker& broker, const std::string& text) {
    return errorOf([&] { broker.compileMofText(text, "t.mof"); });
}

struct Words {
    std::string operator()(std::monostate /*null*/) const { return "NULL"; }
    std::string operator()(bool value) const { return value ? "TRUE" : "FALSE"; }
    std::string operator()(const std::string& value) const {
        std::string text = "\"";
        for (const char c : value) { // control characters by their number
            text += static_cast<unsigned char>(c) < ' ' ? '<' + std::to_string(c) + '>' : std::string(1, c);
        }
        return text + '"';
    }
    template <class Number>
    std::string operator()(Number value) const {
        std::ostringstream text;
        text << value;
        return text.str();
    }
};

std::string wordsOf(const DeclaredValue& value) {
    std::string words;
    for (const auto& element : value.elements) {
        words += (words.empty() ? "" : " ") + std::visit(Words(), element);
    }
    return value.isNull ? "NULL" : (value.type & CMPI_ARRAY) != 0 ? '{' + words + '}' : words;
}

std::string wordsOf(CMPIType type, const std::string& referenceClass) {
    return (type & ~CMPI_ARRAY) == CMPI_ref ? referenceClass + " REF" : oxahv::typeName(type);
}

std::string wordsOf(const oxahv::Qualifiers& qualifiers) {
    std::string words;
    for (const auto& qualifier : qualifiers.list()) {
        words += ' ' + qualifier.name + ':' + oxahv::typeName(qualifier.value.type) + '=' +
                 wordsOf(qualifier.value);
        words += qualifier.isOverridable ? "" : "!";
        words += qualifier.reachesSubclass ? "" : "-";
        words += qualifier.isTranslatable ? "~" : "";
    }
    return words.empty() ? "" : " [" + words.substr(1) + ']';
}

// A class in lines: its qualifiers, `!` where they may not be overridden, `-` where they do not reach
// subclasses, `~` where they are translatable; its properties, keys with a star; its methods.
std::string describe(const EmbeddedBroker& broker, const std::string& name) {
    const auto brackets = [](CMPIType type) { return (type & CMPI_ARRAY) != 0 ? "[]" : ""; };
    std::string text = std::string(broker.isAbstract(name) ? " abstract" : "") +
                       (broker.isAssociation(name) ? " association" : "") +
                       wordsOf(broker.qualifiersOf(name)) + '\n';
    for (const auto& property : broker.propertiesOf(name)) {
        text += wordsOf(property.type, property.referenceClass) + ' ' + property.name +
                brackets(property.type) + (property.isKey ? "*" : "") +
                (property.defaultValue.type != CMPI_null ? " = " + wordsOf(property.defaultValue) : "") +
                wordsOf(property.qualifiers) + '\n';
    }
    for (const auto& method : broker.methodsOf(name)) {
        text += wordsOf(method.returnType, method.returnClass) + ' ' + method.name + "()" +
                wordsOf(method.qualifiers) + '\n';
        for (const auto& parameter : method.parameters) {
            text += std::string(" ") + (parameter.isIn ? " in" : "") + (parameter.isOut ? " out" : "") + ' ' +
                    wordsOf(parameter.type, parameter.referenceClass) + ' ' + parameter.name +
                    brackets(parameter.type) + wordsOf(parameter.qualifiers) + '\n';
        }
    }
    return text;
}

std::string contentOf(const std::string& file) {
    std::ifstream stream(file, std::ios::binary);
    return {std::istreambuf_iterator<char>(stream), {}};
}

// What a slot that asks for a qualifier answers: the value, or the code's name.
template <class Slot, class... Names>
std::string answerOf(Slot slot, const CMPIObjectPath* path, Names... names) {
    CMPIStatus status = {CMPI_RC_ERROR, nullptr};
    const CMPIData data = slot(path, names..., &status);
    return status.rc == CMPI_RC_OK ? oxahv::valueText(data) : oxahv::codeName(status.rc);
}

} // namespace

TEST(MofTest, DeclaresEveryConstruct) {
    EmbeddedBroker broker;
    broker.compileMof(folder + "/Constructs.mof");
    std::string text;
    for (const char* const name : {"Demo_Values", "Demo_Names", "Demo_Base", "Demo_All", "Demo_Derived",
                                   "Demo_Link", "Demo_LinkToo", "Demo_Event"}) {
        text += name + describe(broker, name) + '\n';
    }
    EXPECT_EQ(text, contentOf(folder + "/Constructs.txt"));
    EXPECT_TRUE(broker.isA("demo_linktoo", "Demo_Link"));
    EXPECT_FALSE(broker.isDeclared("Demo_Nowhere"));
    EXPECT_TRUE(broker.methodsOf("Demo_Nowhere").empty());
}

TEST(MofTest, ReportsErrorsWithTheirPlaces) {
    const struct {
        std::string text;
        const char* error;
    } rows[] = {
        // Words
        {"\xEF\xBB\xBF@", "1:1: this character cannot stand here"},
        {"// \u00e9\r\n/* \u00e9 */ @", "2:9: this character cannot stand here"},
        {"class A {};\n /* open", "2:2: the comment is not closed"},
        {"// A comment\r\rclass A {\r\n string B = C;\r};", "4:13: expected a value, found 'C'"},
        {"class A { string B = \"open\n};", "1:22: the text is not closed"},
        {"class A { string B = \"\\q\"; };",
         "1:23: expected b, t, n, f, r, x, a quote or a backslash after this backslash"},
        {"class A { string B = \"\\xD800\"; };", "1:23: this escape sequence stands for no character"},
        {"class A { string B = \"\\xD800\\x41\"; };", "1:23: this escape sequence stands for no character"},
        {"class A { string B = \"\\x0\"; };", "1:23: this escape sequence stands for no character"},
        {"class A { char16 B = 'ab'; };", "1:22: expected one character of 16 bits between the quotes"},
        {"class A { char16 B = '\xF0\x9F\x98\x80'; };",
         "1:22: expected one character of 16 bits between the quotes"},
        {"class A { uint8 B = 0x; };", "1:21: 0x is no number"},
        {"class A { uint8 B = 089; };", "1:21: 089 is no number"},
        {"class A { sint8 B = -; };", "1:21: - is no number"},
        {"class A { real64 B = 1.e5; };", "1:22: 1.e5 is no number"},
        {"class A { real64 B = 1.5e+; };", "1:22: 1.5e+ is no number"},
        {"class A { real64 B = 1.0e999; };", "1:22: 1.0e999 does not fit into real64"},
        {"class A { uint64 B = 18446744073709551616; };",
         "1:22: 18446744073709551616 does not fit into 64 bits"},
        // Grammar
        {"class", "1:6: expected a class name, found the end"},
        {"klass A {};", "1:1: expected 'class', 'instance', 'qualifier' or '#pragma', found 'klass'"},
        {"[Key] qualifier Q : string, scope(any);",
         "1:7: expected 'class', 'instance', 'qualifier' or '#pragma', found 'qualifier'"},
        {"class A : { };", "1:11: expected the superclass's name, found '{'"},
        {"class A as B { };", "1:12: expected an alias such as $name, found 'B'"},
        {"class A { uint33 B; };", "1:11: 'uint33' is no type, and no 'REF' follows it"},
        {"class A { string B = C; };", "1:22: expected a value, found 'C'"},
        {"class A { string B = \"a\" 5; };", "1:26: expected ';', found '5'"},
        {"class A { string \"B\"; };", "1:18: expected a name, found a text"},
        {"class A { uint8 B[0]; };", "1:19: expected a size from 1 on, found '0'"},
        {"class A { A REF B[]; };", "1:18: a reference property cannot be an array"},
        {"[] class A {};", "1:2: expected a qualifier's name, found ']'"},
        {std::string(1000000, '['), "1:2: expected a qualifier's name, found '['"},
        {"[Key :] class A {};", "1:7: expected a flavour, found ']'"},
        {"qualifier Q : string;", "1:21: expected ', scope', found ';'"},
        {"qualifier Q : A, scope(any);", "1:15: expected a type, found 'A'"},
        {"qualifier Q : string, scope(all);", "1:29: expected a scope, found 'all'"},
        {"qualifier Q : string, scope(any), flavor(bitter);", "1:42: expected a flavour, found 'bitter'"},
        {"qualifier Q : uint8 = 256, scope(any);", "1:23: 256 does not fit into uint8"},
        {"instance of A {\n { } ;", "2:2: expected a property's name, found '{'"},
        {"instance of A " + std::string(1000000, '{'), "1:16: expected a property's name, found '{'"},
        {"#progma x", "1:2: expected 'pragma', found 'progma'"},
        {"#pragma locale (\"x\"", "1:16: the parenthesis is not closed"},
        {"#pragma locale // a comment\n (\"x\") #pragma locale /* x */\n(\"x\") @",
         "3:7: this character cannot stand here"},
        {"#pragma locale\r @", "2:2: this character cannot stand here"},
        {"#pragma include (x)", "1:18: expected a file name in quotes, found 'x'"},
        // Meaning
        {"class A { uint8 B = -1; };", "1:21: -1 does not fit into uint8"},
        {"class A { sint16 B = -32769; };", "1:22: -32769 does not fit into sint16"},
        {"class A { char16 B = 65536; };", "1:22: 65536 does not fit into char16"},
        {"class A { real32 B = 1.0e39; };", "1:22: 1.0e39 does not fit into real32"},
        {"class A { boolean B = 1; };", "1:23: expected a value of type boolean"},
        {"class A { string B = 1; };", "1:22: expected a value of type string"},
        {"class A { datetime B = \"now\"; };", "1:24: expected a value of type datetime"},
        {"class A { uint8 B[] = 1; };", "1:23: expected an array in braces"},
        {"class A { uint8 B = { 1 }; };", "1:21: expected a value of type uint8"},
        {"class A { uint8 B[] = {1,\n\"x\"}; };", "2:1: expected a value of type uint8"},
        {"class Base {};", "1:7: class Base is declared already"},
        {"class A : Nowhere {};", "1:11: class A: superclass Nowhere is not declared"},
        {"class A : Base { string X;\n uint8 p[]; };",
         "2:8: class A: property p is declared as uint8 already"},
        {"class A { string P; uint8 p; };", "1:27: class A: property p stands twice"},
        {"class A : Base { string m(); };", "1:25: class A: method m is declared as uint32 already"},
        {"class A { uint8 M(); uint8 m(); };", "1:28: class A: method m stands twice"},
        {"class A { uint8 M(uint8 P, uint8 p); };", "1:34: class A: method M: parameter p stands twice"},
        {"[Key] class A {};", "1:2: qualifier Key cannot stand on a class"},
        {"[Abstract, Association] class A { [In] A REF B; };",
         "1:36: qualifier In cannot stand on a reference"},
        {"class A { [Abstract] string B; };", "1:12: qualifier Abstract cannot stand on a property"},
        {"class A { [Key] string B(); };", "1:12: qualifier Key cannot stand on a method"},
        {"class A { string B([Key] string C); };", "1:21: qualifier Key cannot stand on a parameter"},
        {"qualifier R : boolean, scope(reference); class A { [R] string B; };",
         "1:53: qualifier R cannot stand on a property"},
        {"class A { [Key, key] string B; };", "1:17: qualifier key stands twice"},
        {"class A { [Key(\"x\")] string B; };", "1:16: expected a value of type boolean"},
    };
    EmbeddedBroker broker;
    broker.declare(ClassDeclaration("Base").property("P", CMPI_uint8).method("M", CMPI_uint32));
    for (const auto& row : rows) {
        EXPECT_EQ(errorOfText(broker, row.text), std::string("t.mof:") + row.error) << row.text;
    }
    EXPECT_FALSE(broker.isDeclared("A")) << "a text with an error declares nothing";
    EXPECT_EQ(errorOfText(broker, "[Q] class A {};"), "no error") << "not even a qualifier";
}

TEST(MofTest, ReportsErrorsInIncludedFiles) {
    const ThreadLocale english("C"); // the system's words for its errors
    EmbeddedBroker broker;
    const std::pair<const char*, std::string> rows[] = {
        {"None.mof", "None.mof:1:1: cannot read " + folder + "/None.mof: No such file or directory"},
        {"sub", "sub:1:1: cannot read " + folder + "/sub: it is no regular file"},
        {"Circle.mof", "sub/Circle.mof:2:20: " + folder + "/sub/../Circle.mof includes itself"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(errorOf([&] { broker.compileMof(folder + '/' + row.first); }), folder + '/' + row.second);
    }
    const std::string text = "class A {};\n#pragma include (\"sub/\" \"Faulty.mof\")";
    EXPECT_EQ(errorOf([&] { broker.compileMofText(text, folder + "/x.mof"); }),
              folder + "/sub/Faulty.mof:3:15: 256 does not fit into uint8");
    EXPECT_FALSE(broker.hasDeclarations());
}

// Classes hold their superclasses: a chain without end would be let go of by as many calls, one in the other.
TEST(MofTest, LimitsTheDepthOfClasses) {
    std::string text = "class C0 {};\n";
    for (int i = 1; i <= 1000; ++i) {
        text += "class C" + std::to_string(i) + " : C" + std::to_string(i - 1) + " {};\n";
    }
    EmbeddedBroker broker;
    EXPECT_EQ(errorOfText(broker, text), "no error");
    EXPECT_EQ(errorOfText(broker, "class D : C1000 {};"),
              "t.mof:1:11: class D has more than 1000 superclasses");
}

TEST(MofTest, AnswersTheQualifierSlots) {
    EmbeddedBroker broker;
    oxahv::Request request(broker);
    const CMPIObjectPath* path = request.objectPath("root", "demo_derived");
    const auto ofClass = [&](const char* name) { return answerOf(path->ft->getClassQualifier, path, name); };
    const auto ofProperty = [&](const char* property, const char* name) {
        return answerOf(path->ft->getPropertyQualifier, path, property, name);
    };
    const auto ofMethod = [&](const char* method, const char* name) {
        return answerOf(path->ft->getMethodQualifier, path, method, name);
    };
    const auto ofParameter = [&](const char* parameter, const char* name) {
        return answerOf(path->ft->getParameterQualifier, path, "Change", parameter, name);
    };
    EXPECT_EQ(ofClass("Description"), "CMPI_RC_ERR_NOT_SUPPORTED");
    broker.compileMof(folder + "/Constructs.mof");
    broker.compileMofText(
        "[Numbers { 1, NULL }, Real(1.5), Flag(false), Letter('a'), None(NULL)] class Demo_Q {};", "q");
    EXPECT_EQ(ofClass("DESCRIPTION"), "\"A class with all.\"");
    EXPECT_EQ(ofClass("Abstract"), "CMPI_RC_ERR_NOT_FOUND");
    EXPECT_EQ(ofProperty("state", "Values"), "{\"None\", \"One!\", \"Vendor\"}");
    EXPECT_EQ(ofProperty("Name", "Key"), "TRUE");
    EXPECT_EQ(ofProperty("None", "Key"), "CMPI_RC_ERR_NO_SUCH_PROPERTY");
    EXPECT_EQ(ofMethod("CHANGE", "description"), "\"own\"");
    EXPECT_EQ(ofMethod("None", "Note"), "CMPI_RC_ERR_METHOD_NOT_FOUND");
    EXPECT_EQ(ofParameter("bytes", "In"), "FALSE");
    EXPECT_EQ(ofParameter("None", "In"), "CMPI_RC_ERR_INVALID_PARAMETER");
    EXPECT_EQ(ofParameter("Text", nullptr), "CMPI_RC_ERR_INVALID_PARAMETER");
    path = request.objectPath("root", "Demo_None");
    EXPECT_EQ(ofClass("Abstract"), "CMPI_RC_ERR_INVALID_CLASS");
    path = request.objectPath("root", "Demo_Q");
    EXPECT_EQ(ofClass("Numbers") + ofClass("Real") + ofClass("Flag") + ofClass("Letter") + ofClass("None"),
              "{1, NULL}1.5FALSE97NULL");
}

TEST(MofTest, DeclarationsCanBeBuiltInCode) {
    EmbeddedBroker broker;
    broker.declare(ClassDeclaration("Base").method("Stop", CMPI_uint8, {{"Hard", CMPI_boolean}}));
    ClassDeclaration demo("Demo");
    broker.declare(
        demo.superclass("Base").abstract().association().reference("End", "Base").key("Id", CMPI_uint8));
    EXPECT_EQ(describe(broker, "Demo"),
              " abstract association [Abstract:boolean=TRUE- Association:boolean=TRUE]\n"
              "Base REF End\nuint8 Id* [Key:boolean=TRUE]\nuint8 Stop()\n  in boolean Hard\n");
}

TEST(MofTest, WarnsOfWhatTheStandardForbids) {
    const std::string begin =
        "Qualifier Fixed : string, scope(any), flavor(DisableOverride);\n"
        "[Fixed(\"a\")] class Base { [Key, MaxLen(8)] string Id; [Fixed(\"a\")] uint8 Size; "
        "uint32 Do(uint8 A); };\n"
        "[Association] class Link { [Key] Base REF One; [Key] Base REF Other; };\n";
    const std::pair<const char*, const char*> rows[] = {
        {"class A { [Kye] string Id; };", "4:12: qualifier Kye is not declared"},
        {"class A { [Description(5)] string B; };", "4:24: qualifier Description is of type string"},
        {"class A { [Values] string B; };", "4:12: qualifier Values needs a value"},
        {"[MaxLen(5)] class A { };", "4:2: qualifier MaxLen is not for this kind of element"},
        {"class A { uint8 M([Read] uint8 B); };", "4:20: qualifier Read is not for this kind of element"},
        {"class A { Base REF B; };", "4:20: reference B is in a class that is no association"},
        {"[Association] class A { [Key] Base REF B; };",
         "4:21: association A has one reference, and needs two"},
        {"[Association] class A { };", "4:21: association A has no reference, and needs two"},
        {"class A : Base { [Key] string B; };", "4:31: key B is added to those of class Base"},
        {"class A : Base { [Override(\"Nothing\")] uint8 Size; };",
         "4:19: property Size overrides 'Nothing', which has another name"},
        {"class A : Base { [Override] uint8 B; };", "4:19: property B overrides what no superclass has"},
        {"class A : Base { uint8 Size; };",
         "4:24: property Size is inherited, and redeclared without the qualifier Override"},
        {"class A : Base { [Override(\"Do\")] uint32 Do(); };",
         "4:42: method Do has other parameters than the one that it overrides"},
        {"class A : Link { [Override(\"One\")] Link REF One; };",
         "4:45: reference One leads to Link, which is no Base"},
        {"[Fixed(\"b\")] class A : Base { };",
         "4:2: qualifier Fixed is declared as one that no subclass changes"},
        {"class A : Base { [Override(\"Size\"), Fixed(\"b\")] uint8 Size; };",
         "4:37: qualifier Fixed is declared as one that no subclass changes"},
        {"class A { [EmbeddedInstance(\"Base\")] uint8 B; };",
         "4:12: qualifier EmbeddedInstance is for texts, and B is a uint8"},
        {"class A { uint8 B[2] = {1, 2, 3}; };", "4:24: array B has 3 elements where it is declared with 2"},
    };
    for (const auto& [text, warning] : rows) {
        EmbeddedBroker broker;
        const auto warnings = broker.compileMofText(begin + text, "t.mof");
        ASSERT_EQ(warnings.size(), 1U) << text;
        const oxahv::MofWarning& first = warnings.front();
        EXPECT_EQ(std::to_string(first.line) + ':' + std::to_string(first.column) + ": " + first.text,
                  warning);
        EXPECT_TRUE(first.file == "t.mof" && broker.isDeclared("A")) << text;
        EmbeddedBroker strict;
        const std::string whole = begin + text;
        EXPECT_EQ(errorOf([&] { strict.compileMofText(whole, "t.mof", {true}); }),
                  std::string("t.mof:") + warning);
        EXPECT_FALSE(strict.hasDeclarations());
    }
    EmbeddedBroker broker;
    const std::string right =
        "[Fixed(\"a\"), Description(\"right\")] class A : Base { [Override(\"Size\"), Fixed(\"a\")] uint8 "
        "Size; "
        "[Override(\"Do\")] uint32 Do(uint8 a); [Override(\"Id\")] string Id; uint8 B[2] = {1, 2}; "
        "[EmbeddedInstance(\"Base\"), ValueMap{\"a\"}] string C[]; };\n"
        "class Top : A { }; [Association] class LinkToA : Link { [Override(\"One\")] Top REF One; };";
    EXPECT_TRUE(broker.compileMofText(begin + right, "t.mof", {true}).empty());
}
