// Antialiasing resize: linear, cubic or Lanczos kernels stretched by the
// reduction factor along a shrinking axis, one normalised window of float
// weights per destination position, run on the general window.
#include "resize_spec.h"

#include <math.h>

ZOR_BEGIN

namespace {

enum AaKernel { kAaLinear, kAaCubic, kAaLanczos };

struct Kernel {
    AaKernel kind;
    double B, C;  // cubic
    int32_t lobes;
    int32_t radius;  // taps a side at scale 1
};

// The kernel at distance x >= 0 (float), in double.
double kernel_value(const Kernel& k, float xf) {
    const double x = xf;
    if (k.kind == kAaLinear) return x < 1 ? 1 - x : 0;
    if (k.kind == kAaCubic) return resize_cubic_weight(x, k.B, k.C);
    if (x >= k.lobes) return 0;
    const double u = (double)3.1415927f * x;
    auto sinc = [](double v) { return v == 0 ? 1.0 : ZOR_NAME(zorsSinOne)(v) / v; };
    return sinc(u) * sinc(u / k.lobes);
}

struct AxisTaps {
    int32_t taps;
    double stretch;
};

// Along a shrinking axis the kernel widens by the reduction factor.
AxisTaps axis_taps(int32_t src, int32_t dst, int32_t radius) {
    const double r = (double)dst / src;
    if (r < 1) return {(int32_t)ceil((double)radius * src / dst), r};
    return {radius, 1.0};
}

// Every weight divided by the sum, except that whole groups of eight at
// 32-byte boundaries multiply by the refined reciprocal estimate: the last
// bit of a weight depends on where it lies, the same on every level.
void normalise(float* w, int32_t n, float sum) {
    const float r = _mm_cvtss_f32(_mm_rcp_ss(_mm_set_ss(sum)));
    const float refined = (r + r) - (sum * r) * r;
    int32_t k = 0;
    for (; k < n && ((uintptr_t)(w + k) & 31); ++k) w[k] /= sum;
    for (; k + 8 <= n; k += 8)
        for (int32_t m = 0; m < 8; ++m) w[k + m] *= refined;
    for (; k < n; ++k) w[k] /= sum;
}

void axis_weights(ResizeAxis* a, const double* fractions, AxisTaps t, const Kernel& kernel) {
    const int32_t n = 2 * t.taps;
    for (int32_t i = 0; i < a->dstLen; ++i) {
        float* w = a->coef32f + (int64_t)n * i;
        float d = (float)((double)(1 - t.taps) - fractions[i]);
        float sum = 0;
        for (int32_t k = 0; k < n; ++k) {
            const float x = (float)fabs((double)d * t.stretch);
            w[k] = (float)(kernel_value(kernel, x) * t.stretch);
            sum += w[k];
            d += 1.0f;
        }
        normalise(w, n, sum);
    }
}

ZorStatus aa_init(ZoriSize src, ZoriSize dst, AaKernel kind, float B, float C, Zor32u lobes,
                  ZoriResizeSpec* pSpec, Zor8u* pInitBuf) {
    if (!pSpec || !pInitBuf) return zorStsNullPtrErr;
    if (!src.width || !src.height || !dst.width || !dst.height) return zorStsNoOperation;
    if (src.width < 0 || src.height < 0 || dst.width < 0 || dst.height < 0) return zorStsSizeErr;
    if (kind == kAaLanczos && lobes != 2 && lobes != 3) return zorStsNotSupportedModeErr;
    const Kernel kernel{kind, B, C, (int32_t)lobes,
                        kind == kAaLinear ? 1 : kind == kAaCubic ? 2 : (int32_t)lobes};
    // Tiny weights flush while the tables are made; the caller's control
    // word comes back at the end.
    const uint32_t saved = ps_get_ssx();
    ps_set_ssx(0x8800, 0x8800);

    const AxisTaps ty = axis_taps(src.height, dst.height, kernel.radius);
    const AxisTaps tx = axis_taps(src.width, dst.width, kernel.radius);
    ResizeSpec* s = resize_spec(pSpec);
    uint8_t* at = resize_spec_begin(s, src, dst, kind == kAaLinear ? kInterLinear : kInterCubic,
                                    tx.taps, 0, zor32f);
    s->antialiasing = 1;
    s->tapsY = ty.taps;
    s->reach[1] = s->reach[3] = ty.taps;
    s->dataType = zor8u;
    s->cubicB = kind == kAaCubic ? B : 0;
    s->cubicC = kind == kAaCubic ? C : 0;
    s->lobes = kind == kAaLanczos ? (int32_t)lobes : 0;
    s->initBuffer = pInitBuf;
    s->axisY.coef32f = take<float>(at, 2 * (int64_t)ty.taps * dst.height);
    s->axisX.coef32f = take<float>(at, 2 * (int64_t)tx.taps * dst.width);

    uint8_t* f = align_up(pInitBuf, 32);
    double* fy = take<double>(f, dst.height);
    double* fx = take<double>(f, dst.width);
    resize_map_axis(&s->axisY, ty.taps, fy);
    resize_map_axis(&s->axisX, tx.taps, fx);
    axis_weights(&s->axisX, fx, tx, kernel);
    axis_weights(&s->axisY, fy, ty, kernel);
    if (tx.taps == 1) {
        s->coefSecond = take<float>(at, dst.width);
        for (int32_t i = 0; i < dst.width; ++i) s->coefSecond[i] = s->axisX.coef32f[2 * i + 1];
    }
    ps_set_ssx(saved, 0x8810);
    return zorStsNoErr;
}

template <typename T>
ZorStatus antialiasing(const T* pSrc, int32_t srcStep, T* pDst, int32_t dstStep,
                       ZoriPoint dstOffset, ZoriSize dstSize, int32_t border,
                       const ZoriResizeSpec* pSpec, Zor8u* pBuffer, int32_t channels) {
    ResizeJob k;
    const ZorStatus st = resize_job(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, border,
                                    pSpec, pBuffer, sizeof(T) == 4, kAntialiasingOp, &k);
    if (st != zorStsNoErr) return st;
    resize_window(k, pSrc, srcStep, pDst, dstStep, channels);
    return tile_status(k.t, zorStsNoErr);
}

}  // namespace

