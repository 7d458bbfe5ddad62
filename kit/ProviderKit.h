/**
 * @file
 * All of the kit: a CIM provider as a C++ class. Start with oxahv::InstanceProvider.
 */
#pragma once

#include "AssociationProvider.h"
#include "Context.h"
#include "Entry.h"
#include "IndicationProvider.h"
#include "Instance.h"
#include "InstanceProvider.h"
#include "MethodProvider.h"
#include "Operation.h"
#include "Path.h"
#include "PropertyProvider.h"
#include "Refusal.h"
#include "Replies.h"
#include "Value.h"
