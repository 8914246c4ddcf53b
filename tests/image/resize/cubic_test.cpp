// Cubic resize against a model: (B, C) weights in double (the three common
// pairs through their folded forms), then the two passes of the window
// model with four taps and the four-tap edge rule.
#include <float.h>
#include <math.h>
#include <xmmintrin.h>

#include <vector>

#include "resize_support.h"
#include "zortest.h"

namespace {

using zortest::WindowAxis;

struct Pair {
    float B, C;
};
const Pair kPairs[] = {{0, 0.5f}, {1, 0}, {0.5f, 0.3f}, {1 / 3.0f, 1 / 3.0f}, {-1, 2.5f}, {NAN, 0}};

double weight(double x, const Pair& p) {
    const double B = p.B, C = p.C;
    if (x >= 2) return 0;
    if (x != x) return 1;
    if (B == 1 && C == 0)
        return x < 1 ? (0.5 * (x * x) - x) * x + 2.0 / 3 : (-(x * x) / 6 + x) * x + (4.0 / 3 - 2 * x);
    if (p.B == 0.5f && p.C == 0.3f)
        return x < 1 ? (0.95 * x - 1.7) * (x * x) + 5.0 / 6
                     : ((-0.38333333333333336 * x + 2) * x - 3.4) * x + 1.8666666666666667;
    if (B == 0 && C == 0.5)
        return x < 1 ? (1.5 * x - 2.5) * (x * x) + 1 : ((-0.5 * x + 2.5) * x - 4) * x + 2;
    if (x < 1) return ((2 - 1.5 * B - C) * x + (-3 + 2 * B + C)) * (x * x) + (1 - B / 3);
    return (((-B / 6 - C) * x + (B + 5 * C)) * x - (2 * B + 8 * C)) * x + (4 * B / 3 + 4 * C);
}

// Per destination position: source index and four weights (Init flushes
// denormal weights to zero).
WindowAxis axis(int32_t src, int32_t dst, const Pair& p) {
    WindowAxis a;
    a.taps = 2;
    for (int32_t i = 0; i < dst; ++i) {
        const double pos = (i + 0.5) * ((double)src / dst) - 0.5, index = floor(pos);
        const float d0 = -1.0f - (float)(pos - index);
        a.index.push_back((int32_t)index);
        for (int t = 0; t < 4; ++t) {
            float w = (float)weight(fabsf(d0 + (float)t), p);
            if (fabsf(w) < FLT_MIN) w = copysignf(0, w);
            a.w.push_back(w);
        }
    }
    return a;
}

using Cubic = zortest::LevelTest;

// Widths across every vector tail, sources shrunk, enlarged or equal (at
// least 4), each pair with the border forms in turn; sizes level-independent.
TEST_P(Cubic, SweepMatchesModel) {
    zortest::Rng rng(7);
    uint32_t seed = 1;
    const bool fused = zortest::fuses(GetParam());
    for (int32_t dw = 1; dw <= 34; ++dw) {
        const int32_t widths[] = {dw, dw * 2, dw / 2, dw * 3 / 2 + 1, 2 * dw + 3};
        const int32_t W = std::max(4, widths[dw % 5]), H = 4 + (int32_t)rng.below(6);
        const ZoriSize S{W, H}, D{dw, dw % 5 ? 1 + (int32_t)rng.below(9) : H};
        for (const Pair& p : kPairs) {
            zortest::ResizeRecord rec = zortest::resize_record(S, D, zoriInterCubic, seed % 64);
            ASSERT_EQ(zoriResizeCubicInit_8u(S, D, p.B, p.C, rec.record(), rec.initBuf()),
                      zorStsNoErr);
            const WindowAxis ax = axis(W, D.width, p), ay = axis(H, D.height, p);
            const int32_t border = zortest::kResizeBorders[seed % 9];
            zortest::window_case<Zor8u>(zoriResizeCubic_8u_C1R, rec, S, D, ax, ay, border, 1,
                                        fused, true, seed++);
            zortest::window_case<Zor32f>(zoriResizeCubic_32f_C1R, rec, S, D, ax, ay, border, 1,
                                         fused, true, seed++);
            if (HasFatalFailure()) return;
        }
    }
}

TEST_P(Cubic, ChecksInOrder) {
    const ZoriSize src{6, 5}, dst{4, 7};
    zortest::ResizeRecord rec = zortest::resize_record(src, dst, zoriInterCubic);
    zortest::resize_init_checks(
        [](ZoriSize s, ZoriSize d, ZoriResizeSpec* r, Zor8u* b) {
            return zoriResizeCubicInit_32f(s, d, 0, 0.5f, r, b);
        },
        src, dst, 4, true);
    ZoriResizeSpec* ok = rec.record();
    Zor8u* ib = rec.initBuf();
    // Init hands back the caller's rounding, flush and underflow settings
    // (round toward zero, denormal inputs as zero, underflow unmasked).
    const unsigned int saved = _mm_getcsr(), csr = 0x7780u | 0x40u;
    _mm_setcsr(csr);
    const ZorStatus st = zoriResizeCubicInit_8u(src, dst, 1, 0, ok, ib);
    const unsigned int after = _mm_getcsr();
    _mm_setcsr(saved);
    ASSERT_EQ(st, zorStsNoErr);
    EXPECT_EQ(after & ~0x2fu, csr) << std::hex << after;  // other exception flags may rise
    zortest::resize_op_checks<Zor32f>(zoriInterCubic, src, dst, ok, {});
}

ZOR_INSTANTIATE_LEVELS(Cubic);

}  // namespace
