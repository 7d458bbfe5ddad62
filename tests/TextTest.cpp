// Texts: what the accessors do at each step that can fail, and which texts of users are refused.
#include "BrokerTest.h"
#include "Obvious.h"
#include "TestLocales.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <dlfcn.h>
#include <random>

using TK::ProviderUtilities;

// Stands in the place of the C library's, which may be asked about 0 to 255 and EOF alone.
static std::atomic<int> foldings{0};
static std::atomic<int> strayFoldings{0};
extern "C" __attribute__((visibility("default"))) int tolower(int c) noexcept {
    static const auto real = reinterpret_cast<int (*)(int)>(::dlsym(RTLD_NEXT, "tolower"));
    ++foldings;
    strayFoldings += c < 0 || c > 255 ? 1 : 0;
    return real(c);
}

namespace {

constexpr const char* conversionFailed = "Failed to convert the data to Multi byte";

template <class Text>
const Text untouched(3, 'u');

class Texts : public BrokerTest {
protected:
    Texts() {
        CMSetProperty(instance_, "Null", nullptr, CMPI_string);
        CMAddKey(path_, "Null", nullptr, CMPI_string);
        CMAddArg(args_, "Null", nullptr, CMPI_string);
        store("text");
    }

    const ThreadLocale plain_{"C"};

    void store(const char* text) {
        CMSetProperty(instance_, "Name", text, CMPI_chars);
        CMAddKey(path_, "Name", text, CMPI_chars);
        CMAddArg(args_, "Name", text, CMPI_chars);
    }

    // What a getter does with a name: its result, its output, its calls of the broker and its traces.
    template <class Text, class Get>
    void expectGet(const Get& get, const char* name, bool result, const Text& out,
                   const std::vector<std::string>& slots, const std::vector<std::string>& traces) {
        Text text = untouched<Text>;
        const std::vector<oxahv::Call> calls = recorded([&] { EXPECT_EQ(get(name, text), result); });
        EXPECT_EQ(text, out);
        EXPECT_EQ(members(calls), slots);
        for (const oxahv::Call& call : calls) {
            EXPECT_TRUE(call.hasStatus && call.entryStatus.rc == CMPI_RC_OK && !call.entryStatus.msg);
        }
        EXPECT_EQ(takeTraces(), traces);
    }

    // A getter in every way in which its steps can fail: the slots that it calls in order, the last of them
    // CMPIStringFT.getCharPtr, and what it traces when it succeeds.
    template <class Text, class Get>
    void checkGetter(const std::vector<std::string>& path, const Text& expected,
                     const std::vector<std::string>& traces, const Get& get) {
        SCOPED_TRACE(path[0] + (sizeof(Text{}[0]) == 1 ? " narrow" : " wide"));
        std::vector<std::string> names;
        for (const std::string& slot : path) {
            names.push_back(slot.substr(slot.find('.') + 1));
        }
        const std::vector<std::string> first(1, names[0]);
        expectGet(get, "Name", true, expected, names, traces);
        expectGet(get, "Missing", false, untouched<Text>, first, {});
        expectGet(get, "Null", false, untouched<Text>, first, {});
        for (std::size_t step = 0; step < path.size(); ++step) {
            const std::vector<std::string> reached(names.begin(),
                                                   names.begin() + static_cast<std::ptrdiff_t>(step) + 1);
            for (const oxahv::Fault& fault :
                 {oxahv::Fault{CMPI_RC_ERR_FAILED}, oxahv::Fault{CMPI_RC_OK, true}}) {
                SCOPED_TRACE(path[step] + (fault.yieldsNull ? " yields null" : " fails"));
                broker_.injectFault(path[step], fault);
                expectGet(get, "Name", false, untouched<Text>, reached, {});
                broker_.clearFaults();
            }
        }
        broker_.injectFault(path[0], {CMPI_RC_OK, false, CMPI_nullValue});
        expectGet(get, "Name", false, untouched<Text>, first, {});
        broker_.clearFaults();
        broker_.injectFault(path[0], {CMPI_RC_OK, false, CMPI_keyValue | CMPI_notFound | CMPI_badValue});
        expectGet(get, "Name", true, expected, names, traces);
        broker_.clearFaults();
    }

