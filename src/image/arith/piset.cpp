// Fills: zoriSet_32f_C1R and the 8u and 16s fills other operations use.
// Every width goes through one byte kernel with a 16-byte pattern of the
// value, so the stored bits are the value's own (NaN payloads included).
#include "variant.h"

#include "piinternal.h"

ZOR_BEGIN
namespace {

using arith::VB;
using simd::vu8;

// The pattern repeated over a vector, starting at byte phase off (0..15).
inline vu8 pattern_at(const Zor8u pattern[16], size_t off) {
    Zor8u b[VB + 16];
    for (size_t i = 0; i < VB; i += 16) memcpy(b + i, pattern, 16);
    memcpy(b + VB, pattern, 16);
    return simd::load<vu8>(b + (off & 15));
}

template <bool NT>
void fill_body(Zor8u* a, Zor8u* end, vu8 v) {
    // Four stores a round while a whole round fits.
    for (; a + 4 * VB <= end; a += 4 * VB) {
        if (NT) {
            simd::stream(a, v);
            simd::stream(a + VB, v);
            simd::stream(a + 2 * VB, v);
            simd::stream(a + 3 * VB, v);
        } else {
            simd::store(a, v);
            simd::store(a + VB, v);
            simd::store(a + 2 * VB, v);
            simd::store(a + 3 * VB, v);
        }
    }
    for (; a + VB <= end; a += VB) {
        if (NT)
            simd::stream(a, v);
        else
            simd::store(a, v);
    }
}

}  // namespace

void owniSet_8u_C4_M7(const Zor8u pattern[16], Zor8u* dst, size_t len, int nt) {
    if (len < VB) {
        for (size_t i = 0; i < len; ++i) dst[i] = pattern[i & 15];
        return;
    }
    Zor8u* end = dst + len;
    // Unaligned first and last vectors; vector-aligned stores between them.
    simd::store(dst, pattern_at(pattern, 0));
    simd::store(end - VB, pattern_at(pattern, len - VB));
    Zor8u* a = (Zor8u*)(((uintptr_t)dst + VB - 1) & ~(uintptr_t)(VB - 1));
    const vu8 v = pattern_at(pattern, (size_t)(a - dst));
    if (nt) {
        fill_body<true>(a, end, v);
        simd::store_fence();
    } else {
        fill_body<false>(a, end, v);
    }
}

void owniSet_C1R(const Zor8u pattern[16], Zor8u* pDst, int32_t dstStep, int64_t rowBytes,
                 int32_t height) {
    // The byte count as the 32-bit product the cache test compares (it
    // wraps for images beyond 2 GiB, which then may not stream).
    const int32_t total = (int32_t)((uint32_t)rowBytes * (uint32_t)height);
    int nt = 0;
    if (total >= 0x80001) {
        int32_t cache = 0;
        if (zorGetMaxCacheSizeB(&cache) == zorStsNoErr && total >= cache) nt = 1;
    }
    if (dstStep == rowBytes) {
        owniSet_8u_C4_M7(pattern, pDst, (size_t)rowBytes * (size_t)height, nt);
        return;
    }
    for (int32_t y = 0; y < height; ++y)
        owniSet_8u_C4_M7(pattern, row_at(pDst, dstStep, y), (size_t)rowBytes, nt);
}

namespace {

template <typename T>
inline ZorStatus set_image(T value, T* pDst, int32_t dstStep, ZoriSize roiSize) {
    if (!pDst) return zorStsNullPtrErr;
    if (roiSize.width < 1 || roiSize.height < 1) return zorStsSizeErr;
    Zor8u pattern[16];
    for (size_t i = 0; i < 16; i += sizeof(T)) memcpy(pattern + i, &value, sizeof(T));
    owniSet_C1R(pattern, (Zor8u*)pDst, dstStep, (int64_t)roiSize.width * (int64_t)sizeof(T),
                roiSize.height);
    return zorStsNoErr;
}

}  // namespace
ZOR_END

ZOR_ENTRY ZorStatus ZOR_NAME(zoriSet_32f_C1R)(Zor32f value, Zor32f* pDst, int32_t dstStep,
                                              ZoriSize roiSize) {
    return ZOR_NS::set_image(value, pDst, dstStep, roiSize);
}

ZOR_INTERNAL ZorStatus ZOR_NAME(zoriSet_8u_C1R)(Zor8u value, Zor8u* pDst, int32_t dstStep,
                                                ZoriSize roiSize) {
    return ZOR_NS::set_image(value, pDst, dstStep, roiSize);
}

ZOR_INTERNAL ZorStatus ZOR_NAME(zoriSet_16s_C1R)(Zor16s value, Zor16s* pDst, int32_t dstStep,
                                                 ZoriSize roiSize) {
    return ZOR_NS::set_image(value, pDst, dstStep, roiSize);
}
