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

typedef simd::ivec<int16_t> VW;
typedef simd::ivec<int32_t> VI;
typedef simd::ivec<uint8_t> VB;
constexpr int kIntLanes = simd::Lanes<VI>::count;  // 32-bit lanes of an integer vector

#if ZOR_INT_VECTOR_BYTES == 64
typedef __m512i IV;
#define ZOR_LIN_I(op) _mm512_##op
#elif ZOR_INT_VECTOR_BYTES == 32
typedef __m256i IV;
#define ZOR_LIN_I(op) _mm256_##op
#else
typedef __m128i IV;
#define ZOR_LIN_I(op) _mm_##op
#endif

// Adjacent 16-bit products summed into 32-bit lanes (pmaddwd).
inline VI madd16(VW a, VW b) { return (VI)ZOR_LIN_I(madd_epi16)((IV)a, (IV)b); }
// Interleaved 16-bit lanes of the low or high half of each 128-bit lane.
inline VW unpack_lo16(VW a, VW b) { return (VW)ZOR_LIN_I(unpacklo_epi16)((IV)a, (IV)b); }
inline VW unpack_hi16(VW a, VW b) { return (VW)ZOR_LIN_I(unpackhi_epi16)((IV)a, (IV)b); }
// Saturating narrowing, per 128-bit lane: lane c of the result is lane c
// of a, then lane c of b.
inline VW pack32(VI a, VI b) { return (VW)ZOR_LIN_I(packs_epi32)((IV)a, (IV)b); }
inline VB packu16(VW a, VW b) { return (VB)ZOR_LIN_I(packus_epi16)((IV)a, (IV)b); }
// After pack32 or packu16 of two consecutive vectors: their 64-bit halves
// back in row order.
template <typename V> inline V row_order(V v) {
#if ZOR_INT_VECTOR_BYTES == 64
    return (V)_mm512_permutexvar_epi64(_mm512_setr_epi64(0, 2, 4, 6, 1, 3, 5, 7), (IV)v);
#elif ZOR_INT_VECTOR_BYTES == 32
    return (V)_mm256_permute4x64_epi64((IV)v, 0xD8);
#else
    return v;
#endif
}

// Half a vector's worth of bytes at p, zero-extended to 16-bit lanes.
inline VW widen8(const uint8_t* p) {
#if ZOR_INT_VECTOR_BYTES == 64
    return (VW)_mm512_cvtepu8_epi16(_mm256_loadu_si256((const __m256i*)p));
#elif ZOR_INT_VECTOR_BYTES == 32
    return (VW)_mm256_cvtepu8_epi16(_mm_loadu_si128((const __m128i*)p));
#else
    return (VW)_mm_unpacklo_epi8(_mm_loadl_epi64((const __m128i*)p), _mm_setzero_si128());
#endif
}

#if ZOR_HAS_SSSE3
// Byte shuffle within each 128-bit lane (pshufb); a control byte with the
// top bit set gives 0.
inline VB shuffle8(VB v, VB control) { return (VB)ZOR_LIN_I(shuffle_epi8)((IV)v, (IV)control); }
// Adjacent bytes summed into 16-bit lanes (pmaddubsw with ones).
inline VW sum_pairs8(VB v) {
    return (VW)ZOR_LIN_I(maddubs_epi16)((IV)v, (IV)simd::broadcast<VB>(1));
}
// Lane 0 of each 128-bit lane, repeated over it.
inline VI lane_first(VI v) {
#if ZOR_INT_VECTOR_BYTES == 64
    return (VI)_mm512_shuffle_epi32((IV)v, _MM_PERM_AAAA);
#else
    return (VI)ZOR_LIN_I(shuffle_epi32)((IV)v, 0);
#endif
}
// 16 bytes at each of at[0], at[4], ... into the 128-bit lanes in turn.
inline VB windows16(const uint8_t* s, const int32_t* at) {
#if ZOR_INT_VECTOR_BYTES == 64
    __m512i v = _mm512_castsi128_si512(_mm_loadu_si128((const __m128i*)(s + at[0])));
    v = _mm512_inserti32x4(v, _mm_loadu_si128((const __m128i*)(s + at[4])), 1);
    v = _mm512_inserti32x4(v, _mm_loadu_si128((const __m128i*)(s + at[8])), 2);
    return (VB)_mm512_inserti32x4(v, _mm_loadu_si128((const __m128i*)(s + at[12])), 3);
#elif ZOR_INT_VECTOR_BYTES == 32
    return (VB)_mm256_loadu2_m128i((const __m128i*)(s + at[4]), (const __m128i*)(s + at[0]));
#else
    return (VB)_mm_loadu_si128((const __m128i*)(s + at[0]));
#endif
}
#endif
#undef ZOR_LIN_I