    // The ways of a wide getter beyond that.
    template <class Get>
    void checkWideGetter(const std::string& slot, const std::string& function, const Get& get) {
        const std::vector<std::string> slots = {slot.substr(slot.find('.') + 1), "getCharPtr"};
        std::vector<std::string> traces = {entering(utility, "AStringToWString"),
                                           exiting(utility, "AStringToWString")};
        store("text");
        checkGetter<std::wstring>({slot, "CMPIStringFT.getCharPtr"}, L"text", traces, get);
        store("");
        expectGet<std::wstring>(get, "Name", true, L"", slots, {});
        store("t\xC3\xA4");
        {
            const ThreadLocale utf8("C.UTF-8");
            expectGet<std::wstring>(get, "Name", true, L"t\u00E4", slots, traces);
        }
        traces.push_back(message(providerUtilities, function, conversionFailed));
        expectGet(get, "Name", false, untouched<std::wstring>, slots, traces);
    }

    CMPIObjectPath* const path_ = request_.objectPath("root/cimv2", "Demo_Class");
    CMPIInstance* const instance_ = ProviderUtilities::createInstance(broker_.handle(), path_);
    CMPIArgs* const args_ = CMNewArgs(broker_.handle(), nullptr);
};

} // namespace

TEST_F(Texts, AreReadOrTheOutputLeftAlone) {
    checkGetter<std::string>(
        {"CMPIArgsFT.getArg", "CMPIStringFT.getCharPtr"}, "text", {},
        [&](const char* name, std::string& out) { return ProviderUtilities::getProperty(args_, name, out); });
    checkGetter<std::string>({"CMPIInstanceFT.getProperty", "CMPIStringFT.getCharPtr"}, "text", {},
                             [&](const char* name, std::string& out) {
                                 return ProviderUtilities::getProperty(instance_, name, out, false);
                             });
    checkWideGetter("CMPIArgsFT.getArg", "getProperty", [&](const char* name, std::wstring& out) {
        return ProviderUtilities::getProperty(args_, name, out);
    });
    checkWideGetter("CMPIInstanceFT.getProperty", "getProperty", [&](const char* name, std::wstring& out) {
        return ProviderUtilities::getProperty(instance_, name, out);
    });
    checkWideGetter("CMPIObjectPathFT.getKey", "getKeyProperty", [&](const char* name, std::wstring& out) {
        return ProviderUtilities::getKeyProperty(path_, name, out);
    });
}

TEST_F(Texts, OfDatesAreReadInTheirCimForm) {
    const std::string text = "20090307050409.000123-300";
    CMPIValue value = {};
    value.dateTime = CMNewDateTimeFromChars(broker_.handle(), text.c_str(), nullptr);
    CMSetProperty(instance_, "Name", &value, CMPI_dateTime);
    checkGetter<std::string>(
        {"CMPIInstanceFT.getProperty", "CMPIDateTimeFT.getStringFormat", "CMPIStringFT.getCharPtr"}, text, {},
        [&](const char* name, std::string& out) {
            return ProviderUtilities::getProperty(instance_, name, out, true);
        });
}

// The string decides, not the status that the date/time reports with it.
TEST_F(Texts, OfDatesAreReadWhenThereIsOne) {
    static CMPIString* text = nullptr;
    text = CMNewString(broker_.handle(), "20090307050409.000123-300", nullptr);
    CMPIDateTime date = *CMNewDateTime(broker_.handle(), nullptr);
    CMPIDateTimeFT table = *date.ft;
    table.getStringFormat = [](auto* /*dateTime*/, CMPIStatus* status) {
        *status = {CMPI_RC_ERR_FAILED, nullptr};
        return text;
    };
    date.ft = &table;
    CMPIData data = {};
    data.type = CMPI_dateTime;
    data.value.dateTime = &date;
    Answering<CMPIInstance, CMPIInstanceFT> instance(instance_, &CMPIInstanceFT::getProperty, data,
                                                     CMPI_RC_OK);
    std::string out;
    EXPECT_TRUE(ProviderUtilities::getProperty(instance.handle(), "Name", out, true));
    EXPECT_EQ(out, "20090307050409.000123-300");
}

