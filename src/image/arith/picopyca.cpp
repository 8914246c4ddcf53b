// Copies: zoriCopy_32f_C1R, zoriCopy_16u_C1R and the 8u and 16s copies
// other operations use, all through one byte kernel; and the masked copy
// zoriCopy_32f_C1MR.
#include "variant.h"

#include "piinternal.h"

ZOR_BEGIN
namespace {

using arith::VB;
using simd::vu8;

typedef uint8_t v16u8 __attribute__((vector_size(16)));
typedef uint8_t v32u8 __attribute__((vector_size(32)));

// Two moves of the largest power of two that fits (they overlap in the
// middle), all loads before the stores.
template <typename W>
inline void move_two(Zor8u* d, const Zor8u* s, size_t n) {
    W a, b;
    memcpy(&a, s, sizeof a);
    memcpy(&b, s + n - sizeof b, sizeof b);
    memcpy(d, &a, sizeof a);
    memcpy(d + n - sizeof b, &b, sizeof b);
}

inline void copy_small(Zor8u* d, const Zor8u* s, size_t n) {
    if constexpr (VB > 32) {
        if (n >= 32) return move_two<v32u8>(d, s, n);
    }
    if constexpr (VB > 16) {
        if (n >= 16) return move_two<v16u8>(d, s, n);
    }
    if (n >= 8) return move_two<uint64_t>(d, s, n);
    if (n >= 4) return move_two<uint32_t>(d, s, n);
    if (n >= 2) return move_two<uint16_t>(d, s, n);
    if (n == 1) *d = *s;
}

}  // namespace

void owniCopy_8u_C1_M7(const Zor8u* src, Zor8u* dst, size_t len, int large) {
    if (large && len >= 512) {
        // The string move writes whole cache lines without reading them
        // first, where the vector loop's stores must fetch each line: on a
        // large image that is a third of the memory traffic.
        __asm__ volatile("rep movsb" : "+D"(dst), "+S"(src), "+c"(len) : : "memory");
        return;
    }
    if (len < VB) {
        copy_small(dst, src, len);
        return;
    }
    const vu8 head = simd::load<vu8>(src), tail = simd::load<vu8>(src + len - VB);
    if (len > 2 * VB) {
        // Stores on vector boundaries of the destination: a store across two
        // cache lines costs two. The unaligned ends are the head and tail.
        size_t i = VB - ((uintptr_t)dst & (VB - 1));
        for (; i + 4 * VB <= len; i += 4 * VB) {
            const vu8 a = simd::load<vu8>(src + i), b = simd::load<vu8>(src + i + VB);
            const vu8 c = simd::load<vu8>(src + i + 2 * VB);
            const vu8 e = simd::load<vu8>(src + i + 3 * VB);
            simd::store(dst + i, a);
            simd::store(dst + i + VB, b);
            simd::store(dst + i + 2 * VB, c);
            simd::store(dst + i + 3 * VB, e);
        }
        for (; i + VB <= len; i += VB) simd::store(dst + i, simd::load<vu8>(src + i));
    }
    simd::store(dst, head);
    simd::store(dst + len - VB, tail);
}

void owniCopy_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst, int32_t dstStep,
                  int64_t rowBytes, int32_t height) {
    const int large = rowBytes * height >= 0x100001;
    if (srcStep == dstStep && dstStep == rowBytes) {
        owniCopy_8u_C1_M7(pSrc, pDst, (size_t)rowBytes * (size_t)height, large);
        return;
    }
    for (int32_t y = 0; y < height; ++y)
        owniCopy_8u_C1_M7(row_at(pSrc, srcStep, y), row_at(pDst, dstStep, y),
                          (size_t)rowBytes, large);
}

// ---- masked copy ------------------------------------------------------------

namespace {

// Bit k set where mask byte k of the 16 is not zero.
inline unsigned mask_bits16(const Zor8u* m) {
    const __m128i v = _mm_loadu_si128((const __m128i*)m);
    return (unsigned)_mm_movemask_epi8(_mm_cmpeq_epi8(v, _mm_setzero_si128())) ^ 0xffffu;
}

inline void copy_pixel(const Zor32f* s, Zor32f* d) { memcpy(d, s, 4); }

// A block of 16 pixels with some mask bytes clear: write only the selected
// pixels (the whole source block may be read).
inline void copy_selected16(const Zor32f* s, Zor32f* d, const Zor8u* m, unsigned bits) {
#if ZOR_VECTOR_BYTES == 64
    (void)m;
    _mm512_mask_storeu_ps(d, (__mmask16)bits, _mm512_loadu_ps(s));
#elif ZOR_VECTOR_BYTES == 32
    (void)bits;
    const __m128i sel = ~_mm_cmpeq_epi8(_mm_loadu_si128((const __m128i*)m), _mm_setzero_si128());
#if !ZOR_HAS_AVX2
    // Byte masks widened four at a time (no 256-bit integer work on AVX).
    const __m256i lo = _mm256_setr_m128i(_mm_cvtepi8_epi32(sel),
                                         _mm_cvtepi8_epi32(_mm_srli_si128(sel, 4)));
    const __m256i hi = _mm256_setr_m128i(_mm_cvtepi8_epi32(_mm_srli_si128(sel, 8)),
                                         _mm_cvtepi8_epi32(_mm_srli_si128(sel, 12)));
#else
    const __m256i lo = _mm256_cvtepi8_epi32(sel);
    const __m256i hi = _mm256_cvtepi8_epi32(_mm_srli_si128(sel, 8));
#endif
    _mm256_maskstore_ps(d, lo, _mm256_loadu_ps(s));
    _mm256_maskstore_ps(d + 8, hi, _mm256_loadu_ps(s + 8));
#else
    (void)m;
    for (; bits; bits &= bits - 1) {
        const int k = __builtin_ctz(bits);
        copy_pixel(s + k, d + k);
    }
#endif
}

}  // namespace

