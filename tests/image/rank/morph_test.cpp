// Erosion and dilation through the public stubs, every level forced in
// turn, against a scalar model: the frame made by the border rule, then the
// minimum or maximum over the mask as the library turns it (180 degrees
// about the anchor, even sides extended behind the caller's last row or
// column). Also the size formulas, the record's visible layout and the
// order of the checks.
#include <math.h>
#include <stdint.h>
#include <string.h>

#include <algorithm>
#include <limits>
#include <map>
#include <string>
#include <random>
#include <vector>

#include "image_support.h"
#include "zortest.h"

namespace {

// ---- masks ------------------------------------------------------------------------

struct Mask {
    int w, h;
    std::vector<Zor8u> cells;  // the caller's layout
    const char* what;
};

Mask make_mask(int w, int h, const char* what, const char* rows = nullptr) {
    Mask m{w, h, std::vector<Zor8u>((size_t)w * h, 0), what};
    if (rows)
        for (int i = 0; i < w * h; ++i) m.cells[i] = rows[i] == '1' ? (Zor8u)(1 + i % 7) : 0;
    return m;
}

Mask full(int w, int h) {
    Mask m = make_mask(w, h, "full");
    std::fill(m.cells.begin(), m.cells.end(), 1);
    return m;
}

Mask random_mask(int w, int h, uint32_t seed, int percent) {
    std::mt19937 rng(seed);
    Mask m = make_mask(w, h, "random");
    for (auto& c : m.cells) c = (int)(rng() % 100) < percent ? (Zor8u)(rng() % 255 + 1) : 0;
    return m;
}

// Each row one run of random extent (some rows empty).
Mask runs_mask(int w, int h, uint32_t seed) {
    std::mt19937 rng(seed);
    Mask m = make_mask(w, h, "runs");
    for (int r = 0; r < h; ++r) {
        if (rng() % 5 == 0) continue;
        int a = rng() % w, b = rng() % w;
        if (a > b) std::swap(a, b);
        for (int c = a; c <= b; ++c) m.cells[r * w + c] = 1;
    }
    return m;
}

Mask cross(int w, int h, int row, int col) {
    Mask m = make_mask(w, h, "cross");
    for (int c = 0; c < w; ++c) m.cells[row * w + c] = 1;
    for (int r = 0; r < h; ++r) m.cells[r * w + col] = 1;
    return m;
}

const char* kPlus3 = "010111010";
const char* kDiamond5 = "0010001110111110111000100";
const char* kDisc7 =
    "0001000"
    "0111110"
    "0111110"
    "1111111"
    "0111110"
    "0111110"
    "0001000";

std::vector<Mask> all_masks() {
    return {full(1, 1), make_mask(1, 1, "empty 1x1"), make_mask(5, 4, "empty"),
            full(3, 3), full(5, 5), full(7, 3), full(1, 5), full(5, 1), full(2, 2), full(4, 3),
            full(27, 27), make_mask(3, 3, "plus", kPlus3), make_mask(5, 5, "diamond", kDiamond5),
            make_mask(7, 7, "disc", kDisc7), cross(5, 5, 2, 2), cross(7, 7, 3, 1),
            cross(7, 5, 0, 5), cross(9, 3, 2, 0), runs_mask(6, 5, 11), runs_mask(9, 9, 12),
            random_mask(3, 5, 13, 50), random_mask(8, 7, 14, 40), random_mask(13, 11, 15, 30),
            random_mask(27, 27, 16, 95),  // more than one batch of cells
            random_mask(1, 6, 17, 60), random_mask(6, 1, 18, 60)};
}

// ---- images and the model ------------------------------------------------------------

template <typename T> struct Traits;
template <> struct Traits<Zor8u> {
    static Zor8u value(std::mt19937& r) { return (Zor8u)r(); }
    static constexpr Zor8u lo = 0, hi = 255;
};
template <> struct Traits<Zor16u> {
    static Zor16u value(std::mt19937& r) { return (Zor16u)r(); }
    static constexpr Zor16u lo = 0, hi = 65535;
};
template <> struct Traits<Zor16s> {
    static Zor16s value(std::mt19937& r) { return (Zor16s)r(); }
    static constexpr Zor16s lo = -32768, hi = 32767;
};
template <> struct Traits<Zor32f> {
    // Finite, non-zero: with these every comparison order gives the same.
    static Zor32f value(std::mt19937& r) {
        return ((int)(r() % 20001) - 10000) * 0.37f + ((r() & 1) ? 0.125f : -0.125f);
    }
    static constexpr Zor32f lo = -3.4028234663852886e38f, hi = 3.4028234663852886e38f;
};

// The library's functions by type.
template <typename T> struct Api;
#define MORPH_API(t, T)                                                                        \
    template <> struct Api<T> {                                                                \
        static ZorStatus size(ZoriSize r, ZoriSize m, int32_t* s, int32_t* b) {                \
            return zoriMorphologyBorderGetSize_##t##_C1R(r, m, s, b);                          \
        }                                                                                      \
        static ZorStatus init(ZoriSize r, const Zor8u* m, ZoriSize ms, ZoriMorphState* s,      \
                              Zor8u* b) {                                                      \
            return zoriMorphologyBorderInit_##t##_C1R(r, m, ms, s, b);                         \
        }                                                                                      \
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

// Periodic reflection about the first and last index, edge not repeated.
int reflect(int p, int n) {
    if (n == 1) return 0;
    const int m = 2 * n - 2;
    int q = p % m;
    if (q < 0) q += m;
    return q >= n ? m - q : q;
}

// A source image inside a larger block: every pixel the flags allow the
// library to read exists and holds a random value.
template <typename T> struct Source {
    int W, H, margin, stride;  // stride in elements
    std::vector<T> block;
    const T* roi() const { return block.data() + (size_t)margin * stride + margin; }
    T at(int x, int y) const { return block[(size_t)(y + margin) * stride + x + margin]; }
};

template <typename T> Source<T> make_source(int W, int H, int margin, uint32_t seed) {
    Source<T> s{W, H, margin, W + 2 * margin + 3, {}};
    s.block.resize((size_t)s.stride * (H + 2 * margin));
    std::mt19937 rng(seed);
    for (auto& v : s.block) v = Traits<T>::value(rng);
    return s;
}

struct Border {
    int32_t type;  // as passed
    int kind;      // 1, 3, 6 after the neutral kind is resolved
    bool top, bottom, left, right;
};

// What the library should do with borderType for type T (the 8u forms fold
// bits 8-11 down, the others ignore them).
template <typename T> Border resolve(int32_t type) {
    int32_t b = sizeof(T) == 1 ? ((type & 0xf00) >> 4) | (type & 255) : type & 255;
    Border r{type, b & 15, (b & 16) != 0, (b & 32) != 0, (b & 64) != 0, (b & 128) != 0};
    if (b == 240) r.kind = 1;
    return r;
}

template <typename T>
std::vector<T> model(const Source<T>& s, const Mask& m, const Border& bd, T value, bool erode) {
    const int W = s.W, H = s.H;
    std::vector<T> out((size_t)W * H);
    const int mw = m.w | 1, mh = m.h | 1, ax = m.w >> 1, ay = m.h >> 1;
    bool any = false;
    for (Zor8u c : m.cells) any |= c != 0;
    if ((mw == 1 && mh == 1) || !any) {
        for (int y = 0; y < H; ++y)
            for (int x = 0; x < W; ++x) out[(size_t)y * W + x] = s.at(x, y);
        return out;
    }
    const bool all = bd.top && bd.bottom && bd.left && bd.right;
    // The rectangle of real pixels: the ROI, grown by the mask's reach on
    // each side that is in memory (or that the mask does not reach).
    const int x0 = all || bd.left || ax == 0 ? -ax : 0;
    const int x1 = W + (all || bd.right || ax == 0 ? ax : 0);
    const int y0 = all || bd.top || ay == 0 ? -ay : 0;
    const int y1 = H + (all || bd.bottom || ay == 0 ? ay : 0);
    const T neutral = erode ? Traits<T>::hi : Traits<T>::lo;
    const T cval = (bd.type & 15) == 5 ? neutral : value;
    auto pixel = [&](int x, int y) -> T {
        if (x < x0 || x >= x1 || y < y0 || y >= y1) {
            if (bd.kind == 6 || bd.kind == 5) return cval;
            if (bd.kind == 1) {
                x = std::min(std::max(x, x0), x1 - 1);
                y = std::min(std::max(y, y0), y1 - 1);
            } else {
                x = x0 + reflect(x - x0, x1 - x0);
                y = y0 + reflect(y - y0, y1 - y0);
            }
        }
        return s.at(x, y);
    };
    for (int y = 0; y < H; ++y)
        for (int x = 0; x < W; ++x) {
            T acc = neutral;
            for (int j = 0; j < m.h; ++j)
                for (int i = 0; i < m.w; ++i) {
                    if (!m.cells[(size_t)j * m.w + i]) continue;
                    const T v = pixel(x + (mw - 1 - i) - ax, y + (mh - 1 - j) - ay);
                    acc = erode ? std::min(acc, v) : std::max(acc, v);
                }
            out[(size_t)y * W + x] = acc;
        }
    return out;
}

// The record, the buffer and a destination, each with guard bytes behind
// it, the destination also around it.
constexpr uint8_t kFill = zortest::kGuardByte;

struct Record {
    std::vector<uint8_t> rec, buf;
    int32_t specSize = 0, bufSize = 0;
    ZoriMorphState* state() { return (ZoriMorphState*)rec.data(); }
    bool guards_intact() const {
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

template <typename T> struct Dest {
    int W, H, stride;  // elements
    std::vector<T> block;
    T* roi() { return block.data() + 2 * stride + 2; }
    explicit Dest(int w, int h) : W(w), H(h), stride(w + 5) {
        block.resize((size_t)stride * (h + 4));
        memset(block.data(), kFill, block.size() * sizeof(T));
    }
    // ROI against want, everything else untouched.
    ::testing::AssertionResult check(const std::vector<T>& want) const {
        T fill;
        memset(&fill, kFill, sizeof fill);
        for (int y = 0; y < H + 4; ++y)
            for (int x = 0; x < stride; ++x) {
                const bool in = y >= 2 && y < H + 2 && x >= 2 && x < W + 2;
                const T got = block[(size_t)y * stride + x];
                const T exp = in ? want[(size_t)(y - 2) * W + x - 2] : fill;
                if (memcmp(&got, &exp, sizeof got) != 0)
                    return ::testing::AssertionFailure()
                           << "at (" << x - 2 << ", " << y - 2 << ") got " << +got << " want "
                           << +exp;
            }
        return ::testing::AssertionSuccess();
    }
};

template <typename T>
void run_case(const Mask& m, int W, int H, int32_t border, bool erode, uint32_t seed) {
    SCOPED_TRACE(::testing::Message() << m.what << " " << m.w << "x" << m.h << " roi " << W
                                      << "x" << H << " border " << border
                                      << (erode ? " erode" : " dilate") << " elem " << sizeof(T));
    const int margin = std::max(m.w, m.h) + 1;
    const Source<T> s = make_source<T>(W, H, margin, seed);
    std::mt19937 rng(seed ^ 0x9e3779b9u);
    const T value = Traits<T>::value(rng);
    Record r = make_record<T>({W, H}, m);
    Dest<T> d(W, H);
    ASSERT_EQ(Api<T>::run(erode, s.roi(), s.stride * (int)sizeof(T), d.roi(),
                          d.stride * (int)sizeof(T), {W, H}, border, value, r.state(),
                          r.buf.data()),
              zorStsNoErr);
    // The model is the same for every level: made once per case.
    static std::map<std::string, std::vector<T>> models;
    const std::string key = (::testing::Message()
                             << m.what << m.w << "x" << m.h << "/" << W << "x" << H << "/"
                             << border << erode << "/" << seed)
                                .GetString();
    auto it = models.find(key);
    if (it == models.end())
        it = models.emplace(key, model(s, m, resolve<T>(border), value, erode)).first;
    ASSERT_TRUE(d.check(it->second));
    ASSERT_TRUE(r.guards_intact());
}

const int32_t kBorders[] = {1, 3, 5, 6, 1 | 16 | 64, 3 | 32 | 128, 6 | 16 | 128, 5 | 32 | 64,
                            240, 1 | 0x100 | 0x800, 3 | 0xf00};

// ROIs against the mask: smaller, equal, a little larger, and wide enough
// for several vectors with a tail.
std::vector<ZoriSize> rois(const Mask& m) {
    const int w = m.w | 1, h = m.h | 1;
    std::vector<ZoriSize> v = {{std::max(1, w - 2), std::max(1, h - 1)}, {w, h}, {w + 1, h + 3}};
    if (w * h <= 64) v.push_back({150, 2 * h + 5});
    else v.push_back({75, h + 4});
    return v;
}

template <typename T> void all_cases() {
    uint32_t seed = 1;
    for (const Mask& m : all_masks())
        for (const ZoriSize& roi : rois(m))
            for (int32_t b : kBorders) {
                // Large masks cost the model most: a share of the borders.
                if (m.w * m.h > 100 && (b & 15) != 3 && b != 5 && b != (6 | 16 | 128)) continue;
                const bool erode = (seed & 1) != 0;
                ASSERT_NO_FATAL_FAILURE(run_case<T>(m, roi.width, roi.height, b, erode, ++seed));
            }
}

using Morph = zortest::LevelTest;

TEST_P(Morph, ErodeAndDilateMatchTheModel) {
    zortest::for_each_type([](auto t) { all_cases<decltype(t)>(); });
}

// Both operations on the mask classes the 8u kernels tell apart, with
// every border kind and large enough for the vector bodies.
TEST_P(Morph, BothOperationsOnEveryMaskClass8u) {
    const Mask masks[] = {full(3, 3), full(5, 3), make_mask(3, 3, "plus", kPlus3),
                          make_mask(5, 5, "diamond", kDiamond5), make_mask(7, 7, "disc", kDisc7),
                          cross(5, 5, 2, 2), runs_mask(7, 5, 3), random_mask(5, 5, 4, 50)};
    uint32_t seed = 100000;
    for (const Mask& m : masks)
        for (int32_t b : {1, 3, 5, 6})
            for (bool erode : {true, false})
                ASSERT_NO_FATAL_FAILURE(run_case<Zor8u>(m, 200, 13, b, erode, ++seed));
}

// Rectangles wider than a strip of the columns-first kernel (4 KiB of a
// row): the strips and the wider last strip must meet without a seam.
TEST_P(Morph, WideRectanglesMatchTheModelAcrossStrips) {
    uint32_t seed = 200000;
    for (const Mask& m : {full(5, 5), full(7, 7)})
        for (bool erode : {true, false}) {
            ASSERT_NO_FATAL_FAILURE(run_case<Zor32f>(m, 3500, 6, 3, erode, ++seed));
            ASSERT_NO_FATAL_FAILURE(run_case<Zor16s>(m, 3500, 5, 1, erode, ++seed));
            ASSERT_NO_FATAL_FAILURE(run_case<Zor8u>(m, 7000, 5, 6, erode, ++seed));
        }
}

// ---- masks with a meaning of their own ---------------------------------------------

// An empty or 1x1 mask copies without a buffer: a ROI far larger than the
// buffer was sized for still works.
TEST_P(Morph, EmptyAnd1x1MasksCopyWithoutTouchingTheBuffer) {
    for (const Mask& m : {make_mask(4, 3, "empty"), full(1, 1), make_mask(1, 1, "empty 1x1")}) {
        Record r = make_record<Zor32f>({1, 1}, m);
        const Source<Zor32f> s = make_source<Zor32f>(40, 30, 1, 12);
        Dest<Zor32f> d(40, 30);
        for (bool erode : {true, false}) {
            ASSERT_EQ(Api<Zor32f>::run(erode, s.roi(), s.stride * 4, d.roi(), d.stride * 4,
                                       {40, 30}, 6, 1.0f, r.state(), r.buf.data()),
                      zorStsNoErr);
            std::vector<Zor32f> want(40 * 30);
            for (int y = 0; y < 30; ++y)
                for (int x = 0; x < 40; ++x) want[y * 40 + x] = s.at(x, y);
            EXPECT_TRUE(d.check(want));
            EXPECT_TRUE(r.guards_intact());
        }
    }
}

// The general path starts from the largest finite value: an infinite
// window comes out as that value; a full rectangle passes it through.
TEST_P(Morph, InfinityThroughGeneralAndRectanglePaths32f) {
    const float inf = std::numeric_limits<float>::infinity();
    const float big = 3.4028234663852886e38f;
    std::vector<Zor32f> src(16 * 16, inf);
    for (const Mask& m : {full(3, 3), full(5, 3), cross(5, 5, 2, 2)}) {
        Record r = make_record<Zor32f>({16, 16}, m);
        std::vector<Zor32f> out(16 * 16);
        ASSERT_EQ(zoriErodeBorder_32f_C1R(src.data(), 64, out.data(), 64, {16, 16}, 1, 0,
                                          r.state(), r.buf.data()),
                  zorStsNoErr);
        const float want = (m.w == 5 && m.h == 5) ? big : inf;
        for (float v : out) ASSERT_EQ(v, want) << m.what;
    }
}

// ---- every level gives the same bits --------------------------------------------------

// Floats where the order of comparisons could show (signed zeros and
// infinities), one record made on the processor's own level for all; the
// integer types are pinned to the model on every level already.
std::vector<Zor32f> tricky_values(uint32_t seed, size_t n) {
    std::mt19937 rng(seed);
    const float pick[] = {0.0f, -0.0f, 1.0f, -1.0f, std::numeric_limits<float>::infinity(),
                          -std::numeric_limits<float>::infinity(), 2.5f};
    std::vector<Zor32f> v(n);
    for (auto& x : v) x = pick[rng() % 7];
    return v;
}

template <typename T> void same_on_every_level() {
    const int W = 133, H = 21;
    const std::vector<T> src = tricky_values(77, (size_t)W * H);
    const Mask masks[] = {full(3, 3), full(5, 5), full(4, 7), make_mask(7, 7, "disc", kDisc7),
                          cross(5, 5, 2, 2), runs_mask(7, 6, 5), random_mask(9, 9, 6, 90),
                          random_mask(13, 13, 7, 80)};
    for (const Mask& m : masks) {
        zorInit();
        Record r = make_record<T>({W, H}, m);
        for (int32_t b : {1, 3, 5, 6})
            for (bool erode : {true, false}) {
                std::vector<uint8_t> first;
                for (const zortest::Level& l : zortest::all_levels()) {
                    if (!zortest::runnable(l)) continue;
                    zorSetCpuFeatures(l.select);
                    std::vector<T> out((size_t)W * H);
                    ASSERT_EQ(Api<T>::run(erode, src.data(), W * (int)sizeof(T), out.data(),
                                          W * (int)sizeof(T), {W, H}, b, T(), r.state(),
                                          r.buf.data()),
                              zorStsNoErr);
                    std::vector<uint8_t> bytes((uint8_t*)out.data(),
                                               (uint8_t*)(out.data() + out.size()));
                    if (first.empty()) first = bytes;
                    else
                        ASSERT_EQ(bytes, first) << m.what << " level " << l.name << " border "
                                                << b << (erode ? " erode" : " dilate");
                }
            }
    }
    zorInit();
}

TEST(MorphLevels, SameBitsOnEveryLevel32f) { same_on_every_level<Zor32f>(); }

// ---- the record -----------------------------------------------------------------------------

struct HeadView {
    uint64_t pMask;
    int32_t maskWidth, maskHeight, anchorX, anchorY, isRowRuns;
    uint32_t maskFeature;
    int32_t isCross, isFixedShape;
};

HeadView head_of(const Record& r) {
    HeadView h;
    memcpy(&h, r.rec.data(), sizeof h);
    return h;
}

std::vector<int> u16s(const uint8_t* p, size_t n) {
    std::vector<int> v(n);
    for (size_t i = 0; i < n; ++i) {
        uint16_t x;
        memcpy(&x, p + 2 * i, 2);
        v[i] = x;
    }
    return v;
}

TEST_P(Morph, RecordStoresTheTurnedMaskAndItsTables) {
    // Caller's 4x3 mask (even width): stored 5x3, turned, padding column at 0.
    const Mask m = make_mask(4, 3, "asym", "110001111010");
    Record r = make_record<Zor8u>({8, 8}, m);
    const HeadView h = head_of(r);
    EXPECT_EQ(h.pMask, (uint64_t)(uintptr_t)(r.rec.data() + 136));
    EXPECT_EQ(h.maskWidth, 5);
    EXPECT_EQ(h.maskHeight, 3);
    EXPECT_EQ(h.anchorX, 2);
    EXPECT_EQ(h.anchorY, 1);
    const uint8_t* stored = r.rec.data() + 136;
    for (int sr = 0; sr < 3; ++sr)
        for (int sc = 0; sc < 5; ++sc) {
            const int cc = 4 - sc, cr = 2 - sr;
            const bool set = cc < 4 && m.cells[cr * 4 + cc] != 0;
            EXPECT_EQ(stored[sr * 5 + sc], set ? 255 : 0) << sc << "," << sr;
        }
    // Stored rows: 0 "00101" (caller row 2 "0100" turned), 1 "01110", 2 "00011".
    const std::vector<int> lists = u16s(stored + 15, 3 * 6);
    EXPECT_EQ(std::vector<int>(lists.begin(), lists.begin() + 3), (std::vector<int>{2, 2, 4}));
    EXPECT_EQ(std::vector<int>(lists.begin() + 6, lists.begin() + 10),
              (std::vector<int>{3, 1, 2, 3}));
    EXPECT_EQ(std::vector<int>(lists.begin() + 12, lists.begin() + 15),
              (std::vector<int>{2, 3, 4}));
    const std::vector<int> runs = u16s(stored + 15 + 36, 6);
    EXPECT_EQ(runs, (std::vector<int>{2, 4, 1, 3, 3, 4}));
    EXPECT_EQ(h.isRowRuns, 0);  // row 0 has a gap
    EXPECT_EQ(h.maskFeature, 8u);  // the padding column is empty
}

TEST_P(Morph, TwoByTwoIsStoredAsThreeByThree) {
    Record r = make_record<Zor32f>({5, 5}, full(2, 2));
    const HeadView h = head_of(r);
    EXPECT_EQ(h.maskWidth, 3);
    EXPECT_EQ(h.maskHeight, 3);
    EXPECT_EQ(h.anchorX, 1);
    EXPECT_EQ(h.anchorY, 1);
    const uint8_t want[9] = {0, 0, 0, 0, 255, 255, 0, 255, 255};
    EXPECT_EQ(memcmp(r.rec.data() + 136, want, 9), 0);
    EXPECT_EQ(h.maskFeature, 8u | 16u);
}

TEST_P(Morph, MaskFeatureBits) {
    struct Want {
        Mask m;
        uint32_t feature;
        int rowRuns, cross, fixed;
    };
    const Want cases[] = {
        {full(3, 3), 2 | 16, 1, 0, 0},
        {full(1, 1), 2 | 16, 1, 0, 0},
        {make_mask(3, 3, "empty"), 4 | 8 | 16, 1, 0, 0},
        {make_mask(3, 3, "plus", kPlus3), 16 | 32 | 0x100, 1, 1, 1},
        {make_mask(5, 5, "diamond", kDiamond5), 16 | 0x300, 1, 0, 1},
        {make_mask(7, 7, "disc", kDisc7), 16 | 0x500, 1, 0, 1},
        {cross(5, 5, 2, 2), 16 | 32, 1, 1, 0},
        {cross(7, 5, 0, 6), 16 | 32, 1, 1, 0},
        {cross(4, 5, 2, 1), 8 | 16, 1, 0, 0},  // even width: the padded row is not full
        {make_mask(3, 3, "gap", "101010101"), 0, 0, 0, 0},
        {make_mask(3, 3, "ring", "111101111"), 0, 0, 0, 0},
        {make_mask(3, 3, "corner", "110110000"), 8 | 16, 1, 0, 0},
        {make_mask(5, 1, "line gap", "11011"), 0, 0, 0, 0},
    };
    for (const Want& c : cases) {
        Record r = make_record<Zor16u>({6, 6}, c.m);
        const HeadView h = head_of(r);
        EXPECT_EQ(h.maskFeature, c.feature) << c.m.what;
        EXPECT_EQ(h.isRowRuns, c.rowRuns) << c.m.what;
        EXPECT_EQ(h.isCross, c.cross) << c.m.what;
        EXPECT_EQ(h.isFixedShape, c.fixed) << c.m.what;
    }
    // A cross keeps its full row and column (stored indices) at the head of
    // the run table: caller row 0, column 6 of a 7x5 mask.
    Record r = make_record<Zor8u>({6, 6}, cross(7, 5, 0, 6));
    const std::vector<int> runs = u16s(r.rec.data() + 136 + 35 + 5 * 8 * 2, 2);
    EXPECT_EQ(runs, (std::vector<int>{4, 0}));
}

// ---- sizes -----------------------------------------------------------------------------------

int64_t r32(int64_t x) { return (x + 31) / 32 * 32; }

// The buffer holds the largest band temporary (or the whole framed ROI when
// the ROI is not larger than the mask) and a ring of mask-height rows.
int64_t want_buffer(int W, int H, int mw, int mh, int e) {
    const int w = mw | 1, h = mh | 1, ax = mw / 2, ay = mh / 2;
    int64_t frame;
    if (w < W && h < H) {
        const int64_t topBand = h > 1 ? (int64_t)(W + w - 1) * (ay + h - 1) : 0;
        const int64_t sideBand = w > 1 ? (int64_t)(w + ax - 1) * (h + H - 1) : 0;
        frame = std::max(topBand, sideBand);
    } else {
        frame = (int64_t)(W + w - 1) * (H + h - 1);
    }
    return r32(frame * e) + r32((int64_t)W * e) * h + r32((int64_t)w * e) + 16 * e + 64;
}

template <typename T> void sizes_match() {
    const int e = sizeof(T);
    const ZoriSize roisAndMasks[][2] = {{{10, 10}, {3, 3}}, {{1920, 1080}, {5, 5}},
                                        {{4, 4}, {5, 5}},   {{5, 5}, {5, 5}},
                                        {{6, 9}, {2, 4}},   {{100, 3}, {1, 7}},
                                        {{3, 100}, {7, 1}}, {{1, 1}, {1, 1}},
                                        {{64, 48}, {27, 26}}};
    for (const auto& c : roisAndMasks) {
        const ZoriSize roi = c[0], mask = c[1];
        int32_t rec = -1, buf = -1;
        ASSERT_EQ(Api<T>::size(roi, mask, &rec, &buf), zorStsNoErr);
        const int w = mask.width | 1, h = mask.height | 1;
        // head, stored mask, row lists, and the run table's share
        EXPECT_EQ(rec, 136 + w * h + h * (w + 1) * 2 + (w + 1) * h * 2);
        EXPECT_EQ(buf, want_buffer(roi.width, roi.height, mask.width, mask.height, e))
            << roi.width << "x" << roi.height << " mask " << mask.width << "x" << mask.height;
    }
}

TEST_P(Morph, SizesFollowTheFormulas) {
    zortest::for_each_type([](auto t) { sizes_match<decltype(t)>(); });
}

TEST_P(Morph, SizeAndInitChecks) {
    int32_t s = 0, b = 0;
    EXPECT_EQ(zoriMorphologyBorderGetSize_8u_C1R({0, 5}, {3, 3}, nullptr, &b), zorStsNullPtrErr);
    EXPECT_EQ(zoriMorphologyBorderGetSize_16u_C1R({5, 5}, {3, 3}, &s, nullptr), zorStsNullPtrErr);
    EXPECT_EQ(zoriMorphologyBorderGetSize_16s_C1R({0, 5}, {3, 3}, &s, &b), zorStsSizeErr);
    EXPECT_EQ(zoriMorphologyBorderGetSize_32f_C1R({5, 5}, {3, 0}, &s, &b), zorStsSizeErr);
    EXPECT_EQ(zoriMorphologyBorderGetSize_32f_C1R({5, 5}, {32768, 1}, &s, &b),
              zorStsMaskSizeErr);
    EXPECT_EQ(zoriMorphologyBorderGetSize_8u_C1R({1 << 30, 1 << 30}, {3, 3}, &s, &b),
              zorStsExceededSizeErr);
    EXPECT_EQ(s, 0);
    EXPECT_EQ(b, 0);

    const Zor8u mask[9] = {1, 1, 1, 1, 1, 1, 1, 1, 1};
    std::vector<uint8_t> rec(4096, kFill), buf(16, 0);
    ZoriMorphState* st = (ZoriMorphState*)rec.data();
    EXPECT_EQ(zoriMorphologyBorderInit_8u_C1R({0, 5}, nullptr, {3, 3}, st, buf.data()),
              zorStsNullPtrErr);
    EXPECT_EQ(zoriMorphologyBorderInit_16u_C1R({5, 5}, mask, {3, 3}, nullptr, buf.data()),
              zorStsNullPtrErr);
    EXPECT_EQ(zoriMorphologyBorderInit_16s_C1R({5, 5}, mask, {3, 3}, st, nullptr),
              zorStsNullPtrErr);
    EXPECT_EQ(zoriMorphologyBorderInit_32f_C1R({5, 0}, mask, {3, 3}, st, buf.data()),
              zorStsSizeErr);
    EXPECT_EQ(zoriMorphologyBorderInit_32f_C1R({5, 5}, mask, {0, 3}, st, buf.data()),
              zorStsSizeErr);
    EXPECT_EQ(zoriMorphologyBorderInit_8u_C1R({5, 5}, mask, {1, 40000}, st, buf.data()),
              zorStsMaskSizeErr);
    for (uint8_t v : rec) ASSERT_EQ(v, kFill);
}

// Each check against the next one failing too, so that the order shows;
// nothing is written on any failure.
template <typename T> void checks_in_order() {
    const int e = sizeof(T);
    Record r = make_record<T>({8, 6}, full(3, 3));
    // Room around the ROI for the borders that read memory.
    const Source<T> source = make_source<T>(8, 6, 2, 3);
    const T* srcRoi = source.roi();
    const int ss = source.stride * e;
    Dest<T> d(8, 6);
    T* dst = d.roi();
    const int ds = d.stride * e;
    ZoriMorphState* st = r.state();
    Zor8u* buf = r.buf.data();
    for (bool erode : {true, false}) {
        memset(d.block.data(), kFill, d.block.size() * sizeof(T));
        auto run = [&](const T* s, int32_t ss, T* dd, int32_t dstep, ZoriSize roi, int32_t bt,
                       const ZoriMorphState* rec, Zor8u* bb) {
            return Api<T>::run(erode, s, ss, dd, dstep, roi, bt, T(), rec, bb);
        };
        EXPECT_EQ(run(nullptr, 0, dst, ds, {0, 6}, 0, st, buf), zorStsNullPtrErr);
        EXPECT_EQ(run(srcRoi, 0, nullptr, ds, {8, 6}, 1, st, buf), zorStsNullPtrErr);
        EXPECT_EQ(run(srcRoi, 8 * e, dst, ds, {8, 6}, 1, nullptr, buf), zorStsNullPtrErr);
        EXPECT_EQ(run(srcRoi, 8 * e, dst, ds, {8, 6}, 1, st, nullptr), zorStsNullPtrErr);
        EXPECT_EQ(run(srcRoi, 0, dst, ds, {8, 0}, 0, st, buf), zorStsSizeErr);
        EXPECT_EQ(run(srcRoi, 0, dst, ds, {-1, 6}, 0, st, buf), zorStsSizeErr);
        // Both steps are compared with the width.
        EXPECT_EQ(run(srcRoi, 8 * e - 1, dst, ds, {8, 6}, 0, st, buf), zorStsStepErr);
        EXPECT_EQ(run(srcRoi, 8 * e, dst, 8 * e - 1, {8, 6}, 0, st, buf), zorStsStepErr);
        EXPECT_EQ(run(srcRoi, -8 * e, dst, ds, {8, 6}, 1, st, buf), zorStsStepErr);
        if (e > 1) {
            EXPECT_EQ(run(srcRoi, 8 * e + 1, dst, ds, {8, 6}, 0, st, buf),
                      zorStsNotEvenStepErr);
            EXPECT_EQ(run(srcRoi, 8 * e, dst, ds + e / 2, {8, 6}, 0, st, buf),
                      zorStsNotEvenStepErr);
        } else {
            // 8u takes any step from the width up.
            EXPECT_EQ(run(srcRoi, 9, dst, ds, {8, 6}, 1 | 4096, st, buf), zorStsBorderErr);
        }
        for (int32_t bad : {0, 2, 4, 7, 8, 15, 16, 0x100, 0xf00, 0xff0, 4095, 4096, 4097, -1})
            EXPECT_EQ(run(srcRoi, 8 * e, dst, ds, {8, 6}, bad, st, buf), zorStsBorderErr)
                << bad;
        // In place: refused for the wider types after the border test.
        EXPECT_EQ(run(dst, ds, dst, ds, {8, 6}, 2, st, buf), zorStsBorderErr);
        if (e > 1)
            EXPECT_EQ(run(dst, ds, dst, ds, {8, 6}, 1, st, buf),
                      zorStsInplaceModeNotSupportedErr);
        EXPECT_TRUE(d.check(std::vector<T>(8 * 6, [] {
            T f;
            memset(&f, kFill, sizeof f);
            return f;
        }())));
        for (int32_t good : {1, 3, 5, 6, 240, 1 | 16, 6 | 0xf0, 3 | 0xf00, 5 | 0x7f0})
            EXPECT_EQ(run(srcRoi, ss, dst, ds, {8, 6}, good, st, buf), zorStsNoErr)
                << good;
    }
}

TEST_P(Morph, ChecksInOrder) {
    zortest::for_each_type([](auto t) { checks_in_order<decltype(t)>(); });
}

ZOR_INSTANTIATE_LEVELS(Morph);

}  // namespace