ZOR_END

using namespace ZOR_NS;

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasingLinearInit)(ZoriSize srcSize, ZoriSize dstSize,
                                                               ZoriResizeSpec* pSpec,
                                                               Zor8u* pInitBuf) {
    return aa_init(srcSize, dstSize, kAaLinear, 0, 0, 0, pSpec, pInitBuf);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasingCubicInit)(ZoriSize srcSize, ZoriSize dstSize,
                                                              Zor32f cubicB, Zor32f cubicC,
                                                              ZoriResizeSpec* pSpec,
                                                              Zor8u* pInitBuf) {
    return aa_init(srcSize, dstSize, kAaCubic, cubicB, cubicC, 0, pSpec, pInitBuf);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasingLanczosInit)(ZoriSize srcSize,
                                                                ZoriSize dstSize, Zor32u lobes,
                                                                ZoriResizeSpec* pSpec,
                                                                Zor8u* pInitBuf) {
    return aa_init(srcSize, dstSize, kAaLanczos, 0, 0, lobes, pSpec, pInitBuf);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasing_8u_C1R)(const Zor8u* pSrc, int32_t srcStep,
                                                            Zor8u* pDst, int32_t dstStep,
                                                            ZoriPoint dstOffset, ZoriSize dstSize,
                                                            ZoriBorderType border, const Zor8u*,
                                                            const ZoriResizeSpec* pSpec,
                                                            Zor8u* pBuffer) {
    return antialiasing(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                        pBuffer, 1);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasing_8u_C3R)(const Zor8u* pSrc, int32_t srcStep,
                                                            Zor8u* pDst, int32_t dstStep,
                                                            ZoriPoint dstOffset, ZoriSize dstSize,
                                                            ZoriBorderType border, const Zor8u*,
                                                            const ZoriResizeSpec* pSpec,
                                                            Zor8u* pBuffer) {
    return antialiasing(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                        pBuffer, 3);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeAntialiasing_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                             Zor32f* pDst, int32_t dstStep,
                                                             ZoriPoint dstOffset,
                                                             ZoriSize dstSize,
                                                             ZoriBorderType border, const Zor32f*,
                                                             const ZoriResizeSpec* pSpec,
                                                             Zor8u* pBuffer) {
    return antialiasing(pSrc, srcStep, pDst, dstStep, dstOffset, dstSize, (int32_t)border, pSpec,
                        pBuffer, 1);
}
