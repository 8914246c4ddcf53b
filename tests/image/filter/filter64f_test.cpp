// The direct double filter through the public stubs, every level forced in
// turn, against a scalar model that sums in the order the header promises,
// so results compare bit for bit.
#include <math.h>
#include <stdint.h>
#include <string.h>

#include <vector>

#include "image.h"
#include "zortest.h"

namespace {

using zortest::Image;

// ---- model ------------------------------------------------------------------

// Group widths of a two-dimensional kernel, left to right in the flipped
// kernel.
std::vector<int> groups_of(int kw) {
    if (kw < 6) return {kw};
    if (kw == 6) return {3, 3};
    const int tail[4][2] = {{0, 0}, {5, 0}, {3, 3}, {3, 0}};
    const int* t = tail[kw % 4];
    std::vector<int> g((kw - t[0] - t[1]) / 4, 4);
    for (int i = 0; i < 2; ++i)
        if (t[i]) g.push_back(t[i]);
    return g;
}

// Output (x, y) from the window whose top-left source pixel is s(0, 0).
template <typename S> double model_pixel(S s, const double* k, int kw, int kh, int x, int y) {
    auto f = [&](int r, int c) { return k[(kh - 1 - r) * kw + (kw - 1 - c)]; };
    if (kw == 1 || (kh == 1 && kw < 17)) {  // one line of taps, in order
        double a = 0;
        for (int i = 0; i < kw * kh; ++i) {
            const int r = kw == 1 ? i : 0, c = kw == 1 ? 0 : i;
            const double t = f(r, c) * s(x + c, y + r);
            a = i ? a + t : t;
        }
        return a;
    }
    if (kh == 1) {
        double p[16];
        for (int j = 0; j < kw; ++j) {
            const double t = f(0, j) * s(x + j, y);
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
                const double t = f(r, c) * s(x + c, y + r);
                a = (c0 == 0 && r == 0 && c == 0) ? t : a + t;
            }
        c0 += g;
    }
    return a;
}

// Values of many magnitudes, so that any other summation order shows in
// the last bits.
double draw(zortest::Rng& g) {
    return ldexp((double)((int)g.below(1u << 30) - (1 << 29)) / (1 << 29), (int)g.below(25) - 12);
}

// ---- one call, checked whole ------------------------------------------------

struct Case {
    int kw, kh, width, height;
    ZoriPoint anchor;
    int seed;  // padding and misalignment of both images, buffer or none
};

// The window under the kernel with a margin of NaN around it, so that a
// pixel read beyond the window shows; the destination in guard bytes,
// compared whole. A buffer of the queried size, guarded, or (every third
// case of a column kernel) none at all: the column form works without.
void check_case(const Case& c) {
    SCOPED_TRACE(testing::Message() << "kernel " << c.kw << "x" << c.kh << " anchor (" << c.anchor.x
                                    << "," << c.anchor.y << ") roi " << c.width << "x" << c.height
                                    << " seed " << c.seed);
    zortest::Rng g(c.seed);
    const int wr = c.kw + c.width - 1, wh = c.kh + c.height - 1;
    Image<double> src(wr + 2, wh + 2, (wr + 2) * 8 + (c.seed % 5) * 3, (size_t)(c.seed * 3) % 8);
    src.fill([&](int x, int y) {
        return x == 0 || y == 0 || x > wr || y > wh ? NAN : draw(g);
    });
    Image<double> dst(c.width, c.height, c.width * 8 + (c.seed % 4) * 5, (size_t)(c.seed * 5) % 8);
    // Every seventh kernel is all -0, whose products and sums keep the sign
    // only if the taps reach the vectors with theirs.
    std::vector<double> k((size_t)c.kw * c.kh, -0.0);
    if (c.seed % 7)
        for (double& t : k) t = draw(g);
    Image<double> want = dst;
    auto at = [&](int x, int y) { return src.get(1 + x, 1 + y); };
    for (int y = 0; y < c.height; ++y)
        for (int x = 0; x < c.width; ++x) want.set(x, y, model_pixel(at, k.data(), c.kw, c.kh, x, y));
    int32_t size = -1;
    ASSERT_EQ(zoriFilterGetBufSize_64f_C1R({c.kw, c.kh}, c.width, &size), zorStsNoErr);
    std::vector<uint8_t> buffer = zortest::guarded((size_t)size);
    const bool none = size == 0 || (c.kw == 1 && c.seed % 3 == 0);
    // pSrc is the anchor's pixel of the flipped kernel.
    // A single tap ignores its anchor, whatever it is.
    const ZoriPoint a = c.kw * c.kh == 1 ? ZoriPoint{0, 0} : c.anchor;
    const Zor64f* s = src.ptr(1 + c.kw - 1 - a.x, 1 + c.kh - 1 - a.y);
    ASSERT_EQ(zoriFilter_64f_C1R(s, src.step, dst.ptr(), dst.step, {c.width, c.height}, k.data(),
                                 {c.kw, c.kh}, c.anchor, none ? nullptr : buffer.data()),
              zorStsNoErr);
    ASSERT_TRUE(zortest::same_bytes(dst, want));
    ASSERT_TRUE(zortest::guard_intact(buffer, (size_t)size)) << "work buffer overrun";
}

ZoriPoint anchor_for(int pick, int kw, int kh) {
    if (kw * kh == 1) return {pick % 5 - 2, pick % 3};
    const ZoriPoint a[5] = {{0, 0}, {kw - 1, 0}, {0, kh - 1}, {kw - 1, kh - 1}, {kw / 2, kh / 2}};
    return a[pick % 5];
}

// ---- tests ------------------------------------------------------------------

using Filter64f = zortest::LevelTest;

TEST_P(Filter64f, BufferOnlyForTallColumnsOverWideRows) {
    const struct {
        ZoriSize kernel;
        int32_t width, size;
    } rows[] = {{{1, 3}, 16, 96}, {{1, 7}, 1000, 224}, {{1, 3}, 15, 0},
                {{3, 1}, 16, 0},  {{1, 2}, 16, 0},     {{5, 5}, 64, 0}};
    for (const auto& r : rows) {
        int32_t size = -1;
        EXPECT_EQ(zoriFilterGetBufSize_64f_C1R(r.kernel, r.width, &size), zorStsNoErr);
        EXPECT_EQ(size, r.size) << r.kernel.width << "x" << r.kernel.height << " over " << r.width;
    }
    int32_t size = 77;
    zortest::run_checks({
        {zorStsNullPtrErr, "result", [] { return zoriFilterGetBufSize_64f_C1R({0, 3}, 0, nullptr); }},
        {zorStsSizeErr, "kernel", [&] { return zoriFilterGetBufSize_64f_C1R({0, 3}, 16, &size); }},
        {zorStsSizeErr, "kernel", [&] { return zoriFilterGetBufSize_64f_C1R({1, -1}, 16, &size); }},
        {zorStsSizeErr, "width", [&] { return zoriFilterGetBufSize_64f_C1R({1, 3}, 0, &size); }},
    }, [&] { return size == 77; });
}

// Every path: column (with and without the buffer), short and long rows,
// every group split, over ROI widths on both sides of the vector blocks
// and of the buffer threshold; and ROIs wider and taller than that.
TEST_P(Filter64f, MatchesTheModelBitForBit) {
    int seed = 100 * GetParam().index;
    std::vector<int> widths;
    for (int k = 1; k <= 18; ++k) widths.push_back(k);
    for (int k : {19, 21, 25, 31, 32, 33, 40, 48, 49, 70}) widths.push_back(k);
    for (int kw : widths)
        for (int kh = 1; kh <= 7; ++kh) {
            if (kw > 18 && kh > 1 && kh != 3) continue;
            for (int width = 1; width <= 40; ++width) {
                if (width > 20 && width % 3 && width != 32 && width != 40) continue;
                ++seed;
                ASSERT_NO_FATAL_FAILURE(check_case(
                    {kw, kh, width, 1 + seed % 4, anchor_for(seed, kw, kh), seed}));
            }
        }
    for (const Case& c : {Case{5, 5, 123, 17, {2, 2}, 4}, Case{1, 15, 100, 6, {0, 3}, 3},
                          Case{11, 9, 77, 7, {10, 0}, 5}, Case{14, 2, 90, 4, {0, 1}, 2}})
        ASSERT_NO_FATAL_FAILURE(check_case(c));
}

TEST_P(Filter64f, ChecksInOrderAndWritesNothing) {
    std::vector<double> src(20 * 5, 1.0), k(6, 1.0);
    Image<double> dst(10, 3);
    const Image<double> before = dst;
    const Zor64f* s = &src[20 + 2];
    const int32_t tight = (3 + 10) * 8 - 8;
    auto row = [&](ZorStatus want, const char* what, const Zor64f* ps, int32_t ss, Zor64f* pd,
                   int32_t ds, ZoriSize roi, const Zor64f* pk, ZoriSize ks) {
        return zortest::CheckRow{want, what, [=] {
                                     return zoriFilter_64f_C1R(ps, ss, pd, ds, roi, pk, ks, {1, 1},
                                                               nullptr);
                                 }};
    };
    Zor64f* d = dst.ptr();
    zortest::run_checks({
        row(zorStsNullPtrErr, "source", nullptr, 160, d, 80, {0, 3}, k.data(), {3, 2}),
        row(zorStsNullPtrErr, "destination", s, 160, nullptr, -1, {10, 3}, k.data(), {3, 2}),
        row(zorStsNullPtrErr, "kernel", s, 160, d, 80, {10, 3}, nullptr, {0, 2}),
        row(zorStsSizeErr, "roi", s, -1, d, 80, {10, -3}, k.data(), {3, 2}),
        row(zorStsSizeErr, "kernel size", s, -1, d, 80, {10, 3}, k.data(), {3, 0}),
        row(zorStsStepErr, "source step", s, tight - 1, d, 80, {10, 3}, k.data(), {3, 2}),
        row(zorStsStepErr, "destination step", s, 160, d, 79, {10, 3}, k.data(), {3, 2}),
        row(zorStsStepErr, "destination step", s, 160, d, -80, {10, 3}, k.data(), {3, 2}),
        row(zorStsStepErr, "huge kernel", s, 160, d, 80, {10, 3}, k.data(), {INT32_MAX, 2}),
    }, [&] { return (bool)zortest::same_bytes(dst, before); });
    // The tightest steps pass: each row holds exactly what it needs.
    EXPECT_EQ(zoriFilter_64f_C1R(s, tight, d, 80, {10, 1}, k.data(), {3, 1}, {1, 0}, nullptr), 0);
}

ZOR_INSTANTIATE_LEVELS(Filter64f);

}  // namespace
