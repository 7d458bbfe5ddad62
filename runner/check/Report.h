// How a check of a provider is reported.
#pragma once

#include "check/Findings.h"
#include "show/Output.h"

#include <ostream>
#include <string>
#include <vector>

namespace oxahv::runner {

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
    std::vector<std::string> untested; // sentences
};

// As a table for a person, as a JSON array of one object, or as JUnit's XML:
//
//   {"library", "provider": texts, "passes": [text], "requests": number,
//    "classes": [{"class": text, "served": boolean, "instances": number, "answer": text}],
//    "findings": [{"check", "severity", "class", "pass", "request", "text": texts, "count": number}],
//    "untested": [text]}
//
// where "answer" is there for classes that are not served, and "severity" is "error" or "warning". In JUnit's
// form a finding is a failed test case of its class, a class without findings is a case that passes, and what
// was not tested is skipped. `isColoured` sets the table's severities off by colours.
void printReport(std::ostream& out, Format format, const CheckReport& report, bool isColoured);

} // namespace oxahv::runner
