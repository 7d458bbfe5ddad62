// Texts with places that are filled in.
#pragma once

#include <map>
#include <string>
#include <string_view>

namespace oxahv::runner {

// Puts values in the places `@NAME@` of a text. A value of several lines has no line end after its last; a
// line that is a place alone goes when its value is empty. Throws std::logic_error for a place without value.
std::string filled(std::string_view text, const std::map<std::string, std::string>& values);

// The text of a file in the folder templates, by its name without `.in`.
std::string_view templateText(std::string_view name);

} // namespace oxahv::runner
