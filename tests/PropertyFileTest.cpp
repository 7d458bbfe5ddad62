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
#include <system_error>
#include <type_traits>

using TK::PropertyFile;
namespace fs = std::filesystem;
using namespace std::string_literals;

namespace {

// A scratch folder with the file `path()` in it.
class APropertyFile : public testing::Test {
protected:
    void SetUp() override {
        std::string pattern = testing::TempDir() + "propertiesXXXXXX";
        ASSERT_NE(::mkdtemp(pattern.data()), nullptr);
        folder_ = pattern;
    }
    void TearDown() override { fs::remove_all(folder_); }

    std::string path(const std::string& name = "file") const { return folder_ / name; }

    void write(const std::string& content) const { std::ofstream(path(), std::ios::binary) << content; }

    std::string content() const {
        std::ostringstream content;
        content << std::ifstream(path(), std::ios::binary).rdbuf();
        return content.str();
    }

    std::ptrdiff_t filesInFolder() const { return std::distance(fs::directory_iterator(folder_), {}); }

    fs::path folder_;
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
    const std::wstring nasty[] = {L"",
                                  L" ",
                                  L"\n",
                                  L"\\u{41}",
                                  L"==a = b==",
                                  L"#",
                                  L"# not",
                                  L" ends ",
                                  L"\u00A0\u00A0",
                                  L"\x7F\x1B[0m\b",
                                  L"\u0085\u2028\u2029",
                                  L"\uFEFFkey",
                                  L"\u00FC\u20AC\U0001F600\U0010FFFF",
                                  L"\xDFFF\xD800",
                                  std::wstring(1, static_cast<wchar_t>(0x110000)),
                                  std::wstring(1, static_cast<wchar_t>(-1))};
    std::map<std::wstring, std::wstring> expected = {{std::wstring(L"nul\0key", 7), L"value"}};
    for (const std::wstring& key : nasty) {
        for (const std::wstring& value : nasty) {
            expected[key + L'k' + value] = value + L'v' + key;
            expected[value] = key;
        }
    }
    for (int code = 1; code < 0x3000; ++code) {
        expected[std::wstring(1, static_cast<wchar_t>(code))] = std::wstring(2, static_cast<wchar_t>(code));
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
          "empty=\n"
          "=no key\n"
          R"(\#escaped\s\=\u{1f600}\u{0000041}=\t\\\n\r\s)"
          "\n"
          "last=without end \xC3\xBC\xF0\x9F\x98\x80");
    PropertyFile file(path());
    const std::pair<const wchar_t*, const wchar_t*> rows[] = {
        {L"first", L"1"},    {L"key with blanks", L"a = b"},
        {L"twice", L"2"},    {L"empty", L""},
        {L"", L"no key"},    {L"#escaped =\U0001F600A", L"\t\\\n\r "},
        {L"# comment", L""}, {L"last", L"without end \u00FC\U0001F600"},
    };
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
        PropertyFile file(path());
        file.setEntry(row.key, row.value);
        file.save();
        EXPECT_EQ(content(), row.after);
    }
}

TEST_F(APropertyFile, ReportsDamagedLinesAndWritesThemBackAsTheyAre) {
    const std::string damaged = "no equals sign\n"
                                "good=1\n"
                                "a=\xC3\n"
                                "\xFF=a\r\n"
                                "a=\\q\n"
                                "a=\\\n"
                                "a\\=b\n"
                                "a=\\u{\n"
                                "a=\\u{}\n"
                                "a=\\u{000000041}\n"
                                "a=\\u41}\n"
                                "a=\\u{0x41}\n"
                                "a=\xC0\xAF\n"
                                "a=\xED\xA0\x80\n"
                                "a=\xF4\x90\x80\x80\n"s +
                                "a=\0\n"s + "\\";
    write(damaged);
    PropertyFile file(path());
    EXPECT_EQ(damageOf(file), "1 no equals sign\n3 not UTF-8\n4 not UTF-8\n5 unknown escape\n"
                              "6 unknown escape\n7 no equals sign\n8 unknown escape\n9 unknown escape\n"
                              "10 unknown escape\n11 unknown escape\n12 unknown escape\n13 not UTF-8\n"
                              "14 not UTF-8\n15 not UTF-8\n16 NUL character\n17 no equals sign\n");
    EXPECT_EQ(file.getEntry(L"a"), L"");
    file.setEntry(L"a", L"1");
    file.save();
    EXPECT_EQ(content(), damaged + "\na=1\n");
}

TEST_F(APropertyFile, IsEmptyWhenThereIsNoFileAndFailsWhenItCannotBeRead) {
    PropertyFile file(path());
    EXPECT_EQ(file.getEntry(L"a"), L"");
    file.setEntry(L"a", L"1");
    file.save();
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
    withoutPath.save();
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
    // And when nothing is in the way any more, all of it is there.
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
    // A folder that cannot be read, and so not be synchronised, and one that cannot be written.
    fs::permissions(folder_, fs::perms(0300));
    const int unreadable = savingFailure(file);
    fs::permissions(folder_, fs::perms(0500));
    const int unwritable = savingFailure(file);
    fs::permissions(folder_, fs::perms(0700));
    const std::string untouched = content();
    const int none = savingFailure(file);
    ASSERT_EQ(::seteuid(0), 0);
    EXPECT_EQ(unreadable, EACCES);
    EXPECT_EQ(unwritable, EACCES);
    EXPECT_EQ(untouched, "a=1\n");
    EXPECT_EQ(none, 0);
    EXPECT_EQ(content(), "a=2\n");
    EXPECT_EQ(fs::status(path()).permissions(), fs::perms(0604));
    EXPECT_EQ(filesInFolder(), 1);
}
