// Row pieces shared by the three border families: argument checks, wide
// copies and wide fills of a repeated pixel. Everything is in bytes and
// templated on the pixel size P only, since the copies never look at a
// value: 8u C4 and 32s C1 run the same code. Included by variant sources
// only, after variant.h.
#ifndef ZOR_BORDER_ROWS_H
#define ZOR_BORDER_ROWS_H

#include <stddef.h>
#include <stdint.h>
#include <string.h>
#include "variant.h"
#include "simd.h"

ZOR_BEGIN
namespace border {

using simd::vu8;
constexpr size_t VB = simd::vectorBytes;

typedef uint8_t v16u8 __attribute__((vector_size(16)));
typedef uint8_t v32u8 __attribute__((vector_size(32)));

// ---- checks ------------------------------------------------------------------

inline ZorStatus check_sizes(ZoriSize srcRoi, ZoriSize dstRoi, int32_t top, int32_t left) {
    if (srcRoi.width < 1 || srcRoi.height < 1 || dstRoi.width < 1 || dstRoi.height < 1 || top < 0 ||
        left < 0)
        return zorStsSizeErr;
    // 64-bit sums: a huge border must fail the test, not wrap past it.
    if ((int64_t)dstRoi.width < (int64_t)left + srcRoi.width ||
        (int64_t)dstRoi.height < (int64_t)top + srcRoi.height)
        return zorStsSizeErr;
    return zorStsNoErr;
}

// The checks of every copying form after the equal-pointer branch.
inline ZorStatus check_copy(const void* src, int32_t srcStep, ZoriSize srcRoi, const void* dst,
                            int32_t dstStep, ZoriSize dstRoi, int32_t top, int32_t left) {
    if (!src || !dst) return zorStsNullPtrErr;
    if (srcStep < 1 || dstStep < 1) return zorStsStepErr;
    return check_sizes(srcRoi, dstRoi, top, left);
}

inline ZorStatus check_inplace(const void* srcDst, int32_t step, ZoriSize srcRoi, ZoriSize dstRoi,
                               int32_t top, int32_t left) {
    if (!srcDst) return zorStsNullPtrErr;
    if (step < 1) return zorStsStepErr;
    return check_sizes(srcRoi, dstRoi, top, left);
}

// ---- the frame in bytes ----------------------------------------------------

// One call's geometry once the checks have passed. Row r of the destination
// starts at dst + r * dstStep; the source sits at row top, column left.
struct Frame {
    const uint8_t* src;
    ptrdiff_t srcStep;
    uint8_t* dst;  // first frame pixel
    ptrdiff_t dstStep;
    int32_t srcW, srcH, dstW, dstH;
    int32_t top, left, right, bottom;
    bool inPlace;  // the source rows are the destination's own
};

inline Frame frame_copy(const void* src, int32_t srcStep, ZoriSize srcRoi, void* dst,
                        int32_t dstStep, ZoriSize dstRoi, int32_t top, int32_t left) {
    Frame f;
    f.src = (const uint8_t*)src;
    f.srcStep = srcStep;
    f.dst = (uint8_t*)dst;
    f.dstStep = dstStep;
    f.srcW = srcRoi.width;
    f.srcH = srcRoi.height;
    f.dstW = dstRoi.width;
    f.dstH = dstRoi.height;
    f.top = top;
    f.left = left;
    f.right = dstRoi.width - left - srcRoi.width;
    f.bottom = dstRoi.height - top - srcRoi.height;
    f.inPlace = false;
    return f;
}

// In place the pointer names the first source pixel; the frame begins
// top rows above and left pixels before it.
inline Frame frame_inplace(void* srcDst, int32_t step, ZoriSize srcRoi, ZoriSize dstRoi,
                           int32_t top, int32_t left, size_t pixelBytes) {
    uint8_t* origin =
        (uint8_t*)srcDst - (ptrdiff_t)top * step - (ptrdiff_t)left * (ptrdiff_t)pixelBytes;
    Frame f = frame_copy(srcDst, step, srcRoi, origin, step, dstRoi, top, left);
    f.inPlace = true;
    return f;
}

inline uint8_t* dst_row(const Frame& f, int32_t r) { return f.dst + (ptrdiff_t)r * f.dstStep; }

inline const uint8_t* src_row(const Frame& f, int32_t r) {
    return f.src + (ptrdiff_t)r * f.srcStep;
}

// ---- wide copies ---------------------------------------------------------

// n < VB bytes: two overlapping moves of the largest power of two that
// fits, all loads before the stores.
inline void copy_small(uint8_t* d, const uint8_t* s, size_t n) {
    if constexpr (VB > 32) {
        if (n >= 32) {
            v32u8 a = simd::load<v32u8>(s), b = simd::load<v32u8>(s + n - 32);
            simd::store(d, a);
            simd::store(d + n - 32, b);
            return;
        }
    }
    if constexpr (VB > 16) {
        if (n >= 16) {
            v16u8 a = simd::load<v16u8>(s), b = simd::load<v16u8>(s + n - 16);
            simd::store(d, a);
            simd::store(d + n - 16, b);
            return;
        }
    }
    if (n >= 8) {
        uint64_t a, b;
        memcpy(&a, s, 8);
        memcpy(&b, s + n - 8, 8);
        memcpy(d, &a, 8);
        memcpy(d + n - 8, &b, 8);
    } else if (n >= 4) {
        uint32_t a, b;
        memcpy(&a, s, 4);
        memcpy(&b, s + n - 4, 4);
        memcpy(d, &a, 4);
        memcpy(d + n - 4, &b, 4);
    } else if (n >= 2) {
        uint16_t a, b;
        memcpy(&a, s, 2);
        memcpy(&b, s + n - 2, 2);
        memcpy(d, &a, 2);
        memcpy(d + n - 2, &b, 2);
    } else if (n == 1) {
        *d = *s;
    }
}

// n bytes between regions that do not overlap. Long rows store on vector
// boundaries of the destination (a vector store that straddles two cache
// lines costs two), the unaligned head and tail as overlapping vectors.
inline void copy_bytes(uint8_t* d, const uint8_t* s, size_t n) {
    if (n < VB) {
        copy_small(d, s, n);
        return;
    }
    vu8 head = simd::load<vu8>(s), tail = simd::load<vu8>(s + n - VB);
    if (n > 2 * VB) {
        size_t i = VB - ((uintptr_t)d & (VB - 1));
        for (; i + 4 * VB <= n; i += 4 * VB) {
            vu8 a = simd::load<vu8>(s + i), b = simd::load<vu8>(s + i + VB);
            vu8 c = simd::load<vu8>(s + i + 2 * VB), e = simd::load<vu8>(s + i + 3 * VB);
            simd::store(d + i, a);
            simd::store(d + i + VB, b);
            simd::store(d + i + 2 * VB, c);
            simd::store(d + i + 3 * VB, e);
        }
        for (; i + VB <= n; i += VB) simd::store(d + i, simd::load<vu8>(s + i));
    }
    simd::store(d, head);
    simd::store(d + n - VB, tail);
}

// ---- wide fills of one repeated pixel -------------------------------------

// A pixel repeated from phase 0. Pixel sizes that divide the vector (1, 2,
// 4, 8, 16 bytes) repeat within one vector; 3, 6 and 12 bytes repeat every
// three vectors, and one more vector lets a store start at any phase.
template <int P>
struct Pattern {
    static constexpr size_t period = (VB % P == 0) ? VB : 3 * VB;
    static constexpr size_t bytes = period + VB;
    alignas(64) uint8_t b[bytes];
};

template <int P>
struct PixelWord;
template <>
struct PixelWord<1> {
    typedef uint8_t type;
};
template <>
struct PixelWord<2> {
    typedef uint16_t type;
};
template <>
struct PixelWord<4> {
    typedef uint32_t type;
};
template <>
struct PixelWord<8> {
    typedef uint64_t type;
};

template <size_t Len, size_t Total>
inline void pattern_double(uint8_t* p) {
    if constexpr (Len < Total) {
        constexpr size_t c = Len < Total - Len ? Len : Total - Len;
        memcpy(p + Len, p, c);
        pattern_double<2 * Len, Total>(p);
    }
}

template <int P>
inline void pattern_build(Pattern<P>& pat, const uint8_t* px) {
    constexpr size_t n = Pattern<P>::bytes;
    if constexpr (P == 1 || P == 2 || P == 4 || P == 8) {
        typedef typename PixelWord<P>::type E;
        typedef E VE __attribute__((vector_size(VB)));
        E x;
        memcpy(&x, px, P);
        VE v = VE{} + x;
        for (size_t i = 0; i < n; i += VB) simd::store(pat.b + i, v);
    } else {
        memcpy(pat.b, px, P);
        pattern_double<P, n>(pat.b);
    }
}

// n bytes (a whole number of pixels) of the pattern at d.
template <int P>
inline void fill_bytes(uint8_t* d, size_t n, const Pattern<P>& pat) {
    constexpr size_t K = Pattern<P>::period;
    if (n < VB) {
        copy_small(d, pat.b, n);
        return;
    }
    vu8 head = simd::load<vu8>(pat.b);
    // The last vector ends on a pixel boundary, so its phase is that of n - VB.
    vu8 tail = simd::load<vu8>(pat.b + (n - VB) % K);
    if (n > 2 * VB) {
        size_t i = VB - ((uintptr_t)d & (VB - 1));
        if constexpr (K == VB) {
            vu8 v = simd::load<vu8>(pat.b + i % P);
            for (; i + VB <= n; i += VB) simd::store(d + i, v);
        } else {
            vu8 v0 = simd::load<vu8>(pat.b + i % K);
            vu8 v1 = simd::load<vu8>(pat.b + (i + VB) % K);
            vu8 v2 = simd::load<vu8>(pat.b + (i + 2 * VB) % K);
            for (; i + 3 * VB <= n; i += 3 * VB) {
                simd::store(d + i, v0);
                simd::store(d + i + VB, v1);
                simd::store(d + i + 2 * VB, v2);
            }
            if (i + VB <= n) simd::store(d + i, v0), i += VB;
            if (i + VB <= n) simd::store(d + i, v1);
        }
    }
    simd::store(d, head);
    simd::store(d + n - VB, tail);
}

// count copies of the pixel px at d, for fills whose pixel changes from row
// to row: a few pixels go one by one, longer runs through a pattern.
template <int P>
inline void fill_pixel(uint8_t* d, int32_t count, const uint8_t* px) {
    constexpr int32_t few = (VB % P == 0) ? 16 / P + 1 : 8;
    if (count <= few) {
        uint8_t v[P];
        memcpy(v, px, P);
        for (int32_t k = 0; k < count; ++k) memcpy(d + (size_t)k * P, v, P);
        return;
    }
    Pattern<P> pat;
    pattern_build<P>(pat, px);
    fill_bytes<P>(d, (size_t)count * P, pat);
}

}  // namespace border
ZOR_END

#endif
