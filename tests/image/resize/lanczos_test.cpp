// Lanczos resize against a model: the sampled sinc table made from the
// formula, the split normalisation (the processor's reciprocal estimate for
// the first four weights), then the two-pass window of the other methods.
#include <math.h>
#include <xmmintrin.h>

#include <vector>

#include "resize_support.h"
#include "zortest.h"

namespace {

using zortest::WindowAxis;

WindowAxis lanczos_axis(int32_t src, int32_t dst, int32_t lobes) {
    const int32_t per = lobes == 2 ? 200 : 100;
    std::vector<float> t((size_t)(lobes * per + 2), 0.0f);
    for (int32_t k = 0; k < lobes * per; ++k) {
        const double x = (double)k / per, u = M_PI * x, v = u / lobes;
        t[(size_t)k] = (float)(k ? sin(u) / u * (sin(v) / v) : 1.0);
    }
    WindowAxis a;
    a.taps = lobes;
    for (int32_t i = 0; i < dst; ++i) {
        const double pos = (i + 0.5) * ((double)src / dst) - 0.5, index = floor(pos);
        const float d0 = (float)(1 - lobes) - (float)(pos - index);
        a.index.push_back((int32_t)index);
        float w[6], S = 0;
        for (int32_t k = 0; k < 2 * lobes; ++k) {
            const float d = d0 + (float)k, s = fabsf(d) * (float)per;
            const int32_t j = (int32_t)s;
            w[k] = fabsf(d) < (float)lobes ? t[j] + (t[j + 1] - t[j]) * (s - (float)j) : 0.0f;
            S += w[k];
        }
        const float r = _mm_cvtss_f32(_mm_rcp_ss(_mm_set_ss(S))), r2 = (r + r) - (S * r) * r;
        for (int32_t k = 0; k < 2 * lobes; ++k) {
            float v = k < 4 ? w[k] * r2 : w[k] / S;
            if (fabsf(v) < 1.17549435e-38f) v = copysignf(0.0f, v);  // Init flushes
            a.w.push_back(v);
        }
    }
    return a;
}

using Lanczos = zortest::LevelTest;

// Sizes up, down, equal and by odd ratios; both lobe counts, both types,
// the border forms in turn. Two lobes take the four-tap passes' edges.
TEST_P(Lanczos, SweepMatchesModel) {
    zortest::Rng rng(11);
    uint32_t seed = 1;
    for (int32_t dw = 1; dw <= 40; dw += 3) {
        for (int32_t lobes = 2; lobes <= 3; ++lobes) {
            const int32_t W = 2 * lobes + (int32_t)rng.below(3 * dw + 1),
                          H = 2 * lobes + (int32_t)rng.below(12);
            const ZoriSize S{W, H}, D{dw, 1 + (int32_t)rng.below(2 * H)};
            zortest::ResizeRecord rec = zortest::resize_record(S, D, zoriInterLanczos, seed % 64);
            ASSERT_EQ(zoriResizeLanczosInit_8u(S, D, (Zor32u)lobes, rec.record(), rec.initBuf()),
                      zorStsNoErr);
            const WindowAxis ax = lanczos_axis(W, D.width, lobes), ay = lanczos_axis(H, D.height, lobes);
            const int32_t border = zortest::kResizeBorders[seed % 9];
            const bool fused = zortest::fuses(GetParam());
            zortest::window_case<Zor8u>(
                zoriResizeLanczos_8u_C1R, rec, S, D, ax, ay,
                border, 1, fused, lobes == 2, seed++);
            zortest::window_case<Zor32f>(
                zoriResizeLanczos_32f_C1R, rec, S, D, ax, ay,
                border, 1, fused, lobes == 2, seed++);
            if (HasFatalFailure()) return;
        }
    }
}

TEST_P(Lanczos, ChecksInOrder) {
    const ZoriSize src{7, 6}, dst{4, 9};
    // Too small a source is judged after the record is begun (it is left
    // unusable), so those rows come below.
    zortest::resize_init_checks(
        [](ZoriSize s, ZoriSize d, ZoriResizeSpec* r, Zor8u* b) {
            return zoriResizeLanczosInit_32f(s, d, 3, r, b);
        },
        src, dst, 0, true);
    zortest::ResizeRecord rec = zortest::resize_record(src, dst, zoriInterLanczos);
    EXPECT_EQ(zoriResizeLanczosInit_8u({3, 6}, dst, 2, rec.record(), rec.initBuf()),
              zorStsSizeErr);
    for (Zor32u lobes : {0u, 1u, 4u, 0x80000000u})
        EXPECT_EQ(zoriResizeLanczosInit_8u(src, dst, lobes, rec.record(), rec.initBuf()),
                  zorStsNotSupportedModeErr);
    // The query asks 4 pixels whatever the lobes; three lobes need six.
    int32_t a = 0, b = 0;
    EXPECT_EQ(zoriResizeGetSize_8u({5, 5}, dst, zoriInterLanczos, 0, &a, &b), zorStsNoErr);
    EXPECT_EQ(zoriResizeLanczosInit_8u({5, 5}, dst, 3, rec.record(), rec.initBuf()),
              zorStsSizeErr);
    ASSERT_EQ(zoriResizeLanczosInit_8u(src, dst, 3, rec.record(), rec.initBuf()), zorStsNoErr);
    zortest::ResizeRecord cubic = zortest::resize_record(src, dst, zoriInterCubic);
    ASSERT_EQ(zoriResizeCubicInit_8u(src, dst, 0, 0.5f, cubic.record(), cubic.initBuf()),
              zorStsNoErr);
    zortest::resize_op_checks<Zor8u>(zoriInterLanczos, src, dst, rec.record(), {cubic.record()});
    zortest::resize_op_checks<Zor32f>(zoriInterLanczos, src, dst, rec.record(), {});
}

ZOR_INSTANTIATE_LEVELS(Lanczos);

}  // namespace
