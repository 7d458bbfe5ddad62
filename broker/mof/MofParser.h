// The grammar of MOF: from words to a tree of what is written, not yet of what it means.
#pragma once

#include "Declarations.h"
#include "mof/MofLexer.h"

#include <optional>
#include <string>
#include <variant>
#include <vector>

namespace oxahv {

struct MofName {
    std::size_t offset = 0;
    std::string text;
};

struct MofInstance;

// A value: its constants, where adjacent texts are one. A constant that is the word `instance` is the next of
// the instances.
struct MofValue {
    std::size_t offset = 0;
    bool isArray = false;
    std::vector<MofToken> constants;
    std::vector<MofInstance> instances;
};

struct MofAssignment {
    MofName name;
    MofValue value;
};

struct MofInstance {
    MofName className;
    std::string alias; // with its dollar sign; empty when there is none
    std::vector<MofAssignment> properties;
};

enum class MofFlavour { enableOverride, disableOverride, restricted, toSubclass, toInstance, translatable };

struct MofQualifier {
    MofName name;
    std::optional<MofValue> value;
    std::vector<MofFlavour> flavours;
};

// A property, a parameter, or a method without its parameters.
struct MofElement {
    std::vector<MofQualifier> qualifiers;
    CMPIType type = CMPI_null;  // with `CMPI_ARRAY`
    std::string referenceClass; // of a reference
    MofName name;
    std::optional<MofValue> value;
    unsigned long long arraySize = 0; // 0: any
};

struct MofMethod : MofElement {
    std::vector<MofElement> parameters;
};

struct MofClass {
    std::vector<MofQualifier> qualifiers;
    MofName name;
    MofName superclass; // empty when there is none
    std::vector<MofElement> properties;
    std::vector<MofMethod> methods;
};

// Where a qualifier may stand: bits that are combined.
namespace mofScope {
constexpr unsigned int schema = 1U << 0U;
constexpr unsigned int classes = 1U << 1U;
constexpr unsigned int association = 1U << 2U;
constexpr unsigned int indication = 1U << 3U;
constexpr unsigned int qualifier = 1U << 4U;
constexpr unsigned int property = 1U << 5U;
constexpr unsigned int reference = 1U << 6U;
constexpr unsigned int method = 1U << 7U;
constexpr unsigned int parameter = 1U << 8U;
constexpr unsigned int any = (1U << 9U) - 1U;
} // namespace mofScope

// The names of scopes in MOF; "any" alone for all of them.
std::vector<std::string> scopeNames(unsigned int scopes);

struct MofQualifierType {
    MofName name;
    CMPIType type = CMPI_null; // with `CMPI_ARRAY`
    std::optional<MofValue> value;
    unsigned int scopes = 0;
    std::vector<MofFlavour> flavours;
};

struct MofInclude {
    MofName file;
};

using MofDeclaration = std::variant<MofClass, MofQualifierType, MofInclude, MofInstance>;

class MofParser {
public:
    // Keeps the reference.
    explicit MofParser(const MofSource& source);

    // The next declaration; nothing behind the last one. Throws BrokerError.
    std::optional<MofDeclaration> next();
    // A text that is one instance, with or without a semicolon at its end. Throws BrokerError.
    MofInstance readOnlyInstance();

private:
    [[noreturn]] void failExpecting(const std::string& what) const;
    MofToken take();
    bool isSymbol(char symbol) const;
    bool isWord(std::string_view word) const;
    bool takeSymbol(char symbol);
    bool takeWord(std::string_view word);
    void expectSymbol(char symbol);
    void expectWord(std::string_view word);
    MofName readName(const char* what);

    std::optional<MofInclude> readPragma();
    std::string readAlias();
    MofInstance readInstance();
    MofQualifierType readQualifierType();
    unsigned int readScopes();
    bool takeFlavours(std::vector<MofFlavour>& flavours);
    std::vector<MofQualifier> readQualifiers();
    MofQualifier readQualifier();
    MofClass readClass(std::vector<MofQualifier> qualifiers);
    void readFeature(MofClass& declared);
    MofElement readElement();
    CMPIType readDataType();
    CMPIType readArraySuffix(CMPIType type, unsigned long long* size = nullptr);
    std::vector<MofElement> readParameters();
    MofValue readValue(bool mayEmbed = false);
    MofToken readConstant();
    void readElement(MofValue& value, bool mayEmbed);

    const MofSource& source_;
    MofLexer lexer_;
    MofToken token_;        // the one that is looked at, not taken yet
    std::size_t depth_ = 0; // of instances within each other
};

} // namespace oxahv
