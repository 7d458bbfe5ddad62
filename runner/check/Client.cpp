#include "check/Client.h"

#include "check/LostTexts.h"

#include <algorithm>
#include <cstddef>

namespace oxahv::runner {

namespace {

bool endsWith(const std::string& text, const std::string& end) {
    return text.size() >= end.size() && text.compare(text.size() - end.size(), end.size(), end) == 0;
}

// Calls that the broker refuses show what the provider gives it, whether or not it minds the refusal.
struct Refusal {
    const char* member;
    CMPIrc code;
    CheckKind kind;
    std::string (*text)(const Call& call);
};

std::string propertyText(const Call& call) {
    return "property " + call.name;
}
std::string typedText(const Call& call) {
    return "property " + call.name + " is set as " + typeText(call.type);
}
std::string classText(const Call& /*call*/) {
    return "an instance is made of a class that is not declared";
}
std::string dateText(const Call& call) {
    return '\'' + call.name + '\'';
}

constexpr Refusal refusals[] = {
    {".setProperty", CMPI_RC_ERR_NO_SUCH_PROPERTY, CheckKind::undeclared, propertyText},
    {".setPropertyWithOrigin", CMPI_RC_ERR_NO_SUCH_PROPERTY, CheckKind::undeclared, propertyText},
    {".addKey", CMPI_RC_ERR_NO_SUCH_PROPERTY, CheckKind::undeclared, propertyText},
    {".setProperty", CMPI_RC_ERR_TYPE_MISMATCH, CheckKind::type, typedText},
    {".setPropertyWithOrigin", CMPI_RC_ERR_TYPE_MISMATCH, CheckKind::type, typedText},
    {".addKey", CMPI_RC_ERR_TYPE_MISMATCH, CheckKind::type, typedText},
    {".newInstance", CMPI_RC_ERR_INVALID_CLASS, CheckKind::undeclared, classText},
    {".newDateTimeFromChars", CMPI_RC_ERR_INVALID_PARAMETER, CheckKind::date, dateText},
};

// What the broker answers for a provider that throws.
bool isException(const Answer& answer) {
    return answer.code == CMPI_RC_ERR_FAILED && answer.message.rfind("exception", 0) == 0;
}

Message beginOf(const Query& query, const std::string& text) {
    return {Message::Kind::begin, 0, text, query.operation->name};
}

// Whether one of the next calls does the same with success: for a number without a type, the kit tries one
// type after the other.
bool isMended(std::vector<ProviderCall>::const_iterator made, std::vector<ProviderCall>::const_iterator end) {
    constexpr std::ptrdiff_t most = 32;
    return std::any_of(made, made + std::min(most, end - made), [&](const ProviderCall& next) {
        return next.call.code == CMPI_RC_OK && next.call.slot == made->call.slot &&
               next.call.object == made->call.object && next.call.name == made->call.name;
    });
}

bool isStandard(CMPIrc code) {
    return codeName(code) != "CMPI_RC_" + std::to_string(static_cast<int>(code));
}

} // namespace

// Tells the parent what is begun before it begins, so that it knows what was at work when the process ends.
template <class Work>
auto Client::tracked(const Message& begin, Work work) {
    struct End {
        Client& client;
        std::size_t number;
        ~End() { client.tell({Message::Kind::end, number, ""}); }
    };
    const std::size_t number = ++number_;
    Message message = begin;
    message.number = number;
    tell(message);
    const End end = {*this, number};
    return work();
}

std::optional<Answer> Client::ask(const Query& query) {
    const std::string text = textOf(query);
    if (task_.skipped.count(text) != 0) {
        return std::nullopt;
    }
    const std::size_t before = broker_.liveObjects().total();
    std::vector<ProviderCall> calls;
    Answer answer;
    try {
        answer = tracked(beginOf(query, text), [&] { return sendRecorded(broker_, options_, query, calls); });
    } catch (const BrokerError& error) {
        find(CheckKind::failed, text, std::string("the request cannot be made: ") + error.what());
        return std::nullopt;
    }
    checkCode(text, answer);
    checkCalls(text, calls);
    if (answer.ok() && !answer.isDone) {
        find(CheckKind::notDone, text, query.operation->name + std::string(" does not call returnDone"));
    }
    checkLostText(query, text);
    asked_.push_back({query, answer.code, checkLeftOver(query, before)});
    const Yields yields = query.operation->yields;
    const bool isRead = yields != Yields::nothing && yields != Yields::onePath; // can be repeated
    if (task_.isFirst && isRead) {
        Message message = {Message::Kind::asked, 0, ""};
        message.known = asked_.back();
        tell(message);
    }
    return answer;
}

std::optional<Answer> Client::askPlainly(const Query& query, const FailingCall* failing) {
    std::string text = textOf(query);
    if (failing != nullptr) {
        text += " --fault " + failing->slot + ':' + std::to_string(failing->number);
    }
    if (task_.skipped.count(text) != 0) {
        return std::nullopt;
    }
    Message begin = beginOf(query, text);
    if (failing != nullptr) {
        begin.summary = wordsOf(query, *failing);
        begin.group = groupOf(query, *failing);
    }
    try {
        Answer answer = tracked(begin, [&] { return send(broker_, options_, query, failing); });
        checkCode(text, answer);
        return answer;
    } catch (const BrokerError&) { // the call that fails is one of the client's own
        return std::nullopt;
    }
}

std::optional<Answer> Client::askRecorded(const Query& query, std::vector<ProviderCall>& calls) {
    const std::string text = textOf(query);
    if (task_.skipped.count(text) != 0) {
        return std::nullopt;
    }
    try {
        return tracked(beginOf(query, text), [&] { return sendRecorded(broker_, options_, query, calls); });
    } catch (const BrokerError&) {
        return std::nullopt;
    }
}

void Client::doing(const std::string& name, const std::function<void()>& work) {
    tracked({Message::Kind::begin, 0, name, name}, work);
}

void Client::fail(const std::string& request, const std::string& what, const Answer& answer) {
    if (isStandard(answer.code) && !isException(answer)) {
        find(CheckKind::failed, request, what + ": " + wordsOf(answer));
    }
}

void Client::find(CheckKind kind, const std::string& request, const std::string& text) {
    if (reports_) {
        Message message = {Message::Kind::finding, 0, ""};
        message.finding = {kind, task_.className, task_.pass, request, text};
        tell(message);
    }
}

void Client::checkCode(const std::string& request, const Answer& answer) {
    if (!isStandard(answer.code)) {
        find(CheckKind::notACode, request, "the answer is " + std::to_string(static_cast<int>(answer.code)));
    }
    if (isException(answer)) {
        find(CheckKind::exception, request, answer.message);
    }
}

void Client::checkCalls(const std::string& request, const std::vector<ProviderCall>& calls) {
    for (auto made = calls.begin(); made != calls.end(); ++made) {
        for (const Refusal& refusal : refusals) {
            if (made->call.code == refusal.code && endsWith(made->call.slot, refusal.member) &&
                !isMended(made, calls.end())) {
                find(refusal.kind, request, refusal.text(made->call));
            }
        }
    }
}

// The library traces each text that the locale cannot convert, and goes on without it.
void Client::checkLostText(const Query& query, const std::string& request) {
    if (takeLostTexts() > 0) {
        find(CheckKind::textLost, request,
             query.operation->name + std::string(" loses text that the locale cannot convert"));
    }
}

// A provider may keep what it made for a first request; it makes no more for the second.
bool Client::checkLeftOver(const Query& query, std::size_t before) {
    if (broker_.liveObjects().total() <= before) {
        return false;
    }
    const std::size_t kept = broker_.liveObjects().total();
    askPlainly(query);
    const std::size_t left = broker_.liveObjects().total();
    if (left > kept) {
        find(CheckKind::leftOver, textOf(query),
             query.operation->name + (" leaves " + std::to_string(left - kept)) +
                 (left - kept == 1 ? " object" : " objects"));
    }
    return left > kept;
}

} // namespace oxahv::runner