TEST_F(Texts, WithCharactersAndAnErrorAreReadFromArgumentsAlone) {
    StringWithAnError string(CMNewString(broker_.handle(), "text", nullptr));
    CMPIData data = {};
    data.type = CMPI_string;
    data.value.string = string.handle();
    Answering<CMPIArgs, CMPIArgsFT> args(args_, &CMPIArgsFT::getArg, data, CMPI_RC_OK);
    Answering<CMPIInstance, CMPIInstanceFT> instance(instance_, &CMPIInstanceFT::getProperty, data,
                                                     CMPI_RC_OK);
    Answering<CMPIObjectPath, CMPIObjectPathFT> path(path_, &CMPIObjectPathFT::getKey, data, CMPI_RC_OK);
    std::string narrow = "as it was";
    EXPECT_FALSE(ProviderUtilities::getProperty(instance.handle(), "Name", narrow, false));
    EXPECT_FALSE(ProviderUtilities::getKeyProperty(path.handle(), "Name", narrow));
    EXPECT_EQ(narrow, "as it was");
    EXPECT_TRUE(ProviderUtilities::getProperty(args.handle(), "Name", narrow));
    EXPECT_EQ(narrow, "characters");
    std::wstring wide = L"as it was";
    EXPECT_FALSE(ProviderUtilities::getProperty(args.handle(), "Name", wide));
    EXPECT_FALSE(ProviderUtilities::getProperty(instance.handle(), "Name", wide));
    EXPECT_FALSE(ProviderUtilities::getKeyProperty(path.handle(), "Name", wide));
    EXPECT_EQ(wide, L"as it was");
    EXPECT_TRUE(takeTraces().empty());
}

TEST_F(Texts, AreSetAsTextsOrAsDates) {
    const auto set = [&](std::string value, bool isDate) {
        return recorded(
            [&] { ProviderUtilities::setProperty(broker_.handle(), instance_, "Name", value, isDate); });
    };
    std::vector<oxahv::Call> calls = set("20090307", false);
    ASSERT_EQ(members(calls), std::vector<std::string>({"setProperty"}));
    EXPECT_EQ(calls[0].type, CMPI_chars);
    EXPECT_STREQ(CMGetCharsPtr(CMGetProperty(instance_, "Name", nullptr).value.string, nullptr), "20090307");
    EXPECT_TRUE(takeTraces().empty());

    const std::string text = "20090307050409.000123-300";
    const auto traces = [](const std::string& date) {
        return std::vector<std::string>({variable(providerUtilities, "setProperty", "isDate", "1"),
                                         variable(providerUtilities, "setProperty", "Date", date)});
    };
    calls = set(text, true);
    ASSERT_EQ(members(calls), std::vector<std::string>({"newDateTimeFromChars", "setProperty"}));
    EXPECT_EQ(calls[0].name, text);
    EXPECT_EQ(calls[0].entryStatus.rc, CMPI_RC_OK);
    EXPECT_EQ(calls[1].name, "Name");
    EXPECT_EQ(calls[1].type, CMPI_dateTime);
    EXPECT_EQ(CMGetProperty(instance_, "Name", nullptr).type, CMPI_dateTime);
    EXPECT_EQ(takeTraces(), traces(text));

    // Refused: the property stays.
    EXPECT_EQ(members(set("yesterday", true)), std::vector<std::string>({"newDateTimeFromChars"}));
    EXPECT_EQ(takeTraces(), traces("yesterday"));
    for (const oxahv::Fault& fault : {oxahv::Fault{CMPI_RC_ERR_FAILED}, oxahv::Fault{CMPI_RC_OK, true}}) {
        broker_.injectFault("newDateTimeFromChars", fault);
        EXPECT_EQ(members(set(text, true)), std::vector<std::string>({"newDateTimeFromChars"}));
        EXPECT_EQ(takeTraces(), traces(text));
    }
    EXPECT_EQ(CMGetProperty(instance_, "Name", nullptr).type, CMPI_dateTime);
    CMSetProperty(instance_, "Name", "earlier", CMPI_chars);
    std::string value = text;
    ProviderUtilities::setProperty(ErringBroker(broker_.handle()).handle(), instance_, "Name", value, true);
    EXPECT_EQ(CMGetProperty(instance_, "Name", nullptr).type, CMPI_string) << "a date with an error";
    takeTraces();
    broker_.injectFault("CMPIInstanceFT.setProperty", {CMPI_RC_ERR_FAILED, false, 0, 1, 0});
    set(text, true);
    set(text, false);
    EXPECT_EQ(takeTraces(), traces(text));
}

