// The class registry, and class ancestry by the broker.
#include "BrokerTest.h"
#include "TestLocales.h"

#include "ClassTable.h"

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

void expectAsTheChain(const std::string& text) {
    // Sanitizers see the bounds of a block of just this size.
    const std::vector<char> exact(text.c_str(), text.c_str() + text.size() + 1);
    const char* const name = exact.data();
    ASSERT_EQ(ProviderUtilities::getClassId(name), chain(name, 0)) << name;
    ASSERT_EQ(ProviderUtilities::extend_getClassId(name), chain(name, 119)) << name;
}

class ClassRegistryTest : public BrokerTest {};

class AncestryTest : public BrokerTest {
protected:
    AncestryTest() {
        broker_.declare(oxahv::ClassDeclaration("CIM_Port"));
        broker_.declare(oxahv::ClassDeclaration("Demo_Port").superclass("CIM_Port"));
        broker_.declare(oxahv::ClassDeclaration("Demo_Disk"));
    }

    // Whether any of the candidates is a CIM_Port; `log_` tells how that was found.
    bool related(std::vector<std::string> candidates, const CMPIBroker* broker = nullptr) {
        bool result = false;
        broker = broker != nullptr ? broker : broker_.handle();
        log_ = logOf([&] {
            result = ProviderUtilities::areClassesRelated(broker, "root/cimv2", candidates, "CIM_Port");
        });
        return result;
    }

    // What is done for a candidate.
    std::string asked(const std::string& candidate, bool isMade = true) const {
        return creating(broker_.handle(), candidate, "root/cimv2", isMade) +
               (isMade ? "classPathIsA CIM_Port\n" : "");
    }

    std::string log_;
};

} // namespace

TEST_F(ClassRegistryTest, KnowsTheClassesOfBothTables) {
    ASSERT_EQ(TK::classCount, 133U);
    EXPECT_EQ(chain("OXATK_NICTeam", 0), 150); // as OXATK_Partition
    EXPECT_EQ(chain("OXATK_CMMEthernetSystemDevice", 119), 180);
    EXPECT_EQ(chain("OXATK_CMMLanHostedAccessPoint", 119), 255);
    for (const char* const name : {"", "OXATK_", "OXATK_Fa", " OXATK_Fan", "CIM_ComputerSystem"}) {
        expectAsTheChain(name);
    }
    EXPECT_EQ(ProviderUtilities::getClassId(static_cast<const char*>(nullptr)), 0);
    EXPECT_EQ(ProviderUtilities::extend_getClassId(nullptr), 0);
    EXPECT_TRUE(loggerCalls().empty());
}

// Callers keep class ids, so none may ever change: a sum over all rows (64 bit FNV-1a of ids and names).
TEST_F(ClassRegistryTest, NeverChangesAnId) {
    unsigned long long sum = 0xCBF29CE484222325U;
    for (const TK::ClassEntry& entry : TK::classTable) {
        for (const char c : std::to_string(entry.id) + entry.name) {
            sum = (sum ^ static_cast<unsigned char>(c)) * 0x100000001B3U;
        }
    }
    EXPECT_EQ(sum, 0xEAB88D90EA28EDCCU);
}

TEST_F(ClassRegistryTest, AnswersLikeAChainOfComparisons) {
    const std::string letters = "_aZ5-\x80\xC4\xB1";
    for (const TK::ClassEntry& entry : TK::classTable) {
        const std::string name = entry.name;
        expectAsTheChain(name);
        for (std::size_t i = 0; i <= name.size(); ++i) {
            for (const char letter : letters) {
                expectAsTheChain(std::string(name).insert(i, 1, letter));
            }
        }
        for (std::size_t i = 0; i < name.size(); ++i) {
            expectAsTheChain(std::string(name).erase(i, 1));
            for (const char letter : letters + static_cast<char>(name[i] ^ 0x20)) { // the other case
                expectAsTheChain(std::string(name).replace(i, 1, 1, letter));
            }
        }
    }
}

