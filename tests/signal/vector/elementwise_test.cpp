// Element-wise arithmetic, maximum, reversal, copies and moves on every
// level against scalar models (vt::sweep), and the checks in their order.

#include "vector_support.h"
#include "zors.h"

namespace {

using vt::sweep;
using VectorOps = zortest::LevelTest;

template <typename T> std::vector<std::vector<T>> sources(int count) {
    std::vector<std::vector<T>> v;
    for (int k = 0; k < count; ++k) v.push_back(vt::values<T>(16400, 7 + k));
    return v;
}

// Two sources (or one and the destination) through fn against op; unit 2
// treats complex sums as real ones over both parts of each element.
template <typename T, typename E = T, typename Fn, typename Op> void binary(Fn fn, Op op, bool inplace, int unit = 1) {
    const auto d = sources<T>(2);
    sweep<T>(d, inplace, unit, false,
             [&](const T* const* s, T* dst, int32_t n) {
                 if constexpr (std::is_invocable_v<Fn, const E*, const E*, E*, int32_t>)
                     return fn((const E*)s[0], (const E*)s[1], (E*)dst, n);
                 else
                     return fn((const E*)s[1], (E*)dst, n);  // srcDst = srcDst op src
             },
             [&](size_t i) { return op(d[0][i], d[1][i]); });
}

const auto add = [](auto x, auto y) { return x + y; };
const auto mul = [](auto x, auto y) { return x * y; };

TEST_P(VectorOps, SumsAndProducts) {
    binary<float>(zorsAdd_32f, add, false), binary<float>(zorsAdd_32f_I, add, true);
    binary<double>(zorsAdd_64f, add, false), binary<double>(zorsAdd_64f_I, add, true);
    binary<float>(zorsMul_32f, mul, false), binary<float>(zorsMul_32f_I, mul, true);
    binary<float, Zor32fc>(zorsAdd_32fc, add, false, 2), binary<float, Zor32fc>(zorsAdd_32fc_I, add, true, 2);
    binary<double, Zor64fc>(zorsAdd_64fc, add, false, 2), binary<double, Zor64fc>(zorsAdd_64fc_I, add, true, 2);
}

// Constant forms and the square. By 1 a copy and by +-0 a clear, bit for
// bit whatever the elements hold (signalling NaNs too); subtracting +-0 a
// copy. Complex products take no short cut, for 1 and 0 either.
TEST_P(VectorOps, ConstantForms) {
    const auto f = sources<float>(1);
    const auto d = sources<double>(1);
    using F = const float* const*;
    for (float v : {2.5f, 1e30f, vt::f32(0x80000123u), std::numeric_limits<float>::quiet_NaN(), 1.0f, 0.0f, -0.0f}) {
        const bool cut = v == 1 || v == 0;
        const auto times = [&](size_t i) { return v == 1 ? f[0][i] : v == 0 ? 0.0f : f[0][i] * v; };
        sweep<float>(f, false, 1, cut, [v](F s, float* o, int32_t n) { return zorsMulC_32f(s[0], o, n, v); }, times);
        sweep<float>(f, true, 1, cut, [v](F, float* o, int32_t n) { return zorsMulC_32f_I(o, n, v); }, times);
        sweep<float>(f, false, 1, v == 0, [v](F s, float* o, int32_t n) { return zorsSubC_32f(s[0], o, n, v); },
                     [&](size_t i) { return v == 0 ? f[0][i] : f[0][i] - v; });
        sweep<double>(d, false, 1, cut, [v](const double* const* s, double* o, int32_t n) {
            return zorsMulC_64f(s[0], o, n, v); }, [&](size_t i) { return v == 1 ? d[0][i] : v == 0 ? 0.0 : d[0][i] * v; });
    }
    sweep<float>(f, true, 1, false, [](F, float* o, int32_t n) { return zorsSqr_32f_I(o, n); },
                 [&](size_t i) { return f[0][i] * f[0][i]; });
    const float cases[][2] = {{1.5f, -2.25f}, {1, 0}, {0, 0}, {-0.0f, 3}, {1e-40f, 7e30f}};
    for (const auto& c : cases) {
        auto model = [](const auto& v, auto re, auto im) {
            return [&v, re, im](size_t i) {
                const auto x = v[i & ~(size_t)1], y = v[i | 1];
                return i % 2 ? y * re + x * im : x * re - y * im;
            };
        };
        sweep<float>(f, false, 2, false, [&](F s, float* o, int32_t n) {
            return zorsMulC_32fc((const Zor32fc*)s[0], (Zor32fc*)o, n, Zor32fc{c[0], c[1]}); }, model(f[0], c[0], c[1]));
        sweep<double>(d, false, 2, false, [&](const double* const* s, double* o, int32_t n) {
            return zorsMulC_64fc((const Zor64fc*)s[0], (Zor64fc*)o, n, Zor64fc{c[0], c[1]}); },
                      model(d[0], (double)c[0], (double)c[1]));
    }
}

template <typename T> T larger(T a, T b) { return a > b ? a : b; }

template <typename T> std::vector<std::vector<T>> max_sources() {
    if constexpr (std::is_floating_point_v<T>) return sources<T>(2);
    std::vector<std::vector<T>> v(2, std::vector<T>(16400));
    std::mt19937 gen(3);
    for (auto& s : v) std::generate(s.begin(), s.end(), [&] { return (T)gen(); });
    return v;
}

// No tolerance: the rule picks one operand, bits and all; for NaN and
// signed-zero pairs, which the values hold, the second. With destination
// and either source overlapping, the result is that of an element by
// element walk from the first.
template <typename T> void max_all(ZorStatus (*fn)(const T*, const T*, T*, uint32_t)) {
    const auto v = max_sources<T>();
    sweep<T>(v, false, 1, true, [fn](const T* const* s, T* o, int32_t n) { return fn(s[0], s[1], o, n); },
             [&](size_t i) { return larger(v[0][i], v[1][i]); });
    for (int shift = -20; shift <= 20; ++shift)
        for (int len : {7, 8, 9, 31, 64, 100})
            for (int which = 0; which < 2; ++which) {
                std::vector<T> buf(v[0].begin(), v[0].begin() + 200), model = buf;
                const T* other = v[1].data() + 60;
                const int d = 60 + shift;
                for (int i = 0; i < len; ++i)
                    model[d + i] = which ? larger(other[i], model[60 + i]) : larger(model[60 + i], other[i]);
                ASSERT_EQ(which ? fn(other, &buf[60], &buf[d], len) : fn(&buf[60], other, &buf[d], len), zorStsNoErr);
                ASSERT_EQ(std::memcmp(buf.data(), model.data(), 200 * sizeof(T)), 0)
                    << "shift " << shift << " len " << len << " source " << which + 1;
            }
}

TEST_P(VectorOps, MaximumEveryTypeLengthAndOverlap) {
    max_all(zorsMaxEvery_8u), max_all(zorsMaxEvery_16u), max_all(zorsMaxEvery_32f), max_all(zorsMaxEvery_64f);
}

// A range moved onto itself shifted by every byte count up to 70 either
// way gives the source's former content; every move is the same byte
// move, so two element sizes suffice.
template <typename T> void overlap(ZorStatus (*fn)(const T*, T*, int32_t)) {
    for (int len = 1; len <= 1300; len += len < 70 ? 1 : 97)
        for (long shift = -70; shift <= 70; ++shift)
            for (size_t base : {(size_t)0, (size_t)5}) {
                vt::Region r(len * sizeof(T) + 160, base, 21);
                uint8_t* src = r.data() + 80;
                auto want = r.raw;
                std::memmove(r.in(want) + 80 + shift, r.in(want) + 80, len * sizeof(T));
                ASSERT_EQ(fn((const T*)src, (T*)(src + shift), len), zorStsNoErr);
                ASSERT_IMAGE(r, want) << "len " << len << " shift " << shift << " base " << base;
            }
}

TEST_P(VectorOps, ReversalsCopiesAndMoves) {
    vt::copy_sweep(zorsFlip_32f, true), vt::copy_sweep(zorsCopy_32f), vt::copy_sweep(zorsMove_32f);
    vt::copy_sweep(zorsFlip_32fc, true), vt::copy_sweep(zorsCopy_32fc), vt::copy_sweep(zorsMove_32fc);
    vt::copy_sweep(zorsFlip_64f, true), vt::copy_sweep(zorsCopy_64f), vt::copy_sweep(zorsMove_64f);
    vt::copy_sweep(zorsFlip_64fc, true), vt::copy_sweep(zorsCopy_64fc), vt::copy_sweep(zorsMove_64fc);
    overlap(zorsMove_32f), overlap(zorsMove_64fc);
}

TEST_P(VectorOps, ChecksPointersThenLength) {
    float f[4] = {1, 2, 3, 4};
    double d[4] = {1, 2, 3, 4};
    Zor32fc c[2] = {{1, 2}, {3, 4}};
    Zor64fc z[2] = {{1, 2}, {3, 4}};
    Zor8u b[4] = {1, 2, 3, 4};
    Zor16u h[4] = {1, 2, 3, 4};
    const ZorStatus N = zorStsNullPtrErr, S = zorStsSizeErr;
    const struct {
        ZorStatus got, want;
    } cases[] = {
        {zorsAdd_32f(nullptr, f, f, 0), N}, {zorsAdd_32f(f, f, nullptr, 4), N}, {zorsAdd_32f(f, f, f, 0), S},
        {zorsAdd_32f(f, f, f, -3), S}, {zorsAdd_64f(d, nullptr, d, -1), N}, {zorsAdd_32f_I(nullptr, f, 0), N},
        {zorsAdd_64f_I(d, d, 0), S}, {zorsMul_32f(f, nullptr, f, 0), N}, {zorsMul_32f_I(f, f, -1), S},
        {zorsMulC_32f(nullptr, f, 0, 1.0f), N}, {zorsMulC_32f(f, f, 0, 1.0f), S}, {zorsMulC_32f(f, f, 0, 0.0f), S},
        {zorsMulC_64f(d, nullptr, 1, 0.0), N}, {zorsMulC_32f_I(nullptr, 0, 1.0f), N}, {zorsMulC_32f_I(f, 0, 1.0f), S},
        {zorsMulC_32fc(c, nullptr, 0, c[0]), N}, {zorsMulC_64fc(z, z, 0, z[0]), S},
        {zorsSubC_32f(f, nullptr, 0, 0.0f), N}, {zorsSubC_32f(f, f, -2, 0.0f), S}, {zorsSqr_32f_I(nullptr, -1), N},
        {zorsSqr_32f_I(f, 0), S},
        // Complex sums: the length first, then the real form over 2 * len
        // (32 bits: from 0x40000000 on it wraps negative), pointers there.
        {zorsAdd_32fc(nullptr, nullptr, nullptr, 0), S}, {zorsAdd_64fc(nullptr, z, z, -1), S},
        {zorsAdd_32fc_I(nullptr, nullptr, 0), S}, {zorsAdd_32fc(c, nullptr, c, 1), N},
        {zorsAdd_32fc(nullptr, c, c, 0x3fffffff), N}, {zorsAdd_32fc(c, c, c, 0x40000000), S},
        {zorsAdd_64fc(nullptr, nullptr, nullptr, 0x40000000), N}, {zorsAdd_32fc_I(c, c, 0x7fffffff), S},
        {zorsAdd_64fc_I(z, z, 0x60000000), S},
        // Flip: equal pointers go to the in-place form and its checks.
        {zorsFlip_32f(nullptr, nullptr, 0), N}, {zorsFlip_32f(f, f, 0), S}, {zorsFlip_64fc(nullptr, nullptr, 5), N},
        {zorsFlip_32fc(c, nullptr, 0), N}, {zorsFlip_64f(d, d + 1, 0), S}, {zorsCopy_32f(nullptr, f, 0), N},
        {zorsCopy_64fc(z, z, 0), S}, {zorsCopy_64f(d, nullptr, 3), N}, {zorsCopy_32fc(c, c + 1, -1), S},
        {zorsMove_32f(f, nullptr, 0), N}, {zorsMove_64fc(z, z, 0), S}, {zorsMove_64f(nullptr, d, 2), N},
        {zorsMove_32fc(c, c, -7), S},
        // Maximum: pointers first, then the unsigned length, only 0 refused.
        {zorsMaxEvery_8u(b, b, nullptr, 0), N}, {zorsMaxEvery_8u(b, b, b, 0), S},
        {zorsMaxEvery_16u(nullptr, h, h, 4), N}, {zorsMaxEvery_32f(f, f, f, 0), S},
        {zorsMaxEvery_64f(d, nullptr, d, 0), N},
    };
    for (const auto& c : cases) EXPECT_EQ(c.got, c.want) << "case " << &c - cases;
    // Nothing written by any refused call.
    EXPECT_TRUE(f[0] == 1 && f[3] == 4 && d[3] == 4 && c[1].im == 4 && z[1].im == 4 && b[3] == 4 && h[3] == 4);
}

ZOR_INSTANTIATE_LEVELS(VectorOps);

}  // namespace
