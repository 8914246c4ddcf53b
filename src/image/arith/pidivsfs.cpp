// Scaled integer quotients: zoriDiv_8u/16u/16s_C1RSfs, dst = src2 / src1,
// and the row forms zorsDiv_8u_Sfs and zorsDiv_16s_Sfs.
//
// Inside each type's range of scale factors the quotient is the single
// precision division (n * 2^-s) / d, the scaling being exact, clamped to the
// element's range and converted to the nearest integer (ties to even in
// the default rounding mode). Every level uses the true division
// instruction, so the integers agree on all of them. A zero divisor counts
// for status 2 and gives the largest value for n > 0, 0 for n == 0 and the
// smallest for n < 0: the lane divides by 2^-64 instead, which takes any
// non-zero scaled numerator past the clamp with its own sign. Outside the
// range the results are known without dividing.
#include "variant.h"

#include "piinternal.h"

ZOR_BEGIN
namespace {

using simd::vf32;
using simd::vs32;

constexpr int L = simd::Lanes<vf32>::count;

struct D8u {
    typedef Zor8u T;
    static constexpr int kMinS = -15, kMaxS = 8;
    static constexpr int32_t kHi = 255, kLo = 0;
};
struct D16u {
    typedef Zor16u T;
    static constexpr int kMinS = -31, kMaxS = 16;
    static constexpr int32_t kHi = 65535, kLo = 0;
};
struct D16s {
    typedef Zor16s T;
    static constexpr int kMinS = -30, kMaxS = 15;
    static constexpr int32_t kHi = 32767, kLo = -32768;
};

inline float pow2(int e) {
    const uint32_t bits = (uint32_t)(127 + e) << 23;
    float f;
    memcpy(&f, &bits, 4);
    return f;
}

// A zero divisor's result.
template <typename E>
inline int32_t by_zero(int32_t n) {
    return n > 0 ? E::kHi : n < 0 ? E::kLo : 0;
}

template <typename E>
inline int32_t quotient(int32_t n, int32_t d, float scale, float tiny) {
    const float df = d == 0 ? tiny : (float)d;
    float q = ((float)n * scale) / df;
    q = q < (float)E::kHi ? q : (float)E::kHi;
    q = q > (float)E::kLo ? q : (float)E::kLo;
    return arith::round_to_int(q);
}

// The zero test and its record in float lanes: AVX has no 256-bit integer
// compare.
template <typename E>
inline vs32 quotient(vs32 n, vs32 d, vf32 scale, vf32 tiny, vf32& zeros) {
    vf32 df = __builtin_convertvector(d, vf32);
    const vs32 z = df == vf32{};
    zeros = z ? simd::broadcast<vf32>(1.0f) : zeros;
    df = z ? tiny : df;
    vf32 q = (__builtin_convertvector(n, vf32) * scale) / df;
    const vf32 hi = simd::broadcast<vf32>((float)E::kHi), lo = simd::broadcast<vf32>((float)E::kLo);
    q = arith::vmin(q, hi);
    if constexpr (E::kLo != 0) q = arith::vmax(q, lo);
    return arith::round_to_int(q);
}

// 8u: divisors are never negative, so a maximum with 2^-64 replaces the
// zero ones and a running minimum records them. Scaled only where s is not
// 0 (the scaling is exact either way). On the 64-byte levels the narrowing
// saturates, so no clamp is needed before the conversion.
template <bool Scaled>
inline vs32 quotient8u(vs32 n, vs32 d, vf32 scale, vf32 tiny, vf32& dmin) {
    const vf32 df = __builtin_convertvector(d, vf32);
    dmin = arith::vmin(dmin, df);
    vf32 nf = __builtin_convertvector(n, vf32);
    if constexpr (Scaled) nf = nf * scale;
    vf32 q = nf / arith::vmax(df, tiny);
    if constexpr (ZOR_VECTOR_BYTES != 64) q = arith::vmin(q, simd::broadcast<vf32>(255.0f));
    return arith::round_to_int(q);
}

#if ZOR_VECTOR_BYTES == 64
// 8u with s >= 0 on AVX-512, without the divider. There x = n / (d * 2^s)
// is at most 255, and a quotient that is not a tie lies at least x / (2n)
// >= x / 510 from the nearest half-integer, while a tie is a half-integer
// of at most 10 significant bits. The 14-bit reciprocal estimate gives x
// within 2^-14 of itself; rounding that to 11 significant bits (13 low
// bits cleared, to nearest) moves every tie exactly onto its half-integer
// and every other quotient less than it would need to reach one. The
// conversion then gives the correctly rounded integer, the same as the
// true division's (whose quotient is within 2^-24 and cannot cross a
// half-integer either).
// A zero divisor becomes 2^-20 here: any n >= 1 then gives at least 2^12,
// and 255 at most 2^28, so the conversion stays in range and saturates
// when narrowed. The caller records zero divisors.
template <bool Scaled>
inline vs32 quotient8u_estimate(vs32 n, vs32 d, vf32 scale) {
    vf32 nf = __builtin_convertvector(n, vf32);
    if constexpr (Scaled) nf = nf * scale;
    const vf32 df = arith::vmax(__builtin_convertvector(d, vf32), simd::broadcast<vf32>(0x1p-20f));
    const vf32 q = nf * (vf32)_mm512_rcp14_ps((__m512)df);
    return arith::round_to_int((vf32)(((vs32)q + (1 << 12)) & -(1 << 13)));
}

// 64 pixels: the least divisor byte kept for the status, the results
// packed with saturation (the packs work within 128-bit lanes, the
// permutation puts the dwords back in order).
template <bool Scaled>
inline void block64_estimate(const Zor8u* a, const Zor8u* b, Zor8u* d, vf32 scale,
                             __m512i& dminBytes) {
    vs32 r[4];
    for (int k = 0; k < 4; ++k)
        r[k] = quotient8u_estimate<Scaled>(arith::load_u8_i32<64>(b + 16 * k),
                                           arith::load_u8_i32<64>(a + 16 * k), scale);
#if ZOR_HAS_AVX512BW
    dminBytes = _mm512_min_epu8(dminBytes, _mm512_loadu_si512(a));
    const __m512i w0 = _mm512_packs_epi32((__m512i)r[0], (__m512i)r[1]);
    const __m512i w1 = _mm512_packs_epi32((__m512i)r[2], (__m512i)r[3]);
    const __m512i order = _mm512_setr_epi32(0, 4, 8, 12, 1, 5, 9, 13, 2, 6, 10, 14, 3, 7, 11, 15);
    _mm512_storeu_si512(d, _mm512_permutexvar_epi32(order, _mm512_packus_epi16(w0, w1)));
#else
    // No byte minimum without AVX-512BW: the 16-byte one, four times.
    __m128i m = _mm512_castsi512_si128(dminBytes);
    for (int k = 0; k < 4; ++k) {
        m = _mm_min_epu8(m, _mm_loadu_si128((const __m128i*)(a + 16 * k)));
        _mm_storeu_si128((__m128i*)(d + 16 * k), _mm512_cvtusepi32_epi8((__m512i)r[k]));
    }
    dminBytes = _mm512_castsi128_si512(m);
#endif
}

// Rows with s >= 0: 64 pixels a round; returns how far it got and whether
// a divisor was zero.
inline int32_t div8u_estimate(const Zor8u* a, const Zor8u* b, Zor8u* d, int32_t len, int s,
                              bool* zero) {
    const vf32 scale = simd::broadcast<vf32>(pow2(-s));
    __m512i dmin = _mm512_set1_epi32(-1);
    int32_t i = 0;
    if (s == 0) {
        for (; i + 64 <= len; i += 64) block64_estimate<false>(a + i, b + i, d + i, scale, dmin);
    } else {
        for (; i + 64 <= len; i += 64) block64_estimate<true>(a + i, b + i, d + i, scale, dmin);
    }
#if ZOR_HAS_AVX512BW
    *zero = i > 0 && _mm512_cmpeq_epi8_mask(dmin, _mm512_setzero_si512()) != 0;
#else
    const __m128i m = _mm512_castsi512_si128(dmin);
    *zero = i > 0 && _mm_movemask_epi8(_mm_cmpeq_epi8(m, _mm_setzero_si128())) != 0;
#endif
    return i;
}
#endif

template <typename E>
inline vs32 widen(const typename E::T* p) {
    if constexpr (sizeof(typename E::T) == 1)
        return arith::load_u8_i32<ZOR_VECTOR_BYTES>(p);
    else
        return arith::load_16_i32<ZOR_VECTOR_BYTES, (E::kLo < 0)>(p);
}

// Sixteen results of the block at i; 8u as one 16-byte store.
template <typename E, bool Scaled>
inline void block16(const typename E::T* a, const typename E::T* b, typename E::T* d, vf32 scale,
                    vf32 tiny, vf32& zeros) {
    vs32 r[arith::kMaskVectors];
    if constexpr (sizeof(typename E::T) == 1) {
        for (int k = 0; k < arith::kMaskVectors; ++k)
            r[k] = quotient8u<Scaled>(widen<E>(b + k * L), widen<E>(a + k * L), scale, tiny, zeros);
        simd::store(d, arith::narrow16<true>(r));
    } else {
        for (int k = 0; k < arith::kMaskVectors; ++k)
            r[k] = quotient<E>(widen<E>(b + k * L), widen<E>(a + k * L), scale, tiny, zeros);
        for (int k = 0; k < arith::kMaskVectors; ++k)
            arith::store_i32_16<ZOR_VECTOR_BYTES, (E::kLo < 0)>(d + k * L, r[k]);
    }
}

// One row: a holds the divisors, b the numerators.
template <typename E>
ZorStatus div_row(const typename E::T* a, const typename E::T* b, typename E::T* d, int32_t len,
                  int s) {
    typedef typename E::T T;
    bool zero = false;
    if (s < E::kMinS) {
        // Every non-zero quotient saturates, by the signs (a zero divisor
        // counting as positive).
        for (int32_t i = 0; i < len; ++i) {
            const int32_t n = simd::load<T>(b + i), dv = simd::load<T>(a + i);
            zero |= dv == 0;
            simd::store(d + i, (T)(n == 0 ? 0 : ((n > 0) == (dv >= 0) ? E::kHi : E::kLo)));
        }
    } else if (s > E::kMaxS) {
        // Every quotient rounds to 0; zero divisors keep their own rule.
        for (int32_t i = 0; i < len; ++i) {
            const int32_t n = simd::load<T>(b + i), dv = simd::load<T>(a + i);
            zero |= dv == 0;
            simd::store(d + i, (T)(dv == 0 ? by_zero<E>(n) : 0));
        }
    } else {
        const float scale = pow2(-s), tiny = pow2(-64);
        const vf32 vscale = simd::broadcast<vf32>(scale), vtiny = simd::broadcast<vf32>(tiny);
        // 8u keeps the least divisor, the others a 1 where one was zero.
        const bool bytes = sizeof(T) == 1;
        vf32 zeros = bytes ? simd::broadcast<vf32>(1.0f) : vf32{};
        int32_t i = 0;
#if ZOR_VECTOR_BYTES == 64
        if constexpr (sizeof(T) == 1) {
            if (s >= 0) i = div8u_estimate(a, b, d, len, s, &zero);
        }
#endif
        if (s == 0) {
            for (; i + 16 <= len; i += 16)
                block16<E, false>(a + i, b + i, d + i, vscale, vtiny, zeros);
        } else {
            for (; i + 16 <= len; i += 16)
                block16<E, true>(a + i, b + i, d + i, vscale, vtiny, zeros);
        }
        for (int k = 0; k < L; ++k) zero |= bytes ? zeros[k] == 0.0f : zeros[k] != 0.0f;
        for (; i < len; ++i) {
            const int32_t n = simd::load<T>(b + i), dv = simd::load<T>(a + i);
            zero |= dv == 0;
            simd::store(d + i, (T)quotient<E>(n, dv, scale, tiny));
        }
    }
    return zero ? zorStsDivByZero : zorStsNoErr;
}

template <typename E>
inline ZorStatus check_row(const void* a, const void* b, const void* d, int32_t len) {
    if (!a || !b || !d) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    return zorStsNoErr;
}

// Rows in order; the first row's non-zero status is the call's, and every
// row is computed.
template <typename E, typename Row>
inline ZorStatus div_rows(const typename E::T* pSrc1, int32_t src1Step, const typename E::T* pSrc2,
                          int32_t src2Step, typename E::T* pDst, int32_t dstStep, ZoriSize roi,
                          int s, Row rowFn) {
    ZorStatus status = zorStsNoErr;
    for (int32_t y = 0; y < roi.height; ++y) {
        const ZorStatus st = rowFn(row_at(pSrc1, src1Step, y),
                                   row_at(pSrc2, src2Step, y),
                                   row_at(pDst, dstStep, y), roi.width, s);
        if (status == zorStsNoErr) status = st;
    }
    return status;
}

inline ZorStatus check_image(const void* a, int32_t aStep, const void* b, int32_t bStep,
                             const void* d, int32_t dStep, ZoriSize roi, bool testSteps) {
    if (!a || !b || !d) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1) return zorStsSizeErr;
    if (testSteps && (aStep < 1 || bStep < 1 || dStep < 1)) return zorStsStepErr;
    return zorStsNoErr;
}

