/* zor: border-extending copies.
 *
 * Each copy builds a framed image: the source ROI (srcRoiSize) is placed at
 * column leftBorderWidth, row topBorderHeight of the destination ROI
 * (dstRoiSize), and every destination pixel around it is made up from the
 * border rule. The right border is dstRoiSize.width - leftBorderWidth -
 * srcRoiSize.width pixels wide, the bottom border dstRoiSize.height -
 * topBorderHeight - srcRoiSize.height rows high; both may be zero.
 * Pointers address the first pixel of each ROI, steps are in bytes, and
 * neither pointers nor steps need any alignment (an odd step is accepted).
 * The copies move bits only: no pixel value is converted.
 *
 * Checks, in this order; the first failure is returned and nothing is
 * written:
 *   1. (Replicate only) pSrc == pDst: the call frames the image in place
 *      inside the destination, as if pDst pointed at the first source pixel
 *      of a larger image: the frame starts at pDst - topBorderHeight *
 *      dstStep - leftBorderWidth pixels, only the frame pixels around the
 *      ROI are written and srcStep is not looked at. The constant copies
 *      have no such branch: equal pointers there are overlapping images
 *      and the result is undefined.
 *   2. pSrc or pDst null: zorStsNullPtrErr (-8).
 *   3. srcStep < 1 or dstStep < 1: zorStsStepErr (-16).
 *   4. zorStsSizeErr (-6) if a width or height of either ROI is below 1,
 *      if topBorderHeight or leftBorderWidth is negative, or if the
 *      destination is smaller than the source plus the top-left border in
 *      either direction (no clamping).
 */
#ifndef ZORIBORDER_H
#define ZORIBORDER_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Frame pixels take `value`; the source rows are copied unchanged. The
 * 32f form stores the bit pattern of value, so a signalling NaN arrives
 * bit for bit. */
ZorStatus zoriCopyConstBorder_8u_C1R(const Zor8u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                     Zor8u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                     int32_t topBorderHeight, int32_t leftBorderWidth, Zor8u value);
ZorStatus zoriCopyConstBorder_16u_C1R(const Zor16u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor16u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth,
                                      Zor16u value);
ZorStatus zoriCopyConstBorder_32f_C1R(const Zor32f* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor32f* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth,
                                      Zor32f value);

/* Frame pixel (x, y) takes source pixel (clamp(x - left, 0, srcW - 1),
 * clamp(y - top, 0, srcH - 1)): each row is extended by its first and last
 * pixel, the rows above repeat the extended first row and the rows below
 * the extended last row. */
ZorStatus zoriCopyReplicateBorder_8u_C1R(const Zor8u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                         Zor8u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                         int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_16u_C1R(const Zor16u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                          Zor16u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                          int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_32f_C1R(const Zor32f* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                          Zor32f* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                          int32_t topBorderHeight, int32_t leftBorderWidth);

#ifdef __cplusplus
}
#endif

#endif