typedef simd::vec<ZOR_VECTOR_BYTES, float> VF;
typedef simd::vec<ZOR_VECTOR_BYTES, int32_t> VFI;  // int32 lanes beside VF's
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

// How a block's column indices lie: steps of at most 2 leave no column
// between pairs unread (ratios up to 2); steps of exactly 2 make the pairs
// one run of consecutive pixels (halving).
enum Columns { kScattered, kContiguous, kStride2 };

inline Columns columns_of(const int32_t* lx, int32_t n) {
    bool contiguous = true;
    for (int32_t i = 1; i < n; ++i) contiguous &= lx[i] - lx[i - 1] <= 2;
    if (!contiguous) return kScattered;
    return lx[n - 1] - lx[0] == 2 * (n - 1) ? kStride2 : kContiguous;
}

// ---- 8u, 14-bit fixed point ------------------------------------------------------------

inline uint16_t blend_q14(int32_t a, int32_t b, const uint16_t* w) {
    return (uint16_t)((a * w[0] + b * w[1] + 128) >> 8);
}

// out[i] = (a * w0 + b * w1 + 128) >> 8 for the pair (a, b) at lx[i] and
// weight pair i, two integer vectors of results a step. Halving reads the
// pairs straight from the row. Other contiguous columns: each 128-bit lane
// takes 16 bytes from its first pair on and picks its four pairs with
// pshufb, as long as those bytes stay within the row's pairs. Elsewhere
// the pairs are gathered into the row first (2 bytes each, as wide as the
// result) and blended in place.
inline void hpass_q14(const uint8_t* s, const int32_t* lx, const uint16_t* wpairs, uint16_t* out,
                      int32_t n, Columns columns) {
    constexpr int L = kIntLanes;
    auto blend_run = [&](const uint8_t* pairs, int32_t at) {
        return (madd16(widen8(pairs), simd::load<VW>(wpairs + 2 * at)) + 128) >> 8;
    };
    int32_t i = 0;
    if (columns == kStride2) {
        for (; i + 2 * L <= n; i += 2 * L) {
            const VI r0 = blend_run(s + lx[i], i), r1 = blend_run(s + lx[i + L], i + L);
            simd::store(out + i, row_order(pack32(r0, r1)));
        }
    }
#if ZOR_HAS_SSSE3
    if (columns == kContiguous) {
        const int32_t last = lx[n - 1] + 1;
        const VI spread = simd::broadcast<VI>((int32_t)0x80018000);
        // Bytes (d, zero, d + 1, zero): each pair as two 16-bit lanes.
        auto blend = [&](int32_t at) {
            const VI x = simd::load<VI>(lx + at), d = x - lane_first(x);
            const VB pairs = shuffle8(windows16(s, lx + at), (VB)(d + (d << 16) + spread));
            return (madd16((VW)pairs, simd::load<VW>(wpairs + 2 * at)) + 128) >> 8;
        };
        for (; i + 2 * L <= n && lx[i + 2 * L - 4] + 15 <= last; i += 2 * L) {
            const VI r0 = blend(i), r1 = blend(i + L);
            simd::store(out + i, row_order(pack32(r0, r1)));
        }
    }
#endif
    for (int32_t k = i; k < n; ++k) out[k] = pair_8u(s + lx[k]);
    for (; i + 2 * L <= n; i += 2 * L) {
        const VI r0 = blend_run((const uint8_t*)(out + i), i);
        const VI r1 = blend_run((const uint8_t*)(out + i + L), i + L);
        simd::store(out + i, row_order(pack32(r0, r1)));
    }
    for (; i < n; ++i) out[i] = blend_q14(out[i] & 255, out[i] >> 8, wpairs + 2 * i);
}

