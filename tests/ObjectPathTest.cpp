// Object paths: created, turned into monikers, and filled from monikers.
#include "BrokerTest.h"

#include <algorithm>

using TK::Moniker;
using TK::ProviderUtilities;

namespace {

std::string entering(const std::string& function, const std::string& list) {
    return entering(providerUtilities, function, list);
}

std::string exiting(const std::string& function, const std::string& list) {
    return exiting(providerUtilities, function, list);
}

std::string keyCountTrace(const std::string& name, const std::string& value) {
    return variable(providerUtilities, "getKeyCount", name, value);
}

std::string pathTrace(const std::string& name, const std::string& value) {
    return variable(providerUtilities, "createObjectPath", name, value);
}

struct Key {
    unsigned short type;
    std::string name;
    std::string value;
};

bool operator==(const Key& a, const Key& b) {
    return a.type == b.type && a.name == b.name && a.value == b.value;
}

std::ostream& operator<<(std::ostream& stream, const Key& key) {
    return stream << '{' << key.type << ", " << key.name << ", " << key.value << '}';
}

template <class Number>
std::string number(const Moniker& moniker) {
    Number value{};
    moniker.getValue(value);
    return std::to_string(value);
}

std::vector<Key> keysOf(Moniker moniker) {
    std::vector<Key> keys;
    for (unsigned int i = 0; moniker.selectKey(i); ++i) {
        Key key = {};
        moniker.getType(key.type);
        moniker.getName(key.name);
        switch (key.type) {
        case Moniker::COMPONENT_UINT8:
            key.value = number<unsigned char>(moniker);
            break;
        case Moniker::COMPONENT_UINT16:
            key.value = number<unsigned short>(moniker);
            break;
        case Moniker::COMPONENT_UINT32:
            key.value = number<unsigned int>(moniker);
            break;
        case Moniker::COMPONENT_UINT64:
            key.value = number<unsigned long long>(moniker);
            break;
        default:
            moniker.getValue(key.value);
        }
        keys.push_back(key);
    }
    return keys;
}

std::string selectedName(const Moniker& moniker) {
    std::string name;
    moniker.getName(name);
    return name;
}

const std::vector<Key> oneOfEach = {
    {0, "a", "7"}, {1, "b", "8"}, {2, "c", "9"}, {3, "d", "18446744073709551615"}, {4, "e", "te\"xt"}};

class ObjectPaths : public BrokerTest {
protected:
    CMPIObjectPath* newPath() { return request_.objectPath("root/cimv2", "Demo_Class"); }

    CMPIObjectPath* pathWithOneOfEach() {
        CMPIObjectPath* const path = newPath();
        ProviderUtilities::setKeyProperty(path, "a", static_cast<unsigned char>(7));
        ProviderUtilities::setKeyProperty(path, "b", static_cast<unsigned short>(8));
        ProviderUtilities::setKeyProperty(path, "c", 9U);
        ProviderUtilities::setKeyProperty(path, "d", 18446744073709551615ULL);
        ProviderUtilities::setKeyProperty(path, "e", "te\"xt");
        return path;
    }

    static Moniker monikerOf(const CMPIObjectPath* path) {
        Moniker moniker;
        ProviderUtilities::transformObjectPathToMoniker(path, moniker);
        return moniker;
    }
};

} // namespace

TEST_F(ObjectPaths, BecomeMonikersOfTheSameKeys) {
    CMPIObjectPath* const path = pathWithOneOfEach();
    Moniker moniker;
    ProviderUtilities::transformObjectPathToMoniker(path, moniker);
    EXPECT_EQ(keysOf(moniker), oneOfEach);
    EXPECT_EQ(selectedName(moniker), "e");
    const std::string list = " objectPath=" + address(path) + " moniker=" + address(&moniker);
    EXPECT_EQ(takeTraces(),
              std::vector<std::string>({entering("transformObjectPathToMoniker", list),
                                        keyCountTrace("keyCount", "5"), keyCountTrace("count", "5"),
                                        exiting("transformObjectPathToMoniker", list)}));
    ProviderUtilities::transformObjectPathToMoniker(path, moniker);
    EXPECT_EQ(moniker.getKeyCount(), 10U);
}

