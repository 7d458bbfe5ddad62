#include "repository/MofRepository.h"

#include "Core.h"
#include "mof/MofInstances.h"

#include <algorithm>
#include <map>

namespace oxahv {

namespace {

using Aliases = std::map<std::string, std::string, encoding::NameLess>; // to the texts of paths

// A reference may name an instance by its alias, where it comes later in the text.
void resolve(const MofSource& source, MofInstance& instance, const Aliases& aliases) {
    for (MofAssignment& assignment : instance.properties) {
        for (MofToken& constant : assignment.value.constants) {
            if (constant.kind != MofKind::alias) {
                continue;
            }
            const auto found = aliases.find(constant.spelling);
            if (found == aliases.end()) {
                source.fail(constant.offset,
                            "there is no instance " + std::string(constant.spelling) + " before this one");
            }
            constant.kind = MofKind::text;
            constant.text = found->second;
        }
    }
}

void requireKeys(const MofSource& source, const MofInstance& written, const Instance& instance) {
    const DeclaredClass* const declared = instance.declaredClass();
    for (std::size_t i = 0; declared != nullptr && i < declared->properties.size(); ++i) {
        const PropertyDeclaration& property = declared->properties[i];
        if (property.isKey && !instance.path->keys.find(property.name)) {
            source.fail(written.className.offset, "key " + property.name + " has no value");
        }
    }
}

} // namespace

void keepInstances(Core& core, std::vector<MofCompiler::WrittenInstance>& written) {
    std::vector<std::unique_ptr<ObjectPath>> added;
    Aliases aliases;
    try {
        for (auto& [source, instance] : written) {
            if (core.classes.find(instance.className.text) == nullptr) {
                continue; // texts of whole schemas have some whose class is another text's
            }
            resolve(*source, instance, aliases);
            std::unique_ptr<Instance> made = instanceOf(core, *source, instance, "");
            requireKeys(*source, instance, *made);
            std::unique_ptr<ObjectPath> path = made->path->copy();
            if (!instance.alias.empty()) {
                aliases[instance.alias] = pathText(path.get());
            }
            added.push_back(path->copy());
            try {
                core.repository.add(std::move(made));
            } catch (const Failure& failure) {
                added.pop_back();
                source->fail(instance.className.offset, *failure.text);
            }
        }
    } catch (...) {
        for (const auto& path : added) {
            core.repository.remove(*path);
        }
        throw;
    }
    for (const auto& path : added) {
        core.repository.keep(path->className);
    }
}

} // namespace oxahv
