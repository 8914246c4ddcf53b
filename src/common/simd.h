// Vectors of this level's natural width (16, 32 or 64 bytes) as compiler
// vector types, with unaligned loads and stores. Kernels written on these
// compile to SSE, AVX or AVX-512 code from one source; anything that needs
// a particular instruction goes in a small per-level helper instead.
#ifndef ZOR_SIMD_H
#define ZOR_SIMD_H

#include <immintrin.h>
#include <stddef.h>
#include <stdint.h>
#include <string.h>

#include <type_traits>

#include "level_config.h"

namespace ZOR_NS {
namespace simd {

constexpr int vectorBytes = ZOR_VECTOR_BYTES;

typedef float vf32 __attribute__((vector_size(ZOR_VECTOR_BYTES)));
typedef double vf64 __attribute__((vector_size(ZOR_VECTOR_BYTES)));
typedef uint8_t vu8 __attribute__((vector_size(ZOR_VECTOR_BYTES)));
typedef uint16_t vu16 __attribute__((vector_size(ZOR_VECTOR_BYTES)));
typedef int16_t vs16 __attribute__((vector_size(ZOR_VECTOR_BYTES)));
typedef int32_t vs32 __attribute__((vector_size(ZOR_VECTOR_BYTES)));
typedef uint32_t vu32 __attribute__((vector_size(ZOR_VECTOR_BYTES)));
typedef int64_t vs64 __attribute__((vector_size(ZOR_VECTOR_BYTES)));

// A vector of W bytes of T, for kernels that run at another width than the
// level's float width: vec<ZOR_INT_VECTOR_BYTES, uint8_t> for byte work,
// vec<16, float> for a half-width tail.
template <int W, typename T> struct VecType {
    typedef T type __attribute__((vector_size(W)));
};
template <int W, typename T> using vec = typename VecType<W, T>::type;

// Integer vectors at the width the level's byte and word instructions have.
template <typename T> using ivec = vec<ZOR_INT_VECTOR_BYTES, T>;

// T at the width the level computes it in: floating point at the full
// width, integers at the width of the integer instructions.
template <typename T>
using native = typename std::conditional<std::is_floating_point<T>::value,
                                         vec<ZOR_VECTOR_BYTES, T>, ivec<T>>::type;

template <typename V> struct Lanes {
    typedef __typeof__((*(V*)0)[0]) Element;
    static constexpr int count = sizeof(V) / sizeof(Element);
};

// memcpy of a whole vector compiles to one unaligned load or store.
template <typename V> inline V load(const void* p) {
    V v;
    memcpy(&v, p, sizeof v);
    return v;
}

template <typename V> inline void store(void* p, V v) {
    memcpy(p, &v, sizeof v);
}

// Lane by lane rather than V{} + x: an addition to zero would turn -0 into
// +0 and quiet a signalling NaN.
template <typename V> inline V broadcast(typename Lanes<V>::Element x) {
    V v = V{};
    for (int i = 0; i < Lanes<V>::count; ++i) v[i] = x;
    return v;
}

// Lane i of the result is lane i + By of the concatenation (a, b): the
// vector By lanes further along a row whose neighbouring vectors are a, b.
template <int By, typename V> inline V lanes_from(V a, V b) {
    typedef typename Lanes<V>::Element E;
    typedef typename std::conditional<
        sizeof(E) == 1, int8_t,
        typename std::conditional<sizeof(E) == 2, int16_t,
                                  typename std::conditional<sizeof(E) == 4, int32_t,
                                                            int64_t>::type>::type>::type I;
    static_assert(By >= 0 && By <= Lanes<V>::count, "a shift within the two vectors");
    vec<sizeof(V), I> m;
    for (int i = 0; i < Lanes<V>::count; ++i) m[i] = (I)(i + By);
    return __builtin_shuffle(a, b, m);
}

// Store past the caches (p vector aligned); a store_fence() orders such
// stores before any later ones.
template <typename V> inline void stream(void* p, V v) {
#if ZOR_VECTOR_BYTES == 16
    _mm_stream_si128((__m128i*)p, (__m128i)v);
#elif ZOR_VECTOR_BYTES == 32
    _mm256_stream_si256((__m256i*)p, (__m256i)v);
#else
    _mm512_stream_si512((__m512i*)p, (__m512i)v);
#endif
}

inline void store_fence() { _mm_sfence(); }

}  // namespace simd

// ---- rows and alignment -------------------------------------------------------
// Row y of an image whose rows are `step` bytes apart; the product is formed
// in pointer width so that large images and negative steps stay exact.
template <typename T> inline T* row_at(T* p, ptrdiff_t step, ptrdiff_t y) {
    typedef typename std::conditional<std::is_const<T>::value, const char, char>::type Byte;
    return (T*)((Byte*)p + step * y);
}

// p moved up to the next multiple of `a` bytes (a power of two).
template <typename T> inline T* align_up(T* p, uintptr_t a) {
    return (T*)(((uintptr_t)p + a - 1) & ~(a - 1));
}

namespace simd {

// ---- row tails and fused arithmetic -------------------------------------------

// The first n lanes (0 <= n <= lanes) at p, the others zero: a row's
// tail. Levels with masked tails load just those lanes of 4-byte
// elements; the others copy them.
template <typename V> inline V load_n(const void* p, int n) {
    typedef typename Lanes<V>::Element E;
#if ZOR_HAS_MASKED_TAILS
    if constexpr (sizeof(V) == 64 && sizeof(E) == 4)
        return (V)_mm512_maskz_loadu_ps((__mmask16)((1u << n) - 1u), p);
#endif
    V v = V{};
    memcpy(&v, p, (size_t)n * sizeof(E));
    return v;
}

// The first n lanes of v to p; nothing past them is touched.
template <typename V> inline void store_n(void* p, V v, int n) {
    typedef typename Lanes<V>::Element E;
#if ZOR_HAS_MASKED_TAILS
    if constexpr (sizeof(V) == 64 && sizeof(E) == 4) {
        _mm512_mask_storeu_ps(p, (__mmask16)((1u << n) - 1u), (__m512)v);
        return;
    }
#endif
    memcpy(p, &v, (size_t)n * sizeof(E));
}

#if ZOR_HAS_FMA
// a * b + c of float lanes, rounded once. Nothing fuses by itself (the
// build keeps -ffp-contract=off): call this where an operation's rule
// says that a level fuses.
template <typename V> inline V fma(V a, V b, V c) {
    static_assert(std::is_same<typename Lanes<V>::Element, float>::value, "float lanes");
    if constexpr (sizeof(V) == 16) return (V)_mm_fmadd_ps((__m128)a, (__m128)b, (__m128)c);
    if constexpr (sizeof(V) == 32) return (V)_mm256_fmadd_ps((__m256)a, (__m256)b, (__m256)c);
#if ZOR_HAS_AVX512
    if constexpr (sizeof(V) == 64) return (V)_mm512_fmadd_ps((__m512)a, (__m512)b, (__m512)c);
#endif
}
#endif

}  // namespace simd
}  // namespace ZOR_NS

#endif
