/* Operations that every level has but does not export: other operations
 * of the same level call them by their prefixed names (ZOR_NAME), and the
 * tests reach them the same way. Checks as in the public headers: null
 * pointers -8, then len < 1 -6, unless noted. */
#ifndef ZOR_INTERNAL_H
#define ZOR_INTERNAL_H

#include <stddef.h>

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

ZorStatus zorsAbs_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len);
ZorStatus zorsSqr_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len);
/* pDst = pSrc2 / pSrc1 element by element, in the level's own arithmetic
 * (reciprocal estimate on the SSE levels and e9, refined with FMA on l9,
 * true division on the AVX-512 levels); zorStsDivByZero (2) when a divisor
 * counted as zero, with its lanes set to a signed infinity or NaN. */
ZorStatus zorsDiv_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len);
/* value == 0 (or -0) returns at once. */
ZorStatus zorsAddC_32f_I(Zor32f* pSrcDst, int32_t len, Zor32f value);
/* value == 1 returns at once; value == 0 zero-fills. */
ZorStatus zorsMulC_64f_I(Zor64f* pSrcDst, int32_t len, Zor64f value);

/* In-place reversal. */
ZorStatus zorsFlip_32f_I(Zor32f* pSrcDst, int32_t len);
ZorStatus zorsFlip_32fc_I(Zor32fc* pSrcDst, int32_t len);
ZorStatus zorsFlip_64f_I(Zor64f* pSrcDst, int32_t len);
ZorStatus zorsFlip_64fc_I(Zor64fc* pSrcDst, int32_t len);

/* All bytes of the vector zero. Byte counts are formed in 64 bits, so a
 * vector of more than 2 GiB is cleared (or copied) whole. */
ZorStatus zorsZero_8u(Zor8u* pDst, int32_t len);
ZorStatus zorsZero_32s(Zor32s* pDst, int32_t len);
ZorStatus zorsZero_32f(Zor32f* pDst, int32_t len);
ZorStatus zorsZero_64f(Zor64f* pDst, int32_t len);
ZorStatus zorsZero_32fc(Zor32fc* pDst, int32_t len);
ZorStatus zorsZero_64fc(Zor64fc* pDst, int32_t len);

ZorStatus zorsCopy_8u(const Zor8u* pSrc, Zor8u* pDst, int32_t len);
ZorStatus zorsCopy_16s(const Zor16s* pSrc, Zor16s* pDst, int32_t len);
ZorStatus zorsCopy_32s(const Zor32s* pSrc, Zor32s* pDst, int32_t len);

/* dst = saturate(round(src * 2^-scaleFactor)). rndMode 0 truncates,
 * 1 rounds to nearest (ties to even), any other value rounds toward zero
 * through the MXCSR rounding control, restored afterwards. */
ZorStatus zorsConvert_32f8u_Sfs(const Zor32f* pSrc, Zor8u* pDst, int32_t len, int32_t rndMode,
                                int32_t scaleFactor);
ZorStatus zorsConvert_32f16u_Sfs(const Zor32f* pSrc, Zor16u* pDst, int32_t len, int32_t rndMode,
                                 int32_t scaleFactor);
ZorStatus zorsConvert_32f16s_Sfs(const Zor32f* pSrc, Zor16s* pDst, int32_t len, int32_t rndMode,
                                 int32_t scaleFactor);

ZorStatus zorsMin_32f(const Zor32f* pSrc, int32_t len, Zor32f* pMin);
/* Lowest index of equal minima on every path; a null pIndx acts as Min. */
ZorStatus zorsMinIndx_32f(const Zor32f* pSrc, int32_t len, Zor32f* pMin, int32_t* pIndx);

/* Quicksort (median of three, explicit stack, selection below 10). */
ZorStatus zorsSortAscend_32f_I(Zor32f* pSrcDst, int32_t len);
/* dataType 1, 5, 7, 9, 11, 13, 15, 17, 19; others store 0 and give -59. */
ZorStatus zorsSortRadixGetBufferSize(int32_t len, ZorDataType dataType, int32_t* pBufSize);
/* Stable radix sort by bit pattern: -0 before +0, NaNs beyond the infinities. */
ZorStatus zorsSortRadixAscend_32f_I(Zor32f* pSrcDst, int32_t len, Zor8u* pBuffer);

