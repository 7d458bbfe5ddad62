#include "drafts/Code.h"

#include <Utf8.h>

#include <algorithm>
#include <utility>

namespace oxahv::runner {

namespace {

constexpr std::size_t limit = 110;
constexpr std::size_t indentWidth = 4;

std::string blanks(std::size_t count) {
    return std::string(count, ' ');
}

std::string joined(const std::vector<std::string>& items) {
    std::string text;
    for (const std::string& item : items) {
        text += (text.empty() ? "" : ", ") + item;
    }
    return text;
}

// Puts items into lines, as many into each as fit.
class Lines {
public:
    Lines(std::string start, std::size_t indent) : text_(std::move(start)), indent_(indent) {}

    // `tail` is the comma or what ends all.
    void add(const std::string& item, const std::string& tail) {
        const std::size_t size = item.size() + tail.size();
        if (!isFirst_ && column() + 1 + size <= limit) {
            text_ += ' ';
        } else if (!isFirst_) {
            breakLine();
        }
        text_ += item + tail;
        isFirst_ = false;
    }
    void breakLine() { text_ += '\n' + blanks(indent_); }
    std::size_t column() const { return text_.size() - (text_.rfind('\n') + 1); }
    std::string& text() { return text_; }

private:
    std::string text_;
    std::size_t indent_;
    bool isFirst_ = true;
};

bool fits(std::size_t indent, const Enclosed& parts) {
    const std::size_t last = parts.items.size() - 1;
    for (std::size_t i = 0; i <= last; ++i) {
        const bool isEnd = i == last && parts.list.empty();
        if (indent + parts.items[i].size() + (isEnd ? parts.tail.size() : 1) > limit) {
            return false;
        }
    }
    return true;
}

std::string joined(const std::vector<Listed>& list) {
    std::vector<std::string> texts;
    for (const Listed& item : list) {
        texts.push_back(item.text);
    }
    return '{' + joined(texts) + '}';
}

void addList(Lines& lines, std::size_t indent, const Enclosed& parts) {
    const std::string whole = joined(parts.list);
    if (indent + whole.size() + parts.tail.size() <= limit) {
        lines.add(whole, parts.tail);
        return;
    }
    std::vector<std::string> texts;
    std::size_t widest = 0;
    for (const Listed& item : parts.list) {
        const bool isLast = &item == &parts.list.back();
        texts.push_back((texts.empty() ? "{" : " ") + item.text + (isLast ? '}' + parts.tail : ","));
        widest = std::max(widest, texts.back().size());
    }
    for (std::size_t i = 0; i < texts.size(); ++i) {
        lines.breakLine();
        lines.text() += texts[i] + blanks(widest - texts[i].size()) + " // " + parts.list[i].comment;
    }
}

bool isPlain(char32_t code) {
    // Marks that change the direction of writing, and others that are not seen.
    const bool isUnseen = (code >= 0x200B && code <= 0x206F) || code == 0xAD || code == 0xFEFF;
    return !encoding::isControl(code) && !isUnseen;
}

// The text with single blanks for all white space; empty when it has characters that a comment should not
// have.
std::string onOneLine(std::string_view text) {
    std::string line;
    while (!text.empty()) {
        const std::string_view before = text;
        const auto code = encoding::takeUtf8(text);
        if (code && (*code == ' ' || *code == '\t' || *code == '\n' || *code == '\r')) {
            line += line.empty() || line.back() == ' ' ? "" : " ";
        } else if (!code || !isPlain(*code)) {
            return {};
        } else {
            line.append(before.substr(0, before.size() - text.size()));
        }
    }
    if (!line.empty() && line.back() == ' ') {
        line.pop_back();
    }
    return line;
}

std::vector<std::string> allItems(const Enclosed& parts) {
    std::vector<std::string> items = parts.items;
    if (!parts.list.empty()) {
        items.push_back(joined(parts.list));
    }
    return items;
}

// The items in lines that begin in a column, behind what the first line starts with.
std::string broken(const std::string& start, std::size_t column, const Enclosed& parts) {
    Lines lines(start, column);
    for (const std::string& item : parts.items) {
        const bool isEnd = &item == &parts.items.back() && parts.list.empty();
        lines.add(item, isEnd ? parts.tail : ",");
    }
    if (!parts.list.empty()) {
        addList(lines, column, parts);
    }
    return lines.text();
}

std::ptrdiff_t lineEnds(const std::string& text) {
    return std::count(text.begin(), text.end(), '\n');
}

// The size of the first sentence; 0 when there is but one. "e.g." ends none.
std::size_t endOfSentence(const std::string& line) {
    for (std::size_t end = line.find(". "); end != std::string::npos; end = line.find(". ", end + 1)) {
        if (end < 2 || line[end - 2] != '.') {
            return end + 1;
        }
    }
    return 0;
}

} // namespace

std::string enclosed(std::size_t indent, const Enclosed& parts) {
    const std::string start = blanks(indent) + parts.head;
    const std::string line = start + joined(allItems(parts)) + parts.tail;
    if (line.size() <= limit) {
        return line;
    }
    const std::string aligned = broken(start, start.size(), parts);
    const std::size_t column = indent + indentWidth;
    const std::string indented = broken(start + '\n' + blanks(column), column, parts);
    // clang-format weighs breaks: one after a parenthesis against those between items.
    const std::ptrdiff_t weight = parts.tail.back() == '{' ? 6 : 2;
    return fits(start.size(), parts) && lineEnds(aligned) <= lineEnds(indented) - 1 + weight ? aligned
                                                                                             : indented;
}

std::string memberFunction(std::size_t indent, const Enclosed& signature,
                           const std::vector<std::string>& body) {
    const bool isComment = !body.empty() && body[0].compare(0, 2, "//") == 0;
    if (body.size() == 1 && !isComment) {
        std::string line =
            blanks(indent) + signature.head + joined(signature.items) + signature.tail + ' ' + body[0] + " }";
        if (line.size() <= limit && line.find('\n') == std::string::npos) {
            return line + '\n';
        }
    }
    std::string text = enclosed(indent, signature) + '\n';
    for (const std::string& statement : body) {
        text += blanks(indent + indentWidth) + statement + '\n';
    }
    return text + blanks(indent) + "}\n";
}

std::string comment(std::size_t indent, std::string_view text) {
    std::string line = onOneLine(text);
    const std::size_t most = limit - indent - 3;
    if (line.size() > most) {
        line.resize(endOfSentence(line));
    }
    // A backslash at the end would make the next line a comment, too.
    const bool isMistakable =
        line.compare(0, 12, "clang-format") == 0 || line.find("\?\?/") != std::string::npos;
    if (line.empty() || line.size() > most || line.back() == '\\' || isMistakable) {
        return {};
    }
    return blanks(indent) + "// " + line + '\n';
}

std::string textLiteral(std::string_view text) {
    std::string literal = "\"";
    for (const char c : text) {
        literal += c == '"' || c == '\\' || c == '?' ? std::string("\\") + c : std::string(1, c);
    }
    return literal + '"';
}

} // namespace oxahv::runner
