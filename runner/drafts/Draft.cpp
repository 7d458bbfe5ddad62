#include "drafts/Draft.h"

#include "drafts/Mof.h"
#include "drafts/Sources.h"
#include "drafts/Template.h"

#include <algorithm>
#include <iostream>
#include <map>
#include <stdexcept>

namespace oxahv::runner {

namespace {

namespace fs = std::filesystem;

// In the texts of several files, none of which has a quote for it.
void requirePlain(const std::string& nameSpace) {
    const char* const allowed = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_/-.";
    if (nameSpace.empty() || nameSpace.find_first_not_of(allowed) != std::string::npos) {
        throw std::runtime_error("a registration cannot name the namespace '" + nameSpace + '\'');
    }
}

struct Kind {
    const char* word;
    const char* number; // in the form of instances
};

std::vector<Kind> kindsOf(const DraftClass& drafted) {
    std::vector<Kind> kinds = {{"instance", "2"}};
    if (drafted.isAssociation) {
        kinds.push_back({"association", "3"});
    }
    if (drafted.hasMethods) {
        kinds.push_back({"method", "5"});
    }
    return kinds;
}

std::string listed(const std::vector<Kind>& kinds, const char* Kind::*member, const char* separator) {
    std::string text;
    for (const Kind& kind : kinds) {
        text += (text.empty() ? "" : separator) + std::string(kind.*member);
    }
    return text;
}

constexpr const char* section = R"([@CLASS@]
    provider: @PROVIDER@
    location: @PROVIDER@
    type: @WORDS@
    unload: never
    namespace: @NAMESPACE@
)";

constexpr const char* capabilities = R"(
instance of PG_ProviderCapabilities {
    ProviderModuleName = "@PROVIDER@Module";
    ProviderName = "@PROVIDER@";
    CapabilityID = "@ID@";
    ClassName = "@CLASS@";
    Namespaces = {"@NAMESPACE@"};
    ProviderType = {@NUMBERS@};
};)";

using Values = std::map<std::string, std::string>;

void addRegistrations(const DraftProvider& provider, Values& values) {
    std::size_t id = 0;
    for (const DraftClass& drafted : provider.classes) {
        const std::vector<Kind> kinds = kindsOf(drafted);
        const Values ofClass = {{"CLASS", drafted.name},
                                {"PROVIDER", provider.name},
                                {"NAMESPACE", provider.nameSpace},
                                {"ID", std::to_string(++id)},
                                {"WORDS", listed(kinds, &Kind::word, " ")},
                                {"NUMBERS", listed(kinds, &Kind::number, ", ")}};
        values["SECTIONS"] += (id > 1 ? "\n" : "") + filled(section, ofClass);
        values["CAPABILITIES"] += (id > 1 ? "\n" : "") + filled(capabilities, ofClass);
    }
    values["SECTIONS"].pop_back();
}

void addClasses(const DraftProvider& provider, Values& values) {
    values["FIRST_CLASS"] = provider.classes[0].name;
    for (const DraftClass& drafted : provider.classes) {
        const bool isFirst = &drafted == &provider.classes.front();
        const bool isLast = &drafted == &provider.classes.back();
        values["CLASS_LIST"] += (isFirst ? "" : isLast ? " and " : ", ") + drafted.name;
        const std::string lineEnd = isFirst ? "" : "\n";
        values["EXPECT_NAMES"] += lineEnd + "    expectEveryName(\"" + drafted.name + "\");";
        values["EXPECT_FAILURES"] += lineEnd + "    expectFailure(\"" + drafted.name + "\");";
        values["CLASS_OPTIONS"] += lineEnd + "            --class " + drafted.name;
    }
}

void addMof(const std::vector<NewFile>& mofFiles, Values& values) {
    for (const NewFile& mof : mofFiles) {
        const std::string lineEnd = &mof == &mofFiles.front() ? "" : "\n";
        values["COMPILE_MOF"] += lineEnd + "        broker.compileMof(MOF_FOLDER \"/" + mof.name + "\");";
        values["MOF_OPTIONS"] += lineEnd + "        --mof ${CMAKE_CURRENT_SOURCE_DIR}/" + mof.name;
        values["MOF_WORDS"] += (lineEnd.empty() ? "--mof " : " --mof ") + mof.name;
    }
}

struct Generated {
    const char* suffix; // after the provider's name, or the whole name
    const char* fromTemplate;
    bool isNamedAfterProvider = true;
};
constexpr Generated generated[] = {{"CMakeLists.txt", "CMakeLists.txt", false},
                                   {"README.md", "README.md", false},
                                   {"Test.cpp", "ProviderTest.cpp"},
                                   {".reg", "Registration.reg"},
                                   {"Registration.mof", "Registration.mof"}};

std::vector<NewFile> filesOf(const EmbeddedBroker& broker, const DraftProvider& provider,
                             const std::vector<std::string>& mofFiles, const fs::path& folder) {
    std::vector<NewFile> files = {{provider.name + ".cpp", providerSource(broker, provider)},
                                  {"Classes.h", classesHeader(provider)}};
    std::vector<std::string> taken = {files[0].name, files[1].name};
    for (const Generated& file : generated) {
        taken.push_back((file.isNamedAfterProvider ? provider.name : "") + file.suffix);
    }
    const std::vector<NewFile> mof = mofOf(mofFiles, folder, taken);
    Values values = {{"PROVIDER", provider.name}, {"NAMESPACE", provider.nameSpace}};
    addRegistrations(provider, values);
    addClasses(provider, values);
    addMof(mof, values);
    for (const Generated& file : generated) {
        files.push_back({(file.isNamedAfterProvider ? provider.name : "") + file.suffix,
                         filled(templateText(file.fromTemplate), values)});
    }
    files.insert(files.end(), mof.begin(), mof.end());
    return files;
}

} // namespace

int runNew(const Options& options, const DraftOptions& draftOptions) {
    if (options.mofFiles.empty()) {
        throw std::runtime_error("--mof is required: it declares the classes");
    }
    requirePlain(options.nameSpace);
    EmbeddedBroker broker;
    for (const std::string& file : options.mofFiles) {
        broker.compileMof(file);
    }
    const DraftProvider provider =
        draftProvider(broker, draftOptions.classes, draftOptions.provider, options.nameSpace);
    const fs::path folder = draftOptions.folder;
    std::vector<NewFile> files = filesOf(broker, provider, options.mofFiles, folder);
    std::sort(files.begin(), files.end(), [](const NewFile& a, const NewFile& b) { return a.name < b.name; });
    writeNewFiles(folder, files);
    for (const NewFile& file : files) {
        std::cout << (folder / file.name).string() << '\n';
    }
    return 0;
}

} // namespace oxahv::runner
