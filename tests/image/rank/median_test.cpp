// Median filter with border through the public stubs, every level forced in
// turn, against a scalar model: the mask's pixels are taken by the border
// definition (nearest ROI pixel, the constant, or real pixels on the sides
// flagged in memory) and the order statistic is found by sorting them.
#include <math.h>
#include <stdint.h>
#include <string.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

#include "image_support.h"
#include "zortest.h"

namespace {

constexpr int kRepl = zorBorderRepl, kConst = zorBorderConst;
constexpr int kTop = zorBorderInMemTop, kBottom = zorBorderInMemBottom;
constexpr int kLeft = zorBorderInMemLeft, kRight = zorBorderInMemRight;

// ---- calling the four forms ------------------------------------------------

template <typename T> struct Form;
#define MEDIAN_FORM(T, t)                                          \
    template <> struct Form<T> {                                   \
        static constexpr ZorDataType type = zor##t;                \
        static constexpr auto fn = zoriFilterMedianBorder_##t##_C1R; \
    };
MEDIAN_FORM(Zor8u, 8u)
MEDIAN_FORM(Zor16u, 16u)
MEDIAN_FORM(Zor16s, 16s)
MEDIAN_FORM(Zor32f, 32f)
#undef MEDIAN_FORM

template <typename T>
ZorStatus call(const T* src, int32_t srcStep, T* dst, int32_t dstStep, ZoriSize roi, ZoriSize mask,
               int border, T value, Zor8u* buffer) {
    return Form<T>::fn(src, srcStep, dst, dstStep, roi, mask, (ZoriBorderType)border, value,
                       buffer);
}

// ---- images with margins ---------------------------------------------------

// An image whose ROI has `margin` pixels of real data on every side (what
// the in-memory flags let the filter read), rows padded to `pad` extra
// pixels so that the step is not the width.
template <typename T>
struct Image {
    int w, h, margin, stride;  // stride in elements
    std::vector<T> data;
    Image(int w_, int h_, int margin_, int pad = 3)
        : w(w_), h(h_), margin(margin_), stride(w_ + 2 * margin_ + pad),
          data((size_t)stride * (h_ + 2 * margin_)) {}
    T* roi() { return data.data() + (size_t)margin * stride + margin; }
    const T* roi() const { return data.data() + (size_t)margin * stride + margin; }
    int32_t step() const { return stride * (int32_t)sizeof(T); }
    // Pixel (x, y) relative to the ROI; inside the margin.
    T at(int x, int y) const { return roi()[(ptrdiff_t)y * stride + x]; }
};

template <typename T> T random_value(std::mt19937& rng, int style);
template <> Zor8u random_value<Zor8u>(std::mt19937& rng, int style) {
    return style ? (Zor8u)(100 + rng() % 7) : (Zor8u)rng();
}
template <> Zor16u random_value<Zor16u>(std::mt19937& rng, int style) {
    // Narrow values stay near a coarse-bin edge of the 16-bit histogram.
    return style ? (Zor16u)(0x3f0 + rng() % 40) : (Zor16u)rng();
}
template <> Zor16s random_value<Zor16s>(std::mt19937& rng, int style) {
    return style ? (Zor16s)((int)(rng() % 40) - 20) : (Zor16s)rng();
}
template <> Zor32f random_value<Zor32f>(std::mt19937& rng, int style) {
    // Halves, so that equal values occur; never -0.
    const int range = style ? 9 : 2001;
    const int v = (int)(rng() % range) - range / 2;
    return v == 0 ? 0.0f : (float)v * 0.5f;
}

template <typename T>
void fill(Image<T>& img, std::mt19937& rng, int style) {
    for (T& v : img.data) v = random_value<T>(rng, style);
}

// ---- the model -------------------------------------------------------------

template <typename T>
T model_pixel(const Image<T>& src, int kw, int kh, int border, T value, int x, int y) {
    const int flags = border == zorBorderInMem ? zorBorderInMem : (border & 0xF0);
    const bool cnst = (border & 0x0F) == kConst;
    std::vector<T> v;
    for (int dy = -(kh / 2); dy <= kh / 2; ++dy) {
        for (int dx = -(kw / 2); dx <= kw / 2; ++dx) {
            int sx = x + dx, sy = y + dy;
            bool outside = false;
            if (sx < 0 && !(flags & kLeft)) outside = true, sx = 0;
            if (sx >= src.w && !(flags & kRight)) outside = true, sx = src.w - 1;
            if (sy < 0 && !(flags & kTop)) outside = true, sy = 0;
            if (sy >= src.h && !(flags & kBottom)) outside = true, sy = src.h - 1;
            v.push_back(outside && cnst ? value : src.at(sx, sy));
        }
    }
    std::nth_element(v.begin(), v.begin() + v.size() / 2, v.end());
    return v[v.size() / 2];
}

template <typename T>
std::vector<T> model(const Image<T>& src, int kw, int kh, int border, T value) {
    std::vector<T> out((size_t)src.w * src.h);
    for (int y = 0; y < src.h; ++y)
        for (int x = 0; x < src.w; ++x)
            out[(size_t)y * src.w + x] = model_pixel(src, kw, kh, border, value, x, y);
    return out;
}

// ---- one call under guard ----------------------------------------------------

std::vector<Zor8u> buffer_for(ZoriSize roi, ZoriSize mask, ZorDataType type) {
    int32_t size = -1;
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize(roi, mask, type, 1, &size), zorStsNoErr);
    return zortest::guarded((size_t)size);
}

