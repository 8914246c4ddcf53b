// The direct double filter through the public stubs, every level forced in
// turn, against a scalar model that sums in the order the header promises,
// so results compare bit for bit.
#include <math.h>
#include <stdint.h>
#include <string.h>

#include <random>
#include <vector>

#include "zortest.h"

namespace {

// ---- model ------------------------------------------------------------------

// Group widths of a two-dimensional kernel, left to right in the flipped
// kernel.
std::vector<int> groups_of(int kw) {
    if (kw < 6) return {kw};
    if (kw == 6) return {3, 3};
    std::vector<int> g;
    const int tail[4][2] = {{0, 0}, {5, 0}, {3, 3}, {3, 0}};
    const int* t = tail[kw % 4];
    const int rest = t[0] + t[1];
    for (int i = 0; i < (kw - rest) / 4; ++i) g.push_back(4);
    for (int i = 0; i < 2; ++i)
        if (t[i]) g.push_back(t[i]);
    return g;
}

struct Window {
    // Source pixels under the kernel: (kw + width - 1) x (kh + height - 1),
    // row r at byte r * step.
    const uint8_t* base;
    ptrdiff_t step;
    double at(int x, int y) const {
        double v;
        memcpy(&v, base + y * step + x * 8, 8);
        return v;
    }
};

double model_pixel(const Window& s, const double* k, int kw, int kh, int x, int y) {
    auto f = [&](int r, int c) { return k[(kh - 1 - r) * kw + (kw - 1 - c)]; };
    if (kw == 1) {
        double a = f(0, 0) * s.at(x, y);
        for (int r = 1; r < kh; ++r) a = a + f(r, 0) * s.at(x, y + r);
        return a;
    }
    if (kh == 1 && kw < 17) {
        double a = f(0, 0) * s.at(x, y);
        for (int c = 1; c < kw; ++c) a = a + f(0, c) * s.at(x + c, y);
        return a;
    }
    if (kh == 1) {
        double p[16];
        for (int j = 0; j < kw; ++j) {
            const double t = f(0, j) * s.at(x + j, y);
            p[j % 16] = j < 16 ? t : p[j % 16] + t;
        }
        for (int n = 8; n >= 1; n /= 2)
            for (int i = 0; i < n; ++i) p[i] = p[i] + p[i + n];
        return p[0];
    }
    double a = 0;
    int c0 = 0;
    for (int g : groups_of(kw)) {
        for (int r = 0; r < kh; ++r)
            for (int c = c0; c < c0 + g; ++c) {
                const double t = f(r, c) * s.at(x + c, y + r);
                a = (c0 == 0 && r == 0 && c == 0) ? t : a + t;
            }
        c0 += g;
    }
    return a;
}

// Values of many magnitudes, so that any other summation order shows in
// the last bits.
double draw(std::mt19937& rng) {
    std::uniform_real_distribution<double> unit(-1.0, 1.0);
    std::uniform_int_distribution<int> scale(-12, 12);
    return ldexp(unit(rng), scale(rng));
}

// ---- one call, checked whole ------------------------------------------------

constexpr uint8_t kGuard = 0xa5;

struct Case {
    int kw, kh;
    int width, height;
    ZoriPoint anchor;
    int srcPad, dstPad;  // bytes added to the tightest steps, odd ones too
    int srcShift, dstShift;  // misalignment of the first row
};

// Sources outside the window hold NaN, so a pixel that read beyond it
// would not compare.
struct Frame {
    std::vector<uint8_t> src, dst, want;
    ptrdiff_t srcStep, dstStep;
    size_t srcOrigin, dstOrigin;
    std::vector<double> kernel;
};

Frame make_frame(const Case& c, std::mt19937& rng) {
    Frame f;
    const int wr = c.kw + c.width - 1, wh = c.kh + c.height - 1;
    f.srcStep = (ptrdiff_t)wr * 8 + c.srcPad;
    f.dstStep = (ptrdiff_t)c.width * 8 + c.dstPad;
    f.srcOrigin = f.srcStep + 16 + c.srcShift;
    f.src.resize(f.srcOrigin + (size_t)(wh + 1) * f.srcStep + 16);
    const double nan = NAN;
    for (size_t i = 0; i + 8 <= f.src.size(); i += 8) memcpy(&f.src[i], &nan, 8);
    for (int y = 0; y < wh; ++y)
        for (int x = 0; x < wr; ++x) {
            const double v = draw(rng);
            memcpy(&f.src[f.srcOrigin + y * f.srcStep + x * 8], &v, 8);
        }
    f.dstOrigin = f.dstStep + 8 + c.dstShift;
    f.dst.assign(f.dstOrigin + (size_t)(c.height + 1) * f.dstStep + 24, kGuard);
    f.kernel.resize((size_t)c.kw * c.kh);
    for (double& k : f.kernel) k = draw(rng);
    f.want = f.dst;
    const Window w{&f.src[f.srcOrigin], f.srcStep};
    for (int y = 0; y < c.height; ++y)
        for (int x = 0; x < c.width; ++x) {
            const double v = model_pixel(w, f.kernel.data(), c.kw, c.kh, x, y);
            memcpy(&f.want[f.dstOrigin + y * f.dstStep + x * 8], &v, 8);
        }
    return f;
}

// pSrc as the caller passes it: the anchor's pixel of the flipped kernel.
const Zor64f* src_arg(const Frame& f, const Case& c) {
    const ptrdiff_t off = (ptrdiff_t)f.srcOrigin + (ptrdiff_t)(c.kw - 1 - c.anchor.x) * 8 +
                          (ptrdiff_t)(c.kh - 1 - c.anchor.y) * f.srcStep;
    return (const Zor64f*)(f.src.data() + off);
}

ZorStatus run(Frame& f, const Case& c, Zor8u* buffer) {
    return zoriFilter_64f_C1R(src_arg(f, c), (int32_t)f.srcStep, (Zor64f*)(f.dst.data() + f.dstOrigin),
                              (int32_t)f.dstStep, {c.width, c.height}, f.kernel.data(),
                              {c.kw, c.kh}, c.anchor, buffer);
}

std::string describe(const Case& c) {
    char text[160];
    snprintf(text, sizeof text, "kernel %dx%d anchor (%d,%d) roi %dx%d pads %d/%d shifts %d/%d",
             c.kw, c.kh, c.anchor.x, c.anchor.y, c.width, c.height, c.srcPad, c.dstPad, c.srcShift,
             c.dstShift);
    return text;
}

// Runs one case with a buffer of exactly the queried size followed by a
// guard, and checks the destination block and the guard whole.
void check_case(const Case& c, std::mt19937& rng) {
    Frame f = make_frame(c, rng);
    int32_t size = -1;
    ASSERT_EQ(zoriFilterGetBufSize_64f_C1R({c.kw, c.kh}, c.width, &size), zorStsNoErr);
    std::vector<Zor8u> buffer((size_t)size + 64, kGuard);
    ASSERT_EQ(run(f, c, size ? buffer.data() : nullptr), zorStsNoErr) << describe(c);
    if (f.dst != f.want) {
        for (size_t i = 0; i < f.dst.size(); ++i)
            if (f.dst[i] != f.want[i]) {
                const long row = (long)i / f.dstStep - 1;
                FAIL() << describe(c) << ": first difference at byte " << i << " (row " << row
                       << ")";
            }
    }
    for (size_t i = (size_t)size; i < buffer.size(); ++i)
        ASSERT_EQ(buffer[i], kGuard) << describe(c) << ": work buffer overrun";
}

ZoriPoint anchor_for(int pick, int kw, int kh) {
    switch (pick % 5) {
    case 0: return {0, 0};
    case 1: return {kw - 1, 0};
    case 2: return {0, kh - 1};
    case 3: return {kw - 1, kh - 1};
    default: return {kw / 2, kh / 2};
    }
}

Case vary(int kw, int kh, int width, int height, int seed) {
    static const int srcPads[] = {0, 3, 8, 13, 64};
    static const int dstPads[] = {0, 5, 24, 1};
    return {kw,
            kh,
            width,
            height,
            anchor_for(seed, kw, kh),
            srcPads[seed % 5],
            dstPads[seed % 4],
            (seed * 3) % 8,
            (seed * 5) % 8};
}

// ---- tests ------------------------------------------------------------------

using Filter64fSize = zortest::LevelTest;

TEST_P(Filter64fSize, AsksForABufferOnlyForTallColumnsOverWideRows) {
    int32_t size = -1;
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({1, 3}, 16, &size), zorStsNoErr);
    EXPECT_EQ(size, 96);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({1, 7}, 1000, &size), zorStsNoErr);
    EXPECT_EQ(size, 7 * 32);
    const struct {
        ZoriSize kernel;
        int32_t width;
    } none[] = {{{1, 3}, 15}, {{3, 1}, 16}, {{1, 2}, 16}, {{1, 1}, 100}, {{2, 5}, 16}, {{5, 5}, 64}};
    for (const auto& c : none) {
        size = -1;
        EXPECT_EQ(zoriFilterGetBufSize_64f_C1R(c.kernel, c.width, &size), zorStsNoErr);
        EXPECT_EQ(size, 0) << c.kernel.width << "x" << c.kernel.height << " over " << c.width;
    }
}

