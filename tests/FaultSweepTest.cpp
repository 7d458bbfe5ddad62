// Every operation of the library, with every failure below it, one at a time: for n = 1, 2, 3 … until the
// operation gets by, the n-th call of the broker, the n-th allocation, or the n-th call of the logger fails.
// What comes of it has to be what the headers say: the operation's own failure or the exception, outputs and
// the caller's objects as they were or as far as they came, and nothing of the broker's released.
#include "EmbeddedBroker.h"
#include "FailingMemory.h"
#include "HVLogger.h"
#include "ProviderUtilities.h"
#include "Trace.h"
#include "Utility.h"
#include "utils.h"

#include <algorithm>
#include <fstream>
#include <gtest/gtest.h>
#include <iostream>
#include <iterator>
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
const std::wstring noAscii(L"b\u00FCro");
const std::string dateText("20260329013000.000250+001");

struct LoggerFailure {};

// Counts the logger's calls and makes one of them throw.
class FailingLogger {
public:
    explicit FailingLogger(unsigned int failing) {
        HVLog::HVLogger::setSink([this, failing](const HVLog::Message& /*message*/) {
            if (++calls_ == failing) {
                throw LoggerFailure();
            }
        });
        HVLog::HVLogger::setThreshold(0);
    }
    ~FailingLogger() { HVLog::HVLogger::reset(); }
    FailingLogger(const FailingLogger&) = delete;
    FailingLogger& operator=(const FailingLogger&) = delete;
    unsigned int calls() const { return calls_; }

private:
    unsigned int calls_ = 0;
};

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

std::string textOf(CMPIObjectPath* path) {
    std::string text = PU::getNamespace(path) + ':' + PU::getClassName(path) + ' ';
    for (CMPICount i = 0; i < CMGetKeyCount(path, nullptr); ++i) {
        CMPIString* name = nullptr;
        const CMPIData data = CMGetKeyAt(path, i, &name, nullptr);
        text += CMGetCharsPtr(name, nullptr) + ("=" + textOf(data)) + ' ';
    }
    return text;
}

std::string textOf(Moniker moniker) {
    std::string text;
    for (unsigned int i = 0; moniker.selectKey(i); ++i) {
        std::string name;
        moniker.getName(name);
        unsigned short type = 0;
        moniker.getType(type);
        std::string value = "?";
        if (type == Moniker::COMPONENT_STRING) {
            moniker.getValue(value);
        } else if (type == Moniker::COMPONENT_UINT64) {
            unsigned long long number = 0;
            moniker.getValue(number);
            value = std::to_string(number);
        }
        text += name + ':' + std::to_string(type) + '=' + value + ' ';
    }
    return text;
}

template <class Element>
std::string textOf(const std::vector<Element>& elements) {
    std::ostringstream text;
    for (const Element& element : elements) {
        if constexpr (std::is_same_v<Element, std::wstring>) {
            text << TK::make_string(element) << ' ';
        } else {
            text << element << ' ';
        }
    }
    return text.str();
}

void addText(std::string& text, CMPIString* string) {
    text += string != nullptr ? CMGetCharsPtr(string, nullptr) : "NULL";
}

