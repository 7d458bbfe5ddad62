// The front for CIM clients without its sockets: requests in CIM-XML, and what the broker and a provider that
// keeps instances make of them.
#include "EmbeddedBroker.h"
#include "FailingMemory.h"
#include "Front.h"

#include <algorithm>
#include <gtest/gtest.h>
#include <string>
#include <vector>

extern "C" {
CMPIInstanceMI* KeptProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
CMPIAssociationMI* KeptProvider_Create_AssociationMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
CMPIMethodMI* KeptProvider_Create_MethodMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
}

namespace {

using cimxml::HttpRequest;
using cimxml::HttpResponse;

const std::string local =
    R"(<LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="cimv2"/></LOCALNAMESPACEPATH>)";

std::string parameter(const std::string& name, const std::string& content) {
    return "<IPARAMVALUE NAME=\"" + name + "\">" + content + "</IPARAMVALUE>";
}

std::string value(const std::string& name, const std::string& text) {
    return parameter(name, "<VALUE>" + text + "</VALUE>");
}

std::string list(const std::string& name, const std::vector<std::string>& texts) {
    std::string all;
    for (const std::string& text : texts) {
        all += "<VALUE>" + text + "</VALUE>";
    }
    return parameter(name, "<VALUE.ARRAY>" + all + "</VALUE.ARRAY>");
}

std::string classNamed(const std::string& name, const std::string& parameterName = "ClassName") {
    return parameter(parameterName, "<CLASSNAME NAME=\"" + name + "\"/>");
}

// An INSTANCENAME, as clients that know no types write it.
std::string thing(const std::string& id, const std::string& className = "Kept_Thing") {
    return "<INSTANCENAME CLASSNAME=\"" + className +
           "\"><KEYBINDING NAME=\"Id\"><KEYVALUE VALUETYPE=\"string\">" + id +
           "</KEYVALUE></KEYBINDING></INSTANCENAME>";
}

// The same as the server writes it.
std::string typed(std::string name) {
    const std::string type = "VALUETYPE=\"string\"";
    return name.replace(name.find(type), type.size(), type + " TYPE=\"string\"");
}

std::string instance(const std::string& properties, const std::string& className = "Kept_Thing") {
    return "<INSTANCE CLASSNAME=\"" + className + "\">" + properties + "</INSTANCE>";
}

std::string property(const std::string& name, const std::string& type, const std::string& text) {
    return "<PROPERTY NAME=\"" + name + "\" TYPE=\"" + type + "\"><VALUE>" + text + "</VALUE></PROPERTY>";
}

std::string messageWith(const std::string& requests) {
    return R"(<?xml version="1.0" encoding="utf-8"?><CIM CIMVERSION="2.0" DTDVERSION="2.0">)"
           R"(<MESSAGE ID="7" PROTOCOLVERSION="1.0">)" +
           requests + "</MESSAGE></CIM>";
}

std::string simple(const std::string& operation, const std::string& parameters,
                   const std::string& nameSpace = local) {
    return "<SIMPLEREQ><IMETHODCALL NAME=\"" + operation + "\">" + nameSpace + parameters +
           "</IMETHODCALL></SIMPLEREQ>";
}

HttpRequest requestFor(const std::string& operation, const std::string& parameters) {
    return {"POST",
            {{"Content-Type", "application/xml; charset=\"utf-8\""},
             {"cimoperation", "MethodCall"},
             {"CIMMethod", operation},
             {"CIMObject", "root%2Fcimv2"}},
            messageWith(simple(operation, parameters))};
}

HttpRequest methodRequest(const std::string& method, const std::string& object, const std::string& target,
                          const std::string& arguments) {
    return {"POST",
            {{"CIMOperation", "MethodCall"}, {"CIMMethod", method}, {"CIMObject", object}},
            messageWith("<SIMPLEREQ><METHODCALL NAME=\"" + method + "\">" + target + arguments +
                        "</METHODCALL></SIMPLEREQ>")};
}

// The content of an element: what is between its first start and its last end; all where it is not there.
std::string inside(const std::string& text, const std::string& element) {
    const std::size_t start = std::min(text.find('<' + element + ' '), text.find('<' + element + '>'));
    const std::size_t begin = text.find('>', start) + 1;
    const std::size_t end = text.rfind("</" + element + '>');
    return start == std::string::npos || end == std::string::npos ? text : text.substr(begin, end - begin);
}

class CimXmlTest : public testing::Test {
protected:
    CimXmlTest() {
        broker_.compileMof(MOF_FIXTURES "/Kept.mof");
        broker_.host("Kept", {KeptProvider_Create_InstanceMI, KeptProvider_Create_AssociationMI,
                              KeptProvider_Create_MethodMI});
    }

