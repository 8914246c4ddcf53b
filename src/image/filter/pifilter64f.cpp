// Direct double-precision filter: true convolution over a source that the
// caller has framed, no border logic.
//
// Every destination pixel is summed in an order fixed by the kernel's
// shape alone (see zorifilter64f.h), one lane per pixel where vectors run
// across pixels, so all levels give the same bits and the vector width
// only decides how many pixels go at once. Wide kernels run as passes of
// at most five columns over each destination row while it is in cache;
// the taps of a pass are few enough to stay near the registers.
#include "variant.h"

#include <stddef.h>
#include <string.h>

#include "simd.h"

#if ZOR_VECTOR_BYTES == 64
#include <immintrin.h>
#endif

ZOR_BEGIN
namespace {

using simd::vf64;
constexpr int kLanes = simd::Lanes<vf64>::count;
// Rows may start anywhere (odd steps): memory is touched only through the
// vector layer's loads and stores, which carry no alignment promise.

// A run of four equal taps, as the column form lays them out in the work
// buffer, as one vector of this level.
inline vf64 tap_run(const char* p) {
#if ZOR_VECTOR_BYTES == 64
    return (vf64)_mm512_broadcast_f64x4(_mm256_loadu_pd((const double*)p));
#else
    return simd::load<vf64>(p);
#endif
}

// Taps straight from the caller's kernel. `last` points at the tap that
// meets the group's first column of the top source row: tap (r, k) of the
// group lies r kernel rows and k columns before it.
struct KernelTaps {
    const double* last;
    ptrdiff_t kw;
    double at(ptrdiff_t r, int k) const { return last[-(r * kw + k)]; }
    vf64 vec(ptrdiff_t r, int k) const { return simd::broadcast<vf64>(at(r, k)); }
};

// Column taps from the work buffer: 32 bytes per kernel row, flipped, so
// the loop reads forward.
struct BufferTaps {
    const char* buf;
    double at(ptrdiff_t r, int) const { return simd::load<double>(buf + r * 32); }
    vf64 vec(ptrdiff_t r, int) const { return tap_run(buf + r * 32); }
};

// One pass of a G-column group over one destination row, U vectors of
// pixels at a time; returns the first pixel it did not reach. Add: the
// group adds to what an earlier group left in the row. The fixed-count
// loops are unrolled by hand: at -O2 the compiler would otherwise keep the
// accumulators in memory.
template <int G, bool Add, int U, class Taps>
int group_vec(const char* s, ptrdiff_t srcStep, char* d, int x, int width, Taps taps, int kh) {
    constexpr int kBlock = U * kLanes;
    for (; x + kBlock <= width; x += kBlock) {
        const char* sx = s + (ptrdiff_t)x * 8;
        char* dx = d + (ptrdiff_t)x * 8;
        vf64 acc[U];
        {
            const vf64 t = taps.vec(0, 0);
            #pragma GCC unroll 16
            for (int u = 0; u < U; ++u) {
                const vf64 p = t * simd::load<vf64>(sx + u * kLanes * 8);
                acc[u] = Add ? simd::load<vf64>(dx + u * kLanes * 8) + p : p;
            }
        }
        #pragma GCC unroll 16
        for (int k = 1; k < G; ++k) {
            const vf64 t = taps.vec(0, k);
            #pragma GCC unroll 16
            for (int u = 0; u < U; ++u)
                acc[u] = acc[u] + t * simd::load<vf64>(sx + (k + u * kLanes) * 8);
        }
        for (int r = 1; r < kh; ++r) {
            const char* sr = sx + r * srcStep;
            #pragma GCC unroll 16
            for (int k = 0; k < G; ++k) {
                const vf64 t = taps.vec(r, k);
                #pragma GCC unroll 16
                for (int u = 0; u < U; ++u)
                    acc[u] = acc[u] + t * simd::load<vf64>(sr + (k + u * kLanes) * 8);
            }
        }
        #pragma GCC unroll 16
        for (int u = 0; u < U; ++u) simd::store(dx + u * kLanes * 8, acc[u]);
    }
    return x;
}

template <int G, bool Add, class Taps>
void group_row(const char* s, ptrdiff_t srcStep, char* d, int width, Taps taps, int kh) {
    int x = group_vec<G, Add, 4>(s, srcStep, d, 0, width, taps, kh);
    x = group_vec<G, Add, 1>(s, srcStep, d, x, width, taps, kh);
    for (; x < width; ++x) {
        const char* sx = s + (ptrdiff_t)x * 8;
        const double p = taps.at(0, 0) * simd::load<double>(sx);
        double a = Add ? simd::load<double>(d + (ptrdiff_t)x * 8) + p : p;
        #pragma GCC unroll 16
        for (int k = 1; k < G; ++k) a = a + taps.at(0, k) * simd::load<double>(sx + k * 8);
        for (int r = 1; r < kh; ++r) {
            const char* sr = sx + r * srcStep;
            #pragma GCC unroll 16
            for (int k = 0; k < G; ++k) a = a + taps.at(r, k) * simd::load<double>(sr + k * 8);
        }
        simd::store(d + (ptrdiff_t)x * 8, a);
    }
}

struct Image {
    const char* src;  // top-left source pixel under the kernel
    ptrdiff_t srcStep;
    char* dst;
    ptrdiff_t dstStep;
    int width, height;
};

// Kernel one column wide.
template <class Taps>
void filter_column(const Image& im, Taps taps, int kh) {
    for (int y = 0; y < im.height; ++y)
        group_row<1, false>(im.src + y * im.srcStep, im.srcStep, im.dst + y * im.dstStep, im.width,
                            taps, kh);
}

// Kernel one row high and 2 to 16 wide: one pass with all taps.
template <int W>
void row_short(const Image& im, KernelTaps taps) {
    for (int y = 0; y < im.height; ++y)
        group_row<W, false>(im.src + y * im.srcStep, 0, im.dst + y * im.dstStep, im.width, taps, 1);
}

void filter_row_short(const Image& im, KernelTaps taps, int kw) {
    switch (kw) {
    case 2: return row_short<2>(im, taps);
    case 3: return row_short<3>(im, taps);
    case 4: return row_short<4>(im, taps);
    case 5: return row_short<5>(im, taps);
    case 6: return row_short<6>(im, taps);
    case 7: return row_short<7>(im, taps);
    case 8: return row_short<8>(im, taps);
    case 9: return row_short<9>(im, taps);
    case 10: return row_short<10>(im, taps);
    case 11: return row_short<11>(im, taps);
    case 12: return row_short<12>(im, taps);
    case 13: return row_short<13>(im, taps);
    case 14: return row_short<14>(im, taps);
    case 15: return row_short<15>(im, taps);
    default: return row_short<16>(im, taps);
    }
}

// Kernel one row high and at least 17 wide: per pixel a dot product whose
// tap j goes to partial sum j mod 16. The vectors hold the 16 partial sums
// across their lanes, so the flipped kernel is read backwards and each
// piece reversed.
constexpr int kSumVectors = 16 / kLanes;

inline vf64 reversed(vf64 v) {
#if ZOR_VECTOR_BYTES == 16
    return __builtin_shuffle(v, simd::vs64{1, 0});
#elif ZOR_VECTOR_BYTES == 32
    return __builtin_shuffle(v, simd::vs64{3, 2, 1, 0});
#else
    return __builtin_shuffle(v, simd::vs64{7, 6, 5, 4, 3, 2, 1, 0});
#endif
}

// Flipped taps j .. j + kLanes - 1; `end` is the kernel's last element.
inline vf64 flipped(const double* end, ptrdiff_t j) {
    return reversed(simd::load<vf64>((const char*)(end - j - (kLanes - 1))));
}

// Partial sums over the full blocks for the P pixels from s on, into
// sums[16 * p + lane].
template <int P>
void row_long_sums(const char* s, const double* end, ptrdiff_t blocks, double* sums) {
    vf64 acc[P][kSumVectors];
    #pragma GCC unroll 16
    for (int v = 0; v < kSumVectors; ++v) {
        const vf64 t = flipped(end, v * kLanes);
        #pragma GCC unroll 16
        for (int p = 0; p < P; ++p) acc[p][v] = t * simd::load<vf64>(s + (p + v * kLanes) * 8);
    }
    for (ptrdiff_t b = 1; b < blocks; ++b) {
        const char* sb = s + b * 16 * 8;
        #pragma GCC unroll 16
        for (int v = 0; v < kSumVectors; ++v) {
            const vf64 t = flipped(end, b * 16 + v * kLanes);
            #pragma GCC unroll 16
            for (int p = 0; p < P; ++p)
                acc[p][v] = acc[p][v] + t * simd::load<vf64>(sb + (p + v * kLanes) * 8);
        }
    }
    #pragma GCC unroll 16
    for (int p = 0; p < P; ++p)
        #pragma GCC unroll 16
        for (int v = 0; v < kSumVectors; ++v) simd::store(sums + p * 16 + v * kLanes, acc[p][v]);
}

void filter_row_long(const Image& im, const double* kernel, int kw) {
    const double* end = kernel + kw - 1;
    const ptrdiff_t blocks = kw / 16;
    const int rest = kw % 16;
    // Wider vectors have registers to spare for a second pixel, which
    // shares the reversed taps.
    constexpr int kPair = kLanes >= 4 ? 2 : 1;
    double sums[kPair * 16];
    const double* fr = end - blocks * 16;
    for (int y = 0; y < im.height; ++y) {
        const char* s = im.src + y * im.srcStep;
        char* d = im.dst + y * im.dstStep;
        for (int x = 0; x < im.width;) {
            const char* sx = s + (ptrdiff_t)x * 8;
            int n = kPair;
            if (x + kPair <= im.width)
                row_long_sums<kPair>(sx, end, blocks, sums);
            else
                row_long_sums<1>(sx, end, blocks, sums), n = 1;
            for (int i = 0; i < n; ++i, ++x) {
                double* p = sums + i * 16;
                const char* sr = s + ((ptrdiff_t)x + blocks * 16) * 8;
                for (int t = 0; t < rest; ++t)
                    p[t] = p[t] + fr[-t] * simd::load<double>(sr + t * 8);
                #pragma GCC unroll 16
                for (int k = 0; k < 8; ++k) p[k] = p[k] + p[k + 8];
                #pragma GCC unroll 16
                for (int k = 0; k < 4; ++k) p[k] = p[k] + p[k + 4];
                #pragma GCC unroll 16
                for (int k = 0; k < 2; ++k) p[k] = p[k] + p[k + 2];
                simd::store(d + (ptrdiff_t)x * 8, p[0] + p[1]);
            }
        }
    }
}

// Two-dimensional kernel: column groups of 2 to 5, left to right in the
// flipped kernel; the first sets the row, the others add to it.
template <bool Add>
void group_pass(const char* s, ptrdiff_t srcStep, char* d, int width, KernelTaps taps, int kh,
                int g) {
    switch (g) {
    case 2: return group_row<2, Add>(s, srcStep, d, width, taps, kh);
    case 3: return group_row<3, Add>(s, srcStep, d, width, taps, kh);
    case 4: return group_row<4, Add>(s, srcStep, d, width, taps, kh);
    default: return group_row<5, Add>(s, srcStep, d, width, taps, kh);
    }
}

void filter_groups(const Image& im, const double* kernel, int kw, int kh) {
    // Widths of the groups, left to right: fours, then what the rest of
    // the width needs so that no group is narrower than three (or two for
    // a two-column kernel).
    int groups[3 + 1];
    int fours = 0, n = 0;
    if (kw < 6) {
        groups[n++] = kw;
    } else if (kw == 6) {
        groups[n++] = 3;
        groups[n++] = 3;
    } else {
        switch (kw % 4) {
        case 0: fours = kw / 4; break;
        case 1: fours = (kw - 5) / 4; groups[n++] = 5; break;
        case 2: fours = (kw - 6) / 4; groups[n++] = 3; groups[n++] = 3; break;
        default: fours = (kw - 3) / 4; groups[n++] = 3; break;
        }
    }
    const double* last = kernel + (ptrdiff_t)kw * kh - 1;
    for (int y = 0; y < im.height; ++y) {
        const char* s = im.src + y * im.srcStep;
        char* d = im.dst + y * im.dstStep;
        int c = 0;
        for (int i = 0; i < fours; ++i, c += 4) {
            const KernelTaps taps{last - c, kw};
            if (c == 0)
                group_row<4, false>(s, im.srcStep, d, im.width, taps, kh);
            else
                group_row<4, true>(s + c * 8, im.srcStep, d, im.width, taps, kh);
        }
        for (int i = 0; i < n; c += groups[i++]) {
            const KernelTaps taps{last - c, kw};
            if (c == 0)
                group_pass<false>(s + c * 8, im.srcStep, d, im.width, taps, kh, groups[i]);
            else
                group_pass<true>(s + c * 8, im.srcStep, d, im.width, taps, kh, groups[i]);
        }
    }
}

}  // namespace
ZOR_END

