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
    // Every method keeps the sizes: the tile rule and the source ROI use them.
    s->srcWidth = src.width;
    s->srcHeight = src.height;
    s->dstWidth = dst.width;
    s->dstHeight = dst.height;
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

// 64-bit: for long sources the count passes 2^31, and the size check
// below must see it.
int64_t next_multiple_term(int64_t s, int64_t d) {
    const int64_t r = s % d;
    return d * (s / d + (r == 0 ? 0 : r == 1 ? 1 : 2));
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
    const int64_t line = a32(4 * (int64_t)numChannels * w), T = s->tapsY;
    if (s->interpolation != kInterNearest) size += 2 * T * line;
    if (s->antialiasing) {
        // The window's ring pointers, border tap tables and line buffer.
        const ResizeAxis &x = s->axisX, &y = s->axisY;
        size += a32(16 * T + 8) + a32(16 * (int64_t)x.lowCount * s->tapsX) +
                a32(16 * (int64_t)x.highCount * s->tapsX) + a32(16 * (int64_t)y.lowCount * T) +
                a32(16 * (int64_t)y.highCount * T) + line;
    }
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
    for (ResizeAxis* a : {&s->axisY, &s->axisX}) {
        const double ratio = axis_ratio(*a);
        for (int32_t i = 0; i < a->dstLen; ++i)
            a->indexTable[i] = (int32_t)(((double)i + 0.5) * ratio - 1e-10);
    }
    return zorStsNoErr;
}

// ---- nearest rows ---------------------------------------------------------------
// A row is dst[i] = row[localX[i]]: element copies, never arithmetic, so bit
// patterns (NaN payloads) survive every path. Vector paths read only source
// elements from localX[0] to the tile's last index, like the plain loop.

template <typename T>
void nearest_row_plain(const T* row, T* d, const int32_t* localX, int32_t from, int32_t w) {
    for (int32_t i = from; i < w; ++i) memcpy(d + i, row + localX[i], sizeof(T));
}

#if ZOR_HAS_SSSE3
// Bytes: per 16 destination bytes, the first source index and two shuffles
// picking them out of the 32 source bytes from there (the second shuffle
// for the upper 16). The blocks are written over the local index table of
// the tile, each inside the 64 bytes its own 16 indices held, so the work
// buffer needs no more room than the plain copy's.
struct ByteBlock {
    int32_t base;
    uint8_t low[16], high[16];
};
static_assert(sizeof(ByteBlock) <= 16 * sizeof(int32_t), "a block fits over its indices");
constexpr int32_t kByteBlock = 16;

typedef simd::vec<16, uint8_t> v16u8;

inline v16u8 shuffle_bytes(v16u8 v, v16u8 m) {
    return (v16u8)_mm_shuffle_epi8((__m128i)v, (__m128i)m);
}

// Turns the leading blocks whose 32-byte window stays within the tile's
// indices into ByteBlocks; returns how many (the rest keep their indices).
int32_t byte_blocks(int32_t* localX, int32_t w) {
    const int32_t last = localX[w - 1];
    int32_t n = 0;
    for (; (n + 1) * kByteBlock <= w; ++n) {
        int32_t* x = localX + n * kByteBlock;
        const int32_t base = x[0];
        if (x[kByteBlock - 1] - base > 31 || base + 31 > last) break;
        ByteBlock b;
        b.base = base;
        for (int32_t k = 0; k < kByteBlock; ++k) {
            const int32_t o = x[k] - base;
            b.low[k] = o < 16 ? (uint8_t)o : 0x80;  // the top bit makes the lane zero
            b.high[k] = o >= 16 ? (uint8_t)(o - 16) : 0x80;
        }
        memcpy(x, &b, sizeof b);
    }
    return n;
}

void byte_row(const uint8_t* row, uint8_t* d, const int32_t* blocks, int32_t nblocks) {
    for (int32_t n = 0; n < nblocks; ++n) {
        const uint8_t* b = (const uint8_t*)(blocks + n * kByteBlock);
        int32_t base;
        memcpy(&base, b, 4);
        const v16u8 lo = simd::load<v16u8>(row + base), hi = simd::load<v16u8>(row + base + 16);
        const v16u8 r = shuffle_bytes(lo, simd::load<v16u8>(b + offsetof(ByteBlock, low))) |
                        shuffle_bytes(hi, simd::load<v16u8>(b + offsetof(ByteBlock, high)));
        simd::store(d + n * kByteBlock, r);
    }
}
#endif

