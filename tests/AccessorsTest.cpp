// Scalars and texts: what the setters hand the broker, and what the getters make of each of its answers.
#include "BrokerTest.h"

#include <limits>

using TK::FrameworkException;
using TK::ProviderUtilities;

namespace {

constexpr const char* setPropertySlot = "CMPIInstanceFT.setProperty";
constexpr const char* addKeySlot = "CMPIObjectPathFT.addKey";

class Accessors : public BrokerTest {
protected:
    CMPIObjectPath* const path_ = request_.objectPath("root/cimv2", "Demo_Class");
    CMPIInstance* const instance_ = ProviderUtilities::createInstance(broker_.handle(), path_);

    // The only call of a slot that an operation makes.
    template <class Operation>
    oxahv::Call callOf(const char* slot, const Operation& operation) {
        const std::vector<oxahv::Call> calls = recorded(operation);
        EXPECT_EQ(calls.size(), 1U);
        if (calls.empty()) {
            return {};
        }
        EXPECT_EQ(calls[0].slot, slot);
        EXPECT_EQ(calls[0].name, "Name");
        return calls[0];
    }

    // The type and the value that the setters of both kinds hand over.
    template <class T, class Check>
    void checkSetters(T value, CMPIType type, const Check& check) {
        const oxahv::Call key =
            callOf(addKeySlot, [&] { ProviderUtilities::setKeyProperty(path_, "Name", value); });
        EXPECT_EQ(key.object, path_);
        EXPECT_EQ(key.type, type);
        EXPECT_TRUE(check(key.value)) << "key of type " << type;
        checkPropertySetter(value, type, check);
    }

    template <class T, class Check>
    void checkPropertySetter(T value, CMPIType type, const Check& check) {
        const oxahv::Call property =
            callOf(setPropertySlot, [&] { ProviderUtilities::setProperty(instance_, "Name", value); });
        EXPECT_EQ(property.object, instance_);
        EXPECT_EQ(property.type, type);
        EXPECT_TRUE(check(property.value)) << "property of type " << type;
    }

    void setProperty(const CMPIValue& value, CMPIType type) {
        CMSetProperty(instance_, "Name", &value, type);
    }
};

} // namespace

TEST_F(Accessors, HandEveryTypeOverWithItsCodeInItsMember) {
    checkSetters<unsigned char>(200, CMPI_uint8, [](const CMPIValue& v) { return v.uint8 == 200; });
    checkSetters<unsigned short>(60000, CMPI_uint16, [](const CMPIValue& v) { return v.uint16 == 60000; });
    checkSetters<unsigned int>(4000000000U, CMPI_uint32,
                               [](const CMPIValue& v) { return v.uint32 == 4000000000U; });
    checkSetters<unsigned long long>(~0ULL, CMPI_uint64,
                                     [](const CMPIValue& v) { return v.uint64 == ~0ULL; });
    const char* const chars = "text";
    checkSetters<const char*>(chars, CMPI_chars, [&](const CMPIValue& v) { return v.chars == chars; });
    CMPIString* const string = CMNewString(broker_.handle(), "string", nullptr);
    checkSetters<CMPIString*>(string, CMPI_string, [&](const CMPIValue& v) { return v.string == string; });
    CMPIObjectPath* const other = request_.objectPath("root/cimv2", "Demo_Other");
    checkSetters<CMPIObjectPath*>(other, CMPI_ref, [&](const CMPIValue& v) { return v.ref == other; });

    checkPropertySetter<bool>(true, CMPI_boolean, [](const CMPIValue& v) { return v.boolean == 1; });
    checkPropertySetter<bool>(false, CMPI_boolean, [](const CMPIValue& v) { return v.boolean == 0; });
    checkPropertySetter<short>(-2, CMPI_sint16, [](const CMPIValue& v) { return v.sint16 == -2; });
    checkPropertySetter<float>(1.5F, CMPI_real32, [](const CMPIValue& v) { return v.real32 == 1.5F; });
    checkPropertySetter<double>(-0.25, CMPI_real64, [](const CMPIValue& v) { return v.real64 == -0.25; });
}

TEST_F(Accessors, HandOverAStringsOwnCharacters) {
    std::string text = "a text that is longer than any short string buffer holds";
    const oxahv::Call key = callOf(addKeySlot, [&] {
        ProviderUtilities::setKeyProperty(path_, "Name", static_cast<const std::string&>(text));
    });
    EXPECT_EQ(key.type, CMPI_chars);
    EXPECT_EQ(key.value.chars, text.c_str());
    const oxahv::Call property =
        callOf(setPropertySlot, [&] { ProviderUtilities::setProperty(instance_, "Name", text); });
    EXPECT_EQ(property.type, CMPI_chars);
    EXPECT_EQ(property.value.chars, text.c_str());
}

