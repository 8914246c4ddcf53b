// Image allocators: one block whose rows each start on a 64-byte boundary.
#include "variant.h"

ZOR_BEGIN

static void* alloc_image(int32_t width, int32_t height, int64_t pixelBytes, bool limitRow,
                         int32_t* pStepBytes) {
    if (!pStepBytes) return nullptr;
    if (width < 1 || height < 1) {
        *pStepBytes = 0;
        return nullptr;
    }
    int64_t rowBytes = (int64_t)width * pixelBytes;
    if (limitRow && rowBytes > 0x7fffffffLL) {
        *pStepBytes = 0;
        return nullptr;
    }
    int64_t step = (rowBytes + 63) & ~(int64_t)63;
    *pStepBytes = (int32_t)step;
    int64_t total = step * height;
    if (total >= 0x80000000LL) return nullptr;
    return zorMalloc((int32_t)total);
}

ZOR_END

ZOR_ENTRY Zor8u* ZOR_NAME(zoriMalloc_8u_C1)(int32_t widthPixels, int32_t heightPixels,
                                            int32_t* pStepBytes) {
    return (Zor8u*)ZOR_NS::alloc_image(widthPixels, heightPixels, 1, false, pStepBytes);
}
ZOR_ENTRY Zor32f* ZOR_NAME(zoriMalloc_32f_C1)(int32_t widthPixels, int32_t heightPixels,
                                              int32_t* pStepBytes) {
    return (Zor32f*)ZOR_NS::alloc_image(widthPixels, heightPixels, 4, true, pStepBytes);
}
ZOR_ENTRY void ZOR_NAME(zoriFree)(void* ptr) {
    zorFree(ptr);
}
