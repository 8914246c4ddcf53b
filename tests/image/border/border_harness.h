// Border copies under test: a scalar model that frames an image by the
// border definitions, guard-buffer runs of any form against it, and the
// argument-check cases. Shared by the public and the level-private tests;
// each names its forms through FORM_* macros over its own way of calling.
#ifndef ZOR_TEST_BORDER_HARNESS_H
#define ZOR_TEST_BORDER_HARNESS_H

#include <gtest/gtest.h>

#include <stdint.h>
#include <string.h>

#include <algorithm>
#include <climits>
#include <string>
#include <vector>

#include "zor.h"

namespace bordertest {

enum Kind { kConst, kRepl, kMirror };

// ---- model ---------------------------------------------------------------

// Source index for frame position p on an axis of n source pixels placed
// after `before` border positions, with `after` positions behind it.
inline int64_t tri(int64_t k, int64_t n) {
    const int64_t period = 2 * n - 2;
    k %= period;
    return k >= n ? period - k : k;
}

inline int mirror_index(int p, int before, int n, int after) {
    if (p < before) {
        if (before < n) return before - p;  // edge pixel not repeated
        if (n == 1) return 0;
        return (int)tri(before + p, n);  // p counts from the outer edge
    }
    if (p < before + n) return p - before;
    const int j = p - before - n;  // 0 next to the image
    if (after < n) return n - 2 - j;
    if (n == 1) return 0;
    return n - 1 - (int)tri(after + (after - 1 - j), n);  // left rule, flipped
}

inline int repl_index(int p, int before, int n) { return std::min(std::max(p - before, 0), n - 1); }

struct Geometry {
    int srcW, srcH, top, left, right, bottom;
    int dstW() const { return left + srcW + right; }
    int dstH() const { return top + srcH + bottom; }
};

inline std::string describe(const Geometry& g) {
    return "src " + std::to_string(g.srcW) + "x" + std::to_string(g.srcH) + " top " +
           std::to_string(g.top) + " left " + std::to_string(g.left) + " right " +
           std::to_string(g.right) + " bottom " + std::to_string(g.bottom);
}

// Writes the frame of pixel size P into dst; the source ROI is written too
// unless inPlace (then the caller's bytes there stay).
inline void model(Kind kind, const Geometry& g, size_t P, const uint8_t* src, ptrdiff_t srcStep,
                  uint8_t* dst, ptrdiff_t dstStep, const uint8_t* value, bool inPlace) {
    for (int y = 0; y < g.dstH(); ++y)
        for (int x = 0; x < g.dstW(); ++x) {
            const bool inside =
                x >= g.left && x < g.left + g.srcW && y >= g.top && y < g.top + g.srcH;
            if (inside && inPlace) continue;
            uint8_t* d = dst + y * dstStep + x * (ptrdiff_t)P;
            int sx, sy;
            if (kind == kConst) {
                if (!inside) {
                    memcpy(d, value, P);
                    continue;
                }
                sx = x - g.left;
                sy = y - g.top;
            } else if (kind == kRepl) {
                sx = repl_index(x, g.left, g.srcW);
                sy = repl_index(y, g.top, g.srcH);
            } else {
                sx = mirror_index(x, g.left, g.srcW, g.right);
                sy = mirror_index(y, g.top, g.srcH, g.bottom);
            }
            memcpy(d, src + sy * srcStep + sx * (ptrdiff_t)P, P);
        }
}

// ---- forms -----------------------------------------------------------------

struct Args {
    const void* src;
    int32_t srcStep;
    ZoriSize srcRoi;
    void* dst;
    int32_t dstStep;
    ZoriSize dstRoi;
    int32_t top, left;
    const void* value;  // Const only: one pixel
};

// level: index of the level in force (the private tests pick the body).
typedef ZorStatus (*CopyFn)(int level, const Args& a);
typedef ZorStatus (*InPlaceFn)(int level, void* p, int32_t step, ZoriSize srcRoi, ZoriSize dstRoi,
                               int32_t top, int32_t left);

struct Form {
    const char* name;
    Kind kind;
    int elemBytes, channels;
    CopyFn copy;
    InPlaceFn inPlace;  // null where the family has no in-place form of the type
    size_t pixel() const { return (size_t)elemBytes * channels; }
};

#define BORDER_ARGS_R(T) \
    (const T*)a.src, a.srcStep, a.srcRoi, (T*)a.dst, a.dstStep, a.dstRoi, a.top, a.left
// CALL(fn) names the body to run; `level` is in scope where it expands.
#define BORDER_FORM(kind, fn, T, C, copyBody, inPlace)                     \
    bordertest::Form {                                                     \
        #fn, kind, (int)sizeof(T), C,                                      \
            [](int level, const bordertest::Args& a) -> ZorStatus {        \
                (void)level;                                               \
                copyBody;                                                  \
            },                                                             \
            inPlace                                                        \
    }
#define FORM_CONST1(CALL, fn, T)                                                        \
    BORDER_FORM(bordertest::kConst, fn, T, 1, T v; memcpy(&v, a.value, sizeof v);       \
                return CALL(fn)(BORDER_ARGS_R(T), v), nullptr)
#define FORM_CONSTN(CALL, fn, T, C) \
    BORDER_FORM(bordertest::kConst, fn, T, C, return CALL(fn)(BORDER_ARGS_R(T), (const T*)a.value), nullptr)
#define FORM_COPY(CALL, kind, fn, T, C) \
    BORDER_FORM(kind, fn, T, C, return CALL(fn)(BORDER_ARGS_R(T)), nullptr)
#define FORM_BOTH(CALL, kind, fn, ifn, T, C)                                                  \
    BORDER_FORM(kind, fn, T, C, return CALL(fn)(BORDER_ARGS_R(T)),                           \
                ([](int level, void* p, int32_t step, ZoriSize s, ZoriSize d, int32_t t,     \
                    int32_t l) -> ZorStatus {                                                 \
                    (void)level;                                                              \
                    return CALL(ifn)((T*)p, step, s, d, t, l);                                \
                }))

// ---- buffers ---------------------------------------------------------------

inline void scramble(std::vector<uint8_t>& b, uint32_t seed) {
    for (uint8_t& x : b) {
        seed = seed * 1664525u + 1013904223u;
        x = (uint8_t)(seed >> 24);
    }
}

constexpr size_t kGuard = 67;

// An image of w x h pixels inside a guarded buffer; the first pixel lies
// `skew` bytes past a 64-byte boundary and rows are `pad` bytes longer
// than the pixels, so rows and steps are as misaligned as we like.
struct Image {
    std::vector<uint8_t> bytes;
    size_t origin;
    int32_t step;
    uint8_t* at(int x, int y, size_t P) {
        return bytes.data() + origin + (ptrdiff_t)y * step + x * P;
    }
};

inline Image make_image(int w, int h, size_t P, int skew, int pad, uint32_t seed) {
    Image im;
    im.step = (int32_t)(w * P + pad);
    im.bytes.resize(kGuard * 2 + 64 + (size_t)im.step * h);
    uintptr_t base = (uintptr_t)im.bytes.data() + kGuard;
    im.origin = kGuard + ((64 - base % 64) % 64) + skew;
    im.bytes.resize(im.origin + (size_t)im.step * h + kGuard);
    scramble(im.bytes, seed);
    return im;
}

// Geometries: source lengths 1, 2, 3 and longer (past two vectors of the
// widest level for every pixel size), borders from none to several mirror
// periods, paired so that each axis meets every border length.
inline std::vector<Geometry> geometries() {
    std::vector<Geometry> out;
    const int widths[] = {1, 2, 3, 4, 7, 45, 131};
    const int heights[] = {1, 2, 3, 5};
    for (int w : widths) {
        const int per = 2 * w - 2;
        std::vector<int> bl = {0, 1, 2, std::max(w - 1, 0), w, w + 1, 2 * w + 3, 3 * per + 1, 70};
        std::sort(bl.begin(), bl.end());
        bl.erase(std::unique(bl.begin(), bl.end()), bl.end());
        for (size_t i = 0; i < bl.size(); ++i)
            for (size_t j = 0; j < bl.size(); j += (i % 2 ? 1 : 2)) {
                const int h = heights[(i + j) % 4];
                const int vper = 2 * h - 2;
                const int vb[] = {0, 1, h - 1, h, h + 2, 3 * vper + 2, 9};
                out.push_back({w, h, vb[(i + 2 * j) % 7], bl[i], bl[j], vb[(3 * i + j + 1) % 7]});
            }
    }
    return out;
}

// One pixel of distinct bytes for the constant; every 4-byte group is a
// signalling NaN (alternating signs), which a float form must pass on as
// bits without quieting it.
inline std::vector<uint8_t> const_value(size_t P) {
    std::vector<uint8_t> v(P);
    for (size_t i = 0; i < P; ++i) v[i] = (uint8_t)(0xA1 + 13 * i);
    for (size_t i = 3; i < P; i += 4) {
        v[i - 1] = (uint8_t)(0x80 | (v[i - 1] & 0x3f));
        v[i] = (uint8_t)(i & 4 ? 0xff : 0x7f);
    }
    return v;
}

// The copying form against the model; source and whole guarded destination
// compared after the call.
inline void run_copy(const Form& f, int level, const Geometry& g, int seed) {
    const size_t P = f.pixel();
    Image src = make_image(g.srcW, g.srcH, P, seed % 5, 1 + 2 * (seed % 3), 100 + seed);
    Image dst = make_image(g.dstW(), g.dstH(), P, (seed + 3) % 7, 3 + (seed % 4), 200 + seed);
    const std::vector<uint8_t> srcBefore = src.bytes;
    std::vector<uint8_t> expect = dst.bytes;
    const std::vector<uint8_t> value = const_value(P);
    model(f.kind, g, P, src.at(0, 0, P), src.step, expect.data() + dst.origin, dst.step,
          value.data(), false);
    const Args a{src.at(0, 0, P),      src.step, {g.srcW, g.srcH}, dst.at(0, 0, P), dst.step,
                 {g.dstW(), g.dstH()}, g.top,    g.left,           value.data()};
    ASSERT_EQ(f.copy(level, a), zorStsNoErr) << f.name << " " << describe(g);
    ASSERT_TRUE(src.bytes == srcBefore) << f.name << " wrote its source, " << describe(g);
    ASSERT_TRUE(dst.bytes == expect) << f.name << " " << describe(g);
}

// In place, through the in-place form and through the copying form with
// equal pointers (its source step must not matter then).
inline void run_in_place(const Form& f, int level, const Geometry& g, int seed,
                         bool equalPointers) {
    const size_t P = f.pixel();
    Image im = make_image(g.dstW(), g.dstH(), P, seed % 6, 1 + (seed % 5), 300 + seed);
    std::vector<uint8_t> expect = im.bytes;
    uint8_t* roi = im.at(g.left, g.top, P);
    model(f.kind, g, P, roi, im.step, expect.data() + im.origin, im.step, nullptr, true);
    ZorStatus status;
    if (equalPointers) {
        const Args a{roi,   -7,     {g.srcW, g.srcH}, roi, im.step, {g.dstW(), g.dstH()},
                     g.top, g.left, nullptr};
        status = f.copy(level, a);
    } else {
        status =
            f.inPlace(level, roi, im.step, {g.srcW, g.srcH}, {g.dstW(), g.dstH()}, g.top, g.left);
    }
    ASSERT_EQ(status, zorStsNoErr)
        << f.name << (equalPointers ? " (pSrc == pDst) " : " (in place) ") << describe(g);
    ASSERT_TRUE(im.bytes == expect)
        << f.name << (equalPointers ? " (pSrc == pDst) " : " (in place) ") << describe(g);
}

// ---- argument checks -------------------------------------------------------

struct BadCase {
    const char* what;
    bool nullSrc, nullDst, nullValue;
    int32_t srcStep, dstStep;
    ZoriSize srcRoi, dstRoi;
    int32_t top, left;
    ZorStatus expect;
};

// A valid call is src 4x3 into 7x6 at top 1, left 2, steps 64.
inline std::vector<BadCase> bad_cases() {
    const ZoriSize s{4, 3}, d{7, 6};
    return {
        {"null source", true, false, false, 64, 64, s, d, 1, 2, zorStsNullPtrErr},
        {"null destination", false, true, false, 64, 64, s, d, 1, 2, zorStsNullPtrErr},
        {"null before step and size", true, true, false, 0, 0, {0, 0}, d, -1, 2, zorStsNullPtrErr},
        {"source step 0", false, false, false, 0, 64, s, d, 1, 2, zorStsStepErr},
        {"destination step -1", false, false, false, 64, -1, s, d, 1, 2, zorStsStepErr},
        {"step before size", false, false, false, 64, 0, {0, 3}, d, -1, 2, zorStsStepErr},
        {"source width 0", false, false, false, 64, 64, {0, 3}, d, 1, 2, zorStsSizeErr},
        {"source height 0", false, false, false, 64, 64, {4, 0}, d, 1, 2, zorStsSizeErr},
        {"destination width 0", false, false, false, 64, 64, s, {0, 6}, 0, 0, zorStsSizeErr},
        {"destination height -2", false, false, false, 64, 64, s, {7, -2}, 0, 0, zorStsSizeErr},
        {"top -1", false, false, false, 64, 64, s, d, -1, 2, zorStsSizeErr},
        {"left -1", false, false, false, 64, 64, s, d, 1, -1, zorStsSizeErr},
        {"width one short", false, false, false, 64, 64, s, {5, 6}, 1, 2, zorStsSizeErr},
        {"height one short", false, false, false, 64, 64, s, {7, 3}, 1, 2, zorStsSizeErr},
        {"left past int range", false, false, false, 64, 64, s, d, 1, INT_MAX, zorStsSizeErr},
        {"top past int range", false, false, false, 64, 64, s, d, INT_MAX - 1, 2, zorStsSizeErr},
    };
}

// Every check case on a form, copying and in place: the status, and not a
// byte of the guarded buffers changed.
inline void run_checks(const Form& f, int level) {
    const size_t P = f.pixel();
    Image src = make_image(8, 8, P, 1, 5, 7);
    Image dst = make_image(8, 8, P, 3, 5, 9);
    const std::vector<uint8_t> srcBefore = src.bytes, dstBefore = dst.bytes;
    const std::vector<uint8_t> value = const_value(P);
    for (const BadCase& c : bad_cases()) {
        const Args a{c.nullSrc ? nullptr : src.at(0, 0, P),
                     c.srcStep == 64 ? src.step : c.srcStep,
                     c.srcRoi,
                     c.nullDst ? nullptr : dst.at(0, 0, P),
                     c.dstStep == 64 ? dst.step : c.dstStep,
                     c.dstRoi,
                     c.top,
                     c.left,
                     value.data()};
        EXPECT_EQ(f.copy(level, a), c.expect) << f.name << ": " << c.what;
        // In place: one pointer and one step, so a bad source step alone has
        // no counterpart.
        if (f.inPlace && !(c.srcStep != 64 && c.dstStep == 64)) {
            EXPECT_EQ(f.inPlace(level, c.nullSrc || c.nullDst ? nullptr : dst.at(2, 2, P),
                                a.dstStep, c.srcRoi, c.dstRoi, c.top, c.left),
                      c.expect)
                << f.name << " in place: " << c.what;
        }
    }
    if (f.kind == kConst && f.channels > 1) {
        const Args a{src.at(0, 0, P), src.step, {4, 3}, dst.at(0, 0, P), dst.step,
                     {7, 6},          1,        2,      nullptr};
        EXPECT_EQ(f.copy(level, a), zorStsNullPtrErr) << f.name << ": null value";
    }
    // Equal pointers: Replicate and Mirror go in place and test only the
    // destination step; Const has no such branch and tests the source step.
    {
        const Args a{dst.at(2, 2, P), 0, {1, 1}, dst.at(2, 2, P), f.kind == kConst ? dst.step : -3,
                     {3, 3},          1, 1,      value.data()};
        EXPECT_EQ(f.copy(level, a), zorStsStepErr) << f.name << ": equal pointers, bad step";
        const Args n{nullptr, 64, {1, 1}, nullptr, 64, {3, 3}, 1, 1, value.data()};
        EXPECT_EQ(f.copy(level, n), zorStsNullPtrErr) << f.name << ": both null";
    }
    EXPECT_TRUE(src.bytes == srcBefore) << f.name;
    EXPECT_TRUE(dst.bytes == dstBefore) << f.name;
}

}  // namespace bordertest

#endif
