// Element-wise float arithmetic: the row functions other code of the level
// calls, and the vector operations built on them. One IEEE operation per
// element; how a row is cut into scalar steps and vector blocks never
// changes a result.
#include "variant.h"

#include <stdint.h>
#include <string.h>

#include <utility>

#include "psround.h"
#include "simd.h"

ZOR_BEGIN
namespace {

using simd::vf32;
using simd::vf64;
using simd::vs32;
using simd::vs64;

constexpr uintptr_t VB = ZOR_VECTOR_BYTES;

// Rows shorter than kShortRow elements stay scalar. From kPeelFrom on, a
// destination on an element boundary is first stepped to a vector
// boundary so that the block stores are aligned; the wider levels keep
// rows of up to 28 elements in unaligned blocks, where the peel would cost
// more than it gains.
#if ZOR_VECTOR_BYTES == 16
constexpr int32_t kShortRow = 11, kPeelFrom = 11;
#else
constexpr int32_t kShortRow = 16, kPeelFrom = 29;
#endif

template <typename T> inline int32_t peel_count(const T* d, int32_t len) {
    if (len < kPeelFrom || (uintptr_t)d % sizeof(T) != 0) return 0;
    return (int32_t)((-(uintptr_t)d & (VB - 1)) / sizeof(T));
}

// Whole vectors of d = op(a, b) from index 0, two a round; returns the count
// done. Each round loads before it stores, so d may be a or b.
template <typename V, typename T, typename Op>
inline int32_t vec_binary(const T* a, const T* b, T* d, int32_t len, Op op) {
    constexpr int32_t L = VB / sizeof(T);
    int32_t i = 0;
    for (; len - i >= 2 * L; i += 2 * L) {
        const V x0 = op(simd::load<V>(a + i), simd::load<V>(b + i));
        const V x1 = op(simd::load<V>(a + i + L), simd::load<V>(b + i + L));
        simd::store(d + i, x0);
        simd::store(d + i + L, x1);
    }
    if (len - i >= L) {
        simd::store(d + i, op(simd::load<V>(a + i), simd::load<V>(b + i)));
        i += L;
    }
    return i;
}

template <typename V, typename T, typename Op>
inline int32_t vec_unary(const T* a, T* d, int32_t len, Op op) {
    constexpr int32_t L = VB / sizeof(T);
    int32_t i = 0;
    for (; len - i >= 2 * L; i += 2 * L) {
        const V x0 = op(simd::load<V>(a + i));
        const V x1 = op(simd::load<V>(a + i + L));
        simd::store(d + i, x0);
        simd::store(d + i + L, x1);
    }
    if (len - i >= L) {
        simd::store(d + i, op(simd::load<V>(a + i)));
        i += L;
    }
    return i;
}

// Element i alone. Through the vector layer's loads: a row of an image
// with an odd step is not on an element boundary.
template <typename T, typename Op> inline void binary1(const T* a, const T* b, T* d, int32_t i, Op op) {
    simd::store(d + i, op(simd::load<T>(a + i), simd::load<T>(b + i)));
}
template <typename T, typename Op> inline void unary1(const T* a, T* d, int32_t i, Op op) {
    simd::store(d + i, op(simd::load<T>(a + i)));
}

// Scalar steps to the destination's vector boundary, blocks, scalar rest.
template <typename V, typename T, typename Op>
void binary(const T* a, const T* b, T* d, int32_t len, Op op) {
    int32_t i = 0;
    if (len >= kShortRow) {
        for (const int32_t h = peel_count(d, len); i < h; ++i) binary1(a, b, d, i, op);
        i += vec_binary<V>(a + i, b + i, d + i, len - i, op);
    }
    for (; i < len; ++i) binary1(a, b, d, i, op);
}

template <typename V, typename T, typename Op>
void unary(const T* a, T* d, int32_t len, Op op) {
    int32_t i = 0;
    if (len >= kShortRow) {
        for (const int32_t h = peel_count(d, len); i < h; ++i) unary1(a, d, i, op);
        i += vec_unary<V>(a + i, d + i, len - i, op);
    }
    for (; i < len; ++i) unary1(a, d, i, op);
}

// Operations written once for scalars and vectors alike.
const auto add = [](auto x, auto y) { return x + y; };
const auto sub = [](auto x, auto y) { return x - y; };
const auto mul = [](auto x, auto y) { return x * y; };
const auto sqr = [](auto x) { return x * x; };

struct Abs32 {
    float operator()(float x) const {
        uint32_t u;
        memcpy(&u, &x, 4);
        u &= 0x7fffffffu;
        memcpy(&x, &u, 4);
        return x;
    }
    vf32 operator()(vf32 x) const { return (vf32)((vs32)x & 0x7fffffff); }
};

// Lane i of x with its neighbour in the pair (re <-> im).
template <typename V, size_t... I> inline V swap_pairs(V x, std::index_sequence<I...>) {
    return __builtin_shufflevector(x, x, (I ^ 1)...);
}
// Even lanes (real parts) from a, odd lanes (imaginary parts) from b.
template <typename V, size_t... I> inline V even_odd(V a, V b, std::index_sequence<I...>) {
    return __builtin_shufflevector(a, b, ((I & 1) ? I + sizeof...(I) : I)...);
}

// Complex times a constant over n complex elements: the vector form forms
// the same four products and the same two sums as the scalar one.
template <typename V, typename T> void mulc_complex(const T* a, T* d, int32_t n, T re, T im) {
    constexpr int32_t L = VB / sizeof(T);
    const auto lanes = std::make_index_sequence<L>();
    const V vre = simd::broadcast<V>(re), vim = simd::broadcast<V>(im);
    const int32_t total = 2 * n;
    int32_t i = 0;
    for (; total - i >= L; i += L) {
        const V x = simd::load<V>(a + i);
        const V t1 = x * vre;                   // (a.re*re, a.im*re)
        const V t2 = swap_pairs(x, lanes) * vim;  // (a.im*im, a.re*im)
        simd::store(d + i, even_odd(t1 - t2, t1 + t2, lanes));
    }
    for (; i < total; i += 2) {
        const T x = simd::load<T>(a + i), y = simd::load<T>(a + i + 1);
        simd::store(d + i, (T)(rounded(x * re) - rounded(y * im)));
        simd::store(d + i + 1, (T)(rounded(y * re) + rounded(x * im)));
    }
}

inline bool is_zero(double v) { return v == 0; }  // -0 too; NaN never

}  // namespace
ZOR_END

