// Level-private element-wise operations on every level: absolute value,
// square, the in-place constant forms and their short cuts, in-place
// reversal, clears and the integer copies, and the conversions to
// integers in all three rounding modes.
#include <gtest/gtest.h>

#include <xmmintrin.h>

#include <cmath>
#include <cstdint>
#include <algorithm>
#include <cstring>
#include <limits>
#include <vector>

#include "vector_support.h"
#include "zorinternal.h"

namespace {

using vt::get;
using vt::put;
using vt::Region;

using Elementwise = zortest::LevelTest;
using Clear = zortest::LevelTest;
using Convert = zortest::LevelTest;

// dst = model(src) for every length, at aligned, element- and byte-
// misaligned places; in place too when inplace.
template <typename T, typename Fn, typename Model> void sweep(Fn fn, Model model, bool inplace) {
    const auto a = vt::values<T>(9000, 3);
    for (size_t os : {(size_t)0, sizeof(T), (size_t)1})
        for (size_t od : {(size_t)0, 2 * sizeof(T), (size_t)3})
            for (int len : vt::lengths()) {
                const size_t bytes = len * sizeof(T);
                Region rs(bytes, os), rd(bytes, od, 2);
                for (int i = 0; i < len; ++i) put<T>(inplace ? rd.data() : rs.data(), i, a[i]);
                auto want = rd.raw;
                for (int i = 0; i < len; ++i) put<T>(rd.in(want), i, model(a[i]));
                const ZorStatus st = fn(inplace ? rd.as<T>() : rs.as<T>(), rd.as<T>(), len);
                ASSERT_EQ(st, len ? zorStsNoErr : zorStsSizeErr);
                for (size_t i = 0; i < want.size(); ++i) {
                    const bool inside = i >= rd.offset && i < rd.offset + bytes;
                    if (!inside) ASSERT_EQ(rd.raw[i], want[i]) << "guard, len " << len;
                }
                for (int i = 0; i < len; ++i)
                    ASSERT_TRUE(vt::same(get<T>(rd.data(), i), get<T>(rd.in(want), i)))
                        << "len " << len << " element " << i;
            }
}

TEST_P(Elementwise, AbsoluteValueClearsTheSignBitOnly) {
    // Bit exact, NaN payloads included: no tolerance here.
    const auto body = ZOR_BODY(zorsAbs_32f);
    for (int len : vt::lengths()) {
        std::vector<uint32_t> src(len + 1), dst(len + 1, 0xdeadbeefu);
        for (int i = 0; i < len; ++i) src[i] = 0x9e3779b9u * (i + 1) ^ (i % 3 ? 0x80000000u : 0);
        ASSERT_EQ(body((const float*)src.data(), (float*)dst.data(), len), len ? zorStsNoErr : zorStsSizeErr);
        for (int i = 0; i < len; ++i) ASSERT_EQ(dst[i], src[i] & 0x7fffffffu) << i;
        ASSERT_EQ(dst[len], 0xdeadbeefu);
    }
    sweep<float>(ZOR_BODY(zorsAbs_32f), [](float x) { return vt::f32(vt::bits(x) & 0x7fffffffu); }, false);
}

TEST_P(Elementwise, SquareAndConstantForms) {
    sweep<float>(ZOR_BODY(zorsSqr_32f), [](float x) { return x * x; }, false);
    const auto addc = ZOR_BODY(zorsAddC_32f_I);
    const auto mulc = ZOR_BODY(zorsMulC_64f_I);
    for (float v : {1.5f, -3e-39f, std::numeric_limits<float>::quiet_NaN()})
        sweep<float>([&](const float*, float* d, int32_t n) { return addc(d, n, v); },
                     [v](float x) { return x + v; }, true);
    for (double v : {0.75, -1e300, std::numeric_limits<double>::infinity()})
        sweep<double>([&](const double*, double* d, int32_t n) { return mulc(d, n, v); },
                      [v](double x) { return x * v; }, true);
}

TEST_P(Elementwise, ShortCutsOfTheInPlaceConstantForms) {
    const auto addc = ZOR_BODY(zorsAddC_32f_I);
    const auto mulc = ZOR_BODY(zorsMulC_64f_I);
    // Adding +-0 and multiplying by 1 touch nothing, signalling NaNs included.
    std::vector<uint32_t> f(37);
    for (size_t i = 0; i < f.size(); ++i) f[i] = i % 2 ? 0x7f800001u + (uint32_t)i : 0x80000000u;
    auto f0 = f;
    for (float zero : {0.0f, -0.0f}) {
        ASSERT_EQ(addc((float*)f.data(), 37, zero), zorStsNoErr);
        EXPECT_EQ(f, f0);
    }
    std::vector<uint64_t> d(37);
    for (size_t i = 0; i < d.size(); ++i) d[i] = i % 2 ? 0x7ff0000000000001ull + i : 0xfff8000000000000ull;
    auto d0 = d;
    ASSERT_EQ(mulc((double*)d.data(), 37, 1.0), zorStsNoErr);
    EXPECT_EQ(d, d0);
    // Multiplying by +-0 clears, whatever the element.
    for (double zero : {0.0, -0.0}) {
        d = d0;
        ASSERT_EQ(mulc((double*)d.data(), 37, zero), zorStsNoErr);
        EXPECT_EQ(d, std::vector<uint64_t>(37, 0));
    }
    // Checks: pointer, then length; nothing changes on refusal.
    EXPECT_EQ(addc(nullptr, 0, 1.0f), zorStsNullPtrErr);
    EXPECT_EQ(addc((float*)f.data(), 0, 0.0f), zorStsSizeErr);
    EXPECT_EQ(mulc(nullptr, -1, 1.0), zorStsNullPtrErr);
    EXPECT_EQ(mulc((double*)d0.data(), 0, 0.0), zorStsSizeErr);
    EXPECT_EQ(ZOR_BODY(zorsAbs_32f)(nullptr, (float*)f.data(), 0), zorStsNullPtrErr);
    EXPECT_EQ(ZOR_BODY(zorsSqr_32f)((float*)f.data(), (float*)f.data(), -4), zorStsSizeErr);
    EXPECT_EQ(f, f0);
}

TEST_P(Elementwise, InPlaceReversal) {
    auto check = [](auto body, size_t size) {
        for (int len : vt::lengths()) {
            for (size_t off : {(size_t)0, (size_t)4, (size_t)1}) {
                Region r(len * size, off);
                auto want = r.raw;
                for (int i = 0; i < len; ++i)
                    std::memcpy(r.in(want) + i * size, r.data() + (len - 1 - i) * size, size);
                ASSERT_EQ(body(r.data(), len), len ? zorStsNoErr : zorStsSizeErr);
                ASSERT_IMAGE(r, want) << "size " << size << " len " << len << " at " << off;
            }
        }
        EXPECT_EQ(body(nullptr, 0), zorStsNullPtrErr);
    };
    const auto f32 = ZOR_BODY(zorsFlip_32f_I);
    const auto f32c = ZOR_BODY(zorsFlip_32fc_I);
    const auto f64 = ZOR_BODY(zorsFlip_64f_I);
    const auto f64c = ZOR_BODY(zorsFlip_64fc_I);
    check([&](void* p, int32_t n) { return f32((Zor32f*)p, n); }, 4);
    check([&](void* p, int32_t n) { return f32c((Zor32fc*)p, n); }, 8);
    check([&](void* p, int32_t n) { return f64((Zor64f*)p, n); }, 8);
    check([&](void* p, int32_t n) { return f64c((Zor64fc*)p, n); }, 16);
}

// ---- clears and integer copies ---------------------------------------------------

struct Cleared {
    ZorStatus (*fn)(void*, int32_t);
    size_t size;
};

TEST_P(Clear, EveryTypeEveryPlaceAroundTheThresholds) {
    const int level = GetParam().index;
    static const auto zero8 = ZOR_BODIES(zorsZero_8u);
    static const auto zero32s = ZOR_BODIES(zorsZero_32s);
    static const auto zero32f = ZOR_BODIES(zorsZero_32f);
    static const auto zero64f = ZOR_BODIES(zorsZero_64f);
    static const auto zero32fc = ZOR_BODIES(zorsZero_32fc);
    static const auto zero64fc = ZOR_BODIES(zorsZero_64fc);
    static int lv;
    lv = level;
    const Cleared kinds[] = {
        {[](void* p, int32_t n) { return zero8[lv]((Zor8u*)p, n); }, 1},
        {[](void* p, int32_t n) { return zero32s[lv]((Zor32s*)p, n); }, 4},
        {[](void* p, int32_t n) { return zero32f[lv]((Zor32f*)p, n); }, 4},
        {[](void* p, int32_t n) { return zero64f[lv]((Zor64f*)p, n); }, 8},
        {[](void* p, int32_t n) { return zero32fc[lv]((Zor32fc*)p, n); }, 8},
        {[](void* p, int32_t n) { return zero64fc[lv]((Zor64fc*)p, n); }, 16},
    };
    std::vector<long> bytes;
    for (long n = 0; n <= 200; ++n) bytes.push_back(n);
    for (long th : {0x8000L, 0x80000L})
        for (long d : {-16L, -1L, 0L, 1L, 16L}) bytes.push_back(th + d);
    for (const Cleared& k : kinds)
        for (long b : bytes) {
            if (b % (long)k.size) continue;
            if (b > 0x1000 && k.size != 1 && k.size != 16) continue;  // all clears share one byte kernel
            for (size_t off = 0; off < (b > 0x1000 ? 64u : 40u); off += (b > 0x1000 ? 21 : 1)) {
                Region r(b, off);
                auto want = r.raw;
                std::memset(r.in(want), 0, b);
                ASSERT_EQ(k.fn(r.data(), (int32_t)(b / k.size)), b ? zorStsNoErr : zorStsSizeErr);
                ASSERT_IMAGE(r, want) << "size " << k.size << " bytes " << b << " at " << off;
            }
        }
    EXPECT_EQ(kinds[0].fn(nullptr, 0), zorStsNullPtrErr);
    EXPECT_EQ(kinds[5].fn(nullptr, 5), zorStsNullPtrErr);
    uint8_t one = 1;
    EXPECT_EQ(kinds[0].fn(&one, -1), zorStsSizeErr);
    EXPECT_EQ(one, 1);
}

TEST_P(Clear, IntegerCopies) {
    const auto c8 = ZOR_BODY(zorsCopy_8u);
    const auto c16 = ZOR_BODY(zorsCopy_16s);
    const auto c32 = ZOR_BODY(zorsCopy_32s);
    for (int len : vt::lengths())
        for (size_t os : {0, 1, 6})
            for (size_t od : {0, 3, 32}) {
                for (size_t size : {1, 2, 4}) {
                    Region rs(len * size, os), rd(len * size, od, 5);
                    auto want = rd.raw;
                    std::memcpy(rd.in(want), rs.data(), len * size);
                    const ZorStatus st = size == 1   ? c8(rs.data(), rd.data(), len)
                                         : size == 2 ? c16(rs.as<Zor16s>(), rd.as<Zor16s>(), len)
                                                     : c32(rs.as<Zor32s>(), rd.as<Zor32s>(), len);
                    ASSERT_EQ(st, len ? zorStsNoErr : zorStsSizeErr);
                    ASSERT_IMAGE(rd, want) << "size " << size << " len " << len;
                }
            }
    EXPECT_EQ(c8(nullptr, nullptr, 0), zorStsNullPtrErr);
    EXPECT_EQ(c32(nullptr, nullptr, 5), zorStsNullPtrErr);
}

// ---- conversion ---------------------------------------------------------------

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

template <typename D>
void convert_all(ZorStatus (*fn)(const Zor32f*, D*, int32_t, int32_t, int32_t), long lo, long hi) {
    const auto src = convert_inputs();
    const int n = (int)src.size();
    const int scales[] = {0, 1, -1, 3, -3, 8, -8, 20, -20, 126, 127, 128, -126, -127, -128,
                          149, 150, -149, -150, 200, -200, 1000, -1000, INT32_MAX, INT32_MIN};
    for (int mode : {0, 1, 2, -1, 99})
        for (int sf : scales)
            for (int start : {0, 1, 5}) {
                std::vector<D> dst(n + 1, (D)0x5a5a);
                ASSERT_EQ(fn(src.data() + start, dst.data(), n - start, mode, sf), zorStsNoErr);
                for (int i = 0; i < n - start; ++i)
                    ASSERT_EQ((long)dst[i], convert_model(src[start + i], mode == 1 ? 1 : 0, sf, lo, hi))
                        << "x " << src[start + i] << " mode " << mode << " scale " << sf;
                ASSERT_EQ(dst[n - start], (D)0x5a5a);
            }
}

TEST_P(Convert, EveryModeAndScaleSaturated) {
    convert_all<Zor8u>(ZOR_BODY(zorsConvert_32f8u_Sfs), 0, 255);
    convert_all<Zor16u>(ZOR_BODY(zorsConvert_32f16u_Sfs), 0, 65535);
    convert_all<Zor16s>(ZOR_BODY(zorsConvert_32f16s_Sfs), -32768, 32767);
}

// The rounding control is the caller's again afterwards, and no mode's
// result depends on it.
TEST_P(Convert, CallersRoundingControlKeptAndIrrelevant) {
    const float src[9] = {0.5f, 1.5f, -2.5f, 2.7f, -2.7f, 3.5f, 100.25f, -0.5f, 4.5f};
    const unsigned base = _mm_getcsr();
    for (unsigned rc : {0x0000u, 0x2000u, 0x4000u, 0x6000u}) {
        for (int mode : {0, 1, 2}) {
            Zor16s dst[9];
            _mm_setcsr((base & ~0x6000u) | rc);
            const ZorStatus st = ZOR_BODY(zorsConvert_32f16s_Sfs)(src, dst, 9, mode, 0);
            const unsigned after = _mm_getcsr();
            _mm_setcsr(base);
            ASSERT_EQ(st, zorStsNoErr);
            EXPECT_EQ(after & ~0x3fu, ((base & ~0x6000u) | rc) & ~0x3fu) << "control " << rc << " mode " << mode;
            for (int i = 0; i < 9; ++i)
                EXPECT_EQ(dst[i], convert_model(src[i], mode == 1, 0, -32768, 32767))
                    << "control " << rc << " mode " << mode << " x " << src[i];
        }
    }
}

TEST_P(Convert, Checks) {
    float f = 1.0f;
    Zor8u b = 7;
    EXPECT_EQ(ZOR_BODY(zorsConvert_32f8u_Sfs)(nullptr, &b, 0, 1, 0), zorStsNullPtrErr);
    EXPECT_EQ(ZOR_BODY(zorsConvert_32f16u_Sfs)(&f, nullptr, 1, 1, 0), zorStsNullPtrErr);
    EXPECT_EQ(ZOR_BODY(zorsConvert_32f8u_Sfs)(&f, &b, 0, 1, 0), zorStsSizeErr);
    EXPECT_EQ(ZOR_BODY(zorsConvert_32f8u_Sfs)(&f, &b, -1, 5, 0), zorStsSizeErr);
    EXPECT_EQ(b, 7);
}

ZOR_INSTANTIATE_LEVELS(Elementwise);
ZOR_INSTANTIATE_LEVELS(Clear);
ZOR_INSTANTIATE_LEVELS(Convert);

}  // namespace
