/* zor: whole-image resize (nearest, linear, cubic, Lanczos, antialiasing),
 * called per tile.
 *
 * Calling order:
 *   1. zoriResizeGetSize_8u (or _32f): sizes of the record and of an init
 *      buffer. Allocate both; any alignment will do (the record starts at
 *      the first 64-byte boundary inside the block, which is why the size
 *      includes 64 spare bytes; every call finds it the same way).
 *   2. One Init fills the record for a source and destination size. The
 *      record holds pointers into itself: never move or copy it byte by
 *      byte. It is read-only from then on.
 *   3. zoriResizeGetBufferSize_8u (or _32f): the work buffer of one call,
 *      for the largest tile and the channel count.
 *   4. Per destination tile (dstOffset, dstSize): zoriResizeGetSrcOffset_8u
 *      gives the source pixel the tile starts from; pass pSrc advanced to
 *      that pixel and pDst at the tile's first pixel. Any partition of the
 *      destination into tiles gives exactly the one-call result, so tiles
 *      may run at once on different threads, each with its own buffer.
 *
 * The tile rule. With ratio = srcLen / dstLen per axis (double):
 * shift = floor(dstOffset * ratio) is the source offset of a tile; a tile
 * that runs past the destination is clipped to it and written. The call
 * returns zorStsSizeWrn (48) when the requested width or height itself
 * exceeds the destination's (a tile merely overrunning the edge gives 0).
 *
 * Nearest: source index = trunc((i + 0.5) * ratio - 1e-10) in double, so
 * a destination centre on a source pixel boundary takes the lower pixel
 * (halving picks 0, 2, 4, ...). Pixels are copied bit for bit.
 *
 * Linear: pos = (i + 0.5) * ratio - 0.5, index = floor(pos), fraction
 * f = pos - index, per axis at Init. Horizontal pass into float rows
 * r = a + (b - a) * f, vertical pass v = r0 + (r1 - r0) * f.
 *   - zoriResizeLinearInit_8u makes a 14-bit fixed-point record for the
 *     8u operation: weight w = trunc(f * 16384 + 1e-7), horizontal
 *     r = (a * (16384 - w) + b * w + 128) >> 8 (6 fraction bits), vertical
 *     v = (r0 * (16384 - w) + r1 * w + 0x80000) >> 20, saturated to 0..255.
 *     Identical on every level.
 *   - zoriResizeLinearInit_32f makes a float record. Given to the 8u
 *     operation it runs the accurate path: float rows, results rounded to
 *     nearest even and saturated. The 32f operation refuses others (-13).
 *   - On AVX2 and AVX-512 levels the float passes use fused multiply-add:
 *     the last bit of a float result may differ from the other levels.
 *
 * Cubic: four taps per axis with the two-parameter cubic family (B, C),
 * weights in double from the float distances, stored as float and used
 * without normalising. Rows are float for 8u too; a pixel is
 * (r0*c0 + r1*c1) + (r2*c2 + r3*c3) per pass, 8u rounded to nearest even
 * and saturated. (0, 0.5) is Catmull-Rom, (1, 0) the B-spline, which
 * smooths even at equal sizes. Any float B and C are accepted. AVX2 and
 * AVX-512 levels fuse the multiply-adds.
 *
 * Lanczos: sinc(x) sinc(x / a) with a = 2 or 3 lobes, 2a taps per axis
 * from index - (a - 1) to index + a. The function is sampled 200 (a = 2)
 * or 100 (a = 3) times a unit into a float table and read with linear
 * interpolation between samples; distances of a or more weigh 0. Per
 * position the weights (float) are normalised by their sum S: the first
 * four are multiplied by r' = (r + r) - (S * r) * r, r the processor's
 * 12-bit reciprocal estimate of S, and the last two of three lobes are
 * divided by S, so a row of weights need not sum exactly to one (an
 * unchanged 8u size may move a pixel by the rounding of r'). Two lobes
 * run exactly as cubic does with these weights; three lobes as below.
 * Init refuses lobes other than 2 or 3 (-14) and sources below 2a pixels
 * (-6) after it has begun the record, which is then unusable.
 *
 * Antialiasing (zoriResizeGetSize_8u with antialiasing 1): along an axis
 * that shrinks by r = dst / src < 1 the kernel (linear, cubic (B, C) or
 * Lanczos) is stretched by 1 / r and its taps a side grow to
 * ceil(radius * src / dst); an axis that grows or keeps its size keeps the
 * plain kernel. Per position, from the double fraction f: d = (1 - taps)
 * - f in float, then for each tap w = K(|d * s|) * s (s = r or 1; x and w
 * rounded to float, K in double; the Lanczos sine is the library's own),
 * d += 1. The weights are divided by their float sum, except whole groups
 * of eight at 32-byte boundaries of the table, which take the refined
 * estimate r' above. Shrinking by 2 with the linear kernel gives 1/8,
 * 3/8, 3/8, 1/8. The operations refuse a plain record and the plain
 * operations an antialiasing record (-14); C3 filters each channel as C1.
 *
 * The general window (three-lobe Lanczos, antialiasing): each pixel's
 * taps, in order, summed in groups of four as (p0 + p1) + (p2 + p3), each
 * group added to the running sum, a last pair added alone; first along
 * the row into float rows, then down the column the same way, 8u rounded
 * to nearest even and saturated. One tap a side along the row is the
 * linear form a + (b - a) * w1. Edge pixels clamp every tap into the
 * image on the sides whose strips they lie in. AVX2 and AVX-512 levels
 * fuse each pair as fma(x1, c1, x0 * c0).
 *
 * Border (every filtering method): pixels whose filter reaches outside the
 * source image are computed by replicating the edge pixels, one at a time;
 * the others by the row passes above. border is zorBorderRepl (1) with
 * any of the flags zorBorderInMemTop/Bottom/Left/Right (16/32/64/128): a
 * flagged side is read from memory beyond the image instead (one row or
 * column for linear, up to two for cubic, up to the taps a side for the
 * others). zorBorderInMem (240) alone reads memory on all sides. Other
 * values: zorStsBorderErr. The border value pointer is never read. The edge pixels of the 8u
 * fixed-point path round as ((v + ((v >> 14) & 1) + 8192) >> 14) of their
 * 14-bit sum, which may differ from the interior's rounding by one.
 *
 * Checks of every resize operation, in order: border value (-225), null
 * pointers (-8; pBorderValue not checked), zero dstSize (1, before the
 * record is looked at), record id (-13), negative dstSize (-6), 32f steps
 * not multiples of 4 (-16), dstOffset outside the destination (-11),
 * antialiasing record (-14), record of another method (-13). Steps are in
 * bytes; the 8u operation runs a float linear record. Images are
 * single-channel but for zoriResizeAntialiasing_8u_C3R. */