using namespace ZOR_NS;

// ---- row functions ----------------------------------------------------------

ZOR_INTERNAL void ZOR_NAME(ownsAdd_32f)(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len) {
    binary<vf32>(pSrc1, pSrc2, pDst, len, add);
}
ZOR_INTERNAL void ZOR_NAME(ownsSub_32f)(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len) {
    binary<vf32>(pSrc2, pSrc1, pDst, len, sub);
}
ZOR_INTERNAL void ZOR_NAME(ownsMul_32f)(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len) {
    binary<vf32>(pSrc1, pSrc2, pDst, len, mul);
}
ZOR_INTERNAL void ZOR_NAME(ownsAdd_64f)(const Zor64f* pSrc1, const Zor64f* pSrc2, Zor64f* pDst, int32_t len) {
    binary<vf64>(pSrc1, pSrc2, pDst, len, add);
}
ZOR_INTERNAL void ZOR_NAME(ownsAdd_32f_I)(const Zor32f* pSrc, Zor32f* pSrcDst, int32_t len) {
    binary<vf32>(pSrcDst, pSrc, pSrcDst, len, add);
}
ZOR_INTERNAL void ZOR_NAME(ownsMul_32f_I)(const Zor32f* pSrc, Zor32f* pSrcDst, int32_t len) {
    binary<vf32>(pSrcDst, pSrc, pSrcDst, len, mul);
}
ZOR_INTERNAL void ZOR_NAME(ownsAdd_64f_I)(const Zor64f* pSrc, Zor64f* pSrcDst, int32_t len) {
    binary<vf64>(pSrcDst, pSrc, pSrcDst, len, add);
}
ZOR_INTERNAL void ZOR_NAME(ownsAddC_32f)(const Zor32f* pSrc, Zor32f* pDst, int32_t len, Zor32f value) {
    unary<vf32>(pSrc, pDst, len, [value](auto x) { return x + value; });
}
ZOR_INTERNAL void ZOR_NAME(ownsSubC_32f)(const Zor32f* pSrc, Zor32f* pDst, int32_t len, Zor32f value) {
    unary<vf32>(pSrc, pDst, len, [value](auto x) { return x - value; });
}
ZOR_INTERNAL void ZOR_NAME(ownsMulC_32f)(const Zor32f* pSrc, Zor32f* pDst, int32_t len, Zor32f value) {
    unary<vf32>(pSrc, pDst, len, [value](auto x) { return x * value; });
}
ZOR_INTERNAL void ZOR_NAME(ownsMulC_64f)(const Zor64f* pSrc, Zor64f* pDst, int32_t len, Zor64f value) {
    unary<vf64>(pSrc, pDst, len, [value](auto x) { return x * value; });
}
ZOR_INTERNAL void ZOR_NAME(ownsMulC_32f_I)(Zor32f* pSrcDst, int32_t len, Zor32f value) {
    ZOR_NAME(ownsMulC_32f)(pSrcDst, pSrcDst, len, value);
}
ZOR_INTERNAL void ZOR_NAME(ownsMulC_64f_I)(Zor64f* pSrcDst, int32_t len, Zor64f value) {
    ZOR_NAME(ownsMulC_64f)(pSrcDst, pSrcDst, len, value);
}
ZOR_INTERNAL void ZOR_NAME(ownsMulC_32fc)(const Zor32fc* pSrc, Zor32fc* pDst, int32_t len, Zor32fc value) {
    // A complex vector as its floats: no member access, the rows need not
    // sit on an element boundary.
    mulc_complex<vf32>((const Zor32f*)pSrc, (Zor32f*)pDst, len, value.re, value.im);
}
ZOR_INTERNAL void ZOR_NAME(ownsMulC_64fc)(const Zor64fc* pSrc, Zor64fc* pDst, int32_t len, Zor64fc value) {
    mulc_complex<vf64>((const Zor64f*)pSrc, (Zor64f*)pDst, len, value.re, value.im);
}



