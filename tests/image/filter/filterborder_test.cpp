// The general filter with border through the public stubs, every level
// forced in turn, against a model that frames the source by the shared
// border rules and correlates in double precision.
//
// Dyadic taps (multiples of 1/16) on small pixels make every float sum
// exact in any order, fused or not: an integer pixel is then the exact sum
// converted by the record's rounding (scalar path) or to nearest (vector
// paths, which ignore the mode), a 32f pixel the sum itself. Arbitrary
// taps accept anything between the conversions of sum - bound and
// sum + bound, the bound being the float accumulation's worst error.
#include <fenv.h>
#include <math.h>
#include <string.h>

#include <string>
#include <vector>

#include "border_model.h"
#include "image.h"
#include "zortest.h"

namespace {

using zortest::Image;
using zortest::Rng;

// Type id, saturation range (none for 32f), small pixels, border value.
template <typename T> struct Pix;
#define FB_TYPE(T, sfx, idv, lov, hiv, draw, bv)                    \
    template <> struct Pix<T> {                                     \
        static constexpr ZorDataType id = idv;                      \
        static constexpr double lo = lov, hi = hiv;                 \
        static T random(Rng& g) { return (T)(draw); }               \
        static constexpr T border = bv;                             \
        static constexpr auto filter = zoriFilterBorder_##sfx##_C1R; \
    };
FB_TYPE(Zor8u, 8u, zor8u, 0, 255, g.below(256), 77)
FB_TYPE(Zor16u, 16u, zor16u, 0, 65535, g.below(4096), 1234)
FB_TYPE(Zor16s, 16s, zor16s, -32768, 32767, (int)g.below(8192) - 4096, -321)
FB_TYPE(Zor32f, 32f, zor32f, 0, 0, ((int)g.below(512) - 256) * 0.25f, 2.5f)
#undef FB_TYPE
template <typename T> constexpr bool is_int() { return Pix<T>::hi > Pix<T>::lo; }

// ---- the model ---------------------------------------------------------------

// The scalar rounding rules; NaN does not occur in these tests.
double round_by(double v, int mode, double lo, double hi) {
    if (v >= hi) return hi;
    if (v <= lo) return lo;
    if (mode == 0) return trunc(v);
    if (mode == 2) return v < 0 ? trunc(v - 0.5) : trunc(v + 0.5);
    return nearbyint(v);  // ties to even in the default rounding mode
}

struct Case {
    int W, H, kw, kh, borderType, roundMode;
};

std::string describe(const Case& c) {
    return "W " + std::to_string(c.W) + " H " + std::to_string(c.H) + " kernel " +
           std::to_string(c.kw) + "x" + std::to_string(c.kh) + " border " +
           std::to_string(c.borderType) + " round " + std::to_string(c.roundMode);
}

constexpr int64_t kConstant = INT64_MIN;

// Where the filter reads position t of an axis of n pixels, or kConstant:
// sides in memory widen the real span, and the border rule counts from
// the real span's ends.
int64_t axis_at(int t, int n, int reachLo, int reachHi, bool inLo, bool inHi, int kind) {
    const int lo = inLo ? -reachLo : 0, hi = inHi ? n + reachHi : n;
    const int64_t i = zortest::border_index(kind, t - lo, hi - lo);
    return i < 0 ? kConstant : lo + i;
}

// A source with real pixels all around the ROI, M of them on each side.
constexpr int M = 14;

template <typename T> double framed(const Image<T>& src, const Case& c, int x, int y) {
    const int ax = (c.kw - 1) / 2, ay = (c.kh - 1) / 2, f = c.borderType;
    const int kind = f & 15;
    const int64_t sx = axis_at(x, c.W, ax, c.kw - ax - 1, f & zorBorderInMemLeft,
                               f & zorBorderInMemRight, kind);
    const int64_t sy = axis_at(y, c.H, ay, c.kh - ay - 1, f & zorBorderInMemTop,
                               f & zorBorderInMemBottom, kind);
    if (sx == kConstant || sy == kConstant) return (double)Pix<T>::border;
    return (double)src.get(M + (int)sx, M + (int)sy);
}

// The exact sum at (x, y) and the float accumulation's error bound.
template <typename T>
void model(const Image<T>& src, const Case& c, const std::vector<float>& k, int x, int y,
           double* sum, double* bound) {
    const int ax = (c.kw - 1) / 2, ay = (c.kh - 1) / 2;
    double s = 0, mag = 0;
    for (int j = 0; j < c.kh; ++j)
        for (int i = 0; i < c.kw; ++i) {
            const double p = (double)k[j * c.kw + i] * framed(src, c, x + i - ax, y + j - ay);
            s += p;
            mag += fabs(p);
        }
    *sum = s;
    *bound = mag * (c.kw * c.kh + 2) * ldexp(1.0, -24);
}

// The pixel the model expects: the one we got if it is acceptable, else
// the nearest acceptable one.
template <typename T> T expected(T got, double sum, double bound, int mode) {
    if (!is_int<T>()) return fabs((double)got - sum) <= bound ? got : (T)sum;
    for (int m : {mode, 1}) {
        const double lo = round_by(sum - bound, m, Pix<T>::lo, Pix<T>::hi);
        const double hi = round_by(sum + bound, m, Pix<T>::lo, Pix<T>::hi);
        if ((double)got >= lo && (double)got <= hi) return got;
    }
    return (T)round_by(sum, mode, Pix<T>::lo, Pix<T>::hi);
}

// ---- running one case ----------------------------------------------------------

// A record of the kernel for data type t on roi and its work buffer, both
// of the sizes GetSize asks for, at odd offsets (3 and 5 bytes) inside
// blocks with guard bytes behind them; Init's status is checked against want.
struct Made {
    std::vector<uint8_t> rec, buf;
    int32_t specSize = 0, bufSize = 0;
    ZoriFilterBorderSpec* state() { return (ZoriFilterBorderSpec*)(rec.data() + 3); }
    Zor8u* buffer() { return buf.data() + 5; }
};

Made make(const float* k, ZoriSize ks, ZoriSize roi, ZorDataType t, int mode,
          ZorStatus want = zorStsNoErr) {
    Made m;
    EXPECT_EQ(zoriFilterBorderGetSize(ks, roi, t, zor32f, 1, &m.specSize, &m.bufSize), 0);
    m.rec = zortest::guarded(3 + (size_t)m.specSize);
    m.buf = zortest::guarded(5 + (size_t)m.bufSize);
    EXPECT_EQ(zoriFilterBorderInit_32f(k, ks, t, 1, mode, m.state()), want);
    EXPECT_TRUE(zortest::guard_intact(m.rec, 3 + (size_t)m.specSize)) << "Init overran";
    return m;
}

// Runs the filter on a fresh image and compares the destination with its
// guards whole against the model; the work buffer must stay within its size.
template <typename T>
void check_case(const Case& c, const std::vector<float>& k, int seed,
                const ZoriFilterBorderSpec* given = nullptr) {
    SCOPED_TRACE(describe(c));
    Rng g(seed);
    Image<T> src(c.W + 2 * M, c.H + 2 * M,
                 (c.W + 2 * M) * (int)sizeof(T) + (int)sizeof(T) * (seed % 3) + (seed % 2),
                 (size_t)(seed % 4) * sizeof(T));
    src.fill([&](int, int) { return Pix<T>::random(g); });
    Image<T> dst(c.W, c.H, c.W * (int)sizeof(T) + (sizeof(T) == 1 ? seed % 3 : 0), seed % 5);
    Made m = make(k.data(), {c.kw, c.kh}, {c.W, c.H}, Pix<T>::id, c.roundMode);
    const T value = Pix<T>::border;
    ASSERT_EQ(Pix<T>::filter(src.ptr(M, M), src.step, dst.ptr(), dst.step, {c.W, c.H},
                             c.borderType, &value, given ? given : m.state(), m.buffer()),
              zorStsNoErr);
    ASSERT_TRUE(zortest::guard_intact(m.buf, 5 + (size_t)m.bufSize)) << "work buffer overrun";
    Image<T> want = dst;
    for (int y = 0; y < c.H; ++y)
        for (int x = 0; x < c.W; ++x) {
            double sum, bound;
            model(src, c, k, x, y, &sum, &bound);
            want.set(x, y, expected(dst.get(x, y), sum, bound, c.roundMode & 3));
        }
    ASSERT_TRUE(zortest::same_bytes(dst, want));
}

// Taps k/16 with |k| <= 8 (every sum exact), or arbitrary ones.
std::vector<float> kernel(int kw, int kh, Rng& g, bool dyadic) {
    std::vector<float> k(kw * kh);
    for (float& t : k)
        t = dyadic ? (float)((int)g.below(17) - 8) / 16.0f
                   : (float)((int)g.below(1 << 20) - (1 << 19)) * ldexp(1.0f, -19);
    return k;
}

using FilterBorder = zortest::LevelTest;

// Every kernel from 1x1 to 13x13 on ROIs of 1 to 3 pixels (reaching up to
// six times past them), smaller than, equal to and just larger than the
// kernel, and a larger one; the cases rotate through every kind with every
// combination of the in-memory flags, the bare 240, and the rounding
// modes. Every fifth shape has arbitrary taps.
template <typename T> void sweep(int level) {
    Rng g(1000 + level);
    int n = 0;
    for (int kh = 1; kh <= 13; ++kh)
        for (int kw = 1; kw <= 13; ++kw) {
            const std::vector<float> k = kernel(kw, kh, g, (kw + kh) % 5 != 0);
            const int sizes[][2] = {{1 + n % 3, 1 + (n / 3) % 3},
                                    {kw > 1 ? kw - 1 : 1, kh > 2 ? kh - 2 : 1},
                                    {kw, kh},
                                    {kw + 1, kh + 1},
                                    {kw + 23 + n % 7, kh + 9}};
            for (const auto& sz : sizes) {
                const int b = n % 49;
                const int border = b == 48 ? zorBorderInMem : "\1\3\6"[b % 3] | (b / 3) << 4;
                const Case c{sz[0], sz[1], kw, kh, border, n % 3};
                ++n;
                ASSERT_NO_FATAL_FAILURE(check_case<T>(c, k, n));
            }
        }
}

TEST_P(FilterBorder, Sweep) {
    zortest::for_each_type([this](auto t) { sweep<decltype(t)>(GetParam().index); });
}

// Mirror frames longer than the image reflect at every distance: the
// pixel left of the image is pixel 1 whatever the kernel's reach.
TEST_P(FilterBorder, MirrorBeyondTheImage) {
    std::vector<float> k11(11, 0.0f), k7(7, 0.0f);
    k11[4] = 1;  // dst(x) = src(x - 1)
    k7[1] = 1;   // dst(x) = src(x - 2)
    const Zor8u a[4] = {10, 20, 30, 40}, b[3] = {10, 20, 30};
    Zor8u out[4];
    Made m11 = make(k11.data(), {11, 1}, {4, 1}, zor8u, 0), m7 = make(k7.data(), {7, 1}, {3, 1}, zor8u, 0);
    ASSERT_EQ(zoriFilterBorder_8u_C1R(a, 4, out, 4, {4, 1}, 3, nullptr, m11.state(), m11.buffer()), 0);
    EXPECT_EQ(std::vector<int>(out, out + 4), (std::vector<int>{20, 10, 20, 30}));
    ASSERT_EQ(zoriFilterBorder_8u_C1R(b, 3, out, 3, {3, 1}, 3, nullptr, m7.state(), m7.buffer()), 0);
    EXPECT_EQ(std::vector<int>(out, out + 3), (std::vector<int>{30, 20, 10}));
}

// A record is the same on every level: one made under each level serves
// every other. The kernel may already lie where the record keeps its taps
// (the 8u record here); it is then reversed in place.
TEST_P(FilterBorder, RecordFromAnotherLevelAndKernelInside) {
    Rng g(11);
    const Case c{45, 12, 5, 3, zorBorderMirror, 1};
    const std::vector<float> k = kernel(c.kw, c.kh, g, true);
    for (const zortest::Level& maker : zortest::all_levels()) {
        if (!zortest::runnable(maker)) continue;
        SCOPED_TRACE(std::string("record made under ") + maker.name);
        zorSetCpuFeatures(maker.select);
        Made m16 = make(k.data(), {c.kw, c.kh}, {c.W, c.H}, zor16s, c.roundMode);
        Made m8 = make(k.data(), {c.kw, c.kh}, {c.W, c.H}, zor8u, c.roundMode);
        float* inside = (float*)((((uintptr_t)m8.state() + 63) & ~(uintptr_t)63) + 128);
        memcpy(inside, k.data(), k.size() * sizeof(float));
        ASSERT_EQ(zoriFilterBorderInit_32f(inside, {c.kw, c.kh}, zor8u, 1, 1, m8.state()), 0);
        zorSetCpuFeatures(GetParam().select);
        ASSERT_NO_FATAL_FAILURE(check_case<Zor16s>(c, k, 3, m16.state()));
        ASSERT_NO_FATAL_FAILURE(check_case<Zor8u>(c, k, 4, m8.state()));
    }
}

// ---- rounding ----------------------------------------------------------------

// One pixel of a kernel of one or two taps on a ROI narrow enough for the
// scalar path on every level: the record's mode rules.
template <typename T> T one_pixel(std::vector<T> img, std::vector<float> k, int mode) {
    Made m = make(k.data(), {(int)k.size(), 1}, {1, 1}, Pix<T>::id, mode);
    T out = 0;
    EXPECT_EQ(Pix<T>::filter(img.data(), (int)(img.size() * sizeof(T)), &out, sizeof(T), {1, 1},
                             zorBorderInMem, nullptr, m.state(), m.buffer()),
              0);
    return out;
}

TEST_P(FilterBorder, ScalarRoundingRules) {
    // {a, b, mode, want}: the mean of a and b converted by the mode; the
    // first six rows on 8u, the rest on 16s.
    const int rows[][4] = {{254, 255, 1, 254}, {253, 254, 1, 254}, {0, 1, 1, 0},  {1, 2, 1, 2},
                           {254, 255, 2, 255}, {254, 255, 0, 254}, {-1, 0, 1, 0}, {-3, -2, 1, -2},
                           {-5, -4, 1, -4},    {-3, -2, 2, -3},    {-3, -2, 0, -2}, {-6, -5, 1, -6},
                           {32766, 32767, 1, 32766}};
    for (int i = 0; i < 13; ++i) {
        const int* r = rows[i];
        EXPECT_EQ(i < 6 ? one_pixel<Zor8u>({(Zor8u)r[0], (Zor8u)r[1]}, {0.5f, 0.5f}, r[2])
                        : one_pixel<Zor16s>({(Zor16s)r[0], (Zor16s)r[1]}, {0.5f, 0.5f}, r[2]),
                  r[3])
            << r[0] << "+" << r[1] << " mode " << r[2];
    }
    EXPECT_EQ(one_pixel<Zor8u>({171}, {1.5f}, 1), 255);  // 256.5 saturates
    EXPECT_EQ(one_pixel<Zor16s>({-32768}, {2.0f}, 0), -32768);
    EXPECT_EQ(one_pixel<Zor16u>({60000}, {2.0f}, 0), 65535);
    EXPECT_EQ(one_pixel<Zor16u>({100}, {-2.0f}, 0), 0);
}

// With roundMode 0 on a 100-wide ROI and a 3x3 kernel the edge columns
// truncate while the rest rounds to nearest: the vector paths ignore the
// mode. Every sum here is k + 0.75.
TEST_P(FilterBorder, SeamBetweenTruncatedEdgesAndRoundedCentre) {
    const int W = 100, H = 6;
    std::vector<Zor8u> img((W + 2) * (H + 2));
    for (size_t i = 0; i < img.size(); ++i) img[i] = (Zor8u)(4 * (i % 50) + 3);
    std::vector<float> k(9, 0.0f);
    k[4] = 0.25f;  // pixel 4m + 3 gives m + 0.75
    Made m = make(k.data(), {3, 3}, {W, H}, zor8u, 0);
    // Nearest is nearest whatever the caller's rounding control says.
    for (int rc : {FE_TONEAREST, FE_TOWARDZERO, FE_DOWNWARD}) {
        std::vector<Zor8u> out(W * H);
        fesetround(rc);
        const ZorStatus st = zoriFilterBorder_8u_C1R(img.data() + (W + 2) + 1, W + 2, out.data(),
                                                     W, {W, H}, zorBorderRepl, nullptr, m.state(),
                                                     m.buffer());
        fesetround(FE_TONEAREST);
        ASSERT_EQ(st, 0);
        for (int y = 0; y < H; ++y)
            for (int x = 0; x < W; ++x) {
                const int p = img[(y + 1) * (W + 2) + x + 1];
                // The top and bottom rows belong to the full-width bands.
                const bool edge = (x == 0 || x == W - 1) && y > 0 && y < H - 1;
                ASSERT_EQ(out[y * W + x], edge ? p / 4 : p / 4 + 1) << x << "," << y << " rc " << rc;
            }
    }
}

// ---- reads beyond the ROI ---------------------------------------------------------

// A ROI whose rows end right before an unreadable page (atEnd), or start
// right after one: a kernel that reads past the ROI on a side not flagged
// as in memory faults.
template <typename T> void fenced(int W, int H, int kw, int kh, bool atEnd) {
    zortest::Fenced<T> img(W, H, atEnd);
    ASSERT_TRUE(img.map);
    img.fill([](int x, int y) { return (x + y) % 13; });
    Rng g(kw);
    const std::vector<float> k = kernel(kw, kh, g, true);
    Made m = make(k.data(), {kw, kh}, {W, H}, Pix<T>::id, 1);
    std::vector<T> out(W * H);
    const T v = 1;
    for (int kind : {zorBorderRepl, zorBorderMirror, zorBorderConst})
        EXPECT_EQ(Pix<T>::filter(img.ptr(), W * (int)sizeof(T), out.data(), W * (int)sizeof(T),
                                 {W, H}, kind, &v, m.state(), m.buffer()),
                  0);
}

// Widths that leave every kind of vector tail.
TEST_P(FilterBorder, NoReadsPastTheRoiWhereNothingIsInMemory) {
    for (int W : {8, 9, 15, 17, 31, 33, 67})
        for (int kw : {1, 2, 3, 6, 11}) {
            SCOPED_TRACE("W " + std::to_string(W) + " kw " + std::to_string(kw));
            fenced<Zor32f>(W, 23, kw, 5, true);
            fenced<Zor8u>(W, 23, kw, 5, false);
        }
}

// ---- argument checks --------------------------------------------------------------

// Each row breaks one more rule than the next, so the status shows which
// test came first.
TEST_P(FilterBorder, FilterChecksInOrderAndWritesNothing) {
    const float k[9] = {0, 0, 0, 0, 1, 0, 0, 0, 0};
    Made made = make(k, {3, 3}, {8, 8}, zor8u, 1);
    const ZoriFilterBorderSpec* rec = made.state();
    Zor8u* buf = made.buffer();
    Image<Zor8u> src(24, 24), dst(8, 8);
    const Zor8u* s = src.ptr(8, 8);
    Zor8u* d = dst.ptr();
    const Image<Zor8u> before = dst;
    const Zor8u v = 0;
    const ZoriSize roi{8, 8};
    auto row = [&](ZorStatus want, const char* what, const Zor8u* ps, int32_t ss, Zor8u* pd,
                   int32_t ds, ZoriSize r, int32_t bt, const Zor8u* val,
                   const ZoriFilterBorderSpec* sp, Zor8u* b) {
        return zortest::CheckRow{want, what, [=] {
                                     return zoriFilterBorder_8u_C1R(ps, ss, pd, ds, r, bt, val, sp, b);
                                 }};
    };
    std::vector<zortest::CheckRow> rows = {
        row(zorStsNullPtrErr, "source", nullptr, 0, d, 0, {0, 0}, 2, nullptr, rec, buf),
        row(zorStsNullPtrErr, "destination", s, 0, nullptr, 0, {0, 0}, 2, nullptr, rec, buf),
        row(zorStsNullPtrErr, "record", s, 0, d, 0, {0, 0}, 2, nullptr, nullptr, buf),
        row(zorStsNullPtrErr, "buffer", s, 0, d, 0, {0, 0}, 2, nullptr, rec, nullptr),
        row(zorStsNullPtrErr, "value", s, 0, d, 0, {0, 0}, zorBorderConst | 0x100, nullptr, rec, buf),
        row(zorStsSizeErr, "width", s, 0, d, 0, {0, 8}, 2, &v, rec, buf),
        row(zorStsSizeErr, "height", s, 0, d, 0, {8, -1}, 2, &v, rec, buf),
        row(zorStsStepErr, "source step", s, 0, d, 8, roi, 2, &v, rec, buf),
        row(zorStsStepErr, "destination step", s, 8, d, 7, roi, 2, &v, rec, buf),
    };
    for (int bt : {0, 2, 4, 5, 7, 8, 15, 16 | 2, 240 | 4, 256, 256 + 1, -1, 0x7fffffff})
        rows.push_back(row(zorStsBorderErr, "border", s, 8, d, 8, roi, bt, &v, rec, buf));
    zortest::run_checks(rows, [&] { return (bool)zortest::same_bytes(dst, before); });
    // The source step is not compared with the width, and the value is
    // read for the constant kind only.
    EXPECT_EQ(zoriFilterBorder_8u_C1R(s, 1, d, 8, {8, 1}, zorBorderInMem, nullptr, rec, buf), 0);
    EXPECT_EQ(zoriFilterBorder_8u_C1R(s, 24, d, 8, roi, zorBorderRepl, nullptr, rec, buf), 0);
    Zor16u s16[64] = {}, d16[64];
    Zor32f s32[64] = {}, d32[64];
    EXPECT_EQ(zoriFilterBorder_16u_C1R(s16, 16, d16, 15, roi, 1, nullptr, rec, buf), zorStsStepErr);
    EXPECT_EQ(zoriFilterBorder_32f_C1R(s32, 32, d32, 31, roi, 1, nullptr, rec, buf), zorStsStepErr);
}

TEST_P(FilterBorder, InitChecksInOrder) {
    const float k[4] = {1, 2, 3, 4};
    std::vector<uint8_t> block(4096);
    ZoriFilterBorderSpec* rec = (ZoriFilterBorderSpec*)block.data();
    auto row = [&](ZorStatus want, const char* what, const float* pk, ZoriSize ks, int t, int c,
                   int mode, ZoriFilterBorderSpec* r) {
        return zortest::CheckRow{
            want, what, [=] { return zoriFilterBorderInit_32f(pk, ks, (ZorDataType)t, c, mode, r); }};
    };
    std::vector<zortest::CheckRow> rows = {
        row(zorStsNullPtrErr, "kernel", nullptr, {0, 0}, 0, 0, 9, rec),
        row(zorStsNullPtrErr, "record", k, {0, 0}, 0, 0, 9, nullptr),
        row(zorStsSizeErr, "size", k, {2, 0}, 0, 0, 9, rec),
    };
    for (int t : {0, 2, 3, 6, 19}) rows.push_back(row(zorStsDataTypeErr, "type", k, {2, 2}, t, 0, 9, rec));
    for (int c : {0, 5, -1}) rows.push_back(row(zorStsChannelErr, "channels", k, {2, 2}, 5, c, 9, rec));
    // The hint is the value 16; with it taken off the mode must be 0 to 2.
    for (int m : {3, 19, -1, 0x10000, 0x10002})
        rows.push_back(row(zorStsRoundModeNotSupportedErr, "mode", k, {2, 2}, 5, 4, m, rec));
    for (int m : {16, 17, 18})
        rows.push_back(row(zorStsAccurateModeNotSupported, "hint", k, {2, 2}, 1, 1, m, rec));
    for (int m : {0, 1, 2}) rows.push_back(row(zorStsNoErr, "mode", k, {2, 2}, 5, 3, m, rec));
    zortest::run_checks(rows);
}

// roundMode 16 (truncate with the hint) warns, and the record truncates
// on the scalar path.
TEST_P(FilterBorder, HintWarnsAndIsRemoved) {
    const float k[1] = {0.75f};
    Made m = make(k, {1, 1}, {3, 1}, zor8u, 16, zorStsAccurateModeNotSupported);
    const Zor8u src[3] = {3, 5, 7};
    Zor8u dst[3];
    ASSERT_EQ(zoriFilterBorder_8u_C1R(src, 3, dst, 3, {3, 1}, zorBorderRepl, nullptr, m.state(),
                                      m.buffer()),
              0);
    EXPECT_EQ(std::vector<int>(dst, dst + 3), (std::vector<int>{2, 3, 5}));  // 2.25 3.75 5.25
}

// ---- sizes ----------------------------------------------------------------------

// Worked by hand from the size rules: bands against the whole frame, the
// mirror's extra column of 2-wide kernels, 16-bit taps answered as float
// taps, channels, the double filter; and sizes past 32 bits (buffer size
// 0): lines of 2^28 floats, one frame of 2^31 rows, a 2^62-tap kernel,
// while a huge square ROI still fits, the frame following the perimeter.
TEST_P(FilterBorder, SizesOfAHandfulOfCases) {
    const int E = zorStsExceededSizeErr;
    const struct {
        int kw, kh, W, H, dataType, kernelType, channels, status, rec, buffer;
    } sizes[] = {
        {3, 3, 100, 50, 1, 13, 1, 0, 1407, 2335},   {2, 2, 10, 10, 1, 13, 1, 0, 639, 607},
        {13, 13, 13, 13, 13, 13, 1, 0, 18239, 8191}, {1, 7, 64, 8, 7, 7, 1, 0, 1535, 1695},
        {5, 5, 30, 30, 13, 13, 3, 0, 3199, 3135},   {1, 3, 16, 16, 19, 19, 1, 0, 255, 638},
        {3, 3, 12, 12, 13, 7, 1, 0, 1215, 287},     {3, 3, 1 << 28, 10, 1, 13, 1, E, -1, 0},
        {3, 3, 2, 0x7fffffff, 13, 13, 4, E, -1, 0}, {0x7fffffff, 0x7fffffff, 1, 1, 19, 19, 1, E, -1, 0},
        {3, 3, 100000, 100000, 13, 13, 1, 0, 1407, 1200575},
    };
    for (const auto& s : sizes) {
        int32_t rec = -1, buf = -1;
        EXPECT_EQ(zoriFilterBorderGetSize({s.kw, s.kh}, {s.W, s.H}, (ZorDataType)s.dataType,
                                          (ZorDataType)s.kernelType, s.channels, &rec, &buf),
                  s.status);
        if (s.rec >= 0) EXPECT_EQ(rec, s.rec) << s.kw << "x" << s.kh << " " << s.W << "x" << s.H;
        EXPECT_EQ(buf, s.buffer) << s.kw << "x" << s.kh << " " << s.W << "x" << s.H;
    }
}

TEST_P(FilterBorder, SizeChecksInOrder) {
    int32_t rec = 0, buf = 0;
    auto row = [&](ZorStatus want, const char* what, ZoriSize k, ZoriSize r, int dt, int kt, int c,
                   int32_t* ps, int32_t* pb) {
        return zortest::CheckRow{want, what, [=] {
                                     return zoriFilterBorderGetSize(k, r, (ZorDataType)dt,
                                                                    (ZorDataType)kt, c, ps, pb);
                                 }};
    };
    zortest::run_checks({
        row(zorStsSizeErr, "kernel", {0, 3}, {5, 5}, 0, 0, 0, nullptr, nullptr),
        row(zorStsSizeErr, "roi", {3, 3}, {5, 0}, 0, 0, 0, nullptr, nullptr),
        row(zorStsDataTypeErr, "64f data", {3, 3}, {5, 5}, 13, 19, 0, nullptr, nullptr),
        row(zorStsChannelErr, "64f channels", {3, 3}, {5, 5}, 19, 19, 2, nullptr, nullptr),
        row(zorStsNullPtrErr, "64f result", {3, 3}, {5, 5}, 19, 19, 1, &rec, nullptr),
        row(zorStsDataTypeErr, "64f data, float taps", {3, 3}, {5, 5}, 19, 13, 0, nullptr, nullptr),
        row(zorStsDataTypeErr, "kernel type", {3, 3}, {5, 5}, 1, 5, 0, nullptr, nullptr),
        row(zorStsChannelErr, "channels", {3, 3}, {5, 5}, 13, 13, 5, nullptr, nullptr),
        row(zorStsNullPtrErr, "record size", {3, 3}, {5, 5}, 13, 13, 4, nullptr, &buf),
        row(zorStsNullPtrErr, "buffer size", {3, 3}, {5, 5}, 13, 13, 4, &rec, nullptr),
        row(zorStsNoErr, "valid", {3, 3}, {5, 5}, 13, 13, 4, &rec, &buf),
    });
}

ZOR_INSTANTIATE_LEVELS(FilterBorder);

}  // namespace
