// Minimum searches, quicksort and radix sort of every level against plain
// models.

#include "vector_support.h"
#include "zorinternal.h"

namespace {

using SearchSort = zortest::LevelTest;

const float kInf = std::numeric_limits<float>::infinity(), kNaN = std::numeric_limits<float>::quiet_NaN();

using vt::bits;

std::vector<float> random_floats(size_t n, uint32_t seed, int range = 1000) {
    std::mt19937 gen(seed);
    std::uniform_int_distribution<int> d(-range, range);
    std::vector<float> v(n);
    for (auto& x : v) x = d(gen) * 0.25f;
    return v;
}

void expect_like_model(const float* p, int len, const char* what, int level) {
    float v = 1234, w = 5678;
    int mi = 0, i = -7;
    for (int k = 1; k < len; ++k) mi = p[k] < p[mi] ? k : mi;
    const float mv = p[mi];
    ASSERT_EQ(ZOR_BODIES(zorsMinIndx_32f)[level](p, len, &v, &i), zorStsNoErr);
    ASSERT_EQ(ZOR_BODIES(zorsMin_32f)[level](p, len, &w), zorStsNoErr);
    ASSERT_TRUE(bits(v) == bits(mv) && i == mi && bits(w) == bits(mv))
        << what << " len " << len << ": " << v << " at " << i << ", Min " << w << "; want " << mv << " at " << mi;
}

// Few distinct values, so that equal minima land in different lanes, with
// NaNs sprinkled in (passed over); then a NaN first (it stands), the
// minimum a zero of either sign, and -infinity last, at every length and
// start alignment.
TEST_P(SearchSort, MinimumAgreesWithTheStrictScanOnEveryPath) {
    const int level = GetParam().index;
    const auto data = random_floats(8192 + 8, 3, 6);
    for (int variant = 0; variant < 4; ++variant) {
        auto buf = data;
        for (size_t i = 0; i < buf.size(); ++i) {
            if (i % 37 == 5) buf[i] = kNaN;
            if (variant == 2 && buf[i] <= 0) buf[i] = i % 2 ? -0.0f : 0.0f;
        }
        for (int offset = 0; offset < 4; ++offset)
            for (int len : vt::lengths(1)) {
                float* p = buf.data() + offset;
                float& edge = variant == 3 ? p[len - 1] : p[0];
                const float keep = edge;
                if (variant == 1 || variant == 3) edge = variant == 1 ? kNaN : -kInf;
                expect_like_model(p, len, variant ? "variant" : "random", level);
                edge = keep;
                if (HasFatalFailure()) return;
            }
    }
}

// Patterns that trouble quicksorts: presorted runs, many equal keys,
// organ pipes, sawtooth, zeros of both signs, NaNs.
std::vector<float> pattern(int kind, int n, uint32_t seed) {
    std::vector<float> v = random_floats(n, seed, 1 << 20);
    switch (kind) {
        case 1: std::sort(v.begin(), v.end()); break;
        case 2: std::sort(v.begin(), v.end(), std::greater<float>()); break;
        case 3: for (auto& x : v) x = std::fmod(std::fabs(x), 4.0f); break;
        case 4: std::fill(v.begin(), v.end(), 2.5f); break;
        case 5: for (int i = 0; i < n; ++i) v[i] = (float)std::min(i, n - i); break;
        case 6: for (int i = 0; i < n; ++i) v[i] = (float)(i % 17); break;
        case 7: for (int i = 0; i < n; ++i) v[i] = (i % 3) ? v[i] : (i % 2) ? -0.0f : 0.0f; break;
        case 8: for (int i = 0; i < n; i += 3) v[i] = kNaN; break;
    }
    return v;
}

// The bit patterns, as a multiset unless sort is false: zeros of either
// sign compare equal, so they may change places, never count.
std::vector<uint32_t> sorted_bits(const std::vector<float>& v, bool sort = true) {
    std::vector<uint32_t> b;
    for (float x : v) b.push_back(bits(x));
    if (sort) std::sort(b.begin(), b.end());
    return b;
}

// Every pattern at every length to 40 and a few large ones: sorted, the
// same elements, and the first level's order bit for bit (which signed
// zeros make observable: the algorithm fixes it). NaNs (kind 8) neither
// hang nor lose elements.
TEST_P(SearchSort, QuickSortsEveryPattern) {
    std::vector<int> sizes = {63, 64, 65, 100, 1000, 4096, 100000};
    for (int n = 1; n <= 40; ++n) sizes.push_back(n);
    for (int kind = 0; kind < 9; ++kind)
        for (int n : sizes) {
            const auto in = pattern(kind, n, 100 + n);
            auto out = in, first = in;
            ASSERT_EQ(ZOR_BODY(zorsSortAscend_32f_I)(out.data(), n), zorStsNoErr);
            ZOR_BODIES(zorsSortAscend_32f_I)[0](first.data(), n);
            ASSERT_TRUE(kind == 8 || std::is_sorted(out.begin(), out.end())) << "kind " << kind << " n " << n;
            ASSERT_EQ(sorted_bits(in), sorted_bits(out)) << "kind " << kind << " n " << n;
            ASSERT_EQ(sorted_bits(out, false), sorted_bits(first, false)) << "kind " << kind << " n " << n;
        }
}

// The order the radix sort promises: by key, the sign bit flipped for
// positives and every bit for negatives; equal keys are equal bits.
uint32_t sort_key(float x) {
    const uint32_t v = bits(x);
    return (v & 0x80000000u) ? ~v : (v | 0x80000000u);
}

std::vector<float> radix_model(std::vector<float> v) {
    std::sort(v.begin(), v.end(), [](float a, float b) { return sort_key(a) < sort_key(b); });
    return v;
}

// Every class of float, NaNs of both signs included; half of them any bit
// pattern or any denormal, so that every byte of the key varies.
std::vector<float> random_patterns(int n, uint32_t seed) {
    std::mt19937 gen(seed);
    auto v = vt::values<float>(n, seed);
    for (auto& x : v)
        if (gen() % 2) x = vt::f32(gen() % 3 ? (uint32_t)gen() : (uint32_t)gen() & 0x807FFFFFu);
    return v;
}

void run_radix(int level, std::vector<float>& v, int misalign) {
    int32_t size = 0;
    ASSERT_EQ(ZOR_BODIES(zorsSortRadixGetBufferSize)[0]((int)v.size(), zor32f, &size), zorStsNoErr);
    std::vector<Zor8u> buf(size + misalign + 64, 0xA5);
    ASSERT_EQ(ZOR_BODIES(zorsSortRadixAscend_32f_I)[level](v.data(), (int)v.size(), buf.data() + misalign),
              zorStsNoErr);
    for (int k = 0; k < 64; ++k) ASSERT_EQ(buf[misalign + size + k], 0xA5) << "wrote past its buffer";
}

TEST_P(SearchSort, RadixOrdersByBitPattern) {
    const int level = GetParam().index;
    for (int n : vt::lengths(1)) {
        const auto in = random_patterns(n, 1000 + n);
        auto out = in;
        run_radix(level, out, n % 4);
        const auto expected = radix_model(in);
        for (int i = 0; i < n; ++i) ASSERT_EQ(bits(out[i]), bits(expected[i])) << "n " << n << " at " << i;
    }
}

// Pointers, then length, nothing written on refusal; a null index
// pointer is no error: the search then acts as Min.
TEST_P(SearchSort, ChecksOfTheSearchesAndSorts) {
    float v[3] = {3, 1, 2}, m = 9;
    int i = 9;
    Zor8u buf[20480 + 8];
    const ZorStatus N = zorStsNullPtrErr, S = zorStsSizeErr;
    const struct {
        ZorStatus got, want;
    } cases[] = {
        {ZOR_BODY(zorsMin_32f)(nullptr, 0, &m), N}, {ZOR_BODY(zorsMin_32f)(v, 3, nullptr), N},
        {ZOR_BODY(zorsMin_32f)(v, 0, &m), S}, {ZOR_BODY(zorsMinIndx_32f)(nullptr, -1, &m, &i), N},
        {ZOR_BODY(zorsMinIndx_32f)(v, -1, nullptr, &i), N}, {ZOR_BODY(zorsMinIndx_32f)(v, 0, &m, nullptr), S},
        {ZOR_BODY(zorsMinIndx_32f)(v, -4, &m, &i), S}, {ZOR_BODY(zorsSortAscend_32f_I)(nullptr, 0), N},
        {ZOR_BODY(zorsSortAscend_32f_I)(v, 0), S}, {ZOR_BODY(zorsSortRadixAscend_32f_I)(nullptr, 2, buf), N},
        {ZOR_BODY(zorsSortRadixAscend_32f_I)(v, 0, nullptr), N}, {ZOR_BODY(zorsSortRadixAscend_32f_I)(v, 0, buf), S},
        {ZOR_BODY(zorsSortRadixAscend_32f_I)(v, -2, buf), S},
    };
    for (const auto& k : cases) EXPECT_EQ(k.got, k.want) << "case " << &k - cases;
    EXPECT_TRUE(m == 9 && i == 9 && v[0] == 3 && v[1] == 1);
    EXPECT_EQ(ZOR_BODY(zorsMinIndx_32f)(v, 3, &m, nullptr), zorStsNoErr);
    EXPECT_EQ(m, 1);
}

// The length is checked before the type; a size error stores nothing, a
// type error stores 0.
TEST_P(SearchSort, RadixBufferSizeByType) {
    const ZorStatus OK = zorStsNoErr, T = zorStsDataTypeErr, S = zorStsSizeErr;
    const struct {
        int type;
        int32_t len;
        ZorStatus status;
        int32_t size;
    } rows[] = {
        {1, 10, OK, 1034},  {5, 10, OK, 2068},   {7, 1, OK, 2050},    {9, 10, OK, 20520},   {11, 10, OK, 20520},
        {13, 100, OK, 20880}, {15, 10, OK, 82000}, {17, 1, OK, 81928}, {19, 10, OK, 41040}, {3, 10, T, 0},
        {0, 10, T, 0},      {20, 10, T, 0},      {-1, 10, T, 0},      {13, 0x7FFFFFFF, S, -1}, {zor32f, 0, S, -1},
        {3, 0, S, -1},
    };
    for (const auto& r : rows) {
        int32_t size = -1;
        EXPECT_EQ(ZOR_BODY(zorsSortRadixGetBufferSize)(r.len, (ZorDataType)r.type, &size), r.status) << r.type;
        EXPECT_EQ(size, r.size) << r.type << " " << r.len;
    }
    EXPECT_EQ(ZOR_BODY(zorsSortRadixGetBufferSize)(-1, zor32f, nullptr), zorStsNullPtrErr);
}

ZOR_INSTANTIATE_LEVELS(SearchSort);

}  // namespace
