// The unscaled point operations through the public stubs on every level:
// one scalar model per operation swept over sizes, steps and alignments
// with the destination compared whole, each level's own division, the
// extremes, and the argument checks in their order.
#include <immintrin.h>
#include <math.h>

#include <algorithm>
#include <functional>

#include "sweep.h"
#include "zortest.h"

namespace {

using namespace arithtest;

enum NanRule {
    kBits,       // bit for bit, NaN payloads included
    kAnyNan,     // where the model gives NaN, any NaN will do
    kClearSign,  // any NaN, but with its sign bit clear
};

// Up to two source images of S and an optional mask, one destination of D
// (read too: the masked forms keep or accumulate into it).
template <typename S, typename D> struct Op {
    const char* name;
    int sources;
    bool mask;
    StepRule rule;
    NanRule nan;
    bool stepsFirst;  // steps are tested before the ROI
    bool large;       // also run on images beyond the cache thresholds
    std::function<ZorStatus(const S* const*, const int32_t*, const Zor8u*, int32_t, D*, int32_t,
                            ZoriSize)>
        call;
    std::function<D(const S*, Zor8u, D)> model;
};

float clear_sign(float v) { return bits_f(f_bits(v) & 0x7fffffffu); }
float proc_min(float a, float b) { return a < b ? a : b; }  // the second on NaN or equal
float proc_max(float a, float b) { return a > b ? a : b; }

#define SRC2(fn, T)                                                                     \
    [](const T* const* s, const int32_t* ss, const Zor8u*, int32_t, T* d, int32_t ds, \
       ZoriSize r) { return fn(s[0], ss[0], s[1], ss[1], d, ds, r); }
#define SRC1(fn, S, D, ...)                                                            \
    [=](const S* const* s, const int32_t* ss, const Zor8u*, int32_t, D* d, int32_t ds, \
        ZoriSize r) { return fn(s[0], ss[0], d, ds, r, ##__VA_ARGS__); }
#define MODEL(S, D, expr) [=](const S* v, Zor8u m, D old) -> D { (void)v, (void)m, (void)old; return expr; }

const float kC = 0.37f;

std::vector<Op<Zor32f, Zor32f>> float_ops() {
    typedef Zor32f F;
    std::vector<Op<F, F>> ops = {
        {"Add", 2, false, kFree, kAnyNan, false, true, SRC2(zoriAdd_32f_C1R, F), MODEL(F, F, v[0] + v[1])},
        {"Sub", 2, false, kFree, kAnyNan, false, false, SRC2(zoriSub_32f_C1R, F), MODEL(F, F, v[1] - v[0])},
        {"Mul", 2, false, kFree, kAnyNan, false, false, SRC2(zoriMul_32f_C1R, F), MODEL(F, F, v[0] * v[1])},
        {"AddC", 1, false, kFree, kAnyNan, false, false, SRC1(zoriAddC_32f_C1R, F, F, kC), MODEL(F, F, v[0] + kC)},
        {"SubC", 1, false, kFree, kAnyNan, false, false, SRC1(zoriSubC_32f_C1R, F, F, kC), MODEL(F, F, v[0] - kC)},
        {"MulC", 1, false, kFree, kAnyNan, false, false, SRC1(zoriMulC_32f_C1R, F, F, kC), MODEL(F, F, v[0] * kC)},
        // No short cut in the image form: NaN and infinity times 0 stay NaN.
        {"MulC by 0", 1, false, kFree, kAnyNan, false, false, SRC1(zoriMulC_32f_C1R, F, F, 0.0f), MODEL(F, F, v[0] * 0.0f)},
        // By 3: the rounded third differs from a true division for many
        // sources, so a division would show.
        {"DivC", 1, false, kPositive, kAnyNan, false, false, SRC1(zoriDivC_32f_C1R, F, F, 3.0f),
         [](const F* v, Zor8u, F) {
             volatile float third = 1.0f / 3.0f;
             return v[0] * third;
         }},
        {"Abs", 1, false, kRounded, kBits, false, false, SRC1(zoriAbs_32f_C1R, F, F), MODEL(F, F, clear_sign(v[0]))},
        {"Sqr", 1, false, kRounded, kAnyNan, false, true, SRC1(zoriSqr_32f_C1R, F, F), MODEL(F, F, v[0] * v[0])},
        {"AbsDiff_32f", 2, false, kRow, kClearSign, false, true, SRC2(zoriAbsDiff_32f_C1R, F),
         MODEL(F, F, clear_sign(v[0] - v[1]))},
        {"AbsDiffC_32f", 1, false, kRow, kClearSign, false, false, SRC1(zoriAbsDiffC_32f_C1R, F, F, kC),
         MODEL(F, F, clear_sign(v[0] - kC))},
        {"Copy_32f", 1, false, kFree, kBits, false, true, SRC1(zoriCopy_32f_C1R, F, F), MODEL(F, F, v[0])},
        {"Copy_32f_C1MR", 1, true, kFree, kBits, false, false,
         [](const F* const* s, const int32_t* ss, const Zor8u* m, int32_t ms, F* d, int32_t ds,
            ZoriSize r) { return zoriCopy_32f_C1MR(s[0], ss[0], d, ds, r, m, ms); },
         MODEL(F, F, m ? v[0] : old)},
        // The mask zeroes the first factor; the sum is always formed.
        {"AddProduct", 2, true, kRow, kAnyNan, false, false,
         [](const F* const* s, const int32_t* ss, const Zor8u* m, int32_t ms, F* d, int32_t ds,
            ZoriSize r) { return zoriAddProduct_32f_C1IMR(s[0], ss[0], s[1], ss[1], m, ms, d, ds, r); },
         MODEL(F, F, old + (m ? v[0] : 0.0f) * v[1])},
    };
    // A signalling NaN value must arrive as given.
    const float value = bits_f(0x7f800001u);
    for (float t : {0.0f, -0.0f, 1.5f, bits_f(0x7fc00000u), bits_f(0xff800000u)}) {
        ops.push_back({"Threshold_GT", 1, false, kPositive, kBits, false, false,
                       SRC1(zoriThreshold_GT_32f_C1R, F, F, t), MODEL(F, F, proc_min(v[0], t))});
        ops.push_back({"Threshold_LT", 1, false, kPositive, kBits, false, false,
                       SRC1(zoriThreshold_LT_32f_C1R, F, F, t), MODEL(F, F, proc_max(v[0], t))});
        ops.push_back({"Threshold_GTVal", 1, false, kPositive, kBits, false, false,
                       SRC1(zoriThreshold_GTVal_32f_C1R, F, F, t, value), MODEL(F, F, t < v[0] ? value : v[0])});
        ops.push_back({"Threshold_LTVal", 1, false, kPositive, kBits, false, false,
                       SRC1(zoriThreshold_LTVal_32f_C1R, F, F, t, value), MODEL(F, F, v[0] < t ? value : v[0])});
    }
    for (uint32_t bits : {0x80000000u, 0x7f800001u, 0x3f8ccccdu}) {
        const float fill = bits_f(bits);
        ops.push_back({"Set", 0, false, kFree, kBits, false, bits == 0x3f8ccccdu,
                       [fill](const F* const*, const int32_t*, const Zor8u*, int32_t, F* d,
                              int32_t ds, ZoriSize r) { return zoriSet_32f_C1R(fill, d, ds, r); },
                       MODEL(F, F, fill)});
    }
    return ops;
}

std::vector<Op<Zor32f, Zor8u>> compare_ops() {
    std::vector<Op<Zor32f, Zor8u>> ops;
    for (int c = 0; c <= 4; ++c)
        for (float t : {0.0f, -0.0f, -2.25f, bits_f(0x7f800000u), bits_f(0x7fc00000u)})
            ops.push_back({"CompareC", 1, false, kPositive, kBits, true, false,
                           SRC1(zoriCompareC_32f_C1R, Zor32f, Zor8u, c, t),
                           [c, t](const Zor32f* v, Zor8u, Zor8u) -> Zor8u {
                               const float s = v[0];
                               const bool r = c == 0 ? s < t : c == 1 ? s <= t : c == 2 ? s == t
                                                             : c == 3 ? s >= t : s > t;
                               return r ? 255 : 0;
                           }});
    return ops;
}

std::vector<Op<Zor8u, Zor8u>> byte_ops() {
    return {
        {"AbsDiff_8u", 2, false, kRow, kBits, false, false, SRC2(zoriAbsDiff_8u_C1R, Zor8u),
         MODEL(Zor8u, Zor8u, (Zor8u)abs(v[0] - v[1]))},
        {"Not", 1, false, kPositive, kBits, true, false, SRC1(zoriNot_8u_C1R, Zor8u, Zor8u),
         MODEL(Zor8u, Zor8u, (Zor8u)~v[0])},
    };
}

std::vector<Op<Zor16u, Zor16u>> word_ops() {
    return {
        {"AbsDiff_16u", 2, false, kRow, kBits, false, false, SRC2(zoriAbsDiff_16u_C1R, Zor16u),
         MODEL(Zor16u, Zor16u, (Zor16u)abs(v[0] - v[1]))},
        {"Copy_16u", 1, false, kFree, kBits, false, false, SRC1(zoriCopy_16u_C1R, Zor16u, Zor16u),
         MODEL(Zor16u, Zor16u, v[0])},
    };
}

// Where the model and the result are both NaN the processor may keep
// either operand's payload: take the result's.
template <typename D> void accept_nans(Image<D>& want, const Image<D>& got, NanRule rule) {
    if constexpr (sizeof(D) == 4)
        for (int32_t y = 0; y < want.h && rule != kBits; ++y)
            for (int32_t x = 0; x < want.w; ++x) {
                const float w = want.get(x, y), g = got.get(x, y);
                if (isnan(w) && isnan(g) && (rule == kAnyNan || (f_bits(g) >> 31) == 0))
                    want.set(x, y, g);
            }
}

// None, blocks of 16 alike, random, all set: the masked kernels' paths.
Zor8u mask_byte(Rng& r, size_t turn, int32_t x, int32_t y) {
    switch (turn % 4) {
    case 0: return 0;
    case 1: return (x / 16 + y) % 3 == 0 ? 0 : (Zor8u)(0x80 | r.below(2));
    case 2: return r.below(2) ? (Zor8u)(1 + r.below(255)) : 0;
    default: return (Zor8u)(1 + r.below(255));
    }
}

template <typename S, typename D>
void run(const Op<S, D>& op, ZoriSize g, const int32_t* steps, size_t turn, Rng& r) {
    const int32_t e = (int32_t)sizeof(S);
    const bool odd = op.rule == kFree;
    Image<S> src[2];
    const S* sp[2] = {};
    for (int i = 0; i < op.sources; ++i) {
        const int32_t layout = op.rule == kRounded ? steps[i] & ~3 : steps[i];
        src[i] = image<S>(g.width, g.height, layout, misalign(e, odd, turn + i));
        src[i].randomize(r);
        sp[i] = src[i].ptr();
    }
    Image<Zor8u> mask;
    if (op.mask) {
        mask = image<Zor8u>(g.width, g.height, steps[2], (turn + 3) % 64);
        mask.fill([&](int32_t x, int32_t y) { return mask_byte(r, turn, x, y); });
    }
    const int32_t dl = op.rule == kRounded ? steps[3] & ~3 : steps[3];
    Image<D> dst = image<D>(g.width, g.height, dl, misalign((int32_t)sizeof(D), odd, turn + 2));
    dst.randomize(r);
    Image<D> want = dst;
    // In row order, so that coinciding rows (zero steps) end as the last.
    for (int32_t y = 0; y < g.height; ++y)
        for (int32_t x = 0; x < g.width; ++x) {
            const S v[2] = {op.sources > 0 ? src[0].get(x, y) : S(),
                            op.sources > 1 ? src[1].get(x, y) : S()};
            want.set(x, y, op.model(v, op.mask ? mask.get(x, y) : 0, want.get(x, y)));
        }
    ASSERT_EQ(op.call(sp, steps, op.mask ? mask.ptr() : nullptr, steps[2], dst.ptr(), steps[3], g),
              zorStsNoErr)
        << op.name << " " << g.width << "x" << g.height;
    accept_nans(want, dst, op.nan);
    ASSERT_TRUE(same_bytes(dst, want)) << op.name << " steps " << steps[0] << " " << steps[1]
                                        << " " << steps[2] << " " << steps[3];
}

template <typename S, typename D> void sweep(const std::vector<Op<S, D>>& ops, uint64_t seed) {
    for (const Op<S, D>& op : ops) {
        Rng r(seed++);
        size_t turn = seed;
        for (ZoriSize g : geometries()) {
            const std::vector<int32_t> ss = steps_for(g.width * (int32_t)sizeof(S), sizeof(S), op.rule);
            const std::vector<int32_t> ds = steps_for(g.width * (int32_t)sizeof(D), sizeof(D), op.rule);
            // Mask steps: at least the width for AddProduct, any for the copy.
            const std::vector<int32_t> ms =
                steps_for(g.width, 1, op.rule == kRow ? kRow : kFree);
            for (size_t k = 0; k < ss.size(); ++k, ++turn) {
                const int32_t steps[4] = {ss[k], ss[(k + 1) % ss.size()], ms[k % ms.size()],
                                          ds[(k + 2) % ds.size()]};
                if (op.rule == kRounded && ((steps[0] & ~3) == 0 || (steps[3] & ~3) == 0)) continue;
                ASSERT_NO_FATAL_FAILURE(run(op, g, steps, turn, r));
            }
        }
        // Beyond the cache thresholds: merged rows and padded ones.
        if (op.large)
            for (int32_t pad : {0, 36}) {
                const ZoriSize g = {1024, 1024};
                const int32_t s = g.width * (int32_t)sizeof(S) + pad;
                const int32_t steps[4] = {s, s, g.width, s};
                ASSERT_NO_FATAL_FAILURE(run(op, g, steps, turn++, r));
            }
    }
}

using Point = zortest::LevelTest;

TEST_P(Point, EveryOperationAgainstItsModel) {
    ASSERT_NO_FATAL_FAILURE(sweep(float_ops(), 1));
    ASSERT_NO_FATAL_FAILURE(sweep(compare_ops(), 100));
    ASSERT_NO_FATAL_FAILURE(sweep(byte_ops(), 200));
    ASSERT_NO_FATAL_FAILURE(sweep(word_ops(), 300));
}

// ---- argument checks ------------------------------------------------------------

// The rows of one operation in its order, on an 8 x 2 ROI: each pointer
// null, each ROI side below 1, each step its rule refuses, each step that
// is not a multiple of the element.
template <typename S, typename D> void check_order(const Op<S, D>& op) {
    static S src[64];
    static Zor8u mask[64];
    D dst[64];
    memset(dst, 0x5a, sizeof dst);
    D* const dp = dst;
    const int32_t row = 8 * (int32_t)sizeof(S), drow = 8 * (int32_t)sizeof(D);
    const int32_t good[4] = {row, row, 8, drow};
    auto call = [&](int nullAt, ZoriSize roi, int slot, int32_t step) {
        const S* sp[2] = {nullAt == 0 ? nullptr : src, nullAt == 1 ? nullptr : src};
        int32_t s[4] = {good[0], good[1], good[2], good[3]};
        if (slot >= 0) s[slot] = step;
        return [=, &op] {
            return op.call(sp, s, nullAt == 2 ? nullptr : mask, s[2], nullAt == 3 ? nullptr : dp,
                           s[3], roi);
        };
    };
    std::vector<int> slots;
    for (int i = 0; i < op.sources; ++i) slots.push_back(i);
    if (op.mask) slots.push_back(2);
    slots.push_back(3);
    std::vector<CheckRow> rows;
    for (int i : slots) rows.push_back({zorStsNullPtrErr, "null pointer", call(i, {0, 0}, i, -1)});
    const ZorStatus stepErr = op.rule == kFree ? zorStsNoErr : zorStsStepErr;
    std::vector<CheckRow> sizes = {{zorStsSizeErr, "width 0", call(-1, {0, 2}, -1, 0)},
                                   {zorStsSizeErr, "height -1", call(-1, {8, -1}, -1, 0)}};
    if (!op.stepsFirst) rows.insert(rows.end(), sizes.begin(), sizes.end());
    for (int i : slots) {
        if (op.rule == kFree) continue;
        const int32_t e = i == 2 ? 1 : i == 3 ? (int32_t)sizeof(D) : (int32_t)sizeof(S);
        const int32_t shortStep = op.rule == kRow ? good[i] - e : 0;
        rows.push_back({stepErr, "short step", call(-1, op.stepsFirst ? ZoriSize{0, 0} : ZoriSize{8, 2}, i, shortStep)});
        if (op.rule == kRow && e > 1)
            rows.push_back({zorStsNotEvenStepErr, "uneven step", call(-1, {8, 2}, i, good[i] + e + 1)});
    }
    if (op.stepsFirst) rows.insert(rows.end(), sizes.begin(), sizes.end());
    run_checks(rows, [&] {
        for (size_t i = 0; i < sizeof dst; ++i)
            if (((uint8_t*)dst)[i] != 0x5a) return false;
        return true;
    });
}

TEST_P(Point, ChecksInOrder) {
    for (const auto& op : float_ops()) check_order(op);
    for (const auto& op : compare_ops()) check_order(op);
    for (const auto& op : byte_ops()) check_order(op);
    for (const auto& op : word_ops()) check_order(op);
    // Values after the steps: a zero divisor of either sign; NaN passes.
    Zor32f src[2] = {2, 2}, dst[2] = {9, 9};
    EXPECT_EQ(zoriDivC_32f_C1R(src, 4, dst, 4, {1, 1}, 0.0f), zorStsDivByZeroErr);
    EXPECT_EQ(zoriDivC_32f_C1R(src, 4, dst, 4, {1, 1}, -0.0f), zorStsDivByZeroErr);
    EXPECT_EQ(dst[0], 9.0f);
    EXPECT_EQ(zoriDivC_32f_C1R(src, 4, dst, 4, {1, 1}, NAN), zorStsNoErr);
    EXPECT_TRUE(isnan(dst[0]));
    // A selector above 4, read as unsigned, does nothing and succeeds.
    Zor8u flags[2] = {9, 9};
    for (int32_t c : {5, 1000, -1}) EXPECT_EQ(zoriCompareC_32f_C1R(src, 8, flags, 2, {2, 1}, c, 1), 0);
    EXPECT_EQ(flags[1], 9);
}

// ---- each level's own division ---------------------------------------------------

float rcp(float d) { return _mm_cvtss_f32(_mm_rcp_ss(_mm_set_ss(d))); }

// One lane of `level` (m7 n8 y8 e9 l9 n0 k0 = 0..6); groupZero: its group
// holds a divisor that counts as zero there. anyNan: a NaN of the
// arithmetic, whose payload is the processor's.
float div_lane(int level, float n, float d, bool groupZero, bool* anyNan) {
    const bool exact = level >= 5, fma = level == 4, exactGroups = level == 0 || level == 2;
    const uint32_t pattern = exactGroups ? 0x7fc00000u : 0x7fbfffffu;
    const bool zero = level == 3 || level == 4 ? f_bits(d) == 0 : d == 0;
    *anyNan = false;
    if (zero) {
        if (isnan(n) || n == 0) return bits_f(pattern);
        const uint32_t sign = exact ? (f_bits(n) ^ f_bits(d)) & 0x80000000u : f_bits(n) & 0x80000000u;
        return bits_f(sign | 0x7f800000u);
    }
    float q;
    if (exact) {
        q = n / d;
    } else if (exactGroups && groupZero) {
        if (isnan(d)) return bits_f(pattern);
        q = n / d;
    } else {
        const float r = rcp(d), dd = r == 0 ? 0.0f : d;
        if (fma) {
            const float t = fmaf(-dd, r, 1.0f), u = fmaf(t, t, t);
            q = n * fmaf(r, u, r);
        } else {
            const float t = 1.0f - dd * r;
            q = n * (r + (r * t) * (1.0f + t));
        }
    }
    *anyNan = isnan(q);
    return q;
}

// Divisors that reach every rule: zeros of both signs, NaN, infinities,
// huge values whose estimate is 0, denormals, ordinary values.
float random_divisor(Rng& r) {
    static const uint32_t special[] = {0x00000000u, 0x80000000u, 0x7fc00000u, 0x7f800000u,
                                       0xff800000u, 0x7f7fffffu, 0xfe800000u, 0x7e800000u,
                                       0x00000001u, 0x00800000u, 0x3f800000u, 0xc0000000u};
    if (r.below(6) == 0) return bits_f(special[r.below(12)]);
    return bits_f((r.next() & 0x80000000u) | (0x30000000u + r.below(0x1c000000u)));
}

TEST_P(Point, DivisionFollowsTheLevelsArithmetic) {
    static const int kGroup[7] = {4, 4, 4, 8, 8, 16, 16};
    const int level = GetParam().index, group = kGroup[level];
    Rng r(31);
    size_t turn = 0;
    for (ZoriSize g : geometries()) {
        const std::vector<int32_t> steps = steps_for(g.width * 4, 4, kPositive);
        for (size_t k = 0; k < steps.size(); ++k, ++turn) {
            const int32_t s[3] = {steps[k], steps[(k + 1) % steps.size()], steps[(k + 2) % steps.size()]};
            Image<float> a = image<float>(g.width, g.height, s[0], misalign(4, true, turn));
            Image<float> b = image<float>(g.width, g.height, s[1], 4), d = image<float>(g.width, g.height, s[2], 12);
            // Every other image without zero divisors, for the status.
            a.fill([&](int32_t, int32_t) {
                float v = random_divisor(r);
                while (k % 2 && v == 0) v = random_divisor(r);
                return v;
            });
            b.fill([&](int32_t, int32_t) { return r.below(5) ? random_divisor(r) : Type<float>::random(r); });
            Image<float> want = d;
            std::vector<char> loose((size_t)g.width * g.height);
            bool anyZero = false;
            for (int32_t y = 0; y < g.height; ++y)
                for (int32_t g0 = 0; g0 < g.width; g0 += group) {
                    const int32_t g1 = std::min(g.width, g0 + group);
                    bool zero = false;
                    for (int32_t x = g0; x < g1; ++x)
                        zero |= level == 3 || level == 4 ? f_bits(a.get(x, y)) == 0 : a.get(x, y) == 0;
                    anyZero |= zero;
                    for (int32_t x = g0; x < g1; ++x) {
                        bool anyNan;
                        want.set(x, y, div_lane(level, b.get(x, y), a.get(x, y), zero, &anyNan));
                        loose[(size_t)y * g.width + x] = anyNan;
                    }
                }
            ASSERT_EQ(zoriDiv_32f_C1R(a.ptr(), s[0], b.ptr(), s[1], d.ptr(), s[2], g),
                      anyZero ? zorStsDivByZero : zorStsNoErr);
            // Fixed-up lanes carry exact patterns; NaNs of the arithmetic
            // need only be NaN.
            for (int32_t y = 0; y < g.height; ++y)
                for (int32_t x = 0; x < g.width; ++x)
                    if (loose[(size_t)y * g.width + x] && isnan(d.get(x, y))) want.set(x, y, d.get(x, y));
            ASSERT_TRUE(same_bytes(d, want)) << g.width << "x" << g.height;
        }
    }
}

// ---- extremes --------------------------------------------------------------------

// Sixteen lanes; pixel x goes to lane x mod 16, a row's last partial block
// brings the start constants into the lanes it does not reach, and the
// lanes fold in order; accumulator first in every step.
void minmax_model(const Image<float>& p, float* mn, float* mx) {
    float lo[16], hi[16];
    std::fill(lo, lo + 16, bits_f(0x7f7fffffu));
    std::fill(hi, hi + 16, bits_f(0xff7fffffu));
    for (int32_t y = 0; y < p.h; ++y)
        for (int32_t x = 0; x < (p.w + 15) / 16 * 16; ++x) {
            lo[x % 16] = proc_min(lo[x % 16], x < p.w ? p.get(x, y) : bits_f(0x7f7fffffu));
            hi[x % 16] = proc_max(hi[x % 16], x < p.w ? p.get(x, y) : bits_f(0xff7fffffu));
        }
    *mn = lo[0];
    *mx = hi[0];
    for (int k = 1; k < 16; ++k) {
        *mn = proc_min(*mn, lo[k]);
        *mx = proc_max(*mx, hi[k]);
    }
}

TEST_P(Point, MinMaxMatchesTheLaneModel) {
    Rng r(77);
    size_t turn = 0;
    for (ZoriSize g : geometries())
        for (int32_t step : steps_for(g.width * 4, 4, kFree)) {
            Image<float> src = image<float>(g.width, g.height, step, misalign(4, false, turn++));
            src.randomize(r);
            // Now and then one infinity throughout: it cannot be reported
            // past the start constants.
            if (turn % 9 == 0) src.fill([&](int32_t, int32_t) { return bits_f(turn % 2 ? 0x7f800000u : 0xff800000u); });
            const Image<float> before = src;
            float mn = 0, mx = 0, wantMin, wantMax;
            minmax_model(src, &wantMin, &wantMax);
            ASSERT_EQ(zoriMinMax_32f_C1R(src.ptr(), step, g, &mn, &mx), zorStsNoErr);
            ASSERT_EQ(f_bits(mn), f_bits(wantMin)) << g.width << "x" << g.height << " step " << step;
            ASSERT_EQ(f_bits(mx), f_bits(wantMax)) << g.width << "x" << g.height << " step " << step;
            ASSERT_TRUE(same_bytes(src, before));
        }
    float src[2] = {1, 2}, mn = 9, mx = 9;
    run_checks({{zorStsNullPtrErr, "src", [&] { return zoriMinMax_32f_C1R(nullptr, 8, {0, 0}, &mn, &mx); }},
                {zorStsNullPtrErr, "min", [&] { return zoriMinMax_32f_C1R(src, 8, {1, 1}, nullptr, &mx); }},
                {zorStsNullPtrErr, "max", [&] { return zoriMinMax_32f_C1R(src, 8, {1, 1}, &mn, nullptr); }},
                {zorStsSizeErr, "height", [&] { return zoriMinMax_32f_C1R(src, -8, {1, 0}, &mn, &mx); }}},
               [&] { return mn == 9 && mx == 9; });
}

// Clear blocks of 16 and clear single pixels are neither read nor written:
// they lie on a page that may not be touched at all.
TEST_P(Point, MaskedCopyLeavesClearBlocksAlone) {
    for (int32_t head : {0, 1, 2, 3})         // pixels before a 16-byte boundary
        for (int32_t clear : {16, 19, 35}) {  // clear pixels at the row's end
            const int32_t open = 16 + head, w = open + clear;
            Fenced<Zor32f> src(open, 1, true), dst(open, 1, true);
            src.fill([](int32_t x, int32_t) { return (float)x + 0.5f; });
            std::vector<Zor8u> mask((size_t)w, 0);
            std::fill(mask.begin(), mask.begin() + open, 1);
            ASSERT_EQ(zoriCopy_32f_C1MR(src.ptr(), w * 4, dst.ptr(), w * 4, {w, 1}, mask.data(), w), 0);
            for (int32_t x = 0; x < open; ++x) ASSERT_EQ(*dst.ptr(x), (float)x + 0.5f);
        }
}

ZOR_INSTANTIATE_LEVELS(Point);

}  // namespace
