#include "WholeFile.h"

#include <array>
#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <filesystem>
#include <string_view>
#include <sys/stat.h>
#include <system_error>
#include <unistd.h>

namespace TK::WholeFile {

namespace {

// Throws the failure that errno tells.
[[noreturn]] void fail(const char* action, const std::string& path) {
    const int code = errno;
    throw std::system_error(code, std::generic_category(), std::string(action) + " '" + path + "'");
}

class Descriptor {
public:
    explicit Descriptor(int descriptor) : descriptor_(descriptor) {}
    ~Descriptor() {
        if (descriptor_ >= 0) {
            ::close(descriptor_);
        }
    }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;

    bool isOpen() const { return descriptor_ >= 0; }
    int get() const { return descriptor_; }

    // Closes it; some file systems tell of a failed write only now.
    bool close() {
        const int closed = descriptor_;
        descriptor_ = -1;
        return ::close(closed) == 0;
    }

private:
    int descriptor_;
};

// A temporary file beside the one that it is going to replace, and removed unless it does.
class Replacement {
public:
    explicit Replacement(const std::filesystem::path& target)
        : target_(target),
          path_((target.parent_path() / ('.' + target.filename().string().substr(0, longestPart) + ".XXXXXX"))
                    .string()),
          file_(::mkostemp(path_.data(), O_CLOEXEC)) {
        if (!file_.isOpen()) {
            fail("cannot create a file beside", target_);
        }
    }
    ~Replacement() {
        if (!done_) {
            ::unlink(path_.c_str());
        }
    }
    Replacement(const Replacement&) = delete;
    Replacement& operator=(const Replacement&) = delete;

    // Takes over permissions, and owner and group as far as the process may.
    void resemble(const struct stat& earlier) {
        mode_t mode = earlier.st_mode & 07777U;
        if (::fchown(file_.get(), earlier.st_uid, earlier.st_gid) != 0) {
            // What was the owner's or the group's is not for whichever the file has now.
            mode &= ~static_cast<mode_t>(S_ISUID);
            if (::fchown(file_.get(), static_cast<uid_t>(-1), earlier.st_gid) != 0) {
                mode &= ~static_cast<mode_t>(S_IRWXG | S_ISGID);
            }
        }
        if (::fchmod(file_.get(), mode) != 0) {
            fail("cannot set the permissions of", path_);
        }
    }

    void write(std::string_view content) {
        while (!content.empty()) {
            const ssize_t written = ::write(file_.get(), content.data(), content.size());
            if (written >= 0) {
                content.remove_prefix(static_cast<std::size_t>(written));
            } else if (errno != EINTR) {
                fail("cannot write", path_);
            }
        }
    }

    void replace() {
        if (::fsync(file_.get()) != 0 || !file_.close()) {
            fail("cannot write", path_);
        }
        if (::rename(path_.c_str(), target_.c_str()) != 0) {
            fail("cannot replace", target_);
        }
        done_ = true;
    }

private:
    // Of the target's name in the temporary one, which may be no longer than a file system takes.
    static constexpr std::size_t longestPart = 100;

    std::string target_;
    std::string path_;
    Descriptor file_;
    bool done_ = false;
};

// The file that a path names, with a last component that is no symbolic link. The file itself need not exist.
std::filesystem::path followed(std::filesystem::path path) {
    for (int links = 0; std::filesystem::is_symlink(std::filesystem::symlink_status(path)); ++links) {
        if (links == 40) {
            errno = ELOOP;
            fail("cannot follow", path);
        }
        path = path.parent_path() / std::filesystem::read_symlink(path);
    }
    return path;
}

} // namespace

std::string read(const std::string& path) {
    const Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (!file.isOpen()) {
        if (errno == ENOENT) {
            return {};
        }
        fail("cannot open", path);
    }
    std::string content;
    std::array<char, 4096> block{};
    for (;;) {
        const ssize_t size = ::read(file.get(), block.data(), block.size());
        if (size == 0) {
            return content;
        }
        if (size > 0) {
            content.append(block.data(), static_cast<std::size_t>(size));
        } else if (errno != EINTR) {
            fail("cannot read", path);
        }
    }
}

void replace(const std::string& path, const std::string& content) {
    const std::filesystem::path target = followed(path);
    const std::string folderPath = target.has_parent_path() ? target.parent_path().string() : ".";
    // Opened before anything changes, so that a folder that cannot be synchronised fails early.
    const Descriptor folder(::open(folderPath.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!folder.isOpen()) {
        fail("cannot open folder", folderPath);
    }
    struct stat earlier {};
    const bool exists = ::stat(target.c_str(), &earlier) == 0;
    if (!exists && errno != ENOENT) {
        fail("cannot examine", target);
    }
    if (exists && !S_ISREG(earlier.st_mode)) {
        errno = S_ISDIR(earlier.st_mode) ? EISDIR : EINVAL;
        fail("cannot replace what is no file,", target);
    }
    Replacement replacement(target);
    if (exists) {
        replacement.resemble(earlier);
    }
    replacement.write(content);
    replacement.replace();
    // EINVAL: the file system cannot synchronise folders.
    if (::fsync(folder.get()) != 0 && errno != EINVAL) {
        fail("cannot synchronise folder", folderPath);
    }
}

} // namespace TK::WholeFile
