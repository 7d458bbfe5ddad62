// How every function of a provider runs: under its locale, traced, and with no way out but a status.
#pragma once

#include "Hosted.h"

#include <Trace.h>

#include <cxxabi.h>
#include <exception>
#include <limits>

namespace oxahv::detail {

// Traces

// One trace point for all functions of all providers, which are named in it.
inline void traceFlow(const std::string& category, const char* function, const char* parameters,
                      TK::MessageType type) {
    constexpr const char* file = TK::traceFileName(__FILE__);
    constexpr int line = __LINE__;
    const std::string text = TK::tracepara(function, file, line, parameters, type);
    HVLog::HVLogger::logLevelMessage(function, file, line, category, TK::parametersLevelCode, nullptr, 0, 0,
                                     text);
    HVLog::HVLogger::traceLevelMessage(function, file, line, category, TK::parametersLevelCode, nullptr, 0, 0,
                                       text);
}

// " name=text"; a null text is left out.
inline void appendParameter(std::string& list, const char* name, const char* text) {
    if (text != nullptr) {
        list.append(1, ' ').append(name).append(1, '=').append(text);
    }
}

inline void appendParameter(std::string& list, const char* name, std::size_t number) {
    char digits[std::numeric_limits<std::size_t>::digits10 + 2] = {};
    char* first = digits + sizeof digits - 1;
    do {
        *--first = static_cast<char>('0' + number % 10);
        number /= 10;
    } while (number != 0);
    appendParameter(list, name, first);
}

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
        std::string parameters;
        appendParameter(parameters, "code", static_cast<std::size_t>(code));
        appendParameter(parameters, "text", text);
        traceFlow(category, function, parameters.c_str(), TK::EXITING);
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

    static Instance end(AssociationProvider& provider, const Operation& operation, const Path& path) {
        return provider.end(operation, path);
    }
    // Instances for a reply that is made of something else in the end.
    static void associate(AssociationProvider& provider, const Operation& operation, Names& reply) {
        Instances instances(operation, reply);
        instances.provider_ = &provider;
        instances.end_ = end;
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

private:
    static void run(const ServerCall& call, const void* closure, Serve serve) {
        const Operation operation(call.hosted.category, Context(call.hosted.broker, call.context), call.path,
                                  call.properties, call.wanted, call.filter);
        std::string parameters;
        appendParameter(parameters, "class", operation.className());
        appendParameter(parameters, "method", call.method);
        if (call.filter != nullptr) {
            appendParameter(parameters, "associationClass", call.filter->associationClass.ancestor);
            appendParameter(parameters, "resultClass", call.filter->resultClass.ancestor);
            appendParameter(parameters, "role", call.filter->role);
            appendParameter(parameters, "resultRole", call.filter->resultRole);
        }
        traceFlow(call.hosted.category, call.function, parameters.c_str(), TK::ENTERING);
        Names reply(call.result);
        serve(closure, operation, reply);
        require(CMReturnDone(writable(call.result)), "end the reply");
        parameters.clear();
        appendParameter(parameters, "results", reply.count_);
        traceFlow(call.hosted.category, call.function, parameters.c_str(), TK::EXITING);
    }
};

} // namespace oxahv::detail
