// Linear resize. Init builds per axis the source index and the weight of
// every destination position; a call replicates the image's edge into the
// strips whose taps leave the image, one pixel at a time, and runs the
// interior through a ring of two horizontally filtered source rows.
#include "resize_spec.h"

#include <string.h>

#include "resize_linear_rows.h"

ZOR_BEGIN
namespace {

using namespace linear;

// ---- Init ---------------------------------------------------------------------------

// pos = (i + 0.5) * ratio - 0.5, index = floor(pos). The float record keeps
// the fraction; the fixed-point one w = trunc(fraction * 16384 + 1e-7),
// per row alone, per column as the pair (16384 - w, w) that pmaddwd takes.
// The counts are of positions whose left tap lies below 0 or whose right
// tap lies past the last pixel.
void build_axis(ResizeAxis* a, bool q14, bool pairs) {
    const double ratio = axis_ratio(*a);
    int32_t low = 0, high = 0;
    for (int32_t i = 0; i < a->dstLen; ++i) {
        const double pos = ((double)i + 0.5) * ratio - 0.5;
        const double index = floor(pos);
        a->indexTable[i] = (int32_t)index;
        if (q14) {
            const int32_t w = (int32_t)((pos - index) * 16384.0 + 1e-7);
            if (pairs) {
                a->coefQ14[2 * i] = (uint16_t)(16384 - w);
                a->coefQ14[2 * i + 1] = (uint16_t)w;
            } else {
                a->coefQ14[i] = (uint16_t)w;
            }
            low += pos < 0;
            high += pos >= a->srcLen - 1;
        } else {
            a->coef32f[i] = (float)(pos - index);
            low += index < 0;
            high += index >= a->srcLen - 1;
        }
    }
    a->lowCount = low;
    a->highCount = high;
}

ZorStatus linear_init(ZoriSize src, ZoriSize dst, ZoriResizeSpec* pSpec, bool q14) {
    if (!pSpec) return zorStsNullPtrErr;
    if (!src.width || !src.height || !dst.width || !dst.height) return zorStsNoOperation;
    if (src.width < 2 || src.height < 2 || dst.width < 0 || dst.height < 0) return zorStsSizeErr;
    ResizeSpec* s = resize_spec(pSpec);
    uint8_t* at = resize_spec_begin(s, src, dst, kInterLinear, 1, q14 ? kHintQ14 : kHintFloat,
                                    q14 ? zor16s : zor32f);
    s->dataType = q14 ? zor8u : zor16u;
    if (q14) {
        s->axisY.coefQ14 = take<uint16_t>(at, dst.height);
        s->axisX.coefQ14 = take<uint16_t>(at, 2 * (int64_t)dst.width);
    } else {
        s->axisY.coef32f = take<float>(at, dst.height);
        s->axisX.coef32f = take<float>(at, dst.width);
    }
    build_axis(&s->axisY, q14, false);
    build_axis(&s->axisX, q14, true);
    return zorStsNoErr;
}

// ---- the three arithmetics ------------------------------------------------------------

// What differs between the fixed-point 8u path, the float 8u path and 32f:
// the row buffer element, the row passes, and the arithmetic of one edge
// pixel from a pair along x (column weight) or along y (row weight).
struct Q14 {
    typedef uint8_t Pixel;
    typedef uint16_t Row;
    const uint16_t* cx;  // weight pairs per destination column
    const uint16_t* cy;  // weight per destination row
    // The edges' rounding: an odd integer part gets one more unit.
    static uint8_t round14(int32_t v) {
        return (uint8_t)saturate_8u((v + ((v >> 14) & 1) + 8192) >> 14);
    }
    uint8_t along_x(uint8_t a, uint8_t b, int32_t x) const {
        return round14(a * cx[2 * x] + b * cx[2 * x + 1]);
    }
    uint8_t along_y(uint8_t a, uint8_t b, int32_t y) const {
        return round14((a << 14) + (b - a) * cy[y]);
    }
    void hpass(const uint8_t* s, const int32_t* lx, int32_t x, Row* out, int32_t n,
               Columns columns) const {
        hpass_q14(s, lx, cx + 2 * x, out, n, columns);
    }
    void vpass(const Row* r0, const Row* r1, int32_t y, uint8_t* d, int32_t n, bool) const {
        vpass_q14(r0, r1, cy[y], d, n);
    }
    // Every column weight of the block one half.
    bool halves(int32_t x, int32_t n) const {
        for (int32_t i = 0; i < 2 * n; ++i)
            if (cx[2 * x + i] != 8192) return false;
        return true;
    }
    bool halving(const uint8_t* s0, const uint8_t* s1, int32_t x, int32_t y, uint8_t* d,
                 int32_t n, bool, bool halves) const {
        hvpass_q14_halving(s0, s1, cx + 2 * x, cy[y], d, n, halves);
        return true;
    }
};

template <typename T> struct Float {
    typedef T Pixel;
    typedef float Row;
    const float* cx;  // fraction per destination column
    const float* cy;  // fraction per destination row
    static T out(float v) {
        if constexpr (sizeof(T) == 1)
            return (T)saturate_8u(round_to_int(v));
        else
            return v;
    }
    T along_x(T a, T b, int32_t x) const { return out(lerp((float)a, (float)b, cx[x])); }
    T along_y(T a, T b, int32_t y) const { return out(lerp((float)a, (float)b, cy[y])); }
    void hpass(const T* s, const int32_t* lx, int32_t x, Row* out, int32_t n,
               Columns columns) const {
        hpass_float(s, lx, cx + x, out, n, columns);
    }
    void vpass(const Row* r0, const Row* r1, int32_t y, T* d, int32_t n, bool stream) const {
        vpass_float(r0, r1, cy[y], d, n, stream);
    }
    bool halves(int32_t, int32_t) const { return false; }
    bool halving(const T* s0, const T* s1, int32_t x, int32_t y, T* d, int32_t n, bool stream,
                 bool) const {
        if constexpr (sizeof(T) == 1) return false;
        else hvpass_float_halving(s0, s1, cx + x, cy[y], d, n, stream);
        return true;
    }
};

// ---- the edge strips ------------------------------------------------------------------

// Every strip pixel alone, reading the image's first or last row or column
// (relative to pSrc: -shift and len - shift - 1) as the replicated edge.
template <typename A>
void edge_strips(const A& ar, const ResizeSpec* s, const ResizeTile& t, const ResizeStrips& st,
                 const typename A::Pixel* pSrc, int32_t srcStep, typename A::Pixel* pDst,
                 int32_t dstStep) {
    typedef typename A::Pixel T;
    const int32_t firstX = -t.shiftX, lastX = s->axisX.srcLen - t.shiftX - 1;
    const int32_t firstY = -t.shiftY, lastY = s->axisY.srcLen - t.shiftY - 1;
    auto at = [&](int32_t x, int32_t y) { return pixel(row_at(pSrc, srcStep, y) + x); };
    auto put = [&](int32_t i, int32_t j, T v) {
        memcpy(row_at(pDst, dstStep, j) + i, &v, sizeof v);
    };
    auto edge_row = [&](int32_t j, int32_t y) {
        for (int32_t i = 0; i < t.w; ++i) {
            int32_t c0 = t.localX[i], c1 = c0 + 1;
            if (c0 < firstX && st.left)
                c0 = c1 = firstX;
            else if (c0 >= lastX && st.right)
                c0 = c1 = lastX;
            put(i, j, ar.along_x(at(c0, y), at(c1, y), t.x0 + i));
        }
    };
    auto edge_column = [&](int32_t i, int32_t x) {
        for (int32_t j = st.top; j < t.h - st.bottom; ++j)
            put(i, j, ar.along_y(at(x, t.localY[j]), at(x, t.localY[j] + 1), t.y0 + j));
    };
    for (int32_t j = 0; j < st.top; ++j) edge_row(j, firstY);
    for (int32_t i = 0; i < st.left; ++i) edge_column(i, firstX);
    for (int32_t i = t.w - st.right; i < t.w; ++i) edge_column(i, lastX);
    for (int32_t j = t.h - st.bottom; j < t.h; ++j) edge_row(j, lastY);
}

// ---- the core ---------------------------------------------------------------------------

// A w x h block whose taps all lie in readable memory: each source row it
// needs is filtered horizontally once into the ring, then each destination
// row blends the ring's two rows. x and y are the block's first
// destination column and row (for the weights).
template <typename A>
void core(const A& ar, const typename A::Pixel* pSrc, int32_t srcStep, typename A::Pixel* pDst,
          int32_t dstStep, const int32_t* lx, const int32_t* ly, int32_t x, int32_t y0,
          int32_t w, int32_t h, typename A::Row* cur, typename A::Row* next) {
    const Columns columns = columns_of(lx, w);
    const bool halves = columns == kStride2 && ar.halves(x, w);
    // A destination larger than the caches is stored past them: it would
    // only push out the source rows still to come.
    int32_t cache = 0;
    zorGetMaxCacheSizeB(&cache);
    const bool stream = (int64_t)w * h * (int64_t)sizeof(typename A::Pixel) > cache;
    int32_t prev = ly[0] - 1;
    ar.hpass(row_at(pSrc, srcStep, prev + 1), lx, x, next, w, columns);
    for (int32_t j = 0; j < h; ++j) {
        const int32_t y = ly[j];
        // Halving, neither row needed again: no row goes through the ring.
        if (columns == kStride2 && y > prev + 1 && (j + 1 == h || ly[j + 1] > y + 1) &&
            ar.halving(row_at(pSrc, srcStep, y) + lx[0], row_at(pSrc, srcStep, y + 1) + lx[0], x,
                       y0 + j, row_at(pDst, dstStep, j), w, stream, halves)) {
            // The ring holds nothing the next row can use: it filters both.
            if (j + 1 < h) prev = ly[j + 1] - 2;
            continue;
        }
        if (y > prev) {
            typename A::Row* const t = cur;
            cur = next;
            next = t;
            ar.hpass(row_at(pSrc, srcStep, y + 1), lx, x, next, w, columns);
            if (y > prev + 1) ar.hpass(row_at(pSrc, srcStep, y), lx, x, cur, w, columns);
            prev = y;
        }
        ar.vpass(cur, next, y0 + j, row_at(pDst, dstStep, j), w, stream);
    }
    if (stream) simd::store_fence();
}

template <typename A>
ZorStatus run(const A& ar, const ResizeSpec* s, const typename A::Pixel* pSrc, int32_t srcStep,
              typename A::Pixel* pDst, int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
              int32_t border, Zor8u* pBuffer) {
    ResizeTile t;
    resize_tile(s, dstOffset, dstSize, pBuffer, &t);
    const ResizeStrips st = resize_strips(s, t, border);
    edge_strips(ar, s, t, st, pSrc, srcStep, pDst, dstStep);
    const int32_t w = t.w - st.left - st.right, h = t.h - st.top - st.bottom;
    if (w < 1 || h < 1) return tile_status(t, zorStsNoErr);
    typedef typename A::Row Row;
    Row* const r0 = (Row*)t.rows;
    Row* const r1 = (Row*)(t.rows + tile_row_bytes(t));
    core(ar, pSrc, srcStep, row_at(pDst, dstStep, st.top) + st.left, dstStep, t.localX + st.left,
         t.localY + st.top, t.x0 + st.left, t.y0 + st.top, w, h, r0, r1);
    return tile_status(t, zorStsNoErr);
}

template <typename T>
ZorStatus resize_linear(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep,
                        ZoriPoint dstOffset, ZoriSize dstSize, int32_t border,
                        const ZoriResizeSpec* pSpec, Zor8u* pBuffer) {
    if (!resize_border_ok(border)) return zorStsBorderErr;
    const ResizeSpec* s;
    const ZorStatus st = resize_check(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, pSpec,
                                      pBuffer, sizeof(T) == 4, kInterLinear, &s);
    if (st != zorStsNoErr) return st;
    if constexpr (sizeof(T) == 1)
        if (s->hint == kHintQ14)
            return run(Q14{s->axisX.coefQ14, s->axisY.coefQ14}, s, pSrc, srcStep, pDst, dstStep,
                       dstOffset, dstSize, border, pBuffer);
    // A fixed-point record has no float tables: refused rather than read.
    if (!s->axisX.coef32f) return zorStsContextMatchErr;
    return run(Float<T>{s->axisX.coef32f, s->axisY.coef32f}, s, pSrc, srcStep, pDst, dstStep,
               dstOffset, dstSize, border, pBuffer);
}

}  // namespace
ZOR_END

using namespace ZOR_NS;

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLinearInit_8u)(ZoriSize srcSize, ZoriSize dstSize,
                                                      ZoriResizeSpec* pSpec) {
    return linear_init(srcSize, dstSize, pSpec, true);
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLinearInit_32f)(ZoriSize srcSize, ZoriSize dstSize,
                                                       ZoriResizeSpec* pSpec) {
    return linear_init(srcSize, dstSize, pSpec, false);
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLinear_8u_C1R)(const Zor8u* pSrc, int32_t srcStep,
                                                      Zor8u* pDst, int32_t dstStep,
                                                      ZoriPoint dstOffset, ZoriSize dstSize,
                                                      ZoriBorderType border, const Zor8u*,
                                                      const ZoriResizeSpec* pSpec,
                                                      Zor8u* pBuffer) {
    return resize_linear(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                  pBuffer);
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLinear_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                       Zor32f* pDst, int32_t dstStep,
                                                       ZoriPoint dstOffset, ZoriSize dstSize,
                                                       ZoriBorderType border, const Zor32f*,
                                                       const ZoriResizeSpec* pSpec,
                                                       Zor8u* pBuffer) {
    return resize_linear(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                  pBuffer);
}
