// Stands in the place of the logger's two functions and records what they are called with.
//
// A test program that links LoggerCalls.cpp sees every call of the library, since the dynamic linker takes
// the program's own definition first.
#pragma once

#include <string>
#include <vector>

struct LoggerCall {
    bool isTrace;
    std::string function;
    std::string file;
    int line;
    std::string category;
    int level;
    bool restIsNothing; // the null pointer and the two zeros
    std::string text;
};

// Starts afresh.
void forgetLoggerCalls();

// All calls since, in order, from every thread.
std::vector<LoggerCall> loggerCalls();

// The texts of the calls, one per trace point: that the second call equals the first in all but its function
// is checked.
std::vector<std::string> tracedTexts();

// A module of the library, as its traces name it.
struct TracingModule {
    const char* category;
    const char* file;
};
constexpr TracingModule providerUtilities = {"Hovara.ProviderUtilities", "ProviderUtilities.cpp"};
constexpr TracingModule utility = {"Hovara.ProviderUtilities", "Utility.cpp"};
constexpr TracingModule utils = {"Hovara.Utils", "utils.cpp"};

// The trace points since the start or the last call: of each its category, level, function and text, the text
// without its source line.
std::vector<std::string> takeTraces();

// What takeTraces tells of a trace point of each kind in `function` of `module`.
std::string entering(const TracingModule& module, const std::string& function);
std::string exiting(const TracingModule& module, const std::string& function);
std::string entering(const TracingModule& module, const std::string& function, const std::string& parameters);
std::string exiting(const TracingModule& module, const std::string& function, const std::string& parameters);
std::string variable(const TracingModule& module, const std::string& function, const std::string& name,
                     const std::string& value);
std::string message(const TracingModule& module, const std::string& function, const std::string& text);

// A pointer as a parameter list shows it.
std::string address(const void* pointer);

// Makes the n-th call from now (from 1) throw std::runtime_error("logger"); 0 none.
void failLoggerCall(int n);
