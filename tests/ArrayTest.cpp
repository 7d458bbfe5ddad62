// Arrays: every element with every fault at every place.
#include "BrokerTest.h"
#include "TestLocales.h"

using PU = TK::ProviderUtilities;

namespace {

using Strings = std::vector<std::string>;

class ArrayTest : public BrokerTest {
protected:
    const ThreadLocale plain_{"C"};
    CMPIInstance* const instance_ =
        PU::createInstance(broker_.handle(), request_.objectPath("root/cimv2", "Demo_Class"));

    template <class Element>
    std::string logOfSetting(std::vector<Element>& value, const char* name, const CMPIBroker* broker) {
        return logOf([&] { PU::setProperty(broker, instance_, name, value); });
    }

    std::string parameters(const void* value, const CMPIBroker* broker, const char* name = "Name") const {
        return " broker=" + address(broker) + " instance=" + address(instance_) + " name=" + name +
               (value != nullptr ? " value=" + address(value) : "");
    }

    // The log of a setter of which the broker refuses a call, counted from 1.
    template <class Element>
    std::string expectedLog(const std::vector<Element>& value, const std::string& type, const Strings& texts,
                            unsigned int refused, const CMPIBroker* broker) {
        constexpr bool isWide = std::is_same_v<Element, std::wstring>;
        std::string log = variable(providerUtilities, "setProperty", "count", std::to_string(value.size()));
        bool goesOn = !value.empty();
        unsigned int call = 0;
        const auto add = [&](const std::string& lines) {
            if (goesOn) {
                log += lines;
                goesOn = ++call != refused;
            }
        };
        add("newArray 3 " + type + '\n');
        const bool isMade = goesOn;
        std::string elements;
        for (std::size_t i = 0; i < 3; ++i) {
            std::string shown = texts[i];
            if (type == "string") {
                const std::string made = "newString" + (shown.empty() ? "" : ' ' + shown) + '\n';
                add(isWide ? passing(utility, "WStringToAString") + made +
                                 variable(providerUtilities, "setProperty", "strTarget", shown)
                           : made);
                shown = '"' + shown + '"';
            }
            add("setElementAt " + std::to_string(i) + ' ' + type + " = " + shown + '\n');
            elements += (i == 0 ? "" : ", ") + (goesOn ? shown : "NULL");
        }
        log += isMade ? "setProperty Name " + type + "[] = {" + elements + "}\n" : "";
        const std::string list = parameters(&value, broker);
        return isWide ? log
                      : entering(providerUtilities, "setProperty", list) + log +
                            exiting(providerUtilities, "setProperty", list);
    }

    // A setter of three elements, in every way in which the broker can refuse one of its calls.
    template <class Element>
    void checkSetter(std::vector<Element> value, const std::string& type, const Strings& texts) {
        const bool isText = type == "string";
        const auto expect = [&](unsigned int refused, const CMPIBroker* broker) {
            EXPECT_EQ(logOfSetting(value, "Name", broker), expectedLog(value, type, texts, refused, broker));
        };
        const CMPIBroker* const broker = broker_.handle();
        for (unsigned int call = 1; call <= 9; ++call) { // the last one is not reached
            broker_.injectFault("*", {CMPI_RC_ERR_FAILED, false, 0, call});
            expect(call, broker);
        }
        broker_.injectFault("newArray", nothing);
        expect(1, broker);
        broker_.injectFault("newString", nothing);
        expect(isText ? 2 : 0, broker);
        // What comes with an error is not taken.
        Otherwise<&CMPIBrokerEncFT::newArray> noArrays(broker);
        expect(1, noArrays.handle());
        Otherwise<&CMPIBrokerEncFT::newString> noStrings(broker);
        expect(isText ? 2 : 0, noStrings.handle());
        value.clear();
        expect(0, broker);
    }

    // What a getter of an array property makes of a vector that holds something, and its result.
    template <class Element>
    std::string got(const char* name, const CMPIInstance* from) {
        std::vector<Element> out = {Element{}};
        const bool result = PU::getProperty(from, name, out);
        return testing::PrintToString(out) + (result ? " true" : " false");
    }
};

} // namespace

TEST_F(ArrayTest, SetterStopsAtTheFirstRefusedElement) {
    checkSetter<unsigned char>({0, 7, 255}, "uint8", {"0", "7", "255"});
    checkSetter<unsigned short>({0, 256, 65535}, "uint16", {"0", "256", "65535"});
    checkSetter<std::string>({std::string("cut\0off", 7), "", "t\xC3\xA4"}, "string",
                             {"cut", "", "t\xC3\xA4"});
    // What the locale cannot convert becomes empty.
    checkSetter<std::wstring>({L"a", L"t\u00E4", L"ccc"}, "string", {"a", "", "ccc"});
    const ThreadLocale utf8("C.UTF-8");
    checkSetter<std::wstring>({L"t\u00E4", L"", L"c"}, "string", {"t\xC3\xA4", "", "c"});
}

