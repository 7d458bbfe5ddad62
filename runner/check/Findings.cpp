#include "check/Findings.h"

#include "show/Text.h"

#include <nlohmann/json.hpp>

#include <algorithm>

namespace oxahv::runner {

namespace {

using Json = nlohmann::ordered_json;

const Check& checkOf(CheckKind kind) {
    return checks()[static_cast<std::size_t>(kind)];
}

const char* wordOf(Severity severity) {
    return severity == Severity::error ? "error" : "warning";
}

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
    out << counted(report.requests, "request", "requests") << ", " << counted(errors, "error", "errors")
        << ", " << counted(findings.size() - errors, "warning", "warnings") << '\n';
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
                                    {"findings", jsonOf(report.findings.sorted())}}});
    out << json.dump(2, ' ', false, Json::error_handler_t::replace) << '\n';
}

} // namespace

const std::vector<Check>& checks() {
    constexpr Severity error = Severity::error;
    constexpr Severity warning = Severity::warning;
    static const std::vector<Check> all = {
        {CheckKind::crash, "crash", error, "the provider ended its process"},
        {CheckKind::hang, "hang", error, "the provider did not answer in time"},
        {CheckKind::notServed, "not-served", error, "the provider refuses a class that is to be checked"},
        {CheckKind::failed, "failed", error, "a request that has to succeed does not"},
        {CheckKind::exception, "exception", error, "a C++ exception left the provider"},
        {CheckKind::notACode, "not-a-code", error, "the answer is no CMPI return code"},
        {CheckKind::absent, "absent", error, "an instance that does not exist is not answered NOT_FOUND"},
        {CheckKind::notOne, "not-one", error, "a request for one instance yields none or several"},
        {CheckKind::otherPath, "other-path", error, "the instance is another than the one asked for"},
        {CheckKind::namesDiffer, "names-differ", error, "names and instances are not the same"},
        {CheckKind::duplicate, "duplicate", error, "a path stands twice"},
        {CheckKind::otherClass, "other-class", error, "a result is not of the class asked for"},
        {CheckKind::keyMissing, "key-missing", error, "a path lacks a key of its class"},
        {CheckKind::nullKey, "null-key", error, "a key has no value"},
        {CheckKind::type, "type", error, "a value is not of its declared type"},
        {CheckKind::undeclared, "undeclared", error, "the class does not declare it"},
        {CheckKind::encoding, "encoding", error, "a text is not UTF-8"},
        {CheckKind::date, "date", error, "a text for a date or an interval is none"},
        {CheckKind::getDiffers, "get-differs", error, "one instance has other properties than in the list"},
        {CheckKind::propertyList, "property-list", error, "a property that was asked for is missing"},
        {CheckKind::listIgnored, "list-ignored", warning, "properties come that were not asked for"},
        {CheckKind::associationsDiffer, "associations-differ", error,
         "instances, names and references tell different associations"},
        {CheckKind::associationEnd, "association-end", error,
         "an association does not lead to the instance asked for"},
        {CheckKind::oneSided, "one-sided", error, "an association is seen from one of its ends only"},
        {CheckKind::filter, "filter", error, "a filter yields other results than it selects"},
        {CheckKind::methodResult, "method-result", error,
         "a method's results are not what its class declares"},
        {CheckKind::threadsDiffer, "threads-differ", error, "several threads at once get other results"},
        {CheckKind::leftOver, "left-over", error, "objects of the broker are not released"},
        {CheckKind::keysUnread, "keys-unread", error,
         "the answer is another when the keys come as other servers deliver them"},
        {CheckKind::staysMapped, "stays-mapped", error,
         "the library cannot be unloaded: to replace it under a running server crashes that"},
        {CheckKind::notDone, "not-done", warning, "the provider does not tell the broker that it is done"},
    };
    return all;
}

void Findings::add(Finding finding) {
    const auto known = std::find_if(all_.begin(), all_.end(), [&](const Finding& other) {
        return other.kind == finding.kind && other.className == finding.className &&
               other.text == finding.text;
    });
    if (known != all_.end()) {
        known->count += finding.count;
    } else {
        all_.push_back(std::move(finding));
    }
}

std::vector<Finding> Findings::sorted() const {
    std::vector<Finding> findings = all_;
    const auto rank = [](const Finding& finding) {
        return std::make_pair(checkOf(finding.kind).severity, finding.kind);
    };
    std::stable_sort(findings.begin(), findings.end(),
                     [&](const Finding& a, const Finding& b) { return rank(a) < rank(b); });
    return findings;
}

void printReport(std::ostream& out, Format format, const CheckReport& report, bool isColoured) {
    if (format == Format::json) {
        printJson(out, report);
    } else {
        printTable(out, report, isColoured);
    }
}

} // namespace oxahv::runner
