// Median filter with border through the public stubs, every level forced in
// turn, against one model: the mask's pixels taken by the border rule (real
// pixels on the sides flagged in memory), sorted, element n / 2.
#include <stdint.h>
#include <string.h>

#include <algorithm>
#include <string>
#include <vector>

#include "border_model.h"
#include "image.h"
#include "zortest.h"

namespace {

using zortest::Image;
using zortest::Rng;

template <typename T> struct Api;
#define MEDIAN_API(t, T)                                              \
    template <> struct Api<T> {                                       \
        static constexpr ZorDataType type = zor##t;                   \
        static constexpr auto run = zoriFilterMedianBorder_##t##_C1R; \
    };
MEDIAN_API(8u, Zor8u)
MEDIAN_API(16u, Zor16u)
MEDIAN_API(16s, Zor16s)
MEDIAN_API(32f, Zor32f)
#undef MEDIAN_API

// The shared random values without NaN and negative zero, whose place in
// the order depends on the path a mask takes (the NaN test below covers
// them level against level).
template <typename T> T value(Rng& r) {
    T v = zortest::Type<T>::random(r);
    if constexpr (sizeof(T) == 4)
        if (v != v || zortest::f_bits(v) == 0x80000000u) v = 1.5f;
    return v;
}

std::vector<uint8_t> buffer_for(ZoriSize roi, int kw, int kh, ZorDataType type) {
    int32_t size = -1;
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize(roi, {kw, kh}, type, 1, &size), zorStsNoErr);
    return zortest::guarded((size_t)size);
}

// The pixels a call may read: the ROI and, beyond each side flagged in
// memory, the mask's reach (l, r, u, d); an unreadable page right before
// the first of them or right after the last, so that reading further
// faults. With `up` the rows run upwards in memory (a negative step).
template <typename T> struct Source {
    int l, u;
    bool up;
    zortest::Fenced<T> f;
    Source(int W, int H, int l_, int r, int u_, int d, bool atEnd, bool up_)
        : l(l_),
          u(u_),
          up(up_),
          f(W + l_ + r, H + u_ + d, atEnd, (W + l_ + r + 3) * (int)sizeof(T)) {}
    T* ptr(int x, int y) { return f.ptr(x + l, up ? f.h - 1 - y - u : y + u); }
    int32_t step() const { return up ? -f.step : f.step; }
    T get(int x, int y) {
        T v;
        memcpy(&v, ptr(x, y), sizeof v);
        return v;
    }
    std::vector<uint8_t> bytes() { return {(uint8_t*)f.ptr(), (uint8_t*)f.ptr(f.w, f.h - 1)}; }
};

// Index of a frame position on one axis, kOut for the constant: real
// pixels reach `lo` before and `hi` after the ROI, the rule takes over
// beyond.
constexpr int64_t kOut = INT64_MIN;
int64_t axis(int kind, int64_t x, int64_t n, int64_t lo, int64_t hi) {
    const int64_t i = zortest::border_index(kind, x + lo, n + lo + hi);
    return i < 0 ? kOut : i - lo;
}

// Element n / 2 of the window at (x, y); l, r, u, d as for Source.
template <typename T>
T model_pixel(Source<T>& s, int W, int H, int kw, int kh, int r, int d, int kind, T value, int x,
              int y) {
    static std::vector<T> v;
    v.clear();
    for (int dy = -(kh / 2); dy <= kh / 2; ++dy)
        for (int dx = -(kw / 2); dx <= kw / 2; ++dx) {
            const int64_t sx = axis(kind, x + dx, W, s.l, r), sy = axis(kind, y + dy, H, s.u, d);
            v.push_back(sx == kOut || sy == kOut ? value : s.get((int)sx, (int)sy));
        }
    std::nth_element(v.begin(), v.begin() + v.size() / 2, v.end());
    return v[v.size() / 2];
}