// d[i] = (r0 * (16384 - w) + r1 * w + 0x80000) >> 20 with the rows
// interleaved for pmaddwd; the rows hold at most 16320, so the result is
// already within 0..255.
inline void vpass_q14(const uint16_t* r0, const uint16_t* r1, int32_t w, uint8_t* d, int32_t n) {
    constexpr int L = 2 * kIntLanes;  // 16-bit lanes
    const VW wv = (VW)simd::broadcast<VI>((int32_t)(((uint32_t)w << 16) | (uint32_t)(16384 - w)));
    const VI half = simd::broadcast<VI>(0x80000);
    int32_t i = 0;
    auto blend = [&](int32_t at) {
        const VW a = simd::load<VW>(r0 + at), b = simd::load<VW>(r1 + at);
        return pack32((madd16(unpack_lo16(a, b), wv) + half) >> 20,
                      (madd16(unpack_hi16(a, b), wv) + half) >> 20);
    };
    for (; i + 2 * L <= n; i += 2 * L) {
        const VW v0 = blend(i), v1 = blend(i + L);
        simd::store(d + i, row_order(packu16(v0, v1)));
    }
    for (; i < n; ++i) d[i] = (uint8_t)((r0[i] * (16384 - w) + r1[i] * w + 0x80000) >> 20);
}

// Halving where neither source row serves a later destination row: both
// rows' horizontal results stay in registers and go straight into the
// vertical blend, with the arithmetic of hpass_q14 then vpass_q14. s0 and
// s1 are the two rows at lx[0]; pair i lies at 2i. halves: every weight of
// the block is 8192, and then the two passes reduce exactly to the rounded
// mean of the four pixels: r = ((a + b) * 8192 + 128) >> 8 = (a + b) * 32,
// and ((r0 + r1) * 8192 + 0x80000) >> 20 = (a + b + c + d + 2) >> 2.
inline void hvpass_q14_halving(const uint8_t* s0, const uint8_t* s1, const uint16_t* wpairs,
                               int32_t w, uint8_t* d, int32_t n, bool halves) {
    constexpr int L = kIntLanes;
    int32_t i = 0;
#if ZOR_HAS_SSSE3
    if (halves && w == 8192) {
        constexpr int B = ZOR_INT_VECTOR_BYTES;
        const VW two = simd::broadcast<VW>(2);
        auto mean = [&](int32_t at) {
            return (sum_pairs8(simd::load<VB>(s0 + 2 * at)) +
                    sum_pairs8(simd::load<VB>(s1 + 2 * at)) + two) >> 2;
        };
        for (; i + B <= n; i += B) {
            const VW lo = mean(i), hi = mean(i + B / 2);
            simd::store(d + i, row_order(packu16(lo, hi)));
        }
    }
#endif
    (void)halves;
    const VW wv = (VW)simd::broadcast<VI>((int32_t)(((uint32_t)w << 16) | (uint32_t)(16384 - w)));
    const VI half = simd::broadcast<VI>(0x80000);
    auto hrow = [&](const uint8_t* s, int32_t at) {  // 2L results in row order
        const VI a = (madd16(widen8(s + 2 * at), simd::load<VW>(wpairs + 2 * at)) + 128) >> 8;
        const VI b =
            (madd16(widen8(s + 2 * (at + L)), simd::load<VW>(wpairs + 2 * (at + L))) + 128) >> 8;
        return row_order(pack32(a, b));
    };
    auto vblend = [&](int32_t at) {
        const VW a = hrow(s0, at), b = hrow(s1, at);
        return pack32((madd16(unpack_lo16(a, b), wv) + half) >> 20,
                      (madd16(unpack_hi16(a, b), wv) + half) >> 20);
    };
    for (; i + 4 * L <= n; i += 4 * L) {
        const VW v0 = vblend(i), v1 = vblend(i + 2 * L);
        simd::store(d + i, row_order(packu16(v0, v1)));
    }
    for (; i < n; ++i) {
        const int32_t r0 = blend_q14(s0[2 * i], s0[2 * i + 1], wpairs + 2 * i);
        const int32_t r1 = blend_q14(s1[2 * i], s1[2 * i + 1], wpairs + 2 * i);
        d[i] = (uint8_t)((r0 * (16384 - w) + r1 * w + 0x80000) >> 20);
    }
}

// ---- float rows -------------------------------------------------------------------------

// Two pixel pairs of a float row (at s + i0 and s + i1) as one vector
// [a0 b0 a1 b1].
inline __m128 two_pairs(const float* s, int32_t i0, int32_t i1) {
    double p0, p1;
    memcpy(&p0, s + i0, 8);
    memcpy(&p1, s + i1, 8);
    return _mm_castpd_ps(_mm_set_pd(p1, p0));
}

