#include "check/Strain.h"

#include "check/Results.h"

#include <algorithm>
#include <chrono>
#include <iterator>
#include <map>
#include <set>
#include <thread>

namespace oxahv::runner {

namespace {

// Threads

using Answers = std::vector<std::optional<Answer>>;

// What differs between two answers to a query. `values` are what may change by itself as well.
struct Difference {
    std::set<std::string> structure;
    std::set<std::string> values;
};

std::map<std::string, const Result*> byIdentity(const Answer& answer) {
    std::map<std::string, const Result*> results;
    for (const Result& result : answer.results) {
        results[result.identity] = &result;
    }
    return results;
}

void compareValues(const std::string& where, const NamedData& one, const NamedData& other,
                   Difference& difference) {
    for (const auto& [name, value] : one) {
        const auto found = other.find(name);
        if (found == other.end() || !(found->second == value)) {
            difference.values.insert(where + name);
        }
    }
    for (const auto& [name, value] : other) {
        if (one.count(name) == 0) {
            difference.values.insert(where + name);
        }
    }
}

Difference differenceOf(const Answer& one, const Answer& other) {
    Difference difference;
    if (one.code != other.code) {
        difference.structure.insert(codeName(one.code) + " in place of " + codeName(other.code));
        return difference;
    }
    const auto ours = byIdentity(one);
    const auto theirs = byIdentity(other);
    if (ours.size() != theirs.size() || one.results.size() != other.results.size()) {
        difference.structure.insert(std::to_string(one.results.size()) + " results in place of " +
                                    std::to_string(other.results.size()));
        return difference;
    }
    for (const auto& [identity, result] : ours) {
        const auto found = theirs.find(identity);
        if (found == theirs.end()) {
            difference.structure.insert("result " + result->path);
        } else {
            compareValues(result->path + ": property ", result->properties, found->second->properties,
                          difference);
        }
    }
    compareValues("output argument ", one.out, other.out, difference);
    if (!(one.data == other.data)) {
        difference.values.insert("the return value");
    }
    return difference;
}

std::set<std::string> without(const std::set<std::string>& all, const std::set<std::string>& excepted) {
    std::set<std::string> rest;
    std::set_difference(all.begin(), all.end(), excepted.begin(), excepted.end(),
                        std::inserter(rest, rest.end()));
    return rest;
}

Answers askAll(Client& client, const std::vector<Query>& queries) {
    Answers answers;
    for (const Query& query : queries) {
        answers.push_back(client.askPlainly(query));
    }
    return answers;
}

std::vector<Answers> askAtOnce(Client& client, const std::vector<Query>& queries) {
    std::vector<Answers> all(client.task().threads);
    std::vector<std::thread> threads;
    threads.reserve(all.size());
    for (Answers& answers : all) {
        threads.emplace_back([&] { answers = askAll(client, queries); });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    return all;
}

// What differs of a query, beyond what differs of itself between the two times that one thread asked.
using Differences = std::map<std::size_t, Difference>;

Differences oneRound(Client& client, const std::vector<Query>& queries) {
    const Answers before = askAll(client, queries);
    const std::vector<Answers> atOnce = askAtOnce(client, queries);
    const Answers after = askAll(client, queries);
    Differences differences;
    for (std::size_t i = 0; i < queries.size(); ++i) {
        if (!before[i] || !after[i]) {
            continue;
        }
        const Difference itself = differenceOf(*before[i], *after[i]);
        for (const Answers& answers : atOnce) {
            if (answers[i]) {
                const Difference found = differenceOf(*answers[i], *before[i]);
                if (itself.structure.empty()) {
                    differences[i].structure.insert(found.structure.begin(), found.structure.end());
                }
                const std::set<std::string> values = without(found.values, itself.values);
                differences[i].values.insert(values.begin(), values.end());
            }
        }
    }
    return differences;
}

// What changes by itself while one thread asks for a second.
std::set<std::string> restlessValues(Client& client, const Query& query) {
    constexpr unsigned int times = 20;
    constexpr std::chrono::milliseconds pause(50);
    std::set<std::string> restless;
    const std::optional<Answer> first = client.askPlainly(query);
    for (unsigned int i = 0; first && i < times; ++i) {
        std::this_thread::sleep_for(pause);
        if (const std::optional<Answer> again = client.askPlainly(query)) {
            restless.merge(differenceOf(*again, *first).values);
        }
    }
    return restless;
}

// A value that is different once may have changed, and so may one that is different twice when it changes all
// the time, as a number of processes does.
std::set<std::string> lastingValues(Client& client, const Query& query, const Difference& first,
                                    const Difference& second) {
    std::set<std::string> both;
    std::set_intersection(first.values.begin(), first.values.end(), second.values.begin(),
                          second.values.end(), std::inserter(both, both.end()));
    return both.empty() ? both : without(both, restlessValues(client, query));
}

void compareThreads(Client& client, const std::vector<Query>& queries) {
    const Differences first = oneRound(client, queries);
    const bool hasValues = std::any_of(first.begin(), first.end(),
                                       [](const auto& entry) { return !entry.second.values.empty(); });
    Differences second = hasValues ? oneRound(client, queries) : Differences();
    for (const auto& [index, difference] : first) {
        for (const std::string& text : difference.structure) {
            client.find(CheckKind::threadsDiffer, textOf(queries[index]), text);
        }
        for (const std::string& text : lastingValues(client, queries[index], difference, second[index])) {
            client.find(CheckKind::threadsDiffer, textOf(queries[index]), text);
        }
    }
}

// Faults

// Of the calls for one name and of all calls of one slot. A request for a thousand instances makes the same
// calls for each of them.
constexpr unsigned int mostOfAName = 2;
constexpr unsigned int mostOfASlot = 30;

// A call that gives something back is not made to fail: what is left over then would be the broker's fault.
bool canFail(const std::string& slot) {
    const std::string member = slot.substr(slot.find('.') + 1);
    return member != "release" && member.rfind("free", 0) != 0 && member != "detachThread";
}

// What the call is about, where it can be said in a word.
std::string nameOf(const Call& call) {
    const std::string member = call.slot.substr(call.slot.find('.') + 1);
    const bool isNamed = member.find("Property") != std::string::npos ||
                         member.find("Key") != std::string::npos || member.find("Arg") != std::string::npos;
    return isNamed ? call.name : "";
}

std::vector<FailingCall> failingCalls(const std::vector<ProviderCall>& calls) {
    std::map<std::string, unsigned int> last;
    for (const ProviderCall& made : calls) {
        last[made.call.slot] = made.number;
    }
    std::map<std::string, unsigned int> ofSlot;
    std::map<std::string, unsigned int> ofName;
    std::vector<FailingCall> failing;
    for (const ProviderCall& made : calls) {
        const std::string& slot = made.call.slot;
        if (!canFail(slot)) {
            continue;
        }
        const bool isNew = ++ofName[slot + ' ' + made.call.name] <= mostOfAName && ofSlot[slot] < mostOfASlot;
        if (isNew || made.number == last[slot]) {
            ++ofSlot[slot];
            failing.push_back({slot, made.number, nameOf(made.call)});
        }
    }
    return failing;
}

// One query with each of its calls failing.
class FaultedQuery {
public:
    FaultedQuery(Client& client, const Query& query) : client_(client), query_(query) {}

    void run() {
        std::vector<ProviderCall> calls;
        whole_ = client_.askRecorded(query_, calls);
        if (!whole_) {
            return;
        }
        for (const FailingCall& failing : failingCalls(calls)) {
            if (!isSkipped(failing)) {
                failOne(failing);
            }
        }
    }

private:
    // What has crashed is not made to crash again in the same way.
    bool isSkipped(const FailingCall& failing) const {
        const std::set<std::string>& skipped = client_.task().skippedFaults;
        return skipped.count(wordsOf(query_, failing)) != 0 || skipped.count(groupOf(query_, failing)) != 0;
    }

    void failOne(const FailingCall& failing) {
        const std::size_t before = live();
        const std::optional<Answer> answer = client_.askPlainly(query_, &failing);
        const std::size_t kept = live();
        if (answer) {
            compare(*answer, failing);
        }
        if (kept > before) {
            const std::size_t again = live();
            client_.askPlainly(query_, &failing);
            if (live() > again) {
                report(CheckKind::leftOver, failing,
                       query_.operation->name + (" leaves objects when " + failing.slot + " fails"));
            }
        }
    }

    // An answer that says OK has to be whole. Values may be missing: the calls that set them have no result
    // that a provider must mind. Only what is so a second time counts, as instances come and go.
    void compare(const Answer& answer, const FailingCall& failing) {
        if (!isLess(answer)) {
            return;
        }
        const std::optional<Answer> now = client_.askPlainly(query_);
        if (!now || !differenceOf(*now, *whole_).structure.empty()) {
            whole_ = now ? now : whole_;
            return;
        }
        const std::optional<Answer> again = client_.askPlainly(query_, &failing);
        if (again && isLess(*again)) {
            report(CheckKind::faultHidden, failing,
                   wordsOf(query_, failing) + ": OK, but " +
                       *differenceOf(*again, *whole_).structure.begin());
        }
    }

    bool isLess(const Answer& answer) const {
        return whole_->ok() && answer.ok() && !differenceOf(answer, *whole_).structure.empty();
    }

    void report(CheckKind kind, const FailingCall& failing, const std::string& text) {
        client_.find(kind, textOf(query_) + " --fault " + failing.slot + ':' + std::to_string(failing.number),
                     text);
    }

    std::size_t live() const { return client_.broker().liveObjects().total(); }

    Client& client_;
    const Query& query_;
    std::optional<Answer> whole_; // without a failing call
};

} // namespace

// A method does its work each time, and is not repeated. A failure has been told.
void strainByConduct(Client& client) {
    const std::vector<KnownQuery> all = client.asked();
    const auto askAgain = [&](const Query& query, const Conduct& conduct) {
        apply(client.broker(), conduct);
        return client.askPlainly(query);
    };
    for (const KnownQuery& asked : all) {
        const Operation& operation = *asked.query.operation;
        const bool isTold = asked.code != CMPI_RC_OK && !isRefusal(asked.code);
        if (operation.target == Target::ofClass || operation.takes == Takes::method || isTold) {
            continue;
        }
        const std::optional<Answer> before = askAgain(asked.query, client.task().conduct);
        const std::optional<Answer> plain = askAgain(asked.query, {});
        const std::optional<Answer> after = askAgain(asked.query, client.task().conduct);
        if (!before || !plain || !after || differenceOf(*before, *plain).structure.empty()) {
            continue;
        }
        for (const std::string& text : differenceOf(*after, *plain).structure) {
            client.find(CheckKind::keysUnread, textOf(asked.query), operation.name + (": " + text));
        }
    }
    apply(client.broker(), client.task().conduct);
}

void strainByThreads(Client& client) {
    std::vector<Query> queries;
    std::map<std::string, unsigned int> ofShape;
    constexpr unsigned int mostOfAShape = 3;
    for (const KnownQuery& known : client.task().known) {
        if (++ofShape[shapeOf(known.query) + codeName(known.code)] <= mostOfAShape) {
            queries.push_back(known.query);
        }
    }
    for (unsigned int round = 0; round < client.task().rounds; ++round) {
        client.tell({Message::Kind::queriesLeft, client.task().rounds - round, ""});
        compareThreads(client, queries);
    }
}

std::vector<KnownQuery> oneOfEachShape(const std::vector<KnownQuery>& known) {
    std::set<std::string> shapes;
    std::vector<KnownQuery> chosen;
    for (const KnownQuery& candidate : known) {
        if (shapes.insert(shapeOf(candidate.query) + codeName(candidate.code)).second) {
            chosen.push_back(candidate);
        }
    }
    return chosen;
}

void strainByFaults(Client& client) {
    const std::vector<KnownQuery> chosen = oneOfEachShape(client.task().known);
    for (std::size_t i = client.task().firstKnown; i < chosen.size(); ++i) {
        client.tell({Message::Kind::queriesLeft, chosen.size() - i, ""});
        if (!chosen[i].leavesObjects) {
            FaultedQuery(client, chosen[i].query).run();
        }
    }
}

} // namespace oxahv::runner
