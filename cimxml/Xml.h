// XML as far as CIM-XML needs it: a document as a tree of elements, and elements as text. All texts are
// UTF-8.
#pragma once

#include <cstddef>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace cimxml {

using Attribute = std::pair<const char*, std::string>;

struct Element {
    std::string name;
    std::vector<std::pair<std::string, std::string>> attributes;
    std::string text; // the characters between its tags, without those of its children
    std::vector<Element> children;

    // Null when there is none.
    const std::string* find(std::string_view attribute) const;
    const Element* child(std::string_view childName) const;
    // The attribute's value; empty when there is none.
    std::string attribute(std::string_view attributeName) const;
};

// A text that is no XML document, or one that is larger than any request has to be.
class XmlError : public std::runtime_error {
public:
    XmlError(const std::string& text, bool isWellFormed)
        : std::runtime_error(text), isWellFormed_(isWellFormed) {}
    // Whether the text may be a document, which is refused for its size.
    bool isWellFormed() const { return isWellFormed_; }

private:
    bool isWellFormed_;
};

// The root element. Throws XmlError. Nothing outside the text is ever read, and no entity is declared in it.
Element parseXml(std::string_view text);

// Writes elements one after the other.
class XmlWriter {
public:
    // `content` writes what is between the tags.
    template <class Content>
    void element(const char* name, const std::vector<Attribute>& attributes, const Content& content) {
        open(name, attributes);
        text_ += '>';
        content();
        text_.append("</").append(name) += '>';
    }
    void element(const char* name, const std::vector<Attribute>& attributes) {
        open(name, attributes);
        text_ += "/>";
    }
    // Characters. What no XML 1.0 document can hold, and what is not UTF-8, becomes U+FFFD.
    void text(std::string_view characters) { append(characters, false); }
    // Elements that have been written already.
    void raw(std::string_view elements) { text_ += elements; }

    const std::string& written() const { return text_; }
    // How many characters have become U+FFFD.
    std::size_t replacements() const { return replacements_; }

private:
    void open(const char* name, const std::vector<Attribute>& attributes);
    void append(std::string_view characters, bool isAttribute);

    std::string text_;
    std::size_t replacements_ = 0;
};

} // namespace cimxml