// The scene of one attempt: the caller's objects and outputs, made afresh.
class Stage {
public:
    explicit Stage(oxahv::EmbeddedBroker& embedded) : broker(embedded.handle()), request(embedded) {
        path = request.objectPathFromText("Demo.Byte=1,Big=7,Text=\"" + longText + "\"", "root/x");
        linked = request.objectPath("root/x", "Link");
        PU::setKeyProperty(linked, "End", path);
        reference = request.objectPath("root/x", "Earlier");
        instance = CMNewInstance(broker, request.objectPath("root/x", "Demo"), nullptr);
        CMPIValue value = {};
        value.uint16 = 7;
        CMSetProperty(instance, "Number", &value, CMPI_uint16);
        value.uint32 = 70000;
        CMSetProperty(instance, "Word", &value, CMPI_uint32);
        value.boolean = 1;
        CMSetProperty(instance, "Flag", &value, CMPI_boolean);
        CMSetProperty(instance, "Text", longText.c_str(), CMPI_chars);
        value.dateTime = CMNewDateTimeFromChars(broker, dateText.c_str(), nullptr);
        CMSetProperty(instance, "Date", &value, CMPI_dateTime);
        CMPIArray* const numberArray = CMNewArray(broker, 3, CMPI_uint16, nullptr);
        CMPIArray* const textArray = CMNewArray(broker, 3, CMPI_string, nullptr);
        for (CMPICount i = 0; i < 3; ++i) {
            value.uint16 = static_cast<CMPIUint16>(i + 4);
            CMSetArrayElementAt(numberArray, i, &value, CMPI_uint16);
            value.string = CMNewString(broker, (longText + std::to_string(i)).c_str(), nullptr);
            CMSetArrayElementAt(textArray, i, &value, CMPI_string);
        }
        value.array = numberArray;
        CMSetProperty(instance, "Numbers", &value, CMPI_uint16A);
        value.array = textArray;
        CMSetProperty(instance, "Texts", &value, CMPI_stringA);
        args = CMNewArgs(broker, nullptr);
        value.uint16 = 8;
        CMAddArg(args, "Number", &value, CMPI_uint16);
        value.uint32 = 80000;
        CMAddArg(args, "Word", &value, CMPI_uint32);
        value.boolean = 1;
        CMAddArg(args, "Flag", &value, CMPI_boolean);
        CMAddArg(args, "Text", longText.c_str(), CMPI_chars);
        string = CMNewString(broker, longText.c_str(), nullptr);
        keys.addKey("Text", longText);
        keys.addKey("Big", 18446744073709551615ULL);
        moniker.addKey("earlier", "key");
        file.setEntry(L"number", L"17");
        file.setEntry(L"date", L"2026-03-29 01:30:00");
        file.setEntry(L"text", wideText);
        std::ofstream(filePath) << "text = earlier\n";
    }
    ~Stage() { ::unlink(filePath.c_str()); }
    Stage(const Stage&) = delete;
    Stage& operator=(const Stage&) = delete;

    void answer(bool yes) { result = yes ? "true" : "false"; }
    void made(const void* object) { result = object != nullptr ? "made" : "null"; }

    // Everything that the caller can see, one text for each object.
    std::vector<std::string> fields() {
        std::string handles;
        addText(handles, string);
        std::ostringstream content;
        content << std::ifstream(filePath).rdbuf();
        std::vector<std::string> all = {"number=" + std::to_string(number),
                                        "word=" + std::to_string(word),
                                        "flag=" + std::to_string(flag ? 1 : 0),
                                        "text=" + text,
                                        "wide=" + TK::make_string(wide),
                                        "string=" + handles,
                                        "reference=" + (reference != nullptr ? textOf(reference) : "NULL"),
                                        textOf(numbers),
                                        textOf(texts),
                                        textOf(wides),
                                        textOf(moniker),
                                        textOf(keys),
                                        textOf(instance),
                                        textOf(path),
                                        content.str(),
                                        textOf(wideInputs),
                                        textOf(candidates),
                                        textOf(textInputs)};
        for (const wchar_t* const key : {L"number", L"word", L"date", L"text"}) {
            all.push_back(TK::make_string(file.getEntry(key)));
        }
        return all;
    }

