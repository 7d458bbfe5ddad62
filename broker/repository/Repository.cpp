#include "repository/Repository.h"

#include "Core.h"
#include "hosting/HostedProvider.h"

#include <algorithm>
#include <mutex>

namespace oxahv {

extern const CMPIInstanceMIFT repositoryInstanceTable;
extern const CMPIAssociationMIFT repositoryAssociationTable;

namespace {

CMPIInstanceMI* createInstanceMI(const CMPIBroker* broker, const CMPIContext* /*context*/,
                                 CMPIStatus* /*status*/) {
    return &coreOf(broker)->repository.instanceMI;
}

CMPIAssociationMI* createAssociationMI(const CMPIBroker* broker, const CMPIContext* /*context*/,
                                       CMPIStatus* /*status*/) {
    return &coreOf(broker)->repository.associationMI;
}

std::string placeOf(const std::string& nameSpace, const std::string& identity) {
    return foldedName(nameSpace) + '\n' + identity;
}

std::string keyText(const Value& value) {
    if (value.type() == CMPI_ref && !value.isNull()) {
        return '(' + Repository::identityOf(*ObjectPath::of(value.data().value.ref)) + ')';
    }
    return valueText(value.data());
}

Exposed<Instance> copyOf(const Instance& instance, const std::string& nameSpace) {
    Exposed<Instance> copy(static_cast<Instance*>(instance.clone().release()));
    copy->path->nameSpace = nameSpace;
    return copy;
}

bool isIn(const Instance& instance, const std::string& nameSpace) {
    const std::string& own = instance.path->nameSpace;
    return own.empty() || sameName(own, nameSpace);
}

} // namespace

Repository::Repository(Core& theCore)
    : instanceMI{this, &repositoryInstanceTable}, associationMI{this, &repositoryAssociationTable},
      core(theCore) {}

Repository::~Repository() = default;

void Repository::keep(const std::string& className) {
    const std::unique_lock<std::shared_mutex> lock(mutex_);
    if (provider_ == nullptr) {
        auto made = std::make_shared<HostedProvider>(core, "repository", std::vector<std::string>());
        ProviderFactories factories;
        factories.instance = createInstanceMI;
        factories.association = createAssociationMI;
        made->create(factories);
        provider_ = std::move(made);
    }
    if (std::none_of(classes_.begin(), classes_.end(),
                     [&](const std::string& kept) { return sameName(kept, className); })) {
        classes_.push_back(className);
    }
}

Repository::Kept Repository::kept(std::string_view className) const {
    const std::shared_lock<std::shared_mutex> lock(mutex_);
    Kept result = Kept::no;
    for (const std::string& kept : classes_) {
        if (core.classes.isA(className, kept)) {
            return Kept::itself;
        }
        result = core.classes.isA(kept, className) ? Kept::inPart : result;
    }
    return result;
}

bool Repository::keepsAssociations() const {
    const std::shared_lock<std::shared_mutex> lock(mutex_);
    return std::any_of(classes_.begin(), classes_.end(), [&](const std::string& kept) {
        const DeclaredClass* const declared = core.classes.find(kept);
        return declared != nullptr && declared->qualifiers.isTrue("Association");
    });
}

std::shared_ptr<HostedProvider> Repository::provider() const {
    const std::shared_lock<std::shared_mutex> lock(mutex_);
    return provider_;
}

std::string Repository::identityOf(const ObjectPath& path) {
    const std::unique_ptr<ObjectPath> copy = path.copy();
    copy->declareKeys();
    std::map<std::string, std::string> keys;
    for (const NamedValue& key : copy->keys) {
        keys.emplace(foldedName(key.name), keyText(key.value));
    }
    std::string identity = foldedName(path.className);
    for (const auto& [name, value] : keys) {
        identity += ',' + name + '=' + value;
    }
    return identity;
}

Repository::Instances::const_iterator Repository::locate(const ObjectPath& path) const {
    const std::string identity = identityOf(path);
    auto found = order_.find(placeOf(path.nameSpace, identity));
    found = found != order_.end() ? found : order_.find(placeOf("", identity));
    return found != order_.end() ? instances_.find(found->second) : instances_.end();
}

void Repository::add(std::unique_ptr<Instance> instance) {
    const ObjectPath& path = *instance->path;
    const std::string place = placeOf(path.nameSpace, identityOf(path));
    const std::unique_lock<std::shared_mutex> lock(mutex_);
    if (locate(path) != instances_.end()) {
        failWith(CMPI_RC_ERR_ALREADY_EXISTS, "there is an instance " + pathText(&path) + " already");
    }
    const std::uint64_t order = next_++;
    const auto added = instances_.emplace(order, Exposed<Instance>(instance.release())).first;
    try {
        order_.emplace(place, order);
    } catch (...) {
        instances_.erase(added);
        throw;
    }
}

std::vector<Exposed<Instance>> Repository::instancesOf(const std::string& nameSpace,
                                                       const std::string& className) const {
    std::vector<Exposed<Instance>> found;
    const std::shared_lock<std::shared_mutex> lock(mutex_);
    for (const auto& [order, instance] : instances_) {
        if (isIn(*instance, nameSpace) &&
            (className.empty() || core.classes.isA(instance->path->className, className))) {
            found.push_back(copyOf(*instance, nameSpace));
        }
    }
    return found;
}

Exposed<Instance> Repository::find(const ObjectPath& path) const {
    const std::shared_lock<std::shared_mutex> lock(mutex_);
    const auto found = locate(path);
    return found != instances_.end() ? copyOf(*found->second, path.nameSpace) : nullptr;
}

void Repository::change(const ObjectPath& path, const std::function<void(Instance&)>& change) {
    const std::unique_lock<std::shared_mutex> lock(mutex_);
    const auto found = locate(path);
    if (found == instances_.end()) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    Exposed<Instance> changed = copyOf(*found->second, found->second->path->nameSpace);
    change(*changed);
    instances_[found->first] = std::move(changed);
}

void Repository::remove(const ObjectPath& path) {
    const std::unique_lock<std::shared_mutex> lock(mutex_);
    const auto found = locate(path);
    if (found == instances_.end()) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    order_.erase(placeOf(found->second->path->nameSpace, identityOf(path)));
    instances_.erase(found);
}

} // namespace oxahv
