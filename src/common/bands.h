// The band cutter of every operation whose kernel reads a window around
// each output pixel. The ROI is cut into up to five rectangles: thin bands
// at the sides that need made-up pixels (top, bottom, left, right), each run
// over a small temporary that a border copy has framed, and the centre, run
// straight on the caller's image. A ROI not larger than the window is framed
// whole. So no kernel ever tests a coordinate.
#ifndef ZOR_BANDS_H
#define ZOR_BANDS_H

#include <stddef.h>
#include <stdint.h>

#include "border_type.h"
#include "simd.h"
#include "variant.h"

ZOR_BEGIN
namespace bands {

// How many pixels the window reaches beyond its output pixel on each side.
struct Reach {
    int32_t left, right, up, down;
};

// The copies of one element type: plain, and the frame builders of the
// three kinds (this level's bodies).
template <typename T> struct Copies {
    ZorStatus (*plain)(const T*, int32_t, T*, int32_t, ZoriSize);
    ZorStatus (*replicate)(const T*, int32_t, ZoriSize, T*, int32_t, ZoriSize, int32_t, int32_t);
    ZorStatus (*mirror)(const T*, int32_t, ZoriSize, T*, int32_t, ZoriSize, int32_t, int32_t);
    ZorStatus (*constant)(const T*, int32_t, ZoriSize, T*, int32_t, ZoriSize, int32_t, int32_t, T);
};

template <typename T> Copies<T> copies();
#define ZOR_BAND_COPIES(t)                                                             \
    template <> inline Copies<Zor##t> copies<Zor##t>() {                               \
        return {ZOR_NAME(zoriCopy_##t##_C1R), ZOR_NAME(zoriCopyReplicateBorder_##t##_C1R), \
                ZOR_NAME(zoriCopyMirrorBorder_##t##_C1R),                              \
                ZOR_NAME(zoriCopyConstBorder_##t##_C1R)};                              \
    }
ZOR_BAND_COPIES(8u)
ZOR_BAND_COPIES(16u)
ZOR_BAND_COPIES(16s)
ZOR_BAND_COPIES(32f)
#undef ZOR_BAND_COPIES

// What the frames are made of: the kind (replicate, mirror or constant),
// the sides whose pixels are in memory, and the constant.
template <typename T> struct Border {
    int32_t kind;
    int32_t inMem;  // zorBorderInMem* flags
    T value;
    Copies<T> copy;
};

// sw x sh source pixels into a temporary of tw x th pixels (rows exactly tw
// pixels apart) at (left, top); the rest is made up by the kind.
template <typename T>
ZorStatus make_frame(const Border<T>& b, const T* src, int32_t srcStep, int32_t sw, int32_t sh,
                     T* tmp, int32_t tw, int32_t th, int32_t top, int32_t left) {
    const int32_t ts = tw * (int32_t)sizeof(T);
    if (b.kind == zorBorderRepl)
        return b.copy.replicate(src, srcStep, {sw, sh}, tmp, ts, {tw, th}, top, left);
    if (b.kind == zorBorderMirror)
        return b.copy.mirror(src, srcStep, {sw, sh}, tmp, ts, {tw, th}, top, left);
    return b.copy.constant(src, srcStep, {sw, sh}, tmp, ts, {tw, th}, top, left, b.value);
}

template <typename T> inline T* at(T* p, ptrdiff_t step, ptrdiff_t dy, ptrdiff_t dx) {
    return row_at(p, step, dy) + dx;
}

// Which part of the ROI a run makes.
enum Part { kTop, kBottom, kLeft, kRight, kCentre, kWhole };

// A mirror reflects about the image's edge pixel, so a band's source must
// hold one pixel more than the frame is wide, or the copy would reflect
// about the band's inner end as well. Where the window reaches nothing on
// the inner side (a 2-wide kernel's left) the band takes one more output.
inline int32_t band_width(int32_t outer, int32_t inner, bool mirror) {
    return mirror && inner == 0 ? outer + 1 : outer;
}

// Calls run(part, s, ss, x, y, w, h) for the outputs x .. x+w-1, y .. y+h-1
// of the W x H ROI, s the source pixel under output (x, y) and ss its row
// step in bytes; every pixel the window reaches from there is readable.
// tmp holds the largest temporary: the whole (W + left + right) x
// (H + up + down) frame when the ROI is not larger than the window, else
// the larger of a top or bottom band of W + left + right pixels by up +
// down + (the band's rows) rows and a side band of left + right + (its
// columns) pixels by H + up + down rows. A failing frame copy stops the
// cut with its status. After the callers' checks only a temporary row too
// long for a 32-bit step can fail, and the full-width bands, which come
// first, have the longest rows: a failure comes before any output.
template <typename T, typename Run>
ZorStatus cut(const T* src, int32_t srcStep, int32_t W, int32_t H, Reach r, const Border<T>& b,
              T* tmp, Run run) {
    // A side the window does not reach counts as in memory.
    int32_t in = b.inMem;
    if (r.left == 0) in |= zorBorderInMemLeft;
    if (r.right == 0) in |= zorBorderInMemRight;
    if (r.up == 0) in |= zorBorderInMemTop;
    if (r.down == 0) in |= zorBorderInMemBottom;
    const bool inT = in & zorBorderInMemTop, inB = in & zorBorderInMemBottom;
    const bool inL = in & zorBorderInMemLeft, inR = in & zorBorderInMemRight;
    if (inT && inB && inL && inR) {
        run(kCentre, src, srcStep, 0, 0, W, H);
        return zorStsNoErr;
    }
    const int32_t kw = r.left + r.right + 1, kh = r.up + r.down + 1, e = (int32_t)sizeof(T);
    const int32_t tw = W + kw - 1;
    ZorStatus st;
    if (W <= kw || H <= kh) {
        // Sides in memory enlarge the copied rectangle instead of being made up.
        const int32_t th = H + kh - 1;
        const int32_t sw = W + (inL ? r.left : 0) + (inR ? r.right : 0);
        const int32_t sh = H + (inT ? r.up : 0) + (inB ? r.down : 0);
        st = make_frame(b, at(src, srcStep, inT ? -r.up : 0, inL ? -r.left : 0), srcStep, sw, sh,
                        tmp, tw, th, inT ? 0 : r.up, inL ? 0 : r.left);
        if (st != zorStsNoErr) return st;
        run(kWhole, at(tmp, (ptrdiff_t)tw * e, r.up, r.left), tw * e, 0, 0, W, H);
        return zorStsNoErr;
    }
    const bool mirror = b.kind == zorBorderMirror;
    const int32_t outT = inT ? 0 : band_width(r.up, r.down, mirror);
    const int32_t outB = inB ? 0 : band_width(r.down, r.up, mirror);
    const int32_t outL = inL ? 0 : band_width(r.left, r.right, mirror);
    const int32_t outR = inR ? 0 : band_width(r.right, r.left, mirror);
    // Top and bottom bands span the full width; their corners come from
    // memory where the left or right side is there, else from the frame.
    const int32_t bandX = inL ? -r.left : 0, bandLeft = inL ? 0 : r.left;
    const int32_t bandW = W + (inL ? r.left : 0) + (inR ? r.right : 0);
    const ptrdiff_t bandStep = (ptrdiff_t)tw * e;
    if (outT) {
        const int32_t rows = outT + r.down;
        st = make_frame(b, at(src, srcStep, 0, bandX), srcStep, bandW, rows, tmp, tw,
                        r.up + rows, r.up, bandLeft);
        if (st != zorStsNoErr) return st;
        run(kTop, at(tmp, bandStep, r.up, r.left), tw * e, 0, 0, W, outT);
    }
    if (outB) {
        const int32_t rows = outB + r.up;
        st = make_frame(b, at(src, srcStep, H - rows, bandX), srcStep, bandW, rows, tmp, tw,
                        rows + r.down, 0, bandLeft);
        if (st != zorStsNoErr) return st;
        run(kBottom, at(tmp, bandStep, r.up, r.left), tw * e, 0, H - outB, W, outB);
    }
    // Left and right bands need no vertical frame: the rows above and below
    // what remains are real, taken off by the bands above or in memory.
    const int32_t y0 = outT, rows = H - outT - outB, th = rows + kh - 1;
    if (outL) {
        const int32_t cols = outL + r.right, sideW = r.left + cols;
        st = make_frame(b, at(src, srcStep, y0 - r.up, 0), srcStep, cols, th, tmp, sideW, th, 0,
                        r.left);
        if (st != zorStsNoErr) return st;
        run(kLeft, at(tmp, (ptrdiff_t)sideW * e, r.up, r.left), sideW * e, 0, y0, outL, rows);
    }
    if (outR) {
        const int32_t cols = outR + r.left, sideW = cols + r.right;
        st = make_frame(b, at(src, srcStep, y0 - r.up, W - cols), srcStep, cols, th, tmp, sideW,
                        th, 0, 0);
        if (st != zorStsNoErr) return st;
        run(kRight, at(tmp, (ptrdiff_t)sideW * e, r.up, r.left), sideW * e, W - outR, y0, outR,
            rows);
    }
    run(kCentre, at(src, srcStep, y0, outL), srcStep, outL, y0, W - outL - outR, rows);
    return zorStsNoErr;
}

}  // namespace bands
ZOR_END

#endif
