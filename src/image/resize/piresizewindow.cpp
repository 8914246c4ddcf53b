// The general resize window: 2 * tapsX taps per destination column and
// 2 * tapsY per row, for three-lobe Lanczos and the antialiasing kernels.
// A pixel's taps are summed in groups of four, (p0 + p1) + (p2 + p3), each
// group added to the running sum in order, a last pair added alone.
#include "resize_spec.h"

#include <string.h>

ZOR_BEGIN

namespace {

// x0*c0 + x1*c1; fusing levels round the second product into the first.
inline float pair(float x0, float c0, float x1, float c1) {
#if ZOR_HAS_FMA
    return fmaf(x1, c1, x0 * c0);
#else
    return x0 * c0 + x1 * c1;
#endif
}

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

inline float pixel(const Zor8u* p) { return (float)*p; }
inline float pixel(const Zor32f* p) {
    float v;
    memcpy(&v, p, 4);
    return v;
}

// Conversion in the caller's rounding mode, then saturation to 0..255.
inline void put(Zor8u* p, float v) {
    const int32_t i = _mm_cvtss_si32(_mm_set_ss(v));
    *p = (Zor8u)(i < 0 ? 0 : i > 255 ? 255 : i);
}
inline void put(Zor32f* p, float v) { memcpy(p, &v, 4); }

inline int32_t clamp(int32_t v, int32_t lo, int32_t hi) { return v < lo ? lo : v > hi ? hi : v; }

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

// Floats [off, off + n) of the rows r[0 .. ny) with one destination row's
// weights, to dst[0 .. n).
template <typename T>
void vertical(const Window& k, float* const* r, int64_t off, const float* c, T* dst, int64_t n) {
    float x[64];
    for (int64_t i = 0; i < n; ++i) {
        float acc = 0;
        for (int32_t g = 0; g < k.ny; g += 64) {
            const int32_t m = k.ny - g < 64 ? k.ny - g : 64;
            for (int32_t a = 0; a < m; ++a) x[a] = r[g + a][off + i];
            acc = window_sum(x, c + g, m, acc, g == 0);
        }
        put(dst + i, acc);
    }
}

template <typename T, int C> struct Engine {
    const Window& k;
    const T* src;
    int32_t srcStep;
    T* dst;
    int32_t dstStep;
    float** ring;  // ny row buffers

    const T* source_row(int32_t y) const { return row_at(src, srcStep, y); }
    float* buffer(int32_t a) const {
        return (float*)(k.t->rows + a * tile_row_bytes(*k.t, C));
    }

    // A row of the top or bottom strip: all its window's rows clamped on
    // the sides with strips, every column clamped likewise.
    void strip_row(int32_t j, Clamp rows, Clamp cols) {
        const ResizeTile& t = *k.t;
        const int32_t lo = -t.shiftY, hi = (int32_t)k.s->axisY.srcLen - 1 - t.shiftY;
        for (int32_t a = 0; a < k.ny; ++a) {
            int32_t y = t.localY[j] + 1 - k.ny / 2 + a;
            if (rows.low && y < lo) y = lo;
            if (rows.high && y > hi) y = hi;
            ring[a] = buffer(a);
            horizontal<T, C>(k, source_row(y), 0, t.w, cols, ring[a]);
        }
        vertical(k, ring, 0, k.cy + (int64_t)k.ny * j, row_at(dst, dstStep, j), (int64_t)C * t.w);
    }

    // Columns [i0, i1) of a row between the strips, computed alone with
    // their columns clamped.
    void side(int32_t j, int32_t i0, int32_t i1, Clamp cols) {
        const ResizeTile& t = *k.t;
        for (int32_t a = 0; a < k.ny; ++a) {
            ring[a] = buffer(a);
            horizontal<T, C>(k, source_row(t.localY[j] + 1 - k.ny / 2 + a), i0, i1, cols,
                             ring[a]);
        }
        vertical(k, ring, (int64_t)C * i0, k.cy + (int64_t)k.ny * j,
                 row_at(dst, dstStep, j) + (int64_t)C * i0, (int64_t)C * (i1 - i0));
    }

    // The ring over the core: ring[a] holds source row prev + 1 - ty + a.
    void core(const ResizeStrips& st) {
        const ResizeTile& t = *k.t;
        const int32_t w = t.w - st.left - st.right, h = t.h - st.top - st.bottom;
        const int32_t ty = k.ny / 2;
        for (int32_t a = 0; a < k.ny; ++a) ring[a] = buffer(a);
        auto filter = [&](int32_t y, float* out) {
            horizontal<T, C>(k, source_row(y), st.left, st.left + w, Clamp{false, false}, out);
        };
        int32_t prev = t.localY[st.top];
        for (int32_t a = 0; a < k.ny; ++a) filter(prev + 1 - ty + a, ring[a]);
        for (int32_t j = st.top; j < st.top + h; ++j) {
            const int32_t y = t.localY[j];
            if (y > prev) {
                const int32_t d = y - prev < k.ny ? y - prev : k.ny;
                // Rotate by d: the oldest d buffers take the newest rows.
                for (int32_t r = 0; r < d; ++r) {
                    float* oldest = ring[0];
                    memmove(ring, ring + 1, sizeof(float*) * (size_t)(k.ny - 1));
                    ring[k.ny - 1] = oldest;
                }
                for (int32_t a = k.ny - 1; a >= k.ny - d; --a) filter(y + 1 - ty + a, ring[a]);
                prev = y;
            }
            vertical(k, ring, (int64_t)C * st.left, k.cy + (int64_t)k.ny * j,
                     row_at(dst, dstStep, j) + (int64_t)C * st.left, (int64_t)C * w);
        }
    }

    static constexpr int32_t kMaxStack = 64;
};

template <typename T, int C>
void run(const ResizeJob& job, const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep) {
    const ResizeSpec* s = job.s;
    const ResizeTile& t = job.t;
    const ResizeStrips& st = job.st;
    Window k{s,
             &t,
             2 * s->tapsX,
             2 * s->tapsY,
             s->axisX.coef32f + 2 * (int64_t)s->tapsX * t.x0,
             s->axisY.coef32f + 2 * (int64_t)s->tapsY * t.y0,
             s->coefSecond ? s->coefSecond + t.x0 : nullptr};
    // Ring pointers: on the stack for short windows, else in the buffer
    // room antialiasing records reserve behind the row buffers.
    float* stackRing[Engine<T, C>::kMaxStack];
    float** ring = stackRing;
    if (k.ny > Engine<T, C>::kMaxStack)
        ring = (float**)(t.rows + (int64_t)k.ny * tile_row_bytes(t, C));
    Engine<T, C> e{k, pSrc, srcStep, pDst, dstStep, ring};
    const Clamp rows{st.top != 0, st.bottom != 0}, cols{st.left != 0, st.right != 0};
    for (int32_t j = 0; j < st.top; ++j) e.strip_row(j, rows, cols);
    for (int32_t j = st.top; j < t.h - st.bottom; ++j) {
        if (st.left) e.side(j, 0, st.left, cols);
        if (st.right) e.side(j, t.w - st.right, t.w, cols);
    }
    for (int32_t j = t.h - st.bottom; j < t.h; ++j) e.strip_row(j, rows, cols);
    if (t.w - st.left - st.right >= 1 && t.h - st.top - st.bottom >= 1) e.core(st);
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
