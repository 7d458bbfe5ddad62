// The functions of each of CMPI's tables, in the order of memory.
#pragma once

#include <cmpift.h>

// Calls `visit` with the name and the function of each slot.
#define TABLE(table)          \
    template <class Function> \
    void forEachSlot(const table& functions, Function visit) {
#define SLOT(table, slot) visit(#table "." #slot, functions.slot);
#define END_TABLE() }
#include "CmpiStandard.inc"
