// The level-private fills, copies and division rows of every level.
#include <math.h>

#include "sweep.h"
#include "zorinternal.h"

namespace {

using namespace arithtest;

using ArithInternal = zortest::LevelTest;

// Fill and copy of each element width against the plain definition, with
// the checks (pointers, then ROI; no step test) after.
template <typename T, typename Fill, typename Copy>
void check_fill_copy(Fill fill, Copy copy, T value, uint64_t seed) {
    Rng r(seed);
    const int32_t e = (int32_t)sizeof(T);
    size_t turn = 0;
    for (ZoriSize g : geometries()) {
        const std::vector<int32_t> steps = steps_for(g.width * e, e, kFree);
        for (size_t k = 0; k < steps.size(); ++k, ++turn) {
            const int32_t ds = steps[(k + 1) % steps.size()];
            Image<T> src = image<T>(g.width, g.height, steps[k], misalign(e, true, turn));
            Image<T> dst = image<T>(g.width, g.height, ds, misalign(e, true, turn + 1));
            src.randomize(r);
            Image<T> want = dst, filled = dst;
            for (int32_t y = 0; y < g.height; ++y)
                for (int32_t x = 0; x < g.width; ++x) want.set(x, y, src.get(x, y));
            ASSERT_EQ(copy(src.ptr(), steps[k], dst.ptr(), ds, g), zorStsNoErr);
            ASSERT_TRUE(same_bytes(dst, want));
            want.fill([&](int32_t, int32_t) { return value; });
            ASSERT_EQ(fill(value, filled.ptr(), ds, g), zorStsNoErr);
            ASSERT_TRUE(same_bytes(filled, want));
        }
    }
    T a[2] = {1, 2}, b[2] = {5, 5};
    run_checks({{zorStsNullPtrErr, "fill", [&] { return fill(value, nullptr, 2, {0, 0}); }},
                {zorStsSizeErr, "fill", [&] { return fill(value, b, 2, {0, 1}); }},
                {zorStsNullPtrErr, "copy", [&] { return copy(nullptr, 2, b, 2, {0, 0}); }},
                {zorStsNullPtrErr, "copy", [&] { return copy(a, 2, nullptr, 2, {1, 1}); }},
                {zorStsSizeErr, "copy", [&] { return copy(a, 2, b, 2, {1, 0}); }}},
               [&] { return b[0] == 5 && b[1] == 5; });
}

TEST_P(ArithInternal, FillAndCopyEveryWidth) {
    ASSERT_NO_FATAL_FAILURE(check_fill_copy<Zor8u>(ZOR_BODY(zoriSet_8u_C1R), ZOR_BODY(zoriCopy_8u_C1R),
                                                   (Zor8u)0xa5, 1));
    ASSERT_NO_FATAL_FAILURE(check_fill_copy<Zor16s>(ZOR_BODY(zoriSet_16s_C1R),
                                                    ZOR_BODY(zoriCopy_16s_C1R), (Zor16s)-12345, 2));
}

// The row forms: dst = src2 / src1 over len elements, status 2 on a zero
// divisor, -8 and -6 on bad arguments.
template <typename T>
int64_t div_model(int64_t n, int64_t d, int s, int lo, int hi) {
    const int64_t top = std::numeric_limits<T>::max(), low = std::numeric_limits<T>::min();
    if (d == 0) return n > 0 ? top : n < 0 ? low : 0;
    if (n == 0) return 0;
    if (s < lo) return (n > 0) == (d > 0) ? top : low;
    if (s > hi) return 0;
    const float q = nearbyintf(((float)n * ldexpf(1.0f, -s)) / (float)d);
    return q >= (float)top ? top : q <= (float)low ? low : (int64_t)q;
}

template <typename T, typename Row>
void check_div_row(Row row, int lo, int hi, uint64_t seed) {
    Rng r(seed);
    for (int32_t len : {1, 7, 15, 16, 17, 31, 33, 64, 70, 129}) {
        for (int s = lo - 2; s <= hi + 2; ++s) {
            std::vector<T> a((size_t)len), b((size_t)len), d((size_t)len + 2, (T)99);
            bool zero = false;
            for (int32_t i = 0; i < len; ++i) {
                a[(size_t)i] = (T)(r.below(8) == 0 ? 0 : r.next() & (r.below(2) ? 0xff : 0xffff));
                b[(size_t)i] = (T)(r.next() & (r.below(2) ? 0xff : 0xffff));
                zero |= a[(size_t)i] == 0;
            }
            ASSERT_EQ(row(a.data(), b.data(), d.data() + 1, len, s),
                      zero ? zorStsDivByZero : zorStsNoErr);
            ASSERT_EQ(d[0], (T)99);
            ASSERT_EQ(d[(size_t)len + 1], (T)99);
            for (int32_t i = 0; i < len; ++i)
                ASSERT_EQ(d[(size_t)i + 1],
                          (T)div_model<T>(b[(size_t)i], a[(size_t)i], s, lo, hi))
                    << "len " << len << " scale " << s << " at " << i;
        }
    }
    T a[1] = {1}, d[1] = {9};
    EXPECT_EQ(row(nullptr, a, d, 1, 0), zorStsNullPtrErr);
    EXPECT_EQ(row(a, nullptr, d, 1, 0), zorStsNullPtrErr);
    EXPECT_EQ(row(a, a, nullptr, 1, 0), zorStsNullPtrErr);
    EXPECT_EQ(row(a, a, d, 0, 0), zorStsSizeErr);
    EXPECT_EQ(row(a, a, d, -1, 0), zorStsSizeErr);
    EXPECT_EQ(d[0], 9);
}

TEST_P(ArithInternal, DivisionRows) {
    ASSERT_NO_FATAL_FAILURE(check_div_row<Zor8u>(ZOR_BODY(zorsDiv_8u_Sfs), -15, 8, 5));
    ASSERT_NO_FATAL_FAILURE(check_div_row<Zor16s>(ZOR_BODY(zorsDiv_16s_Sfs), -30, 15, 6));
}

ZOR_INSTANTIATE_LEVELS(ArithInternal);

}  // namespace
