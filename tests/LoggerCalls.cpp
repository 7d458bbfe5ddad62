#include "LoggerCalls.h"

#include "HVLogger.h"

#include <gtest/gtest.h>
#include <sstream>
#include <tuple>
#include <utility>

namespace {

std::vector<LoggerCall> calls;
std::function<void()> callHook;

void record(LoggerCall call) {
    if (callHook) {
        callHook();
    }
    calls.push_back(std::move(call));
}

std::string tracePoint(const TracingModule& module, int level, const std::string& function,
                       const std::string& text) {
    return module.category + (" " + std::to_string(level)) + " " + function + "| " + text + '\n';
}

std::string flow(const char* kind, const TracingModule& module, const std::string& function,
                 const std::string& parameters) {
    return tracePoint(module, parameters.empty() ? 4000 : 3000, function,
                      kind + function + "() in " + module.file + " [Line: ]" +
                          (parameters.empty() ? "" : ",Parameters List: " + parameters));
}

} // namespace

void HVLog::HVLogger::logLevelMessage(const char* function, const char* file, int line,
                                      const std::string& category, int level, char* pointer, int first,
                                      int second, const std::string& text) {
    record({false, function, file, line, category, level, pointer == nullptr && first == 0 && second == 0,
            text});
}

void HVLog::HVLogger::traceLevelMessage(const char* function, const char* file, int line,
                                        const std::string& category, int level, char* pointer, int first,
                                        int second, const std::string& text) {
    record(
        {true, function, file, line, category, level, pointer == nullptr && first == 0 && second == 0, text});
}

const std::vector<LoggerCall>& loggerCalls() {
    return calls;
}

void atLoggerCalls(std::function<void()> hook) {
    callHook = std::move(hook);
}

std::string takeTraces() {
    EXPECT_EQ(calls.size() % 2, 0U);
    std::string texts;
    for (std::size_t i = 0; i + 1 < calls.size(); i += 2) {
        const LoggerCall& log = calls[i];
        const LoggerCall& trace = calls[i + 1];
        EXPECT_TRUE(!log.isTrace && trace.isTrace && log.restIsNothing && trace.restIsNothing);
        EXPECT_EQ(std::tie(log.function, log.file, log.line, log.category, log.level, log.text),
                  std::tie(trace.function, trace.file, trace.line, trace.category, trace.level, trace.text));
        std::string text = log.text;
        for (const std::string mark : {"[Line: ", ", Line: ", "at line "}) {
            const std::size_t begin = text.find(mark + std::to_string(log.line));
            if (begin != std::string::npos) {
                text.erase(begin + mark.size(), std::to_string(log.line).size());
            }
        }
        texts += tracePoint({log.category.c_str(), ""}, log.level, log.function, text);
    }
    calls.clear();
    return texts;
}

std::string entering(const TracingModule& module, const std::string& function,
                     const std::string& parameters) {
    return flow("ENTERING: ", module, function, parameters);
}

std::string exiting(const TracingModule& module, const std::string& function, const std::string& parameters) {
    return flow("EXITING: ", module, function, parameters);
}

std::string passing(const TracingModule& module, const std::string& function) {
    return entering(module, function) + exiting(module, function);
}

std::string variable(const TracingModule& module, const std::string& function, const std::string& name,
                     const std::string& value) {
    return tracePoint(module, 4000, function,
                      "VARIABLE: '" + name + "' has Value '" + value + "' at line  in " + module.file);
}

std::string message(const TracingModule& module, const std::string& function, const std::string& text) {
    return tracePoint(module, 6000, function,
                      std::string("MESSAGE [File: ") + module.file + ", Line: ]: " + text);
}

std::string address(const void* pointer) {
    std::ostringstream stream;
    stream << pointer;
    return stream.str();
}