bool guard_intact(const std::vector<Zor8u>& buffer) {
    return zortest::guard_intact(buffer, buffer.size() - 64);
}

std::string what(int kw, int kh, int w, int h, int border, const char* extra = "") {
    return "mask " + std::to_string(kw) + "x" + std::to_string(kh) + " roi " + std::to_string(w) +
           "x" + std::to_string(h) + " border " + std::to_string(border) + extra;
}

template <typename T>
bool same(const T& a, const T& b) {
    return memcmp(&a, &b, sizeof a) == 0;
}

// Runs one case out of place and in place and compares each with the
// model; everything outside the ROI must keep its value, and the buffer's
// guard its bytes.
template <typename T>
void run_case(int kw, int kh, int w, int h, int border, int seed, int style = 0) {
    const std::string where = what(kw, kh, w, h, border);
    std::mt19937 rng(seed);
    const int margin = std::max(kw, kh) / 2 + 2;
    Image<T> src(w, h, margin);
    fill(src, rng, style);
    const T value = random_value<T>(rng, 0);
    const std::vector<T> want = model(src, kw, kh, border, value);

    // Out of place the destination's pad and margin are its guard; in place
    // the margin is read, never written.
    const Image<T> srcBefore = src;
    for (bool inPlace : {false, true}) {
        Image<T> dst = inPlace ? srcBefore : Image<T>(w, h, 2, 5);
        if (!inPlace) fill(dst, rng, 0);
        std::vector<T> expect = dst.data;
        for (int y = 0; y < h; ++y)
            for (int x = 0; x < w; ++x)
                expect[(size_t)(y + dst.margin) * dst.stride + x + dst.margin] =
                    want[(size_t)y * w + x];
        std::vector<Zor8u> buffer = buffer_for({w, h}, {kw, kh}, Form<T>::type);
        const std::string at = where + (inPlace ? " in place" : "");
        ASSERT_EQ(call<T>(inPlace ? dst.roi() : src.roi(), inPlace ? dst.step() : src.step(),
                          dst.roi(), dst.step(), {w, h}, {kw, kh}, border, value, buffer.data()),
                  zorStsNoErr)
            << at;
        ASSERT_TRUE(guard_intact(buffer)) << at;
        ASSERT_TRUE(src.data == srcBefore.data) << at;
        for (size_t i = 0; i < expect.size(); ++i)
            ASSERT_TRUE(same(dst.data[i], expect[i]))
                << at << " at " << (int)(i % dst.stride) - dst.margin << ","
                << (int)(i / dst.stride) - dst.margin << ": " << +dst.data[i] << " want "
                << +expect[i];
    }
}

struct Mask {
    int kw, kh;
};

