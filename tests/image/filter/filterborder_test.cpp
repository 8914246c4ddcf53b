// The general filter with border through the public stubs, every level
// forced in turn, against a model that frames the image by the border
// definition and correlates in double precision.
//
// Integer checks are exact: the taps are multiples of 1/16 and the pixels
// small enough that every float sum is exact, whatever the order or the
// use of fused multiply-add, so the expected value is the exact sum
// converted by the rounding of the path the pixel's rectangle takes on
// that level. Tests with arbitrary taps accept any value between the
// conversions of (sum - bound) and (sum + bound), the bound being the
// float accumulation's worst error: a sum that close to a rounding edge
// may legitimately land on either side.
#include <fenv.h>
#include <math.h>
#include <string.h>
#include <sys/mman.h>
#include <unistd.h>

#include <functional>
#include <random>
#include <string>
#include <vector>

#include "image_support.h"
#include "zortest.h"

namespace {

constexpr int kLevelsSse = 3;  // m7, n8, y8 come first in level order

// ---- element types -----------------------------------------------------------

template <typename T> struct Type;
// Type id, integer or not, saturation range, random pixel, border value.
#define FB_TYPE(T, sfx, idv, intv, lov, hiv, rnd, bv)                 \
    template <> struct Type<T> {                                       \
        static constexpr ZorDataType id = idv;                         \
        static constexpr bool isInt = intv;                            \
        static constexpr double lo = lov, hi = hiv;                    \
        static T random(std::mt19937& g) { return rnd; }               \
        static constexpr T border = bv;                                \
        static constexpr auto filter = zoriFilterBorder_##sfx##_C1R;   \
    };
FB_TYPE(Zor8u, 8u, zor8u, true, 0, 255, (Zor8u)(g() & 255), 77)
FB_TYPE(Zor16u, 16u, zor16u, true, 0, 65535, (Zor16u)(g() & 4095), 1234)
FB_TYPE(Zor16s, 16s, zor16s, true, -32768, 32767, (Zor16s)((int)(g() & 8191) - 4096), -321)
FB_TYPE(Zor32f, 32f, zor32f, false, 0, 0,
        std::uniform_real_distribution<float>(-100.0f, 100.0f)(g), 2.5f)
#undef FB_TYPE

// ---- the model ---------------------------------------------------------------

// The scalar rounding rules; NaN does not occur in these tests.
double round_by(double v, int mode, double lo, double hi) {
    if (v >= hi) return hi;
    if (v <= lo) return lo;
    if (mode == 0) return trunc(v);
    if (mode == 2) return v < 0 ? trunc(v - 0.5) : trunc(v + 0.5);
    return nearbyint(v);  // ties to even in the default rounding mode
}

// Mirror of a border b >= n pixels: a triangular wave of period 2n - 2.
int tri(long k, int n) {
    if (n == 1) return 0;
    const long p = 2L * n - 2, m = k % p;
    return (int)(m < n ? m : p - m);
}

struct Axis {
    int lo, hi;         // pixels that are real: [lo, hi) relative to the ROI
    int before, after;  // made-up pixels the kernel reads on each side
};

constexpr long kConst = -(1L << 40);

// Where a made-up pixel at t (t < lo or t >= hi) reads from, or kConst for
// the constant. Reflections count from the real span, as the frame copies do.
long map_axis(const Axis& a, int t, int kind) {
    if (t >= a.lo && t < a.hi) return t;
    if (kind == zorBorderConst) return kConst;
    const int n = a.hi - a.lo;
    if (kind == zorBorderRepl) return t < a.lo ? a.lo : a.hi - 1;
    if (t < a.lo) {
        const int d = a.lo - t, b = a.before;
        return a.lo + (b < n ? d : tri((long)b + (b - d), n));
    }
    const int j = t - a.hi, b = a.after;
    return a.lo + (b < n ? n - 2 - j : n - 1 - tri((long)b + (b - 1 - j), n));
}

struct Case {
    int W, H, kw, kh, borderType, roundMode;
};

// Which sides count as in memory after the driver completes the flags.
int completed_flags(const Case& c) {
    const int ax = (c.kw - 1) / 2, ay = (c.kh - 1) / 2;
    int f = c.borderType & 0xF0;
    if (ax == 0) f |= zorBorderInMemLeft | (c.kw == 1 ? zorBorderInMemRight : 0);
    if (ay == 0) f |= zorBorderInMemTop | (c.kh == 1 ? zorBorderInMemBottom : 0);
    return f;
}

// The rectangle that holds output pixel (x, y) as the driver cuts the ROI:
// its width decides the path, and the path the integer rounding.
void rect_of(const Case& c, int x, int y, int* rw) {
    const int ax = (c.kw - 1) / 2, ay = (c.kh - 1) / 2;
    const int kind = c.borderType & 15;
    const int f = completed_flags(c);
    const bool small = c.W <= c.kw || c.H <= c.kh;
    if (f == 0xF0 || small) {
        *rw = c.W;
        return;
    }
    int right = c.kw - ax - 1, bottom = c.kh - ay - 1;
    if (kind == zorBorderMirror) {
        if (c.kw == 2) right = 2;
        if (c.kh == 2) bottom = 2;
    }
    const int top = f & zorBorderInMemTop ? 0 : ay;
    const int bot = f & zorBorderInMemBottom ? 0 : bottom;
    if (y < top || y >= c.H - bot) {
        *rw = c.W;
        return;
    }
    const int left = f & zorBorderInMemLeft ? 0 : ax;
    const int rgt = f & zorBorderInMemRight ? 0 : right;
    if (x < left)
        *rw = left;
    else if (x >= c.W - rgt)
        *rw = rgt;
    else
        *rw = c.W - left - rgt;
}

// Rounding mode of a rectangle of width w on a level: the record's on the
// scalar path, nearest on the vector paths.
int mode_of(int level, const Case& c, int w) {
    const bool scalar = level < kLevelsSse ? (c.kw <= 2 || w <= 16) : w < 8;
    return scalar ? c.roundMode : 1;
}

// An image with real pixels all around the ROI (margin M), at a chosen
// misalignment and row step.
template <typename T> struct Source {
    static constexpr int M = 14;
    std::vector<uint8_t> mem;
    int32_t step;
    T* roi;
    Source(int W, int H, int pad, int offsetBytes, std::mt19937& g) {
        step = (int32_t)((W + 2 * M) * sizeof(T)) + pad;
        mem.assign((size_t)step * (H + 2 * M) + 64 + sizeof(T), 0);
        uint8_t* base = mem.data() + offsetBytes;
        for (int y = 0; y < H + 2 * M; ++y)
            for (int x = 0; x < W + 2 * M; ++x) {
                const T v = Type<T>::random(g);
                memcpy(base + (size_t)y * step + x * sizeof(T), &v, sizeof v);
            }
        roi = (T*)(base + (size_t)M * step + M * sizeof(T));
    }
    T at(int x, int y) const {
        T v;
        memcpy(&v, (const uint8_t*)roi + (ptrdiff_t)y * step + (ptrdiff_t)x * (ptrdiff_t)sizeof(T),
               sizeof v);
        return v;
    }
};

// The framed source pixel the filter sees at (x, y), ROI coordinates.
template <typename T> double framed(const Source<T>& src, const Case& c, int x, int y) {
    const int ax = (c.kw - 1) / 2, ay = (c.kh - 1) / 2;
    const int right = c.kw - ax - 1, bottom = c.kh - ay - 1;
    const int f = completed_flags(c);
    if (f == 0xF0) return (double)src.at(x, y);
    const int kind = c.borderType & 15;
    const bool inT = f & zorBorderInMemTop, inB = f & zorBorderInMemBottom;
    const bool inL = f & zorBorderInMemLeft, inR = f & zorBorderInMemRight;
    const Axis h{inL ? -ax : 0, inR ? c.W + right : c.W, inL ? 0 : ax, inR ? 0 : right};
    const Axis v{inT ? -ay : 0, inB ? c.H + bottom : c.H, inT ? 0 : ay, inB ? 0 : bottom};
    const long mx = map_axis(h, x, kind), my = map_axis(v, y, kind);
    if (mx == kConst || my == kConst) return (double)Type<T>::border;
    return (double)src.at((int)mx, (int)my);
}

struct Expect {
    double value, bound;  // exact sum and the float accumulation's error bound
};

template <typename T>
Expect model(const Source<T>& src, const Case& c, const std::vector<float>& k, int x, int y) {
    const int ax = (c.kw - 1) / 2, ay = (c.kh - 1) / 2;
    double sum = 0, mag = 0;
    for (int j = 0; j < c.kh; ++j)
        for (int i = 0; i < c.kw; ++i) {
            const double p = (double)k[j * c.kw + i] * framed(src, c, x + i - ax, y + j - ay);
            sum += p;
            mag += fabs(p);
        }
    return {sum, mag * (c.kw * c.kh + 2) * ldexp(1.0, -24)};
}

// ---- running one case ----------------------------------------------------------

constexpr uint8_t kGuard = zortest::kGuardByte;
using zortest::guard_intact;

// A record of the kernel for data type t on roi and its work buffer, both
// of the sizes GetSize asks for, at odd offsets (3 and 5 bytes) inside
// blocks with guard bytes behind them; Init's status is checked against want.
struct Made {
    std::vector<uint8_t> rec, buf;
    int32_t specSize = 0, bufSize = 0;
    ZoriFilterBorderSpec* state() { return (ZoriFilterBorderSpec*)(rec.data() + 3); }
    Zor8u* buffer() { return buf.data() + 5; }
    bool buffer_intact() const { return guard_intact(buf, 5 + (size_t)bufSize); }
};

Made make(const float* k, ZoriSize ks, ZoriSize roi, ZorDataType t, int mode,
          ZorStatus want = zorStsNoErr) {
    Made m;
    EXPECT_EQ(zoriFilterBorderGetSize(ks, roi, t, zor32f, 1, &m.specSize, &m.bufSize),
              zorStsNoErr);
    m.rec = zortest::guarded(3 + (size_t)m.specSize);
    m.buf = zortest::guarded(5 + (size_t)m.bufSize);
    EXPECT_EQ(zoriFilterBorderInit_32f(k, ks, t, 1, mode, m.state()), want);
    EXPECT_TRUE(guard_intact(m.rec, 3 + (size_t)m.specSize)) << "Init wrote past the record";
    return m;
}

std::string describe(const Case& c) {
    return "W " + std::to_string(c.W) + " H " + std::to_string(c.H) + " kernel " +
           std::to_string(c.kw) + "x" + std::to_string(c.kh) + " border " +
           std::to_string(c.borderType) + " round " + std::to_string(c.roundMode);
}

// Runs the filter on a fresh image and checks every ROI pixel against the
// model and every byte around the ROI against the guard.
template <typename T>
void check_case(int level, const Case& c, const std::vector<float>& k, bool exact, int seed,
                const ZoriFilterBorderSpec* given = nullptr) {
    SCOPED_TRACE(describe(c));
    std::mt19937 g(seed);
    const int pad = sizeof(T) == 1 ? (seed % 5) : (int)sizeof(T) * (seed % 3);
    const int offset = (seed % 4) * (int)sizeof(T);
    Source<T> src(c.W, c.H, pad, offset, g);

    Made m = make(k.data(), {c.kw, c.kh}, {c.W, c.H}, Type<T>::id, c.roundMode);
    const ZoriFilterBorderSpec* use = given ? given : m.state();

    const int G = 3;  // guard pixels around the destination ROI
    const int32_t dstStep = (int32_t)((c.W + 2 * G) * sizeof(T)) + (sizeof(T) == 1 ? 1 : 0);
    std::vector<uint8_t> dstMem((size_t)dstStep * (c.H + 2 * G), kGuard);
    T* dst = (T*)(dstMem.data() + (size_t)G * dstStep + G * sizeof(T));
    const T value = Type<T>::border;
    ASSERT_EQ(Type<T>::filter(src.roi, src.step, dst, dstStep, {c.W, c.H}, c.borderType, &value,
                              use, m.buffer()),
              zorStsNoErr);
    ASSERT_TRUE(m.buffer_intact()) << "work buffer overrun";

    int bad = 0;
    for (int y = -G; y < c.H + G && bad < 5; ++y)
        for (int x = -G; x < c.W + G && bad < 5; ++x) {
            const uint8_t* p = (const uint8_t*)dst + (ptrdiff_t)y * dstStep +
                               (ptrdiff_t)x * (ptrdiff_t)sizeof(T);
            if (x < 0 || y < 0 || x >= c.W || y >= c.H) {
                for (size_t b = 0; b < sizeof(T); ++b)
                    if (p[b] != kGuard) {
                        ADD_FAILURE() << "wrote outside the ROI at " << x << "," << y;
                        ++bad;
                        break;
                    }
                continue;
            }
            T got;
            memcpy(&got, p, sizeof got);
            const Expect e = model(src, c, k, x, y);
            if (Type<T>::isInt) {
                int rw = 0;
                rect_of(c, x, y, &rw);
                const int mode = mode_of(level, c, rw);
                const double b = exact ? 0 : e.bound;
                const double lo = round_by(e.value - b, mode, Type<T>::lo, Type<T>::hi);
                const double hi = round_by(e.value + b, mode, Type<T>::lo, Type<T>::hi);
                if ((double)got < lo || (double)got > hi) {
                    ADD_FAILURE() << "pixel " << x << "," << y << ": got " << (double)got
                                  << ", sum " << e.value << " (mode " << mode << ")";
                    ++bad;
                }
            } else if (fabs((double)got - e.value) > e.bound) {
                ADD_FAILURE() << "pixel " << x << "," << y << ": got " << (double)got
                              << ", sum " << e.value << " bound " << e.bound;
                ++bad;
            }
        }
}

// Taps k/16 with |k| <= 8: every float sum of these tests is exact.
std::vector<float> dyadic_kernel(int kw, int kh, std::mt19937& g) {
    std::vector<float> k(kw * kh);
    for (float& t : k) t = (float)((int)(g() % 17) - 8) / 16.0f;
    return k;
}

std::vector<float> real_kernel(int kw, int kh, std::mt19937& g) {
    std::vector<float> k(kw * kh);
    for (float& t : k) t = std::uniform_real_distribution<float>(-1.0f, 1.0f)(g);
    return k;
}

const int kBorders[] = {
    zorBorderRepl,
    zorBorderMirror,
    zorBorderConst,
    zorBorderInMem,
    zorBorderRepl | zorBorderInMemTop,
    zorBorderMirror | zorBorderInMemBottom | zorBorderInMemLeft,
    zorBorderConst | zorBorderInMemRight,
    zorBorderMirror | zorBorderInMemTop | zorBorderInMemRight,
    zorBorderRepl | zorBorderInMemLeft | zorBorderInMemBottom | zorBorderInMemRight,
    zorBorderConst | zorBorderInMemTop | zorBorderInMemLeft,
    zorBorderMirror | zorBorderInMem,
};

// Every kernel size from 1x1 to 13x13 with ROIs smaller than, equal to and
// just larger than the kernel, and a larger one; border types and rounding
// modes rotate through the cases.
template <typename T> void sweep(int level) {
    std::mt19937 g(1000 + level);
    int n = 0;
    for (int kh = 1; kh <= 13; ++kh)
        for (int kw = 1; kw <= 13; ++kw) {
            const std::vector<float> k = dyadic_kernel(kw, kh, g);
            const int sizes[][2] = {{kw > 1 ? kw - 1 : 1, kh > 2 ? kh - 2 : 1},
                                    {kw, kh},
                                    {kw + 1, kh + 1},
                                    {kw + 23 + (n % 7), kh + 9}};
            for (const auto& sz : sizes) {
                const Case c{sz[0], sz[1], kw, kh,
                             kBorders[n % (sizeof kBorders / sizeof kBorders[0])], n % 3};
                ++n;
                ASSERT_NO_FATAL_FAILURE(check_case<T>(level, c, k, true, n));
            }
        }
}

using FilterBorder = zortest::LevelTest;

TEST_P(FilterBorder, Sweep) {
    const int level = GetParam().index;
    zortest::for_each_type([level](auto t) { sweep<decltype(t)>(level); });
}

// Every kind with every combination of the four flags, on a few kernel
// shapes (even ones included) and on ROIs that take the single frame and
// the bands. The driver is the same for every type: one integer type with
// its rounding seams, and 32f with its own kernels.
template <typename T> void all_borders(int level) {
    std::mt19937 g(77 + level);
    const int shapes[][2] = {{3, 3}, {2, 2}, {4, 5}, {1, 6}, {7, 1}, {2, 7}, {6, 2}};
    const int rois[][2] = {{3, 4}, {40, 19}};
    int n = 0;
    for (const auto& s : shapes) {
        const std::vector<float> k = dyadic_kernel(s[0], s[1], g);
        for (int kind : {zorBorderRepl, zorBorderMirror, zorBorderConst})
            for (int flags = 0; flags < 16; ++flags)
                for (const auto& r : rois) {
                    const Case c{r[0], r[1], s[0], s[1], kind | (flags << 4), (n++) % 3};
                    ASSERT_NO_FATAL_FAILURE(check_case<T>(level, c, k, true, n));
                }
    }
}

TEST_P(FilterBorder, EveryBorderAndFlag8u) { all_borders<Zor8u>(GetParam().index); }
TEST_P(FilterBorder, EveryBorderAndFlag32f) { all_borders<Zor32f>(GetParam().index); }

// Arbitrary float taps: 32f within the accumulation bound, integers within
// one rounding step where the bound straddles a rounding edge.
TEST_P(FilterBorder, ArbitraryTapsWithinBound) {
    const int level = GetParam().index;
    std::mt19937 g(5);
    const int shapes[][2] = {{3, 3}, {5, 5}, {11, 11}, {13, 4}, {1, 9}, {9, 1}, {8, 6}};
    int n = 0;
    for (const auto& s : shapes) {
        const std::vector<float> k = real_kernel(s[0], s[1], g);
        const Case c{61, 17, s[0], s[1], kBorders[n % 11], n % 3};
        ++n;
        zortest::for_each_type([&](auto t) { check_case<decltype(t)>(level, c, k, false, n); });
    }
}

// A record is the same on every level: one made under each level serves
// every other.
TEST_P(FilterBorder, RecordFromAnotherLevel) {
    const int level = GetParam().index;
    std::mt19937 g(11);
    const Case c{45, 12, 5, 3, zorBorderMirror, 0};
    const std::vector<float> k = dyadic_kernel(c.kw, c.kh, g);
    for (const zortest::Level& maker : zortest::all_levels()) {
        if (!zortest::runnable(maker)) continue;
        SCOPED_TRACE(std::string("record made under ") + maker.name);
        zorSetCpuFeatures(maker.select);
        Made m16 = make(k.data(), {c.kw, c.kh}, {c.W, c.H}, zor16s, c.roundMode);
        Made m32 = make(k.data(), {c.kw, c.kh}, {c.W, c.H}, zor32f, 0);
        zorSetCpuFeatures(GetParam().select);
        ASSERT_NO_FATAL_FAILURE(check_case<Zor16s>(level, c, k, true, 3, m16.state()));
        ASSERT_NO_FATAL_FAILURE(check_case<Zor32f>(level, c, k, true, 3, m32.state()));
    }
}

// ---- rounding ----------------------------------------------------------------

// Runs a kernel on a small image with the whole border in memory and
// returns the first output row.
template <typename T>
std::vector<T> run_plain(const std::vector<T>& img, int W, int H, const std::vector<float>& k,
                         int kw, int kh, int roundMode, int outW, int outH) {
    Made m = make(k.data(), {kw, kh}, {outW, outH}, Type<T>::id, roundMode);
    std::vector<T> out((size_t)outW * outH);
    const int ax = (kw - 1) / 2, ay = (kh - 1) / 2;
    EXPECT_EQ(Type<T>::filter(img.data() + ay * W + ax, W * sizeof(T), out.data(),
                              outW * sizeof(T), {outW, outH}, zorBorderInMem, nullptr, m.state(),
                              m.buffer()),
              zorStsNoErr);
    return out;
}

// Narrow ROIs take the scalar path on every level: the record's mode rules.
TEST_P(FilterBorder, ScalarRoundingRules) {
    const std::vector<float> half = {0.5f, 0.5f};
    // Pairs of pixels whose mean is the value under test.
    struct Row {
        int a, b, mode, want;
    };
    const Row rows8u[] = {
        {254, 255, 1, 254}, {253, 254, 1, 254}, {0, 1, 1, 0},     {1, 2, 1, 2},
        {254, 255, 2, 255}, {2, 3, 2, 3},       {254, 255, 0, 254}, {0, 1, 2, 1},
    };
    auto check = [&](const Row& r, auto t) {
        using T = decltype(t);
        SCOPED_TRACE(std::to_string(r.a) + "+" + std::to_string(r.b) + " mode " +
                     std::to_string(r.mode));
        const std::vector<T> img = {(T)r.a, (T)r.b, 0, 0};
        EXPECT_EQ(run_plain(img, 4, 1, half, 2, 1, r.mode, 1, 1)[0], r.want);
    };
    for (const Row& r : rows8u) check(r, Zor8u());
    // 256.5 saturates.
    EXPECT_EQ(run_plain(std::vector<Zor8u>{171, 0}, 2, 1, {1.5f}, 1, 1, 1, 1, 1)[0], 255);
    const Row rows16s[] = {
        {-1, 0, 1, 0},   {0, 1, 1, 0},    {-3, -2, 1, -2}, {-5, -4, 1, -4}, {-3, -2, 2, -3},
        {-3, -2, 0, -2}, {2, 3, 0, 2},    {-6, -5, 1, -6}, {32766, 32767, 1, 32766},
    };
    for (const Row& r : rows16s) check(r, Zor16s());
    EXPECT_EQ(run_plain(std::vector<Zor16s>{-32768, -32768}, 2, 1, {2.0f}, 1, 1, 0, 1, 1)[0],
              -32768);
    EXPECT_EQ(run_plain(std::vector<Zor16u>{60000}, 1, 1, {2.0f}, 1, 1, 0, 1, 1)[0], 65535);
    EXPECT_EQ(run_plain(std::vector<Zor16u>{100}, 1, 1, {-2.0f}, 1, 1, 0, 1, 1)[0], 0);
}

// With roundMode 0 on a 100-wide ROI and a 3x3 kernel the edge columns
// truncate while the rest rounds to nearest: the vector paths ignore the
// mode. Every sum here is k + 0.75.
TEST_P(FilterBorder, SeamBetweenTruncatedEdgesAndRoundedCentre) {
    const int W = 100, H = 6;
    std::vector<Zor8u> img((W + 2) * (H + 2));
    for (size_t i = 0; i < img.size(); ++i) img[i] = (Zor8u)(4 * (i % 50) + 3);
    // Centre tap 1/4, the rest 0: pixel p = 4m + 3 gives m + 0.75.
    std::vector<float> k(9, 0.0f);
    k[4] = 0.25f;
    Made m = make(k.data(), {3, 3}, {W, H}, zor8u, 0);
    // Nearest is nearest whatever the caller's rounding control says.
    for (int rc : {FE_TONEAREST, FE_TOWARDZERO, FE_DOWNWARD}) {
        SCOPED_TRACE("rounding control " + std::to_string(rc));
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
                ASSERT_EQ(out[y * W + x], edge ? p / 4 : p / 4 + 1) << x << "," << y;
            }
    }
}

