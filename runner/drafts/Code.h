// Lines of C++, broken where clang-format breaks them by this project's settings, so that a draft is
// formatted without it.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace oxahv::runner {

// An item of a list in braces. One that is longer than a line has each on its own, with its comment: without,
// clang-format would put them in columns.
struct Listed {
    std::string text;
    std::string comment;
};

// Items between a head such as "serve(" and a tail such as ");".
struct Enclosed {
    std::string head;
    std::vector<std::string> items;
    std::vector<Listed> list{}; // if not empty, the last item: a list in braces
    std::string tail;
};

// The lines of it, without a line end after the last.
std::string enclosed(std::size_t indent, const Enclosed& parts);

// A function in a class with statements for its body, one a line: on one line where it fits.
std::string memberFunction(std::size_t indent, const Enclosed& signature,
                           const std::vector<std::string>& body);

// A comment of one line, with its line end: the whole text, or its first sentence; empty when neither fits or
// a compiler or reader could take the text for something else.
std::string comment(std::size_t indent, std::string_view text);

// A literal of C++. Plain ASCII alone.
std::string textLiteral(std::string_view text);

} // namespace oxahv::runner
