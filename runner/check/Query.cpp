#include "check/Query.h"

#include "RequestText.h"

#include <algorithm>
#include <map>

namespace oxahv::runner {

namespace {

// Takes faults and the record away, whatever happens.
class Hooked {
public:
    Hooked(EmbeddedBroker& broker, const FailingCall* failing, bool isRecorded)
        : broker_(broker), isFailing_(failing != nullptr), isRecorded_(isRecorded) {
        if (failing != nullptr) {
            Fault fault;
            fault.firstCall = failing->number;
            broker_.injectFault(failing->slot, fault);
        }
        if (isRecorded_) {
            broker_.startRecording();
        }
    }
    ~Hooked() { end(); }
    Hooked(const Hooked&) = delete;
    Hooked& operator=(const Hooked&) = delete;

    std::vector<Call> calls() { return isRecorded_ ? broker_.stopRecording() : std::vector<Call>(); }
    void end() {
        if (isFailing_) {
            broker_.clearFaults();
        }
        if (isRecorded_) {
            broker_.stopRecording();
        }
        isFailing_ = false;
        isRecorded_ = false;
    }

private:
    EmbeddedBroker& broker_;
    bool isFailing_;
    bool isRecorded_;
};

Answer sendHooked(EmbeddedBroker& broker, const Options& options, const Query& query,
                  const FailingCall* failing, std::vector<ProviderCall>* calls) {
    Hooked hooked(broker, failing, calls != nullptr);
    Request request(broker);
    const CMPIObjectPath* const target = targetOf(request, options, *query.operation, query.operands);
    std::map<std::string, unsigned int> counts;
    if (calls != nullptr) {
        for (const Call& call : broker.stopRecording()) {
            ++counts[call.slot];
        }
        broker.startRecording();
    }
    const Reply reply = query.operation->perform(broker, request, target, query.operands);
    for (Call& call : hooked.calls()) {
        const unsigned int number = ++counts[call.slot];
        calls->push_back({std::move(call), number});
    }
    hooked.end(); // before the reply is read, which takes slots too
    return answerOf(reply, options.nameSpace);
}

} // namespace

Query queryOf(const std::string& verb, Operands operands) {
    const auto found = std::find_if(operations().begin(), operations().end(),
                                    [&](const Operation& candidate) { return verb == candidate.name; });
    return {&*found, std::move(operands)};
}

Query queryOf(const std::string& verb, const std::string& target) {
    Operands operands;
    operands.target = target;
    return queryOf(verb, std::move(operands));
}

std::string textOf(const Query& query) {
    return requestText(*query.operation, query.operands);
}

std::string shapeOf(const Query& query) {
    std::string shape = query.operation->name + (' ' + query.operands.method);
    const AssociationFilter& filter = query.operands.filter;
    for (const std::string& value :
         {filter.associationClass, filter.resultClass, filter.role, filter.resultRole}) {
        shape += value.empty() ? '-' : '+';
    }
    return shape + (query.operands.properties ? '+' : '-');
}

std::string groupOf(const Query& query, const FailingCall& failing) {
    return query.operation->name + (" with " + failing.slot);
}

std::string wordsOf(const Query& query, const FailingCall& failing) {
    return groupOf(query, failing) + (failing.name.empty() ? "" : " of " + failing.name) + " failing";
}

Answer send(EmbeddedBroker& broker, const Options& options, const Query& query, const FailingCall* failing) {
    return sendHooked(broker, options, query, failing, nullptr);
}

Answer sendRecorded(EmbeddedBroker& broker, const Options& options, const Query& query,
                    std::vector<ProviderCall>& calls) {
    return sendHooked(broker, options, query, nullptr, &calls);
}

} // namespace oxahv::runner