    const CMPIBroker* broker;
    oxahv::Request request;
    CMPIInstance* instance = nullptr;
    CMPIObjectPath* path = nullptr;
    CMPIObjectPath* linked = nullptr; // has a reference to the path
    CMPIArgs* args = nullptr;
    std::string result = "returned";
    unsigned short number = 1;
    unsigned int word = 1;
    bool flag = false;
    std::string text = "earlier";
    std::wstring wide = L"earlier";
    CMPIString* string = nullptr;
    CMPIObjectPath* reference = nullptr;
    std::vector<unsigned short> numbers = {1};
    std::vector<std::string> texts = {"earlier"};
    std::vector<std::wstring> wides = {L"earlier"};
    Moniker moniker;
    Moniker keys;
    TK::PropertyFile file;
    std::string filePath = testing::TempDir() + "oxahv-sweep-" + std::to_string(::getpid());
    std::string textInput = longText;
    std::string dateInput = dateText;
    std::wstring wideInput = wideText;
    std::vector<unsigned char> byteInputs = {1, 2, 3};
    std::vector<unsigned short> numberInputs = {10, 20, 30};
    std::vector<std::string> textInputs = {longText, "short", longText};
    std::vector<std::string> candidates = {"Other", longText, "Demo"};
    std::string nameSpace = "root/x";
    std::vector<std::wstring> wideInputs = {wideText, L"short", wideText};
};

struct Scenario {
    const char* name;
    void (*run)(Stage& stage);
    std::vector<std::string> failures{}; // results that a failure may have
    bool isPartial = false;              // what was done before the failure stays
};

const char* const noConversion = "exception: String Conversion Failed !!";
const char* const noKeys = "exception: Could not Extract Keys from Object Path.";

