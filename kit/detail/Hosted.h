// A provider's object in a CIM server: made by the first factory call, destroyed by the last cleanup.
#pragma once

#include "../AssociationProvider.h"
#include "../IndicationProvider.h"
#include "../InstanceProvider.h"
#include "../MethodProvider.h"
#include "../PropertyProvider.h"
#include "Utf8Thread.h"

#include <mutex>
#include <string>

namespace oxahv::detail {

struct Hosted;

// What a library keeps of one provider. It has no destructor: at the end of a process, requests may still
// run.
struct Module {
    const char* name;
    std::mutex mutex{};
    Hosted* first = nullptr; // of each broker one; guarded by the mutex
};

// The object for one broker, with the records by which that broker calls it.
struct Hosted {
    Hosted(Module& itsModule, const CMPIBroker* itsBroker, const char* itsCategory)
        : module(itsModule), broker(itsBroker), category(itsCategory) {}

    Module& module;
    const CMPIBroker* broker;
    std::string category;
    Utf8Locale locale{};
    unsigned int users = 0; // factory calls without their cleanup; guarded by the module's mutex
    Hosted* next = nullptr; // likewise

    void* object = nullptr;
    void (*destroy)(void* object) = nullptr;
    // The object as what it serves; null for what it does not.
    InstanceProvider* instances = nullptr;
    AssociationProvider* associations = nullptr;
    MethodProvider* methods = nullptr;
    PropertyProvider* properties = nullptr;
    IndicationProvider* indications = nullptr;

    CMPIInstanceMIFT instanceTable{};
    CMPIAssociationMIFT associationTable{};
    CMPIMethodMIFT methodTable{};
    CMPIPropertyMIFT propertyTable{};
    CMPIIndicationMIFT indicationTable{};
    CMPIInstanceMI instanceMI{this, &instanceTable};
    CMPIAssociationMI associationMI{this, &associationTable};
    CMPIMethodMI methodMI{this, &methodTable};
    CMPIPropertyMI propertyMI{this, &propertyTable};
    CMPIIndicationMI indicationMI{this, &indicationTable};
};

template <class MI>
Hosted& hostedOf(const MI* mi) {
    return *static_cast<Hosted*>(const_cast<void*>(static_cast<const void*>(mi->hdl)));
}

} // namespace oxahv::detail
