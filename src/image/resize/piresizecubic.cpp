// Cubic resize: four taps per axis from the (B, C) family of cubics, the
// weights made once at Init, then per tile a border pass for the pixels
// whose taps leave the image and a four-row ring for the rest.
#include "resize_spec.h"
#include "resize_lanes.h"

#include <math.h>
#include <string.h>

ZOR_BEGIN

namespace {

using namespace resize_lanes;

// ---- weights ------------------------------------------------------------------------

// The family at distance x >= 0 in double; NaN distances weigh 1. The three
// common pairs have the constants folded.
double cubic_general(double x, double B, double C) { return resize_cubic_weight(x, B, C); }

double cubic_catmull_rom(double x, double, double) {  // (0, 0.5)
    if (x >= 2) return 0;
    if (x < 1) return (1.5 * x - 2.5) * (x * x) + 1;
    if (x < 2) return ((-0.5 * x + 2.5) * x - 4) * x + 2;
    return 1.0;
}

double cubic_bspline(double x, double, double) {  // (1, 0)
    if (x >= 2) return 0;
    if (x < 1) return (0.5 * (x * x) - x) * x + 2.0 / 3;
    if (x < 2) return (-(x * x) / 6 + x) * x + (4.0 / 3 - 2 * x);
    return 1.0;
}

double cubic_half_03(double x, double, double) {  // (0.5, 0.3)
    if (x >= 2) return 0;
    if (x < 1) return (0.95 * x - 1.7) * (x * x) + 5.0 / 6;
    if (x < 2) return ((-0.38333333333333336 * x + 2) * x - 3.4) * x + 1.8666666666666667;
    return 1.0;
}

typedef double (*CubicKernel)(double, double, double);

CubicKernel cubic_kernel(float B, float C) {
    if (B == 0.0f && C == 0.5f) return cubic_catmull_rom;
    if (B == 1.0f && C == 0.0f) return cubic_bspline;
    if (B == 0.5f && C == 0.3f) return cubic_half_03;
    return cubic_general;
}

// Weights of index - 1 .. index + 2: the distances in float, the kernel
// in double, stored as float.
void axis_weights(ResizeAxis* a, const float* fractions, CubicKernel k, double B, double C) {
    for (int32_t i = 0; i < a->dstLen; ++i) {
        const float d0 = -1.0f - fractions[i];
        const float d[4] = {d0, d0 + 1.0f, d0 + 2.0f, d0 + 3.0f};
        for (int t = 0; t < 4; ++t) a->coef32f[4 * i + t] = (float)k(fabsf(d[t]), B, C);
    }
}

ZorStatus cubic_init(ZoriSize src, ZoriSize dst, float B, float C, ZoriResizeSpec* pSpec,
                     Zor8u* pInitBuf) {
    if (!pSpec || !pInitBuf) return zorStsNullPtrErr;
    if (!src.width || !src.height || !dst.width || !dst.height) return zorStsNoOperation;
    if (src.width < 0 || src.height < 0 || dst.width < 0 || dst.height < 0 || src.width < 4 ||
        src.height < 4)
        return zorStsSizeErr;
    // Tiny weights flush to zero while the tables are made; the caller's
    // flush, underflow mask and underflow flag come back at the end.
    const uint32_t saved = ps_get_ssx();
    ps_set_ssx(0x8800, 0x8800);

    ResizeSpec* s = resize_spec(pSpec);
    uint8_t* at = resize_spec_begin(s, src, dst, kInterCubic, 2, kHintFloat, zor32f);
    s->dataType = zor8u;
    s->cubicB = B;
    s->cubicC = C;
    s->initBuffer = pInitBuf;
    s->axisY.coef32f = take<float>(at, 4 * (int64_t)dst.height);
    s->axisX.coef32f = take<float>(at, 4 * (int64_t)dst.width);

    uint8_t* f = align_up(pInitBuf, 32);
    float* fy = take<float>(f, dst.height);
    float* fx = take<float>(f, dst.width);
    resize_map_axis(&s->axisY, 2, fy);
    resize_map_axis(&s->axisX, 2, fx);
    const CubicKernel k = cubic_kernel(B, C);
    axis_weights(&s->axisX, fx, k, B, C);
    axis_weights(&s->axisY, fy, k, B, C);

    ps_set_ssx(saved, 0x8810);
    return zorStsNoErr;
}

// ---- arithmetic shared by every path ------------------------------------------------

inline float quad(const float* x, const float* c) {
    return pair(x[0], c[0], x[1], c[1]) + pair(x[2], c[2], x[3], c[3]);
}

// ---- vector helpers -----------------------------------------------------------------

using simd::vf32;
constexpr int L = simd::Lanes<vf32>::count;
constexpr int Q = L / 4;  // positions per vector of four taps

// The four taps of the Q positions x[0 .. Q) of a row as floats, one
// position per 16 bytes.
inline vf32 taps(const Zor32f* row, const int32_t* x) {
#if ZOR_VECTOR_BYTES == 16
    return simd::load<vf32>(row + x[0] - 1);
#elif ZOR_VECTOR_BYTES == 32
    return (vf32)_mm256_insertf128_ps(_mm256_castps128_ps256(_mm_loadu_ps(row + x[0] - 1)),
                                      _mm_loadu_ps(row + x[1] - 1), 1);
#else
    __m512 v = _mm512_castps128_ps512(_mm_loadu_ps(row + x[0] - 1));
    v = _mm512_insertf32x4(v, _mm_loadu_ps(row + x[1] - 1), 1);
    v = _mm512_insertf32x4(v, _mm_loadu_ps(row + x[2] - 1), 2);
    return (vf32)_mm512_insertf32x4(v, _mm_loadu_ps(row + x[3] - 1), 3);
#endif
}

inline int32_t bytes4(const Zor8u* p) {
    int32_t b;
    memcpy(&b, p, 4);
    return b;
}

inline __m128i widen4(const Zor8u* p) { return widen_bytes(_mm_cvtsi32_si128(bytes4(p))); }

inline vf32 taps(const Zor8u* row, const int32_t* x) {
#if ZOR_VECTOR_BYTES == 16
    return (vf32)_mm_cvtepi32_ps(widen4(row + x[0] - 1));
#elif ZOR_VECTOR_BYTES == 32 && !ZOR_HAS_AVX2
    return (vf32)_mm256_cvtepi32_ps(_mm256_insertf128_si256(
        _mm256_castsi128_si256(widen4(row + x[0] - 1)), widen4(row + x[1] - 1), 1));
#elif ZOR_VECTOR_BYTES == 32
    const __m128i v = _mm_insert_epi32(_mm_cvtsi32_si128(bytes4(row + x[0] - 1)),
                                       bytes4(row + x[1] - 1), 1);
    return (vf32)_mm256_cvtepi32_ps(_mm256_cvtepu8_epi32(v));
#else
    __m128i v = _mm_cvtsi32_si128(bytes4(row + x[0] - 1));
    v = _mm_insert_epi32(v, bytes4(row + x[1] - 1), 1);
    v = _mm_insert_epi32(v, bytes4(row + x[2] - 1), 2);
    v = _mm_insert_epi32(v, bytes4(row + x[3] - 1), 3);
    return (vf32)_mm512_cvtepi32_ps(_mm512_cvtepu8_epi32(v));
#endif
}

// Per 128-bit lane [a0+a1, a2+a3, b0+b1, b2+b3].
inline vf32 pair_sums(vf32 a, vf32 b) {
#if ZOR_VECTOR_BYTES == 16
    return (vf32)_mm_hadd_ps((__m128)a, (__m128)b);
#elif ZOR_VECTOR_BYTES == 32
    return (vf32)_mm256_hadd_ps((__m256)a, (__m256)b);
#else
    return (vf32)_mm512_add_ps(_mm512_shuffle_ps((__m512)a, (__m512)b, 0x88),
                               _mm512_shuffle_ps((__m512)a, (__m512)b, 0xDD));
#endif
}

// Per 128-bit lane, taps x and weights c of two vectors a, b: the pair
// sums of `pair`, laid out as pair_sums lays them.
inline vf32 pair_products(vf32 xa, vf32 ca, vf32 xb, vf32 cb) {
#if ZOR_HAS_FMA
    const vf32 pa = xa * ca, pb = xb * cb;
#if ZOR_VECTOR_BYTES == 32
    const vf32 even = (vf32)_mm256_shuffle_ps((__m256)pa, (__m256)pb, 0x88);
    const vf32 xo = (vf32)_mm256_shuffle_ps((__m256)xa, (__m256)xb, 0xDD);
    const vf32 co = (vf32)_mm256_shuffle_ps((__m256)ca, (__m256)cb, 0xDD);
#else
    const vf32 even = (vf32)_mm512_shuffle_ps((__m512)pa, (__m512)pb, 0x88);
    const vf32 xo = (vf32)_mm512_shuffle_ps((__m512)xa, (__m512)xb, 0xDD);
    const vf32 co = (vf32)_mm512_shuffle_ps((__m512)ca, (__m512)cb, 0xDD);
#endif
    return simd::fma(xo, co, even);
#else
    return pair_sums(xa * ca, xb * cb);
#endif
}

// The sums of the horizontal kernel come out with lane 4l + k holding
// position k*Q + l; this puts them in position order.
inline vf32 position_order(vf32 r) {
#if ZOR_VECTOR_BYTES == 16
    return r;
#elif ZOR_VECTOR_BYTES == 32 && ZOR_HAS_AVX2
    return (vf32)_mm256_permutevar8x32_ps((__m256)r, _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7));
#elif ZOR_VECTOR_BYTES == 32
    const __m256 s = _mm256_permute2f128_ps((__m256)r, (__m256)r, 1);
    const __m256 hi = _mm256_unpackhi_ps((__m256)r, s);
    return (vf32)_mm256_insertf128_ps(_mm256_unpacklo_ps((__m256)r, s),
                                      _mm256_castps256_ps128(hi), 1);
#else
    return (vf32)_mm512_permutexvar_ps(
        _mm512_setr_epi32(0, 4, 8, 12, 1, 5, 9, 13, 2, 6, 10, 14, 3, 7, 11, 15), (__m512)r);
#endif
}

