// The general resize window: 2 * tapsX taps per destination column and
// 2 * tapsY per row, for three-lobe Lanczos and the antialiasing kernels.
// A pixel's taps are summed in groups of four, (p0 + p1) + (p2 + p3), each
// group added to the running sum in order, a last pair added alone.
#include "resize_spec.h"
#include "resize_lanes.h"

#include <string.h>

#include <type_traits>

ZOR_BEGIN

namespace {

using namespace resize_lanes;

// n (even, >= 2) taps x[k] against weights c[k], each group added to acc
// (the first group of a pixel starts the sum: `first`).
inline float window_sum(const float* x, const float* c, int32_t n, float acc, bool first) {
    int32_t k = 0;
    for (; k + 4 <= n; k += 4) {
        const float q =
            pair(x[k], c[k], x[k + 1], c[k + 1]) + pair(x[k + 2], c[k + 2], x[k + 3], c[k + 3]);
        acc = first && !k ? q : acc + q;
    }
    if (k < n) {
        const float p = pair(x[k], c[k], x[k + 1], c[k + 1]);
        acc = first && !k ? p : acc + p;
    }
    return acc;
}

// a + (b - a) * f, the linear row form.
inline float lerp(float a, float b, float f) {
#if ZOR_HAS_FMA
    return fmaf(b - a, f, a);
#else
    return a + (b - a) * f;
#endif
}

// Which image sides a pass clamps its taps to: the sides whose strips the
// tile has (an in-memory side is read beyond the image).
struct Clamp {
    bool low, high;
};

struct Window {
    const ResizeSpec* s;
    const ResizeTile* t;
    int32_t nx, ny;  // taps per column, per row
    const float* cx;  // weights of the tile's first column
    const float* cy;  // of its first row
    const float* fx;  // coefSecond of the first column (tapsX 1)
};

// Columns [i0, i1) of one source row (relative to the tile's source
// pointer) through the horizontal pass into out (C floats per column).
template <typename T, int C>
void horizontal(const Window& k, const T* row, int32_t i0, int32_t i1, Clamp c, float* out) {
    const ResizeTile& t = *k.t;
    const int32_t first = 1 - k.nx / 2, lo = -t.shiftX,
                  hi = (int32_t)k.s->axisX.srcLen - 1 - t.shiftX;
    float x[64];
    for (int32_t i = i0; i < i1; ++i) {
        const int32_t base = t.localX[i] + first;
        for (int ch = 0; ch < C; ++ch) {
            float acc = 0;
            if (k.nx == 2) {
                int32_t a = base, b = base + 1;
                if (c.low) a = a < lo ? lo : a, b = b < lo ? lo : b;
                if (c.high) a = a > hi ? hi : a, b = b > hi ? hi : b;
                acc = lerp(pixel(row + a * C + ch), pixel(row + b * C + ch), k.fx[i]);
            } else {
                // Groups of up to 64 taps keep the running sum's order.
                const float* w = k.cx + (int64_t)k.nx * i;
                for (int32_t g = 0; g < k.nx; g += 64) {
                    const int32_t n = k.nx - g < 64 ? k.nx - g : 64;
                    for (int32_t m = 0; m < n; ++m) {
                        int32_t col = base + g + m;
                        if (c.low && col < lo) col = lo;
                        if (c.high && col > hi) col = hi;
                        x[m] = pixel(row + (int64_t)col * C + ch);
                    }
                    acc = window_sum(x, w + g, n, acc, g == 0);
                }
            }
            out[i * C + ch] = acc;
        }
    }
}

// ---- vector passes ------------------------------------------------------------------
// The horizontal pass takes four outputs at a time (an output is a column
// and channel) and a chunk of each one's taps per vector: four taps (one
// group) in 128 bits, eight (two groups) on the AVX2 levels. The pair
// sums, then the group sums, come out in output order, and each group is
// added to the running sums as the scalar pass does.

typedef __m128 v4;

// [x0, -0, x2, -0]: a group's second pair, absent, adds nothing.
inline v4 drop_odd_pairs(v4 v) {
    const v4 keep = _mm_castsi128_ps(_mm_setr_epi32(-1, 0, -1, 0));
    return _mm_or_ps(_mm_and_ps(v, keep), _mm_setr_ps(0.0f, -0.0f, 0.0f, -0.0f));
}

// [a01, a23, b01, b23] (the levels that fuse take eight-tap chunks).
inline v4 pair_sums4(v4 xa, v4 ca, v4 xb, v4 cb) {
    return _mm_hadd_ps(_mm_mul_ps(xa, ca), _mm_mul_ps(xb, cb));
}

// Four taps of one output from p (element index of the first tap).
template <int C> inline v4 taps4(const Zor32f* p) { return _mm_loadu_ps(p); }
template <int C> inline v4 taps4(const Zor8u* p) {
    if (C == 1) {
        int32_t b;
        memcpy(&b, p, 4);
        return _mm_cvtepi32_ps(widen_bytes(_mm_cvtsi32_si128(b)));
    }
#if ZOR_HAS_SSSE3
    const __m128i v = _mm_loadu_si128((const __m128i*)p);
    return _mm_cvtepi32_ps(_mm_shuffle_epi8(
        v, _mm_setr_epi8(0, -1, -1, -1, 3, -1, -1, -1, 6, -1, -1, -1, 9, -1, -1, -1)));
#else
    return _mm_cvtepi32_ps(_mm_setr_epi32(p[0], p[3], p[6], p[9]));
#endif
}

#if ZOR_HAS_AVX2 && ZOR_HAS_FMA
inline __m256 loadu_chunk(const float* p) { return _mm256_loadu_ps(p); }
// Eight taps a chunk: a 256-bit vector holds two groups of four.
constexpr int32_t kChunk = 8;
typedef __m256 vc;

template <int C> inline vc taps_chunk(const Zor32f* p) { return _mm256_loadu_ps(p); }
template <int C> inline vc taps_chunk(const Zor8u* p) {
    __m128i b;
    if (C == 1) {
        b = _mm_loadl_epi64((const __m128i*)p);
    } else {  // every third byte of 24
        const __m128i lo = _mm_loadu_si128((const __m128i*)p);
        const __m128i hi = _mm_loadu_si128((const __m128i*)(p + 8));
        b = _mm_or_si128(
            _mm_shuffle_epi8(lo, _mm_setr_epi8(0, 3, 6, 9, 12, 15, -1, -1, -1, -1, -1, -1, -1,
                                               -1, -1, -1)),
            _mm_shuffle_epi8(hi, _mm_setr_epi8(-1, -1, -1, -1, -1, -1, 10, 13, -1, -1, -1, -1,
                                               -1, -1, -1, -1)));
    }
    return _mm256_cvtepi32_ps(_mm256_cvtepu8_epi32(b));
}

// Per 128-bit half [a01, a23, b01, b23]: the fused pair sums of two outputs.
inline vc pair_sums(vc xa, vc ca, vc xb, vc cb) {
    const vc even = _mm256_shuffle_ps(_mm256_mul_ps(xa, ca), _mm256_mul_ps(xb, cb), 0x88);
    return _mm256_fmadd_ps(_mm256_shuffle_ps(xa, xb, 0xDD), _mm256_shuffle_ps(ca, cb, 0xDD), even);
}

// The pairs of a last chunk past the window become -0 (adding nothing):
// pair p of an output sits in lane p (p < 2) or p + 2 of its half.
inline vc pairs_mask(int32_t pairs) {
    const __m256i lane = _mm256_setr_epi32(0, 1, 0, 1, 2, 3, 2, 3);
    return _mm256_castsi256_ps(_mm256_cmpgt_epi32(_mm256_set1_epi32(pairs), lane));
}
inline vc keep_pairs(vc v, vc keep) {
    return _mm256_or_ps(_mm256_and_ps(keep, v), _mm256_andnot_ps(keep, _mm256_set1_ps(-0.0f)));
}

inline __m128 chunk_sums(vc ab, vc cd, __m128 acc, bool first) {
    const vc q = _mm256_hadd_ps(ab, cd);  // [qa qb qc qd] of both groups
    const __m128 lo = _mm256_castps256_ps128(q), hi = _mm256_extractf128_ps(q, 1);
    return _mm_add_ps(first ? lo : _mm_add_ps(acc, lo), hi);
}
#else
inline __m128 loadu_chunk(const float* p) { return _mm_loadu_ps(p); }
// Four taps a chunk: one group.
constexpr int32_t kChunk = 4;
typedef __m128 vc;

template <int C> inline vc taps_chunk(const Zor32f* p) { return taps4<C>(p); }
template <int C> inline vc taps_chunk(const Zor8u* p) { return taps4<C>(p); }
inline vc pair_sums(vc xa, vc ca, vc xb, vc cb) { return pair_sums4(xa, ca, xb, cb); }
inline vc pairs_mask(int32_t) { return vc{}; }
inline vc keep_pairs(vc v, vc) { return drop_odd_pairs(v); }
inline __m128 chunk_sums(vc ab, vc cd, __m128 acc, bool first) {
    const __m128 q = _mm_hadd_ps(ab, cd);
    return first ? q : _mm_add_ps(acc, q);
}
#endif

// Elements past a chunk's first tap that its load reads.
template <typename T, int C> constexpr int32_t load_reach() {
    return C == 1 ? kChunk - 1 : kChunk == 8 ? 2 + 23 : 2 + 15;
}

// Outputs [i0, i1) of one row, no clamping, for windows of four or more
// taps; returns where it stopped: outputs whose loads would pass `limit`
// (the last element the caller may read) or whose weights would pass the
// table's end are left to the scalar pass.
template <typename T, int C>
int32_t horizontal_fast(const Window& k, const T* row, int32_t i0, int32_t i1, int64_t limit,
                        int32_t tableEnd, float* out) {
    const ResizeTile& t = *k.t;
    const int32_t n = k.nx, chunks = (n + kChunk - 1) / kChunk, first = 1 - n / 2;
    const int32_t lastPairs = (n - kChunk * (chunks - 1)) / 2;
    // Columns only move right: the few that may not load whole chunks are
    // the last ones.
    int32_t end = i1;
    while (end > i0 &&
           ((int64_t)(t.localX[end - 1] + first + kChunk * (chunks - 1)) * C + load_reach<T, C>() >
                limit ||
            (n % kChunk != 0 && t.x0 + end >= tableEnd)))
        --end;
    const vc keep = pairs_mask(lastPairs);
    const bool partial = 2 * lastPairs < kChunk;
    const int32_t* x = t.localX + i0;
    const float* cx = k.cx + (int64_t)n * i0;
    float* dst = out + (int64_t)i0 * C;
    // Four outputs (a column's channel each) to d: the chunks of each, the
    // last one's absent pairs dropped, added in order. Inlined, so the
    // pointers stay in registers.
    auto four = [=](const T* pa, const float* wa, const T* pb, const float* wb, const T* pc,
                    const float* wc, const T* pd, const float* wd, float* d,
                    auto oneChunk) __attribute__((always_inline)) {
        __m128 acc = _mm_setzero_ps();
        const int32_t last = decltype(oneChunk)::value ? 0 : chunks - 1;
        for (int32_t g = 0; g <= last; ++g) {
            const int32_t e = kChunk * g, te = e * C;
            vc ab = pair_sums(taps_chunk<C>(pa + te), (vc)loadu_chunk(wa + e),
                              taps_chunk<C>(pb + te), (vc)loadu_chunk(wb + e));
            vc cd = pair_sums(taps_chunk<C>(pc + te), (vc)loadu_chunk(wc + e),
                              taps_chunk<C>(pd + te), (vc)loadu_chunk(wd + e));
            if (g == last && partial) {
                ab = keep_pairs(ab, keep);
                cd = keep_pairs(cd, keep);
            }
            acc = chunk_sums(ab, cd, acc, g == 0);
        }
        _mm_storeu_ps(d, acc);
    };
    // Four columns a step: their C * 4 outputs in groups of four.
    auto columns = [=](int32_t i, auto oneChunk) __attribute__((always_inline)) {
        const T* p0 = row + (int64_t)(x[i] + first) * C;
        const T* p1 = row + (int64_t)(x[i + 1] + first) * C;
        const T* p2 = row + (int64_t)(x[i + 2] + first) * C;
        const T* p3 = row + (int64_t)(x[i + 3] + first) * C;
        const float *w0 = cx + (int64_t)n * i, *w1 = w0 + n, *w2 = w1 + n, *w3 = w2 + n;
        float* d = dst + (int64_t)C * i;
        if (C == 1) {
            four(p0, w0, p1, w1, p2, w2, p3, w3, d, oneChunk);
        } else {
            four(p0, w0, p0 + 1, w0, p0 + 2, w0, p1, w1, d, oneChunk);
            four(p1 + 1, w1, p1 + 2, w1, p2, w2, p2 + 1, w2, d + 4, oneChunk);
            four(p2 + 2, w2, p3, w3, p3 + 1, w3, p3 + 2, w3, d + 8, oneChunk);
        }
    };
    const int32_t cols = end - i0;
    int32_t o = 0;
    if (chunks == 1) {
        for (; o + 4 <= cols; o += 4) columns(o, std::true_type{});
        // The last few again from four before the end: the same values.
        if (o < cols && cols >= 4) columns(o = cols - 4, std::true_type{}), o = cols;
    } else {
        for (; o + 4 <= cols; o += 4) columns(o, std::false_type{});
        if (o < cols && cols >= 4) columns(o = cols - 4, std::false_type{}), o = cols;
    }
    return i0 + o;
}

// Floats [off, off + n) of the window's rows (logical row a lives in slot
// (head + a) mod ny) with one destination row's weights, to dst.
template <typename T>
void vertical(const Window& k, const uint8_t* rows, int64_t rowBytes, int32_t head, int64_t off,
              const float* c, T* dst, int64_t n) {
    using simd::vf32;
    constexpr int L = simd::Lanes<vf32>::count;
    const int32_t ny = k.ny;
    // The rows in window order and their weights, on the stack for the
    // usual short windows.
    const float* local[16];
    auto row = [&](int32_t a) __attribute__((always_inline)) {
        if (ny <= 16) return local[a];
        const int32_t slot = head + a >= ny ? head + a - ny : head + a;
        return (const float*)(rows + slot * rowBytes) + off;
    };
    vf32 cw[16];
    if (ny <= 16)
        for (int32_t a = 0; a < ny; ++a) {
            const int32_t slot = head + a >= ny ? head + a - ny : head + a;
            local[a] = (const float*)(rows + slot * rowBytes) + off;
            cw[a] = simd::broadcast<vf32>(c[a]);
        }
    auto run = [&](int64_t i, int lanes) __attribute__((always_inline)) {
        auto ld = [&](int32_t a) __attribute__((always_inline)) {
            return lanes == L ? simd::load<vf32>(row(a) + i) : simd::load_n<vf32>(row(a) + i, lanes);
        };
        auto vp = [&](int32_t a) __attribute__((always_inline)) {
            const vf32 x0 = ld(a), x1 = ld(a + 1);
            const vf32 c0 = ny <= 16 ? cw[a] : simd::broadcast<vf32>(c[a]);
            const vf32 c1 = ny <= 16 ? cw[a + 1] : simd::broadcast<vf32>(c[a + 1]);
#if ZOR_HAS_FMA
            return simd::fma(x1, c1, x0 * c0);
#else
            return x0 * c0 + x1 * c1;
#endif
        };
        vf32 acc = vf32{};
        int32_t a = 0;
        for (; a + 4 <= ny; a += 4) {
            const vf32 q = vp(a) + vp(a + 2);
            acc = a ? acc + q : q;
        }
        if (a < ny) acc = a ? acc + vp(a) : vp(a);
        store_row(dst + i, acc, lanes);
    };
    int64_t i = 0;
    for (; i + L <= n; i += L) run(i, L);
    if (i < n) run(i, (int)(n - i));
}

template <typename T, int C> struct Engine {
    const Window& k;
    const T* src;
    int32_t srcStep;
    T* dst;
    int32_t dstStep;
    int64_t rowBytes;

    const T* source_row(int32_t y) const { return row_at(src, srcStep, y); }
    float* slot(int32_t a) const { return (float*)(k.t->rows + a * rowBytes); }

    // Columns [i0, i1) unclamped: the vector pass as far as it may read,
    // the scalar one for the rest.
    void filter(const T* row, int32_t i0, int32_t i1, float* out) const {
        if (i0 >= i1) return;
        int32_t i = i0;
        if (k.nx >= 4) {
            const int64_t limit = (int64_t)(k.t->localX[i1 - 1] + k.nx / 2) * C + C - 1;
            i = horizontal_fast<T, C>(k, row, i0, i1, limit, (int32_t)k.s->dstWidth, out);
        }
        horizontal<T, C>(k, row, i, i1, Clamp{false, false}, out);
    }

    // A whole row: the side strips' columns clamped, the others not.
    void row_pass(const T* row, Clamp cols, const ResizeStrips& st, float* out) const {
        const int32_t w = k.t->w, mid0 = st.left, mid1 = w - st.right;
        if (mid0 >= mid1) {
            horizontal<T, C>(k, row, 0, w, cols, out);
            return;
        }
        horizontal<T, C>(k, row, 0, mid0, cols, out);
        filter(row, mid0, mid1, out);
        horizontal<T, C>(k, row, mid1, w, cols, out);
    }

    void put_row(int32_t j, int32_t head) const {
        vertical(k, k.t->rows, rowBytes, head, 0, k.cy + (int64_t)k.ny * j,
                 row_at(dst, dstStep, j), (int64_t)C * k.t->w);
    }

    // A row of the top or bottom strip: its window's rows clamped on the
    // sides with strips.
    void strip_row(int32_t j, Clamp rows, Clamp cols, const ResizeStrips& st) const {
        const ResizeTile& t = *k.t;
        const int32_t lo = -t.shiftY, hi = (int32_t)k.s->axisY.srcLen - 1 - t.shiftY;
        for (int32_t a = 0; a < k.ny; ++a) {
            int32_t y = t.localY[j] + 1 - k.ny / 2 + a;
            if (rows.low && y < lo) y = lo;
            if (rows.high && y > hi) y = hi;
            row_pass(source_row(y), cols, st, slot(a));
        }
        put_row(j, 0);
    }

    // The ring over the rows between the strips: logical row a (source row
    // prev + 1 - ty + a) lives in slot (head + a) mod ny; a step of d rows
    // turns head by d. The side strips' pixels come out of the same rows,
    // their columns clamped.
    void core(Clamp cols, const ResizeStrips& st) const {
        const ResizeTile& t = *k.t;
        const int32_t h = t.h - st.top - st.bottom, ty = k.ny / 2;
        int32_t prev = t.localY[st.top], head = 0;
        for (int32_t a = 0; a < k.ny; ++a)
            row_pass(source_row(prev + 1 - ty + a), cols, st, slot(a));
        for (int32_t j = st.top; j < st.top + h; ++j) {
            const int32_t y = t.localY[j];
            if (y > prev) {
                const int32_t d = y - prev < k.ny ? y - prev : k.ny;
                head = (int32_t)((head + (int64_t)d) % k.ny);
                for (int32_t a = k.ny - 1; a >= k.ny - d; --a) {
                    const int32_t sl = head + a >= k.ny ? head + a - k.ny : head + a;
                    row_pass(source_row(y + 1 - ty + a), cols, st, slot(sl));
                }
                prev = y;
            }
            put_row(j, head);
        }
    }
};

template <typename T, int C>
void run(const ResizeJob& job, const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep) {
    const ResizeSpec* s = job.s;
    const ResizeTile& t = job.t;
    const ResizeStrips& st = job.st;
    const Window k{s,
                   &t,
                   2 * s->tapsX,
                   2 * s->tapsY,
                   s->axisX.coef32f + 2 * (int64_t)s->tapsX * t.x0,
                   s->axisY.coef32f + 2 * (int64_t)s->tapsY * t.y0,
                   s->coefSecond ? s->coefSecond + t.x0 : nullptr};
    const Engine<T, C> e{k, pSrc, srcStep, pDst, dstStep, tile_row_bytes(t, C)};
    const Clamp rows{st.top != 0, st.bottom != 0}, cols{st.left != 0, st.right != 0};
    for (int32_t j = 0; j < st.top; ++j) e.strip_row(j, rows, cols, st);
    for (int32_t j = t.h - st.bottom; j < t.h; ++j) e.strip_row(j, rows, cols, st);
    if (t.h - st.top - st.bottom >= 1) e.core(cols, st);
}

}  // namespace

void resize_window(const ResizeJob& k, const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                   int32_t dstStep, int32_t channels) {
    if (channels == 3)
        run<Zor8u, 3>(k, pSrc, srcStep, pDst, dstStep);
    else
        run<Zor8u, 1>(k, pSrc, srcStep, pDst, dstStep);
}

void resize_window(const ResizeJob& k, const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                   int32_t dstStep, int32_t) {
    run<Zor32f, 1>(k, pSrc, srcStep, pDst, dstStep);
}

ZOR_END
