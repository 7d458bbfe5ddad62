#include "check/Findings.h"

#include <algorithm>

namespace oxahv::runner {

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
        {CheckKind::otherNameSpace, "other-namespace", error,
         "a path is in another namespace than the one asked for"},
        {CheckKind::range, "range", error, "a value is not one that its qualifiers allow"},
        {CheckKind::textLost, "text-lost", error,
         "a text is lost, since the server's locale cannot convert it"},
        {CheckKind::argumentAccepted, "argument-accepted", error,
         "a method succeeds with an argument that it should refuse"},
        {CheckKind::writing, "write", error,
         "an instance is not created, changed or deleted as the answer says"},
        {CheckKind::faultHidden, "fault-hidden", error,
         "a call of the broker fails, and the answer is OK and not whole"},
        {CheckKind::residue, "residue", error,
         "the provider changes the server's process, or leaves something in it"},
        {CheckKind::sanitizer, "sanitizer", error, "a sanitizer that the provider is built with reports it"},
        {CheckKind::notDone, "not-done", warning, "the provider does not tell the broker that it is done"},
        {CheckKind::untested, "untested", warning, "the check has not tried it"},
    };
    return all;
}

const Check& checkOf(CheckKind kind) {
    return checks()[static_cast<std::size_t>(kind)];
}

const char* wordOf(Severity severity) {
    return severity == Severity::error ? "error" : "warning";
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

} // namespace oxahv::runner
