// How every function of a provider runs: under its locale, traced, and with no way out but a status.
#pragma once

#include "Hosted.h"

#include <Trace.h>

#include <cstring>
#include <cxxabi.h>
#include <exception>
#include <limits>

namespace oxahv::detail {

// Traces

// A parameter list: " name=text name=text", as far as a trace can show it.
class TraceList {
public:
    TraceList& add(const char* name, const char* text) {
        return append(" ").append(name).append("=").append(text);
    }
    // A null text is left out.
    TraceList& addGiven(const char* name, const char* text) {
        return text != nullptr ? add(name, text) : *this;
    }
    TraceList& add(const char* name, std::size_t number) {
        char digits[std::numeric_limits<std::size_t>::digits10 + 2] = {};
        char* first = digits + sizeof digits - 1;
        do {
            *--first = static_cast<char>('0' + number % 10);
            number /= 10;
        } while (number != 0);
        return add(name, first);
    }
    TraceList() { *list_ = 0; }
    const char* text() const { return list_; }

private:
    TraceList& append(const char* text) {
        const std::size_t room = sizeof list_ - 1 - size_;
        const std::size_t size = ::strnlen(text, room);
        std::memcpy(list_ + size_, text, size);
        size_ += size;
        list_[size_] = '\0';
        return *this;
    }

    std::size_t size_ = 0;
    char list_[TK::traceBufferSize]; // NOLINT(*-member-init): written as far as it is read
};

// The trace point of all functions of all providers, which are named in it. What the logger takes is one text
// for entry and exit, since making it anew would cost a request its second allocation.
class FlowTrace {
public:
    FlowTrace(const std::string& category, const char* function) : category_(category), function_(function) {
        text_.reserve(TK::traceBufferSize);
    }

    void log(TK::MessageType type, const TraceList& list) {
        constexpr const char* file = TK::traceFileName(__FILE__);
        constexpr int line = __LINE__;
        text_ = TK::tracepara(function_, file, line, list.text(), type);
        HVLog::HVLogger::logLevelMessage(function_, file, line, category_, TK::parametersLevelCode, nullptr,
                                         0, 0, text_);
        HVLog::HVLogger::traceLevelMessage(function_, file, line, category_, TK::parametersLevelCode, nullptr,
                                           0, 0, text_);
    }

private:
    const std::string& category_;
    const char* function_;
    std::string text_;
};

// Failures

// pthread_exit and cancellation unwind as a foreign exception, which has to go on.
inline void passOnTheEndOfAThread() {
    if (abi::__cxa_current_exception_type() == nullptr) {
        throw;
    }
}

// What a failure is answered with. Neither a trace nor a text that fails keeps the code from the client.
[[gnu::cold, gnu::noinline]] inline CMPIStatus statusOf(const CMPIBroker* broker, const std::string& category,
                                                        const char* function, CMPIrc code, const char* text) {
    try {
        FlowTrace trace(category, function);
        trace.log(TK::EXITING, TraceList().add("code", static_cast<std::size_t>(code)).add("text", text));
    } catch (...) {
        passOnTheEndOfAThread();
    }
    return {code, *text != '\0' ? CMNewString(writable(broker), text, nullptr) : nullptr};
}

// The status of the exception that is being handled.
[[gnu::cold, gnu::noinline]] inline CMPIStatus statusOfException(const CMPIBroker* broker,
                                                                 const std::string& category,
                                                                 const char* function) {
    passOnTheEndOfAThread();
    try {
        throw;
    } catch (const Refusal& refusal) {
        return statusOf(broker, category, function, refusal.code(), refusal.what());
    } catch (const TK::FrameworkException& exception) {
        return statusOf(broker, category, function, CMPI_RC_ERR_INVALID_PARAMETER, exception.what());
    } catch (const std::exception& exception) {
        return statusOf(broker, category, function, CMPI_RC_ERR_FAILED, exception.what());
    } catch (...) {
        return statusOf(broker, category, function, CMPI_RC_ERR_FAILED, "unknown exception");
    }
}

// Requests

// What the server called a function with.
struct ServerCall {
    const Hosted& hosted;
    const char* function;
    const CMPIContext* context;
    const CMPIResult* result;
    const CMPIObjectPath* path;
    const char** properties = nullptr;
    Wanted wanted = Wanted::instances;
    EndFilter* filter = nullptr;
    const char* method = nullptr; // or the query
};

// What may make an Operation.
struct Service {
    // Serves the operation; returns to `reply`.
    using Serve = void (*)(const void* closure, const Operation& operation, Names& reply);

