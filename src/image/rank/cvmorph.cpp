// Erosion and dilation with border: the size query, the record that
// classifies the mask once, the argument checks and the driver. The driver
// cuts the ROI like the general filter does: thin bands at the edges run
// over small framed temporaries in the caller's buffer, the centre runs on
// the caller's image, and a ROI no larger than the mask is framed whole, so
// that the kernels never test coordinates.
#include "variant.h"

#include <string.h>

#include "border_type.h"
#include "bands.h"
#include "morph_internal.h"

ZOR_BEGIN
namespace morph {
namespace {

constexpr int32_t kMaxMaskSide = 32767;  // columns are kept in 16 bits
constexpr int64_t kMaxSize = 0x7fffffff;

inline int64_t round32(int64_t x) { return (x + 31) & ~(int64_t)31; }

template <typename P> inline P* align32(P* p) {
    return (P*)(((uintptr_t)p + 31) & ~(uintptr_t)31);
}

// The frame area in elements: the larger band temporary, or the whole
// framed ROI when the ROI is not larger than the mask.
int64_t frame_elems(int32_t mw, int32_t mh, int32_t ax, int32_t ay, int64_t W, int64_t H) {
    const int64_t w = mw, h = mh;
    if (w < W && h < H) {
        const int64_t bottom = h - ay - 1, right = w - ax - 1;
        int64_t a = bottom > 0 ? (w + W - 1) * (2 * h - ay - 2) : 0;
        if (right > 0) {
            const int64_t side = (h + H - 1) * (2 * w - ax - 2);
            if (side > a) a = side;
        }
        return a;
    }
    return (w + W - 1) * (h + H - 1);
}

ZorStatus get_size(ZoriSize roi, ZoriSize mask, int32_t e, int32_t* pSpecSize,
                   int32_t* pBufferSize) {
    if (!pSpecSize || !pBufferSize) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1 || mask.width < 1 || mask.height < 1)
        return zorStsSizeErr;
    if (mask.width > kMaxMaskSide || mask.height > kMaxMaskSide) return zorStsMaskSizeErr;
    const int64_t w = mask.width | 1, h = mask.height | 1;
    const int64_t rec = h * ((w + 1) * 2 + w) + 136 + (w + 1) * h * 2;
    const int64_t a =
        frame_elems((int32_t)w, (int32_t)h, mask.width >> 1, mask.height >> 1, roi.width,
                    roi.height) *
        e;
    const int64_t ring = round32((int64_t)roi.width * e) * h + round32(w * e) + 16 * e;
    const int64_t buf = round32(a) + ring + 64;
    if (rec > kMaxSize || buf > kMaxSize) {
        *pSpecSize = 0;
        *pBufferSize = 0;
        return zorStsExceededSizeErr;
    }
    *pSpecSize = (int32_t)rec;
    *pBufferSize = (int32_t)buf;
    return zorStsNoErr;
}

inline void wr16(uint8_t* p, ptrdiff_t i, int32_t v) {
    const uint16_t u = (uint16_t)v;
    memcpy(p + 2 * i, &u, 2);
}

// The three fixed shapes, row by row, as half-widths of a centred run.
const int8_t kShape3[3] = {0, 1, 0};
const int8_t kShape5[5] = {0, 1, 2, 1, 0};
const int8_t kShape7[7] = {0, 2, 2, 3, 2, 2, 0};

bool is_shape(const uint8_t* m, int32_t mw, int32_t mh, const int8_t* hw, int32_t n) {
    if (mw != n || mh != n) return false;
    const int32_t c = n >> 1;
    for (int32_t r = 0; r < n; ++r)
        for (int32_t x = 0; x < n; ++x) {
            const bool want = x >= c - hw[r] && x <= c + hw[r];
            if ((m[r * n + x] != 0) != want) return false;
        }
    return true;
}

ZorStatus init(ZoriSize roi, const Zor8u* pMask, ZoriSize mask, ZoriMorphState* pState,
               const Zor8u* pBuffer) {
    if (!pMask || !pState || !pBuffer) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1 || mask.width < 1 || mask.height < 1)
        return zorStsSizeErr;
    if (mask.width > kMaxMaskSide || mask.height > kMaxMaskSide) return zorStsMaskSizeErr;

