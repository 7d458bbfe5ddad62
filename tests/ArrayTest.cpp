// Arrays: every element with every fault at every place.
#include "BrokerTest.h"
#include "TestLocales.h"

#include <algorithm>
#include <stdexcept>

using TK::ProviderUtilities;

namespace {

using Strings = std::vector<std::string>;

// An error, and nothing in spite of success, at the n-th call.
std::vector<oxahv::Fault> failuresAt(unsigned int call) {
    return {{CMPI_RC_ERR_FAILED, false, 0, call}, {CMPI_RC_OK, true, 0, call}};
}

class Arrays : public BrokerTest {
protected:
    const ThreadLocale plain_{"C"};

    // The property's elements, those that are NULL as "-"; "none" when there is no array of that type.
    Strings elements(CMPIType elementType) {
        const CMPIData data = CMGetProperty(instance_, "Name", nullptr);
        if (data.type != (elementType | CMPI_ARRAY)) {
            return {"none"};
        }
        Strings result;
        for (CMPICount i = 0; i < CMGetArrayCount(data.value.array, nullptr); ++i) {
            const CMPIData element = CMGetArrayElementAt(data.value.array, i, nullptr);
            if ((element.state & CMPI_nullValue) != 0) {
                result.emplace_back("-");
            } else if (elementType == CMPI_string) {
                result.emplace_back(CMGetCharsPtr(element.value.string, nullptr));
            } else {
                result.push_back(
                    std::to_string(elementType == CMPI_uint8 ? element.value.uint8 : element.value.uint16));
            }
        }
        return result;
    }

    // Sets the property and tells the calls of the broker, each with a correct status.
    template <class Element>
    std::vector<oxahv::Call> set(std::vector<Element>& value, const char* name = "Name") {
        const std::vector<oxahv::Call> calls =
            recorded([&] { ProviderUtilities::setProperty(broker_.handle(), instance_, name, value); });
        for (const oxahv::Call& call : calls) {
            EXPECT_TRUE(call.hasStatus && call.entryStatus.rc == CMPI_RC_OK && !call.entryStatus.msg);
        }
        return calls;
    }

    std::string parameters(const void* value, const char* name = "Name") const {
        return " broker=" + address(broker_.handle()) + " instance=" + address(instance_) + " name=" + name +
               " value=" + address(value);
    }

    // What a setter traces: `texts` are the elements that the wide setter converts.
    template <class Element>
    Strings traces(const std::vector<Element>& value, const Strings& texts) const {
        Strings result = {variable(providerUtilities, "setProperty", "count", std::to_string(value.size()))};
        if constexpr (std::is_same_v<Element, std::wstring>) {
            for (const std::string& text : texts) {
                result.push_back(entering(utility, "WStringToAString"));
                result.push_back(exiting(utility, "WStringToAString"));
                result.push_back(variable(providerUtilities, "setProperty", "strTarget", text));
            }
        } else {
            result.insert(result.begin(), entering(providerUtilities, "setProperty", parameters(&value)));
            result.push_back(exiting(providerUtilities, "setProperty", parameters(&value)));
        }
        return result;
    }

