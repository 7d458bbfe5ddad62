// Provider "DemoFileSystem": serves Demo_FileSystem.
// [includes]
#include <ProviderKit.h>

#include <mntent.h>
#include <sys/statvfs.h>

#include <memory>
#include <set>
#include <string>
// [includes]

// [machine]
// The folders that something is mounted on. A folder can be mounted on twice, but a key must be
// unique: a set.
static std::set<std::string> mountPoints() {
    const std::unique_ptr<FILE, int (*)(FILE*)> table(setmntent("/proc/self/mounts", "r"),
                                                      endmntent);
    std::set<std::string> roots;
    mntent entry;
    char line[8192];
    while (table != nullptr && getmntent_r(table.get(), &entry, line, sizeof line) != nullptr) {
        roots.insert(entry.mnt_dir);
    }
    return roots;
}
// [machine]

// [provider]
class FileSystems : public oxahv::InstanceProvider {
public:
    static constexpr const char* traceCategory = "Demo.FileSystem";

    void enumerate(const oxahv::Operation& operation, oxahv::Instances& reply) override {
        for (const std::string& root : mountPoints()) {
            auto instance = operation.instance("Demo_FileSystem", {{"Root", root}});
            struct statvfs state;
            // Where it fails, the other properties stay NULL.
            if (instance.isVisible() && statvfs(root.c_str(), &state) == 0) {
                const std::uint64_t block = state.f_frsize;
                instance.set("FileSystemSize", block * state.f_blocks)
                    .set("AvailableSpace", block * state.f_bavail)
                    .set("ReadOnly", (state.f_flag & ST_RDONLY) != 0);
            }
            reply.add(instance);
        }
    }
};
// [provider]

// [entry]
OXAHV_PROVIDER(DemoFileSystem, FileSystems);
// [entry]