// ---- the two passes -----------------------------------------------------------------

// One source row (pointer at the tile's column 0) into n floats: taps at
// x[i] - 1 .. x[i] + 2 with the weights c[4i ..].
template <typename T>
void horizontal(const T* src, const int32_t* x, const float* c, float* out, int32_t n) {
    int32_t i = 0;
    for (; i + L <= n; i += L) {
        // Four vectors of Q positions each: their weights lie L apart.
        const int32_t* xi = x + i;
        const float* ci = c + 4 * i;
        const vf32 s0 = pair_products(taps(src, xi), simd::load<vf32>(ci), taps(src, xi + Q),
                                      simd::load<vf32>(ci + L));
        const vf32 s1 = pair_products(taps(src, xi + 2 * Q), simd::load<vf32>(ci + 2 * L),
                                      taps(src, xi + 3 * Q), simd::load<vf32>(ci + 3 * L));
        simd::store(out + i, position_order(pair_sums(s0, s1)));
    }
    for (; i < n; ++i) {
        const T* p = src + x[i] - 1;
        const float v[4] = {pixel(p), pixel(p + 1), pixel(p + 2), pixel(p + 3)};
        out[i] = quad(v, c + 4 * i);
    }
}

inline vf32 vpair(vf32 x0, vf32 c0, vf32 x1, vf32 c1) {
#if ZOR_HAS_FMA
    return simd::fma(x1, c1, x0 * c0);
#else
    return x0 * c0 + x1 * c1;
#endif
}

