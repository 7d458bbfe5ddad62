// Reads and replaces files whole, for property files. A replacement is written beside the file and renamed
// over it, so that no reader, crash or full disk meets half of one.
#include "WholeFile.h"

#include "FailedCall.h"
#include "FileAttributes.h"

#include <Descriptor.h>

#include <cstdlib>
#include <dirent.h>
#include <fcntl.h>
#include <filesystem>
#include <memory>
#include <optional>
#include <string_view>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

namespace TK::WholeFile {

namespace {

using files::Descriptor;

// Temporary files are named `.NAME.XXXXXX.saving`, X being any letter or digit.
constexpr std::string_view anyName = "XXXXXX";
constexpr std::string_view nameEnd = ".saving";

// The name is cut, since a file system takes no more than 255 bytes.
std::string nameStart(const std::filesystem::path& target) {
    return '.' + target.filename().string().substr(0, 100) + '.';
}

// A temporary file beside the one that it is going to replace, and removed unless it does. A lock shows that
// it is in use; whatever way the process dies, the kernel drops the lock.
class Replacement {
public:
    explicit Replacement(const std::filesystem::path& target) : target_(target) {
        // Another process may take the file for a stray one before it is locked, and remove it.
        for (int attempts = 0; attempts < 10 && (!file_ || isRemoved()); ++attempts) {
            create(target);
        }
    }
    ~Replacement() {
        if (!done_) {
            ::unlink(path_.c_str());
        }
    }
    Replacement(const Replacement&) = delete;
    Replacement& operator=(const Replacement&) = delete;

    void resemble(const struct stat& earlier) const { takeAttributes(file_->get(), path_, target_, earlier); }

    void write(std::string_view content) const {
        while (!content.empty()) {
            const ssize_t written = ::write(file_->get(), content.data(), content.size());
            if (written >= 0) {
                content.remove_prefix(static_cast<std::size_t>(written));
            } else if (errno != EINTR) {
                fail("cannot write", path_);
            }
        }
    }

    void replace() {
        if (::fsync(file_->get()) != 0 || !file_->close()) {
            fail("cannot write", path_);
        }
        if (::rename(path_.c_str(), target_.c_str()) != 0) {
            fail("cannot replace", target_);
        }
        done_ = true;
    }

private:
    void create(const std::filesystem::path& target) {
        std::string name = nameStart(target);
        name += anyName;
        name += nameEnd;
        path_ = (target.parent_path() / name).string();
        file_.emplace(::mkostemps(path_.data(), static_cast<int>(nameEnd.size()), O_CLOEXEC));
        if (!file_->isOpen()) {
            fail("cannot create a file beside", target_);
        }
        lock_.emplace(::fcntl(file_->get(), F_DUPFD_CLOEXEC, 0));
        // On a file system without locks strays cannot be told from files in use, and stay.
        ::flock(lock_->get(), LOCK_EX | LOCK_NB);
    }

    bool isRemoved() const {
        struct stat status {};
        return ::fstat(file_->get(), &status) == 0 && status.st_nlink == 0;
    }

    std::string target_;
    std::string path_;
    std::optional<Descriptor> file_;
    std::optional<Descriptor> lock_; // holds the lock while file_ is closed and the rename not yet done
    bool done_ = false;
};

void removeStray(const std::string& path) {
    const Descriptor stray(::open(path.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    if (stray.isOpen() && ::flock(stray.get(), LOCK_EX | LOCK_NB) == 0) {
        ::unlink(path.c_str());
    }
}

bool isTemporaryName(std::string_view name, std::string_view start) {
    const std::size_t endAt = start.size() + anyName.size();
    return name.size() == endAt + nameEnd.size() && name.substr(0, start.size()) == start &&
           name.substr(endAt) == nameEnd;
}

// Removes the temporary files of saves of `target` that ended with their process. What cannot be removed
// stays. The standard library's iterator would end the process when memory runs out.
void removeStrays(const std::filesystem::path& target, const std::string& folder) {
    const std::string start = nameStart(target);
    const std::unique_ptr<DIR, int (*)(DIR*)> entries(::opendir(folder.c_str()), ::closedir);
    while (const dirent* const entry = entries != nullptr ? ::readdir(entries.get()) : nullptr) {
        if (isTemporaryName(&entry->d_name[0], start)) {
            removeStray(folder + '/' + &entry->d_name[0]);
        }
    }
}

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

// The status of the regular file at `target`; nothing when there is no file.
std::optional<struct stat> statusOf(const std::filesystem::path& target) {
    struct stat status {};
    if (::stat(target.c_str(), &status) != 0) {
        if (errno == ENOENT) {
            return std::nullopt;
        }
        fail("cannot examine", target);
    }
    if (!S_ISREG(status.st_mode)) {
        errno = S_ISDIR(status.st_mode) ? EISDIR : EINVAL;
        fail("cannot replace what is no file,", target);
    }
    return status;
}

} // namespace

std::string read(const std::string& path) {
    const Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK)); // a pipe's would wait
    if (!file.isOpen()) {
        if (errno == ENOENT) {
            return {};
        }
        fail("cannot open", path);
    }
    // One byte more than the file has, so that its end needs no further block. What is no regular file has no
    // size to go by, and a file may grow.
    struct stat status {};
    const bool isKnown = ::fstat(file.get(), &status) == 0;
    if (isKnown && S_ISFIFO(status.st_mode)) {
        errno = EINVAL;
        fail("cannot read what is no file,", path);
    }
    std::string content;
    content.resize(isKnown ? static_cast<std::size_t>(status.st_size) + 1 : 1);
    for (std::size_t filled = 0;;) {
        const ssize_t size = ::read(file.get(), &content[filled], content.size() - filled);
        if (size == 0) {
            content.resize(filled);
            return content;
        }
        if (size > 0) {
            filled += static_cast<std::size_t>(size);
            if (filled == content.size()) {
                content.resize(2 * filled + 4096);
            }
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
    const std::optional<struct stat> earlier = statusOf(target);
    removeStrays(target, folderPath);
    Replacement replacement(target);
    if (earlier) {
        replacement.resemble(*earlier);
    }
    replacement.write(content);
    replacement.replace();
    // EINVAL: the file system cannot synchronise folders.
    if (::fsync(folder.get()) != 0 && errno != EINVAL) {
        fail("cannot synchronise folder", folderPath);
    }
}

} // namespace TK::WholeFile
