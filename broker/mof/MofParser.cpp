#include "mof/MofParser.h"

#include "objects/Records.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace oxahv {

namespace {

constexpr CMPIType dataTypes[] = {CMPI_boolean, CMPI_char16, CMPI_real32, CMPI_real64,  CMPI_uint8,
                                  CMPI_uint16,  CMPI_uint32, CMPI_uint64, CMPI_sint8,   CMPI_sint16,
                                  CMPI_sint32,  CMPI_sint64, CMPI_string, CMPI_dateTime};

// Instances within instances are read on the stack.
constexpr std::size_t mostInstances = 64;

template <class Meaning>
struct Word {
    std::string_view name;
    Meaning meaning;
};

constexpr Word<unsigned int> scopeWords[] = {
    {"schema", mofScope::schema},           {"class", mofScope::classes},
    {"association", mofScope::association}, {"indication", mofScope::indication},
    {"qualifier", mofScope::qualifier},     {"property", mofScope::property},
    {"reference", mofScope::reference},     {"method", mofScope::method},
    {"parameter", mofScope::parameter},     {"any", mofScope::any},
};

constexpr Word<MofFlavour> flavourWords[] = {
    {"EnableOverride", MofFlavour::enableOverride}, {"DisableOverride", MofFlavour::disableOverride},
    {"Restricted", MofFlavour::restricted},         {"ToSubclass", MofFlavour::toSubclass},
    {"ToInstance", MofFlavour::toInstance},         {"Translatable", MofFlavour::translatable},
};

template <class Meaning, std::size_t size>
const Meaning* meaningOf(const Word<Meaning> (&words)[size], const MofToken& token) {
    const auto* const found =
        std::find_if(std::begin(words), std::end(words), [&](const Word<Meaning>& word) {
            return token.kind == MofKind::word && sameName(word.name, token.spelling);
        });
    return found != std::end(words) ? &found->meaning : nullptr;
}

// `CMPI_null` for what is no data type.
CMPIType dataTypeOf(const MofToken& token) {
    const auto* const found = std::find_if(std::begin(dataTypes), std::end(dataTypes), [&](CMPIType type) {
        return token.kind == MofKind::word && sameName(typeName(type), token.spelling);
    });
    return found != std::end(dataTypes) ? *found : static_cast<CMPIType>(CMPI_null);
}

} // namespace

std::vector<std::string> scopeNames(unsigned int scopes) {
    std::vector<std::string> names;
    for (const Word<unsigned int>& word : scopeWords) {
        const bool isAny = word.meaning == mofScope::any;
        if (isAny ? scopes == mofScope::any : scopes != mofScope::any && (scopes & word.meaning) != 0) {
            names.emplace_back(word.name);
        }
    }
    return names;
}

MofParser::MofParser(const MofSource& source) : source_(source), lexer_(source), token_(lexer_.next()) {}

void MofParser::failExpecting(const std::string& what) const {
    std::string found = "the end";
    if (token_.kind == MofKind::text) {
        found = "a text";
    } else if (token_.kind != MofKind::end) {
        found = '\'' + std::string(token_.spelling) + '\'';
    }
    source_.fail(token_.offset, "expected " + what + ", found " + found);
}

MofToken MofParser::take() {
    return std::exchange(token_, lexer_.next());
}

bool MofParser::isSymbol(char symbol) const {
    return token_.kind == MofKind::symbol && token_.spelling[0] == symbol;
}

bool MofParser::isWord(std::string_view word) const {
    return token_.kind == MofKind::word && sameName(token_.spelling, word);
}

bool MofParser::takeSymbol(char symbol) {
    const bool is = isSymbol(symbol);
    if (is) {
        take();
    }
    return is;
}

bool MofParser::takeWord(std::string_view word) {
    const bool is = isWord(word);
    if (is) {
        take();
    }
    return is;
}

void MofParser::expectSymbol(char symbol) {
    if (!takeSymbol(symbol)) {
        failExpecting(std::string("'") + symbol + '\'');
    }
}

void MofParser::expectWord(std::string_view word) {
    if (!takeWord(word)) {
        failExpecting('\'' + std::string(word) + '\'');
    }
}

MofName MofParser::readName(const char* what) {
    if (token_.kind != MofKind::word) {
        failExpecting(what);
    }
    const MofToken token = take();
    return {token.offset, std::string(token.spelling)};
}

