// What a check of a provider finds, and how it is reported.
#pragma once

#include <string>
#include <vector>

namespace oxahv::runner {

enum class Severity { error, warning };

// The checks. `checks()` has one line for each, in this order.
enum class CheckKind {
    crash,
    hang,
    notServed,
    failed,
    exception,
    notACode,
    absent,
    notOne,
    otherPath,
    namesDiffer,
    duplicate,
    otherClass,
    keyMissing,
    nullKey,
    type,
    undeclared,
    encoding,
    date,
    getDiffers,
    propertyList,
    listIgnored,
    associationsDiffer,
    associationEnd,
    oneSided,
    filter,
    methodResult,
    threadsDiffer,
    leftOver,
    keysUnread,
    staysMapped,
    otherNameSpace,
    range,
    textLost,
    argumentAccepted,
    writing,
    faultHidden,
    residue,
    sanitizer,
    notDone,
    untested
};

struct Check {
    CheckKind kind;
    const char* name;
    Severity severity;
    const char* meaning; // what is wrong where it finds something
};

// In the order of CheckKind.
const std::vector<Check>& checks();
const Check& checkOf(CheckKind kind);

// "error" or "warning".
const char* wordOf(Severity severity);

struct Finding {
    CheckKind kind = CheckKind::crash;
    std::string className; // empty: the library itself
    std::string pass;      // the first one that showed it
    std::string request;   // the verb and its operands, as the command line takes them; empty if none
    std::string text;      // what exactly is wrong
    std::size_t count = 1;
};

// Findings, each once: what is found again, by another request or in another pass, is counted.
class Findings {
public:
    void add(Finding finding);
    // Errors first, each severity in the order of the checks.
    std::vector<Finding> sorted() const;
    bool empty() const { return all_.empty(); }

private:
    std::vector<Finding> all_;
};

} // namespace oxahv::runner
