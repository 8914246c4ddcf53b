// Unscaled float arithmetic and absolute differences through the public
// stubs on every level: scalar models over guarded geometries, each level's
// own division arithmetic, statuses and the order of the checks.
#include <immintrin.h>
#include <math.h>

#include <functional>

#include "arith_harness.h"
#include "zortest.h"

namespace {

using namespace arithtest;

// ---- the element-wise operations against scalar models ---------------------------

enum StepRule {
    kFree,     // no test: zero, negative and odd steps run
    kPositive, // at least 1, used as it stands
    kRounded,  // at least 1, two low bits cleared before use
    kRow,      // at least a row, multiple of the element size
};

// The last argument is the constant of the C forms, ignored by the others.
typedef std::function<ZorStatus(const void*, int32_t, const void*, int32_t, void*, int32_t,
                                ZoriSize, float)>
    Call;
// want(x, y) from a(x, y) and b(x, y) (b unused by one-source operations).
typedef std::function<void(Plane&, Plane&, Plane&, int32_t, int32_t)> Model;

const float kC = 0.37f;

struct Op {
    const char* name;
    int esize;
    StepRule rule;
    bool nanSign;  // a NaN result's sign is defined (cleared), not only its NaN-ness
    Call call;
    Model model;
    float value = kC;  // the constant of the C forms
};

template <typename F>
Model float_model(F f) {
    return [f](Plane& a, Plane& b, Plane& d, int32_t x, int32_t y) {
        d.put<float>(x, y, f(a.get<float>(x, y), b.get<float>(x, y)));
    };
}
template <typename T>
Model int_absdiff() {
    return [](Plane& a, Plane& b, Plane& d, int32_t x, int32_t y) {
        const int32_t u = a.get<T>(x, y), v = b.get<T>(x, y);
        d.put<T>(x, y, (T)(u > v ? u - v : v - u));
    };
}
inline float clear_sign(float v) { return bits_f(f_bits(v) & 0x7fffffffu); }

#define ZT_BIN(fn, T)                                                             \
    [](const void* a, int32_t sa, const void* b, int32_t sb, void* d, int32_t sd, \
       ZoriSize r, float) { return fn((const T*)a, sa, (const T*)b, sb, (T*)d, sd, r); }
#define ZT_CONST(fn)                                                                   \
    [](const void* a, int32_t sa, const void*, int32_t, void* d, int32_t sd, ZoriSize r, \
       float v) { return fn((const Zor32f*)a, sa, (Zor32f*)d, sd, r, v); }
#define ZT_UN(fn)                                                                      \
    [](const void* a, int32_t sa, const void*, int32_t, void* d, int32_t sd, ZoriSize r, \
       float) { return fn((const Zor32f*)a, sa, (Zor32f*)d, sd, r); }


std::vector<Op> ops() {
    return {
        {"Add", 4, kFree, false, ZT_BIN(zoriAdd_32f_C1R, Zor32f),
         float_model([](float a, float b) { return a + b; })},
        {"Sub", 4, kFree, false, ZT_BIN(zoriSub_32f_C1R, Zor32f),
         float_model([](float a, float b) { return b - a; })},
        {"Mul", 4, kFree, false, ZT_BIN(zoriMul_32f_C1R, Zor32f),
         float_model([](float a, float b) { return a * b; })},
        {"AddC", 4, kFree, false, ZT_CONST(zoriAddC_32f_C1R),
         float_model([](float a, float) { return a + kC; })},
        {"SubC", 4, kFree, false, ZT_CONST(zoriSubC_32f_C1R),
         float_model([](float a, float) { return a - kC; })},
        {"MulC", 4, kFree, false, ZT_CONST(zoriMulC_32f_C1R),
         float_model([](float a, float) { return a * kC; })},
        // By 3: the rounded third differs from a true division for many
        // sources, so a division would show.
        {"DivC", 4, kPositive, false, ZT_CONST(zoriDivC_32f_C1R),
         float_model([](float a, float) {
             volatile float r = 1.0f / 3.0f;
             return a * r;
         }),
         3.0f},
        {"Abs", 4, kRounded, true, ZT_UN(zoriAbs_32f_C1R),
         float_model([](float a, float) { return clear_sign(a); })},
        {"Sqr", 4, kRounded, false, ZT_UN(zoriSqr_32f_C1R),
         float_model([](float a, float) { return a * a; })},
        {"AbsDiff_32f", 4, kRow, true, ZT_BIN(zoriAbsDiff_32f_C1R, Zor32f),
         float_model([](float a, float b) { return clear_sign(a - b); })},
        {"AbsDiffC_32f", 4, kRow, true, ZT_CONST(zoriAbsDiffC_32f_C1R),
         float_model([](float a, float) { return clear_sign(a - kC); })},
        {"AbsDiff_8u", 1, kRow, false, ZT_BIN(zoriAbsDiff_8u_C1R, Zor8u), int_absdiff<Zor8u>()},
        {"AbsDiff_16u", 2, kRow, false, ZT_BIN(zoriAbsDiff_16u_C1R, Zor16u),
         int_absdiff<Zor16u>()},
    };
}

// Fills the ROI: special and ordinary floats, or random integers.
void fill(Plane& p, int esize, Rng& r) {
    for (int32_t y = 0; y < p.h; ++y)
        for (int32_t x = 0; x < p.w; ++x) {
            if (esize == 4)
                p.put<float>(x, y, random_float(r));
            else if (esize == 2)
                p.put<Zor16u>(x, y, (Zor16u)(r.below(4) ? r.next() : r.below(3)));
            else
                p.put<Zor8u>(x, y, (Zor8u)r.next());
        }
}

// Where both are NaN the model cannot know which operand's payload the
// processor keeps: take the result's bits (its sign only where nanSign).
void accept_nan_payloads(Plane& want, Plane& got, bool nanSign) {
    for (int32_t y = 0; y < want.h; ++y)
        for (int32_t x = 0; x < want.w; ++x) {
            const float w = want.get<float>(x, y), g = got.get<float>(x, y);
            if (isnan(w) && isnan(g) && (!nanSign || (f_bits(w) >> 31) == (f_bits(g) >> 31)))
                want.put<float>(x, y, g);
        }
}

void run_op(const Op& op, uint64_t seed) {
    Rng r(seed);
    size_t turn = 0;
    for (const Geometry& g : geometries()) {
        const int32_t rowBytes = g.w * op.esize;
        std::vector<int32_t> steps =
            steps_for(rowBytes, op.esize, op.rule == kFree, op.rule != kRow || op.esize == 1);
        if (op.rule == kFree) steps.push_back(0);
        const std::vector<size_t> ms = misaligns(op.esize, op.rule == kFree);
        for (size_t k = 0; k < steps.size(); ++k, ++turn) {
            // Each image its own step; a rounded step lays out the memory
            // at the multiple of 4 it becomes.
            const int32_t s[3] = {steps[k], steps[(k + 1) % steps.size()],
                                  steps[(k + 2) % steps.size()]};
            int32_t layout[3];
            for (int i = 0; i < 3; ++i) layout[i] = op.rule == kRounded ? s[i] & ~3 : s[i];
            if (op.rule == kRounded && (layout[0] == 0 || layout[2] == 0)) continue;
            Plane a(g.w, g.h, op.esize, layout[0], ms[turn % ms.size()], r);
            Plane b(g.w, g.h, op.esize, layout[1], ms[(turn + 1) % ms.size()], r);
            Plane d(g.w, g.h, op.esize, layout[2], ms[(turn + 2) % ms.size()], r);
            fill(a, op.esize, r);
            fill(b, op.esize, r);
            Plane want = d;
            // A zero step reads and writes one row again and again: the
            // last row's result stands.
            for (int32_t y = 0; y < g.h; ++y)
                for (int32_t x = 0; x < g.w; ++x) op.model(a, b, want, x, y);
            const ZorStatus st =
                op.call(a.ptr<void>(), s[0], b.ptr<void>(), s[1], d.ptr<void>(), s[2], {g.w, g.h}, op.value);
            ASSERT_EQ(st, zorStsNoErr) << op.name << " " << where(d);
            if (op.esize == 4) accept_nan_payloads(want, d, op.nanSign);
            ASSERT_TRUE(same_bytes(d.mem, want.mem, d)) << op.name;
        }
    }
}

using FloatArith = zortest::LevelTest;

TEST_P(FloatArith, ElementWiseAgainstModels) {
    uint64_t seed = 1;
    for (const Op& op : ops()) ASSERT_NO_FATAL_FAILURE(run_op(op, seed++)) << op.name;
}

// Pixels that follow each other in memory as one run, large enough for
// every store path (prefetching and non-temporal squares, merged rows).
TEST_P(FloatArith, LargeImages) {
    Rng r(99);
    for (ZoriSize roi : {ZoriSize{1024, 1024}, ZoriSize{1000, 300}, ZoriSize{333, 5}}) {
        for (int32_t pad : {0, 4, 36}) {
            const int32_t step = roi.width * 4 + pad;
            Plane a(roi.width, roi.height, 4, step, pad, r), b = a, d = a;
            fill(a, 4, r);
            fill(b, 4, r);
            for (const Op& op : ops()) {
                const std::string name = op.name;
                if (name != "Sqr" && name != "Add" && name != "AbsDiff_32f") continue;
                Plane want = d, got = d;
                for (int32_t y = 0; y < roi.height; ++y)
                    for (int32_t x = 0; x < roi.width; ++x) op.model(a, b, want, x, y);
                ASSERT_EQ(op.call(a.at(0, 0), step, b.at(0, 0), step, got.at(0, 0), step, roi, op.value), 0)
                    << name;
                accept_nan_payloads(want, got, op.nanSign);
                ASSERT_TRUE(same_bytes(got.mem, want.mem, got)) << name;
            }
        }
    }
}

// ---- masked product accumulation ------------------------------------------------

TEST_P(FloatArith, AddProductMasksByZeroingAFactor) {
    Rng r(7);
    for (const Geometry& g : geometries()) {
        const std::vector<int32_t> steps = steps_for(g.w * 4, 4, false, false);
        for (size_t k = 0; k < steps.size(); ++k) {
            const int32_t s1 = steps[k], s2 = steps[(k + 1) % steps.size()],
                          sd = steps[(k + 2) % steps.size()];
            const int32_t sm = g.w + (int32_t)(k % 3);  // odd mask steps are fine
            Plane a(g.w, g.h, 4, s1, 4 * (k % 4), r), b(g.w, g.h, 4, s2, 60, r);
            Plane m(g.w, g.h, 1, sm, k, r), d(g.w, g.h, 4, sd, 16, r);
            fill(a, 4, r);
            fill(b, 4, r);
            fill(d, 4, r);
            for (int32_t y = 0; y < g.h; ++y)
                for (int32_t x = 0; x < g.w; ++x) m.put<Zor8u>(x, y, (Zor8u)(r.below(2) * r.next()));
            Plane want = d;
            for (int32_t y = 0; y < g.h; ++y)
                for (int32_t x = 0; x < g.w; ++x) {
                    const float f = m.get<Zor8u>(x, y) ? a.get<float>(x, y) : 0.0f;
                    want.put<float>(x, y, d.get<float>(x, y) + f * b.get<float>(x, y));
                }
            ASSERT_EQ(zoriAddProduct_32f_C1IMR(a.ptr<Zor32f>(), s1, b.ptr<Zor32f>(), s2,
                                               m.ptr<Zor8u>(), sm, d.ptr<Zor32f>(), sd,
                                               {g.w, g.h}),
                      zorStsNoErr);
            accept_nan_payloads(want, d, false);
            ASSERT_TRUE(same_bytes(d.mem, want.mem, d));
        }
    }
    // Mask 0 keeps the pixel unless src2 is infinite or NaN.
    const Zor32f a[4] = {5, 5, 5, 5}, b[4] = {-2, INFINITY, NAN, 1e30f};
    const Zor8u mask[4] = {0, 0, 0, 0};
    Zor32f d[4] = {-0.0f, 1, 1, 7};
    ASSERT_EQ(zoriAddProduct_32f_C1IMR(a, 16, b, 16, mask, 4, d, 16, {4, 1}), 0);
    EXPECT_EQ(f_bits(d[0]), 0x80000000u);
    EXPECT_TRUE(isnan(d[1]) && isnan(d[2]));
    EXPECT_EQ(d[3], 7.0f);
}

// ---- each level's own division ---------------------------------------------------

float rcp(float d) { return _mm_cvtss_f32(_mm_rcp_ss(_mm_set_ss(d))); }

struct Quotient {
    float q;
    bool anyNan;  // a NaN of the arithmetic: its payload is the processor's
};

// One lane of a group of `level`; groupZero: the group holds a divisor
// that counts as zero on this level.
Quotient div_lane(int level, float n, float d, bool groupZero) {
    const bool sse = level <= 2, exact = level >= 5, fma = level == 4;
    const uint32_t pattern = level == 0 || level == 2 ? 0x7fc00000u : 0x7fbfffffu;
    const bool zero = level == 3 || level == 4 ? f_bits(d) == 0 : d == 0;
    const bool nanOrZeroN = isnan(n) || n == 0;
    if (zero) {
        if (nanOrZeroN) return {bits_f(pattern), false};
        const uint32_t sign = exact ? (f_bits(n) ^ f_bits(d)) & 0x80000000u
                                    : f_bits(n) & 0x80000000u;
        return {bits_f(sign | 0x7f800000u), false};
    }
    Quotient out;
    if (exact) {
        out.q = n / d;
    } else if (sse && level != 1 && groupZero) {
        if (isnan(d)) return {bits_f(pattern), false};
        out.q = n / d;
    } else {
        const float r = rcp(d);
        const float dd = r == 0 ? 0.0f : d;
        if (fma) {
            const float t = fmaf(-dd, r, 1.0f), u = fmaf(t, t, t);
            out.q = n * fmaf(r, u, r);
        } else {
            const float t = 1.0f - dd * r;
            out.q = n * (r + (r * t) * (1.0f + t));
        }
    }
    out.anyNan = isnan(out.q);
    return out;
}

const int kGroup[7] = {4, 4, 4, 8, 8, 16, 16};

// A row of the level's division: groups from the row's start.
ZorStatus div_row_model(int level, const float* d, const float* n, int32_t len, Quotient* q) {
    bool any = false;
    for (int32_t g0 = 0; g0 < len; g0 += kGroup[level]) {
        const int32_t g1 = std::min(len, g0 + kGroup[level]);
        bool zero = false;
        for (int32_t i = g0; i < g1; ++i)
            zero |= level == 3 || level == 4 ? f_bits(d[i]) == 0 : d[i] == 0;
        for (int32_t i = g0; i < g1; ++i) q[i] = div_lane(level, n[i], d[i], zero);
        any |= zero;
    }
    return any ? zorStsDivByZero : zorStsNoErr;
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

TEST_P(FloatArith, DivisionFollowsTheLevelsArithmetic) {
    const int level = GetParam().index;
    Rng r(31);
    for (const Geometry& g : geometries()) {
        const std::vector<int32_t> steps = steps_for(g.w * 4, 4, false, true);
        for (size_t k = 0; k < steps.size(); ++k) {
            const int32_t s1 = steps[k], s2 = steps[(k + 1) % steps.size()],
                          sd = steps[(k + 2) % steps.size()];
            Plane a(g.w, g.h, 4, s1, misaligns(4, true)[k % 5], r), b(g.w, g.h, 4, s2, 4, r);
            Plane d(g.w, g.h, 4, sd, 12, r);
            // Some rows without any zero, so that the status is tested too.
            const bool zeros = k % 2 == 0;
            for (int32_t y = 0; y < g.h; ++y)
                for (int32_t x = 0; x < g.w; ++x) {
                    float v = random_divisor(r);
                    while (!zeros && v == 0) v = random_divisor(r);
                    a.put<float>(x, y, v);
                    b.put<float>(x, y, r.below(5) ? random_divisor(r) : random_float(r));
                }
            Plane want = d;
            ZorStatus wantStatus = zorStsNoErr;
            std::vector<float> dv(g.w), nv(g.w);
            std::vector<Quotient> q(g.w);
            for (int32_t y = 0; y < g.h; ++y) {
                for (int32_t x = 0; x < g.w; ++x) {
                    dv[x] = a.get<float>(x, y);
                    nv[x] = b.get<float>(x, y);
                }
                if (div_row_model(level, dv.data(), nv.data(), g.w, q.data()) != zorStsNoErr)
                    wantStatus = zorStsDivByZero;
                for (int32_t x = 0; x < g.w; ++x) want.put<float>(x, y, q[x].q);
            }
            const ZorStatus st = zoriDiv_32f_C1R(a.ptr<Zor32f>(), s1, b.ptr<Zor32f>(), s2,
                                                 d.ptr<Zor32f>(), sd, {g.w, g.h});
            ASSERT_EQ(st, wantStatus) << where(d);
            // Fixed-up lanes carry exact patterns; NaNs of the arithmetic
            // only need to be NaN.
            for (int32_t y = 0; y < g.h; ++y) {
                for (int32_t x = 0; x < g.w; ++x) {
                    dv[x] = a.get<float>(x, y);
                    nv[x] = b.get<float>(x, y);
                }
                div_row_model(level, dv.data(), nv.data(), g.w, q.data());
                for (int32_t x = 0; x < g.w; ++x)
                    if (q[x].anyNan && isnan(d.get<float>(x, y)))
                        want.put<float>(x, y, d.get<float>(x, y));
            }
            ASSERT_TRUE(same_bytes(d.mem, want.mem, d));
        }
    }
}

// The table's worked cases, per level.
TEST_P(FloatArith, DivisionWorkedValues) {
    const int level = GetParam().index;
    const bool sse = level <= 2, avx = level == 3 || level == 4;
    const uint32_t pattern = level == 0 || level == 2 ? 0x7fc00000u : 0x7fbfffffu;
    // d: 2, +0, -0, +0, +0;  n: 6, -1, 5, 0, NaN
    const Zor32f d[5] = {2, 0.0f, -0.0f, 0.0f, 0.0f}, n[5] = {6, -1, 5, 0, NAN};
    Zor32f q[5];
    for (int i = 0; i < 5; ++i) {
        ASSERT_EQ(zoriDiv_32f_C1R(d + i, 4, n + i, 4, q + i, 4, {1, 1}),
                  i == 0 || (avx && i == 2) ? zorStsNoErr : zorStsDivByZero)
            << i;
    }
    EXPECT_NEAR(q[0], 3.0f, sse || avx ? 3e-6f : 0.0f);
    EXPECT_EQ(f_bits(q[1]), 0xff800000u);  // -1 / +0
    if (avx)
        EXPECT_TRUE(isnan(q[2]));  // -0 goes through the reciprocal
    else if (level >= 5)
        EXPECT_EQ(f_bits(q[2]), 0xff800000u);  // signs' exclusive-or
    else
        EXPECT_EQ(f_bits(q[2]), 0x7f800000u);  // the numerator's sign
    EXPECT_EQ(f_bits(q[3]), pattern);
    EXPECT_EQ(f_bits(q[4]), pattern);
    // A later row is computed after the first one reported.
    const Zor32f d2[2] = {0, 4}, n2[2] = {1, 8};
    Zor32f q2[2] = {0, 0};
    EXPECT_EQ(zoriDiv_32f_C1R(d2, 4, n2, 4, q2, 4, {1, 2}), zorStsDivByZero);
    EXPECT_NEAR(q2[1], 2.0f, 3e-6f);
    // A NaN value of DivC passes the zero test; +-0 does not.
    Zor32f src = 2, dst = 9;
    EXPECT_EQ(zoriDivC_32f_C1R(&src, 4, &dst, 4, {1, 1}, NAN), zorStsNoErr);
    EXPECT_TRUE(isnan(dst));
    dst = 9;
    EXPECT_EQ(zoriDivC_32f_C1R(&src, 4, &dst, 4, {1, 1}, -0.0f), zorStsDivByZeroErr);
    EXPECT_EQ(dst, 9);
}

// ---- checks in order ----------------------------------------------------------------

// Every operation in one signature: (src1, src2 / mask, dst) with steps; the
// one-source forms ignore src2.
struct Checked {
    const char* name;
    int esize;
    StepRule rule;
    int extra;  // 1: division by a value that must not be 0; 2: AddProduct
    bool twoImages;
    Call call;
};

TEST_P(FloatArith, ChecksInOrder) {
    // AddProduct: src1 and src2 share the first pointer and step; the mask
    // is the second image with its own step.
    auto addProduct = [](const void* a, int32_t sa, const void* m, int32_t sm, void* d,
                         int32_t sd, ZoriSize r, float) {
        return zoriAddProduct_32f_C1IMR((const Zor32f*)a, sa, (const Zor32f*)a, sa,
                                        (const Zor8u*)m, sm, (Zor32f*)d, sd, r);
    };
    const std::vector<Checked> all = {
        {"Add", 4, kFree, 0, true, ZT_BIN(zoriAdd_32f_C1R, Zor32f)},
        {"Sub", 4, kFree, 0, true, ZT_BIN(zoriSub_32f_C1R, Zor32f)},
        {"Mul", 4, kFree, 0, true, ZT_BIN(zoriMul_32f_C1R, Zor32f)},
        {"Div", 4, kPositive, 0, true, ZT_BIN(zoriDiv_32f_C1R, Zor32f)},
        {"AddC", 4, kFree, 0, false, ZT_CONST(zoriAddC_32f_C1R)},
        {"SubC", 4, kFree, 0, false, ZT_CONST(zoriSubC_32f_C1R)},
        {"MulC", 4, kFree, 0, false, ZT_CONST(zoriMulC_32f_C1R)},
        {"DivC", 4, kPositive, 1, false, ZT_CONST(zoriDivC_32f_C1R)},
        {"Abs", 4, kRounded, 0, false, ZT_UN(zoriAbs_32f_C1R)},
        {"Sqr", 4, kRounded, 0, false, ZT_UN(zoriSqr_32f_C1R)},
        {"AbsDiff_8u", 1, kRow, 0, true, ZT_BIN(zoriAbsDiff_8u_C1R, Zor8u)},
        {"AbsDiff_16u", 2, kRow, 0, true, ZT_BIN(zoriAbsDiff_16u_C1R, Zor16u)},
        {"AbsDiff_32f", 4, kRow, 0, true, ZT_BIN(zoriAbsDiff_32f_C1R, Zor32f)},
        {"AbsDiffC_32f", 4, kRow, 0, false, ZT_CONST(zoriAbsDiffC_32f_C1R)},
        {"AddProduct", 4, kRow, 2, true, addProduct},
    };
    alignas(64) Zor32f src[64];
    for (Zor32f& v : src) v = 1.5f;
    for (const Checked& c : all) {
        alignas(64) Zor32f dst[64];
        for (Zor32f& v : dst) v = 7;
        auto untouched = [&] {
            for (Zor32f v : dst)
                if (v != 7) return false;
            return true;
        };
        const int32_t row = 8 * c.esize;  // ROI 8 x 2 below
        const ZoriSize roi = {8, 2};
        // The mask of AddProduct is a second image of bytes.
        const int32_t row2 = c.extra == 2 ? 8 : row;
        auto call = [&](const void* a, const void* b, void* d, ZoriSize r, int32_t s1, int32_t s2,
                        int32_t sd, float v) { return c.call(a, s1, b, s2, d, sd, r, v); };
        EXPECT_EQ(call(nullptr, src, dst, {0, 0}, row, row2, row, 1), zorStsNullPtrErr) << c.name;
        if (c.twoImages)
            EXPECT_EQ(call(src, nullptr, dst, {0, 0}, row, row2, row, 1), zorStsNullPtrErr)
                << c.name;
        EXPECT_EQ(call(src, src, nullptr, roi, -1, -1, -1, 0), zorStsNullPtrErr) << c.name;
        EXPECT_EQ(call(src, src, dst, {0, 2}, -1, -1, -1, 0), zorStsSizeErr) << c.name;
        EXPECT_EQ(call(src, src, dst, {8, -1}, -1, -1, -1, 0), zorStsSizeErr) << c.name;
        EXPECT_TRUE(untouched()) << c.name;
        const ZorStatus stepErr = c.rule == kFree ? zorStsNoErr : zorStsStepErr;
        const int32_t tooSmall = c.rule == kRow ? row - c.esize : 0;
        for (int which = 0; which < 3; ++which) {
            if (which == 1 && !c.twoImages) continue;  // one-source forms have no second step
            int32_t s[3] = {row, row2, row};
            s[which] = which == 1 && c.extra == 2 ? row2 - 1 : tooSmall;
            const ZorStatus st = call(src, src, dst, roi, s[0], s[1], s[2], c.extra == 1 ? 0 : 1);
            if (c.rule != kFree) EXPECT_TRUE(untouched()) << c.name << " step " << which;
            EXPECT_EQ(st, stepErr) << c.name << " step " << which;
            for (Zor32f& v : dst) v = 7;
        }
        if (c.rule == kRow && c.esize > 1) {
            // Large enough but not a multiple of the element.
            for (int which = 0; which < 3; ++which) {
                if (which == 1 && (c.extra == 2 || !c.twoImages)) continue;  // mask steps may be odd
                int32_t s[3] = {row, row2, row};
                s[which] = row + c.esize + 2 - (c.esize == 2 ? 1 : 0);
                EXPECT_EQ(call(src, src, dst, roi, s[0], s[1], s[2], 1), zorStsNotEvenStepErr)
                    << c.name << " step " << which;
                EXPECT_TRUE(untouched()) << c.name;
            }
        }
        if (c.extra == 1) {
            for (float z : {0.0f, -0.0f})
                EXPECT_EQ(call(src, src, dst, roi, row, row, row, z), zorStsDivByZeroErr);
            EXPECT_TRUE(untouched()) << c.name;
        }
    }
}

ZOR_INSTANTIATE_LEVELS(FloatArith);

}  // namespace
