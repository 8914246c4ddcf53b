// Comparison, thresholds, extremes, Not, Set and the copies through the
// public stubs on every level, against scalar models written from the
// operations' definitions.
#include <sys/mman.h>
#include <unistd.h>

#include <functional>

#include "arith_harness.h"
#include "zortest.h"

namespace {

using namespace arithtest;

// ---- a generic run: one source image, one destination ---------------------

template <typename S, typename D>
using UnaryCall = std::function<ZorStatus(const S*, int32_t, D*, int32_t, ZoriSize)>;

// Every geometry with several pairs of steps (all of them, or one per
// geometry in turn when light); the source from gen, the expected
// destination from model, the whole destination buffer compared.
template <typename S, typename D>
void check_unary(const UnaryCall<S, D>& call, const std::function<D(S)>& model,
                 const std::function<S(Rng&)>& gen, bool negative, bool odd, uint64_t seed,
                 bool light = false) {
    Rng r(seed);
    size_t turn = seed;
    for (const Geometry& g : geometries()) {
        const std::vector<int32_t> ss = steps_for(g.w * (int32_t)sizeof(S), sizeof(S), negative, odd);
        const std::vector<int32_t> ds = steps_for(g.w * (int32_t)sizeof(D), sizeof(D), negative, odd);
        const std::vector<size_t> ms = misaligns(sizeof(S), false);
        for (size_t k = light ? turn++ % (2 * ss.size()) : 0; k < 2 * ss.size(); ++k) {
            const int32_t sstep = ss[k % ss.size()];
            const int32_t dstep = k < ss.size() ? ds[k] : ds[(k + (size_t)g.w) % ds.size()];
            Plane src(g.w, g.h, sizeof(S), sstep, ms[(k + (size_t)g.w) % ms.size()], r);
            Plane dst(g.w, g.h, sizeof(D), dstep, ms[(k + 1) % ms.size()], r);
            for (int32_t y = 0; y < g.h; ++y)
                for (int32_t x = 0; x < g.w; ++x) src.put<S>(x, y, gen(r));
            Plane want = dst;
            for (int32_t y = 0; y < g.h; ++y)
                for (int32_t x = 0; x < g.w; ++x) want.put<D>(x, y, model(src.get<S>(x, y)));
            ASSERT_EQ(call(src.ptr<S>(), sstep, dst.ptr<D>(), dstep, {g.w, g.h}), zorStsNoErr)
                << where(dst);
            ASSERT_TRUE(same_bytes(dst.mem, want.mem, dst));
            if (light) break;
        }
    }
}

// The check order of a one-source operation: every pointer null, every ROI
// side below 1, and (where tested) every step below 1, in the given order;
// nothing written on any of them.
struct OrderCase {
    bool nullSrc, nullDst;
    ZoriSize roi;
    int32_t srcStep, dstStep;
    ZorStatus expect;
};

template <typename S, typename D>
void check_order(const UnaryCall<S, D>& call, const std::vector<OrderCase>& cases) {
    S src[8] = {};
    D dst[8];
    memset(dst, 0x5a, sizeof dst);
    for (const OrderCase& c : cases) {
        EXPECT_EQ(call(c.nullSrc ? nullptr : src, c.srcStep, c.nullDst ? nullptr : dst, c.dstStep,
                       c.roi),
                  c.expect)
            << "null " << c.nullSrc << c.nullDst << " roi " << c.roi.width << "x" << c.roi.height
            << " steps " << c.srcStep << "," << c.dstStep;
        if (c.expect < 0)
            for (size_t i = 0; i < sizeof dst; ++i) ASSERT_EQ(((uint8_t*)dst)[i], 0x5a);
        memset(dst, 0x5a, sizeof dst);
    }
}

// Pointers, then ROI, then steps (the usual order).
std::vector<OrderCase> usual_order(int32_t row) {
    return {
        {true, false, {0, 0}, 0, 0, zorStsNullPtrErr},
        {false, true, {1, 1}, row, row, zorStsNullPtrErr},
        {false, false, {0, 1}, 0, 0, zorStsSizeErr},
        {false, false, {1, 0}, -4, -4, zorStsSizeErr},
        {false, false, {-3, 1}, row, row, zorStsSizeErr},
        {false, false, {1, 1}, 0, row, zorStsStepErr},
        {false, false, {1, 1}, row, -1, zorStsStepErr},
        {false, false, {2, 1}, 1, 1, zorStsNoErr},
    };
}

// Pointers, then steps, then ROI.
std::vector<OrderCase> steps_first_order(int32_t row) {
    return {
        {true, true, {0, 0}, 0, 0, zorStsNullPtrErr},
        {false, true, {1, 1}, row, row, zorStsNullPtrErr},
        {false, false, {0, 0}, 0, 0, zorStsStepErr},
        {false, false, {0, 1}, row, -row, zorStsStepErr},
        {false, false, {0, 1}, row, row, zorStsSizeErr},
        {false, false, {1, -1}, row, row, zorStsSizeErr},
        {false, false, {2, 1}, 1, 1, zorStsNoErr},
    };
}

// Pointers and ROI only: zero and negative steps run.
std::vector<OrderCase> no_step_order() {
    return {
        {true, false, {0, 0}, 0, 0, zorStsNullPtrErr},
        {false, true, {1, 1}, 4, 4, zorStsNullPtrErr},
        {false, false, {0, 1}, 4, 4, zorStsSizeErr},
        {false, false, {1, 0}, 4, 4, zorStsSizeErr},
        {false, false, {1, 2}, 0, 0, zorStsNoErr},
    };
}

using Select = zortest::LevelTest;

// ---- CompareC ---------------------------------------------------------------

TEST_P(Select, CompareCMatchesOrderedComparisons) {
    const float values[] = {0.0f, -0.0f, 1.0f, -2.25f, bits_f(0x7f800000u), bits_f(0x7fc00000u)};
    for (int op = 0; op <= 4; ++op) {
        for (float v : values) {
            const std::function<Zor8u(Zor32f)> model = [op, v](Zor32f s) -> Zor8u {
                if (s != s || v != v) return 0;
                const bool r = op == 0 ? s < v : op == 1 ? s <= v : op == 2 ? s == v
                                                  : op == 3 ? s >= v : s > v;
                return r ? 255 : 0;
            };
            const UnaryCall<Zor32f, Zor8u> call = [op, v](const Zor32f* s, int32_t ss, Zor8u* d,
                                                          int32_t ds, ZoriSize roi) {
                return zoriCompareC_32f_C1R(s, ss, d, ds, roi, op, v);
            };
            ASSERT_NO_FATAL_FAILURE((
                check_unary<Zor32f, Zor8u>(call, model, random_float, false, false, op * 7 + 1, true)))
                << "op " << op << " value " << v;
        }
    }
}

TEST_P(Select, CompareCChecksStepsBeforeRoiAndIgnoresUnknownSelectors) {
    for (int32_t op : {0, 4, 5, -1}) {
        const UnaryCall<Zor32f, Zor8u> call = [op](const Zor32f* s, int32_t ss, Zor8u* d,
                                                   int32_t ds, ZoriSize roi) {
            return zoriCompareC_32f_C1R(s, ss, d, ds, roi, op, 1.0f);
        };
        check_order<Zor32f, Zor8u>(call, steps_first_order(8));
    }
    // Selectors above 4 read as unsigned: success, destination untouched.
    const Zor32f src[4] = {1, 2, 3, 4};
    for (int32_t op : {5, 6, 1000, -1, (int32_t)0x80000000}) {
        Zor8u dst[4] = {9, 9, 9, 9};
        EXPECT_EQ(zoriCompareC_32f_C1R(src, 16, dst, 4, {4, 1}, op, 2.0f), zorStsNoErr);
        for (Zor8u b : dst) EXPECT_EQ(b, 9) << "selector " << op;
    }
}

// ---- thresholds ---------------------------------------------------------------

// The processor's minimum and maximum: the first operand if the comparison
// holds, else the second (so NaN in either gives the second, and of two
// zeros the second).
float proc_min(float a, float b) { return a < b ? a : b; }
float proc_max(float a, float b) { return a > b ? a : b; }

TEST_P(Select, ThresholdsClipAndReplaceLikeTheModel) {
    const float thresholds[] = {0.0f, -0.0f, 1.5f, -3.0f, bits_f(0x7fc00000u),
                                bits_f(0xff800000u)};
    const float value = bits_f(0x7f800001u);  // a signalling NaN must arrive as given
    uint64_t seed = 100;
    for (float t : thresholds) {
        for (int form = 0; form < 4; ++form) {
            std::function<Zor32f(Zor32f)> model;
            UnaryCall<Zor32f, Zor32f> call;
            switch (form) {
            case 0:
                model = [t](Zor32f s) { return proc_min(s, t); };
                call = [t](const Zor32f* s, int32_t ss, Zor32f* d, int32_t ds, ZoriSize roi) {
                    return zoriThreshold_GT_32f_C1R(s, ss, d, ds, roi, t);
                };
                break;
            case 1:
                model = [t](Zor32f s) { return proc_max(s, t); };
                call = [t](const Zor32f* s, int32_t ss, Zor32f* d, int32_t ds, ZoriSize roi) {
                    return zoriThreshold_LT_32f_C1R(s, ss, d, ds, roi, t);
                };
                break;
            case 2:
                model = [t, value](Zor32f s) { return t < s ? value : s; };
                call = [t, value](const Zor32f* s, int32_t ss, Zor32f* d, int32_t ds,
                                  ZoriSize roi) {
                    return zoriThreshold_GTVal_32f_C1R(s, ss, d, ds, roi, t, value);
                };
                break;
            default:
                model = [t, value](Zor32f s) { return s < t ? value : s; };
                call = [t, value](const Zor32f* s, int32_t ss, Zor32f* d, int32_t ds,
                                  ZoriSize roi) {
                    return zoriThreshold_LTVal_32f_C1R(s, ss, d, ds, roi, t, value);
                };
                break;
            }
            // Models return bit patterns through memcpy: compare as bits.
            const std::function<Zor32f(Zor32f)> exact = [model](Zor32f s) { return model(s); };
            ASSERT_NO_FATAL_FAILURE((
                check_unary<Zor32f, Zor32f>(call, exact, random_float, false, false, ++seed, true)))
                << "form " << form << " threshold " << t;
        }
    }
}

TEST_P(Select, ThresholdChecksInOrder) {
    const std::vector<UnaryCall<Zor32f, Zor32f>> calls = {
        [](const Zor32f* s, int32_t ss, Zor32f* d, int32_t ds, ZoriSize roi) {
            return zoriThreshold_GT_32f_C1R(s, ss, d, ds, roi, 1.0f);
        },
        [](const Zor32f* s, int32_t ss, Zor32f* d, int32_t ds, ZoriSize roi) {
            return zoriThreshold_LT_32f_C1R(s, ss, d, ds, roi, 1.0f);
        },
        [](const Zor32f* s, int32_t ss, Zor32f* d, int32_t ds, ZoriSize roi) {
            return zoriThreshold_GTVal_32f_C1R(s, ss, d, ds, roi, 1.0f, 2.0f);
        },
        [](const Zor32f* s, int32_t ss, Zor32f* d, int32_t ds, ZoriSize roi) {
            return zoriThreshold_LTVal_32f_C1R(s, ss, d, ds, roi, 1.0f, 2.0f);
        },
    };
    for (const auto& call : calls) check_order<Zor32f, Zor32f>(call, usual_order(16));
}

// ---- MinMax ---------------------------------------------------------------------

// Sixteen lanes; pixel x of each row goes to lane x mod 16; a row's last
// partial block brings the start constants into the lanes it does not
// reach; the lanes fold in order. Accumulator first in every step.
void minmax_model(Plane& p, float* mn, float* mx) {
    float lo[16], hi[16];
    for (int k = 0; k < 16; ++k) {
        lo[k] = bits_f(0x7f7fffffu);
        hi[k] = bits_f(0xff7fffffu);
    }
    const int32_t padded = (p.w + 15) / 16 * 16;
    for (int32_t y = 0; y < p.h; ++y) {
        for (int32_t x = 0; x < padded; ++x) {
            const float a = x < p.w ? p.get<float>(x, y) : bits_f(0x7f7fffffu);
            const float b = x < p.w ? p.get<float>(x, y) : bits_f(0xff7fffffu);
            lo[x % 16] = proc_min(lo[x % 16], a);
            hi[x % 16] = proc_max(hi[x % 16], b);
        }
    }
    *mn = lo[0];
    *mx = hi[0];
    for (int k = 1; k < 16; ++k) {
        *mn = proc_min(*mn, lo[k]);
        *mx = proc_max(*mx, hi[k]);
    }
}

TEST_P(Select, MinMaxMatchesTheLaneModel) {
    Rng r(77);
    for (const Geometry& g : geometries()) {
        for (int32_t step : steps_for(g.w * 4, 4, true, true)) {
            for (int nanRate : {0, 1}) {
                Plane src(g.w, g.h, 4, step, misaligns(4, false)[r.below(4)], r);
                for (int32_t y = 0; y < g.h; ++y)
                    for (int32_t x = 0; x < g.w; ++x) {
                        float v = (float)((int)r.below(2001) - 1000) / 8.0f;
                        if (nanRate && r.below(9) == 0) v = bits_f(0x7fc00000u + r.below(5));
                        if (r.below(40) == 0) v = bits_f(r.below(2) ? 0x7f800000u : 0xff800000u);
                        src.put<float>(x, y, v);
                    }
                const std::vector<uint8_t> before = src.mem;
                float mn = 0, mx = 0, wantMin, wantMax;
                minmax_model(src, &wantMin, &wantMax);
                ASSERT_EQ(zoriMinMax_32f_C1R(src.ptr<Zor32f>(), step, {g.w, g.h}, &mn, &mx),
                          zorStsNoErr);
                ASSERT_EQ(f_bits(mn), f_bits(wantMin)) << where(src);
                ASSERT_EQ(f_bits(mx), f_bits(wantMax)) << where(src);
                ASSERT_EQ(src.mem, before);
            }
        }
    }
}

TEST_P(Select, MinMaxStartConstantsAndSpecialImages) {
    struct Case {
        uint32_t fill;
        int32_t w;
        uint32_t wantMin, wantMax;
    } cases[] = {
        {0x40e00000u, 1, 0x40e00000u, 0x40e00000u},   // one pixel of 7
        {0x7f800000u, 1, 0x7f7fffffu, 0x7f800000u},   // +inf: the minimum stays FLT_MAX
        {0xff800000u, 1, 0xff800000u, 0xff7fffffu},   // -inf: the maximum stays -FLT_MAX
        {0x7f800000u, 50, 0x7f7fffffu, 0x7f800000u},
        {0xff800000u, 64, 0xff800000u, 0xff7fffffu},
        {0x80000000u, 16, 0x80000000u, 0x80000000u},  // -0 everywhere
        {0x7f7fffffu, 3, 0x7f7fffffu, 0x7f7fffffu},
    };
    for (const Case& c : cases) {
        std::vector<Zor32f> img((size_t)c.w * 2, bits_f(c.fill));
        float mn, mx;
        ASSERT_EQ(zoriMinMax_32f_C1R(img.data(), c.w * 4, {c.w, 2}, &mn, &mx), zorStsNoErr);
        EXPECT_EQ(f_bits(mn), c.wantMin) << std::hex << c.fill << " width " << std::dec << c.w;
        EXPECT_EQ(f_bits(mx), c.wantMax) << std::hex << c.fill << " width " << std::dec << c.w;
    }
}

TEST_P(Select, MinMaxChecksPointersThenRoi) {
    Zor32f src[4] = {1, 2, 3, 4};
    float mn = 9, mx = 9;
    EXPECT_EQ(zoriMinMax_32f_C1R(nullptr, 16, {0, 0}, &mn, &mx), zorStsNullPtrErr);
    EXPECT_EQ(zoriMinMax_32f_C1R(src, 16, {1, 1}, nullptr, &mx), zorStsNullPtrErr);
    EXPECT_EQ(zoriMinMax_32f_C1R(src, 16, {1, 1}, &mn, nullptr), zorStsNullPtrErr);
    EXPECT_EQ(zoriMinMax_32f_C1R(src, 16, {0, 1}, &mn, &mx), zorStsSizeErr);
    EXPECT_EQ(zoriMinMax_32f_C1R(src, 16, {1, 0}, &mn, &mx), zorStsSizeErr);
    EXPECT_EQ(mn, 9.0f);
    EXPECT_EQ(mx, 9.0f);
    // No step test: a zero step reads the first row again.
    EXPECT_EQ(zoriMinMax_32f_C1R(src, 0, {2, 3}, &mn, &mx), zorStsNoErr);
    EXPECT_EQ(mn, 1.0f);
    EXPECT_EQ(mx, 2.0f);
}

// ---- Not, Set, Copy ------------------------------------------------------------

Zor8u random_byte(Rng& r) { return (Zor8u)r.next(); }
Zor16u random_word(Rng& r) { return (Zor16u)r.next(); }
Zor32f random_bits(Rng& r) { return bits_f(r.next() ^ (r.next() << 11)); }

TEST_P(Select, NotInvertsEveryBit) {
    const UnaryCall<Zor8u, Zor8u> call = zoriNot_8u_C1R;
    ASSERT_NO_FATAL_FAILURE((check_unary<Zor8u, Zor8u>(
        call, [](Zor8u s) { return (Zor8u)~s; }, random_byte, false, true, 5)));
    check_order<Zor8u, Zor8u>(call, steps_first_order(2));
}

TEST_P(Select, CopiesMoveBitsUnchanged) {
    const UnaryCall<Zor16u, Zor16u> c16 = zoriCopy_16u_C1R;
    ASSERT_NO_FATAL_FAILURE((check_unary<Zor16u, Zor16u>(
        c16, [](Zor16u s) { return s; }, random_word, true, true, 6)));
    check_order<Zor16u, Zor16u>(c16, no_step_order());
    // Float copies keep NaN payloads: compared as bytes.
    const UnaryCall<Zor32f, Zor32f> c32 = zoriCopy_32f_C1R;
    ASSERT_NO_FATAL_FAILURE((check_unary<Zor32f, Zor32f>(
        c32, [](Zor32f s) { return s; }, random_bits, true, true, 7)));
    check_order<Zor32f, Zor32f>(c32, no_step_order());
}

// Images of a megabyte and more take the copy's large-image loop, merged
// and row by row.
TEST_P(Select, LargeCopiesAndFills) {
    Rng r(8);
    for (int32_t pad : {0, 20}) {
        const ZoriSize roi = {700, 400};
        const int32_t step = roi.width * 4 + pad;
        Plane src(roi.width, roi.height, 4, step, 4, r);
        for (int32_t dstep : {step + 4, step}) {  // row by row, and merged when unpadded
            Plane dst(roi.width, roi.height, 4, dstep, dstep == step ? 0 : 8, r);
            Plane want = dst;
            for (int32_t y = 0; y < roi.height; ++y)
                memcpy(want.at(0, y), src.at(0, y), (size_t)roi.width * 4);
            ASSERT_EQ(zoriCopy_32f_C1R(src.ptr<Zor32f>(), step, dst.ptr<Zor32f>(), dstep, roi),
                      zorStsNoErr);
            ASSERT_TRUE(same_bytes(dst.mem, want.mem, dst));
        }
        // A fill above the size where the cache is asked.
        const float v = bits_f(0xffc01234u);
        Plane fill(roi.width, roi.height, 4, step, 12, r);
        Plane want3 = fill;
        for (int32_t y = 0; y < roi.height; ++y)
            for (int32_t x = 0; x < roi.width; ++x) want3.put<float>(x, y, v);
        ASSERT_EQ(zoriSet_32f_C1R(v, fill.ptr<Zor32f>(), step, roi), zorStsNoErr);
        ASSERT_TRUE(same_bytes(fill.mem, want3.mem, fill));
    }
}

TEST_P(Select, SetFillsEveryPixelWithTheValuesBits) {
    Rng r(9);
    for (uint32_t bits : {0x80000000u, 0x7f800001u, 0x3f8ccccdu}) {
        const float v = bits_f(bits);
        for (const Geometry& g : geometries()) {
            for (int32_t step : steps_for(g.w * 4, 4, true, true)) {
                Plane dst(g.w, g.h, 4, step, misaligns(4, false)[r.below(4)], r);
                Plane want = dst;
                for (int32_t y = 0; y < g.h; ++y)
                    for (int32_t x = 0; x < g.w; ++x) want.put<float>(x, y, v);
                ASSERT_EQ(zoriSet_32f_C1R(v, dst.ptr<Zor32f>(), step, {g.w, g.h}), zorStsNoErr);
                ASSERT_TRUE(same_bytes(dst.mem, want.mem, dst));
            }
        }
    }
    // A zero step fills the one row twice.
    Zor32f row[4] = {0, 0, 0, 9};
    EXPECT_EQ(zoriSet_32f_C1R(2.5f, row, 0, {3, 2}), zorStsNoErr);
    EXPECT_EQ(row[0], 2.5f);
    EXPECT_EQ(row[2], 2.5f);
    EXPECT_EQ(row[3], 9.0f);
    EXPECT_EQ(zoriSet_32f_C1R(1.0f, nullptr, 4, {0, 0}), zorStsNullPtrErr);
    EXPECT_EQ(zoriSet_32f_C1R(1.0f, row, 4, {0, 1}), zorStsSizeErr);
    EXPECT_EQ(zoriSet_32f_C1R(1.0f, row, 4, {1, -2}), zorStsSizeErr);
    EXPECT_EQ(row[0], 2.5f);
}

// ---- masked copy ------------------------------------------------------------------

TEST_P(Select, MaskedCopyWritesOnlySelectedPixels) {
    Rng r(10);
    for (const Geometry& g : geometries()) {
        const std::vector<int32_t> steps = steps_for(g.w * 4, 4, true, true);
        for (size_t k = 0; k < steps.size(); ++k) {
            for (int density : {0, 1, 2, 3}) {  // none, blocks, random, all
                const int32_t sstep = steps[k], dstep = steps[(k + 1) % steps.size()];
                const int32_t mstep = k % 2 ? g.w + 3 : -g.w;
                Plane src(g.w, g.h, 4, sstep, 0, r);
                Plane dst(g.w, g.h, 4, dstep, misaligns(4, true)[(k + (size_t)density) % 5], r);
                Plane mask(g.w, g.h, 1, mstep, 1, r);
                for (int32_t y = 0; y < g.h; ++y)
                    for (int32_t x = 0; x < g.w; ++x) {
                        Zor8u m = 0;
                        if (density == 1) m = (x / 16 + y) % 3 == 0 ? 0 : (x / 16 + y) % 3 == 1 ? 0x80 : (Zor8u)r.below(2);
                        if (density == 2) m = r.below(2) ? (Zor8u)(1 + r.below(255)) : 0;
                        if (density == 3) m = (Zor8u)(1 + r.below(255));
                        mask.put<Zor8u>(x, y, m);
                    }
                Plane want = dst;
                for (int32_t y = 0; y < g.h; ++y)
                    for (int32_t x = 0; x < g.w; ++x)
                        if (mask.get<Zor8u>(x, y)) memcpy(want.at(x, y), src.at(x, y), 4);
                ASSERT_EQ(zoriCopy_32f_C1MR(src.ptr<Zor32f>(), sstep, dst.ptr<Zor32f>(), dstep,
                                            {g.w, g.h}, mask.ptr<Zor8u>(), mstep),
                          zorStsNoErr);
                ASSERT_TRUE(same_bytes(dst.mem, want.mem, dst)) << "density " << density;
            }
        }
    }
}

// Clear blocks of 16 and clear single pixels are neither read nor written:
// they lie on a page that may not be touched at all.
TEST_P(Select, MaskedCopyLeavesClearBlocksAlone) {
    const size_t page = (size_t)sysconf(_SC_PAGESIZE);
    uint8_t* mem = (uint8_t*)mmap(nullptr, 4 * page, PROT_READ | PROT_WRITE,
                                  MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    ASSERT_NE(mem, MAP_FAILED);
    // Source on page 0 up to its end, destination likewise on page 2; pages
    // 1 and 3 are closed.
    ASSERT_EQ(mprotect(mem + page, page, PROT_NONE), 0);
    ASSERT_EQ(mprotect(mem + 3 * page, page, PROT_NONE), 0);
    for (int32_t head : {0, 1, 2, 3}) {       // pixels before a 16-byte boundary
        for (int32_t clear : {16, 19, 35}) {  // clear pixels at the end of the row
            const int32_t open = 16 + head;   // copied pixels before them
            const int32_t w = open + clear;
            // Destination pixel open starts the closed page, 16-byte aligned
            // after head single pixels.
            Zor32f* dst = (Zor32f*)(mem + 3 * page) - open;
            const Zor32f* src = (const Zor32f*)(mem + page) - open;
            for (int32_t x = 0; x < open; ++x) ((Zor32f*)src)[x] = (float)x + 0.5f;
            std::vector<Zor8u> mask((size_t)w, 0);
            for (int32_t x = 0; x < open; ++x) mask[(size_t)x] = 1;
            ASSERT_EQ(zoriCopy_32f_C1MR(src, w * 4, dst, w * 4, {w, 1}, mask.data(), w),
                      zorStsNoErr);
            for (int32_t x = 0; x < open; ++x) ASSERT_EQ(dst[x], (float)x + 0.5f);
        }
    }
    munmap(mem, 4 * page);
}

TEST_P(Select, MaskedCopyChecksPointersThenRoi) {
    Zor32f src[2] = {1, 2}, dst[2] = {7, 7};
    Zor8u mask[2] = {1, 1};
    EXPECT_EQ(zoriCopy_32f_C1MR(src, 8, dst, 8, {0, 0}, nullptr, 2), zorStsNullPtrErr);
    EXPECT_EQ(zoriCopy_32f_C1MR(nullptr, 8, dst, 8, {1, 1}, mask, 2), zorStsNullPtrErr);
    EXPECT_EQ(zoriCopy_32f_C1MR(src, 8, nullptr, 8, {1, 1}, mask, 2), zorStsNullPtrErr);
    EXPECT_EQ(zoriCopy_32f_C1MR(src, 8, dst, 8, {0, 1}, mask, 2), zorStsSizeErr);
    EXPECT_EQ(zoriCopy_32f_C1MR(src, 8, dst, 8, {2, 0}, mask, 2), zorStsSizeErr);
    EXPECT_EQ(dst[0], 7.0f);
}

ZOR_INSTANTIATE_LEVELS(Select);

}  // namespace
