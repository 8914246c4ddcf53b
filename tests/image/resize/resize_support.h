// What the resize tests share: records and buffers placed as a caller would
// (odd addresses, guard bytes behind), tilings, sources, check tables.
#ifndef ZOR_TEST_RESIZE_SUPPORT_H
#define ZOR_TEST_RESIZE_SUPPORT_H

#include <math.h>
#include <string.h>
#include <xmmintrin.h>

#include <algorithm>
#include <map>
#include <vector>

#include "image.h"
#include "zortest.h"

namespace zortest {

// A record block of the size the query gives, starting `misalign` bytes
// past a 64-byte boundary, with guard bytes behind; and its init buffer.
struct ResizeRecord {
    std::vector<uint8_t> mem, init;
    size_t offset = 0;  // of the record in mem
    int32_t specSize = 0, initSize = 0;
    ZoriResizeSpec* record() { return (ZoriResizeSpec*)(mem.data() + offset); }
    Zor8u* initBuf() { return init.data(); }
};

inline ResizeRecord resize_record(ZoriSize src, ZoriSize dst, ZoriInterpolationType method,
                                  size_t misalign = 13) {
    ResizeRecord r;
    EXPECT_EQ(zoriResizeGetSize_8u(src, dst, method, 0, &r.specSize, &r.initSize), zorStsNoErr);
    // Everything behind the record keeps the guard byte.
    r.mem = guarded((size_t)r.specSize + 128);
    r.offset = ((64 - ((uintptr_t)r.mem.data() & 63)) + misalign) & 63;
    r.init = guarded((size_t)r.initSize);
    return r;
}

// Whether nothing was written past the record's or init buffer's size.
inline bool record_guards_intact(const ResizeRecord& r) {
    return guard_intact(r.mem, r.offset + (size_t)r.specSize) &&
           guard_intact(r.init, (size_t)r.initSize);
}

// A work buffer of the queried size for tiles up to `tile`, guard behind.
inline std::vector<uint8_t> resize_buffer(const ZoriResizeSpec* record, ZoriSize tile,
                                          int32_t* size = nullptr, Zor32u channels = 1) {
    int32_t n = 0;
    const ZorStatus st = zoriResizeGetBufferSize_8u(record, tile, channels, &n);
    EXPECT_TRUE(st == zorStsNoErr || st == zorStsSizeWrn) << st;
    if (size) *size = n;
    return guarded((size_t)n);
}

// A random partition of a destination: cuts of columns and rows.
inline std::vector<ZoriRect> random_tiles(ZoriSize dst, Rng& rng, int32_t maxCuts = 4) {
    auto cuts = [&](int32_t len) {
        std::vector<int32_t> c{0};
        const int32_t n = (int32_t)rng.below((uint32_t)maxCuts + 1);
        for (int32_t i = 0; i < n && len > 1; ++i)
            c.push_back(1 + (int32_t)rng.below((uint32_t)len - 1));
        c.push_back(len);
        std::sort(c.begin(), c.end());
        c.erase(std::unique(c.begin(), c.end()), c.end());
        return c;
    };
    const std::vector<int32_t> xs = cuts(dst.width), ys = cuts(dst.height);
    std::vector<ZoriRect> tiles;
    for (size_t j = 0; j + 1 < ys.size(); ++j)
        for (size_t i = 0; i + 1 < xs.size(); ++i)
            tiles.push_back({xs[i], ys[j], xs[i + 1] - xs[i], ys[j + 1] - ys[j]});
    return tiles;
}

// Replicate, all in memory, and replicate with one or two sides in memory.
const int32_t kResizeBorders[] = {1,      240,     241,          1 | 16,     1 | 32,
                                  1 | 64, 1 | 128, 1 | 16 | 128, 1 | 32 | 64};

// l9, n0 and k0 fuse the float kernels; the others multiply, then add.
inline bool fuses(const Level& l) { return l.index >= 4; }

// Levels of one arithmetic agree bit for bit: the first keeps case `key`.
inline bool agrees_within_group(bool fused, uint64_t key, const std::vector<uint8_t>& bytes) {
    static std::map<uint64_t, std::vector<uint8_t>> seen[2];
    std::vector<uint8_t>& first = seen[fused][key];
    if (first.empty()) first = bytes;
    return first == bytes;
}

// Selector of the antialiasing operations in resize_op (not an interpolation).
constexpr ZoriInterpolationType kAntialiasing = (ZoriInterpolationType)-1;

// One name for the single-channel operations: method, then the type.
template <typename T> ZorStatus resize_op(ZoriInterpolationType m, const T* s, int32_t ss, T* d,
                                          int32_t ds, ZoriPoint o, ZoriSize z, int32_t border,
                                          const ZoriResizeSpec* r, Zor8u* b) {
    const ZoriBorderType bt = (ZoriBorderType)border;
    if constexpr (sizeof(T) == 1) {
        if (m == zoriInterNN) return zoriResizeNearest_8u_C1R(s, ss, d, ds, o, z, r, b);
        auto f = m == zoriInterLinear    ? zoriResizeLinear_8u_C1R
                 : m == zoriInterCubic   ? zoriResizeCubic_8u_C1R
                 : m == zoriInterLanczos ? zoriResizeLanczos_8u_C1R
                                         : zoriResizeAntialiasing_8u_C1R;
        return f(s, ss, d, ds, o, z, bt, nullptr, r, b);
    } else {
        if (m == zoriInterNN) return zoriResizeNearest_32f_C1R(s, ss, d, ds, o, z, r, b);
        auto f = m == zoriInterLinear    ? zoriResizeLinear_32f_C1R
                 : m == zoriInterCubic   ? zoriResizeCubic_32f_C1R
                 : m == zoriInterLanczos ? zoriResizeLanczos_32f_C1R
                                         : zoriResizeAntialiasing_32f_C1R;
        return f(s, ss, d, ds, o, z, bt, nullptr, r, b);
    }
}

// A W x H source with `margin` pixels on each in-memory side, none elsewhere,
// against an unreadable page: no read may leave what the flags promise.
template <typename T> struct ResizeSource {
    int32_t l, u;
    Fenced<T> f;
    ResizeSource(int32_t W, int32_t H, int32_t border, int32_t margin, bool atEnd)
        : l(border & 64 ? margin : 0),
          u(border & 16 ? margin : 0),
          f(W + l + (border & 128 ? margin : 0), H + u + (border & 32 ? margin : 0), atEnd,
            (W + l + (border & 128 ? margin : 0) + 1) * (int32_t)sizeof(T)) {}
    T* ptr(int32_t x, int32_t y) { return f.ptr(x + l, y + u); }
    double get(int32_t x, int32_t y) {
        T v;
        memcpy(&v, ptr(x, y), sizeof v);
        return (double)v;
    }
};

// The destination in random tiles, each with its guarded buffer; with `over`
// right-edge tiles ask past the destination (and the bottom one below it):
// clipped, 48. `call(source offset, tile, size, buffer)`.
template <typename F>
void resize_tiles(const ZoriResizeSpec* record, ZoriSize dst, Rng& rng, bool over, F call,
                  Zor32u channels = 1) {
    for (const ZoriRect& t : random_tiles(dst, rng)) {
        ZoriPoint off{-1, -1};
        ASSERT_EQ(zoriResizeGetSrcOffset_8u(record, {t.x, t.y}, &off), zorStsNoErr);
        const bool past = over && t.x + t.width == dst.width;
        const ZoriSize size{past ? dst.width + 1 : t.width,
                            t.height + (past && t.y + t.height == dst.height)};
        int32_t n = 0;
        std::vector<uint8_t> buf = resize_buffer(record, size, &n, channels);
        ASSERT_EQ(call(off, t, size, buf.data()), past ? zorStsSizeWrn : zorStsNoErr)
            << t.x << "," << t.y << " " << size.width << "x" << size.height;
        ASSERT_TRUE(guard_intact(buf, (size_t)n));
    }
}

// Init's checks in order, writing nothing; sources below `least` pixels
// refused. `init(src, dst, record, initBuffer)`.
template <typename F>
void resize_init_checks(F init, ZoriSize S, ZoriSize D, int32_t least, bool initBuffer) {
    ResizeRecord r = resize_record(S, D, zoriInterCubic);
    const std::vector<uint8_t> blank = r.mem;
    ZoriResizeSpec* sp = r.record();
    Zor8u* ib = r.initBuf();
    auto row = [&](ZorStatus want, const char* what, ZoriSize s, ZoriSize d, ZoriResizeSpec* rp,
                   Zor8u* b) {
        return CheckRow{want, what, [=] { return init(s, d, rp, b); }};
    };
    std::vector<CheckRow> rows = {row(zorStsNullPtrErr, "null record", S, D, nullptr, ib)};
    if (initBuffer) rows.push_back(row(zorStsNullPtrErr, "null init buffer", S, D, sp, nullptr));
    for (const CheckRow& c :
         {row(zorStsNoOperation, "zero length", {-1, S.height}, {0, D.height}, sp, ib),
          row(zorStsSizeErr, "negative length", S, {D.width, -1}, sp, ib),
          row(zorStsSizeErr, "narrow source", {least - 1, S.height}, D, sp, ib),
          row(zorStsSizeErr, "short source", {S.width, least - 1}, D, sp, ib)})
        rows.push_back(c);
    run_checks(rows, [&] { return r.mem == blank; });
}

// Operation checks in order, writing nothing; records of `others` (and
// nearest's, for a filter) refused; odd steps fail 32f only (8u fails the
// offset after them). Then a tile past the destination: clipped, 48, written.
template <typename T> void resize_op_checks(ZoriInterpolationType m, ZoriSize S, ZoriSize D,
                                            const ZoriResizeSpec* ok,
                                            std::vector<const ZoriResizeSpec*> others,
                                            ZorStatus otherKind = zorStsContextMatchErr) {
    ResizeRecord nn = resize_record(S, D, zoriInterNN);
    EXPECT_EQ(zoriResizeNearestInit_8u(S, D, nn.record()), zorStsNoErr);
    if (m != zoriInterNN) others.push_back(nn.record());
    std::vector<uint8_t> buf = resize_buffer(ok, D), zero(512, 0);
    Image<T> src(S.width, S.height), dst(D.width, D.height);
    const Image<T> before = dst;
    src.fill([](int x, int y) { return (T)(1 + x + y); });
    const ZoriResizeSpec* bad = (const ZoriResizeSpec*)zero.data();
    const int32_t st = src.step, odd = src.step + 1, dodd = dst.step - 1;
    const ZorStatus step = sizeof(T) == 4 ? zorStsStepErr : zorStsOutOfRangeErr;
    auto row = [&](ZorStatus want, const char* what, int32_t border, int32_t ss, ZoriPoint at,
                   ZoriSize size, const ZoriResizeSpec* r, int nulls, int32_t ds = 0) {
        return CheckRow{want, what, [=, &src, &dst, &buf] {  // nulls: 1 src, 2 dst, 4 buffer
                            return resize_op<T>(m, nulls & 1 ? nullptr : src.ptr(), ss,
                                                nulls & 2 ? nullptr : dst.ptr(), ds ? ds : dst.step,
                                                at, size, border, r,
                                                nulls & 4 ? nullptr : buf.data());
                        }};
    };
    std::vector<CheckRow> rows;
    if (m != zoriInterNN)
        rows = {row(zorStsBorderErr, "border 0 before all", 0, st, {0, 0}, D, nullptr, 7),
                row(zorStsBorderErr, "border 3", 3, st, {0, 0}, D, ok, 0),
                row(zorStsBorderErr, "mirror", 3 | 16, st, {0, 0}, D, ok, 0),
                row(zorStsBorderErr, "border 257", 257, st, {0, 0}, D, ok, 0)};
    for (const CheckRow& r :
         {row(zorStsNullPtrErr, "null source", 1, st, {0, 0}, D, ok, 1),
          row(zorStsNullPtrErr, "null destination", 1, st, {0, 0}, D, ok, 2),
          row(zorStsNullPtrErr, "null record", 1, st, {0, 0}, D, nullptr, 0),
          row(zorStsNullPtrErr, "null buffer", 1, st, {0, 0}, D, ok, 4),
          row(zorStsNoOperation, "zero size before id", 1, odd, {9, 0}, {0, 1}, bad, 0),
          row(zorStsContextMatchErr, "record id", 1, odd, {9, 0}, {-1, 1}, bad, 0),
          row(zorStsSizeErr, "negative size", 1, odd, {9, 0}, {-1, 1}, ok, 0),
          row(step, "source step", 1, odd, {9, 0}, D, ok, 0),
          row(step, "destination step", 1, st, {-1, 0}, D, ok, 0, dodd),
          row(zorStsOutOfRangeErr, "x", 1, st, {D.width, 0}, D, ok, 0),
          row(zorStsOutOfRangeErr, "negative y", 1, st, {0, -1}, D, ok, 0),
          row(zorStsOutOfRangeErr, "y", 1, st, {0, D.height}, D, ok, 0)})
        rows.push_back(r);
    for (const ZoriResizeSpec* r : others)
        rows.push_back(row(otherKind, "other record", 1, st, {0, 0}, D, r, 0));
    run_checks(rows, [&] { return (bool)same_bytes(dst, before); });
    if (sizeof(T) == 1)  // 8u rows may start anywhere and take odd steps
        EXPECT_EQ(row(zorStsNoErr, "", 1, odd, {0, 0}, {D.width - 1, D.height}, ok, 0, dodd).call(),
                  zorStsNoErr);
    EXPECT_EQ(row(zorStsSizeWrn, "", 1, st, {0, 0}, {D.width + 1, D.height + 1}, ok, 0).call(),
              zorStsSizeWrn);
    EXPECT_FALSE(same_bytes(dst, before)) << "the clipped tile was not written";
}

// Per destination position of one axis: source index and 2 * taps weights.
struct WindowAxis {
    int32_t taps = 0;
    std::vector<int32_t> index;
    std::vector<float> w;
};

inline float window_pair(float x0, float c0, float x1, float c1, bool fused) {
    return fused ? fmaf(x1, c1, x0 * c0) : x0 * c0 + x1 * c1;
}

// n taps summed in groups of four, (p0 + p1) + (p2 + p3), each added to
// the running sum in order, a last pair alone.
inline float window_sum(const float* x, const float* c, int32_t n, bool fused) {
    float acc = 0;
    for (int32_t k = 0; k < n; k += 4) {
        float g = window_pair(x[k], c[k], x[k + 1], c[k + 1], fused);
        if (k + 2 < n) g = g + window_pair(x[k + 2], c[k + 2], x[k + 3], c[k + 3], fused);
        acc = k ? acc + g : g;
    }
    return acc;
}

// The general window at destination (x, y) before conversion: taps from
// index + 1 - taps on, each index clamped into the image on a side without
// its in-memory flag (240: none clamps); one tap a side is the linear row
// form a + (b - a) * w1. `get(col, row)` reads the (one-channel) source.
// The four-tap passes (`fourTap`) read the last pixel four times once the
// index passes len - 2 on a clamped side.
template <typename Get>
float window_model(Get get, int32_t W, int32_t H, const WindowAxis& ax, const WindowAxis& ay,
                   int32_t border, bool fused, int32_t x, int32_t y, bool fourTap = false) {
    const bool mem = border == 240;
    auto at = [&](int32_t index, int32_t v, int32_t n, int lowFlag, int highFlag) {
        const bool high = !mem && !(border & highFlag);
        if (!mem && !(border & lowFlag) && v < 0) v = 0;
        if (high && (v > n - 1 || (fourTap && index > n - 2))) v = n - 1;
        return v;
    };
    const int32_t nx = 2 * ax.taps, ny = 2 * ay.taps;
    std::vector<float> rows((size_t)ny), px((size_t)nx);
    for (int32_t a = 0; a < ny; ++a) {
        const int32_t sy = at(ay.index[y], ay.index[y] + 1 - ay.taps + a, H, 16, 32);
        for (int32_t b = 0; b < nx; ++b)
            px[b] = get(at(ax.index[x], ax.index[x] + 1 - ax.taps + b, W, 64, 128), sy);
        const float f = ax.w[(size_t)nx * x + 1];
        rows[a] = nx == 2 ? (fused ? fmaf(px[1] - px[0], f, px[0]) : px[0] + (px[1] - px[0]) * f)
                          : window_sum(px.data(), &ax.w[(size_t)nx * x], nx, fused);
    }
    return window_sum(rows.data(), &ay.w[(size_t)ny * y], ny, fused);
}

inline uint8_t resize_u8(float v) {  // the caller's rounding, then 0..255
    const int32_t i = _mm_cvtss_si32(_mm_set_ss(v));
    return (uint8_t)(i < 0 ? 0 : i > 255 ? 255 : i);
}

// A filled record's operation `op` (C channels, 8u only for 3) on a fenced
// random source against window_model, bit for bit; levels of one arithmetic
// agree; random tiles give the one-call result. `margin`: pixels a tap may
// reach past an in-memory side.
template <typename T, typename Op>
void window_case(Op op, ResizeRecord& rec, ZoriSize S, ZoriSize D, const WindowAxis& ax,
                 const WindowAxis& ay, int32_t border, int32_t C, bool fused, bool fourTap,
                 uint32_t seed) {
    SCOPED_TRACE(::testing::Message() << Type<T>::name << " C" << C << " " << S.width << "x"
                                      << S.height << " to " << D.width << "x" << D.height
                                      << " taps " << ax.taps << "," << ay.taps << " border "
                                      << border);
    ASSERT_TRUE(record_guards_intact(rec));
    Rng rng(seed);
    const int32_t margin = std::max(ax.taps, ay.taps) + 1;
    ResizeSource<T> s(S.width * C, S.height, border, margin * C, seed & 1);
    s.f.fill([&](int32_t, int32_t) {
        return sizeof(T) == 1 ? (T)rng.next() : (T)(((int32_t)rng.below(2001) - 1000) * 0.37f);
    });
    Image<T> out(D.width * C, D.height, (D.width * C + 3) * (int32_t)sizeof(T),
                 seed % 4 * sizeof(T));
    auto run = [&](ZoriPoint o, Image<T>& d, ZoriRect r, ZoriSize z, Zor8u* b) {
        return op(s.ptr(o.x * C, o.y), s.f.step, d.ptr(r.x * C, r.y), d.step, ZoriPoint{r.x, r.y},
                  z, (ZoriBorderType)border, nullptr, rec.record(), b);
    };
    int32_t n = 0;
    std::vector<uint8_t> buf = resize_buffer(rec.record(), D, &n, (Zor32u)C);
    ASSERT_EQ(run({0, 0}, out, {0, 0, D.width, D.height}, D, buf.data()), zorStsNoErr);
    ASSERT_TRUE(guard_intact(buf, (size_t)n));
    for (int32_t y = 0; y < D.height; ++y)
        for (int32_t x = 0; x < D.width; ++x)
            for (int32_t c = 0; c < C; ++c) {
                auto get = [&](int32_t sx, int32_t sy) { return (float)s.get(sx * C + c, sy); };
                const float v = window_model(get, S.width, S.height, ax, ay, border, fused, x, y,
                                             fourTap);
                const T want = sizeof(T) == 1 ? (T)resize_u8(v) : (T)v, got = out.get(x * C + c, y);
                ASSERT_TRUE(memcmp(&got, &want, sizeof(T)) == 0 || (got != got && want != want))
                    << x << "," << y << "." << c << ": " << (double)got << " vs " << (double)v;
            }
    // NaN weights: which NaN a sum keeps depends on operand order, which the
    // compiler may swap, so NaNs are compared as one value from here on.
    out.fill([&](int32_t x, int32_t y) { const T v = out.get(x, y); return v != v ? (T)NAN : v; });
    const uint64_t key = seed ^ (uint64_t)S.width << 20 ^ (uint64_t)S.height << 32 ^
                         (uint64_t)D.width << 42 ^ (uint64_t)D.height << 52 ^
                         (uint64_t)(ax.taps + ay.taps) << 58 ^ (uint64_t)C << 62;
    std::vector<uint8_t> pixels;
    for (int32_t y = 0; y < D.height; ++y)
        pixels.insert(pixels.end(), out.bytes(0, y), out.bytes(D.width * C, y));
    ASSERT_TRUE(agrees_within_group(fused, key, pixels)) << "levels of one arithmetic differ";
    Image<T> tiled = out;
    tiled.fill([](int32_t, int32_t) { return 0; });
    ASSERT_NO_FATAL_FAILURE(resize_tiles(
        rec.record(), D, rng, seed & 2,
        [&](ZoriPoint o, ZoriRect r, ZoriSize z, Zor8u* b) { return run(o, tiled, r, z, b); },
        (Zor32u)C));
    tiled.fill([&](int32_t x, int32_t y) { const T v = tiled.get(x, y); return v != v ? (T)NAN : v; });
    ASSERT_TRUE(same_bytes(tiled, out));
}

}  // namespace zortest

#endif
