// From MOF to declarations: reads files, follows includes, and gives what is written its meaning.
#pragma once

#include "classes/Classes.h"
#include "mof/MofParser.h"

#include <cstddef>
#include <filesystem>
#include <vector>

namespace oxahv {

// Adds to declarations; one that has thrown has added some of them. Throws BrokerError,
// `file:line:column: message`.
class MofCompiler {
public:
    // Keeps the reference. A strict one throws at what it would else collect.
    explicit MofCompiler(Declarations& declarations, const MofOptions& options = {});

    void compileFile(const std::string& file);
    void compileText(const std::string& text, const std::string& name);
    std::vector<MofWarning> takeWarnings() { return std::move(warnings_); }

private:
    void compile(const MofSource& source);
    void compileFile(const std::filesystem::path& file, const MofSource& asker, std::size_t offset);

    void declare(const MofSource& source, const MofClass& declared);
    void declare(const MofSource& source, const MofQualifierType& declared);
    void declare(const MofSource& source, const MofInclude& include);
    void declare(const MofSource& source, const MofInstance& instance);

    void checkRules(const MofSource& source, const MofClass& declared);
    unsigned int scopesOf(const MofClass& declared) const;
    PropertyDeclaration propertyOf(const MofSource& source, const MofElement& element) const;
    MethodDeclaration methodOf(const MofSource& source, const MofMethod& method) const;
    Qualifiers qualifiersOf(const MofSource& source, const std::vector<MofQualifier>& qualifiers,
                            unsigned int scopes, const char* element) const;
    QualifierDeclaration qualifierOf(const MofSource& source, const MofQualifier& qualifier,
                                     unsigned int scopes, const char* element) const;

    Declarations& declarations_;
    MofOptions options_;
    std::vector<MofWarning> warnings_;
    std::vector<std::filesystem::path>
        open_;             // the files that are being read, each included by the one before
    std::size_t size_ = 0; // of all texts so far
    std::size_t files_ = 0;
};

} // namespace oxahv