// kLanes pixel pairs of a float row as the a and b vectors: the pairs
// placed so that an even/odd split within each 128-bit lane gives the
// lanes in row order.
inline void gather_pairs(const float* s, const int32_t* lx, VF* a, VF* b) {
#if ZOR_VECTOR_BYTES == 64
    __m512 x0 = _mm512_castps128_ps512(two_pairs(s, lx[0], lx[1]));
    __m512 x1 = _mm512_castps128_ps512(two_pairs(s, lx[2], lx[3]));
    x0 = _mm512_insertf32x4(x0, two_pairs(s, lx[4], lx[5]), 1);
    x1 = _mm512_insertf32x4(x1, two_pairs(s, lx[6], lx[7]), 1);
    x0 = _mm512_insertf32x4(x0, two_pairs(s, lx[8], lx[9]), 2);
    x1 = _mm512_insertf32x4(x1, two_pairs(s, lx[10], lx[11]), 2);
    x0 = _mm512_insertf32x4(x0, two_pairs(s, lx[12], lx[13]), 3);
    x1 = _mm512_insertf32x4(x1, two_pairs(s, lx[14], lx[15]), 3);
    *a = (VF)_mm512_shuffle_ps(x0, x1, 0x88);
    *b = (VF)_mm512_shuffle_ps(x0, x1, 0xDD);
#elif ZOR_VECTOR_BYTES == 32
    const __m256 x0 = _mm256_set_m128(two_pairs(s, lx[4], lx[5]), two_pairs(s, lx[0], lx[1]));
    const __m256 x1 = _mm256_set_m128(two_pairs(s, lx[6], lx[7]), two_pairs(s, lx[2], lx[3]));
    *a = (VF)_mm256_shuffle_ps(x0, x1, 0x88);
    *b = (VF)_mm256_shuffle_ps(x0, x1, 0xDD);
#else
    const __m128 x0 = two_pairs(s, lx[0], lx[1]), x1 = two_pairs(s, lx[2], lx[3]);
    *a = (VF)_mm_shuffle_ps(x0, x1, 0x88);
    *b = (VF)_mm_shuffle_ps(x0, x1, 0xDD);
#endif
}

// kLanes consecutive pairs (2 * kLanes floats from s) as a and b.
inline void split_pairs(const float* s, VF* a, VF* b) {
#if ZOR_VECTOR_BYTES == 64
    const __m512i order = _mm512_setr_epi64(0, 2, 4, 6, 1, 3, 5, 7);
    const __m512 x0 = _mm512_loadu_ps(s), x1 = _mm512_loadu_ps(s + 16);
    *a = (VF)_mm512_permutexvar_pd(order, _mm512_castps_pd(_mm512_shuffle_ps(x0, x1, 0x88)));
    *b = (VF)_mm512_permutexvar_pd(order, _mm512_castps_pd(_mm512_shuffle_ps(x0, x1, 0xDD)));
#elif ZOR_VECTOR_BYTES == 32
    const __m256 y0 = _mm256_loadu_ps(s), y1 = _mm256_loadu_ps(s + 8);
    const __m256 x0 = _mm256_permute2f128_ps(y0, y1, 0x20);
    const __m256 x1 = _mm256_permute2f128_ps(y0, y1, 0x31);
    *a = (VF)_mm256_shuffle_ps(x0, x1, 0x88);
    *b = (VF)_mm256_shuffle_ps(x0, x1, 0xDD);
#else
    const __m128 x0 = _mm_loadu_ps(s), x1 = _mm_loadu_ps(s + 4);
    *a = (VF)_mm_shuffle_ps(x0, x1, 0x88);
    *b = (VF)_mm_shuffle_ps(x0, x1, 0xDD);
#endif
}

#if ZOR_HAS_AVX2
// Lanes of v picked by idx across the whole vector (vpermps).
inline VF permute(VF v, VFI idx) {
#if ZOR_VECTOR_BYTES == 64
    return (VF)_mm512_permutexvar_ps((__m512i)idx, (__m512)v);
#else
    return (VF)_mm256_permutevar8x32_ps((__m256)v, (__m256i)idx);
#endif
}
// Lanes of the concatenation (v0, v1) picked by idx (0 to 2 * kLanes - 1).
inline VF permute2(VF v0, VF v1, VFI idx) {
#if ZOR_VECTOR_BYTES == 64
    return (VF)_mm512_permutex2var_ps((__m512)v0, (__m512i)idx, (__m512)v1);
#else
    // vpermps reads the low three bits; bit 3, moved to the sign, picks v1.
    return (VF)_mm256_blendv_ps((__m256)permute(v0, idx), (__m256)permute(v1, idx),
                                _mm256_castsi256_ps(_mm256_slli_epi32((__m256i)idx, 28)));
#endif
}
#endif

inline void gather_pairs(const uint8_t* s, const int32_t* lx, VF* a, VF* b) {
    VFI g;
    for (int k = 0; k < kLanes; ++k) g[k] = pair_8u(s + lx[k]);
    *a = __builtin_convertvector(g & 255, VF);
    *b = __builtin_convertvector(g >> 8, VF);
}

