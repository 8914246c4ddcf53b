/* zor: erosion and dilation with border.
 *
 * Each destination pixel is the minimum (erode) or the maximum (dilate) of
 * the source pixels under a binary mask of maskSize.width by
 * maskSize.height cells, given row by row; any non-zero byte is a set cell.
 * The mask is used turned by 180 degrees about its anchor
 * (maskSize.width / 2, maskSize.height / 2): with w and h the mask sides
 * made odd (w | 1, h | 1) and a caller's cell (i, j) set,
 *     dst(x, y) = min or max of src(x + w - 1 - i - w / 2, y + h - 1 - j - h / 2).
 * An even side is thus extended by an empty row or column behind the
 * caller's last one. An empty mask, or one of 1 by 1, copies the source.
 *
 * Calling order: zoriMorphologyBorderGetSize_* for the largest ROI and the
 * mask, allocate both sizes, zoriMorphologyBorderInit_* once, then any
 * number of erosions and dilations. The four element types share one
 * record layout, so a record made by any Init serves every type. The
 * record holds pointers into itself: it can't be moved or copied byte for
 * byte. It is read only during a call, so threads may share one as long as
 * each has its own buffer. pBuffer is scratch, nothing is kept in it; a
 * call with a larger ROI than the buffer was sized for overruns it, which
 * nothing checks (except for an empty or 1 by 1 mask, which never touches
 * it).
 *
 * borderType: pixels outside the ROI come from
 *   - zorBorderRepl (1): the nearest ROI pixel;
 *   - zorBorderMirror (3): the reflection about the edge pixel;
 *   - zorBorderDefault (5): a constant that can never decide a result
 *     (erode: the type's largest value, 255, 65535, 32767 or
 *     3.4028235e38; dilate: its smallest, 0, 0, -32768 or -3.4028235e38);
 *   - zorBorderConst (6): borderValue, which no other kind reads;
 *   - flags zorBorderInMemTop/Bottom/Left/Right (16/32/64/128) with any of
 *     these kinds: that side's pixels exist in memory and are read, as far
 *     as the mask reaches; 240 alone means all four sides.
 * The 8u forms also take the four flags one place higher, in bits 8 to 11
 * (0x100 top .. 0x800 right); the other types accept such bits and ignore
 * them.
 *
 * Floats are compared as the processor's min and max instructions do, the
 * running result first: a NaN is not propagated reliably, and the general
 * mask path (any mask but a full rectangle) starts from the largest finite
 * value, so an infinity comes out as +-3.4028235e38 there. Which of +0
 * and -0 (or which NaN) comes out depends on the mask's class and the
 * order of its comparisons, never on the processor level: every level
 * gives the same bits. */
#ifndef ZORIMORPH_H
#define ZORIMORPH_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Opaque record made by zoriMorphologyBorderInit_*. */
typedef struct ZoriMorphState ZoriMorphState;

/* Sizes in bytes of the record and of the work buffer for a ROI and mask.
 * With w = maskSize.width | 1, h = maskSize.height | 1:
 *   *pSpecSize = h * ((w + 1) * 2 + w) + 136 + (w + 1) * h * 2;
 * *pBufferSize covers the frames of the ROI's edges and a ring of h rows
 * of the ROI's width. Checks, in this order:
 *   zorStsNullPtrErr (-8)         a null result pointer
 *   zorStsSizeErr (-6)            a side of roiSize or maskSize below 1
 *   zorStsMaskSizeErr (-33)       a side of maskSize above 32767
 *   zorStsExceededSizeErr (-232)  a size of 2^31 bytes or more; both
 *                                 results are set to 0 */
ZorStatus zoriMorphologyBorderGetSize_8u_C1R(ZoriSize roiSize, ZoriSize maskSize,
                                             int32_t* pSpecSize, int32_t* pBufferSize);
ZorStatus zoriMorphologyBorderGetSize_16u_C1R(ZoriSize roiSize, ZoriSize maskSize,
                                              int32_t* pSpecSize, int32_t* pBufferSize);
ZorStatus zoriMorphologyBorderGetSize_16s_C1R(ZoriSize roiSize, ZoriSize maskSize,
                                              int32_t* pSpecSize, int32_t* pBufferSize);
ZorStatus zoriMorphologyBorderGetSize_32f_C1R(ZoriSize roiSize, ZoriSize maskSize,
                                              int32_t* pSpecSize, int32_t* pBufferSize);

