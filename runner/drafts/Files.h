// New files: all of them, or none.
#pragma once

#include <filesystem>
#include <string>
#include <vector>

namespace oxahv::runner {

struct NewFile {
    std::string name; // in the folder
    std::string content;
};

// Writes files into a folder, which it makes when there is none. Overwrites nothing; when it throws
// std::runtime_error it has written nothing, or removed it again.
void writeNewFiles(const std::filesystem::path& folder, const std::vector<NewFile>& files);

} // namespace oxahv::runner
