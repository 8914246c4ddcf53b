/* zor: vector (signal domain) operations.
 *
 * A vector is a pointer and a length in elements; complex elements are
 * interleaved (re, im) and counted as one. No alignment is required.
 * Unless noted: a null pointer gives zorStsNullPtrErr (-8), then len < 1
 * gives zorStsSizeErr (-6), and nothing is written. Float results are one
 * IEEE operation per element in the rounding mode in force, identical on
 * every level. */
#ifndef ZORS_H
#define ZORS_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

/* dst = src1 + src2. Complex forms test len first (-6 even with null
 * pointers), then run the real form over 2*len floats (32-bit product:
 * len >= 0x40000000 wraps and is refused with -6). */
ZorStatus zorsAdd_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len);
ZorStatus zorsAdd_64f(const Zor64f* pSrc1, const Zor64f* pSrc2, Zor64f* pDst, int32_t len);
ZorStatus zorsAdd_32fc(const Zor32fc* pSrc1, const Zor32fc* pSrc2, Zor32fc* pDst, int32_t len);
ZorStatus zorsAdd_64fc(const Zor64fc* pSrc1, const Zor64fc* pSrc2, Zor64fc* pDst, int32_t len);
/* srcDst = srcDst + src */
ZorStatus zorsAdd_32f_I(const Zor32f* pSrc, Zor32f* pSrcDst, int32_t len);
ZorStatus zorsAdd_64f_I(const Zor64f* pSrc, Zor64f* pSrcDst, int32_t len);
ZorStatus zorsAdd_32fc_I(const Zor32fc* pSrc, Zor32fc* pSrcDst, int32_t len);
ZorStatus zorsAdd_64fc_I(const Zor64fc* pSrc, Zor64fc* pSrcDst, int32_t len);

/* dst = src1 * src2; srcDst = srcDst * src */
ZorStatus zorsMul_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len);
ZorStatus zorsMul_32f_I(const Zor32f* pSrc, Zor32f* pSrcDst, int32_t len);

/* dst = src * value. value == 1 (after the checks) copies, bit for bit,
 * NaN payloads included; value == 0 or -0 zero-fills, so NaN or infinite
 * elements give +0. The in-place form returns at once for 1. A NaN value
 * goes to the arithmetic. The complex forms take no short cut and do not
 * conjugate: re = s.re*v.re - s.im*v.im, im = s.im*v.re + s.re*v.im, each
 * product rounded on its own (no fused multiply-add on any level). */
ZorStatus zorsMulC_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len, Zor32f value);
ZorStatus zorsMulC_64f(const Zor64f* pSrc, Zor64f* pDst, int32_t len, Zor64f value);
ZorStatus zorsMulC_32f_I(Zor32f* pSrcDst, int32_t len, Zor32f value);
ZorStatus zorsMulC_32fc(const Zor32fc* pSrc, Zor32fc* pDst, int32_t len, Zor32fc value);
ZorStatus zorsMulC_64fc(const Zor64fc* pSrc, Zor64fc* pDst, int32_t len, Zor64fc value);

/* dst = src - value; value == 0 copies. */
ZorStatus zorsSubC_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len, Zor32f value);

/* srcDst = srcDst * srcDst */
ZorStatus zorsSqr_32f_I(Zor32f* pSrcDst, int32_t len);

/* Copy: the vectors must not overlap. Move: any overlap. */
ZorStatus zorsCopy_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len);
ZorStatus zorsCopy_32fc(const Zor32fc* pSrc, Zor32fc* pDst, int32_t len);
ZorStatus zorsCopy_64f(const Zor64f* pSrc, Zor64f* pDst, int32_t len);
ZorStatus zorsCopy_64fc(const Zor64fc* pSrc, Zor64fc* pDst, int32_t len);
ZorStatus zorsMove_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len);
ZorStatus zorsMove_32fc(const Zor32fc* pSrc, Zor32fc* pDst, int32_t len);
ZorStatus zorsMove_64f(const Zor64f* pSrc, Zor64f* pDst, int32_t len);
ZorStatus zorsMove_64fc(const Zor64fc* pSrc, Zor64fc* pDst, int32_t len);

/* dst[i] = src[len-1-i]. pSrc == pDst reverses in place (equal null
 * pointers give -8 from there). Complex elements keep (re, im) order. */
ZorStatus zorsFlip_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len);
ZorStatus zorsFlip_32fc(const Zor32fc* pSrc, Zor32fc* pDst, int32_t len);
ZorStatus zorsFlip_64f(const Zor64f* pSrc, Zor64f* pDst, int32_t len);
ZorStatus zorsFlip_64fc(const Zor64fc* pSrc, Zor64fc* pDst, int32_t len);

/* dst[i] = src1[i] > src2[i] ? src1[i] : src2[i]: a NaN on either side
 * gives src2, and of +0/-0 the second. len is unsigned: only 0 is refused.
 * A destination overlapping a source gives the result of an element by
 * element walk from the first element. */
ZorStatus zorsMaxEvery_8u(const Zor8u* pSrc1, const Zor8u* pSrc2, Zor8u* pDst, uint32_t len);
ZorStatus zorsMaxEvery_16u(const Zor16u* pSrc1, const Zor16u* pSrc2, Zor16u* pDst, uint32_t len);
ZorStatus zorsMaxEvery_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, uint32_t len);
ZorStatus zorsMaxEvery_64f(const Zor64f* pSrc1, const Zor64f* pSrc2, Zor64f* pDst, uint32_t len);

/* Sum of the elements. hint 1: single-precision lanes (fast; last bits
 * may differ by level). Any other hint: double-precision accumulation,
 * identical on every level, rounded once to single precision. */
ZorStatus zorsSum_32f(const Zor32f* pSrc, int32_t len, Zor32f* pSum, int32_t hint);

/* Sum of products in the element's precision, no conjugation. Below 16
 * elements the order is fixed; from 16 on the summation order is the
 * level's own and the last bits may differ between levels. */
ZorStatus zorsDotProd_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, int32_t len, Zor32f* pDp);
ZorStatus zorsDotProd_32fc(const Zor32fc* pSrc1, const Zor32fc* pSrc2, int32_t len, Zor32fc* pDp);
ZorStatus zorsDotProd_32f32fc(const Zor32f* pSrc1, const Zor32fc* pSrc2, int32_t len, Zor32fc* pDp);
ZorStatus zorsDotProd_64f(const Zor64f* pSrc1, const Zor64f* pSrc2, int32_t len, Zor64f* pDp);
ZorStatus zorsDotProd_64fc(const Zor64fc* pSrc1, const Zor64fc* pSrc2, int32_t len, Zor64fc* pDp);
ZorStatus zorsDotProd_64f64fc(const Zor64f* pSrc1, const Zor64fc* pSrc2, int32_t len, Zor64fc* pDp);

#ifdef __cplusplus
}
#endif

#endif