std::optional<MofDeclaration> MofParser::next() {
    while (token_.kind != MofKind::end) {
        if (takeSymbol('#')) {
            if (std::optional<MofInclude> include = readPragma()) {
                return include;
            }
        } else if (takeWord("qualifier")) {
            return readQualifierType();
        } else {
            std::vector<MofQualifier> qualifiers = readQualifiers();
            if (takeWord("class")) {
                return readClass(std::move(qualifiers));
            }
            if (!isWord("instance")) {
                failExpecting("'class', 'instance', 'qualifier' or '#pragma'");
            }
            MofInstance instance = readInstance();
            expectSymbol(';');
            return instance;
        }
    }
    return std::nullopt;
}

// An include's file; nothing for a pragma that means nothing here.
std::optional<MofInclude> MofParser::readPragma() {
    if (!isWord("pragma")) {
        failExpecting("'pragma'");
    }
    take();
    if (token_.kind != MofKind::word) {
        failExpecting("a pragma's name");
    }
    if (!isWord("include")) {
        lexer_.skipPragma();
        take();
        return std::nullopt;
    }
    take();
    const bool hasParenthesis = takeSymbol('(');
    if (token_.kind != MofKind::text) {
        failExpecting("a file name in quotes");
    }
    MofToken file = readConstant();
    if (hasParenthesis) {
        expectSymbol(')');
    }
    return MofInclude{{file.offset, std::move(file.text)}};
}

std::string MofParser::readAlias() {
    if (!takeWord("as")) {
        return {};
    }
    if (token_.kind != MofKind::alias) {
        failExpecting("an alias such as $name");
    }
    return std::string(take().spelling);
}

MofInstance MofParser::readInstance() {
    const MofToken start = take();
    if (++depth_ > mostInstances) {
        source_.fail(start.offset,
                     "instances are nested more than " + std::to_string(mostInstances) + " deep");
    }
    MofInstance instance;
    expectWord("of");
    instance.className = readName("a class name");
    instance.alias = readAlias();
    expectSymbol('{');
    while (!takeSymbol('}')) {
        readQualifiers(); // of older versions: instances have no qualifiers any more
        MofAssignment property;
        property.name = readName("a property's name");
        expectSymbol('=');
        property.value = readValue(true);
        expectSymbol(';');
        instance.properties.push_back(std::move(property));
    }
    --depth_;
    return instance;
}

MofInstance MofParser::readOnlyInstance() {
    if (!isWord("instance")) {
        failExpecting("'instance'");
    }
    MofInstance instance = readInstance();
    takeSymbol(';');
    if (token_.kind != MofKind::end) {
        failExpecting("the end");
    }
    return instance;
}

MofQualifierType MofParser::readQualifierType() {
    MofQualifierType declared;
    declared.name = readName("a qualifier's name");
    expectSymbol(':');
    declared.type = readArraySuffix(readDataType());
    if (takeSymbol('=')) {
        declared.value = readValue();
    }
    while (takeSymbol(',')) {
        if (takeWord("scope")) {
            declared.scopes |= readScopes();
        } else if (takeWord("flavor")) {
            expectSymbol('(');
            do {
                if (!takeFlavours(declared.flavours)) {
                    failExpecting("a flavour");
                }
            } while (takeSymbol(','));
            expectSymbol(')');
        } else {
            failExpecting("'scope' or 'flavor'");
        }
    }
    if (declared.scopes == 0) {
        failExpecting("', scope'");
    }
    expectSymbol(';');
    return declared;
}

unsigned int MofParser::readScopes() {
    unsigned int scopes = 0;
    expectSymbol('(');
    do {
        const unsigned int* const scope = meaningOf(scopeWords, token_);
        if (scope == nullptr) {
            failExpecting("a scope");
        }
        scopes |= *scope;
        take();
    } while (takeSymbol(','));
    expectSymbol(')');
    return scopes;
}

bool MofParser::takeFlavours(std::vector<MofFlavour>& flavours) {
    bool any = false;
    while (const MofFlavour* const flavour = meaningOf(flavourWords, token_)) {
        flavours.push_back(*flavour);
        take();
        any = true;
    }
    return any;
}

std::vector<MofQualifier> MofParser::readQualifiers() {
    std::vector<MofQualifier> qualifiers;
    if (!takeSymbol('[')) {
        return qualifiers;
    }
    do {
        // Flavours are parted by blanks, but by commas too, as qualifiers are.
        if (qualifiers.empty() || qualifiers.back().flavours.empty() ||
            !takeFlavours(qualifiers.back().flavours)) {
            qualifiers.push_back(readQualifier());
        }
    } while (takeSymbol(','));
    expectSymbol(']');
    return qualifiers;
}