#define CHECK2(p, q, len)                                     \
    if ((p) == nullptr || (q) == nullptr) return zorStsNullPtrErr; \
    if ((len) < 1) return zorStsSizeErr
#define CHECK3(p, q, r, len)                                                     \
    if ((p) == nullptr || (q) == nullptr || (r) == nullptr) return zorStsNullPtrErr; \
    if ((len) < 1) return zorStsSizeErr

ZOR_ENTRY ZorStatus ZOR_NAME(zorsAdd_32f)(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst,
                                          int32_t len) {
    CHECK3(pSrc1, pSrc2, pDst, len);
    ZOR_NAME(ownsAdd_32f)(pSrc1, pSrc2, pDst, len);
    return zorStsNoErr;
}
ZOR_ENTRY ZorStatus ZOR_NAME(zorsAdd_64f)(const Zor64f* pSrc1, const Zor64f* pSrc2, Zor64f* pDst,
                                          int32_t len) {
    CHECK3(pSrc1, pSrc2, pDst, len);
    ZOR_NAME(ownsAdd_64f)(pSrc1, pSrc2, pDst, len);
    return zorStsNoErr;
}
ZOR_ENTRY ZorStatus ZOR_NAME(zorsAdd_32f_I)(const Zor32f* pSrc, Zor32f* pSrcDst, int32_t len) {
    CHECK2(pSrc, pSrcDst, len);
    ZOR_NAME(ownsAdd_32f_I)(pSrc, pSrcDst, len);
    return zorStsNoErr;
}
ZOR_ENTRY ZorStatus ZOR_NAME(zorsAdd_64f_I)(const Zor64f* pSrc, Zor64f* pSrcDst, int32_t len) {
    CHECK2(pSrc, pSrcDst, len);
    ZOR_NAME(ownsAdd_64f_I)(pSrc, pSrcDst, len);
    return zorStsNoErr;
}

