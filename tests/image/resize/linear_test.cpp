// Linear resize against a model: per axis pos = (i + 0.5) * ratio - 0.5, its
// floor and fraction (and 14-bit weight), then per pixel the edge or the
// interior arithmetic, whichever the strip rule gives it.
#include <fenv.h>
#include <math.h>

#include <numeric>

#include "resize_support.h"
#include "zortest.h"

namespace {

using zortest::Image;
using zortest::Rng;

enum Path { kQ14, kFloat8u, kFloat32f };

struct Tap {
    int32_t index, w;  // w: the 14-bit weight
    float f;
};
std::vector<Tap> taps(int32_t src, int32_t dst) {
    const int32_t g = std::gcd(src, dst);
    std::vector<Tap> t;
    for (int32_t i = 0; i < dst; ++i) {
        const double pos = (i + 0.5) * ((double)(src / g) / (dst / g)) - 0.5, index = floor(pos);
        t.push_back(
            {(int32_t)index, (int32_t)((pos - index) * 16384 + 1e-7), (float)(pos - index)});
    }
    return t;
}

// The source has a pixel on each in-memory side: those read true neighbours.
template <typename T> struct Model {
    zortest::ResizeSource<T>& src;
    int32_t W, H, border;
    Path path;
    bool fused;
    std::vector<Tap> tx, ty;

    double at(int32_t x, int32_t y) const { return src.get(x, y); }
    float lerp(float a, float b, float f) const {
        return fused ? fmaf(b - a, f, a) : a + (b - a) * f;
    }
    T out(double v) const {
        if (path == kFloat8u) return (T)std::clamp((int32_t)nearbyintf((float)v), 0, 255);
        return (T)v;
    }
    double edge(double a, double b, const Tap& t, bool alongY) const {
        if (path != kQ14) return lerp((float)a, (float)b, t.f);
        const int32_t v = alongY ? ((int32_t)a << 14) + ((int32_t)b - (int32_t)a) * t.w
                                 : (int32_t)a * (16384 - t.w) + (int32_t)b * t.w;
        return (v + ((v >> 14) & 1) + 8192) >> 14;
    }
    double row(int32_t y, const Tap& x) const {
        const double a = at(x.index, y), b = at(x.index + 1, y);
        if (path == kQ14) return ((int32_t)a * (16384 - x.w) + (int32_t)b * x.w + 128) >> 8;
        return lerp((float)a, (float)b, x.f);
    }
    T pixel(int32_t i, int32_t j) const {
        const Tap &x = tx[i], &y = ty[j];
        const bool top = !(border & 16) && y.index < 0, bottom = !(border & 32) && y.index >= H - 1;
        const bool left = !(border & 64) && x.index < 0,
                   right = !(border & 128) && x.index >= W - 1;
        if (top || bottom) {
            const int32_t r = top ? 0 : H - 1, c = left ? 0 : right ? W - 1 : x.index;
            return out(edge(at(c, r), at(left || right ? c : c + 1, r), x, false));
        }
        if (left || right) {
            const int32_t c = left ? 0 : W - 1;
            return out(edge(at(c, y.index), at(c, y.index + 1), y, true));
        }
        const double r0 = row(y.index, x), r1 = row(y.index + 1, x);
        if (path == kQ14)
            return (T)std::min(255,
                               ((int32_t)r0 * (16384 - y.w) + (int32_t)r1 * y.w + 0x80000) >> 20);
        return out(lerp((float)r0, (float)r1, y.f));
    }
};

// One resize in tiles against the model; fused levels also within 8 ulp of
// the largest source magnitude (8u: 1) of the unfused model: each pass adds
// at most 2 ulp of its inputs' magnitude, the vertical one carries both.
template <typename T> void run_case(Path path, ZoriSize S, ZoriSize D, int32_t border, bool fused,
                                    Rng& rng, int round = FE_TONEAREST, bool stripes = false) {
    SCOPED_TRACE(::testing::Message() << S.width << "x" << S.height << " -> " << D.width << "x"
                                      << D.height << " border " << border << " path " << path);
    zortest::ResizeRecord rec = zortest::resize_record(S, D, zoriInterLinear, rng.below(64));
    ASSERT_EQ(
        (path == kQ14 ? zoriResizeLinearInit_8u : zoriResizeLinearInit_32f)(S, D, rec.record()),
        zorStsNoErr);
    ASSERT_TRUE(zortest::record_guards_intact(rec));
    zortest::ResizeSource<T> src(S.width, S.height, border, 1, rng.below(2));
    double M = 0;  // the largest finite source magnitude
    src.f.fill([&](int x, int y) {
        const T v = stripes ? (T)(5 + ((x + y) & 1)) : zortest::Type<T>::random(rng);
        if (isfinite((double)v)) M = std::max(M, fabs((double)v));
        return v;
    });
    Image<T> got(D.width, D.height, (D.width + (int32_t)rng.below(5)) * sizeof(T),
                 rng.below(4) * sizeof(T));
    Image<T> want = got, loose = got;
    Model<T> m{src,
               S.width,
               S.height,
               border,
               path,
               fused,
               taps(S.width, D.width),
               taps(S.height, D.height)};
    fesetround(round);
    for (Image<T>* im : {&want, &loose}) {
        for (int32_t j = 0; j < D.height; ++j)
            for (int32_t i = 0; i < D.width; ++i) im->set(i, j, m.pixel(i, j));
        m.fused = false;
    }
    ASSERT_NO_FATAL_FAILURE(zortest::resize_tiles(
        rec.record(), D, rng, rng.below(2), [&](ZoriPoint o, ZoriRect r, ZoriSize z, Zor8u* b) {
            return zortest::resize_op<T>(zoriInterLinear, src.ptr(o.x, o.y), src.f.step,
                                         got.ptr(r.x, r.y), got.step, {r.x, r.y}, z, border,
                                         rec.record(), b);
        }));
    fesetround(FE_TONEAREST);
    const double bound = path == kFloat32f ? 8 * ldexp(1.0, ilogb(std::max(M, 1e-30)) - 23) : 1;
    for (int32_t y = 0; y < D.height; ++y)
        for (int32_t x = 0; x < D.width; ++x) {
            const T g = got.get(x, y), l = loose.get(x, y);
            ASSERT_TRUE(g == l || (g != g && l != l) || fabs((double)g - l) <= bound)
                << x << "," << y;
            if (g != g) got.set(x, y, want.get(x, y));  // NaN payloads follow operand order
        }
    ASSERT_TRUE(same_bytes(got, want));
}

using Linear = zortest::LevelTest;

// Widths across every vector tail, shrinking and enlarging, 2x2 sources, 1-pixel
// destinations, border forms in turn; float 8u also under directed rounding.
TEST_P(Linear, SizesBordersAndTilesMatchTheModel) {
    const bool fused = zortest::fuses(GetParam());
    Rng rng(GetParam().index + 1);
    int k = 0;
    auto one = [&](Path path, ZoriSize S, ZoriSize D, int round) {
        const int32_t border = zortest::kResizeBorders[k++ % 9];
        if (path == kFloat32f) return run_case<Zor32f>(path, S, D, border, fused, rng);
        run_case<Zor8u>(path, S, D, border, fused, rng, path == kQ14 ? FE_TONEAREST : round);
    };
    for (Path path : {kQ14, kFloat8u, kFloat32f})
        for (int32_t dw = 1; dw <= (path == kFloat32f ? 33 : 129); ++dw) {
            const int32_t widths[] = {dw * 2, dw / 2, dw, dw * 3 / 2 + 1, 2 * dw + 3};
            const ZoriSize S{std::max(2, widths[k % 5]), 2 + (int32_t)rng.below(6)};
            const int round = k % 3 ? FE_TONEAREST : k % 2 ? FE_UPWARD : FE_DOWNWARD;
            ASSERT_NO_FATAL_FAILURE(one(path, S, {dw, 1 + (int32_t)rng.below(9)}, round));
        }
    for (const ZoriSize& S : {ZoriSize{2, 2}, ZoriSize{240, 136}})
        for (const ZoriSize& D :
             {ZoriSize{1, 1}, ZoriSize{S.width * 2, S.height * 2},
              ZoriSize{S.width / 2, S.height / 2}, ZoriSize{S.width * 2 / 3 + 1, S.height * 4 / 3}})
            for (Path path : {kQ14, kFloat8u, kFloat32f})
                ASSERT_NO_FATAL_FAILURE(one(path, S, D, FE_TONEAREST));
    // Edge weight 8191 between 5 and 6: the odd integer part rounds it up.
    ASSERT_NO_FATAL_FAILURE(
        run_case<Zor8u>(kQ14, {2, 2}, {16384, 4}, 1, fused, rng, FE_TONEAREST, true));
}

TEST_P(Linear, ChecksInOrderWriteNothing) {
    const ZoriSize S{9, 7}, D{5, 4};
    zortest::ResizeRecord q = zortest::resize_record(S, D, zoriInterLinear), f = q;
    for (auto init : {zoriResizeLinearInit_8u, zoriResizeLinearInit_32f})
        zortest::resize_init_checks(
            [&](ZoriSize s, ZoriSize d, ZoriResizeSpec* r, Zor8u*) { return init(s, d, r); }, S, D,
            2, false);
    ASSERT_EQ(zoriResizeLinearInit_8u(S, D, q.record()), zorStsNoErr);
    ASSERT_EQ(zoriResizeLinearInit_32f(S, D, f.record()), zorStsNoErr);
    zortest::resize_op_checks<Zor32f>(zoriInterLinear, S, D, f.record(), {q.record()});
}

ZOR_INSTANTIATE_LEVELS(Linear);

}  // namespace