MofQualifier MofParser::readQualifier() {
    MofQualifier qualifier;
    qualifier.name = readName("a qualifier's name");
    if (isSymbol('{')) {
        qualifier.value = readValue();
    } else if (takeSymbol('(')) {
        const std::size_t offset = token_.offset;
        qualifier.value = MofValue{offset, false, {readConstant()}, {}};
        expectSymbol(')');
    }
    if (takeSymbol(':') && !takeFlavours(qualifier.flavours)) {
        failExpecting("a flavour");
    }
    return qualifier;
}

MofClass MofParser::readClass(std::vector<MofQualifier> qualifiers) {
    MofClass declared;
    declared.qualifiers = std::move(qualifiers);
    declared.name = readName("a class name");
    readAlias();
    if (takeSymbol(':')) {
        declared.superclass = readName("the superclass's name");
    }
    expectSymbol('{');
    while (!takeSymbol('}')) {
        readFeature(declared);
    }
    expectSymbol(';');
    return declared;
}

void MofParser::readFeature(MofClass& declared) {
    MofElement element = readElement();
    if (takeSymbol('(')) {
        declared.methods.push_back({std::move(element), readParameters()});
    } else {
        const std::size_t offset = token_.offset;
        element.type = readArraySuffix(element.type, &element.arraySize);
        if (element.type == (CMPI_ref | CMPI_ARRAY)) {
            source_.fail(offset, "a reference property cannot be an array");
        }
        if (takeSymbol('=')) {
            element.value = readValue();
        }
        declared.properties.push_back(std::move(element));
    }
    expectSymbol(';');
}

// Qualifiers, type and name. Any word can be a name: which ones are types, only the place tells.
MofElement MofParser::readElement() {
    MofElement element;
    element.qualifiers = readQualifiers();
    element.type = dataTypeOf(token_);
    const MofName type = readName("a type");
    if (element.type == CMPI_null) {
        if (!takeWord("ref")) {
            source_.fail(type.offset, '\'' + type.text + "' is no type, and no 'REF' follows it");
        }
        element.type = CMPI_ref;
        element.referenceClass = type.text;
    }
    element.name = readName("a name");
    return element;
}

CMPIType MofParser::readDataType() {
    const CMPIType type = dataTypeOf(token_);
    if (type == CMPI_null) {
        failExpecting("a type");
    }
    take();
    return type;
}

// The type, as an array if brackets follow, with or without a size.
CMPIType MofParser::readArraySuffix(CMPIType type, unsigned long long* size) {
    if (!takeSymbol('[')) {
        return type;
    }
    if (token_.kind == MofKind::integer) {
        if (token_.isNegative() || token_.magnitude == 0) {
            failExpecting("a size from 1 on");
        }
        if (size != nullptr) {
            *size = token_.magnitude;
        }
        take();
    }
    expectSymbol(']');
    return static_cast<CMPIType>(type | CMPI_ARRAY);
}

std::vector<MofElement> MofParser::readParameters() {
    std::vector<MofElement> parameters;
    if (takeSymbol(')')) {
        return parameters;
    }
    do {
        parameters.push_back(readElement());
        parameters.back().type = readArraySuffix(parameters.back().type, &parameters.back().arraySize);
    } while (takeSymbol(','));
    expectSymbol(')');
    return parameters;
}

MofValue MofParser::readValue(bool mayEmbed) {
    MofValue value;
    value.offset = token_.offset;
    value.isArray = takeSymbol('{');
    if (!value.isArray) {
        readElement(value, mayEmbed);
    } else if (!takeSymbol('}')) {
        do {
            readElement(value, mayEmbed);
        } while (takeSymbol(','));
        expectSymbol('}');
    }
    return value;
}

void MofParser::readElement(MofValue& value, bool mayEmbed) {
    if (mayEmbed && isWord("instance")) {
        value.constants.push_back(token_);
        value.instances.push_back(readInstance());
    } else {
        value.constants.push_back(readConstant());
    }
}

MofToken MofParser::readConstant() {
    const bool isWordConstant = isWord("true") || isWord("false") || isWord("null");
    if (token_.kind == MofKind::symbol || token_.kind == MofKind::end ||
        (token_.kind == MofKind::word && !isWordConstant)) {
        failExpecting("a value");
    }
    MofToken constant = take();
    while (constant.kind == MofKind::text && token_.kind == MofKind::text) {
        constant.text += take().text;
    }
    return constant;
}

} // namespace oxahv
