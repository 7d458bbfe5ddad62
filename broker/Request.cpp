#include "Core.h"
#include "text/PathText.h"

namespace oxahv {

// What belongs to one request: the owner of its objects, and its context.
class Request::Impl {
public:
    explicit Impl(EmbeddedBroker& broker) : core(broker.impl()) {
        core.addContextEntries(context);
        CMPIValue flags = {};
        flags.uint32 = 0;
        context.values.set(CMPIInvocationFlags, Value::number(flags, CMPI_uint32));
        context.values.set(CMPIPrincipal, Value::text(core, ""));
    }

    // The context of a request for a path.
    const CMPIContext* contextFor(const CMPIObjectPath* path) {
        const ObjectPath* const target = ObjectPath::of(path);
        if (target != nullptr) {
            context.values.set(CMPIInitNameSpace, Value::text(core, target->nameSpace));
        }
        context.progress = &progress;
        return &context;
    }

    Core& core;
    Context context{core}; // nobody's: a provider that releases it does no harm
    Owner owner{core};
    std::function<void(std::size_t)> progress;
    Owner::Scope scope{owner};
};

Request::Request(EmbeddedBroker& broker) : impl_(std::make_unique<Impl>(broker)) {}

Request::~Request() = default;

const CMPIContext* Request::context() const {
    return &impl_->context;
}

void Request::setProgressHandler(std::function<void(std::size_t results)> handler) {
    impl_->progress = std::move(handler);
}

CMPIObjectPath* Request::objectPath(const std::string& nameSpace, const std::string& className) {
    return CMNewObjectPath(&impl_->core.record, nameSpace.c_str(), className.c_str(), nullptr);
}

CMPIObjectPath* Request::objectPathFromText(const std::string& text, const std::string& nameSpace) {
    return handOut(readPath(impl_->core, text, nameSpace));
}

CMPIData Request::valueFromText(const std::string& text, CMPIType type) {
    return keep(impl_->core, readValue(impl_->core, text, type));
}

CMPIObjectPath* Request::deliver(const CMPIObjectPath* path) {
    return impl_->core.hosting.deliver(path);
}

Reply Request::enumerateInstances(const CMPIObjectPath* classPath,
                                  const std::vector<std::string>* properties) {
    return impl_->core.hosting.enumerateInstances(impl_->contextFor(classPath), classPath,
                                                  PropertyArray(properties).get());
}

Reply Request::enumerateInstanceNames(const CMPIObjectPath* classPath) {
    return impl_->core.hosting.enumerateInstanceNames(impl_->contextFor(classPath), classPath);
}

Reply Request::getInstance(const CMPIObjectPath* path, const std::vector<std::string>* properties) {
    return impl_->core.hosting.getInstance(impl_->contextFor(path), path, PropertyArray(properties).get());
}

Reply Request::createInstance(const CMPIObjectPath* classPath, const CMPIInstance* instance) {
    return impl_->core.hosting.createInstance(impl_->contextFor(classPath), classPath, instance);
}

Reply Request::modifyInstance(const CMPIObjectPath* path, const CMPIInstance* instance,
                              const std::vector<std::string>* properties) {
    return impl_->core.hosting.modifyInstance(impl_->contextFor(path), path, instance,
                                              PropertyArray(properties).get());
}

Reply Request::deleteInstance(const CMPIObjectPath* path) {
    return impl_->core.hosting.deleteInstance(impl_->contextFor(path), path);
}

Reply Request::execQuery(const CMPIObjectPath* classPath, const std::string& query,
                         const std::string& language) {
    return impl_->core.hosting.execQuery(impl_->contextFor(classPath), classPath, query.c_str(),
                                         language.c_str());
}

Reply Request::associators(const CMPIObjectPath* path, const AssociationFilter& filter,
                           const std::vector<std::string>* properties) {
    return impl_->core.hosting.associators(impl_->contextFor(path), path, filter,
                                           PropertyArray(properties).get());
}

Reply Request::associatorNames(const CMPIObjectPath* path, const AssociationFilter& filter) {
    return impl_->core.hosting.associatorNames(impl_->contextFor(path), path, filter);
}

Reply Request::references(const CMPIObjectPath* path, const AssociationFilter& filter,
                          const std::vector<std::string>* properties) {
    return impl_->core.hosting.references(impl_->contextFor(path), path, filter,
                                          PropertyArray(properties).get());
}

Reply Request::referenceNames(const CMPIObjectPath* path, const AssociationFilter& filter) {
    return impl_->core.hosting.referenceNames(impl_->contextFor(path), path, filter);
}

Reply Request::invokeMethod(const CMPIObjectPath* path, const std::string& method, const CMPIArgs* in) {
    return impl_->core.hosting.invokeMethod(impl_->contextFor(path), path, method.c_str(), in);
}

} // namespace oxahv
