// Median filter with border: the buffer size query, the argument checks and
// the driver. The driver cuts the ROI into thin bands at the sides that need
// a frame and a centre read straight from the caller's image, so that no
// kernel ever tests a coordinate; band results wait in the buffer and reach
// the destination last, which is what lets the source and destination be
// one image.
#include "variant.h"

#include "border_type.h"
#include "bands.h"
#include "median_internal.h"

ZOR_BEGIN
namespace {

using namespace median;

inline int64_t align32(int64_t x) { return (x + 31) & ~(int64_t)31; }

int32_t elem_size(int32_t dataType) {
    switch (dataType) {
        case zor8u: return 1;
        case zor16u:
        case zor16s: return 2;
        default: return 4;
    }
}

// Scratch of the kernels of one mask class.
int64_t scratch_bytes(int64_t kw, int64_t kh, int32_t dataType) {
    if (kw < 6 && kh < 6 && (kw == 1 || kh == 1 || kw == kh)) return 0;
    const int64_t n = kw * kh;
    const int64_t e = elem_size(dataType);
    int64_t s;
    if (dataType == zor32f) {
        if (kw == 1 || kh == 1) {
            s = n * 4;
        } else if (n < 625) {
            const int64_t side = kw > kh ? kw : kh;
            s = ((side + 15) & ~15) * 4 + ((n + 15) & ~15) * 12;
            if (n >= 51) s += 4 * n + 20480;  // the radix sort's own buffer
        } else {
            s = ((n + 15) >> 4) * 128 + 28672;
        }
    } else {
        s = n * 4 * e;
    }
    return align32(s);
}

// Ring of the in-place centre: two blocks of kh rows.
int64_t ring_bytes(int64_t W, int64_t kh, int64_t e) { return kh * 2 * align32(W * e); }

int64_t frame_bytes(int64_t W, int64_t H, int64_t kw, int64_t kh, int64_t e) {
    if (kw < W && kh < H) {
        const int64_t top = (W + kw - 1) * (kh + (kh >> 1)) * e;
        const int64_t side = (kw + (kw >> 1)) * (H + kh - 1) * e;
        return 2 * (align32(W * (kh >> 1) * e) + align32(H * (kw >> 1) * e)) +
               align32(top > side ? top : side);
    }
    return align32((W + kw - 1) * (H + kh - 1) * e);
}

int64_t one_channel_bytes(int64_t W, int64_t H, int64_t kw, int64_t kh, int32_t dataType) {
    const int64_t e = elem_size(dataType);
    int64_t total = scratch_bytes(kw, kh, dataType) + frame_bytes(W, H, kw, kh, e);
    if (kw < W && kh < H) total += ring_bytes(W, kh, e);
    return total;
}

int64_t multi_channel_bytes(int64_t W, int64_t H, int64_t kw, int64_t kh, int32_t dataType,
                            int64_t c) {
    int64_t a;
    if (kw < W && kh < H) {
        const int64_t top = (W + kw - 1) * (kh + (kh >> 1) - 1);
        const int64_t side = (kw + (kw >> 1) - 1) * (H + kh - 1);
        a = top > side ? top : side;
    } else {
        a = (W + kw - 1) * (H + kh - 1);
    }
    if (dataType == zor8u) return align32(c * a);
    int64_t s = align32(2 * c * a);
    if (!(kw < 6 && kh < 6 && kw + kh != 8)) s += kw * kh * 8;
    return s;
}

// ---- the driver -------------------------------------------------------------

template <typename T> Kernel<T> general(int32_t kw, int32_t kh);
template <> Kernel<Zor8u> general<Zor8u>(int32_t, int32_t) { return general_8u; }
template <> Kernel<Zor16u> general<Zor16u>(int32_t, int32_t) { return general_16u; }
template <> Kernel<Zor32f> general<Zor32f>(int32_t, int32_t) { return general_32f; }
template <> Kernel<Zor16s> general<Zor16s>(int32_t kw, int32_t kh) {
    if (kw == 1 && kh == 7) return fixed_1x7_16s;
    if (kw == 7 && kh == 1) return fixed_7x1_16s;
    return general_16s;
}

// The seven mask classes; the 16s general class tries its 7-tap lines first.
template <typename T>
Kernel<T> class_kernel(int32_t kw, int32_t kh) {
    if (kw == 1 && kh == 3) return fixed_1x3<T>;
    if (kw == 1 && kh == 5) return fixed_1x5<T>;
    if (kw == 3 && kh == 1) return fixed_3x1<T>;
    if (kw == 5 && kh == 1) return fixed_5x1<T>;
    if (kw == 3 && kh == 3) return fixed_3x3<T>;
    if (kw == 5 && kh == 5) return fixed_5x5<T>;
    return general<T>(kw, kh);
}

template <typename T>
void copy_rows(const T* src, ptrdiff_t srcStep, T* dst, ptrdiff_t dstStep, int32_t width,
               int32_t height) {
    for (int32_t y = 0; y < height; ++y)
        memcpy(row_at(dst, dstStep, y), row_at(src, srcStep, y), (size_t)width * sizeof(T));
}

// The kernel over a region whose neighbours are all in memory. In place,
// results go through a ring of two blocks of kh/2 rows: block k is written
// back only after block k+1, the last one to read its rows, has run.
template <typename T>
void run_in_memory(Kernel<T> kernel, Job<T> job, uint8_t* ring) {
    if ((const void*)job.src != (const void*)job.dst) {
        kernel(job);
        return;
    }
    T* const image = job.dst;
    const ptrdiff_t imageStep = job.dstStep;
    const int32_t rows = job.kh >> 1 > 0 ? job.kh >> 1 : 1;
    const ptrdiff_t ringStep = (ptrdiff_t)job.width * (ptrdiff_t)sizeof(T);
    T* const block[2] = {(T*)ring, (T*)(ring + ringStep * rows)};
    const int32_t height = job.height;
    int32_t pending = -1, pendingRows = 0;
    for (int32_t y = 0, k = 0; y < height; y += rows, ++k) {
        Job<T> part = job;
        part.src = row_at(job.src, job.srcStep, y);
        part.height = height - y < rows ? height - y : rows;
        part.dst = block[k & 1];
        part.dstStep = ringStep;
        kernel(part);
        if (pending >= 0)
            copy_rows(block[(k - 1) & 1], ringStep, row_at(image, imageStep, pending), imageStep,
                      job.width, pendingRows);
        pending = y;
        pendingRows = part.height;
    }
    copy_rows(block[((height + rows - 1) / rows - 1) & 1], ringStep,
              row_at(image, imageStep, pending), imageStep, job.width, pendingRows);
}

template <typename T>
ZorStatus median_filter(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep, ZoriSize roi,
                        ZoriSize mask, int32_t borderType, T borderValue, Zor8u* pBuffer,
                        int32_t dataType) {
    if (pSrc == nullptr || pDst == nullptr || pBuffer == nullptr) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1) return zorStsSizeErr;
    if (sizeof(T) > 1 && ((srcStep | dstStep) & (int32_t)(sizeof(T) - 1)))
        return zorStsNotEvenStepErr;
    if (mask.width < 1 || mask.height < 1 || !(mask.width & 1) || !(mask.height & 1))
        return zorStsMaskSizeErr;
    if (zorBorderTypeCheck(borderType, zorBorderAcceptRepl | zorBorderAcceptConst,
                           zorBorderLimit) != zorStsNoErr)
        return zorStsBorderErr;

