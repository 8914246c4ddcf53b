// Lanczos resize: windowed-sinc weights from a sampled table, made once at
// Init; two lobes run on the cubic passes, three on the general window.
#include "resize_spec.h"

#include <math.h>

#include "zor_internal.h"

ZOR_BEGIN

namespace {

// sinc(x) sinc(x / a) sampled `per` times a unit on 0 <= x < a, in double
// through the library's sine, rounded to float; two entries past the last
// sample keep the interpolation below in range, and they are 0.
void sample_table(int32_t a, int32_t per, float* t) {
    const double pi = 3.14159265358979323846;
    auto sinc = [&](double x) { return x == 0 ? 1.0 : ZOR_NAME(zorsSinOne)(pi * x) / (pi * x); };
    for (int32_t k = 0; k < a * per + 2; ++k) {
        const double x = (double)k / per;
        t[k] = k >= a * per ? 0.0f : (float)(sinc(x) * sinc(x / a));
    }
}

// Weights of index - (lobes - 1) .. index + lobes from the sampled table,
// all in float. The first four are scaled by a refined reciprocal of their
// sum, the last two of three lobes divided by it: the two do not agree to
// the last bit, and the tables follow the processor's estimate.
void axis_weights(ResizeAxis* a, const float* fractions, int32_t lobes, const float* table) {
    const int32_t n = 2 * lobes;
    const float scale = lobes == 2 ? 200.0f : 100.0f, reach = (float)lobes;
    for (int32_t i = 0; i < a->dstLen; ++i) {
        const float d0 = (float)(1 - lobes) - fractions[i];
        float* w = a->coef32f + (int64_t)n * i;
        float sum = 0;
        for (int32_t k = 0; k < n; ++k) {
            const float d = k ? d0 + (float)k : d0;
            float v = 0;
            if (d > -reach && d < reach) {
                const float s = fabsf(d) * scale;
                const int32_t j = (int32_t)s;
                v = table[j] + (table[j + 1] - table[j]) * (s - (float)j);
            }
            w[k] = v;
            sum += v;
        }
        const float r = _mm_cvtss_f32(_mm_rcp_ss(_mm_set_ss(sum)));
        const float refined = (r + r) - (sum * r) * r;
        for (int32_t k = 0; k < 4; ++k) w[k] *= refined;
        for (int32_t k = 4; k < n; ++k) w[k] /= sum;
    }
}

ZorStatus lanczos_init(ZoriSize src, ZoriSize dst, Zor32u lobes, ZoriResizeSpec* pSpec,
                       Zor8u* pInitBuf) {
    if (!pSpec || !pInitBuf) return zorStsNullPtrErr;
    if (!src.width || !src.height || !dst.width || !dst.height) return zorStsNoOperation;
    if (src.width < 0 || src.height < 0 || dst.width < 0 || dst.height < 0) return zorStsSizeErr;
    // As the cubic Init: tiny weights flush while the tables are made.
    const uint32_t saved = ps_get_ssx();
    ps_set_ssx(0x8800, 0x8800);

    // The record and the mapping come before the lobes are judged: a
    // refused Init leaves a record with its id, which callers must not use.
    ResizeSpec* s = resize_spec(pSpec);
    const int32_t taps = (int32_t)(lobes > 0x7FFFFFFFu ? 0x7FFFFFFFu : lobes);
    uint8_t* at = resize_spec_begin(s, src, dst, kInterLanczos, taps, kHintFloat, zor32f);
    s->dataType = zor8u;
    s->lobes = taps;
    s->initBuffer = pInitBuf;
    uint8_t* f = align_up(pInitBuf, 32);
    float* fy = take<float>(f, dst.height);
    float* fx = take<float>(f, dst.width);
    resize_map_axis(&s->axisY, lobes, fy);
    resize_map_axis(&s->axisX, lobes, fx);

    ZorStatus status = zorStsNoErr;
    if (lobes != 2 && lobes != 3) {
        status = zorStsNotSupportedModeErr;
    } else if (src.width < 2 * (int32_t)lobes || src.height < 2 * (int32_t)lobes) {
        status = zorStsSizeErr;
    } else {
        s->axisY.coef32f = take<float>(at, 2 * (int64_t)lobes * dst.height);
        s->axisX.coef32f = take<float>(at, 2 * (int64_t)lobes * dst.width);
        float table[402];
        sample_table((int32_t)lobes, lobes == 2 ? 200 : 100, table);
        axis_weights(&s->axisX, fx, (int32_t)lobes, table);
        axis_weights(&s->axisY, fy, (int32_t)lobes, table);
    }
    ps_set_ssx(saved, 0x8810);
    return status;
}

template <typename T>
ZorStatus lanczos(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep, ZoriPoint dstOffset,
                  ZoriSize dstSize, int32_t border, const ZoriResizeSpec* pSpec, Zor8u* pBuffer) {
    ResizeJob k;
    const ZorStatus st = resize_job(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, border,
                                    pSpec, pBuffer, sizeof(T) == 4, kInterLanczos, &k);
    if (st != zorStsNoErr) return st;
    if (k.s->lobes == 2)
        resize_four_taps(k, pSrc, srcStep, pDst, dstStep);
    else
        resize_window(k, pSrc, srcStep, pDst, dstStep, 1);
    return tile_status(k.t, zorStsNoErr);
}

}  // namespace

ZOR_END

using namespace ZOR_NS;

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLanczosInit_8u)(ZoriSize srcSize, ZoriSize dstSize,
                                                       Zor32u lobes, ZoriResizeSpec* pSpec,
                                                       Zor8u* pInitBuf) {
    return lanczos_init(srcSize, dstSize, lobes, pSpec, pInitBuf);
}
ZOR_SECOND_NAME(zoriResizeLanczosInit_32f, zoriResizeLanczosInit_8u)

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLanczos_8u_C1R)(const Zor8u* pSrc, int32_t srcStep,
                                                       Zor8u* pDst, int32_t dstStep,
                                                       ZoriPoint dstOffset, ZoriSize dstSize,
                                                       ZoriBorderType border, const Zor8u*,
                                                       const ZoriResizeSpec* pSpec,
                                                       Zor8u* pBuffer) {
    return lanczos(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                   pBuffer);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLanczos_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                        Zor32f* pDst, int32_t dstStep,
                                                        ZoriPoint dstOffset, ZoriSize dstSize,
                                                        ZoriBorderType border, const Zor32f*,
                                                        const ZoriResizeSpec* pSpec,
                                                        Zor8u* pBuffer) {
    return lanczos(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                   pBuffer);
}
