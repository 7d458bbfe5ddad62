// Object paths: created, turned into monikers, and filled from monikers.
#include "BrokerTest.h"
#include "MonikerText.h"

using PU = TK::ProviderUtilities;
using TK::Moniker;

namespace {

const std::string chars = "getCharPtr\n";
const std::string noCount = "throws Could not Extract Keys from Object Path.\n";
const std::string noText = "throws String Conversion Failed !!\n";
const std::string noType = "throws Moniker component for data type not available.\n";

std::string counted(const std::string& keyCount, const std::string& calls, const std::string& count,
                    const char* first = "getKeyCount\n") {
    return first + variable(providerUtilities, "getKeyCount", "keyCount", keyCount) + calls +
           variable(providerUtilities, "getKeyCount", "count", count);
}

// The calls of the broker for the keys at the positions from 0 on, each with what is called behind it.
std::string keysAt(const std::vector<std::string>& behind) {
    std::string calls;
    for (std::size_t i = 0; i < behind.size(); ++i) {
        calls += "getKeyAt " + std::to_string(i) + '\n' + behind[i];
    }
    return calls;
}

// A path with as many keys as one likes.
class Counted : public Otherwise<&CMPIObjectPathFT::getKeyCount> {
public:
    Counted(const CMPIObjectPath* real, CMPICount wanted)
        : Otherwise(real, [wanted](CMPICount& count, CMPIStatus& status) {
              count = wanted;
              status = {CMPI_RC_OK, nullptr};
          }) {}
};

class ObjectPathTest : public BrokerTest {
protected:
    CMPIObjectPath* newPath() { return request_.objectPath("root/cimv2", "Demo_Class"); }

    CMPIObjectPath* pathWithOneOfEach() {
        CMPIObjectPath* const path = newPath();
        PU::setKeyProperty(path, "a", static_cast<unsigned char>(7));
        PU::setKeyProperty(path, "b", static_cast<unsigned short>(8));
        PU::setKeyProperty(path, "c", 9U);
        PU::setKeyProperty(path, "d", 18446744073709551615ULL);
        PU::setKeyProperty(path, "e", "text");
        return path;
    }

    // What turning a path into a moniker does, and the moniker's text behind it.
    std::string logOfTransforming(const CMPIObjectPath* path, Moniker moniker = Moniker()) {
        const std::string list = " objectPath=" + address(path) + " moniker=" + address(&moniker);
        std::string log = logOf([&] { PU::transformObjectPathToMoniker(path, moniker); });
        const std::string begin = entering(providerUtilities, "transformObjectPathToMoniker", list);
        const std::string end = exiting(providerUtilities, "transformObjectPathToMoniker", list);
        EXPECT_EQ(log.rfind(begin, 0), 0U);
        log.erase(0, begin.size());
        const bool isWhole = log.size() > end.size() && log.rfind(end) == log.size() - end.size();
        EXPECT_NE(isWhole, log.find("throws") != std::string::npos) << log;
        return (isWhole ? log.substr(0, log.size() - end.size()) : log) + textOf(moniker);
    }
};

const std::string oneOfEach = "a:0=7 b:1=8 c:2=9 d:3=18446744073709551615 e:4=text  > e:4=text";

} // namespace

TEST_F(ObjectPathTest, ConvertsToMonikersAndBack) {
    const CMPIObjectPath* const path = pathWithOneOfEach();
    const std::string log = counted("5", keysAt(std::vector<std::string>(5)), "5") +
                            keysAt({chars, chars, chars, chars, chars + chars});
    EXPECT_EQ(logOfTransforming(path), log + oneOfEach);

    Moniker moniker;
    PU::transformObjectPathToMoniker(path, moniker);
    EXPECT_EQ(logOfTransforming(path, moniker), log + oneOfEach.substr(0, oneOfEach.find(" > ")) + oneOfEach);
    ASSERT_TRUE(moniker.selectKey(0));
    CMPIObjectPath* again = newPath();
    const std::string list = " moniker=" + address(&moniker) + " passedObjectPath=" + address(&again);
    EXPECT_EQ(logOf([&] { PU::transformMonikerToObjectPath(moniker, &again); }),
              entering(providerUtilities, "transformMonikerToObjectPath", list) +
                  "addKey a uint8 = 7\naddKey b uint16 = 8\naddKey c uint32 = 9\n"
                  "addKey d uint64 = 18446744073709551615\naddKey e chars\n" +
                  exiting(providerUtilities, "transformMonikerToObjectPath", list));
    EXPECT_EQ(textOf(moniker), oneOfEach) << "the last key is selected";
    EXPECT_EQ(logOfTransforming(again), log + oneOfEach);
}

