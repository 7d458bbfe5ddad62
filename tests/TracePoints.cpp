// A function for each kind of trace point, of which check-trace-size measures the code.
#include "Trace.h"

extern const std::string category;

extern "C" {

void smallPlain() {
    TK_TRACE_ENTERING(category);
}

void smallMessage(const char* text) {
    TK_TRACE_MESSAGE(category, text);
}

void smallNumber(unsigned int value) {
    TK_TRACE_VARIABLE(category, "value", value);
}

void smallText(const std::string& value) {
    TK_TRACE_VARIABLE(category, "value", value);
}

void largeList(const void* broker, const char* name, const std::string& value) {
    TK_TRACE_ENTERING_PARAMETERS(category, " broker=" << broker << " name=" << name << " value=" << value);
}

} // extern "C"
