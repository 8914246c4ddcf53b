// The resize frame: size queries against their formulas, argument checks in
// order, and nearest neighbour against a model of its index rule.
#include <math.h>
#include <stdint.h>
#include <string.h>

#include <algorithm>
#include <string>
#include <vector>

#include "image.h"
#include "resize_support.h"
#include "zortest.h"

namespace {

using zortest::Image;
using zortest::Rng;

int64_t a32(int64_t n) { return (n + 31) / 32 * 32; }
int64_t gcd(int64_t a, int64_t b) { return b ? gcd(b, a % b) : a; }

struct Sizes {
    ZorStatus st;
    int64_t record, init;
};

Sizes model_sizes(ZoriSize s, ZoriSize d, int interp, int aa) {
    if (!s.width || !s.height || !d.width || !d.height) return {zorStsNoOperation, 0, 0};
    if (s.width < 0 || s.height < 0 || d.width < 0 || d.height < 0) return {zorStsSizeErr, 0, 0};
    if (interp != 0 && interp != 1 && interp != 2 && interp != 6 && interp != 8 && interp != 16)
        return {zorStsInterpolationErr, 0, 0};
    if (interp == 0) return {zorStsNotSupportedModeErr, 0, 0};
    const int64_t aw = a32(d.width), ah = a32(d.height), dw = d.width, dh = d.height;
    const bool filter = interp == 2 || interp == 6 || interp == 16;
    if (filter && std::min(s.width, s.height) < (interp == 2 ? 2 : 4)) return {zorStsSizeErr, 0, 0};
    Sizes r{aa && !filter ? zorStsNoAntialiasing : zorStsNoErr, 0, 64};
    if (aa && filter) {
        const double sx = (double)s.width / d.width, sy = (double)s.height / d.height;
        const int t0 = interp == 2 ? 2 : interp == 6 ? 4 : 6;
        const int64_t tx = sx <= 1 ? t0 : 2 * (int64_t)ceil(t0 * sx);
        const int64_t ty = sy <= 1 ? t0 : 2 * (int64_t)ceil(t0 * sy);
        r.record = 368 + 4 * (aw + ah) + a32(4 * dw * tx) + a32(4 * dh * ty) +
                   (sx <= 1 && interp == 2 ? a32(4 * dw) : 0);
        r.init = 64 + 8 * (aw + ah);
    } else if (interp == 1 || interp == 2) {
        r.record = 368 + 4 * interp * (aw + ah);
    } else if (filter) {
        const int64_t k = interp == 6 ? 4 : 6, pad = interp == 6 ? 96 : 160;
        r.record = 368 + 4 * (aw + ah) + 4 * (a32(k * dw + pad) + a32(k * dh + pad));
        r.init = 64 + 4 * (aw + ah);
    } else {
        if (s.width < d.width || s.height < d.height) return {zorStsSizeErr, 0, 0};
        auto n = [](int64_t src, int64_t dst) {
            const int64_t g = gcd(src, dst), sr = src / g, dr = dst / g, m = sr % dr;
            return dr * (sr / dr + (m == 0 ? 0 : m == 1 ? 1 : 2));
        };
        const int64_t nx = n(s.width, d.width), ny = n(s.height, d.height);
        r.record = 368 + 4 * (a32(nx) + nx + ny + a32(ny));
    }
    if (r.record >= 0x7FFFFFFF || r.init >= 0x7FFFFFFF) return {zorStsExceededSizeErr, 0, 0};
    return r;
}

// Lengths through the 32-byte roundings to the record size's overflow; a
// zero or negative one now and then for the early checks.
TEST(ResizeFrame, GetSizeFollowsTheFormulas) {
    const int32_t lens[] = {1,    2,    3,       4,          5,          31, 32, 33, 100,
                            1080, 4099, 1 << 27, 0x1FFFFFF0, 0x7FFFFFFF, 0,  -1, -32};
    const int methods[] = {0, 1, 2, 6, 8, 16, 3, 4, 7, -1};
    Rng rng(3);
    for (int k = 0; k < 30000; ++k) {
        auto len = [&] { return lens[rng.below(rng.below(8) ? 14 : 17)]; };
        const ZoriSize s{len(), len()}, d{len(), len()};
        const int interp = methods[rng.below(10)], aa = (int)rng.below(3) - (k & 1);
        const Sizes want = model_sizes(s, d, interp, aa);
        const bool written = want.st == zorStsNoErr || want.st == zorStsNoAntialiasing;
        for (auto query : {zoriResizeGetSize_8u, zoriResizeGetSize_32f}) {
            int32_t record = -7, init = -7;
            ASSERT_EQ(query(s, d, (ZoriInterpolationType)interp, aa, &record, &init), want.st)
                << s.width << "x" << s.height << " -> " << d.width << "x" << d.height << " method "
                << interp << " aa " << aa;
            ASSERT_TRUE(record == (written ? want.record : -7) &&
                        init == (written ? want.init : -7));
        }
    }
}

int32_t model_index(int64_t i, int64_t srcLen, int64_t dstLen) {
    return (int32_t)(((double)i + 0.5) * ((double)srcLen / (double)dstLen) - 1e-10);
}
int32_t model_shift(int64_t off, int64_t srcLen, int64_t dstLen) {
    return (int32_t)floor((double)off * ((double)srcLen / (double)dstLen));
}

// A record made under `initLevel` (8u or float name in turn), run in tiles
// under `runLevel`, against the model bit for bit.
template <typename T> void nearest_case(ZoriSize src, ZoriSize dst, uint32_t seed,
                                        const zortest::Level& runLevel,
                                        const zortest::Level& initLevel) {
    SCOPED_TRACE(::testing::Message() << zortest::Type<T>::name << " " << src.width << "x"
                                      << src.height << " -> " << dst.width << "x" << dst.height
                                      << " seed " << seed << " init " << initLevel.name);
    Rng rng(seed);
    const bool alt = seed & 1;
    zortest::ResizeRecord rec = zortest::resize_record(src, dst, zoriInterNN, seed % 64);
    zorSetCpuFeatures(initLevel.select);
    ASSERT_EQ((alt ? zoriResizeNearestInit_32f : zoriResizeNearestInit_8u)(src, dst, rec.record()),
              zorStsNoErr);
    zorSetCpuFeatures(runLevel.select);
    // Steps with slack (odd for 8u), the destination off its element boundary,
    // the source against an unreadable page: no path may read outside it.
    const int32_t e = sizeof(T), pad = (int32_t)rng.below(3) * (e == 1 ? 3 : 4);
    zortest::Fenced<T> s(src.width, src.height, seed & 2, src.width * e + pad);
    // Any bits for 32f: NaN payloads too.
    s.fill([&](int, int) { return e == 1 ? (T)rng.next() : (T)zortest::bits_f(rng.next()); });
    auto mx = [&](int32_t i) { return model_index(i, src.width, dst.width); };
    auto my = [&](int32_t i) { return model_index(i, src.height, dst.height); };
    Image<T> out(dst.width, dst.height, dst.width * e + pad, seed % 7), want = out;
    for (int32_t y = 0; y < dst.height; ++y)
        for (int32_t x = 0; x < dst.width; ++x) memcpy(want.bytes(x, y), s.ptr(mx(x), my(y)), e);
    ASSERT_NO_FATAL_FAILURE(zortest::resize_tiles(
        rec.record(), dst, rng, seed & 4, [&](ZoriPoint o, ZoriRect t, ZoriSize z, Zor8u* b) {
            const int32_t lx = t.x + t.width, ly = t.y + t.height;
            ZoriPoint o32{-1, -1}, ro{-1, -1};
            ZoriSize rs{-1, -1};
            // The source rectangle runs to the last centre's pixel, or to the
            // source's end for a tile at the destination's last column or row.
            const int32_t rw = lx == dst.width ? src.width : mx(lx - 1) + 1;
            const int32_t rh = ly == dst.height ? src.height : my(ly - 1) + 1;
            const bool ok =
                zoriResizeGetSrcOffset_32f(rec.record(), {t.x, t.y}, &o32) == zorStsNoErr &&
                zoriResizeGetSrcRoi_8u(rec.record(), {t.x, t.y}, {t.width, t.height}, &ro, &rs) ==
                    zorStsNoErr &&
                o.x == model_shift(t.x, src.width, dst.width) && o32.x == o.x && ro.x == o.x &&
                o.y == model_shift(t.y, src.height, dst.height) && o32.y == o.y && ro.y == o.y &&
                rs.width == rw - o.x && rs.height == rh - o.y;
            if (!ok) return (ZorStatus)-999;  // reading from a wrong offset may fault
            return zortest::resize_op<T>(zoriInterNN, s.ptr(o.x, o.y), s.step, out.ptr(t.x, t.y),
                                         out.step, {t.x, t.y}, z, 0, rec.record(), b);
        }));
    ASSERT_TRUE(same_bytes(out, want));
    ASSERT_TRUE(zortest::record_guards_intact(rec));
}

using ResizeNearest = zortest::LevelTest;

// Ratios of all kinds down to 1 pixel, records made under another level;
// then the vector paths' ratios on long rows, and one past their windows.
TEST_P(ResizeNearest, TilesMatchTheModel) {
    std::vector<const zortest::Level*> levels;
    for (const zortest::Level& l : zortest::all_levels())
        if (zortest::runnable(l)) levels.push_back(&l);
    const int32_t lens[] = {1, 2, 3, 7, 16, 17, 33, 64, 95, 200};
    uint32_t seed = 0;
    for (int32_t sw : lens)
        for (int32_t dw : lens) {
            const ZoriSize src{sw, lens[(seed + 3) % 10]}, dst{dw, lens[(seed * 7) % 10]};
            ++seed;
            const zortest::Level& other = *levels[seed % levels.size()];
            ASSERT_NO_FATAL_FAILURE(nearest_case<Zor8u>(src, dst, seed, GetParam(), other));
            ASSERT_NO_FATAL_FAILURE(nearest_case<Zor32f>(src, dst, seed + 99, GetParam(), other));
        }
    const int32_t wide[][4] = {{1920, 4, 960, 3},
                               {1920, 3, 1280, 5},
                               {960, 2, 1920, 4},
                               {999, 3, 461, 3},
                               {1000, 3, 1000, 3}};
    for (const auto& c : wide)
        for (int k = 0; k < 4; ++k) {
            const ZoriSize s{c[0], c[1]}, d{c[2], c[3]};
            ASSERT_NO_FATAL_FAILURE(nearest_case<Zor8u>(s, d, ++seed, GetParam(), GetParam()));
            ASSERT_NO_FATAL_FAILURE(nearest_case<Zor32f>(s, d, ++seed, GetParam(), GetParam()));
        }
}

// A nearest record 8x6 -> 5x4, its id (the first word) then set.
zortest::ResizeRecord nearest_record(uint32_t id = 0x4B617389u) {
    zortest::ResizeRecord r = zortest::resize_record({8, 6}, {5, 4}, zoriInterNN);
    EXPECT_EQ(zoriResizeNearestInit_8u({8, 6}, {5, 4}, r.record()), zorStsNoErr);
    memcpy((void*)(((uintptr_t)r.record() + 63) & ~(uintptr_t)63), &id, 4);
    return r;
}

#define CALL(expr) [&] { return expr; }

TEST(ResizeFrame, QueriesCheckInOrder) {
    zortest::ResizeRecord rec = nearest_record(), bad = nearest_record(0x4B617388u);
    const std::vector<uint8_t> before = rec.mem;
    int32_t a = -7, b = -7;
    ZoriPoint p{-7, -7};
    ZoriSize z{-7, -7};
    ZoriResizeSpec *sp = rec.record(), *bp = bad.record();
    const ZoriInterpolationType nn = zoriInterNN, no = (ZoriInterpolationType)3;
    zortest::run_checks(
        {{zorStsNullPtrErr, "size", CALL(zoriResizeGetSize_8u({0, 1}, {1, 1}, no, 0, nullptr, &b))},
         {zorStsNullPtrErr, "size", CALL(zoriResizeGetSize_8u({0, 1}, {1, 1}, no, 0, &a, nullptr))},
         {zorStsNoOperation, "size", CALL(zoriResizeGetSize_8u({-1, 1}, {1, 0}, no, 0, &a, &b))},
         {zorStsSizeErr, "size", CALL(zoriResizeGetSize_8u({4, 4}, {4, -1}, no, 0, &a, &b))},
         {zorStsInterpolationErr, "size",
          CALL(zoriResizeGetSize_8u({1, 1}, {4, 4}, no, 1, &a, &b))},
         {zorStsExceededSizeErr, "size",
          CALL(zoriResizeGetSize_8u({1, 1}, {0x7FFFFFFF, 1}, nn, 0, &a, &b))},
         {zorStsNullPtrErr, "buffer", CALL(zoriResizeGetBufferSize_8u(nullptr, {0, 1}, 2, &a))},
         {zorStsNullPtrErr, "buffer", CALL(zoriResizeGetBufferSize_8u(bp, {0, 1}, 2, nullptr))},
         {zorStsNoOperation, "buffer", CALL(zoriResizeGetBufferSize_8u(bp, {-1, 0}, 2, &a))},
         {zorStsContextMatchErr, "buffer", CALL(zoriResizeGetBufferSize_8u(bp, {-1, 1}, 2, &a))},
         {zorStsNumChannelsErr, "buffer", CALL(zoriResizeGetBufferSize_8u(sp, {-1, 1}, 2, &a))},
         {zorStsSizeErr, "buffer", CALL(zoriResizeGetBufferSize_8u(sp, {-1, 1}, 3, &a))},
         {zorStsNullPtrErr, "offset", CALL(zoriResizeGetSrcOffset_8u(nullptr, {-1, 0}, &p))},
         {zorStsNullPtrErr, "offset", CALL(zoriResizeGetSrcOffset_8u(sp, {-1, 0}, nullptr))},
         {zorStsContextMatchErr, "offset", CALL(zoriResizeGetSrcOffset_8u(bp, {-1, 0}, &p))},
         {zorStsOutOfRangeErr, "offset", CALL(zoriResizeGetSrcOffset_8u(sp, {5, 0}, &p))},
         {zorStsOutOfRangeErr, "offset", CALL(zoriResizeGetSrcOffset_8u(sp, {0, -1}, &p))},
         {zorStsNullPtrErr, "roi", CALL(zoriResizeGetSrcRoi_8u(sp, {0, 0}, {0, 1}, nullptr, &z))},
         {zorStsNullPtrErr, "roi", CALL(zoriResizeGetSrcRoi_8u(sp, {0, 0}, {0, 1}, &p, nullptr))},
         {zorStsSizeErr, "roi", CALL(zoriResizeGetSrcRoi_8u(bp, {-1, 0}, {0, 1}, &p, &z))},
         {zorStsSizeErr, "roi", CALL(zoriResizeGetSrcRoi_8u(bp, {-1, 0}, {3, -1}, &p, &z))},
         {zorStsContextMatchErr, "roi", CALL(zoriResizeGetSrcRoi_8u(bp, {-1, 0}, {3, 1}, &p, &z))},
         {zorStsOutOfRangeErr, "roi", CALL(zoriResizeGetSrcRoi_8u(sp, {0, 4}, {3, 1}, &p, &z))},
         {zorStsNullPtrErr, "init", CALL(zoriResizeNearestInit_8u({0, 1}, {1, 1}, nullptr))},
         {zorStsNoOperation, "init", CALL(zoriResizeNearestInit_8u({-1, 1}, {1, 0}, sp))},
         {zorStsSizeErr, "init", CALL(zoriResizeNearestInit_8u({3, 1}, {1, -1}, sp))}},
        [&] { return a + b + p.x + p.y + z.width == -35 && rec.mem == before; });
    // Work buffer: two index tables and 64 for any channels; 48 if clipped.
    for (Zor32u c : {1u, 3u, 4u})
        for (const ZoriSize& t :
             {ZoriSize{1, 1}, ZoriSize{5, 4}, ZoriSize{9, 2}, ZoriSize{3, 70}}) {
            ASSERT_EQ(
                (c == 3 ? zoriResizeGetBufferSize_32f : zoriResizeGetBufferSize_8u)(sp, t, c, &a),
                t.width > 5 || t.height > 4 ? zorStsSizeWrn : zorStsNoErr);
            EXPECT_EQ(a, a32(4 * std::min(t.width, 5)) + a32(4 * std::min(t.height, 4)) + 64);
        }
    // The last column with width 1 is in range; an oversized tile warns.
    ASSERT_EQ(zoriResizeGetSrcRoi_8u(sp, {4, 3}, {1, 1}, &p, &z), zorStsNoErr);
    EXPECT_TRUE(p.x == 6 && p.y == 4 && z.width == 2 && z.height == 2);
    ASSERT_EQ(zoriResizeGetSrcRoi_8u(sp, {1, 0}, {9, 3}, &p, &z), zorStsSizeWrn);
    EXPECT_TRUE(p.x == 1 && p.y == 0 && z.width == 7 && z.height == 4);
}

TEST_P(ResizeNearest, OperationsCheckInOrderWriteNothing) {
    zortest::ResizeRecord rec = nearest_record(),
                          lin = zortest::resize_record({8, 6}, {5, 4}, zoriInterLinear);
    EXPECT_EQ(zoriResizeLinearInit_8u({8, 6}, {5, 4}, lin.record()), zorStsNoErr);
    zortest::resize_op_checks<Zor8u>(zoriInterNN, {8, 6}, {5, 4}, rec.record(), {lin.record()});
    zortest::resize_op_checks<Zor32f>(zoriInterNN, {8, 6}, {5, 4}, rec.record(), {lin.record()});
}

ZOR_INSTANTIATE_LEVELS(ResizeNearest);

}  // namespace
