#include "Core.h"
#include "text/PathText.h"

namespace oxahv {

namespace {

// The property list of a request, as CMPI wants it; null for none.
class PropertyArray {
public:
    explicit PropertyArray(const std::vector<std::string>* names) {
        if (names != nullptr) {
            for (const std::string& name : *names) {
                pointers_.push_back(name.c_str());
            }
            pointers_.push_back(nullptr);
        }
    }
    const char** get() { return pointers_.empty() ? nullptr : pointers_.data(); }

private:
    std::vector<const char*> pointers_;
};

} // namespace

// What belongs to one request: the owner of its objects, and its context.
class Request::Impl {
public:
    explicit Impl(EmbeddedBroker& broker) : core(broker.impl()) {
        core.addContextEntries(*context);
        core.addClientEntries(*context, "", 0);
    }

    // The context of a request for a path.
    const CMPIContext* contextFor(const CMPIObjectPath* path) {
        const ObjectPath* const target = ObjectPath::of(path);
        if (target != nullptr) {
            context->values.set(CMPIInitNameSpace, Value::text(core, target->nameSpace));
        }
        context->receiver = &receiver;
        return context.get();
    }

    template <auto slot, class... Arguments>
    Reply serve(const CMPIObjectPath* path, Arguments... arguments) {
        return core.hosting.serve<slot>(contextFor(path), path, arguments...);
    }

    Core& core;
    Exposed<Context> context{new Context(core)}; // nobody's: a provider that releases it does no harm
    Owner owner{core};
    Receiver receiver;
    Owner::Scope scope{owner};
};

Request::Request(EmbeddedBroker& broker) : impl_(std::make_unique<Impl>(broker)) {}

Request::~Request() = default;

const CMPIContext* Request::context() const {
    return impl_->context.get();
}

void Request::setContextEntry(const std::string& name, const std::string& text) {
    impl_->context->values.set(name, Value::text(impl_->core, text));
}

void Request::setInvocationFlags(CMPIFlags flags) {
    CMPIValue value = {};
    value.uint32 = flags;
    impl_->context->values.set(CMPIInvocationFlags, Value::number(value, CMPI_uint32));
}

void Request::setProgressHandler(std::function<void(std::size_t results)> handler) {
    impl_->receiver.progress = std::move(handler);
}

void Request::setResultHandlers(InstanceHandler instances, PathHandler paths) {
    impl_->receiver.instances = std::move(instances);
    impl_->receiver.paths = std::move(paths);
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
    return impl_->core.delivery.deliver(path);
}

Reply Request::enumerateInstances(const CMPIObjectPath* classPath,
                                  const std::vector<std::string>* properties) {
    return impl_->serve<&CMPIInstanceMIFT::enumerateInstances>(classPath, PropertyArray(properties).get());
}

Reply Request::enumerateInstanceNames(const CMPIObjectPath* classPath) {
    return impl_->serve<&CMPIInstanceMIFT::enumerateInstanceNames>(classPath);
}

Reply Request::getInstance(const CMPIObjectPath* path, const std::vector<std::string>* properties) {
    return impl_->serve<&CMPIInstanceMIFT::getInstance>(path, PropertyArray(properties).get());
}

Reply Request::createInstance(const CMPIObjectPath* classPath, const CMPIInstance* instance) {
    return impl_->serve<&CMPIInstanceMIFT::createInstance>(classPath, instance);
}

Reply Request::modifyInstance(const CMPIObjectPath* path, const CMPIInstance* instance,
                              const std::vector<std::string>* properties) {
    return impl_->serve<&CMPIInstanceMIFT::modifyInstance>(path, instance, PropertyArray(properties).get());
}

Reply Request::deleteInstance(const CMPIObjectPath* path) {
    return impl_->serve<&CMPIInstanceMIFT::deleteInstance>(path);
}

Reply Request::execQuery(const CMPIObjectPath* classPath, const std::string& query,
                         const std::string& language) {
    return impl_->core.hosting.execQuery(impl_->contextFor(classPath), classPath, query.c_str(),
                                         language.c_str());
}

Reply Request::associators(const CMPIObjectPath* path, const AssociationFilter& filter,
                           const std::vector<std::string>* properties) {
    return impl_->serve<&CMPIAssociationMIFT::associators>(
        path, filter.associationClass.c_str(), filter.resultClass.c_str(), filter.role.c_str(),
        filter.resultRole.c_str(), PropertyArray(properties).get());
}

Reply Request::associatorNames(const CMPIObjectPath* path, const AssociationFilter& filter) {
    return impl_->serve<&CMPIAssociationMIFT::associatorNames>(
        path, filter.associationClass.c_str(), filter.resultClass.c_str(), filter.role.c_str(),
        filter.resultRole.c_str());
}

Reply Request::references(const CMPIObjectPath* path, const AssociationFilter& filter,
                          const std::vector<std::string>* properties) {
    return impl_->serve<&CMPIAssociationMIFT::references>(
        path, filter.resultClass.c_str(), filter.role.c_str(), PropertyArray(properties).get());
}

Reply Request::referenceNames(const CMPIObjectPath* path, const AssociationFilter& filter) {
    return impl_->serve<&CMPIAssociationMIFT::referenceNames>(path, filter.resultClass.c_str(),
                                                              filter.role.c_str());
}

Reply Request::getProperty(const CMPIObjectPath* path, const std::string& name) {
    return impl_->core.hosting.getProperty(impl_->contextFor(path), path, name.c_str());
}

Reply Request::setProperty(const CMPIObjectPath* path, const std::string& name, const CMPIData& value) {
    // A slot takes the text of CMPI_chars itself in place of a value.
    const CMPIValue* const given =
        value.type == CMPI_chars ? reinterpret_cast<const CMPIValue*>(value.value.chars) : &value.value;
    return impl_->core.hosting.setProperty(impl_->contextFor(path), path, name.c_str(),
                                           CMIsNullValue(value) ? nullptr : given, value.type);
}

Reply Request::invokeMethod(const CMPIObjectPath* path, const std::string& method, const CMPIArgs* in) {
    return impl_->core.hosting.invokeMethod(impl_->contextFor(path), path, method.c_str(), in);
}

} // namespace oxahv
