// Lanczos resize: windowed-sinc weights from a sampled table, made once at
// Init; two lobes run on the cubic passes, three on the general window.
#include "resize_spec.h"

ZOR_BEGIN

namespace {

ZorStatus lanczos_init(ZoriSize src, ZoriSize dst, Zor32u lobes, ZoriResizeSpec* pSpec,
                       Zor8u* pInitBuf) {
    (void)src, (void)dst, (void)lobes, (void)pSpec, (void)pInitBuf;
    return zorStsNotSupportedModeErr;  // TODO(init)
}

template <typename T>
ZorStatus lanczos(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep, ZoriPoint dstOffset,
                  ZoriSize dstSize, int32_t border, const ZoriResizeSpec* pSpec, Zor8u* pBuffer) {
    if (!resize_border_ok(border)) return zorStsBorderErr;
    ResizeJob k;
    const ZorStatus st = resize_check(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, pSpec,
                                      pBuffer, sizeof(T) == 4, kInterLanczos, &k.s);
    if (st != zorStsNoErr) return st;
    resize_tile(k.s, dstOffset, dstSize, pBuffer, &k.t);
    k.st = resize_strips(k.s, k.t, border);
    if (k.s->lobes == 2)
        resize_four_taps(k, pSrc, srcStep, pDst, dstStep);
    else
        resize_window(k, pSrc, srcStep, pDst, dstStep, 1);
    return tile_status(k.t, zorStsNoErr);
}

}  // namespace

ZOR_END

using namespace ZOR_NS;

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLanczosInit_8u)(ZoriSize srcSize, ZoriSize dstSize,
                                                       Zor32u lobes, ZoriResizeSpec* pSpec,
                                                       Zor8u* pInitBuf) {
    return lanczos_init(srcSize, dstSize, lobes, pSpec, pInitBuf);
}
ZOR_SECOND_NAME(zoriResizeLanczosInit_32f, zoriResizeLanczosInit_8u)

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLanczos_8u_C1R)(const Zor8u* pSrc, int32_t srcStep,
                                                       Zor8u* pDst, int32_t dstStep,
                                                       ZoriPoint dstOffset, ZoriSize dstSize,
                                                       ZoriBorderType border, const Zor8u*,
                                                       const ZoriResizeSpec* pSpec,
                                                       Zor8u* pBuffer) {
    return lanczos(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                   pBuffer);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLanczos_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                        Zor32f* pDst, int32_t dstStep,
                                                        ZoriPoint dstOffset, ZoriSize dstSize,
                                                        ZoriBorderType border, const Zor32f*,
                                                        const ZoriResizeSpec* pSpec,
                                                        Zor8u* pBuffer) {
    return lanczos(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                   pBuffer);
}
