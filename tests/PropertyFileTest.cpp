// Property files: what is read, what a save keeps, and saves that fail half-way.
#include "PropertyFile.h"
#include "ScratchFolder.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <fcntl.h>
#include <functional>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <sys/xattr.h>
#include <system_error>
#include <type_traits>
#include <unistd.h>
#include <utility>
#include <vector>

using TK::PropertyFile;
namespace fs = std::filesystem;
using namespace std::string_literals;

// Functions of the C library that the tests watch or let fail. The library under test calls these.
static std::string calls;
static std::function<void()> beforeSync;
static int attributeFailure = 0;

#define REPLACED extern "C" __attribute__((visibility("default")))
REPLACED int fsync(int descriptor) {
    if (beforeSync) {
        std::exchange(beforeSync, nullptr)();
    }
    struct stat status {};
    ::fstat(descriptor, &status);
    calls += S_ISDIR(status.st_mode) ? "sync-folder " : "sync-file ";
    return static_cast<int>(::syscall(SYS_fsync, descriptor));
}
REPLACED int rename(const char* from, const char* to) noexcept {
    calls += fs::path(from).parent_path() == fs::path(to).parent_path() ? "rename " : "move ";
    return static_cast<int>(::syscall(SYS_renameat2, AT_FDCWD, from, AT_FDCWD, to, 0));
}
REPLACED int fsetxattr(int descriptor, const char* name, const void* value, size_t size, int flags) noexcept {
    errno = attributeFailure;
    return attributeFailure != 0
               ? -1
               : static_cast<int>(::syscall(SYS_fsetxattr, descriptor, name, value, size, flags));
}

namespace {

class PropertyFileTest : public testing::Test, protected ScratchFolder {
protected:
    void save(const std::wstring& key, const std::wstring& value) const {
        PropertyFile file(path());
        file.setEntry(key, value);
        file.save();
    }

    // False where the file system has no such attributes.
    bool setAttribute(const char* name, const std::string& value) const {
        return ::setxattr(path().c_str(), name, value.data(), value.size(), 0) == 0;
    }

    std::string attribute(const char* name) const {
        std::string value(1000, '\0');
        const ssize_t size = ::getxattr(path().c_str(), name, value.data(), value.size());
        value.resize(static_cast<std::size_t>(std::max<ssize_t>(size, 0)));
        return value;
    }

    unsigned int mode() const { return static_cast<unsigned int>(fs::status(path()).permissions()); }

    std::ptrdiff_t filesInFolder() const { return std::distance(fs::directory_iterator(folder_), {}); }
};

constexpr const char* accessList = "system.posix_acl_access";

// user::rw-, user:1:r--, group::, mask::rw-, other::r--, as the kernel writes them.
std::string accessListWith(char group) {
    const std::string nobody = "\xFF\xFF\xFF\xFF";
    return "\2\0\0\0\1\0\6\0"s + nobody + "\2\0\4\0\1\0\0\0\4\0"s + group + '\0' + nobody + "\x10\0\6\0"s +
           nobody + "\x20\0\4\0"s + nobody;
}

const std::string mark = "\xEF\xBB\xBF"; // of UTF-8

template <class Operation>
int failureOf(const Operation& operation) {
    try {
        operation();
        return 0;
    } catch (const std::system_error& failure) {
        return failure.code().value();
    }
}

int savingFailure(PropertyFile& file) {
    return failureOf([&] { file.save(); });
}

std::string damageOf(const PropertyFile& file) {
    std::string all;
    for (const PropertyFile::DamagedLine& line : file.damagedLines()) {
        all += std::to_string(line.number) + ' ' + line.reason + '\n';
    }
    return all;
}

static_assert(!std::is_copy_constructible_v<PropertyFile> && !std::is_copy_assignable_v<PropertyFile>);

} // namespace

