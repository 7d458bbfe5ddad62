#include "PropertyFile.h"

#include <cerrno>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <map>
#include <sstream>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <system_error>
#include <type_traits>
#include <unistd.h>
#include <vector>

using TK::PropertyFile;
namespace fs = std::filesystem;
using namespace std::string_literals;

static std::string synchronised; // what was, and where a file was renamed

// Stand between the library and the C library.
extern "C" __attribute__((visibility("default"))) int fsync(int descriptor) {
    struct stat status {};
    ::fstat(descriptor, &status);
    synchronised += S_ISDIR(status.st_mode) ? "folder " : "file ";
    return static_cast<int>(::syscall(SYS_fsync, descriptor));
}
extern "C" __attribute__((visibility("default"))) int rename(const char* from, const char* to) noexcept {
    synchronised += fs::path(from).parent_path() == fs::path(to).parent_path() ? "rename " : "move ";
    return static_cast<int>(::syscall(SYS_rename, from, to));
}

namespace {

// A scratch folder with the file `path()` in it.
class APropertyFile : public testing::Test {
protected:
    ~APropertyFile() override { fs::remove_all(folder_); }

    std::string path(const std::string& name = "file") const { return folder_ / name; }

    void write(const std::string& content) const { std::ofstream(path(), std::ios::binary) << content; }

    std::string content() const {
        std::ostringstream content;
        content << std::ifstream(path(), std::ios::binary).rdbuf();
        return content.str();
    }

    void save(const std::wstring& key, const std::wstring& value) const {
        PropertyFile file(path());
        file.setEntry(key, value);
        file.save();
    }

    std::ptrdiff_t filesInFolder() const { return std::distance(fs::directory_iterator(folder_), {}); }