// Rows y - 1 .. y + 2 with one destination row's weights.
template <typename T> void vertical(const float* const* r, const float* c, T* dst, int32_t n) {
    const vf32 c0 = simd::broadcast<vf32>(c[0]), c1 = simd::broadcast<vf32>(c[1]);
    const vf32 c2 = simd::broadcast<vf32>(c[2]), c3 = simd::broadcast<vf32>(c[3]);
    int32_t i = 0;
    for (; i + L <= n; i += L) {
        const vf32 x0 = simd::load<vf32>(r[0] + i), x1 = simd::load<vf32>(r[1] + i);
        const vf32 x2 = simd::load<vf32>(r[2] + i), x3 = simd::load<vf32>(r[3] + i);
        store_row(dst + i, vpair(x0, c0, x1, c1) + vpair(x2, c2, x3, c3), L);
    }
    if (i < n) {
        const int k = n - i;
        const vf32 x0 = simd::load_n<vf32>(r[0] + i, k), x1 = simd::load_n<vf32>(r[1] + i, k);
        const vf32 x2 = simd::load_n<vf32>(r[2] + i, k), x3 = simd::load_n<vf32>(r[3] + i, k);
        store_row(dst + i, vpair(x0, c0, x1, c1) + vpair(x2, c2, x3, c3), k);
    }
}