// A fuzz target tries them in combination.
TEST_F(PropertyFileTest, ReadsBackEveryCharacter) {
    std::wstring characters = L"\u20AC\uFEFF\U0001F600\U0010FFFF\xD800\xDFFF\x110000\xFFFFFFFF";
    for (wchar_t code = 1; code < 0x3000; ++code) {
        characters += code;
    }
    PropertyFile file(path());
    file.setEntry(std::wstring(L"nul\0key", 7), L"value");
    for (const wchar_t character : characters) {
        file.setEntry({character}, L"something longer at first");
        file.setEntry({character}, {character, L'v', character});
    }
    file.save();
    PropertyFile again(path());
    EXPECT_EQ(damageOf(again), "");
    EXPECT_EQ(again.getEntry(std::wstring(L"nul\0key", 7)), L"value");
    for (const wchar_t character : characters) {
        const std::wstring value = {character, L'v', character};
        ASSERT_EQ(file.getEntry({character}), value) << static_cast<unsigned long>(character);
        ASSERT_EQ(again.getEntry({character}), value) << static_cast<unsigned long>(character);
    }
}

TEST_F(PropertyFileTest, ReadsFilesWrittenByPeople) {
    write(mark +
          "first=1\r\n  \t# comment = no entry\n\n key with blanks \t=\t a = b \r\ntwice=1\ntwice=2\n" +
          "=no key\n\\#escaped\\s\\=\\u{1f600}\\u{0000041}=\\t\\\\\\n\\r\\s\n" +
          "last=without end \xC3\xBC\xF0\x9F\x98\x80");
    PropertyFile file(path());
    const std::pair<const wchar_t*, const wchar_t*> rows[] = {{L"first", L"1"},
                                                              {L"key with blanks", L"a = b"},
                                                              {L"twice", L"2"},
                                                              {L"", L"no key"},
                                                              {L"# comment", L""},
                                                              {L"#escaped =\U0001F600A", L"\t\\\n\r "},
                                                              {L"last", L"without end \u00FC\U0001F600"}};
    for (const auto& [key, value] : rows) {
        EXPECT_EQ(file.getEntry(key), value) << testing::PrintToString(std::wstring(key));
    }
    EXPECT_EQ(damageOf(file), "");
}

TEST_F(PropertyFileTest, SaveChangesNothingElse) {
    const struct {
        std::string before;
        std::wstring key;
        std::wstring value;
        std::string after;
    } rows[] = {
        {"# c\n\n b = 1 \r\na=2\n", L"b", L"3", "# c\n\n b = 3\r\na=2\n"},
        {"# c\n\n b = \\u{31} \r\na=2", L"b", L"1", "# c\n\n b = \\u{31} \r\na=2"},
        {"a=1\nb=2\na=3\n", L"a", L"4", "a=1\nb=2\na=4\n"},
        {"a=1\r\nb=2", L"c", L"3", "a=1\r\nb=2\r\nc=3\r\n"},
        {"a=1\nb=2\r\n", L"c", L"3", "a=1\nb=2\r\nc=3\n"},
        {mark + "a=1", L"a", L"", mark + "a="},
        {"", L"\uFEFF#", L"\t= a\tb\x1B ", "\\u{feff}\\#=\\t= a\\tb\\u{1b}\\s\n"},
        {"", L"a", std::wstring(L"42\0\0", 4), "a=42\n"},
        {"a =", L"a", L"= #", "a == #"},
        {"a=x\r", L"b", L"1", "a=x\r\r\nb=1\n"},
    };
    for (const auto& row : rows) {
        write(row.before);
        save(row.key, row.value);
        EXPECT_EQ(content(), row.after);
    }
}

TEST_F(PropertyFileTest, ReportsDamagedLinesAndKeepsThem) {
    const std::pair<const char*, std::vector<std::string>> rows[] = {
        {"no equals sign", {"no equals sign", "a\\=b"}},
        {"not UTF-8", {"a=\xC3", "\xFF=a\r", "a=\xC0\xAF", "a=\xED\xA0\x80", "a=\xF4\x90\x80\x80"}},
        {"unknown escape",
         {"a=\\q", "a=\\", "a=\\u{", "a=\\u{}", "a=\\u{000000041}", "a=\\u41}", "a=\\u{0x41}"}},
        {"NUL character", {"a=\0"s}},
        {"no equals sign", {"\\"}},
    };
    std::string damaged = "good=1";
    std::string damage;
    int number = 1;
    for (const auto& [reason, lines] : rows) {
        for (const std::string& line : lines) {
            damaged += '\n' + line;
            damage += std::to_string(++number) + ' ' + reason + '\n';
        }
    }
    write(damaged);
    PropertyFile file(path());
    EXPECT_EQ(damageOf(file), damage);
    EXPECT_EQ(file.getEntry(L"a"), L"");
    save(L"a", L"1");
    EXPECT_EQ(content(), damaged + "\na=1\n");
}