    // A setter of three elements, in every way in which the broker can refuse one of its calls.
    template <class Element>
    void checkSetter(std::vector<Element> value, CMPIType type, const Strings& texts) {
        const bool isText = type == CMPI_string;
        const std::vector<Element> before = value;
        const auto expectSet = [&](std::size_t filled, bool handledOneMore, bool hasArray, Strings slots) {
            CMSetProperty(instance_, "Name", "earlier", CMPI_chars);
            const std::vector<oxahv::Call> calls = set(value);
            EXPECT_EQ(value, before);
            EXPECT_EQ(members(calls), slots);
            for (std::size_t i = 0, index = 0; i < calls.size(); ++i) {
                const oxahv::Call& call = calls[i];
                if (slots[i] == "newArray") {
                    EXPECT_EQ(call.index, value.size());
                    EXPECT_EQ(call.type, type);
                } else if (slots[i] == "newString") {
                    EXPECT_EQ(call.name, texts[index]);
                } else if (slots[i] == "setElementAt") {
                    EXPECT_EQ(call.index, index++);
                    EXPECT_EQ(call.type, type);
                } else {
                    EXPECT_EQ(call.name, "Name");
                    EXPECT_EQ(call.type, type | CMPI_ARRAY);
                }
            }
            Strings wanted(texts.begin(), texts.begin() + static_cast<std::ptrdiff_t>(filled));
            EXPECT_EQ(takeTraces(),
                      traces(value,
                             Strings(texts.begin(), texts.begin() + static_cast<std::ptrdiff_t>(
                                                                        filled + (handledOneMore ? 1 : 0)))));
            wanted.resize(value.size(), "-");
            EXPECT_EQ(elements(type), hasArray ? wanted : Strings({"none"}));
            broker_.clearFaults();
        };
        const auto slotsUpTo = [isText](std::size_t count) {
            Strings slots = {"newArray"};
            for (std::size_t i = 0; i < count; ++i) {
                slots.insert(slots.end(), isText ? 2 : 1, "setElementAt");
                slots[slots.size() - (isText ? 2 : 1)] = isText ? "newString" : "setElementAt";
            }
            return slots;
        };
        const auto with = [](Strings slots, const Strings& more) {
            slots.insert(slots.end(), more.begin(), more.end());
            return slots;
        };
        expectSet(value.size(), false, true, with(slotsUpTo(value.size()), {"setProperty"}));
        for (const oxahv::Fault& failure : failuresAt(1)) {
            broker_.injectFault("newArray", failure);
            expectSet(0, false, false, {"newArray"});
        }
        for (unsigned int i = 0; i < value.size(); ++i) {
            SCOPED_TRACE(i);
            broker_.injectFault("CMPIArrayFT.setElementAt", {CMPI_RC_ERR_FAILED, false, 0, i + 1});
            expectSet(i, true, true, with(slotsUpTo(i + 1), {"setProperty"}));
            for (const oxahv::Fault& failure : failuresAt(i + 1)) {
                if (isText) {
                    broker_.injectFault("CMPIBrokerEncFT.newString", failure);
                    expectSet(i, true, true, with(slotsUpTo(i), {"newString", "setProperty"}));
                }
            }
        }
        broker_.injectFault("CMPIInstanceFT.setProperty", {CMPI_RC_ERR_FAILED, false, 0, 2});
        set(value);
        set(value);
        EXPECT_EQ(takeTraces().size(), 2 * traces(value, texts).size());
        broker_.clearFaults();

        // None at all.
        CMSetProperty(instance_, "Name", "earlier", CMPI_chars);
        std::vector<Element> nothing;
        EXPECT_TRUE(set(nothing).empty());
        EXPECT_EQ(takeTraces(), traces(nothing, {}));
        EXPECT_EQ(elements(type), Strings({"none"}));
    }

    // Stops a setter at each of its trace points: the steps are the slots that it calls, "trace" among them.
    template <class Element>
    void checkOrder(std::vector<Element> value, const Strings& steps) {
        for (std::size_t step = 0, points = 0; step < steps.size(); ++step) {
            if (steps[step] == "trace") {
                failLoggerCall(static_cast<int>(2 * points + 1));
                const std::vector<oxahv::Call> calls = recorded([&] {
                    EXPECT_THROW(ProviderUtilities::setProperty(broker_.handle(), instance_, "Name", value),
                                 std::runtime_error);
                });
                ++points;
                Strings wanted(steps.begin(), steps.begin() + static_cast<std::ptrdiff_t>(step));
                wanted.erase(std::remove(wanted.begin(), wanted.end(), "trace"), wanted.end());
                EXPECT_EQ(members(calls), wanted);
            }
        }
        forgetLoggerCalls();
    }

    // Reads the property over what the vector already holds.
    template <class Element>
    std::pair<bool, std::vector<Element>> get(std::vector<Element> out, const char* name = "Name") {
        bool result = false;
        const std::vector<oxahv::Call> calls =
            recorded([&] { result = ProviderUtilities::getProperty(instance_, name, out); });
        for (const oxahv::Call& call : calls) {
            EXPECT_TRUE(call.hasStatus && call.entryStatus.rc == CMPI_RC_OK && !call.entryStatus.msg);
        }
        slots_ = members(calls);
        broker_.clearFaults();
        return {result, out};
    }

    CMPIInstance* const instance_ =
        ProviderUtilities::createInstance(broker_.handle(), request_.objectPath("root/cimv2", "Demo_Class"));
    Strings slots_;
};

template <class Element>
using Read = std::pair<bool, std::vector<Element>>;

} // namespace

