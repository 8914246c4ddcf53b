// Erosion and dilation through the public stubs, every level forced in
// turn, against one model: the frame made by the border index rules, then
// the minimum or maximum over the mask as the library turns it (180 degrees
// about the anchor, even sides extended behind the caller's last row or
// column). Also the sizes, the record's visible layout and the checks.
#include <stdint.h>
#include <string.h>

#include <algorithm>
#include <limits>
#include <string>
#include <vector>

#include "border_model.h"
#include "image.h"
#include "zortest.h"

namespace {

using zortest::Image;
using zortest::Rng;

template <typename T> struct Api;
#define MORPH_API(t, T)                                                                        \
    template <> struct Api<T> {                                                                \
        static constexpr auto size = zoriMorphologyBorderGetSize_##t##_C1R;                    \
        static constexpr auto init = zoriMorphologyBorderInit_##t##_C1R;                       \
        static ZorStatus run(bool erode, const T* s, int32_t ss, T* d, int32_t ds, ZoriSize r, \
                             int32_t bt, T v, const ZoriMorphState* st, Zor8u* b) {            \
            return erode ? zoriErodeBorder_##t##_C1R(s, ss, d, ds, r, bt, v, st, b)            \
                         : zoriDilateBorder_##t##_C1R(s, ss, d, ds, r, bt, v, st, b);          \
        }                                                                                      \
    };
MORPH_API(8u, Zor8u)
MORPH_API(16u, Zor16u)
MORPH_API(16s, Zor16s)
MORPH_API(32f, Zor32f)
#undef MORPH_API

// The shared random values without NaN, negative zero and infinities:
// with those the order of the folds shows, which differs by path (the
// level test below pins them level against level).
template <typename T> T value(Rng& r) {
    T v = zortest::Type<T>::random(r);
    if constexpr (sizeof(T) == 4)
        if (!(v - v == 0) || zortest::f_bits(v) == 0x80000000u) v = 1.5f;
    return v;
}

// ---- masks ------------------------------------------------------------------------

struct Mask {
    int w, h;
    std::vector<Zor8u> cells;  // the caller's layout; any non-zero byte is set
};

Mask mask(int w, int h, const std::string& rows) {
    Mask m{w, h, std::vector<Zor8u>((size_t)w * h)};
    for (size_t i = 0; i < rows.size(); ++i) m.cells[i] = rows[i] == '1' ? (Zor8u)(1 + i % 7) : 0;
    return m;
}
Mask full(int w, int h) { return mask(w, h, std::string((size_t)w * h, '1')); }
Mask random_mask(int w, int h, uint32_t seed, int percent) {
    Rng r(seed);
    Mask m{w, h, std::vector<Zor8u>((size_t)w * h)};
    for (auto& c : m.cells) c = (int)r.below(100) < percent ? (Zor8u)(r.below(255) + 1) : 0;
    return m;
}
Mask cross(int w, int h, int row, int col) {
    Mask m = mask(w, h, "");
    for (int c = 0; c < w; ++c) m.cells[row * w + c] = 1;
    for (int r = 0; r < h; ++r) m.cells[r * w + col] = 1;
    return m;
}
const char* kPlus3 = "010111010";
const char* kDiamond5 = "0010001110111110111000100";
const char* kDisc7 = "0001000011111001111101111111011111001111100001000";

// Every class the kernels tell apart: copies, full rectangles (3x3 and
// separable, with the columns-first 5x5 and 7x7), the fixed shapes,
// crosses, row runs, general lists, and more cells than one batch.
// clang-format off
std::vector<Mask> all_masks() {
    return {full(1, 1), mask(5, 4, ""), full(3, 3), full(5, 5), full(7, 7), full(7, 3), full(1, 5),
            full(5, 1), full(2, 2), mask(3, 3, kPlus3), mask(5, 5, kDiamond5), mask(7, 7, kDisc7),
            cross(5, 5, 2, 2), cross(7, 7, 3, 1), cross(9, 3, 2, 0), random_mask(3, 5, 13, 50),
            mask(6, 5, "011000111100000001011110001111"), random_mask(8, 7, 14, 40),
            random_mask(27, 27, 16, 95)};
}
// clang-format on

// An empty or 1x1 mask copies.
bool copies(const Mask& m) {
    return (m.w == 1 && m.h == 1) ||
           std::all_of(m.cells.begin(), m.cells.end(), [](Zor8u c) { return !c; });
}

// ---- the model ----------------------------------------------------------------------

// The record, the buffer, each with guard bytes behind it.
struct Record {
    std::vector<uint8_t> rec, buf;
    int32_t specSize = 0, bufSize = 0;
    ZoriMorphState* state() { return (ZoriMorphState*)rec.data(); }
    bool intact() const {
        return zortest::guard_intact(rec, specSize) && zortest::guard_intact(buf, bufSize);
    }
};

template <typename T> Record make_record(ZoriSize roi, const Mask& m) {
    Record r;
    EXPECT_EQ(Api<T>::size(roi, {m.w, m.h}, &r.specSize, &r.bufSize), zorStsNoErr);
    r.rec = zortest::guarded(r.specSize);
    r.buf = zortest::guarded(r.bufSize);
    EXPECT_EQ(Api<T>::init(roi, m.cells.data(), {m.w, m.h}, r.state(), r.buf.data()), zorStsNoErr);
    return r;
}

// The pixels a call may read: the ROI and, beyond each side flagged in
// memory, the mask's reach (l, r, u, d); an unreadable page right before
// the first of them or right after the last, so that reading further
// faults.
template <typename T> struct Source {
    int l, u;
    zortest::Fenced<T> f;
    Source(int W, int H, int l_, int r, int u_, int d, bool atEnd)
        : l(l_), u(u_), f(W + l_ + r, H + u_ + d, atEnd, (W + l_ + r + 3) * (int)sizeof(T)) {}
    T* ptr(int x, int y) { return f.ptr(x + l, y + u); }
    T get(int x, int y) {
        T v;
        memcpy(&v, ptr(x, y), sizeof v);
        return v;
    }
};

// Output (x, y) is the fold over set caller cells (i, j) of the pixel at
// (x + mw - 1 - i - ax, y + mh - 1 - j - ay) of the frame: the source's
// pixels, the border rule beyond them.
template <typename T> void run_case(const Mask& m, int W, int H, int32_t border, uint32_t seed) {
    const bool erode = seed & 1;
    SCOPED_TRACE(std::string(zortest::Type<T>::name) + " mask " + std::to_string(m.w) + "x" +
                 std::to_string(m.h) + " roi " + std::to_string(W) + "x" + std::to_string(H) +
                 " border " + std::to_string(border) + (erode ? " erode" : " dilate"));
    // The 8u forms take the flags from bits 8-11 too, the others ignore them.
    const int b = sizeof(T) == 1 ? ((border & 0xf00) >> 4) | (border & 255) : border & 255;
    const int f = (b & 15) == 0 ? 240 : b & 240, kind = b & 15;
    const int mw = m.w | 1, mh = m.h | 1, ax = m.w >> 1, ay = m.h >> 1;
    const int l = f & 64 ? ax : 0, r = f & 128 ? mw - ax - 1 : 0;
    const int u = f & 16 ? ay : 0, d = f & 32 ? mh - ay - 1 : 0;
    Rng rng(seed);
    Source<T> s(W, H, l, r, u, d, seed & 2);
    s.f.fill([&](int, int) { return value<T>(rng); });
    const T cv = value<T>(rng),
            neutral = erode ? std::numeric_limits<T>::max() : std::numeric_limits<T>::lowest();
    Image<T> dst(W, H, (W + 1) * (int)sizeof(T), seed % 5 * sizeof(T));
    dst.fill([&](int, int) { return value<T>(rng); });
    Image<T> want = dst;
    for (int y = 0; y < H; ++y)
        for (int x = 0; x < W; ++x) {
            T acc = neutral;
            for (int j = 0; j < m.h; ++j)
                for (int i = 0; i < m.w; ++i) {
                    if (!m.cells[(size_t)j * m.w + i]) continue;
                    const int64_t sx =
                        zortest::border_index(kind, x + mw - 1 - i - ax + l, W + l + r);
                    const int64_t sy =
                        zortest::border_index(kind, y + mh - 1 - j - ay + u, H + u + d);
                    const T v = sx < 0 || sy < 0 ? (kind == 5 ? neutral : cv)
                                                 : s.get((int)sx - l, (int)sy - u);
                    acc = erode ? std::min(acc, v) : std::max(acc, v);
                }
            want.set(x, y, copies(m) ? s.get(x, y) : acc);
        }
    // A copy touches no buffer, so its record may be sized for one pixel.
    Record rec = make_record<T>(copies(m) ? ZoriSize{1, 1} : ZoriSize{W, H}, m);
    ASSERT_EQ(Api<T>::run(erode, s.ptr(0, 0), s.f.step, dst.ptr(), dst.step, {W, H}, border, cv,
                          rec.state(), rec.buf.data()),
              zorStsNoErr);
    ASSERT_TRUE(same_bytes(dst, want));
    ASSERT_TRUE(rec.intact());
}

const int32_t kBorders[] = {
    1,        3, 5, 6, 1 | 16 | 64, 3 | 32 | 128, 6 | 16 | 128, 5 | 32 | 64, 240, 1 | 0x100 | 0x800,
    3 | 0xf00};

using Morph = zortest::LevelTest;

// ROIs smaller than the mask, equal, a little larger, and rows with every
// kind of vector tail (one border for a row wider than the columns-first
// kernel's strips); then reaches from 0 to three times the ROI. Sources
// against unreadable pages.
TEST_P(Morph, MasksSizesAndBordersMatchTheModel) {
    zortest::for_each_type([](auto t) {
        typedef decltype(t) T;
        uint32_t seed = 1;
        for (const Mask& m : all_masks()) {
            const int w = m.w | 1, h = m.h | 1;
            const ZoriSize rois[] = {{std::max(1, w - 2), std::max(1, h - 1)},
                                     {w, h},
                                     {w + 1, h + 3},
                                     {w * h > 64 ? 75 : 150, h + 4},
                                     {7000, 3}};
            for (const ZoriSize& roi : rois)
                for (int32_t b : kBorders)
                    if (roi.width < 7000 || (w * h <= 49 && b == kBorders[seed % 11]))
                        ASSERT_NO_FATAL_FAILURE(run_case<T>(m, roi.width, roi.height, b, ++seed));
        }
        for (int w = 1; w <= 20; w += 3)
            for (int h = 1; h <= 14; h += 2)
                for (const Mask& m : {full(w, h), random_mask(w, h, seed, 30)})
                    for (int32_t b : {1, 3, 5, 6, 3 | 16 | 64, 1 | 32 | 128})
                        ASSERT_NO_FATAL_FAILURE(run_case<T>(m, 3, 2, b, ++seed));
    });
}

// The rotation and the mirror's fold in one: the cell left of the anchor
// reads two pixels to the right.
TEST_P(Morph, MirrorFoldsFramesLongerThanTheImage) {
    const Zor8u src[3] = {10, 20, 30}, want[3] = {30, 20, 10};
    Zor8u out[3];
    Record r = make_record<Zor8u>({3, 1}, mask(7, 1, "0100000"));
    ASSERT_EQ(zoriErodeBorder_8u_C1R(src, 3, out, 3, {3, 1}, 3, 0, r.state(), r.buf.data()),
              zorStsNoErr);
    EXPECT_EQ(memcmp(out, want, 3), 0) << +out[0] << " " << +out[1] << " " << +out[2];
}

// The general path starts from the largest finite value: an infinite
// window comes out as that value; a full rectangle passes it through.
TEST_P(Morph, InfinityThroughGeneralAndRectanglePaths32f) {
    const float inf = std::numeric_limits<float>::infinity();
    std::vector<Zor32f> src(16 * 16, inf), out(16 * 16);
    for (const Mask& m : {full(3, 3), full(5, 3), cross(5, 5, 2, 2)}) {
        Record r = make_record<Zor32f>({16, 16}, m);
        ASSERT_EQ(zoriErodeBorder_32f_C1R(src.data(), 64, out.data(), 64, {16, 16}, 1, 0, r.state(),
                                          r.buf.data()),
                  zorStsNoErr);
        for (float v : out)
            ASSERT_EQ(v, m.w == 5 && m.h == 5 ? std::numeric_limits<float>::max() : inf);
    }
}

// Floats where the order of comparisons could show (signed zeros,
// infinities, NaN): one record, the same bits on every level.
TEST(MorphLevels, SameBitsOnEveryLevel32f) {
    const int W = 133, H = 21;
    Rng rng(77);
    Image<Zor32f> src(W, H);
    src.randomize(rng);
    const Image<Zor32f> proto(W, H);
    for (const Mask& m : {full(3, 3), full(5, 5), full(4, 7), mask(7, 7, kDisc7), cross(5, 5, 2, 2),
                          random_mask(9, 9, 6, 90), random_mask(13, 13, 7, 80)}) {
        zorInit();
        Record r = make_record<Zor32f>({W, H}, m);
        for (int32_t b : {1, 3, 5, 6})
            for (bool erode : {true, false}) {
                std::vector<Image<Zor32f>> outs;
                for (const zortest::Level& l : zortest::all_levels()) {
                    if (!zortest::runnable(l)) continue;
                    zorSetCpuFeatures(l.select);
                    outs.push_back(proto);
                    ASSERT_EQ(Api<Zor32f>::run(erode, src.ptr(), src.step, outs.back().ptr(),
                                               outs.back().step, {W, H}, b, 0.0f, r.state(),
                                               r.buf.data()),
                              zorStsNoErr);
                    EXPECT_TRUE(same_bytes(outs.back(), outs[0])) << l.name << " border " << b;
                }
            }
    }
    zorInit();
}

// ---- the record and the sizes ----------------------------------------------------------

struct HeadView {
    uint64_t pMask;
    int32_t maskWidth, maskHeight, anchorX, anchorY, isRowRuns, maskFeature, isCross, isFixed;
};

std::vector<int> u16s(const uint8_t* p, size_t n) {
    std::vector<uint16_t> v(n);
    memcpy(v.data(), p, 2 * n);
    return std::vector<int>(v.begin(), v.end());
}

TEST(MorphRecord, TurnedMaskTablesAndFeatures) {
    // Caller's 4x3 mask (even width): stored 5x3, turned, padding column at
    // 0; stored rows "00101", "01110", "00011".
    Record r = make_record<Zor8u>({8, 8}, mask(4, 3, "110001111010"));
    HeadView h;
    memcpy(&h, r.rec.data(), sizeof h);
    EXPECT_EQ(h.pMask, (uint64_t)(uintptr_t)(r.rec.data() + 136));
    EXPECT_EQ(std::vector<int>({h.maskWidth, h.maskHeight, h.anchorX, h.anchorY}),
              std::vector<int>({5, 3, 2, 1}));
    const uint8_t stored[15] = {0, 0, 255, 0, 255, 0, 255, 255, 255, 0, 0, 0, 0, 255, 255};
    EXPECT_EQ(memcmp(r.rec.data() + 136, stored, 15), 0);
    const std::vector<int> lists = u16s(r.rec.data() + 136 + 15, 18);  // 6 entries a row
    EXPECT_EQ(std::vector<int>({lists[0], lists[1], lists[2], lists[6], lists[7], lists[8],
                                lists[9], lists[12], lists[13], lists[14]}),
              std::vector<int>({2, 2, 4, 3, 1, 2, 3, 2, 3, 4}));
    EXPECT_EQ(u16s(r.rec.data() + 136 + 15 + 36, 6), std::vector<int>({2, 4, 1, 3, 3, 4}));
    struct Want {
        Mask m;
        int feature, rowRuns, cross, fixed;
    };
    // clang-format off
    const Want cases[] = {
        {mask(4, 3, "110001111010"), 8, 0, 0, 0},  // row 0 has a gap, the padding is empty
        {full(2, 2), 8 | 16, 1, 0, 0},     {full(3, 3), 2 | 16, 1, 0, 0},
        {full(1, 1), 2 | 16, 1, 0, 0},     {mask(3, 3, ""), 4 | 8 | 16, 1, 0, 0},
        {mask(3, 3, kPlus3), 16 | 32 | 0x100, 1, 1, 1},  // a fixed shape before a cross
        {mask(5, 5, kDiamond5), 16 | 0x300, 1, 0, 1},    {mask(7, 7, kDisc7), 16 | 0x500, 1, 0, 1},
        {cross(7, 5, 0, 6), 16 | 32, 1, 1, 0},
        {cross(4, 5, 2, 1), 8 | 16, 1, 0, 0},  // even width: the padded row is not full
        {mask(3, 3, "101010101"), 0, 0, 0, 0}, {mask(3, 3, "111101111"), 0, 0, 0, 0}};
    // clang-format on
    for (const Want& c : cases) {
        Record rc = make_record<Zor16u>({6, 6}, c.m);
        memcpy(&h, rc.rec.data(), sizeof h);
        EXPECT_EQ(std::vector<int>({h.maskFeature, h.isRowRuns, h.isCross, h.isFixed}),
                  std::vector<int>({c.feature, c.rowRuns, c.cross, c.fixed}))
            << c.m.w << "x" << c.m.h;
    }
    // A cross keeps its full row and column (stored indices) at the head of
    // the run table: caller row 0, column 6 of a 7x5 mask.
    Record rc = make_record<Zor8u>({6, 6}, cross(7, 5, 0, 6));
    EXPECT_EQ(u16s(rc.rec.data() + 136 + 35 + 5 * 8 * 2, 2), std::vector<int>({4, 0}));
}

int64_t r32(int64_t x) { return (x + 31) / 32 * 32; }

TEST(MorphRecord, SizesFollowTheFormulas) {
    const ZoriSize cases[][2] = {{{10, 10}, {3, 3}}, {{1920, 1080}, {5, 5}}, {{4, 4}, {5, 5}},
                                 {{6, 9}, {2, 4}},   {{100, 3}, {1, 7}},     {{3, 100}, {7, 1}},
                                 {{1, 1}, {1, 1}},   {{64, 48}, {27, 26}}};
    for (int e : {1, 2, 4})
        for (const auto& c : cases) {
            const int W = c[0].width, H = c[0].height, w = c[1].width | 1, h = c[1].height | 1;
            const int ax = c[1].width >> 1, ay = c[1].height >> 1;
            int64_t a = (int64_t)(W + w - 1) * (H + h - 1);
            if (w < W && h < H) {
                a = h - ay - 1 > 0 ? (int64_t)(w + W - 1) * (2 * h - ay - 2) : 0;
                if (w - ax - 1 > 0) a = std::max(a, (int64_t)(h + H - 1) * (2 * w - ax - 2));
            }
            int32_t rec = -1, buf = -1;
            const auto size = e == 1   ? Api<Zor8u>::size
                              : e == 2 ? Api<Zor16s>::size
                                       : Api<Zor32f>::size;
            ASSERT_EQ(size(c[0], c[1], &rec, &buf), zorStsNoErr);
            EXPECT_EQ(rec, h * ((w + 1) * 2 + w) + 136 + (w + 1) * h * 2);
            EXPECT_EQ(buf, r32(a * e) + r32((int64_t)W * e) * h + r32((int64_t)w * e) + 16 * e + 64)
                << W << "x" << H << " mask " << w << "x" << h << " e " << e;
        }
}

// ---- checks ----------------------------------------------------------------------------

TEST(MorphRecord, SizeAndInitChecksInOrder) {
    zortest::for_each_type([](auto t) {
        typedef decltype(t) T;
        int32_t s = 0, b = 0;
        const Zor8u m[9] = {1, 1, 1, 1, 1, 1, 1, 1, 1};
        std::vector<uint8_t> rec(4096, zortest::kGuardByte), buf(16);
        ZoriMorphState* st = (ZoriMorphState*)rec.data();
        Zor8u* bp = buf.data();
        auto size = [](ZoriSize r, ZoriSize k, int32_t* a, int32_t* c) {
            return [=] { return Api<T>::size(r, k, a, c); };
        };
        auto init = [](ZoriSize r, const Zor8u* mk, ZoriSize k, ZoriMorphState* sp, Zor8u* p) {
            return [=] { return Api<T>::init(r, mk, k, sp, p); };
        };
        zortest::run_checks({{zorStsNullPtrErr, "record", size({0, 5}, {3, 3}, nullptr, &b)},
                             {zorStsNullPtrErr, "buf", size({0, 5}, {3, 3}, &s, nullptr)},
                             {zorStsSizeErr, "roi", size({0, 5}, {3, 0}, &s, &b)},
                             {zorStsSizeErr, "mask", size({5, 5}, {3, 0}, &s, &b)},
                             {zorStsMaskSizeErr, "long", size({5, 5}, {32768, 1}, &s, &b)},
                             {zorStsNullPtrErr, "mask", init({0, 5}, nullptr, {3, 3}, st, bp)},
                             {zorStsNullPtrErr, "state", init({0, 5}, m, {3, 3}, nullptr, bp)},
                             {zorStsNullPtrErr, "buffer", init({0, 5}, m, {3, 3}, st, nullptr)},
                             {zorStsSizeErr, "roi", init({5, 0}, m, {0, 3}, st, bp)},
                             {zorStsSizeErr, "mask", init({5, 5}, m, {0, 3}, st, bp)},
                             {zorStsMaskSizeErr, "long", init({5, 5}, m, {1, 40000}, st, bp)}},
                            [&] { return s == 0 && b == 0 && zortest::guard_intact(rec, 0); });
        // 2^31 bytes or more: both sizes 0.
        s = b = 7;
        EXPECT_EQ(Api<T>::size({1 << 30, 1 << 30}, {3, 3}, &s, &b), zorStsExceededSizeErr);
        EXPECT_EQ(s + b, 0);
    });
}

TEST_P(Morph, ChecksInOrderWriteNothing) {
    zortest::for_each_type([](auto t) {
        typedef decltype(t) T;
        const int e = sizeof(T);
        Record r = make_record<T>({8, 6}, full(3, 3));
        Image<T> src(12, 10), dst(8, 6);
        const Image<T> before = dst;
        const T* s = src.ptr(2, 2);
        T* d = dst.ptr();
        const int32_t ss = src.step, ds = dst.step;
        ZoriMorphState* st = r.state();
        Zor8u* buf = r.buf.data();
        for (bool erode : {true, false}) {
            auto call = [&](const T* sp, int32_t sstep, T* dp, int32_t dstep, ZoriSize roi,
                            int32_t bt, const ZoriMorphState* rec, Zor8u* bb) {
                return
                    [=] { return Api<T>::run(erode, sp, sstep, dp, dstep, roi, bt, T(), rec, bb); };
            };
            std::vector<zortest::CheckRow> rows = {
                {zorStsNullPtrErr, "src", call(nullptr, 0, d, ds, {0, 6}, 0, st, buf)},
                {zorStsNullPtrErr, "dst", call(s, 0, nullptr, ds, {8, 6}, 1, st, buf)},
                {zorStsNullPtrErr, "state", call(s, 0, d, ds, {8, 6}, 1, nullptr, buf)},
                {zorStsNullPtrErr, "buffer", call(s, 0, d, ds, {8, 6}, 1, st, nullptr)},
                {zorStsSizeErr, "roi", call(s, 0, d, ds, {-1, 6}, 0, st, buf)},
                // Both steps are compared with the width; negative ones fail.
                {zorStsStepErr, "src step", call(s, 8 * e - 1, d, ds, {8, 6}, 0, st, buf)},
                {zorStsStepErr, "dst step", call(s, 8 * e, d, 8 * e - 1, {8, 6}, 0, st, buf)},
                {zorStsStepErr, "negative", call(s, -ss, d, ds, {8, 6}, 1, st, buf)},
                {zorStsBorderErr, "kind 2 in place", call(d, ds, d, ds, {8, 6}, 2, st, buf)},
                {e > 1 ? zorStsNotEvenStepErr : zorStsBorderErr, "odd",
                 call(s, ss + 1, d, ds, {8, 6}, 0, st, buf)},
            };
            // 8u takes any step from the width up, and runs in place.
            if (e > 1)
                rows.push_back({zorStsInplaceModeNotSupportedErr, "in place",
                                call(d, ds, d, ds, {8, 6}, 1, st, buf)});
            for (int32_t bad : {0, 2, 4, 7, 8, 15, 16, 0x100, 0xf00, 0xff0, 4095, 4096, -1})
                rows.push_back(
                    {zorStsBorderErr, "border", call(s, ss, d, ds, {8, 6}, bad, st, buf)});
            zortest::run_checks(rows, [&] { return (bool)same_bytes(dst, before); });
            Image<T> out(8, 6);
            for (int32_t good : {1 | 16, 6 | 0xf0, 3 | 0xf00, 5 | 0x7f0})
                EXPECT_EQ(call(s, ss, out.ptr(), out.step, {8, 6}, good, st, buf)(), zorStsNoErr)
                    << good;
        }
    });
}

ZOR_INSTANTIATE_LEVELS(Morph);

}  // namespace