TEST_F(Accessors, DropTheStatusOfASetter) {
    broker_.injectFault(addKeySlot, {CMPI_RC_ERR_FAILED});
    broker_.injectFault(setPropertySlot, {CMPI_RC_ERR_TYPE_MISMATCH});
    ProviderUtilities::setKeyProperty(path_, "Name", 1U);
    ProviderUtilities::setProperty(instance_, "Name", 1U);
    EXPECT_EQ(CMGetKeyCount(path_, nullptr), 0U);
    EXPECT_EQ(CMGetPropertyCount(instance_, nullptr), 0U);
}

namespace {

// A getter in every way in which it can be called and fail: `get` writes to its argument, `first` is the slot
// that it reads by.
template <class T, class Get>
void checkGetter(oxahv::EmbeddedBroker& broker, const char* slot, const T& untouched, const T& expected,
                 const Get& get) {
    T out = untouched;
    broker.startRecording();
    EXPECT_TRUE(get("Name", out)) << slot;
    const std::vector<oxahv::Call> calls = broker.stopRecording();
    EXPECT_EQ(out, expected) << slot;
    for (const oxahv::Call& call : calls) {
        EXPECT_TRUE(call.hasStatus);
        EXPECT_EQ(call.entryStatus.rc, CMPI_RC_OK);
        EXPECT_EQ(call.entryStatus.msg, nullptr);
    }
    out = untouched;
    EXPECT_FALSE(get("Missing", out)) << slot;
    EXPECT_EQ(out, untouched) << slot;
    EXPECT_FALSE(get("Null", out)) << slot;
    EXPECT_EQ(out, untouched) << slot;
    for (const CMPIrc code : {CMPI_RC_ERR_FAILED, CMPI_RC_ERR_NOT_SUPPORTED}) {
        broker.injectFault(slot, {code});
        EXPECT_FALSE(get("Name", out)) << slot;
        EXPECT_EQ(out, untouched) << slot;
    }
    broker.clearFaults();
    broker.injectFault(slot, {CMPI_RC_OK, false, CMPI_nullValue});
    EXPECT_FALSE(get("Name", out)) << slot;
    EXPECT_EQ(out, untouched) << slot;
    broker.clearFaults();
    broker.injectFault(slot, {CMPI_RC_OK, false, CMPI_keyValue | CMPI_notFound | CMPI_badValue});
    EXPECT_TRUE(get("Name", out)) << slot << ": only the NULL bit counts";
    broker.clearFaults();
}

} // namespace

TEST_F(Accessors, GetAPropertyOrLeaveTheOutputAlone) {
    constexpr const char* slot = "CMPIInstanceFT.getProperty";
    CMPIValue value = {};
    CMSetProperty(instance_, "Null", nullptr, CMPI_uint16);
    value.uint16 = 60000;
    setProperty(value, CMPI_uint16);
    checkGetter<unsigned short>(broker_, slot, 7, 60000, [&](const char* name, unsigned short& out) {
        return ProviderUtilities::getProperty(instance_, name, out);
    });
    value.uint32 = 4000000000U;
    setProperty(value, CMPI_uint32);
    checkGetter<unsigned int>(broker_, slot, 7, 4000000000U, [&](const char* name, unsigned int& out) {
        return ProviderUtilities::getProperty(instance_, name, out);
    });
    value.boolean = 2; // any nonzero byte is true
    setProperty(value, CMPI_boolean);
    checkGetter<bool>(broker_, slot, false, true, [&](const char* name, bool& out) {
        return ProviderUtilities::getProperty(instance_, name, out);
    });
    CMSetProperty(instance_, "Name", "text", CMPI_chars);
    CMPIString* const stored = CMGetProperty(instance_, "Name", nullptr).value.string;
    checkGetter<CMPIString*>(broker_, slot, nullptr, stored, [&](const char* name, CMPIString*& out) {
        return ProviderUtilities::getProperty(instance_, name, &out);
    });
}

