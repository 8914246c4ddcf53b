/* Include first in every variant source. Gives the decorating macro for
 * external names, the per-level namespace and the declarations of this
 * level's bodies of every public and internal operation (typed after the public
 * prototype, so a body that drifts from its header does not compile). */
#ifndef ZOR_VARIANT_H
#define ZOR_VARIANT_H

#include "level_config.h"
#include "zor.h"
#include "zor_internal.h"
#include "zori_internal.h"
#include "zori_border.h"

#define ZOR_BEGIN namespace ZOR_NS {
#define ZOR_END }

#define ZOR_ENTRY extern "C" __attribute__((visibility("default")))

#define ZOR_API(name) ZOR_ENTRY decltype(::name) ZOR_NAME(name);
#include "jmp_names.def"
#undef ZOR_API

/* A public name that is another one's body under a second name: it keeps
 * its own stub and table, and this level's slot holds the first name's
 * code. The two prototypes must agree. */
#define ZOR_STR_(x) #x
#define ZOR_STR(x) ZOR_STR_(x)
#define ZOR_SECOND_NAME(name, first) \
    ZOR_ENTRY decltype(::name) ZOR_NAME(name) __attribute__((alias(ZOR_STR(ZOR_NAME(first))), nothrow));

/* Level-private operations: global inside the level's partial link, never
 * exported from the library. */
#define ZOR_INTERNAL extern "C" __attribute__((visibility("hidden")))
#define ZOR_INTERNAL_API(name) ZOR_INTERNAL decltype(::name) ZOR_NAME(name);
#include "internal_names.def"
#include "internal_image_names.def"
#include "internal_border_names.def"
#undef ZOR_INTERNAL_API

#endif
