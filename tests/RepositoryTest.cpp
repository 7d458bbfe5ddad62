// Instances that the broker keeps itself: from MOF, and as clients and providers change them.
#include "EmbeddedBroker.h"
#include "ErrorOf.h"

#include <gtest/gtest.h>

using oxahv::AssociationFilter;
using oxahv::EmbeddedBroker;
using oxahv::Reply;
using oxahv::Request;

namespace {

constexpr const char* mof = R"(
class T_Setting { [Key] string Name; uint32 Size = 7; string Note; };
class T_Special : T_Setting { string More = "much"; };
class T_Port { [Key] uint16 Number; };
[Association] class T_Uses { [Key] T_Port REF Port; [Key] T_Setting REF Setting; };
[Association] class T_Prefers : T_Uses { };
instance of T_Setting as $a { Name = "a"; Size = 1; };
instance of T_Special as $b { Name = "b"; Note = "x"; };
instance of T_Port as $p { Number = 1; };
instance of T_Uses { Port = $p; Setting = $a; };
instance of T_Prefers { Port = "T_Port.Number=1"; Setting = $b; };
)";

class ARepository : public testing::Test {
protected:
    ARepository() { broker_.compileMofText(mof, "text"); }

    CMPIObjectPath* path(const std::string& text) { return request_.objectPathFromText(text, "root"); }
    CMPIInstance* instance(const std::string& text) {
        return CMNewInstance(broker_.handle(), path(text), nullptr);
    }

    // The paths and instances of a reply in a line, or its code.
    static std::string lineOf(const Reply& reply) {
        std::string line = reply.ok() ? "" : oxahv::codeName(reply.code) + ' ';
        for (const CMPIObjectPath* const one : reply.objectPaths) {
            line += oxahv::pathText(one) + ' ';
        }
        for (const CMPIInstance* const one : reply.instances) {
            line += oxahv::pathText(CMGetObjectPath(one, nullptr)) + '{';
            for (CMPICount i = 0; i < CMGetPropertyCount(one, nullptr); ++i) {
                line += oxahv::valueText(CMGetPropertyAt(one, i, nullptr, nullptr)) + ' ';
            }
            line.back() = '}';
            line += ' ';
        }
        return line.substr(0, line.size() - (line.empty() ? 0 : 1));
    }

    EmbeddedBroker broker_;
    Request request_{broker_};
};

} // namespace

TEST_F(ARepository, ServesTheInstancesOfItsMofInEveryNamespace) {
    EXPECT_EQ(lineOf(request_.enumerateInstanceNames(path("other:T_Setting"))),
              R"(other:T_Setting.Name="a" other:T_Special.Name="b")");
    EXPECT_EQ(lineOf(request_.enumerateInstances(path("T_Setting"))),
              R"(root:T_Setting.Name="a"{"a" 1 NULL} root:T_Special.Name="b"{"b" 7 "x" "much"})");
    const std::vector<std::string> list = {"size"};
    EXPECT_EQ(lineOf(request_.getInstance(path("T_Special.Name=\"b\""), &list)),
              R"(root:T_Special.Name="b"{"b" 7})");
    EXPECT_EQ(lineOf(request_.getInstance(path("T_Setting.Name=\"b\""))), "CMPI_RC_ERR_NOT_FOUND");
    EXPECT_EQ(lineOf(request_.execQuery(path("T_Setting"), "SELECT * FROM T_Setting WHERE Size > 3", "WQL")),
              R"(root:T_Special.Name="b"{"b" 7 "x" "much"})");
}

TEST_F(ARepository, FindsAnInstanceHoweverItsKeysAreDelivered) {
    for (const auto mode : {oxahv::KeyMode::exact, oxahv::KeyMode::untyped, oxahv::KeyMode::chars,
                            oxahv::KeyMode::signedIntegers, oxahv::KeyMode::text}) {
        broker_.setKeyMode(mode);
        EXPECT_EQ(lineOf(request_.getInstance(path("T_Port.number=1"))), "root:T_Port.Number=1{1}");
        EXPECT_EQ(lineOf(request_.referenceNames(path("T_Setting.Name=\"a\""))),
                  R"(root:T_Uses.Port="T_Port.Number=1",Setting="T_Setting.Name=\"a\"")");
    }
}

TEST_F(ARepository, CreatesModifiesAndDeletes) {
    CMPIInstance* const made = instance("T_Special.Name=\"c\"");
    EXPECT_EQ(lineOf(request_.createInstance(path("T_Special"), made)), R"(root:T_Special.Name="c")");
    EXPECT_EQ(lineOf(request_.createInstance(path("T_Special"), made)), "CMPI_RC_ERR_ALREADY_EXISTS");
    EXPECT_EQ(lineOf(request_.createInstance(path("T_Special"), instance("T_Special"))),
              "CMPI_RC_ERR_INVALID_PARAMETER");
    EXPECT_EQ(lineOf(request_.getInstance(path("T_Special.Name=\"c\""))),
              R"(root:T_Special.Name="c"{"c" 7 NULL "much"})");
    EXPECT_EQ(lineOf(request_.getInstance(path("other:T_Special.Name=\"c\""))), "CMPI_RC_ERR_NOT_FOUND");
    CMSetProperty(made, "Note", "new", CMPI_chars);
    CMSetProperty(made, "More", "less", CMPI_chars);
    const std::vector<std::string> list = {"NOTE"};
    EXPECT_EQ(lineOf(request_.modifyInstance(path("T_Special.Name=\"c\""), made, &list)), "");
    EXPECT_EQ(lineOf(request_.getInstance(path("T_Special.Name=\"c\""))),
              R"(root:T_Special.Name="c"{"c" 7 "new" "much"})");
    EXPECT_EQ(lineOf(request_.deleteInstance(path("T_Special.Name=\"c\""))), "");
    EXPECT_EQ(lineOf(request_.deleteInstance(path("T_Special.Name=\"c\""))), "CMPI_RC_ERR_NOT_FOUND");
    EXPECT_EQ(lineOf(request_.deleteInstance(path("T_Setting.Name=\"a\""))), "") << "one of MOF";
    EXPECT_EQ(lineOf(request_.enumerateInstanceNames(path("T_Setting"))), R"(root:T_Special.Name="b")");
}

