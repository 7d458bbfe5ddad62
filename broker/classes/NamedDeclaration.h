// The search of a declaration by its name, in any case.
#pragma once

#include "objects/Object.h"

#include <algorithm>
#include <string_view>
#include <vector>

namespace oxahv {

template <class Declaration>
const Declaration* named(const std::vector<Declaration>& declarations, std::string_view name) {
    const auto found = std::find_if(declarations.begin(), declarations.end(),
                                    [&](const Declaration& d) { return sameName(d.name, name); });
    return found != declarations.end() ? &*found : nullptr;
}

} // namespace oxahv
