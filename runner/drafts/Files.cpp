#include "drafts/Files.h"

#include <cerrno>
#include <fcntl.h>
#include <stdexcept>
#include <system_error>
#include <unistd.h>

namespace oxahv::runner {

namespace {

namespace fs = std::filesystem;

[[noreturn]] void fail(const fs::path& path, int error) {
    throw std::runtime_error("cannot write " + path.string() + ": " + std::generic_category().message(error));
}

// What was made, and is removed unless it is kept.
class Made {
public:
    Made() = default;
    ~Made() {
        for (auto path = paths_.rbegin(); path != paths_.rend(); ++path) {
            std::error_code ignored; // there is nothing else that could be done
            fs::remove(*path, ignored);
        }
    }
    Made(const Made&) = delete;
    Made& operator=(const Made&) = delete;

    void add(const fs::path& path) { paths_.push_back(path); }
    void keep() { paths_.clear(); }

private:
    std::vector<fs::path> paths_;
};

void makeFolder(const fs::path& folder, Made& made) {
    std::error_code error;
    if (folder.empty() || fs::is_directory(folder, error)) {
        return;
    }
    if (fs::exists(folder, error)) {
        fail(folder, ENOTDIR);
    }
    makeFolder(folder.parent_path(), made);
    if (!fs::create_directory(folder, error) && error) {
        fail(folder, error.value());
    }
    made.add(folder);
}

void write(const fs::path& path, const std::string& content, Made& made) {
    // Fails for a file that has come into being meanwhile, too.
    const int file = ::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
    if (file < 0) {
        fail(path, errno);
    }
    made.add(path);
    for (std::size_t done = 0; done < content.size();) {
        const ssize_t count = ::write(file, content.data() + done, content.size() - done);
        if (count < 0 && errno != EINTR) {
            const int error = errno;
            ::close(file);
            fail(path, error);
        }
        done += count > 0 ? static_cast<std::size_t>(count) : 0;
    }
    if (::close(file) != 0) {
        fail(path, errno);
    }
}

} // namespace

void writeNewFiles(const fs::path& folder, const std::vector<NewFile>& files) {
    for (const NewFile& file : files) {
        std::error_code error;
        // A link that leads nowhere is there, too.
        if (fs::exists(fs::symlink_status(folder / file.name, error))) {
            throw std::runtime_error((folder / file.name).string() + " exists; nothing was written");
        }
    }
    Made made;
    makeFolder(folder, made);
    for (const NewFile& file : files) {
        write(folder / file.name, file.content, made);
    }
    made.keep();
}

} // namespace oxahv::runner