#ifndef ZORIRESIZE_H
#define ZORIRESIZE_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef struct ZoriResizeSpec ZoriResizeSpec;

/* Sizes in bytes of the record and the init buffer. Zero lengths give 1
 * (nothing written); linear needs a source of at least 2x2, cubic and
 * Lanczos 4x4 (-6); zoriInterSuper gives a size although no Init takes it;
 * antialiasing with nearest or super gives the plain sizes and 46. */
ZorStatus zoriResizeGetSize_8u(ZoriSize srcSize, ZoriSize dstSize,
                               ZoriInterpolationType interpolation, int32_t antialiasing,
                               int32_t* pSpecSize, int32_t* pInitBufSize);
ZorStatus zoriResizeGetSize_32f(ZoriSize srcSize, ZoriSize dstSize,
                                ZoriInterpolationType interpolation, int32_t antialiasing,
                                int32_t* pSpecSize, int32_t* pInitBufSize);
/* Work buffer for tiles up to dstSize with numChannels (1, 3 or 4); 48
 * with the size written when dstSize exceeds the record's destination. */
ZorStatus zoriResizeGetBufferSize_8u(const ZoriResizeSpec* pSpec, ZoriSize dstSize,
                                     Zor32u numChannels, int32_t* pBufSize);
ZorStatus zoriResizeGetBufferSize_32f(const ZoriResizeSpec* pSpec, ZoriSize dstSize,
                                      Zor32u numChannels, int32_t* pBufSize);
/* The source pixel a tile at dstOffset starts from (-11 outside the
 * destination). */
ZorStatus zoriResizeGetSrcOffset_8u(const ZoriResizeSpec* pSpec, ZoriPoint dstOffset,
                                    ZoriPoint* pSrcOffset);
ZorStatus zoriResizeGetSrcOffset_32f(const ZoriResizeSpec* pSpec, ZoriPoint dstOffset,
                                     ZoriPoint* pSrcOffset);
/* The source rectangle whose pixels the tile's centres fall on, with no
 * margin for filter taps; a tile reaching the last destination column or
 * row reaches the source's last one too. 48 when the tile was clipped. */
ZorStatus zoriResizeGetSrcRoi_8u(const ZoriResizeSpec* pSpec, ZoriPoint dstRoiOffset,
                                 ZoriSize dstRoiSize, ZoriPoint* pSrcRoiOffset,
                                 ZoriSize* pSrcRoiSize);

ZorStatus zoriResizeNearestInit_8u(ZoriSize srcSize, ZoriSize dstSize, ZoriResizeSpec* pSpec);
ZorStatus zoriResizeNearestInit_32f(ZoriSize srcSize, ZoriSize dstSize, ZoriResizeSpec* pSpec);
ZorStatus zoriResizeNearest_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                   int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
                                   const ZoriResizeSpec* pSpec, Zor8u* pBuffer);