// One call, out of place or in place, against the model; the destination's
// guards, the source and the buffer's guard must keep their bytes.
template <typename T> void run_case(int kw, int kh, int W, int H, int border, uint32_t seed) {
    SCOPED_TRACE(std::string(zortest::Type<T>::name) + " mask " + std::to_string(kw) + "x" +
                 std::to_string(kh) + " roi " + std::to_string(W) + "x" + std::to_string(H) +
                 " border " + std::to_string(border) + " seed " + std::to_string(seed));
    Rng rng(seed);
    const bool inPlace = seed & 1, up = seed & 4;
    const int f = border == zorBorderInMem ? border : border & 0xF0, rx = kw / 2, ry = kh / 2;
    const int l = f & zorBorderInMemLeft ? rx : 0, r = f & zorBorderInMemRight ? rx : 0;
    const int u = f & zorBorderInMemTop ? ry : 0, d = f & zorBorderInMemBottom ? ry : 0;
    Source<T> s(W, H, l, r, u, d, seed & 2, up);
    s.f.fill([&](int, int) { return value<T>(rng); });
    const T cv = value<T>(rng);
    Image<T> dst(W, H, (up ? -1 : 1) * (W + 1) * (int)sizeof(T), seed % 7 * sizeof(T));
    dst.fill([&](int, int) { return value<T>(rng); });
    Image<T> want = dst;
    std::vector<uint8_t> wantSrc = s.bytes();
    for (int y = 0; y < H; ++y)
        for (int x = 0; x < W; ++x) {
            const T v = model_pixel(s, W, H, kw, kh, r, d, border & 15, cv, x, y);
            if (inPlace)
                memcpy(&wantSrc[(uint8_t*)s.ptr(x, y) - (uint8_t*)s.f.ptr()], &v, sizeof v);
            else
                want.set(x, y, v);
        }
    std::vector<uint8_t> buf = buffer_for({W, H}, kw, kh, Api<T>::type);
    ASSERT_EQ(Api<T>::run(s.ptr(0, 0), s.step(), inPlace ? s.ptr(0, 0) : dst.ptr(),
                          inPlace ? s.step() : dst.step, {W, H}, {kw, kh}, (ZoriBorderType)border,
                          cv, buf.data()),
              zorStsNoErr);
    ASSERT_TRUE(zortest::guard_intact(buf, buf.size() - 64));
    ASSERT_TRUE(same_bytes(dst, want));
    ASSERT_TRUE(s.bytes() == wantSrc) << "source or in-place result";
}

// Replicate, constant, each with some or all sides in memory.
const int kBorders[] = {1, 6, 1 | 16 | 64, 6 | 32 | 128, 240, 6 | 240};

// Every mask class and the general masks' own paths: lines and columns,
// the 16s 7-tap lines, 8u 7x7, sorted windows with and without a radix
// start, the key histogram (n >= 625, also as a line).
struct Mask {
    int kw, kh;
};
const Mask kMasks[] = {{1, 1}, {1, 3},   {3, 1},   {1, 5},   {5, 1},  {3, 3},
                       {5, 5}, {1, 7},   {7, 1},   {7, 7},   {3, 5},  {9, 1},
                       {1, 9}, {11, 11}, {25, 23}, {25, 25}, {27, 5}, {1, 625}};

using MedianFilter = zortest::LevelTest;

// ROIs below, at and above the mask, and rows with every kind of vector
// tail and more than one pass of the sorted-column kernels; then mask
// reaches from 0 to three times the ROI's sides. Sources against
// unreadable pages, rows upwards, in place.
TEST_P(MedianFilter, MasksSizesAndBordersMatchTheModel) {
    zortest::for_each_type([](auto t) {
        typedef decltype(t) T;
        uint32_t seed = 1;
        for (const Mask& m : kMasks) {
            std::vector<ZoriSize> rois = {{1, 1}, {m.kw + 1, m.kh + 2}};
            if (m.kw * m.kh <= 100)
                rois.insert(rois.end(), {{m.kw, m.kh}, {18, 5}, {67, 9}, {300, 3}});
            else if (m.kh > 600)
                rois.back() = {3, 9};
            for (const ZoriSize& roi : rois)
                for (int border : kBorders)
                    ASSERT_NO_FATAL_FAILURE(
                        run_case<T>(m.kw, m.kh, roi.width, roi.height, border, ++seed));
        }
        for (int kw = 1; kw <= 19; kw += 2)
            for (int kh = 1; kh <= 13; kh += 2)
                for (int border : kBorders)
                    ASSERT_NO_FATAL_FAILURE(run_case<T>(kw, kh, 3, 2, border, ++seed));
    });
}

// ---- checks ------------------------------------------------------------------

