// Scaled integer products and quotients through the public stubs on every
// level: all 8u pairs at every scale factor that matters and beyond,
// sampled 16-bit pairs, guarded geometries, statuses and check order.
#include <limits.h>
#include <math.h>

#include <algorithm>

#include "sweep.h"
#include "zortest.h"

namespace {

using namespace arithtest;

// ---- models ----------------------------------------------------------------------

template <typename T>
int64_t saturate(int64_t v) {
    const int64_t lo = std::numeric_limits<T>::min(), hi = std::numeric_limits<T>::max();
    return v < lo ? lo : v > hi ? hi : v;
}

// p * 2^-s rounded to nearest, ties to the even neighbour, saturated to T;
// the 16u scale of 32 is the product's top bit.
template <typename T>
int64_t mul_model(int64_t a, int64_t b, int s) {
    const int64_t p = a * b;
    if (sizeof(T) == 2 && !std::numeric_limits<T>::is_signed && s == 32) return (uint64_t)p >> 31;
    if (s <= 0) {
        if (p == 0) return 0;
        if (s < -23) return saturate<T>(p > 0 ? INT64_MAX : INT64_MIN);
        return saturate<T>(p * ((int64_t)1 << -s));
    }
    if (s > 40) return 0;
    int64_t q = p >> s;  // floor
    const int64_t r = p - q * ((int64_t)1 << s), half = (int64_t)1 << (s - 1);
    if (r > half || (r == half && (q & 1))) ++q;
    return saturate<T>(q);
}

struct DivRange {
    int lo, hi;
};
template <typename T>
DivRange div_range() {
    if (sizeof(T) == 1) return {-15, 8};
    return std::numeric_limits<T>::is_signed ? DivRange{-30, 15} : DivRange{-31, 16};
}

// n / d (d from the first source, n from the second): the single-precision
// quotient of n * 2^-s by d, rounded to nearest even and saturated, inside
// the type's range of s; known values outside it; zero divisors by their
// own rule.
template <typename T>
int64_t div_model(int64_t d, int64_t n, int s) {
    const int64_t hi = std::numeric_limits<T>::max(), lo = std::numeric_limits<T>::min();
    if (d == 0) return n > 0 ? hi : n < 0 ? lo : 0;
    if (n == 0) return 0;
    const DivRange range = div_range<T>();
    if (s < range.lo) return (n > 0) == (d > 0) ? hi : lo;
    if (s > range.hi) return 0;
    const float q = ((float)n * ldexpf(1.0f, -s)) / (float)d;
    const float r = nearbyintf(q);
    return r >= (float)hi ? hi : r <= (float)lo ? lo : (int64_t)r;
}

template <typename T>
using SfsFn = ZorStatus (*)(const T*, int32_t, const T*, int32_t, T*, int32_t, ZoriSize, int32_t);

// ---- all pairs of a list, laid out row after row --------------------------------

// Runs fn on the pairs (a[k], b[k]) laid out in rows of width w and
// compares each result with the model; returns the status.
template <typename T, typename Model>
ZorStatus run_pairs(SfsFn<T> fn, const std::vector<T>& a, const std::vector<T>& b, int32_t w,
                    int s, Model model, const char* what) {
    const int32_t h = (int32_t)((a.size() + (size_t)w - 1) / (size_t)w);
    std::vector<T> A((size_t)w * h, 0), B((size_t)w * h, 0), D((size_t)w * h, 0);
    std::copy(a.begin(), a.end(), A.begin());
    std::copy(b.begin(), b.end(), B.begin());
    const int32_t step = w * (int32_t)sizeof(T);
    const ZorStatus st = fn(A.data(), step, B.data(), step, D.data(), step, {w, h}, s);
    for (size_t k = 0; k < a.size(); ++k) {
        const int64_t want = model(a[k], b[k], s);
        if (D[k] != want) {
            ADD_FAILURE() << what << " " << (int64_t)A[k] << ", " << (int64_t)B[k] << " scale "
                          << s << " width " << w << ": got " << (int64_t)D[k] << ", expected "
                          << want;
            break;
        }
    }
    return st;
}

std::vector<int> scales(int from, int to) {
    std::vector<int> s;
    for (int i = from; i <= to; ++i) s.push_back(i);
    for (int i : {INT_MIN, -1000, 1000, INT_MAX}) s.push_back(i);
    return s;
}

void all_8u_pairs(std::vector<Zor8u>& a, std::vector<Zor8u>& b) {
    for (int k = 0; k < 65536; ++k) {
        a.push_back((Zor8u)(k & 255));
        b.push_back((Zor8u)(k >> 8));
    }
}

// Edge values of a 16-bit type crossed with each other, then random pairs.
template <typename T>
void sampled_pairs(std::vector<T>& a, std::vector<T>& b, uint64_t seed) {
    std::vector<int64_t> edges = {0, 1, 2, 3, 5, 127, 128, 181, 182, 255, 256, 257, 4095, 4096,
                                  32767};
    if (std::numeric_limits<T>::is_signed) {
        for (int64_t v : {-1, -2, -3, -181, -182, -256, -32767, -32768}) edges.push_back(v);
    } else {
        for (int64_t v : {32768, 46340, 46341, 65534, 65535}) edges.push_back(v);
    }
    for (int64_t x : edges)
        for (int64_t y : edges) {
            a.push_back((T)x);
            b.push_back((T)y);
        }
    Rng r(seed);
    for (int k = 0; k < 6000; ++k) {
        // Small magnitudes as often as large ones, so quotients are not all 0.
        const uint32_t m1 = r.below(3) == 0 ? 0xff : 0xffff, m2 = r.below(3) == 0 ? 0xff : 0xffff;
        a.push_back((T)(r.next() & m1));
        b.push_back((T)(r.next() & m2));
    }
}

using Sfs = zortest::LevelTest;

// Every scale from lo to hi and the extremes, on rows of two widths; the
// divisors hold zeros, so every division reports status 2.
template <typename T, typename Model>
void pairs_at_scales(SfsFn<T> fn, Model model, const std::vector<T>& a, const std::vector<T>& b,
                     int lo, int hi, bool division, const char* what) {
    for (int s : scales(lo, hi))
        for (int32_t w : {sizeof(T) == 1 ? 256 : 64, sizeof(T) == 1 ? 7 : 5})
            ASSERT_EQ(run_pairs<T>(fn, a, b, w, s, model, what),
                      division ? zorStsDivByZero : zorStsNoErr);
}

TEST_P(Sfs, Every8uPairSampled16bitPairs) {
    std::vector<Zor8u> a, b;
    all_8u_pairs(a, b);
    pairs_at_scales(zoriMul_8u_C1RSfs, mul_model<Zor8u>, a, b, -10, 20, false, "mul");
    pairs_at_scales(zoriDiv_8u_C1RSfs, div_model<Zor8u>, a, b, -18, 11, true, "div");
    std::vector<Zor16u> ua, ub;
    sampled_pairs(ua, ub, 11);
    pairs_at_scales(zoriMul_16u_C1RSfs, mul_model<Zor16u>, ua, ub, -20, 36, false, "mul");
    pairs_at_scales(zoriDiv_16u_C1RSfs, div_model<Zor16u>, ua, ub, -35, 20, true, "div");
    std::vector<Zor16s> sa, sb;
    sampled_pairs(sa, sb, 12);
    pairs_at_scales(zoriMul_16s_C1RSfs, mul_model<Zor16s>, sa, sb, -20, 34, false, "mul");
    pairs_at_scales(zoriDiv_16s_C1RSfs, div_model<Zor16s>, sa, sb, -34, 19, true, "div");
}

// ---- guarded geometries -----------------------------------------------------------

// Every layout of the sweep, the scale stepping through lo..hi so that
// each rounding and saturation rule meets odd widths and steps.
template <typename T, typename Model>
void check_geometries(SfsFn<T> fn, Model model, bool division, int lo, int hi, StepRule rule,
                      uint64_t seed) {
    Rng r(seed);
    size_t turn = 0;
    const int32_t e = (int32_t)sizeof(T);
    for (ZoriSize g : geometries()) {
        const std::vector<int32_t> steps = steps_for(g.width * e, e, rule);
        for (size_t k = 0; k < steps.size(); ++k, ++turn) {
            const int s = lo + (int)(turn * 7 % (size_t)(hi - lo + 1));
            const int32_t st[3] = {steps[k], steps[(k + 1) % steps.size()], steps[(k + 2) % steps.size()]};
            Image<T> a = image<T>(g.width, g.height, st[0], misalign(e, false, k));
            Image<T> b = image<T>(g.width, g.height, st[1], misalign(e, false, k + 1));
            Image<T> d = image<T>(g.width, g.height, st[2], misalign(e, false, k + 2));
            // Small values now and then, so that every rule sees both.
            const bool small = turn % 3 == 0;
            a.fill([&](int32_t, int32_t) { return small ? r.below(4) : r.next(); });
            b.fill([&](int32_t, int32_t) { return small ? r.below(40) : r.next(); });
            Image<T> want = d;
            bool zero = false;
            for (int32_t y = 0; y < g.height; ++y)
                for (int32_t x = 0; x < g.width; ++x) {
                    want.set(x, y, (T)model(a.get(x, y), b.get(x, y), s));
                    zero |= a.get(x, y) == 0;
                }
            const ZorStatus st0 = fn(a.ptr(), st[0], b.ptr(), st[1], d.ptr(), st[2], g, s);
            ASSERT_TRUE(same_bytes(d, want)) << "scale " << s << " steps " << st[0] << " " << st[2];
            ASSERT_EQ(st0, division && zero ? zorStsDivByZero : zorStsNoErr) << "scale " << s;
        }
    }
}

TEST_P(Sfs, GuardedGeometries) {
    check_geometries<Zor8u>(zoriMul_8u_C1RSfs, mul_model<Zor8u>, false, -8, 17, kFree, 21);
    check_geometries<Zor16u>(zoriMul_16u_C1RSfs, mul_model<Zor16u>, false, -16, 33, kFree, 22);
    check_geometries<Zor16s>(zoriMul_16s_C1RSfs, mul_model<Zor16s>, false, -15, 31, kFree, 23);
    check_geometries<Zor8u>(zoriDiv_8u_C1RSfs, div_model<Zor8u>, true, -16, 9, kPositive, 24);
    check_geometries<Zor16u>(zoriDiv_16u_C1RSfs, div_model<Zor16u>, true, -32, 17, kFree, 25);
    check_geometries<Zor16s>(zoriDiv_16s_C1RSfs, div_model<Zor16s>, true, -31, 16, kPositive, 26);
}

// Pointers, ROI, then steps where the operation tests them (the divisions
// of 8u and 16s); nothing written on an error.
template <typename T> void check_order(SfsFn<T> fn, bool stepTest) {
    static const T src[8] = {1, 1, 1, 1, 1, 1, 1, 1};
    T dst[8] = {7, 7, 7, 7, 7, 7, 7, 7};
    T* const d = dst;
    const int32_t row = 2 * (int32_t)sizeof(T);
    std::vector<CheckRow> rows = {
        {zorStsNullPtrErr, "src1", [=] { return fn(nullptr, row, src, row, d, row, {0, 0}, 1); }},
        {zorStsNullPtrErr, "src2", [=] { return fn(src, row, nullptr, row, d, row, {2, 1}, 1); }},
        {zorStsNullPtrErr, "dst", [=] { return fn(src, row, src, row, nullptr, row, {2, 1}, 1); }},
        {zorStsSizeErr, "width", [=] { return fn(src, 0, src, 0, d, 0, {0, 1}, 1); }},
        {zorStsSizeErr, "height", [=] { return fn(src, -1, src, -1, d, -1, {2, -1}, 1); }},
    };
    if (stepTest)
        for (int k = 0; k < 3; ++k)
            rows.push_back({zorStsStepErr, "step", [=] {
                                return fn(src, k == 0 ? 0 : row, src, k == 1 ? -row : row, d,
                                          k == 2 ? 0 : row, {2, 1}, 1);
                            }});
    run_checks(rows, [&] { return std::all_of(dst, dst + 8, [](T v) { return v == 7; }); });
}

TEST_P(Sfs, ChecksInOrder) {
    check_order<Zor8u>(zoriMul_8u_C1RSfs, false);
    check_order<Zor16u>(zoriMul_16u_C1RSfs, false);
    check_order<Zor16s>(zoriMul_16s_C1RSfs, false);
    check_order<Zor8u>(zoriDiv_8u_C1RSfs, true);
    check_order<Zor16u>(zoriDiv_16u_C1RSfs, false);
    check_order<Zor16s>(zoriDiv_16s_C1RSfs, true);
}

ZOR_INSTANTIATE_LEVELS(Sfs);

}  // namespace
