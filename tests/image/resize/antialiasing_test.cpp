// Antialiasing resize against a model: taps widened by the reduction
// factor, per-position weights from the linear, cubic or Lanczos kernel
// normalised by their sum (groups of eight on 32-byte boundaries through
// the refined reciprocal estimate), then the general window.
#include <float.h>
#include <math.h>
#include <xmmintrin.h>

#include <vector>

#include "resize_support.h"
#include "zortest.h"

namespace {

using zortest::WindowAxis;

struct Kernel {
    const char* name;
    int32_t radius;  // 1 linear, 2 cubic, lobes
    float B, C;
    bool lanczos;
};
const Kernel kKernels[] = {{"linear", 1, 0, 0, false},   {"cubic", 2, 0, 0.5f, false},
                           {"cubic", 2, 1 / 3.0f, 1 / 3.0f, false}, {"lanczos", 2, 0, 0, true},
                           {"lanczos", 3, 0, 0, true}};

double value(const Kernel& k, double x) {
    if (k.lanczos) {
        if (x >= k.radius) return 0;
        const double u = (double)3.1415927f * x, v = u / k.radius;
        return (u ? sin(u) / u : 1.0) * (v ? sin(v) / v : 1.0);
    }
    if (k.radius == 1) return x < 1 ? 1 - x : 0;
    const double B = k.B, C = k.C;
    if (x >= 2) return 0;
    if (x < 1) return ((2 - 1.5 * B - C) * x + (-3 + 2 * B + C)) * (x * x) + (1 - B / 3);
    return (((-B / 6 - C) * x + (B + 5 * C)) * x - (2 * B + 8 * C)) * x + (4 * B / 3 + 4 * C);
}

WindowAxis aa_axis(int32_t src, int32_t dst, const Kernel& k) {
    const double r = (double)dst / src, s = r < 1 ? r : 1;
    WindowAxis a;
    a.taps = r < 1 ? (int32_t)ceil((double)k.radius * src / dst) : k.radius;
    const int32_t n = 2 * a.taps;
    for (int32_t i = 0; i < dst; ++i) {
        const double pos = (i + 0.5) * ((double)src / dst) - 0.5, index = floor(pos);
        a.index.push_back((int32_t)index);
        std::vector<float> w((size_t)n);
        float d = (float)((1 - a.taps) - (pos - index)), S = 0;
        for (int32_t m = 0; m < n; ++m, d += 1.0f) {
            w[m] = (float)(value(k, (float)fabs((double)d * s)) * s);
            S += w[m];
        }
        // The table starts on 32 bytes: whole groups of eight from there on
        // take the estimate, the rest divide.
        const float e = _mm_cvtss_f32(_mm_rcp_ss(_mm_set_ss(S))), r2 = (e + e) - (S * e) * e;
        const int32_t lead = (8 - (int32_t)(((int64_t)n * i) % 8)) % 8;
        for (int32_t m = 0; m < n; ++m) {
            const bool group = m >= lead && lead + (m - lead) / 8 * 8 + 8 <= n;
            float v = group ? w[m] * r2 : w[m] / S;
            if (fabsf(v) < FLT_MIN) v = copysignf(0.0f, v);  // Init flushes
            a.w.push_back(v);
        }
    }
    return a;
}

ZorStatus init(const Kernel& k, ZoriSize S, ZoriSize D, zortest::ResizeRecord& rec) {
    if (k.lanczos)
        return zoriResizeAntialiasingLanczosInit(S, D, (Zor32u)k.radius, rec.record(),
                                                 rec.initBuf());
    if (k.radius == 2)
        return zoriResizeAntialiasingCubicInit(S, D, k.B, k.C, rec.record(), rec.initBuf());
    return zoriResizeAntialiasingLinearInit(S, D, rec.record(), rec.initBuf());
}

zortest::ResizeRecord aa_record(const Kernel& k, ZoriSize S, ZoriSize D, size_t misalign = 13) {
    zortest::ResizeRecord r;
    const ZoriInterpolationType m =
        k.lanczos ? zoriInterLanczos : k.radius == 1 ? zoriInterLinear : zoriInterCubic;
    EXPECT_EQ(zoriResizeGetSize_8u(S, D, m, 1, &r.specSize, &r.initSize), zorStsNoErr);
    r.mem = zortest::guarded((size_t)r.specSize + 128);
    r.offset = ((64 - ((uintptr_t)r.mem.data() & 63)) + misalign) & 63;
    r.init = zortest::guarded((size_t)r.initSize);
    EXPECT_EQ(init(k, S, D, r), zorStsNoErr);
    return r;
}

using Antialiasing = zortest::LevelTest;

// Shrinking by 2, 8 and 17, by odd ratios, growing, one axis each way and
// equal sizes, 1-pixel destinations, for every kernel, 8u C1 and C3 and
// 32f, the border forms in turn.
TEST_P(Antialiasing, SweepMatchesModel) {
    const ZoriSize cases[][2] = {{{8, 6}, {4, 3}},   {{67, 9}, {8, 1}},  {{71, 40}, {4, 2}},
                                 {{13, 11}, {5, 7}}, {{5, 4}, {12, 9}},  {{9, 30}, {20, 6}},
                                 {{6, 6}, {6, 6}},   {{4, 4}, {1, 1}},   {{37, 4}, {1, 9}},
                                 {{40, 7}, {33, 7}}, {{4, 45}, {2, 3}}};
    const bool fused = zortest::fuses(GetParam());
    uint32_t seed = 1;
    for (const auto& c : cases)
        for (const Kernel& k : kKernels) {
            const ZoriSize S = c[0], D = c[1];
            zortest::ResizeRecord rec = aa_record(k, S, D, seed % 64);
            const WindowAxis ax = aa_axis(S.width, D.width, k), ay = aa_axis(S.height, D.height, k);
            const int32_t border = zortest::kResizeBorders[seed % 9];
            zortest::window_case<Zor8u>(zoriResizeAntialiasing_8u_C1R, rec, S, D, ax, ay, border,
                                        1, fused, false, seed++);
            zortest::window_case<Zor8u>(zoriResizeAntialiasing_8u_C3R, rec, S, D, ax, ay, border,
                                        3, fused, false, seed++);
            zortest::window_case<Zor32f>(zoriResizeAntialiasing_32f_C1R, rec, S, D, ax, ay,
                                         border, 1, fused, false, seed++);
            if (HasFatalFailure()) return;
        }
}

TEST_P(Antialiasing, ChecksInOrder) {
    const ZoriSize src{9, 5}, dst{4, 7};
    for (const Kernel& k : kKernels)
        zortest::resize_init_checks(
            [&k](ZoriSize s, ZoriSize d, ZoriResizeSpec* r, Zor8u* b) {
                return k.lanczos ? zoriResizeAntialiasingLanczosInit(s, d, (Zor32u)k.radius, r, b)
                       : k.radius == 2 ? zoriResizeAntialiasingCubicInit(s, d, k.B, k.C, r, b)
                                       : zoriResizeAntialiasingLinearInit(s, d, r, b);
            },
            src, dst, 0, true);
    zortest::ResizeRecord aa = aa_record(kKernels[1], src, dst);
    for (Zor32u lobes : {0u, 1u, 4u})
        EXPECT_EQ(zoriResizeAntialiasingLanczosInit(src, dst, lobes, aa.record(), aa.initBuf()),
                  zorStsNotSupportedModeErr);
    // Init hands back the caller's rounding, flush and underflow settings.
    const unsigned int saved = _mm_getcsr(), csr = 0x7780u | 0x40u;
    _mm_setcsr(csr);
    const ZorStatus st = init(kKernels[4], src, dst, aa);
    const unsigned int after = _mm_getcsr();
    _mm_setcsr(saved);
    ASSERT_EQ(st, zorStsNoErr);
    EXPECT_EQ(after & ~0x2fu, csr) << std::hex << after;
    // Plain records are refused by these operations, and theirs by the plain ones: -14.
    zortest::ResizeRecord cubic = zortest::resize_record(src, dst, zoriInterCubic);
    ASSERT_EQ(zoriResizeCubicInit_8u(src, dst, 0, 0.5f, cubic.record(), cubic.initBuf()),
              zorStsNoErr);
    zortest::resize_op_checks<Zor8u>(zortest::kAntialiasing, src, dst, aa.record(),
                                     {cubic.record()}, zorStsNotSupportedModeErr);
    zortest::resize_op_checks<Zor32f>(zortest::kAntialiasing, src, dst, aa.record(), {},
                                      zorStsNotSupportedModeErr);
    std::vector<uint8_t> buf = zortest::resize_buffer(aa.record(), dst);
    std::vector<Zor8u> in(45), out(28);
    for (ZoriInterpolationType m : {zoriInterLinear, zoriInterCubic, zoriInterLanczos})
        EXPECT_EQ(zortest::resize_op<Zor8u>(m, in.data(), 9, out.data(), 4, {0, 0}, dst, 1,
                                            aa.record(), buf.data()),
                  zorStsNotSupportedModeErr);
}

ZOR_INSTANTIATE_LEVELS(Antialiasing);

}  // namespace
