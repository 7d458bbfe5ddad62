// Texts: names in any case, UTF-8, and what may stand on a terminal.
#pragma once

#include <limits>
#include <string>
#include <string_view>

// With the ASCII letters of a name as small ones.
std::string lowerCase(std::string text);

// Whether two names are one: the case of ASCII letters does not matter.
bool sameName(const std::string& a, const std::string& b);

// Whether the text is UTF-8: no overlong forms, surrogates or numbers beyond U+10FFFF.
bool isUtf8(std::string_view text);

// The text for one line of a terminal, at most its first characters: control characters and what is not UTF-8
// are question marks. What a provider or its MOF file holds may be anything.
std::string printable(std::string_view text, std::size_t most = std::numeric_limits<std::size_t>::max());
