// Constant frame: the rows above and below and both sides of each source
// row are filled with the caller's value, the source rows copied between.
// One body per pixel size: 16u runs the 16s form and 32f the 32s form with
// the value's bits, so even a signalling NaN is stored untouched.
#include "variant.h"

#include "border_rows.h"

ZOR_BEGIN
namespace {

using namespace border;

template <int P>
void const_body(const Frame& f, const uint8_t* px) {
    Pattern<P> pat;
    pattern_build<P>(pat, px);
    const size_t rowBytes = (size_t)f.dstW * P;
    const size_t leftBytes = (size_t)f.left * P, srcBytes = (size_t)f.srcW * P;
    const size_t rightBytes = (size_t)f.right * P;
    for (int32_t r = 0; r < f.top; ++r) fill_bytes<P>(dst_row(f, r), rowBytes, pat);
    for (int32_t y = 0; y < f.srcH; ++y) {
        uint8_t* d = dst_row(f, f.top + y);
        fill_bytes<P>(d, leftBytes, pat);
        copy_bytes(d + leftBytes, src_row(f, y), srcBytes);
        fill_bytes<P>(d + leftBytes + srcBytes, rightBytes, pat);
    }
    for (int32_t r = f.top + f.srcH; r < f.dstH; ++r) fill_bytes<P>(dst_row(f, r), rowBytes, pat);
}

// value points to one pixel's worth of bytes.
template <int P>
ZorStatus const_copy(const void* pSrc, int32_t srcStep, ZoriSize srcRoi, void* pDst,
                     int32_t dstStep, ZoriSize dstRoi, int32_t top, int32_t left,
                     const void* value) {
    // The channel values are a pointer like the images: same test, same status.
    if (!value) return zorStsNullPtrErr;
    const ZorStatus status = check_copy(pSrc, srcStep, srcRoi, pDst, dstStep, dstRoi, top, left);
    if (status != zorStsNoErr) return status;
    const_body<P>(frame_copy(pSrc, srcStep, srcRoi, pDst, dstStep, dstRoi, top, left),
                  (const uint8_t*)value);
    return zorStsNoErr;
}

}  // namespace
ZOR_END

#define CONST_ARGS(T, VALUE)                                                        \
    (const T* pSrc, int32_t srcStep, ZoriSize srcRoiSize, T* pDst, int32_t dstStep, \
     ZoriSize dstRoiSize, int32_t topBorderHeight, int32_t leftBorderWidth, VALUE)
#define CONST_PASS \
    pSrc, srcStep, srcRoiSize, pDst, dstStep, dstRoiSize, topBorderHeight, leftBorderWidth

// C1 passes the address of its value: the body reads a pixel's bytes.
#define CONST_C1(LINK, T, tname)                                                        \
    LINK ZorStatus ZOR_NAME(zoriCopyConstBorder_##tname##_C1R) CONST_ARGS(T, T value) { \
        return ZOR_NS::const_copy<sizeof(T)>(CONST_PASS, &value);                       \
    }
#define CONST_CN(T, tname, C)                                              \
    ZOR_INTERNAL ZorStatus ZOR_NAME(zoriCopyConstBorder_##tname##_C##C##R) \
        CONST_ARGS(T, const T value[C]) {                                  \
        return ZOR_NS::const_copy<C * sizeof(T)>(CONST_PASS, value);       \
    }

CONST_C1(ZOR_ENTRY, Zor8u, 8u)
CONST_CN(Zor8u, 8u, 3)
CONST_CN(Zor8u, 8u, 4)
CONST_C1(ZOR_INTERNAL, Zor16s, 16s)
CONST_CN(Zor16s, 16s, 3)
CONST_CN(Zor16s, 16s, 4)
CONST_C1(ZOR_INTERNAL, Zor32s, 32s)
CONST_CN(Zor32s, 32s, 3)
CONST_CN(Zor32s, 32s, 4)

// The forms that run a body of the same element width.
ZOR_ENTRY ZorStatus ZOR_NAME(zoriCopyConstBorder_16u_C1R) CONST_ARGS(Zor16u, Zor16u value) {
    return ZOR_NAME(zoriCopyConstBorder_16s_C1R)((const Zor16s*)pSrc, srcStep, srcRoiSize,
                                                 (Zor16s*)pDst, dstStep, dstRoiSize,
                                                 topBorderHeight, leftBorderWidth, (Zor16s)value);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriCopyConstBorder_32f_C1R) CONST_ARGS(Zor32f, Zor32f value) {
    // Bits, not a conversion: a NaN must not be quieted on the way.
    Zor32s bits;
    memcpy(&bits, &value, sizeof bits);
    return ZOR_NAME(zoriCopyConstBorder_32s_C1R)((const Zor32s*)pSrc, srcStep, srcRoiSize,
                                                 (Zor32s*)pDst, dstStep, dstRoiSize,
                                                 topBorderHeight, leftBorderWidth, bits);
}

#define CONST_32F(C)                                                                      \
    ZOR_INTERNAL ZorStatus ZOR_NAME(zoriCopyConstBorder_32f_C##C##R)                      \
        CONST_ARGS(Zor32f, const Zor32f value[C]) {                                       \
        return ZOR_NAME(zoriCopyConstBorder_32s_C##C##R)(                                 \
            (const Zor32s*)pSrc, srcStep, srcRoiSize, (Zor32s*)pDst, dstStep, dstRoiSize, \
            topBorderHeight, leftBorderWidth, (const Zor32s*)value);                      \
    }

CONST_32F(3)
CONST_32F(4)
