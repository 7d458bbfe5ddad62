/* What the compiler of C makes of the headers: layout, codes, and every convenience name. */
#define USES usesInC
#define PROVIDER ProviderInC
#include "Uses.h"

#include <assert.h>

#define CODE(name, value) static_assert((long)(name) == (value), #name);
#define SIZE(record, size) static_assert(sizeof(record) == (size), #record);
#define MEMBER(record, member, offset, ...)                                                    \
    static_assert(offsetof(record, member) == (offset), #record "." #member);                  \
    static_assert(__builtin_types_compatible_p(__typeof__(((record*)0)->member), __VA_ARGS__), \
                  #record "." #member);
#include "CmpiStandard.inc"