TEST_F(Accessors, GetAnArgumentOrLeaveTheOutputAlone) {
    constexpr const char* slot = "CMPIArgsFT.getArg";
    CMPIArgs* const args = CMNewArgs(broker_.handle(), nullptr);
    CMPIValue value = {};
    CMAddArg(args, "Null", nullptr, CMPI_uint16);
    value.uint16 = 60000;
    CMAddArg(args, "Name", &value, CMPI_uint16);
    checkGetter<unsigned short>(broker_, slot, 7, 60000, [&](const char* name, unsigned short& out) {
        return ProviderUtilities::getProperty(args, name, out);
    });
    value.uint32 = 4000000000U;
    CMAddArg(args, "Name", &value, CMPI_uint32);
    checkGetter<unsigned int>(broker_, slot, 7, 4000000000U, [&](const char* name, unsigned int& out) {
        return ProviderUtilities::getProperty(args, name, out);
    });
    value.boolean = 1;
    CMAddArg(args, "Name", &value, CMPI_boolean);
    checkGetter<bool>(broker_, slot, false, true, [&](const char* name, bool& out) {
        return ProviderUtilities::getProperty(args, name, out);
    });
}

TEST_F(Accessors, GetAKeyOrLeaveTheOutputAlone) {
    constexpr const char* slot = "CMPIObjectPathFT.getKey";
    CMAddKey(path_, "Null", nullptr, CMPI_string);
    CMAddKey(path_, "Name", "text", CMPI_chars);
    CMPIString* const stored = CMGetKey(path_, "Name", nullptr).value.string;
    checkGetter<CMPIString*>(broker_, slot, nullptr, stored, [&](const char* name, CMPIString*& out) {
        return ProviderUtilities::getKeyProperty(path_, name, &out);
    });
    const auto getText = [&](const char* name, std::string& out) {
        return ProviderUtilities::getKeyProperty(path_, name, out);
    };
    checkGetter<std::string>(broker_, slot, "as it was", "text", getText);

    // The text's characters can fail as well: by an error, by no characters, by no string.
    std::string out = "as it was";
    for (const oxahv::Fault& fault : {oxahv::Fault{CMPI_RC_ERR_FAILED}, oxahv::Fault{CMPI_RC_OK, true}}) {
        broker_.injectFault("CMPIStringFT.getCharPtr", fault);
        EXPECT_FALSE(getText("Name", out));
    }
    broker_.clearFaults();
    broker_.injectFault(slot, {CMPI_RC_OK, true});
    EXPECT_FALSE(getText("Name", out));
    EXPECT_EQ(out, "as it was");

    CMPIValue value = {};
    value.ref = request_.objectPath("root/cimv2", "Demo_Other");
    CMAddKey(path_, "Name", &value, CMPI_ref);
    CMPIObjectPath* const reference = CMGetKey(path_, "Name", nullptr).value.ref;
    broker_.clearFaults();
    checkGetter<CMPIObjectPath*>(broker_, slot, nullptr, reference,
                                 [&](const char* name, CMPIObjectPath*& result) {
                                     return ProviderUtilities::getKeyProperty(path_, name, &result);
                                 });
}