    // No exception may reach the CIM server, whose caller is C.
    static CMPIStatus answer(const ServerCall& call, const void* closure, Serve serve) {
        try {
            const Utf8Thread utf8(call.hosted.locale);
            run(call, closure, serve);
            return {CMPI_RC_OK, nullptr};
        } catch (...) {
            return statusOfException(call.hosted.broker, call.hosted.category, call.function);
        }
    }

    template <class Function>
    static CMPIStatus answer(const ServerCall& call, const Function& function) {
        return answer(call, &function, [](const void* closure, const Operation& operation, Names& reply) {
            (*static_cast<const Function*>(closure))(operation, reply);
        });
    }

    static EndFilter filter(const char* associationClass, const char* resultClass, const char* role,
                            const char* resultRole) {
        return {{associationClass}, {resultClass}, role, resultRole, Operation::mayWant};
    }
    static Instance end(AssociationProvider& provider, const Operation& operation, const Path& path) {
        return provider.end(operation, path);
    }
    // Instances for a reply that is made of something else in the end.
    static void associate(AssociationProvider& provider, const Operation& operation, Names& reply) {
        Instances instances(operation, reply);
        instances.provider_ = &provider;
        instances.end_ = end;
        instances.addAssociation_ = &Instances::addAssociation;
        provider.associations(operation, instances);
    }
    static void list(InstanceProvider& provider, const Operation& operation, Names& reply) {
        Instances instances(operation, reply);
        provider.enumerate(operation, instances);
    }
    static void get(InstanceProvider& provider, const Operation& operation, Names& reply) {
        Instances instances(operation, reply, true);
        provider.get(operation, instances);
        if (reply.count_ == 0) {
            throw Refusal(CMPI_RC_ERR_NOT_FOUND,
                          std::string("there is no such instance of class ") + operation.className());
        }
    }
    static void query(InstanceProvider& provider, const Operation& operation, const char* query,
                      const char* language, Names& reply) {
        Instances instances(operation, reply);
        provider.query(operation, query, language, instances);
    }
    static void invoke(MethodProvider& provider, const MethodCall& call) { provider.invoke(call); }
    static void getProperty(PropertyProvider& provider, const Operation& operation, const CMPIResult* result,
                            const char* name) {
        ValueReply reply(operation, result, name);
        provider.getProperty(operation, name, reply);
    }
    static void setProperty(PropertyProvider& provider, const Operation& operation, const char* name,
                            const CMPIData& data) {
        provider.setProperty(operation, name,
                             SentValue({operation.broker(), "property", name, true, false, data}));
    }

    // A call that is about no object.
    template <class Function>
    static CMPIStatus answerWithoutObject(const Hosted& hosted, const char* name, const Function& function) {
        try {
            const Utf8Thread utf8(hosted.locale);
            FlowTrace trace(hosted.category, name);
            trace.log(TK::ENTERING, TraceList());
            function();
            trace.log(TK::EXITING, TraceList());
            return {CMPI_RC_OK, nullptr};
        } catch (...) {
            return statusOfException(hosted.broker, hosted.category, name);
        }
    }

private:
    static void run(const ServerCall& call, const void* closure, Serve serve) {
        const Operation operation(call.hosted.category, Context(call.hosted.broker, call.context), call.path,
                                  call.properties, call.wanted, call.filter);
        FlowTrace trace(call.hosted.category, call.function);
        traceEntry(trace, call, operation);
        Names reply(call.result);
        serve(closure, operation, reply);
        if (call.result != nullptr) { // as there is none for indications
            require(CMReturnDone(writable(call.result)), "end the reply");
        }
        trace.log(TK::EXITING, TraceList().add("results", reply.count_));
    }

    static void traceEntry(FlowTrace& trace, const ServerCall& call, const Operation& operation) {
        TraceList list;
        list.add("class", operation.className()).addGiven("method", call.method);
        if (call.filter != nullptr) {
            list.addGiven("associationClass", call.filter->associationClass.ancestor)
                .addGiven("resultClass", call.filter->resultClass.ancestor)
                .addGiven("role", call.filter->role)
                .addGiven("resultRole", call.filter->resultRole);
        }
        trace.log(TK::ENTERING, list);
    }
};

} // namespace oxahv::detail
