// Median kernels of the general float masks: a partial bubble sort for
// lines, a sorted window that slides by deleting and merging one column
// for rectangles below 625 values, and for larger ones a three-level
// histogram of integer keys that order like the floats.
#include "variant.h"

#include "median_internal.h"

ZOR_BEGIN
namespace median {
namespace {

// A line (one of the sides is 1): gather it and bubble the smallest to the
// front until the middle element is in place.
void line_bubble(const Job<Zor32f>& j) {
    const int32_t n = j.kw * j.kh, t = n >> 1;
    const bool vertical = j.kw == 1;
    const ptrdiff_t tap = vertical ? j.srcStep : (ptrdiff_t)sizeof(Zor32f);
    const ptrdiff_t first = -(ptrdiff_t)(n >> 1) * tap;
    float* a = (float*)j.scratch;
    for (int32_t y = 0; y < j.height; ++y) {
        const uint8_t* s = (const uint8_t*)row_at(j.src, j.srcStep, y) + first;
        Zor32f* d = row_at(j.dst, j.dstStep, y);
        for (int32_t x = 0; x < j.width; ++x, s += sizeof(Zor32f)) {
            for (int32_t k = 0; k < n; ++k) memcpy(a + k, s + k * tap, sizeof(float));
            for (int32_t pass = 0; pass <= t; ++pass) {
                for (int32_t k = n - 1; k > pass; --k) {
                    if (a[k] < a[k - 1]) {
                        const float v = a[k];
                        a[k] = a[k - 1];
                        a[k - 1] = v;
                    }
                }
            }
            d[x] = a[t];
        }
    }
}

// Index of an element of win[0, m) equal to v: binary search by value;
// a value that no element equals (a NaN) is looked for by its bits, and
// failing that the last element goes, so that the window keeps its size.
int32_t find_value(const float* win, int32_t m, float v) {
    int32_t lo = 0, hi = m;
    while (lo < hi) {
        const int32_t mid = (lo + hi) >> 1;
        if (win[mid] < v)
            lo = mid + 1;
        else
            hi = mid;
    }
    if (lo < m && win[lo] == v) return lo;
    for (int32_t i = 0; i < m; ++i)
        if (memcmp(win + i, &v, sizeof v) == 0) return i;
    return m - 1;
}

void sorted_window(const Job<Zor32f>& j) {
    const int32_t kw = j.kw, kh = j.kh, rx = kw >> 1, ry = kh >> 1;
    const int32_t n = kw * kh, t = n >> 1;
    const int32_t side = kw > kh ? kw : kh;
    const int32_t stride = (n + 15) & ~15;
    float* enter = (float*)j.scratch;
    float* win = enter + ((side + 15) & ~15);
    float* merged = win + stride;
    Zor8u* radix = (Zor8u*)(merged + 2 * stride);
    const ptrdiff_t step = j.srcStep;
    for (int32_t y = 0; y < j.height; ++y) {
        const Zor32f* top = row_at(j.src, step, (ptrdiff_t)y - ry);
        Zor32f* d = row_at(j.dst, j.dstStep, y);
        for (int32_t k = 0; k < kh; ++k)
            memcpy(win + k * kw, row_at(top, step, k) - rx, (size_t)kw * sizeof(float));
        if (n > 50)
            ZOR_NAME(zorsSortRadixAscend_32f_I)(win, n, radix);
        else
            ZOR_NAME(zorsSortAscend_32f_I)(win, n);
        d[0] = win[t];
        for (int32_t x = 1; x < j.width; ++x) {
            int32_t m = n;
            for (int32_t k = 0; k < kh; ++k) {
                const int32_t i = find_value(win, m, row_at(top, step, k)[x - rx - 1]);
                memmove(win + i, win + i + 1, (size_t)(m - i - 1) * sizeof(float));
                --m;
                enter[k] = row_at(top, step, k)[x + rx];
            }
            ZOR_NAME(zorsSortAscend_32f_I)(enter, kh);
            int32_t a = 0, b = 0, o = 0;
            while (a < m && b < kh) merged[o++] = enter[b] < win[a] ? enter[b++] : win[a++];
            while (a < m) merged[o++] = win[a++];
            while (b < kh) merged[o++] = enter[b++];
            float* const swap = win;
            win = merged;
            merged = swap;
            d[x] = win[t];
        }
    }
}

// ---- 625 values and more -----------------------------------------------------

// Keys that order like the floats: a negative value's bits inverted, a
// positive value's sign bit set.
inline uint32_t key_of(float v) {
    uint32_t b;
    memcpy(&b, &v, sizeof b);
    return (b & 0x80000000u) ? ~b : (b | 0x80000000u);
}
inline float value_of(uint32_t key) {
    const uint32_t b = (key & 0x80000000u) ? (key & 0x7fffffffu) : ~key;
    float v;
    memcpy(&v, &b, sizeof v);
    return v;
}

struct KeyTables {
    int32_t l1[2048];  // key >> 21
    int32_t l2[2048];  // (key >> 10) & 0x7ff, keys of the median's l1 bin
    int32_t l3[1024];  // key & 0x3ff, keys of the median's l2 bin
};
// The buffer query reserves kKeyTableBytes for them ahead of the keys (a
// share sized for the documented buffer, 8 KiB more than the tables take).
static_assert(sizeof(KeyTables) <= kKeyTableBytes, "key tables fit their scratch share");

struct KeyHist {
    KeyTables* tab;
    const uint32_t* keys;  // the window, kw columns of kh keys
    int32_t n, t;
    int32_t m1, b1, m2, b2, m3, b3;  // bin of the median and keys below it, per level
    bool valid2, valid3;

