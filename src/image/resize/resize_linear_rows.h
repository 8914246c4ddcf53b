// Row kernels of the linear resize: the horizontal pass (a gather of pixel
// pairs at the local column indices, then a blend by the column weights)
// and the vertical pass (a pure stream over two filtered rows). Each reads
// exactly the columns lx[i] and lx[i] + 1 of its source row.
#ifndef ZOR_RESIZE_LINEAR_ROWS_H
#define ZOR_RESIZE_LINEAR_ROWS_H

#include <math.h>
#include <stdint.h>
#include <string.h>

#include "variant.h"
#include "simd.h"

ZOR_BEGIN
namespace linear {

// ---- level helpers (candidates for the vector layer) --------------------------------

// Adjacent 16-bit products summed into 32-bit lanes (pmaddwd), at the
// width of the level's integer vectors.
inline simd::ivec<int32_t> madd16(simd::ivec<int16_t> a, simd::ivec<int16_t> b) {
#if ZOR_INT_VECTOR_BYTES == 64
    return (simd::ivec<int32_t>)_mm512_madd_epi16((__m512i)a, (__m512i)b);
#elif ZOR_INT_VECTOR_BYTES == 32
    return (simd::ivec<int32_t>)_mm256_madd_epi16((__m256i)a, (__m256i)b);
#else
    return (simd::ivec<int32_t>)_mm_madd_epi16((__m128i)a, (__m128i)b);
#endif
}

typedef simd::vec<ZOR_VECTOR_BYTES, float> VF;
typedef simd::vec<ZOR_VECTOR_BYTES, int32_t> VFI;  // int32 lanes beside VF's
typedef simd::vec<ZOR_VECTOR_BYTES, double> VD;
constexpr int kLanes = simd::Lanes<VF>::count;

// Float lanes to int32 in the current rounding mode (cvtps2dq).
inline VFI round_to_int(VF v) {
#if ZOR_VECTOR_BYTES == 64
    return (VFI)_mm512_cvtps_epi32((__m512)v);
#elif ZOR_VECTOR_BYTES == 32
    return (VFI)_mm256_cvtps_epi32((__m256)v);
#else
    return (VFI)_mm_cvtps_epi32((__m128)v);
#endif
}
inline int32_t round_to_int(float v) { return _mm_cvtss_si32(_mm_set_ss(v)); }

// a + (b - a) * f: fused on the levels that fuse the float kernels, so
// that the scalar edges and the vector lanes of one level agree.
inline VF lerp(VF a, VF b, VF f) {
#if ZOR_HAS_FMA
    return simd::fma(b - a, f, a);
#else
    return a + (b - a) * f;
#endif
}
inline float lerp(float a, float b, float f) {
#if ZOR_HAS_FMA
    return __builtin_fmaf(b - a, f, a);
#else
    return a + (b - a) * f;
#endif
}

// int32 to 0..255 by way of signed 16 bits: the same as a clamp.
inline int32_t saturate_8u(int32_t v) { return v < 0 ? 0 : v > 255 ? 255 : v; }

template <typename T> inline T pixel(const T* p) {
    T v;
    memcpy(&v, p, sizeof v);
    return v;
}
inline uint16_t pair_8u(const uint8_t* p) {
    uint16_t v;
    memcpy(&v, p, 2);
    return v;
}

// ---- 8u, 14-bit fixed point ------------------------------------------------------------

// out[i] = (a * w0 + b * w1 + 128) >> 8 for the pair (a, b) at lx[i] and the
// weight pair i. The pairs are gathered into the row first (2 bytes each,
// as wide as the result), then blended in place by pmaddwd.
inline void hpass_q14(const uint8_t* s, const int32_t* lx, const uint16_t* wpairs, uint16_t* out,
                      int32_t n) {
    for (int32_t i = 0; i < n; ++i) out[i] = pair_8u(s + lx[i]);
    typedef simd::ivec<int16_t> VW;
    typedef simd::ivec<int32_t> VI;
    constexpr int L = simd::Lanes<VI>::count;
    typedef simd::vec<2 * L, uint8_t> VB;
    typedef simd::vec<2 * L, uint16_t> VR;
    int32_t i = 0;
    for (; i + L <= n; i += L) {
        const VW p = __builtin_convertvector(simd::load<VB>(out + i), VW);
        const VI m = madd16(p, simd::load<VW>(wpairs + 2 * i));
        simd::store(out + i, __builtin_convertvector((m + 128) >> 8, VR));
    }
    for (; i < n; ++i) {
        const int32_t a = out[i] & 255, b = out[i] >> 8;
        out[i] = (uint16_t)((a * wpairs[2 * i] + b * wpairs[2 * i + 1] + 128) >> 8);
    }
}

// d[i] = (r0 * (16384 - w) + r1 * w + 0x80000) >> 20; the rows hold at most
// 16320, so the result is already within 0..255.
inline void vpass_q14(const uint16_t* r0, const uint16_t* r1, int32_t w, uint8_t* d, int32_t n) {
    typedef simd::ivec<int16_t> VW;
    typedef simd::ivec<int32_t> VI;
    typedef simd::ivec<uint32_t> VU;
    constexpr int L = simd::Lanes<VI>::count;
    typedef simd::vec<2 * L, uint16_t> VR;
    typedef simd::vec<L, uint8_t> VO;
    const VI wv = simd::broadcast<VI>((int32_t)(((uint32_t)w << 16) | (uint32_t)(16384 - w)));
    int32_t i = 0;
    for (; i + 2 * L <= n; i += 2 * L) {
        const VU a0 = __builtin_convertvector(simd::load<VR>(r0 + i), VU);
        const VU b0 = __builtin_convertvector(simd::load<VR>(r1 + i), VU);
        const VU a1 = __builtin_convertvector(simd::load<VR>(r0 + i + L), VU);
        const VU b1 = __builtin_convertvector(simd::load<VR>(r1 + i + L), VU);
        const VI m0 = madd16((VW)(a0 | (b0 << 16)), (VW)wv);
        const VI m1 = madd16((VW)(a1 | (b1 << 16)), (VW)wv);
        simd::store(d + i, __builtin_convertvector((m0 + 0x80000) >> 20, VO));
        simd::store(d + i + L, __builtin_convertvector((m1 + 0x80000) >> 20, VO));
    }
    for (; i < n; ++i) d[i] = (uint8_t)((r0[i] * (16384 - w) + r1[i] * w + 0x80000) >> 20);
}

// ---- float rows -------------------------------------------------------------------------

// kLanes pixel pairs of a float row as the a and b vectors: two 8-byte
// loads per pair into double lanes, ordered so that an in-lane even/odd
// split (shufps per 128 bits) gives the lanes in row order.
inline void gather_pairs(const float* s, const int32_t* lx, VF* a, VF* b) {
    constexpr int H = kLanes / 2;  // pairs per double vector
    VD q0, q1;
    for (int k = 0; k < H; ++k) {
        const int at = 4 * (k / 2) + (k % 2);
        q0[k] = pixel((const double*)(s + lx[at]));
        q1[k] = pixel((const double*)(s + lx[at + 2]));
    }
    simd::vec<ZOR_VECTOR_BYTES, int32_t> even, odd;
    for (int m = 0; m < kLanes; ++m) {
        const int c = 4 * (m / 4), t = m % 4;
        even[m] = t < 2 ? c + 2 * t : kLanes + c + 2 * (t - 2);
        odd[m] = even[m] + 1;
    }
    *a = __builtin_shuffle((VF)q0, (VF)q1, even);
    *b = __builtin_shuffle((VF)q0, (VF)q1, odd);
}

inline void gather_pairs(const uint8_t* s, const int32_t* lx, VF* a, VF* b) {
    VFI g;
    for (int k = 0; k < kLanes; ++k) g[k] = pair_8u(s + lx[k]);
    *a = __builtin_convertvector(g & 255, VF);
    *b = __builtin_convertvector(g >> 8, VF);
}

template <typename T>
inline void hpass_float(const T* s, const int32_t* lx, const float* f, float* out, int32_t n) {
    int32_t i = 0;
    for (; i + kLanes <= n; i += kLanes) {
        VF a, b;
        gather_pairs(s, lx + i, &a, &b);
        simd::store(out + i, lerp(a, b, simd::load<VF>(f + i)));
    }
    for (; i < n; ++i) out[i] = lerp((float)pixel(s + lx[i]), (float)pixel(s + lx[i] + 1), f[i]);
}

inline void vpass_float(const float* r0, const float* r1, float f, float* d, int32_t n) {
    const VF fv = simd::broadcast<VF>(f);
    int32_t i = 0;
    for (; i + kLanes <= n; i += kLanes)
        simd::store(d + i, lerp(simd::load<VF>(r0 + i), simd::load<VF>(r1 + i), fv));
    for (; i < n; ++i) {
        const float v = lerp(r0[i], r1[i], f);
        memcpy(d + i, &v, 4);  // destination rows may sit off their element boundary
    }
}

// 8u results: rounded in the current mode, saturated.
inline void vpass_float(const float* r0, const float* r1, float f, uint8_t* d, int32_t n) {
    const VF fv = simd::broadcast<VF>(f);
    const VFI lo = simd::broadcast<VFI>(0), hi = simd::broadcast<VFI>(255);
    typedef simd::vec<kLanes, uint8_t> VO;
    int32_t i = 0;
    for (; i + kLanes <= n; i += kLanes) {
        VFI v = round_to_int(lerp(simd::load<VF>(r0 + i), simd::load<VF>(r1 + i), fv));
        v = v < lo ? lo : v > hi ? hi : v;
        simd::store(d + i, __builtin_convertvector(v, VO));
    }
    for (; i < n; ++i) d[i] = (uint8_t)saturate_8u(round_to_int(lerp(r0[i], r1[i], f)));
}

}  // namespace linear
ZOR_END

#endif