#if ZOR_HAS_AVX2
// Floats, eight at a time: when the eight lie within 16 source elements of
// the first, two loads and two lane permutes (bit 3 of the offset, moved to
// the sign, picks the load); otherwise, and near the end of the tile's
// source, a gather of exactly the eight.
void float_row(const float* row, float* d, const int32_t* localX, int32_t w, int32_t* done) {
    const int32_t last = localX[w - 1];
    int32_t i = 0;
    for (; i + 8 <= w; i += 8) {
        const __m256i x = (__m256i)simd::load<simd::vec<32, int32_t>>(localX + i);
        const int32_t base = localX[i];
        __m256 r;
        if (localX[i + 7] - base <= 15 && base + 15 <= last) {
            const __m256i o = _mm256_sub_epi32(x, _mm256_set1_epi32(base));
            const __m256i m = _mm256_or_si256(o, _mm256_slli_epi32(o, 28));
            const __m256 lo = _mm256_permutevar8x32_ps(_mm256_loadu_ps(row + base), m);
            const __m256 hi = _mm256_permutevar8x32_ps(_mm256_loadu_ps(row + base + 8), m);
            r = _mm256_blendv_ps(lo, hi, _mm256_castsi256_ps(m));
        } else {
            r = _mm256_i32gather_ps(row, x, 4);
        }
        _mm256_storeu_ps(d + i, r);
    }
    *done = i;
}
#endif

// One tile's rows. Prepares the local X table once (identity, byte blocks)
// and copies the previous destination row when a row repeats its source.
template <typename T>
void nearest_tile(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep, ResizeTile& t) {
    bool identity = true;
    for (int32_t i = 0; i < t.w && identity; ++i) identity = t.localX[i] == i;
#if ZOR_HAS_SSSE3
    const int32_t nblocks = sizeof(T) == 1 && !identity ? byte_blocks(t.localX, t.w) : 0;
#endif
    const T* row = pSrc;
    for (int32_t j = 0; j < t.h; ++j) {
        row = row_at(row, srcStep, t.localY[j] - (j ? t.localY[j - 1] : 0));
        T* d = row_at(pDst, dstStep, j);
        if (j && t.localY[j] == t.localY[j - 1]) {
            memmove(d, row_at(pDst, dstStep, j - 1), (size_t)t.w * sizeof(T));
            continue;
        }
        if (identity) {
            memcpy(d, row, (size_t)t.w * sizeof(T));
            continue;
        }
        int32_t from = 0;
#if ZOR_HAS_SSSE3
        if constexpr (sizeof(T) == 1) {
            byte_row(row, d, t.localX, nblocks);
            from = nblocks * kByteBlock;
        }
#endif
#if ZOR_HAS_AVX2
        if constexpr (sizeof(T) == 4) float_row(row, d, t.localX, t.w, &from);
#endif
        nearest_row_plain(row, d, t.localX, from, t.w);
    }
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
    nearest_tile(pSrc, srcStep, pDst, dstStep, t);
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
    if ((s->antialiasing != 0) != (interpolation == kAntialiasingOp))
        return zorStsNotSupportedModeErr;
    if (interpolation != kAntialiasingOp && s->interpolation != interpolation)
        return zorStsContextMatchErr;
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

ZorStatus resize_job(const void* pSrc, int32_t srcStep, const void* pDst, int32_t dstStep,
                     ZoriPoint dstOffset, ZoriSize dstSize, int32_t border,
                     const ZoriResizeSpec* pSpec, Zor8u* pBuffer, bool stepsInFloats,
                     int32_t interpolation, ResizeJob* job) {
    if (!resize_border_ok(border)) return zorStsBorderErr;
    const ZorStatus st = resize_check(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, pSpec,
                                      pBuffer, stepsInFloats, interpolation, &job->s);
    if (st != zorStsNoErr) return st;
    resize_tile(job->s, dstOffset, dstSize, pBuffer, &job->t);
    job->st = resize_strips(job->s, job->t, border);
    return zorStsNoErr;
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
    const int64_t lastX = dstRoiOffset.x + w - 1, lastY = dstRoiOffset.y + h - 1;
    pSrcRoiOffset->x = sx;
    pSrcRoiOffset->y = sy;
    pSrcRoiSize->width = lastX == s->dstWidth - 1 ? (int32_t)(s->srcWidth - sx)
                                                  : s->axisX.indexTable[lastX] - sx + 1;
    pSrcRoiSize->height = lastY == s->dstHeight - 1 ? (int32_t)(s->srcHeight - sy)
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
