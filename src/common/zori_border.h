/* Border-extending copies that every level has but does not export; the
 * filter, rank and geometry operations of the same level call them by
 * ZOR_NAME(name). */
#ifndef ZORI_BORDER_H
#define ZORI_BORDER_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

/* ---- Constant frame ---------------------------------------------------- */
/* Frame pixels take the value (C1: one element; C3/C4: one element per
 * channel, a null value pointer is a null-pointer error like pSrc and pDst).
 * No equal-pointer branch. 16u and 32f run the 16s and 32s bodies, the
 * 32f value as its bit pattern. The 16u and 32f C1 forms are public. */
ZorStatus zoriCopyConstBorder_8u_C3R(const Zor8u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                     Zor8u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                     int32_t topBorderHeight, int32_t leftBorderWidth,
                                     const Zor8u value[3]);
ZorStatus zoriCopyConstBorder_8u_C4R(const Zor8u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                     Zor8u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                     int32_t topBorderHeight, int32_t leftBorderWidth,
                                     const Zor8u value[4]);
ZorStatus zoriCopyConstBorder_16s_C1R(const Zor16s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor16s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth,
                                      Zor16s value);
ZorStatus zoriCopyConstBorder_16s_C3R(const Zor16s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor16s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth,
                                      const Zor16s value[3]);
ZorStatus zoriCopyConstBorder_16s_C4R(const Zor16s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor16s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth,
                                      const Zor16s value[4]);
ZorStatus zoriCopyConstBorder_32s_C1R(const Zor32s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor32s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth,
                                      Zor32s value);
ZorStatus zoriCopyConstBorder_32s_C3R(const Zor32s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor32s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth,
                                      const Zor32s value[3]);
ZorStatus zoriCopyConstBorder_32s_C4R(const Zor32s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor32s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth,
                                      const Zor32s value[4]);
ZorStatus zoriCopyConstBorder_32f_C3R(const Zor32f* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor32f* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth,
                                      const Zor32f value[3]);
ZorStatus zoriCopyConstBorder_32f_C4R(const Zor32f* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor32f* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth,
                                      const Zor32f value[4]);

/* ---- Replicated frame -------------------------------------------------- */
/* pSrc == pDst turns a call into the in-place form with pDst and dstStep.
 * In-place: pSrcDst is the first source pixel inside a larger image, the
 * frame starts topBorderHeight rows above and leftBorderWidth pixels to the
 * left of it, and only frame pixels are written. 16u and 32f run the 16s
 * and 32s bodies; the 16u and 32f C1 forms are public. */
ZorStatus zoriCopyReplicateBorder_8u_C3R(const Zor8u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                         Zor8u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                         int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_8u_C4R(const Zor8u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                         Zor8u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                         int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_16s_C1R(const Zor16s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                          Zor16s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                          int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_16s_C3R(const Zor16s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                          Zor16s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                          int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_16s_C4R(const Zor16s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                          Zor16s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                          int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_32s_C1R(const Zor32s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                          Zor32s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                          int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_32s_C3R(const Zor32s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                          Zor32s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                          int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_32s_C4R(const Zor32s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                          Zor32s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                          int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_32f_C3R(const Zor32f* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                          Zor32f* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                          int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_32f_C4R(const Zor32f* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                          Zor32f* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                          int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_8u_C1IR(Zor8u* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                          ZoriSize dstRoiSize, int32_t topBorderHeight,
                                          int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_8u_C3IR(Zor8u* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                          ZoriSize dstRoiSize, int32_t topBorderHeight,
                                          int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_8u_C4IR(Zor8u* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                          ZoriSize dstRoiSize, int32_t topBorderHeight,
                                          int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_16s_C1IR(Zor16s* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                           ZoriSize dstRoiSize, int32_t topBorderHeight,
                                           int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_16s_C3IR(Zor16s* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                           ZoriSize dstRoiSize, int32_t topBorderHeight,
                                           int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_16s_C4IR(Zor16s* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                           ZoriSize dstRoiSize, int32_t topBorderHeight,
                                           int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_32s_C1IR(Zor32s* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                           ZoriSize dstRoiSize, int32_t topBorderHeight,
                                           int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_32s_C3IR(Zor32s* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                           ZoriSize dstRoiSize, int32_t topBorderHeight,
                                           int32_t leftBorderWidth);
ZorStatus zoriCopyReplicateBorder_32s_C4IR(Zor32s* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                           ZoriSize dstRoiSize, int32_t topBorderHeight,
                                           int32_t leftBorderWidth);

/* ---- Mirrored frame ---------------------------------------------------- */
/* Reflection about the edge pixel, which is not repeated, at every
 * distance: the frame pixel at distance d from the image (1 next to it)
 * reads source pixel tri(d), with tri(k) = k mod (2n-2), folded to
 * 2n-2-k when >= n; right and bottom borders are the mirror image (pixel
 * n-1-tri(d)). A border shorter than the image is the plain reflection
 * 1, 2, .. from the image outwards. A one-pixel axis repeats its pixel.
 * pSrc == pDst turns a call into the in-place form as for Replicate. 16s
 * runs the 16u body and 32f the 32s body. */
ZorStatus zoriCopyMirrorBorder_8u_C1R(const Zor8u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor8u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_8u_C3R(const Zor8u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor8u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_8u_C4R(const Zor8u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                      Zor8u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                      int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_16s_C1R(const Zor16s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor16s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_16s_C3R(const Zor16s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor16s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_16s_C4R(const Zor16s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor16s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_16u_C1R(const Zor16u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor16u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_16u_C3R(const Zor16u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor16u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_16u_C4R(const Zor16u* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor16u* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_32s_C1R(const Zor32s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor32s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_32s_C3R(const Zor32s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor32s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_32s_C4R(const Zor32s* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor32s* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_32f_C1R(const Zor32f* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor32f* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_32f_C3R(const Zor32f* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor32f* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_32f_C4R(const Zor32f* pSrc, int32_t srcStep, ZoriSize srcRoiSize,
                                       Zor32f* pDst, int32_t dstStep, ZoriSize dstRoiSize,
                                       int32_t topBorderHeight, int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_8u_C1IR(Zor8u* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                       ZoriSize dstRoiSize, int32_t topBorderHeight,
                                       int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_8u_C3IR(Zor8u* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                       ZoriSize dstRoiSize, int32_t topBorderHeight,
                                       int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_8u_C4IR(Zor8u* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                       ZoriSize dstRoiSize, int32_t topBorderHeight,
                                       int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_16u_C1IR(Zor16u* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                        ZoriSize dstRoiSize, int32_t topBorderHeight,
                                        int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_16u_C3IR(Zor16u* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                        ZoriSize dstRoiSize, int32_t topBorderHeight,
                                        int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_16u_C4IR(Zor16u* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                        ZoriSize dstRoiSize, int32_t topBorderHeight,
                                        int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_32s_C1IR(Zor32s* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                        ZoriSize dstRoiSize, int32_t topBorderHeight,
                                        int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_32s_C3IR(Zor32s* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                        ZoriSize dstRoiSize, int32_t topBorderHeight,
                                        int32_t leftBorderWidth);
ZorStatus zoriCopyMirrorBorder_32s_C4IR(Zor32s* pSrcDst, int32_t srcDstStep, ZoriSize srcRoiSize,
                                        ZoriSize dstRoiSize, int32_t topBorderHeight,
                                        int32_t leftBorderWidth);

#ifdef __cplusplus
}
#endif

#endif
