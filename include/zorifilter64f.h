/* zor: direct double-precision filter without border handling.
 *
 * The caller guarantees that every source pixel under the kernel exists
 * (frame the image first with a border copy to get edge behaviour).
 *
 * Kernel: kernelSize.width x kernelSize.height doubles, row-major, applied
 * as a true convolution. With kw, kh the kernel's sides, (ax, ay) the
 * anchor and F[r][c] = pKernel[(kh-1-r)*kw + (kw-1-c)] the flipped kernel,
 * destination pixel (x, y) is
 *     sum over r < kh, c < kw of F[r][c] * S(x + c, y + r),
 * where S(0, 0) is the source pixel kw-1-ax columns left of and kh-1-ay
 * rows above pSrc. The anchor is thus counted in the flipped kernel and is
 * not tested: a wrong one reads outside the image. A 1 x 1 kernel scales
 * the pixel at pSrc whatever the anchor.
 *
 * Every sum is formed in double precision without fused multiply-add, in
 * a fixed order, so each level returns the same bits:
 *   - kw == 1 (column form): F[0][0]*S0 + F[1][0]*S1 + ... in row order.
 *   - kh == 1, kw < 17 (row form): F[0][0]*S0 + F[0][1]*S1 + ... in order.
 *   - kh == 1, kw >= 17: tap j goes to partial sum j mod 16 (a full block
 *     of 16 taps after another; the first block sets the sums, and taps
 *     of the last, partial block go to the first kw mod 16 sums). The 16
 *     partial sums p are then folded by halves: p[i] += p[i+8] for i < 8,
 *     p[i] += p[i+4] for i < 4, p[i] += p[i+2] for i < 2, p[0] + p[1].
 *   - otherwise the kernel's columns are taken in groups, left to right
 *     in F: kw < 6 one group of kw; kw == 6 two of 3; kw % 4 == 0 groups
 *     of 4; kw % 4 == 1 groups of 4 then one of 5; kw % 4 == 2 groups of
 *     4 then two of 3; kw % 4 == 3 groups of 4 then one of 3. The first
 *     group sets the pixel to its first product, later groups add to it;
 *     within a group the products are added kernel row by kernel row, and
 *     left to right within a row.
 *
 * Statuses, tested in this order; on an error nothing is written:
 *   zorStsNullPtrErr (-8)  pSrc, pDst or pKernel null
 *   zorStsSizeErr (-6)     a side of dstRoiSize or kernelSize below 1
 *   zorStsStepErr (-16)    srcStep < (kw + width) * 8 - 8 or
 *                          dstStep < width * 8
 * Steps are in bytes and need not be multiples of 8.
 */
#ifndef ZORIFILTER64F_H
#define ZORIFILTER64F_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Work buffer for zoriFilter_64f_C1R: kernelSize.height * 32 bytes when the
 * kernel is one column wide, at least 3 high and roiWidth is at least 16
 * (the column taps are laid out there for vector loads); 0 otherwise, and
 * then pBuffer may be null. zorStsNullPtrErr (-8) for a null pBufSize;
 * zorStsSizeErr (-6) for a kernel side or roiWidth below 1, or a size that
 * does not fit in 32 bits. */
ZorStatus zoriFilterGetBufSize_64f_C1R(ZoriSize kernelSize, int32_t roiWidth, int32_t* pBufSize);

/* The filter described above. pBuffer: at least the size query's answer
 * for this kernel and dstRoiSize.width; when null although the query asks
 * for a buffer, the taps are taken from pKernel directly, same result. */
ZorStatus zoriFilter_64f_C1R(const Zor64f* pSrc, int32_t srcStep, Zor64f* pDst, int32_t dstStep,
                             ZoriSize dstRoiSize, const Zor64f* pKernel, ZoriSize kernelSize,
                             ZoriPoint anchor, Zor8u* pBuffer);

#ifdef __cplusplus
}
#endif

#endif
