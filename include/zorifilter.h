/* zor: general two-dimensional linear filter with border.
 *
 * The filter is a correlation with the kernel as written, anchored at its
 * centre. For a kernel kw wide and kh high (row-major, kw * kh floats),
 * ax = (kw - 1) / 2 and ay = (kh - 1) / 2 (rounded down):
 *
 *     dst(x, y) = sum over j < kh, i < kw of
 *                 kernel[j * kw + i] * src(x + i - ax, y + j - ay)
 *
 * Source pixels outside the ROI are read from memory on the sides that the
 * border type flags as in memory, and made up by the border kind on the
 * others (see below); only ROI pixels of the destination are written.
 *
 * Arithmetic: every sum is formed in single-precision float, also for
 * integer pixels, kernel rows in order. Levels l9, n0 and k0 use fused
 * multiply-add in their vector paths, so the last bit of a 32f result may
 * differ between levels. Integer results are then converted:
 *   - narrow rectangles (the scalar path: the left and right bands of the
 *     ROI, ROIs up to 16 pixels wide or kernels up to 2 wide on the SSE
 *     levels m7, n8, y8, and ROIs under 8 pixels wide on e9 and above)
 *     saturate and round by the record's roundMode: 0 toward zero,
 *     1 to nearest with ties to even, 2 half away from zero;
 *   - everything else (the vector paths) saturates and rounds to nearest
 *     with ties to even, whatever roundMode says.
 * So with roundMode 0 or 2 a ROI can show a seam between the edge columns
 * and the rest. 32f results are stored as summed.
 *
 * Calling order: zoriFilterBorderGetSize, allocate specSize and
 * bufferSize bytes, zoriFilterBorderInit_32f once, then any number of
 * zoriFilterBorder_* calls. The record is read-only during a call, so
 * several threads may share it, each with a buffer of its own. The record
 * is placed at the first 64-byte boundary of the caller's block and holds
 * pointers into it: it can't be moved or copied byte for byte.
 */
#ifndef ZORIFILTER_H
#define ZORIFILTER_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Opaque record made by zoriFilterBorderInit_32f. */
typedef struct ZoriFilterBorderSpec ZoriFilterBorderSpec;

/* Sizes in bytes of the record and of the work buffer for a kernel and the
 * largest ROI the filter will be called with (a call with a larger ROI
 * overruns the buffer; nothing checks it). dataType and kernelType:
 * zor8u, zor16u, zor16s, zor32f (data) with zor16s or zor32f (taps), or
 * zor64f for both with one channel. Records made by
 * zoriFilterBorderInit_32f have float taps: size them with kernelType
 * zor32f. 16-bit taps are answered as float taps for 16u data and for 16s
 * data with 3 or 4 channels, a kernel 1 wide or 1 high, or one channel and
 * a kernel under 3 wide; 32f data with 16-bit taps gets no work area.
 * Checks, in this order:
 *   zorStsSizeErr (-6)          a side of kernelSize or dstRoiSize below 1
 *   zorStsDataTypeErr (-59)     a type outside the sets above
 *   zorStsChannelErr (-47)      numChannels not 1..4 (1 for zor64f)
 *   zorStsNullPtrErr (-8)       a null result pointer
 *   zorStsExceededSizeErr (-232) a size beyond 2^31 - 1; *pBufferSize
 *                               is then set to 0 */
ZorStatus zoriFilterBorderGetSize(ZoriSize kernelSize, ZoriSize dstRoiSize, ZorDataType dataType,
                                  ZorDataType kernelType, int32_t numChannels,
                                  int32_t* pSpecSize, int32_t* pBufferSize);

/* Fills the record from a float kernel (kernelSize.width *
 * kernelSize.height taps, row-major, applied as written). dataType names
 * the pixels the record is meant for (zor8u, zor16u, zor16s, zor32f); a
 * record applied to another type gives wrong pixels, not an error.
 * roundMode 0, 1 or 2 as above; bit 16 (0x10000) asks for an accurate
 * mode that isn't offered: it is removed and reported by a warning.
 * The kernel may lie where the record keeps its taps (128 bytes after the
 * first 64-byte boundary of pSpec); it is then reversed in place.
 * Checks, in this order:
 *   zorStsNullPtrErr (-8)       pKernel or pSpec null
 *   zorStsSizeErr (-6)          a kernel side below 1
 *   zorStsDataTypeErr (-59)     dataType not one of the four above
 *   zorStsChannelErr (-47)      numChannels not 1..4
 *   zorStsRoundModeNotSupportedErr (-213)  roundMode without bit 16
 *                               outside 0..2 (negative values included)
 * Returns zorStsAccurateModeNotSupported (52), a warning with a usable
 * record, when bit 16 was set. */
ZorStatus zoriFilterBorderInit_32f(const Zor32f* pKernel, ZoriSize kernelSize,
                                   ZorDataType dataType, int32_t numChannels, int32_t roundMode,
                                   ZoriFilterBorderSpec* pSpec);

/* Filters dstRoiSize pixels of one channel. pSrc and pDst point to the
 * ROI's first pixel; steps are in bytes and need no alignment.
 * borderType: kind zorBorderRepl (1: nearest ROI pixel), zorBorderMirror
 * (3: reflection about the edge pixel, which is not repeated) or
 * zorBorderConst (6: *pBorderValue), combined with the flags
 * zorBorderInMemTop/Bottom/Left/Right (16/32/64/128) for sides whose
 * pixels exist in memory and are read; zorBorderInMem (240) alone means
 * all four sides are in memory. pBorderValue is read for the constant
 * kind only. pBuffer: bufferSize bytes from zoriFilterBorderGetSize,
 * scratch only.
 * Checks, in this order:
 *   zorStsNullPtrErr (-8)       pSrc, pDst, pSpec or pBuffer null, or a
 *                               constant border with pBorderValue null
 *   zorStsSizeErr (-6)          a side of dstRoiSize below 1
 *   zorStsStepErr (-16)         srcStep < 1 or dstStep below a row
 *   zorStsBorderErr (-225)      borderType above 255, or a kind other
 *                               than 1, 3, 6 (240 alone is accepted) */
ZorStatus zoriFilterBorder_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                  int32_t dstStep, ZoriSize dstRoiSize, int32_t borderType,
                                  const Zor8u* pBorderValue, const ZoriFilterBorderSpec* pSpec,
                                  Zor8u* pBuffer);
ZorStatus zoriFilterBorder_16u_C1R(const Zor16u* pSrc, int32_t srcStep, Zor16u* pDst,
                                   int32_t dstStep, ZoriSize dstRoiSize, int32_t borderType,
                                   const Zor16u* pBorderValue, const ZoriFilterBorderSpec* pSpec,
                                   Zor8u* pBuffer);
ZorStatus zoriFilterBorder_16s_C1R(const Zor16s* pSrc, int32_t srcStep, Zor16s* pDst,
                                   int32_t dstStep, ZoriSize dstRoiSize, int32_t borderType,
                                   const Zor16s* pBorderValue, const ZoriFilterBorderSpec* pSpec,
                                   Zor8u* pBuffer);
ZorStatus zoriFilterBorder_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                   int32_t dstStep, ZoriSize dstRoiSize, int32_t borderType,
                                   const Zor32f* pBorderValue, const ZoriFilterBorderSpec* pSpec,
                                   Zor8u* pBuffer);

#ifdef __cplusplus
}
#endif

#endif
