// Instances that the broker keeps itself, as a CIM server's repository does: those in MOF texts and those
// that clients and providers create of the same classes. A provider of the broker's own serves them.
#pragma once

#include "classes/Classes.h"
#include "objects/Records.h"

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <shared_mutex>
#include <string>
#include <string_view>
#include <vector>

namespace oxahv {

class HostedProvider;

class Repository {
public:
    // How a class is kept: itself, as a class that kept ones derive from, or not at all.
    enum class Kept { itself, inPart, no };

    explicit Repository(Core& core);
    ~Repository();
    Repository(const Repository&) = delete;
    Repository& operator=(const Repository&) = delete;

    // From now on keeps instances of a class and of those derived from it.
    void keep(const std::string& className);
    Kept kept(std::string_view className) const;
    bool keepsAssociations() const;
    // Serves what is kept; null as long as no class is.
    std::shared_ptr<HostedProvider> provider() const;

    // Adds an instance with its path; an empty namespace is every one. Throws Failure.
    void add(std::unique_ptr<Instance> instance);
    // Copies of the instances of a class and of those derived from it in a namespace, in the order in which
    // they came; of all classes for an empty name.
    std::vector<Exposed<Instance>> instancesOf(const std::string& nameSpace,
                                               const std::string& className) const;
    // A copy of one; null when there is none.
    Exposed<Instance> find(const ObjectPath& path) const;
    // Changes or removes one. Both throw CMPI_RC_ERR_NOT_FOUND.
    void change(const ObjectPath& path, const std::function<void(Instance&)>& change);
    void remove(const ObjectPath& path);

    // The class and the keys, in an order of their own: two paths of one instance have the same.
    static std::string identityOf(const ObjectPath& path);

    CMPIInstanceMI instanceMI;
    CMPIAssociationMI associationMI;
    Core& core;

private:
    using Instances = std::map<std::uint64_t, Exposed<Instance>>; // by their order

    Instances::const_iterator locate(const ObjectPath& path) const;

    mutable std::shared_mutex mutex_;
    std::vector<std::string> classes_;
    Instances instances_;
    std::map<std::string, std::uint64_t> order_; // by namespace and identity
    std::uint64_t next_ = 0;
    std::shared_ptr<HostedProvider> provider_;
};

} // namespace oxahv
