// Monikers and object paths: the lines of an input are keys, and come back from a path as they went in.
#include "Fuzz.h"

#include "EmbeddedBroker.h"
#include "Moniker.h"
#include "ProviderUtilities.h"

#include <array>
#include <cctype>
#include <locale>
#include <set>

namespace {

// The first character of a line tells the type, the second the length of the name; the value follows it.
void addKey(TK::Moniker& moniker, const std::string& line, std::set<std::string>& names) {
    fuzz::Input input(reinterpret_cast<const std::uint8_t*>(line.data()), line.size());
    const auto type = input.number<std::uint8_t>() % 5U;
    const auto length = input.number<std::uint8_t>() % 16U;
    std::string name = input.rest();
    const std::string value = name.substr(std::min<std::size_t>(length, name.size()));
    name = name.substr(0, length);
    name = name.c_str(); // CMPI's texts end at a NUL
    std::string folded = name;
    std::transform(folded.begin(), folded.end(), folded.begin(),
                   [](unsigned char c) { return static_cast<char>(c >= 'A' && c <= 'Z' ? c + 32 : c); });
    // A path has one key of a name, whatever its case, and a key has a name.
    if (name.empty() || !names.insert(folded).second) {
        return;
    }
    fuzz::Input number(reinterpret_cast<const std::uint8_t*>(value.data()), value.size());
    switch (type) {
    case TK::Moniker::COMPONENT_UINT8: {
        // White space does not read back.
        const auto byte = number.number<unsigned char>();
        moniker.addKey(name, std::isspace(byte) != 0 ? static_cast<unsigned char>('s') : byte);
        break;
    }
    case TK::Moniker::COMPONENT_UINT16:
        moniker.addKey(name, number.number<unsigned short>());
        break;
    case TK::Moniker::COMPONENT_UINT32:
        moniker.addKey(name, number.number<unsigned int>());
        break;
    case TK::Moniker::COMPONENT_UINT64:
        moniker.addKey(name, number.number<unsigned long long>());
        break;
    default:
        moniker.addKey(name, std::string(value.c_str()));
        break;
    }
}

template <class Value>
Value valueOf(const TK::Moniker& moniker) {
    Value value{};
    moniker.getValue(value);
    return value;
}

template <class Value>
bool sameValue(const TK::Moniker& left, const TK::Moniker& right) {
    return valueOf<Value>(left) == valueOf<Value>(right);
}

// The selected components of both are equal.
bool isSame(const TK::Moniker& left, const TK::Moniker& right) {
    static constexpr std::array<bool (*)(const TK::Moniker&, const TK::Moniker&), 5> compare = {
        &sameValue<unsigned char>, &sameValue<unsigned short>, &sameValue<unsigned int>,
        &sameValue<unsigned long long>, &sameValue<std::string>};
    unsigned short type = 0;
    unsigned short otherType = 0;
    std::string name;
    std::string otherName;
    left.getType(type);
    right.getType(otherType);
    left.getName(name);
    right.getName(otherName);
    return type == otherType && name == otherName && compare.at(type)(left, right);
}

void goThroughAPath(const std::uint8_t* data, std::size_t size) {
    using TK::ProviderUtilities;
    TK::Moniker moniker;
    std::set<std::string> names;
    for (fuzz::Input lines(data, size); !lines.isEmpty();) {
        addKey(moniker, lines.line(), names);
    }
    static oxahv::EmbeddedBroker broker;
    oxahv::Request request(broker);
    CMPIObjectPath* path =
        ProviderUtilities::createObjectPath(broker.handle(), "OXATK_Anything", "root/cimv2");
    ProviderUtilities::transformMonikerToObjectPath(moniker, &path);
    TK::Moniker again;
    ProviderUtilities::transformObjectPathToMoniker(path, again);
    FUZZ_REQUIRE(again.getKeyCount() == moniker.getKeyCount());
    for (unsigned int i = 0; i < moniker.getKeyCount(); ++i) {
        moniker.selectKey(i);
        again.selectKey(i);
        FUZZ_REQUIRE(isSame(moniker, again));
    }
}

struct Grouped : std::numpunct<char> {
    std::string do_grouping() const override { return "\1\3"; }
    char do_thousands_sep() const override { return '.'; }
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const std::locale grouped(std::locale::classic(), new Grouped);
    for (const std::locale& locale : {std::locale::classic(), grouped}) {
        std::locale::global(locale);
        goThroughAPath(data, size);
    }
    return 0;
}
