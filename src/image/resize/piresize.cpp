// The resize frame: size queries, the record's common part, the tile rule
// and the argument checks every method shares, and nearest neighbour.
#include "resize_spec.h"

#include <string.h>

#include <initializer_list>

ZOR_BEGIN

// ---- the record -----------------------------------------------------------------

uint8_t* resize_spec_begin(ResizeSpec* s, ZoriSize src, ZoriSize dst, int32_t interpolation,
                           int32_t taps, int32_t hint, int32_t workType) {
    memset(s, 0, sizeof *s);
    s->id = kResizeId;
    s->workType = workType;
    s->interpolation = interpolation;
    s->tapsX = s->tapsY = taps;
    for (int32_t& r : s->reach) r = taps;
    s->hint = hint;
    const int64_t gy = gcd64(src.height, dst.height), gx = gcd64(src.width, dst.width);
    s->axisY = ResizeAxis{src.height, dst.height, (int32_t)(src.height / gy),
                          (int32_t)(dst.height / gy), nullptr, nullptr, nullptr, nullptr, 0, 0};
    s->axisX = ResizeAxis{src.width, dst.width, (int32_t)(src.width / gx),
                          (int32_t)(dst.width / gx), nullptr, nullptr, nullptr, nullptr, 0, 0};
    uint8_t* at = (uint8_t*)s + kResizeTablesAt;
    s->axisY.indexTable = take<int32_t>(at, dst.height);
    s->axisX.indexTable = take<int32_t>(at, dst.width);
    return at;
}