TEST_F(ARepository, GoesAlongItsAssociations) {
    const struct {
        AssociationFilter filter;
        const char* names;
    } cases[] = {
        {{}, R"(root:T_Setting.Name="a" root:T_Special.Name="b")"},
        {{"T_Prefers", "", "", ""}, R"(root:T_Special.Name="b")"},
        {{"", "T_Special", "", ""}, R"(root:T_Special.Name="b")"},
        {{"", "T_Port", "", ""}, ""},
        {{"T_Uses", "", "port", "setting"}, R"(root:T_Setting.Name="a" root:T_Special.Name="b")"},
        {{"", "", "Setting", ""}, ""},
        {{"", "", "", "Port"}, ""},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(lineOf(request_.associatorNames(path("T_Port.Number=1"), c.filter)), c.names);
    }
    const std::vector<std::string> list = {"Size"};
    EXPECT_EQ(lineOf(request_.associators(path("T_Port.Number=1"), {"T_Prefers", "", "", ""}, &list)),
              R"(root:T_Special.Name="b"{"b" 7})");
    EXPECT_EQ(lineOf(request_.associatorNames(path("T_Special.Name=\"b\""))), "root:T_Port.Number=1");
    EXPECT_EQ(request_.references(path("T_Port.Number=1")).instances.size(), 2U);
    EXPECT_EQ(request_.references(path("T_Port.Number=1"), {"", "T_Prefers", "", ""}).instances.size(), 1U);
    EXPECT_EQ(request_.referenceNames(path("T_Port.Number=1"), {"", "", "Setting", ""}).objectPaths.size(),
              0U);
}

TEST_F(ARepository, ServesUpcalls) {
    const CMPIBroker* const broker = broker_.handle();
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIEnumeration* const all = CBEnumInstanceNames(broker, request_.context(), path("T_Setting"), &status);
    int count = 0;
    for (; status.rc == CMPI_RC_OK && CMHasNext(all, nullptr); ++count) {
        CMGetNext(all, nullptr);
    }
    EXPECT_EQ(count, 2);
    CBCreateInstance(broker, request_.context(), path("T_Setting"), instance("T_Setting.Name=\"d\""),
                     &status);
    EXPECT_EQ(status.rc, CMPI_RC_OK);
    const CMPIInstance* const made =
        CBGetInstance(broker, request_.context(), path("T_Setting.Name=\"d\""), nullptr, &status);
    ASSERT_EQ(status.rc, CMPI_RC_OK);
    EXPECT_EQ(CMGetProperty(made, "Size", nullptr).value.uint32, 7U);
}

TEST_F(ARepository, RefusesFaultyMofAsAWhole) {
    const struct {
        const char* text;
        const char* error;
    } cases[] = {
        {"class T_New { [Key] string K; }; instance of T_New { K = \"1\"; }; instance of T_New { K = \"1\"; "
         "};",
         "text:1:78: there is an instance T_New.K=\"1\" already"},
        {"class T_New { [Key] string K; }; instance of T_New { };", "text:1:46: key K has no value"},
        {"instance of T_Uses { Port = $none; Setting = \"T_Setting.Name=\\\"a\\\"\"; };",
         "text:1:29: there is no instance $none before this one"},
        {"instance of T_Port { Number = \"x\"; };", "text:1:31: expected a value of type uint16"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(errorOf([&] { broker_.compileMofText(c.text, "text"); }), c.error);
        EXPECT_FALSE(broker_.isDeclared("T_New"));
    }
    broker_.compileMofText("class T_New { [Key] string K; }; instance of T_New { K = \"1\"; };", "text");
    EXPECT_EQ(lineOf(request_.enumerateInstanceNames(path("T_New"))), R"(root:T_New.K="1")");
}

TEST(AClass, IsKeptOnlyWhereSomebodySaysSo) {
    EmbeddedBroker broker;
    broker.compileMofText("class T_Setting { [Key] string Name; };", "text");
    Request request(broker);
    CMPIObjectPath* const path = request.objectPathFromText("T_Setting.Name=\"a\"", "root");
    const CMPIInstance* const instance = CMNewInstance(broker.handle(), path, nullptr);
    EXPECT_FALSE(request.createInstance(path, instance).isServed);
    broker.keepInstances("T_Setting");
    EXPECT_TRUE(request.createInstance(path, instance).ok());
    EXPECT_TRUE(request.getInstance(path).ok());
}
