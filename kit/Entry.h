/**
 * @file
 * OXAHV_PROVIDER, which makes a class the provider that a CIM server loads.
 */
#pragma once

#include "AssociationProvider.h"
#include "IndicationProvider.h"
#include "InstanceProvider.h"
#include "MethodProvider.h"
#include "PropertyProvider.h"
#include "detail/Tables.h"

#include <TKExport.h>

/** Declares a factory function, and defines it when the class has the kind: a function that a class template
 * defines as its friend comes into being with that class. Used by OXAHV_PROVIDER alone. */
#define OXAHV_FACTORY_(name, Kind, member)                                                                \
    extern "C" TK_EXPORT CMPI##Kind##MI* name##_Create_##Kind##MI(const CMPIBroker*, const CMPIContext*,  \
                                                                  CMPIStatus*);                           \
    template <class Provider, bool isServed>                                                              \
    struct OxahvFactory_##name##_##Kind {                                                                 \
        static constexpr decltype(&name##_Create_##Kind##MI) get() { return nullptr; }                    \
    };                                                                                                    \
    template <class Provider>                                                                             \
    struct OxahvFactory_##name##_##Kind<Provider, true> {                                                 \
        friend CMPI##Kind##MI* name##_Create_##Kind##MI(const CMPIBroker* broker,                         \
                                                        const CMPIContext* context, CMPIStatus* status) { \
            return ::oxahv::detail::makeMI<Provider>(oxahvModule_##name, broker, context, status,         \
                                                     &::oxahv::detail::Hosted::member);                   \
        }                                                                                                 \
        static constexpr auto get() { return &name##_Create_##Kind##MI; }                                 \
    };                                                                                                    \
    [[gnu::used]] static const auto oxahv##Kind##Factory_##name = OxahvFactory_##name##_##Kind<           \
        OxahvClass_##name, ::std::is_convertible_v<OxahvClass_##name*, ::oxahv::Kind##Provider*>>::get()

/**
 * Defines the factory functions of a provider, `NAME_Create_InstanceMI`,
 * `NAME_Create_AssociationMI`, `NAME_Create_MethodMI`, `NAME_Create_PropertyMI` and
 * `NAME_Create_IndicationMI`: those of the kinds that the class derives from. At namespace scope, once in a
 * library for each name, and followed by a semicolon.
 *
 * The server's first call of a factory makes an object of the class, for each broker one that all kinds
 * share; the last `cleanup` destroys it. Its constructor takes a `const oxahv::Context&`, the server's, or
 * nothing; what it throws becomes the factory's status. It must not send requests to the server.
 *
 * @param name the provider's name (the MI name), an identifier.
 * @param Class a class that derives from InstanceProvider, AssociationProvider, MethodProvider,
 * PropertyProvider or IndicationProvider, or from several of them. Where it has a member `static constexpr
 * const char* traceCategory`, that is the category of its traces; else the provider's name is.
 */
#define OXAHV_PROVIDER(name, Class)                           \
    using OxahvClass_##name = Class;                          \
    static ::oxahv::detail::Module oxahvModule_##name{#name}; \
    OXAHV_FACTORY_(name, Instance, instanceMI);               \
    OXAHV_FACTORY_(name, Association, associationMI);         \
    OXAHV_FACTORY_(name, Method, methodMI);                   \
    OXAHV_FACTORY_(name, Property, propertyMI);               \
    OXAHV_FACTORY_(name, Indication, indicationMI)