namespace {

bool record_ok(const ResizeSpec* s) { return s->id == kResizeId; }

int32_t next_multiple_term(int64_t s, int64_t d) {
    const int64_t r = s % d;
    return (int32_t)(d * (s / d + (r == 0 ? 0 : r == 1 ? 1 : 2)));
}

// Window entries per axis of an antialiasing record (upper bounds).
int64_t antialias_taps(int32_t interpolation, double scale) {
    const double t0 = interpolation == kInterLinear ? 2 : interpolation == kInterCubic ? 4 : 6;
    return scale <= 1 ? (int64_t)t0 : 2 * (int64_t)ceil(t0 * scale);
}

ZorStatus get_size(ZoriSize src, ZoriSize dst, int32_t interpolation, int32_t antialiasing,
                   int32_t* pSpecSize, int32_t* pInitBufSize) {
    if (!pSpecSize || !pInitBufSize) return zorStsNullPtrErr;
    if (!src.width || !src.height || !dst.width || !dst.height) return zorStsNoOperation;
    if (src.width < 0 || src.height < 0 || dst.width < 0 || dst.height < 0) return zorStsSizeErr;
    if (interpolation != 0 && interpolation != kInterNearest && interpolation != kInterLinear &&
        interpolation != kInterCubic && interpolation != kInterSuper &&
        interpolation != kInterLanczos)
        return zorStsInterpolationErr;
    if (interpolation == 0) return zorStsNotSupportedModeErr;

    const int64_t aw = a32(dst.width), ah = a32(dst.height);
    int64_t record = 0, init = 64;
    ZorStatus status = zorStsNoErr;
    const bool filtered = interpolation == kInterLinear || interpolation == kInterCubic ||
                          interpolation == kInterLanczos;
    const int32_t minSrc = interpolation == kInterLinear ? 2 : 4;
    if (filtered && (src.width < minSrc || src.height < minSrc)) return zorStsSizeErr;

    if (antialiasing && filtered) {
        const double sx = (double)src.width / dst.width, sy = (double)src.height / dst.height;
        const int64_t tx = antialias_taps(interpolation, sx), ty = antialias_taps(interpolation, sy);
        record = 368 + 4 * (aw + ah) + a32(4 * (int64_t)dst.width * tx) +
               a32(4 * (int64_t)dst.height * ty);
        if (sx <= 1 && interpolation == kInterLinear) record += a32(4 * (int64_t)dst.width);
        init = 64 + 8 * (aw + ah);
    } else if (interpolation == kInterNearest) {
        record = 368 + 4 * (aw + ah);
    } else if (interpolation == kInterLinear) {
        record = 368 + 8 * (aw + ah);
    } else if (interpolation == kInterCubic) {
        record = 368 + 4 * (aw + ah) + 4 * (a32(4 * (int64_t)dst.width + 96) +
                                          a32(4 * (int64_t)dst.height + 96));
        init = 64 + 4 * (aw + ah);
    } else if (interpolation == kInterLanczos) {
        record = 368 + 4 * (aw + ah) + 4 * (a32(6 * (int64_t)dst.width + 160) +
                                          a32(6 * (int64_t)dst.height + 160));
        init = 64 + 4 * (aw + ah);
    } else {  // super-sampling: sizes only
        if (src.width < dst.width || src.height < dst.height) return zorStsSizeErr;
        const int64_t gw = gcd64(src.width, dst.width), gh = gcd64(src.height, dst.height);
        const int64_t nx = next_multiple_term(src.width / gw, dst.width / gw);
        const int64_t ny = next_multiple_term(src.height / gh, dst.height / gh);
        record = 368 + 4 * (a32(nx) + nx + ny + a32(ny));
    }
    if (antialiasing && !filtered) status = zorStsNoAntialiasing;
    if (record >= 0x7FFFFFFF || init >= 0x7FFFFFFF) return zorStsExceededSizeErr;
    *pSpecSize = (int32_t)record;
    *pInitBufSize = (int32_t)init;
    return status;
}

ZorStatus get_buffer_size(const ZoriResizeSpec* pSpec, ZoriSize dst, Zor32u numChannels,
                          int32_t* pBufSize) {
    if (!pSpec || !pBufSize) return zorStsNullPtrErr;
    if (!dst.width || !dst.height) return zorStsNoOperation;
    const ResizeSpec* s = resize_spec(pSpec);
    if (!record_ok(s)) return zorStsContextMatchErr;
    if (numChannels != 1 && numChannels != 3 && numChannels != 4) return zorStsNumChannelsErr;
    if (dst.width < 0 || dst.height < 0) return zorStsSizeErr;
    const int64_t w = dst.width < s->dstWidth ? dst.width : s->dstWidth;
    const int64_t h = dst.height < s->dstHeight ? dst.height : s->dstHeight;
    int64_t size = a32(4 * h) + a32(4 * w);
    if (s->interpolation != kInterNearest)
        size += 2 * (int64_t)s->tapsY * a32(4 * (int64_t)numChannels * w);
    size += 64;
    if (size >= 0x7FFFFFFF) return zorStsExceededSizeErr;
    *pBufSize = (int32_t)size;
    return dst.width > s->dstWidth || dst.height > s->dstHeight ? zorStsSizeWrn : zorStsNoErr;
}

bool offset_in_range(const ResizeSpec* s, ZoriPoint p) {
    return p.x >= 0 && p.y >= 0 && p.x < s->dstWidth && p.y < s->dstHeight;
}

ZorStatus get_src_offset(const ZoriResizeSpec* pSpec, ZoriPoint dstOffset, ZoriPoint* pSrcOffset) {
    if (!pSpec || !pSrcOffset) return zorStsNullPtrErr;
    const ResizeSpec* s = resize_spec(pSpec);
    if (!record_ok(s)) return zorStsContextMatchErr;
    if (!offset_in_range(s, dstOffset)) return zorStsOutOfRangeErr;
    pSrcOffset->x = tile_shift(s->axisX, dstOffset.x);
    pSrcOffset->y = tile_shift(s->axisY, dstOffset.y);
    return zorStsNoErr;
}

ZorStatus nearest_init(ZoriSize src, ZoriSize dst, ZoriResizeSpec* pSpec) {
    if (!pSpec) return zorStsNullPtrErr;
    if (!src.width || !src.height || !dst.width || !dst.height) return zorStsNoOperation;
    if (src.width < 0 || src.height < 0 || dst.width < 0 || dst.height < 0) return zorStsSizeErr;
    ResizeSpec* s = resize_spec(pSpec);
    resize_spec_begin(s, src, dst, kInterNearest, 0, kHintFloat, zor32f);
    // The record keeps the destination for the tile rule; the source sizes
    // live in the axes.
    s->dstWidth = dst.width;
    s->dstHeight = dst.height;
    for (ResizeAxis* a : {&s->axisY, &s->axisX}) {
        const double ratio = axis_ratio(*a);
        for (int32_t i = 0; i < a->dstLen; ++i)
            a->indexTable[i] = (int32_t)(((double)i + 0.5) * ratio - 1e-10);
    }
    return zorStsNoErr;
}

template <typename T>
ZorStatus nearest(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep, ZoriPoint dstOffset,
                  ZoriSize dstSize, const ZoriResizeSpec* pSpec, Zor8u* pBuffer) {
    const ResizeSpec* s;
    const ZorStatus st = resize_check(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, pSpec,
                                      pBuffer, sizeof(T) == 4, kInterNearest, &s);
    if (st != zorStsNoErr) return st;
    ResizeTile t;
    resize_tile(s, dstOffset, dstSize, pBuffer, &t);
    const T* row = pSrc;
    int32_t prev = 0;
    for (int32_t j = 0; j < t.h; ++j) {
        row = row_at(row, srcStep, t.localY[j] - prev);
        prev = t.localY[j];
        T* d = row_at(pDst, dstStep, j);
        // Whole elements through memcpy: bit patterns (NaN payloads) kept,
        // rows off their element boundary allowed.
        for (int32_t i = 0; i < t.w; ++i) memcpy(d + i, row + t.localX[i], sizeof(T));
    }
    return tile_status(t, zorStsNoErr);
}

}  // namespace

