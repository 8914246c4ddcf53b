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
#include "variant.h"
#include "simd.h"

ZOR_BEGIN

// ---- kernels (defined in the arith sources) --------------------------------

// len bytes from src to dst (not overlapping). large: the image the row
// belongs to is large, which selects the string move for long rows.
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

// The processor's minimum and maximum: the second operand where the first
// is NaN or the two are equal.
inline simd::vf32 vmin(simd::vf32 a, simd::vf32 b) {
#if ZOR_VECTOR_BYTES == 16
    return (simd::vf32)_mm_min_ps((__m128)a, (__m128)b);
#elif ZOR_VECTOR_BYTES == 32
    return (simd::vf32)_mm256_min_ps((__m256)a, (__m256)b);
#else
    return (simd::vf32)_mm512_min_ps((__m512)a, (__m512)b);
#endif
}
inline simd::vf32 vmax(simd::vf32 a, simd::vf32 b) {
#if ZOR_VECTOR_BYTES == 16
    return (simd::vf32)_mm_max_ps((__m128)a, (__m128)b);
#elif ZOR_VECTOR_BYTES == 32
    return (simd::vf32)_mm256_max_ps((__m256)a, (__m256)b);
#else
    return (simd::vf32)_mm512_max_ps((__m512)a, (__m512)b);
#endif
}

// Sixteen 32-bit lanes, given as 16 / lanes vectors, narrowed to sixteen
// bytes: lane masks (0 or -1) to 0 or 0xff, or values 0..255 as they are
// (Unsigned). Each value must already fit, except as noted.
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
#elif !ZOR_HAS_AVX2
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
    // Unsigned: lanes read as unsigned and saturated, so 0x80000000 (a
    // conversion out of range) gives 255.
    if (Unsigned) return (v16u8)_mm512_cvtusepi32_epi8((__m512i)m[0]);
    return (v16u8)_mm512_cvtepi32_epi8((__m512i)m[0]);
#endif
}

// ---- integer lanes ----------------------------------------------------------

// Bytes at the level's integer width, as two vectors of 16-bit lanes (the
// low and high bytes of each 128-bit lane), and back; pack_bytes undoes
// widen_bytes exactly for values up to 255.
typedef simd::ivec<uint8_t> iu8;
typedef simd::ivec<uint16_t> iu16;

inline void widen_bytes(iu8 x, iu16& lo, iu16& hi) {
#if ZOR_INT_VECTOR_BYTES == 64
    lo = (iu16)_mm512_unpacklo_epi8((__m512i)x, _mm512_setzero_si512());
    hi = (iu16)_mm512_unpackhi_epi8((__m512i)x, _mm512_setzero_si512());
#elif ZOR_INT_VECTOR_BYTES == 32
    lo = (iu16)_mm256_unpacklo_epi8((__m256i)x, _mm256_setzero_si256());
    hi = (iu16)_mm256_unpackhi_epi8((__m256i)x, _mm256_setzero_si256());
#else
    lo = (iu16)_mm_unpacklo_epi8((__m128i)x, _mm_setzero_si128());
    hi = (iu16)_mm_unpackhi_epi8((__m128i)x, _mm_setzero_si128());
#endif
}

inline iu8 pack_bytes(iu16 lo, iu16 hi) {
#if ZOR_INT_VECTOR_BYTES == 64
    return (iu8)_mm512_packus_epi16((__m512i)lo, (__m512i)hi);
#elif ZOR_INT_VECTOR_BYTES == 32
    return (iu8)_mm256_packus_epi16((__m256i)lo, (__m256i)hi);
#else
    return (iu8)_mm_packus_epi16((__m128i)lo, (__m128i)hi);
#endif
}

