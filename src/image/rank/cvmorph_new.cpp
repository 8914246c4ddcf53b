// Erosion and dilation kernels. Each is written once over a vector type V
// and instantiated twice: with the level's vector for the body of a row and
// with the element itself for the row's tail, so that both give the same
// result per pixel (floats: the same comparisons in the same order). The
// running result is always the first operand.
#include "variant.h"

#include "morph_internal.h"

ZOR_BEGIN
namespace morph {
namespace {

// ---- 3 by 3 rectangle: one pass, two output rows share the middle rows ------

template <typename V, typename Op, typename T>
MORPH_INLINE void rect3_pair(const T* r0, const T* r1, const T* r2, const T* r3, T* d0, T* d1) {
    V c0[3], c1[3];
#pragma GCC unroll 3
    for (int k = 0; k < 3; ++k) {
        const V a = simd::load<V>(r0 + k), b = simd::load<V>(r1 + k), c = simd::load<V>(r2 + k), d = simd::load<V>(r3 + k);
        const V m = Op::f(b, c);
        c0[k] = Op::f(a, m);
        c1[k] = Op::f(m, d);
    }
    simd::store(d0, Op::f(Op::f(c0[0], c0[1]), c0[2]));
    simd::store(d1, Op::f(Op::f(c1[0], c1[1]), c1[2]));
}

template <typename V, typename Op, typename T>
MORPH_INLINE void rect3_one(const T* r0, const T* r1, const T* r2, T* d0) {
    V c0[3];
#pragma GCC unroll 3
    for (int k = 0; k < 3; ++k)
        c0[k] = Op::f(simd::load<V>(r0 + k), Op::f(simd::load<V>(r1 + k), simd::load<V>(r2 + k)));
    simd::store(d0, Op::f(Op::f(c0[0], c0[1]), c0[2]));
}

}  // namespace

template <typename T, typename Op> void rect3x3(const Job<T>& j) {
    const int32_t W = j.width;
    int32_t y = 0;
    for (; y + 2 <= j.height; y += 2) {
        const T* r0 = row_at(j.src, j.srcStep, y);
        const T* r1 = row_at(j.src, j.srcStep, y + 1);
        const T* r2 = row_at(j.src, j.srcStep, y + 2);
        const T* r3 = row_at(j.src, j.srcStep, y + 3);
        T* d0 = row_at(j.dst, j.dstStep, y);
        T* d1 = row_at(j.dst, j.dstStep, y + 1);
        for_row<T>(0, W, true, d0, [&](auto tag, int32_t x) MORPH_LAMBDA {
            typedef typename decltype(tag)::type U;
            rect3_pair<U, Op>(r0 + x, r1 + x, r2 + x, r3 + x, d0 + x, d1 + x);
        });
    }
    if (y < j.height) {
        const T* r0 = row_at(j.src, j.srcStep, y);
        const T* r1 = row_at(j.src, j.srcStep, y + 1);
        const T* r2 = row_at(j.src, j.srcStep, y + 2);
        T* d0 = row_at(j.dst, j.dstStep, y);
        for_row<T>(0, W, true, d0, [&](auto tag, int32_t x) MORPH_LAMBDA {
            typedef typename decltype(tag)::type U;
            rect3_one<U, Op>(r0 + x, r1 + x, r2 + x, d0 + x);
        });
    }
}

// ---- any other rectangle: rows, then columns over a ring of row results -------
// Output rows go in pairs, which share all but one ring row; the two new
// row results are made and stored in the same pass.

namespace {

// MW, MH: the mask's sides when fixed at compile time (3, 5, 7), else 0.
template <int MW, typename V, typename Op, typename T>
MORPH_INLINE V row_fold(const T* s, int32_t mw) {
    if (MW) mw = MW;
    V acc = simd::load<V>(s);
#pragma GCC unroll 8
    for (int32_t c = 1; c < mw; ++c) acc = Op::f(acc, simd::load<V>(s + c));
    return acc;
}

// The ring rows of one output pair (or single output), found once per row
// pair: the slot of the window's first row, the slots after it (wrapping
// around), and the slot the next row result goes to.
struct RingRows {
    uint8_t* base;
    uint8_t* end;
    ptrdiff_t stride;  // bytes
    uint8_t* top;      // slot of window row 0
    uint8_t* next;     // slot of window row 1
    uint8_t* fresh;    // free slot for window row mh - 1
};

MORPH_INLINE uint8_t* wrap(uint8_t* p, const RingRows& r) {
    p += r.stride;
    return p == r.end ? r.base : p;
}

// Pair of outputs y, y + 1 (window rows 0 .. mh): the ring holds window
// rows 0 .. mh - 2, rows mh - 1 and mh are made here.
template <int MW, int MH, typename V, typename Op, typename T>
MORPH_INLINE void sep_pair(const T* sA, const T* sB, const RingRows& r, int32_t mw, int32_t mh,
                           int32_t x, T* d0, T* d1) {
    if (MH) mh = MH;
    const ptrdiff_t xb = x * (ptrdiff_t)sizeof(T);
    const V a = row_fold<MW, V, Op>(sA + x, mw), b = row_fold<MW, V, Op>(sB + x, mw);
    uint8_t* p = r.next;
    V mid = simd::load<V>(p + xb);
#pragma GCC unroll 8
    for (int32_t k = 2; k <= mh - 2; ++k) {
        p = wrap(p, r);
        mid = Op::f(mid, simd::load<V>(p + xb));
    }
    mid = Op::f(mid, a);
    const V top = simd::load<V>(r.top + xb);
    simd::store(d0 + x, Op::f(top, mid));
    simd::store(d1 + x, Op::f(mid, b));
    simd::store(r.fresh + xb, a);
    simd::store(r.top + xb, b);
}

// A last single output (window rows 0 .. mh - 1).
template <int MW, int MH, typename V, typename Op, typename T>
MORPH_INLINE void sep_one(const T* sA, const RingRows& r, int32_t mw, int32_t mh, int32_t x,
                          T* d0) {
    if (MH) mh = MH;
    const ptrdiff_t xb = x * (ptrdiff_t)sizeof(T);
    const V a = row_fold<MW, V, Op>(sA + x, mw);
    uint8_t* p = r.top;
    V acc = simd::load<V>(p + xb);
#pragma GCC unroll 8
    for (int32_t k = 1; k <= mh - 2; ++k) {
        p = wrap(p, r);
        acc = Op::f(acc, simd::load<V>(p + xb));
    }
    simd::store(d0 + x, Op::f(acc, a));
}

template <int MW, typename V, typename Op, typename T>
MORPH_INLINE void row_only(const T* s, int32_t mw, int32_t x, T* d) {
    simd::store(d + x, row_fold<MW, V, Op>(s + x, mw));
}

template <int MW, int MH, typename T, typename Op> void separable(const Job<T>& j) {
    const int32_t W = j.width, H = j.height;
    const int32_t mw = j.head->maskWidth, mh = j.head->maskHeight;
    if (mh == 1) {
        for (int32_t y = 0; y < H; ++y) {
            const T* s = row_at(j.src, j.srcStep, y);
            T* d = row_at(j.dst, j.dstStep, y);
            for_row<T>(0, W, true, d, [&](auto tag, int32_t x) MORPH_LAMBDA {
                typedef typename decltype(tag)::type U;
                row_only<MW, U, Op>(s, mw, x, d);
            });
        }
        return;
    }
    // Window row i of output row y has its row result in slot (y + i) % mh.
    const ptrdiff_t stride = (W * (ptrdiff_t)sizeof(T) + 31) & ~(ptrdiff_t)31;
    RingRows r;
    r.base = j.ring;
    r.end = j.ring + mh * stride;
    r.stride = stride;
    auto slot = [&](int32_t i) { return j.ring + (i % mh) * stride; };
    for (int32_t i = 0; i < mh - 1; ++i) {
        const T* s = row_at(j.src, j.srcStep, i);
        T* d = (T*)slot(i);
        for_row<T>(0, W, true, d, [&](auto tag, int32_t x) MORPH_LAMBDA {
            typedef typename decltype(tag)::type U;
            row_only<MW, U, Op>(s, mw, x, d);
        });
    }
    int32_t y = 0;
    for (; y + 2 <= H; y += 2) {
        const T* sA = row_at(j.src, j.srcStep, y + mh - 1);
        const T* sB = row_at(j.src, j.srcStep, y + mh);
        T* d0 = row_at(j.dst, j.dstStep, y);
        T* d1 = row_at(j.dst, j.dstStep, y + 1);
        r.top = slot(y);
        r.next = slot(y + 1);
        r.fresh = slot(y + mh - 1);
        // The ring is rewritten in place: no pixel may be taken twice.
        for_row<T>(0, W, false, d0, [&](auto tag, int32_t x) MORPH_LAMBDA {
            typedef typename decltype(tag)::type U;
            sep_pair<MW, MH, U, Op>(sA, sB, r, mw, mh, x, d0, d1);
        });
    }
    if (y < H) {
        const T* sA = row_at(j.src, j.srcStep, y + mh - 1);
        T* d0 = row_at(j.dst, j.dstStep, y);
        r.top = slot(y);
        for_row<T>(0, W, true, d0, [&](auto tag, int32_t x) MORPH_LAMBDA {
            typedef typename decltype(tag)::type U;
            sep_one<MW, MH, U, Op>(sA, r, mw, mh, x, d0);
        });
    }
}

// Columns first: a pair of output rows shares the fold of the mh - 1
// source rows they have in common, the two column results go to two lines
// in the ring area, and a fold along each line gives the outputs. Fewer
// loads than the ring of row results. (Keeping the column results in
// registers and shifting them into place measured 40% slower on k0 for
// 32f: the lines let the source rows stream on their own.)
template <int MW, int MH, typename T, typename Op> bool columns_first(const Job<T>& j) {
    const int32_t W = j.width, H = j.height, n = W + MW - 1;
    const ptrdiff_t e = (ptrdiff_t)sizeof(T);
    const ptrdiff_t lineBytes = (n * e + 63) & ~(ptrdiff_t)63;
    const ptrdiff_t ringBytes = MH * ((W * e + 31) & ~(ptrdiff_t)31) + ((MW * e + 31) & ~31);
    if (2 * lineBytes > ringBytes) return false;
    T* const line0 = (T*)j.ring;
    T* const line1 = (T*)(j.ring + lineBytes);
    // Outputs x0 .. x1 - 1 of every row; the lines are indexed like the row.
    auto strip = [&](int32_t x0, int32_t x1) {
        for (int32_t y = 0; y < H; y += 2) {
            const bool pair = y + 1 < H;
            const T* rows[MH + 1];
            for (int i = 0; i < MH + (pair ? 1 : 0); ++i)
                rows[i] = row_at(j.src, j.srcStep, y + i);
            for_row<T>(x0, x1 + MW - 1, true, line0, [&](auto tag, int32_t x) MORPH_LAMBDA {
                typedef typename decltype(tag)::type U;
                U mid = simd::load<U>(rows[1] + x);
#pragma GCC unroll 8
                for (int k = 2; k < MH; ++k) mid = Op::f(mid, simd::load<U>(rows[k] + x));
                simd::store(line0 + x, Op::f(simd::load<U>(rows[0] + x), mid));
                if (pair) simd::store(line1 + x, Op::f(mid, simd::load<U>(rows[MH] + x)));
            });
            T* d0 = row_at(j.dst, j.dstStep, y);
            for_row<T>(x0, x1, true, d0, [&](auto tag, int32_t x) MORPH_LAMBDA {
                typedef typename decltype(tag)::type U;
                row_only<MW, U, Op>(line0, MW, x, d0);
            });
            if (!pair) break;
            T* d1 = row_at(j.dst, j.dstStep, y + 1);
            for_row<T>(x0, x1, true, d1, [&](auto tag, int32_t x) MORPH_LAMBDA {
                typedef typename decltype(tag)::type U;
                row_only<MW, U, Op>(line1, MW, x, d1);
            });
        }
    };
    // Strips of 4 KiB keep the source rows of a pass and the two lines in
    // L1 (k0 32f 5x5: 1.07 -> 0.94 ms); the last strip takes up to one and
    // a half strips.
    constexpr int32_t S = 4096 / (int32_t)sizeof(T);
    for (int32_t x0 = 0; x0 < W;) {
        const int32_t x1 = W - x0 < S + S / 2 ? W : x0 + S;
        strip(x0, x1);
        x0 = x1;
    }
    return true;
}

}  // namespace

template <typename T, typename Op> void rect_separable(const Job<T>& j) {
    const int32_t mw = j.head->maskWidth, mh = j.head->maskHeight;
    // Integers on the 16-byte levels measured faster with the ring. Floats
    // take the same path on every level: the order of the folds decides
    // which of two equal zeros comes out.
    if constexpr (ZOR_VECTOR_BYTES >= 32 || sizeof(T) == 4) {
        if (mw == 5 && mh == 5 && columns_first<5, 5, T, Op>(j)) return;
        if (mw == 7 && mh == 7 && columns_first<7, 7, T, Op>(j)) return;
    }
    if (mw == 5 && mh == 5) separable<5, 5, T, Op>(j);
    else if (mw == 7 && mh == 7) separable<7, 7, T, Op>(j);
    else separable<0, 0, T, Op>(j);
}

// ---- 8u fixed shapes: centred runs per mask row --------------------------------
// Each input row's runs are made once (half-widths growing from the centre)
// and folded into every output row of the block that uses that row.

namespace {

template <int MH> struct Shape;
template <> struct Shape<3> {
    static constexpr int hw[3] = {0, 1, 0};
    static constexpr int maxHw = 1;
};
template <> struct Shape<5> {
    static constexpr int hw[5] = {0, 1, 2, 1, 0};
    static constexpr int maxHw = 2;
};
template <> struct Shape<7> {
    static constexpr int hw[7] = {0, 2, 2, 3, 2, 2, 0};
    static constexpr int maxHw = 3;
};

constexpr int kBlock = 4;  // output rows per pass of the mask kernels

template <typename V, typename Op, int MH, int R>
MORPH_INLINE void fixed_block(const Zor8u* const* rows, Zor8u* const* drows, int32_t x) {
    constexpr int c = (MH - 1) / 2;
    V acc[R];
#pragma GCC unroll 16
    for (int i = 0; i < R + MH - 1; ++i) {
        const Zor8u* p = rows[i] + x + c;
        V h[Shape<MH>::maxHw + 1];
        h[0] = simd::load<V>(p);
#pragma GCC unroll 4
        for (int k = 1; k <= Shape<MH>::maxHw; ++k)
            h[k] = Op::f(Op::f(h[k - 1], simd::load<V>(p - k)), simd::load<V>(p + k));
#pragma GCC unroll 16
        for (int o = 0; o < R; ++o) {
            const int r = i - o;
            if (r < 0 || r >= MH) continue;
            const V v = h[Shape<MH>::hw[r]];
            acc[o] = r == 0 ? v : Op::f(acc[o], v);
        }
    }
#pragma GCC unroll 16
    for (int o = 0; o < R; ++o) simd::store(drows[o] + x, acc[o]);
}

template <typename Op, int MH, int R>
MORPH_INLINE void fixed_rows(const Job<Zor8u>& j, int32_t y) {
    const Zor8u* rows[R + MH - 1];
    Zor8u* drows[R];
    for (int i = 0; i < R + MH - 1; ++i) rows[i] = row_at(j.src, j.srcStep, y + i);
    for (int o = 0; o < R; ++o) drows[o] = row_at(j.dst, j.dstStep, y + o);
    for_row<Zor8u>(0, j.width, true, drows[0], [&](auto tag, int32_t x) MORPH_LAMBDA {
        typedef typename decltype(tag)::type U;
        fixed_block<U, Op, MH, R>(rows, drows, x);
    });
}

template <typename Op, int MH> void fixed_shape(const Job<Zor8u>& j) {
    int32_t y = 0;
    for (; y + kBlock <= j.height; y += kBlock) fixed_rows<Op, MH, kBlock>(j, y);
    for (; y < j.height; ++y) fixed_rows<Op, MH, 1>(j, y);
}

}  // namespace

template <typename Op> void fixed_8u(const Job<Zor8u>& j) {
    const uint32_t f = j.head->maskFeature;
    if ((f & kFixed7) == kFixed7) fixed_shape<Op, 7>(j);
    else if ((f & kFixed5) == kFixed5) fixed_shape<Op, 5>(j);
    else fixed_shape<Op, 3>(j);
}

// ---- 8u mask kernels with per-row data from the record -------------------------
// Blocks of kBlock output rows (then single rows) keep their results in
// registers while the mask is walked. 8u starts from the neutral value,
// which changes nothing for integers. The bodies also serve single
// elements, so the start is V{} + value, not a broadcast: exact for every
// neutral value.

namespace {

template <typename Op> constexpr Zor8u neutral8() { return Neutral<Zor8u, Op>::v; }

// Row pointers of a block come from the source step: the window's rows
// y .. y + R + mh - 2, walked by index (no array as long as the mask).
struct RowSet {
    const Zor8u* base;
    ptrdiff_t step;
    MORPH_INLINE const Zor8u* operator[](int32_t i) const { return base + i * step; }
};

// The cross: the full row's segment and the full column's segment.
template <typename V, typename Op, int R>
MORPH_INLINE void cross_block(const RowSet& rows, Zor8u* const* drows, int32_t x, int32_t mw,
                        int32_t mh, int32_t fr, int32_t fc) {
    V col[R];
#pragma GCC unroll 16
    for (int o = 0; o < R; ++o) col[o] = V{} + neutral8<Op>();
    for (int32_t i = 0; i < R + mh - 1; ++i) {
        const V v = simd::load<V>(rows[i] + x + fc);
#pragma GCC unroll 16
        for (int o = 0; o < R; ++o)
            if (i >= o && i - o < mh) col[o] = Op::f(col[o], v);
    }
#pragma GCC unroll 16
    for (int o = 0; o < R; ++o) {
        const Zor8u* p = rows[o + fr] + x;
        V acc = col[o];
        for (int32_t c = 0; c < mw; ++c) acc = Op::f(acc, simd::load<V>(p + c));
        simd::store(drows[o] + x, acc);
    }
}

// The same for the usual square crosses, with every loop unrolled.
template <typename V, typename Op, int R, int S>
MORPH_INLINE void cross_block_sq(const RowSet& rows, Zor8u* const* drows, int32_t x, int32_t fr,
                                 int32_t fc) {
    V col[R];
#pragma GCC unroll 16
    for (int i = 0; i < R + S - 1; ++i) {
        const V v = simd::load<V>(rows[i] + x + fc);
#pragma GCC unroll 16
        for (int o = 0; o < R; ++o) {
            if (i < o || i - o >= S) continue;
            col[o] = i == o ? v : Op::f(col[o], v);
        }
    }
#pragma GCC unroll 16
    for (int o = 0; o < R; ++o) {
        const Zor8u* p = rows[o + fr] + x;
        V acc = col[o];
#pragma GCC unroll 16
        for (int c = 0; c < S; ++c) acc = Op::f(acc, simd::load<V>(p + c));
        simd::store(drows[o] + x, acc);
    }
}

template <typename V, typename Op, int R>
MORPH_INLINE void runs_block(const RowSet& rows, Zor8u* const* drows, int32_t x, int32_t mh,
                       const uint8_t* runs) {
    V acc[R];
#pragma GCC unroll 16
    for (int o = 0; o < R; ++o) acc[o] = V{} + neutral8<Op>();
    for (int32_t r = 0; r < mh; ++r) {
        const int32_t first = rd16s(runs, 2 * r);
        if (first < 0) continue;
        const int32_t last = rd16s(runs, 2 * r + 1);
#pragma GCC unroll 16
        for (int o = 0; o < R; ++o) {
            const Zor8u* p = rows[o + r] + x;
            V a = acc[o];
            for (int32_t c = first; c <= last; ++c) a = Op::f(a, simd::load<V>(p + c));
            acc[o] = a;
        }
    }
#pragma GCC unroll 16
    for (int o = 0; o < R; ++o) simd::store(drows[o] + x, acc[o]);
}

template <typename V, typename Op, int R>
MORPH_INLINE void list_block(const RowSet& rows, Zor8u* const* drows, int32_t x, int32_t mw,
                       int32_t mh, const uint8_t* lists) {
    V acc[R];
#pragma GCC unroll 16
    for (int o = 0; o < R; ++o) acc[o] = V{} + neutral8<Op>();
    for (int32_t r = 0; r < mh; ++r) {
        const uint8_t* list = lists + (ptrdiff_t)r * (mw + 1) * 2;
        const int32_t n = rd16u(list, 0);
        for (int32_t k = 1; k <= n; ++k) {
            const int32_t c = rd16u(list, k);
#pragma GCC unroll 16
            for (int o = 0; o < R; ++o) acc[o] = Op::f(acc[o], simd::load<V>(rows[o + r] + x + c));
        }
    }
#pragma GCC unroll 16
    for (int o = 0; o < R; ++o) simd::store(drows[o] + x, acc[o]);
}

enum MaskKind { kindCross, kindCross5, kindCross7, kindRuns, kindList };

template <typename V, typename Op, int R, MaskKind K>
MORPH_INLINE void mask_block(const Job<Zor8u>& j, const RowSet& rows, Zor8u* const* drows,
                       int32_t x) {
    const Head& h = *j.head;
    if (K == kindCross5)
        cross_block_sq<V, Op, R, 5>(rows, drows, x, rd16s(h.pRuns, 0), rd16s(h.pRuns, 1));
    else if (K == kindCross7)
        cross_block_sq<V, Op, R, 7>(rows, drows, x, rd16s(h.pRuns, 0), rd16s(h.pRuns, 1));
    else if (K == kindCross)
        cross_block<V, Op, R>(rows, drows, x, h.maskWidth, h.maskHeight, rd16s(h.pRuns, 0),
                              rd16s(h.pRuns, 1));
    else if (K == kindRuns)
        runs_block<V, Op, R>(rows, drows, x, h.maskHeight, h.pRuns);
    else
        list_block<V, Op, R>(rows, drows, x, h.maskWidth, h.maskHeight, h.pRowLists);
}

template <typename Op, int R, MaskKind K>
MORPH_INLINE void mask_rows(const Job<Zor8u>& j, int32_t y) {
    const RowSet rows = {row_at(j.src, j.srcStep, y), j.srcStep};
    Zor8u* drows[R];
    for (int o = 0; o < R; ++o) drows[o] = row_at(j.dst, j.dstStep, y + o);
    for_row<Zor8u>(0, j.width, true, drows[0], [&](auto tag, int32_t x) MORPH_LAMBDA {
        typedef typename decltype(tag)::type U;
        mask_block<U, Op, R, K>(j, rows, drows, x);
    });
}

template <typename Op, MaskKind K> void mask_8u(const Job<Zor8u>& j) {
    int32_t y = 0;
    for (; y + kBlock <= j.height; y += kBlock) mask_rows<Op, kBlock, K>(j, y);
    for (; y < j.height; ++y) mask_rows<Op, 1, K>(j, y);
}

}  // namespace

template <typename Op> void cross_8u(const Job<Zor8u>& j) {
    const int32_t mw = j.head->maskWidth, mh = j.head->maskHeight;
    if (mw == 5 && mh == 5) mask_8u<Op, kindCross5>(j);
    else if (mw == 7 && mh == 7) mask_8u<Op, kindCross7>(j);
    else mask_8u<Op, kindCross>(j);
}
template <typename Op> void row_runs_8u(const Job<Zor8u>& j) { mask_8u<Op, kindRuns>(j); }
template <typename Op> void general_8u(const Job<Zor8u>& j) { mask_8u<Op, kindList>(j); }

// ---- 16u, 16s, 32f: byte offsets in batches ------------------------------------
// The set cells become byte offsets from the window's corner, at most
// kBatch at a time. The first batch starts from the neutral value, later
// ones from what the destination holds, so that any number of cells folds
// in list order without a buffer.
//
// Blocks of kBlockRows output rows share their loads: a source pixel at window
// row i, column c serves output row o of the block where (i - o, c) is in
// the batch. The batch becomes a list of loads in (i, c) order, each with
// the set of output rows it feeds. Each output still folds its cells in
// list order, so the block size never shows in a result.

namespace {

constexpr int kBatch = 128;
// Output rows per block and vectors side by side: as many accumulators as
// the level's registers hold (16 below AVX-512, 32 with it).
constexpr int kBlockRows = ZOR_VECTOR_BYTES == 64 ? 4 : 2;
constexpr int kSideBySide = 4;

struct Load {
    ptrdiff_t off;  // bytes from the block's window corner
    uint32_t rows;  // bit o: output row o of the block takes it
};

// The loads of a block of R <= kBlockRows rows for the batch's n cells of
// (row, column), which are in list order. At most R * n entries.
int32_t block_loads(const int32_t* cellRow, const int32_t* cellCol, int32_t n, int R,
                    ptrdiff_t srcStep, ptrdiff_t elem, Load* out) {
    int32_t at[kBlockRows] = {};  // next cell of each output row
    int32_t count = 0;
    for (;;) {
        // Smallest (window row, column) among the rows' next cells.
        int32_t bi = -1, bc = 0;
        for (int o = 0; o < R; ++o) {
            if (at[o] == n) continue;
            const int32_t i = cellRow[at[o]] + o, c = cellCol[at[o]];
            if (bi < 0 || i < bi || (i == bi && c < bc)) bi = i, bc = c;
        }
        if (bi < 0) return count;
        uint32_t rows = 0;
        for (int o = 0; o < R; ++o)
            if (at[o] < n && cellRow[at[o]] + o == bi && cellCol[at[o]] == bc) {
                rows |= 1u << o;
                ++at[o];
            }
        out[count].off = bi * srcStep + bc * elem;
        out[count].rows = rows;
        ++count;
    }
}

template <typename V, typename Op, int R, int U, typename T>
MORPH_INLINE void block_step(const T* s, T* d, ptrdiff_t dstStep, const Load* loads, int32_t n,
                             bool first) {
    constexpr int N = (int)(sizeof(V) / sizeof(T));
    V acc[R][U];
#pragma GCC unroll 8
    for (int o = 0; o < R; ++o)
#pragma GCC unroll 4
        for (int u = 0; u < U; ++u)
            acc[o][u] = first ? V{} + Neutral<T, Op>::v : simd::load<V>(row_at(d, dstStep, o) + u * N);
    for (int32_t k = 0; k < n; ++k) {
        const T* p = (const T*)((const uint8_t*)s + loads[k].off);
        const uint32_t rows = loads[k].rows;
        V v[U];
#pragma GCC unroll 4
        for (int u = 0; u < U; ++u) v[u] = simd::load<V>(p + u * N);
#pragma GCC unroll 8
        for (int o = 0; o < R; ++o)
            if (rows & (1u << o))
#pragma GCC unroll 4
                for (int u = 0; u < U; ++u) acc[o][u] = Op::f(acc[o][u], v[u]);
    }
#pragma GCC unroll 8
    for (int o = 0; o < R; ++o)
#pragma GCC unroll 4
        for (int u = 0; u < U; ++u) simd::store(row_at(d, dstStep, o) + u * N, acc[o][u]);
}

// Output rows y .. y + R - 1 over the whole width.
template <typename T, typename Op, int R>
void block_rows(const Job<T>& j, int32_t y, const Load* loads, int32_t n, bool first) {
    typedef simd::native<T> V;
    constexpr int N = simd::Lanes<V>::count;
    constexpr int U = kSideBySide;
    const T* s = row_at(j.src, j.srcStep, y);
    T* d = row_at(j.dst, j.dstStep, y);
    // A later batch folds into the destination: no pixel twice.
    auto one = [&](auto tag, int32_t x) MORPH_LAMBDA {
        typedef typename decltype(tag)::type W;
        block_step<W, Op, R, 1>(s + x, d + x, j.dstStep, loads, n, first);
    };
    int32_t x = 0;
    if (j.width >= 2 * U * N && ((uintptr_t)d % sizeof(T)) == 0) {
        // Stores on vector boundaries from here on (see for_row).
        const int32_t a = (int32_t)(((0 - (uintptr_t)d) & (sizeof(V) - 1)) / sizeof(T));
        if (a) {
            if (first) one(Tag<V>(), 0);
            else for_part<T>(0, a, one);
            x = a;
        }
    }
    for (; x + U * N <= j.width; x += U * N)
        block_step<V, Op, R, U>(s + x, d + x, j.dstStep, loads, n, first);
    for_row<T>(x, j.width, first, d, one);
}

}  // namespace

template <typename T, typename Op> void offsets(const Job<T>& j) {
    constexpr int R = kBlockRows;
    const Head& h = *j.head;
    int32_t cellRow[kBatch], cellCol[kBatch];
    Load loads[R * kBatch];
    int32_t n = 0;
    bool first = true;
    auto run = [&]() {
        const int32_t nb = block_loads(cellRow, cellCol, n, R, j.srcStep, sizeof(T), loads);
        int32_t y = 0;
        for (; y + R <= j.height; y += R) block_rows<T, Op, R>(j, y, loads, nb, first);
        if (y < j.height) {
            const int32_t n1 = block_loads(cellRow, cellCol, n, 1, j.srcStep, sizeof(T), loads);
            for (; y < j.height; ++y) block_rows<T, Op, 1>(j, y, loads, n1, first);
        }
        first = false;
        n = 0;
    };
    for (int32_t r = 0; r < h.maskHeight; ++r) {
        const uint8_t* list = h.pRowLists + (ptrdiff_t)r * (h.maskWidth + 1) * 2;
        const int32_t count = rd16u(list, 0);
        for (int32_t k = 1; k <= count; ++k) {
            cellRow[n] = r;
            cellCol[n] = rd16u(list, k);
            if (++n == kBatch) run();
        }
    }
    if (n > 0) run();
}

// ---- instances -------------------------------------------------------------------

#define MORPH_RECT(T)                                        \
    template void rect3x3<T, OpMin>(const Job<T>&);          \
    template void rect3x3<T, OpMax>(const Job<T>&);          \
    template void rect_separable<T, OpMin>(const Job<T>&);   \
    template void rect_separable<T, OpMax>(const Job<T>&);
MORPH_RECT(Zor8u)
MORPH_RECT(Zor16u)
MORPH_RECT(Zor16s)
MORPH_RECT(Zor32f)
#undef MORPH_RECT

template void fixed_8u<OpMin>(const Job<Zor8u>&);
template void fixed_8u<OpMax>(const Job<Zor8u>&);
template void cross_8u<OpMin>(const Job<Zor8u>&);
template void cross_8u<OpMax>(const Job<Zor8u>&);
template void row_runs_8u<OpMin>(const Job<Zor8u>&);
template void row_runs_8u<OpMax>(const Job<Zor8u>&);
template void general_8u<OpMin>(const Job<Zor8u>&);
template void general_8u<OpMax>(const Job<Zor8u>&);
template void offsets<Zor16u, OpMin>(const Job<Zor16u>&);
template void offsets<Zor16u, OpMax>(const Job<Zor16u>&);
template void offsets<Zor16s, OpMin>(const Job<Zor16s>&);
template void offsets<Zor16s, OpMax>(const Job<Zor16s>&);
template void offsets<Zor32f, OpMin>(const Job<Zor32f>&);
template void offsets<Zor32f, OpMax>(const Job<Zor32f>&);

}  // namespace morph
ZOR_END