    const int32_t kw = mask.width, kh = mask.height, W = roi.width, H = roi.height;
    if (kw == 1 && kh == 1) {
        if ((const void*)pSrc == (const void*)pDst) return zorStsNoErr;
        return bands::copies<T>().plain(pSrc, srcStep, pDst, dstStep, roi);
    }

    int32_t flags = borderType == zorBorderInMem ? (int32_t)zorBorderInMem : borderType & 0xF0;
    // A median is the same upside down: a negative source step is turned
    // into a positive one, so that the frame copies can read the rows.
    if (srcStep < 0) {
        pSrc = row_at(pSrc, srcStep, H - 1);
        pDst = row_at(pDst, dstStep, H - 1);
        srcStep = -srcStep;
        dstStep = -dstStep;
        flags = (flags & ~(zorBorderInMemTop | zorBorderInMemBottom)) |
                (flags & zorBorderInMemTop ? zorBorderInMemBottom : 0) |
                (flags & zorBorderInMemBottom ? zorBorderInMemTop : 0);
    }
    const Kernel<T> kernel = class_kernel<T>(kw, kh);
    const int32_t rx = kw >> 1, ry = kh >> 1;
    const int32_t e = (int32_t)sizeof(T);
    const bool large = kw < W && kh < H;

    // A ROI not larger than the mask: the frame, then the scratch (the
    // frame's place is the ring when no frame is needed). Otherwise scratch,
    // ring, the four result bands, then the band frames.
    uint8_t *scratch, *ring, *frame;
    T *topBand = nullptr, *bottomBand = nullptr, *leftBand = nullptr, *rightBand = nullptr;
    if (!large) {
        frame = ring = pBuffer;
        scratch = pBuffer + align32((int64_t)(W + kw - 1) * (H + kh - 1) * e);
    } else {
        uint8_t* p = pBuffer;
        scratch = p;
        p += scratch_bytes(kw, kh, dataType);
        ring = p;
        p += ring_bytes(W, kh, e);
        topBand = (T*)p;
        p += align32((int64_t)W * ry * e);
        bottomBand = (T*)p;
        p += align32((int64_t)W * ry * e);
        leftBand = (T*)p;
        p += align32((int64_t)H * rx * e);
        rightBand = (T*)p;
        p += align32((int64_t)H * rx * e);
        frame = p;
    }
    // Bands go to their result bands, the centre through the ring when in
    // place; a whole frame has been read completely, so it goes to pDst.
    struct Band {
        T* at;
        ptrdiff_t step;
        int32_t x, y, w, h;
    } band[4] = {{topBand, (ptrdiff_t)W * e, 0, 0, 0, 0},
                 {bottomBand, (ptrdiff_t)W * e, 0, 0, 0, 0},
                 {leftBand, (ptrdiff_t)rx * e, 0, 0, 0, 0},
                 {rightBand, (ptrdiff_t)rx * e, 0, 0, 0, 0}};
    const bands::Border<T> border = {borderType & zorBorderKindMask, flags, borderValue,
                                     bands::copies<T>()};
    const ZorStatus status = bands::cut<T>(
        pSrc, srcStep, W, H, bands::Reach{rx, rx, ry, ry}, border, (T*)frame,
        [&](int32_t part, const T* s, int32_t ss, int32_t x, int32_t y, int32_t w, int32_t h) {
            Job<T> job = {s, ss, bands::at(pDst, dstStep, y, x), dstStep, w, h, kw, kh, scratch};
            if (part == bands::kCentre) {
                run_in_memory(kernel, job, ring);
            } else if (part == bands::kWhole) {
                kernel(job);
            } else {
                Band& b = band[part];
                b.x = x, b.y = y, b.w = w, b.h = h;
                job.dst = b.at;
                job.dstStep = b.step;
                kernel(job);
            }
        });
    if (status != zorStsNoErr) return status;
    // Bands last: every source pixel has been read by now.
    for (const Band& b : band)
        copy_rows(b.at, b.step, bands::at(pDst, dstStep, b.y, b.x), dstStep, b.w, b.h);
    return zorStsNoErr;
}

}  // namespace
ZOR_END

