// Arrays: every element with every fault at every place.
#include "BrokerTest.h"
#include "TestLocales.h"

using PU = TK::ProviderUtilities;

namespace {

using Strings = std::vector<std::string>;

class Arrays : public BrokerTest {
protected:
    const ThreadLocale plain_{"C"};
    CMPIInstance* const instance_ =
        PU::createInstance(broker_.handle(), request_.objectPath("root/cimv2", "Demo_Class"));

    template <class Element>
    std::string logOfSetting(std::vector<Element>& value, const char* name = "Name",
                             const CMPIBroker* broker = nullptr) {
        return logOf(
            [&] { PU::setProperty(broker != nullptr ? broker : broker_.handle(), instance_, name, value); });
    }

    std::string parameters(const void* value, const CMPIBroker* broker, const char* name = "Name") const {
        return " broker=" + address(broker) + " instance=" + address(instance_) + " name=" + name +
               (value != nullptr ? " value=" + address(value) : "");
    }

    // The log of a setter until the filling has failed at an element, which it has to call the broker twice
    // for when it is a text: with the string (`atString`) or with the array. Nothing fails at 3, the array
    // at -1.
    template <class Element>
    std::string expectedLog(const std::vector<Element>& value, const std::string& type, const Strings& texts,
                            int failing, bool atString, const CMPIBroker* broker) {
        constexpr bool isWide = std::is_same_v<Element, std::wstring>;
        const bool isText = type == "string";
        const std::string list = parameters(&value, broker);
        std::string log = variable(providerUtilities, "setProperty", "count", std::to_string(value.size()));
        log = (isWide ? "" : entering(providerUtilities, "setProperty", list)) + log;
        if (!value.empty()) {
            log += "newArray " + std::to_string(value.size()) + ' ' + type + '\n';
        }
        std::string elements;
        for (int i = 0; i < static_cast<int>(value.size()); ++i) {
            const std::string text = texts[static_cast<std::size_t>(i)];
            const std::string shown = isText ? '"' + text + '"' : text;
            if (i <= failing && isText) {
                log += isWide ? passing(utility, "WStringToAString") : "";
                log += "newString" + (text.empty() ? "" : ' ' + text) + '\n';
                log += isWide ? variable(providerUtilities, "setProperty", "strTarget", text) : "";
            }
            if (i < failing || (i == failing && !atString)) {
                log += "setElementAt " + std::to_string(i) + ' ' + type + " = " + shown + '\n';
            }
            elements += (i == 0 ? "" : ", ") + (i < failing ? shown : "NULL");
        }
        if (!value.empty() && failing >= 0) {
            log += "setProperty Name " + type + "[] = {" + elements + "}\n";
        }
        return log + (isWide ? "" : exiting(providerUtilities, "setProperty", list));
    }

    // A setter of three elements, in every way in which the broker can refuse one of its calls.
    template <class Element>
    void checkSetter(std::vector<Element> value, const std::string& type, const Strings& texts) {
        const auto expect = [&](int failing, bool atString, const CMPIBroker* broker = nullptr) {
            broker = broker != nullptr ? broker : broker_.handle();
            EXPECT_EQ(logOfSetting(value, "Name", broker),
                      expectedLog(value, type, texts, failing, atString, broker));
        };
        expect(3, false);
        for (oxahv::Fault fault : {anError, nothing}) {
            broker_.injectFault("newArray", fault);
            expect(-1, false);
            for (int i = 0; i < 3; ++i) {
                fault.firstCall = static_cast<unsigned int>(i) + 1;
                if (type == "string") {
                    broker_.injectFault("newString", fault);
                    expect(i, true);
                }
                if (fault.code != CMPI_RC_OK) {
                    broker_.injectFault("CMPIArrayFT.setElementAt", fault);
                    expect(i, false);
                }
            }
        }
        broker_.injectFault("CMPIInstanceFT.setProperty", anError);
        expect(3, false);
        // What comes with an error is not taken.
        Otherwise<&CMPIBrokerEncFT::newArray> noArrays(broker_.handle());
        expect(-1, false, noArrays.handle());
        Otherwise<&CMPIBrokerEncFT::newString> noStrings(broker_.handle());
        if (type == "string") {
            expect(0, true, noStrings.handle());
        }
        value.clear();
        expect(3, false);
    }

    // A getter of an array property over what the vector already holds: its log, its result and its output.
    template <class Element>
    std::string get(const char* name, const CMPIInstance* from = nullptr) {
        std::vector<Element> out = {Element{}};
        bool result = false;
        std::string text =
            logOf([&] { result = PU::getProperty(from != nullptr ? from : instance_, name, out); });
        for (const Element& element : out) {
            if constexpr (std::is_same_v<Element, std::string>) {
                text += element + ',';
            } else {
                text += std::to_string(element) + ',';
            }
        }
        return text + (result ? "true" : "false");
    }
};

} // namespace

TEST_F(Arrays, AreFilledUntilTheBrokerRefusesAnElement) {
    checkSetter<unsigned char>({0, 7, 255}, "uint8", {"0", "7", "255"});
    checkSetter<unsigned short>({0, 256, 65535}, "uint16", {"0", "256", "65535"});
    checkSetter<std::string>({std::string("cut\0off", 7), "", "t\xC3\xA4"}, "string",
                             {"cut", "", "t\xC3\xA4"});
    // What the locale cannot convert becomes empty.
    checkSetter<std::wstring>({L"a", L"t\u00E4", L"ccc"}, "string", {"a", "", "ccc"});
    const ThreadLocale utf8("C.UTF-8");
    checkSetter<std::wstring>({L"t\u00E4", L"", L"c"}, "string", {"t\xC3\xA4", "", "c"});
}

