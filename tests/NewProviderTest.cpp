// The verb `new`: what it refuses, and that it overwrites nothing. What it writes is built by drafts/check.
#include "Command.h"
#include "ScratchFolder.h"

namespace {

namespace fs = std::filesystem;

class NewProvider : public testing::Test, protected ScratchFolder {
protected:
    std::string project() const { return path("made/project"); }
    // Without the folder's name at the end of the command line.
    Outcome draft(const std::string& options) {
        return run("new --mof " KINDS " " + options + ' ' + project());
    }
    void expectRefusal(const std::string& options, const std::string& reason) {
        const Outcome outcome = draft(options);
        EXPECT_EQ(outcome.status, 2) << options;
        EXPECT_EQ(outcome.output, "oxahv-provider: " + reason + '\n') << options;
        EXPECT_FALSE(fs::exists(path("made"))) << options;
    }
};

} // namespace

TEST_F(NewProvider, RefusesWhatThereCanBeNoProviderOf) {
    const struct {
        const char* options;
        const char* reason;
    } cases[] = {
        {"--class Kind_Nowhere", "class Kind_Nowhere is not declared in the MOF files"},
        {"--class Kind_Abstract", "class Kind_Abstract is abstract, so it has no instances of its own"},
        {"--class Kind_Keyless", "class Kind_Keyless has no keys, so its instances have no names"},
        {"--class Kind_Event", "class Kind_Event is an indication, which has no instances"},
        {"--class Kind_Größe", "class Kind_Größe has a name that is no identifier in C++"},
        {"--class Kind_ArrayKey", "key ID of class Kind_ArrayKey is an array, which names no instance"},
        {"--class Kind_EmbeddedKey",
         "key ID of class Kind_EmbeddedKey is an embedded object, which names no instance"},
        {"--class Kind_Text --class kind_text", "class Kind_Text is named twice"},
        {"--class Kind_Text --name my-provider",
         "a provider cannot be named 'my-provider', which is no identifier in C++"},
        {"--class Kind_Text --name int", "a provider cannot be named 'int', which is no identifier in C++"},
        {"--class Kind_Text --name unix", "a provider cannot be named 'unix', which is no identifier in C++"},
        {"--class Kind_Text --name test",
         "a provider cannot be named 'test', which is a target of CMake's own"},
        {"--class Kind_Text --namespace 'root/\"'", "a registration cannot name the namespace 'root/\"'"},
    };
    for (const auto& c : cases) {
        expectRefusal(c.options, c.reason);
    }
    expectFailure("new --class Kind_Text " + project(), 2, "--mof is required: it declares the classes");
    expectFailure("new --mof " KINDS " " + project(), 2,
                  "--class is required; oxahv-provider --help shows the usage");
}

TEST_F(NewProvider, OverwritesNothing) {
    const std::string options = "--class Kind_Text";
    for (const char* name : {"Classes.h", "README.md", "Kinds.mof", "KindTextRegistration.mof"}) {
        write(std::string("made/project/") + name, "mine");
        const Outcome outcome = draft(options);
        EXPECT_EQ(outcome.status, 2);
        EXPECT_EQ(outcome.output,
                  "oxahv-provider: " + project() + '/' + name + " exists; nothing was written\n");
        EXPECT_EQ(content(std::string("made/project/") + name), "mine");
        EXPECT_EQ(std::distance(fs::directory_iterator(project()), {}), 1);
        fs::remove(project() + '/' + name);
    }
    fs::create_symlink("nowhere", project() + "/Classes.h");
    EXPECT_EQ(draft(options).status, 2);
    fs::remove(project() + "/Classes.h");
    write("made/project/other", "mine");
    EXPECT_EQ(draft(options).status, 0);
    EXPECT_EQ(content("made/project/other"), "mine");
}

TEST_F(NewProvider, LeavesNothingWhenItCannotWriteAll) {
    const Outcome outcome =
        shell("bash -c 'trap \"\" XFSZ; ulimit -f 1; " RUNNER " new --mof " KINDS " --class Kind_All " +
              project() + " 2>&1'");
    EXPECT_EQ(outcome.status, 2);
    EXPECT_EQ(outcome.output, "oxahv-provider: cannot write " + project() + "/Classes.h: File too large\n");
    EXPECT_FALSE(fs::exists(path("made")));
    write("made", "a file");
    EXPECT_EQ(draft("--class Kind_Text").output,
              "oxahv-provider: cannot write " + path("made") + ": Not a directory\n");
}

TEST_F(NewProvider, NamesAFileLikeNoOther) {
    write("a/CMakeLists.txt", "class Demo_A { [Key] string ID; };");
    write("b/Demo A;$.mof", "#pragma include (\"../a/CMakeLists.txt\")\nclass Demo_B : Demo_A {};");
    const Outcome outcome =
        run("new --mof '" + path("b/Demo A;$.mof") + "' --class demo_b " + project() +
            " && " RUNNER " new --mof " + path("a/CMakeLists.txt") + " --class Demo_A " + path("other"));
    EXPECT_EQ(outcome.status, 0);
    EXPECT_NE(content("made/project/Demo_A__.mof").find("#pragma include (\"../../b/Demo A;$.mof\")\n"),
              std::string::npos);
    EXPECT_EQ(content("other/2-CMakeLists.txt"), content("a/CMakeLists.txt"));
}