// ---- shared by the methods ----------------------------------------------------------

ZorStatus resize_check(const void* pSrc, int32_t srcStep, const void* pDst, int32_t dstStep,
                       ZoriPoint dstOffset, ZoriSize dstSize, const ZoriResizeSpec* pSpec,
                       const void* pBuffer, bool stepsInFloats, int32_t interpolation,
                       const ResizeSpec** record) {
    if (!pSrc || !pDst || !pSpec || !pBuffer) return zorStsNullPtrErr;
    if (!dstSize.width || !dstSize.height) return zorStsNoOperation;
    const ResizeSpec* s = resize_spec(pSpec);
    if (!record_ok(s)) return zorStsContextMatchErr;
    if (dstSize.width < 0 || dstSize.height < 0) return zorStsSizeErr;
    if (stepsInFloats && ((srcStep & 3) || (dstStep & 3))) return zorStsStepErr;
    if (!offset_in_range(s, dstOffset)) return zorStsOutOfRangeErr;
    if (s->antialiasing) return zorStsNotSupportedModeErr;
    if (s->interpolation != interpolation) return zorStsContextMatchErr;
    *record = s;
    return zorStsNoErr;
}

void resize_tile(const ResizeSpec* s, ZoriPoint dstOffset, ZoriSize dstSize, uint8_t* pBuffer,
                 ResizeTile* t) {
    t->x0 = dstOffset.x;
    t->y0 = dstOffset.y;
    t->w = dstSize.width;
    t->h = dstSize.height;
    t->clipped = dstSize.width > s->dstWidth || dstSize.height > s->dstHeight;
    if ((int64_t)dstOffset.x + t->w > s->dstWidth) t->w = (int32_t)(s->dstWidth - dstOffset.x);
    if ((int64_t)dstOffset.y + t->h > s->dstHeight) t->h = (int32_t)(s->dstHeight - dstOffset.y);
    t->shiftX = tile_shift(s->axisX, dstOffset.x);
    t->shiftY = tile_shift(s->axisY, dstOffset.y);
    uint8_t* at = align_up(pBuffer, 64);
    t->localX = take<int32_t>(at, t->w);
    t->localY = take<int32_t>(at, t->h);
    t->rows = at;
    for (int32_t i = 0; i < t->w; ++i) t->localX[i] = s->axisX.indexTable[t->x0 + i] - t->shiftX;
    for (int32_t j = 0; j < t->h; ++j) t->localY[j] = s->axisY.indexTable[t->y0 + j] - t->shiftY;
}

ResizeStrips resize_strips(const ResizeSpec* s, const ResizeTile& t, int32_t border) {
    ResizeStrips r{0, 0, 0, 0};
    if (border == 240) return r;
    auto limit = [](int64_t v, int32_t n) { return (int32_t)(v < 0 ? 0 : v > n ? n : v); };
    if (!(border & zorBorderInMemTop)) r.top = limit(s->axisY.lowCount - (int64_t)t.y0, t.h);
    if (!(border & zorBorderInMemLeft)) r.left = limit(s->axisX.lowCount - (int64_t)t.x0, t.w);
    if (!(border & zorBorderInMemBottom))
        r.bottom = limit(s->axisY.highCount - (s->dstHeight - t.h - t.y0), t.h);
    if (!(border & zorBorderInMemRight))
        r.right = limit(s->axisX.highCount - (s->dstWidth - t.w - t.x0), t.w);
    return r;
}

ZOR_END

// ---- exported ---------------------------------------------------------------------