TEST_F(PropertyFileTest, LoadFailsWithoutChangingEntries) {
    PropertyFile file(path());
    EXPECT_EQ(file.getEntry(L"a"), L"") << "no file is an empty one";
    save(L"a", L"1");
    EXPECT_EQ(mode(), 0600U);
    EXPECT_EQ(failureOf([&] { PropertyFile(path("file/below")); }), ENOTDIR);
    file.setEntry(L"a", L"2");
    fs::remove(path());
    fs::create_directory(path());
    EXPECT_EQ(failureOf([&] { file.load(); }), EISDIR);
    EXPECT_EQ(file.getEntry(L"a"), L"2");
    fs::remove(path());
    write("a=3");
    file.load();
    EXPECT_EQ(file.getEntry(L"a"), L"3") << "what was not saved is forgotten";

    PropertyFile withoutPath;
    withoutPath.setEntry(L"a", L"1");
    EXPECT_EQ(savingFailure(withoutPath), 0);
    withoutPath.load();
    EXPECT_EQ(withoutPath.getEntry(L"a"), L"1");
}

TEST_F(PropertyFileTest, SaveKeepsPermissionsOwnerAndLinks) {
    write("a=1\n");
    const bool isRoot = ::geteuid() == 0;
    const uid_t owner = isRoot ? 1 : ::getuid();
    const gid_t group = isRoot ? 2 : ::getgid();
    ASSERT_EQ(::chown(path().c_str(), owner, group), 0);
    fs::permissions(path(), fs::perms(0754));
    fs::create_directory(path("links"));
    fs::create_symlink("../second", path("links/first"));
    fs::create_symlink(path(), path("second"));
    PropertyFile file(path("links/first"));
    file.setEntry(L"a", L"2");
    file.save();
    EXPECT_EQ(content(), "a=2\n");
    EXPECT_TRUE(fs::is_symlink(path("links/first")) && fs::is_symlink(path("second")));
    struct stat status {};
    ASSERT_EQ(::stat(path().c_str(), &status), 0);
    EXPECT_EQ(std::tie(status.st_uid, status.st_gid), std::tie(owner, group));
    EXPECT_EQ(mode(), 0754U);
    fs::remove(path());
    file.save();
    EXPECT_EQ(content(), "a=2\n") << "a dangling link names the new file";
    fs::remove(path());
    fs::create_symlink("second", path());
    EXPECT_EQ(savingFailure(file), ELOOP);
}

TEST_F(PropertyFileTest, SaveKeepsAccessControlListAndAttributesOrFails) {
    write("a=1\n");
    if (!setAttribute(accessList, accessListWith(0)) || !setAttribute("user.note", "x")) {
        GTEST_SKIP() << "the file system has no attributes";
    }
    save(L"a", L"2");
    EXPECT_EQ(attribute(accessList), accessListWith(0));
    EXPECT_EQ(attribute("user.note"), "x");
    EXPECT_EQ(mode(), 0664U);
    attributeFailure = ENOSPC;
    EXPECT_EQ(failureOf([&] { save(L"a", L"3"); }), ENOSPC);
    attributeFailure = 0;
    EXPECT_EQ(content(), "a=2\n");
    EXPECT_EQ(filesInFolder(), 1);

    // A list that new files get from their folder must not open a file that had none.
    fs::remove(path());
    write("a=1\n");
    fs::permissions(path(), fs::perms(0660));
    const std::string list = accessListWith(0);
    ASSERT_EQ(::setxattr(folder_.c_str(), "system.posix_acl_default", list.data(), list.size(), 0), 0);
    save(L"a", L"2");
    EXPECT_EQ(attribute(accessList), "");
    EXPECT_EQ(mode(), 0660U);
}