TEST_F(Texts, OfWideCharactersAreSetWhenTheLocaleHasThem) {
    const auto setKey = [&](const std::wstring& value) {
        return recorded([&] { ProviderUtilities::setKeyProperty(path_, "Name", value); });
    };
    const auto setProperty = [&](std::wstring value) {
        return recorded([&] { ProviderUtilities::setProperty(instance_, "Name", value); });
    };
    const auto chars = [](const CMPIData& data) {
        return std::string(CMGetCharsPtr(data.value.string, nullptr));
    };
    const std::vector<std::string> converted = {entering(utility, "WStringToAString"),
                                                exiting(utility, "WStringToAString")};
    const auto expectSet = [&](const std::wstring& value, const std::string& stored,
                               const std::vector<std::string>& traces) {
        std::vector<oxahv::Call> calls = setKey(value);
        ASSERT_EQ(members(calls), std::vector<std::string>({"addKey"}));
        EXPECT_EQ(calls[0].type, CMPI_chars);
        EXPECT_EQ(chars(CMGetKey(path_, "Name", nullptr)), stored);
        EXPECT_EQ(takeTraces(), traces);
        calls = setProperty(value);
        ASSERT_EQ(members(calls), std::vector<std::string>({"setProperty"}));
        EXPECT_EQ(calls[0].type, CMPI_chars);
        EXPECT_EQ(chars(CMGetProperty(instance_, "Name", nullptr)), stored);
        EXPECT_EQ(takeTraces(), traces);
    };
    expectSet(L"wide", "wide", converted);
    expectSet(std::wstring(L"cut\0off", 7), "cut", converted);
    expectSet(L"", "", {});
    {
        const ThreadLocale utf8("C.UTF-8");
        expectSet(L"t\u00E4\U0001F600", "t\xC3\xA4\xF0\x9F\x98\x80", converted);
    }
    for (const char* const function : {"setKeyProperty", "setProperty"}) {
        const bool isKey = std::string(function) == "setKeyProperty";
        EXPECT_TRUE((isKey ? setKey(L"t\u00E4") : setProperty(L"t\u00E4")).empty());
        std::vector<std::string> traces = converted;
        traces.push_back(message(providerUtilities, function, conversionFailed));
        EXPECT_EQ(takeTraces(), traces);
    }
}

TEST_F(Texts, AreConvertedUnlessEmpty) {
    std::string narrow = "earlier";
    std::wstring wide = L"earlier";
    EXPECT_FALSE(ProviderUtilities::ConvertWideCharToMultiByte(L"\u00E4", narrow));
    EXPECT_FALSE(ProviderUtilities::ConvertMultiByteToWideChar("\xE4", wide));
    EXPECT_EQ(narrow, "earlier");
    EXPECT_EQ(wide, L"earlier");
    EXPECT_TRUE(ProviderUtilities::ConvertWideCharToMultiByte(L"text", narrow));
    EXPECT_TRUE(ProviderUtilities::ConvertMultiByteToWideChar("text", wide));
    EXPECT_EQ(narrow, "text");
    EXPECT_EQ(wide, L"text");
    EXPECT_EQ(takeTraces().size(), 8U);
    EXPECT_TRUE(ProviderUtilities::ConvertWideCharToMultiByte(L"", narrow));
    EXPECT_TRUE(ProviderUtilities::ConvertMultiByteToWideChar("", wide));
    EXPECT_EQ(narrow, "");
    EXPECT_EQ(wide, L"");
    EXPECT_TRUE(takeTraces().empty());
    EXPECT_TRUE(ProviderUtilities::ConvertWideCharToMultiByte(std::wstring(1, L'\0'), narrow));
    EXPECT_EQ(takeTraces().size(), 2U);
}

