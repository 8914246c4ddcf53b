// Vector kernels of the general filter on the AVX levels (e9, l9, n0, k0).
//
// Every kernel one tap wide, every 32f kernel, and integer kernels of few
// taps (any size on l9) keep all sums of a block of outputs in registers:
// each source vector loaded (and converted, for integer pixels) serves
// every output row it lies under. Larger integer kernels go through float
// rows in the kernel work area: for each pair of output rows, every source
// row under them is converted once and applied tap by tap to both float
// lines with its kernel row for each (the first kernel row sets a line,
// later ones add). Integer results round to nearest with saturation. l9
// and above use fused multiply-add, so their last bit may differ from e9.
#include "variant.h"

#if ZOR_HAS_AVX

#include <immintrin.h>
#include <string.h>

#include "pifilter.h"
#include "simd.h"

ZOR_BEGIN
namespace filt {
namespace {

// ---- pixels in and out of float vectors ----------------------------------------------

typedef simd::vf32 vf;
constexpr int VL = simd::Lanes<vf>::count;
// A row's last partial vector goes under a mask, or (without masked
// tails) the last whole vector is redone.
constexpr bool kMasked = ZOR_HAS_MASKED_TAILS;

// t * v + a: fused where the level has it (l9 and above), else rounded
// twice; this is what makes the AVX2 levels' last bit differ from e9's.
inline vf madd(vf t, vf v, vf a) {
#if ZOR_HAS_FMA
    return simd::fma(t, v, a);
#else
    return t * v + a;
#endif
}

// 16s on AVX2 and above multiplies pixels standing in the upper half of a
// lane by the record's table of taps scaled by 2^-16; the product is the
// same as the plain one, both being exact powers of two apart.
constexpr bool kScaled16s = ZOR_HAS_AVX2;

#if ZOR_VECTOR_BYTES == 32

// max with the bound second: a NaN lane takes the bound.
inline vf vclamp(vf v, float lo, float hi) {
    return (vf)_mm256_min_ps(_mm256_max_ps((__m256)v, _mm256_set1_ps(lo)), _mm256_set1_ps(hi));
}

#if ZOR_HAS_AVX2
inline vf vpix(const Zor8u* p) {
    return (vf)_mm256_cvtepi32_ps(_mm256_cvtepu8_epi32(_mm_loadl_epi64((const __m128i*)p)));
}
inline vf vpix(const Zor16u* p) {
    return (vf)_mm256_cvtepi32_ps(_mm256_cvtepu16_epi32(_mm_loadu_si128((const __m128i*)p)));
}
// 16s pixels in the upper half of each lane, for the scaled taps.
inline vf vpix(const Zor16s* p) {
    return (vf)_mm256_cvtepi32_ps(
        _mm256_slli_epi32(_mm256_cvtepi16_epi32(_mm_loadu_si128((const __m128i*)p)), 16));
}
#else  // AVX alone widens by halves
inline __m256i join(__m128i lo, __m128i hi) {
    return _mm256_insertf128_si256(_mm256_castsi128_si256(lo), hi, 1);
}
inline vf vpix(const Zor8u* p) {
    const __m128i v = _mm_loadl_epi64((const __m128i*)p);
    return (vf)_mm256_cvtepi32_ps(
        join(_mm_cvtepu8_epi32(v), _mm_cvtepu8_epi32(_mm_srli_si128(v, 4))));
}
inline vf vpix(const Zor16u* p) {
    const __m128i v = _mm_loadu_si128((const __m128i*)p);
    return (vf)_mm256_cvtepi32_ps(
        join(_mm_cvtepu16_epi32(v), _mm_cvtepu16_epi32(_mm_srli_si128(v, 8))));
}
inline vf vpix(const Zor16s* p) {
    const __m128i v = _mm_loadu_si128((const __m128i*)p);
    return (vf)_mm256_cvtepi32_ps(
        join(_mm_cvtepi16_epi32(v), _mm_cvtepi16_epi32(_mm_srli_si128(v, 8))));
}
#endif

// Saturated and rounded to nearest, ties to even, whatever the caller's
// rounding control says.
inline __m256i vnear(vf v, float lo, float hi) {
    return _mm256_cvttps_epi32(_mm256_round_ps((__m256)vclamp(v, lo, hi),
                                               _MM_FROUND_TO_NEAREST_INT | _MM_FROUND_NO_EXC));
}
inline void vput(Zor8u* p, vf v) {
    const __m256i i = vnear(v, 0.0f, 255.0f);
    const __m128i w =
        _mm_packus_epi32(_mm256_castsi256_si128(i), _mm256_extractf128_si256(i, 1));
    _mm_storel_epi64((__m128i*)p, _mm_packus_epi16(w, w));
}
inline void vput(Zor16u* p, vf v) {
    const __m256i i = vnear(v, 0.0f, 65535.0f);
    _mm_storeu_si128((__m128i*)p,
                     _mm_packus_epi32(_mm256_castsi256_si128(i), _mm256_extractf128_si256(i, 1)));
}
inline void vput(Zor16s* p, vf v) {
    const __m256i i = vnear(v, -32768.0f, 32767.0f);
    _mm_storeu_si128((__m128i*)p,
                     _mm_packs_epi32(_mm256_castsi256_si128(i), _mm256_extractf128_si256(i, 1)));
}
template <typename T> inline void vput_n(T* p, vf v, int32_t n) {
    T b[VL];
    vput(b, v);
    memcpy(p, b, (size_t)n * sizeof(T));
}

#else  // 64-byte vectors: AVX-512F only, so n0 runs it too

// Full-mask forms: the plain ones start from an undefined vector, which
// GCC 12 reports as uninitialised once they are inlined deep enough.
inline vf vclamp(vf v, float lo, float hi) {
    return (vf)_mm512_maskz_min_ps(
        0xFFFF, _mm512_maskz_max_ps(0xFFFF, (__m512)v, _mm512_set1_ps(lo)), _mm512_set1_ps(hi));
}
inline __mmask16 lanes(int32_t n) { return (__mmask16)((1u << n) - 1u); }

// Saturated and rounded to nearest, ties to even, whatever the caller's
// rounding control says.
inline __m512i vnear(vf v, float lo, float hi) {
    return _mm512_maskz_cvt_roundps_epi32(0xFFFF, (__m512)vclamp(v, lo, hi),
                                          _MM_FROUND_TO_NEAREST_INT | _MM_FROUND_NO_EXC);
}

inline vf vpix(const Zor8u* p) {
    return (vf)_mm512_cvtepi32_ps(_mm512_cvtepu8_epi32(_mm_loadu_si128((const __m128i*)p)));
}
inline vf vpix(const Zor16u* p) {
    return (vf)_mm512_cvtepi32_ps(_mm512_cvtepu16_epi32(_mm256_loadu_si256((const __m256i*)p)));
}
inline vf vpix(const Zor16s* p) {
    return (vf)_mm512_cvtepi32_ps(
        _mm512_slli_epi32(_mm512_cvtepi16_epi32(_mm256_loadu_si256((const __m256i*)p)), 16));
}

// Narrowing stores under a mask; the whole-vector ones take every lane.
inline void vput_n(Zor8u* p, vf v, int32_t n) {
    _mm512_mask_cvtusepi32_storeu_epi8(p, lanes(n), vnear(v, 0.0f, 255.0f));
}
inline void vput_n(Zor16u* p, vf v, int32_t n) {
    _mm512_mask_cvtusepi32_storeu_epi16(p, lanes(n), vnear(v, 0.0f, 65535.0f));
}
inline void vput_n(Zor16s* p, vf v, int32_t n) {
    _mm512_mask_cvtsepi32_storeu_epi16(p, lanes(n), vnear(v, -32768.0f, 32767.0f));
}
inline void vput(Zor8u* p, vf v) { vput_n(p, v, VL); }
inline void vput(Zor16u* p, vf v) { vput_n(p, v, VL); }
inline void vput(Zor16s* p, vf v) { vput_n(p, v, VL); }

#endif

// 32f pixels are floats already.
inline vf vpix(const Zor32f* p) { return simd::load<vf>(p); }
inline void vput(Zor32f* p, vf v) { simd::store(p, v); }
inline void vput_n(Zor32f* p, vf v, int32_t n) { simd::store_n(p, v, n); }

// A partial vector of pixels: byte and word loads under a mask need BW,
// which n0 lacks, so integers are staged.
inline vf vpix_n(const Zor32f* p, int32_t n) { return simd::load_n<vf>(p, n); }
template <typename T> inline vf vpix_n(const T* p, int32_t n) {
    T b[VL] = {};
    memcpy(b, p, (size_t)n * sizeof(T));
    return vpix(b);
}

// Taps in the caller's order, read in place from the record: tap k at
// base[k * S] (S = -1: the reversed store walked backwards; S = 4: the
// table of four copies per tap). The stride is fixed per level and type.
template <int S> struct Walk {
    const float* base;
    float operator[](int32_t k) const { return base[(ptrdiff_t)k * S]; }
    Walk from(int32_t k) const { return Walk{base + (ptrdiff_t)k * S}; }
};
typedef Walk<-1> Reversed;

inline Reversed reversed_taps(const Record& s) {
    return Reversed{s.pTaps + s.kernelWidth * s.kernelHeight - 1};
}

template <typename T> struct TapsOf {
    typedef Reversed type;
    static type get(const Record& s) { return reversed_taps(s); }
};
template <> struct TapsOf<Zor16s> {
    typedef Walk<kScaled16s ? 4 : -1> type;
    static type get(const Record& s) { return type{kScaled16s ? s.pBroadcastTaps : reversed_taps(s).base}; }
};

// 32f records carry no broadcast table: every level reads the reversed store.

inline float pix1(Zor8u v) { return (float)v; }
inline float pix1(Zor16u v) { return (float)v; }
inline float pix1(Zor16s v) { return kScaled16s ? (float)v * 65536.0f : (float)v; }

// A loaded vector that feeds several sums stays in its register: without
// this the compiler folds the load into every multiply-add, which turns
// one (usually line-splitting) load into several.
inline void keep(vf& v) { __asm__("" : "+v"(v)); }

constexpr int NB = 8;  // vectors summed side by side in the wide loops

// ---- integer pixels ------------------------------------------------------------

// n pixels into floats; the row's spare lanes up to `len` are zeroed.
template <typename T> void to_float(const T* p, float* out, int32_t n, int32_t len) {
    int32_t i = 0;
    for (; i + VL <= n; i += VL) simd::store(out + i, vpix(p + i));
    for (; i < n; ++i) out[i] = pix1(simd::load<T>(p + i));
    for (; i < len; ++i) out[i] = 0.0f;
}

// One line of output in the making: the kernel row applied to it next,
// whether that row is the first (the line starts at zero) and where the
// line goes when that row is its last (null: keep it as floats).
template <typename T> struct Line {
    float* acc;
    typename TapsOf<T>::type taps;
    bool first;
    T* out;
};

// The float row `in` applied to L lines at once for the vectors
// [x, x + N * VL): each vector of the row loaded serves every line.
template <int N, int L, typename T>
inline void pass_block(const float* in, const Line<T>* ln, int32_t kw, int32_t x, int32_t w) {
    vf a[L][N];
#pragma GCC unroll 4
    for (int l = 0; l < L; ++l)
#pragma GCC unroll 16
        for (int k = 0; k < N; ++k)
            a[l][k] = ln[l].first ? vf{} : simd::load<vf>(ln[l].acc + x + k * VL);
    for (int32_t i = 0; i < kw; ++i) {
        vf v[N];
#pragma GCC unroll 16
        for (int k = 0; k < N; ++k) {
            v[k] = simd::load<vf>(in + x + i + k * VL);
            if (L > 1) keep(v[k]);
        }
#pragma GCC unroll 4
        for (int l = 0; l < L; ++l) {
            const vf t = simd::broadcast<vf>(ln[l].taps[i]);
#pragma GCC unroll 16
            for (int k = 0; k < N; ++k) a[l][k] = madd(t, v[k], a[l][k]);
        }
    }
#pragma GCC unroll 4
    for (int l = 0; l < L; ++l)
#pragma GCC unroll 16
        for (int k = 0; k < N; ++k) {
            const int32_t at = x + k * VL;
            if (!ln[l].out)
                simd::store(ln[l].acc + at, a[l][k]);
            else if (at + VL <= w)
                vput(ln[l].out + at, a[l][k]);
            else if (at < w)
                vput_n(ln[l].out + at, a[l][k], w - at);
        }
}

// Lines and the float row are padded to whole vectors: the last block
// runs on spare lanes that are never stored to the image.
template <int L, typename T>
void pass(const float* in, const Line<T>* ln, int32_t kw, int32_t lw, int32_t w) {
    constexpr int N = L == 1 ? NB : NB / 2;
    int32_t x = 0;
    for (; x + N * VL <= lw; x += N * VL) pass_block<N, L>(in, ln, kw, x, w);
    for (; x < lw; x += VL) pass_block<1, L>(in, ln, kw, x, w);
}

// Rows of kernels at least 2 wide: each source row is converted once per
// pair of output rows and feeds both (kernel row r for the upper line,
// r - 1 for the lower one).
template <typename T>
void filter_int(const T* src, int32_t srcStep, T* dst, int32_t dstStep, int32_t w, int32_t h,
                const Record& s, float* work) {
    const int32_t kw = s.kernelWidth, kh = s.kernelHeight;
    const typename TapsOf<T>::type c = TapsOf<T>::get(s);
    // Work area: two lines of lw floats and the float row of lw + kw - 1,
    // within the 4 W + 4 kw kh floats that the size query grants.
    const int32_t lw = (w + VL - 1) & ~(VL - 1);
    const int32_t inLen = lw + kw - 1;
    float* l0 = work;
    float* l1 = work + lw;
    float* in = work + 2 * lw;
    const int32_t n = w + kw - 1;

    int32_t y = 0;
    if (kh > 1) {
        for (; y + 1 < h; y += 2) {
            T* out0 = row_at(dst, dstStep, y);
            T* out1 = row_at(dst, dstStep, y + 1);
            for (int32_t r = 0; r <= kh; ++r) {
                to_float(row_at(src, srcStep, y + r), in, n, inLen);
                const Line<T> up{l0, c.from((r < kh ? r : 0) * kw), r == 0, r == kh - 1 ? out0 : nullptr};
                const Line<T> down{l1, c.from((r > 0 ? r - 1 : 0) * kw), r == 1,
                                     r == kh ? out1 : nullptr};
                if (r == 0) {
                    pass<1>(in, &up, kw, lw, w);
                } else if (r == kh) {
                    pass<1>(in, &down, kw, lw, w);
                } else {
                    const Line<T> both[2] = {up, down};
                    pass<2>(in, both, kw, lw, w);
                }
            }
        }
    }
    for (; y < h; ++y) {
        T* out = row_at(dst, dstStep, y);
        for (int32_t r = 0; r < kh; ++r) {
            to_float(row_at(src, srcStep, y + r), in, n, inLen);
            const Line<T> one{l0, c.from(r * kw), r == 0, r == kh - 1 ? out : nullptr};
            pass<1>(in, &one, kw, lw, w);
        }
    }
}

// ---- all taps in registers ------------------------------------------------------

// One source row's taps into the R x N sums; kAll: every output row of
// the block lies over this source row.
template <int R, int N, bool kAll, typename T, typename C>
__attribute__((always_inline)) inline void source_row(const T* p, vf (&a)[R][N],
                                                      const bool (&live)[R],
                                                      const C (&rowTaps)[R], int32_t kw) {
    for (int32_t i = 0; i < kw; ++i) {
        vf v[N];
#pragma GCC unroll 16
        for (int k = 0; k < N; ++k) {
            v[k] = vpix(p + i + k * VL);
            if (R > 1) keep(v[k]);
        }
#pragma GCC unroll 4
        for (int q = 0; q < R; ++q) {
            if (!kAll && !live[q]) continue;
            const vf t = simd::broadcast<vf>(rowTaps[q][i]);
#pragma GCC unroll 16
            for (int k = 0; k < N; ++k) a[q][k] = madd(t, v[k], a[q][k]);
        }
    }
}

// All taps for R output rows by N vectors at x, in registers: every
// source vector loaded serves each of the R rows it lies under.
template <int R, int N, typename T, typename C>
inline void block(const T* src, int32_t srcStep, T* dst, int32_t dstStep, C c, int32_t kw,
                  int32_t kh, int32_t x) {
    vf a[R][N];
#pragma GCC unroll 4
    for (int q = 0; q < R; ++q)
#pragma GCC unroll 16
        for (int k = 0; k < N; ++k) a[q][k] = vf{};
    for (int32_t r = 0; r < kh + R - 1; ++r) {
        const T* p = row_at(src, srcStep, r) + x;
        // Output row q takes this source row with kernel row r - q.
        bool live[R];
        C rowTaps[R];
#pragma GCC unroll 4
        for (int q = 0; q < R; ++q) {
            live[q] = r - q >= 0 && r - q < kh;
            rowTaps[q] = c.from(live[q] ? (r - q) * kw : 0);
        }
        bool all = true;
#pragma GCC unroll 4
        for (int q = 0; q < R; ++q) all = all && live[q];
        // Rows under every output row of the block take the loop without
        // tests; only the first and last R - 1 rows take the other.
        if (all)
            source_row<R, N, true>(p, a, live, rowTaps, kw);
        else
            source_row<R, N, false>(p, a, live, rowTaps, kw);
    }
#pragma GCC unroll 4
    for (int q = 0; q < R; ++q)
#pragma GCC unroll 16
        for (int k = 0; k < N; ++k) vput(row_at(dst, dstStep, q) + x + k * VL, a[q][k]);
}

// The last n < VL outputs of one row (n0, k0).
template <typename T, typename C>
inline void tail(const T* src, int32_t srcStep, T* out, C c, int32_t kw, int32_t kh, int32_t x,
                 int32_t n) {
    vf a = vf{};
    for (int32_t j = 0; j < kh; ++j) {
        const T* p = row_at(src, srcStep, j) + x;
        const C cj = c.from(j * kw);
        for (int32_t i = 0; i < kw; ++i) a = madd(simd::broadcast<vf>(cj[i]), vpix_n(p + i, n), a);
    }
    vput_n(out + x, a, n);
}

// R rows of output.
template <int R, int N, typename T, typename C>
void rows(const T* src, int32_t srcStep, T* dst, int32_t dstStep, int32_t w, C c, int32_t kw,
          int32_t kh) {
    int32_t x = 0;
    for (; x + N * VL <= w; x += N * VL) block<R, N>(src, srcStep, dst, dstStep, c, kw, kh, x);
    // The whole vectors left over in one block, so that each source vector
    // loaded still serves all R rows.
    switch ((w - x) / VL) {
    case 3: block<R, 3>(src, srcStep, dst, dstStep, c, kw, kh, x); break;
    case 2: block<R, 2>(src, srcStep, dst, dstStep, c, kw, kh, x); break;
    case 1: block<R, 1>(src, srcStep, dst, dstStep, c, kw, kh, x); break;
    default:
        for (; x + VL <= w; x += VL) block<R, 1>(src, srcStep, dst, dstStep, c, kw, kh, x);
    }
    x += (w - x) / VL * VL;
    if (x == w) return;
    if (kMasked) {
        for (int q = 0; q < R; ++q)
            tail(row_at(src, srcStep, q), srcStep, row_at(dst, dstStep, q), c, kw, kh, x, w - x);
    } else {  // w >= VL on e9 and l9: redo the last whole vector
        block<R, 1>(src, srcStep, dst, dstStep, c, kw, kh, w - VL);
    }
}

#if ZOR_VECTOR_BYTES == 64
constexpr int kRows = 4, kCols = 4;  // 16 of the 32 registers accumulate
#else
constexpr int kRows = 2, kCols = 4;  // 8 of the 16
#endif

template <typename T, typename C>
void filter_regs(const T* src, int32_t srcStep, T* dst, int32_t dstStep, int32_t w, int32_t h,
                 C c, int32_t kw, int32_t kh) {
    int32_t y = 0;
    for (; y + kRows <= h; y += kRows)
        rows<kRows, kCols>(row_at(src, srcStep, y), srcStep, row_at(dst, dstStep, y), dstStep, w,
                           c, kw, kh);
    for (; y < h; ++y)
        rows<1, NB>(row_at(src, srcStep, y), srcStep, row_at(dst, dstStep, y), dstStep, w, c, kw,
                    kh);
}

// Integer pixels: kernels up to kRegsTaps taps keep all sums in registers
// and convert the pixels as they load them; larger ones convert each row
// once per pair of output rows and sum through float lines. Where the
// turn lies was measured per level at 1920x1080.
constexpr int32_t kRegsTaps = ZOR_FILTER_REGS_TAPS;

template <typename T>
void filter_any(const T* src, int32_t srcStep, T* dst, int32_t dstStep, int32_t w, int32_t h,
                const Record& s, float* work) {
    const int32_t kw = s.kernelWidth, kh = s.kernelHeight;
    if (kw == 1 || kw * kh <= kRegsTaps)
        filter_regs(src, srcStep, dst, dstStep, w, h, TapsOf<T>::get(s), kw, kh);
    else
        filter_int(src, srcStep, dst, dstStep, w, h, s, work);
}

}  // namespace

void vec_avx(const Zor8u* src, int32_t srcStep, Zor8u* dst, int32_t dstStep, int32_t w, int32_t h,
             const Record& s, float* work) {
    filter_any(src, srcStep, dst, dstStep, w, h, s, work);
}
void vec_avx(const Zor16u* src, int32_t srcStep, Zor16u* dst, int32_t dstStep, int32_t w,
             int32_t h, const Record& s, float* work) {
    filter_any(src, srcStep, dst, dstStep, w, h, s, work);
}
void vec_avx(const Zor16s* src, int32_t srcStep, Zor16s* dst, int32_t dstStep, int32_t w,
             int32_t h, const Record& s, float* work) {
    filter_any(src, srcStep, dst, dstStep, w, h, s, work);
}
void vec_avx(const Zor32f* src, int32_t srcStep, Zor32f* dst, int32_t dstStep, int32_t w,
             int32_t h, const Record& s, float*) {
    filter_regs(src, srcStep, dst, dstStep, w, h, reversed_taps(s), s.kernelWidth,
                s.kernelHeight);
}

}  // namespace filt
ZOR_END

#endif