// Every mask class and the general masks' own paths (columns, lines,
// radix start, large keys), with ROIs below, at and above the mask's size
// and wide enough for the vector bodies with their tails.
const std::vector<Mask>& small_masks() {
    static const std::vector<Mask> m = {{1, 3}, {3, 1}, {1, 5}, {5, 1}, {3, 3}, {5, 5},
                                        {1, 7}, {7, 1}, {1, 9}, {9, 1}, {3, 5}, {5, 3},
                                        {7, 7}, {7, 3}, {1, 1}};
    return m;
}

const std::vector<ZoriSize>& rois_for(const Mask& m) {
    static std::vector<ZoriSize> r;
    r = {{1, 1}, {m.kw, m.kh}, {m.kw + 1, m.kh + 2}, {70, 9}, {131, 7}};
    // Past one pass of the sorted-column kernels.
    if (m.kw == m.kh && (m.kw == 3 || m.kw == 5)) r.push_back({300, 3});
    return r;
}

const int kBorders[] = {kRepl,
                        kConst,
                        kRepl | kTop | kLeft,
                        kConst | kBottom | kRight,
                        kConst | kTop | kBottom,
                        kRepl | kLeft | kRight,
                        zorBorderInMem,
                        kConst | zorBorderInMem};

template <typename T>
void all_small_cases() {
    int seed = 1;
    for (const Mask& m : small_masks())
        for (const ZoriSize& roi : rois_for(m))
            for (int border : kBorders) {
                ++seed;
                ASSERT_NO_FATAL_FAILURE(
                    run_case<T>(m.kw, m.kh, roi.width, roi.height, border, seed, seed % 3 == 0));
            }
}

using MedianFilter = zortest::LevelTest;

TEST_P(MedianFilter, SmallMasks) {
    zortest::for_each_type([](auto t) { all_small_cases<decltype(t)>(); });
}

// Large masks on small images: 11x11 (sorted window with a radix start for
// floats), 25x23 (n = 575, the last size below the key histogram), 25x25
// and 27x27 (key histogram), lines of 27, and non-square shapes.
template <typename T>
void large_cases() {
    const Mask masks[] = {{11, 11}, {25, 23}, {25, 25}, {27, 27}, {1, 27}, {27, 1},
                          {13, 5},  {5, 13},  {9, 27},  {27, 25}, {1, 625}, {15, 15}};
    const ZoriSize rois[] = {{3, 2}, {30, 31}, {41, 12}};
    const int borders[] = {kRepl, kConst | kTop | kRight, kRepl | kBottom | kLeft};
    int seed = 1000;
    for (const Mask& m : masks)
        for (const ZoriSize& roi : rois)
            for (int border : borders) {
                if (m.kh > 600 && roi.height > 3) continue;  // keep the model's time down
                ++seed;
                ASSERT_NO_FATAL_FAILURE(
                    run_case<T>(m.kw, m.kh, roi.width, roi.height, border, seed, seed & 1));
            }
}

TEST_P(MedianFilter, LargeMasks) {
    zortest::for_each_type([](auto t) { large_cases<decltype(t)>(); });
}

// Negative steps walk the rows upwards: the same result as the image
// stored the usual way round, with the top and bottom flags meaning the
// rows before and after the ROI in the caller's order.
TEST_P(MedianFilter, NegativeStepsAreRowsUpwards) {
    const int w = 40, h = 9;
    std::mt19937 rng(7);
    for (int border : {kRepl, kConst | kTop, kRepl | kBottom | kLeft}) {
        for (Mask m : {Mask{3, 3}, Mask{5, 5}, Mask{7, 5}}) {
            Image<Zor8u> src(w, h, 4);
            fill(src, rng, 0);
            const std::vector<Zor8u> want = model<Zor8u>(src, m.kw, m.kh, border, 9);
            // The same pixels stored bottom row first.
            Image<Zor8u> flipped(w, h, 4);
            for (int y = -4; y < h + 4; ++y)
                for (int x = -4; x < w + 4; ++x)
                    flipped.roi()[(ptrdiff_t)(h - 1 - y) * flipped.stride + x] = src.at(x, y);
            std::vector<Zor8u> out((size_t)w * h, 0);
            std::vector<Zor8u> buffer = buffer_for({w, h}, {m.kw, m.kh}, zor8u);
            ASSERT_EQ(zoriFilterMedianBorder_8u_C1R(
                          flipped.roi() + (ptrdiff_t)(h - 1) * flipped.stride, -flipped.step(),
                          out.data() + (size_t)(h - 1) * w, -w, {w, h}, {m.kw, m.kh},
                          (ZoriBorderType)border, 9, buffer.data()),
                      zorStsNoErr);
            // Result row y lies at memory row h - 1 - y.
            std::vector<Zor8u> inOrder((size_t)w * h);
            for (int y = 0; y < h; ++y)
                memcpy(&inOrder[(size_t)y * w], &out[(size_t)(h - 1 - y) * w], w);
            EXPECT_TRUE(inOrder == want) << what(m.kw, m.kh, w, h, border);
            EXPECT_TRUE(guard_intact(buffer));
        }
    }
}

