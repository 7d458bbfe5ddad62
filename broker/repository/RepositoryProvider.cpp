// The provider of the instances that the broker keeps: its MIs' function tables.

#include "query/Query.h"
#include "tables/Slots.h"

#include <algorithm>
#include <set>

namespace oxahv {

namespace {

template <class MI>
Repository& repositoryOf(MI* mi) {
    return *static_cast<Repository*>(const_cast<void*>(mi->hdl));
}

const ObjectPath& pathOf(const CMPIObjectPath* handle) {
    return *ObjectPath::of(handle);
}

// Runs an operation on what the handles lead to. Nothing that it throws leaves a function of a table.
template <class MI, class Operation>
CMPIStatus serve(MI* mi, const CMPIResult* result, const Operation& operation) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    Repository& repository = repositoryOf(mi);
    try {
        Result& results = *Result::of(result);
        operation(repository, results);
        results.reply.done = true;
        return status;
    } catch (const Failure& failure) {
        return failed<CMPIStatus>(repository.core, status, failure);
    } catch (const std::bad_alloc&) {
        return {CMPI_RC_ERROR_SYSTEM, nullptr};
    }
}

void filter(Instance& instance, const char** properties) {
    if (properties != nullptr) {
        std::vector<std::string> names;
        for (; *properties != nullptr; ++properties) {
            names.emplace_back(*properties);
        }
        instance.setFilter(std::move(names));
    }
}

bool isListed(const char** properties, const std::string& name) {
    for (; properties != nullptr && *properties != nullptr; ++properties) {
        if (sameName(*properties, name)) {
            return true;
        }
    }
    return false;
}

// Instances

CMPIStatus enumerateNames(CMPIInstanceMI* mi, const CMPIContext* /*context*/, const CMPIResult* result,
                          const CMPIObjectPath* path) {
    return serve(mi, result, [&](Repository& repository, Result& results) {
        for (const auto& instance : repository.instancesOf(pathOf(path).nameSpace, pathOf(path).className)) {
            results.add(*instance->path);
        }
    });
}

CMPIStatus enumerate(CMPIInstanceMI* mi, const CMPIContext* /*context*/, const CMPIResult* result,
                     const CMPIObjectPath* path, const char** properties) {
    return serve(mi, result, [&](Repository& repository, Result& results) {
        for (const auto& instance : repository.instancesOf(pathOf(path).nameSpace, pathOf(path).className)) {
            filter(*instance, properties);
            results.add(*instance);
        }
    });
}

CMPIStatus get(CMPIInstanceMI* mi, const CMPIContext* /*context*/, const CMPIResult* result,
               const CMPIObjectPath* path, const char** properties) {
    return serve(mi, result, [&](Repository& repository, Result& results) {
        const Exposed<Instance> instance = repository.find(pathOf(path));
        if (instance == nullptr) {
            throw Failure{CMPI_RC_ERR_NOT_FOUND};
        }
        filter(*instance, properties);
        results.add(*instance);
    });
}

// A property without a value gets its declared default, a key is needed.
void complete(Instance& instance, const DeclaredClass& declared) {
    Core& core = instance.core();
    for (const PropertyDeclaration& property : declared.properties) {
        const std::optional<NamedValue> given = instance.properties.find(property.name);
        if (given && !given->value.isNull()) {
            continue;
        }
        if (property.isKey) {
            failWith(CMPI_RC_ERR_INVALID_PARAMETER, "key " + property.name + " has no value");
        }
        if (property.defaultValue.type == property.type && !property.defaultValue.isNull) {
            Owner own(core); // of what the value is copied from
            const Owner::Scope scope(own);
            const CMPIData data = dataOf(core, property.defaultValue);
            instance.properties.set(property.name, Value::from(core, &data.value, data.type));
        }
    }
}

CMPIStatus create(CMPIInstanceMI* mi, const CMPIContext* /*context*/, const CMPIResult* result,
                  const CMPIObjectPath* path, const CMPIInstance* handle) {
    return serve(mi, result, [&](Repository& repository, Result& results) {
        std::unique_ptr<Object> copy = Instance::of(handle)->clone();
        std::unique_ptr<Instance> instance(static_cast<Instance*>(copy.release()));
        const DeclaredClass* const declared = instance->declaredClass();
        for (const NamedValue& key : pathOf(path).keys) { // a client may name it by the path alone
            instance->path->keys.set(key.name, key.value);
        }
        instance->path->declareKeys();
        for (const NamedValue& key : instance->path->keys) {
            const std::optional<NamedValue> given = instance->properties.find(key.name);
            if (!given || given->value.isNull()) {
                instance->properties.set(key.name, key.value);
            }
        }
        if (declared != nullptr) {
            if (declared->qualifiers.isTrue("Abstract")) {
                failWith(CMPI_RC_ERR_NOT_SUPPORTED, "class " + declared->name + " is abstract");
            }
            complete(*instance, *declared);
        }
        instance->path = instance->keyedPath();
        instance->path->nameSpace = pathOf(path).nameSpace;
        const std::unique_ptr<ObjectPath> created = instance->path->copy();
        repository.add(std::move(instance));
        results.add(*created);
    });
}

CMPIStatus modify(CMPIInstanceMI* mi, const CMPIContext* /*context*/, const CMPIResult* result,
                  const CMPIObjectPath* path, const CMPIInstance* handle, const char** properties) {
    return serve(mi, result, [&](Repository& repository, Result& /*results*/) {
        const Instance& wanted = *Instance::of(handle);
        repository.change(pathOf(path), [&](Instance& instance) {
            const DeclaredClass* const declared = instance.declaredClass();
            for (const NamedValue& property : wanted.properties) {
                if ((properties == nullptr || isListed(properties, property.name)) &&
                    !instance.isKey(declared, property.name)) {
                    instance.properties.set(property.name, property.value);
                }
            }
        });
    });
}

CMPIStatus remove(CMPIInstanceMI* mi, const CMPIContext* /*context*/, const CMPIResult* result,
                  const CMPIObjectPath* path) {
    return serve(mi, result,
                 [&](Repository& repository, Result& /*results*/) { repository.remove(pathOf(path)); });
}

CMPIStatus execQuery(CMPIInstanceMI* mi, const CMPIContext* /*context*/, const CMPIResult* result,
                     const CMPIObjectPath* path, const char* text, const char* language) {
    return serve(mi, result, [&](Repository& repository, Result& results) {
        const auto query = Query::parse(required(text), required(language));
        query->check(repository.core.classes);
        for (const auto& instance : repository.instancesOf(pathOf(path).nameSpace, query->className())) {
            if (query->accepts(*instance)) {
                query->project(*instance);
                results.add(*instance);
            }
        }
    });
}

// Associations

struct Filter {
    const char* associationClass;
    const char* resultClass;
    const char* role;
    const char* resultRole;
};

// The path that is the value of a property; null where it is none.
const ObjectPath* referenceIn(const Value& value) {
    return value.type() == CMPI_ref && !value.isNull() ? ObjectPath::of(value.data().value.ref) : nullptr;
}

bool isWanted(const char* wanted, const std::string& name) {
    return wanted == nullptr || sameName(wanted, name);
}

// Calls `found` with each association of a path and the name of the reference to it.
template <class Found>
void forEachAssociation(const Repository& repository, const ObjectPath& end, const Filter& filter,
                        const Found& found) {
    const std::string identity = Repository::identityOf(end);
    for (const auto& association : repository.instancesOf(
             end.nameSpace, filter.associationClass != nullptr ? filter.associationClass : "")) {
        for (const NamedValue& property : association->properties) {
            const ObjectPath* const path = referenceIn(property.value);
            if (path != nullptr && isWanted(filter.role, property.name) &&
                (path->nameSpace.empty() || sameName(path->nameSpace, end.nameSpace)) &&
                Repository::identityOf(*path) == identity) {
                found(*association, property.name);
                break;
            }
        }
    }
}

// Calls `found` with the path of each other end, once.
template <class Found>
void forEachEnd(const Repository& repository, const ObjectPath& end, const Filter& filter,
                const Found& found) {
    std::set<std::string> known;
    forEachAssociation(repository, end, filter, [&](const Instance& association, const std::string& role) {
        for (const NamedValue& property : association.properties) {
            const ObjectPath* const path = referenceIn(property.value);
            if (path == nullptr || property.name == role || !isWanted(filter.resultRole, property.name) ||
                (filter.resultClass != nullptr &&
                 !repository.core.classes.isA(path->className, filter.resultClass))) {
                continue;
            }
            const std::unique_ptr<ObjectPath> other = path->copy();
            other->nameSpace = other->nameSpace.empty() ? end.nameSpace : other->nameSpace;
            if (known.insert(pathText(other.get())).second) {
                found(*other);
            }
        }
    });
}

CMPIStatus associatorNames(CMPIAssociationMI* mi, const CMPIContext* /*context*/, const CMPIResult* result,
                           const CMPIObjectPath* path, const char* associationClass, const char* resultClass,
                           const char* role, const char* resultRole) {
    return serve(mi, result, [&](Repository& repository, Result& results) {
        forEachEnd(repository, pathOf(path), {associationClass, resultClass, role, resultRole},
                   [&](const ObjectPath& other) { results.add(other); });
    });
}

// An end may be another provider's.
CMPIStatus associators(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                       const CMPIObjectPath* path, const char* associationClass, const char* resultClass,
                       const char* role, const char* resultRole, const char** properties) {
    return serve(mi, result, [&](Repository& repository, Result& results) {
        forEachEnd(repository, pathOf(path), {associationClass, resultClass, role, resultRole},
                   [&](const ObjectPath& other) {
                       const Reply reply = repository.core.hosting.serve<&CMPIInstanceMIFT::getInstance>(
                           context, &other, properties);
                       if (!reply.instances.empty()) {
                           results.add(*Instance::of(reply.instances.front()));
                       }
                   });
    });
}

CMPIStatus referenceNames(CMPIAssociationMI* mi, const CMPIContext* /*context*/, const CMPIResult* result,
                          const CMPIObjectPath* path, const char* resultClass, const char* role) {
    return serve(mi, result, [&](Repository& repository, Result& results) {
        forEachAssociation(repository, pathOf(path), {resultClass, nullptr, role, nullptr},
                           [&](const Instance& association, const std::string& /*role*/) {
                               results.add(*association.path);
                           });
    });
}

CMPIStatus references(CMPIAssociationMI* mi, const CMPIContext* /*context*/, const CMPIResult* result,
                      const CMPIObjectPath* path, const char* resultClass, const char* role,
                      const char** properties) {
    return serve(mi, result, [&](Repository& repository, Result& results) {
        forEachAssociation(repository, pathOf(path), {resultClass, nullptr, role, nullptr},
                           [&](Instance& association, const std::string& /*role*/) {
                               filter(association, properties);
                               results.add(association);
                           });
    });
}

} // namespace

extern const CMPIInstanceMIFT repositoryInstanceTable = {CMPICurrentVersion,
                                                         CMPICurrentVersion,
                                                         "repository",
                                                         nullptr,
                                                         enumerateNames,
                                                         enumerate,
                                                         get,
                                                         create,
                                                         modify,
                                                         remove,
                                                         execQuery,
                                                         nullptr};

extern const CMPIAssociationMIFT repositoryAssociationTable = {
    CMPICurrentVersion, CMPICurrentVersion, "repository",   nullptr, associators,
    associatorNames,    references,         referenceNames, nullptr, nullptr};

} // namespace oxahv