std::vector<Scenario> scenarios() {
    const std::vector<std::string> no = {"false"};
    return {
        {"createInstance", [](Stage& s) { s.made(PU::createInstance(s.broker, s.path)); }, {"null"}},
        {"getClassName", [](Stage& s) { s.result = PU::getClassName(s.path); }, {""}},
        {"getNamespace", [](Stage& s) { s.result = PU::getNamespace(s.path); }, {""}},
        {"convertToString", [](Stage& s) { s.result = PU::convertToString(s.string); }, {noConversion}},
        {"setKeyProperty",
         [](Stage& s) {
             PU::setKeyProperty(s.path, "K1", static_cast<unsigned char>(1));
             PU::setKeyProperty(s.path, "K2", static_cast<unsigned short>(2));
             PU::setKeyProperty(s.path, "K3", 3U);
             PU::setKeyProperty(s.path, "K4", 4ULL);
             PU::setKeyProperty(s.path, "K5", "chars");
             PU::setKeyProperty(s.path, "K6", s.string);
             PU::setKeyProperty(s.path, "K7", s.textInput);
             PU::setKeyProperty(s.path, "K8", PU::createObjectPath(s.broker, "Other", "root/x"));
         },
         {},
         true},
        {"setKeyProperty(wide)", [](Stage& s) { PU::setKeyProperty(s.path, "Wide", s.wideInput); }},
        {"setKeyProperty(no ASCII)", [](Stage& s) { PU::setKeyProperty(s.path, "Wide", noAscii); }},
        {"setProperty",
         [](Stage& s) {
             PU::setProperty(s.instance, "P1", static_cast<unsigned char>(1));
             PU::setProperty(s.instance, "P2", static_cast<unsigned short>(2));
             PU::setProperty(s.instance, "P3", 3U);
             PU::setProperty(s.instance, "P4", 4ULL);
             PU::setProperty(s.instance, "P5", static_cast<short>(5));
             PU::setProperty(s.instance, "P6", 6.0F);
             PU::setProperty(s.instance, "P7", 7.0);
             PU::setProperty(s.instance, "P8", "chars");
             PU::setProperty(s.instance, "P9", s.string);
             PU::setProperty(s.instance, "PA", s.textInput);
             PU::setProperty(s.instance, "PB", true);
             PU::setProperty(s.instance, "PC", s.path);
         },
         {},
         true},
        {"setProperty(text)",
         [](Stage& s) { PU::setProperty(s.broker, s.instance, "Text", s.dateInput, false); }},
        {"setProperty(date)",
         [](Stage& s) { PU::setProperty(s.broker, s.instance, "When", s.dateInput, true); }},
        {"setProperty(no date)",
         [](Stage& s) { PU::setProperty(s.broker, s.instance, "When", s.textInput, true); }},
        {"setProperty(wide)", [](Stage& s) { PU::setProperty(s.instance, "Text", s.wideInput); }},
        {"setProperty(bytes)",
         [](Stage& s) { PU::setProperty(s.broker, s.instance, "Array", s.byteInputs); },
         {},
         true},
        {"setProperty(numbers)",
         [](Stage& s) { PU::setProperty(s.broker, s.instance, "Array", s.numberInputs); },
         {},
         true},
        {"setProperty(texts)",
         [](Stage& s) { PU::setProperty(s.broker, s.instance, "Array", s.textInputs); },
         {},
         true},
        {"setProperty(passwords)",
         [](Stage& s) { PU::setProperty(s.broker, s.instance, "UserPassword", s.textInputs); },
         {},
         true},
        {"setProperty(wides)",
         [](Stage& s) { PU::setProperty(s.broker, s.instance, "Array", s.wideInputs); },
         {},
         true},
        {"getKeyProperty(handle)", [](Stage& s) { s.answer(PU::getKeyProperty(s.path, "Text", &s.string)); },
         no},
        {"getKeyProperty(text)", [](Stage& s) { s.answer(PU::getKeyProperty(s.path, "Text", s.text)); }, no},
        {"getKeyProperty(wide)", [](Stage& s) { s.answer(PU::getKeyProperty(s.path, "Text", s.wide)); }, no},
        {"getKeyProperty(reference)",
         [](Stage& s) { s.answer(PU::getKeyProperty(s.linked, "End", &s.reference)); }, no},
        {"getProperty(16)", [](Stage& s) { s.answer(PU::getProperty(s.instance, "Number", s.number)); }, no},
        {"getProperty(32)", [](Stage& s) { s.answer(PU::getProperty(s.instance, "Word", s.word)); }, no},
        {"getProperty(flag)", [](Stage& s) { s.answer(PU::getProperty(s.instance, "Flag", s.flag)); }, no},
        {"getProperty(handle)", [](Stage& s) { s.answer(PU::getProperty(s.instance, "Text", &s.string)); },
         no},
        {"getProperty(text)", [](Stage& s) { s.answer(PU::getProperty(s.instance, "Text", s.text, false)); },
         no},
        {"getProperty(date)", [](Stage& s) { s.answer(PU::getProperty(s.instance, "Date", s.text, true)); },
         no},
        {"getProperty(wide)", [](Stage& s) { s.answer(PU::getProperty(s.instance, "Text", s.wide)); }, no},
        {"getProperty(numbers)",
         [](Stage& s) { s.answer(PU::getProperty(s.instance, "Numbers", s.numbers)); }, no, true},
        {"getProperty(texts)", [](Stage& s) { s.answer(PU::getProperty(s.instance, "Texts", s.texts)); }, no,
         true},
        {"getProperty(args, 16)", [](Stage& s) { s.answer(PU::getProperty(s.args, "Number", s.number)); },
         no},
        {"getProperty(args, 32)", [](Stage& s) { s.answer(PU::getProperty(s.args, "Word", s.word)); }, no},
        {"getProperty(args, flag)", [](Stage& s) { s.answer(PU::getProperty(s.args, "Flag", s.flag)); }, no},
        {"getProperty(args, text)", [](Stage& s) { s.answer(PU::getProperty(s.args, "Text", s.text)); }, no},
        {"getProperty(args, wide)", [](Stage& s) { s.answer(PU::getProperty(s.args, "Text", s.wide)); }, no},
        {"getKeyCount",
         [](Stage& s) { s.result = std::to_string(PU::getKeyCount(s.path)); },
         {"0", "1", "2", noKeys}},
        {"transformObjectPathToMoniker",
         [](Stage& s) { PU::transformObjectPathToMoniker(s.path, s.moniker); },
         {noKeys, noConversion},
         true},
        {"transformMonikerToObjectPath",
         [](Stage& s) { PU::transformMonikerToObjectPath(s.keys, &s.path); },
         {},
         true},
        {"createObjectPath",
         [](Stage& s) { s.made(PU::createObjectPath(s.broker, "Demo", longText)); },
         {"null"}},
        {"getClassId", [](Stage& s) { s.result = std::to_string(PU::getClassId(s.path)); }, {"0"}},
        {"areClassesRelated",
         [](Stage& s) { s.answer(PU::areClassesRelated(s.broker, s.nameSpace, s.candidates, "Demo")); }, no,
         true},
        {"names",
         [](Stage& s) {
             s.answer(PU::getClassId("oxatk_ethernetport") != 255 && PU::extend_getClassId(nullptr) == 0 &&
                      PU::textEqual("A", "a"));
         }},
        {"ValidateInput",
         [](Stage& s) {
             s.answer(PU::ValidateInput(s.textInput, longText) && PU::ValidateInput(s.wideInput, L"sftp:"));
         }},
        {"isKVM", [](Stage& s) { s.answer(PU::isKVM()); }},
        {"getNLSText", [](Stage& s) { s.result = PU::getNLSText(s.wideInput); }},
        {"WStringToAString", [](Stage& s) { s.answer(CUtility::WStringToAString(s.wideInput, s.text)); }},
        {"AStringToWString", [](Stage& s) { s.answer(CUtility::AStringToWString(s.textInput, s.wide)); }},
        {"AStringArrToWStringArr",
         [](Stage& s) { s.answer(CUtility::AStringArrToWStringArr(s.textInputs, s.wides)); },
         {},
         true},
        {"WStringArrToAStringArr",
         [](Stage& s) { s.answer(CUtility::WStringArrToAStringArr(s.wideInputs, s.texts)); },
         {},
         true},
        {"Convert...",
         [](Stage& s) {
             s.answer(PU::ConvertWideCharToMultiByte(s.wideInput, s.text) &&
                      PU::ConvertMultiByteToWideChar(s.textInput, s.wide));
         },
         {},
         true},
        {"CIM dates",
         [](Stage& s) {
             s.text = Utils::convertCIMDateTime(Utils::convertStringToDateTime(s.dateInput)) +
                      Utils::stripSpaces(s.textInput) + Utils::addZero(40);
         }},
        {"reading a property file",
         [](Stage& s) {
             s.text = Utils::ReadStringFromFile(s.file, "text");
             s.word =
                 Utils::ReadUint32FromFile(s.file, "number") + Utils::ReadUint8FromFile(s.file, "number");
             s.number = Utils::ReadDateFromFile(s.file, "date").getYear();
         },
         {},
         true},
        {"writing a property file",
         [](Stage& s) {
             Utils::WriteStringToFile(s.file, "text", longText);
             Utils::WriteUint8ToFile(s.file, "number", 200);
             Utils::WriteUint32ToFile(s.file, "word", 4000000000U);
             Utils::WriteDateToFile(s.file, "date", {"1999-12-31 23:59:59", 3});
         },
         {},
         true},
        {"saving a property file",
         [](Stage& s) {
             TK::PropertyFile saved(s.filePath);
             Utils::WriteStringToFile(saved, "text", longText);
             saved.save();
         }},
        {"monikers",
         [](Stage& s) {
             Moniker copy(s.keys);
             copy.addKey(longText, longText);
             s.moniker = copy;
             unsigned long long big = 0;
             s.moniker.selectKey(1);
             s.moniker.getValue(big);
         }},
        {"an exception's copies",
         [](Stage& s) {
             const TK::FrameworkException first(longText.c_str());
             TK::FrameworkException copy(first);
             copy = first;
             s.result = copy.what();
         }},
        {"trace points",
         [](Stage& s) {
             TK_TRACE_ENTERING(category);
             TK_TRACE_ENTERING_PARAMETERS(category, " stage=" << &s << " text=" << s.textInput << 1.5);
             TK_TRACE_MESSAGE(category, longText.c_str());
             TK_TRACE_VARIABLE(category, "word", s.word);
             TK_TRACE_VARIABLE(category, "textInput", s.textInput);
             TK_TRACE_EXITING_PARAMETERS(category, " result=" << s.text);
             TK_TRACE_EXITING(category);
         }},
    };
}

