// Element-wise maximum of two vectors by the processor's rule: src1 if it
// is greater, else src2. So a NaN on either side and a pair of zeros of
// either sign give src2, on every path and at every length.
#include "variant.h"

#include <stddef.h>
#include <stdint.h>

#include "simd.h"

ZOR_BEGIN
namespace {

constexpr size_t VB = ZOR_VECTOR_BYTES;

// Written once for scalars and vectors; on vectors the compiler makes the
// maximum instruction of the level (or compare and select, same rule).
template <typename X> inline X larger(X a, X b) { return a > b ? a : b; }

// Element i (through the layer's loads: a pointer need not sit on an
// element boundary).
template <typename T> inline void larger1(const T* a, const T* b, T* d, size_t i) {
    simd::store(d + i, larger(simd::load<T>(a + i), simd::load<T>(b + i)));
}

// Nearer than one vector but not the same address: in place is safe for
// whole vectors.
inline bool near(const void* p, const void* q) {
    const uintptr_t a = (uintptr_t)p, b = (uintptr_t)q;
    return a != b && (a > b ? a - b : b - a) < VB;
}

// A destination nearer to a source than one vector, either way round, goes
// element by element from the first, so that an overlap reads what the
// walk has already written. Otherwise, from 8 elements on and with the
// destination on an element boundary, scalar steps to its vector boundary
// and whole vectors; the scalar loop finishes.
template <typename V, typename T> void max_every(const T* a, const T* b, T* d, size_t n) {
    constexpr size_t L = VB / sizeof(T);
    size_t i = 0;
    if (n >= 8 && !near(a, d) && !near(b, d) && (uintptr_t)d % sizeof(T) == 0) {
        for (; i < n && ((uintptr_t)(d + i) & (VB - 1)) != 0; ++i) larger1(a, b, d, i);
        for (; n - i >= L; i += L)
            simd::store(d + i, larger(simd::load<V>(a + i), simd::load<V>(b + i)));
    }
    for (; i < n; ++i) larger1(a, b, d, i);
}

}  // namespace
ZOR_END

// The length is unsigned: only 0 is refused.
#define MAX_EVERY(name, T, V)                                                                \
    ZOR_ENTRY ZorStatus ZOR_NAME(name)(const T* pSrc1, const T* pSrc2, T* pDst, uint32_t len) { \
        if (pSrc1 == nullptr || pSrc2 == nullptr || pDst == nullptr) return zorStsNullPtrErr;   \
        if (len == 0) return zorStsSizeErr;                                                   \
        ZOR_NS::max_every<ZOR_NS::simd::V>(pSrc1, pSrc2, pDst, len);                          \
        return zorStsNoErr;                                                                   \
    }

MAX_EVERY(zorsMaxEvery_8u, Zor8u, vu8)
MAX_EVERY(zorsMaxEvery_16u, Zor16u, vu16)
MAX_EVERY(zorsMaxEvery_32f, Zor32f, vf32)
MAX_EVERY(zorsMaxEvery_64f, Zor64f, vf64)
#undef MAX_EVERY