// ---- the operation ------------------------------------------------------------------

// The image index a tap reads in a clamped direction (table by the
// window's index: below 0, 0, len - 2, above len - 2, else unclamped);
// `low`/`high` say whether that side clamps at all.
inline void clamp_taps(int32_t index, int32_t len, bool low, bool high, int32_t* out) {
    if (low && index < 0) {
        out[0] = out[1] = out[2] = 0;
        out[3] = 1;
    } else if (low && index == 0) {
        out[0] = out[1] = 0;
        out[2] = 1;
        out[3] = 2;
    } else if (high && index == len - 2) {
        out[0] = len - 3;
        out[1] = len - 2;
        out[2] = out[3] = len - 1;
    } else if (high && index > len - 2) {
        out[0] = out[1] = out[2] = out[3] = len - 1;
    } else {
        for (int t = 0; t < 4; ++t) out[t] = index - 1 + t;
    }
}

typedef ResizeJob Tile;

// Column i of a source row (relative to the tile) through the horizontal
// pass, columns clamped on the sides whose strips are not empty.
template <typename T> float clamped_h(const Tile& k, const T* row, int32_t i) {
    const ResizeTile& t = k.t;
    int32_t cols[4];
    clamp_taps(t.localX[i] + t.shiftX, k.s->axisX.srcLen, k.st.left != 0, k.st.right != 0, cols);
    float v[4];
    for (int b = 0; b < 4; ++b) v[b] = pixel(row + (cols[b] - t.shiftX));
    return quad(v, k.s->axisX.coef32f + 4 * (int64_t)(t.x0 + i));
}

// A pixel of a side strip between the top and bottom strips, alone from
// its 4x4 window: rows unclamped.
template <typename T>
void side_pixel(const Tile& k, const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep,
                int32_t i, int32_t j) {
    const ResizeTile& t = k.t;
    float r[4];
    for (int a = 0; a < 4; ++a) r[a] = clamped_h(k, row_at(pSrc, srcStep, t.localY[j] - 1 + a), i);
    put(row_at(pDst, dstStep, j) + i, quad(r, k.s->axisY.coef32f + 4 * (int64_t)(t.y0 + j)));
}

// A row of the top or bottom strip: its four clamped source rows through
// the horizontal pass into the row buffers (the core's kernel between the
// side strips, which reads no clamped column), then the vertical pass. The
// arithmetic is that of a pixel computed alone.
template <typename T>
void strip_row(const Tile& k, const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep,
               int32_t j) {
    const ResizeTile& t = k.t;
    const ResizeStrips& st = k.st;
    int32_t rows[4];
    clamp_taps(t.localY[j] + t.shiftY, k.s->axisY.srcLen, true, true, rows);
    const int32_t mid = t.w - st.left - st.right;
    float* ring[4];
    for (int a = 0; a < 4; ++a) {
        float* out = ring[a] = (float*)(t.rows + a * tile_row_bytes(t));
        const T* row = row_at(pSrc, srcStep, rows[a] - t.shiftY);
        if (mid > 0)
            horizontal(row, t.localX + st.left, k.s->axisX.coef32f + 4 * (int64_t)(t.x0 + st.left),
                       out + st.left, mid);
        for (int32_t i = 0; i < st.left; ++i) out[i] = clamped_h(k, row, i);
        for (int32_t i = t.w - st.right; i < t.w; ++i) out[i] = clamped_h(k, row, i);
    }
    vertical(ring, k.s->axisY.coef32f + 4 * (int64_t)(t.y0 + j), row_at(pDst, dstStep, j), t.w);
}

template <typename T>
void border_pass(const Tile& k, const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep) {
    const ResizeTile& t = k.t;
    const ResizeStrips& st = k.st;
    for (int32_t j = 0; j < st.top; ++j) strip_row(k, pSrc, srcStep, pDst, dstStep, j);
    for (int32_t j = st.top; j < t.h - st.bottom; ++j) {
        for (int32_t i = 0; i < st.left; ++i) side_pixel(k, pSrc, srcStep, pDst, dstStep, i, j);
        for (int32_t i = t.w - st.right; i < t.w; ++i)
            side_pixel(k, pSrc, srcStep, pDst, dstStep, i, j);
    }
    for (int32_t j = t.h - st.bottom; j < t.h; ++j) strip_row(k, pSrc, srcStep, pDst, dstStep, j);
}

