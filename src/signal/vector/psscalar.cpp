// Floor, ceiling and square root of one double, for the table builders of
// other operations. Same results on every level; SSE4.1 levels round in
// hardware, the older ones truncate through a 64-bit integer.
#include "variant.h"

#include <emmintrin.h>
#include <stdint.h>
#include <string.h>
#if defined(__SSE4_1__)
#include <smmintrin.h>
#endif

ZOR_BEGIN
namespace {

inline uint64_t bits_of(double x) {
    uint64_t u;
    memcpy(&u, &x, sizeof u);
    return u;
}

inline double with_sign_of(double magnitude, double x) {
    uint64_t u = (bits_of(magnitude) & 0x7FFFFFFFFFFFFFFFULL) | (bits_of(x) & 0x8000000000000000ULL);
    double d;
    memcpy(&d, &u, sizeof d);
    return d;
}

#if defined(__SSE4_1__)

inline double floor_one(double x) {
    __m128d v = _mm_set_sd(x);
    return _mm_cvtsd_f64(_mm_round_sd(v, v, _MM_FROUND_TO_NEG_INF | _MM_FROUND_NO_EXC));
}

inline double ceil_one(double x) {
    __m128d v = _mm_set_sd(x);
    return _mm_cvtsd_f64(_mm_round_sd(v, v, _MM_FROUND_TO_POS_INF | _MM_FROUND_NO_EXC));
}

#else

// |x| >= 2^52 is already an integer, infinite or NaN: returned as x + 0,
// which quiets a signalling NaN the way the rounding instruction does.
inline bool integral_already(double x) {
    return (bits_of(x) & 0x7FFFFFFFFFFFFFFFULL) >= 0x4330000000000000ULL;
}

// Truncation keeping the sign, so that -0.5 truncates to -0.
inline double trunc_one(double x) {
    return with_sign_of((double)_mm_cvttsd_si64(_mm_set_sd(x)), x);
}

inline double floor_one(double x) {
    if (integral_already(x)) return x + 0.0;
    double t = trunc_one(x);
    return t > x ? t - 1.0 : t;
}

inline double ceil_one(double x) {
    if (integral_already(x)) return x + 0.0;
    double t = trunc_one(x);
    return t < x ? t + 1.0 : t;
}

#endif

}  // namespace
ZOR_END

ZOR_INTERNAL double ZOR_NAME(zorsFloorOne)(double x) {
    return ZOR_NS::floor_one(x);
}

ZOR_INTERNAL double ZOR_NAME(zorsCeilOne)(double x) {
    return ZOR_NS::ceil_one(x);
}

ZOR_INTERNAL double ZOR_NAME(zorsSqrtOne)(double x) {
    const uint64_t u = ZOR_NS::bits_of(x);
    if (u <= 0x7FF0000000000000ULL) return _mm_cvtsd_f64(_mm_sqrt_sd(_mm_setzero_pd(), _mm_set_sd(x)));
    if (u == 0x8000000000000000ULL) return x;
    if ((u & 0x7FFFFFFFFFFFFFFFULL) > 0x7FF0000000000000ULL) return x + x;
    // Negative: a NaN that raises the invalid flag. The barrier keeps the
    // product from being folded at compile time.
    double zero = 0.0;
    __asm__("" : "+x"(zero));
    return zero * __builtin_inf();
}
