// Row kernels and per-level helpers shared by the point operations (and by
// any other image code of the same level that fills, copies or thresholds).
// Kernels trust their callers: no argument checks. Included by variant
// sources only, after variant.h.
#ifndef ZOR_PIINTERNAL_H
#define ZOR_PIINTERNAL_H

#include <immintrin.h>
#include <stddef.h>
#include <stdint.h>
#include <string.h>

#include "simd.h"

ZOR_BEGIN

// ---- kernels (defined in the arith sources) --------------------------------

// len bytes from src to dst (not overlapping). large: the image the row
// belongs to is large, which only selects the shape of the loop.
void owniCopy_8u_C1_M7(const Zor8u* src, Zor8u* dst, size_t len, int large);
// len bytes of dst from a 16-byte pattern that starts at dst. nt: stream the
// aligned body past the caches (a store fence ends the call).
void owniSet_8u_C4_M7(const Zor8u pattern[16], Zor8u* dst, size_t len, int nt);
// One row of the masked copy of 4-byte pixels.
void owniCopy_32f_C1M_M7(const Zor32f* src, Zor32f* dst, const Zor8u* mask, int32_t width);
// dst = src ^ value over the ROI (no checks).
void ownpi_XorC_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u value, Zor8u* pDst,
                       int32_t dstStep, ZoriSize roiSize);
// Threshold without value: relation 4 clips from above (processor minimum,
// source first), 0 from below (maximum); any other relation gives -14.
// Checks: pointers, ROI, steps >= 1, relation.
ZorStatus owniThreshold_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                int32_t dstStep, ZoriSize roiSize, Zor32f threshold,
                                int32_t relation);
// The fill of Set in every element width: rows of rowBytes, merged into one
// run when the step is the row length; non-temporal stores when the image
// is at least as large as the biggest cache (asked only from 0x80001 bytes).
void owniSet_C1R(const Zor8u pattern[16], Zor8u* pDst, int32_t dstStep, int64_t rowBytes,
                 int32_t height);
// The copy of every element width: one run when both steps are the row
// length; the kernel's large-image loop from 0x100001 bytes.
void owniCopy_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst, int32_t dstStep,
                  int64_t rowBytes, int32_t height);

// ---- per-level helpers -----------------------------------------------------

namespace arith {

constexpr size_t VB = simd::vectorBytes;

inline const Zor8u* row(const void* p, int32_t step, int32_t y) {
    return (const Zor8u*)p + (ptrdiff_t)y * step;
}
inline Zor8u* row(void* p, int32_t step, int32_t y) { return (Zor8u*)p + (ptrdiff_t)y * step; }

// Store one vector past the caches; p is vector aligned.
inline void stream_store(void* p, simd::vu8 v) {
#if ZOR_VECTOR_BYTES == 16
    _mm_stream_si128((__m128i*)p, (__m128i)v);
#elif ZOR_VECTOR_BYTES == 32
    _mm256_stream_si256((__m256i*)p, (__m256i)v);
#else
    _mm512_stream_si512((__m512i*)p, (__m512i)v);
#endif
}

inline void store_fence() { _mm_sfence(); }

// Round to nearest integer in the rounding mode in force (the conversion
// instruction, not a truncation); out-of-range lanes give 0x80000000.
inline simd::vs32 round_to_int(simd::vf32 v) {
#if ZOR_VECTOR_BYTES == 16
    return (simd::vs32)_mm_cvtps_epi32((__m128)v);
#elif ZOR_VECTOR_BYTES == 32
    return (simd::vs32)_mm256_cvtps_epi32((__m256)v);
#else
    return (simd::vs32)_mm512_cvtps_epi32((__m512)v);
#endif
}

inline int32_t round_to_int(float v) { return _mm_cvtss_si32(_mm_set_ss(v)); }

// Sixteen 32-bit lanes, given as 16 / lanes vectors, narrowed to sixteen
// bytes: lane masks (0 or -1) to 0 or 0xff, or values 0..255 as they are
// (Unsigned). Each value must already fit; only its low byte is kept.
typedef uint8_t v16u8 __attribute__((vector_size(16)));
constexpr int kMaskVectors = 64 / ZOR_VECTOR_BYTES;

template <bool Unsigned>
inline __m128i pack_words(__m128i a, __m128i b) {
    return Unsigned ? _mm_packus_epi16(a, b) : _mm_packs_epi16(a, b);
}

template <bool Unsigned>
inline v16u8 narrow16(const simd::vs32* m) {
#if ZOR_VECTOR_BYTES == 16
    __m128i a = _mm_packs_epi32((__m128i)m[0], (__m128i)m[1]);
    __m128i b = _mm_packs_epi32((__m128i)m[2], (__m128i)m[3]);
    return (v16u8)pack_words<Unsigned>(a, b);
#elif defined(ZOR_LEVEL_e9)
    // AVX has no 256-bit integer packs: two halves each.
    __m256i m0 = (__m256i)m[0], m1 = (__m256i)m[1];
    __m128i a = _mm_packs_epi32(_mm256_castsi256_si128(m0), _mm256_extractf128_si256(m0, 1));
    __m128i b = _mm_packs_epi32(_mm256_castsi256_si128(m1), _mm256_extractf128_si256(m1, 1));
    return (v16u8)pack_words<Unsigned>(a, b);
#elif ZOR_VECTOR_BYTES == 32
    __m256i w = _mm256_packs_epi32((__m256i)m[0], (__m256i)m[1]);  // in-lane order
    __m128i b = pack_words<Unsigned>(_mm256_castsi256_si128(w), _mm256_extracti128_si256(w, 1));
    // b holds m0[0..3] m1[0..3] m0[4..7] m1[4..7]: put the dwords in order.
    return (v16u8)_mm_shuffle_epi32(b, _MM_SHUFFLE(3, 1, 2, 0));
#else
    return (v16u8)_mm512_cvtepi32_epi8((__m512i)m[0]);
#endif
}

}  // namespace arith

ZOR_END

#endif
