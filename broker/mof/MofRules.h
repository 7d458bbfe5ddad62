// What DSP0004 asks of classes beyond their grammar and beyond what the broker needs of them.
#pragma once

#include "classes/DeclaredClass.h"
#include "mof/MofParser.h"

#include <functional>
#include <string>

namespace oxahv {

// Looks at one class, which is declared already.
class MofRules {
public:
    // Is told what breaks a rule, and where in the text.
    using Report = std::function<void(std::size_t offset, const std::string& message)>;

    // Keeps the references.
    MofRules(const Declarations& declarations, const MofSource& source, const MofClass& written,
             const Report& report);

    void check();

private:
    void checkQualifiers(const std::vector<MofQualifier>& qualifiers, unsigned int scopes,
                         const Qualifiers& own, const Qualifiers* inherited);
    void checkKnown(const MofQualifier& qualifier, unsigned int scopes);
    void checkValue(const MofQualifier& qualifier, CMPIType type);
    void checkChange(const MofQualifier& qualifier, const Qualifiers& own, const Qualifiers& inherited);
    void checkProperty(const MofElement& property);
    void checkMethod(const MofMethod& method);
    void checkOverride(const MofElement& element, const char* kind, bool isInherited);
    void checkKey(const MofElement& property, const PropertyDeclaration* inherited);
    void checkReference(const MofElement& reference, const PropertyDeclaration* inherited);
    void checkParameters(const MofMethod& method, const MethodDeclaration* inherited);
    void checkElement(const MofElement& element);
    void checkEnds();

    const Declarations& declarations_;
    const MofSource& source_;
    const MofClass& written_;
    const Report& report_;
    std::shared_ptr<const DeclaredClass> declared_;
    const DeclaredClass* superclass_; // null when there is none
    unsigned int scopes_;             // of the class
};

} // namespace oxahv
