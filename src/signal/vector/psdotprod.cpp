// Dot products of real and complex vectors, in the element's precision and
// without conjugation. Below 16 elements the products go alternately into
// two lanes in a fixed order, the same on every level. From 16 on the
// level's own vector accumulators take over, after a scalar head that
// aligns the first source; their order differs by level, so the last bits
// may too.
#include "variant.h"

#include <stddef.h>
#include <stdint.h>
#include <utility>

#include "psround.h"
#include "simd.h"

ZOR_BEGIN
namespace {
using simd::vf32;
using simd::vf64;

constexpr int32_t kShortLimit = 16;

// -0 is the neutral start of every sum: -0 + x is x for every x.
template <typename V> inline V neg_zero() {
    return -V{};
}

// ---- element arithmetic of the fixed short order ----------------------------

// Each product rounded on its own (rounded(): no fused multiply-add on any
// level), so the short order gives the same bits everywhere.
template <typename T> inline void complex_mul(T ar, T ai, T br, T bi, T* re, T* im) {
    *re = rounded(ar * br) - rounded(ai * bi);
    *im = rounded(ar * bi) + rounded(ai * br);
}

inline float mul(float a, float b) { return a * b; }
inline double mul(double a, double b) { return a * b; }
inline Zor32fc mul(const Zor32fc& a, const Zor32fc& b) {
    Zor32fc r;
    complex_mul(a.re, a.im, b.re, b.im, &r.re, &r.im);
    return r;
}
inline Zor64fc mul(const Zor64fc& a, const Zor64fc& b) {
    Zor64fc r;
    complex_mul(a.re, a.im, b.re, b.im, &r.re, &r.im);
    return r;
}
inline Zor32fc mul(float a, const Zor32fc& b) { return {a * b.re, a * b.im}; }
inline Zor64fc mul(double a, const Zor64fc& b) { return {a * b.re, a * b.im}; }

inline float add(float a, float b) { return a + b; }
inline double add(double a, double b) { return a + b; }
inline Zor32fc add(const Zor32fc& a, const Zor32fc& b) { return {a.re + b.re, a.im + b.im}; }
inline Zor64fc add(const Zor64fc& a, const Zor64fc& b) { return {a.re + b.re, a.im + b.im}; }

template <typename R> inline R zero_of();
template <> inline float zero_of<float>() { return -0.0f; }
template <> inline double zero_of<double>() { return -0.0; }
template <> inline Zor32fc zero_of<Zor32fc>() { return {-0.0f, -0.0f}; }
template <> inline Zor64fc zero_of<Zor64fc>() { return {-0.0, -0.0}; }

// Even products to lane 0, odd ones to lane 1; an odd last product joins
// lane 1, and lane 0 comes last.
template <typename R, typename A, typename B>
R dot_short(const A* a, const B* b, int32_t len) {
    R lane0 = zero_of<R>(), lane1 = zero_of<R>();
    int32_t i = 0;
    for (; len - i >= 2; i += 2) {
        lane0 = add(lane0, mul(a[i], b[i]));
        lane1 = add(lane1, mul(a[i + 1], b[i + 1]));
    }
    if (i < len) lane1 = add(lane1, mul(a[i], b[i]));
    return add(lane1, lane0);
}

// ---- wide paths -------------------------------------------------------------

// Leading units of unitBytes to take one by one so that p reaches the
// vector width; none if p is not even aligned to its unit.
inline ptrdiff_t head_units(const void* p, size_t unitBytes) {
    const uintptr_t a = (uintptr_t)p;
    if (a % unitBytes != 0) return 0;
    return (ptrdiff_t)(((ZOR_VECTOR_BYTES - a % ZOR_VECTOR_BYTES) % ZOR_VECTOR_BYTES) / unitBytes);
}

template <typename V, size_t... I>
inline V swap_pairs(V v, std::index_sequence<I...>) {
    return __builtin_shufflevector(v, v, (I ^ 1)...);
}
// Each element of the lower (upper) half twice, to meet (re, im) pairs.
template <typename V, size_t... I>
inline V twice_low(V v, std::index_sequence<I...>) {
    return __builtin_shufflevector(v, v, (I / 2)...);
}
template <typename V, size_t... I>
inline V twice_high(V v, std::index_sequence<I...>) {
    return __builtin_shufflevector(v, v, (sizeof...(I) / 2 + I / 2)...);
}

template <typename T, typename V>
T dot_wide_real(const T* a, const T* b, ptrdiff_t len) {
    constexpr int N = sizeof(V) / sizeof(T);
    T head = -0.0;
    ptrdiff_t i = 0;
    for (const ptrdiff_t h = head_units(a, sizeof(T)); i < h; ++i) head += a[i] * b[i];
    V s0 = neg_zero<V>(), s1 = s0, s2 = s0, s3 = s0;
    for (; len - i >= 4 * N; i += 4 * N) {
        s0 += simd::load<V>(a + i) * simd::load<V>(b + i);
        s1 += simd::load<V>(a + i + N) * simd::load<V>(b + i + N);
        s2 += simd::load<V>(a + i + 2 * N) * simd::load<V>(b + i + 2 * N);
        s3 += simd::load<V>(a + i + 3 * N) * simd::load<V>(b + i + 3 * N);
    }
    for (; len - i >= N; i += N) s0 += simd::load<V>(a + i) * simd::load<V>(b + i);
    T lane[N];
    simd::store(lane, (s0 + s1) + (s2 + s3));
    T sum = head;
    for (int k = 0; k < N; ++k) sum += lane[k];
    for (; i < len; ++i) sum += a[i] * b[i];
    return sum;
}

// Both complex: a*b collects (ar br, ai bi), a*swap(b) collects
// (ar bi, ai br); the real part is their even lanes less their odd lanes.
template <typename T, typename V>
void dot_wide_complex(const T* a, const T* b, ptrdiff_t len, T* re, T* im) {
    constexpr int N = sizeof(V) / sizeof(T);
    const auto pairs = std::make_index_sequence<N>();
    const ptrdiff_t n = 2 * len;
    T hre = -0.0, him = -0.0;
    ptrdiff_t i = 0;
    for (const ptrdiff_t h = 2 * head_units(a, 2 * sizeof(T)); i < h; i += 2) {
        T pr, pi;
        complex_mul(a[i], a[i + 1], b[i], b[i + 1], &pr, &pi);
        hre += pr;
        him += pi;
    }
    V p0 = neg_zero<V>(), p1 = p0, q0 = p0, q1 = p0;
    for (; n - i >= 2 * N; i += 2 * N) {
        const V a0 = simd::load<V>(a + i), b0 = simd::load<V>(b + i);
        const V a1 = simd::load<V>(a + i + N), b1 = simd::load<V>(b + i + N);
        p0 += a0 * b0;
        q0 += a0 * swap_pairs(b0, pairs);
        p1 += a1 * b1;
        q1 += a1 * swap_pairs(b1, pairs);
    }
    for (; n - i >= N; i += N) {
        const V a0 = simd::load<V>(a + i), b0 = simd::load<V>(b + i);
        p0 += a0 * b0;
        q0 += a0 * swap_pairs(b0, pairs);
    }
    T pl[N], ql[N];
    simd::store(pl, p0 + p1);
    simd::store(ql, q0 + q1);
    T even = hre, odd = -0.0, imag = him;
    for (int k = 0; k < N; k += 2) {
        even += pl[k];
        odd += pl[k + 1];
        imag += ql[k] + ql[k + 1];
    }
    T real = even - odd;
    for (; i < n; i += 2) {
        T pr, pi;
        complex_mul(a[i], a[i + 1], b[i], b[i + 1], &pr, &pi);
        real += pr;
        imag += pi;
    }
    *re = real;
    *im = imag;
}

// Real first, complex second: each real meets its (re, im) pair twice.
template <typename T, typename V>
void dot_wide_real_complex(const T* a, const T* b, ptrdiff_t len, T* re, T* im) {
    constexpr int N = sizeof(V) / sizeof(T);
    const auto lanes = std::make_index_sequence<N>();
    T hre = -0.0, him = -0.0;
    ptrdiff_t i = 0;
    for (const ptrdiff_t h = head_units(a, sizeof(T)); i < h; ++i) {
        hre += a[i] * b[2 * i];
        him += a[i] * b[2 * i + 1];
    }
    V s0 = neg_zero<V>(), s1 = s0, s2 = s0, s3 = s0;
    for (; len - i >= 2 * N; i += 2 * N) {
        const V a0 = simd::load<V>(a + i), a1 = simd::load<V>(a + i + N);
        s0 += twice_low(a0, lanes) * simd::load<V>(b + 2 * i);
        s1 += twice_high(a0, lanes) * simd::load<V>(b + 2 * i + N);
        s2 += twice_low(a1, lanes) * simd::load<V>(b + 2 * i + 2 * N);
        s3 += twice_high(a1, lanes) * simd::load<V>(b + 2 * i + 3 * N);
    }
    for (; len - i >= N; i += N) {
        const V a0 = simd::load<V>(a + i);
        s0 += twice_low(a0, lanes) * simd::load<V>(b + 2 * i);
        s1 += twice_high(a0, lanes) * simd::load<V>(b + 2 * i + N);
    }
    T lane[N];
    simd::store(lane, (s0 + s1) + (s2 + s3));
    T real = hre, imag = him;
    for (int k = 0; k < N; k += 2) {
        real += lane[k];
        imag += lane[k + 1];
    }
    for (; i < len; ++i) {
        real += a[i] * b[2 * i];
        imag += a[i] * b[2 * i + 1];
    }
    *re = real;
    *im = imag;
}

inline bool any_null(const void* a, const void* b, const void* c) {
    return a == nullptr || b == nullptr || c == nullptr;
}

}  // namespace
ZOR_END

