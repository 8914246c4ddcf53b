/* zor: image point operations.
 *
 * An image is a pointer to the first pixel of the region of interest (ROI)
 * and a step in bytes between rows (independent per image, may be
 * negative where no step test is listed). Every image of a call is read or
 * written for exactly roiSize pixels; nothing outside is touched. No
 * alignment is required. Checks in this order, first failure returned,
 * nothing written: null pointers -8, ROI width or height < 1 -6, step
 * tests -16, step divisibility -108, then values. Float arithmetic is one
 * IEEE single operation per element in the rounding mode in force. */
#ifndef ZORI_H
#define ZORI_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

/* ---- Unscaled float arithmetic ------------------------------------------- */

/* dst = src1 + src2. No step test. */
ZorStatus zoriAdd_32f_C1R(const Zor32f* pSrc1, int32_t src1Step, const Zor32f* pSrc2,
                          int32_t src2Step, Zor32f* pDst, int32_t dstStep, ZoriSize roiSize);
/* dst = src2 - src1 (second minus first). No step test. */
ZorStatus zoriSub_32f_C1R(const Zor32f* pSrc1, int32_t src1Step, const Zor32f* pSrc2,
                          int32_t src2Step, Zor32f* pDst, int32_t dstStep, ZoriSize roiSize);
/* dst = src1 * src2. No step test. */
ZorStatus zoriMul_32f_C1R(const Zor32f* pSrc1, int32_t src1Step, const Zor32f* pSrc2,
                          int32_t src2Step, Zor32f* pDst, int32_t dstStep, ZoriSize roiSize);
/* dst = src2 / src1 (second divided by first); steps >= 1. Zero divisors
 * give status 2 (zorStsDivByZero) and a level-specific infinity or NaN;
 * quotients use the level's reciprocal arithmetic (m7..e9 refined
 * estimate, l9 refined with FMA, n0/k0 true division). */
ZorStatus zoriDiv_32f_C1R(const Zor32f* pSrc1, int32_t src1Step, const Zor32f* pSrc2,
                          int32_t src2Step, Zor32f* pDst, int32_t dstStep, ZoriSize roiSize);
/* dst = src + value, src - value, src * value. No step test. */
ZorStatus zoriAddC_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                           ZoriSize roiSize, Zor32f value);
ZorStatus zoriSubC_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                           ZoriSize roiSize, Zor32f value);
ZorStatus zoriMulC_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                           ZoriSize roiSize, Zor32f value);
/* dst = src * (1 / value): the reciprocal rounded to single first, so two
 * roundings. Steps >= 1; value +-0 gives -10. */
ZorStatus zoriDivC_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                           ZoriSize roiSize, Zor32f value);
/* |src| by clearing the sign bit; src * src. Steps >= 1, and rounded down
 * to a multiple of 4 before use. */
ZorStatus zoriAbs_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                          ZoriSize roiSize);
ZorStatus zoriSqr_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                          ZoriSize roiSize);
/* |src1 - src2|, exact for the integer types; the float form clears the
 * sign of the difference (NaN comes out with a clear sign). Steps at least
 * a row; 16u steps even and 32f steps multiples of 4, else -108. */
ZorStatus zoriAbsDiff_8u_C1R(const Zor8u* pSrc1, int32_t src1Step, const Zor8u* pSrc2,
                             int32_t src2Step, Zor8u* pDst, int32_t dstStep, ZoriSize roiSize);
ZorStatus zoriAbsDiff_16u_C1R(const Zor16u* pSrc1, int32_t src1Step, const Zor16u* pSrc2,
                              int32_t src2Step, Zor16u* pDst, int32_t dstStep, ZoriSize roiSize);
ZorStatus zoriAbsDiff_32f_C1R(const Zor32f* pSrc1, int32_t src1Step, const Zor32f* pSrc2,
                              int32_t src2Step, Zor32f* pDst, int32_t dstStep, ZoriSize roiSize);
ZorStatus zoriAbsDiffC_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                               ZoriSize roiSize, Zor32f value);
/* srcDst += (mask ? src1 : +0) * src2: the mask zeroes a factor and the sum
 * is always formed, so an infinite or NaN src2 under mask 0 gives NaN. */
ZorStatus zoriAddProduct_32f_C1IMR(const Zor32f* pSrc1, int32_t src1Step, const Zor32f* pSrc2,
                                   int32_t src2Step, const Zor8u* pMask, int32_t maskStep,
                                   Zor32f* pSrcDst, int32_t srcDstStep, ZoriSize roiSize);

/* ---- Scaled integer arithmetic -------------------------------------------- */

/* dst = saturate(round(src1 * src2 * 2^-scaleFactor)), ties to even, from
 * the exact product. No step test; every scale factor accepted. 16u at a
 * scale factor of exactly 32 gives the product's top bit (1 from 2^31). */
ZorStatus zoriMul_8u_C1RSfs(const Zor8u* pSrc1, int32_t src1Step, const Zor8u* pSrc2,
                            int32_t src2Step, Zor8u* pDst, int32_t dstStep, ZoriSize roiSize,
                            int32_t scaleFactor);
