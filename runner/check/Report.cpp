#include "check/Report.h"

#include "show/Text.h"

#include <nlohmann/json.hpp>

#include <algorithm>

namespace oxahv::runner {

namespace {

using Json = nlohmann::ordered_json;

// The table

std::string counted(std::size_t count, const std::string& one, const std::string& many) {
    return std::to_string(count) + ' ' + (count == 1 ? one : many);
}

void printClasses(std::ostream& out, const std::vector<CheckedClass>& classes) {
    std::string refused;
    for (const CheckedClass& checked : classes) {
        if (checked.isServed) {
            out << "checked     " << checked.name << ": "
                << counted(checked.instances, "instance", "instances") << '\n';
        } else {
            refused += "not served  " + checked.name + ": " + printable(checked.answer) + '\n';
        }
    }
    out << refused;
}

void printFinding(std::ostream& out, const Finding& finding, bool isColoured) {
    const Check& check = checkOf(finding.kind);
    const char* const colour = check.severity == Severity::error ? "\033[31m" : "\033[33m";
    out << (isColoured ? colour : "") << wordOf(check.severity) << (isColoured ? "\033[0m" : "") << "  "
        << check.name << "  " << finding.className << (finding.className.empty() ? "" : ": ")
        << printable(finding.text) << '\n';
    if (!finding.request.empty()) {
        out << "    " << printable(finding.request) << '\n';
    }
    out << "    " << check.meaning << "; pass: " << finding.pass;
    if (finding.count > 1) {
        out << ", " << finding.count << " times";
    }
    out << '\n';
}

void printTable(std::ostream& out, const CheckReport& report, bool isColoured) {
    printClasses(out, report.classes);
    const std::vector<Finding> findings = report.findings.sorted();
    std::size_t errors = 0;
    for (const Finding& finding : findings) {
        printFinding(out, finding, isColoured);
        errors += checkOf(finding.kind).severity == Severity::error ? 1 : 0;
    }
    for (const std::string& text : report.untested) {
        out << "not tested  " << printable(text) << '\n';
    }
    out << counted(report.requests, "request", "requests") << ", " << counted(errors, "error", "errors")
        << ", " << counted(findings.size() - errors, "warning", "warnings") << '\n';
}

// JUnit's XML

// Characters that XML does not know, not even as references, become question marks.
std::string xmlText(const std::string& text) {
    std::string result;
    for (const char c : printable(text)) {
        switch (c) {
        case '&':
            result += "&amp;";
            break;
        case '<':
            result += "&lt;";
            break;
        case '>':
            result += "&gt;";
            break;
        case '"':
            result += "&quot;";
            break;
        default:
            result += c;
        }
    }
    return result;
}

void printCase(std::ostream& out, const std::string& suite, const std::string& name,
               const std::string& content) {
    out << "  <testcase classname=\"" << xmlText(suite) << "\" name=\"" << xmlText(name) << "\">" << content
        << "</testcase>\n";
}

std::string failureOf(const Finding& finding) {
    const Check& check = checkOf(finding.kind);
    return std::string("<failure type=\"") + wordOf(check.severity) + "\" message=\"" +
           xmlText(finding.text) + "\">" + xmlText(finding.request) + "; " + check.meaning +
           "; pass: " + xmlText(finding.pass) + "</failure>";
}

void printJunit(std::ostream& out, const CheckReport& report) {
    const std::vector<Finding> findings = report.findings.sorted();
    const auto isClean = [&](const CheckedClass& checked) {
        return checked.isServed &&
               std::none_of(findings.begin(), findings.end(),
                            [&](const Finding& finding) { return finding.className == checked.name; });
    };
    const auto clean =
        static_cast<std::size_t>(std::count_if(report.classes.begin(), report.classes.end(), isClean));
    out << "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<testsuite name=\"" << xmlText(report.provider)
        << "\" tests=\"" << findings.size() + clean + report.untested.size() << "\" failures=\""
        << findings.size() << "\" errors=\"0\" skipped=\"" << report.untested.size() << "\">\n";
    for (const CheckedClass& checked : report.classes) {
        if (isClean(checked)) {
            printCase(out, checked.name, "check", "");
        }
    }
    for (const Finding& finding : findings) {
        printCase(out, finding.className.empty() ? report.provider : finding.className,
                  checkOf(finding.kind).name + (": " + finding.text), failureOf(finding));
    }
    for (const std::string& text : report.untested) {
        printCase(out, report.provider, "not tested: " + text, "<skipped/>");
    }
    out << "</testsuite>\n";
}

// JSON

Json jsonOf(const CheckedClass& checked) {
    Json json = {{"class", checked.name}, {"served", checked.isServed}, {"instances", checked.instances}};
    if (!checked.isServed) {
        json["answer"] = checked.answer;
    }
    return json;
}

Json jsonOf(const Finding& finding) {
    const Check& check = checkOf(finding.kind);
    return {{"check", check.name},   {"severity", wordOf(check.severity)}, {"class", finding.className},
            {"pass", finding.pass},  {"request", finding.request},         {"text", finding.text},
            {"count", finding.count}};
}

template <class Item>
Json jsonOf(const std::vector<Item>& items) {
    Json array = Json::array();
    for (const Item& item : items) {
        array.push_back(jsonOf(item));
    }
    return array;
}

void printJson(std::ostream& out, const CheckReport& report) {
    const Json json = Json::array({{{"library", report.library},
                                    {"provider", report.provider},
                                    {"passes", report.passes},
                                    {"requests", report.requests},
                                    {"classes", jsonOf(report.classes)},
                                    {"findings", jsonOf(report.findings.sorted())},
                                    {"untested", report.untested}}});
    out << json.dump(2, ' ', false, Json::error_handler_t::replace) << '\n';
}

} // namespace

void printReport(std::ostream& out, Format format, const CheckReport& report, bool isColoured) {
    switch (format) {
    case Format::json:
        printJson(out, report);
        break;
    case Format::junit:
        printJunit(out, report);
        break;
    case Format::mof:
        printTable(out, report, isColoured);
        break;
    }
}

} // namespace oxahv::runner
