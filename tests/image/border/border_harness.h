// Border copies under test: every form against the shared border model
// over a sweep of frames, copying and in place, and the argument checks in
// their order. Shared by the public and the level-private tests; each
// names its forms through FORM_* macros over its own way of calling.
#ifndef ZOR_TEST_BORDER_HARNESS_H
#define ZOR_TEST_BORDER_HARNESS_H

#include <gtest/gtest.h>

#include <stdint.h>
#include <string.h>

#include <climits>
#include <string>
#include <vector>

#include "border_model.h"
#include "image.h"

namespace bordertest {

// The border kinds, as the model numbers them.
enum Kind { kRepl = 1, kMirror = 3, kConst = 6 };

// Images of P-byte pixels are byte images P times as wide.
typedef zortest::Image<uint8_t> Img;

struct Geometry {
    int srcW, srcH, top, left, right, bottom;
    int dstW() const { return left + srcW + right; }
    int dstH() const { return top + srcH + bottom; }
};
inline std::ostream& operator<<(std::ostream& o, const Geometry& g) {
    return o << "src " << g.srcW << "x" << g.srcH << " top " << g.top << " left " << g.left
             << " right " << g.right << " bottom " << g.bottom;
}

// The expected frame in `want`: each pixel from the source pixel the model
// names (srcAt(x, y) gives its bytes) or the constant. In place the ROI is
// the source itself and stays as it is.
template <typename SrcAt>
void model(Kind kind, const Geometry& g, size_t P, SrcAt srcAt, Img& want, const uint8_t* value,
           bool inPlace) {
    for (int y = 0; y < g.dstH(); ++y)
        for (int x = 0; x < g.dstW(); ++x) {
            const int64_t sx = zortest::border_index(kind, x - g.left, g.srcW);
            const int64_t sy = zortest::border_index(kind, y - g.top, g.srcH);
            // Outside the ROI no index equals its own position.
            if (inPlace && sx == x - g.left && sy == y - g.top) continue;
            memcpy(want.bytes(x * (int)P, y), sx < 0 || sy < 0 ? value : srcAt((int)sx, (int)sy),
                   P);
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
#define BORDER_FORM(kind, fn, T, C, copyBody, inPlace)                                         \
    bordertest::Form {                                                                         \
        #fn, kind, (int)sizeof(T), C,                                                          \
            [](int level, const bordertest::Args& a) -> ZorStatus {                            \
                (void)level;                                                                   \
                copyBody;                                                                      \
            },                                                                                 \
            inPlace                                                                            \
    }
#define FORM_CONST1(CALL, fn, T)                                                  \
    BORDER_FORM(bordertest::kConst, fn, T, 1, T v; memcpy(&v, a.value, sizeof v); \
                return CALL(fn)(BORDER_ARGS_R(T), v), nullptr)
#define FORM_CONSTN(CALL, fn, T, C)                                                            \
    BORDER_FORM(bordertest::kConst, fn, T, C, return CALL(fn)(BORDER_ARGS_R(T), (const T*)a.value), \
                nullptr)
#define FORM_COPY(CALL, kind, fn, T, C) \
    BORDER_FORM(kind, fn, T, C, return CALL(fn)(BORDER_ARGS_R(T)), nullptr)
#define FORM_BOTH(CALL, kind, fn, ifn, T, C)                                              \
    BORDER_FORM(kind, fn, T, C, return CALL(fn)(BORDER_ARGS_R(T)),                       \
                ([](int level, void* p, int32_t step, ZoriSize s, ZoriSize d, int32_t t, \
                    int32_t l) -> ZorStatus {                                             \
                    (void)level;                                                          \
                    return CALL(ifn)((T*)p, step, s, d, t, l);                            \
                }))

// ---- frames ------------------------------------------------------------------

// Border lengths from 0 to three times the source length: all of them on
// short axes, where the reflections fold; on long ones the points around
// one and two lengths and a stride between.
inline std::vector<int> border_lengths(int n) {
    std::vector<int> out;
    for (int b = 0; b <= 3 * n; ++b)
        if (n <= 7 || b < 3 || b % (n / 5) == 0 || (b >= n - 1 && b <= n + 1) ||
            (b >= 2 * n - 3 && b <= 2 * n) || b == 3 * n)
            out.push_back(b);
    return out;
}

// Each axis in turn runs through its border lengths on sources of 1, 2, 3
// pixels (no period, the shortest ones) up to 131 (wider than two vectors
// of the widest level for one-byte pixels), while the other axis takes a
// short source with borders that rotate through their own range. One frame
// without any border at all.
inline std::vector<Geometry> geometries() {
    std::vector<Geometry> out = {{5, 3, 0, 0, 0, 0}};
    int k = 0;
    for (int n : {1, 2, 3, 4, 7, 45, 131}) {
        const std::vector<int> bl = border_lengths(n);
        for (size_t i = 0; i < bl.size(); ++i, ++k) {
            const int m = 1 + k % 4, far = bl[(i * 5 + 3) % bl.size()];
            const int t = k % (3 * m + 1), u = (k * 7 + 2) % (3 * m + 1);
            out.push_back({n, m, t, bl[i], far, u});
            out.push_back({m, n, bl[i], t, u, far});
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

// An image of w x h pixels of P bytes with odd row padding and
// misalignment, random bytes.
inline Img random_image(int w, int h, size_t P, int seed) {
    zortest::Rng r(seed);
    Img im(w * (int)P, h, w * (int)P + 1 + seed % 5, (size_t)(seed * 3) % 11);
    im.randomize(r);
    return im;
}

// The copying form against the model; the source and the destination
// with its guards are compared whole after the call.
inline void run_copy(const Form& f, int level, const Geometry& g, int seed) {
    const size_t P = f.pixel();
    Img src = random_image(g.srcW, g.srcH, P, seed);
    Img dst = random_image(g.dstW(), g.dstH(), P, seed + 1);
    const Img srcBefore = src;
    Img want = dst;
    const std::vector<uint8_t> value = const_value(P);
    model(f.kind, g, P, [&](int x, int y) { return src.bytes(x * (int)P, y); }, want,
          value.data(), false);
    const Args a{src.ptr(), src.step, {g.srcW, g.srcH}, dst.ptr(), dst.step, {g.dstW(), g.dstH()},
                 g.top,     g.left,   value.data()};
    ASSERT_EQ(f.copy(level, a), zorStsNoErr);
    ASSERT_TRUE(zortest::same_bytes(src, srcBefore)) << "wrote its source";
    ASSERT_TRUE(zortest::same_bytes(dst, want));
}

// In place, through the in-place form or through the copying form with
// equal pointers (whose source step must not matter then).
inline void run_in_place(const Form& f, int level, const Geometry& g, int seed,
                         bool equalPointers) {
    const size_t P = f.pixel();
    Img im = random_image(g.dstW(), g.dstH(), P, seed);
    Img want = im;
    model(f.kind, g, P, [&](int x, int y) { return want.bytes((g.left + x) * (int)P, g.top + y); },
          want, nullptr, true);
    uint8_t* roi = im.bytes(g.left * (int)P, g.top);
    const ZoriSize s{g.srcW, g.srcH}, d{g.dstW(), g.dstH()};
    const ZorStatus status =
        equalPointers ? f.copy(level, {roi, -7, s, roi, im.step, d, g.top, g.left, nullptr})
                      : f.inPlace(level, roi, im.step, s, d, g.top, g.left);
    ASSERT_EQ(status, zorStsNoErr) << (equalPointers ? "pSrc == pDst" : "in place");
    ASSERT_TRUE(zortest::same_bytes(im, want)) << (equalPointers ? "pSrc == pDst" : "in place");
}

// Every form over every frame: the copy, then in place by the form the
// family has (both in turn where it has both).
inline void run_sweep(const std::vector<Form>& forms, int level) {
    const std::vector<Geometry> frames = geometries();
    for (const Form& f : forms) {
        int seed = 0;
        for (const Geometry& g : frames) {
            SCOPED_TRACE(testing::Message() << f.name << " " << g);
            ASSERT_NO_FATAL_FAILURE(run_copy(f, level, g, ++seed));
            if (f.kind == kConst) continue;
            const bool equal = !f.inPlace || seed % 2;
            ASSERT_NO_FATAL_FAILURE(run_in_place(f, level, g, seed, equal));
        }
    }
}

// ---- argument checks -------------------------------------------------------

// A valid call is src 4x3 into 7x6 at top 1, left 2. Rows in the order of
// the checks; each row breaks its own rule and, where it can, a later one
// as well, so that the status shows which test came first.
struct BadCase {
    const char* what;
    bool nullSrc, nullDst;
    int32_t srcStep, dstStep;  // 64: the image's own step
    ZoriSize srcRoi, dstRoi;
    int32_t top, left;
    ZorStatus expect;
};

inline std::vector<BadCase> bad_cases() {
    const ZoriSize s{4, 3}, d{7, 6};
    return {
        {"null source", true, false, 0, 0, {0, 0}, d, -1, 2, zorStsNullPtrErr},
        {"null destination", false, true, 0, 0, {0, 0}, d, -1, 2, zorStsNullPtrErr},
        {"source step 0", false, false, 0, 64, {0, 3}, d, -1, 2, zorStsStepErr},
        {"destination step -1", false, false, 64, -1, {0, 3}, d, -1, 2, zorStsStepErr},
        {"source width 0", false, false, 64, 64, {0, 3}, d, 1, 2, zorStsSizeErr},
        {"destination height -2", false, false, 64, 64, s, {7, -2}, 0, 0, zorStsSizeErr},
        {"top -1", false, false, 64, 64, s, d, -1, 2, zorStsSizeErr},
        {"left -1", false, false, 64, 64, s, d, 1, -1, zorStsSizeErr},
        {"width one short", false, false, 64, 64, s, {5, 6}, 1, 2, zorStsSizeErr},
        {"height one short", false, false, 64, 64, s, {7, 3}, 1, 2, zorStsSizeErr},
        {"left past int range", false, false, 64, 64, s, d, 1, INT_MAX, zorStsSizeErr},
        {"top past int range", false, false, 64, 64, s, d, INT_MAX - 1, 2, zorStsSizeErr},
    };
}

// Every row on the copying form and the in-place one, then the equal
// pointers: nothing written on any of them.
inline void run_checks(const Form& f, int level) {
    const size_t P = f.pixel();
    Img src = random_image(8, 8, P, 7), dst = random_image(8, 8, P, 9);
    const Img srcBefore = src, dstBefore = dst;
    const std::vector<uint8_t> value = const_value(P);
    std::vector<zortest::CheckRow> rows;
    for (const BadCase& c : bad_cases()) {
        const Args a{c.nullSrc ? nullptr : src.ptr(), c.srcStep == 64 ? src.step : c.srcStep,
                     c.srcRoi, c.nullDst ? nullptr : dst.ptr(), c.dstStep == 64 ? dst.step : c.dstStep,
                     c.dstRoi, c.top, c.left, value.data()};
        rows.push_back({c.expect, c.what, [&f, level, a] { return f.copy(level, a); }});
        // One pointer and one step in place: a bad source step alone has no
        // counterpart there.
        if (f.inPlace && !(c.srcStep != 64 && c.dstStep == 64))
            rows.push_back({c.expect, c.what, [&f, level, a, &dst] {
                                return f.inPlace(level, a.src && a.dst ? dst.bytes(2 * (int)f.pixel(), 2) : nullptr,
                                                 a.dstStep, a.srcRoi, a.dstRoi, a.top, a.left);
                            }});
    }
    const Args nullValue{src.ptr(), src.step, {4, 3}, dst.ptr(), dst.step, {7, 6}, 1, 2, nullptr};
    if (f.kind == kConst && f.channels > 1)
        rows.push_back({zorStsNullPtrErr, "null value", [&f, level, nullValue] {
                            return f.copy(level, nullValue);
                        }});
    // Equal pointers: Replicate and Mirror go in place and test only the
    // destination step; Const has no such branch and tests the source step.
    uint8_t* p = dst.bytes(2 * (int)P, 2);
    const Args equal{p, 0, {1, 1}, p, f.kind == kConst ? dst.step : -3, {3, 3}, 1, 1, value.data()};
    rows.push_back({zorStsStepErr, "equal pointers, bad step", [&f, level, equal] {
                        return f.copy(level, equal);
                    }});
    SCOPED_TRACE(f.name);
    zortest::run_checks(rows, [&] {
        return zortest::same_bytes(src, srcBefore) && zortest::same_bytes(dst, dstBefore);
    });
}

}  // namespace bordertest

#endif
