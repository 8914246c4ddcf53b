// Floor, ceiling, square root, sine and cosine of one double, on every
// level. Sine and cosine: within one ulp of the correctly rounded result
// and the same bits on every level, on a table of hard arguments worked out
// beforehand and, where quad precision is linked, a sweep against it.

#include <cfenv>

#include "vector_support.h"
#include "zorinternal.h"

#ifdef ZOR_HAVE_QUADMATH
#include <quadmath.h>
#endif

namespace {

using ScalarOne = zortest::LevelTest;

const double kInf = std::numeric_limits<double>::infinity(), kNaN = std::numeric_limits<double>::quiet_NaN();

using vt::bits;

std::vector<double> rounding_cases() {
    std::vector<double> v = {0.0, -0.0, 0.5, -0.5, 0.3, -0.3, 1.0, -1.0, 1.5, -1.5, 2.5, -2.5, 1e-310, -1e-310,
                             0x1p-1074, -0x1p-1074, 0x1.fffffffffffffp-1, -0x1.fffffffffffffp-1, 0x1p52, -0x1p52,
                             0x1p52 - 0.5, -(0x1p52 - 0.5), 0x1p52 + 1, 0x1p53 + 2, -0x1p63, 0x1p63, 0x1p64 * 3, 1e300,
                             -1e300, 4503599627370495.5, -4503599627370495.5, kInf, -kInf};
    std::mt19937_64 gen(17);
    std::uniform_real_distribution<double> d(-1e6, 1e6);
    for (int i = 0; i < 2000; ++i) v.push_back(d(gen));
    return v;
}

TEST_P(ScalarOne, FloorCeilSqrtMatchTheLibrary) {
    for (double x : rounding_cases()) {
        EXPECT_EQ(bits(ZOR_BODY(zorsFloorOne)(x)), bits(std::floor(x))) << std::hexfloat << x;
        EXPECT_EQ(bits(ZOR_BODY(zorsCeilOne)(x)), bits(std::ceil(x))) << std::hexfloat << x;
        if (!std::signbit(x) || x == 0) EXPECT_EQ(bits(ZOR_BODY(zorsSqrtOne)(x)), bits(std::sqrt(x))) << x;
    }
    EXPECT_TRUE(std::isnan(ZOR_BODY(zorsFloorOne)(kNaN)));
    EXPECT_TRUE(std::isnan(ZOR_BODY(zorsCeilOne)(-kNaN)));
    // NaNs come back quiet, with their payload and sign.
    const double quiet = vt::f64(0xFFF8000000000123ULL);
    EXPECT_EQ(bits(ZOR_BODY(zorsSqrtOne)(quiet)), bits(quiet));
    EXPECT_EQ(bits(ZOR_BODY(zorsSqrtOne)(vt::f64(0x7FF0000000000001ULL))), 0x7FF8000000000001ULL);
    for (double x : {-1.0, -0x1p-1074, -kInf}) {
        std::feclearexcept(FE_ALL_EXCEPT);
        EXPECT_TRUE(std::isnan(ZOR_BODY(zorsSqrtOne)(x)) && std::fetestexcept(FE_INVALID)) << x;
    }
}

struct Hard {
    double x, sin, cos;  // correctly rounded results
};

const Hard kHard[] = {
    {0x1.921fb54442d18p+0, 0x1.0000000000000p+0, 0x1.1a62633145c07p-54},  // medium k=1 |r|=6.12e-17
    {0x1.5ffb2915e3cc9p+16, 0x1.e2a7b30a463c6p-39, 0x1.0000000000000p+0},  // k=57364 near 90112
    {0x1.6000000000000p+16, -0x1.fbde6256f07e5p-1, 0x1.03a487f06b7f8p-3},  // huge-path boundary
    {0x1.5ffffffffffffp+16, -0x1.fbde6256f48cep-1, 0x1.03a487efec87fp-3},  // huge-path boundary
    {0x1.6ac5b262ca1ffp+849, 0x1.0000000000000p+0, -0x1.14ae72e6ba22fp-61},  // worst case 2^797
    {-0x1.6ac5b262ca1ffp+849, -0x1.0000000000000p+0, -0x1.14ae72e6ba22fp-61},  // worst case negative
    {0x1.fffffffffffffp+1023, 0x1.452fc98b34e97p-8, -0x1.fffe62ecfab75p-1},  // max
    {0x1.0f0cf064dd592p+73, -0x1.b453ab76bf397p-1, 0x1.0be2cef01c8f4p-1},  // 1e22
    {0x1.0000000000000p-252, 0x1.0000000000000p-252, 0x1.0000000000000p+0},  // 2^-252
    {0x1.fffffffffffffp-253, 0x1.fffffffffffffp-253, 0x1.0000000000000p+0},  // below 2^-252
    {0x0.0000000000001p-1022, 0x0.0000000000001p-1022, 0x1.0000000000000p+0},  // min denormal
};

// y is the correctly rounded value or one of its neighbours.
bool within_one_ulp(double y, double correct) {
    return y == correct || y == std::nextafter(correct, kInf) || y == std::nextafter(correct, -kInf);
}

TEST_P(ScalarOne, SinCosHardArgumentsWithinOneUlpAndSpecialOnes) {
    const auto sinBody = ZOR_BODY(zorsSinOne);
    const auto cosBody = ZOR_BODY(zorsCosOne);
    int exact = 0;
    for (const Hard& h : kHard) {
        const double s = sinBody(h.x), c = cosBody(h.x);
        EXPECT_TRUE(within_one_ulp(s, h.sin)) << std::hexfloat << "sin " << h.x << " = " << s << ", not " << h.sin;
        EXPECT_TRUE(within_one_ulp(c, h.cos)) << std::hexfloat << "cos " << h.x << " = " << c << ", not " << h.cos;
        exact += (s == h.sin) + (c == h.cos);
    }
    RecordProperty("correctly_rounded", exact);
    for (double x : {kInf, -kInf, kNaN, -kNaN}) EXPECT_TRUE(std::isnan(sinBody(x)) && std::isnan(cosBody(x))) << x;
    std::feclearexcept(FE_ALL_EXCEPT);
    sinBody(kInf);
    EXPECT_TRUE(std::fetestexcept(FE_INVALID));
    // Below 2^-252 the argument itself, its sign included.
    for (double x : {-0.0, -1e-100, 0x1p-1074}) EXPECT_EQ(bits(sinBody(x)), bits(x)) << x;
}

#ifdef ZOR_HAVE_QUADMATH

// Error in units of the last place of the correctly rounded result.
double ulp_error(double y, __float128 ref) {
    const double a = std::fabs((double)ref);
    return (double)(fabsq((__float128)y - ref) / (a == 0 ? 0x1p-1074 : std::nextafter(a, kInf) - a));
}

// Tiny, medium, next to multiples of pi/2 up to the boundary and far
// beyond, huge of every exponent.
std::vector<double> sweep_arguments() {
    std::vector<double> v;
    std::mt19937_64 gen(2024);
    std::uniform_real_distribution<double> unit(0.0, 1.0);
    for (int i = 0; i < 4000; ++i) v.push_back(std::ldexp(1.0 + unit(gen), (int)(gen() % 270) - 262));
    for (int i = 0; i < 4000; ++i) v.push_back((2 * unit(gen) - 1) * 90112.0);
    for (int i = 0; i < 3000; ++i) {
        // Near k*pi/2 for k up to the boundary (57367) and well past it.
        const uint64_t k = i < 2000 ? 1 + gen() % 57400 : 1 + (gen() >> (20 + i % 40));
        const double x = (double)((__float128)k * M_PI_2q);
        for (int d = -2; d <= 2; ++d) v.push_back(vt::f64(bits(x) + d));
    }
    for (int i = 0; i < 4000; ++i) v.push_back(std::ldexp(1.0 + unit(gen), 16 + (int)(gen() % 1008)));
    const size_t n = v.size();
    for (size_t i = 0; i < n; i += 2) v.push_back(-v[i]);
    return v;
}

// Within one ulp, about half an ulp plus a little at worst, and the first
// level's bits.
TEST_P(ScalarOne, SinCosSweepWithinOneUlpAndSameBitsOnEveryLevel) {
    const auto sinBody = ZOR_BODY(zorsSinOne), cosBody = ZOR_BODY(zorsCosOne);
    const auto sinFirst = ZOR_BODIES(zorsSinOne)[0], cosFirst = ZOR_BODIES(zorsCosOne)[0];
    int failures = 0;
    for (double x : sweep_arguments()) {
        const __float128 q = x;
        const double s = sinBody(x), c = cosBody(x);
        const bool close = ulp_error(s, sinq(q)) < 0.6 && ulp_error(c, cosq(q)) < 0.6;
        const bool same = bits(s) == bits(sinFirst(x)) && bits(c) == bits(cosFirst(x));
        if ((!close || !same) && ++failures < 10)
            ADD_FAILURE() << std::hexfloat << "x " << x << " sin " << s << " cos " << c << (same ? "" : " (level differs)");
    }
    EXPECT_EQ(failures, 0);
}

#else

TEST_P(ScalarOne, SinCosSweepWithinOneUlpAndSameBitsOnEveryLevel) {
    GTEST_SKIP() << "no quad-precision library: only the table of hard arguments is checked";
}

#endif

ZOR_INSTANTIATE_LEVELS(ScalarOne);

}  // namespace