    std::string pattern_ = testing::TempDir() + "propertiesXXXXXX";
    const fs::path folder_ = ::mkdtemp(pattern_.data());
};

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

TEST_F(APropertyFile, GivesBackEveryKeyAndValue) {
    const std::wstring nasty =
        L" \t\n\r\b\x7F\x1B\\u{4}=#"
        L"k\u0085\u00A0\u2028\uFEFF\u20AC\U0001F600\U0010FFFF\xD800\xDFFF\x110000\xFFFFFFFF";
    std::map<std::wstring, std::wstring> expected = {{L"", L""}, {std::wstring(L"nul\0key", 7), L"value"}};
    for (const wchar_t first : nasty) {
        for (const wchar_t second : nasty) {
            expected[{first, second}] = {second, L'v', first};
        }
    }
    for (wchar_t code = 1; code < 0x3000; ++code) {
        expected[std::wstring(1, code)] = std::wstring(2, code);
    }
    PropertyFile file(path());
    for (const auto& [key, value] : expected) {
        file.setEntry(key, L"something longer at first");
        file.setEntry(key, value);
    }
    file.save();
    PropertyFile again(path());
    EXPECT_EQ(damageOf(again), "");
    for (const auto& [key, value] : expected) {
        ASSERT_EQ(file.getEntry(key), value) << testing::PrintToString(key);
        ASSERT_EQ(again.getEntry(key), value) << testing::PrintToString(key);
    }
}

TEST_F(APropertyFile, IsReadAsPeopleWriteIt) {
    write("\xEF\xBB\xBF"
          "first=1\r\n"
          "  \t# comment = no entry\n"
          "\n"
          " key with blanks \t=\t a = b \r\n"
          "twice=1\n"
          "twice=2\n"
          "=no key\n"
          R"(\#escaped\s\=\u{1f600}\u{0000041}=\t\\\n\r\s)"
          "\n"
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

TEST_F(APropertyFile, KeepsWhatAChangeDoesNotTouch) {
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
        {"\xEF\xBB\xBF"
         "a=1",
         L"a", L"",
         "\xEF\xBB\xBF"
         "a="},
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

TEST_F(APropertyFile, ReportsDamagedLinesAndWritesThemBackAsTheyAre) {
    const std::pair<const char*, std::vector<std::string>> rows[] = {
        {"no equals sign", {"no equals sign", "a\\=b"}},
        {"not UTF-8", {"a=\xC3", "\xFF=a\r", "a=\xC0\xAF", "a=\xED\xA0\x80", "a=\xF4\x90\x80\x80"}},
        {"unknown escape",
         {"a=\\q", "a=\\", "a=\\u{", "a=\\u{}", "a=\\u{000000041}", "a=\\u41}", "a=\\u{0x41}"}},
        {"NUL character", {"a=\0"s}},
        {"no equals sign", {"\\"}},
    };
    std::string damaged = "good=1\n";
    std::string damage;
    int number = 1;
    for (const auto& [reason, lines] : rows) {
        for (const std::string& line : lines) {
            damaged += line + '\n';
            damage += std::to_string(++number) + ' ' + reason + '\n';
        }
    }
    damaged.pop_back();
    write(damaged);
    PropertyFile file(path());
    EXPECT_EQ(damageOf(file), damage);
    EXPECT_EQ(file.getEntry(L"a"), L"");
    save(L"a", L"1");
    EXPECT_EQ(content(), damaged + "\na=1\n");
}

TEST_F(APropertyFile, IsEmptyWhenThereIsNoFileAndFailsWhenItCannotBeRead) {
    PropertyFile file(path());
    EXPECT_EQ(file.getEntry(L"a"), L"");
    save(L"a", L"1");
    EXPECT_EQ(fs::status(path()).permissions(), fs::perms::owner_read | fs::perms::owner_write);
    EXPECT_EQ(failureOf([&] { PropertyFile(path("file/below")); }), ENOTDIR);
    // A failed load leaves the entries; a good one forgets what was not saved.
    file.setEntry(L"a", L"2");
    fs::remove(path());
    fs::create_directory(path());
    EXPECT_EQ(failureOf([&] { file.load(); }), EISDIR);
    EXPECT_EQ(file.getEntry(L"a"), L"2");
    fs::remove(path());
    write("a=3");
    file.load();
    EXPECT_EQ(file.getEntry(L"a"), L"3");

    PropertyFile withoutPath;
    withoutPath.setEntry(L"a", L"1");
    EXPECT_EQ(savingFailure(withoutPath), 0);
    withoutPath.load();
    EXPECT_EQ(withoutPath.getEntry(L"a"), L"1");
}

TEST_F(APropertyFile, KeepsPermissionsOwnerAndLinks) {
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
    EXPECT_EQ(status.st_mode & 07777U, 0754U);
    EXPECT_EQ(status.st_uid, owner);
    EXPECT_EQ(status.st_gid, group);
    // A link that dangles names the file that is made.
    fs::remove(path());
    file.save();
    EXPECT_EQ(content(), "a=2\n");
    fs::remove(path());
    fs::create_symlink("second", path());
    EXPECT_EQ(savingFailure(file), ELOOP);
}

TEST_F(APropertyFile, OutlivesAPowerFailureAsItWasOrAsItIs) {
    PropertyFile file(path(std::string(255, 'n'))); // no file system takes a longer name
    file.setEntry(L"a", L"1");
    synchronised.clear();
    file.save();
    EXPECT_EQ(synchronised, "file rename folder ");
}

TEST_F(APropertyFile, IsUntouchedByASaveThatFails) {
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

    // Something that is no file is in the way.
    fs::remove(path());
    fs::create_directory(path());
    EXPECT_EQ(savingFailure(file), EISDIR);
    fs::remove(path());
    ASSERT_EQ(::mkfifo(path().c_str(), 0600), 0);
    EXPECT_EQ(savingFailure(file), EINVAL);
    EXPECT_EQ(filesInFolder(), 1);

    fs::remove_all(folder_);
    EXPECT_EQ(savingFailure(file), ENOENT);
    // When nothing is in the way any more, all of it is there.
    fs::create_directory(folder_);
    file.save();
    EXPECT_EQ(content(), "a=" + std::string(5000, 'x') + '\n');
}

TEST_F(APropertyFile, GivesNothingAwayWhenItsGroupCannotBeKept) {
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
    // A folder that cannot be read, and so not be synchronised, and one that cannot be written; at last
    // neither.
    std::vector<int> failures;
    for (const unsigned int mode : {0300U, 0500U, 0700U}) {
        EXPECT_EQ(content(), "a=1\n");
        fs::permissions(folder_, fs::perms(mode));
        failures.push_back(savingFailure(file));
    }
    ASSERT_EQ(::seteuid(0), 0);
    EXPECT_EQ(failures, std::vector<int>({EACCES, EACCES, 0}));
    EXPECT_EQ(content(), "a=2\n");
    EXPECT_EQ(fs::status(path()).permissions(), fs::perms(0604));
    EXPECT_EQ(filesInFolder(), 1);
}