ZOR_ENTRY ZorStatus ZOR_NAME(zoriFilterMedianBorderGetBufferSize)(ZoriSize dstRoiSize,
                                                                  ZoriSize maskSize,
                                                                  ZorDataType dataType,
                                                                  int32_t numChannels,
                                                                  int32_t* pBufferSize) {
    using namespace ZOR_NS;
    if (pBufferSize == nullptr) return zorStsNullPtrErr;
    if (dstRoiSize.width < 1 || dstRoiSize.height < 1) return zorStsSizeErr;
    if (maskSize.width < 1 || maskSize.height < 1 || !(maskSize.width & 1) ||
        !(maskSize.height & 1))
        return zorStsMaskSizeErr;
    if (numChannels != 1 && numChannels != 3 && numChannels != 4) return zorStsNumChannelsErr;
    const int32_t type = (int32_t)dataType;
    const bool integer = type == zor8u || type == zor16u || type == zor16s;
    if (!(integer || (numChannels == 1 && type == zor32f))) return zorStsDataTypeErr;

    const int64_t W = dstRoiSize.width, H = dstRoiSize.height;
    const int64_t kw = maskSize.width, kh = maskSize.height;
    const int64_t total = numChannels == 1
                              ? one_channel_bytes(W, H, kw, kh, type)
                              : multi_channel_bytes(W, H, kw, kh, type, numChannels);
    if (total >= 0x80000000LL) {
        *pBufferSize = 0;
        return zorStsExceededSizeErr;
    }
    *pBufferSize = (int32_t)total;
    return zorStsNoErr;
}

#define MEDIAN_ENTRY(T, suffix, type)                                                            \
    ZOR_ENTRY ZorStatus ZOR_NAME(zoriFilterMedianBorder_##suffix##_C1R)(                         \
        const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep, ZoriSize dstRoiSize,           \
        ZoriSize maskSize, ZoriBorderType borderType, T borderValue, Zor8u* pBuffer) {           \
        return ZOR_NS::median_filter<T>(pSrc, srcStep, pDst, dstStep, dstRoiSize, maskSize,      \
                                        (int32_t)borderType, borderValue, pBuffer, type);        \
    }

MEDIAN_ENTRY(Zor8u, 8u, zor8u)
MEDIAN_ENTRY(Zor16u, 16u, zor16u)
MEDIAN_ENTRY(Zor16s, 16s, zor16s)
MEDIAN_ENTRY(Zor32f, 32f, zor32f)