// What an attempt came to.
struct Outcome {
    std::string result;
    std::vector<std::string> before;
    std::vector<std::string> fields;
    bool isBadAlloc = false;
    bool isLoggerFailure = false;
    bool failedInBroker = false;
    unsigned int occasions = 0; // calls or allocations that were made
};

class NoOutput : public std::streambuf {
    int_type overflow(int_type character) override { return traits_type::not_eof(character); }
};

class TheFaultSweep : public testing::Test {
protected:
    TheFaultSweep() { output_ = std::cout.rdbuf(&noOutput_); }
    ~TheFaultSweep() override { std::cout.rdbuf(output_); }

    template <class Prepare, class Finish>
    Outcome attempt(const Scenario& scenario, const Prepare& prepare, const Finish& finish) {
        Outcome outcome;
        {
            Stage stage(broker_);
            outcome.before = stage.fields();
            prepare();
            try {
                scenario.run(stage);
                outcome.occasions = finish();
            } catch (const TK::FrameworkException& exception) {
                outcome.occasions = finish();
                stage.result = std::string("exception: ") + exception.what();
            } catch (const std::bad_alloc&) {
                outcome.occasions = finish();
                outcome.isBadAlloc = true;
            } catch (const LoggerFailure&) {
                outcome.occasions = finish();
                outcome.isLoggerFailure = true;
            }
            outcome.failedInBroker = failing::failedIn("oxahvbroker");
            outcome.result = stage.result;
            outcome.fields = stage.fields();
        }
        EXPECT_EQ(broker_.liveObjects().total(), 0U) << "everything dies with the request";
        return outcome;
    }

