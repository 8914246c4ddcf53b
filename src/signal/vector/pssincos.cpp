// Sine and cosine of one double, for the table builders of other
// operations; every level gives the same bits (no fused multiply-add, the
// same operations in the same order).
//
// |x| below 90112: n = rint(x * 32/pi), r = x - n*pi/32 with pi/32 in three
// parts (the first two short enough that their products with n are exact,
// the third kept as a correction), then the addition formula with a table
// of sin and cos of j*pi/32 (high and low parts) and Taylor polynomials for
// r. Every larger finite x, and the rare medium x so near a multiple of
// pi/32 that the three parts leave too few good bits of r, is reduced
// exactly: x*32/pi modulo 64 from a 256-bit window of the bits of 2/pi,
// chosen by the exponent of x.
#include "variant.h"

#include <emmintrin.h>
#include <stdint.h>
#include <string.h>

ZOR_BEGIN
namespace {

// sin(j*pi/32) high, low, cos(j*pi/32) high, low, for j = 0..63.
static const double kSinCosTable[64][4] = {
    {0.0, 0.0, 1.0, 0.0},
    {0.0980171403295606, -1.634582362244256e-18, 0.9951847266721969, -4.248691367830441e-17},
    {0.19509032201612828, -7.991079068461731e-18, 0.9807852804032304, 1.8546939997825006e-17},
    {0.2902846772544624, -1.892797870777425e-17, 0.9569403357322088, 4.05538698618757e-17},
    {0.3826834323650898, -1.0050772696461588e-17, 0.9238795325112867, 1.7645047084336677e-17},
    {0.47139673682599764, 6.516678136069013e-18, 0.881921264348355, -1.9843248405890562e-17},
    {0.5555702330196022, 4.709410940561677e-17, 0.8314696123025452, 1.4073856984728024e-18},
    {0.6343932841636455, 1.0420901929280035e-17, 0.773010453362737, -3.256590703364977e-17},
    {0.7071067811865476, -4.833646656726457e-17, 0.7071067811865476, -4.833646656726457e-17},
    {0.773010453362737, -3.256590703364977e-17, 0.6343932841636455, 1.0420901929280035e-17},
    {0.8314696123025452, 1.4073856984728024e-18, 0.5555702330196022, 4.709410940561677e-17},
    {0.881921264348355, -1.9843248405890562e-17, 0.47139673682599764, 6.516678136069013e-18},
    {0.9238795325112867, 1.7645047084336677e-17, 0.3826834323650898, -1.0050772696461588e-17},
    {0.9569403357322088, 4.05538698618757e-17, 0.2902846772544624, -1.892797870777425e-17},
    {0.9807852804032304, 1.8546939997825006e-17, 0.19509032201612828, -7.991079068461731e-18},
    {0.9951847266721969, -4.248691367830441e-17, 0.0980171403295606, -1.634582362244256e-18},
    {1.0, 0.0, 0.0, 0.0},
    {0.9951847266721969, -4.248691367830441e-17, -0.0980171403295606, 1.634582362244256e-18},
    {0.9807852804032304, 1.8546939997825006e-17, -0.19509032201612828, 7.991079068461731e-18},
    {0.9569403357322088, 4.05538698618757e-17, -0.2902846772544624, 1.892797870777425e-17},
    {0.9238795325112867, 1.7645047084336677e-17, -0.3826834323650898, 1.0050772696461588e-17},
    {0.881921264348355, -1.9843248405890562e-17, -0.47139673682599764, -6.516678136069013e-18},
    {0.8314696123025452, 1.4073856984728024e-18, -0.5555702330196022, -4.709410940561677e-17},
    {0.773010453362737, -3.256590703364977e-17, -0.6343932841636455, -1.0420901929280035e-17},
    {0.7071067811865476, -4.833646656726457e-17, -0.7071067811865476, 4.833646656726457e-17},
    {0.6343932841636455, 1.0420901929280035e-17, -0.773010453362737, 3.256590703364977e-17},
    {0.5555702330196022, 4.709410940561677e-17, -0.8314696123025452, -1.4073856984728024e-18},
    {0.47139673682599764, 6.516678136069013e-18, -0.881921264348355, 1.9843248405890562e-17},
    {0.3826834323650898, -1.0050772696461588e-17, -0.9238795325112867, -1.7645047084336677e-17},
    {0.2902846772544624, -1.892797870777425e-17, -0.9569403357322088, -4.05538698618757e-17},
    {0.19509032201612828, -7.991079068461731e-18, -0.9807852804032304, -1.8546939997825006e-17},
    {0.0980171403295606, -1.634582362244256e-18, -0.9951847266721969, 4.248691367830441e-17},
    {0.0, 0.0, -1.0, 0.0},
    {-0.0980171403295606, 1.634582362244256e-18, -0.9951847266721969, 4.248691367830441e-17},
    {-0.19509032201612828, 7.991079068461731e-18, -0.9807852804032304, -1.8546939997825006e-17},
    {-0.2902846772544624, 1.892797870777425e-17, -0.9569403357322088, -4.05538698618757e-17},
    {-0.3826834323650898, 1.0050772696461588e-17, -0.9238795325112867, -1.7645047084336677e-17},
    {-0.47139673682599764, -6.516678136069013e-18, -0.881921264348355, 1.9843248405890562e-17},
    {-0.5555702330196022, -4.709410940561677e-17, -0.8314696123025452, -1.4073856984728024e-18},
    {-0.6343932841636455, -1.0420901929280035e-17, -0.773010453362737, 3.256590703364977e-17},
    {-0.7071067811865476, 4.833646656726457e-17, -0.7071067811865476, 4.833646656726457e-17},
    {-0.773010453362737, 3.256590703364977e-17, -0.6343932841636455, -1.0420901929280035e-17},
    {-0.8314696123025452, -1.4073856984728024e-18, -0.5555702330196022, -4.709410940561677e-17},
    {-0.881921264348355, 1.9843248405890562e-17, -0.47139673682599764, -6.516678136069013e-18},
    {-0.9238795325112867, -1.7645047084336677e-17, -0.3826834323650898, 1.0050772696461588e-17},
    {-0.9569403357322088, -4.05538698618757e-17, -0.2902846772544624, 1.892797870777425e-17},
    {-0.9807852804032304, -1.8546939997825006e-17, -0.19509032201612828, 7.991079068461731e-18},
    {-0.9951847266721969, 4.248691367830441e-17, -0.0980171403295606, 1.634582362244256e-18},
    {-1.0, 0.0, 0.0, 0.0},
    {-0.9951847266721969, 4.248691367830441e-17, 0.0980171403295606, -1.634582362244256e-18},
    {-0.9807852804032304, -1.8546939997825006e-17, 0.19509032201612828, -7.991079068461731e-18},
    {-0.9569403357322088, -4.05538698618757e-17, 0.2902846772544624, -1.892797870777425e-17},
    {-0.9238795325112867, -1.7645047084336677e-17, 0.3826834323650898, -1.0050772696461588e-17},
    {-0.881921264348355, 1.9843248405890562e-17, 0.47139673682599764, 6.516678136069013e-18},
    {-0.8314696123025452, -1.4073856984728024e-18, 0.5555702330196022, 4.709410940561677e-17},
    {-0.773010453362737, 3.256590703364977e-17, 0.6343932841636455, 1.0420901929280035e-17},
    {-0.7071067811865476, 4.833646656726457e-17, 0.7071067811865476, -4.833646656726457e-17},
    {-0.6343932841636455, -1.0420901929280035e-17, 0.773010453362737, -3.256590703364977e-17},
    {-0.5555702330196022, -4.709410940561677e-17, 0.8314696123025452, 1.4073856984728024e-18},
    {-0.47139673682599764, -6.516678136069013e-18, 0.881921264348355, -1.9843248405890562e-17},
    {-0.3826834323650898, 1.0050772696461588e-17, 0.9238795325112867, 1.7645047084336677e-17},
    {-0.2902846772544624, 1.892797870777425e-17, 0.9569403357322088, 4.05538698618757e-17},
    {-0.19509032201612828, 7.991079068461731e-18, 0.9807852804032304, 1.8546939997825006e-17},
    {-0.0980171403295606, 1.634582362244256e-18, 0.9951847266721969, -4.248691367830441e-17},
};

// The bits of 2/pi after the point, 64 to a word, most significant first:
// enough for the window of the largest exponent.
static const uint64_t kTwoOverPi[20] = {
    0xa2f9836e4e441529ULL,
    0xfc2757d1f534ddc0ULL,
    0xdb6295993c439041ULL,
    0xfe5163abdebbc561ULL,
    0xb7246e3a424dd2e0ULL,
    0x06492eea09d1921cULL,
    0xfe1deb1cb129a73eULL,
    0xe88235f52ebb4484ULL,
    0xe99c7026b45f7e41ULL,
    0x3991d639835339f4ULL,
    0x9c845f8bbdf9283bULL,
    0x1ff897ffde05980fULL,
    0xef2f118b5a0a6d1fULL,
    0x6d367ecf27cb09b7ULL,
    0x4f463f669e5fea2dULL,
    0x7527bac7ebe5f17bULL,
    0x3d0739f78a5292eaULL,
    0x6bfb5fb11f8d5d08ULL,
    0x56033046fc7b6babULL,
    0xf0cfbc209af4361dULL
};

constexpr double kThirtyTwoOverPi = 10.185916357881302;
// pi/32 = part1 + part2 + part3 to about 2^-127; part1 has 31 significant
// bits and part2 32, so that n * part is exact for |n| < 2^20.
constexpr double kPiOver32Part1 = 0.09817477042088285;
constexpr double kPiOver32Part2 = 3.798187816439979e-12;
constexpr double kPiOver32Part3 = 1.2639164054974691e-22;
// pi/32 as a double-double, for the exact reduction.
constexpr double kPiOver32Hi = 0.09817477042468103;
constexpr double kPiOver32Lo = 3.827021247335479e-18;

constexpr double kInv3 = 0.16666666666666666;  // 1/3!
constexpr double kInv4 = 0.041666666666666664;
constexpr double kInv5 = 0.008333333333333333;
constexpr double kInv6 = 0.001388888888888889;
constexpr double kInv7 = 0.0001984126984126984;
constexpr double kInv8 = 2.48015873015873e-5;
constexpr double kInv9 = 2.7557319223985893e-6;

// Top 16 bits of |x|: below kTiny (|x| < 2^-252) the argument is the sine;
// from kHuge (|x| >= 90112) on the exact reduction is used.
constexpr uint32_t kTiny = 12336;
constexpr uint32_t kHuge = 16630;
constexpr uint32_t kInfinite = 0x7FF0;

// Cosine is sine a quarter turn on: 16 table rows.
constexpr int kSineMode = 2, kCosineMode = 1;

inline uint64_t bits_of(double x) {
    uint64_t u;
    memcpy(&u, &x, sizeof u);
    return u;
}

inline double from_bits(uint64_t u) {
    double x;
    memcpy(&x, &u, sizeof x);
    return x;
}

// 2^k for a normal result.
inline double pow2(int k) {
    return from_bits((uint64_t)(k + 1023) << 52);
}

inline uint32_t top16(double x) {
    return (uint32_t)(bits_of(x) >> 48) & 0x7FFF;
}

struct DD {
    double hi, lo;
};

// Dekker's exact product by splitting into 26-bit halves.
inline void split(double a, double* hi, double* lo) {
    const double c = 134217729.0 * a;
    *hi = c - (c - a);
    *lo = a - *hi;
}

inline DD two_prod(double a, double b) {
    double ah, al, bh, bl;
    split(a, &ah, &al);
    split(b, &bh, &bl);
    const double p = a * b;
    return {p, ((ah * bh - p) + ah * bl + al * bh) + al * bl};
}

inline DD two_sum(double a, double b) {
    const double s = a + b;
    const double bb = s - a;
    return {s, (a - (s - bb)) + (b - bb)};
}

// |a| >= |b| (or a == 0).
inline DD fast_two_sum(double a, double b) {
    const double s = a + b;
    return {s, b - (s - a)};
}

// x = n*pi/32 + hi + lo; only n modulo 64 matters.
struct Reduced {
    int32_t n;
    double hi, lo;
};

// sin(j*pi/32 + r), r = rh + rl, |r| about pi/64 at most. The exact
// product C*rh and the sum S + C*rh carry the bulk; everything else is a
// small tail added first.
double evaluate(int32_t j, double rh, double rl) {
    const double* row = kSinCosTable[j & 63];
    const double sh = row[0], sl = row[1], ch = row[2], cl = row[3];
    const double r2 = rh * rh;
    const double sinMinusR = rh * r2 * (-kInv3 + r2 * (kInv5 + r2 * (-kInv7 + r2 * kInv9)));
    const double cosMinusOne = r2 * (-0.5 + r2 * (kInv4 + r2 * (-kInv6 + r2 * kInv8)));
    const DD p = two_prod(ch, rh);
    const DD s = two_sum(sh, p.hi);
    const double tail = (sh * (cosMinusOne - rh * rl) + ch * sinMinusR) + ((cl * rh + ch * rl) + sl) +
                        (s.lo + p.lo);
    return s.hi + tail;
}

// Three-part reduction for |x| < 90112. False where r has come out so
// small that the error of the three parts (about 2^-105) could show.
bool reduce_medium(double x, Reduced* out) {
    const int32_t n = _mm_cvtsd_si32(_mm_set_sd(x * kThirtyTwoOverPi));
    const double nd = n;
    const double t = x - nd * kPiOver32Part1;
    const DD d = two_sum(t, -(nd * kPiOver32Part2));
    if (n != 0 && (bits_of(d.hi) & 0x7FFFFFFFFFFFFFFFULL) < 0x3D70000000000000ULL) return false;
    const DD r = fast_two_sum(d.hi, d.lo - nd * kPiOver32Part3);
    *out = {n, r.hi, r.lo};
    return true;
}

// 64 bits of the 320-bit little-endian number w from bit pos (>= 0) up.
inline uint64_t bits_from(const uint64_t* w, int pos) {
    const int i = pos >> 6, b = pos & 63;
    if (i >= 5) return 0;
    uint64_t v = w[i] >> b;
    if (b != 0 && i + 1 < 5) v |= w[i + 1] << (64 - b);
    return v;
}

// Exact reduction of a finite x with |x| >= 2^-10. With x = m * 2^(s-4),
// x*32/pi = m * 2^s * 2/pi; bits of 2/pi of weight 2^(s-i) >= 64 add only
// multiples of 64, so the window starts at bit s-5. Its 256 bits leave a
// fraction of more than 190 bits; the bits left out of the window are worth
// less than 2^-140 of pi/32.
Reduced reduce_exact(double x) {
    const uint64_t u = bits_of(x);
    const uint64_t m = (u & 0x000FFFFFFFFFFFFFULL) | 0x0010000000000000ULL;
    const int s = (int)((u >> 52) & 0x7FF) - 1075 + 4;
    const int firstBit = s - 5;
    const int k0 = firstBit <= 1 ? 0 : (firstBit - 1) / 64;
    uint64_t p[5];
    unsigned __int128 acc = 0;
    for (int w = 0; w < 4; ++w) {
        acc += (unsigned __int128)m * kTwoOverPi[k0 + 3 - w];
        p[w] = (uint64_t)acc;
        acc >>= 64;
    }
    p[4] = (uint64_t)acc;
    // The product is the window's contribution times 2^q.
    const int q = 64 * k0 + 256 - s;
    int32_t n = (int32_t)(bits_from(p, q) & 63);
    unsigned __int128 f = ((unsigned __int128)bits_from(p, q - 64) << 64) | bits_from(p, q - 128);
    const bool negative = (f >> 127) != 0;
    if (negative) {
        // Round to the nearer multiple: fraction - 1, as a magnitude.
        f = -f;
        n += 1;
    }
    double fh = 0.0, fl = 0.0;
    if (f != 0) {
        const uint64_t top = (uint64_t)(f >> 64);
        const int lz = top != 0 ? __builtin_clzll(top) : 64 + __builtin_clzll((uint64_t)f);
        f <<= lz;
        fh = (double)(int64_t)(uint64_t)(f >> 75) * pow2(-53 - lz);
        fl = (double)(int64_t)(((uint64_t)(f >> 22)) & 0x001FFFFFFFFFFFFFULL) * pow2(-106 - lz);
    }
    const DD ph = two_prod(fh, kPiOver32Hi);
    DD r = fast_two_sum(ph.hi, ph.lo + (fh * kPiOver32Lo + fl * kPiOver32Hi));
    if (negative) {
        r.hi = -r.hi;
        r.lo = -r.lo;
    }
    if ((int64_t)u < 0) return {-n, -r.hi, -r.lo};
    return {n, r.hi, r.lo};
}

double sin_cos_exact(double x, int mode) {
    const Reduced r = reduce_exact(x);
    return evaluate(r.n + (mode == kCosineMode ? 16 : 0), r.hi, r.lo);
}

double sin_kernel(double x) {
    if (top16(x) < kTiny) return x;
    Reduced r;
    if (!reduce_medium(x, &r)) r = reduce_exact(x);
    return evaluate(r.n, r.hi, r.lo);
}

double cos_kernel(double x) {
    if (top16(x) < kTiny) return 1.0;
    Reduced r;
    if (!reduce_medium(x, &r)) r = reduce_exact(x);
    return evaluate(r.n + 16, r.hi, r.lo);
}

}  // namespace
ZOR_END

ZOR_INTERNAL double ZOR_NAME(zorsSinOne)(double x) {
    using namespace ZOR_NS;
    const uint32_t top = top16(x);
    if (top < kHuge) return sin_kernel(x);
    if (top < kInfinite) return sin_cos_exact(x, kSineMode);
    return x * -0.0;
}

ZOR_INTERNAL double ZOR_NAME(zorsCosOne)(double x) {
    using namespace ZOR_NS;
    const uint32_t top = top16(x);
    if (top < kHuge) return cos_kernel(x);
    if (top < kInfinite) return sin_cos_exact(x, kCosineMode);
    return x * -0.0;
}
