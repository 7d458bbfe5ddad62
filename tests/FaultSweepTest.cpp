// Lets the n-th call of the broker, the n-th allocation or the n-th call of the logger fail in each operation
// of the library, for n = 1, 2, 3 … until the operation succeeds. The result must be what the headers say:
// the operation's own failure or the exception, outputs and the caller's objects unchanged or changed in
// part, and no object of the broker released. Operations that make a single call of the broker have tests of
// their own.
#include "FailureWays.h"
#include "MonikerText.h"
#include "ProviderUtilities.h"
#include "ScratchFolder.h"
#include "Trace.h"
#include "Utility.h"
#include "utils.h"

#include <algorithm>
#include <iostream>
#include <locale>
#include <sstream>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

using PU = TK::ProviderUtilities;
using TK::CUtility;
using TK::Moniker;
using TK::Utils;

namespace {

const std::string category("Test.Sweep");
// Longer than a std::string holds without an allocation.
const std::string longText("a-text-that-does-not-fit-into-a-string-itself");
const std::wstring wideText(L"a-wide-text-that-does-not-fit-into-a-string");
const std::string dateText("20260329013000.000250+001");

// A value; the elements of an array are words of their own.
std::string textOf(const CMPIData& data) {
    std::string text;
    for (const char c : oxahv::valueText(data)) {
        text += c == '{' ? "{ " : c == '}' ? " }" : c == ',' ? "" : std::string(1, c);
    }
    return text;
}

std::string textOf(CMPIInstance* instance) {
    std::string text;
    for (CMPICount i = 0; i < CMGetPropertyCount(instance, nullptr); ++i) {
        CMPIString* name = nullptr;
        const CMPIData data = CMGetPropertyAt(instance, i, &name, nullptr);
        text += CMGetCharsPtr(name, nullptr) + ("=" + textOf(data)) + ' ';
    }
    return text;
}

template <class Element>
std::string textOf(const std::vector<Element>& elements) {
    std::string text;
    for (const Element& element : elements) {
        if constexpr (std::is_same_v<Element, std::wstring>) {
            text += TK::make_string(element) + ' ';
        } else if constexpr (std::is_same_v<Element, std::string>) {
            text += element + ' ';
        } else {
            text += std::to_string(element) + ' ';
        }
    }
    return text;
}

// A path's keys as words.
std::string textOf(CMPIObjectPath* path) {
    std::string text = oxahv::pathText(path);
    std::replace(text.begin(), text.end(), ',', ' ');
    return text;
}

// The scene of one attempt: the caller's objects and outputs, made afresh.
class Stage {
public:
    explicit Stage(oxahv::EmbeddedBroker& embedded) : broker(embedded.handle()), request(embedded) {
        path = request.objectPathFromText("Demo.Byte=1,Big=7,Text=\"" + longText + "\"", "root/x");
        instance = PU::createInstance(broker, path);
        CMSetProperty(instance, "Text", longText.c_str(), CMPI_chars);
        PU::setProperty(broker, instance, "Date", dateInput, true);
        PU::setProperty(broker, instance, "Numbers", numberInputs);
        PU::setProperty(broker, instance, "Texts", textInputs);
        args = CMNewArgs(broker, nullptr);
        CMAddArg(args, "Text", longText.c_str(), CMPI_chars);
        string = CMNewString(broker, longText.c_str(), nullptr);
        keys.addKey("Text", longText);
        keys.addKey("Big", 18446744073709551615ULL);
        moniker.addKey("earlier", "key");
        file.setEntry(L"number", L"17");
        file.setEntry(L"date", L"2026-03-29 01:30:00");
        file.setEntry(L"text", wideText);
        folder.write("text = earlier\n");
    }

    void answer(bool yes) { result = yes ? "true" : "false"; }
    void made(const void* object) { result = object != nullptr ? "made" : "null"; }

