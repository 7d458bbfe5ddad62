// A folder for a test's files, which is removed with them at the end.
#pragma once

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <iterator>
#include <string>

class ScratchFolder {
public:
    ScratchFolder() = default;
    ~ScratchFolder() { std::filesystem::remove_all(folder_); }
    ScratchFolder(const ScratchFolder&) = delete;
    ScratchFolder& operator=(const ScratchFolder&) = delete;

    std::string path(const std::string& name = "file") const { return folder_.string() + '/' + name; }

    void write(const std::string& name, const std::string& content) const {
        std::filesystem::create_directories(std::filesystem::path(path(name)).parent_path());
        std::ofstream(path(name), std::ios::binary) << content;
    }
    void write(const std::string& content) const { write("file", content); }

    std::string content(const std::string& name = "file") const {
        std::ifstream stream(path(name), std::ios::binary);
        return {std::istreambuf_iterator<char>(stream), {}};
    }

private:
    std::string pattern_ = testing::TempDir() + "oxahv-XXXXXX";

protected:
    const std::filesystem::path folder_ = ::mkdtemp(pattern_.data());
};
