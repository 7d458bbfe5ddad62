#include "Rows.h"

#ifdef OXAHVBENCH_KIT
#include "Kit.h"
#endif

#include "ClassTable.h"
#include "Floors.h"
#include "ThinBroker.h"
#include "Trace.h"
#include "Utility.h"
#include "utils.h"

#include <array>
#include <cctype>
#include <charconv>
#include <cmpimacs.h>
#include <cstdio>
#include <cstring>
#include <cwchar>
#include <strings.h>

namespace rows {

namespace {

using Utilities = TK::ProviderUtilities;

const std::string category("Hovara.Benchmark");
thin::Objects& broker = thin::objects();

// Hides from the optimizer what a value is.
template <class T>
T opaque(T value) {
    benchmark::DoNotOptimize(value);
    return value;
}

// Puts the table together. Each call after `add` says more about the row that it added.
class Table {
public:
    template <class Operation>
    Table& add(std::string name, Operation operation) {
        rows_.emplace_back();
        last().name = std::move(name);
        last().operation = repeat(std::move(operation));
        return *this;
    }
    template <class Floor>
    Table& floor(std::string name, Floor run) {
        last().floorName = std::move(name);
        last().floor = repeat(std::move(run));
        return *this;
    }

    Table& units(double each) { return units(each, each); }
    Table& units(double each, double ofFloor) {
        last().units = each;
        last().floorUnits = ofFloor;
        return *this;
    }
    Table& onTwoThreads() {
        last().onTwoThreads = true;
        return *this;
    }

    // Goals.
    Table& atMostFloor(double times) {
        last().atMostFloor = times;
        return *this;
    }
    Table& overFloor(double nanoseconds, double blocks) {
        last().overFloor = nanoseconds;
        last().allocationsOverFloor = blocks;
        return *this;
    }
    Table& atMostBaseline(double times) {
        last().atMostBaseline = times;
        return *this;
    }
    Table& allocations(double most) {
        last().allocations = most;
        return *this;
    }

    std::vector<Row>& rows() { return rows_; }

private:
    Row& last() { return rows_.back(); }

