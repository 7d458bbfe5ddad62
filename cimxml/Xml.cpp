#include "Xml.h"

#include <Utf8.h>

#include <algorithm>
#include <exception>
#include <expat.h>
#include <memory>
#include <optional>

namespace cimxml {

namespace {

// No request comes near; without limits a small text becomes a large tree.
constexpr std::size_t mostDepth = 64;
constexpr std::size_t mostElements = 200'000;

class TreeBuilder {
public:
    explicit TreeBuilder(XML_Parser parser) : parser_(parser) {
        XML_SetUserData(parser, this);
        XML_SetElementHandler(parser, start, end);
        XML_SetCharacterDataHandler(parser, characters);
        XML_SetDoctypeDeclHandler(parser, doctype, nullptr);
        XML_SetSkippedEntityHandler(parser, skippedEntity);
    }

    Element build(std::string_view text) {
        const XML_Status status = XML_Parse(parser_, text.data(), static_cast<int>(text.size()), XML_TRUE);
        if (failure_) {
            std::rethrow_exception(failure_);
        }
        if (status != XML_STATUS_OK) {
            throw XmlError(XML_ErrorString(XML_GetErrorCode(parser_)) + place(), false);
        }
        return std::move(root_);
    }

private:
    std::string place() const {
        return " in line " + std::to_string(XML_GetCurrentLineNumber(parser_)) + ", column " +
               std::to_string(XML_GetCurrentColumnNumber(parser_) + 1);
    }

    // Exceptions must not pass through the parser, which is C: they wait until it has returned.
    template <class Action>
    static void run(void* self, const Action& action) {
        auto& builder = *static_cast<TreeBuilder*>(self);
        if (builder.failure_) {
            return;
        }
        try {
            action(builder);
        } catch (...) {
            builder.failure_ = std::current_exception();
            XML_StopParser(builder.parser_, XML_FALSE);
        }
    }

    static void start(void* self, const XML_Char* name, const XML_Char** attributes) {
        run(self, [&](TreeBuilder& builder) {
            if (++builder.elements_ > mostElements) {
                throw XmlError("more than " + std::to_string(mostElements) + " elements", true);
            }
            if (builder.open_.size() >= mostDepth) {
                throw XmlError("elements nested more than " + std::to_string(mostDepth) + " deep", true);
            }
            Element* element = &builder.root_;
            if (!builder.open_.empty()) {
                std::vector<Element>& siblings = builder.open_.back()->children;
                element = &siblings.emplace_back(); // moves siblings, none of which is open any more
            }
            element->name = name;
            for (; *attributes != nullptr; attributes += 2) {
                element->attributes.emplace_back(attributes[0], attributes[1]);
            }
            builder.open_.push_back(element);
        });
    }

    static void end(void* self, const XML_Char* /*name*/) {
        run(self, [](TreeBuilder& builder) { builder.open_.pop_back(); });
    }

    static void characters(void* self, const XML_Char* text, int length) {
        run(self, [&](TreeBuilder& builder) {
            builder.open_.back()->text.append(text, static_cast<std::size_t>(length));
        });
    }

    // Entities that a document declares are of no use to CIM-XML, and how they expand is a known attack.
    static void doctype(void* self, const XML_Char* /*name*/, const XML_Char* /*system*/,
                        const XML_Char* /*publicId*/, int hasInternalSubset) {
        run(self, [&](TreeBuilder& builder) {
            if (hasInternalSubset != 0) {
                throw XmlError("declarations in the document" + builder.place(), false);
            }
        });
    }

    static void skippedEntity(void* self, const XML_Char* name, int /*isParameterEntity*/) {
        run(self, [&](TreeBuilder& builder) {
            throw XmlError("unknown entity " + std::string(name) + builder.place(), false);
        });
    }

    XML_Parser parser_;
    Element root_;
    std::vector<Element*> open_; // from the root to the innermost
    std::size_t elements_ = 0;
    std::exception_ptr failure_;
};

// Whether XML 1.0 has the character.
bool isXmlCharacter(char32_t code) {
    return code == U'\t' || code == U'\n' || code == U'\r' ||
           (code >= 0x20 && code != 0xFFFE && code != 0xFFFF);
}

// The reference for a character that cannot appear as it is; null for all others. Parsers turn line ends into
// line feeds, and in attributes all white space into blanks.
const char* referenceOf(char c, bool isAttribute) {
    switch (c) {
    case '&':
        return "&amp;";
    case '<':
        return "&lt;";
    case '>':
        return "&gt;";
    case '"':
        return isAttribute ? "&quot;" : nullptr;
    case '\r':
        return "&#13;";
    case '\n':
        return isAttribute ? "&#10;" : nullptr;
    case '\t':
        return isAttribute ? "&#9;" : nullptr;
    default:
        return nullptr;
    }
}

} // namespace

const std::string* Element::find(std::string_view attribute) const {
    const auto found = std::find_if(attributes.begin(), attributes.end(),
                                    [&](const auto& candidate) { return candidate.first == attribute; });
    return found != attributes.end() ? &found->second : nullptr;
}

const Element* Element::child(std::string_view childName) const {
    const auto found = std::find_if(children.begin(), children.end(),
                                    [&](const Element& candidate) { return candidate.name == childName; });
    return found != children.end() ? &*found : nullptr;
}

std::string Element::attribute(std::string_view attributeName) const {
    const std::string* const value = find(attributeName);
    return value != nullptr ? *value : "";
}

Element parseXml(std::string_view text) {
    const std::unique_ptr<XML_ParserStruct, decltype(&XML_ParserFree)> parser(XML_ParserCreate("UTF-8"),
                                                                              XML_ParserFree);
    if (parser == nullptr) {
        throw std::bad_alloc();
    }
    return TreeBuilder(parser.get()).build(text);
}

void XmlWriter::open(const char* name, const std::vector<Attribute>& attributes) {
    text_.append("<").append(name);
    for (const auto& [attribute, value] : attributes) {
        text_.append(" ").append(attribute).append("=\"");
        append(value, true);
        text_ += '"';
    }
}

void XmlWriter::append(std::string_view characters, bool isAttribute) {
    while (!characters.empty()) {
        if (const char* const reference = referenceOf(characters.front(), isAttribute)) {
            text_ += reference;
            characters.remove_prefix(1);
            continue;
        }
        const std::string_view before = characters;
        const std::optional<char32_t> code = encoding::takeUtf8(characters);
        if (code && isXmlCharacter(*code)) {
            text_ += before.substr(0, before.size() - characters.size());
            continue;
        }
        if (!code) {
            characters.remove_prefix(1);
        }
        encoding::appendUtf8(text_, 0xFFFD);
        ++replacements_;
    }
}

} // namespace cimxml