double zorsFloorOne(double x);
double zorsCeilOne(double x);
double zorsSqrtOne(double x);
double zorsSinOne(double x);
double zorsCosOne(double x);

/* Row functions for the image operations of the same level: no argument
 * checks (valid pointers, len >= 0) and no short cuts for special values,
 * so a NaN times 0 stays NaN. One IEEE operation per element in the
 * rounding mode in force, the same bits on every level and alignment.
 * Sub is the second minus the first: dst = src2 - src1. */
void ownsAdd_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len);
void ownsSub_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len);
void ownsMul_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len);
void ownsAdd_64f(const Zor64f* pSrc1, const Zor64f* pSrc2, Zor64f* pDst, int32_t len);
/* srcDst = srcDst op src */
void ownsAdd_32f_I(const Zor32f* pSrc, Zor32f* pSrcDst, int32_t len);
void ownsMul_32f_I(const Zor32f* pSrc, Zor32f* pSrcDst, int32_t len);
void ownsAdd_64f_I(const Zor64f* pSrc, Zor64f* pSrcDst, int32_t len);
/* dst = src op value */
void ownsAddC_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len, Zor32f value);
void ownsSubC_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len, Zor32f value);
void ownsMulC_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len, Zor32f value);
void ownsMulC_64f(const Zor64f* pSrc, Zor64f* pDst, int32_t len, Zor64f value);
void ownsMulC_32f_I(Zor32f* pSrcDst, int32_t len, Zor32f value);
void ownsMulC_64f_I(Zor64f* pSrcDst, int32_t len, Zor64f value);
/* re = a.re*v.re - a.im*v.im, im = a.im*v.re + a.re*v.im, each product
 * rounded on its own (never fused). */
void ownsMulC_32fc(const Zor32fc* pSrc, Zor32fc* pDst, int32_t len, Zor32fc value);
void ownsMulC_64fc(const Zor64fc* pSrc, Zor64fc* pDst, int32_t len, Zor64fc value);
/* Byte counts. Copy: no overlap; it picks vector loops, string moves or
 * non-temporal stores by length and cache size, the bytes written the same
 * whichever way. Zero likewise. */
void ownsCopy_8u(const Zor8u* pSrc, Zor8u* pDst, size_t len);
void ownsZero_8u(Zor8u* pDst, size_t len);

/* Memory kernels behind the copies and clears, one per way of moving the
 * bytes; each works for any length and alignment (copies: no overlap). The
 * operations choose among them by length and cache size, so these names
 * let tests reach every way directly. */
void ownsCopy_8u_E9(const Zor8u* pSrc, Zor8u* pDst, size_t len);    /* vector loop */
void ownsCopy_8u_repE9(const Zor8u* pSrc, Zor8u* pDst, size_t len); /* string move */
void ownsCopy_8u_nt(const Zor8u* pSrc, Zor8u* pDst, size_t len);    /* non-temporal blocks */
void ownsCopy_8u_inv(const Zor8u* pSrc, Zor8u* pDst, size_t len);   /* blocks from the end */
void ownsCopy_8u_ra(const Zor8u* pSrc, Zor8u* pDst, size_t len);    /* read-ahead chunks */
/* The level's whole copy choice for a given largest cache size in bytes
 * (negative: unknown). */
void ownsCopy_8u_cache(const Zor8u* pSrc, Zor8u* pDst, size_t len, int64_t cacheBytes);
void ownsZero_8u_E9(Zor8u* pDst, size_t len);
void ownsZero_8u_repE9(Zor8u* pDst, size_t len);
void ownsZero_8u_nt(Zor8u* pDst, size_t len);
void ownsZero_8u_cache(Zor8u* pDst, size_t len, int64_t cacheBytes);
/* Copy that allows any overlap. */
void ownsMove_8u(const Zor8u* pSrc, Zor8u* pDst, size_t len);
/* Largest cache named by a CPUID leaf 2 answer, from the copy's own
 * descriptor table; -1 when none. */
int32_t ownsCopyCacheSize(const uint32_t regs[4]);

#ifdef __cplusplus
}
#endif

#endif
