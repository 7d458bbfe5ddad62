// Stands in for libFuzzer where a build has none: hands the files of the folders that are named to the
// target, then damaged: cut off at each place, and with a byte changed at each.
#include "Fuzz.h"

#include <csignal>
#include <filesystem>
#include <fstream>
#include <iterator>

namespace {

// The input that the target is asked about, for the report of a wrong answer.
std::string file;
unsigned int damage = 0;

void ask(const std::string& input) {
    ++damage;
    LLVMFuzzerTestOneInput(reinterpret_cast<const std::uint8_t*>(input.data()), input.size());
}

void replay(const std::string& input) {
    damage = 0;
    ask(input);
    // Long inputs are damaged in one way at a place, in turn.
    const bool isLong = input.size() > 300;
#ifdef __SANITIZE_ADDRESS__
    const std::size_t step = isLong ? 8 : 1;
#else
    const std::size_t step = 1;
#endif
    for (std::size_t i = 0; i < input.size(); i += step) {
        ask(input.substr(0, i));
        const int byte = static_cast<unsigned char>(input[i]);
        const int replacements[] = {0, byte ^ 0x01, byte ^ 0x10, byte ^ 0x20, byte ^ 0x80, '"', '{', '\\'};
        std::string damaged = input;
        for (std::size_t kind = 0; kind < std::size(replacements); ++kind) {
            damaged[i] = static_cast<char>(replacements[kind]);
            if (!isLong || kind == i / step % std::size(replacements)) {
                ask(damaged);
            }
        }
    }
}

} // namespace

int main(int argc, char** argv) {
    if (LLVMFuzzerInitialize != nullptr) {
        LLVMFuzzerInitialize(&argc, &argv);
    }
    std::signal(SIGABRT, [](int) { std::fprintf(stderr, "%s, damage %u\n", file.c_str(), damage); });
    int count = 0;
    for (int i = 1; i < argc; ++i) {
        for (const auto& entry : std::filesystem::directory_iterator(argv[i])) {
            file = entry.path();
            std::ifstream stream(file, std::ios::binary);
            replay({std::istreambuf_iterator<char>(stream), {}});
            ++count;
        }
    }
    return count > 0 ? 0 : 1;
}