TEST_F(Arrays, AreFilledUntilTheBrokerRefusesAnElement) {
    checkSetter<unsigned char>({0, 7, 255}, CMPI_uint8, {"0", "7", "255"});
    checkSetter<unsigned short>({0, 256, 65535}, CMPI_uint16, {"0", "256", "65535"});
    checkSetter<std::string>({"a", "", "t\xC3\xA4"}, CMPI_string, {"a", "", "t\xC3\xA4"});
    checkSetter<std::string>({std::string("cut\0off", 7), "b", "c"}, CMPI_string, {"cut", "b", "c"});
    checkSetter<std::wstring>({L"a", L"", L"ccc"}, CMPI_string, {"a", "", "ccc"});
    // What the locale cannot convert becomes empty.
    checkSetter<std::wstring>({L"a", L"t\u00E4", L"c"}, CMPI_string, {"a", "", "c"});
    const ThreadLocale utf8("C.UTF-8");
    checkSetter<std::wstring>({L"t\u00E4", L"b", L"\U0001F600"}, CMPI_string,
                              {"t\xC3\xA4", "b", "\xF0\x9F\x98\x80"});
}

TEST_F(Arrays, AreTracedBetweenTheStepsThatTheTracesTellOf) {
    checkOrder<unsigned char>({1}, {"trace", "trace", "newArray", "setElementAt", "setProperty", "trace"});
    checkOrder<unsigned short>({1}, {"trace", "trace", "newArray", "setElementAt", "setProperty", "trace"});
    checkOrder<std::string>(
        {"a"}, {"trace", "trace", "newArray", "newString", "setElementAt", "setProperty", "trace"});
    checkOrder<std::wstring>({L"a", L"b"},
                             {"trace", "newArray", "trace", "trace", "newString", "trace", "setElementAt",
                              "trace", "trace", "newString", "trace", "setElementAt", "setProperty"});
}

TEST_F(Arrays, HoldNothingThatCameWithAnError) {
    std::vector<unsigned short> numbers = {1, 2};
    Strings narrow = {"a", "b"};
    std::vector<std::wstring> wide = {L"a", L"b"};
    const ErringBroker noArrays(broker_.handle(), &CMPIBrokerEncFT::newArray);
    const ErringBroker noStrings(broker_.handle(), &CMPIBrokerEncFT::newString);
    CMSetProperty(instance_, "Name", "earlier", CMPI_chars);
    ProviderUtilities::setProperty(noArrays.handle(), instance_, "Name", numbers);
    ProviderUtilities::setProperty(noArrays.handle(), instance_, "Name", narrow);
    ProviderUtilities::setProperty(noArrays.handle(), instance_, "Name", wide);
    EXPECT_EQ(CMGetProperty(instance_, "Name", nullptr).type, CMPI_string);
    ProviderUtilities::setProperty(noStrings.handle(), instance_, "Name", narrow);
    EXPECT_EQ(elements(CMPI_string), Strings({"-", "-"}));
    CMSetProperty(instance_, "Name", "earlier", CMPI_chars);
    ProviderUtilities::setProperty(noStrings.handle(), instance_, "Name", wide);
    EXPECT_EQ(elements(CMPI_string), Strings({"-", "-"}));
}

TEST_F(Arrays, OfPasswordsDoNotTellWhereTheyLie) {
    Strings value = {"secret"};
    for (const Strings& values : {Strings({"secret"}), Strings()}) {
        value = values;
        set(value, "UserPassword");
        const std::string list =
            " broker=" + address(broker_.handle()) + " instance=" + address(instance_) + " name=UserPassword";
        EXPECT_EQ(takeTraces(),
                  Strings({entering(providerUtilities, "setProperty", list),
                           variable(providerUtilities, "setProperty", "count", std::to_string(value.size())),
                           exiting(providerUtilities, "setProperty", list)}));
    }
    for (const char* const name : {"userpassword", "UserPasswor", "UserPasswords", ""}) {
        set(value, name);
        EXPECT_EQ(takeTraces().front(), entering(providerUtilities, "setProperty", parameters(&value, name)));
    }
    std::vector<unsigned char> bytes = {1};
    set(bytes, "UserPassword");
    EXPECT_EQ(takeTraces().back(),
              exiting(providerUtilities, "setProperty", parameters(&bytes, "UserPassword")));
    std::vector<std::wstring> wide = {L"secret"};
    set(wide, "UserPassword");
    EXPECT_EQ(takeTraces().back(), variable(providerUtilities, "setProperty", "strTarget", "secret"));
}

