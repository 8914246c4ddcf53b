// Median kernels of the general masks of the integer types: a histogram
// that slides along each output row (256 counters for 8u; for 16-bit keys
// a coarse table on the high byte and fine tables on the low byte of the
// median's coarse bin), and for 8u columns a partial bubble sort.
#include "variant.h"

#include "median_internal.h"

ZOR_BEGIN
namespace median {
namespace {

// Mask one pixel wide: gather the column as 32-bit values and bubble the
// smallest to the front, pass after pass from the bottom, until the middle
// element is in place.
void column_bubble_8u(const Job<Zor8u>& j) {
    const int32_t n = j.kh, t = n >> 1, ry = j.kh >> 1;
    uint32_t* a = (uint32_t*)j.scratch;
    for (int32_t y = 0; y < j.height; ++y) {
        const Zor8u* top = row_at(j.src, j.srcStep, (ptrdiff_t)y - ry);
        Zor8u* d = row_at(j.dst, j.dstStep, y);
        for (int32_t x = 0; x < j.width; ++x) {
            for (int32_t k = 0; k < n; ++k) a[k] = row_at(top, j.srcStep, k)[x];
            for (int32_t pass = 0; pass <= t; ++pass) {
                for (int32_t k = n - 1; k > pass; --k) {
                    const uint32_t lo = a[k] < a[k - 1] ? a[k] : a[k - 1];
                    const uint32_t hi = a[k] < a[k - 1] ? a[k - 1] : a[k];
                    a[k - 1] = lo;
                    a[k] = hi;
                }
            }
            d[x] = (Zor8u)a[t];
        }
    }
}

// 256 counters for one output row at a time. `below` counts the window's
// pixels under the median bin, so that each step only moves the bin by as
// far as the median moved.
void sliding_8u(const Job<Zor8u>& j, int32_t firstRow) {
    const int32_t kw = j.kw, kh = j.kh, rx = kw >> 1, ry = kh >> 1;
    const int32_t t = (kw * kh) >> 1;
    const ptrdiff_t step = j.srcStep;
    int32_t hist[256];
    for (int32_t y = firstRow; y < j.height; ++y) {
        const Zor8u* top = row_at(j.src, step, (ptrdiff_t)y - ry);
        Zor8u* d = row_at(j.dst, j.dstStep, y);
        ZOR_NAME(zorsZero_32s)(hist, 256);
        for (int32_t k = 0; k < kh; ++k) {
            const Zor8u* r = row_at(top, step, k);
            for (int32_t dx = -rx; dx <= rx; ++dx) ++hist[r[dx]];
        }
        int32_t med = 0, below = 0;
        while (below + hist[med] <= t) below += hist[med++];
        d[0] = (Zor8u)med;
        for (int32_t x = 1; x < j.width; ++x) {
            const Zor8u* r = top + x;
            for (int32_t k = 0; k < kh; ++k, r += step) {
                const int32_t out = r[-rx - 1], in = r[rx];
                --hist[out];
                ++hist[in];
                below += (in < med) - (out < med);
            }
            while (below > t) below -= hist[--med];
            while (below + hist[med] <= t) below += hist[med++];
            d[x] = (Zor8u)med;
        }
    }
}

// R output rows at a time (2 or 4): the window rows all of them read have
// their counters kept once, and each output row has its own counters for
// the rest of its window. Counters are 16-bit, four bins to a 64-bit word
// (n stays below 32768, so words add without carries between lanes), and
// each median is first found to its word, four bins a step, then to its
// lane. The R counts of pixels under the medians' words travel as 16-bit
// lanes of one 64-bit word, and a table tells for each word of bins which
// medians' words lie above it, so that a pixel updates all counts with one
// addition.
constexpr uint64_t kLanes = 0x0001000100010001ull;

// Each lane plus the lanes below it.
inline uint64_t lane_totals(uint64_t w) {
    w += w << 16;
    return w + (w << 32);
}

// How many leading lanes of a word hold running totals of at most r: a
// lane of (r | 0x8000) - total keeps its top bit exactly then.
inline int32_t lanes_within(uint64_t w, uint32_t r) {
    const uint64_t kept = (((uint64_t)(r | 0x8000u) * kLanes - lane_totals(w)) >> 15) & kLanes;
    return (int32_t)(lane_totals(kept) >> 48);
}

inline uint64_t word_at(const uint16_t* counts, int32_t w) {
    uint64_t v;
    memcpy(&v, counts + 4 * w, 8);
    return v;
}

// Window rows a block keeps pointers for: kh + R - 1 of them.
constexpr int32_t kBlockWindowRows = 64;

template <int R>
void sliding_8u_rows(const Job<Zor8u>& j, int32_t y) {
    const int32_t kw = j.kw, kh = j.kh, rx = kw >> 1, ry = kh >> 1;
    const uint32_t t = (uint32_t)(kw * kh) >> 1;
    const ptrdiff_t step = j.srcStep;
    uint16_t shared[256], own[R][256];
    uint64_t under[256 / 4];  // per word of bins, lane i: under median i's word
    // Window rows u = 0 .. kh + R - 2 from the first output row's top; row u
    // belongs to outputs lo .. hi. Rows of all outputs come first.
    const Zor8u* top = row_at(j.src, step, (ptrdiff_t)y - ry);
    const Zor8u* rows[kBlockWindowRows];
    int32_t lo[kBlockWindowRows], hi[kBlockWindowRows];
    int32_t nShared = 0, nRows = 0;
    for (int32_t u = R - 1; u < kh; ++u, ++nShared, ++nRows) rows[nRows] = row_at(top, step, u);
    for (int32_t u = 0; u < kh + R - 1; ++u) {
        if (u >= R - 1 && u < kh) continue;
        rows[nRows] = row_at(top, step, u);
        lo[nRows] = u - kh + 1 > 0 ? u - kh + 1 : 0;
        hi[nRows] = u < R - 1 ? u : R - 1;
        ++nRows;
    }
    ZOR_NAME(zorsZero_8u)((Zor8u*)shared, (int32_t)sizeof shared);
    ZOR_NAME(zorsZero_8u)((Zor8u*)own, (int32_t)sizeof own);
    ZOR_NAME(zorsZero_8u)((Zor8u*)under, (int32_t)sizeof under);
    for (int32_t k = 0; k < nShared; ++k)
        for (int32_t dx = -rx; dx <= rx; ++dx) ++shared[rows[k][dx]];
    for (int32_t k = nShared; k < nRows; ++k)
        for (int32_t i = lo[k]; i <= hi[k]; ++i)
            for (int32_t dx = -rx; dx <= rx; ++dx) ++own[i][rows[k][dx]];

    // Moves median i to its word again and returns it.
    int32_t wm[R];
    uint32_t sum[R];
    auto walk = [&](int32_t i) {
        const uint16_t* mine = own[i];
        const uint64_t bit = 1ull << (16 * i);
        int32_t w = wm[i];
        uint32_t s = sum[i];
        uint64_t word;
        while (s > t) {
            --w;
            s -= (uint32_t)(lane_totals(word_at(shared, w) + word_at(mine, w)) >> 48);
            under[w] &= ~bit;
        }
        for (;;) {
            word = word_at(shared, w) + word_at(mine, w);
            const uint32_t n = (uint32_t)(lane_totals(word) >> 48);
            if (s + n > t) break;
            s += n;
            under[w] |= bit;
            ++w;
        }
        wm[i] = w;
        sum[i] = s;
        return (Zor8u)(4 * w + lanes_within(word, t - s));
    };
    Zor8u* d[R];
    for (int32_t i = 0; i < R; ++i) {
        d[i] = row_at(j.dst, j.dstStep, (ptrdiff_t)y + i);
        wm[i] = 0;
        sum[i] = 0;
    }
    for (int32_t x = 0;; ++x) {
#pragma GCC unroll 4
        for (int32_t i = 0; i < R; ++i) d[i][x] = walk(i);
        if (x + 1 == j.width) break;
        uint64_t kept = 0;
        for (int32_t i = 0; i < R; ++i) kept += (uint64_t)sum[i] << (16 * i);
#pragma GCC unroll 4
        for (int32_t k = 0; k < nShared; ++k) {
            const int32_t out = rows[k][x - rx], in = rows[k][x + 1 + rx];
            --shared[out];
            ++shared[in];
            kept += under[in >> 2] - under[out >> 2];
        }
        for (int32_t k = nShared; k < nRows; ++k) {
            const int32_t out = rows[k][x - rx], in = rows[k][x + 1 + rx];
            uint64_t lanes = 0;
            for (int32_t i = lo[k]; i <= hi[k]; ++i) {
                --own[i][out];
                ++own[i][in];
                lanes |= 0xffffull << (16 * i);
            }
            // Whole-word arithmetic: each lane ends between 0 and n.
            kept += (under[in >> 2] & lanes) - (under[out >> 2] & lanes);
        }
        for (int32_t i = 0; i < R; ++i) sum[i] = (uint32_t)(kept >> (16 * i)) & 0xffff;
    }
}

// ---- 16-bit keys --------------------------------------------------------------

// 16u pixels are their own keys; 16s pixels are biased by 32768.
template <typename T> inline uint32_t key_of(T v);
template <> inline uint32_t key_of<Zor16u>(Zor16u v) { return v; }
template <> inline uint32_t key_of<Zor16s>(Zor16s v) { return (uint32_t)((Zor16u)v ^ 0x8000u); }
template <typename T> inline T value_of(uint32_t key);
template <> inline Zor16u value_of<Zor16u>(uint32_t key) { return (Zor16u)key; }
template <> inline Zor16s value_of<Zor16s>(uint32_t key) { return (Zor16s)(Zor16u)(key ^ 0x8000u); }

struct Hist16 {
    int32_t coarse[256];  // key >> 8
    int32_t fine[256];    // key & 255, keys of the median's coarse bin only
    int32_t group[16];    // (key & 255) >> 4, the same keys
    int32_t cm, belowC;   // median's coarse bin, keys under it
    int32_t fm, belowF;   // median's fine bin, keys of bin cm under it
};

// Rebuilds the fine tables of coarse bin cm from the window at column x
// and finds the median's fine bin for rank t afresh.
template <typename T>
void refine(Hist16& h, const T* top, ptrdiff_t step, int32_t x, int32_t kw, int32_t kh,
            int32_t t) {
    const int32_t rx = kw >> 1;
    ZOR_NAME(zorsZero_32s)(h.fine, 256);
    ZOR_NAME(zorsZero_32s)(h.group, 16);
    for (int32_t k = 0; k < kh; ++k) {
        const T* r = row_at(top, step, k) + x;
        for (int32_t dx = -rx; dx <= rx; ++dx) {
            const uint32_t key = key_of<T>(r[dx]);
            if ((int32_t)(key >> 8) == h.cm) {
                ++h.fine[key & 255];
                ++h.group[(key & 255) >> 4];
            }
        }
    }
    const int32_t rank = t - h.belowC;
    int32_t g = 0, acc = 0;
    while (acc + h.group[g] <= rank) acc += h.group[g++];
    int32_t f = g << 4;
    while (acc + h.fine[f] <= rank) acc += h.fine[f++];
    h.fm = f;
    h.belowF = acc;
}

template <typename T>
inline void count16(Hist16& h, uint32_t key, int32_t delta) {
    const int32_t c = (int32_t)(key >> 8);
    h.coarse[c] += delta;
    if (c < h.cm) {
        h.belowC += delta;
    } else if (c == h.cm) {
        const int32_t f = (int32_t)(key & 255);
        h.fine[f] += delta;
        h.group[f >> 4] += delta;
        if (f < h.fm) h.belowF += delta;
    }
}

template <typename T>
void sliding_16(const Job<T>& j) {
    const int32_t kw = j.kw, kh = j.kh, rx = kw >> 1, ry = kh >> 1;
    const int32_t t = (kw * kh) >> 1;
    const ptrdiff_t step = j.srcStep;
    Hist16 h;
    for (int32_t y = 0; y < j.height; ++y) {
        const T* top = row_at(j.src, step, (ptrdiff_t)y - ry);
        T* d = row_at(j.dst, j.dstStep, y);
        ZOR_NAME(zorsZero_32s)(h.coarse, 256);
        for (int32_t k = 0; k < kh; ++k) {
            const T* r = row_at(top, step, k);
            for (int32_t dx = -rx; dx <= rx; ++dx) ++h.coarse[key_of<T>(r[dx]) >> 8];
        }
        h.cm = 0;
        h.belowC = 0;
        while (h.belowC + h.coarse[h.cm] <= t) h.belowC += h.coarse[h.cm++];
        refine(h, top, step, 0, kw, kh, t);
        d[0] = value_of<T>((uint32_t)(h.cm << 8 | h.fm));
        for (int32_t x = 1; x < j.width; ++x) {
            const T* r = top + x;
            for (int32_t k = 0; k < kh; ++k, r = row_at(r, step, 1)) {
                count16<T>(h, key_of<T>(r[-rx - 1]), -1);
                count16<T>(h, key_of<T>(r[rx]), +1);
            }
            if (h.belowC > t || h.belowC + h.coarse[h.cm] <= t) {
                // Another coarse bin: its fine tables are made anew.
                while (h.belowC > t) h.belowC -= h.coarse[--h.cm];
                while (h.belowC + h.coarse[h.cm] <= t) h.belowC += h.coarse[h.cm++];
                refine(h, top, step, x, kw, kh, t);
            } else {
                const int32_t rank = t - h.belowC;
                while (h.belowF > rank) h.belowF -= h.fine[--h.fm];
                while (h.belowF + h.fine[h.fm] <= rank) h.belowF += h.fine[h.fm++];
            }
            d[x] = value_of<T>((uint32_t)(h.cm << 8 | h.fm));
        }
    }
}

}  // namespace

void general_8u(const Job<Zor8u>& j) {
    if (j.kw == 1) {
        column_bubble_8u(j);
        return;
    }
    if (j.kw == 7 && j.kh == 7 && j.width >= simd::Lanes<simd::native<Zor8u>>::count) {
        square7_8u(j);
        return;
    }
    // A mask one row high shares nothing between rows; 16-bit counters
    // hold n below 32768; a block of four outputs has kh + 3 window rows.
    int32_t y = 0;
    if (j.kh > 1 && j.kw * j.kh < 32768 && j.kh + 3 < kBlockWindowRows) {
        for (; y + 3 < j.height; y += 4) sliding_8u_rows<4>(j, y);
        for (; y + 1 < j.height; y += 2) sliding_8u_rows<2>(j, y);
    }
    sliding_8u(j, y);
}

void general_16u(const Job<Zor16u>& j) { sliding_16<Zor16u>(j); }
void general_16s(const Job<Zor16s>& j) { sliding_16<Zor16s>(j); }

}  // namespace median
ZOR_END
