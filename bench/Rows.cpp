#include "Rows.h"

#ifdef OXAHVBENCH_KIT
#include "Kit.h"
#endif

#include "ClassTable.h"
#include "Floors.h"
#include "Naive.h"
#include "ThinBroker.h"
#include "Trace.h"
#include "Utility.h"

#include <array>
#include <cctype>
#include <cmpimacs.h>
#include <cstdio>
#include <cstring>
#include <cwchar>
#include <strings.h>

namespace rows {

namespace {

const std::string category("Hovara.Benchmark");
thin::Objects& broker = thin::objects();

// Hides from the optimizer what a value is.
template <class T>
T opaque(T value) {
    benchmark::DoNotOptimize(value);
    return value;
}

} // namespace

struct Library {
    using Moniker = TK::Moniker;
    using ProviderUtilities = TK::ProviderUtilities;
    using CUtility = TK::CUtility;
    using Utils = TK::Utils;

    // As naive::Trace.
    struct Trace {
        static void entering(const std::string& logger) { TK_TRACE_ENTERING(logger); }
        static void message(const std::string& logger, const char* text) { TK_TRACE_MESSAGE(logger, text); }
        template <class Value>
        static void variable(const std::string& logger, const char* name, Value value) {
            TK_TRACE_VARIABLE(logger, name, value);
        }
        static void parameters(const std::string& logger, const CMPIBroker* server,
                               const CMPIInstance* instance, const char* name,
                               const std::vector<unsigned short>* value) {
            TK_TRACE_ENTERING_PARAMETERS(logger, " broker=" << server << " instance=" << instance
                                                            << " name=" << name << " value=" << value);
        }
    };
};

struct Naive {
    using Moniker = naive::Moniker;
    using ProviderUtilities = naive::ProviderUtilities;
    using CUtility = naive::CUtility;
    using Utils = naive::Utils;
    using Trace = naive::Trace;
};

namespace {

// Results as text

std::string textOf(const std::string& text) {
    return text;
}

std::string textOf(const std::wstring& text) {
    std::string codes;
    for (const wchar_t c : text) {
        codes += std::to_string(static_cast<long>(c)) + ' ';
    }
    return codes;
}

template <class Number, std::enable_if_t<std::is_arithmetic_v<Number>, int> = 0>
std::string textOf(Number number) {
    return std::to_string(number);
}

template <class Moniker, class = decltype(&Moniker::getKeyCount)>
std::string textOf(Moniker moniker) {
    std::string text;
    for (unsigned int i = 0; moniker.selectKey(i); ++i) {
        unsigned short type = 0;
        moniker.getType(type);
        std::string name;
        moniker.getName(name);
        unsigned char byte = 0;
        unsigned short word = 0;
        unsigned int number = 0;
        unsigned long long big = 0;
        std::string value;
        switch (type) {
        case TK::Moniker::COMPONENT_UINT8:
            moniker.getValue(byte);
            value = std::to_string(byte);
            break;
        case TK::Moniker::COMPONENT_UINT16:
            moniker.getValue(word);
            value = std::to_string(word);
            break;
        case TK::Moniker::COMPONENT_UINT32:
            moniker.getValue(number);
            value = std::to_string(number);
            break;
        case TK::Moniker::COMPONENT_UINT64:
            moniker.getValue(big);
            value = std::to_string(big);
            break;
        default:
            moniker.getValue(value);
        }
        text.append(name)
            .append(1, ' ')
            .append(std::to_string(type))
            .append(1, ' ')
            .append(value)
            .append(1, '\n');
    }
    return text;
}

template <class Function>
std::function<std::string()> describe(Function function) {
    return [function = std::move(function)] {
        if constexpr (std::is_void_v<std::invoke_result_t<const Function&>>) {
            function();
            return std::string();
        } else {
            return textOf(function());
        }
    };
}

// The heap's share of traces: a text for each of a plain point's two logger calls, one more for a list.
constexpr double traces(int plain, int lists) {
    return 2 * plain + 3 * lists;
}

// Puts a table together.
class Table {
public:
    // A row of the library alone.
    template <class Operation>
    Table& add(std::string name, Operation operation) {
        rows_.emplace_back();
        last().name = std::move(name);
        last().operation = repeat(std::move(operation));
        return *this;
    }