TEST_F(ObjectPathTest, KeepsTheWidestTypeOfDeliveredKeys) {
    broker_.setKeyMode(oxahv::KeyMode::untyped);
    Moniker moniker;
    PU::transformObjectPathToMoniker(request_.deliver(pathWithOneOfEach()), moniker);
    EXPECT_EQ(textOf(moniker), "a:3=7 b:3=8 c:3=9 d:3=18446744073709551615 e:4=text  > e:4=text");
    broker_.setKeyMode(oxahv::KeyMode::chars);
    const std::string log = logOfTransforming(request_.deliver(pathWithOneOfEach()));
    EXPECT_NE(log.find(noType + "a:0=7 b:1=8 c:2=9 d:3=18446744073709551615  > d:3="), std::string::npos)
        << log;
}

TEST_F(ObjectPathTest, WithoutKeysChangesNoMoniker) {
    Moniker moniker;
    moniker.addKey("x", 1U);
    moniker.addKey("y", 2U);
    ASSERT_TRUE(moniker.selectKey(0));
    EXPECT_EQ(logOfTransforming(newPath(), moniker), counted("0", "", "0") + "x:2=1 y:2=2  > x:2=1");
    Moniker empty;
    CMPIObjectPath* none = nullptr;
    PU::transformMonikerToObjectPath(empty, &none); // touches neither
}

TEST_F(ObjectPathTest, HasOneKeyPerName) {
    Moniker moniker;
    moniker.addKey("name", 1U);
    moniker.addKey("NAME", 2U);
    CMPIObjectPath* path = newPath();
    PU::transformMonikerToObjectPath(moniker, &path);
    Moniker again;
    PU::transformObjectPathToMoniker(path, again);
    EXPECT_EQ(moniker.getKeyCount(), 2U);
    EXPECT_EQ(textOf(again), "name:2=2  > name:2=2");
}

TEST_F(ObjectPathTest, CountsKeysThatHaveAValue) {
    CMPIObjectPath* const path = newPath();
    CMAddKey(path, "null", nullptr, CMPI_string);
    PU::setKeyProperty(path, "a", 1U);
    CMAddKey(path, "other null", nullptr, CMPI_uint32);
    PU::setKeyProperty(path, "b", 2U);
    const std::string keys = keysAt({"", "", "", ""});
    EXPECT_EQ(logOfTransforming(path),
              counted("4", keys, "2") + keysAt({"", chars, "", chars}) + "a:2=1 b:2=2  > b:2=2");
    // A key that cannot be read counts as none, whatever comes with the error.
    for (const unsigned int position : {1U, 2U}) { // which has no value, and which has one
        const int count = position == 1 ? 2 : 1;
        EXPECT_EQ(logOf([&] { EXPECT_EQ(PU::getKeyCount(path), count); }, "CMPIObjectPathFT.getKeyAt",
                        {CMPI_RC_ERR_FAILED, false, 0, position}),
                  counted("4", keys, std::to_string(count)));
    }
    Otherwise<&CMPIObjectPathFT::getKeyAt> erring(path);
    EXPECT_EQ(logOfTransforming(Counted(erring.handle(), 4).handle()),
              counted("4", keys, "0", "") + " > Key is not selected.");
}

TEST_F(ObjectPathTest, CountsKeysModulo65536) {
    Otherwise<&CMPIObjectPathFT::getKeyAt> path(pathWithOneOfEach(), [](auto&, auto&) {});
    Counted many(path.handle(), 65536 + 2);
    EXPECT_EQ(logOf([&] { EXPECT_EQ(PU::getKeyCount(many.handle()), 2); }),
              counted("2", keysAt({"", ""}), "2", ""));
}

