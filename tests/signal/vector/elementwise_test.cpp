// Element-wise float arithmetic, maximum and reversal on every level,
// against scalar models: every length up to 70 and around powers of two,
// operands at aligned, element-misaligned and byte-misaligned addresses,
// special values, the short cuts for special constants and the checks in
// their order. Buffers are compared whole, guards included.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <cstring>
#include <limits>
#include <vector>

#include "vector_support.h"
#include "zors.h"
#include "zortest.h"

namespace {

using vt::get;
using vt::put;
using vt::Region;

using Arith = zortest::LevelTest;
using MaxEvery = zortest::LevelTest;
using Flip = zortest::LevelTest;
using Checks = zortest::LevelTest;

// Guards bytewise, elements bit for bit (two NaNs may differ in payload).
template <typename T>
::testing::AssertionResult matches(const Region& r, const std::vector<uint8_t>& want, int len) {
    for (size_t i = 0; i < r.raw.size(); ++i) {
        if (i >= r.offset && i < r.offset + len * sizeof(T)) continue;
        if (r.raw[i] != want[i])
            return ::testing::AssertionFailure() << "guard byte " << (long long)i - (long long)r.offset;
    }
    for (int i = 0; i < len; ++i) {
        const T g = get<T>(r.raw.data() + r.offset, i), w = get<T>(want.data() + r.offset, i);
        if (!vt::same(g, w))
            return ::testing::AssertionFailure() << "element " << i << ": got " << g << " want " << w;
    }
    return ::testing::AssertionSuccess();
}

template <typename T> void fill(Region& r, const std::vector<T>& v, int len, int from = 0) {
    for (int i = 0; i < len; ++i) put<T>(r.data(), i, v[from + i]);
}

// Placements: aligned, one element off, a few elements off, one byte off.
template <typename T> std::vector<size_t> placements() { return {0, sizeof(T), 3 * sizeof(T), 1}; }

// dst = model(src1, src2) through fn, for every length and placement.
template <typename T, typename Fn, typename Model> void sweep2(Fn fn, Model model) {
    const auto a = vt::values<T>(9000, 1), b = vt::values<T>(9000, 2);
    for (size_t oa : placements<T>())
        for (size_t od : placements<T>())
            for (int len : vt::lengths()) {
                const size_t bytes = len * sizeof(T);
                Region ra(bytes, oa), rb(bytes, (oa + od) % 16, 2), rd(bytes, od, 3);
                fill(ra, a, len);
                fill(rb, b, len);
                auto want = rd.raw;
                for (int i = 0; i < len; ++i) put<T>(rd.in(want), i, model(a[i], b[i]));
                ASSERT_EQ(fn(ra.as<T>(), rb.as<T>(), rd.as<T>(), len), len ? zorStsNoErr : zorStsSizeErr);
                ASSERT_TRUE(matches<T>(rd, want, len)) << "len " << len << " at " << oa << ", " << od;
            }
}

// srcDst = model(srcDst, src).
template <typename T, typename Fn, typename Model> void sweep_inplace(Fn fn, Model model) {
    const auto a = vt::values<T>(9000, 4), b = vt::values<T>(9000, 5);
    for (size_t os : placements<T>())
        for (size_t od : placements<T>())
            for (int len : vt::lengths()) {
                const size_t bytes = len * sizeof(T);
                Region rs(bytes, os), rd(bytes, od, 3);
                fill(rs, a, len);
                fill(rd, b, len);
                auto want = rd.raw;
                for (int i = 0; i < len; ++i) put<T>(rd.in(want), i, model(b[i], a[i]));
                ASSERT_EQ(fn(rs.as<T>(), rd.as<T>(), len), len ? zorStsNoErr : zorStsSizeErr);
                ASSERT_TRUE(matches<T>(rd, want, len)) << "len " << len << " at " << os << ", " << od;
            }
}

// dst = model(src) through fn(src, dst, len); fn may run in place.
template <typename T, typename Fn, typename Model> void sweep1(Fn fn, Model model, uint32_t seed) {
    const auto a = vt::values<T>(9000, seed);
    for (size_t os : placements<T>())
        for (size_t od : placements<T>())
            for (int len : vt::lengths()) {
                const size_t bytes = len * sizeof(T);
                Region rs(bytes, os), rd(bytes, od, 3);
                fill(rs, a, len);
                auto want = rd.raw;
                for (int i = 0; i < len; ++i) put<T>(rd.in(want), i, model(a[i]));
                ASSERT_EQ(fn(rs.as<T>(), rd.as<T>(), len), len ? zorStsNoErr : zorStsSizeErr);
                ASSERT_TRUE(matches<T>(rd, want, len)) << "len " << len << " at " << os << ", " << od;
            }
}

// ---- arithmetic ---------------------------------------------------------------

TEST_P(Arith, RealSumsAndProducts) {
    sweep2<float>(zorsAdd_32f, [](float x, float y) { return x + y; });
    sweep2<double>(zorsAdd_64f, [](double x, double y) { return x + y; });
    sweep2<float>(zorsMul_32f, [](float x, float y) { return x * y; });
    sweep_inplace<float>(zorsAdd_32f_I, [](float x, float y) { return x + y; });
    sweep_inplace<double>(zorsAdd_64f_I, [](double x, double y) { return x + y; });
    sweep_inplace<float>(zorsMul_32f_I, [](float x, float y) { return x * y; });
}

TEST_P(Arith, ComplexSumsAreRealSumsOverBothParts) {
    // len complex elements are 2 * len floats: the model runs over floats.
    auto add32 = [](const float* a, const float* b, float* d, int32_t n) {
        return n % 2 ? zorsAdd_32f(a, b, d, n)  // odd: the real form, for the lengths' sake
                     : zorsAdd_32fc((const Zor32fc*)a, (const Zor32fc*)b, (Zor32fc*)d, n / 2);
    };
    auto add64 = [](const double* a, const double* b, double* d, int32_t n) {
        return n % 2 ? zorsAdd_64f(a, b, d, n)
                     : zorsAdd_64fc((const Zor64fc*)a, (const Zor64fc*)b, (Zor64fc*)d, n / 2);
    };
    sweep2<float>(add32, [](float x, float y) { return x + y; });
    sweep2<double>(add64, [](double x, double y) { return x + y; });
    auto add32i = [](const float* a, float* d, int32_t n) {
        return n % 2 ? zorsAdd_32f_I(a, d, n) : zorsAdd_32fc_I((const Zor32fc*)a, (Zor32fc*)d, n / 2);
    };
    auto add64i = [](const double* a, double* d, int32_t n) {
        return n % 2 ? zorsAdd_64f_I(a, d, n) : zorsAdd_64fc_I((const Zor64fc*)a, (Zor64fc*)d, n / 2);
    };
    sweep_inplace<float>(add32i, [](float x, float y) { return x + y; });
    sweep_inplace<double>(add64i, [](double x, double y) { return x + y; });
}

TEST_P(Arith, ConstantForms) {
    for (float v : {2.5f, 1e30f, vt::f32(0x80000123u), std::numeric_limits<float>::quiet_NaN()}) {
        sweep1<float>([v](const float* s, float* d, int32_t n) { return zorsMulC_32f(s, d, n, v); },
                      [v](float x) { return x * v; }, 6);
        sweep1<float>([v](const float* s, float* d, int32_t n) { return zorsSubC_32f(s, d, n, v); },
                      [v](float x) { return x - v; }, 7);
        sweep1<float>(
            [v](const float* s, float* d, int32_t n) {
                if (n > 0) std::memcpy(d, s, n * sizeof(float));
                return zorsMulC_32f_I(d, n, v);
            },
            [v](float x) { return x * v; }, 8);
        sweep1<double>([v](const double* s, double* d, int32_t n) { return zorsMulC_64f(s, d, n, v); },
                       [v](double x) { return x * (double)v; }, 9);
    }
    sweep1<float>(
        [](const float* s, float* d, int32_t n) {
            if (n > 0) std::memcpy(d, s, n * sizeof(float));
            return zorsSqr_32f_I(d, n);
        },
        [](float x) { return x * x; }, 10);
}

template <typename T, typename C, typename Fn> void sweep_complex(Fn fn, T re, T im) {
    // Lengths count complex elements: floats 2 * len.
    const auto a = vt::values<T>(18000, 11);
    for (size_t os : placements<T>())
        for (size_t od : placements<T>())
            for (int len : vt::lengths()) {
                const size_t bytes = 2 * len * sizeof(T);
                Region rs(bytes, os), rd(bytes, od, 3);
                fill(rs, a, 2 * len);
                auto want = rd.raw;
                for (int i = 0; i < len; ++i) {
                    const T x = a[2 * i], y = a[2 * i + 1];
                    put<T>(rd.in(want), 2 * i, x * re - y * im);
                    put<T>(rd.in(want), 2 * i + 1, y * re + x * im);
                }
                ASSERT_EQ(fn(rs.as<C>(), rd.as<C>(), len, C{re, im}), len ? zorStsNoErr : zorStsSizeErr);
                ASSERT_TRUE(matches<T>(rd, want, 2 * len)) << "len " << len << " at " << os << ", " << od;
            }
}

TEST_P(Arith, ComplexConstantProduct) {
    // No short cuts here: 1 and 0 are multiplied like any value.
    const float cases[][2] = {{1.5f, -2.25f}, {1, 0}, {0, 0}, {-0.0f, 3}, {1e-40f, 7e30f}};
    for (const auto& c : cases) {
        sweep_complex<float, Zor32fc>(zorsMulC_32fc, c[0], c[1]);
        sweep_complex<double, Zor64fc>(zorsMulC_64fc, (double)c[0], (double)c[1]);
    }
}

// Every bit pattern as it stands, NaN payloads and signalling NaNs too.
std::vector<uint32_t> awkward_patterns(int n) {
    const uint32_t special[] = {0x7f800001u, 0xffbfffffu, 0x7fc00001u, 0x80000000u, 0x7f800000u, 0x00000001u};
    std::vector<uint32_t> v(n);
    for (int i = 0; i < n; ++i) v[i] = i % 3 ? special[i % 6] : 0x3f800000u + 77u * i;
    return v;
}

TEST_P(Arith, ShortCutsForOneAndZero) {
    const int n = 67;
    const auto pattern = awkward_patterns(n);
    for (size_t off : {0, 4, 1}) {
        Region rs(n * 4, 0), rd(n * 4, off, 2);
        std::memcpy(rs.data(), pattern.data(), n * 4);
        // By one: a copy, bit for bit.
        auto want = rd.raw;
        std::memcpy(rd.in(want), pattern.data(), n * 4);
        ASSERT_EQ(zorsMulC_32f(rs.as<float>(), rd.as<float>(), n, 1.0f), zorStsNoErr);
        EXPECT_IMAGE(rd, want);
        // By +-0: all bits clear, whatever the element.
        for (float zero : {0.0f, -0.0f}) {
            std::memset(rd.in(want), 0, n * 4);
            ASSERT_EQ(zorsMulC_32f(rs.as<float>(), rd.as<float>(), n, zero), zorStsNoErr);
            EXPECT_IMAGE(rd, want);
        }
        // Subtracting +-0: a copy, bit for bit.
        for (float zero : {0.0f, -0.0f}) {
            std::memcpy(rd.in(want), pattern.data(), n * 4);
            ASSERT_EQ(zorsSubC_32f(rs.as<float>(), rd.as<float>(), n, zero), zorStsNoErr);
            EXPECT_IMAGE(rd, want);
        }
        // In place by one: untouched.
        std::memcpy(rd.data(), pattern.data(), n * 4);
        want = rd.raw;
        ASSERT_EQ(zorsMulC_32f_I(rd.as<float>(), n, 1.0f), zorStsNoErr);
        EXPECT_IMAGE(rd, want);
        ASSERT_EQ(zorsMulC_32f_I(rd.as<float>(), n, -0.0f), zorStsNoErr);
        std::memset(rd.in(want), 0, n * 4);
        EXPECT_IMAGE(rd, want);
    }
    // The double form the same way.
    std::vector<uint64_t> p64(n);
    for (int i = 0; i < n; ++i) p64[i] = i % 2 ? 0x7ff0000000000001ull + i : 0xfff8000000000000ull - i;
    Region rs(n * 8, 0), rd(n * 8, 4, 2);
    std::memcpy(rs.data(), p64.data(), n * 8);
    auto want = rd.raw;
    std::memcpy(rd.in(want), p64.data(), n * 8);
    ASSERT_EQ(zorsMulC_64f(rs.as<double>(), rd.as<double>(), n, 1.0), zorStsNoErr);
    EXPECT_IMAGE(rd, want);
    std::memset(rd.in(want), 0, n * 8);
    ASSERT_EQ(zorsMulC_64f(rs.as<double>(), rd.as<double>(), n, -0.0), zorStsNoErr);
    EXPECT_IMAGE(rd, want);
}

TEST_P(Arith, NaNConstantFailsEveryShortCut) {
    const float src[3] = {1.0f, 0.0f, -2.0f};
    float dst[3];
    ASSERT_EQ(zorsMulC_32f(src, dst, 3, std::numeric_limits<float>::quiet_NaN()), zorStsNoErr);
    for (float x : dst) EXPECT_TRUE(std::isnan(x));
    ASSERT_EQ(zorsSubC_32f(src, dst, 3, std::numeric_limits<float>::quiet_NaN()), zorStsNoErr);
    for (float x : dst) EXPECT_TRUE(std::isnan(x));
    float v[3] = {1.0f, 0.0f, -2.0f};
    ASSERT_EQ(zorsMulC_32f_I(v, 3, std::numeric_limits<float>::quiet_NaN()), zorStsNoErr);
    for (float x : v) EXPECT_TRUE(std::isnan(x));
}

// ---- maximum ------------------------------------------------------------------

template <typename T> T larger(T a, T b) { return a > b ? a : b; }

template <typename T> std::vector<T> max_values(size_t n, uint32_t seed) {
    std::vector<T> v(n);
    std::mt19937 gen(seed);
    for (auto& x : v) x = (T)gen();
    return v;
}
template <> std::vector<float> max_values<float>(size_t n, uint32_t seed) { return vt::values<float>(n, seed); }
template <> std::vector<double> max_values<double>(size_t n, uint32_t seed) { return vt::values<double>(n, seed); }

template <typename T> void sweep_max(ZorStatus (*fn)(const T*, const T*, T*, uint32_t)) {
    const auto a = max_values<T>(9000, 1), b = max_values<T>(9000, 2);
    for (size_t oa : placements<T>())
        for (size_t od : placements<T>())
            for (int len : vt::lengths()) {
                const size_t bytes = len * sizeof(T);
                Region ra(bytes, oa), rb(bytes, od), rd(bytes, od, 3);
                fill(ra, a, len);
                fill(rb, b, len);
                auto want = rd.raw;
                for (int i = 0; i < len; ++i) put<T>(rd.in(want), i, larger(a[i], b[i]));
                ASSERT_EQ(fn(ra.as<T>(), rb.as<T>(), rd.as<T>(), len), len ? zorStsNoErr : zorStsSizeErr);
                // No tolerance: the rule picks one operand, bits and all.
                ASSERT_IMAGE(rd, want) << "len " << len << " at " << oa << ", " << od;
            }
}

TEST_P(MaxEvery, EveryTypeEveryLength) {
    sweep_max<Zor8u>(zorsMaxEvery_8u);
    sweep_max<Zor16u>(zorsMaxEvery_16u);
    sweep_max<Zor32f>(zorsMaxEvery_32f);
    sweep_max<Zor64f>(zorsMaxEvery_64f);
}

TEST_P(MaxEvery, SecondOperandWinsNaNAndZeroPairs) {
    const float nan1 = vt::f32(0x7fc00011u), nan2 = vt::f32(0xffc00022u);
    for (int len : {3, 8, 16, 37, 64}) {
        std::vector<float> a(len), b(len), d(len);
        for (int i = 0; i < len; ++i) {
            switch (i % 5) {
                case 0: a[i] = nan1, b[i] = 2.0f; break;   // NaN first: the second
                case 1: a[i] = 2.0f, b[i] = nan2; break;   // NaN second: NaN
                case 2: a[i] = 0.0f, b[i] = -0.0f; break;  // zeros: the second
                case 3: a[i] = -0.0f, b[i] = 0.0f; break;
                default: a[i] = nan1, b[i] = nan2; break;
            }
        }
        ASSERT_EQ(zorsMaxEvery_32f(a.data(), b.data(), d.data(), len), zorStsNoErr);
        for (int i = 0; i < len; ++i) EXPECT_EQ(vt::bits(d[i]), vt::bits(b[i])) << "len " << len << " i " << i;
    }
    const double dn = vt::f64(0x7ff8000000000abcull);
    std::vector<double> a = {dn, 1.0, 0.0, -0.0, 5.0, dn, 0.0, -0.0, dn}, b = {1.0, dn, -0.0, 0.0, 4.0, dn, -0.0, 0.0, 1.0};
    std::vector<double> d(a.size());
    ASSERT_EQ(zorsMaxEvery_64f(a.data(), b.data(), d.data(), (uint32_t)a.size()), zorStsNoErr);
    for (size_t i = 0; i < a.size(); ++i) EXPECT_EQ(vt::bits(d[i]), vt::bits(i == 4 ? 5.0 : b[i])) << i;
    // Unsigned: the top half is the larger.
    const Zor16u u1[9] = {0, 0x8000, 0xffff, 1, 0x7fff, 0x8001, 0, 5, 65535};
    const Zor16u u2[9] = {0xffff, 0x7fff, 0, 2, 0x8000, 0x8000, 0, 5, 65534};
    Zor16u ud[9];
    ASSERT_EQ(zorsMaxEvery_16u(u1, u2, ud, 9), zorStsNoErr);
    for (int i = 0; i < 9; ++i) EXPECT_EQ(ud[i], std::max(u1[i], u2[i])) << i;
}

// Overlap of destination and a source: the result is that of an element by
// element walk from the first, on every level.
template <typename T> void overlap_walk(ZorStatus (*fn)(const T*, const T*, T*, uint32_t)) {
    const auto v = max_values<T>(400, 3), w = max_values<T>(400, 4);
    for (int shift = -20; shift <= 20; ++shift)
        for (int len : {7, 8, 9, 31, 64, 100}) {
            for (int which = 0; which < 2; ++which) {
                std::vector<T> buf(v.begin(), v.begin() + 200), other(w.begin(), w.begin() + 200);
                std::vector<T> model = buf;
                const int s = 60, d = 60 + shift;
                for (int i = 0; i < len; ++i)
                    model[d + i] = which ? larger(other[s + i], model[s + i]) : larger(model[s + i], other[s + i]);
                const ZorStatus st = which ? fn(other.data() + s, buf.data() + s, buf.data() + d, len)
                                           : fn(buf.data() + s, other.data() + s, buf.data() + d, len);
                ASSERT_EQ(st, zorStsNoErr);
                for (size_t i = 0; i < buf.size(); ++i)
                    ASSERT_TRUE(std::memcmp(&buf[i], &model[i], sizeof(T)) == 0)
                        << "shift " << shift << " len " << len << " source " << which + 1 << " at " << i;
            }
        }
}

TEST_P(MaxEvery, OverlapActsAsAnElementWalk) {
    overlap_walk<Zor8u>(zorsMaxEvery_8u);
    overlap_walk<Zor16u>(zorsMaxEvery_16u);
    overlap_walk<Zor32f>(zorsMaxEvery_32f);
    overlap_walk<Zor64f>(zorsMaxEvery_64f);
}

// ---- reversal -----------------------------------------------------------------

template <typename T> void sweep_flip(ZorStatus (*fn)(const T*, T*, int32_t)) {
    // Elements are distinct bit patterns: floats by their bytes.
    std::vector<uint8_t> src(9000 * sizeof(T));
    for (size_t i = 0; i < src.size(); ++i) src[i] = (uint8_t)(i * 7 + i / 251);
    for (size_t os : {(size_t)0, sizeof(T) / 2, (size_t)1, 2 * sizeof(T)})
        for (size_t od : {(size_t)0, (size_t)4, (size_t)1, 3 * sizeof(T)})
            for (int len : vt::lengths()) {
                const size_t bytes = len * sizeof(T);
                Region rs(bytes, os), rd(bytes, od, 3);
                std::memcpy(rs.data(), src.data(), bytes);
                auto want = rd.raw;
                for (int i = 0; i < len; ++i)
                    std::memcpy(rd.in(want) + i * sizeof(T), src.data() + (len - 1 - i) * sizeof(T), sizeof(T));
                ASSERT_EQ(fn(rs.as<T>(), rd.as<T>(), len), len ? zorStsNoErr : zorStsSizeErr);
                ASSERT_IMAGE(rd, want) << "len " << len << " at " << os << ", " << od;
                // The same pointer twice: in place.
                auto in_place = rs.raw;
                for (int i = 0; i < len; ++i)
                    std::memcpy(rs.in(in_place) + i * sizeof(T), src.data() + (len - 1 - i) * sizeof(T), sizeof(T));
                ASSERT_EQ(fn(rs.as<T>(), rs.as<T>(), len), len ? zorStsNoErr : zorStsSizeErr);
                ASSERT_IMAGE(rs, in_place) << "in place, len " << len << " at " << os;
            }
}

TEST_P(Flip, EveryTypeOutOfPlaceAndInPlace) {
    sweep_flip<Zor32f>(zorsFlip_32f);
    sweep_flip<Zor32fc>(zorsFlip_32fc);
    sweep_flip<Zor64f>(zorsFlip_64f);
    sweep_flip<Zor64fc>(zorsFlip_64fc);
}

// ---- checks in their order -------------------------------------------------------

TEST_P(Checks, PointersThenLength) {
    float f[4] = {1, 2, 3, 4};
    double d[4] = {1, 2, 3, 4};
    Zor32fc c[2] = {{1, 2}, {3, 4}};
    Zor64fc z[2] = {{1, 2}, {3, 4}};
    Zor8u b[4] = {1, 2, 3, 4};
    Zor16u h[4] = {1, 2, 3, 4};
    const float* nf = nullptr;
    const ZorStatus N = zorStsNullPtrErr, S = zorStsSizeErr;
    struct Case {
        ZorStatus got, want;
        int line;
    };
    const Case cases[] = {
        {zorsAdd_32f(nf, f, f, 0), N, __LINE__},          {zorsAdd_32f(f, f, nullptr, 4), N, __LINE__},
        {zorsAdd_32f(f, f, f, 0), S, __LINE__},           {zorsAdd_32f(f, f, f, -3), S, __LINE__},
        {zorsAdd_64f(d, nullptr, d, -1), N, __LINE__},    {zorsAdd_32f_I(nullptr, f, 0), N, __LINE__},
        {zorsAdd_64f_I(d, d, 0), S, __LINE__},            {zorsMul_32f(f, nullptr, f, 0), N, __LINE__},
        {zorsMul_32f_I(f, f, -1), S, __LINE__},           {zorsMulC_32f(nf, f, 0, 1.0f), N, __LINE__},
        {zorsMulC_32f(f, f, 0, 1.0f), S, __LINE__},       {zorsMulC_32f(f, f, 0, 0.0f), S, __LINE__},
        {zorsMulC_64f(d, nullptr, 1, 0.0), N, __LINE__},  {zorsMulC_32f_I(nullptr, 0, 1.0f), N, __LINE__},
        {zorsMulC_32f_I(f, 0, 1.0f), S, __LINE__},        {zorsMulC_32fc(c, nullptr, 0, c[0]), N, __LINE__},
        {zorsMulC_64fc(z, z, 0, z[0]), S, __LINE__},      {zorsSubC_32f(f, nullptr, 0, 0.0f), N, __LINE__},
        {zorsSubC_32f(f, f, -2, 0.0f), S, __LINE__},      {zorsSqr_32f_I(nullptr, -1), N, __LINE__},
        {zorsSqr_32f_I(f, 0), S, __LINE__},
        // Complex sums: the length first, then the real form with 2 * len.
        {zorsAdd_32fc(nullptr, nullptr, nullptr, 0), S, __LINE__},
        {zorsAdd_64fc(nullptr, z, z, -1), S, __LINE__},
        {zorsAdd_32fc_I(nullptr, nullptr, 0), S, __LINE__},
        {zorsAdd_64fc_I(z, nullptr, INT32_MIN), S, __LINE__},
        {zorsAdd_32fc(c, nullptr, c, 1), N, __LINE__},
        {zorsAdd_32fc(nullptr, c, c, 0x3fffffff), N, __LINE__},  // doubled, still positive
        {zorsAdd_32fc(c, c, c, 0x40000000), S, __LINE__},        // doubled, wraps negative
        {zorsAdd_64fc(nullptr, nullptr, nullptr, 0x40000000), N, __LINE__},  // wrapped, pointers first
        {zorsAdd_32fc_I(c, c, 0x7fffffff), S, __LINE__},
        {zorsAdd_64fc_I(nullptr, z, 0x60000000), N, __LINE__},
        // Flip: equal pointers go to the in-place form and its checks.
        {zorsFlip_32f(nullptr, nullptr, 0), N, __LINE__}, {zorsFlip_32f(f, f, 0), S, __LINE__},
        {zorsFlip_64fc(nullptr, nullptr, 5), N, __LINE__}, {zorsFlip_32fc(c, nullptr, 0), N, __LINE__},
        {zorsFlip_64f(d, d, -1), S, __LINE__},            {zorsFlip_64f(d, d + 1, 0), S, __LINE__},
        // Copies and moves.
        {zorsCopy_32f(nf, f, 0), N, __LINE__},            {zorsCopy_64fc(z, z, 0), S, __LINE__},
        {zorsCopy_64f(d, nullptr, 3), N, __LINE__},       {zorsCopy_32fc(c, c + 1, -1), S, __LINE__},
        {zorsMove_32f(f, nullptr, 0), N, __LINE__},       {zorsMove_64fc(z, z, 0), S, __LINE__},
        {zorsMove_64f(nullptr, d, 2), N, __LINE__},       {zorsMove_32fc(c, c, -7), S, __LINE__},
        // Maximum: unsigned length, only 0 refused; pointers first.
        {zorsMaxEvery_8u(b, b, nullptr, 0), N, __LINE__}, {zorsMaxEvery_8u(b, b, b, 0), S, __LINE__},
        {zorsMaxEvery_16u(nullptr, h, h, 4), N, __LINE__}, {zorsMaxEvery_32f(f, f, f, 0), S, __LINE__},
        {zorsMaxEvery_64f(d, nullptr, d, 0), N, __LINE__},
    };
    for (const Case& c : cases) EXPECT_EQ(c.got, c.want) << "case at line " << c.line;
    // Nothing written by any refused call.
    EXPECT_EQ(f[0], 1);
    EXPECT_EQ(f[3], 4);
    EXPECT_EQ(d[3], 4);
    EXPECT_EQ(c[1].im, 4);
    EXPECT_EQ(z[1].im, 4);
    EXPECT_EQ(b[3], 4);
    EXPECT_EQ(h[3], 4);
}

ZOR_INSTANTIATE_LEVELS(Arith);
ZOR_INSTANTIATE_LEVELS(MaxEvery);
ZOR_INSTANTIATE_LEVELS(Flip);
ZOR_INSTANTIATE_LEVELS(Checks);

}  // namespace