ZorStatus zoriResizeNearest_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                    int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
                                    const ZoriResizeSpec* pSpec, Zor8u* pBuffer);

/* Sources of at least 2x2. _8u: fixed-point record; _32f: float record. */
ZorStatus zoriResizeLinearInit_8u(ZoriSize srcSize, ZoriSize dstSize, ZoriResizeSpec* pSpec);
ZorStatus zoriResizeLinearInit_32f(ZoriSize srcSize, ZoriSize dstSize, ZoriResizeSpec* pSpec);
ZorStatus zoriResizeLinear_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                  int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
                                  ZoriBorderType border, const Zor8u* pBorderValue,
                                  const ZoriResizeSpec* pSpec, Zor8u* pBuffer);
ZorStatus zoriResizeLinear_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                   int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
                                   ZoriBorderType border, const Zor32f* pBorderValue,
                                   const ZoriResizeSpec* pSpec, Zor8u* pBuffer);

/* Sources of at least 4x4. The floating-point control word is saved, set
 * to flush denormals while the weights are made, and restored. */
ZorStatus zoriResizeCubicInit_8u(ZoriSize srcSize, ZoriSize dstSize, Zor32f cubicB,
                                 Zor32f cubicC, ZoriResizeSpec* pSpec, Zor8u* pInitBuf);
ZorStatus zoriResizeCubicInit_32f(ZoriSize srcSize, ZoriSize dstSize, Zor32f cubicB,
                                  Zor32f cubicC, ZoriResizeSpec* pSpec, Zor8u* pInitBuf);
ZorStatus zoriResizeCubic_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                 int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
                                 ZoriBorderType border, const Zor8u* pBorderValue,
                                 const ZoriResizeSpec* pSpec, Zor8u* pBuffer);
ZorStatus zoriResizeCubic_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                  int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
                                  ZoriBorderType border, const Zor32f* pBorderValue,
                                  const ZoriResizeSpec* pSpec, Zor8u* pBuffer);

/* Lanczos: lobes 2 or 3 (else -14); sources of at least 4x4 (2 lobes) or
 * 6x6 (3 lobes), else -6 with the record left unusable. */
ZorStatus zoriResizeLanczosInit_8u(ZoriSize srcSize, ZoriSize dstSize, Zor32u lobes,
                                   ZoriResizeSpec* pSpec, Zor8u* pInitBuf);
ZorStatus zoriResizeLanczosInit_32f(ZoriSize srcSize, ZoriSize dstSize, Zor32u lobes,
                                    ZoriResizeSpec* pSpec, Zor8u* pInitBuf);
ZorStatus zoriResizeLanczos_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                   int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
                                   ZoriBorderType border, const Zor8u* pBorderValue,
                                   const ZoriResizeSpec* pSpec, Zor8u* pBuffer);
ZorStatus zoriResizeLanczos_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                    int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
                                    ZoriBorderType border, const Zor32f* pBorderValue,
                                    const ZoriResizeSpec* pSpec, Zor8u* pBuffer);

/* Antialiasing: sizes from zoriResizeGetSize_8u with antialiasing 1 and
 * the kernel's interpolation (linear, cubic or Lanczos); one record serves
 * the three operations. */
ZorStatus zoriResizeAntialiasingLinearInit(ZoriSize srcSize, ZoriSize dstSize,
                                           ZoriResizeSpec* pSpec, Zor8u* pInitBuf);
ZorStatus zoriResizeAntialiasingCubicInit(ZoriSize srcSize, ZoriSize dstSize, Zor32f cubicB,
                                          Zor32f cubicC, ZoriResizeSpec* pSpec,
                                          Zor8u* pInitBuf);
ZorStatus zoriResizeAntialiasingLanczosInit(ZoriSize srcSize, ZoriSize dstSize, Zor32u lobes,
                                            ZoriResizeSpec* pSpec, Zor8u* pInitBuf);
ZorStatus zoriResizeAntialiasing_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                        int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
                                        ZoriBorderType border, const Zor8u* pBorderValue,
                                        const ZoriResizeSpec* pSpec, Zor8u* pBuffer);
ZorStatus zoriResizeAntialiasing_8u_C3R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                        int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
                                        ZoriBorderType border, const Zor8u* pBorderValue,
                                        const ZoriResizeSpec* pSpec, Zor8u* pBuffer);
ZorStatus zoriResizeAntialiasing_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                         int32_t dstStep, ZoriPoint dstOffset, ZoriSize dstSize,
                                         ZoriBorderType border, const Zor32f* pBorderValue,
                                         const ZoriResizeSpec* pSpec, Zor8u* pBuffer);

#ifdef __cplusplus
}
#endif

#endif
