// Monikers and object paths: the lines of an input are keys, and come back from a path as they went in.
#include "Fuzz.h"

#include "../tests/MonikerText.h"

#include "EmbeddedBroker.h"
#include "ProviderUtilities.h"

#include <cctype>
#include <locale>
#include <set>

namespace {

// The first character of a line tells the type, the second the length of the name; the value follows it.
void addKey(TK::Moniker& moniker, const std::string& line, std::set<std::string>& names) {
    fuzz::Input input(line);
    const auto type = input.number<std::uint8_t>() % 5U;
    const auto length = input.number<std::uint8_t>() % 16U;
    const std::string rest = input.rest();
    const std::string name = rest.substr(0, length).c_str(); // CMPI's texts end at a NUL
    const std::string value = rest.substr(std::min<std::size_t>(length, rest.size()));
    std::string folded = name;
    std::transform(folded.begin(), folded.end(), folded.begin(),
                   [](unsigned char c) { return static_cast<char>(c >= 'A' && c <= 'Z' ? c + 32 : c); });
    // A path has one key of a name, whatever its case, and a key has a name.
    if (name.empty() || !names.insert(folded).second) {
        return;
    }
    fuzz::Input number(value);
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
    FUZZ_REQUIRE(keysOf(again) == keysOf(moniker));
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