TEST_P(MedianFilter, ChecksInOrderWriteNothing) {
    zortest::for_each_type([](auto t) {
        typedef decltype(t) T;
        Image<T> src(12, 10), dst(8, 6);
        const Image<T> before = dst;
        std::vector<uint8_t> buf = buffer_for({8, 6}, 5, 5, Api<T>::type);
        const int32_t ss = src.step, ds = dst.step, odd = sizeof(T) > 1 ? 1 : 0;
        auto call = [&](const T* src, int32_t sstep, T* d, int32_t dstep, ZoriSize roi,
                        ZoriSize mask, int border, uint8_t* b) {
            return [=] {
                return Api<T>::run(src, sstep, d, dstep, roi, mask, (ZoriBorderType)border, T(), b);
            };
        };
        T* const sp = src.ptr(2, 2);
        T* const dp = dst.ptr();
        uint8_t* const bp = buf.data();
        std::vector<zortest::CheckRow> rows = {
            {zorStsNullPtrErr, "src", call(nullptr, ss + odd, dp, ds, {0, 0}, {2, 2}, 300, bp)},
            {zorStsNullPtrErr, "dst", call(sp, ss + odd, nullptr, ds, {0, 0}, {2, 2}, 300, bp)},
            {zorStsNullPtrErr, "buffer", call(sp, ss + odd, dp, ds, {0, 0}, {2, 2}, 300, nullptr)},
            {zorStsSizeErr, "roi", call(sp, ss + odd, dp, ds, {8, 0}, {2, 2}, 300, bp)},
            {zorStsMaskSizeErr, "even mask", call(sp, ss, dp, ds, {8, 6}, {3, 2}, 300, bp)},
            {zorStsMaskSizeErr, "mask 0", call(sp, ss, dp, ds, {8, 6}, {0, 3}, 300, bp)},
            {zorStsMaskSizeErr, "mask -3", call(sp, ss, dp, ds, {8, 6}, {-3, 3}, 1, bp)},
            {zorStsBorderErr, "above 255", call(sp, ss, dp, ds, {8, 6}, {3, 3}, 256 | 1, bp)},
            {zorStsBorderErr, "negative", call(sp, ss, dp, ds, {8, 6}, {3, 3}, -1, bp)},
            {zorStsStepErr, "source step 0", call(sp, 0, dp, ds, {8, 6}, {3, 3}, 1, bp)},
            // Steps of whole elements before the mask; 8u takes any.
            {odd ? zorStsNotEvenStepErr : zorStsMaskSizeErr, "src step",
             call(sp, ss + 1, dp, ds, {8, 6}, {2, 2}, 300, bp)},
            {odd ? zorStsNotEvenStepErr : zorStsMaskSizeErr, "dst step",
             call(sp, ss, dp, ds - 1, {8, 6}, {2, 2}, 1, bp)},
        };
        for (int bad : {0, 2, 3, 4, 5, 7, 8, 15, 3 | 16, 16 | 64})
            rows.push_back(
                {zorStsBorderErr, "kind", call(sp, ss, dp, ds, {8, 6}, {3, 3}, bad, bp)});
        // Mirror is refused even where the mask copies.
        rows.push_back(
            {zorStsBorderErr, "1x1 mirror", call(sp, ss, dp, ds, {8, 6}, {1, 1}, 3, bp)});
        zortest::run_checks(rows, [&] { return (bool)same_bytes(dst, before); });
    });
}

// ---- the size query ------------------------------------------------------------

int64_t a32(int64_t x) { return (x + 31) & ~(int64_t)31; }

// The documented sizes, for one channel and for three or four.
int64_t expected_size(int64_t W, int64_t H, int64_t kw, int64_t kh, int type, int64_t c) {
    const int64_t e = type == zor8u ? 1 : type == zor32f ? 4 : 2, n = kw * kh;
    const bool large = kw < W && kh < H;
    if (c != 1) {
        const int64_t a =
            large ? std::max((W + kw - 1) * (kh + kh / 2 - 1), (kw + kw / 2 - 1) * (H + kh - 1))
                  : (W + kw - 1) * (H + kh - 1);
        if (type == zor8u) return a32(c * a);
        return a32(2 * c * a) + (kw < 6 && kh < 6 && kw + kh != 8 ? 0 : n * 8);
    }
    int64_t scratch = 0;
    if (!(kw < 6 && kh < 6 && (kw == 1 || kh == 1 || kw == kh))) {
        if (type != zor32f)
            scratch = a32(n * 4 * e);
        else if (kw == 1 || kh == 1)
            scratch = a32(n * 4);
        else if (n >= 625)
            scratch = a32((n + 15) / 16 * 128 + 28672);
        else
            scratch = a32((std::max(kw, kh) + 15) / 16 * 16 * 4 + (n + 15) / 16 * 16 * 12 +
                          (n > 50 ? 4 * n + 20480 : 0));
    }
    if (!large) return scratch + a32((W + kw - 1) * (H + kh - 1) * e);
    return scratch + kh * 2 * a32(W * e) + 2 * a32(W * (kh / 2) * e) + 2 * a32(H * (kw / 2) * e) +
           a32(std::max((W + kw - 1) * (kh + kh / 2) * e, (kw + kw / 2) * (H + kh - 1) * e));
}

