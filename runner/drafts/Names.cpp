#include "drafts/Names.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace oxahv::runner {

namespace {

// In the order of their letters. The words after C++17's own are those of C++20; `i386`, `linux` and `unix`
// are macros of GCC without -std=c++17, the others of C headers.
constexpr std::string_view reservedWords[] = {"NULL",      "alignas",    "alignof",       "and",
                                              "and_eq",    "asm",        "assert",        "auto",
                                              "bitand",    "bitor",      "bool",          "break",
                                              "case",      "catch",      "char",          "char16_t",
                                              "char32_t",  "char8_t",    "class",         "co_await",
                                              "co_return", "co_yield",   "compl",         "concept",
                                              "const",     "const_cast", "consteval",     "constexpr",
                                              "constinit", "continue",   "decltype",      "default",
                                              "delete",    "do",         "double",        "dynamic_cast",
                                              "else",      "enum",       "errno",         "explicit",
                                              "export",    "extern",     "false",         "float",
                                              "for",       "friend",     "goto",          "i386",
                                              "if",        "inline",     "int",           "linux",
                                              "long",      "mutable",    "namespace",     "new",
                                              "noexcept",  "not",        "not_eq",        "nullptr",
                                              "operator",  "or",         "or_eq",         "private",
                                              "protected", "public",     "register",      "reinterpret_cast",
                                              "requires",  "return",     "short",         "signed",
                                              "sizeof",    "static",     "static_assert", "static_cast",
                                              "stderr",    "stdin",      "stdout",        "struct",
                                              "switch",    "template",   "this",          "thread_local",
                                              "throw",     "true",       "try",           "typedef",
                                              "typeid",    "typename",   "union",         "unix",
                                              "unsigned",  "using",      "virtual",       "void",
                                              "volatile",  "wchar_t",    "while",         "xor",
                                              "xor_eq"};

// Macros of C headers that are capitals alone.
constexpr std::string_view reservedTypes[] = {"EOF", "FALSE", "INFINITY", "NAN", "NULL", "TRUE"};

bool isDigit(char c) {
    return c >= '0' && c <= '9';
}
bool isCapital(char c) {
    return c >= 'A' && c <= 'Z';
}
bool isSmall(char c) {
    return c >= 'a' && c <= 'z';
}
bool isPart(char c) {
    return isSmall(c) || isCapital(c) || isDigit(c);
}
char capital(char c) {
    return isSmall(c) ? static_cast<char>(c - 'a' + 'A') : c;
}
char small(char c) {
    return isCapital(c) ? static_cast<char>(c - 'A' + 'a') : c;
}

// The words of a name in one, each but the first with a capital. Underscores go, since names with two of them
// are the compiler's.
std::string joined(std::string_view name, const char* substitute) {
    std::string result;
    bool isWordStart = false;
    for (const char c : name) {
        if (isPart(c)) {
            result += isWordStart ? capital(c) : c;
        }
        isWordStart = !isPart(c) && !result.empty();
    }
    return result.empty() || isDigit(result[0]) ? substitute + result : result;
}

bool isReserved(const std::string_view* first, const std::string_view* last, std::string_view word) {
    return std::find(first, last, word) != last;
}

} // namespace

bool isIdentifier(std::string_view text) {
    return !text.empty() && !isDigit(text[0]) &&
           std::all_of(text.begin(), text.end(), [](char c) { return isPart(c) || c == '_'; }) &&
           !isReserved(std::begin(reservedWords), std::end(reservedWords), text);
}

std::string structName(std::string_view name) {
    std::string result = joined(name, "Class");
    result[0] = capital(result[0]);
    return isReserved(std::begin(reservedTypes), std::end(reservedTypes), result) ? result + '_' : result;
}

std::string variableName(std::string_view name) {
    std::string result = joined(name, "value");
    // Of the capitals that it begins with, the last one is the next word's.
    for (std::size_t i = 0; i < result.size() && isCapital(result[i]); ++i) {
        if (i > 0 && i + 1 < result.size() && isSmall(result[i + 1])) {
            break;
        }
        result[i] = small(result[i]);
    }
    return isIdentifier(result) ? result : result + '_';
}

std::string Scope::add(std::string name) {
    while (!taken_.insert(name).second) {
        name += '_';
    }
    return name;
}

} // namespace oxahv::runner