// ---- checks ------------------------------------------------------------------

template <typename T>
void checks_in_order() {
    T src[64 * 8], dst[64 * 8];
    for (int i = 0; i < 64 * 8; ++i) src[i] = (T)(i % 50), dst[i] = (T)7;
    T before[64 * 8];
    memcpy(before, dst, sizeof dst);
    Zor8u buffer[1 << 16];
    const int32_t step = 64 * sizeof(T);
    const int32_t odd = sizeof(T) > 1 ? step + 1 : step;
    struct Case {
        const T* s;
        T* d;
        Zor8u* b;
        int32_t srcStep;
        ZoriSize roi, mask;
        int border;
        ZorStatus want;
    } cases[] = {
        // Pointers first, whatever else is wrong.
        {nullptr, dst, buffer, odd, {0, 0}, {2, 2}, 300, zorStsNullPtrErr},
        {src, nullptr, buffer, step, {8, 8}, {3, 3}, kRepl, zorStsNullPtrErr},
        {src, dst, nullptr, step, {8, 8}, {3, 3}, kRepl, zorStsNullPtrErr},
        // Then the ROI, before steps, mask and border.
        {src, dst, buffer, odd, {0, 8}, {2, 2}, 300, zorStsSizeErr},
        {src, dst, buffer, odd, {8, -1}, {2, 2}, 300, zorStsSizeErr},
        // The mask before the border.
        {src, dst, buffer, step, {8, 8}, {2, 3}, 300, zorStsMaskSizeErr},
        {src, dst, buffer, step, {8, 8}, {3, 0}, kRepl, zorStsMaskSizeErr},
        {src, dst, buffer, step, {8, 8}, {-3, 3}, kRepl, zorStsMaskSizeErr},
        // Mirror and every kind but replicate and constant are refused.
        {src, dst, buffer, step, {8, 8}, {3, 3}, zorBorderMirror, zorStsBorderErr},
        {src, dst, buffer, step, {8, 8}, {3, 3}, zorBorderMirror | kTop, zorStsBorderErr},
        {src, dst, buffer, step, {8, 8}, {3, 3}, zorBorderDefault, zorStsBorderErr},
        {src, dst, buffer, step, {8, 8}, {3, 3}, zorBorderTransp, zorStsBorderErr},
        {src, dst, buffer, step, {8, 8}, {3, 3}, 0, zorStsBorderErr},
        {src, dst, buffer, step, {8, 8}, {3, 3}, kTop | kLeft, zorStsBorderErr},
        {src, dst, buffer, step, {8, 8}, {3, 3}, 256 | kRepl, zorStsBorderErr},
        {src, dst, buffer, step, {8, 8}, {3, 3}, -1, zorStsBorderErr},
        // A mask of 1x1 copies, but only after the border has passed.
        {src, dst, buffer, step, {8, 8}, {1, 1}, zorBorderMirror, zorStsBorderErr},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(call<T>(c.s, c.srcStep, c.d, step, c.roi, c.mask, c.border, (T)1, c.b), c.want)
            << "roi " << c.roi.width << "x" << c.roi.height << " mask " << c.mask.width << "x"
            << c.mask.height << " border " << c.border;
        EXPECT_EQ(memcmp(dst, before, sizeof dst), 0);
    }
    if (sizeof(T) > 1) {
        // Steps that do not hold whole elements, before the mask.
        for (int32_t bad = 1; bad < (int32_t)sizeof(T); ++bad) {
            EXPECT_EQ(call<T>(src, step + bad, dst, step, {8, 8}, {2, 2}, 300, (T)1, buffer),
                      zorStsNotEvenStepErr);
            EXPECT_EQ(call<T>(src, step, dst, step - bad, {8, 8}, {3, 3}, kRepl, (T)1, buffer),
                      zorStsNotEvenStepErr);
        }
        EXPECT_EQ(memcmp(dst, before, sizeof dst), 0);
    }
    // A source step of 0 cannot be framed; nothing is written either.
    EXPECT_EQ(call<T>(src, 0, dst, step, {8, 8}, {3, 3}, kRepl, (T)1, buffer), zorStsStepErr);
    EXPECT_EQ(memcmp(dst, before, sizeof dst), 0);
    // 240 alone is a complete border mode; 1x1 copies, and in place does nothing.
    EXPECT_EQ(call<T>(src + 64, step, dst + 64, step, {8, 6}, {3, 3}, zorBorderInMem, (T)1, buffer),
              zorStsNoErr);
    EXPECT_EQ(call<T>(src, step, dst, step, {8, 8}, {1, 1}, kConst, (T)1, buffer), zorStsNoErr);
    for (int y = 0; y < 8; ++y) EXPECT_EQ(memcmp(dst + 64 * y, src + 64 * y, 8 * sizeof(T)), 0);
    EXPECT_EQ(memcmp(dst + 8, before + 8, 56 * sizeof(T)), 0);
    EXPECT_EQ(call<T>(dst, step, dst, step, {8, 8}, {1, 1}, kRepl, (T)1, buffer),
              zorStsNoErr);
}