    std::vector<Row> rows_;
};

// Class registry

// Each class's name as it stands, in lower case and in upper case, with the name as it stands.
std::vector<std::pair<std::string, std::string>> classNames() {
    std::vector<std::pair<std::string, std::string>> names;
    for (const auto& entry : TK::classTable) {
        std::string lower;
        std::string upper;
        for (const char c : std::string(entry.name)) {
            lower += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
            upper += static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
        }
        for (const std::string& name : {std::string(entry.name), lower, upper}) {
            names.emplace_back(name, entry.name);
        }
    }
    return names;
}

void addRegistry(Table& table) {
    static const auto names = classNames();
    const std::string compare = "one strcasecmp";
    table
        .add("getClassId, found: mean of all names in any case",
             [] {
                 unsigned int sum = 0;
                 for (const auto& name : names) {
                     sum += Utilities::getClassId(name.first.c_str());
                 }
                 return sum;
             })
        .floor(compare,
               [] {
                   int sum = 0;
                   for (const auto& [asked, given] : names) {
                       sum += static_cast<int>(strcasecmp(opaque(asked.c_str()), given.c_str()) == 0);
                   }
                   return sum;
               })
        .units(static_cast<double>(names.size()))
        .atMostFloor(4)
        .allocations(0);
    const auto notFound = [&](const std::string& what, const char* name, const char* other) {
        table.add("getClassId, not found: " + what, [=] { return Utilities::getClassId(opaque(name)); })
            .floor(compare, [=] { return strcasecmp(opaque(other), other); })
            .atMostFloor(4)
            .allocations(0);
    };
    notFound("same length as a name", "OXATK_EthernetPorz", "OXATK_EthernetPort");
    notFound("unrelated", "CIM_ManagedSystemElement", "CIM_ManagedSystemElement");
}

// Scalar accessors

// The bare calls under the names of TK::ProviderUtilities, so that one function serves operation and floor.
struct BareCalls {
    template <class Value>
    static void setProperty(CMPIInstance* instance, const char* name, Value value) {
        floors::setProperty(instance, name, value);
    }
    static void setProperty(CMPIInstance* instance, const char* name, const std::string& value) {
        floors::setProperty(instance, name, value.c_str());
    }
    template <class Value>
    static void setKeyProperty(CMPIObjectPath* path, const char* name, Value value) {
        floors::setKeyProperty(path, name, value);
    }
    static void setKeyProperty(CMPIObjectPath* path, const char* name, const std::string& value) {
        floors::setKeyProperty(path, name, value.c_str());
    }
    template <class Object, class Out>
    static bool getProperty(const Object* object, const char* name, Out& out) {
        return floors::get(object, name, out);
    }
    template <class Object, class Out>
    static bool getProperty(const Object* object, const char* name, Out** out) {
        return floors::get(object, name, *out);
    }
    template <class Element>
    static bool getProperty(const CMPIInstance* instance, const char* name, std::vector<Element>& out) {
        return floors::getArray(instance, name, out);
    }
    template <class Out>
    static bool getKeyProperty(const CMPIObjectPath* path, const char* name, Out** out) {
        return floors::get(path, name, *out);
    }
    static bool getKeyProperty(const CMPIObjectPath* path, const char* name, std::string& out) {
        return floors::get(path, name, out);
    }
};

template <class Calls>
void setNumbers() {
    CMPIInstance* const instance = &broker.instance;
    Calls::setProperty(instance, "Enabled", true);
    Calls::setProperty(instance, "Slot", static_cast<unsigned char>(65));
    Calls::setProperty(instance, "Port", static_cast<unsigned short>(5989));
    Calls::setProperty(instance, "Index", 90210U);
    Calls::setProperty(instance, "Speed", 1000000000ULL);
    Calls::setProperty(instance, "Offset", static_cast<short>(-7));
    Calls::setProperty(instance, "Load", 0.5F);
    Calls::setProperty(instance, "Temperature", 36.6);
}

std::string elementName = "Onboard network port";

template <class Calls>
void setHandles() {
    Calls::setProperty(&broker.instance, "Name", &broker.text);
    Calls::setProperty(&broker.instance, "System", &broker.path);
    Calls::setProperty(&broker.instance, "DeviceID", "eth0");
    Calls::setProperty(&broker.instance, "ElementName", elementName);
}

template <class Calls>
void setKeyNumbers() {
    CMPIObjectPath* const path = &broker.path;
    Calls::setKeyProperty(path, "Slot", static_cast<unsigned char>(65));
    Calls::setKeyProperty(path, "Port", static_cast<unsigned short>(5989));
    Calls::setKeyProperty(path, "Index", 90210U);
    Calls::setKeyProperty(path, "Address", 92301387612431ULL);
}

template <class Calls>
void setKeyHandles() {
    Calls::setKeyProperty(&broker.path, "Name", &broker.text);
    Calls::setKeyProperty(&broker.path, "System", &broker.path);
    Calls::setKeyProperty(&broker.path, "DeviceID", "eth0");
    Calls::setKeyProperty(&broker.path, "ElementName", elementName);
}

template <class Calls, class Object>
unsigned int getNumbers(const Object* object) {
    unsigned short port = 0;
    unsigned int index = 0;
    bool enabled = false;
    Calls::getProperty(object, "Port", port);
    Calls::getProperty(object, "Index", index);
    Calls::getProperty(object, "Enabled", enabled);
    return port + index + static_cast<unsigned int>(enabled);
}

template <class Calls>
bool getHandles() {
    CMPIString* text = nullptr;
    CMPIString* key = nullptr;
    CMPIObjectPath* reference = nullptr;
    return Calls::getProperty(&broker.textInstance, "Name", &text) &&
           Calls::getKeyProperty(&broker.path, "DeviceID", &key) &&
           Calls::getKeyProperty(&broker.path, "System", &reference);
}

void addScalars(Table& table) {
    const auto row = [&table](const std::string& name, auto operation, auto floor, int calls) {
        table.add(name, operation)
            .floor("the bare CMPI call", floor)
            .units(calls)
            .atMostFloor(1.1)
            .allocations(0);
    };
    row("setProperty: 8 kinds of numbers", setNumbers<Utilities>, setNumbers<BareCalls>, 8);
    row("setProperty: string, reference, C text, C++ text", setHandles<Utilities>, setHandles<BareCalls>, 4);
    row("setKeyProperty: 4 kinds of numbers", setKeyNumbers<Utilities>, setKeyNumbers<BareCalls>, 4);
    row("setKeyProperty: string, reference, C text, C++ text", setKeyHandles<Utilities>,
        setKeyHandles<BareCalls>, 4);
    row(
        "getProperty of an instance: 3 kinds", [] { return getNumbers<Utilities>(&broker.instance); },
        [] { return getNumbers<BareCalls>(&broker.instance); }, 3);
    row(
        "getProperty of arguments: 3 kinds", [] { return getNumbers<Utilities>(&broker.args); },
        [] { return getNumbers<BareCalls>(&broker.args); }, 3);
    row("getProperty, getKeyProperty: 3 handles", getHandles<Utilities>, getHandles<BareCalls>, 3);
}

void addTexts(Table& table) {
    const auto row = [&table](const std::string& name, auto get, auto getBare) -> Table& {
        const auto sizeOf = [](auto getter) {
            return [getter] {
                std::string out;
                getter(out);
                return out.size();
            };
        };
        return table.add(name, sizeOf(get))
            .floor("the bare calls, one assignment", sizeOf(getBare))
            .atMostFloor(1.2);
    };
    row(
        "getProperty of an instance: text",
        [](auto& out) { Utilities::getProperty(&broker.textInstance, "Name", out, false); },
        [](auto& out) { floors::get(&broker.textInstance, "Name", out); })
        .allocations(0);
    row(
        "getProperty of an instance: date as text",
        [](auto& out) { Utilities::getProperty(&broker.dateInstance, "Name", out, true); },
        [](auto& out) { floors::getDate(&broker.dateInstance, "Name", out); })
        .allocations(1); // the result is longer than a string holds by itself
    row(
        "getProperty of arguments: text",
        [](auto& out) { Utilities::getProperty(&broker.textArgs, "Name", out); },
        [](auto& out) { floors::get(&broker.textArgs, "Name", out); })
        .allocations(0);
    row(
        "getKeyProperty: text", [](auto& out) { Utilities::getKeyProperty(&broker.path, "DeviceID", out); },
        [](auto& out) { floors::get(&broker.path, "DeviceID", out); })
        .allocations(0);

    // A wide text takes a conversion besides.
    static std::wstring value = L"Onboard port";
    row(
        "getProperty of an instance: wide text",
        [](auto& /*out*/) {
            std::wstring out;
            Utilities::getProperty(&broker.textInstance, "Name", out);
            benchmark::DoNotOptimize(out);
        },
        [](auto& out) { floors::get(&broker.textInstance, "Name", out); })
        .atMostFloor(0)
        .allocations(5);
    table
        .add("setProperty: wide text", [] { Utilities::setProperty(&broker.instance, "ElementName", value); })
        .floor("the bare CMPI call",
               [] { floors::setProperty(&broker.instance, "ElementName", "Onboard port"); })
        .allocations(5);
}

// Monikers and object paths

// Sixteen keys of four kinds, for a list that a `push` fills.
template <class List, class Push>
void fillWithNumbers(List& list, Push push) {
    for (int i = 0; i < 4; ++i) {
        push(list, "Slot", static_cast<unsigned char>(65));
        push(list, "Port", static_cast<unsigned short>(5989));
        push(list, "InterfaceIndex", 90210U);
        push(list, "Address", 92301387612431ULL);
    }
}

template <class Number>
Number numberOfMoniker() {
    static const TK::Moniker moniker = [] {
        TK::Moniker made;
        made.addKey("Number", static_cast<Number>(54321));
        return made;
    }();
    Number number = 0;
    moniker.getValue(number);
    return number;
}

template <class Number>
Number numberFromChars() {
    static const std::string text = "54321";
    Number number = 0;
    floors::read(text, number);
    return number;
}

void addMonikers(Table& table) {
    table
        .add("addKey: 4 kinds of numbers, 16 keys",
             [] {
                 TK::Moniker moniker;
                 fillWithNumbers(
                     moniker, [](auto& list, const char* name, auto number) { list.addKey(name, number); });
                 return moniker.getKeyCount();
             })
        .floor("push of the record, to_chars",
               [] {
                   floors::Keys keys;
                   fillWithNumbers(keys, [](auto& list, const char* name, auto number) {
                       floors::push(list, name, number);
                   });
                   return keys.size();
               })
        .units(16)
        .atMostFloor(1.5)
        .allocations(5.0 / 16);
    table
        .add("getValue: 4 kinds of numbers",
             [] {
                 return numberOfMoniker<unsigned char>() + numberOfMoniker<unsigned short>() +
                        numberOfMoniker<unsigned int>() + numberOfMoniker<unsigned long long>();
             })
        .floor("from_chars",
               [] {
                   return numberFromChars<unsigned char>() + numberFromChars<unsigned short>() +
                          numberFromChars<unsigned int>() + numberFromChars<unsigned long long>();
               })
        .units(4)
        .atMostFloor(4)
        .allocations(0);
}

// The moniker of a path, made once; each thread has its own, since a selection changes it.
TK::Moniker& monikerOf(const CMPIObjectPath* path) {
    static thread_local std::vector<std::pair<const CMPIObjectPath*, TK::Moniker>> made;
    for (auto& [known, moniker] : made) {
        if (known == path) {
            return moniker;
        }
    }
    made.emplace_back(path, TK::Moniker());
    Utilities::transformObjectPathToMoniker(path, made.back().second);
    return made.back().second;
}

// The broker's calls that the two conversions need.
CMPICount readKeys(const CMPIObjectPath* path) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPICount keys = CMGetKeyCount(path, &status);
    for (CMPICount i = 0; i < 2 * keys; ++i) {
        CMPIString* name = nullptr;
        CMGetKeyAt(path, i % keys, &name, &status);
        benchmark::DoNotOptimize(CMGetCharsPtr(name, &status));
    }
    return keys;
}

CMPIObjectPath* newPath() {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIObjectPath* const path = CMNewObjectPath(&broker.broker, "root/cimv2", "OXATK_EthernetPort", &status);
    CMSetNameSpace(path, "root/cimv2");
    return path;
}

void setFiveKeys() {
    setKeyNumbers<BareCalls>();
    floors::setKeyProperty(&broker.path, "DeviceID", "eth0");
}

void addPaths(Table& table) {
    const std::string bare = "the broker's calls alone";
    table
        .add("path to moniker, 5 keys",
             [] {
                 TK::Moniker moniker;
                 Utilities::transformObjectPathToMoniker(&broker.path, moniker);
                 return moniker.getKeyCount();
             })
        .floor(bare, [] { return readKeys(&broker.path); })
        .onTwoThreads()
        .atMostBaseline(0.65)
        .allocations(15);
    table
        .add("moniker to path, 5 keys",
             [] {
                 CMPIObjectPath* path = &broker.path;
                 Utilities::transformMonikerToObjectPath(monikerOf(path), &path);
             })
        .floor(bare, setFiveKeys)
        .onTwoThreads()
        .atMostBaseline(0.65)
        .allocations(6);
    table
        .add("createObjectPath",
             [] { return Utilities::createObjectPath(&broker.broker, "OXATK_EthernetPort", "root/cimv2"); })
        .floor(bare, newPath)
        .onTwoThreads()
        .allocations(10);
    table.add("getClassId of a path", [] { return Utilities::getClassId(&broker.path); })
        .floor(bare,
               [] {
                   CMPIStatus status = {CMPI_RC_OK, nullptr};
                   return CMGetCharsPtr(CMGetClassName(&broker.path, &status), &status);
               })
        .allocations(2);
}

// Trace points

// The same text twice, into a buffer as large as a trace point's.
template <class... Arguments>
void formatTwice(const char* format, Arguments... arguments) {
    std::array<char, TK::traceBufferSize> text; // NOLINT(cppcoreguidelines-pro-type-member-init): the floor
    for (int i = 0; i < 2; ++i) {
        static_cast<void>(std::snprintf(text.data(), text.size(), format, arguments...));
        benchmark::DoNotOptimize(text);
    }
}

// NOLINTBEGIN(bugprone-lambda-function-name): a trace point names the function that it is in, here a lambda's
void addTraces(Table& table) {
    const auto row = [&table](const std::string& name, auto trace, auto format, double most) {
        table.add("trace point " + name, trace)
            .floor("two snprintf", format)
            .onTwoThreads()
            .atMostFloor(most)
            .allocations(2);
    };
    row(
        "ENTERING", [] { TK_TRACE_ENTERING(category); },
        [] { formatTwice("ENTERING: %s() in %s [Line: %d]", "operator()", "Rows.cpp", 447); }, 0.3);
    row(
        "MESSAGE", [] { TK_TRACE_MESSAGE(category, "Failed to convert the data"); },
        [] {
            formatTwice("MESSAGE [File: %s, Line: %d]: %s", "Rows.cpp", 450, "Failed to convert the data");
        },
        0.3);
    row(
        "VARIABLE, number", [] { TK_TRACE_VARIABLE(category, "keyCount", 90210U); },
        [] {
            formatTwice("VARIABLE: '%s' has Value '%d' at line %d in %s", "keyCount", 90210, 456, "Rows.cpp");
        },
        0.3);
    row(
        "VARIABLE, text", [] { TK_TRACE_VARIABLE(category, "classname", "OXATK_EthernetPort"); },
        [] {
            formatTwice("VARIABLE: '%s' has Value '%s' at line %d in %s", "classname", "OXATK_EthernetPort",
                        462, "Rows.cpp");
        },
        0.3);
    row(
        "ENTERING with parameter list",
        [] {
            TK_TRACE_ENTERING_PARAMETERS(category, " broker=" << &broker.broker << " instance="
                                                              << &broker.instance << " name=RequestedSpeeds");
        },
        [] {
            formatTwice("ENTERING: %s() in %s [Line: %d],Parameters List:  broker=%p instance=%p name=%s",
                        "operator()", "Rows.cpp", 470, static_cast<const void*>(&broker.broker),
                        static_cast<const void*>(&broker.instance), "RequestedSpeeds");
        },
        0.32);
}
// NOLINTEND(bugprone-lambda-function-name)

// Users' texts and conversions

// A text of plain words, without anything that the screen looks for.
std::string words(std::size_t size) {
    const std::string sample = "Rack 12, row B. Power supply redundancy is full. ";
    std::string text;
    text.reserve(size + sample.size());
    while (text.size() < size) {
        text += sample;
    }
    text.resize(size);
    return text;
}

std::wstring wide(const std::string& ascii) {
    return {ascii.begin(), ascii.end()};
}

// A text that is not ASCII, in UTF-8; about half of its characters take two bytes or three.
std::string umlauts(std::size_t size) {
    const std::string sample = "Gr\xC3\xB6\xC3\x9F\xE2\x82\xAC";
    std::string text;
    while (text.size() + sample.size() <= size) {
        text += sample;
    }
    text.append(size - text.size(), '.');
    return text;
}

std::wstring wideUmlauts(std::size_t size) {
    std::wstring text;
    TK::CUtility::AStringToWString(umlauts(size), text);
    return text;
}

constexpr std::size_t small = 16;
constexpr std::size_t page = 4096;
constexpr std::size_t block = 65536;

template <class Text>
bool screen(const Text& text) {
    return Utilities::ValidateInput(text, {});
}

void addScreen(Table& table) {
    static const std::string clean = words(block);
    static const std::wstring wideClean = wide(clean);
    static const std::string shortText = words(small);
    static const std::wstring shortWide = wide(shortText);
    // Each takes its text by value: one block.
    table.add("ValidateInput, clean, 64 KiB", [] { return screen(clean); })
        .floor("one memchr pass", [] { return std::memchr(opaque(clean.data()), '<', clean.size()); })
        .atMostFloor(15)
        .allocations(1);
    table.add("ValidateInput, clean, 64 Ki wide characters", [] { return screen(wideClean); })
        .floor("one wmemchr pass",
               [] { return std::wmemchr(opaque(wideClean.data()), L'<', wideClean.size()); })
        .atMostFloor(10)
        .allocations(1);
    table.add("ValidateInput, clean, 16 wide characters", [] { return screen(shortWide); })
        .floor("the narrow one", [] { return screen(shortText); })
        .atMostFloor(1.3)
        .allocations(1);
}

std::wstring toWide(const std::string& text) {
    std::wstring out;
    TK::CUtility::AStringToWString(text, out);
    return out;
}

std::string toNarrow(const std::wstring& text) {
    std::string out;
    TK::CUtility::WStringToAString(text, out);
    return out;
}

// The C library's conversion alone, into a buffer that exists.
std::size_t bareToWide(const std::string& text) {
    static thread_local std::array<wchar_t, page + 1> buffer;
    return std::mbstowcs(buffer.data(), text.c_str(), buffer.size());
}

std::size_t bareToNarrow(const std::wstring& text) {
    static thread_local std::array<char, 4 * page + 1> buffer;
    const wchar_t* source = text.c_str();
    std::mbstate_t state{};
    return std::wcsrtombs(buffer.data(), &source, buffer.size(), &state);
}

void addConversions(Table& table) {
    struct Case {
        std::string what;
        std::string narrow;
        std::wstring broad;
        double most;
    };
    static const std::array<Case, 3> cases = {{{"4 KiB ASCII", words(page), wide(words(page)), 0.7},
                                               {"4 KiB non-ASCII", umlauts(page), wideUmlauts(page), 1.15},
                                               {"16 B", words(small), wide(words(small)), 0}}};
    for (const Case& each : cases) {
        table.add("AStringToWString, " + each.what, [&each] { return toWide(each.narrow); })
            .floor("mbstowcs alone", [&each] { return bareToWide(each.narrow); })
            .atMostFloor(each.most)
            .allocations(6);
        table.add("WStringToAString, " + each.what, [&each] { return toNarrow(each.broad); })
            .floor("wcsrtombs alone", [&each] { return bareToNarrow(each.broad); })
            .atMostFloor(each.most)
            .allocations(6);
    }
}

// Dates, arrays, property files

const TK::DateTime& someDate() {
    static const TK::DateTime date("2026-03-29 01:30:07.250+002", 3);
    return date;
}

void addDates(Table& table) {
    static const std::string text = "20260329013007.000250+120";
    table.add("date parse", [] { return TK::Utils::convertStringToDateTime(text).getMillisecond(); })
        .floor("eight from_chars",
               [] {
                   int sum = 0;
                   constexpr std::array<std::size_t, 9> ends = {0, 4, 6, 8, 10, 12, 14, 21, 25};
                   for (std::size_t i = 1; i < ends.size(); ++i) {
                       int number = 0;
                       std::from_chars(text.data() + ends[i - 1] + (i > 6 ? 1 : 0), text.data() + ends[i],
                                       number);
                       sum += number;
                   }
                   return sum;
               })
        .allocations(5);
    table.add("date format", [] { return TK::Utils::convertCIMDateTime(someDate()); })
        .floor("one snprintf",
               [] {
                   std::array<char, 26> out; // NOLINT(cppcoreguidelines-pro-type-member-init): the floor
                   static_cast<void>(std::snprintf(out.data(), out.size(),
                                                   "%04u%02u%02u%02u%02u%02u.%06u%c%03u", 2026U, 3U, 29U, 1U,
                                                   30U, 7U, 250U, '+', 120U));
                   return std::string(out.data());
               })
        .allocations(5);
}

template <class Calls, class Element>
std::size_t getArray() {
    std::vector<Element> out;
    const bool areTexts = std::is_same_v<Element, std::string>;
    Calls::getProperty(areTexts ? &broker.textsInstance : &broker.numbersInstance, "Names", out);
    return out.size();
}

void addArrays(Table& table) {
    constexpr std::size_t size = thin::arraySize;
    static std::vector<unsigned char> bytes(size, 65);
    static std::vector<unsigned short> numbers(size, 5989);
    static std::vector<std::string> texts(size, "enp0s31f6");
    static std::vector<std::wstring> wideTexts(size, L"enp0s31f6");
    const auto setter = [&table](const std::string& name, auto& elements, const auto& bare, double blocks) {
        table
            .add("array setter, 64 " + name,
                 [&elements] { Utilities::setProperty(&broker.broker, &broker.instance, "Names", elements); })
            .floor("the bare calls",
                   [&bare] { floors::setArray(&broker.broker, &broker.instance, "Names", bare); })
            .allocations(blocks);
    };
    setter("numbers of 8 bits", bytes, bytes, 8);
    setter("numbers", numbers, numbers, 8);
    setter("texts", texts, texts, 8);
    setter("wide texts", wideTexts, texts, 70);

    const std::string push = "the bare calls, a push of each";
    // The vector grows seven times to 64 elements.
    table.add("array getter, 64 numbers", getArray<Utilities, unsigned short>)
        .floor(push, getArray<BareCalls, unsigned short>)
        .atMostFloor(1.2)
        .allocations(7);
    table.add("array getter, 64 texts", getArray<Utilities, std::string>)
        .floor(push, getArray<BareCalls, std::string>)
        .atMostFloor(1.2)
        .allocations(7);
}

// A file of some entries.
struct FilledFile : TK::PropertyFile {
    FilledFile() {
        for (int i = 0; i < 20; ++i) {
            setEntry(L"asset.entry." + std::to_wstring(i), L"some value");
        }
        setEntry(L"asset.number", L"90210");
        setEntry(L"asset.byte", L"65");
    }
};

void addPropertyFile(Table& table) {
    static FilledFile file;
    static const std::string key = "asset.number";
    static const std::wstring wideKey = L"asset.number";
    static const std::wstring value = L"90210";
    static const std::string byteKey = "asset.byte";
    static const std::wstring wideByteKey = L"asset.byte";
    static const std::wstring byteValue = L"65";
    const auto row = [&table](const std::string& name, auto operation, const std::string& floorName,
                              auto floor) {
        table.add(name, operation).floor(floorName, floor).atMostFloor(1.6);
    };
    row(
        "ReadUint32FromFile", [] { return TK::Utils::ReadUint32FromFile(file, key); }, "the file's getEntry",
        [] { return file.getEntry(wideKey); });
    row(
        "ReadUint8FromFile", [] { return TK::Utils::ReadUint8FromFile(file, byteKey); },
        "the file's getEntry", [] { return file.getEntry(wideByteKey); });
    row(
        "WriteUint8ToFile",
        [] { TK::Utils::WriteUint8ToFile(file, byteKey, opaque(static_cast<unsigned char>(65))); },
        "the file's setEntry", [] { file.setEntry(wideByteKey, byteValue); });
    row(
        "WriteUint32ToFile", [] { TK::Utils::WriteUint32ToFile(file, key, opaque(90210U)); },
        "the file's setEntry", [] { file.setEntry(wideKey, value); });
}

// A request

// What a provider does to answer a request for one instance.
unsigned short answer() {
    const CMPIBroker* const server = &broker.broker;
    const unsigned short id = Utilities::getClassId(&broker.path);
    TK::Moniker moniker;
    Utilities::transformObjectPathToMoniker(&broker.path, moniker);
    CMPIObjectPath* reply =
        Utilities::createObjectPath(server, "OXATK_EthernetPort", Utilities::getNamespace(&broker.path));
    Utilities::transformMonikerToObjectPath(moniker, &reply);
    CMPIInstance* const port = Utilities::createInstance(server, reply);

    Utilities::setProperty(port, "AutoSense", true);
    Utilities::setProperty(port, "FullDuplex", true);
    Utilities::setProperty(port, "PortNumber", static_cast<unsigned char>(1));
    Utilities::setProperty(port, "EnabledState", static_cast<unsigned short>(2));
    Utilities::setProperty(port, "RequestedState", static_cast<unsigned short>(12));
    Utilities::setProperty(port, "LinkTechnology", static_cast<unsigned short>(2));
    Utilities::setProperty(port, "ActiveMaximumTransmissionUnit", 1500U);
    Utilities::setProperty(port, "Speed", 1000000000ULL);
    Utilities::setProperty(port, "MaxSpeed", 10000000000ULL);
    Utilities::setProperty(port, "Offset", static_cast<short>(-7));

    std::string name = "eth0";
    std::wstring description = L"Onboard network port";
    Utilities::setProperty(port, "ElementName", name);
    Utilities::setProperty(port, "Caption", "Ethernet port");
    Utilities::setProperty(port, "Description", description);

    std::string date = TK::Utils::convertCIMDateTime(someDate());
    Utilities::setProperty(server, port, "InstallDate", date, true);

    std::vector<unsigned short> capabilities = {1, 2, 4, 8};
    Utilities::setProperty(server, port, "Capabilities", capabilities);
    return id;
}

// The broker's calls that such an answer needs.
CMPICount callTheBroker() {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIBroker* const server = &broker.broker;
    benchmark::DoNotOptimize(CMGetCharsPtr(CMGetClassName(&broker.path, &status), &status));
    benchmark::DoNotOptimize(CMGetCharsPtr(CMGetNameSpace(&broker.path, &status), &status));
    const CMPICount keys = readKeys(&broker.path);
    CMPIObjectPath* const reply = newPath();
    setFiveKeys();
    CMPIInstance* const port = CMNewInstance(server, reply, &status);
    setNumbers<BareCalls>();
    floors::setProperty(port, "RequestedState", static_cast<unsigned short>(12));
    floors::setProperty(port, "MaxSpeed", 10000000000ULL);
    for (const char* text : {"ElementName", "Caption", "Description"}) {
        floors::setProperty(port, text, text);
    }
    floors::setProperty(port, "InstallDate",
                        CMNewDateTimeFromChars(server, "20260329013007.000250+120", &status));
    static const std::vector<unsigned short> capabilities = {1, 2, 4, 8};
    floors::setArray(server, port, "Capabilities", capabilities);
    return keys;
}

void addRequest(Table& table) {
    table.add("whole request", answer)
        .floor("the broker's calls alone", callTheBroker)
        .onTwoThreads()
        .atMostBaseline(0.65)
        .allocations(16);
#ifdef OXAHVBENCH_KIT
    table.add("getInstance by the kit", kit::serveByKit)
        .floor("a table written by hand", kit::serveByHand)
        .overFloor(150, 1);
#endif
}

// Growth: what a unit costs in a large input, against what it costs in a small one.
void addGrowth(Table& table, std::size_t large) {
    // Caches and pages fresh from the system have their price; what is not linear would cost a thousand times
    // as much.
    constexpr double most = 10;
    const auto row = [&table](const std::string& name, auto operation, const auto& grown, double units,
                              const std::string& smallName, const auto& ungrown, double smallUnits) {
        table.add("growth: " + name, [=, &grown] { return operation(grown); })
            .floor(smallName, [=, &ungrown] { return operation(ungrown); })
            .units(units, smallUnits)
            .atMostFloor(most);
    };
    constexpr double manyKeys = 65535;
    row(
        "path to moniker, 65,535 keys, per key",
        [](const CMPIObjectPath& path) {
            TK::Moniker moniker;
            Utilities::transformObjectPathToMoniker(&path, moniker);
            return moniker.getKeyCount();
        },
        broker.longPath, manyKeys, "5 keys", broker.path, thin::keyKinds);
    row(
        "moniker to path, 65,535 keys, per key",
        [](const CMPIObjectPath& path) {
            CMPIObjectPath* to = &broker.path;
            Utilities::transformMonikerToObjectPath(monikerOf(&path), &to);
        },
        broker.longPath, manyKeys, "5 keys", broker.path, thin::keyKinds);

    static const std::string narrow = words(large);
    static const std::wstring broad = wide(narrow);
    static const std::string narrowBlock = words(block);
    static const std::wstring wideBlock = wide(narrowBlock);
    const std::string size = ", " + std::to_string(large >> 20U) + " Mi characters, each";
    const auto each = static_cast<double>(large);
    row("AStringToWString" + size, toWide, narrow, each, "64 Ki", narrowBlock, block);
    row("WStringToAString" + size, toNarrow, broad, each, "64 Ki", wideBlock, block);
    row("ValidateInput, narrow" + size, screen<std::string>, narrow, each, "64 Ki", narrowBlock, block);
    row("ValidateInput, wide" + size, screen<std::wstring>, broad, each, "64 Ki", wideBlock, block);
}

} // namespace

std::vector<Row> all(std::size_t large) {
    Table table;
    addRegistry(table);
    addScalars(table);
    addTexts(table);
    addMonikers(table);
    addPaths(table);
    addTraces(table);
    addScreen(table);
    addConversions(table);
    addDates(table);
    addArrays(table);
    addPropertyFile(table);
    addRequest(table);
    addGrowth(table, large);
    return std::move(table.rows());
}

} // namespace rows
