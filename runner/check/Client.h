// The client that a check is to a provider: in the child process, it sends queries, tells the parent about
// each, and looks at what any answer has to be.
#pragma once

#include "check/Child.h"
#include "check/Findings.h"
#include "check/Protocol.h"
#include "check/Query.h"

#include <atomic>
#include <functional>
#include <optional>
#include <set>
#include <string>
#include <vector>

namespace oxahv::runner {

// A method that the user wants to be called.
struct MethodCall {
    std::string className;
    std::string method;
    std::vector<std::string> arguments; // name=value
};

// One class in one pass.
struct CheckTask {
    std::string className;
    std::string pass;
    bool isNamed = false; // by the user, who so says that the provider serves it
    Conduct conduct{};
    std::vector<MethodCall> methods;
    unsigned int threads = 4;
    unsigned int rounds = 1; // of the requests that threads send at once
    std::size_t sample = 0;  // how many instances are asked for, and half of them for their associations
    bool isFirst = false;    // whether the queries are told to the parent, for later passes
    bool writes = false;     // whether instances may be created, changed and deleted
    std::vector<KnownQuery> known{};       // the queries of the first pass
    std::size_t firstKnown = 0;            // those before it are done with
    std::set<std::string> skipped{};       // the queries that have ended or blocked the provider
    std::set<std::string> skippedFaults{}; // and queries with a failing call, by their words or group
};

class Client {
public:
    // Without `reports`, what is found is not told: another pass has told it.
    Client(EmbeddedBroker& broker, const Options& options, const CheckTask& task, ChildOutput& output,
           bool reports)
        : broker_(broker), options_(options), task_(task), output_(output), reports_(reports) {}

    EmbeddedBroker& broker() { return broker_; }
    const Options& options() const { return options_; }
    const CheckTask& task() const { return task_; }
    const std::vector<KnownQuery>& asked() const { return asked_; }
    void setReports(bool reports) { reports_ = reports; }

    // The answer; none when the query is one of those that are skipped or cannot be sent.
    std::optional<Answer> ask(const Query& query);
    // The same for several threads at once, and with a failing call: looks at the code alone.
    std::optional<Answer> askPlainly(const Query& query, const FailingCall* failing = nullptr);
    // The same as `askPlainly` without failing call, and notes the provider's calls.
    std::optional<Answer> askRecorded(const Query& query, std::vector<ProviderCall>& calls);
    // Does what is no query, such as the provider's end, under a name.
    void doing(const std::string& name, const std::function<void()>& work);

    // A request that had to succeed did not. What is wrong with the answer itself has been told.
    void fail(const std::string& request, const std::string& what, const Answer& answer);
    void find(CheckKind kind, const std::string& request, const std::string& text);
    void tell(const Message& message) { output_.send(lineOf(message)); }

private:
    template <class Work>
    auto tracked(const Message& begin, Work work);
    void checkLostText(const Query& query, const std::string& request);
    void checkCode(const std::string& request, const Answer& answer);
    void checkCalls(const std::string& request, const std::vector<ProviderCall>& calls);
    bool checkLeftOver(const Query& query, std::size_t before);

    EmbeddedBroker& broker_;
    const Options& options_;
    const CheckTask& task_;
    ChildOutput& output_;
    bool reports_;
    std::vector<KnownQuery> asked_;
    std::atomic<std::size_t> number_{0};
};

} // namespace oxahv::runner