ZOR_ENTRY ZorStatus ZOR_NAME(zoriFilter_64f_C1R)(const Zor64f* pSrc, int32_t srcStep, Zor64f* pDst,
                                                 int32_t dstStep, ZoriSize dstRoiSize,
                                                 const Zor64f* pKernel, ZoriSize kernelSize,
                                                 ZoriPoint anchor, Zor8u* pBuffer) {
    using namespace ZOR_NS;
    if (!pSrc || !pDst || !pKernel) return zorStsNullPtrErr;
    const int32_t width = dstRoiSize.width, height = dstRoiSize.height;
    const int32_t kw = kernelSize.width, kh = kernelSize.height;
    if (width < 1 || height < 1 || kw < 1 || kh < 1) return zorStsSizeErr;
    // The source row under the kernel spans kw + width - 1 pixels.
    if ((int64_t)srcStep < ((int64_t)kw + width) * 8 - 8 || (int64_t)dstStep < (int64_t)width * 8)
        return zorStsStepErr;

    // The anchor counts in the flipped kernel: the pixel under the last
    // kernel element is this far up and left of pSrc. Address arithmetic
    // in integers, as a wrong anchor may leave the caller's block.
    // A single tap only scales: its anchor cannot mean anything else.
    if (kw == 1 && kh == 1) anchor = ZoriPoint{0, 0};
    const intptr_t back = ((intptr_t)kw - 1 - anchor.x) * 8 + ((intptr_t)kh - 1 - anchor.y) * srcStep;
    const Image im{(const char*)((intptr_t)pSrc - back), srcStep, (char*)pDst, dstStep, width, height};

    if (kw == 1) {
        if (kh >= 3 && width >= 16 && pBuffer) {
            for (int32_t r = 0; r < kh; ++r)
                for (int i = 0; i < 4; ++i)
                    simd::store((char*)pBuffer + (ptrdiff_t)r * 32 + i * 8, pKernel[kh - 1 - r]);
            filter_column(im, BufferTaps{(const char*)pBuffer}, kh);
        } else {
            filter_column(im, KernelTaps{pKernel + kh - 1, 1}, kh);
        }
    } else if (kh == 1) {
        if (kw < 17)
            filter_row_short(im, KernelTaps{pKernel + kw - 1, kw}, kw);
        else
            filter_row_long(im, pKernel, kw);
    } else {
        filter_groups(im, pKernel, kw, kh);
    }
    return zorStsNoErr;
}
