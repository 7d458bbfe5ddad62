// Property files: a key and a value in the first two lines, four bytes a character, the file's text behind
// them.
#include "Fuzz.h"

#include "PropertyFile.h"

#include <filesystem>
#include <fstream>
#include <iterator>
#include <unistd.h>

namespace {

// A file of this process in memory; removed when the process ends by itself.
class ScratchFile {
public:
    ScratchFile() {
        const bool hasMemory = std::filesystem::is_directory("/dev/shm");
        folder_ = (hasMemory ? "/dev/shm" : std::filesystem::temp_directory_path().string()) +
                  "/property-file-XXXXXX";
        FUZZ_REQUIRE(::mkdtemp(folder_.data()) != nullptr);
    }
    ~ScratchFile() { std::filesystem::remove_all(folder_); }
    ScratchFile(const ScratchFile&) = delete;
    ScratchFile& operator=(const ScratchFile&) = delete;

    std::string path() const { return folder_ + "/file"; }
    void write(const std::string& bytes) const { std::ofstream(path(), std::ios::binary) << bytes; }
    std::string read() const {
        std::ifstream file(path(), std::ios::binary);
        return {std::istreambuf_iterator<char>(file), {}};
    }

private:
    std::string folder_;
};

std::wstring untilNul(const std::wstring& text) {
    return text.c_str();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const ScratchFile scratch;
    fuzz::Input input(data, size);
    const std::wstring key = fuzz::wide(input.line());
    const std::wstring value = fuzz::wide(input.line());
    const std::string bytes = input.rest();

    // What nobody changes stays byte for byte.
    scratch.write(bytes);
    TK::PropertyFile file(scratch.path());
    file.save();
    FUZZ_REQUIRE(scratch.read() == bytes);
    const std::wstring other = file.getEntry(L"other");

    // What is set reads back, here and from the file; and is the only change.
    file.setEntry(key, value);
    FUZZ_REQUIRE(file.getEntry(key) == untilNul(value));
    file.save();
    TK::PropertyFile again(scratch.path());
    FUZZ_REQUIRE(again.getEntry(key) == untilNul(value));
    FUZZ_REQUIRE(key == L"other" || again.getEntry(L"other") == other);
    FUZZ_REQUIRE(again.damagedLines().size() == file.damagedLines().size());

    // Setting it once more changes nothing.
    const std::string saved = scratch.read();
    again.setEntry(key, value);
    again.save();
    FUZZ_REQUIRE(scratch.read() == saved);
    return 0;
}
