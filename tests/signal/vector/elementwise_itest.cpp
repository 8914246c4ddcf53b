// Level-private element-wise operations that no public sweep reaches, on
// every level, and the memory kernels behind copies and clears.

#include <xmmintrin.h>

#include <array>

#include "vector_support.h"
#include "zorinternal.h"

extern "C" const int32_t ownCacheTable[];

namespace {

using Elementwise = zortest::LevelTest;

// Adding +-0 and multiplying by 1 touch nothing and multiplying by +-0
// clears, bit for bit whatever the elements hold (signalling NaNs too).
TEST_P(Elementwise, SquareAndConstantForms) {
    const std::vector<std::vector<float>> f(1, vt::values<float>(8200, 3));
    const std::vector<std::vector<double>> d(1, vt::values<double>(8200, 4));
    const auto sqr = ZOR_BODY(zorsSqr_32f);
    vt::sweep<float>(f, false, 1, false, [&](const float* const* s, float* o, int32_t n) { return sqr(s[0], o, n); },
                     [&](size_t i) { return f[0][i] * f[0][i]; });
    const auto addc = ZOR_BODY(zorsAddC_32f_I);
    for (float v : {1.5f, -3e-39f, std::numeric_limits<float>::quiet_NaN(), 0.0f, -0.0f})
        vt::sweep<float>(f, true, 1, v == 0, [&](const float* const*, float* o, int32_t n) { return addc(o, n, v); },
                         [&](size_t i) { return v == 0 ? f[0][i] : f[0][i] + v; });
    const auto mulc = ZOR_BODY(zorsMulC_64f_I);
    for (double v : {0.75, -1e300, std::numeric_limits<double>::infinity(), 1.0, 0.0, -0.0})
        vt::sweep<double>(d, true, 1, v == 0 || v == 1, [&](const double* const*, double* o, int32_t n) {
            return mulc(o, n, v); }, [&](size_t i) { return v == 1 ? d[0][i] : v == 0 ? 0.0 : d[0][i] * v; });
}

// Pointer, then length; nothing changes on refusal. The in-place flips are
// swept through the public ones with equal pointers; here their checks.
TEST_P(Elementwise, Checks) {
    float f[2] = {1, 2};
    double d[2] = {3, 4};
    Zor64fc one[1] = {{1, 2}};
    Zor8u b = 7;
    const ZorStatus N = zorStsNullPtrErr, S = zorStsSizeErr;
    const struct {
        ZorStatus got, want;
    } cases[] = {
        {ZOR_BODY(zorsAddC_32f_I)(nullptr, 0, 1.0f), N}, {ZOR_BODY(zorsAddC_32f_I)(f, 0, 0.0f), S},
        {ZOR_BODY(zorsMulC_64f_I)(nullptr, -1, 1.0), N}, {ZOR_BODY(zorsMulC_64f_I)(d, 0, 0.0), S},
        {ZOR_BODY(zorsAbs_32f)(nullptr, f, 0), N}, {ZOR_BODY(zorsSqr_32f)(f, f, -4), S},
        {ZOR_BODY(zorsFlip_32f_I)(nullptr, 0), N}, {ZOR_BODY(zorsFlip_32fc_I)((Zor32fc*)one, 0), S},
        {ZOR_BODY(zorsFlip_64f_I)(nullptr, 5), N}, {ZOR_BODY(zorsFlip_64fc_I)(one, -1), S},
        {ZOR_BODY(zorsConvert_32f8u_Sfs)(nullptr, &b, 0, 1, 0), N},
        {ZOR_BODY(zorsConvert_32f16u_Sfs)(f, nullptr, 1, 1, 0), N},
        {ZOR_BODY(zorsConvert_32f8u_Sfs)(f, &b, 0, 1, 0), S}, {ZOR_BODY(zorsConvert_32f8u_Sfs)(f, &b, -1, 5, 0), S},
    };
    for (const auto& k : cases) EXPECT_EQ(k.got, k.want) << "case " << &k - cases;
    EXPECT_TRUE(f[0] == 1 && f[1] == 2 && d[0] == 3 && one[0].im == 2 && b == 7);
}

// Clears: small lengths at many placements; around the kernel's thresholds
// once per type family.
template <typename T> void clear_case(ZorStatus (*fn)(T*, int32_t), long elements, size_t off) {
    vt::Region r(elements * sizeof(T), off);
    auto want = r.raw;
    std::memset(r.in(want), 0, elements * sizeof(T));
    ASSERT_EQ(fn(r.as<T>(), (int32_t)elements), elements ? zorStsNoErr : zorStsSizeErr);
    ASSERT_IMAGE(r, want) << "size " << sizeof(T) << " elements " << elements << " at " << off;
}

template <typename T> void clear_all(ZorStatus (*fn)(T*, int32_t), bool large) {
    for (long n : vt::lengths())
        for (size_t off : {0, 1, 3, 4, 8, 13, 17, 32, 33, 39}) clear_case(fn, n, off);
    if (large)
        for (long th : {0x8000L, 0x80000L})
            for (long d : {-16L, -1L, 0L, 1L, 16L})
                for (size_t off : {0, 7, 33}) clear_case(fn, (th + d) / (long)sizeof(T), off);
    T one{};
    EXPECT_EQ(fn(nullptr, 0), zorStsNullPtrErr);
    EXPECT_EQ(fn(&one, -1), zorStsSizeErr);
}

TEST_P(Elementwise, ClearsAndIntegerCopies) {
    clear_all(ZOR_BODY(zorsZero_8u), true), clear_all(ZOR_BODY(zorsZero_32s), false);
    clear_all(ZOR_BODY(zorsZero_32f), false), clear_all(ZOR_BODY(zorsZero_64f), false);
    clear_all(ZOR_BODY(zorsZero_32fc), false), clear_all(ZOR_BODY(zorsZero_64fc), true);
    vt::copy_sweep(ZOR_BODY(zorsCopy_8u)), vt::copy_sweep(ZOR_BODY(zorsCopy_16s)), vt::copy_sweep(ZOR_BODY(zorsCopy_32s));
}

// Exact: long double holds every float times any power of two used here.
long convert_model(float x, int mode, int sf, long lo, long hi) {
    if (std::isnan(x)) return lo;
    if (std::isinf(x)) return x > 0 ? hi : lo;
    // (The exponent negated in 64 bits: -INT32_MIN does not fit in 32.)
    const long e = std::max(-10000L, std::min(10000L, -(long)sf));
    const long double y = (long double)x * std::ldexp(1.0L, (int)e);
    long double r = std::trunc(y);
    if (mode == 1) {
        const long double f = y - r;
        const bool odd = std::fmod(r, 2.0L) != 0;
        if (f > 0.5L || (f == 0.5L && odd)) r += 1;
        if (f < -0.5L || (f == -0.5L && odd)) r -= 1;
    }
    return r < lo ? lo : r > hi ? hi : (long)r;
}

std::vector<float> convert_inputs() {
    std::vector<float> v = {0.0f, -0.0f, 0.5f, 1.5f, 2.5f, -0.5f, -1.5f, -2.5f, 0.49999997f, 0.50000006f,
                            254.5f, 255.5f, 256.0f, 65534.5f, 65535.5f, 65536.0f, 32766.5f, 32767.5f,
                            -32767.5f, -32768.5f, -32769.0f, 1e10f, -1e10f, 3e38f, -3e38f, 1e-40f, -1e-45f,
                            std::numeric_limits<float>::infinity(), -std::numeric_limits<float>::infinity(),
                            std::numeric_limits<float>::quiet_NaN(), vt::f32(0xff812345u), 7.75f, -7.75f};
    std::mt19937 gen(5);
    std::uniform_real_distribution<float> d(-70000.0f, 70000.0f);
    while (v.size() < 200) {
        float x = d(gen);
        if (v.size() % 3 == 0) x = std::round(x * 2) / 2;  // ties
        v.push_back(x);
    }
    return v;
}

// Every mode (unknown ones truncate) and scale, saturated, nothing written
// past the end; each call under another rounding control of the caller's,
// which no mode's result depends on and which is the caller's again after.
template <typename D>
void convert_all(ZorStatus (*fn)(const Zor32f*, D*, int32_t, int32_t, int32_t), long lo, long hi) {
    const auto src = convert_inputs();
    const int n = (int)src.size();
    const int scales[] = {0, 1, -1, 3, -3, 8, -8, 20, -20, 126, 127, 128, -126, -127, -128,
                          149, 150, -149, -150, 200, -200, 1000, -1000, INT32_MAX, INT32_MIN};
    const unsigned base = _mm_getcsr() & ~0x6000u;
    unsigned rc = 0;
    for (int mode : {0, 1, 2, -1, 99})
        for (int sf : scales)
            for (int start : {0, 1, 5}) {
                std::vector<D> dst(n + 1, (D)0x5a5a);
                rc = (rc + 0x2000u) & 0x6000u;
                _mm_setcsr(base | rc);
                const ZorStatus st = fn(src.data() + start, dst.data(), n - start, mode, sf);
                const unsigned after = _mm_getcsr();
                _mm_setcsr(base);
                ASSERT_EQ(st, zorStsNoErr);
                ASSERT_EQ(after & ~0x3fu, (base | rc) & ~0x3fu) << "control " << rc << " mode " << mode;
                for (int i = 0; i < n - start; ++i)
                    ASSERT_EQ((long)dst[i], convert_model(src[start + i], mode == 1 ? 1 : 0, sf, lo, hi))
                        << "x " << src[start + i] << " mode " << mode << " scale " << sf << " control " << rc;
                ASSERT_EQ(dst[n - start], (D)0x5a5a);
            }
}

TEST_P(Elementwise, ConvertEveryModeAndScaleSaturated) {
    convert_all<Zor8u>(ZOR_BODY(zorsConvert_32f8u_Sfs), 0, 255);
    convert_all<Zor16u>(ZOR_BODY(zorsConvert_32f16u_Sfs), 0, 65535);
    convert_all<Zor16s>(ZOR_BODY(zorsConvert_32f16s_Sfs), -32768, 32767);
}

// The memory kernels one by one: the machine's own cache answer may never
// lead the public calls to some of them.
typedef void (*CopyKernel)(const Zor8u*, Zor8u*, size_t);
typedef void (*ZeroKernel)(Zor8u*, size_t);

// A copy (or, with no copy kernel, a clear) of n bytes at offsets os, od.
void kernel_case(CopyKernel copy, ZeroKernel zero, size_t n, size_t os, size_t od) {
    vt::Region rs(n, os, 1), rd(n, od, 2);
    auto want = rd.raw;
    copy ? (void)std::memcpy(rd.in(want), rs.data(), n) : (void)std::memset(rd.in(want), 0, n);
    copy ? copy(rs.data(), rd.data(), n) : zero(rd.data(), n);
    ASSERT_IMAGE(rd, want) << (copy ? "copy " : "clear ") << n << " bytes at " << os << ", " << od;
}

// Small lengths at many relative alignments; around 64-byte multiples and
// the 256 KiB chunk at a few.
TEST_P(Elementwise, EveryCopyAndClearKernel) {
    const CopyKernel copies[] = {ZOR_BODY(ownsCopy_8u_E9), ZOR_BODY(ownsCopy_8u_repE9), ZOR_BODY(ownsCopy_8u_nt),
                                 ZOR_BODY(ownsCopy_8u_inv), ZOR_BODY(ownsCopy_8u_ra), nullptr, nullptr, nullptr};
    const ZeroKernel zeros[] = {ZOR_BODY(ownsZero_8u_E9), ZOR_BODY(ownsZero_8u_repE9), ZOR_BODY(ownsZero_8u_nt)};
    std::vector<size_t> lengths;
    for (size_t n = 0; n <= 200; ++n) lengths.push_back(n);
    for (size_t base : {(size_t)4096, (size_t)0x8000, (size_t)0x40000, (size_t)0x80000})
        for (long d : {-65L, -64L, -63L, -1L, 0L, 1L, 63L, 64L, 65L, 129L}) lengths.push_back(base + d);
    for (int k = 0; k < 8; ++k)
        for (size_t n : lengths) {
            const CopyKernel c = copies[k];
            const ZeroKernel z = k < 5 ? nullptr : zeros[k - 5];
            if (n > 200)
                for (const auto& p : {std::array<size_t, 2>{0, 0}, {7, 33}, {63, 1}}) kernel_case(c, z, n, p[0], p[1]);
            else
                for (size_t os : {0, 1, 3, 8, 17, 33, 63})
                    for (size_t od : {0, 1, 2, 3, 4, 7, 8, 15, 16, 17, 31, 32, 33, 48, 63}) kernel_case(c, z, n, os, od);
        }
}

// The level's own choice with a cache answer handed in: unknown, 0, and
// sizes that put half the cache below, at and above the length.
TEST_P(Elementwise, WholeChoiceForGivenCacheSizes) {
    const auto copy = ZOR_BODY(ownsCopy_8u_cache);
    const auto zero = ZOR_BODY(ownsZero_8u_cache);
    const size_t lengths[] = {63, 64, 0x7fff, 0x8000, 0x8001, 0x7ffff, 0x80000, 0x80001, 0x400000, 0x400001, 0x400041};
    // Page offsets: level, a little ahead, at 0xa0, behind (wrapping).
    const size_t places[][2] = {{0, 0}, {0, 0x5f}, {8, 0xa8}, {0xa1, 1}};
    for (size_t n : lengths)
        for (int64_t cache : {(int64_t)-1, (int64_t)0, (int64_t)(2 * n), (int64_t)(2 * n + 2)})
            for (const auto& p : places) {
                vt::Region rs(n, p[0], 1, 4096), rd(n, p[1], 2, 4096);
                auto want = rd.raw;
                std::memcpy(rd.in(want), rs.data(), n);
                copy(rs.data(), rd.data(), n, cache);
                ASSERT_IMAGE(rd, want) << "copy " << n << " cache " << cache << " at " << p[0] << ", " << p[1];
                want = rs.raw;
                std::memset(rs.in(want), 0, n);
                zero(rs.data(), n, cache);
                ASSERT_IMAGE(rs, want) << "clear " << n << " cache " << cache << " at " << p[0];
            }
}

// Every descriptor of the runtime's table decodes to its size (those below
// 256 KiB, which the copy's code cannot hold, to 256 KiB), wherever in the
// answer it stands; the decoding rules are the runtime's.
TEST_P(Elementwise, CacheTableAgreesWithTheRuntime) {
    const auto decode = ZOR_BODY(ownsCopyCacheSize);
    int rows = 0;
    for (const int32_t* row = ownCacheTable; row[0] != 0; row += 2, ++rows) {
        const uint32_t d = (uint32_t)row[0];
        // Sizes the code cannot hold (384 KiB and below 256 KiB) read as 256 KiB.
        const int32_t want = row[1] % 262144 ? 262144 : row[1];
        // (Not in EAX's top byte from 0x80 on: that would be the bit that
        // marks a register without descriptors.)
        const uint32_t places[][4] = {{0x01u | d << 8, 0, 0, 0}, {0x01u | d << 24, 0, 0, 0},
                                      {0x01u, d, 0, 0}, {0x01u, 0, d << 16, 0}, {0x01u, 0, 0, d << 8}};
        for (int k = 0; k < 5; ++k)
            if (k != 1 || d < 0x80) EXPECT_EQ(decode(places[k]), want) << "descriptor " << d << " place " << k;
    }
    EXPECT_EQ(rows, 55);
    // The first byte is the count, which must be 1; a register with bit 31
    // set holds no descriptors; of several, the largest.
    const uint32_t rules[][5] = {{0x00000001u, 0, 0, 0, (uint32_t)-1},       {0x00004902u, 0, 0, 0, (uint32_t)-1},
                                 {0x01u, 0x80000049u, 0, 0, (uint32_t)-1},   {0x00492201u, 0x00ec0000u, 0, 0x44u, 25165824},
                                 {0x0000ff01u, 0x01020304u, 0, 0, (uint32_t)-1}};
    for (const auto& r : rules) EXPECT_EQ(decode(r), (int32_t)r[4]) << std::hex << r[0] << " " << r[1];
}

ZOR_INSTANTIATE_LEVELS(Elementwise);

}  // namespace