// W / 4 bytes to 32-bit lanes (W the float width VB for the divisions, the
// integer width for the 16-bit products).
template <int W>
inline simd::vec<W, int32_t> load_u8_i32(const Zor8u* p) {
    typedef simd::vec<W, int32_t> V;
    if constexpr (W == 16) {
        const __m128i x = _mm_cvtsi32_si128(simd::load<int32_t>(p));
#if ZOR_HAS_SSE41
        return (V)_mm_cvtepu8_epi32(x);
#else
        const __m128i z = _mm_setzero_si128();
        return (V)_mm_unpacklo_epi16(_mm_unpacklo_epi8(x, z), z);
#endif
    } else if constexpr (W == 32) {
#if ZOR_VECTOR_BYTES >= 32
        const __m128i x = _mm_loadl_epi64((const __m128i*)p);
#if ZOR_HAS_AVX2
        return (V)_mm256_cvtepu8_epi32(x);
#else
        return (V)_mm256_setr_m128i(_mm_cvtepu8_epi32(x), _mm_cvtepu8_epi32(_mm_srli_si128(x, 4)));
#endif
#endif
    } else {
#if ZOR_VECTOR_BYTES == 64
        return (V)_mm512_cvtepu8_epi32(_mm_loadu_si128((const __m128i*)p));
#endif
    }
}

// W / 4 16-bit elements to 32-bit lanes.
template <int W, bool Signed>
inline simd::vec<W, int32_t> load_16_i32(const void* p) {
    typedef simd::vec<W, int32_t> V;
    if constexpr (W == 16) {
        const __m128i x = _mm_loadl_epi64((const __m128i*)p);
#if ZOR_HAS_SSE41
        return (V)(Signed ? _mm_cvtepi16_epi32(x) : _mm_cvtepu16_epi32(x));
#else
        if (Signed) return (V)_mm_srai_epi32(_mm_unpacklo_epi16(x, x), 16);
        return (V)_mm_unpacklo_epi16(x, _mm_setzero_si128());
#endif
    } else if constexpr (W == 32) {
#if ZOR_VECTOR_BYTES >= 32
        const __m128i x = _mm_loadu_si128((const __m128i*)p);
#if ZOR_HAS_AVX2
        return (V)(Signed ? _mm256_cvtepi16_epi32(x) : _mm256_cvtepu16_epi32(x));
#else
        const __m128i y = _mm_srli_si128(x, 8);
        if (Signed) return (V)_mm256_setr_m128i(_mm_cvtepi16_epi32(x), _mm_cvtepi16_epi32(y));
        return (V)_mm256_setr_m128i(_mm_cvtepu16_epi32(x), _mm_cvtepu16_epi32(y));
#endif
#endif
    } else {
#if ZOR_VECTOR_BYTES == 64
        const __m256i x = _mm256_loadu_si256((const __m256i*)p);
        return (V)(Signed ? _mm512_cvtepi16_epi32(x) : _mm512_cvtepu16_epi32(x));
#endif
    }
}

// 32-bit lanes, already in the element's range, to W / 4 16-bit elements.
template <int W, bool Signed>
inline void store_i32_16(void* p, simd::vec<W, int32_t> v) {
    if constexpr (W == 16) {
        __m128i x = (__m128i)v;
#if ZOR_HAS_SSE41
        x = Signed ? _mm_packs_epi32(x, x) : _mm_packus_epi32(x, x);
#else
        if (Signed) {
            x = _mm_packs_epi32(x, x);
        } else {
            // No unsigned pack before SSE4.1: into the signed range and back.
            const __m128i t = _mm_sub_epi32(x, _mm_set1_epi32(32768));
            x = _mm_xor_si128(_mm_packs_epi32(t, t), _mm_set1_epi16((short)0x8000));
        }
#endif
        _mm_storel_epi64((__m128i*)p, x);
    } else if constexpr (W == 32) {
#if ZOR_VECTOR_BYTES >= 32
        const __m128i lo = _mm256_castsi256_si128((__m256i)v);
        const __m128i hi = _mm256_extractf128_si256((__m256i)v, 1);
        _mm_storeu_si128((__m128i*)p, Signed ? _mm_packs_epi32(lo, hi) : _mm_packus_epi32(lo, hi));
#endif
    } else {
#if ZOR_VECTOR_BYTES == 64
        _mm256_storeu_si256((__m256i*)p, _mm512_cvtepi32_epi16((__m512i)v));
#endif
    }
}

}  // namespace arith

ZOR_END

#endif
