// The general filter with border: sizes, the record, and the driver that
// cuts a ROI into rectangles so that the kernels never test coordinates.
// Four thin bands at the edges run over small framed temporaries in the
// caller's buffer; the centre runs on the caller's image. A ROI no larger
// than the kernel is framed whole.
#include "variant.h"

#include <string.h>

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

// The three frame copies per element type, as overloads.
#define ZOR_FILTER_FRAMES(T, t)                                                                 \
    inline void repl(const T* s, int32_t ss, ZoriSize sr, T* d, int32_t ds, ZoriSize dr,       \
                     int32_t top, int32_t left) {                                               \
        ZOR_NAME(zoriCopyReplicateBorder_##t##_C1R)(s, ss, sr, d, ds, dr, top, left);           \
    }                                                                                           \
    inline void mirr(const T* s, int32_t ss, ZoriSize sr, T* d, int32_t ds, ZoriSize dr,       \
                     int32_t top, int32_t left) {                                               \
        ZOR_NAME(zoriCopyMirrorBorder_##t##_C1R)(s, ss, sr, d, ds, dr, top, left);              \
    }                                                                                           \
    inline void cnst(const T* s, int32_t ss, ZoriSize sr, T* d, int32_t ds, ZoriSize dr,       \
                     int32_t top, int32_t left, T v) {                                          \
        ZOR_NAME(zoriCopyConstBorder_##t##_C1R)(s, ss, sr, d, ds, dr, top, left, v);            \
    }
ZOR_FILTER_FRAMES(Zor8u, 8u)
ZOR_FILTER_FRAMES(Zor16u, 16u)
ZOR_FILTER_FRAMES(Zor16s, 16s)
ZOR_FILTER_FRAMES(Zor32f, 32f)
#undef ZOR_FILTER_FRAMES

// One framed temporary: a source rectangle at the temporary's (left, top),
// the rest made up by the border kind. Rows of the temporary are exactly
// its width apart.
template <typename T>
void make_frame(int32_t kind, const T* src, int32_t srcStep, int32_t sw, int32_t sh, T* tmp,
                int32_t tw, int32_t th, int32_t top, int32_t left, T value) {
    const int32_t ts = tw * (int32_t)sizeof(T);
    if (kind == zorBorderRepl)
        repl(src, srcStep, {sw, sh}, tmp, ts, {tw, th}, top, left);
    else if (kind == zorBorderMirror)
        mirr(src, srcStep, {sw, sh}, tmp, ts, {tw, th}, top, left);
    else
        cnst(src, srcStep, {sw, sh}, tmp, ts, {tw, th}, top, left, value);
}

template <typename T> inline const T* at(const T* p, int32_t step, int32_t dy, int32_t dx) {
    return (const T*)((const uint8_t*)p + (ptrdiff_t)dy * step) + dx;
}
template <typename T> inline T* at(T* p, int32_t step, int32_t dy, int32_t dx) {
    return (T*)((uint8_t*)p + (ptrdiff_t)dy * step) + dx;
}

template <typename T>
void drive(const T* src, int32_t srcStep, T* dst, int32_t dstStep, int32_t W, int32_t H,
           int32_t borderType, T value, const Record& s, Zor8u* buffer) {
    const int32_t kw = s.kernelWidth, kh = s.kernelHeight;
    const int32_t ax = (kw - 1) >> 1, ay = (kh - 1) >> 1;
    const int32_t kind = zorBorderKind(borderType);
    const bool small = W <= kw || H <= kh;
    // right0/bottom0: what the kernel reads beyond the ROI; right/bottom:
    // the band widths, one more for a mirror with 2-wide kernels, whose
    // band would otherwise frame a single column (or row) and replicate it.
    const int32_t right0 = kw - ax - 1, bottom0 = kh - ay - 1;
    int32_t right = right0, bottom = bottom0;
    if (!small && kind == zorBorderMirror) {
        if (kw == 2) right = 2;
        if (kh == 2) bottom = 2;
    }
    // A side that needs no pixels counts as being in memory.
    int32_t flags = borderType & zorBorderFlagMask;
    if (ax == 0) {
        flags |= zorBorderInMemLeft;
        if (right == 0) flags |= zorBorderInMemRight;
    }
    if (ay == 0) {
        flags |= zorBorderInMemTop;
        if (bottom == 0) flags |= zorBorderInMemBottom;
    }

    T* tmp = align_up((T*)buffer, 32);
    const big frameBytes = border_bytes(kw, kh, W, H, (int32_t)sizeof(T), 1);
    float* work = (float*)align_up((Zor8u*)tmp + (ptrdiff_t)frameBytes, 64);

    if (flags == zorBorderInMem) {
        run(at(src, srcStep, -ay, -ax), srcStep, dst, dstStep, W, H, s, work);
        return;
    }
    const bool inT = flags & zorBorderInMemTop, inB = flags & zorBorderInMemBottom;
    const bool inL = flags & zorBorderInMemLeft, inR = flags & zorBorderInMemRight;

    if (small) {
        // One frame for the whole ROI; sides in memory enlarge the copied
        // rectangle instead of being made up.
        const int32_t tw = W + kw - 1, th = H + kh - 1;
        const int32_t sw = W + (inL ? ax : 0) + (inR ? right0 : 0);
        const int32_t sh = H + (inT ? ay : 0) + (inB ? bottom0 : 0);
        make_frame(kind, at(src, srcStep, inT ? -ay : 0, inL ? -ax : 0), srcStep, sw, sh, tmp, tw,
                   th, inT ? 0 : ay, inL ? 0 : ax, value);
        run(tmp, tw * (int32_t)sizeof(T), dst, dstStep, W, H, s, work);
        return;
    }

    // Top and bottom bands span the full width; their corners come from
    // memory where the left or right side is there, else from the frame.
    const int32_t bandX = inL ? -ax : 0;
    const int32_t bandW = W + (inL ? ax : 0) + (inR ? right0 : 0);
    const int32_t bandLeft = inL ? 0 : ax;
    const int32_t bandTw = W + kw - 1;
    if (!inT) {
        make_frame(kind, at(src, srcStep, 0, bandX), srcStep, bandW, kh - 1, tmp, bandTw,
                   ay + kh - 1, ay, bandLeft, value);
        run(tmp, bandTw * (int32_t)sizeof(T), dst, dstStep, W, ay, s, work);
        src = at(src, srcStep, ay, 0);
        dst = at(dst, dstStep, ay, 0);
        H -= ay;
    }
    if (!inB) {
        const int32_t rows = bottom + ay;  // kh - 1, or kh for the mirror case
        make_frame(kind, at(src, srcStep, H - rows, bandX), srcStep, bandW, rows, tmp, bandTw,
                   rows + bottom0, 0, bandLeft, value);
        run(tmp, bandTw * (int32_t)sizeof(T), at(dst, dstStep, H - bottom, 0), dstStep, W, bottom,
            s, work);
        H -= bottom;
    }
    // Left and right bands need no vertical frame: the rows above and below
    // what remains are real, taken off by the bands above or in memory.
    if (!inL) {
        const int32_t tw = kw + ax - 1, th = kh + H - 1;
        make_frame(kind, at(src, srcStep, -ay, 0), srcStep, kw - 1, th, tmp, tw, th, 0, ax, value);
        run(tmp, tw * (int32_t)sizeof(T), dst, dstStep, ax, H, s, work);
        src += ax;
        dst += ax;
        W -= ax;
    }
    if (!inR) {
        const int32_t cols = right + ax;  // kw - 1, or kw for the mirror case
        const int32_t tw = cols + right0, th = kh + H - 1;
        make_frame(kind, at(src, srcStep, -ay, W - cols), srcStep, cols, th, tmp, tw, th, 0, 0,
                   value);
        run(tmp, tw * (int32_t)sizeof(T), dst + (W - right), dstStep, right, H, s, work);
        W -= right;
    }
    run(at(src, srcStep, -ay, -ax), srcStep, dst, dstStep, W, H, s, work);
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
    drive(pSrc, srcStep, pDst, dstStep, roi.width, roi.height, borderType, value,
          *record_of(pSpec), pBuffer);
    return zorStsNoErr;
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
    const int32_t hint = 0x10000;
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