TEST_F(Arrays, OfNumbersAreAppendedWithoutWhatCannotBeRead) {
    std::vector<unsigned short> value = {1, 65535, 3};
    set(value);
    using Numbers = Read<unsigned short>;
    takeTraces();
    EXPECT_EQ(get<unsigned short>({9}), Numbers(true, {9, 1, 65535, 3}));
    EXPECT_EQ(slots_, Strings({"getProperty", "getSize", "getElementAt", "getElementAt", "getElementAt"}));
    for (unsigned int i = 0; i < 3; ++i) {
        Numbers wanted(true, value);
        wanted.second.erase(wanted.second.begin() + i);
        broker_.injectFault("CMPIArrayFT.getElementAt", {CMPI_RC_ERR_FAILED, false, 0, i + 1});
        EXPECT_EQ(get<unsigned short>({}), wanted) << i;
        EXPECT_EQ(slots_.size(), 5U);
        broker_.injectFault("CMPIArrayFT.getElementAt", {CMPI_RC_OK, false, CMPI_nullValue, i + 1});
        EXPECT_EQ(get<unsigned short>({}), Numbers(true, value)) << "an element's state does not matter";
    }
    EXPECT_TRUE(takeTraces().empty());
}

TEST_F(Arrays, OfTextsAreAppendedWithoutWhatCannotBeRead) {
    Strings value = {"a", "", "c"};
    set(value);
    takeTraces();
    EXPECT_EQ(get<std::string>({"x"}), Read<std::string>(true, {"x", "a", "", "c"}));
    EXPECT_EQ(slots_, Strings({"getProperty", "getSize", "getElementAt", "getCharPtr", "getElementAt",
                               "getCharPtr", "getElementAt", "getCharPtr"}));
    for (unsigned int i = 0; i < 3; ++i) {
        Read<std::string> wanted(true, value);
        wanted.second.erase(wanted.second.begin() + i);
        for (const char* const slot : {"CMPIArrayFT.getElementAt", "CMPIStringFT.getCharPtr"}) {
            for (const oxahv::Fault& failure : failuresAt(i + 1)) {
                broker_.injectFault(slot, failure);
                EXPECT_EQ(get<std::string>({}), wanted) << slot << ' ' << failure.code << ' ' << i;
                EXPECT_EQ(slots_.size(), std::string(slot) == "CMPIStringFT.getCharPtr" ? 8U : 7U);
            }
        }
    }
    EXPECT_TRUE(takeTraces().empty());
}

TEST_F(Arrays, ThatAreNoneAreNotRead) {
    CMSetProperty(instance_, "Null", nullptr, CMPI_uint16A);
    CMPIValue value = {};
    value.uint16 = 7;
    CMSetProperty(instance_, "Scalar", &value, CMPI_uint16);
    for (const char* const name : {"Null", "Scalar", "Missing"}) {
        EXPECT_EQ(get<unsigned short>({9}, name), Read<unsigned short>(false, {9})) << name;
        EXPECT_EQ(get<std::string>({"x"}, name), Read<std::string>(false, {"x"})) << name;
        EXPECT_EQ(slots_, Strings({"getProperty"}));
    }
    value.array = CMNewArray(broker_.handle(), 0, CMPI_uint16, nullptr);
    CMSetProperty(instance_, "Name", &value, CMPI_uint16A);
    EXPECT_EQ(get<unsigned short>({9}), Read<unsigned short>(true, {9}));
    EXPECT_EQ(get<std::string>({"x"}), Read<std::string>(true, {"x"}));
    EXPECT_EQ(slots_, Strings({"getProperty", "getSize"}));

    std::vector<unsigned short> numbers = {1, 2};
    set(numbers);
    broker_.injectFault("CMPIArrayFT.getSize", {CMPI_RC_ERR_FAILED});
    EXPECT_EQ(get<unsigned short>({9}), Read<unsigned short>(true, {9}));
    broker_.injectFault("CMPIInstanceFT.getProperty", {CMPI_RC_OK, false, CMPI_nullValue});
    EXPECT_EQ(get<unsigned short>({9}), Read<unsigned short>(false, {9}));
    // No array where there should be one counts as empty.
    broker_.injectFault("CMPIInstanceFT.getProperty", {CMPI_RC_OK, true});
    EXPECT_EQ(get<unsigned short>({9}), Read<unsigned short>(true, {9}));
    EXPECT_EQ(slots_, Strings({"getProperty"}));

    // The data decides, not the status.
    Answering<CMPIInstance, CMPIInstanceFT> failing(instance_, &CMPIInstanceFT::getProperty,
                                                    CMGetProperty(instance_, "Name", nullptr),
                                                    CMPI_RC_ERR_FAILED);
    std::vector<unsigned short> out;
    EXPECT_TRUE(ProviderUtilities::getProperty(failing.handle(), "Name", out));
    EXPECT_EQ(out, numbers);
}