TEST_F(ObjectPaths, AreFilledFromMonikersAndComeBack) {
    Moniker moniker = monikerOf(pathWithOneOfEach());
    ASSERT_TRUE(moniker.selectKey(0));
    forgetLoggerCalls();
    CMPIObjectPath* path = newPath();
    const std::vector<oxahv::Call> calls =
        recorded([&] { ProviderUtilities::transformMonikerToObjectPath(moniker, &path); });
    EXPECT_EQ(members(calls), std::vector<std::string>(5, "addKey"));
    const std::vector<CMPIType> types = {CMPI_uint8, CMPI_uint16, CMPI_uint32, CMPI_uint64, CMPI_chars};
    for (std::size_t i = 0; i < types.size(); ++i) {
        EXPECT_EQ(calls[i].type, types[i]);
    }
    EXPECT_EQ(selectedName(moniker), "e");
    const std::string list = " moniker=" + address(&moniker) + " passedObjectPath=" + address(&path);
    EXPECT_EQ(takeTraces(), std::vector<std::string>({entering("transformMonikerToObjectPath", list),
                                                      exiting("transformMonikerToObjectPath", list)}));
    EXPECT_EQ(keysOf(monikerOf(path)), oneOfEach);
}

TEST_F(ObjectPaths, KeepTheirKeysInTheWidestTypeWhereTheServerDeliversThemSo) {
    CMPIObjectPath* const path = pathWithOneOfEach();
    broker_.setKeyMode(oxahv::KeyMode::untyped);
    std::vector<Key> widest = oneOfEach;
    for (Key& key : widest) {
        key.type = key.type < 4 ? 3 : 4;
    }
    EXPECT_EQ(keysOf(monikerOf(request_.deliver(path))), widest);

    broker_.setKeyMode(oxahv::KeyMode::chars);
    Moniker moniker;
    EXPECT_EQ(
        failureOf([&] { ProviderUtilities::transformObjectPathToMoniker(request_.deliver(path), moniker); }),
        "Moniker component for data type not available.");
    EXPECT_EQ(moniker.getKeyCount(), 4U);
}

TEST_F(ObjectPaths, WithoutKeysLeaveMonikersAsTheyAre) {
    Moniker moniker;
    moniker.addKey("x", 1U);
    moniker.addKey("y", 2U);
    ASSERT_TRUE(moniker.selectKey(0));
    const CMPIObjectPath* const path = newPath();
    ProviderUtilities::transformObjectPathToMoniker(path, moniker);
    EXPECT_EQ(selectedName(moniker), "x");
    EXPECT_EQ(moniker.getKeyCount(), 2U);
    const std::vector<std::string> texts = takeTraces();
    ASSERT_EQ(texts.size(), 4U);
    EXPECT_EQ(texts[1], keyCountTrace("keyCount", "0"));
    EXPECT_EQ(texts[2], keyCountTrace("count", "0"));

    Moniker empty;
    CMPIObjectPath* none = nullptr;
    ProviderUtilities::transformMonikerToObjectPath(empty, &none);
    EXPECT_EQ(takeTraces().size(), 2U);
    EXPECT_EQ(none, nullptr);
}

TEST_F(ObjectPaths, CountAndConvertTheKeysThatHaveAValue) {
    CMPIObjectPath* const path = newPath();
    CMAddKey(path, "null", nullptr, CMPI_string);
    ProviderUtilities::setKeyProperty(path, "a", 1U);
    CMAddKey(path, "other null", nullptr, CMPI_uint32);
    ProviderUtilities::setKeyProperty(path, "b", 2U);
    EXPECT_EQ(ProviderUtilities::getKeyCount(path), 2);
    EXPECT_EQ(takeTraces(),
              std::vector<std::string>({keyCountTrace("keyCount", "4"), keyCountTrace("count", "2")}));

    // A key that cannot be read, at one position or all the time.
    for (unsigned int position = 1; position <= 4; ++position) {
        broker_.clearFaults();
        broker_.injectFault("CMPIObjectPathFT.getKeyAt", {CMPI_RC_ERR_FAILED, false, 0, position});
        EXPECT_EQ(ProviderUtilities::getKeyCount(path), position % 2 == 0 ? 1 : 2) << position;
    }
    broker_.clearFaults();
    broker_.injectFault("CMPIObjectPathFT.getKeyAt", {CMPI_RC_ERR_FAILED, false, 0, 1, 0});
    EXPECT_EQ(ProviderUtilities::getKeyCount(path), 0);
    broker_.clearFaults();

    Moniker moniker;
    const std::vector<oxahv::Call> calls =
        recorded([&] { ProviderUtilities::transformObjectPathToMoniker(path, moniker); });
    EXPECT_EQ(keysOf(moniker), (std::vector<Key>{{2, "a", "1"}, {2, "b", "2"}}));
    EXPECT_EQ(members(calls), std::vector<std::string>({"getKeyCount", "getKeyAt", "getKeyAt", "getKeyAt",
                                                        "getKeyAt", "getKeyAt", "getKeyAt", "getCharPtr",
                                                        "getKeyAt", "getKeyAt", "getCharPtr"}));
    for (const oxahv::Call& call : calls) {
        EXPECT_EQ(call.entryStatus.rc, CMPI_RC_OK);
        EXPECT_EQ(call.entryStatus.msg, nullptr);
    }
}