    // The content of the response's IRETURNVALUE; of a failure its ERROR.
    std::string ask(const std::string& operation, const std::string& parameters) {
        const HttpResponse response = front_.answer(requestFor(operation, parameters));
        EXPECT_EQ(response.status, 200) << response.body;
        return inside(inside(response.body, "IMETHODRESPONSE"), "IRETURNVALUE");
    }

    std::string create(const std::string& id, const std::string& properties = "",
                       const std::string& className = "Kept_Thing") {
        return ask("CreateInstance",
                   parameter("NewInstance", instance(property("Id", "string", id) + properties, className)));
    }

    std::string get(const std::string& id, const std::string& parameters) {
        return inside(ask("GetInstance", parameter("InstanceName", thing(id)) + parameters), "INSTANCE");
    }

    oxahv::EmbeddedBroker broker_;
    cimxml::Front front_{broker_, "root/cimv2"};
};

std::string scalar(const std::string& name, const std::string& type, const std::string& text) {
    return property(name, type, text);
}

std::string array(const std::string& name, const std::string& type, const std::string& elements) {
    return "<PROPERTY.ARRAY NAME=\"" + name + "\" TYPE=\"" + type + "\"><VALUE.ARRAY>" + elements +
           "</VALUE.ARRAY></PROPERTY.ARRAY>";
}

TEST_F(CimXmlTest, CarriesValuesOfEveryType) {
    struct Row {
        std::string name;
        std::string sent;
        std::string got{}; // the same where it is empty
    };
    const std::vector<Row> rows = {
        {"Flag", scalar("Flag", "boolean", "TRUE")},
        {"Flag", scalar("Flag", "boolean", "false"), scalar("Flag", "boolean", "FALSE")},
        {"Letter", scalar("Letter", "char16", "ü")},
        {"U8", scalar("U8", "uint8", "255")},
        {"U16", scalar("U16", "uint16", " 0xFFFF\n"), scalar("U16", "uint16", "65535")},
        {"U32", scalar("U32", "uint32", "+4294967295"), scalar("U32", "uint32", "4294967295")},
        {"U64", scalar("U64", "uint64", "18446744073709551615")},
        {"S8", scalar("S8", "sint8", "-128")},
        {"S16", scalar("S16", "sint16", "-0x8000"), scalar("S16", "sint16", "-32768")},
        {"S32", scalar("S32", "sint32", "-2147483648")},
        {"S64", scalar("S64", "sint64", "-9223372036854775808")},
        {"R32", scalar("R32", "real32", "0.1")},
        {"R64", scalar("R64", "real64", "-1e300"), scalar("R64", "real64", "-1.0e+300")},
        {"R64", scalar("R64", "real64", "-INF")},
        {"R64", scalar("R64", "real64", "NaN")},
        {"Text", scalar("Text", "string", " &lt;&amp;&gt; \"ü€😀\"&#13;\n ")},
        {"Text", scalar("Text", "string", "")},
        {"When", scalar("When", "datetime", "20260329013000.000250+060")},
        {"When", scalar("When", "datetime", "00000001020304.000000:000")},
        {"Flags", array("Flags", "boolean", "<VALUE>TRUE</VALUE><VALUE.NULL/><VALUE>FALSE</VALUE>")},
        {"Numbers", array("Numbers", "uint16", "")},
        {"Texts", array("Texts", "string", "<VALUE.NULL/><VALUE>a</VALUE><VALUE></VALUE>")},
        {"Dates", array("Dates", "datetime", "<VALUE>20260329013000.000250+060</VALUE>")},
    };
    int id = 0;
    for (const Row& row : rows) {
        const std::string name = std::to_string(++id);
        EXPECT_EQ(create(name, row.sent), typed(thing(name)));
        EXPECT_EQ(get(name, list("PropertyList", {row.name})), row.got.empty() ? row.sent : row.got);
    }
}

TEST_F(CimXmlTest, ReplacesCharactersThatXmlLacks) {
    oxahv::Request request(broker_);
    CMPIObjectPath* const path = request.objectPathFromText("Kept_Thing.Id=\"x\"", "root/cimv2");
    CMPIInstance* const wanted = CMNewInstance(broker_.handle(), path, nullptr);
    CMSetProperty(wanted, "Text",
                  "a\x01"
                  "b\xFF"
                  "c\xEF\xBF\xBE",
                  CMPI_chars);
    ASSERT_TRUE(request.createInstance(path, wanted).ok());
    const HttpResponse response = front_.answer(
        requestFor("GetInstance", parameter("InstanceName", thing("x")) + list("PropertyList", {"text"})));
    EXPECT_EQ(inside(response.body, "INSTANCE"), scalar("Text", "string", "a\uFFFDb\uFFFDc\uFFFD"));
    EXPECT_EQ(response.summary, "GetInstance (3 characters that XML does not have became U+FFFD)");
}

TEST_F(CimXmlTest, RefusesWithCodesAndReasons) {
    create("a");
    struct Row {
        std::string operation;
        std::string parameters;
        std::string error;
    };
    const std::string name = parameter("InstanceName", thing("a"));
    const auto modified = [](const std::string& content) {
        return parameter("ModifiedInstance", "<VALUE.NAMEDINSTANCE>" + content + "</VALUE.NAMEDINSTANCE>");
    };
    const std::vector<Row> rows = {
        {"GetInstance", parameter("InstanceName", thing("b")),
         "6: there is no such instance of class Kept_Thing"},
        {"GetInstance", parameter("InstanceName", thing("b", "No_Such")), "5: class No_Such is not declared"},
        {"GetInstance", "", "4: parameter InstanceName is missing"},
        {"GetInstance", classNamed("Kept_Thing", "InstanceName"),
         "4: parameter InstanceName is no INSTANCENAME"},
        {"GetInstance", name + name, "4: parameter InstanceName appears twice"},
        {"GetInstance", name + value("Odd", "x"), "4: parameter Odd is not known"},
        {"GetInstance", name + value("LocalOnly", "perhaps"),
         "4: parameter LocalOnly is neither TRUE nor FALSE"},
        {"GetInstance", name + value("PropertyList", "Id"), "4: parameter PropertyList is no VALUE.ARRAY"},
        {"GetInstance",
         parameter("InstanceName", "<INSTANCENAME CLASSNAME=\"Kept_Thing\"><KEYBINDING NAME=\"Text\">"
                                   "<KEYVALUE>x</KEYVALUE></KEYBINDING></INSTANCENAME>"),
         "4: class Kept_Thing has no key Text"},
        {"CreateInstance", parameter("NewInstance", instance(property("Id", "string", "a"))),
         "11: there is a thing a"},
        {"CreateInstance", parameter("NewInstance", instance(property("Odd", "string", "a"))),
         "4: class Kept_Thing has no property Odd"},
        {"CreateInstance", parameter("NewInstance", instance(property("U8", "uint16", "1"))),
         "13: property U8 is declared as uint8"},
        {"CreateInstance", parameter("NewInstance", instance(property("U8", "uint8", "256"))),
         "4: property U8: '256' is no uint8"},
        {"CreateInstance", parameter("NewInstance", instance(property("U8", "uint8", "-1"))),
         "4: property U8: '-1' is no uint8"},
        {"CreateInstance", parameter("NewInstance", instance(property("S8", "sint8", "0x"))),
         "4: property S8: '0x' is no sint8"},
        {"CreateInstance", parameter("NewInstance", instance(property("When", "datetime", "now"))),
         "4: property When: 'now' is no datetime"},
        {"CreateInstance", parameter("NewInstance", instance(property("Letter", "char16", "😀"))),
         "4: property Letter: '😀' is no char16"},
        {"CreateInstance", parameter("NewInstance", instance(property("Part", "string", "&lt;x"))),
         "4: property Part: no embedded instance: unclosed token in line 1, column 1"},
        {"CreateInstance", parameter("NewInstance", instance(array("Text", "string", ""))),
         "13: property Text is declared as string"},
        {"ModifyInstance", modified(thing("b") + instance("")), "6: there is no such thing"},
        {"ModifyInstance", modified(thing("a") + instance(property("Odd", "string", "x"))),
         "12: class Kept_Thing has no property Odd"},
        {"ModifyInstance", modified(thing("a") + instance("", "Kept_Part")),
         "4: an instance of class Kept_Part has the path of another class"},
        {"DeleteInstance", parameter("InstanceName", thing("b")), "6: there is no such thing"},
        {"GetProperty", name + value("PropertyName", "Odd"), "12: class Kept_Thing has no property Odd"},
        {"Associators", classNamed("Kept_Thing", "ObjectName"),
         "7: associations between classes are not supported"},
        {"ExecQuery", value("QueryLanguage", "WQL") + value("Query", "SELECT *"),
         "15: the query names no class: there is no FROM in it"},
        {"GetClass", classNamed("No_Such"), "6: class No_Such is not declared"},
        {"EnumerateClassNames", classNamed("No_Such"), "5: class No_Such is not declared"},
        {"GetQualifier", value("QualifierName", "Odd"), "6: qualifier Odd is not declared"},
        {"OpenEnumerateInstances", classNamed("Kept_Thing"),
         "7: operation OpenEnumerateInstances is not supported"},
        {"DeleteClass", classNamed("Kept_Thing"), "7: operation DeleteClass is not supported"},
    };
    for (const Row& row : rows) {
        const std::size_t colon = row.error.find(':');
        EXPECT_EQ(ask(row.operation, row.parameters), "<ERROR CODE=\"" + row.error.substr(0, colon) +
                                                          "\" DESCRIPTION=\"" + row.error.substr(colon + 2) +
                                                          "\"/>")
            << row.operation;
    }
}

TEST_F(CimXmlTest, KeepsWhatClientsCreateChangeAndDelete) {
    create("a", property("Text", "string", "old") + property("U8", "uint8", "1"));
    const std::string change = "<VALUE.NAMEDINSTANCE>" + thing("a") +
                               instance(property("Text", "string", "new") + property("U8", "uint8", "2")) +
                               "</VALUE.NAMEDINSTANCE>";
    EXPECT_EQ(ask("ModifyInstance", parameter("ModifiedInstance", change) + list("PropertyList", {"text"})),
              "");
    EXPECT_EQ(get("a", list("PropertyList", {"U8", "Text"})),
              property("U8", "uint8", "1") + property("Text", "string", "new"));

    const std::string name = parameter("InstanceName", thing("a"));
    const std::string u8 = name + value("PropertyName", "u8");
    EXPECT_EQ(ask("GetProperty", u8), "<VALUE>1</VALUE>");
    EXPECT_EQ(ask("SetProperty", u8 + value("NewValue", "3")), "");
    EXPECT_EQ(ask("GetProperty", u8), "<VALUE>3</VALUE>");
    EXPECT_EQ(ask("SetProperty", u8), "");
    EXPECT_EQ(ask("GetProperty", u8), "");
    EXPECT_EQ(ask("GetProperty", name + value("PropertyName", "R64")), "");
    EXPECT_EQ(ask("DeleteInstance", name), "");
    EXPECT_EQ(ask("EnumerateInstanceNames", classNamed("Kept_Thing")), "");
}

TEST_F(CimXmlTest, EnumeratesSubclassesToo) {
    create("a", property("Text", "string", "x"));
    create("b", property("Text", "string", "y") + property("Extra", "string", "z"), "Kept_Special");
    EXPECT_EQ(ask("EnumerateInstanceNames", classNamed("kept_thing")),
              typed(thing("a")) + typed(thing("b", "Kept_Special")));
    const std::string id = property("Id", "string", "b");
    const std::string text = property("Text", "string", "y");
    const std::string extra = property("Extra", "string", "z");
    const auto special = [&](const std::string& parameters) {
        const std::string all = ask("EnumerateInstances", classNamed("Kept_Thing") + parameters);
        return inside(all.substr(all.find("\"Kept_Special\"")), "INSTANCE");
    };
    const std::string some = list("PropertyList", {"Id", "Text", "EXTRA"});
    EXPECT_EQ(special(some), id + text + extra);
    EXPECT_EQ(special(some + value("DeepInheritance", "FALSE")), id + text);
    EXPECT_EQ(special("").find(id + "<PROPERTY NAME=\"Flag\" TYPE=\"boolean\"></PROPERTY>"), 0U);
    EXPECT_EQ(special(value("LocalOnly", "TRUE")), text + extra);
    EXPECT_EQ(special(list("PropertyList", {})), "");
    EXPECT_EQ(special(list("PropertyList", {"Id"}) + value("IncludeQualifiers", "TRUE") +
                      value("IncludeClassOrigin", "TRUE")),
              "<QUALIFIER NAME=\"Description\" TYPE=\"string\" OVERRIDABLE=\"true\" TOSUBCLASS=\"true\" "
              "TRANSLATABLE=\"true\"><VALUE>A thing &lt; \"any\" &amp; all &gt;</VALUE></QUALIFIER>"
              "<PROPERTY NAME=\"Id\" TYPE=\"string\" CLASSORIGIN=\"Kept_Thing\">"
              "<QUALIFIER NAME=\"Key\" TYPE=\"boolean\" OVERRIDABLE=\"true\" TOSUBCLASS=\"true\" "
              "TRANSLATABLE=\"false\"><VALUE>TRUE</VALUE></QUALIFIER>"
              "<QUALIFIER NAME=\"MaxLen\" TYPE=\"uint32\" OVERRIDABLE=\"true\" TOSUBCLASS=\"true\" "
              "TRANSLATABLE=\"false\"><VALUE>64</VALUE></QUALIFIER><VALUE>b</VALUE></PROPERTY>");
}

TEST_F(CimXmlTest, TraversesAssociations) {
    create("a");
    create("b", "", "Kept_Special");
    create("c");
    const auto from = [&](const std::string& operation, const std::string& parameters) {
        return ask(operation, parameter("ObjectName", thing("b", "Kept_Special")) + parameters);
    };
    const auto path = [](const std::string& name) {
        return "<OBJECTPATH><INSTANCEPATH><NAMESPACEPATH><HOST>localhost</HOST>" + local +
               "</NAMESPACEPATH>" + name + "</INSTANCEPATH></OBJECTPATH>";
    };
    const std::string a = path(typed(thing("a")));
    const std::string c = path(typed(thing("c")));
    EXPECT_EQ(from("AssociatorNames", ""), a + c);
    EXPECT_EQ(from("AssociatorNames", value("Role", "Earlier")), c);
    EXPECT_EQ(from("AssociatorNames", value("ResultRole", "Earlier")), a);
    EXPECT_EQ(from("AssociatorNames", classNamed("Kept_Link", "AssocClass")), a + c);
    EXPECT_EQ(from("AssociatorNames", classNamed("Kept_Special", "ResultClass")), "");
    EXPECT_EQ(
        inside(from("Associators", value("Role", "Earlier") + list("PropertyList", {"Id"})), "INSTANCE"),
        property("Id", "string", "c"));
    const auto reference = [](const std::string& name) {
        return "<VALUE.REFERENCE><LOCALINSTANCEPATH>" + local + name +
               "</LOCALINSTANCEPATH></VALUE.REFERENCE>";
    };
    const std::string later = reference(typed(thing("c")));
    EXPECT_EQ(from("ReferenceNames", value("Role", "Earlier")),
              path("<INSTANCENAME CLASSNAME=\"Kept_Link\"><KEYBINDING NAME=\"Earlier\">" +
                   reference(typed(thing("b", "Kept_Special"))) + "</KEYBINDING><KEYBINDING NAME=\"Later\">" +
                   later + "</KEYBINDING></INSTANCENAME>"));
    EXPECT_EQ(
        inside(from("References", value("Role", "Earlier") + list("PropertyList", {"Later"})), "INSTANCE"),
        "<PROPERTY.REFERENCE NAME=\"Later\" REFERENCECLASS=\"Kept_Thing\">" + later +
            "</PROPERTY.REFERENCE>");
}

TEST_F(CimXmlTest, CallsMethods) {
    create("a");
    const std::string object = "<LOCALINSTANCEPATH>" + local + thing("a") + "</LOCALINSTANCEPATH>";
    const std::string peer = "<VALUE.REFERENCE><LOCALINSTANCEPATH>" + local + typed(thing("p")) +
                             "</LOCALINSTANCEPATH></VALUE.REFERENCE>";
    const auto argument = [](const std::string& name, const std::string& type, const std::string& content) {
        return "<PARAMVALUE NAME=\"" + name + "\" PARAMTYPE=\"" + type + "\">" + content + "</PARAMVALUE>";
    };
    const auto plain = [&](const std::string& name, const std::string& type, const std::string& text) {
        return argument(name, type, "<VALUE>" + text + "</VALUE>");
    };
    const std::string rest =
        plain("Letter", "char16", "€") + plain("Number", "uint8", "9") + plain("Long", "sint64", "-5") +
        plain("Real", "real64", "2.5") + plain("Text", "string", "ä&lt;") +
        argument("Texts", "string", "<VALUE.ARRAY><VALUE>x</VALUE><VALUE></VALUE></VALUE.ARRAY>") +
        plain("When", "datetime", "20260329013000.000250+060") + argument("Peer", "reference", peer);
    const auto content = [&](const HttpRequest& request) {
        return inside(front_.answer(request).body, "METHODRESPONSE");
    };
    const std::string path = "root/cimv2:Kept_Thing.Id=%22a%22";
    EXPECT_EQ(content(methodRequest("Exchange", path, object, plain("Flag", "boolean", "true") + rest)),
              "<RETURNVALUE PARAMTYPE=\"uint32\"><VALUE>9</VALUE></RETURNVALUE>" +
                  plain("Flag", "boolean", "FALSE") + rest);
    // Left out and NULL arguments begin empty.
    EXPECT_EQ(content(methodRequest("Exchange", path, object, argument("Peer", "reference", "")))
                  .rfind("<RETURNVALUE PARAMTYPE=\"uint32\"><VALUE>0</VALUE></RETURNVALUE>", 0),
              0U);

    const std::string error = "<ERROR CODE=\"";
    for (const auto& [authorization, user] :
         {std::pair("", ""), std::pair("basic YW5uYTpnZWhlaW0=", "anna"), std::pair("Basic w7w=", "ü"),
          std::pair("Basic /zp4", ""), std::pair("Basic AA==", ""),
          std::pair("Bearer YW5uYTpnZWhlaW0=", "")}) {
        HttpRequest request = methodRequest("Refuse", path, object, "");
        request.headers.emplace_back("Authorization", authorization);
        EXPECT_EQ(content(request), error + "2\" DESCRIPTION=\"nöt &lt;this&gt;" + user + "\"/>")
            << authorization;
    }
    EXPECT_EQ(content(methodRequest("Odd", path, object, "")),
              error + "17\" DESCRIPTION=\"class Kept_Thing has no method Odd\"/>");
    EXPECT_EQ(content(methodRequest("Exchange", path, object, plain("Odd", "uint8", "1"))),
              error + "4\" DESCRIPTION=\"method Exchange takes no argument Odd\"/>");
    EXPECT_EQ(content(methodRequest("Exchange", path, object, plain("Number", "uint8", "x"))),
              error + "4\" DESCRIPTION=\"argument Number: 'x' is no uint8\"/>");
    const std::string text = plain("Text", "string", "1");
    EXPECT_EQ(content(methodRequest("Exchange", path, object, text + text)),
              error + "4\" DESCRIPTION=\"argument Text appears twice\"/>");
}

TEST_F(CimXmlTest, AnswersFromTheDeclaredClasses) {
    EXPECT_EQ(ask("EnumerateClassNames", ""),
              R"(<CLASSNAME NAME="Kept_Link"/><CLASSNAME NAME="Kept_Part"/><CLASSNAME NAME="Kept_Thing"/>)");
    EXPECT_EQ(ask("EnumerateClassNames", classNamed("Kept_Thing") + value("DeepInheritance", "TRUE")),
              R"(<CLASSNAME NAME="Kept_Special"/>)");
    const std::string bare = value("IncludeQualifiers", "FALSE");
    const std::string special =
        R"(<CLASS NAME="Kept_Special" SUPERCLASS="Kept_Thing"><PROPERTY NAME="Text" TYPE="string"></PROPERTY>)"
        R"(<PROPERTY NAME="Extra" TYPE="string"><VALUE>none</VALUE></PROPERTY></CLASS>)";
    EXPECT_EQ(ask("GetClass", classNamed("kept_special") + bare), special);
    EXPECT_EQ(ask("EnumerateClasses", classNamed("Kept_Thing") + bare), special);
    const std::string inherited =
        R"(<PROPERTY NAME="Text" TYPE="string" CLASSORIGIN="Kept_Thing"></PROPERTY>)"
        R"(<PROPERTY.ARRAY NAME="Numbers" TYPE="uint16" CLASSORIGIN="Kept_Thing" PROPAGATED="true">)"
        R"(<VALUE.ARRAY><VALUE>1</VALUE><VALUE>2</VALUE></VALUE.ARRAY></PROPERTY.ARRAY>)"
        R"(<PROPERTY NAME="Part" TYPE="string" CLASSORIGIN="Kept_Thing" PROPAGATED="true" )"
        R"(EmbeddedObject="instance"></PROPERTY>)"
        R"(<METHOD NAME="Exchange" TYPE="uint32" CLASSORIGIN="Kept_Thing" PROPAGATED="true"><PARAMETER )";
    const std::string origins = bare + value("LocalOnly", "FALSE") + value("IncludeClassOrigin", "TRUE") +
                                list("PropertyList", {"Numbers", "Part", "Text"});
    EXPECT_EQ(
        inside(ask("GetClass", classNamed("Kept_Special") + origins), "CLASS").substr(0, inherited.size()),
        inherited);
    EXPECT_EQ(
        inside(ask("GetClass", classNamed("Kept_Link")), "CLASS"),
        R"(<QUALIFIER NAME="Association" TYPE="boolean" OVERRIDABLE="true" TOSUBCLASS="true" )"
        R"(TRANSLATABLE="false"><VALUE>TRUE</VALUE></QUALIFIER>)"
        R"(<PROPERTY.REFERENCE NAME="Earlier" REFERENCECLASS="Kept_Thing"><QUALIFIER NAME="Key" )"
        R"(TYPE="boolean" OVERRIDABLE="true" TOSUBCLASS="true" TRANSLATABLE="false"><VALUE>TRUE</VALUE>)"
        R"(</QUALIFIER></PROPERTY.REFERENCE><PROPERTY.REFERENCE NAME="Later" )"
        R"(REFERENCECLASS="Kept_Thing"><QUALIFIER NAME="Key" TYPE="boolean" OVERRIDABLE="true" )"
        R"(TOSUBCLASS="true" TRANSLATABLE="false"><VALUE>TRUE</VALUE></QUALIFIER></PROPERTY.REFERENCE>)");
    const std::string maxLen =
        R"(<QUALIFIER.DECLARATION NAME="MaxLen" TYPE="uint32" ISARRAY="false" OVERRIDABLE="true" )"
        R"(TOSUBCLASS="true" TRANSLATABLE="false"><SCOPE PROPERTY="true" METHOD="true" PARAMETER="true"/>)"
        R"(</QUALIFIER.DECLARATION>)";
    EXPECT_EQ(ask("GetQualifier", value("QualifierName", "maxlen")), maxLen);
    EXPECT_NE(ask("EnumerateQualifiers", "").find(maxLen), std::string::npos);
}

TEST_F(CimXmlTest, AnswersEachRequestOfAMessage) {
    create("a");
    const std::string other = R"(<LOCALNAMESPACEPATH><NAMESPACE NAME="root"/></LOCALNAMESPACEPATH>)";
    const HttpRequest request = {
        "M-POST",
        {{"Man", "\"http://www.dmtf.org/cim/mapping/http/v1.0\" ; ns=73"},
         {"73-CIMOperation", "MethodCall"},
         {"73-CIMBatch", ""},
         {"Host", "here:5988"}},
        messageWith("<MULTIREQ>" + simple("EnumerateInstanceNames", classNamed("Kept_Thing")) +
                    simple("EnumerateInstanceNames", classNamed("Kept_Thing"), other) + "</MULTIREQ>")};
    const HttpResponse response = front_.answer(request);
    EXPECT_EQ(response.status, 200);
    const cimxml::Headers headers = {{"Content-Type", "application/xml; charset=\"utf-8\""},
                                     {"Cache-Control", "no-cache"},
                                     {"73-CIMOperation", "MethodResponse"},
                                     {"Ext", ""},
                                     {"Man", "http://www.dmtf.org/cim/mapping/http/v1.0; ns=73"}};
    EXPECT_EQ(response.headers, headers);
    EXPECT_EQ(
        response.body,
        "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n"
        R"(<CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="7" PROTOCOLVERSION="1.0"><MULTIRSP>)"
        R"(<SIMPLERSP><IMETHODRESPONSE NAME="EnumerateInstanceNames"><IRETURNVALUE>)" +
            typed(thing("a")) +
            R"(</IRETURNVALUE></IMETHODRESPONSE></SIMPLERSP>)"
            R"(<SIMPLERSP><IMETHODRESPONSE NAME="EnumerateInstanceNames"><ERROR CODE="3" )"
            R"(DESCRIPTION="there is no namespace root, only root/cimv2"/></IMETHODRESPONSE></SIMPLERSP>)"
            "</MULTIRSP></MESSAGE></CIM>\n");
}

TEST_F(CimXmlTest, RefusesWhatIsNoRequest) {
    struct Row {
        const char* what;
        void (*change)(HttpRequest& request);
        int status;
        std::string cimError;
    };
    static const auto set = [](HttpRequest& request, const std::string& name, const std::string& text) {
        for (auto& [header, content] : request.headers) {
            if (header == name) {
                content = text;
                return;
            }
        }
        request.headers.emplace_back(name, text);
    };
    static const auto replace = [](HttpRequest& request, const std::string& from, const std::string& to) {
        request.body.replace(request.body.find(from), from.size(), to);
    };
    const std::vector<Row> rows = {
        {"nothing", [](HttpRequest&) {}, 200, ""},
        {"GET", [](HttpRequest& r) { r.method = "GET"; }, 405, ""},
        {"M-POST without extension", [](HttpRequest& r) { r.method = "M-POST"; }, 510, ""},
        {"JSON", [](HttpRequest& r) { set(r, "Content-Type", "application/json"); }, 415, ""},
        {"Latin-1", [](HttpRequest& r) { set(r, "Content-Type", "text/xml;charset=latin1"); }, 415, ""},
        {"compressed", [](HttpRequest& r) { set(r, "Content-Encoding", "gzip"); }, 415, ""},
        {"wants HTML", [](HttpRequest& r) { set(r, "Accept", "text/html, image/*;q=0.5"); }, 406, ""},
        {"takes all", [](HttpRequest& r) { set(r, "Accept", "text/html, */*;q=0.5"); }, 200, ""},
        {"no operation", [](HttpRequest& r) { r.headers.erase(r.headers.begin() + 1); }, 400,
         "header-mismatch"},
        {"export", [](HttpRequest& r) { set(r, "cimoperation", "Export"); }, 400, "unsupported-operation"},
        {"version", [](HttpRequest& r) { set(r, "CIMProtocolVersion", "2.0"); }, 501,
         "unsupported-protocol-version"},
        {"other method", [](HttpRequest& r) { set(r, "CIMMethod", "GetClass"); }, 400, "header-mismatch"},
        {"other object", [](HttpRequest& r) { set(r, "CIMObject", "root%2Fcimv22"); }, 400,
         "header-mismatch"},
        {"batch", [](HttpRequest& r) { set(r, "CIMBatch", ""); }, 400, "header-mismatch"},
        {"no XML", [](HttpRequest& r) { r.body = "x"; }, 400, "request-not-well-formed"},
        {"no body", [](HttpRequest& r) { r.body = ""; }, 400, "request-not-well-formed"},
        {"cut", [](HttpRequest& r) { r.body.resize(r.body.size() - 9); }, 400, "request-not-well-formed"},
        {"no UTF-8", [](HttpRequest& r) { replace(r, "Kept", "K\xFFpt"); }, 400, "request-not-well-formed"},
        {"entity", [](HttpRequest& r) { replace(r, "Kept", "&k;"); }, 400, "request-not-well-formed"},
        {"attack",
         [](HttpRequest& r) {
             replace(r, "<CIM", "<!DOCTYPE CIM [<!ENTITY k SYSTEM \"file:///etc/passwd\">]><CIM");
         },
         400, "request-not-well-formed"},
        {"document type", [](HttpRequest& r) { replace(r, "<CIM", "<!DOCTYPE CIM SYSTEM \"x.dtd\"><CIM"); },
         200, ""},
        {"deep",
         [](HttpRequest& r) {
             std::string deep;
             for (int i = 0; i < 100; ++i) {
                 deep = "<VALUE>" + deep + "</VALUE>";
             }
             replace(r, "<IPARAMVALUE", deep + "<IPARAMVALUE");
         },
         400, "request-not-valid"},
        {"wide",
         [](HttpRequest& r) {
             std::string wide;
             for (int i = 0; i < 200'000; ++i) {
                 wide += "<V/>";
             }
             replace(r, "<IPARAMVALUE", wide + "<IPARAMVALUE");
         },
         400, "request-not-valid"},
        {"other root", [](HttpRequest& r) { r.body = "<CIMX/>"; }, 400, "request-not-valid"},
        {"CIM version", [](HttpRequest& r) { replace(r, "CIMVERSION=\"2.0\"", "CIMVERSION=\"3.0\""); }, 501,
         "unsupported-cim-version"},
        {"DTD version", [](HttpRequest& r) { replace(r, "DTDVERSION=\"2.0\"", "DTDVERSION=\"1.0\""); }, 501,
         "unsupported-dtd-version"},
        {"no request", [](HttpRequest& r) { replace(r, "<SIMPLEREQ>", "<X/><SIMPLEREQ2>"); }, 400,
         "request-not-well-formed"},
        {"response", [](HttpRequest& r) { r.body = messageWith("<SIMPLERSP/>"); }, 400, "request-not-valid"},
        {"no name", [](HttpRequest& r) { replace(r, "NAME=\"EnumerateInstanceNames\"", ""); }, 400,
         "request-not-valid"},
        {"indication", [](HttpRequest& r) { r.body = messageWith("<SIMPLEEXPREQ/>"); }, 501,
         "unsupported-operation"},
    };
    for (const Row& row : rows) {
        HttpRequest request = requestFor("EnumerateInstanceNames", classNamed("Kept_Thing"));
        row.change(request);
        const HttpResponse response = front_.answer(request);
        EXPECT_EQ(response.status, row.status) << row.what << ": " << response.body;
        std::string cimError;
        for (const auto& [name, text] : response.headers) {
            cimError = name == "CIMError" ? text : cimError;
        }
        EXPECT_EQ(cimError, row.cimError) << row.what;
    }
}

// Each call of the broker and each allocation of some requests fails in turn. What comes of it is an answer,
// which a client can read, or std::bad_alloc, and nothing leaks.
TEST_F(CimXmlTest, SurvivesEveryFailure) {
    create("a", array("Texts", "string", "<VALUE.NULL/><VALUE>x</VALUE>") +
                    property("When", "datetime", "20260329013000.000250+060"));
    create("b");
    const std::string object = parameter("ObjectName", thing("a"));
    const std::string path = "<LOCALINSTANCEPATH>" + local + thing("a") + "</LOCALINSTANCEPATH>";
    const std::string argument =
        "<PARAMVALUE NAME=\"Peer\"><VALUE.REFERENCE>" + thing("b") + "</VALUE.REFERENCE></PARAMVALUE>";
    const std::vector<HttpRequest> requests = {
        requestFor("EnumerateInstances", classNamed("Kept_Thing")),
        requestFor("GetProperty", parameter("InstanceName", thing("a")) + value("PropertyName", "Texts")),
        requestFor("References", object),
        requestFor("SetProperty", parameter("InstanceName", thing("a")) + value("PropertyName", "When") +
                                      value("NewValue", "20260329013000.000250+060")),
        methodRequest("Exchange", "root/cimv2:Kept_Thing", path, argument)};
    for (const HttpRequest& request : requests) { // kept objects get what is looked into
        front_.answer(request);
    }
    const std::size_t alive = broker_.liveObjects().total();
    for (const HttpRequest& request : requests) {
        broker_.startRecording();
        const std::string good = front_.answer(request).body;
        const auto calls = static_cast<unsigned int>(broker_.stopRecording().size());
        ASSERT_EQ(good.find("<ERROR"), std::string::npos) << good;
        for (unsigned int call = 1; call <= calls; ++call) {
            for (const bool yieldsNull : {false, true}) {
                broker_.injectFault("*", {yieldsNull ? CMPI_RC_OK : CMPI_RC_ERR_FAILED, yieldsNull, 0, call});
                const HttpResponse response = front_.answer(request);
                broker_.clearFaults();
                EXPECT_EQ(response.status, 200);
                EXPECT_EQ(inside(response.body, "CIM").find("<MESSAGE ID=\"7\""), 0U) << response.body;
            }
        }
        bool hasFailed = true;
        for (unsigned int n = 1; hasFailed; ++n) {
            failing::allocation(n);
            try {
                front_.answer(request);
            } catch (const std::bad_alloc&) { // NOLINT(bugprone-empty-catch): one of the two outcomes
            }
            hasFailed = failing::ended();
        }
        EXPECT_EQ(front_.answer(request).body, good);
    }
    EXPECT_EQ(broker_.liveObjects().total(), alive);
}

} // namespace