TEST_P(Filter64fSize, ChecksPointerThenSizes) {
    int32_t size = 77;
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({0, 3}, 0, nullptr), zorStsNullPtrErr);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({0, 3}, 16, &size), zorStsSizeErr);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({1, 0}, 16, &size), zorStsSizeErr);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({1, 3}, 0, &size), zorStsSizeErr);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({-1, 3}, 16, &size), zorStsSizeErr);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({1, INT32_MAX}, 16, &size), zorStsSizeErr);
    EXPECT_EQ(size, 77);
}

ZOR_INSTANTIATE_LEVELS(Filter64fSize);

using Filter64f = zortest::LevelTest;

// The model's split is the header's table; the test data is such that
// summing in another order changes bits, or the comparisons below would
// prove nothing about the order.
TEST(Filter64fModel, SplitsByTheTableAndTheDataSeesTheOrder) {
    EXPECT_EQ(groups_of(5), (std::vector<int>{5}));
    EXPECT_EQ(groups_of(6), (std::vector<int>{3, 3}));
    EXPECT_EQ(groups_of(7), (std::vector<int>{4, 3}));
    EXPECT_EQ(groups_of(8), (std::vector<int>{4, 4}));
    EXPECT_EQ(groups_of(9), (std::vector<int>{4, 5}));
    EXPECT_EQ(groups_of(10), (std::vector<int>{4, 3, 3}));
    EXPECT_EQ(groups_of(13), (std::vector<int>{4, 4, 5}));
    EXPECT_EQ(groups_of(18), (std::vector<int>{4, 4, 4, 3, 3}));
    std::mt19937 rng(7);
    const Case c = vary(7, 3, 40, 4, 0);
    const Frame f = make_frame(c, rng);
    const Window w{&f.src[f.srcOrigin], f.srcStep};
    int differ = 0;
    for (int y = 0; y < c.height; ++y)
        for (int x = 0; x < c.width; ++x) {
            double plain = 0;
            for (int r = 0; r < c.kh; ++r)
                for (int k = 0; k < c.kw; ++k)
                    plain += f.kernel[(c.kh - 1 - r) * c.kw + c.kw - 1 - k] * w.at(x + k, y + r);
            differ += plain != model_pixel(w, f.kernel.data(), c.kw, c.kh, x, y);
        }
    EXPECT_GT(differ, 10);
}

