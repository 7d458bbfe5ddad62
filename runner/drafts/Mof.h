// The MOF files of a draft.
#pragma once

#include "drafts/Files.h"

#include <string>
#include <vector>

namespace oxahv::runner {

// For each file one that declares the same in the folder: a copy or, since a file that includes others cannot
// be copied alone, one that includes it. None has one of the names that are taken. Throws std::runtime_error.
std::vector<NewFile> mofOf(const std::vector<std::string>& files, const std::filesystem::path& folder,
                           std::vector<std::string> taken);

} // namespace oxahv::runner
