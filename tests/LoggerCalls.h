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

// Makes the n-th call from now (from 1) throw std::runtime_error("logger"); 0 none.
void failLoggerCall(int n);