using namespace ZOR_NS;

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeGetSize_8u)(ZoriSize srcSize, ZoriSize dstSize,
                                                   ZoriInterpolationType interpolation,
                                                   int32_t antialiasing, int32_t* pSpecSize,
                                                   int32_t* pInitBufSize) {
    return get_size(srcSize, dstSize, (int32_t)interpolation, antialiasing, pSpecSize,
                    pInitBufSize);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeGetBufferSize_8u)(const ZoriResizeSpec* pSpec,
                                                         ZoriSize dstSize, Zor32u numChannels,
                                                         int32_t* pBufSize) {
    return get_buffer_size(pSpec, dstSize, numChannels, pBufSize);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeGetSrcOffset_8u)(const ZoriResizeSpec* pSpec,
                                                        ZoriPoint dstOffset,
                                                        ZoriPoint* pSrcOffset) {
    return get_src_offset(pSpec, dstOffset, pSrcOffset);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeGetSrcRoi_8u)(const ZoriResizeSpec* pSpec,
                                                     ZoriPoint dstRoiOffset, ZoriSize dstRoiSize,
                                                     ZoriPoint* pSrcRoiOffset,
                                                     ZoriSize* pSrcRoiSize) {
    if (!pSpec || !pSrcRoiOffset || !pSrcRoiSize) return zorStsNullPtrErr;
    if (dstRoiSize.width <= 0 || dstRoiSize.height <= 0) return zorStsSizeErr;
    const ResizeSpec* s = resize_spec(pSpec);
    if (!record_ok(s)) return zorStsContextMatchErr;
    if (!offset_in_range(s, dstRoiOffset)) return zorStsOutOfRangeErr;
    int64_t w = dstRoiSize.width, h = dstRoiSize.height;
    if (dstRoiOffset.x + w > s->dstWidth) w = s->dstWidth - dstRoiOffset.x;
    if (dstRoiOffset.y + h > s->dstHeight) h = s->dstHeight - dstRoiOffset.y;
    const int32_t sx = tile_shift(s->axisX, dstRoiOffset.x);
    const int32_t sy = tile_shift(s->axisY, dstRoiOffset.y);
    // The axes carry the source lengths for every method (nearest records
    // leave the 64-bit source sizes unset).
    const int64_t lastX = dstRoiOffset.x + w - 1, lastY = dstRoiOffset.y + h - 1;
    pSrcRoiOffset->x = sx;
    pSrcRoiOffset->y = sy;
    pSrcRoiSize->width = lastX == s->dstWidth - 1 ? s->axisX.srcLen - sx
                                                  : s->axisX.indexTable[lastX] - sx + 1;
    pSrcRoiSize->height = lastY == s->dstHeight - 1 ? s->axisY.srcLen - sy
                                                    : s->axisY.indexTable[lastY] - sy + 1;
    return dstRoiSize.width > s->dstWidth || dstRoiSize.height > s->dstHeight ? zorStsSizeWrn
                                                                              : zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeNearestInit_8u)(ZoriSize srcSize, ZoriSize dstSize,
                                                       ZoriResizeSpec* pSpec) {
    return nearest_init(srcSize, dstSize, pSpec);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeNearest_8u_C1R)(const Zor8u* pSrc, int32_t srcStep,
                                                       Zor8u* pDst, int32_t dstStep,
                                                       ZoriPoint dstOffset, ZoriSize dstSize,
                                                       const ZoriResizeSpec* pSpec,
                                                       Zor8u* pBuffer) {
    return nearest(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, pSpec, pBuffer);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeNearest_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                        Zor32f* pDst, int32_t dstStep,
                                                        ZoriPoint dstOffset, ZoriSize dstSize,
                                                        const ZoriResizeSpec* pSpec,
                                                        Zor8u* pBuffer) {
    return nearest(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, pSpec, pBuffer);
}

// The float names of the untyped queries and Init: the same bodies under
// a second name, each with its own public stub.
ZOR_SECOND_NAME(zoriResizeGetSize_32f, zoriResizeGetSize_8u)
ZOR_SECOND_NAME(zoriResizeGetBufferSize_32f, zoriResizeGetBufferSize_8u)
ZOR_SECOND_NAME(zoriResizeGetSrcOffset_32f, zoriResizeGetSrcOffset_8u)
ZOR_SECOND_NAME(zoriResizeNearestInit_32f, zoriResizeNearestInit_8u)
