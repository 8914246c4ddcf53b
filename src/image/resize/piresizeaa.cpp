// Antialiasing resize: linear, cubic or Lanczos kernels stretched by the
// reduction factor along a shrinking axis, one normalised window of float
// weights per destination position, run on the general window.
#include "resize_spec.h"

ZOR_BEGIN

namespace {

enum AaKernel { kAaLinear, kAaCubic, kAaLanczos };

ZorStatus aa_init(ZoriSize src, ZoriSize dst, AaKernel kernel, float B, float C, Zor32u lobes,
                  ZoriResizeSpec* pSpec, Zor8u* pInitBuf) {
    (void)src, (void)dst, (void)kernel, (void)B, (void)C, (void)lobes, (void)pSpec,
        (void)pInitBuf;
    return zorStsNotSupportedModeErr;  // TODO(init)
}

template <typename T>
ZorStatus antialiasing(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep,
                       ZoriPoint dstOffset, ZoriSize dstSize, int32_t border,
                       const ZoriResizeSpec* pSpec, Zor8u* pBuffer, int32_t channels) {
    if (!resize_border_ok(border)) return zorStsBorderErr;
    ResizeJob k;
    const ZorStatus st = resize_check(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, pSpec,
                                      pBuffer, sizeof(T) == 4, kAntialiasingOp, &k.s);
    if (st != zorStsNoErr) return st;
    resize_tile(k.s, dstOffset, dstSize, pBuffer, &k.t);
    k.st = resize_strips(k.s, k.t, border);
    resize_window(k, pSrc, srcStep, pDst, dstStep, channels);
    return tile_status(k.t, zorStsNoErr);
}

}  // namespace

ZOR_END

using namespace ZOR_NS;

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasingLinearInit)(ZoriSize srcSize, ZoriSize dstSize,
                                                               ZoriResizeSpec* pSpec,
                                                               Zor8u* pInitBuf) {
    return aa_init(srcSize, dstSize, kAaLinear, 0, 0, 0, pSpec, pInitBuf);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasingCubicInit)(ZoriSize srcSize, ZoriSize dstSize,
                                                              Zor32f cubicB, Zor32f cubicC,
                                                              ZoriResizeSpec* pSpec,
                                                              Zor8u* pInitBuf) {
    return aa_init(srcSize, dstSize, kAaCubic, cubicB, cubicC, 0, pSpec, pInitBuf);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasingLanczosInit)(ZoriSize srcSize,
                                                                ZoriSize dstSize, Zor32u lobes,
                                                                ZoriResizeSpec* pSpec,
                                                                Zor8u* pInitBuf) {
    return aa_init(srcSize, dstSize, kAaLanczos, 0, 0, lobes, pSpec, pInitBuf);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasing_8u_C1R)(const Zor8u* pSrc, int32_t srcStep,
                                                            Zor8u* pDst, int32_t dstStep,
                                                            ZoriPoint dstOffset, ZoriSize dstSize,
                                                            ZoriBorderType border, const Zor8u*,
                                                            const ZoriResizeSpec* pSpec,
                                                            Zor8u* pBuffer) {
    return antialiasing(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                        pBuffer, 1);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasing_8u_C3R)(const Zor8u* pSrc, int32_t srcStep,
                                                            Zor8u* pDst, int32_t dstStep,
                                                            ZoriPoint dstOffset, ZoriSize dstSize,
                                                            ZoriBorderType border, const Zor8u*,
                                                            const ZoriResizeSpec* pSpec,
                                                            Zor8u* pBuffer) {
    return antialiasing(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                        pBuffer, 3);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasing_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                             Zor32f* pDst, int32_t dstStep,
                                                             ZoriPoint dstOffset,
                                                             ZoriSize dstSize,
                                                             ZoriBorderType border, const Zor32f*,
                                                             const ZoriResizeSpec* pSpec,
                                                             Zor8u* pBuffer) {
    return antialiasing(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                        pBuffer, 1);
}
