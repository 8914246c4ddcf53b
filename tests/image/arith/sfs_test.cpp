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

// ---- one sweep per operation ----------------------------------------------------

// Edge values of the type crossed with each other (all 256 x 256 for
// 8u), then random pairs, small magnitudes as often as large ones so that
// quotients are not all 0.
template <typename T> void pairs_of(std::vector<T>& a, std::vector<T>& b) {
    std::vector<int64_t> edges = {0, 1, 2, 3, 5, 127, 128, 181, 182, 255, 256, 257, 4095, 4096, 32767};
    if (sizeof(T) == 1) {
        edges.clear();
        for (int v = 0; v < 256; ++v) edges.push_back(v);
    } else if (std::numeric_limits<T>::is_signed) {
        for (int64_t v : {-1, -2, -3, -181, -182, -256, -32767, -32768}) edges.push_back(v);
    } else {
        for (int64_t v : {32768, 46340, 46341, 65534, 65535}) edges.push_back(v);
    }
    for (int64_t x : edges)
        for (int64_t y : edges) {
            a.push_back((T)x);
            b.push_back((T)y);
        }
    Rng r(sizeof(T) + std::numeric_limits<T>::is_signed);
    for (int k = 0; k < (sizeof(T) == 1 ? 0 : 6000); ++k) {
        a.push_back((T)(r.next() & (r.below(3) ? 0xffff : 0xff)));
        b.push_back((T)(r.next() & (r.below(3) ? 0xffff : 0xff)));
    }
}

// Every pair at every scale from lo to hi and far beyond, in rows of two
// widths; then every layout of the sweep with pixels drawn from the pairs'
// values and the scale stepping through lo..hi. The pairs hold zero
// divisors, so every division of them reports status 2.
template <typename T, typename Model>
void sweep(SfsFn<T> fn, Model model, int lo, int hi, bool division, StepRule rule) {
    std::vector<T> pa, pb;
    pairs_of(pa, pb);
    std::vector<int> scales = {INT_MIN, -1000, 1000, INT_MAX};
    for (int s = lo; s <= hi; ++s) scales.push_back(s);
    for (int s : scales)
        for (int32_t w : {sizeof(T) == 1 ? 256 : 64, sizeof(T) == 1 ? 7 : 5}) {
            const int32_t h = (int32_t)((pa.size() + (size_t)w - 1) / (size_t)w);
            auto from = [&](const std::vector<T>& p) {
                return [&p, w](int32_t x, int32_t y) {
                    const size_t k = (size_t)y * w + x;
                    return k < p.size() ? p[k] : T(1);
                };
            };
            Image<T> a(w, h), b(w, h), d(w, h);
            a.fill(from(pa));
            b.fill(from(pb));
            Image<T> want = d;
            for (int32_t y = 0; y < h; ++y)
                for (int32_t x = 0; x < w; ++x) want.set(x, y, (T)model(a.get(x, y), b.get(x, y), s));
            ASSERT_EQ(fn(a.ptr(), a.step, b.ptr(), b.step, d.ptr(), d.step, {w, h}, s),
                      division ? zorStsDivByZero : zorStsNoErr);
            ASSERT_TRUE(same_bytes(d, want)) << "scale " << s << " width " << w;
        }
    Rng r(lo + 100);
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
            a.fill([&](int32_t, int32_t) { return pa[r.below((uint32_t)pa.size())]; });
            b.fill([&](int32_t, int32_t) { return pb[r.below((uint32_t)pb.size())]; });
            Image<T> want = d;
            bool zero = false;
            for (int32_t y = 0; y < g.height; ++y)
                for (int32_t x = 0; x < g.width; ++x) {
                    want.set(x, y, (T)model(a.get(x, y), b.get(x, y), s));
                    zero |= a.get(x, y) == 0;
                }
            ASSERT_EQ(fn(a.ptr(), st[0], b.ptr(), st[1], d.ptr(), st[2], g, s),
                      division && zero ? zorStsDivByZero : zorStsNoErr) << "scale " << s;
            ASSERT_TRUE(same_bytes(d, want)) << "scale " << s << " steps " << st[0] << " " << st[2];
        }
    }
}

using Sfs = zortest::LevelTest;

TEST_P(Sfs, EveryOperationAgainstItsModel) {
    ASSERT_NO_FATAL_FAILURE(sweep<Zor8u>(zoriMul_8u_C1RSfs, mul_model<Zor8u>, -10, 20, false, kFree));
    ASSERT_NO_FATAL_FAILURE(sweep<Zor8u>(zoriDiv_8u_C1RSfs, div_model<Zor8u>, -18, 11, true, kPositive));
    ASSERT_NO_FATAL_FAILURE(sweep<Zor16u>(zoriMul_16u_C1RSfs, mul_model<Zor16u>, -20, 36, false, kFree));
    ASSERT_NO_FATAL_FAILURE(sweep<Zor16u>(zoriDiv_16u_C1RSfs, div_model<Zor16u>, -35, 20, true, kFree));
    ASSERT_NO_FATAL_FAILURE(sweep<Zor16s>(zoriMul_16s_C1RSfs, mul_model<Zor16s>, -20, 34, false, kFree));
    ASSERT_NO_FATAL_FAILURE(sweep<Zor16s>(zoriDiv_16s_C1RSfs, div_model<Zor16s>, -34, 19, true, kPositive));
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
