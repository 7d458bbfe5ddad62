#include "mof/MofCompiler.h"

#include "mof/MofRules.h"
#include "mof/MofValues.h"

#include <Utf8.h>

#include <algorithm>
#include <fstream>

namespace oxahv {

namespace {

// A text that includes this much is a mistake, or meant to harm.
constexpr std::size_t maximalSize = 256UL * 1024 * 1024;
constexpr std::size_t maximalFiles = 20000;
constexpr std::size_t maximalDepth = 64;
constexpr std::size_t mostWarnings = 1000;

// The qualifiers that the broker heeds, and those that stay with their class, as CIM declares them: they mean
// the same in a text that does not bring their declarations.
struct StandardQualifier {
    const char* name;
    unsigned int scopes;
    CMPIType type;
    bool reachesSubclass;
};
constexpr unsigned int classScopes = mofScope::classes | mofScope::association | mofScope::indication;
constexpr StandardQualifier standardQualifiers[] = {
    {"Abstract", classScopes, CMPI_boolean, false},
    {"Association", mofScope::association, CMPI_boolean, true},
    {"Deprecated", mofScope::any, CMPI_stringA, false},
    {"Experimental", mofScope::any, CMPI_boolean, false},
    {"In", mofScope::parameter, CMPI_boolean, true},
    {"Indication", mofScope::classes | mofScope::indication, CMPI_boolean, true},
    {"Key", mofScope::property | mofScope::reference, CMPI_boolean, true},
    {"Out", mofScope::parameter, CMPI_boolean, true},
    {"Override", mofScope::property | mofScope::method | mofScope::reference, CMPI_string, false},
    {"Version", classScopes | mofScope::schema, CMPI_string, false},
};

// What a qualifier has that names no value.
DeclaredValue impliedValue(CMPIType type) {
    if (type == CMPI_boolean) {
        return {type, false, {PlainValue(true)}};
    }
    return {type, (type & CMPI_ARRAY) == 0, {}};
}

void apply(const std::vector<MofFlavour>& flavours, QualifierDeclaration& qualifier) {
    for (const MofFlavour flavour : flavours) {
        switch (flavour) {
        case MofFlavour::enableOverride:
        case MofFlavour::disableOverride:
            qualifier.isOverridable = flavour == MofFlavour::enableOverride;
            break;
        case MofFlavour::toSubclass:
        case MofFlavour::restricted:
            qualifier.reachesSubclass = flavour == MofFlavour::toSubclass;
            break;
        case MofFlavour::translatable:
            qualifier.isTranslatable = true;
            break;
        case MofFlavour::toInstance: // of older versions: instances have no qualifiers any more
            break;
        }
    }
}

std::string withoutMark(std::string text) {
    if (text.compare(0, encoding::byteOrderMark.size(), encoding::byteOrderMark) == 0) {
        text.erase(0, encoding::byteOrderMark.size());
    }
    return text;
}

using QualifierIterator = std::vector<MofQualifier>::const_iterator;

bool isNamed(QualifierIterator begin, QualifierIterator end, std::string_view name) {
    return std::any_of(begin, end, [&](const MofQualifier& q) { return sameName(q.name.text, name); });
}

// The place in the text that an error is about.
std::size_t placeOf(const DeclarationError& error, const MofClass& declared) {
    switch (error.part()) {
    case DeclarationError::Part::superclass:
        return declared.superclass.offset;
    case DeclarationError::Part::property:
        return declared.properties[error.index()].name.offset;
    case DeclarationError::Part::method:
        return declared.methods[error.index()].name.offset;
    case DeclarationError::Part::parameter:
        return declared.methods[error.index()].parameters[error.parameter()].name.offset;
    default:
        return declared.name.offset;
    }
}

} // namespace

MofCompiler::MofCompiler(Declarations& declarations, const MofOptions& options)
    : declarations_(declarations), options_(options) {
    for (const StandardQualifier& standard : standardQualifiers) {
        if (declarations_.findQualifier(standard.name) == nullptr) {
            QualifierDeclaration implied{standard.name, impliedValue(standard.type)};
            implied.reachesSubclass = standard.reachesSubclass;
            declarations_.declare({standard.scopes, std::move(implied)});
        }
    }
}

void MofCompiler::compileFile(const std::string& file) {
    compileFile(file, {file, {}}, 0);
}

void MofCompiler::compileText(const std::string& text, const std::string& name) {
    size_ += text.size();
    compile({name, withoutMark(text)});
}

// What hinders it from being read is reported at a place of the text that asks for it.
void MofCompiler::compileFile(const std::filesystem::path& file, const MofSource& asker, std::size_t offset) {
    std::error_code error;
    const std::filesystem::path place = std::filesystem::canonical(file, error);
    const bool isRegular = !error && std::filesystem::is_regular_file(place, error);
    const auto size = isRegular ? std::filesystem::file_size(place, error) : 0;
    if (error) {
        asker.fail(offset, "cannot read " + file.string() + ": " + error.message());
    }
    if (!isRegular) {
        asker.fail(offset, "cannot read " + file.string() + ": it is no regular file");
    }
    if (std::find(open_.begin(), open_.end(), place) != open_.end()) {
        asker.fail(offset, file.string() + " includes itself");
    }
    if (open_.size() == maximalDepth) {
        asker.fail(offset, "includes are nested more than " + std::to_string(maximalDepth) + " deep");
    }
    if (++files_ > maximalFiles || size + size_ > maximalSize) {
        asker.fail(offset, "there is more to read than " + std::to_string(maximalFiles) + " files or " +
                               std::to_string(maximalSize) + " bytes");
    }
    std::string text(size, '\0');
    std::ifstream stream(place, std::ios::binary);
    if (!stream.read(text.data(), static_cast<std::streamsize>(size))) {
        asker.fail(offset, "cannot read " + file.string());
    }
    size_ += size;
    open_.push_back(place);
    compile({file.string(), withoutMark(std::move(text))});
    open_.pop_back();
}

void MofCompiler::compile(const MofSource& source) {
    MofParser parser(source);
    while (const std::optional<MofDeclaration> declaration = parser.next()) {
        std::visit([&](const auto& declared) { declare(source, declared); }, *declaration);
    }
}

void MofCompiler::declare(const MofSource& source, const MofInclude& include) {
    const std::filesystem::path file = std::filesystem::path(source.name).parent_path() / include.file.text;
    compileFile(file, source, include.file.offset);
}

// Nobody keeps instances.
void MofCompiler::declare(const MofSource& /*source*/, const MofInstance& /*instance*/) {}

void MofCompiler::declare(const MofSource& source, const MofQualifierType& declared) {
    QualifierType type{declared.scopes, {declared.name.text, impliedValue(declared.type)}};
    if (declared.value) { // what a used qualifier without value has does not depend on it
        type.defaultValue = mofValueOf(source, *declared.value, declared.type);
    }
    apply(declared.flavours, type.implied);
    declarations_.declare(std::move(type));
}

void MofCompiler::declare(const MofSource& source, const MofClass& declared) {
    ClassDeclaration declaration(declared.name.text);
    declaration.superclass(declared.superclass.text);
    declaration.qualifiers(qualifiersOf(source, declared.qualifiers, scopesOf(declared), "class"));
    for (const MofElement& property : declared.properties) {
        declaration.property(propertyOf(source, property));
    }
    for (const MofMethod& method : declared.methods) {
        declaration.method(methodOf(source, method));
    }
    try {
        declarations_.declare(declaration);
    } catch (const DeclarationError& error) {
        source.fail(placeOf(error, declared), error.what());
    }
    checkRules(source, declared);
}

void MofCompiler::checkRules(const MofSource& source, const MofClass& declared) {
    const MofRules::Report report = [&](std::size_t offset, const std::string& message) {
        if (options_.isStrict) {
            source.fail(offset, message);
        }
        if (warnings_.size() < mostWarnings) { // each counts the lines before it
            const MofSource::Place place = source.placeOf(offset);
            warnings_.push_back({source.name, place.line, place.column, message});
        }
    };
    MofRules(declarations_, source, declared, report).check();
}

// An association is a class too, and so is an indication; what a class derives from decides as well.
unsigned int MofCompiler::scopesOf(const MofClass& declared) const {
    const auto superclass = declarations_.find(declared.superclass.text);
    const auto is = [&](std::string_view name) {
        return isNamed(declared.qualifiers.begin(), declared.qualifiers.end(), name) ||
               (superclass != nullptr && superclass->qualifiers.isTrue(name));
    };
    return mofScope::classes | (is("Association") ? mofScope::association : 0U) |
           (is("Indication") ? mofScope::indication : 0U);
}

PropertyDeclaration MofCompiler::propertyOf(const MofSource& source, const MofElement& element) const {
    const bool isReference = element.type == CMPI_ref;
    PropertyDeclaration property{element.name.text, element.type};
    property.referenceClass = element.referenceClass;
    property.qualifiers = qualifiersOf(source, element.qualifiers,
                                       mofScope::property | (isReference ? mofScope::reference : 0U),
                                       isReference ? "reference" : "property");
    if (element.value) {
        property.defaultValue = mofValueOf(source, *element.value, element.type);
    }
    return property;
}

MethodDeclaration MofCompiler::methodOf(const MofSource& source, const MofMethod& method) const {
    MethodDeclaration result{method.name.text, method.type, {}, method.referenceClass};
    result.qualifiers = qualifiersOf(source, method.qualifiers, mofScope::method, "method");
    for (const MofElement& element : method.parameters) {
        ParameterDeclaration parameter{element.name.text, element.type};
        parameter.referenceClass = element.referenceClass;
        const bool isReference = !element.referenceClass.empty();
        parameter.qualifiers =
            qualifiersOf(source, element.qualifiers,
                         mofScope::parameter | (isReference ? mofScope::reference : 0U), "parameter");
        result.parameters.push_back(std::move(parameter));
    }
    return result;
}

Qualifiers MofCompiler::qualifiersOf(const MofSource& source, const std::vector<MofQualifier>& qualifiers,
                                     unsigned int scopes, const char* element) const {
    std::vector<QualifierDeclaration> result;
    for (auto qualifier = qualifiers.begin(); qualifier != qualifiers.end(); ++qualifier) {
        if (isNamed(qualifiers.begin(), qualifier, qualifier->name.text)) {
            source.fail(qualifier->name.offset, "qualifier " + qualifier->name.text + " stands twice");
        }
        result.push_back(qualifierOf(source, *qualifier, scopes, element));
    }
    return Qualifiers(std::move(result));
}

// Where nobody has declared the qualifier's type, its value tells it.
QualifierDeclaration MofCompiler::qualifierOf(const MofSource& source, const MofQualifier& qualifier,
                                              unsigned int scopes, const char* element) const {
    const QualifierType* const type = declarations_.findQualifier(qualifier.name.text);
    if (type != nullptr && (type->scopes & scopes) == 0) {
        source.fail(qualifier.name.offset,
                    "qualifier " + qualifier.name.text + " cannot stand on a " + element);
    }
    QualifierDeclaration result{qualifier.name.text, impliedValue(CMPI_boolean)};
    if (type != nullptr) {
        result = type->implied;
        result.name = qualifier.name.text;
    }
    if (qualifier.value) {
        result.value = mofValueOf(source, *qualifier.value,
                                  type != nullptr ? result.value.type : mofTypeOf(*qualifier.value));
    }
    apply(qualifier.flavours, result);
    return result;
}

} // namespace oxahv
