// Trace texts: what the formatting functions and the trace points make of any text, compared with snprintf.
// The input: how often the text is repeated, the line, the source file's name in the first line, the text.
#include "Fuzz.h"

#include "HVLogger.h"
#include "Trace.h"

#include <array>
#include <vector>

namespace {

std::vector<std::string> loggedTexts;

// A whole buffer: behind the text there are zeros.
template <class... Arguments>
std::array<char, TK::traceBufferSize> formatted(const char* format, Arguments... arguments) {
    std::array<char, TK::traceBufferSize> buffer{};
    std::snprintf(buffer.data(), buffer.size(), format, arguments...); // NOLINT(*-vararg)
    return buffer;
}

template <class... Arguments>
void check(const char* traced, const char* format, Arguments... arguments) {
    const auto expected = formatted(format, arguments...);
    FUZZ_REQUIRE(std::memcmp(traced, expected.data(), expected.size()) == 0);
}

void checkFunctions(const char* text, const char* file, unsigned int line) {
    const auto shown = static_cast<int>(line);
    check(TK::trace(text, file, line, TK::ENTERING), "ENTERING: %s() in %s [Line: %d]", text, file, shown);
    check(TK::trace(text, file, line, TK::EXITING), "EXITING: %s() in %s [Line: %d]", text, file, shown);
    check(TK::trace(text, file, line, TK::MESSAGE), "MESSAGE [File: %s, Line: %d]: %s", file, shown, text);
    check(TK::trace(text, file, line, line), "VARIABLE: '%s' has Value '%d' at line %d in %s", text, shown,
          shown, file);
    check(TK::trace(file, file, line, text), "VARIABLE: '%s' has Value '%s' at line %d in %s", file, text,
          shown, file);
    check(TK::tracepara(file, file, line, text, TK::ENTERING),
          "ENTERING: %s() in %s [Line: %d],Parameters List: %s", file, file, shown, text);
    check(TK::tracepara(file, file, line, text, TK::EXITING),
          "EXITING: %s() in %s [Line: %d],Parameters List: %s", file, file, shown, text);
}

// Both calls of a trace point carry its text.
void checkPoints(const std::string& text) {
    static const std::string category = "Fuzz";
    const char* const shown = text.c_str();
    loggedTexts.clear();
    const int line = __LINE__;
    TK_TRACE_MESSAGE(category, shown);
    TK_TRACE_VARIABLE(category, "text", text);
    TK_TRACE_EXITING_PARAMETERS(category, " text=" << text << " again=" << shown);
    // A NUL ends a parameter list.
    const bool isWhole = std::strlen(shown) == text.size();
    const std::array<std::string, 3> expected = {
        formatted("MESSAGE [File: TraceText.cpp, Line: %d]: %s", line + 1, shown).data(),
        formatted("VARIABLE: 'text' has Value '%s' at line %d in TraceText.cpp", shown, line + 2).data(),
        formatted("EXITING: checkPoints() in TraceText.cpp [Line: %d],Parameters List:  text=%s%s%s",
                  line + 3, shown, isWhole ? " again=" : "", isWhole ? shown : "")
            .data()};
    FUZZ_REQUIRE(loggedTexts.size() == 2 * expected.size());
    for (std::size_t i = 0; i < loggedTexts.size(); ++i) {
        FUZZ_REQUIRE(loggedTexts[i] == expected.at(i / 2));
    }
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    HVLog::HVLogger::setSink([](const HVLog::Message& message) { loggedTexts.push_back(message.text); });
    HVLog::HVLogger::setThreshold(0);
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    fuzz::Input input(data, size);
    // Now and then 64 KiB; it takes its time.
    const auto number = input.number<std::uint16_t>();
    const unsigned int repeated = number == 0xFFFF ? 0x10000U : number % 64U;
    const auto line = input.number<unsigned int>();
    const std::string file = input.line();
    const std::string piece = input.rest();
    std::string text = piece;
    for (unsigned int i = repeated; i > 0 && text.size() < 65'536 && !piece.empty(); --i) {
        text += piece;
    }
    checkFunctions(text.c_str(), file.c_str(), line);
    checkPoints(text);
    return 0;
}
