// Row functions of the vector layer, for other code of the same level
// (image rows, transform buffers). No argument checks: the caller passes
// valid pointers and a length of at least 0. Float results are one IEEE
// operation per element in the rounding mode in force, the same on every
// level and for every alignment. Include after variant.h.
#ifndef ZOR_PSROW_H
#define ZOR_PSROW_H

#include <stddef.h>
#include <stdint.h>

ZOR_BEGIN

// dst = src1 + src2, dst = src2 - src1 (the second minus the first, as the
// image subtraction has it), dst = src1 * src2.
void ownsAdd_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len);
void ownsSub_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len);
void ownsMul_32f(const Zor32f* pSrc1, const Zor32f* pSrc2, Zor32f* pDst, int32_t len);
void ownsAdd_64f(const Zor64f* pSrc1, const Zor64f* pSrc2, Zor64f* pDst, int32_t len);

// srcDst = srcDst op src
void ownsAdd_32f_I(const Zor32f* pSrc, Zor32f* pSrcDst, int32_t len);
void ownsMul_32f_I(const Zor32f* pSrc, Zor32f* pSrcDst, int32_t len);
void ownsAdd_64f_I(const Zor64f* pSrc, Zor64f* pSrcDst, int32_t len);

// dst = src op value, with no short cut for special values: a NaN element
// times 0 stays NaN.
void ownsAddC_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len, Zor32f value);
void ownsSubC_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len, Zor32f value);
void ownsMulC_32f(const Zor32f* pSrc, Zor32f* pDst, int32_t len, Zor32f value);
void ownsMulC_64f(const Zor64f* pSrc, Zor64f* pDst, int32_t len, Zor64f value);
void ownsMulC_32f_I(Zor32f* pSrcDst, int32_t len, Zor32f value);
void ownsMulC_64f_I(Zor64f* pSrcDst, int32_t len, Zor64f value);
// Complex: re = a.re*v.re - a.im*v.im, im = a.im*v.re + a.re*v.im.
void ownsMulC_32fc(const Zor32fc* pSrc, Zor32fc* pDst, int32_t len, Zor32fc value);
void ownsMulC_64fc(const Zor64fc* pSrc, Zor64fc* pDst, int32_t len, Zor64fc value);

// Byte counts. Copy: the ranges must not overlap. Both choose string
// instructions or non-temporal stores by length and cache size; the bytes
// written are the same whichever way.
void ownsCopy_8u(const Zor8u* pSrc, Zor8u* pDst, size_t len);
void ownsZero_8u(Zor8u* pDst, size_t len);
// Any overlap.
void ownsMove_8u(const Zor8u* pSrc, Zor8u* pDst, size_t len);

ZOR_END

#endif
