// Floats to saturated 8u, 16u and 16s with a power-of-two scale:
// dst = saturate(round(src * 2^-scaleFactor)). Rounding: 0 truncates, 1 to
// nearest with ties to even (whatever the rounding control says), any other
// value through the conversion instruction under the control set to
// toward zero, the caller's control restored afterwards. NaN converts as
// the processor's out-of-range integer and so saturates to the type's
// minimum.
#include "variant.h"

#include <immintrin.h>
#include <math.h>
#include <stdint.h>
#include <string.h>

#include "simd.h"

ZOR_BEGIN
namespace {

using simd::vf32;
using simd::vs32;
constexpr int32_t L = ZOR_VECTOR_BYTES / 4;

enum Round { kTrunc, kNearest, kControl };

// ---- per-level conversions -----------------------------------------------

inline vs32 cvt_trunc(vf32 v) {
#if ZOR_VECTOR_BYTES == 16
    return (vs32)_mm_cvttps_epi32((__m128)v);
#elif ZOR_VECTOR_BYTES == 32
    return (vs32)_mm256_cvttps_epi32((__m256)v);
#else
    // The masked form: the plain one trips a false uninitialised warning.
    return (vs32)_mm512_mask_cvttps_epi32(_mm512_setzero_si512(), 0xffff, (__m512)v);
#endif
}

// In the rounding control in force.
inline vs32 cvt_control(vf32 v) {
#if ZOR_VECTOR_BYTES == 16
    return (vs32)_mm_cvtps_epi32((__m128)v);
#elif ZOR_VECTOR_BYTES == 32
    return (vs32)_mm256_cvtps_epi32((__m256)v);
#else
    return (vs32)_mm512_mask_cvtps_epi32(_mm512_setzero_si512(), 0xffff, (__m512)v);
#endif
}

inline int32_t cvt_trunc(float x) { return _mm_cvttss_si32(_mm_set_ss(x)); }
inline int32_t cvt_control(float x) { return _mm_cvtss_si32(_mm_set_ss(x)); }
inline int32_t cvt_trunc(double x) { return _mm_cvttsd_si32(_mm_set_sd(x)); }
inline int32_t cvt_control(double x) { return _mm_cvtsd_si32(_mm_set_sd(x)); }
inline double to_float_type(int32_t t, double) { return t; }
inline float to_float_type(int32_t t, float) { return (float)t; }
inline vf32 to_float_type(vs32 t, vf32) { return __builtin_convertvector(t, vf32); }

// A constant in the shape of X (scalar, or the same in every lane).
template <typename X> inline X splat(X, double v) { return (X)v; }
inline vf32 splat(vf32, double v) { return simd::broadcast<vf32>((float)v); }
inline vs32 splat(vs32, double v) { return simd::broadcast<vs32>((int32_t)v); }

// ---- rounding, written once for scalars and vectors ---------------------------

// Magnitudes are first limited to 2^30 (NaN passes), which saturates all
// the same and keeps every conversion in range. The nearest form corrects
// the truncation by the exact remainder, so it needs no rounding control.
template <Round R, typename F, typename I> inline I to_int(F x, I) {
    const F big = splat(x, 1073741824.0), half = splat(x, 0.5);
    x = x > big ? big : x;
    x = x < -big ? -big : x;
    if (R == kControl) return (I)cvt_control(x);
    const I t = (I)cvt_trunc(x);
    if (R == kTrunc) return t;
    const F r = x - to_float_type(t, x);  // exact
    const I odd = (t & 1) != 0;
    const I up = (r > half) | ((r == half) & odd);
    const I down = (r < -half) | ((r == -half) & odd);
    // A true comparison is -1 in a vector lane and 1 in a scalar.
    if (sizeof(I) == sizeof(int32_t)) return t + up - down;
    return t - up + down;
}

template <typename D> struct Range;
template <> struct Range<Zor8u> { static constexpr int32_t lo = 0, hi = 255; };
template <> struct Range<Zor16u> { static constexpr int32_t lo = 0, hi = 65535; };
template <> struct Range<Zor16s> { static constexpr int32_t lo = -32768, hi = 32767; };

template <typename D, typename I> inline I saturate(I t) {
    const I lo = splat(t, Range<D>::lo), hi = splat(t, Range<D>::hi);
    t = t < lo ? lo : t;
    return t > hi ? hi : t;
}

// Scales whose power of two is a normal float keep the float product exact
// wherever it matters (results of at least 2^-126 in magnitude; smaller ones
// round to 0 in every mode). Other scales go through doubles, with the
// exponent limited to where every result is already 0 or saturated.
template <typename D, Round R> void convert(const float* s, D* d, int32_t len, int32_t sf) {
    int32_t i = 0;
    if (sf >= -127 && sf <= 126) {
        const float scale = ldexpf(1.0f, -sf);
        typedef simd::vec<L * sizeof(D), D> VD;
        const vf32 vscale = simd::broadcast<vf32>(scale);
        for (; len - i >= L; i += L) {
            const vs32 t = saturate<D>(to_int<R>(simd::load<vf32>(s + i) * vscale, vs32{}));
            simd::store(d + i, __builtin_convertvector(t, VD));
        }
        for (; i < len; ++i)
            simd::store(d + i, (D)saturate<D>(to_int<R>(simd::load<float>(s + i) * scale, int32_t{})));
        return;
    }
    const double scale = ldexp(1.0, sf < -300 ? 300 : sf > 300 ? -300 : -sf);
    for (; i < len; ++i)
        simd::store(d + i,
                    (D)saturate<D>(to_int<R>((double)simd::load<float>(s + i) * scale, int32_t{})));
}

template <typename D>
ZorStatus convert_entry(const Zor32f* pSrc, D* pDst, int32_t len, int32_t rndMode, int32_t sf) {
    if (pSrc == nullptr || pDst == nullptr) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    if (rndMode == 0) {
        convert<D, kTrunc>(pSrc, pDst, len, sf);
    } else if (rndMode == 1) {
        convert<D, kNearest>(pSrc, pDst, len, sf);
    } else {
        const uint32_t old = zor_set_rc_ssx(0x6000);
        convert<D, kControl>(pSrc, pDst, len, sf);
        if ((old & 0x6000u) != 0x6000u) zor_set_rc_ssx(old);
    }
    return zorStsNoErr;
}

}  // namespace
ZOR_END

ZOR_INTERNAL ZorStatus ZOR_NAME(zorsConvert_32f8u_Sfs)(const Zor32f* pSrc, Zor8u* pDst, int32_t len,
                                                       int32_t rndMode, int32_t scaleFactor) {
    return ZOR_NS::convert_entry(pSrc, pDst, len, rndMode, scaleFactor);
}
ZOR_INTERNAL ZorStatus ZOR_NAME(zorsConvert_32f16u_Sfs)(const Zor32f* pSrc, Zor16u* pDst, int32_t len,
                                                        int32_t rndMode, int32_t scaleFactor) {
    return ZOR_NS::convert_entry(pSrc, pDst, len, rndMode, scaleFactor);
}
ZOR_INTERNAL ZorStatus ZOR_NAME(zorsConvert_32f16s_Sfs)(const Zor32f* pSrc, Zor16s* pDst, int32_t len,
                                                        int32_t rndMode, int32_t scaleFactor) {
    return ZOR_NS::convert_entry(pSrc, pDst, len, rndMode, scaleFactor);
}
