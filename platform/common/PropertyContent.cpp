#include "PropertyContent.h"

#include <Utf8.h>

#include <algorithm>
#include <array>
#include <functional>
#include <utility>

namespace TK {

namespace {

constexpr std::array<std::string_view, 3> ends{"", "\n", "\r\n"}; // by their size

std::size_t hashOf(std::wstring_view key) {
    return std::hash<std::wstring_view>()(key);
}

} // namespace

PropertyContent::PropertyContent(std::string bytes) : read_(std::move(bytes)) {
    const std::string_view mark = encoding::byteOrderMark;
    markSize_ = read_.compare(0, mark.size(), mark) == 0 ? mark.size() : 0;
    lines_.reserve(static_cast<std::size_t>(std::count(read_.begin(), read_.end(), '\n')) + 1);
    for (std::size_t begin = markSize_; begin < read_.size();) {
        const std::size_t stop = std::min(read_.find('\n', begin), read_.size());
        unsigned char endSize = 0;
        if (stop != read_.size()) {
            endSize = stop > begin && read_[stop - 1] == '\r' ? 2 : 1;
        }
        readLine(begin, stop + 1 - begin - std::max<std::size_t>(endSize, 1), endSize);
        begin = stop + 1;
    }
}

void PropertyContent::readLine(std::size_t begin, std::size_t size, unsigned char endSize) {
    const PropertyText::Line line = PropertyText::split(std::string_view(read_).substr(begin, size));
    lines_.push_back({begin, size, line.key, line.value, false, endSize});
    if (line.damage != nullptr) {
        damaged_.push_back({lines_.size(), line.damage});
    } else if (line.isEntry) {
        addEntry();
    }
}

// Adds the last line to the index, unless it cannot be read.
void PropertyContent::addEntry() {
    std::wstring key;
    const char* damage = PropertyText::read(keyOf(lines_.back()), key);
    if (damage == nullptr) {
        damage = PropertyText::check(valueOf(lines_.back()));
    }
    if (damage != nullptr) {
        damaged_.push_back({lines_.size(), damage});
        return;
    }
    const std::size_t hash = hashOf(key);
    const std::size_t number = lines_.size() - 1;
    const auto earlier = find(key, hash);
    if (earlier != index_.end()) {
        earlier->second = number;
    } else {
        index_.emplace(hash, number);
    }
}

PropertyContent::Index::iterator PropertyContent::find(std::wstring_view key, std::size_t hash) {
    const auto [first, last] = index_.equal_range(hash);
    const auto found = std::find_if(first, last, [&](const auto& entry) {
        return PropertyText::readsAs(keyOf(lines_[entry.second]), key);
    });
    return found == last ? index_.end() : found;
}

std::string_view PropertyContent::textOf(const Line& line) const {
    return line.isWritten ? std::string_view(written_[line.begin])
                          : std::string_view(read_).substr(line.begin, line.size);
}

std::string_view PropertyContent::keyOf(const Line& line) const {
    return line.key.of(textOf(line));
}

std::string_view PropertyContent::valueOf(const Line& line) const {
    return line.value.of(textOf(line));
}

std::wstring PropertyContent::value(const std::wstring& key) {
    std::wstring value;
    const auto entry = find(key, hashOf(key));
    if (entry != index_.end()) {
        PropertyText::read(valueOf(lines_[entry->second]), value);
    }
    return value;
}

void PropertyContent::set(const std::wstring& key, std::wstring_view value) {
    const std::size_t hash = hashOf(key);
    const auto entry = find(key, hash);
    if (entry == index_.end()) {
        append(key, hash, value);
        return;
    }
    Line& line = lines_[entry->second];
    if (!PropertyText::readsAs(valueOf(line), value)) {
        change(line, value);
    }
}

// Replaces a line's value. What is before it stays as somebody has written it.
void PropertyContent::change(Line& line, std::wstring_view value) {
    std::string text(textOf(line).substr(0, line.value.start));
    text += PropertyText::escapeValue(value);
    const std::size_t valueSize = text.size() - line.value.start;
    if (line.isWritten) {
        written_[line.begin] = std::move(text);
    } else {
        written_.push_back(std::move(text));
        line.begin = written_.size() - 1;
        line.isWritten = true;
    }
    line.value.size = valueSize;
}

void PropertyContent::append(const std::wstring& key, std::size_t hash, std::wstring_view value) {
    std::string text = PropertyText::escapeKey(key) + '=';
    const std::size_t valueStart = text.size();
    text += PropertyText::escapeValue(value);
    const PropertyText::Part writtenKey{0, valueStart - 1};
    const PropertyText::Part writtenValue{valueStart, text.size() - valueStart};
    written_.push_back(std::move(text)); // without a line that leads to it, it does not count
    const auto entry = index_.emplace(hash, lines_.size());
    try {
        lines_.push_back({written_.size() - 1, 0, writtenKey, writtenValue, true, newEndSize()});
    } catch (...) {
        index_.erase(entry);
        throw;
    }
}

std::string PropertyContent::bytes() const {
    std::string bytes;
    bytes.reserve(read_.size());
    bytes.append(read_, 0, markSize_);
    for (const Line& line : lines_) {
        const std::string_view text = textOf(line);
        bytes += text;
        std::size_t endSize = line.endSize;
        // A last line without end needs one once another line follows; a carriage return at its end must not
        // become half of it.
        if (endSize == 0 && &line != &lines_.back()) {
            endSize = !text.empty() && text.back() == '\r' ? 2 : newEndSize();
        }
        bytes += ends[endSize];
    }
    return bytes;
}

// New lines end as the first one does.
unsigned char PropertyContent::newEndSize() const {
    return lines_.empty() ? 1 : std::max<unsigned char>(lines_.front().endSize, 1);
}

} // namespace TK