    void count(uint32_t key, int32_t delta) {
        const int32_t h1 = (int32_t)(key >> 21);
        tab->l1[h1] += delta;
        if (h1 < m1) {
            b1 += delta;
        } else if (h1 == m1 && valid2) {
            const int32_t h2 = (int32_t)((key >> 10) & 0x7ff);
            tab->l2[h2] += delta;
            if (h2 < m2) {
                b2 += delta;
            } else if (h2 == m2 && valid3) {
                const int32_t h3 = (int32_t)(key & 0x3ff);
                tab->l3[h3] += delta;
                if (h3 < m3) b3 += delta;
            }
        }
    }

    uint32_t median() {
        int32_t* l1 = tab->l1;
        if (b1 > t || b1 + l1[m1] <= t) {
            while (b1 > t) b1 -= l1[--m1];
            while (b1 + l1[m1] <= t) b1 += l1[m1++];
            valid2 = valid3 = false;
        }
        if (l1[m1] == 1) {
            // The bin holds the median alone: no need for the finer levels.
            valid2 = valid3 = false;
            for (int32_t i = 0;; ++i)
                if ((int32_t)(keys[i] >> 21) == m1) return keys[i];
        }
        int32_t* l2 = tab->l2;
        const int32_t rank2 = t - b1;
        if (!valid2) {
            ZOR_NAME(zorsZero_32s)(l2, 2048);
            for (int32_t i = 0; i < n; ++i)
                if ((int32_t)(keys[i] >> 21) == m1) ++l2[(keys[i] >> 10) & 0x7ff];
            m2 = 0;
            b2 = 0;
            while (b2 + l2[m2] <= rank2) b2 += l2[m2++];
            valid2 = true;
            valid3 = false;
        } else if (b2 > rank2 || b2 + l2[m2] <= rank2) {
            while (b2 > rank2) b2 -= l2[--m2];
            while (b2 + l2[m2] <= rank2) b2 += l2[m2++];
            valid3 = false;
        }
        int32_t* l3 = tab->l3;
        const int32_t rank3 = rank2 - b2;
        const uint32_t high = (uint32_t)m1 << 21 | (uint32_t)m2 << 10;
        if (!valid3) {
            ZOR_NAME(zorsZero_32s)(l3, 1024);
            for (int32_t i = 0; i < n; ++i)
                if ((keys[i] & ~0x3ffu) == high) ++l3[keys[i] & 0x3ff];
            m3 = 0;
            b3 = 0;
            while (b3 + l3[m3] <= rank3) b3 += l3[m3++];
            valid3 = true;
        } else {
            while (b3 > rank3) b3 -= l3[--m3];
            while (b3 + l3[m3] <= rank3) b3 += l3[m3++];
        }
        return high | (uint32_t)m3;
    }
};

void key_histogram(const Job<Zor32f>& j, KeyTables* tab, uint32_t* keys) {
    const int32_t kw = j.kw, kh = j.kh, rx = kw >> 1, ry = kh >> 1;
    const ptrdiff_t step = j.srcStep;
    KeyHist h;
    h.tab = tab;
    h.keys = keys;
    h.n = kw * kh;
    h.t = h.n >> 1;
    for (int32_t y = 0; y < j.height; ++y) {
        const Zor32f* top = row_at(j.src, step, (ptrdiff_t)y - ry);
        Zor32f* d = row_at(j.dst, j.dstStep, y);
        ZOR_NAME(zorsZero_32s)(tab->l1, 2048);
        h.m1 = h.b1 = 0;
        h.m2 = h.b2 = h.m3 = h.b3 = 0;
        h.valid2 = h.valid3 = false;
        // Column c of the window (c = x + dx) keeps its keys in slot c mod kw.
        for (int32_t c = -rx; c <= rx; ++c) {
            uint32_t* slot = keys + (size_t)((c + kw) % kw) * kh;
            for (int32_t k = 0; k < kh; ++k) {
                slot[k] = key_of(row_at(top, step, k)[c]);
                ++tab->l1[slot[k] >> 21];
            }
        }
        d[0] = value_of(h.median());
        for (int32_t x = 1; x < j.width; ++x) {
            // The leaving column x-rx-1 and the entering one x+rx share a slot.
            uint32_t* slot = keys + (size_t)((x + rx) % kw) * kh;
            for (int32_t k = 0; k < kh; ++k) {
                h.count(slot[k], -1);
                slot[k] = key_of(row_at(top, step, k)[x + rx]);
                h.count(slot[k], +1);
            }
            d[x] = value_of(h.median());
        }
    }
}

}  // namespace

void general_32f(const Job<Zor32f>& j) {
    const int32_t n = j.kw * j.kh;
    const bool line = j.kw == 1 || j.kh == 1;
    if (n >= 625) {
        if (line) {
            // A line's scratch holds its keys only; the tables go on the stack.
            KeyTables tables;
            key_histogram(j, &tables, (uint32_t*)j.scratch);
        } else {
            key_histogram(j, (KeyTables*)j.scratch, (uint32_t*)(j.scratch + kKeyTableBytes));
        }
    } else if (line) {
        line_bubble(j);
    } else {
        sorted_window(j);
    }
}

}  // namespace median
ZOR_END