    // Everything that the caller can see, one text for each object.
    std::vector<std::string> fields() {
        std::vector<std::string> all = {
            std::to_string(number), text,          TK::make_string(wide), textOf(numbers),
            textOf(texts),          textOf(wides), keysOf(moniker),       ::textOf(keys),
            textOf(instance),       textOf(path),  folder.content(),      textOf(wideInputs),
            textOf(textInputs)};
        for (const wchar_t* const key : {L"number", L"word", L"date", L"text"}) {
            all.push_back(TK::make_string(file.getEntry(key)));
        }
        return all;
    }

    // What the operations are given.
    const CMPIBroker* broker;
    oxahv::Request request;
    std::string textInput = longText;
    std::string dateInput = dateText;
    std::wstring wideInput = wideText;
    std::vector<unsigned short> numberInputs = {10, 20, 30};
    std::vector<std::string> textInputs = {longText, "Other", "Demo"};
    std::vector<std::wstring> wideInputs = {wideText, L"short", wideText};
    CMPIInstance* instance = nullptr;
    CMPIObjectPath* path = nullptr;
    CMPIArgs* args = nullptr;
    CMPIString* string = nullptr;
    Moniker keys;
    TK::PropertyFile file;
    ScratchFolder folder;
    // Where they write.
    std::string result = "returned";
    unsigned short number = 1;
    std::string text = "earlier";
    std::wstring wide = L"earlier";
    std::vector<unsigned short> numbers = {1};
    std::vector<std::string> texts = {"earlier"};
    std::vector<std::wstring> wides = {L"earlier"};
    Moniker moniker;
};

// What happens to the caller's objects in a failure: they are kept, or partly changed.
enum Rest { kept, partly };

struct Scenario {
    const char* name;
    Rest rest;
    std::string failures; // results that a failure may have, a comma behind each
    void (*run)(Stage& s);
};

const std::string noConversion = "exception: String Conversion Failed !!,";
const std::string noKeys = "exception: Could not Extract Keys from Object Path.,";

const Scenario scenarios[] = {
    {"getClassName", kept, ",", [](Stage& s) { s.result = PU::getClassName(s.path); }},
    {"convertToString", kept, noConversion, [](Stage& s) { s.result = PU::convertToString(s.string); }},
    {"set a wide key", kept, "", [](Stage& s) { PU::setKeyProperty(s.path, "Wide", s.wideInput); }},
    {"set a wide text", kept, "", [](Stage& s) { PU::setProperty(s.instance, "Text", s.wideInput); }},
    {"set date", kept, "",
     [](Stage& s) { PU::setProperty(s.broker, s.instance, "When", s.dateInput, true); }},
    {"set numbers", partly, "",
     [](Stage& s) { PU::setProperty(s.broker, s.instance, "Array", s.numberInputs); }},
    {"set texts", partly, "", [](Stage& s) { PU::setProperty(s.broker, s.instance, "Array", s.textInputs); }},
    {"passwords", partly, "",
     [](Stage& s) { PU::setProperty(s.broker, s.instance, "UserPassword", s.textInputs); }},
    {"set wides", partly, "", [](Stage& s) { PU::setProperty(s.broker, s.instance, "Array", s.wideInputs); }},
    {"get a key", kept, "false,", [](Stage& s) { s.answer(PU::getKeyProperty(s.path, "Text", s.text)); }},
    {"wide key", kept, "false,", [](Stage& s) { s.answer(PU::getKeyProperty(s.path, "Text", s.wide)); }},
    {"get text", kept, "false,",
     [](Stage& s) { s.answer(PU::getProperty(s.instance, "Text", s.text, false)); }},
    {"get date", kept, "false,",
     [](Stage& s) { s.answer(PU::getProperty(s.instance, "Date", s.text, true)); }},
    {"get wide", kept, "false,", [](Stage& s) { s.answer(PU::getProperty(s.instance, "Text", s.wide)); }},
    {"get numbers", partly, "false,",
     [](Stage& s) { s.answer(PU::getProperty(s.instance, "Numbers", s.numbers)); }},
    {"get texts", partly, "false,",
     [](Stage& s) { s.answer(PU::getProperty(s.instance, "Texts", s.texts)); }},
    {"argument", kept, "false,", [](Stage& s) { s.answer(PU::getProperty(s.args, "Text", s.text)); }},
    {"wide argument", kept, "false,", [](Stage& s) { s.answer(PU::getProperty(s.args, "Text", s.wide)); }},
    {"getKeyCount", kept, "0,1,2," + noKeys,
     [](Stage& s) { s.result = std::to_string(PU::getKeyCount(s.path)); }},
    {"transformObjectPathToMoniker", partly, noKeys + noConversion,
     [](Stage& s) { PU::transformObjectPathToMoniker(s.path, s.moniker); }},
    {"transformMonikerToObjectPath", partly, "",
     [](Stage& s) { PU::transformMonikerToObjectPath(s.moniker, &s.path); }},
    {"createObjectPath", kept, "null,",
     [](Stage& s) { s.made(PU::createObjectPath(s.broker, "Demo", longText)); }},
    {"getClassId", kept, "0,", [](Stage& s) { s.result = std::to_string(PU::getClassId(s.path)); }},
    {"areClassesRelated", kept, "false,",
     [](Stage& s) { s.answer(PU::areClassesRelated(s.broker, "root/x", s.textInputs, "Demo")); }},
    {"ValidateInput", kept, "", [](Stage& s) { s.answer(PU::ValidateInput(s.wideInput, L"sftp:")); }},
    {"getNLSText", kept, "", [](Stage& s) { s.result = PU::getNLSText(s.wideInput); }},
    {"narrow", kept, "", [](Stage& s) { s.answer(CUtility::WStringToAString(s.wideInput, s.text)); }},
    {"widen", kept, "", [](Stage& s) { s.answer(CUtility::AStringToWString(s.textInput, s.wide)); }},
    {"to wide texts", partly, "",
     [](Stage& s) { s.answer(CUtility::AStringArrToWStringArr(s.textInputs, s.wides)); }},
    {"to narrow texts", partly, "",
     [](Stage& s) { s.answer(CUtility::WStringArrToAStringArr(s.wideInputs, s.texts)); }},
    {"CIM dates", kept, "",
     [](Stage& s) { s.text = Utils::convertCIMDateTime(Utils::convertStringToDateTime(s.dateInput)); }},
    {"parts of dates", kept, "",
     [](Stage& s) { s.text = Utils::stripSpaces(s.textInput) + Utils::addZero(40); }},
    {"read text", kept, "", [](Stage& s) { s.text = Utils::ReadStringFromFile(s.file, "text"); }},
    {"read number", kept, "", [](Stage& s) { s.number = Utils::ReadUint8FromFile(s.file, "number"); }},
    {"read date", kept, "", [](Stage& s) { s.number = Utils::ReadDateFromFile(s.file, "date").getYear(); }},
    {"write to a file", partly, "",
     [](Stage& s) {
         Utils::WriteStringToFile(s.file, "text", longText);
         Utils::WriteUint8ToFile(s.file, "number", 200);
         Utils::WriteUint32ToFile(s.file, "word", 4000000000U);
         Utils::WriteDateToFile(s.file, "date", {"1999-12-31 23:59:59", 3});
     }},
    {"save a file", kept, "",
     [](Stage& s) {
         TK::PropertyFile saved(s.folder.path());
         Utils::WriteStringToFile(saved, "text", longText);
         saved.save();
     }},
    {"add a text", kept, "", [](Stage& s) { s.keys.addKey(longText, longText); }},
    {"add a number", kept, "", [](Stage& s) { s.keys.addKey(longText, 18446744073709551615ULL); }},
    {"read a key", kept, "", [](Stage& s) { s.result = selectedKey(s.keys); }},
    {"assign a moniker", kept, "", [](Stage& s) { s.keys = Moniker(s.moniker); }},
    {"copy an exception", kept, "",
     [](Stage& s) {
         TK::FrameworkException copy("");
         copy = TK::FrameworkException(TK::FrameworkException(longText.c_str()));
         s.result = copy.what();
     }},
    {"trace", kept, "",
     [](Stage& s) {
         TK_TRACE_ENTERING(category);
         TK_TRACE_ENTERING_PARAMETERS(category, " stage=" << &s << " text=" << s.textInput << 1.5);
         TK_TRACE_VARIABLE(category, "textInput", s.textInput);
         TK_TRACE_EXITING_PARAMETERS(category, " result=" << s.text);
     }},
};

// What an attempt came to.
struct Outcome {
    std::string result;
    std::vector<std::string> before;
    std::vector<std::string> fields;
    Thrown thrown = Thrown::nothing;
    bool isReached = false;
    bool failedInBroker = false;
};

// Whether a text is the whole one as far as it came: words may be missing or nulled, none is another.
bool isPartOf(const std::string& text, const std::string& whole) {
    const auto isInWhole = [&whole](const std::string& begin) {
        return (' ' + whole + ' ').find(' ' + begin) != std::string::npos;
    };
    std::istringstream words(text);
    for (std::string word; words >> word;) {
        const std::string name = word.substr(0, word.find('=') + 1);
        const std::string value = word.substr(name.size());
        const bool isNulled = value == "0" || value == "NULL" || value == "\"\"";
        if (!isInWhole(word + ' ') && !(isNulled && isInWhole(name))) {
            return false;
        }
    }
    return true;
}

enum class Change { none, partial, whole };

// Checks what the caller can see; `change` is what may have become of it.
void expectFields(const Outcome& outcome, const Outcome& whole, Change change) {
    for (std::size_t i = 0; i < whole.fields.size(); ++i) {
        const std::string& field = outcome.fields[i];
        if (change == Change::whole) {
            EXPECT_EQ(field, whole.fields[i]);
        } else if (field != outcome.before[i]) {
            EXPECT_TRUE(change == Change::partial && isPartOf(field, whole.fields[i]))
                << outcome.before[i] << "\nbecame\n"
                << field << "\nin place of\n"
                << whole.fields[i];
        }
    }
}

void check(const Scenario& scenario, const Way& way, const Outcome& outcome, const Outcome& whole) {
    const bool isWhole = outcome.result == whole.result;
    if (!outcome.isReached || way.isHarmless) {
        EXPECT_EQ(outcome.thrown, Thrown::nothing);
        EXPECT_EQ(outcome.result, whole.result);
        expectFields(outcome, whole, Change::whole);
    } else if (outcome.thrown != Thrown::nothing) {
        EXPECT_EQ(outcome.thrown, way.thrown);
        expectFields(outcome, whole, scenario.rest == partly ? Change::partial : Change::none);
    } else { // the operation's own failure, or as much as it could do
        EXPECT_TRUE(way.thrown == Thrown::nothing || outcome.failedInBroker) << "a failure was swallowed";
        EXPECT_TRUE(isWhole ||
                    (',' + scenario.failures).find(',' + outcome.result + ',') != std::string::npos)
            << outcome.result;
        expectFields(outcome, whole, isWhole || scenario.rest == partly ? Change::partial : Change::none);
    }
}

class FaultSweep : public testing::Test {
protected:
    void sweep(const Way& way) {
        const Way none = {"", Thrown::nothing, false, [](unsigned int) {},
                          [](unsigned int) { return false; }};
        unsigned int points = 0;
        for (const Scenario& scenario : scenarios) {
            const Outcome whole = attempt(scenario, none, 1);
            Outcome outcome;
            outcome.isReached = true;
            for (unsigned int n = 1; outcome.isReached; ++n) {
                SCOPED_TRACE(scenario.name + (": " + way.name) + ' ' + std::to_string(n));
                outcome = attempt(scenario, way, n);
                check(scenario, way, outcome, whole);
                points += outcome.isReached ? 1U : 0U;
            }
        }
        std::cerr << way.name << ": " << points << " points\n";
        EXPECT_GT(points, 90U) << way.name;
    }