namespace {

// An object path of as many keys as one likes, all of one type and with the value 0.
class PathOfEqualKeys {
public:
    PathOfEqualKeys(const CMPIObjectPath* real, CMPIString* name, CMPICount count, CMPIType type,
                    CMPIrc code = CMPI_RC_OK)
        : table_(*real->ft), path_(*real) {
        path_.ft = &table_;
        name_ = name;
        count_ = count;
        type_ = type;
        code_ = code;
        table_.getKeyCount = [](auto* /*path*/, CMPIStatus* status) {
            *status = {CMPI_RC_OK, nullptr};
            return count_;
        };
        table_.getKeyAt = [](auto* /*path*/, CMPICount /*index*/, CMPIString** keyName, CMPIStatus* status) {
            *status = {code_, nullptr};
            *keyName = name_;
            CMPIData data = {};
            data.type = type_;
            return data;
        };
    }
    const CMPIObjectPath* handle() const { return &path_; }

private:
    CMPIObjectPathFT table_;
    CMPIObjectPath path_;
    static inline CMPIString* name_;
    static inline CMPICount count_;
    static inline CMPIType type_;
    static inline CMPIrc code_;
};

} // namespace

TEST_F(ObjectPaths, CountTheirKeysModulo65536) {
    const PathOfEqualKeys path(newPath(), CMNewString(broker_.handle(), "key", nullptr), 65536 + 2,
                               CMPI_uint32);
    EXPECT_EQ(ProviderUtilities::getKeyCount(path.handle()), 2);
    EXPECT_EQ(takeTraces(),
              std::vector<std::string>({keyCountTrace("keyCount", "2"), keyCountTrace("count", "2")}));
}

TEST_F(ObjectPaths, SkipKeysThatComeWithAnError) {
    const PathOfEqualKeys path(newPath(), CMNewString(broker_.handle(), "key", nullptr), 3, CMPI_uint32,
                               CMPI_RC_ERR_FAILED);
    EXPECT_EQ(ProviderUtilities::getKeyCount(path.handle()), 0);
    EXPECT_EQ(monikerOf(path.handle()).getKeyCount(), 0U);
}

TEST_F(ObjectPaths, WithAKeyOfAnyOtherTypeThrow) {
    CMPIString* const name = CMNewString(broker_.handle(), "key", nullptr);
    const CMPIObjectPath* const real = newPath();
    for (unsigned int type = 0; type <= 0xFFFF; ++type) {
        const bool fits = type == CMPI_uint8 || type == CMPI_uint16 || type == CMPI_uint32 ||
                          type == CMPI_uint64 || type == CMPI_string;
        const PathOfEqualKeys path(real, name, 1, static_cast<CMPIType>(type));
        Moniker moniker;
        ASSERT_EQ(failureOf([&] { ProviderUtilities::transformObjectPathToMoniker(path.handle(), moniker); }),
                  !fits                 ? "Moniker component for data type not available."
                  : type == CMPI_string ? "String Conversion Failed !!" // of a null string
                                        : "no exception")
            << type;
        forgetLoggerCalls();
    }
}

TEST_F(ObjectPaths, ThatCannotCountTheirKeysThrowAfterTheTrace) {
    const CMPIObjectPath* const path = pathWithOneOfEach();
    for (const bool viaMoniker : {false, true}) {
        broker_.injectFault("CMPIObjectPathFT.getKeyCount", {CMPI_RC_ERR_FAILED});
        Moniker moniker;
        forgetLoggerCalls();
        EXPECT_EQ(failureOf([&] {
                      viaMoniker ? ProviderUtilities::transformObjectPathToMoniker(path, moniker)
                                 : static_cast<void>(ProviderUtilities::getKeyCount(path));
                  }),
                  "Could not Extract Keys from Object Path.");
        EXPECT_EQ(moniker.getKeyCount(), 0U);
        const std::vector<std::string> texts = takeTraces();
        ASSERT_EQ(texts.size(), viaMoniker ? 2U : 1U);
        EXPECT_EQ(texts.back(), keyCountTrace("keyCount", "0"));
    }
}

