// Sum and dot products on every level: the fixed orders bit for bit
// against models, the level-dependent wide orders within an error bound.

#include "vector_support.h"
#include "zors.h"

#include <cfloat>

namespace {

using Reduce = zortest::LevelTest;

using vt::bits;

// Values of mixed sign and magnitude, so that order shows in the bits.
template <typename T> std::vector<T> random_values(size_t n, uint32_t seed) {
    std::mt19937_64 gen(seed);
    std::uniform_real_distribution<T> mant(-1, 1);
    std::uniform_int_distribution<int> expo(-12, 12);
    std::vector<T> v(n);
    for (auto& x : v) x = std::ldexp(mant(gen), expo(gen));
    return v;
}

// The accurate sum's order: an element off an 8-byte boundary first into
// lane 0, element 8k+j of the rest into lane j, then the fold.
float accurate_model(const float* p, int len) {
    double lane[8];
    for (double& l : lane) l = -0.0;
    int i = 0;
    if (reinterpret_cast<uintptr_t>(p) % 8 != 0) lane[0] = p[i++];
    for (int j = 0; i < len; ++i, j = (j + 1) % 8) lane[j] += p[i];
    return (float)(((lane[0] + lane[4]) + (lane[2] + lane[6])) +
                   ((lane[1] + lane[5]) + (lane[3] + lane[7])));
}

// Every hint but 1 takes the accurate order bit for bit; hint 1 is within
// the bound of single-precision addition. All -0 sums to -0 (the lanes
// start there); beyond single precision the accurate form's double lanes
// keep what float lanes would lose.
TEST_P(Reduce, SumAccurateOrderExactFastFormBounded) {
    const auto data = random_values<float>(16384 + 8, 7);
    for (int offset = 0; offset < 4; ++offset)
        for (int len : vt::lengths(1)) {
            const float* p = data.data() + offset;
            long double exact = 0, magnitude = 0;
            for (int i = 0; i < len; ++i) exact += p[i], magnitude += std::fabs(p[i]);
            for (int hint : {0, 1, 2, -1, 77}) {
                float s = 0;
                ASSERT_EQ(zorsSum_32f(p, len, &s, hint), zorStsNoErr);
                if (hint != 1)
                    ASSERT_EQ(bits(s), bits(accurate_model(p, len))) << "len " << len << " at " << offset << " hint " << hint;
                else
                    ASSERT_LE(std::fabs((long double)s - exact), (len + 1) * (long double)FLT_EPSILON * magnitude)
                        << "len " << len << " offset " << offset;
            }
        }
    for (int hint : {0, 1})
        for (int len : {1, 9, 40}) {
            std::vector<float> zeros(len, -0.0f), big(len, 3e38f);
            float s = 0, t = 0;
            ASSERT_EQ(zorsSum_32f(zeros.data(), len, &s, hint), zorStsNoErr);
            ASSERT_EQ(zorsSum_32f(big.data(), len, &t, hint), zorStsNoErr);
            EXPECT_EQ(bits(s), bits(-0.0f)) << len << " hint " << hint;
            EXPECT_EQ(t, len == 1 ? 3e38f : std::numeric_limits<float>::infinity()) << len << " hint " << hint;
        }
}

template <typename T> struct Cx { T re, im; };

// Element i of a real (w = 1) or complex (w = 2) vector, as complex.
template <typename T> Cx<T> at(const T* p, int w, int i) { return w == 2 ? Cx<T>{p[2 * i], p[2 * i + 1]} : Cx<T>{p[i], 0}; }

// Product of element i in the element's precision; with a zero imaginary
// part the real forms come out exactly as their plain products.
template <typename T> Cx<T> prod(Cx<T> x, Cx<T> y) { return {x.re * y.re - x.im * y.im, x.re * y.im + x.im * y.re}; }

// Runs one form over lengths and offsets. Below 16 bitwise to the short
// order: even products in lane 0, odd in lane 1; lane 1 plus an odd last
// product, plus lane 0. From 16 on within (len + 4) eps of the long double
// sum of the products' magnitudes, each component separately.
template <typename T, typename A, typename B, typename R, bool Complex>
void check_form(ZorStatus (*fn)(const A*, const B*, int32_t, R*), uint32_t seed) {
    constexpr int aw = sizeof(A) / sizeof(T), bw = sizeof(B) / sizeof(T);
    const auto ra = random_values<T>((16384 + 4) * aw, seed), rb = random_values<T>((16384 + 4) * bw, seed + 1);
    const T eps = std::numeric_limits<T>::epsilon();
    for (int offA = 0; offA < 3; ++offA)
        for (int len : vt::lengths(1)) {
            const T* pa = ra.data() + offA * aw;
            const T* pb = rb.data() + (offA * 5 + len) % 3 * bw;
            R out{};
            ASSERT_EQ(fn(reinterpret_cast<const A*>(pa), reinterpret_cast<const B*>(pb), len, &out), zorStsNoErr);
            T got[2];
            std::memcpy(got, &out, sizeof out);
            if (len < 16) {
                Cx<T> l0 = {-0.0, -0.0}, l1 = {-0.0, -0.0};
                for (int i = 0; i < len; ++i) {
                    const Cx<T> p = prod(at(pa, aw, i), at(pb, bw, i));
                    Cx<T>& l = (i % 2 || i == len - 1) ? l1 : l0;
                    l = {l.re + p.re, l.im + p.im};
                }
                ASSERT_EQ(bits(got[0]), bits(l1.re + l0.re)) << "len " << len;
                if (Complex) ASSERT_EQ(bits(got[1]), bits(l1.im + l0.im)) << "len " << len;
            } else {
                long double re = 0, im = 0, magRe = 0, magIm = 0;
                for (int i = 0; i < len; ++i) {
                    const Cx<T> x = at(pa, aw, i), y = at(pb, bw, i);
                    const long double rr = (long double)x.re * y.re, ii = (long double)x.im * y.im;
                    const long double ri = (long double)x.re * y.im, ir = (long double)x.im * y.re;
                    re += rr - ii, im += ri + ir;
                    magRe += std::fabs(rr) + std::fabs(ii), magIm += std::fabs(ri) + std::fabs(ir);
                }
                ASSERT_LE(std::fabs(got[0] - re), (len + 4) * eps * magRe) << "len " << len;
                if (Complex) ASSERT_LE(std::fabs(got[1] - im), (len + 4) * eps * magIm) << "len " << len;
            }
        }
}

TEST_P(Reduce, DotProductShortOrderExactWideOrderBounded) {
    check_form<float, Zor32f, Zor32f, Zor32f, false>(zorsDotProd_32f, 1);
    check_form<double, Zor64f, Zor64f, Zor64f, false>(zorsDotProd_64f, 2);
    check_form<float, Zor32fc, Zor32fc, Zor32fc, true>(zorsDotProd_32fc, 3);
    check_form<double, Zor64fc, Zor64fc, Zor64fc, true>(zorsDotProd_64fc, 4);
    check_form<float, Zor32f, Zor32fc, Zor32fc, true>(zorsDotProd_32f32fc, 5);
    check_form<double, Zor64f, Zor64fc, Zor64fc, true>(zorsDotProd_64f64fc, 6);
}

// Pointers, then length; nothing written on refusal.
TEST_P(Reduce, ChecksPointersThenLength) {
    float f[2] = {1, 2}, rf = 7, s = 7;
    double d[2] = {1, 2}, rd = 7;
    Zor32fc c[2] = {}, rc = {7, 7};
    Zor64fc z[2] = {}, rz = {7, 7};
    const ZorStatus N = zorStsNullPtrErr, S = zorStsSizeErr;
    const struct {
        ZorStatus got, want;
    } cases[] = {
        {zorsSum_32f(nullptr, 0, &s, 0), N}, {zorsSum_32f(f, -1, nullptr, 1), N}, {zorsSum_32f(f, 0, &s, 0), S},
        {zorsSum_32f(f, -5, &s, 1), S}, {zorsDotProd_32f(nullptr, f, 0, &rf), N},
        {zorsDotProd_32f(f, nullptr, 2, &rf), N}, {zorsDotProd_32f(f, f, -1, nullptr), N},
        {zorsDotProd_32f(f, f, 0, &rf), S}, {zorsDotProd_64f(d, nullptr, 0, &rd), N},
        {zorsDotProd_64f(d, d, -3, &rd), S}, {zorsDotProd_32fc(c, c, 0, nullptr), N},
        {zorsDotProd_32fc(c, c, 0, &rc), S}, {zorsDotProd_64fc(nullptr, z, 1, &rz), N},
        {zorsDotProd_64fc(z, z, 0, &rz), S}, {zorsDotProd_32f32fc(f, nullptr, -1, &rc), N},
        {zorsDotProd_32f32fc(f, c, 0, &rc), S}, {zorsDotProd_64f64fc(nullptr, z, 0, &rz), N},
        {zorsDotProd_64f64fc(d, z, INT32_MIN, &rz), S},
    };
    for (const auto& k : cases) EXPECT_EQ(k.got, k.want) << "case " << &k - cases;
    EXPECT_TRUE(s == 7 && rf == 7 && rd == 7 && rc.re == 7 && rz.im == 7);
}

ZOR_INSTANTIATE_LEVELS(Reduce);

}  // namespace