// The complex sums are the real ones over twice as many floats. The length
// is tested first and doubled in 32 bits, so from 0x40000000 on it wraps
// negative and the real form refuses it; pointers are the real form's to
// test.
ZOR_ENTRY ZorStatus ZOR_NAME(zorsAdd_32fc)(const Zor32fc* pSrc1, const Zor32fc* pSrc2,
                                           Zor32fc* pDst, int32_t len) {
    if (len < 1) return zorStsSizeErr;
    return ZOR_NAME(zorsAdd_32f)((const Zor32f*)pSrc1, (const Zor32f*)pSrc2, (Zor32f*)pDst,
                                 (int32_t)((uint32_t)len * 2u));
}
ZOR_ENTRY ZorStatus ZOR_NAME(zorsAdd_64fc)(const Zor64fc* pSrc1, const Zor64fc* pSrc2,
                                           Zor64fc* pDst, int32_t len) {
    if (len < 1) return zorStsSizeErr;
    return ZOR_NAME(zorsAdd_64f)((const Zor64f*)pSrc1, (const Zor64f*)pSrc2, (Zor64f*)pDst,
                                 (int32_t)((uint32_t)len * 2u));
}
ZOR_ENTRY ZorStatus ZOR_NAME(zorsAdd_32fc_I)(const Zor32fc* pSrc, Zor32fc* pSrcDst, int32_t len) {
    if (len < 1) return zorStsSizeErr;
    return ZOR_NAME(zorsAdd_32f_I)((const Zor32f*)pSrc, (Zor32f*)pSrcDst,
                                   (int32_t)((uint32_t)len * 2u));
}
ZOR_ENTRY ZorStatus ZOR_NAME(zorsAdd_64fc_I)(const Zor64fc* pSrc, Zor64fc* pSrcDst, int32_t len) {
    if (len < 1) return zorStsSizeErr;
    return ZOR_NAME(zorsAdd_64f_I)((const Zor64f*)pSrc, (Zor64f*)pSrcDst,
                                   (int32_t)((uint32_t)len * 2u));
}

ZOR_ENTRY ZorStatus ZOR_NAME(zorsMul_32f)(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst,
                                          int32_t len) {
    CHECK3(pSrc1, pSrc2, pDst, len);
    ZOR_NAME(ownsMul_32f)(pSrc1, pSrc2, pDst, len);
    return zorStsNoErr;
}
ZOR_ENTRY ZorStatus ZOR_NAME(zorsMul_32f_I)(const Zor32f* pSrc, Zor32f* pSrcDst, int32_t len) {
    CHECK2(pSrc, pSrcDst, len);
    ZOR_NAME(ownsMul_32f_I)(pSrc, pSrcDst, len);
    return zorStsNoErr;
}