// Every path: column (with and without the buffer), short and long rows,
// and every group split, over ROI widths on both sides of the vector
// blocks and of the buffer threshold.
TEST_P(Filter64f, MatchesTheModelBitForBit) {
    std::mt19937 rng(1234 + GetParam().index);
    int seed = 0;
    std::vector<int> widths;
    for (int k = 1; k <= 18; ++k) widths.push_back(k);
    for (int k : {19, 21, 25, 31, 32, 33, 40}) widths.push_back(k);
    for (int kw : widths)
        for (int kh = 1; kh <= 7; ++kh) {
            if (kw > 18 && kh > 1 && kh != 3) continue;
            for (int width = 1; width <= 40; ++width) {
                if (width > 20 && width % 3 && width != 32 && width != 40) continue;
                ++seed;
                ASSERT_NO_FATAL_FAILURE(check_case(vary(kw, kh, width, 1 + seed % 4, seed), rng));
            }
        }
}

// Long rows with several full blocks and every remainder, and ROIs wider
// than the sweep's with tall and flat kernels.
TEST_P(Filter64f, LongRowsAndWideRois) {
    std::mt19937 rng(99 + GetParam().index);
    int seed = 0;
    for (int kw : {23, 48, 49, 70})
        for (int width : {1, 3, 16, 33}) {
            ++seed;
            ASSERT_NO_FATAL_FAILURE(check_case(vary(kw, 1, width, 2, seed), rng));
        }
    const Case cases[] = {vary(5, 5, 123, 17, 4), vary(1, 15, 100, 6, 2), vary(11, 9, 77, 7, 3),
                          vary(2, 13, 65, 3, 0), vary(14, 2, 90, 4, 2)};
    for (const Case& c : cases) ASSERT_NO_FATAL_FAILURE(check_case(c, rng));
}

