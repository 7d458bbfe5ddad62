// A property file's content in memory. It stays as it was read, byte for byte: beside it there are the places
// of the lines, and for each key a hash that leads to its line. Values are read from their lines when they
// are asked for, so that a large file takes little more memory than its own size.
#pragma once

#include "PropertyFile.h"
#include "PropertyText.h"

#include <deque>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace TK {

class PropertyContent {
public:
    PropertyContent() = default;
    explicit PropertyContent(std::string bytes);

    // The value under a key; empty when there is none.
    std::wstring value(const std::wstring& key);
    // Throws std::bad_alloc, and then nothing has changed.
    void set(const std::wstring& key, std::wstring_view value);

    const std::vector<PropertyFile::DamagedLine>& damaged() const { return damaged_; }
    std::string bytes() const;

private:
    struct Line {
        std::size_t begin; // in read_, or the index in written_
        std::size_t size;  // in read_, without the end
        PropertyText::Part key;
        PropertyText::Part value;
        bool isWritten;
        unsigned char endSize; // 0, 1 for LF, 2 for CRLF
    };
    using Index = std::unordered_multimap<std::size_t, std::size_t>; // hash of a key -> line

    void readLine(std::size_t begin, std::size_t size, unsigned char endSize);
    void addEntry();
    Index::iterator find(std::wstring_view key, std::size_t hash);
    std::string_view textOf(const Line& line) const;
    std::string_view keyOf(const Line& line) const;
    std::string_view valueOf(const Line& line) const;
    unsigned char newEndSize() const;
    void change(Line& line, std::wstring_view value);
    void append(const std::wstring& key, std::size_t hash, std::wstring_view value);

    std::string read_;
    std::deque<std::string> written_; // the texts of lines that were changed or added
    std::vector<Line> lines_;
    Index index_;
    std::vector<PropertyFile::DamagedLine> damaged_;
    std::size_t markSize_ = 0; // of the byte order mark, if any
};

} // namespace TK
