// Access control lists are handled as the extended attributes that the kernel makes of them, so that no
// library for them has to be linked.
#include "FileAttributes.h"

#include "FailedCall.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <optional>
#include <string_view>
#include <sys/xattr.h>
#include <unistd.h>

namespace TK {

namespace {

constexpr std::string_view accessList = "system.posix_acl_access";
constexpr std::size_t largest = 65536; // the kernel's limit for a value, and for the list of names

// Attributes that vouch for the content, or that the kernel drops when somebody writes to the file.
bool belongsToContent(std::string_view name) {
    constexpr std::array<std::string_view, 3> names{"security.capability", "security.evm", "security.ima"};
    return std::find(names.begin(), names.end(), name) != names.end();
}

// Whether a call failed because there is no such attribute, or the file system has none at all.
bool isMissing() {
    return errno == ENODATA || errno == ENOTSUP;
}

// The names, each with a NUL after it.
std::string attributeNames(const std::string& path) {
    std::string names(largest, '\0');
    const ssize_t size = ::listxattr(path.c_str(), names.data(), names.size());
    if (size < 0 && !isMissing()) {
        fail("cannot list the extended attributes of", path);
    }
    names.resize(size < 0 ? 0 : static_cast<std::size_t>(size));
    return names;
}

std::optional<std::string> attribute(const std::string& path, const char* name) {
    std::string value(largest, '\0');
    const ssize_t size = ::getxattr(path.c_str(), name, value.data(), value.size());
    if (size < 0) {
        if (isMissing()) {
            return std::nullopt;
        }
        fail("cannot read an extended attribute of", path);
    }
    value.resize(static_cast<std::size_t>(size));
    return value;
}

// Takes all permissions from the owning group in an access control list: four bytes of version, then entries
// of a tag and permissions of two bytes each and an id of four, all little-endian.
void closeToGroup(std::string& list) {
    constexpr std::size_t headerSize = 4;
    constexpr std::size_t entrySize = 8;
    constexpr char owningGroup = 4;
    for (std::size_t entry = headerSize; entry + entrySize <= list.size(); entry += entrySize) {
        if (list[entry] == owningGroup && list[entry + 1] == 0) {
            list[entry + 2] = 0;
        }
    }
}

// Copies all attributes but the access control list, which is returned.
std::optional<std::string> copyAttributes(int file, const std::string& path, const std::string& model) {
    const std::string names = attributeNames(model);
    for (std::size_t at = 0; at < names.size(); at += std::strlen(&names[at]) + 1) {
        const char* const name = &names[at];
        if (name == accessList || belongsToContent(name)) {
            continue;
        }
        const std::optional<std::string> value = attribute(model, name);
        // The system may have labelled the file already, and allow nobody else to do so.
        if (value && attribute(path, name) != value &&
            ::fsetxattr(file, name, value->data(), value->size(), 0) != 0) {
            fail("cannot keep an extended attribute of", model);
        }
    }
    return attribute(model, accessList.data());
}

} // namespace

void takeAttributes(int file, const std::string& path, const std::string& model, const struct stat& status) {
    mode_t mode = status.st_mode & 07777U;
    bool keepsGroup = true;
    if (::fchown(file, status.st_uid, status.st_gid) != 0) {
        mode &= ~static_cast<mode_t>(S_ISUID);
        keepsGroup = ::fchown(file, static_cast<uid_t>(-1), status.st_gid) == 0;
    }
    std::optional<std::string> list = copyAttributes(file, path, model);
    if (!keepsGroup) {
        // With a list, the group's bits of the mode are the mask of the list, and the group has its entry
        // there.
        mode &= ~static_cast<mode_t>(list ? S_ISGID : S_IRWXG | S_ISGID);
    }
    if (list) {
        std::string& entries = *list;
        if (!keepsGroup) {
            closeToGroup(entries);
        }
        if (::fsetxattr(file, accessList.data(), entries.data(), entries.size(), 0) != 0) {
            fail("cannot keep the access control list of", model);
        }
    } else if (::fremovexattr(file, accessList.data()) != 0 && !isMissing()) {
        // A list from the folder's default, which the permissions that follow would put into force.
        fail("cannot remove the access control list of", path);
    }
    if (::fchmod(file, mode) != 0) {
        fail("cannot set the permissions of", path);
    }
}

} // namespace TK