TEST_F(ObjectPaths, WithAKeyThatNoMonikerHoldsThrowAndKeepWhatCameBefore) {
    CMPIValue value = {};
    value.ref = newPath();
    const CMPIType types[] = {CMPI_boolean, CMPI_char16, CMPI_sint8,  CMPI_sint16, CMPI_sint32,
                              CMPI_sint64,  CMPI_real32, CMPI_real64, CMPI_ref};
    for (const CMPIType type : types) {
        CMPIObjectPath* const path = newPath();
        ProviderUtilities::setKeyProperty(path, "before", 1U);
        CMAddKey(path, "key", &value, type);
        ProviderUtilities::setKeyProperty(path, "after", 1U);
        Moniker moniker;
        forgetLoggerCalls();
        EXPECT_EQ(failureOf([&] { ProviderUtilities::transformObjectPathToMoniker(path, moniker); }),
                  "Moniker component for data type not available.")
            << type;
        EXPECT_EQ(keysOf(moniker), (std::vector<Key>{{2, "before", "1"}})) << type;
        EXPECT_EQ(tracedTexts().size(), 3U) << "no EXITING trace";
    }
}

TEST_F(ObjectPaths, WhoseTextsCannotBeReadThrow) {
    const CMPIObjectPath* const path = pathWithOneOfEach();
    for (unsigned int call = 1; call <= 6; ++call) { // five names and a text
        for (const oxahv::Fault& fault :
             {oxahv::Fault{CMPI_RC_ERR_FAILED, false, 0, call}, oxahv::Fault{CMPI_RC_OK, true, 0, call}}) {
            broker_.injectFault("CMPIStringFT.getCharPtr", fault);
            Moniker moniker;
            EXPECT_EQ(failureOf([&] { ProviderUtilities::transformObjectPathToMoniker(path, moniker); }),
                      "String Conversion Failed !!");
            EXPECT_EQ(moniker.getKeyCount(), std::min(call, 5U) - 1);
            broker_.clearFaults();
        }
    }
}

TEST_F(ObjectPaths, TakeAWhiteSpaceByteAsZero) {
    Moniker moniker;
    moniker.addKey("k", static_cast<unsigned char>(' '));
    CMPIObjectPath* path = newPath();
    ProviderUtilities::transformMonikerToObjectPath(moniker, &path);
    EXPECT_EQ(keysOf(monikerOf(path)), (std::vector<Key>{{0, "k", "0"}}));
}

TEST_F(ObjectPaths, AreCreatedWithTheirTraces) {
    CMPIObjectPath* path = nullptr;
    const std::vector<oxahv::Call> calls = recorded(
        [&] { path = ProviderUtilities::createObjectPath(broker_.handle(), "Demo_Class", "root/cimv2"); });
    ASSERT_NE(path, nullptr);
    EXPECT_EQ(oxahv::pathText(path), "root/cimv2:Demo_Class");
    EXPECT_EQ(members(calls), std::vector<std::string>({"newObjectPath", "setNameSpace"}));
    const std::string list =
        " broker=" + address(broker_.handle()) + " classname=Demo_Class nameSpace=root/cimv2";
    const std::string marker =
        pathTrace("\"ProviderUtilities::createObjectPath\"", "ProviderUtilities::createObjectPath");
    EXPECT_EQ(takeTraces(), std::vector<std::string>({entering("createObjectPath", list),
                                                      pathTrace("classname", "Demo_Class"), marker,
                                                      exiting("createObjectPath", list)}));

    EXPECT_EQ(ProviderUtilities::getNamespace(
                  ProviderUtilities::createObjectPath(broker_.handle(), "Demo_Class", "")),
              "");
    broker_.injectFault("CMPIObjectPathFT.setNameSpace", {CMPI_RC_ERR_FAILED});
    EXPECT_NE(ProviderUtilities::createObjectPath(broker_.handle(), "Demo_Class", "root"), nullptr);
}

TEST_F(ObjectPaths, ThatTheBrokerRefusesAreNull) {
    const std::string list = " broker=" + address(broker_.handle()) + " classname=Demo_Class nameSpace=root";
    for (const oxahv::Fault& fault :
         {oxahv::Fault{CMPI_RC_ERR_INVALID_CLASS}, oxahv::Fault{CMPI_RC_OK, true}}) {
        forgetLoggerCalls();
        broker_.injectFault("CMPIBrokerEncFT.newObjectPath", fault);
        EXPECT_EQ(ProviderUtilities::createObjectPath(broker_.handle(), "Demo_Class", "root"), nullptr);
        EXPECT_EQ(takeTraces(), std::vector<std::string>({entering("createObjectPath", list),
                                                          pathTrace("classname", "Demo_Class"),
                                                          exiting("createObjectPath", list)}));
    }
    const std::string ended = " broker=" + address(broker_.handle()) + " classname=";
    EXPECT_EQ(ProviderUtilities::createObjectPath(broker_.handle(), nullptr, "root"), nullptr);
    EXPECT_EQ(takeTraces(),
              std::vector<std::string>({entering("createObjectPath", ended), pathTrace("classname", "(null)"),
                                        exiting("createObjectPath", ended)}));
}
