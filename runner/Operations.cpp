#include "Operations.h"

#include "Arguments.h"

namespace oxahv::runner {

namespace {

const std::vector<std::string>* listOf(const Operands& operands) {
    return operands.properties ? &*operands.properties : nullptr;
}

Reply enumerateNames(EmbeddedBroker& /*broker*/, Request& request, const CMPIObjectPath* target,
                     const Operands& /*operands*/) {
    return request.enumerateInstanceNames(target);
}

Reply enumerate(EmbeddedBroker& /*broker*/, Request& request, const CMPIObjectPath* target,
                const Operands& operands) {
    return request.enumerateInstances(target, listOf(operands));
}

Reply getInstance(EmbeddedBroker& /*broker*/, Request& request, const CMPIObjectPath* target,
                  const Operands& operands) {
    return request.getInstance(target, listOf(operands));
}

Reply associatorNames(EmbeddedBroker& /*broker*/, Request& request, const CMPIObjectPath* target,
                      const Operands& operands) {
    return request.associatorNames(target, operands.filter);
}

Reply associators(EmbeddedBroker& /*broker*/, Request& request, const CMPIObjectPath* target,
                  const Operands& operands) {
    return request.associators(target, operands.filter, listOf(operands));
}

Reply referenceNames(EmbeddedBroker& /*broker*/, Request& request, const CMPIObjectPath* target,
                     const Operands& operands) {
    return request.referenceNames(target, operands.filter);
}

Reply references(EmbeddedBroker& /*broker*/, Request& request, const CMPIObjectPath* target,
                 const Operands& operands) {
    return request.references(target, operands.filter, listOf(operands));
}

Reply callMethod(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* target,
                 const Operands& operands) {
    return request.invokeMethod(target, operands.method,
                                argumentsFrom(broker, request, target, operands.method, operands.values));
}

Reply createInstance(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* target,
                     const Operands& operands) {
    return request.createInstance(target, instanceFrom(broker, request, target, operands.values));
}

// Without a property list a provider sets what the instance lacks to NULL.
Reply modifyInstance(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* target,
                     const Operands& operands) {
    const std::vector<std::string> named = namesOfValues(operands.values);
    return request.modifyInstance(target, instanceFrom(broker, request, target, operands.values), &named);
}

Reply deleteInstance(EmbeddedBroker& /*broker*/, Request& request, const CMPIObjectPath* target,
                     const Operands& /*operands*/) {
    return request.deleteInstance(target);
}

Reply execQuery(EmbeddedBroker& /*broker*/, Request& request, const CMPIObjectPath* target,
                const Operands& operands) {
    return request.execQuery(target, operands.query, operands.language);
}

} // namespace

const std::vector<Operation>& operations() {
    static const std::vector<Operation> all = {
        {"ein", Target::ofClass, Takes::nothing, Yields::paths, "CLASS: the paths of its instances",
         enumerateNames},
        {"ei", Target::ofClass, Takes::nothing, Yields::instances, "CLASS: its instances", enumerate},
        {"gi", Target::ofInstance, Takes::nothing, Yields::oneInstance, "PATH: the instance", getInstance},
        {"an", Target::ofInstance, Takes::filter, Yields::paths,
         "PATH: the paths of the instances associated with it", associatorNames},
        {"ai", Target::ofInstance, Takes::filter, Yields::instances, "PATH: the instances associated with it",
         associators},
        {"rn", Target::ofInstance, Takes::referenceFilter, Yields::paths,
         "PATH: the paths of the associations that refer to it", referenceNames},
        {"ri", Target::ofInstance, Takes::referenceFilter, Yields::instances,
         "PATH: the associations that refer to it", references},
        {"cm", Target::ofInstance, Takes::method, Yields::methodResult,
         "PATH METHOD name=value ...: call a method of the instance", callMethod},
        {"ci", Target::ofInstance, Takes::values, Yields::onePath,
         "PATH name=value ...: create an instance; prints its path", createInstance},
        {"mi", Target::ofInstance, Takes::values, Yields::nothing,
         "PATH name=value ...: change these properties of the instance", modifyInstance},
        {"di", Target::ofInstance, Takes::nothing, Yields::nothing, "PATH: delete the instance",
         deleteInstance},
        {"xq", Target::ofClass, Takes::query, Yields::instances, "CLASS QUERY: what the query selects",
         execQuery},
    };
    return all;
}

} // namespace oxahv::runner