// The four-row ring over the core: ring[a] holds source row prev - 1 + a.
template <typename T>
void core(const Tile& k, const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep) {
    const ResizeTile& t = k.t;
    const ResizeStrips& st = k.st;
    const int32_t w = t.w - st.left - st.right, h = t.h - st.top - st.bottom;
    const int32_t* x = t.localX + st.left;
    const int32_t* y = t.localY + st.top;
    const float* cx = k.s->axisX.coef32f + 4 * (int64_t)(t.x0 + st.left);
    const float* cy = k.s->axisY.coef32f + 4 * (int64_t)(t.y0 + st.top);
    T* dst = row_at(pDst, dstStep, st.top) + st.left;
    float* ring[4];
    for (int a = 0; a < 4; ++a) ring[a] = (float*)(t.rows + a * tile_row_bytes(t));
    auto filter = [&](int32_t row, float* out) {
        horizontal(row_at(pSrc, srcStep, row), x, cx, out, w);
    };
    int32_t prev = y[0] - 1;
    for (int a = 1; a < 4; ++a) filter(prev - 1 + a, ring[a]);
    for (int32_t j = 0; j < h; ++j) {
        const int32_t yj = y[j];
        if (yj > prev) {
            const int32_t d = yj - prev < 4 ? yj - prev : 4;
            float* moved[4];
            for (int a = 0; a < 4; ++a) moved[a] = ring[(a + d) & 3];
            for (int a = 0; a < 4; ++a) ring[a] = moved[a];
            for (int a = 4 - d; a < 4; ++a) filter(yj - 1 + a, ring[a]);
            prev = yj;
        }
        vertical(ring, cy + 4 * (int64_t)j, row_at(dst, dstStep, j), w);
    }
}

template <typename T>
ZorStatus cubic(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep, ZoriPoint dstOffset,
                ZoriSize dstSize, int32_t border, const ZoriResizeSpec* pSpec, Zor8u* pBuffer) {
    ResizeJob k;
    const ZorStatus st = resize_job(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, border,
                                    pSpec, pBuffer, sizeof(T) == 4, kInterCubic, &k);
    if (st != zorStsNoErr) return st;
    resize_four_taps(k, pSrc, srcStep, pDst, dstStep);
    return tile_status(k.t, zorStsNoErr);
}

template <typename T>
void four_taps(const Tile& k, const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep) {
    border_pass(k, pSrc, srcStep, pDst, dstStep);
    if (k.t.w - k.st.left - k.st.right >= 1 && k.t.h - k.st.top - k.st.bottom >= 1)
        core(k, pSrc, srcStep, pDst, dstStep);
}

}  // namespace

void resize_four_taps(const ResizeJob& k, const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                      int32_t dstStep) {
    four_taps(k, pSrc, srcStep, pDst, dstStep);
}
void resize_four_taps(const ResizeJob& k, const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                      int32_t dstStep) {
    four_taps(k, pSrc, srcStep, pDst, dstStep);
}

ZOR_END

using namespace ZOR_NS;

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeCubicInit_8u)(ZoriSize srcSize, ZoriSize dstSize,
                                                     Zor32f cubicB, Zor32f cubicC,
                                                     ZoriResizeSpec* pSpec, Zor8u* pInitBuf) {
    return cubic_init(srcSize, dstSize, cubicB, cubicC, pSpec, pInitBuf);
}
ZOR_SECOND_NAME(zoriResizeCubicInit_32f, zoriResizeCubicInit_8u)

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeCubic_8u_C1R)(const Zor8u* pSrc, int32_t srcStep,
                                                     Zor8u* pDst, int32_t dstStep,
                                                     ZoriPoint dstOffset, ZoriSize dstSize,
                                                     ZoriBorderType border, const Zor8u*,
                                                     const ZoriResizeSpec* pSpec,
                                                     Zor8u* pBuffer) {
    return cubic(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                 pBuffer);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeCubic_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                      Zor32f* pDst, int32_t dstStep,
                                                      ZoriPoint dstOffset, ZoriSize dstSize,
                                                      ZoriBorderType border, const Zor32f*,
                                                      const ZoriResizeSpec* pSpec,
                                                      Zor8u* pBuffer) {
    return cubic(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                 pBuffer);
}