    // A row of both builds: the operation is called with Library or Naive.
    template <class Operation>
    Table& addBoth(std::string name, Operation operation) {
        add(std::move(name), [operation] { return operation(Library()); });
        last().naive = repeat([operation] { return operation(Naive()); });
        last().result = describe([operation] { return operation(Library()); });
        last().naiveResult = describe([operation] { return operation(Naive()); });
        return *this;
    }

    template <class Floor>
    Table& floor(std::string name, Floor run, double atMost) {
        last().floorName = std::move(name);
        last().floor = repeat(std::move(run));
        last().atMostFloor = atMost;
        return *this;
    }

    // The same with the nanoseconds and the blocks of memory that the operation may take beyond it.
    template <class Floor>
    Table& floorBelow(std::string name, Floor run, double nanoseconds, double blocks) {
        floor(std::move(name), std::move(run), 0);
        last().overFloor = nanoseconds;
        last().allocationsOverFloor = blocks;
        return *this;
    }

    Table& units(double each) { return units(each, each); }
    Table& units(double each, double ofFloor) {
        last().units = each;
        last().floorUnits = ofFloor;
        return *this;
    }
    Table& timesFaster(double times) {
        last().timesFaster = times;
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

enum class Letters { given, lower, upper };

std::string inLetters(std::string name, Letters letters) {
    for (char& c : name) {
        const auto code = static_cast<unsigned char>(c);
        if (letters != Letters::given) {
            c = static_cast<char>(letters == Letters::lower ? std::tolower(code) : std::toupper(code));
        }
    }
    return name;
}

// Each class's name as it stands, in lower and in upper case; behind each the name as it stands.
std::vector<std::pair<std::string, std::string>> classNames() {
    std::vector<std::pair<std::string, std::string>> names;
    for (const auto& entry : TK::classTable) {
        for (const Letters letters : {Letters::given, Letters::lower, Letters::upper}) {
            names.emplace_back(inLetters(entry.name, letters), entry.name);
        }
    }
    return names;
}

void addRegistry(Table& table) {
    static const auto names = classNames();
    const auto compareAll = [] {
        int sum = 0;
        for (const auto& [asked, given] : names) {
            sum += static_cast<int>(strcasecmp(opaque(asked.c_str()), given.c_str()) == 0);
        }
        return sum;
    };
    table
        .addBoth("getClassId, found: mean of all names in any case",
                 [](auto side) {
                     unsigned int sum = 0;
                     for (const auto& name : names) {
                         sum += decltype(side)::ProviderUtilities::getClassId(name.first.c_str());
                     }
                     return sum;
                 })
        .floor("one strcasecmp", compareAll, 4)
        .units(static_cast<double>(names.size()))
        .allocations(0);
    const auto compareOne = [](const char* name, const char* other) {
        return [name, other] { return strcasecmp(opaque(name), other); };
    };
    const auto lookUp = [](const char* name) {
        return [name](auto side) { return decltype(side)::ProviderUtilities::getClassId(opaque(name)); };
    };
    table.addBoth("getClassId, not found: same length as a name", lookUp("OXATK_EthernetPorz"))
        .floor("one strcasecmp", compareOne("OXATK_EthernetPort", "OXATK_EthernetPort"), 4)
        .allocations(0);
    table.addBoth("getClassId, not found: unrelated", lookUp("CIM_ManagedSystemElement"))
        .floor("one strcasecmp", compareOne("CIM_ManagedSystemElement", "CIM_ManagedSystemElement"), 4)
        .allocations(0);
}

// Scalar accessors

// What sets scalars: TK::ProviderUtilities, or the bare calls.
struct BareCalls {
    template <class... Arguments>
    static void setProperty(Arguments... arguments) {
        floors::setProperty(arguments...);
    }
    template <class... Arguments>
    static void setKeyProperty(Arguments... arguments) {
        floors::setKeyProperty(arguments...);
    }
    static void setProperty(CMPIInstance* instance, const char* name, const std::string& value) {
        floors::setProperty(instance, name, value.c_str());
    }
    static void setKeyProperty(CMPIObjectPath* path, const char* name, const std::string& value) {
        floors::setKeyProperty(path, name, value.c_str());
    }
    template <class Object, class Out>
    static bool getProperty(const Object* object, const char* name, Out&& out) {
        return floors::getProperty(object, name, std::forward<Out>(out));
    }
    template <class Element>
    static bool getProperty(const CMPIInstance* instance, const char* name, std::vector<Element>& out) {
        return floors::getArray(instance, name, out);
    }
    template <class Out>
    static bool getKeyProperty(const CMPIObjectPath* path, const char* name, Out&& out) {
        return floors::getKeyProperty(path, name, std::forward<Out>(out));
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
    using Utilities = TK::ProviderUtilities;
    const std::string bare = "the bare CMPI call";
    table.add("setProperty: 8 kinds of numbers", setNumbers<Utilities>)
        .floor(bare, setNumbers<BareCalls>, 1.1)
        .units(8)
        .allocations(0);
    table.add("setProperty: string, reference, C text, C++ text", setHandles<Utilities>)
        .floor(bare, setHandles<BareCalls>, 1.1)
        .units(4)
        .allocations(0);
    table.add("setKeyProperty: 4 kinds of numbers", setKeyNumbers<Utilities>)
        .floor(bare, setKeyNumbers<BareCalls>, 1.1)
        .units(4)
        .allocations(0);
    table.add("setKeyProperty: string, reference, C text, C++ text", setKeyHandles<Utilities>)
        .floor(bare, setKeyHandles<BareCalls>, 1.1)
        .units(4)
        .allocations(0);
    table.add("getProperty of an instance: 3 kinds", [] { return getNumbers<Utilities>(&broker.instance); })
        .floor(
            bare, [] { return getNumbers<BareCalls>(&broker.instance); }, 1.1)
        .units(3)
        .allocations(0);
    table.add("getProperty of arguments: 3 kinds", [] { return getNumbers<Utilities>(&broker.args); })
        .floor(
            bare, [] { return getNumbers<BareCalls>(&broker.args); }, 1.1)
        .units(3)
        .allocations(0);
    table.add("getProperty, getKeyProperty: 3 handles", getHandles<Utilities>)
        .floor(bare, getHandles<BareCalls>, 1.1)
        .units(3)
        .allocations(0);
}

void addTextGetters(Table& table) {
    const auto row = [&table](const std::string& from, auto get, auto getBare) {
        const auto sizeOf = [](auto getter) {
            return [getter] {
                std::string out;
                getter(out);
                return out.size();
            };
        };
        table.add(from, sizeOf(get)).floor("the bare calls, one assignment", sizeOf(getBare), 1.2);
    };
    row(
        "getProperty of an instance: text",
        [](auto& out) { TK::ProviderUtilities::getProperty(&broker.textInstance, "Name", out, false); },
        [](auto& out) { floors::getProperty(&broker.textInstance, "Name", out); });
    table.allocations(0);
    row(
        "getProperty of an instance: date as text",
        [](auto& out) { TK::ProviderUtilities::getProperty(&broker.dateInstance, "Name", out, true); },
        [](auto& out) { floors::getDate(&broker.dateInstance, "Name", out); });
    table.allocations(1); // the result is longer than a string holds by itself
    row(
        "getProperty of arguments: text",
        [](auto& out) { TK::ProviderUtilities::getProperty(&broker.textArgs, "Name", out); },
        [](auto& out) { floors::getProperty(&broker.textArgs, "Name", out); });
    table.allocations(0);
    row(
        "getKeyProperty: text",
        [](auto& out) { TK::ProviderUtilities::getKeyProperty(&broker.path, "DeviceID", out); },
        [](auto& out) { floors::getKeyProperty(&broker.path, "DeviceID", out); });
    table.allocations(0);
}

// Wide accessors: a conversion of a short text, and the bare calls.
void addWideAccessors(Table& table) {
    static const std::wstring key = L"Onboard port";
    static std::wstring value = key;
    table
        .addBoth("getProperty, getKeyProperty: wide text, 3 handles",
                 [](auto side) {
                     using Utilities = typename decltype(side)::ProviderUtilities;
                     std::wstring ofInstance;
                     std::wstring ofArguments;
                     std::wstring ofPath;
                     Utilities::getProperty(&broker.textInstance, "Name", ofInstance);
                     Utilities::getProperty(&broker.textArgs, "Name", ofArguments);
                     Utilities::getKeyProperty(&broker.path, "DeviceID", ofPath);
                     return ofInstance.size() + ofArguments.size() + ofPath.size();
                 })
        .units(3)
        .timesFaster(4)
        .allocations(traces(2, 0) + 1); // the result
    table
        .addBoth("setProperty, setKeyProperty: wide text",
                 [](auto side) {
                     using Utilities = typename decltype(side)::ProviderUtilities;
                     Utilities::setProperty(&broker.instance, "ElementName", value);
                     Utilities::setKeyProperty(&broker.path, "ElementName", key);
                 })
        .units(2)
        .timesFaster(4)
        .allocations(traces(2, 0) + 1); // the text that is taken by value
}

// Monikers

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

// A moniker whose one key, a number, is selected.
template <class Moniker, class Number>
const Moniker& oneKey() {
    static const Moniker moniker = [] {
        Moniker made;
        made.addKey("Number", static_cast<Number>(54321));
        return made;
    }();
    return moniker;
}

template <class Moniker, class Number>
Number numberIn() {
    Number number = 0;
    oneKey<Moniker, Number>().getValue(number);
    return number;
}

template <class Number>
Number numberFromChars() {
    static const std::string text = "54321";
    Number number = 0;
    floors::read(text, number);
    return number;
}

// The moniker of a path, made once; each thread has its own, since a selection changes it.
template <class Side>
typename Side::Moniker& monikerOf(const CMPIObjectPath* path) {
    static thread_local std::vector<std::pair<const CMPIObjectPath*, typename Side::Moniker>> made;
    for (auto& [known, moniker] : made) {
        if (known == path) {
            return moniker;
        }
    }
    made.emplace_back(path, typename Side::Moniker());
    Side::ProviderUtilities::transformObjectPathToMoniker(path, made.back().second);
    return made.back().second;
}

void addMonikers(Table& table) {
    table
        .addBoth("addKey: 4 kinds of numbers, 16 keys",
                 [](auto side) {
                     typename decltype(side)::Moniker moniker;
                     fillWithNumbers(moniker, [](auto& list, const char* name, auto number) {
                         list.addKey(name, number);
                     });
                     return moniker.getKeyCount();
                 })
        .floor(
            "push of the record, to_chars",
            [] {
                floors::Keys keys;
                fillWithNumbers(keys, [](auto& list, const char* name, auto number) {
                    floors::push(list, name, number);
                });
                return keys.size();
            },
            1.5)
        .units(16)
        .allocations(5.0 / 16);
    table
        .addBoth("getValue: 4 kinds of numbers",
                 [](auto side) {
                     using Moniker = typename decltype(side)::Moniker;
                     return numberIn<Moniker, unsigned char>() + numberIn<Moniker, unsigned short>() +
                            numberIn<Moniker, unsigned int>() + numberIn<Moniker, unsigned long long>();
                 })
        .floor(
            "from_chars",
            [] {
                return numberFromChars<unsigned char>() + numberFromChars<unsigned short>() +
                       numberFromChars<unsigned int>() + numberFromChars<unsigned long long>();
            },
            4)
        .units(4)
        .allocations(0);
}

void addPaths(Table& table) {
    // The vector of keys grows four times; one name is longer than a string holds by itself.
    constexpr double fiveKeys = 5;
    table
        .addBoth("path to moniker, 5 keys",
                 [](auto side) {
                     typename decltype(side)::Moniker moniker;
                     decltype(side)::ProviderUtilities::transformObjectPathToMoniker(&broker.path, moniker);
                     return moniker;
                 })
        .timesFaster(4)
        .allocations(traces(2, 2) + fiveKeys);
    table
        .addBoth("moniker to path, 5 keys",
                 [](auto side) {
                     static CMPIObjectPath* path = &broker.path;
                     using Side = decltype(side);
                     Side::ProviderUtilities::transformMonikerToObjectPath(monikerOf<Side>(path), &path);
                 })
        .timesFaster(4)
        .allocations(traces(0, 2));
    table
        .addBoth("createObjectPath",
                 [](auto side) {
                     return decltype(side)::ProviderUtilities::createObjectPath(
                                &broker.broker, "OXATK_EthernetPort", "root/cimv2") == &broker.path;
                 })
        .timesFaster(4)
        .allocations(traces(2, 2));
    table
        .addBoth("getClassId of a path",
                 [](auto side) { return decltype(side)::ProviderUtilities::getClassId(&broker.path); })
        .timesFaster(4)
        .allocations(traces(1, 0));
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

void addTraces(Table& table) {
    const std::string twice = "two snprintf";
    table.addBoth("trace point ENTERING", [](auto side) { decltype(side)::Trace::entering(category); })
        .floor(
            twice, [] { formatTwice("ENTERING: %s() in %s [Line: %d]", "entering", "Rows.cpp", 47); }, 0.6)
        .allocations(traces(1, 0));
    table
        .addBoth("trace point MESSAGE",
                 [](auto side) { decltype(side)::Trace::message(category, "Failed to convert the data"); })
        .floor(
            twice,
            [] {
                formatTwice("MESSAGE [File: %s, Line: %d]: %s", "Rows.cpp", 48, "Failed to convert the data");
            },
            0.6)
        .allocations(traces(1, 0));
    table
        .addBoth("trace point VARIABLE, number",
                 [](auto side) { decltype(side)::Trace::variable(category, "keyCount", 90210U); })
        .floor(
            twice,
            [] {
                formatTwice("VARIABLE: '%s' has Value '%d' at line %d in %s", "keyCount", 90210, 51,
                            "Rows.cpp");
            },
            0.6)
        .allocations(traces(1, 0));
    table
        .addBoth(
            "trace point VARIABLE, text",
            [](auto side) { decltype(side)::Trace::variable(category, "classname", "OXATK_EthernetPort"); })
        .floor(
            twice,
            [] {
                formatTwice("VARIABLE: '%s' has Value '%s' at line %d in %s", "classname",
                            "OXATK_EthernetPort", 51, "Rows.cpp");
            },
            0.6)
        .allocations(traces(1, 0));
    static const std::vector<unsigned short> list = {1};
    table
        .addBoth("trace point ENTERING with parameter list",
                 [](auto side) {
                     decltype(side)::Trace::parameters(category, &broker.broker, &broker.instance,
                                                       "RequestedSpeeds", &list);
                 })
        .floor(
            twice,
            [] {
                formatTwice("ENTERING: %s() in %s [Line: %d],Parameters List:  broker=%p instance=%p "
                            "name=%s value=%p",
                            "parameters", "Rows.cpp", 56, static_cast<const void*>(&broker.broker),
                            static_cast<const void*>(&broker.instance), "RequestedSpeeds",
                            static_cast<const void*>(&list));
            },
            0.8)
        .allocations(traces(0, 1));
}

// Users' texts

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

void addScreen(Table& table) {
    static const std::string clean = words(block);
    static const std::wstring wideClean = wide(clean);
    static const std::string shortText = words(small);
    static const std::wstring shortWide = wide(shortText);
    const auto screen = [](const auto& text) {
        return [&text](auto side) { return decltype(side)::ProviderUtilities::ValidateInput(text, {}); };
    };
    // Each takes its text by value: one block.
    table.addBoth("ValidateInput, clean, 64 KiB", screen(clean))
        .floor(
            "one memchr pass", [] { return std::memchr(opaque(clean.data()), '<', clean.size()); }, 15)
        .allocations(1);
    table.addBoth("ValidateInput, clean, 64 Ki wide characters", screen(wideClean))
        .floor(
            "one wmemchr pass", [] { return std::wmemchr(opaque(wideClean.data()), L'<', wideClean.size()); },
            10)
        .allocations(1);
    table.addBoth("ValidateInput, clean, 16 B", screen(shortText)).timesFaster(4).allocations(1);
    table.addBoth("ValidateInput, clean, 16 wide characters", screen(shortWide))
        .timesFaster(4)
        .allocations(1);
}

// Conversions

template <class Side>
std::wstring toWide(const std::string& text) {
    std::wstring out;
    Side::CUtility::AStringToWString(text, out);
    return out;
}

template <class Side>
std::string toNarrow(const std::wstring& text) {
    std::string out;
    Side::CUtility::WStringToAString(text, out);
    return out;
}

// The C library's conversion alone, into a buffer that is there.
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
    static const std::array<std::string, 2> narrow = {words(page), umlauts(page)};
    static const std::array<std::wstring, 2> broad = {wide(words(page)), wideUmlauts(page)};
    static const std::string shortText = words(small);
    static const std::wstring shortWide = wide(shortText);
    // Traces, the text that is taken by value, the result.
    constexpr double blocks = traces(2, 0) + 2;
    for (const std::size_t i : {0U, 1U}) {
        const std::string what = i == 0 ? "ASCII" : "non-ASCII";
        table
            .addBoth("AStringToWString, 4 KiB " + what,
                     [i](auto side) { return toWide<decltype(side)>(narrow[i]); })
            .floor(
                "mbstowcs alone", [i] { return bareToWide(narrow[i]); }, 1.15)
            .allocations(blocks);
        table
            .addBoth("WStringToAString, 4 KiB " + what,
                     [i](auto side) { return toNarrow<decltype(side)>(broad[i]); })
            .floor(
                "wcsrtombs alone", [i] { return bareToNarrow(broad[i]); }, 1.15)
            .allocations(blocks);
    }
    table.addBoth("AStringToWString, 16 B", [](auto side) { return toWide<decltype(side)>(shortText); })
        .timesFaster(4)
        .allocations(blocks);
    table.addBoth("WStringToAString, 16 B", [](auto side) { return toNarrow<decltype(side)>(shortWide); })
        .timesFaster(4)
        .allocations(blocks);
}

// Dates, arrays, property files

const TK::DateTime& someDate() {
    static const TK::DateTime date("2026-03-29 01:30:07.250+002", 3);
    return date;
}

void addDates(Table& table) {
    static const std::string text = "20260329013007.000250+120";
    // Parsing takes its text by value, formatting returns one; both are longer than a string holds by itself.
    table
        .addBoth("date parse",
                 [](auto side) {
                     const TK::DateTime read = decltype(side)::Utils::convertStringToDateTime(text);
                     return ((((read.getYear() * 12ULL + read.getMonth()) * 31 + read.getDay()) * 24 +
                              read.getHour()) *
                                 3600 +
                             read.getMinute() * 60ULL + read.getSecond()) *
                                1000000 +
                            read.getMillisecond() + static_cast<unsigned long long>(read.getOffset());
                 })
        .timesFaster(4)
        .allocations(traces(2, 0) + 1);
    table
        .addBoth("date format",
                 [](auto side) { return decltype(side)::Utils::convertCIMDateTime(someDate()); })
        .timesFaster(4)
        .allocations(traces(2, 0) + 1);
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
    const auto set = [](auto& elements) {
        return [&elements](auto side) {
            decltype(side)::ProviderUtilities::setProperty(&broker.broker, &broker.instance, "Names",
                                                           elements);
        };
    };
    table.addBoth("array setter, 64 numbers of 8 bits", set(bytes)).timesFaster(4).allocations(traces(1, 2));
    table.addBoth("array setter, 64 numbers", set(numbers)).timesFaster(4).allocations(traces(1, 2));
    table.addBoth("array setter, 64 texts", set(texts)).timesFaster(4).allocations(traces(1, 2));
    // Each conversion takes its text by value and traces entry, exit and result.
    table.addBoth("array setter, 64 wide texts", set(wideTexts))
        .timesFaster(4)
        .allocations(traces(1, 0) + size * (traces(3, 0) + 1));

    const std::string push = "the bare calls, a push of each";
    // The vector grows seven times to 64 elements.
    table.add("array getter, 64 numbers", getArray<TK::ProviderUtilities, unsigned short>)
        .floor(push, getArray<BareCalls, unsigned short>, 1.2)
        .allocations(7);
    table.add("array getter, 64 texts", getArray<TK::ProviderUtilities, std::string>)
        .floor(push, getArray<BareCalls, std::string>, 1.2)
        .allocations(7);
}

// A file of some entries.
struct FilledFile {
    FilledFile() {
        for (int i = 0; i < 20; ++i) {
            file.setEntry(L"asset.entry." + std::to_wstring(i), L"some value");
        }
        file.setEntry(L"asset.number", L"90210");
        file.setEntry(L"asset.byte", L"65");
    }
    TK::PropertyFile file;
};

// Each thread has its own, since no file is for two.
TK::PropertyFile& someFile() {
    static thread_local FilledFile filled;
    return filled.file;
}

void addPropertyFile(Table& table) {
    static const std::string key = "asset.number";
    static const std::wstring wideKey = L"asset.number";
    static const std::wstring value = L"90210";
    static const std::string byteKey = "asset.byte";
    static const std::wstring wideByteKey = L"asset.byte";
    static const std::wstring byteValue = L"65";
    table.add("ReadUint32FromFile", [] { return TK::Utils::ReadUint32FromFile(someFile(), key); })
        .floor(
            "the file's getEntry", [] { return someFile().getEntry(wideKey); }, 2);
    table.add("ReadUint8FromFile", [] { return TK::Utils::ReadUint8FromFile(someFile(), key); })
        .floor(
            "the file's getEntry", [] { return someFile().getEntry(wideKey); }, 2);
    table
        .add("WriteUint8ToFile",
             [] { TK::Utils::WriteUint8ToFile(someFile(), byteKey, opaque(static_cast<unsigned char>(65))); })
        .floor(
            "the file's setEntry", [] { someFile().setEntry(wideByteKey, byteValue); }, 2);
    table.add("WriteUint32ToFile", [] { TK::Utils::WriteUint32ToFile(someFile(), key, opaque(90210U)); })
        .floor(
            "the file's setEntry", [] { someFile().setEntry(wideKey, value); }, 2);
}

// A request

// What a provider does to answer a request for one instance.
template <class Side>
unsigned short answer() {
    using Utilities = typename Side::ProviderUtilities;
    const CMPIBroker* const server = &broker.broker;
    const unsigned short id = Utilities::getClassId(&broker.path);
    typename Side::Moniker moniker;
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

    std::string date = Side::Utils::convertCIMDateTime(someDate());
    Utilities::setProperty(server, port, "InstallDate", date, true);

    std::vector<unsigned short> capabilities = {1, 2, 4, 8};
    Utilities::setProperty(server, port, "Capabilities", capabilities);
    return id;
}

// The calls of the broker alone that such an answer takes.
CMPICount callTheBroker() {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIBroker* const server = &broker.broker;
    const CMPIObjectPath* const path = &broker.path;
    CMGetCharsPtr(CMGetClassName(path, &status), &status);
    CMGetCharsPtr(CMGetNameSpace(path, &status), &status);
    const CMPICount keys = CMGetKeyCount(path, &status);
    CMPIString* name = nullptr;
    for (CMPICount i = 0; i < 2 * keys; ++i) {
        CMGetKeyAt(path, i % keys, &name, &status);
    }
    CMPIObjectPath* const reply = CMNewObjectPath(server, "root/cimv2", "OXATK_EthernetPort", &status);
    CMSetNameSpace(reply, "root/cimv2");
    setKeyNumbers<BareCalls>();
    floors::setKeyProperty(reply, "DeviceID", "eth0");
    CMPIInstance* const port = CMNewInstance(server, reply, &status);
    setNumbers<BareCalls>();
    floors::setProperty(port, "RequestedState", static_cast<unsigned short>(12));
    floors::setProperty(port, "MaxSpeed", 10000000000ULL);
    for (const char* text : {"ElementName", "Caption", "Description"}) {
        floors::setProperty(port, text, text);
    }
    CMPIValue value = {};
    value.dateTime = CMNewDateTimeFromChars(server, "20260329013007.000250+120", &status);
    CMSetProperty(port, "InstallDate", &value, CMPI_dateTime);
    CMPIArray* const array = CMNewArray(server, 4, CMPI_uint16, &status);
    for (CMPICount i = 0; i < 4; ++i) {
        CMSetArrayElementAt(array, i, &value, CMPI_uint16);
    }
    value.array = array;
    CMSetProperty(port, "Capabilities", &value, CMPI_uint16A);
    return keys;
}

void addRequest(Table& table) {
    // Class id; the two conversions and the five keys; the new path; one conversion of text; a date formatted
    // and set; an array; the moniker's, the texts' and the array's own blocks.
    constexpr double blocks = traces(1, 0) + traces(2, 2) + 5 + traces(0, 2) + traces(2, 2) + traces(2, 0) +
                              2 + traces(2, 0) + 1 + traces(2, 0) + traces(1, 2) + 2;
    table.addBoth("whole request", [](auto side) { return answer<decltype(side)>(); })
        .floor("the broker's calls alone", callTheBroker, 0)
        .timesFaster(4.5)
        .allocations(blocks);
#ifdef OXAHVBENCH_KIT
    table.add("getInstance by the kit", kit::serveByKit)
        .floorBelow("a table written by hand", kit::serveByHand, 150, 1);
#endif
}

// Growth: what a unit costs in a large input, against what it costs in a small one.

void addGrowth(Table& table, std::size_t large) {
    // Caches and pages fresh from the system have their price; what is not linear would show a thousandfold.
    constexpr double most = 10;
    constexpr double manyKeys = 65535;
    const auto toMoniker = [](const CMPIObjectPath* path) {
        return [path] {
            TK::Moniker moniker;
            TK::ProviderUtilities::transformObjectPathToMoniker(path, moniker);
            return moniker.getKeyCount();
        };
    };
    table.add("growth: path to moniker, 65,535 keys, per key", toMoniker(&broker.longPath))
        .floor("5 keys", toMoniker(&broker.path), most)
        .units(manyKeys, thin::keyKinds);
    const auto toPath = [](CMPIObjectPath& path) {
        return [&path] {
            CMPIObjectPath* to = &path;
            TK::ProviderUtilities::transformMonikerToObjectPath(monikerOf<Library>(&path), &to);
        };
    };
    table.add("growth: moniker to path, 65,535 keys, per key", toPath(broker.longPath))
        .floor("5 keys", toPath(broker.path), most)
        .units(manyKeys, thin::keyKinds);

    static const std::string narrow = words(large);
    static const std::wstring broad = wide(narrow);
    static const std::string narrowBlock = words(block);
    static const std::wstring wideBlock = wide(narrowBlock);
    const std::string size = std::to_string(large >> 20U) + " Mi characters, each";
    const auto each = static_cast<double>(large);
    const auto row = [&](const std::string& name, auto operation, const auto& grown, const auto& ungrown) {
        table.add("growth: " + name + ", " + size, [=, &grown] { return operation(grown); })
            .floor(
                "64 Ki", [=, &ungrown] { return operation(ungrown); }, most)
            .units(each, block);
    };
    const auto screen = [](const auto& text) { return TK::ProviderUtilities::ValidateInput(text, {}); };
    row("AStringToWString", toWide<Library>, narrow, narrowBlock);
    row("WStringToAString", toNarrow<Library>, broad, wideBlock);
    row("ValidateInput, narrow", screen, narrow, narrowBlock);
    row("ValidateInput, wide", screen, broad, wideBlock);
}

} // namespace

std::vector<Row> all(std::size_t large) {
    Table table;
    addRegistry(table);
    addScalars(table);
    addTextGetters(table);
    addWideAccessors(table);
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
