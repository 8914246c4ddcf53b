// Cubic resize against a model: (B, C) weights in double, two passes of
// (x0*c0 + x1*c1) + (x2*c2 + x3*c3) (fused levels round x1*c1 onto the
// rounded x0*c0), taps replicated on the sides without an in-memory flag.
#include <float.h>
#include <math.h>
#include <xmmintrin.h>

#include <vector>

#include "resize_support.h"
#include "zortest.h"

namespace {

using zortest::Image;
using zortest::Rng;

struct Pair {
    float B, C;
    bool folded;  // the library folds the constants: weights may differ by an ulp
};
const Pair kPairs[] = {{0, 0.5f, false},   {1, 0, true},
                       {0.5f, 0.3f, true}, {1 / 3.0f, 1 / 3.0f, false},
                       {-1, 2.5f, false},  {NAN, 0, false}};

double weight(double x, double B, double C) {
    if (x >= 2) return 0;
    if (x < 1) return ((2 - 1.5 * B - C) * x + (-3 + 2 * B + C)) * (x * x) + (1 - B / 3);
    return (((-B / 6 - C) * x + (B + 5 * C)) * x - (2 * B + 8 * C)) * x + (4 * B / 3 + 4 * C);
}

// Per destination position: source index and four weights (Init flushes
// denormal weights to zero).
struct Axis {
    std::vector<int32_t> index;
    std::vector<float> w;
};
Axis axis(int32_t src, int32_t dst, const Pair& p) {
    Axis a;
    for (int32_t i = 0; i < dst; ++i) {
        const double pos = (i + 0.5) * ((double)src / dst) - 0.5, index = floor(pos);
        const float f = (float)(pos - index), d0 = -1.0f - f;
        a.index.push_back((int32_t)index);
        for (int t = 0; t < 4; ++t) {
            float w = (float)weight(fabsf(d0 + (float)t), p.B, p.C);
            if (fabsf(w) < FLT_MIN) w = copysignf(0, w);
            a.w.push_back(w);
        }
    }
    return a;
}

// Tap t of a window at `index` on an axis of length n; a side clamps
// unless its in-memory flag is set.
int32_t tap(int32_t index, int t, int32_t n, bool lowInMem, bool highInMem) {
    if (!lowInMem && index < 0) return t < 3 ? 0 : 1;
    if (!lowInMem && index == 0) return t < 2 ? 0 : t - 1;
    if (!highInMem && index == n - 2) return t < 3 ? n - 3 + t : n - 1;
    if (!highInMem && index > n - 2) return n - 1;
    return index - 1 + t;
}

float quad(const float* x, const float* c, bool fused) {
    if (fused) return fmaf(x[1], c[1], x[0] * c[0]) + fmaf(x[3], c[3], x[2] * c[2]);
    return (x[0] * c[0] + x[1] * c[1]) + (x[2] * c[2] + x[3] * c[3]);
}

uint8_t to_u8(float v) {
    const int32_t i = _mm_cvtss_si32(_mm_set_ss(v));  // NaN, overflow: INT32_MIN
    return (uint8_t)(i < 0 ? 0 : i > 255 ? 255 : i);
}

bool near(Zor8u got, float v, float tol) { return to_u8(v - tol) <= got && got <= to_u8(v + tol); }
bool near(float got, float v, float tol) { return isnan(v) ? isnan(got) : fabsf(got - v) <= tol; }

// One call against the model, then tiles against that call. A folded
// kernel's weights lie within 2^-22 of the formula's: with M the largest tap
// and S, T the axes' absolute weight sums, a result moves by less than
// 2^-19 (1 + S T) M; the check allows twice that.
template <typename T> void run_case(int32_t W, int32_t H, ZoriSize dst, const Pair& p,
                                    int32_t border, bool fused, uint32_t seed) {
    SCOPED_TRACE(::testing::Message()
                 << zortest::Type<T>::name << " " << W << "x" << H << " to " << dst.width << "x"
                 << dst.height << " (" << p.B << ", " << p.C << ") " << border);
    Rng rng(seed);
    // Two pixels per in-memory side: an enlargement's first window starts at -2.
    zortest::ResizeSource<T> s(W, H, border, 2, seed & 1);
    s.f.fill([&](int32_t, int32_t) {
        return sizeof(T) == 1 ? (T)rng.next() : (T)(((int32_t)rng.below(2001) - 1000) * 0.37f);
    });
    zortest::ResizeRecord rec = zortest::resize_record({W, H}, dst, zoriInterCubic, seed % 64);
    ASSERT_EQ(zoriResizeCubicInit_8u({W, H}, dst, p.B, p.C, rec.record(), rec.initBuf()),
              zorStsNoErr);
    ASSERT_TRUE(record_guards_intact(rec));
    std::vector<uint8_t> buf = zortest::resize_buffer(rec.record(), dst);
    Image<T> out(dst.width, dst.height, (dst.width + 3) * (int32_t)sizeof(T), seed % 4 * sizeof(T));
    auto run = [&](ZoriPoint o, Image<T>& d, ZoriRect r, ZoriSize z, Zor8u* b) {
        return zortest::resize_op<T>(zoriInterCubic, s.ptr(o.x, o.y), s.f.step, d.ptr(r.x, r.y),
                                     d.step, {r.x, r.y}, z, border, rec.record(), b);
    };
    ASSERT_EQ(run({0, 0}, out, {0, 0, dst.width, dst.height}, dst, buf.data()), zorStsNoErr);
    ASSERT_TRUE(zortest::guard_intact(buf, buf.size() - 64));

    const Axis ax = axis(W, dst.width, p), ay = axis(H, dst.height, p);
    const bool mem = border == 240;
    std::vector<uint8_t> pixels;
    for (int32_t y = 0; y < dst.height; ++y)
        for (int32_t x = 0; x < dst.width; ++x) {
            float r[4], m = 0, S = 0, Tw = 0;
            for (int a = 0; a < 4; ++a) {
                float px[4];
                const int32_t sy =
                    tap(ay.index[y], a, H, mem || (border & 16), mem || (border & 32));
                for (int b = 0; b < 4; ++b) {
                    px[b] = (float)s.get(
                        tap(ax.index[x], b, W, mem || (border & 64), mem || (border & 128)), sy);
                    m = fmaxf(m, fabsf(px[b]));
                }
                r[a] = quad(px, &ax.w[4 * x], fused);
                S += fabsf(ax.w[4 * x + a]);
                Tw += fabsf(ay.w[4 * y + a]);
            }
            const float v = quad(r, &ay.w[4 * y], fused);
            const T got = out.get(x, y);
            if (p.folded)
                ASSERT_TRUE(near(got, v, ldexpf(1 + S * Tw, -18) * m)) << x << "," << y;
            else if (sizeof(T) == 1)
                ASSERT_EQ(got, to_u8(v)) << x << "," << y;
            else
                ASSERT_TRUE(near(got, v, 0)) << x << "," << y << ": " << got << " vs " << v;
            // (0, 0.5) at equal sizes weighs 0, 1, 0, 0: an 8u copy.
            if (sizeof(T) == 1 && p.B == 0 && p.C == 0.5f && W == dst.width && H == dst.height)
                ASSERT_EQ(got, s.get(x, y));
            const T same = got != got ? (T)NAN : got;  // a NaN's sign and payload are free
            pixels.insert(pixels.end(), (const uint8_t*)&same, (const uint8_t*)&same + sizeof(T));
        }
    ASSERT_TRUE(zortest::agrees_within_group(fused, seed, pixels))
        << "levels of one arithmetic differ";

    Image<T> tiled = out;
    tiled.fill([](int32_t, int32_t) { return 0; });
    ASSERT_NO_FATAL_FAILURE(zortest::resize_tiles(
        rec.record(), dst, rng, seed & 2,
        [&](ZoriPoint o, ZoriRect r, ZoriSize z, Zor8u* b) { return run(o, tiled, r, z, b); }));
    // NaN weights: which NaN a sum keeps depends on operand order, which the
    // compiler may swap, so NaNs are compared as one value.
    for (Image<T>* im : {&tiled, &out})
        im->fill([&](int32_t x, int32_t y) { const T v = im->get(x, y); return v != v ? (T)NAN : v; });
    ASSERT_TRUE(same_bytes(tiled, out));
}

using Cubic = zortest::LevelTest;

// Widths across every vector tail, sources shrunk, enlarged or equal (at
// least 4), each pair with the border forms in turn; sizes level-independent.
TEST_P(Cubic, SweepMatchesModel) {
    Rng rng(7);
    uint32_t seed = 1;
    for (int32_t dw = 1; dw <= 34; ++dw) {
        const int32_t widths[] = {dw, dw * 2, dw / 2, dw * 3 / 2 + 1, 2 * dw + 3};
        const int32_t W = std::max(4, widths[dw % 5]), H = 4 + (int32_t)rng.below(6);
        const ZoriSize dst{dw, dw % 5 ? 1 + (int32_t)rng.below(9) : H};
        for (const Pair& p : kPairs) {
            const int32_t border = zortest::kResizeBorders[seed % 9];
            run_case<Zor8u>(W, H, dst, p, border, zortest::fuses(GetParam()), seed++);
            run_case<Zor32f>(W, H, dst, p, border, zortest::fuses(GetParam()), seed++);
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