TEST_F(PropertyFileTest, SaveSurvivesPowerFailures) {
    PropertyFile file(path(std::string(255, 'n'))); // no file system takes a longer name
    file.setEntry(L"a", L"1");
    calls.clear();
    file.save();
    EXPECT_EQ(calls, "sync-file rename sync-folder ");
}

TEST_F(PropertyFileTest, SaveRemovesFilesOfKilledSaves) {
    write("");
    write(".file.backup", ""); // somebody's own
    const pid_t child = ::fork();
    if (child == 0) {
        beforeSync = [] { ::raise(SIGKILL); };
        save(L"a", L"1");
    }
    ASSERT_EQ(::waitpid(child, nullptr, 0), child);
    EXPECT_EQ(filesInFolder(), 3);
    // A save that is under way keeps its temporary file while another one ends.
    beforeSync = [this] { save(L"a", L"2"); };
    save(L"a", L"3");
    EXPECT_EQ(content(), "a=3\n");
    EXPECT_EQ(filesInFolder(), 2);
}

TEST_F(PropertyFileTest, FailedSaveLeavesTheFileAlone) {
    write("a=1\n");
    PropertyFile file(path());
    file.setEntry(L"a", std::wstring(5000, L'x'));
    // The disk fills up: no file may grow beyond some size.
    const auto earlierHandler = std::signal(SIGXFSZ, SIG_IGN);
    rlimit earlier{};
    ASSERT_EQ(::getrlimit(RLIMIT_FSIZE, &earlier), 0);
    const rlimit small{4096, earlier.rlim_max};
    ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &small), 0);
    const int failure = savingFailure(file);
    ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &earlier), 0);
    std::signal(SIGXFSZ, earlierHandler);
    EXPECT_EQ(failure, EFBIG);
    EXPECT_EQ(content(), "a=1\n");

    // The path names something other than a file.
    fs::remove(path());
    fs::create_directory(path());
    EXPECT_EQ(savingFailure(file), EISDIR);
    fs::remove(path());
    ASSERT_EQ(::mkfifo(path().c_str(), 0600), 0);
    EXPECT_EQ(savingFailure(file), EINVAL);
    EXPECT_EQ(filesInFolder(), 1);

    fs::remove_all(folder_);
    EXPECT_EQ(savingFailure(file), ENOENT);
    fs::create_directory(folder_);
    file.save();
    EXPECT_EQ(content(), "a=" + std::string(5000, 'x') + '\n') << "a later save writes everything";
}

TEST_F(PropertyFileTest, SaveNarrowsAccessWhenTheGroupCannotBeKept) {
    constexpr uid_t nobody = 65534;
    if (::geteuid() != 0) {
        GTEST_SKIP() << "needs to be root first, and nobody then";
    }
    write("a=1\n");
    ASSERT_EQ(::chown(path().c_str(), 1, 2), 0);
    fs::permissions(path(), fs::perms(0664));
    ASSERT_EQ(::chown(folder_.c_str(), nobody, nobody), 0);
    PropertyFile file(path());
    file.setEntry(L"a", L"2");
    ASSERT_EQ(::seteuid(nobody), 0);
    // A folder that cannot be read, and so not be synchronised; one that cannot be written; one that can.
    std::vector<int> failures;
    for (const unsigned int mode : {0300U, 0500U, 0700U}) {
        EXPECT_EQ(content(), "a=1\n");
        fs::permissions(folder_, fs::perms(mode));
        failures.push_back(savingFailure(file));
    }
    ASSERT_EQ(::seteuid(0), 0);
    EXPECT_EQ(failures, std::vector<int>({EACCES, EACCES, 0}));
    EXPECT_EQ(content(), "a=2\n");
    EXPECT_EQ(mode(), 0604U);
    EXPECT_EQ(filesInFolder(), 1);

    // In an access control list, the group has an entry of its own.
    ASSERT_EQ(::chown(path().c_str(), 1, 2), 0);
    if (setAttribute(accessList, accessListWith(6))) {
        ASSERT_EQ(::seteuid(nobody), 0);
        EXPECT_EQ(savingFailure(file), 0);
        ASSERT_EQ(::seteuid(0), 0);
        EXPECT_EQ(attribute(accessList), accessListWith(0));
    }
}