// The column form gives the same bits with the prepared taps and without
// a buffer.
TEST_P(Filter64f, ColumnWithoutBufferMatchesWithIt) {
    std::mt19937 rng(11);
    const Case c = vary(1, 5, 37, 3, 2);
    Frame f = make_frame(c, rng);
    ASSERT_EQ(run(f, c, nullptr), zorStsNoErr);
    EXPECT_EQ(f.dst, f.want);
}

// Products of -0 taps and positive pixels are -0, and so is their sum:
// the taps must reach the vectors with their sign.
TEST_P(Filter64f, NegativeZeroTapsKeepTheirSign) {
    const ZoriSize kernels[] = {{1, 5}, {1, 2}, {5, 1}, {20, 1}, {3, 3}, {7, 2}, {10, 2}};
    const std::vector<double> src(40 * 40, 1.0);
    for (ZoriSize ks : kernels) {
        const std::vector<double> k((size_t)ks.width * ks.height, -0.0);
        std::vector<double> dst(20 * 3, 5.0);
        std::vector<Zor8u> buffer(1024);
        ASSERT_EQ(zoriFilter_64f_C1R(src.data(), 40 * 8, dst.data(), 20 * 8, {20, 3}, k.data(), ks,
                                     {ks.width - 1, ks.height - 1}, buffer.data()),
                  zorStsNoErr);
        for (double v : dst) ASSERT_TRUE(v == 0 && signbit(v)) << ks.width << "x" << ks.height << ": " << v;
    }
}

TEST_P(Filter64f, SingleTapScalesAndIgnoresTheAnchor) {
    const double src[2][3] = {{1, 2, 3}, {4, 5, 6}};
    const double k = 0.5;
    for (ZoriPoint anchor : {ZoriPoint{0, 0}, ZoriPoint{1, 1}, ZoriPoint{-2, 3}}) {
        double dst[2][3] = {};
        ASSERT_EQ(zoriFilter_64f_C1R(&src[0][0], 24, &dst[0][0], 24, {3, 2}, &k, {1, 1}, anchor,
                                     nullptr),
                  zorStsNoErr);
        for (int i = 0; i < 6; ++i) EXPECT_EQ((&dst[0][0])[i], 0.5 * (&src[0][0])[i]);
    }
}

