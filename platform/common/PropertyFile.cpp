#include "PropertyFile.h"

#include "PropertyText.h"
#include "Utf8.h"
#include "WholeFile.h"

#include <algorithm>
#include <string_view>
#include <utility>

namespace TK {

PropertyFile::PropertyFile() = default;

PropertyFile::PropertyFile(std::string path) : path_(std::move(path)) {
    load();
}

PropertyFile::~PropertyFile() = default;

std::wstring PropertyFile::getEntry(const std::wstring& key) {
    const auto entry = content_.entries.find(key);
    return entry == content_.entries.end() ? std::wstring() : entry->second.value;
}

void PropertyFile::setEntry(const std::wstring& key, const std::wstring& value) {
    std::wstring kept = value.substr(0, value.find(L'\0'));
    std::string escapedValue = PropertyText::escapeValue(kept);
    const auto existing = content_.entries.find(key);
    if (existing != content_.entries.end()) {
        Entry& entry = existing->second;
        if (entry.value == kept) {
            return;
        }
        // What stands before the value stays as somebody has written it.
        std::string& text = content_.lines[entry.line].text;
        text = text.substr(0, entry.valueStart) + escapedValue;
        entry.value = std::move(kept);
        return;
    }
    std::string text = PropertyText::escapeKey(key) + '=';
    const std::size_t valueStart = text.size();
    text += escapedValue;
    const auto added =
        content_.entries.emplace(key, Entry{content_.lines.size(), valueStart, std::move(kept)}).first;
    try {
        content_.lines.push_back({std::move(text), lineEnd()});
    } catch (...) {
        content_.entries.erase(added);
        throw;
    }
}

void PropertyFile::load() {
    if (!path_.empty()) {
        content_ = parse(WholeFile::read(path_));
    }
}

void PropertyFile::save() {
    if (!path_.empty()) {
        WholeFile::replace(path_, bytes());
    }
}

const std::vector<PropertyFile::DamagedLine>& PropertyFile::damagedLines() const {
    return content_.damaged;
}

PropertyFile::Content PropertyFile::parse(const std::string& bytes) {
    Content content;
    std::string_view rest = bytes;
    if (rest.substr(0, encoding::byteOrderMark.size()) == encoding::byteOrderMark) {
        content.mark = encoding::byteOrderMark;
        rest.remove_prefix(encoding::byteOrderMark.size());
    }
    while (!rest.empty()) {
        const std::size_t size = std::min(rest.find('\n'), rest.size() - 1) + 1;
        std::string_view text = rest.substr(0, size);
        std::string_view end;
        for (const std::string_view candidate : {"\r\n", "\n"}) {
            if (end.empty() && text.size() >= candidate.size() &&
                text.substr(text.size() - candidate.size()) == candidate) {
                end = candidate;
            }
        }
        text.remove_suffix(end.size());
        rest.remove_prefix(size);
        PropertyText::Line line = PropertyText::parse(text);
        const std::size_t index = content.lines.size();
        if (line.damage != nullptr) {
            content.damaged.push_back({index + 1, line.damage});
        } else if (line.isEntry) {
            content.entries.insert_or_assign(std::move(line.key),
                                             Entry{index, line.valueStart, std::move(line.value)});
        }
        content.lines.push_back({std::string(text), std::string(end)});
    }
    return content;
}

std::string PropertyFile::bytes() const {
    std::string bytes = content_.mark;
    for (const Line& line : content_.lines) {
        bytes += line.text;
        bytes += line.end;
        // A last line without end needs one when it is the last no more; a carriage return in its place must
        // not become half of it.
        if (line.end.empty() && &line != &content_.lines.back()) {
            bytes += !line.text.empty() && line.text.back() == '\r' ? "\r\n" : lineEnd();
        }
    }
    return bytes;
}

std::string PropertyFile::lineEnd() const {
    return content_.lines.empty() || content_.lines.front().end.empty() ? "\n" : content_.lines.front().end;
}

} // namespace TK
