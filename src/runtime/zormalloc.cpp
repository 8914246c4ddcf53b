// The one allocator: 64-byte aligned blocks over malloc, the malloc
// pointer kept in the 8 bytes below the caller's address.
#include <stdlib.h>
#include "runtime_internal.h"

ZOR_EXPORT void* zorMalloc(int32_t length) {
    if (length < 1) return nullptr;
    const int32_t total = (int32_t)((uint32_t)length + 72u);
    if (total < length) return nullptr;  // past 2 GiB
    void* block = malloc((size_t)total);
    if (!block) return nullptr;
    const uintptr_t user = ((uintptr_t)block + 71) & ~(uintptr_t)63;
    ((void**)user)[-1] = block;
    return (void*)user;
}

ZOR_EXPORT void zorFree(void* ptr) {
    if (ptr) free(((void**)ptr)[-1]);
}