// ---- reads beyond the ROI ---------------------------------------------------------

// A ROI whose rows end right before an inaccessible page, and whose first
// row starts right after one: a kernel that reads past the ROI on a side
// not flagged as in memory faults. Widths that leave every kind of vector
// tail.
TEST_P(FilterBorder, NoReadsPastTheRoiWhereNothingIsInMemory) {
    const long page = sysconf(_SC_PAGESIZE);
    for (int W : {8, 9, 15, 17, 31, 33, 67}) {
        for (int kw : {1, 2, 3, 6, 11}) {
            const int H = 23, kh = 5;
            SCOPED_TRACE("W " + std::to_string(W) + " kw " + std::to_string(kw));
            const size_t bytes = (size_t)W * H * sizeof(float);
            const size_t span = (bytes + page - 1) / page * page;
            uint8_t* m = (uint8_t*)mmap(nullptr, span + 2 * page, PROT_READ | PROT_WRITE,
                                        MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
            ASSERT_NE(m, MAP_FAILED);
            ASSERT_EQ(mprotect(m, page, PROT_NONE), 0);
            ASSERT_EQ(mprotect(m + page + span, page, PROT_NONE), 0);
            // 32f image at the end of the readable span; the 8u one at its start.
            float* img32 = (float*)(m + page + span - bytes);
            Zor8u* img8 = m + page;
            for (int i = 0; i < W * H; ++i) {
                img32[i] = (float)(i % 13);
                img8[i] = (Zor8u)(i % 13);
            }
            std::mt19937 g(kw);
            const std::vector<float> k = dyadic_kernel(kw, kh, g);
            Made m32 = make(k.data(), {kw, kh}, {W, H}, zor32f, 1);
            Made m8 = make(k.data(), {kw, kh}, {W, H}, zor8u, 1);
            for (int kind : {zorBorderRepl, zorBorderMirror, zorBorderConst}) {
                std::vector<float> out(W * H);
                const float v32 = 1.0f;
                EXPECT_EQ(zoriFilterBorder_32f_C1R(img32, W * 4, out.data(), W * 4, {W, H}, kind,
                                                   &v32, m32.state(), m32.buffer()),
                          0);
                std::vector<Zor8u> out8(W * H);
                const Zor8u v8 = 1;
                EXPECT_EQ(zoriFilterBorder_8u_C1R(img8, W, out8.data(), W, {W, H}, kind, &v8,
                                                  m8.state(), m8.buffer()),
                          0);
            }
            munmap(m, span + 2 * page);
        }
    }
}

// ---- argument checks --------------------------------------------------------------

TEST_P(FilterBorder, FilterChecksInOrderAndWritesNothing) {
    const float k[9] = {0, 0, 0, 0, 1, 0, 0, 0, 0};
    Made made = make(k, {3, 3}, {8, 8}, zor8u, 1);
    const ZoriFilterBorderSpec* rec = made.state();
    std::vector<uint8_t>& buf = made.buf;
    Zor8u big[256] = {1}, dst[64];
    const Zor8u* src = big + 100;
    memset(dst, 0xEE, sizeof dst);
    const Zor8u v = 0;
    auto call = [&](const Zor8u* s, int32_t ss, Zor8u* d, int32_t ds, ZoriSize r, int32_t bt,
                    const Zor8u* val, const ZoriFilterBorderSpec* sp, Zor8u* b) {
        return zoriFilterBorder_8u_C1R(s, ss, d, ds, r, bt, val, sp, b);
    };
    const ZoriSize roi{8, 8};
    // Each line breaks one more rule than the next, so the status shows
    // which test came first.
    EXPECT_EQ(call(nullptr, 0, dst, 0, {0, 0}, 2, nullptr, rec, buf.data()), zorStsNullPtrErr);
    EXPECT_EQ(call(src, 0, nullptr, 0, {0, 0}, 2, nullptr, rec, buf.data()), zorStsNullPtrErr);
    EXPECT_EQ(call(src, 0, dst, 0, {0, 0}, 2, nullptr, nullptr, buf.data()), zorStsNullPtrErr);
    EXPECT_EQ(call(src, 0, dst, 0, {0, 0}, 2, nullptr, rec, nullptr), zorStsNullPtrErr);
    EXPECT_EQ(call(src, 0, dst, 0, {0, 0}, zorBorderConst, nullptr, rec, buf.data()),
              zorStsNullPtrErr);
    EXPECT_EQ(call(src, 0, dst, 0, {0, 0}, zorBorderConst | 0x100, nullptr, rec, buf.data()),
              zorStsNullPtrErr);
    EXPECT_EQ(call(src, 0, dst, 0, {0, 8}, 2, &v, rec, buf.data()), zorStsSizeErr);
    EXPECT_EQ(call(src, 0, dst, 0, {8, -1}, 2, &v, rec, buf.data()), zorStsSizeErr);
    EXPECT_EQ(call(src, 0, dst, 8, roi, 2, &v, rec, buf.data()), zorStsStepErr);
    EXPECT_EQ(call(src, -8, dst, 8, roi, 2, &v, rec, buf.data()), zorStsStepErr);
    EXPECT_EQ(call(src, 8, dst, 7, roi, 2, &v, rec, buf.data()), zorStsStepErr);
    // The source step is not compared with the width.
    EXPECT_EQ(call(src, 1, dst, 8, {8, 1}, zorBorderInMem, nullptr, rec, buf.data()), 0);
    memset(dst, 0xEE, sizeof dst);
    for (int bt : {0, 2, 4, 5, 7, 8, 15, 16 | 2, 240 | 4, 256, 256 + 1, -1, 0x7fffffff})
        EXPECT_EQ(call(src, 8, dst, 8, roi, bt, &v, rec, buf.data()), zorStsBorderErr) << bt;
    for (int i = 0; i < 64; ++i) ASSERT_EQ(dst[i], 0xEE) << "written on an error";
    for (int bt : {1, 3, 6, 240, 1 | 240, 3 | 16, 6 | 128 | 64, 6 | 240})
        EXPECT_EQ(call(src, 8, dst, 8, roi, bt, &v, rec, buf.data()), zorStsNoErr) << bt;
    // The value pointer is read for the constant kind only.
    EXPECT_EQ(call(src, 8, dst, 8, roi, zorBorderRepl, nullptr, rec, buf.data()), zorStsNoErr);
    Zor16u s16[64] = {}, d16[64];
    Zor16s t16[64] = {}, e16[64];
    Zor32f s32[64] = {}, d32[64];
    EXPECT_EQ(zoriFilterBorder_16u_C1R(s16, 16, d16, 15, roi, 1, nullptr, rec, buf.data()),
              zorStsStepErr);
    EXPECT_EQ(zoriFilterBorder_16s_C1R(t16, 16, e16, 15, roi, 1, nullptr, rec, buf.data()),
              zorStsStepErr);
    EXPECT_EQ(zoriFilterBorder_32f_C1R(s32, 32, d32, 31, roi, 1, nullptr, rec, buf.data()),
              zorStsStepErr);
    EXPECT_EQ(zoriFilterBorder_32f_C1R(s32, 32, d32, 32, roi, 6, nullptr, rec, buf.data()),
              zorStsNullPtrErr);
}

TEST_P(FilterBorder, InitChecksInOrder) {
    const float k[4] = {1, 2, 3, 4};
    std::vector<uint8_t> block(4096);
    ZoriFilterBorderSpec* rec = (ZoriFilterBorderSpec*)block.data();
    EXPECT_EQ(zoriFilterBorderInit_32f(nullptr, {0, 0}, (ZorDataType)0, 0, 9, rec),
              zorStsNullPtrErr);
    EXPECT_EQ(zoriFilterBorderInit_32f(k, {0, 0}, (ZorDataType)0, 0, 9, nullptr),
              zorStsNullPtrErr);
    EXPECT_EQ(zoriFilterBorderInit_32f(k, {2, 0}, (ZorDataType)0, 0, 9, rec), zorStsSizeErr);
    for (int t : {0, 2, 3, 6, 19})
        EXPECT_EQ(zoriFilterBorderInit_32f(k, {2, 2}, (ZorDataType)t, 0, 9, rec),
                  zorStsDataTypeErr)
            << t;
    for (int c : {0, 5, -1})
        EXPECT_EQ(zoriFilterBorderInit_32f(k, {2, 2}, zor16u, c, 9, rec), zorStsChannelErr) << c;
    for (int m : {3, 9, -1, 0x10003, 0x20000})
        EXPECT_EQ(zoriFilterBorderInit_32f(k, {2, 2}, zor16u, 4, m, rec),
                  zorStsRoundModeNotSupportedErr)
            << m;
    for (int c = 1; c <= 4; ++c)
        for (int m : {0, 1, 2})
            EXPECT_EQ(zoriFilterBorderInit_32f(k, {2, 2}, zor16u, c, m, rec), zorStsNoErr);
    EXPECT_EQ(zoriFilterBorderInit_32f(k, {2, 2}, zor8u, 1, 0x10002, rec),
              zorStsAccurateModeNotSupported);
}

// roundMode 16 | 0x10000 (truncate with the hint) warns, and the record
// truncates on the scalar path.
TEST_P(FilterBorder, HintBitWarnsAndIsRemoved) {
    const float k[1] = {0.75f};
    Made m = make(k, {1, 1}, {3, 1}, zor8u, 0x10000, zorStsAccurateModeNotSupported);
    const Zor8u src[3] = {3, 5, 7};
    Zor8u dst[3];
    ASSERT_EQ(zoriFilterBorder_8u_C1R(src, 3, dst, 3, {3, 1}, zorBorderRepl, nullptr, m.state(),
                                      m.buffer()),
              0);
    EXPECT_EQ(dst[0], 2);  // 2.25
    EXPECT_EQ(dst[1], 3);  // 3.75
    EXPECT_EQ(dst[2], 5);  // 5.25
}

// The kernel may already lie where the record keeps its taps; it is then
// reversed in place and filters as a separate copy does.
TEST_P(FilterBorder, KernelInsideTheRecord) {
    const int level = GetParam().index;
    std::mt19937 g(21);
    const Case c{30, 9, 5, 3, zorBorderRepl, 1};
    const std::vector<float> k = dyadic_kernel(c.kw, c.kh, g);
    int32_t specSize = 0, bufSize = 0;
    ASSERT_EQ(zoriFilterBorderGetSize({c.kw, c.kh}, {c.W, c.H}, zor8u, zor32f, 1, &specSize,
                                      &bufSize),
              0);
    std::vector<uint8_t> block(specSize + 64);
    uint8_t* p = block.data() + 7;
    float* where = (float*)((((uintptr_t)p + 63) & ~(uintptr_t)63) + 128);
    memcpy(where, k.data(), k.size() * sizeof(float));
    ASSERT_EQ(zoriFilterBorderInit_32f(where, {c.kw, c.kh}, zor8u, 1, c.roundMode,
                                       (ZoriFilterBorderSpec*)p),
              0);
    ASSERT_NO_FATAL_FAILURE(check_case<Zor8u>(level, c, k, true, 4, (ZoriFilterBorderSpec*)p));
}

// ---- sizes ----------------------------------------------------------------------

// Values worked out by hand from the size rules for a table of cases.
struct SizeCase {
    int kw, kh, W, H, dataType, kernelType, channels, rec, buffer;
};
const SizeCase kSizes[] = {
    {3, 3, 100, 50, 1, 13, 1, 1407, 2335},
    {3, 3, 100, 50, 13, 13, 1, 1407, 1791},
    {5, 5, 1920, 1080, 1, 13, 1, 3199, 42943},
    {2, 2, 10, 10, 1, 13, 1, 639, 607},
    {2, 3, 3, 3, 5, 13, 1, 895, 479},
    {13, 13, 13, 13, 13, 13, 1, 18239, 8191},
    {1, 7, 64, 8, 7, 13, 1, 1535, 1695},
    {1, 7, 64, 8, 7, 7, 1, 1535, 1695},
    {4, 5, 40, 30, 7, 7, 1, 1855, 1599},
    {4, 5, 40, 30, 7, 7, 3, 2239, 4095},
    {3, 3, 17, 9, 1, 7, 1, 1215, 799},
    {1, 4, 33, 5, 1, 7, 1, 895, 1055},
    {6, 1, 20, 4, 1, 7, 1, 767, 447},
    {6, 1, 20, 4, 1, 7, 3, 767, 703},
    {3, 3, 20, 20, 1, 7, 3, 1215, 831},
    {1, 5, 20, 20, 1, 7, 4, 1087, 2943},
    {7, 1, 21, 2, 1, 7, 4, 895, 767},
    {3, 3, 21, 5, 1, 7, 4, 1215, 1023},
    {5, 5, 30, 30, 13, 13, 2, 2751, 1727},
    {5, 5, 30, 30, 1, 13, 2, 2751, 511},
    {5, 5, 30, 30, 13, 13, 3, 3199, 3135},
    {5, 5, 30, 30, 1, 13, 3, 3199, 2783},
    {5, 5, 30, 30, 5, 13, 4, 3199, 4223},
    {1, 3, 16, 16, 19, 19, 1, 255, 638},
    {1, 3, 15, 16, 19, 19, 1, 255, 542},
    {3, 1, 40, 40, 19, 19, 1, 255, 1118},
    {9, 9, 8, 8, 19, 19, 1, 895, 2206},
    {4, 4, 12, 12, 5, 7, 1, 1791, 895},
    {2, 9, 40, 40, 7, 7, 1, 2111, 2175},
    {9, 2, 40, 40, 7, 7, 1, 1855, 1983},
    {3, 3, 12, 12, 13, 7, 1, 1215, 287},  // 16-bit taps on 32f data: no work area
};

TEST_P(FilterBorder, SizesFollowTheRules) {
    for (const SizeCase& s : kSizes) {
        int32_t rec = -1, buf = -1;
        EXPECT_EQ(zoriFilterBorderGetSize({s.kw, s.kh}, {s.W, s.H}, (ZorDataType)s.dataType,
                                          (ZorDataType)s.kernelType, s.channels, &rec, &buf),
                  zorStsNoErr);
        EXPECT_EQ(rec, s.rec) << s.kw << "x" << s.kh << " " << s.W << "x" << s.H << " types "
                                << s.dataType << "/" << s.kernelType << " c" << s.channels;
        EXPECT_EQ(buf, s.buffer) << s.kw << "x" << s.kh << " " << s.W << "x" << s.H << " types "
                                 << s.dataType << "/" << s.kernelType << " c" << s.channels;
    }
}

TEST_P(FilterBorder, SizeChecksInOrder) {
    int32_t rec = 0, buf = 0;
    auto gs = [&](ZoriSize k, ZoriSize r, int dt, int kt, int c, int32_t* ps, int32_t* pb) {
        return zoriFilterBorderGetSize(k, r, (ZorDataType)dt, (ZorDataType)kt, c, ps, pb);
    };
    EXPECT_EQ(gs({0, 3}, {5, 5}, 0, 0, 0, nullptr, nullptr), zorStsSizeErr);
    EXPECT_EQ(gs({3, 3}, {5, 0}, 0, 0, 0, nullptr, nullptr), zorStsSizeErr);
    // Double branch: data type, channels, then pointers.
    EXPECT_EQ(gs({3, 3}, {5, 5}, 13, 19, 0, nullptr, nullptr), zorStsDataTypeErr);
    EXPECT_EQ(gs({3, 3}, {5, 5}, 19, 19, 2, nullptr, nullptr), zorStsChannelErr);
    EXPECT_EQ(gs({3, 3}, {5, 5}, 19, 19, 1, &rec, nullptr), zorStsNullPtrErr);
    EXPECT_EQ(gs({3, 3}, {5, 5}, 19, 19, 1, nullptr, &buf), zorStsNullPtrErr);
    // Others.
    EXPECT_EQ(gs({3, 3}, {5, 5}, 19, 13, 0, nullptr, nullptr), zorStsDataTypeErr);
    EXPECT_EQ(gs({3, 3}, {5, 5}, 2, 13, 0, nullptr, nullptr), zorStsDataTypeErr);
    EXPECT_EQ(gs({3, 3}, {5, 5}, 1, 1, 0, nullptr, nullptr), zorStsDataTypeErr);
    EXPECT_EQ(gs({3, 3}, {5, 5}, 1, 5, 0, nullptr, nullptr), zorStsDataTypeErr);
    EXPECT_EQ(gs({3, 3}, {5, 5}, 1, 7, 0, nullptr, nullptr), zorStsChannelErr);
    EXPECT_EQ(gs({3, 3}, {5, 5}, 13, 13, 5, nullptr, nullptr), zorStsChannelErr);
    EXPECT_EQ(gs({3, 3}, {5, 5}, 13, 13, 4, nullptr, &buf), zorStsNullPtrErr);
    EXPECT_EQ(gs({3, 3}, {5, 5}, 13, 13, 4, &rec, nullptr), zorStsNullPtrErr);
    EXPECT_EQ(gs({3, 3}, {5, 5}, 13, 13, 4, &rec, &buf), zorStsNoErr);
}

TEST_P(FilterBorder, SizesBeyond32BitsAreRefused) {
    int32_t rec = 7, buf = 7;
    // The frame buffer follows the perimeter: a huge square ROI still fits.
    EXPECT_EQ(zoriFilterBorderGetSize({3, 3}, {100000, 100000}, zor32f, zor32f, 1, &rec, &buf),
              zorStsNoErr);
    // Lines of 2^28 floats do not; nor does one frame of 2^31 rows.
    EXPECT_EQ(zoriFilterBorderGetSize({3, 3}, {1 << 28, 10}, zor8u, zor32f, 1, &rec, &buf),
              zorStsExceededSizeErr);
    EXPECT_EQ(buf, 0);
    buf = 7;
    EXPECT_EQ(zoriFilterBorderGetSize({3, 3}, {2, 0x7fffffff}, zor32f, zor32f, 4, &rec, &buf),
              zorStsExceededSizeErr);
    EXPECT_EQ(buf, 0);
    buf = 7;
    EXPECT_EQ(zoriFilterBorderGetSize({0x7fffffff, 0x7fffffff}, {1, 1}, zor64f, zor64f, 1, &rec,
                                      &buf),
              zorStsExceededSizeErr);
    EXPECT_EQ(buf, 0);
}

ZOR_INSTANTIATE_LEVELS(FilterBorder);

}  // namespace
