// The band scheme of the rank filters. A window reaches rx columns and ry
// rows to each side of its pixel. The ROI is cut into thin bands at the
// sides that need a frame (top, bottom, left, right), each run over a small
// temporary that the border copies have framed, and a centre read straight
// from the caller's image; a ROI not larger than the window is framed
// whole. So no kernel ever tests a coordinate. Include after variant.h.
#ifndef ZOR_RANK_BANDS_H
#define ZOR_RANK_BANDS_H

#include <stddef.h>
#include <stdint.h>
#include "variant.h"  // first: the level frame the rest stands on
#include "border_type.h"

ZOR_BEGIN
namespace rank {

// The copies of each element type: plain, and the three framing kinds.
template <typename T> struct Copies;
#define RANK_COPIES(t)                                                                          \
    template <> struct Copies<Zor##t> {                                                         \
        typedef Zor##t T;                                                                       \
        static ZorStatus copy(const T* s, int32_t ss, T* d, int32_t ds, ZoriSize r) {           \
            return ZOR_NAME(zoriCopy_##t##_C1R)(s, ss, d, ds, r);                               \
        }                                                                                       \
        static ZorStatus repl(const T* s, int32_t ss, ZoriSize sr, T* d, int32_t ds, ZoriSize dr,    \
                         int32_t top, int32_t left) {                                           \
            return ZOR_NAME(zoriCopyReplicateBorder_##t##_C1R)(s, ss, sr, d, ds, dr, top, left);       \
        }                                                                                       \
        static ZorStatus mirr(const T* s, int32_t ss, ZoriSize sr, T* d, int32_t ds, ZoriSize dr,    \
                         int32_t top, int32_t left) {                                           \
            return ZOR_NAME(zoriCopyMirrorBorder_##t##_C1R)(s, ss, sr, d, ds, dr, top, left);          \
        }                                                                                       \
        static ZorStatus cnst(const T* s, int32_t ss, ZoriSize sr, T* d, int32_t ds, ZoriSize dr,    \
                         int32_t top, int32_t left, T v) {                                      \
            return ZOR_NAME(zoriCopyConstBorder_##t##_C1R)(s, ss, sr, d, ds, dr, top, left, v);        \
        }                                                                                       \
    };
RANK_COPIES(8u)
RANK_COPIES(16u)
RANK_COPIES(16s)
RANK_COPIES(32f)
#undef RANK_COPIES

template <typename T> inline const T* at(const T* p, ptrdiff_t step, ptrdiff_t dy, ptrdiff_t dx) {
    return (const T*)((const uint8_t*)p + dy * step) + dx;
}
template <typename T> inline T* at(T* p, ptrdiff_t step, ptrdiff_t dy, ptrdiff_t dx) {
    return (T*)((uint8_t*)p + dy * step) + dx;
}

// Copies sw x sh source pixels into a temporary of tw x th pixels (row step
// tw elements) at (left, top); the rest is made up by the border kind.
// The copies refuse a source they cannot frame (a step of 0).
template <typename T>
ZorStatus make_frame(int32_t kind, T value, const T* src, int32_t srcStep, int32_t sw, int32_t sh,
                T* tmp, int32_t tw, int32_t th, int32_t top, int32_t left) {
    const int32_t ts = tw * (int32_t)sizeof(T);
    if (kind == zorBorderRepl)
        return Copies<T>::repl(src, srcStep, {sw, sh}, tmp, ts, {tw, th}, top, left);
    if (kind == zorBorderMirror)
        return Copies<T>::mirr(src, srcStep, {sw, sh}, tmp, ts, {tw, th}, top, left);
    return Copies<T>::cnst(src, srcStep, {sw, sh}, tmp, ts, {tw, th}, top, left, value);
}

// Which part of the ROI a run makes: a band, the centre, or the whole ROI
// from one frame.
enum Part { kTop, kBottom, kLeft, kRight, kCentre, kWhole };

// Calls run(part, s, ss, x, y, w, h) for the outputs x .. x+w-1, y .. y+h-1
// of the ROI, with s the source pixel under output (x, y) and ss its row
// step in bytes; all neighbours within the reach are readable from s.
// flags are the in-memory sides; a side the window does not reach counts
// as one. tmp holds the largest temporary. A frame that fails stops the
// cut with its status.
template <typename T, typename Run>
ZorStatus cut_bands(const T* src, int32_t srcStep, int32_t W, int32_t H, int32_t rx, int32_t ry,
               int32_t flags, int32_t kind, T value, T* tmp, Run run) {
    if (rx == 0) flags |= zorBorderInMemLeft | zorBorderInMemRight;
    if (ry == 0) flags |= zorBorderInMemTop | zorBorderInMemBottom;
    const bool inT = flags & zorBorderInMemTop, inB = flags & zorBorderInMemBottom;
    const bool inL = flags & zorBorderInMemLeft, inR = flags & zorBorderInMemRight;
    if (inT && inB && inL && inR) {
        run(kCentre, src, srcStep, 0, 0, W, H);
        return zorStsNoErr;
    }
    const int32_t kw = 2 * rx + 1, kh = 2 * ry + 1, e = (int32_t)sizeof(T);
    ZorStatus st;
    if (W <= kw || H <= kh) {
        // Sides in memory enlarge the copied rectangle instead of being made up.
        const int32_t tw = W + kw - 1, th = H + kh - 1;
        const int32_t sw = W + (inL ? rx : 0) + (inR ? rx : 0);
        const int32_t sh = H + (inT ? ry : 0) + (inB ? ry : 0);
        st = make_frame(kind, value, at(src, srcStep, inT ? -ry : 0, inL ? -rx : 0), srcStep, sw,
                        sh, tmp, tw, th, inT ? 0 : ry, inL ? 0 : rx);
        if (st != zorStsNoErr) return st;
        run(kWhole, at(tmp, (ptrdiff_t)tw * e, ry, rx), tw * e, 0, 0, W, H);
        return zorStsNoErr;
    }
    // Top and bottom bands span the full width; their corners come from
    // memory where the left or right side is there, else from the frame.
    int32_t y0 = 0, rows = H, x0 = 0, cols = W;
    const int32_t bandX = inL ? -rx : 0, bandLeft = inL ? 0 : rx;
    const int32_t bandW = W + (inL ? rx : 0) + (inR ? rx : 0), bandTw = W + kw - 1;
    if (!inT) {
        st = make_frame(kind, value, at(src, srcStep, 0, bandX), srcStep, bandW, kh - 1, tmp,
                        bandTw, ry + kh - 1, ry, bandLeft);
        if (st != zorStsNoErr) return st;
        run(kTop, at(tmp, (ptrdiff_t)bandTw * e, ry, rx), bandTw * e, 0, 0, W, ry);
        y0 = ry;
        rows -= ry;
    }
    if (!inB) {
        st = make_frame(kind, value, at(src, srcStep, H - kh + 1, bandX), srcStep, bandW, kh - 1,
                        tmp, bandTw, kh - 1 + ry, 0, bandLeft);
        if (st != zorStsNoErr) return st;
        run(kBottom, at(tmp, (ptrdiff_t)bandTw * e, ry, rx), bandTw * e, 0, H - ry, W, ry);
        rows -= ry;
    }
    // Left and right bands need no vertical frame: the rows above and below
    // what remains are real, taken off by the bands above or in memory.
    const int32_t th = rows + kh - 1, tw = kw - 1 + rx;
    if (!inL) {
        st = make_frame(kind, value, at(src, srcStep, y0 - ry, 0), srcStep, kw - 1, th, tmp, tw,
                        th, 0, rx);
        if (st != zorStsNoErr) return st;
        run(kLeft, at(tmp, (ptrdiff_t)tw * e, ry, rx), tw * e, 0, y0, rx, rows);
        x0 = rx;
        cols -= rx;
    }
    if (!inR) {
        st = make_frame(kind, value, at(src, srcStep, y0 - ry, W - kw + 1), srcStep, kw - 1, th,
                        tmp, tw, th, 0, 0);
        if (st != zorStsNoErr) return st;
        run(kRight, at(tmp, (ptrdiff_t)tw * e, ry, rx), tw * e, W - rx, y0, rx, rows);
        cols -= rx;
    }
    run(kCentre, at(src, srcStep, y0, x0), srcStep, x0, y0, cols, rows);
    return zorStsNoErr;
}

}  // namespace rank
ZOR_END

#endif
