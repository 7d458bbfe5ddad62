// Stands in the place of the logger's two functions and records what they are called with, from one thread.
//
// A test program that links LoggerCalls.cpp sees every call of the library, since the dynamic linker takes
// the program's own definition first.
#pragma once

#include <functional>
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

// All calls since the start or takeTraces, in order.
const std::vector<LoggerCall>& loggerCalls();

// What each call begins with; what it throws, the logger throws.
void atLoggerCalls(std::function<void()> hook);

// The trace points since the start or the last call, a line for each: its category, level, function and text,
// the text without its source line. Checks that the two calls of each are equal in all but their function.
std::string takeTraces();

// A module of the library, as its traces name it.
struct TracingModule {
    const char* category;
    const char* file;
};
constexpr TracingModule providerUtilities = {"Hovara.ProviderUtilities", "ProviderUtilities.cpp"};
constexpr TracingModule utility = {"Hovara.ProviderUtilities", "Utility.cpp"};
constexpr TracingModule utils = {"Hovara.Utils", "utils.cpp"};

// What takeTraces tells of a trace point of each kind in `function` of `module`.
std::string entering(const TracingModule& module, const std::string& function,
                     const std::string& parameters = "");
std::string exiting(const TracingModule& module, const std::string& function,
                    const std::string& parameters = "");
std::string passing(const TracingModule& module, const std::string& function); // entering and exiting
std::string variable(const TracingModule& module, const std::string& function, const std::string& name,
                     const std::string& value);
std::string message(const TracingModule& module, const std::string& function, const std::string& text);

// A pointer as a parameter list shows it.
std::string address(const void* pointer);
