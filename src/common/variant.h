/* Include first in every variant source. Gives the decorating macro for
 * external names, the per-level namespace and the declarations of this
 * level's bodies of every public operation (typed after the public
 * prototype, so a body that drifts from its header does not compile). */
#ifndef ZOR_VARIANT_H
#define ZOR_VARIANT_H

#include "level_config.h"
#include "zor.h"

#define ZOR_PASTE_(a, b) a##_##b
#define ZOR_PASTE(a, b) ZOR_PASTE_(a, b)
/* ZOR_NAME(zoriAdd_32f_C1R) is e9_zoriAdd_32f_C1R in the e9 build. */
#define ZOR_NAME(name) ZOR_PASTE(ZOR_LEVEL, name)
/* Namespace for everything else a variant defines; the partial link makes
 * it local as well, this keeps the names apart at compile time. */
#define ZOR_NS ZOR_PASTE(zor, ZOR_LEVEL)
#define ZOR_BEGIN namespace ZOR_NS {
#define ZOR_END }

#define ZOR_ENTRY extern "C" __attribute__((visibility("default")))

#define ZOR_API(name) ZOR_ENTRY decltype(::name) ZOR_NAME(name);
#include "jmp_names.def"
#undef ZOR_API

#endif
