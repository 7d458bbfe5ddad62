// What a check of a provider finds, and how it is reported.
#pragma once

#include "show/Output.h"

#include <ostream>
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
    notDone
};

struct Check {
    CheckKind kind;
    const char* name;
    Severity severity;
    const char* meaning; // what is wrong where it finds something
};

// In the order of CheckKind.
const std::vector<Check>& checks();

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

// A class that was to be checked.
struct CheckedClass {
    std::string name;
    bool isServed = false;
    std::size_t instances = 0;
    std::string answer; // of a class that is not served: the provider's
};

struct CheckReport {
    std::string library;
    std::string provider;
    std::vector<std::string> passes;
    std::vector<CheckedClass> classes;
    std::size_t requests = 0;
    Findings findings;
};

// As a table for a person, or as a JSON array of one object:
//
//   {"library", "provider": texts, "passes": [text], "requests": number,
//    "classes": [{"class": text, "served": boolean, "instances": number, "answer": text}],
//    "findings": [{"check", "severity", "class", "pass", "request", "text": texts, "count": number}]}
//
// where "answer" is there for classes that are not served, and "severity" is "error" or "warning".
// `isColoured` sets the table's severities off by colours.
void printReport(std::ostream& out, Format format, const CheckReport& report, bool isColoured);

} // namespace oxahv::runner