    const int32_t cw = mask.width, ch = mask.height;
    const int32_t mw = cw | 1, mh = ch | 1;
    uint8_t* base = (uint8_t*)pState;
    uint8_t* m = base + sizeof(Head);
    uint8_t* lists = m + (ptrdiff_t)mw * mh;
    uint8_t* runs = lists + (ptrdiff_t)mh * (mw + 1) * 2;

    // Turned by 180 degrees; the padding of an even side lies behind the
    // caller's last row or column, so at stored index 0.
    for (int32_t r = 0; r < mh; ++r) {
        const int32_t cr = mh - 1 - r;
        for (int32_t c = 0; c < mw; ++c) {
            const int32_t cc = mw - 1 - c;
            const bool set = cr < ch && cc < cw && pMask[(ptrdiff_t)cr * cw + cc] != 0;
            m[(ptrdiff_t)r * mw + c] = set ? 255 : 0;
        }
    }

    Head hd;
    memset(&hd, 0, sizeof hd);
    hd.pMask = m;
    hd.maskWidth = mw;
    hd.maskHeight = mh;
    hd.anchorX = cw >> 1;
    hd.anchorY = ch >> 1;
    hd.pRowLists = lists;
    hd.pRuns = runs;
    hd.callerWidth = cw;
    hd.callerHeight = ch;

    // Row lists, runs, and the row counts the cross test needs.
    int64_t total = 0;
    int32_t fullRows = 0, fullRow = -1, crowdedRows = 0;
    hd.isRowRuns = 1;
    for (int32_t r = 0; r < mh; ++r) {
        const uint8_t* row = m + (ptrdiff_t)r * mw;
        uint8_t* list = lists + (ptrdiff_t)r * (mw + 1) * 2;
        int32_t n = 0, first = -1, last = -1;
        for (int32_t c = 0; c < mw; ++c) {
            if (!row[c]) continue;
            wr16(list, 1 + n, c);
            ++n;
            if (first < 0) first = c;
            else if (c != last + 1) hd.isRowRuns = 0;
            last = c;
        }
        wr16(list, 0, n);
        wr16(runs, 2 * r, first);
        wr16(runs, 2 * r + 1, last);
        total += n;
        if (n == mw) {
            ++fullRows;
            fullRow = r;
        } else if (n > 1) {
            ++crowdedRows;
        }
    }
    int32_t fullCols = 0, fullCol = -1, crowdedCols = 0;
    for (int32_t c = 0; c < mw; ++c) {
        int32_t n = 0;
        for (int32_t r = 0; r < mh; ++r) n += m[(ptrdiff_t)r * mw + c] != 0;
        if (n == mh) {
            ++fullCols;
            fullCol = c;
        } else if (n > 1) {
            ++crowdedCols;
        }
    }
    hd.isCross = fullRows == 1 && fullCols == 1 && crowdedRows == 0 && crowdedCols == 0 &&
                 mw >= 2 && mh >= 2;
    if (hd.isCross) {
        wr16(runs, 0, fullRow);
        wr16(runs, 1, fullCol);
    }

    uint32_t shape = 0;
    if (is_shape(m, mw, mh, kShape3, 3)) shape = kFixed;
    else if (is_shape(m, mw, mh, kShape5, 5)) shape = kFixed5;
    else if (is_shape(m, mw, mh, kShape7, 7)) shape = kFixed7;
    hd.isFixedShape = shape != 0;