void owniCopy_32f_C1M_M7(const Zor32f* src, Zor32f* dst, const Zor8u* mask, int32_t width) {
    // Single pixels until the destination is 16-byte aligned (a destination
    // off the 4-byte grid never gets there: the whole row goes singly).
    const uintptr_t a = (uintptr_t)dst;
    int32_t head = (a & 3) ? width : (int32_t)(((16 - (a & 15)) & 15) >> 2);
    if (head > width) head = width;
    int32_t i = 0;
    for (; i < head; ++i)
        if (mask[i]) copy_pixel(src + i, dst + i);
    for (; i + 16 <= width; i += 16) {
        const unsigned bits = mask_bits16(mask + i);
        if (bits == 0) continue;  // neither source nor destination touched
        if (bits == 0xffffu) {
            simd::vu8 v[64 / VB];
            for (size_t k = 0; k < 64 / VB; ++k) v[k] = simd::load<simd::vu8>((const Zor8u*)(src + i) + k * VB);
            for (size_t k = 0; k < 64 / VB; ++k) simd::store((Zor8u*)(dst + i) + k * VB, v[k]);
        } else {
            copy_selected16(src + i, dst + i, mask + i, bits);
        }
    }
    for (; i < width; ++i)
        if (mask[i]) copy_pixel(src + i, dst + i);
}

namespace {

template <typename T>
inline ZorStatus copy_image(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep,
                            ZoriSize roiSize) {
    if (!pSrc || !pDst) return zorStsNullPtrErr;
    if (roiSize.width < 1 || roiSize.height < 1) return zorStsSizeErr;
    owniCopy_C1R((const Zor8u*)pSrc, srcStep, (Zor8u*)pDst, dstStep,
                 (int64_t)roiSize.width * (int64_t)sizeof(T), roiSize.height);
    return zorStsNoErr;
}

}  // namespace
ZOR_END

ZOR_INTERNAL ZorStatus ZOR_NAME(zoriCopy_8u_C1R)(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                                 int32_t dstStep, ZoriSize roiSize) {
    return ZOR_NS::copy_image(pSrc, srcStep, pDst, dstStep, roiSize);
}

ZOR_INTERNAL ZorStatus ZOR_NAME(zoriCopy_16s_C1R)(const Zor16s* pSrc, int32_t srcStep,
                                                  Zor16s* pDst, int32_t dstStep,
                                                  ZoriSize roiSize) {
    return ZOR_NS::copy_image(pSrc, srcStep, pDst, dstStep, roiSize);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriCopy_16u_C1R)(const Zor16u* pSrc, int32_t srcStep, Zor16u* pDst,
                                               int32_t dstStep, ZoriSize roiSize) {
    // The same bits as the signed copy.
    return ZOR_NAME(zoriCopy_16s_C1R)((const Zor16s*)pSrc, srcStep, (Zor16s*)pDst, dstStep,
                                      roiSize);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriCopy_32f_C1R)(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                               int32_t dstStep, ZoriSize roiSize) {
    return ZOR_NS::copy_image(pSrc, srcStep, pDst, dstStep, roiSize);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriCopy_32f_C1MR)(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                                int32_t dstStep, ZoriSize roiSize,
                                                const Zor8u* pMask, int32_t maskStep) {
    if (!pSrc || !pDst || !pMask) return zorStsNullPtrErr;
    if (roiSize.width < 1 || roiSize.height < 1) return zorStsSizeErr;
    for (int32_t y = 0; y < roiSize.height; ++y)
        ZOR_NS::owniCopy_32f_C1M_M7(ZOR_NS::row_at(pSrc, srcStep, y),
                                    ZOR_NS::row_at(pDst, dstStep, y),
                                    ZOR_NS::row_at(pMask, maskStep, y), roiSize.width);
    return zorStsNoErr;
}