TEST_P(MedianFilter, ChecksInOrderAndNothingWritten) {
    zortest::for_each_type([](auto t) { checks_in_order<decltype(t)>(); });
}

// ---- the size query ------------------------------------------------------------

int64_t a32(int64_t x) { return (x + 31) & ~(int64_t)31; }

// The sizes written out from their definition, case by case.
int64_t expected_size(int64_t W, int64_t H, int64_t kw, int64_t kh, int type, int64_t c) {
    const int64_t e = type == zor8u ? 1 : type == zor32f ? 4 : 2;
    const int64_t n = kw * kh;
    if (c != 1) {
        const bool large = kw < W && kh < H;
        const int64_t a = large ? std::max((W + kw - 1) * (kh + kh / 2 - 1),
                                           (kw + kw / 2 - 1) * (H + kh - 1))
                                : (W + kw - 1) * (H + kh - 1);
        if (type == zor8u) return a32(c * a);
        const bool small = kw < 6 && kh < 6 && kw + kh != 8;
        return a32(2 * c * a) + (small ? 0 : n * 8);
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
    if (kw < W && kh < H) {
        const int64_t ring = kh * 2 * a32(W * e);
        const int64_t bands = 2 * a32(W * (kh / 2) * e) + 2 * a32(H * (kw / 2) * e);
        const int64_t frame = a32(std::max((W + kw - 1) * (kh + kh / 2) * e,
                                           (kw + kw / 2) * (H + kh - 1) * e));
        return scratch + ring + bands + frame;
    }
    return scratch + a32((W + kw - 1) * (H + kh - 1) * e);
}

TEST_P(MedianFilter, BufferSizeByTypeMaskAndChannels) {
    const ZoriSize rois[] = {{1, 1}, {5, 5}, {64, 48}, {1920, 1080}, {7, 300}};
    const Mask masks[] = {{1, 1}, {3, 3}, {5, 5},   {1, 5},   {5, 1},   {3, 5},   {5, 3},
                          {7, 7}, {1, 7}, {7, 1},   {7, 9},   {9, 5},   {25, 23}, {25, 25},
                          {5, 11}, {1, 51}, {1, 625}, {51, 1}, {27, 27}, {11, 5}};
    const int types[] = {zor8u, zor16u, zor16s, zor32f};
    for (const ZoriSize& roi : rois)
        for (const Mask& m : masks)
            for (int type : types)
                for (int c : {1, 3, 4}) {
                    if (type == zor32f && c != 1) continue;
                    int32_t size = -1;
                    ASSERT_EQ(zoriFilterMedianBorderGetBufferSize(roi, {m.kw, m.kh},
                                                                  (ZorDataType)type, c, &size),
                              zorStsNoErr);
                    EXPECT_EQ(size, expected_size(roi.width, roi.height, m.kw, m.kh, type, c))
                        << "roi " << roi.width << "x" << roi.height << " mask " << m.kw << "x"
                        << m.kh << " type " << type << " channels " << c;
                }
}

TEST_P(MedianFilter, BufferSizeChecksInOrder) {
    int32_t size = 77;
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({0, 0}, {2, 2}, (ZorDataType)3, 2, nullptr),
              zorStsNullPtrErr);
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({0, 5}, {2, 2}, (ZorDataType)3, 2, &size),
              zorStsSizeErr);
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({5, 5}, {3, 4}, (ZorDataType)3, 2, &size),
              zorStsMaskSizeErr);
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({5, 5}, {0, 3}, zor8u, 1, &size),
              zorStsMaskSizeErr);
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({5, 5}, {3, 3}, (ZorDataType)3, 2, &size),
              zorStsNumChannelsErr);
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({5, 5}, {3, 3}, zor8u, 0, &size),
              zorStsNumChannelsErr);
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({5, 5}, {3, 3}, zor64f, 1, &size),
              zorStsDataTypeErr);
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({5, 5}, {3, 3}, zor32f, 3, &size),
              zorStsDataTypeErr);
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({5, 5}, {3, 3}, zor32f, 4, &size),
              zorStsDataTypeErr);
    EXPECT_EQ(size, 77);
    // 2^31 bytes or more: 0 and an error.
    // A mask as high as the ROI frames the whole image.
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({30000, 3}, {3, 30001}, zor32f, 1, &size),
              zorStsExceededSizeErr);
    EXPECT_EQ(size, 0);
    EXPECT_EQ(zoriFilterMedianBorderGetBufferSize({30000, 3}, {3, 17001}, zor32f, 1, &size),
              zorStsNoErr);
    EXPECT_EQ(size, expected_size(30000, 3, 3, 17001, zor32f, 1));
}