// In Turkish, I is the capital of a dotless i, which is the byte 0xFD, and i the small letter of a dotted I,
// which is 0xDD.
TEST_F(ClassRegistryTest, AnswersLikeAChainOfComparisonsInTurkish) {
    const ThreadLocale turkish("tr_TR.ISO-8859-9");
    if (strcasecmp("i", "\xDD") != 0) {
        GTEST_SKIP() << "a sanitizer's strcasecmp, which knows ASCII alone";
    }
    int known = 0;
    for (const TK::ClassEntry& entry : TK::classTable) {
        std::string name = entry.name;
        for (char& character : name) {
            const char before = character;
            for (const char letter : std::string("iI\xDD\xFD\x80\xC4\xE4")) {
                character = letter;
                known += chain(name.c_str(), 0) != 255 ? 1 : 0;
                expectAsTheChain(name);
            }
            character = before;
        }
    }
    EXPECT_GT(known, 100);
}

TEST_F(ClassRegistryTest, ComparesTextsIgnoringCase) {
    EXPECT_TRUE(ProviderUtilities::textEqual("aBc", "AbC"));
    EXPECT_FALSE(ProviderUtilities::textEqual("abc", "abc "));
    EXPECT_FALSE(ProviderUtilities::textEqual(nullptr, nullptr));
    EXPECT_FALSE(ProviderUtilities::textEqual(nullptr, ""));
    EXPECT_FALSE(ProviderUtilities::textEqual("", nullptr));
}

TEST_F(ClassRegistryTest, FindsTheClassOfAnObjectPath) {
    const CMPIObjectPath* const real = request_.objectPath("root/cimv2", "oxatk_Fan");
    const auto check = [&](const CMPIObjectPath* path, int id, const std::string& log) {
        EXPECT_EQ(logOf([&] { EXPECT_EQ(ProviderUtilities::getClassId(path), id); }), log);
    };
    const auto trace = [](const std::string& name) {
        return variable(providerUtilities, "getClassId", "classname", name);
    };
    check(real, 101, "getClassName\ngetCharPtr\n" + trace("oxatk_Fan"));
    check(nullptr, 0, "");
    broker_.injectFault("CMPIObjectPathFT.getClassName", nothing);
    check(real, 0, "getClassName\n" + trace("(null)"));
    broker_.injectFault("CMPIStringFT.getCharPtr", nothing);
    check(real, 0, "getClassName\ngetCharPtr\n" + trace("(null)"));

    // Characters count whatever status they come with; a name that comes with an error does not.
    Otherwise<&CMPIStringFT::getCharPtr> name(newString("OXATK_Fan"));
    Otherwise<&CMPIObjectPathFT::getClassName> path(
        real, [&](auto& result, CMPIStatus& /*status*/) { result = name.handle(); });
    check(path.handle(), 101, "getClassName\ngetCharPtr\n" + trace("OXATK_Fan"));
    Otherwise<&CMPIObjectPathFT::getClassName> unnamed(real);
    check(unnamed.handle(), 0, "getClassName\n");
}

TEST_F(AncestryTest, AsksTheBroker) {
    EXPECT_FALSE(related({}));
    EXPECT_EQ(log_, "");
    EXPECT_FALSE(related({"Demo_Disk", "Demo_Missing"}));
    EXPECT_TRUE(related({"Demo_Disk", "Demo_Port", "CIM_Port"}));
    EXPECT_EQ(log_, asked("Demo_Disk") + asked("Demo_Port")) << "no more than it takes";
    EXPECT_TRUE(ProviderUtilities::areClassesRelated(broker_.handle(), "root", "CIM_Port", "demo_port"));
    EXPECT_FALSE(ProviderUtilities::areClassesRelated(broker_.handle(), "root", "Demo_Port", "CIM_Port"));
}

TEST_F(AncestryTest, FindsNoneWhenTheBrokerFails) {
    broker_.injectFault("classPathIsA", anError);
    EXPECT_FALSE(related({"Demo_Port"}));
    // A candidate without a path does not end the list.
    broker_.injectFault("newObjectPath", anError);
    EXPECT_TRUE(related({"Demo_Disk", "Demo_Port"}));
    EXPECT_EQ(log_, asked("Demo_Disk", false) + asked("Demo_Port"));
    // An answer that comes with an error counts for nothing.
    Otherwise<&CMPIBrokerEncFT::classPathIsA> erring(broker_.handle());
    EXPECT_FALSE(related({"Demo_Port"}, erring.handle()));
}
