// Reaching level-private operations: every level's body of each internal
// operation is declared here, and ZOR_BODY(name) picks the one of the level
// a LevelTest runs for. Test executables that include this link the static
// zor_internal library instead of the shared one.
#ifndef ZOR_TEST_INTERNAL_H
#define ZOR_TEST_INTERNAL_H

#include <array>

#include "zor_internal.h"
#include "zori_internal.h"
#include "zori_border.h"
#include "zortest.h"

#define ZOR_TEST_DECLARE(level, fn) extern "C" decltype(::fn) level##_##fn;
#define ZOR_INTERNAL_API(fn) ZOR_LEVEL_NAMES(ZOR_TEST_DECLARE, fn)
#include "internal_names.def"
#include "internal_image_names.def"
#include "internal_border_names.def"
#undef ZOR_INTERNAL_API
#undef ZOR_TEST_DECLARE

#define ZOR_TEST_BODY(level, fn) &level##_##fn,
// The seven bodies of an operation, in level order.
#define ZOR_BODIES(fn) (std::array<decltype(&::fn), ZOR_LEVEL_COUNT>{ZOR_LEVEL_NAMES(ZOR_TEST_BODY, fn)})
// The body of the level the current LevelTest runs for.
#define ZOR_BODY(fn) (ZOR_BODIES(fn)[GetParam().index])

#endif