TEST_F(ArrayTest, SetterHidesTheAddressOfPasswords) {
    Strings texts = {"secret"};
    const auto shows = [&](auto& value, const char* name, const void* shown) {
        const std::string list = parameters(shown, broker_.handle(), name);
        const std::string log = logOfSetting(value, name, broker_.handle());
        return log.rfind(entering(providerUtilities, "setProperty", list), 0) == 0 &&
               log.find(exiting(providerUtilities, "setProperty", list)) != std::string::npos;
    };
    EXPECT_TRUE(shows(texts, "UserPassword", nullptr));
    for (const char* const name : {"userpassword", "UserPasswor", "UserPasswords", ""}) {
        EXPECT_TRUE(shows(texts, name, &texts)) << name;
    }
    // Those of other types do.
    std::vector<unsigned short> numbers = {1};
    EXPECT_TRUE(shows(numbers, "UserPassword", &numbers));
    std::vector<std::wstring> wide = {L"secret"};
    const std::string traced = variable(providerUtilities, "setProperty", "strTarget", "secret");
    EXPECT_NE(logOfSetting(wide, "UserPassword", broker_.handle()).find(traced), std::string::npos);
    logOfSetting(texts, nullptr, broker_.handle()); // does not end the process
}

TEST_F(ArrayTest, GetterSkipsUnreadableElements) {
    std::vector<unsigned short> numbers = {1, 65535};
    Strings texts = {"a", "c"};
    PU::setProperty(broker_.handle(), instance_, "Numbers", numbers);
    PU::setProperty(broker_.handle(), instance_, "Texts", texts);
    const auto numbersAre = [&](const std::string& expected) {
        EXPECT_EQ(got<unsigned short>("Numbers", instance_), expected);
    };
    const auto textsAre = [&](const std::string& expected) {
        EXPECT_EQ(got<std::string>("Texts", instance_), expected);
    };
    const std::string allNumbers = "{ 0, 1, 65535 } true";
    const std::string allTexts = "{ \"\", \"a\", \"c\" } true";
    EXPECT_EQ(logOf([&] { numbersAre(allNumbers); }),
              "getProperty Numbers\ngetSize\ngetElementAt 0\ngetElementAt 1\n");
    EXPECT_EQ(logOf([&] { textsAre(allTexts); }), "getProperty Texts\ngetSize\ngetElementAt 0\ngetCharPtr\n"
                                                  "getElementAt 1\ngetCharPtr\n");
    const struct {
        const char* slot;
        oxahv::Fault fault;
        std::string numbers;
        std::string texts;
    } rows[] = {
        {"CMPIInstanceFT.getProperty", {CMPI_RC_OK, false, CMPI_nullValue}, "{ 0 } false", "{ \"\" } false"},
        // No array where there should be one counts as empty.
        {"CMPIInstanceFT.getProperty", nothing, "{ 0 } true", "{ \"\" } true"},
        {"CMPIArrayFT.getSize", anError, "{ 0 } true", "{ \"\" } true"},
        {"CMPIArrayFT.getElementAt", anError, "{ 0, 65535 } true", "{ \"\", \"c\" } true"},
        // An element's state does not matter.
        {"CMPIArrayFT.getElementAt", {CMPI_RC_OK, false, CMPI_nullValue, 2}, allNumbers, allTexts},
        {"CMPIStringFT.getCharPtr", anError, allNumbers, "{ \"\", \"c\" } true"},
        {"CMPIStringFT.getCharPtr", {CMPI_RC_OK, true, 0, 2}, allNumbers, "{ \"\", \"a\" } true"},
    };
    for (const auto& row : rows) {
        logOf([&] { numbersAre(row.numbers); }, row.slot, row.fault);
        logOf([&] { textsAre(row.texts); }, row.slot, row.fault);
    }
    // The data decides, not the status; of an element the status decides.
    Otherwise<&CMPIInstanceFT::getProperty> erring(instance_);
    logOf([&] { EXPECT_EQ(got<unsigned short>("Numbers", erring.handle()), allNumbers); });
    for (const CMPIType type : {CMPIType{CMPI_uint32A}, CMPIType{CMPI_ARRAY}}) { // any will do
        Otherwise<&CMPIInstanceFT::getProperty> retyped(
            instance_, [type](CMPIData& data, CMPIStatus& /*status*/) { data.type = type; });
        EXPECT_EQ(got<unsigned short>("Numbers", retyped.handle()), allNumbers);
        EXPECT_EQ(got<std::string>("Texts", retyped.handle()), allTexts);
    }
    Otherwise<&CMPIArrayFT::getElementAt> unread(CMGetProperty(instance_, "Texts", nullptr).value.array);
    Otherwise<&CMPIArrayFT::getSize> array(unread.handle(), [](CMPICount& count, CMPIStatus& status) {
        count = 2;
        status = {CMPI_RC_OK, nullptr};
    });
    Otherwise<&CMPIInstanceFT::getProperty> instance(
        instance_, [&](CMPIData& data, CMPIStatus& /*status*/) { data.value.array = array.handle(); });
    EXPECT_EQ(got<std::string>("Texts", instance.handle()), "{ \"\" } true");
}

TEST_F(ArrayTest, GetterRejectsNonArrays) {
    CMSetProperty(instance_, "Null", nullptr, CMPI_uint16A);
    CMSetProperty(instance_, "Scalar", "text", CMPI_chars);
    for (const char* const name : {"Null", "Scalar", "Missing"}) {
        EXPECT_EQ(got<unsigned short>(name, instance_), "{ 0 } false");
        EXPECT_EQ(got<std::string>(name, instance_), "{ \"\" } false");
    }
}
