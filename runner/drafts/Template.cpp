#include "drafts/Template.h"

#include <stdexcept>

namespace oxahv::runner {

namespace {

bool isNameOfPlace(std::string_view text) {
    return !text.empty() && text.find_first_not_of("ABCDEFGHIJKLMNOPQRSTUVWXYZ_") == std::string_view::npos;
}

} // namespace

std::string filled(std::string_view text, const std::map<std::string, std::string>& values) {
    std::string result;
    while (!text.empty()) {
        const std::size_t begin = text.find('@');
        const std::size_t end = begin == std::string_view::npos ? begin : text.find('@', begin + 1);
        if (end == std::string_view::npos) {
            break;
        }
        const std::string_view name = text.substr(begin + 1, end - begin - 1);
        result += text.substr(0, begin);
        if (!isNameOfPlace(name)) {
            result += '@';
            text.remove_prefix(begin + 1);
            continue;
        }
        const auto value = values.find(std::string(name));
        if (value == values.end()) {
            throw std::logic_error("no value for the place @" + std::string(name) + '@');
        }
        text.remove_prefix(end + 1);
        const bool isWholeLine =
            (result.empty() || result.back() == '\n') && !text.empty() && text[0] == '\n';
        if (isWholeLine && value->second.empty()) {
            text.remove_prefix(1);
        }
        result += value->second;
    }
    return result.append(text);
}

} // namespace oxahv::runner
