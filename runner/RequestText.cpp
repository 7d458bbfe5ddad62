#include "RequestText.h"

#include <algorithm>
#include <cctype>
#include <string_view>

namespace oxahv::runner {

namespace {

// A word of a shell's command line.
std::string quoted(const std::string& word) {
    const bool isPlain = !word.empty() && std::all_of(word.begin(), word.end(), [](unsigned char c) {
        return c >= 0x80 || std::isalnum(c) != 0 ||
               std::string_view("_./:=,-+").find(static_cast<char>(c)) != std::string_view::npos;
    });
    if (isPlain) {
        return word;
    }
    std::string result = "'";
    for (const char c : word) {
        result += c == '\'' ? "'\\''" : std::string(1, c);
    }
    return result + '\'';
}

std::string joined(const std::vector<std::string>& words) {
    std::string result;
    for (const std::string& word : words) {
        result += (result.empty() ? "" : ",") + word;
    }
    return result;
}

struct Option {
    const char* name;
    const std::string AssociationFilter::*value;
};
constexpr Option filterOptions[] = {{"--assoc-class", &AssociationFilter::associationClass},
                                    {"--result-class", &AssociationFilter::resultClass},
                                    {"--role", &AssociationFilter::role},
                                    {"--result-role", &AssociationFilter::resultRole}};

} // namespace

std::string requestText(const Operation& operation, const Operands& operands) {
    std::string text = operation.name + (' ' + quoted(operands.target));
    if (!operands.method.empty()) {
        text += ' ' + quoted(operands.method);
    }
    for (const std::string& value : operands.values) {
        text += ' ' + quoted(value);
    }
    if (!operands.query.empty()) {
        text += ' ' + quoted(operands.query) + " --language " + quoted(operands.language);
    }
    for (const Option& option : filterOptions) {
        const std::string& value = operands.filter.*option.value;
        text += value.empty() ? "" : std::string(" ") + option.name + ' ' + quoted(value);
    }
    if (operands.properties) {
        text += " --properties " + quoted(joined(*operands.properties));
    }
    return text;
}

} // namespace oxahv::runner
