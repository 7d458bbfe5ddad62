// What a file has beside its content: owner, permissions, access control list, other extended attributes.
#pragma once

#include <string>
#include <sys/stat.h>

namespace TK {

// Gives the new, open file `file` at `path` what the file at `model` has, whose status is `status`. A process
// that may not give files away keeps it for itself, and then the file opens to nobody to whom `model` was
// closed. Throws std::system_error when an attribute cannot be kept.
void takeAttributes(int file, const std::string& path, const std::string& model, const struct stat& status);

} // namespace TK
