// Replicated frame: each source row is extended by its first and last
// pixel, and the rows above and below repeat the extended first and last
// rows. One body per pixel size; 16u runs the 16s form and 32f the 32s
// form. Equal source and destination pointers mean an in-place frame.
#include "variant.h"

#include "border_rows.h"

ZOR_BEGIN
namespace {

using namespace border;

template <int P>
void repl_body(const Frame& f) {
    const size_t rowBytes = (size_t)f.dstW * P;
    const size_t leftBytes = (size_t)f.left * P, srcBytes = (size_t)f.srcW * P;
    for (int32_t y = 0; y < f.srcH; ++y) {
        uint8_t* d = dst_row(f, f.top + y);
        const uint8_t* s = src_row(f, y);
        // Narrow frames down a tall image touch one line per row, which the
        // hardware does not fetch ahead.
        if (y + 8 < f.srcH) __builtin_prefetch(src_row(f, y + 8));
        if (!f.inPlace) copy_bytes(d + leftBytes, s, srcBytes);
        fill_pixel<P>(d, f.left, s);
        fill_pixel<P>(d + leftBytes + srcBytes, f.right, s + srcBytes - P);
        // The rows above while the extended first row is still in cache.
        if (y == 0)
            for (int32_t r = 0; r < f.top; ++r) copy_bytes(dst_row(f, r), d, rowBytes);
    }
    const uint8_t* last = dst_row(f, f.top + f.srcH - 1);
    for (int32_t r = f.top + f.srcH; r < f.dstH; ++r) copy_bytes(dst_row(f, r), last, rowBytes);
}

template <int P>
ZorStatus repl_inplace(void* pSrcDst, int32_t step, ZoriSize srcRoi, ZoriSize dstRoi, int32_t top,
                       int32_t left) {
    const ZorStatus status = check_inplace(pSrcDst, step, srcRoi, dstRoi, top, left);
    if (status != zorStsNoErr) return status;
    repl_body<P>(frame_inplace(pSrcDst, step, srcRoi, dstRoi, top, left, P));
    return zorStsNoErr;
}

// The equal-pointer case is dispatched by the caller, which knows the
// in-place entry of its type.
template <int P>
ZorStatus repl_copy(const void* pSrc, int32_t srcStep, ZoriSize srcRoi, void* pDst, int32_t dstStep,
                    ZoriSize dstRoi, int32_t top, int32_t left) {
    const ZorStatus status = check_copy(pSrc, srcStep, srcRoi, pDst, dstStep, dstRoi, top, left);
    if (status != zorStsNoErr) return status;
    repl_body<P>(frame_copy(pSrc, srcStep, srcRoi, pDst, dstStep, dstRoi, top, left));
    return zorStsNoErr;
}

}  // namespace
ZOR_END

#define REPL_ARGS(T)                                                                \
    (const T* pSrc, int32_t srcStep, ZoriSize srcRoiSize, T* pDst, int32_t dstStep, \
     ZoriSize dstRoiSize, int32_t topBorderHeight, int32_t leftBorderWidth)
#define REPL_IARGS(T)                                                           \
    (T * pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize, ZoriSize dstRoiSize, \
     int32_t topBorderHeight, int32_t leftBorderWidth)

#define REPL_FORMS(LINK, T, tname, C)                                                           \
    ZOR_INTERNAL ZorStatus ZOR_NAME(zoriCopyReplicateBorder_##tname##_C##C##IR) REPL_IARGS(T) { \
        return ZOR_NS::repl_inplace<C * sizeof(T)>(pSrcDst, srcDstStep, srcRoiSize, dstRoiSize, \
                                                   topBorderHeight, leftBorderWidth);           \
    }                                                                                           \
    LINK ZorStatus ZOR_NAME(zoriCopyReplicateBorder_##tname##_C##C##R) REPL_ARGS(T) {           \
        if (pSrc == pDst)                                                                       \
            return ZOR_NAME(zoriCopyReplicateBorder_##tname##_C##C##IR)(                        \
                pDst, dstStep, srcRoiSize, dstRoiSize, topBorderHeight, leftBorderWidth);       \
        return ZOR_NS::repl_copy<C * sizeof(T)>(pSrc, srcStep, srcRoiSize, pDst, dstStep,       \
                                                dstRoiSize, topBorderHeight, leftBorderWidth);  \
    }

REPL_FORMS(ZOR_ENTRY, Zor8u, 8u, 1)
REPL_FORMS(ZOR_INTERNAL, Zor8u, 8u, 3)
REPL_FORMS(ZOR_INTERNAL, Zor8u, 8u, 4)
REPL_FORMS(ZOR_INTERNAL, Zor16s, 16s, 1)
REPL_FORMS(ZOR_INTERNAL, Zor16s, 16s, 3)
REPL_FORMS(ZOR_INTERNAL, Zor16s, 16s, 4)
REPL_FORMS(ZOR_INTERNAL, Zor32s, 32s, 1)
REPL_FORMS(ZOR_INTERNAL, Zor32s, 32s, 3)
REPL_FORMS(ZOR_INTERNAL, Zor32s, 32s, 4)

// Forms that share a body of the same element width.
#define REPL_SHARED(LINK, T, tname, C, U, uname)                                                 \
    LINK ZorStatus ZOR_NAME(zoriCopyReplicateBorder_##tname##_C##C##R) REPL_ARGS(T) {            \
        return ZOR_NAME(zoriCopyReplicateBorder_##uname##_C##C##R)(                              \
            (const U*)pSrc, srcStep, srcRoiSize, (U*)pDst, dstStep, dstRoiSize, topBorderHeight, \
            leftBorderWidth);                                                                    \
    }

REPL_SHARED(ZOR_ENTRY, Zor16u, 16u, 1, Zor16s, 16s)
REPL_SHARED(ZOR_ENTRY, Zor32f, 32f, 1, Zor32s, 32s)
REPL_SHARED(ZOR_INTERNAL, Zor32f, 32f, 3, Zor32s, 32s)
REPL_SHARED(ZOR_INTERNAL, Zor32f, 32f, 4, Zor32s, 32s)