    Outcome plain(const Scenario& scenario) {
        return attempt(
            scenario, [] { failing::allocationsFrom(0); }, [] { return failing::ended() ? 1U : 0U; });
    }

    oxahv::EmbeddedBroker broker_;

private:
    NoOutput noOutput_;
    std::streambuf* output_ = nullptr;
};

std::vector<std::string> words(const std::string& text) {
    std::istringstream stream(text);
    return {std::istream_iterator<std::string>(stream), {}};
}

// Whether a word is the whole one, or the same with a value that the broker nulled.
bool isWordOf(const std::string& word, const std::string& whole) {
    if (word == whole) {
        return true;
    }
    const std::size_t equals = whole.find('=');
    const std::size_t value = equals != std::string::npos ? equals + 1 : 0;
    const std::string rest = word.compare(0, value, whole, 0, value) == 0 ? word.substr(value) : "?";
    return rest == "0" || rest == "NULL" || rest == "\"\"" || rest == "FALSE" || rest.empty();
}

// Whether a text is the whole one as far as it came: words may be missing or nulled, none is another.
bool isPartOf(const std::string& text, const std::string& whole) {
    const std::vector<std::string> wanted = words(whole);
    auto next = wanted.begin();
    for (const std::string& word : words(text)) {
        next = std::find_if(next, wanted.end(), [&](const std::string& w) { return isWordOf(word, w); });
        if (next == wanted.end()) {
            return false;
        }
        ++next;
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

// An outcome that was not thrown by what failed: the operation's own failures, or as much as it could do.
void expectDocumented(const Scenario& scenario, const Outcome& outcome, const Outcome& whole) {
    const bool isFailure = std::find(scenario.failures.begin(), scenario.failures.end(), outcome.result) !=
                           scenario.failures.end();
    EXPECT_TRUE(outcome.result == whole.result || isFailure) << outcome.result;
    const bool isWhole = outcome.result == whole.result;
    expectFields(outcome, whole, isWhole || scenario.isPartial ? Change::partial : Change::none);
}

} // namespace

// What is set up once in a process, at the first text, must not stay half set up. Each attempt is a process
// of its own.
TEST_F(TheFaultSweep, FailsEveryAllocationOfTheFirstLocalisedText) {
    enum Exit { right = 10, rightAtLast, unreached, wrong };
    int last = right;
    unsigned int points = 0;
    for (unsigned int n = 1; last != unreached; ++n) {
        SCOPED_TRACE(n);
        const pid_t child = ::fork();
        if (child == 0) {
            const std::wstring key = wideText;
            const char* text = nullptr;
            failing::allocation(n);
            try {
                text = PU::getNLSText(key);
            } catch (const std::bad_alloc&) {
                text = nullptr;
            }
            const bool isReached = failing::ended();
            const bool isFirstRight = text != nullptr && TK::make_string(key) == text;
            const bool isRight = TK::make_string(key) == PU::getNLSText(key);
            ::_exit(!isRight || (text != nullptr && !isFirstRight) ? wrong
                    : !isReached                                   ? unreached
                    : text != nullptr                              ? right
                                                                   : rightAtLast);
        }
        int status = 0;
        ASSERT_EQ(::waitpid(child, &status, 0), child);
        ASSERT_TRUE(WIFEXITED(status)) << "ended by signal " << WTERMSIG(status);
        last = WEXITSTATUS(status);
        ASSERT_TRUE(last == rightAtLast || last == unreached) << "exit status " << last;
        points += last != unreached ? 1U : 0U;
    }
    EXPECT_GT(points, 5U);
}

TEST_F(TheFaultSweep, FailsEveryCallOfTheBroker) {
    const struct {
        const char* name;
        oxahv::Fault fault;
        bool isHarmless;
    } kinds[] = {
        {"error code", {CMPI_RC_ERR_FAILED}, false},
        {"error code from then on", {CMPI_RC_ERR_FAILED, false, 0, 1, 0}, false},
        {"null with OK", {CMPI_RC_OK, true}, false},
        {"NULL state", {CMPI_RC_OK, false, CMPI_nullValue}, false},
        {"extra state bits",
         {CMPI_RC_OK, false, static_cast<CMPIValueState>(CMPI_keyValue | CMPI_badValue | CMPI_notFound)},
         true},
    };
    unsigned int points = 0;
    for (const Scenario& scenario : scenarios()) {
        const Outcome whole = plain(scenario);
        for (const auto& kind : kinds) {
            bool isReached = true;
            for (unsigned int n = 1; isReached; ++n) {
                SCOPED_TRACE(scenario.name + std::string(", ") + kind.name + ' ' + std::to_string(n));
                oxahv::Fault fault = kind.fault;
                fault.firstCall = n;
                const Outcome outcome = attempt(
                    scenario,
                    [&] {
                        broker_.injectFault("*", fault);
                        broker_.startRecording();
                    },
                    [&] {
                        const std::vector<oxahv::Call> calls = broker_.stopRecording();
                        broker_.clearFaults();
                        for (const oxahv::Call& call : calls) {
                            EXPECT_EQ(call.slot.find("elease"), std::string::npos) << call.slot;
                            EXPECT_EQ(call.slot.find("free"), std::string::npos) << call.slot;
                        }
                        return static_cast<unsigned int>(calls.size());
                    });
                isReached = outcome.occasions >= n;
                points += isReached ? 1U : 0U;
                EXPECT_FALSE(outcome.isBadAlloc || outcome.isLoggerFailure);
                if (isReached && !kind.isHarmless) {
                    expectDocumented(scenario, outcome, whole);
                } else {
                    EXPECT_EQ(outcome.result, whole.result);
                    expectFields(outcome, whole, Change::whole);
                }
            }
        }
    }
    std::cerr << points << " calls of the broker failed\n";
    EXPECT_GT(points, 300U);
}

TEST_F(TheFaultSweep, FailsEveryAllocation) {
    unsigned int points = 0;
    for (const bool once : {true, false}) {
        for (const bool traces : {false, true}) {
            for (const Scenario& scenario : scenarios()) {
                const Outcome whole = plain(scenario);
                bool isReached = true;
                for (unsigned int n = 1; isReached; ++n) {
                    SCOPED_TRACE(scenario.name + std::string(once ? ", allocation " : ", allocations from ") +
                                 std::to_string(n));
                    const FailingLogger logger(0);
                    if (!traces) {
                        HVLog::HVLogger::setThreshold(HVLog::HVLogger::off);
                    }
                    const Outcome outcome = attempt(
                        scenario, [&] { once ? failing::allocation(n) : failing::allocationsFrom(n); },
                        [&] {
                            isReached = failing::ended();
                            return failing::allocations();
                        });
                    points += isReached ? 1U : 0U;
                    if (outcome.isBadAlloc) {
                        expectFields(outcome, whole, scenario.isPartial ? Change::partial : Change::none);
                    } else if (isReached) {
                        EXPECT_TRUE(outcome.failedInBroker) << "a failed allocation was swallowed";
                        expectDocumented(scenario, outcome, whole);
                    } else {
                        EXPECT_EQ(outcome.result, whole.result);
                        expectFields(outcome, whole, Change::whole);
                    }
                }
            }
        }
    }
    std::cerr << points << " allocations failed\n";
    EXPECT_GT(points, 600U);
}

TEST_F(TheFaultSweep, FailsEveryCallOfTheLogger) {
    unsigned int points = 0;
    for (const Scenario& scenario : scenarios()) {
        const Outcome whole = plain(scenario);
        bool isReached = true;
        for (unsigned int n = 1; isReached; ++n) {
            SCOPED_TRACE(scenario.name + std::string(", call of the logger ") + std::to_string(n));
            const FailingLogger logger(n);
            const Outcome outcome = attempt(
                scenario, [] {}, [&] { return logger.calls(); });
            isReached = outcome.occasions >= n;
            points += isReached ? 1U : 0U;
            EXPECT_EQ(outcome.isLoggerFailure, isReached) << "what the logger throws passes through";
            if (isReached) {
                expectFields(outcome, whole, scenario.isPartial ? Change::partial : Change::none);
            } else {
                EXPECT_EQ(outcome.result, whole.result);
                expectFields(outcome, whole, Change::whole);
            }
        }
    }
    std::cerr << points << " calls of the logger failed\n";
    EXPECT_GT(points, 150U);
}

// Where a locale groups digits, a stream writes an address, and it must not keep the lack of memory to
// itself.
TEST_F(TheFaultSweep, FailsEveryAllocationOfAnAddressInALocaleThatGroups) {
    struct Grouping : std::numpunct<char> {
        std::string do_grouping() const override { return "\3"; }
    };
    const std::locale before = std::locale::global(std::locale(std::locale::classic(), new Grouping));
    std::ostringstream expected;
    expected << static_cast<const void*>(this);
    std::string traced;
    traced.reserve(TK::traceBufferSize);
    HVLog::HVLogger::setSink([&](const HVLog::Message& message) { traced = message.text; });
    HVLog::HVLogger::setThreshold(0);
    bool isReached = true;
    for (unsigned int n = 1; isReached; ++n) {
        SCOPED_TRACE(n);
        traced.clear();
        failing::allocation(n);
        try {
            TK_TRACE_ENTERING_PARAMETERS(category, " this=" << this);
            isReached = failing::ended();
            EXPECT_FALSE(isReached) << "a failed allocation was swallowed";
        } catch (const std::bad_alloc&) {
            isReached = failing::ended();
        }
        EXPECT_TRUE(traced.empty() || traced.find(" this=" + expected.str()) != std::string::npos) << traced;
    }
    HVLog::HVLogger::reset();
    std::locale::global(before);
}