using namespace ZOR_NS;

ZOR_ENTRY ZorStatus ZOR_NAME(zorsDotProd_32f)(const Zor32f* pSrc1, const Zor32f* pSrc2, int32_t len,
                                              Zor32f* pDp) {
    if (any_null(pSrc1, pSrc2, pDp)) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    *pDp = len < kShortLimit ? dot_short<Zor32f>(pSrc1, pSrc2, len)
                             : dot_wide_real<float, vf32>(pSrc1, pSrc2, len);
    return zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zorsDotProd_64f)(const Zor64f* pSrc1, const Zor64f* pSrc2, int32_t len,
                                              Zor64f* pDp) {
    if (any_null(pSrc1, pSrc2, pDp)) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    *pDp = len < kShortLimit ? dot_short<Zor64f>(pSrc1, pSrc2, len)
                             : dot_wide_real<double, vf64>(pSrc1, pSrc2, len);
    return zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zorsDotProd_32fc)(const Zor32fc* pSrc1, const Zor32fc* pSrc2, int32_t len,
                                               Zor32fc* pDp) {
    if (any_null(pSrc1, pSrc2, pDp)) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    if (len < kShortLimit) {
        *pDp = dot_short<Zor32fc>(pSrc1, pSrc2, len);
    } else {
        Zor32fc r;
        dot_wide_complex<float, vf32>(&pSrc1->re, &pSrc2->re, len, &r.re, &r.im);
        *pDp = r;
    }
    return zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zorsDotProd_64fc)(const Zor64fc* pSrc1, const Zor64fc* pSrc2, int32_t len,
                                               Zor64fc* pDp) {
    if (any_null(pSrc1, pSrc2, pDp)) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    if (len < kShortLimit) {
        *pDp = dot_short<Zor64fc>(pSrc1, pSrc2, len);
    } else {
        Zor64fc r;
        dot_wide_complex<double, vf64>(&pSrc1->re, &pSrc2->re, len, &r.re, &r.im);
        *pDp = r;
    }
    return zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zorsDotProd_32f32fc)(const Zor32f* pSrc1, const Zor32fc* pSrc2, int32_t len,
                                                  Zor32fc* pDp) {
    if (any_null(pSrc1, pSrc2, pDp)) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    if (len < kShortLimit) {
        *pDp = dot_short<Zor32fc>(pSrc1, pSrc2, len);
    } else {
        Zor32fc r;
        dot_wide_real_complex<float, vf32>(pSrc1, &pSrc2->re, len, &r.re, &r.im);
        *pDp = r;
    }
    return zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zorsDotProd_64f64fc)(const Zor64f* pSrc1, const Zor64fc* pSrc2, int32_t len,
                                                  Zor64fc* pDp) {
    if (any_null(pSrc1, pSrc2, pDp)) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    if (len < kShortLimit) {
        *pDp = dot_short<Zor64fc>(pSrc1, pSrc2, len);
    } else {
        Zor64fc r;
        dot_wide_real_complex<double, vf64>(pSrc1, &pSrc2->re, len, &r.re, &r.im);
        *pDp = r;
    }
    return zorStsNoErr;
}
