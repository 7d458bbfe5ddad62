// The class registry, and class ancestry by the broker.
#include "BrokerTest.h"

#include "ClassTable.h"

#include <cctype>
#include <strings.h>

using TK::ProviderUtilities;

namespace {

// The plain chain of comparisons, over the rows from `first` on.
unsigned short chain(const char* name, std::size_t first) {
    for (std::size_t row = first; row < TK::classCount; ++row) {
        if (strcasecmp(name, TK::classTable[row].name) == 0) {
            return TK::classTable[row].id;
        }
    }
    return 255;
}

void expectAsTheChain(const std::string& name) {
    ASSERT_EQ(ProviderUtilities::getClassId(name.c_str()), chain(name.c_str(), 0)) << name;
    ASSERT_EQ(ProviderUtilities::extend_getClassId(name.c_str()), chain(name.c_str(), 119)) << name;
}

class ClassRegistry : public BrokerTest {};

class Ancestry : public BrokerTest {
protected:
    Ancestry() {
        broker_.declare(oxahv::ClassDeclaration("CIM_Port"));
        broker_.declare(oxahv::ClassDeclaration("CIM_NetworkPort").superclass("CIM_Port"));
        broker_.declare(oxahv::ClassDeclaration("Demo_Port").superclass("CIM_NetworkPort"));
        broker_.declare(oxahv::ClassDeclaration("Demo_Disk"));
    }

    bool related(const char* ancestor, const char* candidate) {
        return ProviderUtilities::areClassesRelated(broker_.handle(), nameSpace_, ancestor, candidate);
    }

    bool anyRelated(std::vector<std::string> candidates, const char* ancestor) {
        return ProviderUtilities::areClassesRelated(broker_.handle(), nameSpace_, candidates, ancestor);
    }

    const std::string nameSpace_ = "root/cimv2";
};

} // namespace

TEST_F(ClassRegistry, KnowsTheClassesOfBothTables) {
    ASSERT_EQ(TK::classCount, 133U);
    struct {
        const char* name;
        unsigned short id;
        unsigned short extensionId;
    } const rows[] = {
        {"OXATK_ComputerSystem", 1, 255},
        {"oxatk_computersystem", 1, 255},
        {"OXATK_COMPUTERSYSTEM", 1, 255},
        {"OXATK_CMMLanHostedAccessPoint", 179, 255},
        {"OXATK_Partition", 150, 255},
        {"OXATK_NICTeam", 150, 255},
        {"OXATK_Node", 151, 255},
        {"OXATK_SystemNICTeaming", 151, 255},
        {"OXATK_ManagementController", 152, 255},
        {"OXATK_MemberOfNICTeaming", 152, 255},
        {"OXATK_HostedAccessPoint", 7, 255},
        {"OXA_HostedAccessPoint", 214, 214},
        {"OXATK_BindsToLanEndPoint", 67, 255},
        {"OXA_BindsToLanEndPoint", 215, 215},
        {"OXATK_CMMEthernetSystemDevice", 180, 180},
        {"oxa_networkswitch", 216, 216},
        {"", 255, 255},
        {" OXATK_Fan", 255, 255},
        {"OXATK_Fan ", 255, 255},
        {"CIM_ComputerSystem", 255, 255},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(ProviderUtilities::getClassId(row.name), row.id) << row.name;
        EXPECT_EQ(ProviderUtilities::extend_getClassId(row.name), row.extensionId) << row.name;
    }
    EXPECT_EQ(ProviderUtilities::getClassId(static_cast<const char*>(nullptr)), 0);
    EXPECT_EQ(ProviderUtilities::extend_getClassId(nullptr), 0);
    EXPECT_TRUE(tracedTexts().empty());
}

// Callers keep class ids, so none may ever change: a sum over all rows (64 bit FNV-1a of ids and names).
TEST_F(ClassRegistry, KeepsItsIds) {
    unsigned long long sum = 0xCBF29CE484222325U;
    for (const TK::ClassEntry& entry : TK::classTable) {
        for (const char c : std::to_string(entry.id) + entry.name) {
            sum = (sum ^ static_cast<unsigned char>(c)) * 0x100000001B3U;
        }
    }
    EXPECT_EQ(sum, 0xEAB88D90EA28EDCCU);
}

TEST_F(ClassRegistry, AnswersAsAChainOfComparisonsForEveryEdit) {
    const std::string letters = "_aZ5-\x80\xC4\xB1";
    for (const TK::ClassEntry& entry : TK::classTable) {
        const std::string name = entry.name;
        expectAsTheChain(name);
        for (std::size_t i = 0; i <= name.size(); ++i) {
            for (const char letter : letters) {
                expectAsTheChain(std::string(name).insert(i, 1, letter));
                if (i < name.size()) {
                    expectAsTheChain(std::string(name).replace(i, 1, 1, letter));
                }
            }
            if (i < name.size()) {
                std::string flipped = name;
                flipped[i] = static_cast<char>(std::isupper(flipped[i]) != 0 ? std::tolower(flipped[i])
                                                                             : std::toupper(flipped[i]));
                expectAsTheChain(flipped);
                expectAsTheChain(std::string(name).erase(i, 1));
            }
        }
    }
}

TEST_F(ClassRegistry, ComparesTextsIgnoringCase) {
    EXPECT_TRUE(ProviderUtilities::textEqual("aBc", "AbC"));
    EXPECT_TRUE(ProviderUtilities::textEqual("", ""));
    EXPECT_FALSE(ProviderUtilities::textEqual("abc", "abc "));
    EXPECT_FALSE(ProviderUtilities::textEqual(nullptr, ""));
    EXPECT_FALSE(ProviderUtilities::textEqual("", nullptr));
    EXPECT_FALSE(ProviderUtilities::textEqual(nullptr, nullptr));
}

