// Mirrored frame: reflection about the edge pixel, which is not repeated.
// A border shorter than the image on its axis is a plain reflection. A
// border as long as the image or longer reflects back and forth: the
// source index runs as a triangular wave of period 2n-2 away from the
// image, whose starting point at the outer edge takes the one division of
// the axis; a one-pixel axis has no period and simply repeats its pixel.
// One body per pixel size; 16s runs the 16u form and 32f the 32s form.
#include "variant.h"

#include "border_rows.h"

ZOR_BEGIN
namespace {

using namespace border;

// Source index along one axis of n pixels for a border b >= n, walked from
// the border's outer edge towards the image. The reflection holds at every
// distance: distance d from the image reads tri(d), tri(k) being k modulo
// 2n-2 folded back into 0..n-1, so the pixels next to the image are 1, 2,
// .. whatever the border's length. The walk starts at tri(b) and each step
// takes the distance down by one. Right and bottom borders walk the mirror
// image (index n-1-idx).
struct Wave {
    int32_t idx, dir;
};

inline Wave wave_start(int32_t b, int32_t n) {
    Wave w;
    if (n == 1) {
        w.idx = 0;
        w.dir = 0;
        return w;
    }
    const int64_t period = 2 * (int64_t)n - 2;
    const int64_t m = b % period;
    // On the rising half of the wave a falling distance lowers the index;
    // on the folded half it raises it.
    if (m < n) {
        w.idx = (int32_t)m;
        w.dir = -1;
    } else {
        w.idx = (int32_t)(period - m);
        w.dir = 1;
    }
    return w;
}

inline void wave_step(Wave& w, int32_t n) {
    const int32_t next = w.idx + w.dir;
    if (next < 0 || next > n - 1) w.dir = -w.dir;
    w.idx += w.dir;
}

inline void put(uint8_t* d, const uint8_t* s, size_t P) { memcpy(d, s, P); }

// Both sides of one extended row; d is the frame row, s the source row.
template <int P>
void mirror_sides(const Frame& f, uint8_t* d, const uint8_t* s, Wave wl, Wave wr) {
    const int32_t n = f.srcW;
    if (f.left < n) {
        for (int32_t t = 0; t < f.left; ++t)
            put(d + (size_t)t * P, s + (size_t)(f.left - t) * P, P);
    } else {
        for (int32_t t = 0; t < f.left; ++t, wave_step(wl, n))
            put(d + (size_t)t * P, s + (size_t)wl.idx * P, P);
    }
    uint8_t* r = d + ((size_t)f.left + n) * P;
    if (f.right < n) {
        for (int32_t j = 0; j < f.right; ++j)
            put(r + (size_t)j * P, s + (size_t)(n - 2 - j) * P, P);
    } else {
        for (int32_t t = 0; t < f.right; ++t, wave_step(wr, n))
            put(r + (size_t)(f.right - 1 - t) * P, s + (size_t)(n - 1 - wr.idx) * P, P);
    }
}

template <int P>
void mirror_body(const Frame& f) {
    const size_t rowBytes = (size_t)f.dstW * P;
    const size_t leftBytes = (size_t)f.left * P, srcBytes = (size_t)f.srcW * P;
    // Wave starts are the same for every row: one division per axis and call.
    const Wave wl = f.left < f.srcW ? Wave{0, 0} : wave_start(f.left, f.srcW);
    const Wave wr = f.right < f.srcW ? Wave{0, 0} : wave_start(f.right, f.srcW);
    for (int32_t y = 0; y < f.srcH; ++y) {
        uint8_t* d = dst_row(f, f.top + y);
        const uint8_t* s = src_row(f, y);
        if (!f.inPlace) copy_bytes(d + leftBytes, s, srcBytes);
        mirror_sides<P>(f, d, s, wl, wr);
    }
    // Rows above and below copy whole extended rows of the frame.
    const int32_t n = f.srcH;
    auto row = [&](int32_t y) { return dst_row(f, f.top + y); };
    if (f.top < n) {
        for (int32_t t = 0; t < f.top; ++t) copy_bytes(dst_row(f, t), row(f.top - t), rowBytes);
    } else {
        Wave w = wave_start(f.top, n);
        for (int32_t t = 0; t < f.top; ++t, wave_step(w, n))
            copy_bytes(dst_row(f, t), row(w.idx), rowBytes);
    }
    const int32_t below = f.top + n;
    if (f.bottom < n) {
        for (int32_t j = 0; j < f.bottom; ++j)
            copy_bytes(dst_row(f, below + j), row(n - 2 - j), rowBytes);
    } else {
        Wave w = wave_start(f.bottom, n);
        for (int32_t t = 0; t < f.bottom; ++t, wave_step(w, n))
            copy_bytes(dst_row(f, below + f.bottom - 1 - t), row(n - 1 - w.idx), rowBytes);
    }
}

template <int P>
ZorStatus mirror_inplace(void* pSrcDst, int32_t step, ZoriSize srcRoi, ZoriSize dstRoi, int32_t top,
                         int32_t left) {
    const ZorStatus status = check_inplace(pSrcDst, step, srcRoi, dstRoi, top, left);
    if (status != zorStsNoErr) return status;
    mirror_body<P>(frame_inplace(pSrcDst, step, srcRoi, dstRoi, top, left, P));
    return zorStsNoErr;
}

template <int P>
ZorStatus mirror_copy(const void* pSrc, int32_t srcStep, ZoriSize srcRoi, void* pDst,
                      int32_t dstStep, ZoriSize dstRoi, int32_t top, int32_t left) {
    const ZorStatus status = check_copy(pSrc, srcStep, srcRoi, pDst, dstStep, dstRoi, top, left);
    if (status != zorStsNoErr) return status;
    mirror_body<P>(frame_copy(pSrc, srcStep, srcRoi, pDst, dstStep, dstRoi, top, left));
    return zorStsNoErr;
}

}  // namespace
ZOR_END

