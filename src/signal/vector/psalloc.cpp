// Typed vector allocators: element count checks, then the shared aligned
// allocator. Identical on every level.
#include "variant.h"

ZOR_BEGIN

static void* alloc_elements(int32_t len, int64_t elementBytes) {
    if (len < 1 || (int64_t)len * elementBytes >= 0x80000000LL) return nullptr;
    return zorMalloc((int32_t)((int64_t)len * elementBytes));
}

ZOR_END

ZOR_ENTRY Zor8u* ZOR_NAME(zorsMalloc_8u)(int32_t len) {
    return (Zor8u*)ZOR_NS::alloc_elements(len, 1);
}
ZOR_ENTRY Zor16u* ZOR_NAME(zorsMalloc_16u)(int32_t len) {
    return (Zor16u*)ZOR_NS::alloc_elements(len, 2);
}
ZOR_ENTRY Zor32f* ZOR_NAME(zorsMalloc_32f)(int32_t len) {
    return (Zor32f*)ZOR_NS::alloc_elements(len, 4);
}
ZOR_ENTRY Zor64f* ZOR_NAME(zorsMalloc_64f)(int32_t len) {
    return (Zor64f*)ZOR_NS::alloc_elements(len, 8);
}
ZOR_ENTRY void ZOR_NAME(zorsFree)(void* ptr) {
    zorFree(ptr);
}