    uint32_t feature = 0;
    if (total == (int64_t)mw * mh) feature |= kFull;
    if (total == 0) feature |= kEmpty;
    bool outerEmpty = false;
    for (int32_t side = 0; side < 2 && !outerEmpty; ++side) {
        const uint8_t* row = m + (ptrdiff_t)(side ? mh - 1 : 0) * mw;
        bool any = false;
        for (int32_t c = 0; c < mw; ++c) any |= row[c] != 0;
        const int32_t col = side ? mw - 1 : 0;
        bool anyCol = false;
        for (int32_t r = 0; r < mh; ++r) anyCol |= m[(ptrdiff_t)r * mw + col] != 0;
        outerEmpty = !any || !anyCol;
    }
    if (outerEmpty) feature |= kOuterEmpty;
    if (hd.isRowRuns) feature |= kRowRuns;
    if (hd.isCross) feature |= kCross;
    feature |= shape;
    hd.maskFeature = feature;

    memcpy(base, &hd, sizeof hd);
    return zorStsNoErr;
}

// ---- the driver ---------------------------------------------------------------

using bands::at;

template <typename T> using Kernel = void (*)(const Job<T>&);

template <typename T, typename Op> struct Pick {
    static Kernel<T> mask(const Head&) { return offsets<T, Op>; }
};
template <typename Op> struct Pick<Zor8u, Op> {
    static Kernel<Zor8u> mask(const Head& h) {
        if (h.maskFeature & kFixed) return fixed_8u<Op>;
        if (h.maskFeature & kCross) return cross_8u<Op>;
        if (h.maskFeature & kRowRuns) return row_runs_8u<Op>;
        return general_8u<Op>;
    }
};

template <typename T, typename Op>
Kernel<T> pick(const Head& h) {
    if (h.maskFeature & kFull)
        return h.maskWidth == 3 && h.maskHeight == 3 ? rect3x3<T, Op> : rect_separable<T, Op>;
    return Pick<T, Op>::mask(h);
}

// borderType arrives checked, with kind 5 already turned into 6 and value
// set; only the low eight bits are looked at here.
template <typename T, typename Op>
ZorStatus drive(const T* src, int32_t srcStep, T* dst, int32_t dstStep, int32_t W, int32_t H,
                int32_t borderType, T value, const ZoriMorphState* state, Zor8u* buffer) {
    Head hd;
    memcpy(&hd, state, sizeof hd);
    const int32_t mw = hd.maskWidth, mh = hd.maskHeight;
    const bands::Copies<T> copies = bands::copies<T>();
    if ((mw == 1 && mh == 1) || (hd.maskFeature & kEmpty))
        return copies.plain(src, srcStep, dst, dstStep, {W, H});
    const Kernel<T> kernel = pick<T, Op>(hd);
    const int32_t ax = (mw - 1) >> 1, ay = (mh - 1) >> 1;
    T* tmp = align32((T*)buffer);
    Job<T> job;
    job.head = &hd;
    job.ring = (uint8_t*)tmp + round32(frame_elems(mw, mh, ax, ay, W, H) * (int64_t)sizeof(T));
    job.dstStep = dstStep;
    const bands::Border<T> border = {zorBorderKind(borderType), borderType & zorBorderFlagMask,
                                     value, copies};
    return bands::cut<T>(
        src, srcStep, W, H, bands::Reach{ax, ax, ay, ay}, border, tmp,
        [&](int32_t, const T* s, int32_t ss, int32_t x, int32_t y, int32_t w, int32_t h) {
            job.src = at(s, ss, -ay, -ax);
            job.srcStep = ss;
            job.dst = at(dst, dstStep, y, x);
            job.width = w;
            job.height = h;
            kernel(job);
        });
}