#define MIRROR_ARGS(T)                                                              \
    (const T* pSrc, int32_t srcStep, ZoriSize srcRoiSize, T* pDst, int32_t dstStep, \
     ZoriSize dstRoiSize, int32_t topBorderHeight, int32_t leftBorderWidth)
#define MIRROR_IARGS(T)                                                         \
    (T * pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize, ZoriSize dstRoiSize, \
     int32_t topBorderHeight, int32_t leftBorderWidth)

#define MIRROR_FORMS(T, tname, C)                                                                 \
    ZOR_INTERNAL ZorStatus ZOR_NAME(zoriCopyMirrorBorder_##tname##_C##C##IR) MIRROR_IARGS(T) {    \
        return ZOR_NS::mirror_inplace<C * sizeof(T)>(pSrcDst, srcDstStep, srcRoiSize, dstRoiSize, \
                                                     topBorderHeight, leftBorderWidth);           \
    }                                                                                             \
    ZOR_INTERNAL ZorStatus ZOR_NAME(zoriCopyMirrorBorder_##tname##_C##C##R) MIRROR_ARGS(T) {      \
        if (pSrc == pDst)                                                                         \
            return ZOR_NAME(zoriCopyMirrorBorder_##tname##_C##C##IR)(                             \
                pDst, dstStep, srcRoiSize, dstRoiSize, topBorderHeight, leftBorderWidth);         \
        return ZOR_NS::mirror_copy<C * sizeof(T)>(pSrc, srcStep, srcRoiSize, pDst, dstStep,       \
                                                  dstRoiSize, topBorderHeight, leftBorderWidth);  \
    }

MIRROR_FORMS(Zor8u, 8u, 1)
MIRROR_FORMS(Zor8u, 8u, 3)
MIRROR_FORMS(Zor8u, 8u, 4)
MIRROR_FORMS(Zor16u, 16u, 1)
MIRROR_FORMS(Zor16u, 16u, 3)
MIRROR_FORMS(Zor16u, 16u, 4)
MIRROR_FORMS(Zor32s, 32s, 1)
MIRROR_FORMS(Zor32s, 32s, 3)
MIRROR_FORMS(Zor32s, 32s, 4)

#define MIRROR_SHARED(T, tname, C, U, uname)                                                     \
    ZOR_INTERNAL ZorStatus ZOR_NAME(zoriCopyMirrorBorder_##tname##_C##C##R) MIRROR_ARGS(T) {     \
        return ZOR_NAME(zoriCopyMirrorBorder_##uname##_C##C##R)(                                 \
            (const U*)pSrc, srcStep, srcRoiSize, (U*)pDst, dstStep, dstRoiSize, topBorderHeight, \
            leftBorderWidth);                                                                    \
    }

MIRROR_SHARED(Zor16s, 16s, 1, Zor16u, 16u)
MIRROR_SHARED(Zor16s, 16s, 3, Zor16u, 16u)
MIRROR_SHARED(Zor16s, 16s, 4, Zor16u, 16u)
MIRROR_SHARED(Zor32f, 32f, 1, Zor32s, 32s)
MIRROR_SHARED(Zor32f, 32f, 3, Zor32s, 32s)
MIRROR_SHARED(Zor32f, 32f, 4, Zor32s, 32s)