TEST_F(Accessors, DoNotTakeAValueThatComesWithAnError) {
    CMPIData data = {};
    data.type = CMPI_string;
    data.value.string = CMNewString(broker_.handle(), "text", nullptr);
    Answering<CMPIInstance, CMPIInstanceFT> instance(instance_, &CMPIInstanceFT::getProperty, data,
                                                     CMPI_RC_ERR_FAILED);
    Answering<CMPIArgs, CMPIArgsFT> args(CMNewArgs(broker_.handle(), nullptr), &CMPIArgsFT::getArg, data,
                                         CMPI_RC_ERR_FAILED);
    Answering<CMPIObjectPath, CMPIObjectPathFT> path(path_, &CMPIObjectPathFT::getKey, data,
                                                     CMPI_RC_ERR_FAILED);
    unsigned short number16 = 7;
    unsigned int number32 = 7;
    bool flag = false;
    std::string text = "as it was";
    CMPIString* string = nullptr;
    CMPIObjectPath* reference = nullptr;
    EXPECT_FALSE(ProviderUtilities::getProperty(instance.handle(), "Name", number16));
    EXPECT_FALSE(ProviderUtilities::getProperty(instance.handle(), "Name", number32));
    EXPECT_FALSE(ProviderUtilities::getProperty(instance.handle(), "Name", flag));
    EXPECT_FALSE(ProviderUtilities::getProperty(instance.handle(), "Name", &string));
    EXPECT_FALSE(ProviderUtilities::getProperty(args.handle(), "Name", number16));
    EXPECT_FALSE(ProviderUtilities::getProperty(args.handle(), "Name", number32));
    EXPECT_FALSE(ProviderUtilities::getProperty(args.handle(), "Name", flag));
    EXPECT_FALSE(ProviderUtilities::getProperty(args.handle(), "Name", text));
    EXPECT_FALSE(ProviderUtilities::getKeyProperty(path.handle(), "Name", &string));
    EXPECT_FALSE(ProviderUtilities::getKeyProperty(path.handle(), "Name", &reference));
    EXPECT_FALSE(ProviderUtilities::getKeyProperty(path.handle(), "Name", text));
    EXPECT_EQ(std::tie(number16, number32, flag, text), std::make_tuple(7, 7U, false, "as it was"));
    EXPECT_EQ(string, nullptr);
    EXPECT_EQ(reference, nullptr);

    static CMPIString* name = nullptr;
    name = data.value.string;
    CMPIObjectPathFT table = *path_->ft;
    table.getClassName = [](auto* /*path*/, CMPIStatus* status) {
        *status = {CMPI_RC_ERR_FAILED, nullptr};
        return name;
    };
    table.getNameSpace = table.getClassName;
    CMPIObjectPath unnamed = *path_;
    unnamed.ft = &table;
    EXPECT_EQ(ProviderUtilities::getClassName(&unnamed), "");
    EXPECT_EQ(ProviderUtilities::getNamespace(&unnamed), "");

    StringWithAnError erring(data.value.string);
    EXPECT_EQ(failureOf([&] { ProviderUtilities::convertToString(erring.handle()); }),
              "String Conversion Failed !!");
    EXPECT_EQ(ProviderUtilities::createInstance(ErringBroker(broker_.handle()).handle(), path_), nullptr);
}

TEST_F(Accessors, ReadTheMemberAskedForWhateverTheType) {
    CMPIValue value = {};
    value.uint16 = 60000;
    setProperty(value, CMPI_uint16);
    unsigned int wide = 0;
    EXPECT_TRUE(ProviderUtilities::getProperty(instance_, "Name", wide));
    EXPECT_EQ(wide & 0xFFFFU, 60000U);
}

TEST_F(Accessors, TellTheTextsOfAnObjectPathOrNothing) {
    EXPECT_EQ(ProviderUtilities::getClassName(path_), "Demo_Class");
    EXPECT_EQ(ProviderUtilities::getNamespace(path_), "root/cimv2");
    for (const char* const slot :
         {"CMPIObjectPathFT.getClassName", "CMPIObjectPathFT.getNameSpace", "CMPIStringFT.getCharPtr"}) {
        for (const oxahv::Fault& fault :
             {oxahv::Fault{CMPI_RC_ERR_FAILED, false, 0, 1, 0}, oxahv::Fault{CMPI_RC_OK, true, 0, 1, 0}}) {
            broker_.injectFault(slot, fault);
            const bool isClassName = std::string(slot) != "CMPIObjectPathFT.getNameSpace";
            EXPECT_EQ(isClassName ? ProviderUtilities::getClassName(path_)
                                  : ProviderUtilities::getNamespace(path_),
                      "");
            broker_.clearFaults();
        }
    }
}

TEST_F(Accessors, ConvertAStringOrThrow) {
    CMPIString* const string = CMNewString(broker_.handle(), "text", nullptr);
    EXPECT_EQ(ProviderUtilities::convertToString(string), "text");
    EXPECT_EQ(failureOf([&] { ProviderUtilities::convertToString(nullptr); }), "String Conversion Failed !!");
    for (const oxahv::Fault& fault : {oxahv::Fault{CMPI_RC_ERR_FAILED}, oxahv::Fault{CMPI_RC_OK, true}}) {
        broker_.injectFault("CMPIStringFT.getCharPtr", fault);
        EXPECT_EQ(failureOf([&] { ProviderUtilities::convertToString(string); }),
                  "String Conversion Failed !!");
    }
}

TEST_F(Accessors, CreateAnInstanceOrNone) {
    EXPECT_NE(instance_, nullptr);
    broker_.injectFault("CMPIBrokerEncFT.newInstance", {CMPI_RC_ERR_INVALID_CLASS});
    EXPECT_EQ(ProviderUtilities::createInstance(broker_.handle(), path_), nullptr);
    EXPECT_TRUE(tracedTexts().empty()) << "none of these operations traces";
}
