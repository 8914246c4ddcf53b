// The median kernels of the fixed masks: branch-free min/max networks over
// whole vectors of pixels. A row is swept in vectors, the last one placed
// to end at the row's end (overlapping its neighbour: the results are the
// same pixels), and a row shorter than one vector takes the same network
// on single elements.
#include "variant.h"

#include "median_internal.h"

ZOR_BEGIN
namespace median {
namespace {

// Calls step(i, V()) for vectors starting at 0, L, 2L, ... and count - L,
// or step(i, T()) for each element when count is below one vector.
template <typename T, typename Step>
inline void sweep(int32_t count, Step step) {
    typedef simd::native<T> V;
    constexpr int32_t L = simd::Lanes<V>::count;
    if (count >= L) {
        int32_t i = 0;
        for (; i + L <= count; i += L) step(i, V());
        if (i < count) step(count - L, V());
    } else {
        for (int32_t i = 0; i < count; ++i) step(i, T());
    }
}

template <typename X> inline X med5(X p0, X p1, X p2, X p3, X p4) {
    cex(p0, p1);
    cex(p3, p4);
    p3 = vmax(p0, p3);
    p1 = vmin(p1, p4);
    cex(p1, p2);
    p2 = vmin(p2, p3);
    return vmax(p1, p2);
}

template <typename X> inline X med7(X p0, X p1, X p2, X p3, X p4, X p5, X p6) {
    cex(p0, p5);
    cex(p0, p3);
    cex(p1, p6);
    cex(p2, p4);
    p1 = vmax(p0, p1);
    cex(p3, p5);
    cex(p2, p6);
    p3 = vmax(p2, p3);
    p3 = vmin(p3, p6);
    p4 = vmin(p4, p5);
    cex(p1, p4);
    p3 = vmax(p1, p3);
    return vmin(p3, p4);
}

// One output per position from neighbours at fixed offsets; `Net` gives
// the value at a byte address with the pixel step (row step or element
// size) between the taps.
template <typename T, typename Net>
void run_taps(const Job<T>& j, ptrdiff_t tap) {
    for (int32_t y = 0; y < j.height; ++y) {
        const uint8_t* s = (const uint8_t*)row_at(j.src, j.srcStep, y);
        uint8_t* d = (uint8_t*)row_at(j.dst, j.dstStep, y);
        sweep<T>(j.width, [&](int32_t x, auto tag) {
            typedef decltype(tag) X;
            simd::store(d + x * sizeof(T), Net::template at<X>(s + x * sizeof(T), tap));
        });
    }
}

struct Net3 {
    template <typename X> static X at(const uint8_t* p, ptrdiff_t t) {
        return med3(simd::load<X>(p - t), simd::load<X>(p), simd::load<X>(p + t));
    }
};
struct Net5 {
    template <typename X> static X at(const uint8_t* p, ptrdiff_t t) {
        return med5(simd::load<X>(p - 2 * t), simd::load<X>(p - t), simd::load<X>(p), simd::load<X>(p + t), simd::load<X>(p + 2 * t));
    }
};
struct Net7 {
    template <typename X> static X at(const uint8_t* p, ptrdiff_t t) {
        return med7(simd::load<X>(p - 3 * t), simd::load<X>(p - 2 * t), simd::load<X>(p - t), simd::load<X>(p), simd::load<X>(p + t),
                    simd::load<X>(p + 2 * t), simd::load<X>(p + 3 * t));
    }
};

// Output columns per pass of the sorted-column kernels.
constexpr int32_t kChunk = 256;

// A column of three sorted by three compare-exchanges, and the 3x3 median
// of three neighbouring sorted columns: the median of the greatest low,
// the median middle and the least high.
template <typename X> struct Sorted3 {
    X lo, mid, hi;
};
template <typename X> inline Sorted3<X> sort3(X a, X b, X c) {
    const X ab = vmin(a, b), ba = vmax(a, b);
    return {vmin(ab, c), vmax(ab, vmin(ba, c)), vmax(ba, c)};
}
template <typename X>
inline X combine3(const Sorted3<X>& l, const Sorted3<X>& m, const Sorted3<X>& r) {
    const X lo = vmax(vmax(l.lo, m.lo), r.lo);
    const X hi = vmin(vmin(l.hi, m.hi), r.hi);
    return med3(lo, med3(l.mid, m.mid, r.mid), hi);
}

// 3x3: every column is sorted once into low, middle and high rows, which
// the outputs of a pass then combine.
template <typename T>
void square3(const Job<T>& j) {
    constexpr int32_t L = simd::Lanes<simd::native<T>>::count;
    T lo[kChunk + 2 + L], mid[kChunk + 2 + L], hi[kChunk + 2 + L];
    for (int32_t y = 0; y < j.height; ++y) {
        const uint8_t* r1 = (const uint8_t*)row_at(j.src, j.srcStep, y);
        const uint8_t* r0 = r1 - j.srcStep;
        const uint8_t* r2 = r1 + j.srcStep;
        uint8_t* d = (uint8_t*)row_at(j.dst, j.dstStep, y);
        for (int32_t x0 = 0; x0 < j.width; x0 += kChunk) {
            const int32_t n = j.width - x0 < kChunk ? j.width - x0 : kChunk;
            const ptrdiff_t at = (ptrdiff_t)(x0 - 1) * (ptrdiff_t)sizeof(T);
            sweep<T>(n + 2, [&](int32_t i, auto tag) {
                typedef decltype(tag) X;
                const ptrdiff_t o = at + (ptrdiff_t)i * (ptrdiff_t)sizeof(T);
                // The row the next output row adds, and that row's output,
                // on their way in while this row is worked on.
                __builtin_prefetch(r2 + j.srcStep + o);
                __builtin_prefetch(d + j.dstStep + o, 1);
                const Sorted3<X> c = sort3(simd::load<X>(r0 + o), simd::load<X>(r1 + o),
                                           simd::load<X>(r2 + o));
                simd::store(lo + i, c.lo);
                simd::store(mid + i, c.mid);
                simd::store(hi + i, c.hi);
            });
            sweep<T>(n, [&](int32_t i, auto tag) {
                typedef decltype(tag) X;
                Sorted3<X> c[3];
                for (int k = 0; k < 3; ++k)
                    c[k] = {simd::load<X>(lo + i + k), simd::load<X>(mid + i + k),
                            simd::load<X>(hi + i + k)};
                simd::store(d + (ptrdiff_t)(x0 + i) * (ptrdiff_t)sizeof(T),
                            combine3(c[0], c[1], c[2]));
            });
        }
    }
}

// 3x3 for floats on rows of at least one vector: the sorted columns stay
// in registers, and the neighbours of a vector's columns are taken from the
// vectors before and after it by lane shuffles instead of going through
// memory. Every column is sorted and combined exactly as square3 does.
// Only 64-byte vectors gain: narrower levels shuffle across lanes in
// several instructions and keep square3.
#if ZOR_VECTOR_BYTES == 64
typedef simd::native<Zor32f> VF;
constexpr int kFloatLanes = simd::Lanes<VF>::count;

// The sorted columns By lanes further along.
template <int By> inline Sorted3<VF> lanes_from(const Sorted3<VF>& a, const Sorted3<VF>& b) {
    return {simd::lanes_from<By>(a.lo, b.lo), simd::lanes_from<By>(a.mid, b.mid),
            simd::lanes_from<By>(a.hi, b.hi)};
}

inline Sorted3<VF> sort_column(const uint8_t* r0, ptrdiff_t step, ptrdiff_t o) {
    return sort3(simd::load<VF>(r0 + o), simd::load<VF>(r0 + step + o),
                 simd::load<VF>(r0 + 2 * step + o));
}

void square3_32f(const Job<Zor32f>& j) {
    constexpr int32_t L = kFloatLanes;
    constexpr ptrdiff_t E = sizeof(Zor32f);
    for (int32_t y = 0; y < j.height; ++y) {
        const uint8_t* r0 = (const uint8_t*)row_at(j.src, j.srcStep, (ptrdiff_t)y - 1);
        uint8_t* d = (uint8_t*)row_at(j.dst, j.dstStep, y);
        // left holds columns x - 1 .. x + L - 2, cur x .. x + L - 1. The
        // first left is loaded: column -1 is the only one left of the ROI
        // that may be read.
        Sorted3<VF> left = sort_column(r0, j.srcStep, -E), cur = sort_column(r0, j.srcStep, 0);
        int32_t x = 0;
        for (; x + 2 * L <= j.width; x += L) {
            const Sorted3<VF> next = sort_column(r0, j.srcStep, (x + L) * E);
            simd::store(d + x * E, combine3(left, cur, lanes_from<1>(cur, next)));
            left = lanes_from<L - 1>(cur, next);
            cur = next;
        }
        // The last vector ends at the row's end; its neighbours are loaded.
        for (; x < j.width; x += L) {
            if (x + L > j.width) x = j.width - L;
            const ptrdiff_t o = x * E;
            simd::store(d + o, combine3(sort_column(r0, j.srcStep, o - E),
                                        sort_column(r0, j.srcStep, o),
                                        sort_column(r0, j.srcStep, o + E)));
        }
    }
}
#endif

// Element 12 of 25 from five sorted columns of five: the first four
// columns merged pairwise, then together, keeping the six ranks (7 to 12)
// that can still be the median, merged with the fifth column; every
// min/max that does not lead to the result is left out.
template <typename X>
inline X select25(const X* c0, const X* c1, const X* c2, const X* c3, const X* c4) {
    const X w1 = vmin<X>(c0[0], c1[0]);
    const X w2 = vmax<X>(c0[0], c1[0]);
    const X w3 = vmin<X>(c0[4], c1[4]);
    const X w4 = vmax<X>(c0[4], c1[4]);
    const X w5 = vmin<X>(w3, w2);
    const X w6 = vmax<X>(w3, w2);
    const X w7 = vmin<X>(c0[2], c1[2]);
    const X w8 = vmax<X>(c0[2], c1[2]);
    const X w9 = vmin<X>(w7, w5);
    const X w10 = vmax<X>(w7, w5);
    const X w11 = vmin<X>(w8, w6);
    const X w12 = vmax<X>(w8, w6);
    const X w13 = vmin<X>(c0[1], c1[1]);
    const X w14 = vmax<X>(c0[1], c1[1]);
    const X w15 = vmin<X>(c0[3], c1[3]);
    const X w16 = vmax<X>(c0[3], c1[3]);
    const X w17 = vmin<X>(w15, w14);
    const X w18 = vmax<X>(w15, w14);
    const X w19 = vmin<X>(w13, w9);
    const X w20 = vmax<X>(w13, w9);
    const X w21 = vmin<X>(w17, w10);
    const X w22 = vmax<X>(w17, w10);
    const X w23 = vmin<X>(w18, w11);
    const X w24 = vmax<X>(w18, w11);
    const X w25 = vmin<X>(w16, w12);
    const X w26 = vmax<X>(w16, w12);
    const X w27 = vmin<X>(c2[0], c3[0]);
    const X w28 = vmax<X>(c2[0], c3[0]);
    const X w29 = vmin<X>(c2[4], c3[4]);
    const X w30 = vmax<X>(c2[4], c3[4]);
    const X w31 = vmin<X>(w29, w28);
    const X w32 = vmax<X>(w29, w28);
    const X w33 = vmin<X>(c2[2], c3[2]);
    const X w34 = vmax<X>(c2[2], c3[2]);
    const X w35 = vmin<X>(w33, w31);
    const X w36 = vmax<X>(w33, w31);
    const X w37 = vmin<X>(w34, w32);
    const X w38 = vmax<X>(w34, w32);
    const X w39 = vmin<X>(c2[1], c3[1]);
    const X w40 = vmax<X>(c2[1], c3[1]);
    const X w41 = vmin<X>(c2[3], c3[3]);
    const X w42 = vmax<X>(c2[3], c3[3]);
    const X w43 = vmin<X>(w41, w40);
    const X w44 = vmax<X>(w41, w40);
    const X w45 = vmin<X>(w39, w35);
    const X w46 = vmax<X>(w39, w35);
    const X w47 = vmin<X>(w43, w36);
    const X w48 = vmax<X>(w43, w36);
    const X w49 = vmin<X>(w44, w37);
    const X w50 = vmax<X>(w44, w37);
    const X w51 = vmin<X>(w42, w38);
    const X w52 = vmax<X>(w42, w38);
    const X w54 = vmax<X>(w1, w27);
    const X w55 = vmin<X>(w26, w52);
    const X w57 = vmin<X>(w55, w54);
    const X w58 = vmax<X>(w55, w54);
    const X w59 = vmin<X>(w22, w48);
    const X w60 = vmax<X>(w22, w48);
    const X w62 = vmax<X>(w59, w57);
    const X w63 = vmin<X>(w60, w58);
    const X w66 = vmax<X>(w20, w46);
    const X w67 = vmin<X>(w24, w50);
    const X w69 = vmin<X>(w67, w66);
    const X w70 = vmax<X>(w67, w66);
    const X w74 = vmax<X>(w69, w62);
    const X w75 = vmin<X>(w70, w63);
    const X w76 = vmax<X>(w70, w63);
    const X w80 = vmax<X>(w19, w45);
    const X w81 = vmin<X>(w4, w30);
    const X w83 = vmin<X>(w81, w80);
    const X w84 = vmax<X>(w81, w80);
    const X w85 = vmin<X>(w23, w49);
    const X w86 = vmax<X>(w23, w49);
    const X w88 = vmax<X>(w85, w83);
    const X w89 = vmin<X>(w86, w84);
    const X w92 = vmax<X>(w21, w47);
    const X w93 = vmin<X>(w25, w51);
    const X w95 = vmin<X>(w93, w92);
    const X w96 = vmax<X>(w93, w92);
    const X w99 = vmin<X>(w95, w88);
    const X w100 = vmax<X>(w95, w88);
    const X w101 = vmin<X>(w96, w89);
    const X w111 = vmin<X>(w99, w74);
    const X w112 = vmax<X>(w99, w74);
    const X w113 = vmin<X>(w100, w75);
    const X w114 = vmax<X>(w100, w75);
    const X w115 = vmin<X>(w101, w76);
    const X w116 = vmax<X>(w101, w76);
    const X w124 = vmax<X>(w111, c4[0]);
    const X w125 = vmin<X>(w115, c4[4]);
    const X w128 = vmax<X>(w125, w124);
    const X w130 = vmax<X>(w113, c4[2]);
    const X w133 = vmin<X>(w130, w128);
    const X w136 = vmax<X>(w112, c4[1]);
    const X w137 = vmin<X>(w116, w136);
    const X w139 = vmin<X>(w114, c4[3]);
    const X w142 = vmax<X>(w139, w137);
    const X w149 = vmin<X>(w142, w133);
    return w149;
}

template <typename T>
void square5(const Job<T>& j) {
    constexpr int32_t L = simd::Lanes<simd::native<T>>::count;
    T col[5][kChunk + 4 + L];
    for (int32_t y = 0; y < j.height; ++y) {
        const uint8_t* r[5];
        for (int k = 0; k < 5; ++k)
            r[k] = (const uint8_t*)row_at(j.src, j.srcStep, (ptrdiff_t)y + k - 2);
        uint8_t* d = (uint8_t*)row_at(j.dst, j.dstStep, y);
        for (int32_t x0 = 0; x0 < j.width; x0 += kChunk) {
            const int32_t n = j.width - x0 < kChunk ? j.width - x0 : kChunk;
            const ptrdiff_t at = (ptrdiff_t)(x0 - 2) * (ptrdiff_t)sizeof(T);
            // Sort each column of five (nine compare-exchanges).
            sweep<T>(n + 4, [&](int32_t i, auto tag) {
                typedef decltype(tag) X;
                const ptrdiff_t o = at + (ptrdiff_t)i * (ptrdiff_t)sizeof(T);
                X p0 = simd::load<X>(r[0] + o), p1 = simd::load<X>(r[1] + o), p2 = simd::load<X>(r[2] + o),
                  p3 = simd::load<X>(r[3] + o), p4 = simd::load<X>(r[4] + o);
                cex(p0, p1);
                cex(p3, p4);
                cex(p2, p4);
                cex(p2, p3);
                cex(p0, p3);
                cex(p0, p2);
                cex(p1, p4);
                cex(p1, p3);
                cex(p1, p2);
                simd::store(col[0] + i, p0);
                simd::store(col[1] + i, p1);
                simd::store(col[2] + i, p2);
                simd::store(col[3] + i, p3);
                simd::store(col[4] + i, p4);
            });
            sweep<T>(n, [&](int32_t i, auto tag) {
                typedef decltype(tag) X;
                X c[5][5];
                for (int k = 0; k < 5; ++k)
                    for (int r = 0; r < 5; ++r) c[k][r] = simd::load<X>(col[r] + i + k);
                simd::store(d + (ptrdiff_t)(x0 + i) * (ptrdiff_t)sizeof(T),
                      select25<X>(c[0], c[1], c[2], c[3], c[4]));
            });
        }
    }
}

// Median of a 7x7 window of 8u pixels by forgetful selection. While the
// values still standing number at least (m + 3) / 2 of the m still in
// question (standing or not yet seen), their least and greatest cannot be
// the median: both are dropped and the next value joins. 26 of the 49
// start; after 23 rounds three are left, and their median is the result.
template <typename X>
inline X forget49(const uint8_t* p, ptrdiff_t step) {
    X s[26];
#pragma GCC unroll 26
    for (int k = 0; k < 26; ++k) s[k] = simd::load<X>(p + (k / 7) * step + k % 7);
#pragma GCC unroll 23
    for (int r = 0; r < 23; ++r) {
#pragma GCC unroll 25
        for (int i = r + 1; i < 26; ++i) cex(s[r], s[i]);
#pragma GCC unroll 24
        for (int i = r + 1; i < 25; ++i) cex(s[i], s[25]);
        const int k = 26 + r;
        s[25] = simd::load<X>(p + (k / 7) * step + k % 7);
    }
    return med3(s[23], s[24], s[25]);
}

}  // namespace

// Rows of at least one vector; the last vector ends at the row's end.
void square7_8u(const Job<Zor8u>& j) {
    typedef simd::native<Zor8u> V;
    constexpr int32_t L = simd::Lanes<V>::count;
    for (int32_t y = 0; y < j.height; ++y) {
        const uint8_t* top = row_at(j.src, j.srcStep, (ptrdiff_t)y - 3) - 3;
        uint8_t* d = row_at(j.dst, j.dstStep, y);
        for (int32_t x = 0;; x += L) {
            if (x + L > j.width) x = j.width - L;
            simd::store(d + x, forget49<V>(top + x, j.srcStep));
            if (x + L == j.width) break;
        }
    }
}

template <typename T> void fixed_1x3(const Job<T>& j) { run_taps<T, Net3>(j, j.srcStep); }
template <typename T> void fixed_1x5(const Job<T>& j) { run_taps<T, Net5>(j, j.srcStep); }
template <typename T> void fixed_3x1(const Job<T>& j) { run_taps<T, Net3>(j, sizeof(T)); }
template <typename T> void fixed_5x1(const Job<T>& j) { run_taps<T, Net5>(j, sizeof(T)); }
template <typename T> void fixed_3x3(const Job<T>& j) {
#if ZOR_VECTOR_BYTES == 64
    if constexpr (sizeof(T) == 4) {
        if (j.width >= kFloatLanes) {
            square3_32f(j);
            return;
        }
    }
#endif
    square3<T>(j);
}
template <typename T> void fixed_5x5(const Job<T>& j) { square5<T>(j); }

void fixed_1x7_16s(const Job<Zor16s>& j) { run_taps<Zor16s, Net7>(j, j.srcStep); }
void fixed_7x1_16s(const Job<Zor16s>& j) { run_taps<Zor16s, Net7>(j, sizeof(Zor16s)); }

#define MEDIAN_FIXED(T)                               \
    template void fixed_1x3<T>(const Job<T>&);        \
    template void fixed_1x5<T>(const Job<T>&);        \
    template void fixed_3x1<T>(const Job<T>&);        \
    template void fixed_5x1<T>(const Job<T>&);        \
    template void fixed_3x3<T>(const Job<T>&);        \
    template void fixed_5x5<T>(const Job<T>&);
MEDIAN_FIXED(Zor8u)
MEDIAN_FIXED(Zor16u)
MEDIAN_FIXED(Zor16s)
MEDIAN_FIXED(Zor32f)

}  // namespace median
ZOR_END
