// Pixel and lane helpers of the float resize passes (cubic and the general
// window): one source, so both convert and fuse alike.
#ifndef ZOR_RESIZE_LANES_H
#define ZOR_RESIZE_LANES_H

#include <math.h>
#include <string.h>

#include "variant.h"
#include "simd.h"

ZOR_BEGIN
namespace resize_lanes {

// x0*c0 + x1*c1; fusing levels round the second product into the first.
inline float pair(float x0, float c0, float x1, float c1) {
#if ZOR_HAS_FMA
    return fmaf(x1, c1, x0 * c0);
#else
    return x0 * c0 + x1 * c1;
#endif
}

// Conversion in the caller's rounding mode (NaN and overflow give the
// integer indefinite), then saturation: through 16 bits to 0..255 is the
// same as straight to 0..255.
inline Zor8u to_u8(float v) {
    const int32_t i = _mm_cvtss_si32(_mm_set_ss(v));
    return (Zor8u)(i < 0 ? 0 : i > 255 ? 255 : i);
}

inline void put(Zor8u* p, float v) { *p = to_u8(v); }
inline void put(Zor32f* p, float v) { memcpy(p, &v, 4); }

inline float pixel(const Zor8u* p) { return (float)*p; }
inline float pixel(const Zor32f* p) {
    float v;
    memcpy(&v, p, 4);
    return v;
}

// The low four bytes as 32-bit lanes.
inline __m128i widen_bytes(__m128i v) {
#if ZOR_HAS_SSE41
    return _mm_cvtepu8_epi32(v);
#else
    const __m128i z = _mm_setzero_si128();
    return _mm_unpacklo_epi16(_mm_unpacklo_epi8(v, z), z);
#endif
}

// The first n (<= lanes) lanes: 8u rounded in the caller's mode and
// saturated to 0..255 as to_u8 does, 32f as they are.
inline void store_row(Zor8u* p, simd::vf32 v, int n) {
#if ZOR_VECTOR_BYTES == 16
    const __m128i i = _mm_cvtps_epi32((__m128)v);
    const __m128i b = _mm_packus_epi16(_mm_packs_epi32(i, i), _mm_setzero_si128());
#elif ZOR_VECTOR_BYTES == 32
    const __m256i i = _mm256_cvtps_epi32((__m256)v);
    const __m128i w = _mm_packs_epi32(_mm256_castsi256_si128(i), _mm256_extractf128_si256(i, 1));
    const __m128i b = _mm_packus_epi16(w, w);
#else
    const __m512i i = _mm512_cvtps_epi32((__m512)v);
    const __m512i c = _mm512_min_epi32(_mm512_max_epi32(i, _mm512_setzero_si512()),
                                       _mm512_set1_epi32(255));
    const __m128i b = _mm512_cvtepi32_epi8(c);
#endif
    if (n == simd::Lanes<simd::vf32>::count)
        memcpy(p, &b, (size_t)simd::Lanes<simd::vf32>::count);
    else
        memcpy(p, &b, (size_t)n);
}
inline void store_row(Zor32f* p, simd::vf32 v, int n) {
    if (n == simd::Lanes<simd::vf32>::count)
        simd::store(p, v);
    else
        simd::store_n(p, v, n);
}

}  // namespace resize_lanes
ZOR_END

#endif