template <typename T, typename Op>
ZorStatus entry(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep, ZoriSize roi,
                int32_t borderType, T borderValue, const ZoriMorphState* pState,
                Zor8u* pBuffer) {
    if (!pSrc || !pDst || !pState || !pBuffer) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1) return zorStsSizeErr;
    const int64_t rowBytes = (int64_t)roi.width * (int64_t)sizeof(T);
    if (srcStep < rowBytes || dstStep < rowBytes) return zorStsStepErr;
    if (sizeof(T) > 1 && ((srcStep | dstStep) & (int32_t)(sizeof(T) - 1)))
        return zorStsNotEvenStepErr;
    if (zorBorderTypeCheck(borderType,
                           zorBorderAcceptRepl | zorBorderAcceptMirror | zorBorderAcceptDefault |
                               zorBorderAcceptConst,
                           zorBorderLimitMorph) != zorStsNoErr)
        return zorStsBorderErr;
    if (sizeof(T) > 1 && (const void*)pSrc == (const void*)pDst)
        return zorStsInplaceModeNotSupportedErr;
    // The 8u forms also take the side flags in bits 8 to 11; the others
    // ignore those bits.
    int32_t border = sizeof(T) == 1 ? ((borderType & 0xf00) >> 4) | (borderType & 255)
                                    : borderType & 255;
    T value = T();
    if (zorBorderKind(border) == zorBorderDefault) {
        border = (border & ~zorBorderKindMask) | zorBorderConst;
        value = Neutral<T, Op>::v;
    } else if (zorBorderKind(border) == zorBorderConst) {
        value = borderValue;
    }
    // The copies see the steps and sizes checked above, positive and at
    // least a row long, so they do not fail on a buffer of the size asked
    // for; their status is passed on all the same.
    return drive<T, Op>(pSrc, srcStep, pDst, dstStep, roi.width, roi.height, border, value,
                        pState, pBuffer);
}

}  // namespace
}  // namespace morph
ZOR_END

using namespace ZOR_NS::morph;

#define MORPH_SIZE_INIT(t, T, e)                                                               \
    ZOR_ENTRY ZorStatus ZOR_NAME(zoriMorphologyBorderGetSize_##t##_C1R)(                       \
        ZoriSize roiSize, ZoriSize maskSize, int32_t * pSpecSize, int32_t * pBufferSize) {     \
        return get_size(roiSize, maskSize, e, pSpecSize, pBufferSize);                         \
    }                                                                                          \
    ZOR_ENTRY ZorStatus ZOR_NAME(zoriMorphologyBorderInit_##t##_C1R)(                          \
        ZoriSize roiSize, const Zor8u* pMask, ZoriSize maskSize, ZoriMorphState* pMorphSpec,   \
        Zor8u* pBuffer) {                                                                      \
        return init(roiSize, pMask, maskSize, pMorphSpec, pBuffer);                            \
    }                                                                                          \
    ZOR_ENTRY ZorStatus ZOR_NAME(zoriErodeBorder_##t##_C1R)(                                   \
        const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep, ZoriSize roiSize,            \
        int32_t borderType, T borderValue, const ZoriMorphState* pMorphSpec, Zor8u* pBuffer) { \
        return entry<T, OpMin>(pSrc, srcStep, pDst, dstStep, roiSize, borderType, borderValue, \
                               pMorphSpec, pBuffer);                                           \
    }                                                                                          \
    ZOR_ENTRY ZorStatus ZOR_NAME(zoriDilateBorder_##t##_C1R)(                                  \
        const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep, ZoriSize roiSize,            \
        int32_t borderType, T borderValue, const ZoriMorphState* pMorphSpec, Zor8u* pBuffer) { \
        return entry<T, OpMax>(pSrc, srcStep, pDst, dstStep, roiSize, borderType, borderValue, \
                               pMorphSpec, pBuffer);                                           \
    }

MORPH_SIZE_INIT(8u, Zor8u, 1)
MORPH_SIZE_INIT(16u, Zor16u, 2)
MORPH_SIZE_INIT(16s, Zor16s, 2)
MORPH_SIZE_INIT(32f, Zor32f, 4)