// True convolution: the kernel's last element meets the leftmost (top)
// source pixel, and the anchor counts in the flipped kernel.
TEST_P(Filter64f, FlipsTheKernelAndCountsTheAnchorInIt) {
    const double src[4] = {10, 20, 30, 40};
    const double k[2] = {1, 2};
    double dst[2] = {};
    // Flipped kernel (2, 1); anchor x 1 is its last element: the window
    // starts at pSrc.
    ASSERT_EQ(zoriFilter_64f_C1R(&src[1], 32, dst, 16, {2, 1}, k, {2, 1}, {1, 0}, nullptr),
              zorStsNoErr);
    EXPECT_EQ(dst[0], 2 * 20 + 30.0);
    EXPECT_EQ(dst[1], 2 * 30 + 40.0);
    // Anchor x 0: the window starts one pixel to the left.
    ASSERT_EQ(zoriFilter_64f_C1R(&src[1], 32, dst, 16, {2, 1}, k, {2, 1}, {0, 0}, nullptr),
              zorStsNoErr);
    EXPECT_EQ(dst[0], 2 * 10 + 20.0);
    EXPECT_EQ(dst[1], 2 * 20 + 30.0);
    // Vertically the same: kernel rows (1; 3), anchor y 0 reaches one row up.
    const double col[3][1] = {{1}, {5}, {7}};
    const double kv[2] = {1, 3};
    ASSERT_EQ(zoriFilter_64f_C1R(&col[1][0], 8, dst, 8, {1, 2}, kv, {1, 2}, {0, 0}, nullptr),
              zorStsNoErr);
    EXPECT_EQ(dst[0], 3 * 1 + 5.0);
    EXPECT_EQ(dst[1], 3 * 5 + 7.0);
}

TEST_P(Filter64f, ChecksInOrderAndWritesNothing) {
    const Case c = vary(3, 2, 10, 3, 0);
    std::mt19937 rng(3);
    Frame f = make_frame(c, rng);
    const std::vector<uint8_t> untouched = f.dst;
    const Zor64f* s = src_arg(f, c);
    Zor64f* d = (Zor64f*)(f.dst.data() + f.dstOrigin);
    const Zor64f* k = f.kernel.data();
    const int32_t ss = (int32_t)f.srcStep, ds = (int32_t)f.dstStep;
    const int32_t tightSrc = (3 + 10) * 8 - 8;
    const struct {
        const Zor64f* s;
        int32_t ss;
        Zor64f* d;
        int32_t ds;
        ZoriSize roi;
        const Zor64f* k;
        ZoriSize ks;
        ZorStatus want;
    } bad[] = {
        {nullptr, ss, d, ds, {0, 3}, k, {3, 2}, zorStsNullPtrErr},
        {s, ss, nullptr, -1, {10, 3}, k, {3, 2}, zorStsNullPtrErr},
        {s, ss, d, ds, {10, 3}, nullptr, {0, 2}, zorStsNullPtrErr},
        {s, -1, d, ds, {0, 3}, k, {3, 2}, zorStsSizeErr},
        {s, -1, d, ds, {10, -3}, k, {3, 2}, zorStsSizeErr},
        {s, -1, d, ds, {10, 3}, k, {0, 2}, zorStsSizeErr},
        {s, -1, d, ds, {10, 3}, k, {3, 0}, zorStsSizeErr},
        {s, tightSrc - 8, d, ds, {10, 3}, k, {3, 2}, zorStsStepErr},
        {s, tightSrc - 1, d, ds, {10, 3}, k, {3, 2}, zorStsStepErr},
        {s, ss, d, 79, {10, 3}, k, {3, 2}, zorStsStepErr},
        {s, ss, d, -80, {10, 3}, k, {3, 2}, zorStsStepErr},
        {s, ss, d, ds, {10, 3}, k, {INT32_MAX, 2}, zorStsStepErr},
    };
    int i = 0;
    for (const auto& b : bad) {
        EXPECT_EQ(zoriFilter_64f_C1R(b.s, b.ss, b.d, b.ds, b.roi, b.k, b.ks, c.anchor, nullptr),
                  b.want)
            << "case " << i++;
        EXPECT_EQ(f.dst, untouched);
    }
    // The tightest steps pass: each row holds exactly what it needs.
    EXPECT_EQ(zoriFilter_64f_C1R(s, tightSrc, d, 80, {10, 1}, k, {3, 1}, c.anchor, nullptr),
              zorStsNoErr);
}

ZOR_INSTANTIATE_LEVELS(Filter64f);

}  // namespace
