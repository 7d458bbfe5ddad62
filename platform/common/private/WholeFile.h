// A file's content read and replaced as a whole.
#pragma once

#include <string>

namespace TK::WholeFile {

// The content; empty when there is no file. Throws std::system_error when the file cannot be read.
std::string read(const std::string& path);

// Replaces the content, all or nothing, as PropertyFile::save tells.
void replace(const std::string& path, const std::string& content);

} // namespace TK::WholeFile