ZorStatus ownps_Div_16u_Sfs(const Zor16u* pSrc1, const Zor16u* pSrc2, Zor16u* pDst, int32_t len,
                            int32_t scaleFactor) {
    return div_row<D16u>(pSrc1, pSrc2, pDst, len, scaleFactor);
}

}  // namespace
ZOR_END

ZOR_INTERNAL ZorStatus ZOR_NAME(zorsDiv_8u_Sfs)(const Zor8u* pSrc1, const Zor8u* pSrc2,
                                                Zor8u* pDst, int32_t len, int32_t scaleFactor) {
    using namespace ZOR_NS;
    const ZorStatus st = check_row<D8u>(pSrc1, pSrc2, pDst, len);
    if (st != zorStsNoErr) return st;
    return div_row<D8u>(pSrc1, pSrc2, pDst, len, scaleFactor);
}

ZOR_INTERNAL ZorStatus ZOR_NAME(zorsDiv_16s_Sfs)(const Zor16s* pSrc1, const Zor16s* pSrc2,
                                                 Zor16s* pDst, int32_t len, int32_t scaleFactor) {
    using namespace ZOR_NS;
    const ZorStatus st = check_row<D16s>(pSrc1, pSrc2, pDst, len);
    if (st != zorStsNoErr) return st;
    return div_row<D16s>(pSrc1, pSrc2, pDst, len, scaleFactor);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriDiv_8u_C1RSfs)(const Zor8u* pSrc1, int32_t src1Step,
                                                const Zor8u* pSrc2, int32_t src2Step, Zor8u* pDst,
                                                int32_t dstStep, ZoriSize roiSize,
                                                int32_t scaleFactor) {
    using namespace ZOR_NS;
    const ZorStatus st =
        check_image(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, true);
    if (st != zorStsNoErr) return st;
    return div_rows<D8u>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, scaleFactor,
                         ZOR_NAME(zorsDiv_8u_Sfs));
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriDiv_16s_C1RSfs)(const Zor16s* pSrc1, int32_t src1Step,
                                                 const Zor16s* pSrc2, int32_t src2Step,
                                                 Zor16s* pDst, int32_t dstStep, ZoriSize roiSize,
                                                 int32_t scaleFactor) {
    using namespace ZOR_NS;
    const ZorStatus st =
        check_image(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, true);
    if (st != zorStsNoErr) return st;
    return div_rows<D16s>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, scaleFactor,
                          ZOR_NAME(zorsDiv_16s_Sfs));
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriDiv_16u_C1RSfs)(const Zor16u* pSrc1, int32_t src1Step,
                                                 const Zor16u* pSrc2, int32_t src2Step,
                                                 Zor16u* pDst, int32_t dstStep, ZoriSize roiSize,
                                                 int32_t scaleFactor) {
    using namespace ZOR_NS;
    // No step test on this one.
    const ZorStatus st =
        check_image(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, false);
    if (st != zorStsNoErr) return st;
    return div_rows<D16u>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, scaleFactor,
                          ownps_Div_16u_Sfs);
}