ZorStatus zoriMul_16u_C1RSfs(const Zor16u* pSrc1, int32_t src1Step, const Zor16u* pSrc2,
                             int32_t src2Step, Zor16u* pDst, int32_t dstStep, ZoriSize roiSize,
                             int32_t scaleFactor);
ZorStatus zoriMul_16s_C1RSfs(const Zor16s* pSrc1, int32_t src1Step, const Zor16s* pSrc2,
                             int32_t src2Step, Zor16s* pDst, int32_t dstStep, ZoriSize roiSize,
                             int32_t scaleFactor);
/* dst = saturate(round(src2 * 2^-scaleFactor / src1)): the single-precision
 * quotient of the exactly scaled src2 by src1, rounded to nearest (ties to
 * even), the same on every level. Real division for scale factors from -15
 * to 8 (8u), -30 to 15 (16s), -31 to 16 (16u); below that range a non-zero
 * src2 saturates by the signs, above it the result is 0. A zero divisor
 * gives the largest value (n > 0), 0 (n == 0) or, in 16s, -32768 (n < 0),
 * at any scale factor, and status 2; every row is computed all the same.
 * 8u and 16s: steps >= 1; 16u: no step test. */
ZorStatus zoriDiv_8u_C1RSfs(const Zor8u* pSrc1, int32_t src1Step, const Zor8u* pSrc2,
                            int32_t src2Step, Zor8u* pDst, int32_t dstStep, ZoriSize roiSize,
                            int32_t scaleFactor);
ZorStatus zoriDiv_16u_C1RSfs(const Zor16u* pSrc1, int32_t src1Step, const Zor16u* pSrc2,
                             int32_t src2Step, Zor16u* pDst, int32_t dstStep, ZoriSize roiSize,
                             int32_t scaleFactor);
ZorStatus zoriDiv_16s_C1RSfs(const Zor16s* pSrc1, int32_t src1Step, const Zor16s* pSrc2,
                             int32_t src2Step, Zor16s* pDst, int32_t dstStep, ZoriSize roiSize,
                             int32_t scaleFactor);

/* ---- Comparison, threshold, extremes, logic, fill, copy -------------------- */

typedef enum {
    zorCmpLess = 0,
    zorCmpLessEq = 1,
    zorCmpEq = 2,
    zorCmpGreaterEq = 3,
    zorCmpGreater = 4
} ZorCmpOp;

/* dst = 255 where (src op value), else 0; ordered: NaN gives 0. Checks:
 * pointers, steps >= 1 (-16), then ROI (-6). A selector above 4 returns 0
 * and leaves dst untouched. */
ZorStatus zoriCompareC_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor8u* pDst, int32_t dstStep,
                               ZoriSize roiSize, int32_t cmpOp, Zor32f value);
/* Clip at the threshold: NaN pixels become the threshold. Steps >= 1. */
ZorStatus zoriThreshold_GT_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                   int32_t dstStep, ZoriSize roiSize, Zor32f threshold);
ZorStatus zoriThreshold_LT_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                   int32_t dstStep, ZoriSize roiSize, Zor32f threshold);
/* Pixels beyond the threshold become value; NaN pixels pass. Steps >= 1. */
ZorStatus zoriThreshold_GTVal_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                      int32_t dstStep, ZoriSize roiSize, Zor32f threshold,
                                      Zor32f value);
ZorStatus zoriThreshold_LTVal_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                      int32_t dstStep, ZoriSize roiSize, Zor32f threshold,
                                      Zor32f value);
/* Least and greatest pixel, starting from +-FLT_MAX (so an all +inf image
 * reports FLT_MAX as minimum). No step test. NaN pixels are not skipped:
 * pixel x of each row goes to running lane x mod 16, which keeps
 * min(lane, pixel) by the processor's rule (a NaN pixel replaces the lane
 * until that lane's next pixel); a row's last partial group of 16 brings
 * +-FLT_MAX into the lanes it does not reach; lanes 0..15 are folded in
 * order at the end. */
ZorStatus zoriMinMax_32f_C1R(const Zor32f* pSrc, int32_t srcStep, ZoriSize roiSize, Zor32f* pMin,
                             Zor32f* pMax);
/* dst = ~src. Checks: pointers, steps >= 1 (-16), then ROI (-6). */
ZorStatus zoriNot_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst, int32_t dstStep,
                         ZoriSize roiSize);
/* Stores the value's bits (NaN payloads, -0) in every pixel. No step test:
 * a zero step fills the one row again. */
ZorStatus zoriSet_32f_C1R(Zor32f value, Zor32f* pDst, int32_t dstStep, ZoriSize roiSize);
/* Bit copies. No step tests (negative steps work). */
ZorStatus zoriCopy_16u_C1R(const Zor16u* pSrc, int32_t srcStep, Zor16u* pDst, int32_t dstStep,
                           ZoriSize roiSize);
ZorStatus zoriCopy_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                           ZoriSize roiSize);
/* Copies the pixels whose mask byte is non-zero; others are not written,
 * and a group of 16 pixels (counted from where the destination row is
 * 16-byte aligned) whose mask bytes are all 0 is not read either. No step
 * tests. */
ZorStatus zoriCopy_32f_C1MR(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                            ZoriSize roiSize, const Zor8u* pMask, int32_t maskStep);

#ifdef __cplusplus
}
#endif

#endif
