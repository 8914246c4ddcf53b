// Erosion and dilation, shared by the driver (cvmorph.cpp) and the kernels
// (cvmorph_new.cpp) of one level: the record's head, the job a kernel gets,
// and the min/max and vector helpers.
#ifndef ZOR_MORPH_INTERNAL_H
#define ZOR_MORPH_INTERNAL_H

#include <stddef.h>
#include <stdint.h>
#include <string.h>

#include "simd.h"
#include "variant.h"

// The helpers are small and called per vector: always inlined, so that
// their loops unroll into registers.
#define MORPH_INLINE inline __attribute__((always_inline))
#define MORPH_LAMBDA __attribute__((always_inline))

ZOR_BEGIN
namespace morph {

// The fixed head of the record, 136 bytes; the stored mask follows right
// behind it, then the row lists, then the run table. Kept identical for all
// types and levels: any level's Init serves any level's call. The caller's
// block need not be aligned, so the head is only ever copied in and out
// with memcpy.
struct Head {
    const uint8_t* pMask;      // maskWidth * maskHeight bytes of 0 or 255
    int32_t maskWidth;         // caller's width | 1
    int32_t maskHeight;        // caller's height | 1
    int32_t anchorX;           // caller's width >> 1
    int32_t anchorY;           // caller's height >> 1
    int32_t isRowRuns;
    uint32_t maskFeature;
    int32_t isCross;
    int32_t isFixedShape;
    const uint8_t* pRowLists;  // per row (maskWidth + 1) 16-bit: count, columns
    const uint8_t* pRuns;      // per row two 16-bit: first, last (-1: none)
    int32_t callerWidth, callerHeight;
    uint8_t reserved[72];
};
static_assert(sizeof(Head) == 136, "the record's head is 136 bytes");

enum : uint32_t {
    kFull = 2,          // every cell set
    kEmpty = 4,         // no cell set
    kOuterEmpty = 8,    // an outer row or column has no set cell
    kRowRuns = 16,      // each row's cells are one run
    kCross = 32,        // one full row and one full column, nothing else
    kFixed = 0x100,     // one of the fixed shapes; 0x200, 0x400 say which
    kFixed5 = 0x300,
    kFixed7 = 0x500
};

// 16-bit entries of the lists and the run table, which may lie at odd
// addresses.
MORPH_INLINE int32_t rd16u(const uint8_t* p, ptrdiff_t i) {
    uint16_t v;
    memcpy(&v, p + 2 * i, 2);
    return v;
}
MORPH_INLINE int32_t rd16s(const uint8_t* p, ptrdiff_t i) {
    int16_t v;
    memcpy(&v, p + 2 * i, 2);
    return v;
}

// ---- vectors ----------------------------------------------------------------
// simd::native<T>: integer min/max runs at the level's byte and word width
// (16 bytes on e9, 32 on n0); floats use the full width everywhere.

// The type a kernel body is instantiated with: a vector, or the element.
template <typename V> struct Tag {
    typedef V type;
};

// Runs f(Tag<V>, x) over the elements from .. end - 1 that are fewer than
// one vector: halves of the vector down to 8 bytes, then single elements.
template <typename T, typename F>
MORPH_INLINE void for_part(int32_t x, int32_t end, F& f) {
    constexpr int B = (int)sizeof(simd::native<T>), E = (int)sizeof(T);
    if constexpr (B > 32) {
        if (x + 32 / E <= end) {
            f(Tag<simd::vec<32, T>>(), x);
            x += 32 / E;
        }
    }
    if constexpr (B > 16) {
        if (x + 16 / E <= end) {
            f(Tag<simd::vec<16, T>>(), x);
            x += 16 / E;
        }
    }
    if constexpr (E < 4) {
        if (x + 8 / E <= end) {
            f(Tag<simd::vec<8, T>>(), x);
            x += 8 / E;
        }
    }
    for (; x < end; ++x) f(Tag<T>(), x);
}

// Runs f(Tag<V>, x) over x = from .. W - 1 in vectors of the level's width.
// The full vectors are placed so that their stores into `aligned` (the
// row f writes, at x = 0) fall on vector boundaries: whole cache lines
// written at once need not be read first. The ends go through for_part,
// or, where f has no state (overlap true), through one more full vector
// that recomputes a few pixels and gives them the same values. Every pixel
// sees the same operations in the same order whichever width takes it.
template <typename T, typename F>
MORPH_INLINE void for_row(int32_t from, int32_t W, bool overlap, const T* aligned, F f) {
    typedef simd::native<T> V;
    constexpr int B = (int)sizeof(V), E = (int)sizeof(T), N = B / E;
    int32_t x = from;
    if (W - x >= 2 * N && ((uintptr_t)aligned % E) == 0) {
        const int32_t a = (int32_t)(((0 - (uintptr_t)(aligned + x)) & (B - 1)) / E);
        if (a) {
            if (overlap) f(Tag<V>(), x);
            else for_part<T>(x, x + a, f);
            x += a;
        }
    }
    for (; x + N <= W; x += N) f(Tag<V>(), x);
    if (x == W) return;
    if (overlap && W - from >= N) {
        f(Tag<V>(), W - N);
        return;
    }
    for_part<T>(x, W, f);
}

// The operations, for scalars and vectors alike, the running result first:
// for floats exactly what minps/maxps do with it as first operand, so a
// row's scalar tail gives what the vector body gives.
struct OpMin {
    template <typename V> static MORPH_INLINE V f(V acc, V x) { return acc < x ? acc : x; }
};
struct OpMax {
    template <typename V> static MORPH_INLINE V f(V acc, V x) { return acc > x ? acc : x; }
};

// Neutral start of the offset kernels.
template <typename T, typename Op> struct Neutral;
template <> struct Neutral<Zor8u, OpMin> { static constexpr Zor8u v = 255; };
template <> struct Neutral<Zor8u, OpMax> { static constexpr Zor8u v = 0; };
template <> struct Neutral<Zor16u, OpMin> { static constexpr Zor16u v = 65535; };
template <> struct Neutral<Zor16u, OpMax> { static constexpr Zor16u v = 0; };
template <> struct Neutral<Zor16s, OpMin> { static constexpr Zor16s v = 32767; };
template <> struct Neutral<Zor16s, OpMax> { static constexpr Zor16s v = -32768; };
template <> struct Neutral<Zor32f, OpMin> { static constexpr Zor32f v = 3.4028234663852886e38f; };
template <> struct Neutral<Zor32f, OpMax> { static constexpr Zor32f v = -3.4028234663852886e38f; };

// ---- jobs -------------------------------------------------------------------
// A kernel reads every cell from memory without testing coordinates: src
// is the window's top-left corner for output (0, 0), so output (x, y) reads
// src rows y .. y + maskHeight - 1 and columns x .. x + maskWidth - 1.
// ring is the caller's buffer behind the frames, 32-byte aligned, with room
// for maskHeight rows of width elements rounded up to 32 bytes.
template <typename T> struct Job {
    const T* src;
    ptrdiff_t srcStep;  // bytes
    T* dst;
    ptrdiff_t dstStep;  // bytes
    int32_t width, height;
    const Head* head;
    uint8_t* ring;
};

// Kernels (cvmorph_new.cpp), instantiated for each type and operation.
template <typename T, typename Op> void rect3x3(const Job<T>& j);
template <typename T, typename Op> void rect_separable(const Job<T>& j);
template <typename Op> void fixed_8u(const Job<Zor8u>& j);
template <typename Op> void cross_8u(const Job<Zor8u>& j);
template <typename Op> void row_runs_8u(const Job<Zor8u>& j);
template <typename Op> void general_8u(const Job<Zor8u>& j);
template <typename T, typename Op> void offsets(const Job<T>& j);

}  // namespace morph
ZOR_END

#endif