TEST_F(ClassRegistry, TellsTheClassOfAnObjectPath) {
    const CMPIObjectPath* const path = request_.objectPath("root/cimv2", "oxatk_Fan");
    EXPECT_EQ(ProviderUtilities::getClassId(path), 101);
    ASSERT_EQ(tracedTexts().size(), 1U);
    EXPECT_EQ(tracedTexts()[0].rfind("VARIABLE: 'classname' has Value 'oxatk_Fan' at line ", 0), 0U);
    EXPECT_EQ(loggerCalls()[0].function, "getClassId");
    EXPECT_EQ(loggerCalls()[0].category, "Hovara.ProviderUtilities");

    forgetLoggerCalls();
    EXPECT_EQ(ProviderUtilities::getClassId(static_cast<const CMPIObjectPath*>(nullptr)), 0);
    broker_.injectFault("CMPIObjectPathFT.getClassName", {CMPI_RC_ERR_FAILED});
    EXPECT_EQ(ProviderUtilities::getClassId(path), 0);
    EXPECT_TRUE(tracedTexts().empty());
}

TEST_F(ClassRegistry, SurvivesABrokerThatYieldsNoName) {
    const CMPIObjectPath* const path = request_.objectPath("root/cimv2", "OXATK_Fan");
    for (const char* const slot : {"CMPIObjectPathFT.getClassName", "CMPIStringFT.getCharPtr"}) {
        broker_.injectFault(slot, {CMPI_RC_OK, true});
        EXPECT_EQ(ProviderUtilities::getClassId(path), 0) << slot;
        EXPECT_EQ(tracedTexts().back().rfind("VARIABLE: 'classname' has Value '(null)'", 0), 0U);
    }
}

TEST_F(ClassRegistry, TakesANameThatCameWithAnError) {
    static StringWithAnError name(CMNewString(broker_.handle(), "text", nullptr));
    const CMPIObjectPath* const real = request_.objectPath("root/cimv2", "OXATK_Fan");
    CMPIObjectPathFT table = *real->ft;
    table.getClassName = [](auto* /*path*/, CMPIStatus* status) {
        *status = {CMPI_RC_OK, nullptr};
        return name.handle();
    };
    CMPIObjectPath path = *real;
    path.ft = &table;
    EXPECT_EQ(ProviderUtilities::getClassId(&path), 255); // "characters" is no class, 0 would be no name
    EXPECT_EQ(takeTraces(), std::vector<std::string>(
                                {variable(providerUtilities, "getClassId", "classname", "characters")}));
}

TEST_F(Ancestry, IsWhatTheBrokerSays) {
    EXPECT_TRUE(related("CIM_Port", "Demo_Port"));
    EXPECT_TRUE(related("cim_networkport", "DEMO_PORT"));
    EXPECT_TRUE(related("Demo_Port", "Demo_Port"));
    EXPECT_FALSE(related("Demo_Port", "CIM_Port"));
    EXPECT_FALSE(related("CIM_Port", "Demo_Disk"));
    EXPECT_FALSE(related("CIM_Port", "Demo_Missing"));
    EXPECT_TRUE(anyRelated({"Demo_Disk", "Demo_Missing", "Demo_Port"}, "CIM_Port"));
    EXPECT_FALSE(anyRelated({"Demo_Disk", "Demo_Missing"}, "CIM_Port"));
}

TEST_F(Ancestry, AsksForNoMoreCandidatesThanItTakes) {
    EXPECT_TRUE(recorded([&] { EXPECT_FALSE(anyRelated({}, "CIM_Port")); }).empty());
    const std::vector<oxahv::Call> calls = recorded([&] {
        EXPECT_TRUE(anyRelated({"Demo_Disk", "Demo_Port", "CIM_Port"}, "CIM_Port"));
    });
    EXPECT_EQ(members(calls), std::vector<std::string>({"newObjectPath", "setNameSpace", "classPathIsA",
                                                        "newObjectPath", "setNameSpace", "classPathIsA"}));
    EXPECT_EQ(calls[0].name, nameSpace_);
    EXPECT_EQ(calls[0].secondName, "Demo_Disk");
    EXPECT_EQ(calls[2].name, "CIM_Port");
}

TEST_F(Ancestry, IsNoneWhenTheBrokerFails) {
    broker_.injectFault("classPathIsA", {CMPI_RC_ERR_FAILED});
    EXPECT_FALSE(related("CIM_Port", "Demo_Port"));
    broker_.injectFault("newObjectPath", {CMPI_RC_ERR_FAILED});
    const std::vector<oxahv::Call> calls = recorded([&] { EXPECT_FALSE(related("CIM_Port", "Demo_Port")); });
    EXPECT_EQ(members(calls), std::vector<std::string>({"newObjectPath"}));
    // An answer that comes with an error counts for nothing.
    const ErringBroker noPaths(broker_.handle(), &CMPIBrokerEncFT::newObjectPath);
    const ErringBroker noAnswers(broker_.handle(), &CMPIBrokerEncFT::classPathIsA);
    for (const ErringBroker* const erring : {&noPaths, &noAnswers}) {
        EXPECT_FALSE(
            ProviderUtilities::areClassesRelated(erring->handle(), nameSpace_, "CIM_Port", "Demo_Port"));
    }
    // A candidate without a path does not end the list.
    broker_.clearFaults();
    broker_.injectFault("newObjectPath", {CMPI_RC_ERR_FAILED});
    EXPECT_TRUE(anyRelated({"CIM_Port", "Demo_Port"}, "CIM_Port"));
}
