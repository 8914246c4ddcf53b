// The general filter with border: sizes, the record, and the driver that
// cuts a ROI into rectangles so that the kernels never test coordinates.
// Four thin bands at the edges run over small framed temporaries in the
// caller's buffer; the centre runs on the caller's image. A ROI no larger
// than the kernel is framed whole.
#include "variant.h"

#include <string.h>

#include "bands.h"
#include "border_type.h"
#include "pifilter.h"

ZOR_BEGIN
namespace filt {
namespace {

typedef __int128 big;  // size arithmetic that can't wrap

constexpr big kMaxSize = 0x7fffffff;

inline int32_t elem_bytes(int32_t dataType) {
    switch (dataType) {
    case zor8u: return 1;
    case zor16u:
    case zor16s: return 2;
    case zor32f: return 4;
    default: return 8;
    }
}

// The frame buffer: the larger of the bands' temporaries, or the whole
// frame when the ROI is not larger than the kernel; 32-byte rounded, plus
// the 32 bytes its start is aligned by.
big border_bytes(int32_t kw, int32_t kh, int32_t w, int32_t h, int32_t es, int32_t c) {
    const int32_t ax = (kw - 1) >> 1, ay = (kh - 1) >> 1;
    big a;
    if (kw < w && kh < h) {
        // 2-wide kernels count the extra column and row of a mirror.
        const int32_t right = kw == 2 ? 2 - ax : kw - ax - 1;
        const int32_t bottom = kh == 2 ? 2 - ay : kh - ay - 1;
        a = bottom > 0 ? (big)(w + (big)kw - 1) * (kh + bottom - 1) : 0;
        if (right > 0) {
            const big side = (big)(kw + right - 1) * ((big)kh + h - 1);
            if (side > a) a = side;
        }
    } else {
        a = ((big)w + kw - 1) * ((big)h + kh - 1);
    }
    a *= es;
    return ((c * a + 31) & ~(big)31) + 32;
}

// Work area of the kernels, before rounding (0: none).
big kernel_x(int32_t kernelType, int32_t dataType, int32_t c, int32_t kw, int32_t kh, int32_t w) {
    const big S = (big)kw * kh, W = w;
    if (kernelType == zor32f) {
        if (dataType == zor32f) return c == 1 ? S * 32 : c == 2 ? 0 : S * 16;
        if (dataType == zor16s && c == 1 && kw == 1) return ((W + 7) >> 2) * 16;
        switch (c) {
        case 1: return 4 * (((W + 3) & ~(big)3) * 2 + ((4 * S + 2 * W + 10) & ~(big)3));
        case 3: return ((3 * W + 3) >> 2) * 32 + ((4 * S + 6 * W + 10) >> 2) * 16;
        case 4: return (4 * S + 16 * W) * 4;
        default: return 0;
        }
    }
    if (dataType == zor32f) return 0;
    if (dataType == zor16s) {
        switch (c) {
        case 1: return ((8 * S + W + 3) >> 2) * 16;
        case 3: return ((4 * S + 3 * W + 31) >> 2) * 16;
        case 4: return (((S + W) * 4 + 31) >> 2) * 16;
        default: return 0;
        }
    }
    // 8u data with 16-bit taps.
    const big K = kw, H = kh;
    switch (c) {
    case 1:
        if (kw == 1) return 80 * H + ((W + 3) >> 2) * 32;
        if (kh == 1) return ((W + 4 * K + 3) >> 2) * 16;
        return ((((K + 1) >> 1) * 16 * H + W + 7) >> 3) * 32;
    case 3:
        if (kw == 1) return (80 * H + ((W + 3) >> 2) * 32) * 3;
        if (kh == 1) return ((3 * W + 4 * K + 3) >> 2) * 16;
        return ((4 * S + 3 * W + 3) >> 2) * 16;
    case 4:
        if (kw == 1) return (80 * H + ((W + 3) >> 2) * 32) * 4;
        if (kh == 1) return (W + K) * 16;
        return (S + W) * 16;
    default: return 0;
    }
}

inline big round64(big x) { return (x + 63) & ~(big)63; }

// The driver: the band cutter with the kernel's four reaches (the anchor
// is the centre, so an even kernel reaches one more to the right and
// down); each rectangle's kernel starts at its window's top-left pixel.
template <typename T>
ZorStatus drive(const T* src, int32_t srcStep, T* dst, int32_t dstStep, int32_t W, int32_t H,
                int32_t borderType, T value, const Record& s, Zor8u* buffer) {
    const int32_t kw = s.kernelWidth, kh = s.kernelHeight;
    const int32_t ax = (kw - 1) >> 1, ay = (kh - 1) >> 1;
    T* tmp = align_up((T*)buffer, 32);
    const big frameBytes = border_bytes(kw, kh, W, H, (int32_t)sizeof(T), 1);
    float* work = (float*)align_up((Zor8u*)tmp + (ptrdiff_t)frameBytes, 64);
    const bands::Border<T> border = {zorBorderKind(borderType), borderType & zorBorderFlagMask,
                                     value, bands::copies<T>()};
    return bands::cut(
        src, srcStep, W, H, bands::Reach{ax, kw - ax - 1, ay, kh - ay - 1}, border, tmp,
        [&](int32_t, const T* p, int32_t ps, int32_t x, int32_t y, int32_t w, int32_t h) {
            run(bands::at(p, ps, -ay, -ax), ps, bands::at(dst, dstStep, y, x), dstStep, w, h, s,
                work);
        });
}

template <typename T>
ZorStatus filter_entry(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep, ZoriSize roi,
                       int32_t borderType, const T* pBorderValue,
                       const ZoriFilterBorderSpec* pSpec, Zor8u* pBuffer) {
    if (!pSrc || !pDst || !pSpec || !pBuffer) return zorStsNullPtrErr;
    if (zorBorderKind(borderType) == zorBorderConst && !pBorderValue) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1) return zorStsSizeErr;
    if (srcStep < 1 || (int64_t)dstStep < (int64_t)roi.width * (int64_t)sizeof(T))
        return zorStsStepErr;
    if (zorBorderTypeCheck(borderType,
                           zorBorderAcceptRepl | zorBorderAcceptMirror | zorBorderAcceptConst,
                           zorBorderLimit) != zorStsNoErr)
        return zorStsBorderErr;
    const T value = zorBorderKind(borderType) == zorBorderConst ? *pBorderValue : T();
    // No frame copy fails on a ROI that GetSize accepted: sizes are
    // positive and a temporary's row is shorter than the buffer. Their
    // status is passed on all the same, for a ROI beyond what the buffer
    // was sized for.
    return drive(pSrc, srcStep, pDst, dstStep, roi.width, roi.height, borderType, value,
                 *record_of(pSpec), pBuffer);
}

}  // namespace
}  // namespace filt
ZOR_END

