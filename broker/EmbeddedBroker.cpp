#include "EmbeddedBroker.h"

#include "Core.h"
#include "mof/MofCompiler.h"

#include <shared_mutex>

namespace oxahv {

BrokerError::BrokerError(const std::string& message) : std::runtime_error(message) {}
BrokerError::~BrokerError() = default;

LiveObjects EmbeddedBroker::Impl::liveObjects() const {
    const auto count = [this](Kind kind) {
        int sum = 0;
        for (const auto& shard : counts_) {
            sum += shard.part[static_cast<std::size_t>(kind)].load(std::memory_order_relaxed);
        }
        return static_cast<std::size_t>(sum);
    };
    LiveObjects live;
    live.instances = count(Kind::instance);
    live.objectPaths = count(Kind::objectPath);
    live.arguments = count(Kind::arguments);
    live.strings = count(Kind::string);
    live.arrays = count(Kind::array);
    live.dateTimes = count(Kind::dateTime);
    live.enumerations = count(Kind::enumeration);
    live.contexts = count(Kind::context);
    live.results = count(Kind::result);
    live.others = count(Kind::other);
    return live;
}

void EmbeddedBroker::Impl::tell(const BrokerMessage& message) const {
    const std::shared_lock<ShardedMutex> lock(handlerMutex_);
    if (handler_) {
        handler_(message);
    }
}

void EmbeddedBroker::Impl::setMessageHandler(std::function<void(const BrokerMessage&)> handler) {
    const std::unique_lock<ShardedMutex> lock(handlerMutex_);
    handler_.swap(handler);
}

void EmbeddedBroker::Impl::tellUnserved(const std::string& className) const {
    const std::shared_lock<ShardedMutex> lock(handlerMutex_);
    if (unservedHandler_) {
        unservedHandler_(className);
    }
}

void EmbeddedBroker::Impl::setUnservedHandler(std::function<void(const std::string&)> handler) {
    const std::unique_lock<ShardedMutex> lock(handlerMutex_);
    unservedHandler_.swap(handler);
}

void EmbeddedBroker::Impl::setContextEntry(const std::string& name, const std::string& text) {
    const std::unique_lock<ShardedMutex> lock(contextMutex_);
    contextEntries_[name] = text;
}

void EmbeddedBroker::Impl::addContextEntries(Context& context) {
    const std::shared_lock<ShardedMutex> lock(contextMutex_);
    for (const auto& [name, text] : contextEntries_) {
        context.values.set(name, Value::text(*this, text));
    }
}

void EmbeddedBroker::Impl::addClientEntries(Context& context, const std::string& principal, CMPIFlags flags) {
    CMPIValue value = {};
    value.uint32 = flags;
    context.values.set(CMPIInvocationFlags, Value::number(value, CMPI_uint32));
    context.values.set(CMPIPrincipal, Value::text(*this, principal));
}

EmbeddedBroker::EmbeddedBroker() : impl_(std::make_unique<Impl>()) {}
EmbeddedBroker::~EmbeddedBroker() = default;

const CMPIBroker* EmbeddedBroker::handle() const {
    return &impl_->record;
}

void EmbeddedBroker::declare(const ClassDeclaration& declaration) {
    impl_->classes.declare(declaration);
}

std::vector<MofWarning> EmbeddedBroker::compileMof(const std::string& file, const MofOptions& options) {
    std::vector<MofWarning> warnings;
    impl_->classes.change([&](Declarations& declarations) {
        MofCompiler compiler(declarations, options);
        compiler.compileFile(file);
        warnings = compiler.takeWarnings();
    });
    return warnings;
}

std::vector<MofWarning> EmbeddedBroker::compileMofText(const std::string& text, const std::string& name,
                                                       const MofOptions& options) {
    std::vector<MofWarning> warnings;
    impl_->classes.change([&](Declarations& declarations) {
        MofCompiler compiler(declarations, options);
        compiler.compileText(text, name);
        warnings = compiler.takeWarnings();
    });
    return warnings;
}

bool EmbeddedBroker::hasDeclarations() const {
    return impl_->classes.any();
}

bool EmbeddedBroker::isDeclared(const std::string& className) const {
    return impl_->classes.find(className) != nullptr;
}

std::vector<std::string> EmbeddedBroker::declaredClasses() const {
    return impl_->classes.names();
}

std::vector<PropertyDeclaration> EmbeddedBroker::propertiesOf(const std::string& className) const {
    const auto declared = impl_->classes.find(className);
    return declared != nullptr ? declared->properties : std::vector<PropertyDeclaration>();
}

std::vector<MethodDeclaration> EmbeddedBroker::methodsOf(const std::string& className) const {
    std::vector<MethodDeclaration> methods;
    if (const auto declared = impl_->classes.find(className)) {
        for (const auto& method : declared->methods) {
            methods.push_back(*method);
        }
    }
    return methods;
}

Qualifiers EmbeddedBroker::qualifiersOf(const std::string& className) const {
    const auto declared = impl_->classes.find(className);
    return declared != nullptr ? declared->qualifiers : Qualifiers();
}

std::string EmbeddedBroker::superclassOf(const std::string& className) const {
    const auto declared = impl_->classes.find(className);
    return declared != nullptr && declared->superclass != nullptr ? declared->superclass->name : "";
}

std::vector<QualifierTypeDeclaration> EmbeddedBroker::qualifierTypes() const {
    std::vector<QualifierTypeDeclaration> types;
    for (const QualifierType& type : impl_->classes.qualifierTypes()) {
        types.push_back({type.implied.name, type.implied.value.type, type.defaultValue,
                         scopeNames(type.scopes), type.implied.isOverridable, type.implied.reachesSubclass,
                         type.implied.isTranslatable});
    }
    return types;
}

bool EmbeddedBroker::isAssociation(const std::string& className) const {
    return qualifiersOf(className).isTrue("Association");
}

bool EmbeddedBroker::isAbstract(const std::string& className) const {
    return qualifiersOf(className).isTrue("Abstract");
}

bool EmbeddedBroker::isA(const std::string& className, const std::string& ancestor) const {
    return impl_->classes.isA(className, ancestor);
}

void EmbeddedBroker::host(const std::string& name, const ProviderFactories& factories,
                          std::vector<std::string> classes) {
    impl_->hosting.host(name, factories, std::move(classes));
}

void EmbeddedBroker::load(const std::string& file, const std::string& name,
                          std::vector<std::string> classes) {
    impl_->hosting.load(file, name, std::move(classes));
}

void EmbeddedBroker::setContextEntry(const std::string& name, const std::string& text) {
    impl_->setContextEntry(name, text);
}

void EmbeddedBroker::unload(const std::string& name) {
    impl_->hosting.unload(name);
}

void EmbeddedBroker::setKeyMode(KeyMode mode) {
    impl_->delivery.setKeyMode(mode);
}

void EmbeddedBroker::setNewInstances(NewInstances mode) {
    impl_->newInstances.store(mode, std::memory_order_relaxed);
}

void EmbeddedBroker::setPathDelivery(PathDelivery delivery) {
    impl_->delivery.setPathDelivery(std::move(delivery));
}

void EmbeddedBroker::injectFault(const std::string& slot, const Fault& fault) {
    impl_->hooks.inject(slot, fault);
}

void EmbeddedBroker::clearFaults() {
    impl_->hooks.clearFaults();
}

std::vector<std::string> EmbeddedBroker::slotNames() {
    return {std::begin(slots), std::end(slots)};
}

void EmbeddedBroker::startRecording() {
    impl_->hooks.startRecording();
}

std::vector<Call> EmbeddedBroker::stopRecording() {
    return impl_->hooks.stopRecording();
}

std::vector<Misuse> EmbeddedBroker::takeMisuses() {
    return impl_->quarantine.takeMisuses();
}

LiveObjects EmbeddedBroker::liveObjects() const {
    return impl_->liveObjects();
}

void EmbeddedBroker::setMessageHandler(std::function<void(const BrokerMessage&)> handler) {
    impl_->setMessageHandler(std::move(handler));
}

void EmbeddedBroker::setUnservedHandler(std::function<void(const std::string& className)> handler) {
    impl_->setUnservedHandler(std::move(handler));
}

} // namespace oxahv