TEST_F(Arrays, OfPasswordsDoNotTellWhereTheyLie) {
    Strings value = {"secret"};
    const auto begins = [&](const char* name, const void* shown) {
        const std::string list = parameters(shown, broker_.handle(), name);
        const std::string log = logOfSetting(value, name);
        return log.rfind(entering(providerUtilities, "setProperty", list), 0) == 0 &&
               log.find(exiting(providerUtilities, "setProperty", list)) != std::string::npos;
    };
    EXPECT_TRUE(begins("UserPassword", nullptr));
    EXPECT_EQ(logOfSetting(value, "UserPassword").find(address(&value)), std::string::npos);
    for (const char* const name : {"userpassword", "UserPasswor", "UserPasswords", ""}) {
        EXPECT_TRUE(begins(name, &value)) << name;
    }
    EXPECT_NO_FATAL_FAILURE(PU::setProperty(broker_.handle(), instance_, nullptr, value));
    takeTraces();
}

TEST_F(Arrays, AreReadWithoutTheElementsThatCannotBe) {
    std::vector<unsigned short> numbers = {1, 65535};
    Strings texts = {"a", "c"};
    PU::setProperty(broker_.handle(), instance_, "Numbers", numbers);
    PU::setProperty(broker_.handle(), instance_, "Texts", texts);
    const std::string first = "getProperty Numbers\n";
    const std::string elements = first + "getSize\ngetElementAt 0\ngetElementAt 1\n";
    const std::string chars = "getProperty Texts\ngetSize\ngetElementAt 0\ngetCharPtr\n";
    const std::string allTexts = chars + "getElementAt 1\ngetCharPtr\n";
    const struct {
        const char* slot;
        oxahv::Fault fault;
        std::string expected;     // of the numbers, when the fault is in the slot
        std::string expectedText; // of the texts
    } rows[] = {
        {"*", {CMPI_RC_OK}, elements + "0,1,65535,true", allTexts + ",a,c,true"},
        {"CMPIInstanceFT.getProperty",
         {CMPI_RC_OK, false, CMPI_nullValue},
         first + "0,false",
         "getProperty Texts\n,false"},
        // No array where there should be one counts as empty.
        {"CMPIInstanceFT.getProperty", nothing, first + "0,true", "getProperty Texts\n,true"},
        {"CMPIArrayFT.getSize", anError, first + "getSize\n0,true", "getProperty Texts\ngetSize\n,true"},
        {"CMPIArrayFT.getElementAt", anError, elements + "0,65535,true",
         "getProperty Texts\ngetSize\ngetElementAt 0\ngetElementAt 1\ngetCharPtr\n,c,true"},
        {"CMPIArrayFT.getElementAt",
         {CMPI_RC_ERR_FAILED, false, 0, 2},
         elements + "0,1,true",
         chars + "getElementAt 1\n,a,true"},
        // An element's state does not matter.
        {"CMPIArrayFT.getElementAt",
         {CMPI_RC_OK, false, CMPI_nullValue, 2},
         elements + "0,1,65535,true",
         allTexts + ",a,c,true"},
        {"CMPIStringFT.getCharPtr", anError, elements + "0,1,65535,true", allTexts + ",c,true"},
        {"CMPIStringFT.getCharPtr",
         {CMPI_RC_OK, true, 0, 2},
         elements + "0,1,65535,true",
         allTexts + ",a,true"},
    };
    for (const auto& row : rows) {
        broker_.injectFault(row.slot, row.fault);
        EXPECT_EQ(get<unsigned short>("Numbers"), row.expected);
        broker_.injectFault(row.slot, row.fault);
        EXPECT_EQ(get<std::string>("Texts"), row.expectedText);
    }
    // The data decides, not the status.
    Otherwise<&CMPIInstanceFT::getProperty> erring(instance_);
    EXPECT_EQ(get<unsigned short>("Numbers", erring.handle()), elements + "0,1,65535,true");
    Otherwise<&CMPIArrayFT::getElementAt> unread(CMGetProperty(instance_, "Texts", nullptr).value.array);
    Otherwise<&CMPIArrayFT::getSize> array(unread.handle(), [](CMPICount& count, CMPIStatus& status) {
        count = 2;
        status = {CMPI_RC_OK, nullptr};
    });
    Otherwise<&CMPIInstanceFT::getProperty> instance(
        instance_, [&](CMPIData& data, CMPIStatus& /*status*/) { data.value.array = array.handle(); });
    EXPECT_EQ(get<std::string>("Texts", instance.handle()),
              "getProperty Texts\ngetElementAt 0\ngetElementAt 1\n,true");
}

TEST_F(Arrays, ThatAreNoneAreNotRead) {
    CMSetProperty(instance_, "Null", nullptr, CMPI_uint16A);
    CMSetProperty(instance_, "Scalar", "text", CMPI_chars);
    for (const std::string name : {"Null", "Scalar", "Missing"}) {
        EXPECT_EQ(get<unsigned short>(name.c_str()), "getProperty " + name + "\n0,false");
        EXPECT_EQ(get<std::string>(name.c_str()), "getProperty " + name + "\n,false");
    }
}
