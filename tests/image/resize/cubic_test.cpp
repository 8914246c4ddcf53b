// Cubic resize through the public stubs on every level against a model made
// from the formulas: positions, fractions and (B, C) weights in double from
// the general formula, two passes of (x0*c0 + x1*c1) + (x2*c2 + x3*c3)
// (fused levels round x1*c1 onto the rounded x0*c0), taps replicated on the
// sides without an in-memory flag. Sources sit against unreadable pages
// with exactly the margins the flags promise.
#include <float.h>
#include <math.h>
#include <xmmintrin.h>

#include <string>
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
const Pair kPairs[] = {{0, 0.5f, false}, {1, 0, true}, {0.5f, 0.3f, true},
                       {1 / 3.0f, 1 / 3.0f, false}, {-1, 2.5f, false}, {NAN, 0, false}};
const int32_t kBorders[] = {1, 240, 1 | 16, 1 | 32, 1 | 64, 1 | 128, 1 | 16 | 64, 1 | 32 | 128, 241};

double weight(double x, double B, double C) {
    if (x >= 2) return 0;
    if (x < 1) return ((2 - 1.5 * B - C) * x + (-3 + 2 * B + C)) * (x * x) + (1 - B / 3);
    if (x < 2)
        return (((-B / 6 - C) * x + (B + 5 * C)) * x - (2 * B + 8 * C)) * x + (4 * B / 3 + 4 * C);
    return 1;
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

// The source with the margins a border form lets the library read: two
// on each in-memory side (an enlargement's first window starts at -2).
// Against an unreadable page.
template <typename T> struct Source {
    int32_t l, u;
    zortest::Fenced<T> f;
    Source(int32_t W, int32_t H, int32_t border, bool atEnd)
        : l(border & 64 ? 2 : 0), u(border & 16 ? 2 : 0),
          f(W + l + (border & 128 ? 2 : 0), H + u + (border & 32 ? 2 : 0), atEnd,
            (W + l + (border & 128 ? 2 : 0) + 1) * (int32_t)sizeof(T)) {}
    T* ptr(int32_t x, int32_t y) { return f.ptr(x + l, y + u); }
    float get(int32_t x, int32_t y) {
        T v;
        memcpy(&v, ptr(x, y), sizeof v);
        return (float)v;
    }
};

template <typename T> T value(Rng& r) {
    if constexpr (sizeof(T) == 1) return (T)r.next();
    return (float)((int32_t)r.below(2001) - 1000) * 0.37f;
}

// The model's float value of every destination pixel, and the bound by
// which a folded kernel's weights (each within 2^-22 of the general
// formula's) may move it: 4 taps of error 2^-22 M per pass and the two
// passes' roundings stay under 2^-19 (1 + S T) M, S and T the weights'
// absolute sums, M the largest tap; the bound doubles that.
template <typename T>
void model(Source<T>& s, int32_t W, int32_t H, ZoriSize dst, int32_t border, const Pair& p,
           bool fused, std::vector<float>& v, std::vector<float>& tol) {
    const Axis ax = axis(W, dst.width, p), ay = axis(H, dst.height, p);
    const bool in[4] = {border == 240 || (border & 16), border == 240 || (border & 32),
                        border == 240 || (border & 64), border == 240 || (border & 128)};
    v.assign((size_t)dst.width * dst.height, 0);
    tol = v;
    for (int32_t y = 0; y < dst.height; ++y)
        for (int32_t x = 0; x < dst.width; ++x) {
            float r[4], m = 0, S = 0, Tw = 0;
            for (int a = 0; a < 4; ++a) {
                float px[4];
                const int32_t sy = tap(ay.index[y], a, H, in[0], in[1]);
                for (int b = 0; b < 4; ++b) {
                    px[b] = s.get(tap(ax.index[x], b, W, in[2], in[3]), sy);
                    m = fmaxf(m, fabsf(px[b]));
                }
                r[a] = quad(px, &ax.w[4 * x], fused);
                S += fabsf(ax.w[4 * x + a]);
                Tw += fabsf(ay.w[4 * y + a]);
            }
            v[(size_t)y * dst.width + x] = quad(r, &ay.w[4 * y], fused);
            tol[(size_t)y * dst.width + x] = p.folded ? ldexpf(1 + S * Tw, -18) * m : 0;
        }
}

template <typename T> struct Op;
template <> struct Op<Zor8u> {
    static constexpr auto run = zoriResizeCubic_8u_C1R;
    static bool near(Zor8u got, float v, float tol) {
        return to_u8(v - tol) <= got && got <= to_u8(v + tol);
    }
};
template <> struct Op<Zor32f> {
    static constexpr auto run = zoriResizeCubic_32f_C1R;
    static bool near(float got, float v, float tol) {
        return isnan(v) ? isnan(got) : fabsf(got - v) <= tol;
    }
};

// Runs the destination as one call and as random tiles; the model decides.
template <typename T>
void run_case(int32_t W, int32_t H, ZoriSize dst, const Pair& p, int32_t border, bool fused,
              uint32_t seed) {
    SCOPED_TRACE(std::string(zortest::Type<T>::name) + " " + std::to_string(W) + "x" +
                 std::to_string(H) + " -> " + std::to_string(dst.width) + "x" +
                 std::to_string(dst.height) + " B " + std::to_string(p.B) + " C " +
                 std::to_string(p.C) + " border " + std::to_string(border));
    Rng rng(seed);
    Source<T> s(W, H, border, seed & 1);
    s.f.fill([&](int32_t, int32_t) { return value<T>(rng); });
    zortest::ResizeRecord rec = zortest::resize_record({W, H}, dst, zoriInterCubic, seed % 64);
    ASSERT_EQ(zoriResizeCubicInit_8u({W, H}, dst, p.B, p.C, rec.spec(), rec.initBuf()),
              zorStsNoErr);
    ASSERT_TRUE(record_guards_intact(rec));
    std::vector<uint8_t> buf = zortest::resize_buffer(rec.spec(), dst);
    Image<T> out(dst.width, dst.height, (dst.width + 3) * (int32_t)sizeof(T), seed % 4 * sizeof(T));
    ASSERT_EQ(Op<T>::run(s.ptr(0, 0), s.f.step, out.ptr(), out.step, {0, 0}, dst, (ZoriBorderType)border, nullptr,
                         rec.spec(), buf.data()),
              zorStsNoErr);
    ASSERT_TRUE(zortest::guard_intact(buf, buf.size() - 64));
    std::vector<float> v, tol;
    model(s, W, H, dst, border, p, fused, v, tol);
    for (int32_t y = 0; y < dst.height; ++y)
        for (int32_t x = 0; x < dst.width; ++x) {
            const size_t i = (size_t)y * dst.width + x;
            if (tol[i] == 0 && sizeof(T) == 1)
                ASSERT_EQ(out.get(x, y), to_u8(v[i])) << x << "," << y;
            else
                ASSERT_TRUE(Op<T>::near(out.get(x, y), v[i], tol[i]))
                    << x << "," << y << ": " << +out.get(x, y) << " vs " << v[i];
        }
    // Any tiling gives the same bytes; guard bytes around the image too.
    Image<T> tiled = out;
    tiled.fill([](int32_t, int32_t) { return 0; });
    for (const ZoriRect& r : zortest::random_tiles(dst, rng)) {
        ZoriPoint off;
        ASSERT_EQ(zoriResizeGetSrcOffset_8u(rec.spec(), {r.x, r.y}, &off), zorStsNoErr);
        std::vector<uint8_t> tb = zortest::resize_buffer(rec.spec(), {r.width, r.height});
        ASSERT_EQ(Op<T>::run(s.ptr(off.x, off.y), s.f.step, tiled.ptr(r.x, r.y), tiled.step,
                             {r.x, r.y}, {r.width, r.height}, (ZoriBorderType)border, nullptr, rec.spec(),
                             tb.data()),
                  zorStsNoErr);
    }
    ASSERT_TRUE(same_bytes(tiled, out));
}

using Cubic = zortest::LevelTest;

// Sizes: the smallest source, equal sizes, integer and non-integer ratios
// both ways, and destination widths around every vector width; each with
// every pair and border form in turn.
TEST_P(Cubic, SweepMatchesModel) {
    const bool fused = GetParam().index >= 4;
    const int32_t sizes[][4] = {{4, 4, 4, 4},    {4, 4, 9, 7},   {4, 5, 1, 2},    {9, 4, 4, 9},
                                {16, 12, 8, 6},  {30, 9, 10, 3}, {17, 13, 11, 8}, {11, 8, 17, 13},
                                {8, 6, 16, 12},  {37, 7, 3, 5},  {37, 7, 15, 5},  {37, 7, 16, 5},
                                {37, 7, 17, 5},  {37, 7, 31, 5}, {37, 7, 33, 5},  {64, 7, 47, 5},
                                {20, 20, 20, 20}};
    uint32_t seed = 1;
    for (const auto& z : sizes)
        for (const Pair& p : kPairs)
            for (int32_t border : {kBorders[seed % 9], kBorders[(seed + 4) % 9]}) {
                run_case<Zor8u>(z[0], z[1], {z[2], z[3]}, p, border, fused, seed++);
                run_case<Zor32f>(z[0], z[1], {z[2], z[3]}, p, border, fused, seed++);
                if (HasFatalFailure()) return;
            }
}

// (0, 0.5) at equal sizes weighs 0, 1, 0, 0 everywhere: an 8u copy.
TEST_P(Cubic, CatmullRomAtEqualSizesCopies8u) {
    for (int32_t n : {4, 19, 40}) {
        Rng rng((uint32_t)n);
        Image<Zor8u> src(n, n + 1), dst(n, n + 1);
        src.randomize(rng);
        zortest::ResizeRecord rec = zortest::resize_record(src.size(), src.size(), zoriInterCubic);
        ASSERT_EQ(zoriResizeCubicInit_8u(src.size(), src.size(), 0, 0.5f, rec.spec(), rec.initBuf()),
                  zorStsNoErr);
        std::vector<uint8_t> buf = zortest::resize_buffer(rec.spec(), src.size());
        ASSERT_EQ(zoriResizeCubic_8u_C1R(src.ptr(), src.step, dst.ptr(), dst.step, {0, 0},
                                         src.size(), zorBorderRepl, nullptr, rec.spec(), buf.data()),
                  zorStsNoErr);
        EXPECT_TRUE(same_bytes(dst, src));
    }
}

// Init leaves the caller's rounding, flush and underflow settings as they
// were, whatever they were.
TEST_P(Cubic, InitKeepsTheCallersControlWord) {
    const unsigned int saved = _mm_getcsr();
    for (unsigned int csr : {0x1f80u, 0x7f80u | 0x8000u, 0x3f80u | 0x0040u, 0x1780u}) {
        zortest::ResizeRecord rec = zortest::resize_record({7, 5}, {3, 11}, zoriInterCubic);
        _mm_setcsr(csr);
        const ZorStatus st = zoriResizeCubicInit_8u({7, 5}, {3, 11}, 1, 0, rec.spec(), rec.initBuf());
        const unsigned int after = _mm_getcsr();
        _mm_setcsr(saved);
        EXPECT_EQ(st, zorStsNoErr);
        EXPECT_EQ(after & ~0x2fu, csr) << std::hex << csr;
    }
}

TEST_P(Cubic, ChecksInOrder) {
    const ZoriSize src{6, 5}, dst{4, 7};
    zortest::ResizeRecord rec = zortest::resize_record(src, dst, zoriInterCubic);
    zortest::ResizeRecord near = zortest::resize_record(src, dst, zoriInterNN);
    ZoriResizeSpec* spec = rec.spec();
    const std::vector<uint8_t> blank = rec.mem;
    Zor8u* ib = rec.initBuf();
    auto init = [&](ZoriSize s, ZoriSize d, ZoriResizeSpec* sp, Zor8u* b) {
        return [=] { return zoriResizeCubicInit_32f(s, d, 0, 0.5f, sp, b); };
    };
    zortest::run_checks({{zorStsNullPtrErr, "null record", init(src, dst, nullptr, ib)},
                         {zorStsNullPtrErr, "null init buffer", init(src, dst, spec, nullptr)},
                         {zorStsNoOperation, "zero length", init(src, {0, 7}, spec, ib)},
                         {zorStsSizeErr, "negative length", init({-6, 5}, dst, spec, ib)},
                         {zorStsSizeErr, "source narrower than 4", init({3, 5}, dst, spec, ib)},
                         {zorStsSizeErr, "source lower than 4", init({6, 3}, dst, spec, ib)}},
                        [&] { return rec.mem == blank; });
    ASSERT_EQ(zoriResizeCubicInit_8u(src, dst, 0, 0.5f, spec, ib), zorStsNoErr);
    ASSERT_EQ(zoriResizeNearestInit_8u(src, dst, near.spec()), zorStsNoErr);
    Image<Zor32f> s(6, 5), d(4, 7);
    const Image<Zor32f> before = d;
    std::vector<uint8_t> buf = zortest::resize_buffer(spec, dst), zero(512, 0);
    auto run = [&](int32_t border, const Zor32f* ps, int32_t ss, Zor32f* pd, ZoriPoint o,
                   ZoriSize z, const ZoriResizeSpec* sp, Zor8u* b) {
        return [=] { return zoriResizeCubic_32f_C1R(ps, ss, pd, 16, o, z, (ZoriBorderType)border, nullptr, sp, b); };
    };
    const ZoriResizeSpec* bad = (const ZoriResizeSpec*)zero.data();
    Zor8u* b = buf.data();
    zortest::run_checks(
        {{zorStsBorderErr, "border 0", run(0, nullptr, 24, d.ptr(), {0, 0}, dst, bad, b)},
         {zorStsBorderErr, "mirror", run(3, s.ptr(), 24, d.ptr(), {0, 0}, dst, spec, b)},
         {zorStsBorderErr, "above 255", run(257, s.ptr(), 24, d.ptr(), {0, 0}, dst, spec, b)},
         {zorStsNullPtrErr, "null source", run(1, nullptr, 24, d.ptr(), {0, 0}, dst, spec, b)},
         {zorStsNullPtrErr, "null destination", run(1, s.ptr(), 24, nullptr, {0, 0}, dst, spec, b)},
         {zorStsNullPtrErr, "null record", run(1, s.ptr(), 24, d.ptr(), {0, 0}, dst, nullptr, b)},
         {zorStsNullPtrErr, "null buffer", run(1, s.ptr(), 24, d.ptr(), {0, 0}, dst, spec, nullptr)},
         {zorStsNoOperation, "zero size first", run(1, s.ptr(), 24, d.ptr(), {0, 0}, {0, 1}, bad, b)},
         {zorStsContextMatchErr, "record id", run(1, s.ptr(), 24, d.ptr(), {0, 0}, dst, bad, b)},
         {zorStsSizeErr, "negative size", run(1, s.ptr(), 26, d.ptr(), {0, 0}, {-1, 1}, spec, b)},
         {zorStsStepErr, "step", run(1, s.ptr(), 26, d.ptr(), {0, 0}, dst, spec, b)},
         {zorStsOutOfRangeErr, "offset", run(1, s.ptr(), 24, d.ptr(), {4, 0}, dst, spec, b)},
         {zorStsOutOfRangeErr, "offset", run(1, s.ptr(), 24, d.ptr(), {0, -1}, dst, spec, b)},
         {zorStsContextMatchErr, "nearest record",
          run(1, s.ptr(), 24, d.ptr(), {0, 0}, dst, near.spec(), b)}},
        [&] { return same_bytes(d, before); });
    // A tile running past the destination is clipped, written, and says so.
    EXPECT_EQ(run(1, s.ptr(), 24, d.ptr(), {0, 0}, {5, 8}, spec, b)(), zorStsSizeWrn);
    EXPECT_FALSE(same_bytes(d, before));
}

ZOR_INSTANTIATE_LEVELS(Cubic);

// Levels without fused multiply-add agree bit for bit, and so do the fused
// ones, on the folded pairs too.
TEST(CubicLevels, AgreeWithinEachArithmetic) {
    const ZoriSize src{45, 23}, dst{61, 17};
    Rng rng(5);
    Image<Zor32f> s(src.width, src.height);
    s.fill([&](int32_t, int32_t) { return value<Zor32f>(rng); });
    for (const Pair& p : kPairs) {
        std::vector<uint8_t> first[2];
        for (const zortest::Level& level : zortest::all_levels()) {
            if (!zortest::runnable(level)) continue;
            zorSetCpuFeatures(level.select);
            zortest::ResizeRecord rec = zortest::resize_record(src, dst, zoriInterCubic);
            ASSERT_EQ(zoriResizeCubicInit_32f(src, dst, p.B, p.C, rec.spec(), rec.initBuf()),
                      zorStsNoErr);
            std::vector<uint8_t> buf = zortest::resize_buffer(rec.spec(), dst);
            Image<Zor32f> d(dst.width, dst.height);
            ASSERT_EQ(zoriResizeCubic_32f_C1R(s.ptr(), s.step, d.ptr(), d.step, {0, 0}, dst, zorBorderRepl,
                                              nullptr, rec.spec(), buf.data()),
                      zorStsNoErr);
            std::vector<uint8_t>& want = first[level.index >= 4];
            if (want.empty()) want = d.mem;
            EXPECT_TRUE(want == d.mem) << level.name << " B " << p.B << " C " << p.C;
        }
    }
    zorInit();
}

}  // namespace