namespace {

using obvious::entries;
using obvious::isAcceptable;
using obvious::widened;

// Random texts over an alphabet, with every exemption and some that are none.
template <class Char>
void checkScreen(const std::basic_string<Char>& alphabet) {
    std::vector<std::basic_string<Char>> exemptions = {widened<Char>(""), widened<Char>("HTTP:"),
                                                       widened<Char>("http"), widened<Char>("<<"),
                                                       widened<Char>(std::string(":\0", 2))};
    for (const std::string& entry : entries) {
        exemptions.push_back(widened<Char>(entry));
    }
    std::mt19937 random(1); // NOLINT: the same texts in every run
    int accepted = 0;
    for (int round = 0; round < 5000; ++round) {
        std::basic_string<Char> text;
        for (std::size_t parts = random() % 5; parts > 0; --parts) {
            if (random() % 8 == 0) { // an entry, perhaps with a letter cut off and one in upper case
                std::string entry = entries[random() % entries.size()].substr(random() % 8 == 0 ? 1 : 0);
                std::transform(entry.begin(), entry.end(), entry.begin(), [&random](char c) {
                    return random() % 2 == 0 && c >= 'a' && c <= 'z' ? static_cast<char>(c - 32) : c;
                });
                text += widened<Char>(entry);
            } else {
                text.append(1 + random() % 2, alphabet[random() % alphabet.size()]);
            }
        }
        for (const std::basic_string<Char>& exemption : exemptions) {
            const bool expected = isAcceptable(text, exemption);
            accepted += expected ? 1 : 0;
            ASSERT_EQ(ProviderUtilities::ValidateInput(text, exemption), expected)
                << testing::PrintToString(text) << " with " << testing::PrintToString(exemption);
        }
    }
    EXPECT_GT(accepted, 5000);
    EXPECT_LT(accepted, 5000 * static_cast<int>(exemptions.size()) - 5000);
}

} // namespace

TEST_F(Texts, OfUsersAreScreened) {
    struct {
        const char* text;
        const char* exemption;
        bool accepted;
    } const rows[] = {
        {"", "", true},
        {"plain words and 123", "", true},
        {"HTTP://x", "", false},
        {"a:b", "", false},
        {"a:b", ":", true},
        {"a\\b", ":", true},
        {"http://x", ":", false},
        {"WWW.x", ":", false},
        {"<http:%$\\\\www.wap.ftp:sftp::\\", "<", true},
        {"http://x", "HTTP:", false},
        {"http://x", "http:", true},
        {"<http://x", "http:", false},
        {"a\\\\b", "\\", false},
        {"a\\b", "\\", true},
        {"a:b\\", "\\", false},
        {"sftp:", "sftp:", false},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(ProviderUtilities::ValidateInput(std::string(row.text), row.exemption), row.accepted)
            << row.text << " with " << row.exemption;
        EXPECT_EQ(
            ProviderUtilities::ValidateInput(widened<wchar_t>(row.text), widened<wchar_t>(row.exemption)),
            row.accepted)
            << row.text << " with " << row.exemption;
    }
    foldings = 0;
    strayFoldings = 0;
    checkScreen<char>(std::string("<htps:%$\\w.afHTPSWAF xyz\0\x7F\x80\xBC\xFF\xD7", 30));
    // Wide characters whose low byte is that of an entry's character stand for themselves.
    std::wstring alphabet(L"<htps:%$\\w.afHTPSWAF xyz\0\u00BC\u00FF\u0157\u013C\u013A\U0001003A\u0125\u0124",
                          33);
    alphabet += static_cast<wchar_t>(-0xC4);
    alphabet += static_cast<wchar_t>(0x8000003A);
    alphabet += static_cast<wchar_t>(-1);
    checkScreen<wchar_t>(alphabet);
    EXPECT_GT(foldings, 100000);
    EXPECT_EQ(strayFoldings, 0);
    EXPECT_TRUE(takeTraces().empty());
}

// Long texts are looked through block by block: an entry is found wherever it stands, across the blocks'
// edges too.
TEST_F(Texts, OfUsersAreScreenedAtAnyLength) {
    constexpr std::size_t length = 3 * 4096 + 100;
    const std::string clean = [] {
        std::string text;
        while (text.size() < length) {
            text += "Row w. Rack p. App. aap. wwp. waw. wa. ww ";
        }
        text.resize(length);
        return text;
    }();
    const auto accepted = [](const std::string& text) {
        const bool narrow = ProviderUtilities::ValidateInput(text, "");
        EXPECT_EQ(ProviderUtilities::ValidateInput(widened<wchar_t>(text), L""), narrow);
        return narrow;
    };
    EXPECT_TRUE(accepted(clean));
    for (const std::string entry : {"www.", "WaP.", "wWW.", "<", ":"}) {
        for (std::size_t block = 0; block <= 3; ++block) {
            for (std::size_t i = 0; i < 20; ++i) {
                const std::size_t position =
                    std::min(block * 4096 + i, length) - std::min<std::size_t>(block * 4096, 10);
                EXPECT_FALSE(accepted(std::string(clean).replace(position, entry.size(), entry)))
                    << entry << " at " << position;
            }
        }
        EXPECT_FALSE(accepted(std::string(clean).replace(length - entry.size(), entry.size(), entry)))
            << entry;
    }
}
