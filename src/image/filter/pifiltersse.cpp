// Vector kernels of the general filter on the SSE levels (m7, n8, y8).
//
// Integer pixels: each source row is converted once into a float row and
// feeds two output lines at a time (the row's kernel row j for output y
// and j - 1 for output y + 1), so every source row loaded serves two
// outputs. The lines are then converted to nearest with saturation,
// whatever rounding the record asks for.
//
// 32f (n8, y8): all taps of a block of outputs are summed in registers,
// kernel rows in order and taps left to right, each product rounded before
// it is added, which is the scalar path's arithmetic.
#include "variant.h"

#if !ZOR_HAS_AVX

#include <emmintrin.h>

#include "pifilter.h"
#include "simd.h"

ZOR_BEGIN
namespace filt {
namespace {

typedef simd::vec<16, float> v4;

// ---- pixels to floats (SSE2 only: m7 has no pmovzx) --------------------------

inline void to_float(const Zor8u* p, float* out, int32_t n) {
    const __m128i z = _mm_setzero_si128();
    int32_t i = 0;
    for (; i + 16 <= n; i += 16) {
        const __m128i v = _mm_loadu_si128((const __m128i*)(p + i));
        const __m128i lo = _mm_unpacklo_epi8(v, z), hi = _mm_unpackhi_epi8(v, z);
        _mm_storeu_ps(out + i, _mm_cvtepi32_ps(_mm_unpacklo_epi16(lo, z)));
        _mm_storeu_ps(out + i + 4, _mm_cvtepi32_ps(_mm_unpackhi_epi16(lo, z)));
        _mm_storeu_ps(out + i + 8, _mm_cvtepi32_ps(_mm_unpacklo_epi16(hi, z)));
        _mm_storeu_ps(out + i + 12, _mm_cvtepi32_ps(_mm_unpackhi_epi16(hi, z)));
    }
    for (; i < n; ++i) out[i] = (float)p[i];
}

inline void to_float(const Zor16u* p, float* out, int32_t n) {
    const __m128i z = _mm_setzero_si128();
    int32_t i = 0;
    for (; i + 8 <= n; i += 8) {
        const __m128i v = _mm_loadu_si128((const __m128i*)(p + i));
        _mm_storeu_ps(out + i, _mm_cvtepi32_ps(_mm_unpacklo_epi16(v, z)));
        _mm_storeu_ps(out + i + 4, _mm_cvtepi32_ps(_mm_unpackhi_epi16(v, z)));
    }
    for (; i < n; ++i) out[i] = (float)simd::load<Zor16u>(p + i);
}

inline void to_float(const Zor16s* p, float* out, int32_t n) {
    int32_t i = 0;
    for (; i + 8 <= n; i += 8) {
        const __m128i v = _mm_loadu_si128((const __m128i*)(p + i));
        const __m128i lo = _mm_srai_epi32(_mm_unpacklo_epi16(v, v), 16);
        const __m128i hi = _mm_srai_epi32(_mm_unpackhi_epi16(v, v), 16);
        _mm_storeu_ps(out + i, _mm_cvtepi32_ps(lo));
        _mm_storeu_ps(out + i + 4, _mm_cvtepi32_ps(hi));
    }
    for (; i < n; ++i) out[i] = (float)simd::load<Zor16s>(p + i);
}

// ---- line to pixels ------------------------------------------------------------

// Bias (zero in every record made here: the call returns at once) and the
// always-nearest conversion of the finished line.
inline void to_pixels(float* line, Zor8u* out, int32_t w, float bias) {
    ZOR_NAME(zorsAddC_32f_I)(line, w, bias);
    ZOR_NAME(zorsConvert_32f8u_Sfs)(line, out, w, 1, 0);
}
inline void to_pixels(float* line, Zor16u* out, int32_t w, float bias) {
    ZOR_NAME(zorsAddC_32f_I)(line, w, bias);
    ZOR_NAME(zorsConvert_32f16u_Sfs)(line, out, w, 1, 0);
}
inline void to_pixels(float* line, Zor16s* out, int32_t w, float bias) {
    ZOR_NAME(zorsAddC_32f_I)(line, w, bias);
    ZOR_NAME(zorsConvert_32f16s_Sfs)(line, out, w, 1, 0);
}

// ---- the line passes -------------------------------------------------------------

// Taps of kernel row j in the caller's order: t[-i] is tap i.
inline const float* taps_row(const Record& s, int32_t j) {
    return s.pTaps + s.kernelWidth * s.kernelHeight - 1 - j * s.kernelWidth;
}

// One kernel row over one line: line = (first ? 0 : line) + sum t[-i] * in[x + i].
// Lines and the float row are padded to whole vectors, so the last block
// runs on spare lanes that are never converted.
template <bool kFirst>
void pass1(const float* in, float* line, const float* t, int32_t w, int32_t kw) {
    for (int32_t x = 0; x < w; x += 8) {
        v4 a0 = kFirst ? v4{} : simd::load<v4>(line + x);
        v4 a1 = kFirst ? v4{} : simd::load<v4>(line + x + 4);
        for (int32_t i = 0; i < kw; ++i) {
            const v4 c = simd::broadcast<v4>(t[-i]);
            a0 = a0 + c * simd::load<v4>(in + x + i);
            a1 = a1 + c * simd::load<v4>(in + x + i + 4);
        }
        simd::store(line + x, a0);
        simd::store(line + x + 4, a1);
    }
}

// One float row into two lines with different kernel rows.
template <bool kFirst0, bool kFirst1>
void pass2(const float* in, float* l0, const float* t0, float* l1, const float* t1, int32_t w,
           int32_t kw) {
    for (int32_t x = 0; x < w; x += 8) {
        v4 a0 = kFirst0 ? v4{} : simd::load<v4>(l0 + x);
        v4 a1 = kFirst0 ? v4{} : simd::load<v4>(l0 + x + 4);
        v4 b0 = kFirst1 ? v4{} : simd::load<v4>(l1 + x);
        v4 b1 = kFirst1 ? v4{} : simd::load<v4>(l1 + x + 4);
        for (int32_t i = 0; i < kw; ++i) {
            const v4 s0 = simd::load<v4>(in + x + i), s1 = simd::load<v4>(in + x + i + 4);
            const v4 c0 = simd::broadcast<v4>(t0[-i]), c1 = simd::broadcast<v4>(t1[-i]);
            a0 = a0 + c0 * s0;
            a1 = a1 + c0 * s1;
            b0 = b0 + c1 * s0;
            b1 = b1 + c1 * s1;
        }
        simd::store(l0 + x, a0);
        simd::store(l0 + x + 4, a1);
        simd::store(l1 + x, b0);
        simd::store(l1 + x + 4, b1);
    }
}

template <typename T>
void rowacc_t(const T* src, int32_t srcStep, T* dst, int32_t dstStep, int32_t w, int32_t h,
              const Record& s, float* work) {
    const int32_t kw = s.kernelWidth, kh = s.kernelHeight;
    const int32_t lw = (w + 7) & ~7;  // lines in whole blocks of 8
    const int32_t inLen = w + kw - 1;
    float* l0 = work;
    float* l1 = work + lw;
    float* in = work + 2 * lw;
    // Spare lanes of the float row read by the last block: zeros, never
    // denormals or NaN left over from another call.
    for (int32_t i = inLen; i < lw + kw - 1; ++i) in[i] = 0.0f;
    const float bias = bias_of(s);

    int32_t y = 0;
    for (; y + 1 < h; y += 2) {
        for (int32_t r = 0; r <= kh; ++r) {
            to_float(row_at(src, srcStep, y + r), in, inLen);
            if (r == 0)
                pass1<true>(in, l0, taps_row(s, 0), w, kw);
            else if (r == kh && kh == 1)
                pass1<true>(in, l1, taps_row(s, 0), w, kw);
            else if (r == kh)
                pass1<false>(in, l1, taps_row(s, kh - 1), w, kw);
            else if (r == 1)
                pass2<false, true>(in, l0, taps_row(s, 1), l1, taps_row(s, 0), w, kw);
            else
                pass2<false, false>(in, l0, taps_row(s, r), l1, taps_row(s, r - 1), w, kw);
        }
        to_pixels(l0, row_at(dst, dstStep, y), w, bias);
        to_pixels(l1, row_at(dst, dstStep, y + 1), w, bias);
    }
    if (y < h) {
        for (int32_t r = 0; r < kh; ++r) {
            to_float(row_at(src, srcStep, y + r), in, inLen);
            if (r == 0)
                pass1<true>(in, l0, taps_row(s, 0), w, kw);
            else
                pass1<false>(in, l0, taps_row(s, r), w, kw);
        }
        to_pixels(l0, row_at(dst, dstStep, y), w, bias);
    }
}

// ---- 32f ---------------------------------------------------------------------

template <int NB>
inline void block_32f(const Zor32f* src, int32_t srcStep, Zor32f* out, int32_t x, const Record& s) {
    const int32_t kw = s.kernelWidth, kh = s.kernelHeight;
    v4 acc[NB];
#pragma GCC unroll 16
    for (int k = 0; k < NB; ++k) acc[k] = v4{};
    const float* t = s.pTaps + kw * kh - 1;
    for (int32_t j = 0; j < kh; ++j, t -= kw) {
        const Zor32f* p = row_at(src, srcStep, j) + x;
        for (int32_t i = 0; i < kw; ++i) {
            const v4 c = simd::broadcast<v4>(t[-i]);
#pragma GCC unroll 16
            for (int k = 0; k < NB; ++k) acc[k] = acc[k] + c * simd::load<v4>(p + i + 4 * k);
        }
    }
#pragma GCC unroll 16
    for (int k = 0; k < NB; ++k) simd::store(out + x + 4 * k, acc[k]);
}

}  // namespace

void rowacc(const Zor8u* src, int32_t srcStep, Zor8u* dst, int32_t dstStep, int32_t w, int32_t h,
            const Record& s, float* work) {
    rowacc_t(src, srcStep, dst, dstStep, w, h, s, work);
}
void rowacc(const Zor16u* src, int32_t srcStep, Zor16u* dst, int32_t dstStep, int32_t w,
            int32_t h, const Record& s, float* work) {
    rowacc_t(src, srcStep, dst, dstStep, w, h, s, work);
}
void rowacc(const Zor16s* src, int32_t srcStep, Zor16s* dst, int32_t dstStep, int32_t w,
            int32_t h, const Record& s, float* work) {
    rowacc_t(src, srcStep, dst, dstStep, w, h, s, work);
}

// w > kw + 8 here, so a last block that overlaps the previous one stays
// inside the row.
void vec_32f_sse(const Zor32f* src, int32_t srcStep, Zor32f* dst, int32_t dstStep, int32_t w,
                 int32_t h, const Record& s) {
    for (int32_t y = 0; y < h; ++y) {
        const Zor32f* in = row_at(src, srcStep, y);
        Zor32f* out = row_at(dst, dstStep, y);
        int32_t x = 0;
        for (; x + 16 <= w; x += 16) block_32f<4>(in, srcStep, out, x, s);
        for (; x + 4 <= w; x += 4) block_32f<1>(in, srcStep, out, x, s);
        if (x < w) block_32f<1>(in, srcStep, out, w - 4, s);
    }
}

}  // namespace filt
ZOR_END

#endif
