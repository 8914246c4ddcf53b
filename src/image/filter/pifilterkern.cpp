// Path choice of the general filter per level and element type, and the
// scalar path with the record's rounding mode. The scalar path takes the
// narrow rectangles (the left and right bands, small ROIs); the vector
// paths convert to nearest whatever the record says, so a ROI can show a
// seam between truncated bands and a rounded centre. That is intended.
#include "variant.h"

#include <math.h>

#include "pifilter.h"
#include "simd.h"

ZOR_BEGIN
namespace filt {
namespace {

template <typename T> struct Limits;
template <> struct Limits<Zor8u> {
    static constexpr double lo = 0.0, hi = 255.0;
};
template <> struct Limits<Zor16u> {
    static constexpr double lo = 0.0, hi = 65535.0;
};
template <> struct Limits<Zor16s> {
    static constexpr double lo = -32768.0, hi = 32767.0;
};

// Saturate, then round by mode: 0 toward zero; 1 nearest with ties to even
// (trunc(0.5 + v) in double, pulled back by one on an odd tie); 2 half
// away from zero. NaN gives 0.
template <typename T> inline T convert(float f, int32_t mode) {
    const double v = f;
    if (v >= Limits<T>::hi) return (T)Limits<T>::hi;
    if (v <= Limits<T>::lo) return (T)Limits<T>::lo;
    if (v != v) return 0;
    double r;
    if (mode == 0) {
        r = trunc(v);
    } else if (mode == 1) {
        if (v <= 0.5 && v >= -0.5) return 0;
        if (v > 0) {
            r = trunc(0.5 + v);
            if (r - v == 0.5 && fmod(r, 2.0) != 0) r -= 1;
        } else {
            r = trunc(v - 0.5);
            if (v - r == 0.5 && fmod(r, 2.0) != 0) r += 1;
        }
    } else {
        r = v < 0 ? trunc(v - 0.5) : trunc(0.5 + v);
    }
    return (T)(int32_t)r;
}

// One output pixel: kernel rows in order, taps left to right (the reversed
// store read backwards). m7 keeps even and odd taps of a row apart for 32f.
template <typename T, bool kSplit>
inline float window_sum(const T* src, int32_t srcStep, int32_t x, const Record& s) {
    const int32_t kw = s.kernelWidth, kh = s.kernelHeight;
    const float* t = s.pTaps + kw * kh - 1;
    float sum = 0.0f;
    for (int32_t j = 0; j < kh; ++j, t -= kw) {
        const T* p = row_at(src, srcStep, j) + x;
        if (kSplit) {
            float even = 0.0f, odd = 0.0f;
            int32_t i = 0;
            for (; i + 1 < kw; i += 2) {
                even += t[-i] * (float)simd::load<T>(p + i);
                odd += t[-i - 1] * (float)simd::load<T>(p + i + 1);
            }
            if (i < kw) even += t[-i] * (float)simd::load<T>(p + i);
            sum += even + odd;
        } else {
            for (int32_t i = 0; i < kw; ++i) sum += t[-i] * (float)simd::load<T>(p + i);
        }
    }
    return sum;
}

// Rows may start off their element boundary (any step): stores go through
// the vector layer.
template <typename T> inline void put(T* o, float v, int32_t mode) {
    simd::store(o, convert<T>(v, mode));
}
inline void put(Zor32f* o, float v, int32_t) { simd::store(o, v); }  // stored as summed

template <typename T, bool kSplit = false>
void scalar(const T* src, int32_t srcStep, T* dst, int32_t dstStep, int32_t w, int32_t h,
            const Record& s) {
    const float bias = bias_of(s);
    const int32_t mode = s.roundMode;
    for (int32_t y = 0; y < h; ++y) {
        const T* in = row_at(src, srcStep, y);
        T* out = row_at(dst, dstStep, y);
        for (int32_t x = 0; x < w; ++x) {
            float v = window_sum<T, kSplit>(in, srcStep, x, s);
            // Only a non-zero bias is added, so that -0 sums stay as they are.
            if (bias != 0.0f) v += bias;
            put(out + x, v, mode);
        }
    }
}

// ---- path choice per level ---------------------------------------------------

#if !ZOR_HAS_AVX

template <typename T>
inline void run_int(const T* src, int32_t srcStep, T* dst, int32_t dstStep, int32_t w, int32_t h,
                    const Record& s, float* work) {
    if (s.kernelWidth <= 2 || w <= 16)
        scalar(src, srcStep, dst, dstStep, w, h, s);
    else
        rowacc(src, srcStep, dst, dstStep, w, h, s, work);
}

inline void run_flt(const Zor32f* src, int32_t srcStep, Zor32f* dst, int32_t dstStep, int32_t w,
                    int32_t h, const Record& s, float*) {
#if ZOR_FILTER_32F_SCALAR
    scalar<Zor32f, true>(src, srcStep, dst, dstStep, w, h, s);
#else
    if (w > s.kernelWidth + 8)
        vec_32f_sse(src, srcStep, dst, dstStep, w, h, s);
    else
        scalar(src, srcStep, dst, dstStep, w, h, s);
#endif
}

#else

template <typename T>
inline void run_int(const T* src, int32_t srcStep, T* dst, int32_t dstStep, int32_t w, int32_t h,
                    const Record& s, float* work) {
    if (w < 8)
        scalar(src, srcStep, dst, dstStep, w, h, s);
    else
        vec_avx(src, srcStep, dst, dstStep, w, h, s, work);
}

inline void run_flt(const Zor32f* src, int32_t srcStep, Zor32f* dst, int32_t dstStep, int32_t w,
                    int32_t h, const Record& s, float* work) {
#if ZOR_HAS_MASKED_TAILS
    // One masked kernel for every width.
    vec_avx(src, srcStep, dst, dstStep, w, h, s, work);
#else
    if (w < 8)
        scalar(src, srcStep, dst, dstStep, w, h, s);
    else
        vec_avx(src, srcStep, dst, dstStep, w, h, s, work);
#endif
}

#endif

}  // namespace

void run(const Zor8u* src, int32_t srcStep, Zor8u* dst, int32_t dstStep, int32_t w, int32_t h,
         const Record& s, float* work) {
    run_int(src, srcStep, dst, dstStep, w, h, s, work);
}
void run(const Zor16u* src, int32_t srcStep, Zor16u* dst, int32_t dstStep, int32_t w, int32_t h,
         const Record& s, float* work) {
    run_int(src, srcStep, dst, dstStep, w, h, s, work);
}
void run(const Zor16s* src, int32_t srcStep, Zor16s* dst, int32_t dstStep, int32_t w, int32_t h,
         const Record& s, float* work) {
    run_int(src, srcStep, dst, dstStep, w, h, s, work);
}
void run(const Zor32f* src, int32_t srcStep, Zor32f* dst, int32_t dstStep, int32_t w, int32_t h,
         const Record& s, float* work) {
    run_flt(src, srcStep, dst, dstStep, w, h, s, work);
}

}  // namespace filt
ZOR_END