// By 1 a copy (NaN payloads kept bit for bit), by +-0 a clear (NaN and
// infinity give +0); a NaN value fails both tests and is multiplied.
ZOR_ENTRY ZorStatus ZOR_NAME(zorsMulC_32f)(const Zor32f* pSrc, Zor32f* pDst, int32_t len,
                                           Zor32f value) {
    CHECK2(pSrc, pDst, len);
    if (value == 1.0f) return ZOR_NAME(zorsCopy_32f)(pSrc, pDst, len);
    if (is_zero(value)) return ZOR_NAME(zorsZero_32f)(pDst, len);
    ZOR_NAME(ownsMulC_32f)(pSrc, pDst, len, value);
    return zorStsNoErr;
}
ZOR_ENTRY ZorStatus ZOR_NAME(zorsMulC_64f)(const Zor64f* pSrc, Zor64f* pDst, int32_t len,
                                           Zor64f value) {
    CHECK2(pSrc, pDst, len);
    if (value == 1.0) return ZOR_NAME(zorsCopy_64f)(pSrc, pDst, len);
    if (is_zero(value)) return ZOR_NAME(zorsZero_64f)(pDst, len);
    ZOR_NAME(ownsMulC_64f)(pSrc, pDst, len, value);
    return zorStsNoErr;
}
ZOR_ENTRY ZorStatus ZOR_NAME(zorsMulC_32f_I)(Zor32f* pSrcDst, int32_t len, Zor32f value) {
    if (pSrcDst == nullptr) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    if (value == 1.0f) return zorStsNoErr;
    if (is_zero(value)) return ZOR_NAME(zorsZero_32f)(pSrcDst, len);
    ZOR_NAME(ownsMulC_32f_I)(pSrcDst, len, value);
    return zorStsNoErr;
}
ZOR_INTERNAL ZorStatus ZOR_NAME(zorsMulC_64f_I)(Zor64f* pSrcDst, int32_t len, Zor64f value) {
    if (pSrcDst == nullptr) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    if (value == 1.0) return zorStsNoErr;
    if (is_zero(value)) return ZOR_NAME(zorsZero_64f)(pSrcDst, len);
    ZOR_NAME(ownsMulC_64f_I)(pSrcDst, len, value);
    return zorStsNoErr;
}
ZOR_ENTRY ZorStatus ZOR_NAME(zorsMulC_32fc)(const Zor32fc* pSrc, Zor32fc* pDst, int32_t len,
                                            Zor32fc value) {
    CHECK2(pSrc, pDst, len);
    ZOR_NAME(ownsMulC_32fc)(pSrc, pDst, len, value);
    return zorStsNoErr;
}
ZOR_ENTRY ZorStatus ZOR_NAME(zorsMulC_64fc)(const Zor64fc* pSrc, Zor64fc* pDst, int32_t len,
                                            Zor64fc value) {
    CHECK2(pSrc, pDst, len);
    ZOR_NAME(ownsMulC_64fc)(pSrc, pDst, len, value);
    return zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zorsSubC_32f)(const Zor32f* pSrc, Zor32f* pDst, int32_t len,
                                           Zor32f value) {
    CHECK2(pSrc, pDst, len);
    if (is_zero(value)) return ZOR_NAME(zorsCopy_32f)(pSrc, pDst, len);
    ZOR_NAME(ownsSubC_32f)(pSrc, pDst, len, value);
    return zorStsNoErr;
}
ZOR_INTERNAL ZorStatus ZOR_NAME(zorsAddC_32f_I)(Zor32f* pSrcDst, int32_t len, Zor32f value) {
    if (pSrcDst == nullptr) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    if (is_zero(value)) return zorStsNoErr;
    ZOR_NAME(ownsAddC_32f)(pSrcDst, pSrcDst, len, value);
    return zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zorsSqr_32f_I)(Zor32f* pSrcDst, int32_t len) {
    if (pSrcDst == nullptr) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    unary<vf32>(pSrcDst, pSrcDst, len, sqr);
    return zorStsNoErr;
}
ZOR_INTERNAL ZorStatus ZOR_NAME(zorsSqr_32f)(const Zor32f* pSrc, Zor32f* pDst, int32_t len) {
    CHECK2(pSrc, pDst, len);
    unary<vf32>(pSrc, pDst, len, sqr);
    return zorStsNoErr;
}
// The sign bit cleared: a NaN keeps its payload and loses its sign.
ZOR_INTERNAL ZorStatus ZOR_NAME(zorsAbs_32f)(const Zor32f* pSrc, Zor32f* pDst, int32_t len) {
    CHECK2(pSrc, pDst, len);
    unary<vf32>(pSrc, pDst, len, Abs32{});
    return zorStsNoErr;
}
