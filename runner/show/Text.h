// Texts: names in any case, and what may go to a terminal.
#pragma once

#include <Names.h>

#include <limits>
#include <string>
#include <string_view>
#include <vector>

namespace oxahv::runner {

using encoding::foldedName;
using encoding::sameName;

// The text for one line of a terminal, at most its first characters: control characters and what is not UTF-8
// are question marks. What a provider or its MOF file holds may be anything.
std::string printable(std::string_view text, std::size_t most = std::numeric_limits<std::size_t>::max());

// The text with its control characters, but for line ends, and its bytes that are not UTF-8 as escapes: a
// backslash, `kind` and four digits. MOF's kind is x, that of JSON u. All four digits are there, because MOF
// reads up to four: the text may go on with what looks like one.
std::string escaped(std::string_view text, char kind);

// The names of a text that has commas between them; none in an empty text.
std::vector<std::string> namesIn(const std::string& text);

} // namespace oxahv::runner