    oxahv::EmbeddedBroker broker_;

private:
    Outcome attempt(const Scenario& scenario, const Way& way, unsigned int n) {
        Outcome outcome;
        {
            Stage stage(broker_);
            outcome.before = stage.fields();
            failing::allocationsFrom(0);
            way.begin(n);
            try {
                scenario.run(stage);
                outcome.isReached = way.end(n);
            } catch (const TK::FrameworkException& exception) {
                outcome.isReached = way.end(n);
                stage.result = std::string("exception: ") + exception.what();
            } catch (const std::bad_alloc&) {
                outcome.isReached = way.end(n);
                outcome.thrown = Thrown::badAlloc;
            } catch (const LoggerFailure&) {
                outcome.isReached = way.end(n);
                outcome.thrown = Thrown::byTheLogger;
            }
            outcome.failedInBroker = failing::failedIn("oxahvbroker");
            outcome.result = stage.result;
            outcome.fields = stage.fields();
        }
        EXPECT_EQ(broker_.liveObjects().total(), 0U) << "everything dies with the request";
        return outcome;
    }
};

} // namespace

// What is set up once in a process, at the first text, must not stay half set up. Each attempt is a process
// of its own.
TEST_F(FaultSweep, FailsEveryAllocationOfTheFirstLocalisedText) {
    enum Exit { unreached = 10, failed, wrong };
    int last = failed;
    unsigned int n = 0;
    while (last != unreached) {
        ++n;
        const pid_t child = ::fork();
        if (child == 0) {
            const std::string right = TK::make_string(wideText);
            const char* text = right.c_str();
            bool isThrown = false;
            failing::allocation(n);
            try {
                text = PU::getNLSText(wideText);
            } catch (const std::bad_alloc&) {
                isThrown = true;
            }
            const bool isReached = failing::ended();
            const bool isRight = right == text && right == PU::getNLSText(wideText);
            ::_exit(!isRight || isThrown != isReached ? wrong : isReached ? failed : unreached);
        }
        int status = 0;
        ASSERT_EQ(::waitpid(child, &status, 0), child);
        ASSERT_TRUE(WIFEXITED(status)) << "ended by signal " << WTERMSIG(status);
        last = WEXITSTATUS(status);
        ASSERT_TRUE(last == failed || last == unreached) << "exit status " << last << " at " << n;
    }
    EXPECT_GT(n, 6U);
}

TEST_F(FaultSweep, FailsEveryCallOfTheBroker) {
    for (const Way& way : waysOfTheBroker(broker_)) {
        sweep(way);
    }
}

// With a plain global locale and with one that groups digits, where numbers go through streams; with and
// without traces.
TEST_F(FaultSweep, FailsEveryAllocation) {
    struct Grouping : std::numpunct<char> {
        std::string do_grouping() const override { return "\3"; }
    };
    const std::locale plain = std::locale();
    for (const std::locale& locale : {plain, std::locale(plain, new Grouping)}) {
        std::locale::global(locale);
        for (const Way& way : waysOfMemory()) {
            sweep(way);
            Way traced = way;
            traced.begin = [&way](unsigned int n) {
                HVLog::HVLogger::setSink([](const HVLog::Message& /*message*/) {});
                HVLog::HVLogger::setThreshold(0);
                way.begin(n);
            };
            traced.end = [&way](unsigned int n) {
                const bool isReached = way.end(n);
                HVLog::HVLogger::reset();
                return isReached;
            };
            sweep(traced);
        }
    }
    std::locale::global(plain);
}

TEST_F(FaultSweep, FailsEveryCallOfTheLogger) {
    sweep(wayOfTheLogger());
}