TEST(MedianBuffer, SizesAndChecks) {
    for (ZoriSize roi : {ZoriSize{1, 1}, ZoriSize{5, 5}, ZoriSize{1920, 1080}, ZoriSize{7, 300}})
        for (const Mask& m : kMasks)
            for (int type : {zor8u, zor16u, zor16s, zor32f})
                for (int c : {1, 3, 4}) {
                    if (type == zor32f && c != 1) continue;
                    int32_t size = -1;
                    ASSERT_EQ(zoriFilterMedianBorderGetBufferSize(roi, {m.kw, m.kh},
                                                                  (ZorDataType)type, c, &size),
                              zorStsNoErr);
                    EXPECT_EQ(size, expected_size(roi.width, roi.height, m.kw, m.kh, type, c))
                        << roi.width << "x" << roi.height << " mask " << m.kw << "x" << m.kh
                        << " type " << type << " channels " << c;
                }
    int32_t size = 77;
    auto q = [&](ZoriSize roi, ZoriSize mask, int type, int c, int32_t* p) {
        return
            [=] { return zoriFilterMedianBorderGetBufferSize(roi, mask, (ZorDataType)type, c, p); };
    };
    zortest::run_checks({{zorStsNullPtrErr, "null", q({0, 0}, {2, 2}, 3, 2, nullptr)},
                         {zorStsSizeErr, "roi", q({0, 5}, {2, 2}, 3, 2, &size)},
                         {zorStsMaskSizeErr, "even", q({5, 5}, {3, 4}, 3, 2, &size)},
                         {zorStsMaskSizeErr, "zero", q({5, 5}, {0, 3}, zor8u, 1, &size)},
                         {zorStsNumChannelsErr, "channels", q({5, 5}, {3, 3}, 3, 2, &size)},
                         {zorStsDataTypeErr, "64f", q({5, 5}, {3, 3}, zor64f, 1, &size)},
                         {zorStsDataTypeErr, "32f C3", q({5, 5}, {3, 3}, zor32f, 3, &size)}},
                        [&] { return size == 77; });
    // 2^31 bytes or more: 0 and an error.
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({30000, 3}, {3, 30001}, zor32f, 1, &size),
              zorStsExceededSizeErr);
    EXPECT_EQ(size, 0);
}

ZOR_INSTANTIATE_LEVELS(MedianFilter);

// With NaNs and signed zeros the result depends on the path a mask takes,
// but never on the level.
TEST(MedianLevels, FloatsWithNaNGiveTheSameBitsOnEveryLevel) {
    const int W = 77, H = 13;
    Rng r(99);
    Image<Zor32f> src(W + 28, H + 28), first(W, H);
    const Image<Zor32f> fresh(W, H);
    src.randomize(r);
    for (const Mask& m : {Mask{3, 1}, Mask{1, 5}, Mask{3, 3}, Mask{5, 5}, Mask{7, 1}, Mask{5, 7},
                          Mask{11, 11}, Mask{27, 25}}) {
        for (const zortest::Level& level : zortest::all_levels()) {
            if (!zortest::runnable(level)) continue;
            zorSetCpuFeatures(level.select);
            Image<Zor32f> out = fresh;
            std::vector<uint8_t> buf = buffer_for({W, H}, m.kw, m.kh, zor32f);
            EXPECT_EQ(zoriFilterMedianBorder_32f_C1R(src.ptr(14, 14), src.step, out.ptr(), out.step,
                                                     {W, H}, {m.kw, m.kh}, zorBorderRepl, 0.0f,
                                                     buf.data()),
                      zorStsNoErr);
            if (level.index == 0) first = out;
            EXPECT_TRUE(same_bytes(out, first)) << m.kw << "x" << m.kh << " " << level.name;
        }
        zorInit();
    }
}

}  // namespace