TEST_F(ObjectPathTest, ConversionThrowsAtAKeyOfAnotherType) {
    CMPIObjectPath* const real = newPath();
    PU::setKeyProperty(real, "before", 1U);
    PU::setKeyProperty(real, "key", 2U);
    int call = 0;
    unsigned int type = 0;
    Otherwise<&CMPIObjectPathFT::getKeyAt> path(real, [&](CMPIData& data, CMPIStatus& /*status*/) {
        if (++call == 4) { // of two to count and two to convert
            data = {};
            data.type = static_cast<CMPIType>(type);
        }
    });
    Counted two(path.handle(), 2);
    for (; type <= 0xFFFF; ++type, call = 0) {
        const bool isNumber =
            type == CMPI_uint8 || type == CMPI_uint16 || type == CMPI_uint32 || type == CMPI_uint64;
        Moniker moniker;
        std::string failure;
        try {
            PU::transformObjectPathToMoniker(two.handle(), moniker);
        } catch (const TK::FrameworkException& exception) {
            failure = std::string("throws ") + exception.what() + '\n';
        }
        ASSERT_EQ(failure, isNumber ? "" : type == CMPI_string ? noText : noType) << type;
        ASSERT_EQ(textOf(moniker).rfind(isNumber ? "before:2=1 key:" : "before:2=1  >", 0), 0U) << type;
        takeTraces();
    }
}

TEST_F(ObjectPathTest, KeyCountThrowsAfterTheTrace) {
    const CMPIObjectPath* const path = pathWithOneOfEach();
    const std::string log =
        "getKeyCount\n" + variable(providerUtilities, "getKeyCount", "keyCount", "0") + noCount;
    EXPECT_EQ(logOf([&] { PU::getKeyCount(path); }, "CMPIObjectPathFT.getKeyCount", anError), log);
    broker_.injectFault("CMPIObjectPathFT.getKeyCount", anError);
    EXPECT_EQ(logOfTransforming(path), log + " > Key is not selected.");
    // The error counts after the keys, where a count comes with it.
    Otherwise<&CMPIObjectPathFT::getKeyAt> keys(path, [](auto&, auto&) {});
    Otherwise<&CMPIObjectPathFT::getKeyCount> erring(keys.handle(), [](CMPICount& count, CMPIStatus& status) {
        count = 2;
        status = {CMPI_RC_ERR_FAILED, nullptr};
    });
    EXPECT_EQ(logOf([&] { PU::getKeyCount(erring.handle()); }),
              variable(providerUtilities, "getKeyCount", "keyCount", "2") + keysAt({"", ""}) + noCount);
}

TEST_F(ObjectPathTest, ConversionThrowsAtAnUnreadableText) {
    const CMPIObjectPath* const path = pathWithOneOfEach();
    for (oxahv::Fault fault : {anError, nothing}) {
        for (fault.firstCall = 1; fault.firstCall <= 6; ++fault.firstCall) { // five names and a text
            broker_.injectFault("CMPIStringFT.getCharPtr", fault);
            const std::string log = logOfTransforming(path);
            const std::string keys = log.substr(log.rfind('\n') + 1);
            EXPECT_EQ(std::count(keys.begin(), keys.end(), '=') - (fault.firstCall > 1 ? 1 : 0),
                      std::min(fault.firstCall, 5U) - 1)
                << log;
            EXPECT_NE(log.find(noText), std::string::npos);
        }
    }
}

TEST_F(ObjectPathTest, ReadsAWhiteSpaceByteAsZero) {
    Moniker moniker;
    moniker.addKey("k", static_cast<unsigned char>(' '));
    CMPIObjectPath* path = newPath();
    PU::transformMonikerToObjectPath(moniker, &path);
    EXPECT_EQ(oxahv::pathText(path), "root/cimv2:Demo_Class.k=0");
}

TEST_F(ObjectPathTest, CreatesPathsUnlessTheBrokerRefuses) {
    const auto expect = [this](const CMPIBroker* broker, bool isMade) {
        const auto create = [&] {
            EXPECT_EQ(PU::createObjectPath(broker, "Demo_Class", "root") != nullptr, isMade);
        };
        EXPECT_EQ(logOf(create), creating(broker, "Demo_Class", "root", isMade));
    };
    const CMPIBroker* const broker = broker_.handle();
    expect(broker, true);
    broker_.injectFault("CMPIObjectPathFT.setNameSpace", anError);
    expect(broker, true);
    for (const oxahv::Fault& fault : {anError, nothing}) {
        broker_.injectFault("CMPIBrokerEncFT.newObjectPath", fault);
        expect(broker, false);
    }
    Otherwise<&CMPIBrokerEncFT::newObjectPath> erring(broker);
    expect(erring.handle(), false);
    EXPECT_EQ(PU::createObjectPath(broker, nullptr, "root"), nullptr);
    EXPECT_EQ(oxahv::pathText(PU::createObjectPath(broker, "Demo_Class", "")), "Demo_Class");
}
