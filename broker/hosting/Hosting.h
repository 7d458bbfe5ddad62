// The providers of a broker, and the way from a request to one of them.
#pragma once

#include "hosting/Operations.h"
#include "objects/Shards.h"

#include <functional>
#include <memory>
#include <shared_mutex>
#include <string>
#include <vector>

namespace oxahv {

class Hosting {
public:
    using Providers = std::vector<std::shared_ptr<HostedProvider>>;

    explicit Hosting(Core& core) : core_(core) {}
    ~Hosting(); // NOLINT(bugprone-exception-escape): see there
    Hosting(const Hosting&) = delete;
    Hosting& operator=(const Hosting&) = delete;

    void host(const std::string& name, const ProviderFactories& factories, std::vector<std::string> classes);
    void load(const std::string& file, const std::string& name, std::vector<std::string> classes);
    void unload(const std::string& name);

    // Finds the provider of the path's class, calls its function in that slot of its MI's table with the
    // arguments behind the path, and returns what it returned. Throws nothing but std::bad_alloc.
    template <auto slot, class... Arguments>
    Reply serve(const CMPIContext* context, const CMPIObjectPath* path, Arguments... arguments) {
        return serve(context, path, OperationOf<slot>(arguments...));
    }
    // The same for a method, whose arguments are checked against its declaration.
    Reply invokeMethod(const CMPIContext* context, const CMPIObjectPath* path, const char* method,
                       const CMPIArgs* in);
    // A single property, checked likewise: by a property MI where there is one that does it, else by the
    // instance that has it.
    Reply getProperty(const CMPIContext* context, const CMPIObjectPath* path, const char* name);
    Reply setProperty(const CMPIContext* context, const CMPIObjectPath* path, const char* name,
                      const CMPIValue* value, CMPIType type);

    // A query: by a provider that does queries, else by all instances of the class that the query names.
    Reply execQuery(const CMPIContext* context, const CMPIObjectPath* path, const char* query,
                    const char* language);

    // Those with an indication MI that serve the class, one above it or one below it, or all classes.
    Providers findForIndications(const std::string& className) const;

    // The answer to a request that no provider gets.
    static Reply refused(CMPIrc code, std::string message = {});

private:
    Reply serve(const CMPIContext* context, const CMPIObjectPath* handle, const Operation& operation);
    void ask(const HostedProvider& provider, const CMPIContext* context, const CMPIObjectPath* path,
             const Operation& operation, Result& result) const;
    template <class Predicate>
    Providers providersThat(const Predicate& match) const;
    Reply modifyProperty(const CMPIContext* context, const CMPIObjectPath* path, const char* name,
                         const CMPIData& data);
    // Whom to ask, in order: those that name the class, or all that may serve it.
    Providers find(const ObjectPath& path, const Operation& operation) const;
    void add(std::shared_ptr<HostedProvider> provider);
    std::shared_ptr<HostedProvider> take(const std::string& name);
    void requireFreeName(const std::string& name) const;
    void requireFreeNameLocked(const std::string& name) const;

    Core& core_;
    mutable ShardedMutex mutex_;
    Providers providers_;
};

} // namespace oxahv
