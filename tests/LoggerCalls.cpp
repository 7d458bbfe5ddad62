#include "LoggerCalls.h"

#include "HVLogger.h"

#include <atomic>
#include <gtest/gtest.h>
#include <mutex>
#include <sstream>
#include <stdexcept>

namespace {

std::mutex mutex;
std::vector<LoggerCall> calls;
std::atomic<int> callsUntilFailure{0};

void record(LoggerCall&& call) {
    if (callsUntilFailure > 0 && --callsUntilFailure == 0) {
        throw std::runtime_error("logger");
    }
    const std::lock_guard<std::mutex> lock(mutex);
    calls.push_back(std::move(call));
}

std::string withoutLine(std::string text) {
    for (const std::string& mark :
         {std::string("[Line: "), std::string(", Line: "), std::string("at line ")}) {
        const std::size_t begin = text.find(mark);
        if (begin != std::string::npos) {
            const std::size_t digits = begin + mark.size();
            text.erase(digits, text.find_first_not_of("0123456789", digits) - digits);
        }
    }
    return text;
}

std::string tracePoint(const TracingModule& module, int level, const std::string& function,
                       const std::string& text) {
    return module.category + (" " + std::to_string(level)) + " " + function + "| " + text;
}

std::string flow(const char* kind, const TracingModule& module, const std::string& function) {
    return kind + function + "() in " + module.file + " [Line: ]";
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

void forgetLoggerCalls() {
    const std::lock_guard<std::mutex> lock(mutex);
    calls.clear();
}

std::vector<LoggerCall> loggerCalls() {
    const std::lock_guard<std::mutex> lock(mutex);
    return calls;
}

std::vector<std::string> tracedTexts() {
    const std::vector<LoggerCall> all = loggerCalls();
    EXPECT_EQ(all.size() % 2, 0U);
    std::vector<std::string> texts;
    for (std::size_t i = 0; i + 1 < all.size(); i += 2) {
        const LoggerCall& log = all[i];
        const LoggerCall& trace = all[i + 1];
        EXPECT_FALSE(log.isTrace);
        EXPECT_TRUE(trace.isTrace);
        EXPECT_TRUE(log.restIsNothing && trace.restIsNothing);
        EXPECT_EQ(std::tie(log.function, log.file, log.line, log.category, log.level, log.text),
                  std::tie(trace.function, trace.file, trace.line, trace.category, trace.level, trace.text));
        texts.push_back(log.text);
    }
    return texts;
}

std::vector<std::string> takeTraces() {
    const std::vector<LoggerCall> all = loggerCalls();
    std::vector<std::string> texts = tracedTexts();
    for (std::size_t i = 0; i < texts.size(); ++i) {
        const LoggerCall& call = all[2 * i];
        texts[i] = tracePoint({call.category.c_str(), ""}, call.level, call.function, withoutLine(texts[i]));
    }
    forgetLoggerCalls();
    return texts;
}

std::string entering(const TracingModule& module, const std::string& function) {
    return tracePoint(module, 4000, function, flow("ENTERING: ", module, function));
}

std::string exiting(const TracingModule& module, const std::string& function) {
    return tracePoint(module, 4000, function, flow("EXITING: ", module, function));
}

std::string entering(const TracingModule& module, const std::string& function,
                     const std::string& parameters) {
    return tracePoint(module, 3000, function,
                      flow("ENTERING: ", module, function) + ",Parameters List: " + parameters);
}

std::string exiting(const TracingModule& module, const std::string& function, const std::string& parameters) {
    return tracePoint(module, 3000, function,
                      flow("EXITING: ", module, function) + ",Parameters List: " + parameters);
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

void failLoggerCall(int n) {
    callsUntilFailure = n;
}
