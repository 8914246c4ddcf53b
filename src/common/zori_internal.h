/* Image-domain operations that every level has but does not export; other
 * operations of the same level call them by ZOR_NAME(name). */
#ifndef ZORI_INTERNAL_H
#define ZORI_INTERNAL_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

ZorStatus zoriSet_8u_C1R(Zor8u value, Zor8u* pDst, int32_t dstStep, ZoriSize roiSize);
ZorStatus zoriSet_16s_C1R(Zor16s value, Zor16s* pDst, int32_t dstStep, ZoriSize roiSize);
ZorStatus zoriCopy_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst, int32_t dstStep,
                          ZoriSize roiSize);
ZorStatus zoriCopy_16s_C1R(const Zor16s* pSrc, int32_t srcStep, Zor16s* pDst, int32_t dstStep,
                           ZoriSize roiSize);

/* Row forms of the divisions: dst = src2 / src1, argument checks as the
 * image functions (pointers -8, len < 1 -6), status 2 on a zero divisor. */
ZorStatus zorsDiv_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len);
ZorStatus zorsDiv_8u_Sfs(const Zor8u* pSrc1, const Zor8u* pSrc2, Zor8u* pDst, int32_t len,
                         int32_t scaleFactor);
ZorStatus zorsDiv_16s_Sfs(const Zor16s* pSrc1, const Zor16s* pSrc2, Zor16s* pDst, int32_t len,
                          int32_t scaleFactor);

#ifdef __cplusplus
}
#endif

#endif
