// Reversal of a vector, out of place and in place. Elements move as whole
// bit patterns (a complex element keeps its real and imaginary order), so
// any value, NaN payloads included, arrives unchanged.
#include "variant.h"

#include <stddef.h>
#include <stdint.h>

#include <utility>

#include "simd.h"

ZOR_BEGIN
namespace {

using simd::vs32;
using simd::vs64;
constexpr size_t VB = ZOR_VECTOR_BYTES;

// Lanes in reverse order by groups of G lanes, each group kept in order.
template <int G, typename V, size_t... I> inline V reverse(V v, std::index_sequence<I...>) {
    constexpr size_t L = sizeof...(I);
    return __builtin_shufflevector(v, v, ((L / G - 1 - I / G) * G + I % G)...);
}

// Elements of G units of type T each (unit = lane); n counts units.
template <typename V, typename T, int G> void flip(const T* s, T* d, size_t n) {
    constexpr size_t L = VB / sizeof(T);
    const auto lanes = std::make_index_sequence<L>();
    size_t i = 0;
    if (n >= 2 * L && (uintptr_t)d % (sizeof(T) * G) == 0) {
        // Whole elements up to the destination's vector boundary.
        for (; ((uintptr_t)(d + i) & (VB - 1)) != 0; i += G)
            for (int g = 0; g < G; ++g) simd::store(d + i + g, simd::load<T>(s + n - i - G + g));
    }
    for (; n - i >= L; i += L) simd::store(d + i, reverse<G>(simd::load<V>(s + n - i - L), lanes));
    for (; i < n; i += G)
        for (int g = 0; g < G; ++g) simd::store(d + i + g, simd::load<T>(s + n - i - G + g));
}

// Swaps a vector from each end while they do not meet, then single
// elements towards the middle.
template <typename V, typename T, int G> void flip_inplace(T* p, size_t n) {
    constexpr size_t L = VB / sizeof(T);
    const auto lanes = std::make_index_sequence<L>();
    size_t lo = 0, hi = n;
    for (; hi - lo >= 2 * L; lo += L, hi -= L) {
        const V a = simd::load<V>(p + lo), b = simd::load<V>(p + hi - L);
        simd::store(p + lo, reverse<G>(b, lanes));
        simd::store(p + hi - L, reverse<G>(a, lanes));
    }
    for (; hi - lo >= 2 * G; lo += G, hi -= G)
        for (int g = 0; g < G; ++g) {
            const T t = simd::load<T>(p + lo + g);
            simd::store(p + lo + g, simd::load<T>(p + hi - G + g));
            simd::store(p + hi - G + g, t);
        }
}

}  // namespace

// Float elements moved as integers of their size (only through the vector
// layer's loads and stores, which need no alignment).
typedef int32_t Bits32;
typedef int64_t Bits64;

ZOR_END

// Units: 32f as 32-bit lanes, 32fc and 64f as 64-bit lanes, 64fc as pairs
// of 64-bit lanes.
#define FLIP(T, suffix, V, U, G)                                                            \
    ZOR_INTERNAL ZorStatus ZOR_NAME(zorsFlip_##suffix##_I)(T * pSrcDst, int32_t len) {      \
        if (pSrcDst == nullptr) return zorStsNullPtrErr;                                    \
        if (len < 1) return zorStsSizeErr;                                                  \
        ZOR_NS::flip_inplace<ZOR_NS::simd::V, U, G>((U*)pSrcDst, (size_t)len * G);          \
        return zorStsNoErr;                                                                 \
    }                                                                                       \
    /* Equal pointers are the in-place form, with its checks. */                            \
    ZOR_ENTRY ZorStatus ZOR_NAME(zorsFlip_##suffix)(const T* pSrc, T* pDst, int32_t len) {  \
        if (pSrc == pDst) return ZOR_NAME(zorsFlip_##suffix##_I)(pDst, len);                \
        if (pSrc == nullptr || pDst == nullptr) return zorStsNullPtrErr;                    \
        if (len < 1) return zorStsSizeErr;                                                  \
        ZOR_NS::flip<ZOR_NS::simd::V, U, G>((const U*)pSrc, (U*)pDst, (size_t)len * G);     \
        return zorStsNoErr;                                                                 \
    }

FLIP(Zor32f, 32f, vs32, ZOR_NS::Bits32, 1)
FLIP(Zor32fc, 32fc, vs64, ZOR_NS::Bits64, 1)
FLIP(Zor64f, 64f, vs64, ZOR_NS::Bits64, 1)
FLIP(Zor64fc, 64fc, vs64, ZOR_NS::Bits64, 2)
#undef FLIP