template <typename T>
inline void hpass_float(const T* s, const int32_t* lx, const float* f, float* out, int32_t n,
                        Columns columns) {
    int32_t i = 0;
    if constexpr (sizeof(T) == 4) {
        if (columns == kStride2)
            for (; i + kLanes <= n; i += kLanes) {
                VF a, b;
                split_pairs(s + lx[i], &a, &b);
                simd::store(out + i, lerp(a, b, simd::load<VF>(f + i)));
            }
#if ZOR_HAS_AVX2 && ZOR_VECTOR_BYTES >= 32
        // Contiguous columns: the pairs of a vector lie within one or two
        // vectors from its first pair on, picked by permutes, while those
        // stay within the row's pairs.
        if (columns == kContiguous) {
            const int32_t last = lx[n - 1] + 1;
            const VFI one = simd::broadcast<VFI>(1);
            for (; i + kLanes <= n && lx[i] + 2 * kLanes - 1 <= last; i += kLanes) {
                const int32_t base = lx[i], span = lx[i + kLanes - 1] + 1 - base;
                const VFI d = simd::load<VFI>(lx + i) - simd::broadcast<VFI>(base);
                const VF w0 = simd::load<VF>(s + base);
                VF a, b;
                if (span < kLanes) {
                    a = permute(w0, d);
                    b = permute(w0, d + one);
                } else if (span < 2 * kLanes) {
                    const VF w1 = simd::load<VF>(s + base + kLanes);
                    a = permute2(w0, w1, d);
                    b = permute2(w0, w1, d + one);
                } else {
                    break;
                }
                simd::store(out + i, lerp(a, b, simd::load<VF>(f + i)));
            }
        }
#endif
    }
    for (; i + kLanes <= n; i += kLanes) {
        VF a, b;
        gather_pairs(s, lx + i, &a, &b);
        simd::store(out + i, lerp(a, b, simd::load<VF>(f + i)));
    }
    for (; i < n; ++i) out[i] = lerp((float)pixel(s + lx[i]), (float)pixel(s + lx[i] + 1), f[i]);
}

// A float destination row from vec(i) (kLanes results) and one(i); with
// stream, stored past the caches where the row allows aligned vectors (the
// caller fences).
template <typename Vec, typename One>
inline void write_row(float* d, int32_t n, bool stream, Vec vec, One one) {
    int32_t i = 0;
    if (stream && ((uintptr_t)d & 3) == 0) {
        const int32_t head = (int32_t)(align_up(d, ZOR_VECTOR_BYTES) - d);
        for (; i < head && i < n; ++i) {
            const float v = one(i);
            memcpy(d + i, &v, 4);
        }
        for (; i + kLanes <= n; i += kLanes) simd::stream(d + i, vec(i));
    }
    for (; i + kLanes <= n; i += kLanes) simd::store(d + i, vec(i));
    for (; i < n; ++i) {
        const float v = one(i);
        memcpy(d + i, &v, 4);  // destination rows may sit off their element boundary
    }
}

inline void vpass_float(const float* r0, const float* r1, float f, float* d, int32_t n,
                        bool stream) {
    const VF fv = simd::broadcast<VF>(f);
    write_row(
        d, n, stream,
        [&](int32_t i) { return lerp(simd::load<VF>(r0 + i), simd::load<VF>(r1 + i), fv); },
        [&](int32_t i) { return lerp(r0[i], r1[i], f); });
}

// The float counterpart of hvpass_q14_halving.
inline void hvpass_float_halving(const float* s0, const float* s1, const float* fx, float fy,
                                 float* d, int32_t n, bool stream) {
    const VF fv = simd::broadcast<VF>(fy);
    auto hrow = [&](const float* s, int32_t i) {
        VF a, b;
        split_pairs(s + 2 * i, &a, &b);
        return lerp(a, b, simd::load<VF>(fx + i));
    };
    write_row(
        d, n, stream, [&](int32_t i) { return lerp(hrow(s0, i), hrow(s1, i), fv); },
        [&](int32_t i) {
            const float r0 = lerp(s0[2 * i], s0[2 * i + 1], fx[i]);
            return lerp(r0, lerp(s1[2 * i], s1[2 * i + 1], fx[i]), fy);
        });
}

// 8u results: rounded in the current mode, saturated.
inline void vpass_float(const float* r0, const float* r1, float f, uint8_t* d, int32_t n, bool) {
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
