#include "drafts/Mof.h"

#include "show/Text.h"

#include <algorithm>
#include <cerrno>
#include <fstream>
#include <iterator>
#include <stdexcept>

namespace oxahv::runner {

namespace {

namespace fs = std::filesystem;

std::string contentOf(const std::string& file) {
    std::ifstream stream(file, std::ios::binary);
    std::string content{std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
    if (!stream) {
        throw std::runtime_error("cannot read " + file);
    }
    return content;
}

// Whether the text may have a pragma that includes another file. One in a comment counts too: then the file
// is included where it could have been copied.
bool mayInclude(const std::string& content) {
    const std::string folded = foldedName(content);
    for (std::size_t hash = folded.find('#'); hash != std::string::npos; hash = folded.find('#', hash + 1)) {
        const std::size_t pragma = folded.find_first_not_of(" \t\r\n", hash + 1);
        if (pragma != std::string::npos && folded.compare(pragma, 6, "pragma") == 0) {
            const std::size_t word = folded.find_first_not_of(" \t\r\n", pragma + 6);
            if (word != std::string::npos && folded.compare(word, 7, "include") == 0) {
                return true;
            }
        }
    }
    return false;
}

// As a text of MOF.
std::string quoted(const std::string& text) {
    std::string result = "\"";
    for (const char c : text) {
        result += c == '"' || c == '\\' ? std::string("\\") + c : std::string(1, c);
    }
    return result + '"';
}

std::string includeOf(const std::string& file, const fs::path& folder) {
    // Links that lead up and down are resolved: the path has to hold in the file system, not in the text.
    const fs::path from = fs::weakly_canonical(fs::absolute(folder));
    return "// The classes are declared in a file that includes others.\n#pragma include (" +
           quoted(fs::canonical(file).lexically_relative(from).string()) + ")\n";
}

// A name that needs no quotes, whatever reads it.
std::string plainName(const std::string& file) {
    std::string name = fs::path(file).filename().string();
    const char* const allowed = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_-.";
    for (std::size_t i = name.find_first_not_of(allowed); i != std::string::npos;
         i = name.find_first_not_of(allowed, i)) {
        name[i] = '_';
    }
    return name;
}

} // namespace

std::vector<NewFile> mofOf(const std::vector<std::string>& files, const fs::path& folder,
                           std::vector<std::string> taken) {
    std::vector<NewFile> result;
    for (const std::string& file : files) {
        const std::string content = contentOf(file);
        std::string name = plainName(file);
        for (int count = 2; std::find(taken.begin(), taken.end(), name) != taken.end(); ++count) {
            name = std::to_string(count) + '-' + plainName(file);
        }
        taken.push_back(name);
        result.push_back({name, mayInclude(content) ? includeOf(file, folder) : content});
    }
    return result;
}

} // namespace oxahv::runner
