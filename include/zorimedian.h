/* zor: median filter with border.
 *
 * Each destination pixel is the median of the maskSize.width by
 * maskSize.height source pixels centred on it: element n / 2 (from 0) of
 * the n = width * height values in ascending order, the mask's centre
 * being (width / 2, height / 2). Only odd mask sizes exist. Pixels outside
 * the ROI come from the border rule:
 *   - zorBorderRepl (1): the nearest ROI pixel;
 *   - zorBorderConst (6): borderValue;
 *   - flags zorBorderInMemTop/Bottom/Left/Right (16/32/64/128) with either
 *     kind: the pixels of that side exist in memory and are read (as far as
 *     the mask reaches: height / 2 rows, width / 2 columns); 240 alone means
 *     all four sides.
 * Mirror (3) and every other kind are refused. A mask width of 1 reads no
 * columns beside the ROI and a height of 1 no rows above or below it, so
 * no frame is made on those sides.
 *
 * pSrc == pDst filters in place and gives the same image as a separate
 * destination; other overlaps have no defined result. Steps are in bytes,
 * are not compared with the width and may be negative; the element types
 * wider than a byte need steps that are multiples of their size.
 * pBuffer is scratch of at least the size zoriFilterMedianBorderGetBufferSize
 * reports for the same ROI, mask and type (a larger ROI overruns it, which
 * nothing checks); it should be aligned to 4 bytes, as any allocator's
 * result is. Nothing is kept in it between calls.
 *
 * Floats are ordered by the comparisons of the path that a mask takes
 * (min/max networks for the small masks, sorts or an order-keeping integer
 * key for the larger ones); with NaNs among the values the result depends
 * on that path, without NaNs it does not. */
#ifndef ZORIMEDIAN_H
#define ZORIMEDIAN_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Scratch size in bytes for one call. Checks, in this order:
 *   1. pBufferSize null: zorStsNullPtrErr (-8);
 *   2. a member of dstRoiSize below 1: zorStsSizeErr (-6);
 *   3. a member of maskSize below 1 or even: zorStsMaskSizeErr (-33);
 *   4. numChannels not 1, 3 or 4: zorStsNumChannelsErr (-53);
 *   5. dataType not zor8u, zor16u, zor16s or zor32f with one channel, or
 *      not zor8u, zor16u, zor16s with three or four: zorStsDataTypeErr (-59).
 * A size of 2^31 bytes or more stores 0 and returns zorStsExceededSizeErr
 * (-232). Three and four channels are answered although only the
 * one-channel filters exist. */
ZorStatus zoriFilterMedianBorderGetBufferSize(ZoriSize dstRoiSize, ZoriSize maskSize,
                                              ZorDataType dataType, int32_t numChannels,
                                              int32_t* pBufferSize);

/* Checks, in this order; the first failure is returned, nothing written:
 *   1. pSrc, pDst or pBuffer null: zorStsNullPtrErr (-8);
 *   2. a member of dstRoiSize below 1: zorStsSizeErr (-6);
 *   3. (16u, 16s) a step not a multiple of 2, (32f) not a multiple of 4:
 *      zorStsNotEvenStepErr (-108);
 *   4. a member of maskSize below 1 or even: zorStsMaskSizeErr (-33);
 *   5. borderType above 255, or other than 240 with a kind that is not
 *      zorBorderRepl or zorBorderConst: zorStsBorderErr (-225).
 * A 1 by 1 mask copies the ROI (nothing at all when pSrc == pDst). A
 * source step of 0 is refused by the frame copies with zorStsStepErr
 * (-16), nothing written, wherever a frame is needed. */
ZorStatus zoriFilterMedianBorder_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                        int32_t dstStep, ZoriSize dstRoiSize, ZoriSize maskSize,
                                        ZoriBorderType borderType, Zor8u borderValue,
                                        Zor8u* pBuffer);
ZorStatus zoriFilterMedianBorder_16u_C1R(const Zor16u* pSrc, int32_t srcStep, Zor16u* pDst,
                                         int32_t dstStep, ZoriSize dstRoiSize, ZoriSize maskSize,
                                         ZoriBorderType borderType, Zor16u borderValue,
                                         Zor8u* pBuffer);
ZorStatus zoriFilterMedianBorder_16s_C1R(const Zor16s* pSrc, int32_t srcStep, Zor16s* pDst,
                                         int32_t dstStep, ZoriSize dstRoiSize, ZoriSize maskSize,
                                         ZoriBorderType borderType, Zor16s borderValue,
                                         Zor8u* pBuffer);
ZorStatus zoriFilterMedianBorder_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                         int32_t dstStep, ZoriSize dstRoiSize, ZoriSize maskSize,
                                         ZoriBorderType borderType, Zor32f borderValue,
                                         Zor8u* pBuffer);

#ifdef __cplusplus
}
#endif

#endif
