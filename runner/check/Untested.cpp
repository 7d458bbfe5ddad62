#include "check/Untested.h"

#include "show/Text.h"

#include <algorithm>

namespace oxahv::runner {

namespace {

// Classes that others derive from are often declared only for those.
bool isBaseOfServed(const EmbeddedBroker& broker, const CheckReport& report, const std::string& className) {
    return std::any_of(report.classes.begin(), report.classes.end(), [&](const CheckedClass& other) {
        return other.isServed && broker.isA(other.name, className);
    });
}

bool isCalled(const std::vector<std::string>& methods, const std::string& method) {
    return std::any_of(methods.begin(), methods.end(),
                       [&](const std::string& called) { return sameName(called, method); });
}

} // namespace

std::vector<std::string> untestedBy(const EmbeddedBroker& broker, const CheckReport& report,
                                    const std::vector<std::string>& methods, std::size_t sample,
                                    bool writes) {
    std::vector<std::string> all;
    for (const CheckedClass& checked : report.classes) {
        const std::string& name = checked.name;
        if (!checked.isServed) {
            if (!isBaseOfServed(broker, report, name)) {
                all.push_back(name + ": the provider does not serve it");
            }
            continue;
        }
        if (checked.instances == 0) {
            all.push_back(name + ": it has no instances, so none was asked for");
        } else if (checked.instances > sample) {
            all.push_back(name + ": all but " + std::to_string(sample) + " of its " +
                          std::to_string(checked.instances) +
                          " instances by name; --exhaustive asks for all");
        }
        for (const MethodDeclaration& method : broker.methodsOf(name)) {
            if (!isCalled(methods, name + '.' + method.name)) {
                all.push_back(name + "." + method.name + ": call it with --method");
            }
        }
    }
    if (!writes) {
        all.emplace_back("ci, mi, di and xq: allow them with --writes");
    }
    all.emplace_back("indications");
    return all;
}

} // namespace oxahv::runner
