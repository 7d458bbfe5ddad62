#include "LoggerCalls.h"

#include "HVLogger.h"

#include <atomic>
#include <gtest/gtest.h>
#include <mutex>
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

void failLoggerCall(int n) {
    callsUntilFailure = n;
}