ZOR_INSTANTIATE_LEVELS(MedianFilter);

// ---- every level alike --------------------------------------------------------

// With NaNs among the floats the result depends on the path a mask takes,
// but never on the level: every level must give the same bits. Without
// NaNs the model test above already pins every level to the same values.
TEST(MedianLevels, FloatsWithNaNGiveTheSameBitsOnEveryLevel) {
    const int w = 77, h = 13;
    std::mt19937 rng(99);
    Image<Zor32f> src(w, h, 14);
    fill(src, rng, 0);
    for (int i = 0; i < 60; ++i) src.data[rng() % src.data.size()] = NAN;
    for (int i = 0; i < 20; ++i) src.data[rng() % src.data.size()] = -NAN;
    const Mask masks[] = {{3, 1}, {1, 5}, {3, 3}, {5, 5}, {7, 1}, {5, 7}, {11, 11}, {27, 25}};
    for (const Mask& m : masks) {
        std::vector<std::vector<Zor32f>> results;
        std::vector<std::string> names;
        for (const zortest::Level& level : zortest::all_levels()) {
            if (!zortest::runnable(level)) continue;
            zorSetCpuFeatures(level.select);
            std::vector<Zor32f> out((size_t)w * h);
            std::vector<Zor8u> buffer = buffer_for({w, h}, {m.kw, m.kh}, zor32f);
            EXPECT_EQ(zoriFilterMedianBorder_32f_C1R(src.roi(), src.step(), out.data(), w * 4,
                                                     {w, h}, {m.kw, m.kh}, zorBorderRepl, 0.0f,
                                                     buffer.data()),
                      zorStsNoErr);
            results.push_back(out);
            names.push_back(level.name);
        }
        zorInit();
        for (size_t l = 1; l < results.size(); ++l)
            EXPECT_EQ(memcmp(results[l].data(), results[0].data(), results[0].size() * 4), 0)
                << "mask " << m.kw << "x" << m.kh << ": " << names[l] << " differs from "
                << names[0];
    }
}

}  // namespace
