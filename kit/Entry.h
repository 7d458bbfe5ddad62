/**
 * @file
 * OXAHV_PROVIDER, which makes a class the provider that a CIM server loads.
 */
#pragma once

#include "AssociationProvider.h"
#include "InstanceProvider.h"
#include "MethodProvider.h"

/**
 * Defines the factory functions of a provider, `NAME_Create_InstanceMI`, `NAME_Create_AssociationMI` and
 * `NAME_Create_MethodMI`: those of the kinds that the class derives from. At namespace scope, once in a
 * library for each name.
 *
 * The server's first call of a factory makes an object of the class, for each broker one that all kinds
 * share; the last `cleanup` destroys it. Its constructor takes a `const oxahv::Context&`, the server's, or
 * nothing; what it throws becomes the factory's status. It must not send requests to the server.
 *
 * @param name the provider's name (the MI name), an identifier.
 * @param Class a class that derives from InstanceProvider, AssociationProvider or MethodProvider, or from
 * several of them. Where it has a member `static constexpr const char* traceCategory`, that is the category
 * of its traces; else the provider's name is.
 */
#define OXAHV_PROVIDER(name, Class)
