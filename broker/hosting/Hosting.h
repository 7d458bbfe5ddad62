// The providers of a broker, and the way from a request to one of them.
#pragma once

#include "EmbeddedBroker.h"

#include <memory>
#include <shared_mutex>
#include <string_view>
#include <vector>

namespace oxahv {

class ObjectPath;
class HostedProvider;

// The property list of a request, as CMPI wants it; null for none.
class PropertyArray {
public:
    explicit PropertyArray(const std::vector<std::string>* names);
    const char** get() { return pointers_.empty() ? nullptr : pointers_.data(); }

private:
    std::vector<const char*> pointers_;
};

class Hosting {
public:
    explicit Hosting(EmbeddedBroker::Impl& core) : core_(core) {}
    ~Hosting(); // NOLINT(bugprone-exception-escape): see there
    Hosting(const Hosting&) = delete;
    Hosting& operator=(const Hosting&) = delete;

    void host(const std::string& name, const ProviderFactories& factories, std::vector<std::string> classes);
    void load(const std::string& file, const std::string& name, std::vector<std::string> classes);
    void unload(const std::string& name);

    // Requests. Each finds the provider of the path's class, runs its function under the context, and returns
    // what it returned. Nothing is thrown but std::bad_alloc.
    Reply enumerateInstances(const CMPIContext* context, const CMPIObjectPath* path, const char** properties);
    Reply enumerateInstanceNames(const CMPIContext* context, const CMPIObjectPath* path);
    Reply getInstance(const CMPIContext* context, const CMPIObjectPath* path, const char** properties);
    Reply createInstance(const CMPIContext* context, const CMPIObjectPath* path,
                         const CMPIInstance* instance);
    Reply modifyInstance(const CMPIContext* context, const CMPIObjectPath* path, const CMPIInstance* instance,
                         const char** properties);
    Reply deleteInstance(const CMPIContext* context, const CMPIObjectPath* path);
    Reply execQuery(const CMPIContext* context, const CMPIObjectPath* path, const char* query,
                    const char* language);
    Reply associators(const CMPIContext* context, const CMPIObjectPath* path, const AssociationFilter& filter,
                      const char** properties);
    Reply associatorNames(const CMPIContext* context, const CMPIObjectPath* path,
                          const AssociationFilter& filter);
    Reply references(const CMPIContext* context, const CMPIObjectPath* path, const AssociationFilter& filter,
                     const char** properties);
    Reply referenceNames(const CMPIContext* context, const CMPIObjectPath* path,
                         const AssociationFilter& filter);
    Reply invokeMethod(const CMPIContext* context, const CMPIObjectPath* path, const char* method,
                       const CMPIArgs* in);

    // A copy of a path as the broker's KeyMode and PathDelivery say; the current owner's.
    CMPIObjectPath* deliver(const CMPIObjectPath* handle) const;

private:
    // Whom to ask, in order: one that names the class, or all that may serve it.
    template <class MI>
    std::vector<std::shared_ptr<HostedProvider>> find(const ObjectPath& path,
                                                      std::string_view associationClass) const;
    template <class MI, class Function>
    Reply request(const CMPIContext* context, const CMPIObjectPath* handle, const Function& function,
                  std::string_view associationClass = {});
    void add(std::shared_ptr<HostedProvider> provider);
    std::shared_ptr<HostedProvider> take(const std::string& name);
    void requireFreeName(const std::string& name) const;
    void requireFreeNameLocked(const std::string& name) const;

    EmbeddedBroker::Impl& core_;
    mutable std::shared_mutex mutex_;
    std::vector<std::shared_ptr<HostedProvider>> providers_;
};

} // namespace oxahv
