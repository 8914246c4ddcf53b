// The level-private fills, copies and division rows of every level.
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

// The division row forms are swept through the public image divisions;
// only their own argument checks are out of that sweep's reach.
template <typename T, typename Row> void check_div_row(Row row) {
    T a[1] = {1}, d[1] = {9};
    run_checks({{zorStsNullPtrErr, "src1", [&] { return row(nullptr, a, d, 0, 0); }},
                {zorStsNullPtrErr, "src2", [&] { return row(a, nullptr, d, 0, 0); }},
                {zorStsNullPtrErr, "dst", [&] { return row(a, a, nullptr, 0, 0); }},
                {zorStsSizeErr, "len 0", [&] { return row(a, a, d, 0, 0); }},
                {zorStsSizeErr, "len -1", [&] { return row(a, a, d, -1, 0); }}},
               [&] { return d[0] == 9; });
}

TEST_P(ArithInternal, DivisionRowChecks) {
    check_div_row<Zor8u>(ZOR_BODY(zorsDiv_8u_Sfs));
    check_div_row<Zor16s>(ZOR_BODY(zorsDiv_16s_Sfs));
}

ZOR_INSTANTIATE_LEVELS(ArithInternal);

}  // namespace
