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
    std::set<std::string> skipped; // the queries that have ended or blocked the provider
};

class Client {
public:
    // A query that was answered, with the provider's calls.
    struct Asked {
        Query query;
        CMPIrc code;
        std::vector<ProviderCall> calls;
        bool leavesObjects = false;
    };

    // Without `reports`, what is found is not told: another pass has told it.
    Client(EmbeddedBroker& broker, const Options& options, const CheckTask& task, ChildOutput& output,
           bool reports)
        : broker_(broker), options_(options), task_(task), output_(output), reports_(reports) {}

    EmbeddedBroker& broker() { return broker_; }
    const Options& options() const { return options_; }
    const CheckTask& task() const { return task_; }
    const std::vector<Asked>& asked() const { return asked_; }
    void setReports(bool reports) { reports_ = reports; }

    // The answer; none when the query is one of those that are skipped or cannot be sent.
    std::optional<Answer> ask(const Query& query);
    // The same for several threads at once, and with a failing call: looks at the code alone.
    std::optional<Answer> askPlainly(const Query& query, const FailingCall* failing = nullptr);
    // Does what is no query, such as the provider's end, under a name.
    void doing(const std::string& name, const std::function<void()>& work);

    // A request that had to succeed did not. What is wrong with the answer itself has been told.
    void fail(const std::string& request, const std::string& what, const Answer& answer);
    void find(CheckKind kind, const std::string& request, const std::string& text);
    void tell(const Message& message) { output_.send(lineOf(message)); }

private:
    template <class Work>
    auto tracked(const std::string& text, Work work);
    void checkCode(const std::string& request, const Answer& answer);
    void checkCalls(const std::string& request, const std::vector<ProviderCall>& calls);
    bool checkLeftOver(const Query& query, std::size_t before);

    EmbeddedBroker& broker_;
    const Options& options_;
    const CheckTask& task_;
    ChildOutput& output_;
    bool reports_;
    std::vector<Asked> asked_;
    std::atomic<std::size_t> number_{0};
};

} // namespace oxahv::runner