/* Fills the record at pMorphSpec (the size GetSize gave) from the mask,
 * maskSize.width * maskSize.height bytes without gaps. roiSize and pBuffer
 * are only checked. Checks, in this order:
 *   zorStsNullPtrErr (-8)    pMask, pMorphSpec or pBuffer null
 *   zorStsSizeErr (-6)       a side of roiSize or maskSize below 1
 *   zorStsMaskSizeErr (-33)  a side of maskSize above 32767 */
ZorStatus zoriMorphologyBorderInit_8u_C1R(ZoriSize roiSize, const Zor8u* pMask,
                                          ZoriSize maskSize, ZoriMorphState* pMorphSpec,
                                          Zor8u* pBuffer);
ZorStatus zoriMorphologyBorderInit_16u_C1R(ZoriSize roiSize, const Zor8u* pMask,
                                           ZoriSize maskSize, ZoriMorphState* pMorphSpec,
                                           Zor8u* pBuffer);
ZorStatus zoriMorphologyBorderInit_16s_C1R(ZoriSize roiSize, const Zor8u* pMask,
                                           ZoriSize maskSize, ZoriMorphState* pMorphSpec,
                                           Zor8u* pBuffer);
ZorStatus zoriMorphologyBorderInit_32f_C1R(ZoriSize roiSize, const Zor8u* pMask,
                                           ZoriSize maskSize, ZoriMorphState* pMorphSpec,
                                           Zor8u* pBuffer);

/* Erosion (minimum) and dilation (maximum). Checks, in this order; the
 * first failure is returned and nothing is written:
 *   1. pSrc, pDst, pMorphSpec or pBuffer null: zorStsNullPtrErr (-8);
 *   2. a side of roiSize below 1: zorStsSizeErr (-6);
 *   3. srcStep or dstStep below roiSize.width times the element size:
 *      zorStsStepErr (-16);
 *   4. (16u, 16s) a step not a multiple of 2, (32f) not a multiple of 4:
 *      zorStsNotEvenStepErr (-108);
 *   5. borderType above 4095, or other than 240 with a kind (low four
 *      bits) other than 1, 3, 5 or 6: zorStsBorderErr (-225);
 *   6. (16u, 16s, 32f) pSrc == pDst: zorStsInplaceModeNotSupportedErr
 *      (-9998).
 * Source and destination must not overlap; the 8u forms do not refuse
 * equal pointers, but such a call has no defined result. */
ZorStatus zoriErodeBorder_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                 int32_t dstStep, ZoriSize roiSize, int32_t borderType,
                                 Zor8u borderValue, const ZoriMorphState* pMorphSpec,
                                 Zor8u* pBuffer);
ZorStatus zoriErodeBorder_16u_C1R(const Zor16u* pSrc, int32_t srcStep, Zor16u* pDst,
                                  int32_t dstStep, ZoriSize roiSize, int32_t borderType,
                                  Zor16u borderValue, const ZoriMorphState* pMorphSpec,
                                  Zor8u* pBuffer);
ZorStatus zoriErodeBorder_16s_C1R(const Zor16s* pSrc, int32_t srcStep, Zor16s* pDst,
                                  int32_t dstStep, ZoriSize roiSize, int32_t borderType,
                                  Zor16s borderValue, const ZoriMorphState* pMorphSpec,
                                  Zor8u* pBuffer);
ZorStatus zoriErodeBorder_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                  int32_t dstStep, ZoriSize roiSize, int32_t borderType,
                                  Zor32f borderValue, const ZoriMorphState* pMorphSpec,
                                  Zor8u* pBuffer);
ZorStatus zoriDilateBorder_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                  int32_t dstStep, ZoriSize roiSize, int32_t borderType,
                                  Zor8u borderValue, const ZoriMorphState* pMorphSpec,
                                  Zor8u* pBuffer);
ZorStatus zoriDilateBorder_16u_C1R(const Zor16u* pSrc, int32_t srcStep, Zor16u* pDst,
                                   int32_t dstStep, ZoriSize roiSize, int32_t borderType,
                                   Zor16u borderValue, const ZoriMorphState* pMorphSpec,
                                   Zor8u* pBuffer);
ZorStatus zoriDilateBorder_16s_C1R(const Zor16s* pSrc, int32_t srcStep, Zor16s* pDst,
                                   int32_t dstStep, ZoriSize roiSize, int32_t borderType,
                                   Zor16s borderValue, const ZoriMorphState* pMorphSpec,
                                   Zor8u* pBuffer);
ZorStatus zoriDilateBorder_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                   int32_t dstStep, ZoriSize roiSize, int32_t borderType,
                                   Zor32f borderValue, const ZoriMorphState* pMorphSpec,
                                   Zor8u* pBuffer);

#ifdef __cplusplus
}
#endif

#endif