using namespace ZOR_NS::filt;

ZOR_ENTRY ZorStatus ZOR_NAME(zoriFilterBorderGetSize)(ZoriSize kernelSize, ZoriSize dstRoiSize,
                                                     ZorDataType dataType, ZorDataType kernelType,
                                                     int32_t numChannels, int32_t* pSpecSize,
                                                     int32_t* pBufferSize) {
    const int32_t kw = kernelSize.width, kh = kernelSize.height;
    const int32_t w = dstRoiSize.width, h = dstRoiSize.height;
    if (kw < 1 || kh < 1 || w < 1 || h < 1) return zorStsSizeErr;
    const big S = (big)kw * kh;
    if (kernelType == zor64f) {
        if (dataType != zor64f) return zorStsDataTypeErr;
        if (numChannels != 1) return zorStsChannelErr;
        if (!pSpecSize || !pBufferSize) return zorStsNullPtrErr;
        int32_t buf64 = 0;
        if (ZOR_NAME(zoriFilterGetBufSize_64f_C1R)(kernelSize, w, &buf64) != zorStsNoErr) {
            *pBufferSize = 0;
            return zorStsExceededSizeErr;
        }
        const big rec = round64(S * 8) + 191;
        const big buf = border_bytes(kw, kh, w, h, 8, 1) + buf64 + 126;
        if (buf > kMaxSize || rec > kMaxSize) {
            *pBufferSize = 0;
            return zorStsExceededSizeErr;
        }
        *pSpecSize = (int32_t)rec;
        *pBufferSize = (int32_t)buf;
        return zorStsNoErr;
    }
    if ((dataType != zor8u && dataType != zor16u && dataType != zor16s && dataType != zor32f) ||
        (kernelType != zor16s && kernelType != zor32f))
        return zorStsDataTypeErr;
    if (numChannels < 1 || numChannels > 4) return zorStsChannelErr;
    if (!pSpecSize || !pBufferSize) return zorStsNullPtrErr;
    int32_t kt = kernelType;
    // 16-bit taps are answered as float taps for 16u data and for the 16s
    // shapes that have no 16-bit-tap kernel. 32f data keeps the 16-bit
    // answer, which has no kernel work area.
    if (kt == zor16s &&
        (dataType == zor16u ||
         (dataType == zor16s && (numChannels == 3 || numChannels == 4 || kw == 1 || kh == 1 ||
                                 (numChannels == 1 && kw < 3)))))
        kt = zor32f;
    const big x = kernel_x(kt, dataType, numChannels, kw, kh, w);
    const big kernelBytes = x == 0 ? 0 : (x + 191) & ~(big)63;
    const big buf = border_bytes(kw, kh, w, h, elem_bytes(dataType), numChannels) + kernelBytes + 63;
    if (buf > kMaxSize) {
        *pBufferSize = 0;
        return zorStsExceededSizeErr;
    }
    const big e = kt == zor16s ? 2 : 4;
    big rec = round64(S * e) + 191 + round64((((big)kw + 1) & ~(big)1) * 5 * kh * 16);
    if (kt == zor32f && numChannels != 2) rec += round64(S * 16);
    if (rec > kMaxSize) {
        *pBufferSize = 0;
        return zorStsExceededSizeErr;
    }
    *pSpecSize = (int32_t)rec;
    *pBufferSize = (int32_t)buf;
    return zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriFilterBorderInit_32f)(const Zor32f* pKernel, ZoriSize kernelSize,
                                                      ZorDataType dataType, int32_t numChannels,
                                                      int32_t roundMode,
                                                      ZoriFilterBorderSpec* pSpec) {
    if (!pKernel || !pSpec) return zorStsNullPtrErr;
    if (kernelSize.width < 1 || kernelSize.height < 1) return zorStsSizeErr;
    if (dataType != zor8u && dataType != zor16u && dataType != zor16s && dataType != zor32f)
        return zorStsDataTypeErr;
    if (numChannels < 1 || numChannels > 4) return zorStsChannelErr;
    // The accuracy hint is the value 16 added to a mode. There is no more
    // accurate filter to give: the hint is taken off and answered with a
    // warning, and the record works with the plain mode.
    const int32_t hint = 16;
    const int32_t mode = roundMode & ~hint;
    if ((uint32_t)mode > 2) return zorStsRoundModeNotSupportedErr;

    Record* s = (Record*)ZOR_NS::align_up((Zor8u*)pSpec, 64);
    const int32_t kw = kernelSize.width, kh = kernelSize.height;
    const ptrdiff_t n = (ptrdiff_t)kw * kh;
    float* taps = (float*)((Zor8u*)s + kHeadBytes);
    float* table = (float*)((Zor8u*)taps + ((n * 4 + 63) & ~(ptrdiff_t)63));
    s->specId = dataType == zor8u ? 3 : dataType == zor16u ? 5 : dataType == zor16s ? 4 : 6;
    s->kernelWidth = kw;
    s->kernelHeight = kh;
    s->roundMode = mode;
    s->bias[0] = 0;
    s->bias[1] = 0;
    s->pTaps = taps;
    s->pBroadcastTaps = table;
    s->numChannels = numChannels;
    if (pKernel == taps) {
        for (ptrdiff_t k = 0, m = n - 1; k < m; ++k, --m) {
            const float t = taps[k];
            taps[k] = taps[m];
            taps[m] = t;
        }
    } else {
        for (ptrdiff_t k = 0; k < n; ++k) taps[k] = pKernel[n - 1 - k];
    }
    // Four copies of each tap in the caller's order (the 16-bit data
    // takes them in pairs along a kernel row, which lands on the same
    // places); 16s taps are scaled by 2^-16 for pixels in the upper half
    // of a 32-bit lane. The 32f kernels read the reversed taps: no table.
    if (numChannels != 2 && dataType != zor32f) {
        const float scale = dataType == zor16s ? 1.0f / 65536.0f : 1.0f;
        for (int32_t j = 0; j < kh; ++j) {
            for (int32_t i = 0; i < kw; ++i) {
                const ptrdiff_t k = (ptrdiff_t)j * kw + i;
                const float t = taps[n - 1 - k] * scale;
                for (int c = 0; c < 4; ++c) table[4 * k + c] = t;
            }
        }
    }
    return roundMode & hint ? zorStsAccurateModeNotSupported : zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriFilterBorder_8u_C1R)(const Zor8u* pSrc, int32_t srcStep,
                                                     Zor8u* pDst, int32_t dstStep,
                                                     ZoriSize dstRoiSize, int32_t borderType,
                                                     const Zor8u* pBorderValue,
                                                     const ZoriFilterBorderSpec* pSpec,
                                                     Zor8u* pBuffer) {
    return filter_entry(pSrc, srcStep, pDst, dstStep, dstRoiSize, borderType, pBorderValue, pSpec,
                        pBuffer);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriFilterBorder_16u_C1R)(const Zor16u* pSrc, int32_t srcStep,
                                                      Zor16u* pDst, int32_t dstStep,
                                                      ZoriSize dstRoiSize, int32_t borderType,
                                                      const Zor16u* pBorderValue,
                                                      const ZoriFilterBorderSpec* pSpec,
                                                      Zor8u* pBuffer) {
    return filter_entry(pSrc, srcStep, pDst, dstStep, dstRoiSize, borderType, pBorderValue, pSpec,
                        pBuffer);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriFilterBorder_16s_C1R)(const Zor16s* pSrc, int32_t srcStep,
                                                      Zor16s* pDst, int32_t dstStep,
                                                      ZoriSize dstRoiSize, int32_t borderType,
                                                      const Zor16s* pBorderValue,
                                                      const ZoriFilterBorderSpec* pSpec,
                                                      Zor8u* pBuffer) {
    return filter_entry(pSrc, srcStep, pDst, dstStep, dstRoiSize, borderType, pBorderValue, pSpec,
                        pBuffer);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriFilterBorder_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                      Zor32f* pDst, int32_t dstStep,
                                                      ZoriSize dstRoiSize, int32_t borderType,
                                                      const Zor32f* pBorderValue,
                                                      const ZoriFilterBorderSpec* pSpec,
                                                      Zor8u* pBuffer) {
    return filter_entry(pSrc, srcStep, pDst, dstStep, dstRoiSize, borderType, pBorderValue, pSpec,
                        pBuffer);
}
