// Helpers of the element-wise vector tests: guarded buffers compared whole,
// bit-level views of floats, and the sets of lengths and values.
#ifndef ZOR_TEST_VECTOR_SUPPORT_H
#define ZOR_TEST_VECTOR_SUPPORT_H

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <iterator>
#include <limits>
#include <random>
#include <type_traits>
#include <vector>

#include "zortest.h"
#include "zortypes.h"

namespace vt {

// A region of `bytes` at 64 + `misalign` bytes past an `align`-byte
// boundary, inside random guard bytes. Copy raw to form the expected image
// of the whole buffer, apply the model to the copy, compare whole.
struct Region {
    std::vector<uint8_t> raw;
    size_t offset;
    size_t bytes;

    Region(size_t n, size_t misalign, uint32_t seed = 1, size_t align = 64)
        : raw(n + misalign + align + 192), bytes(n) {
        for (size_t i = 0; i < raw.size(); ++i) raw[i] = (uint8_t)(((i + 1) * 0x9e3779b97f4a7c15ull * (seed + 1)) >> 56);
        const size_t pad = (align - (uintptr_t)raw.data() % align) % align;
        offset = pad + 64 + misalign;
    }
    uint8_t* data() { return raw.data() + offset; }
    template <typename T> T* as() { return reinterpret_cast<T*>(data()); }
    uint8_t* in(std::vector<uint8_t>& image) const { return image.data() + offset; }
};

// Element access at any byte address; the bits of a float or double, and back.
template <typename T> inline T get(const void* p, size_t i) {
    T x;
    std::memcpy(&x, static_cast<const uint8_t*>(p) + i * sizeof(T), sizeof(T));
    return x;
}
template <typename T> inline void put(void* p, size_t i, T x) { std::memcpy(static_cast<uint8_t*>(p) + i * sizeof(T), &x, sizeof(T)); }
template <typename T> inline auto bits(T x) { return get<std::conditional_t<sizeof(T) == 4, uint32_t, uint64_t>>(&x, 0); }
inline float f32(uint32_t u) { return get<float>(&u, 0); }
inline double f64(uint64_t u) { return get<double>(&u, 0); }

// first..70, and each power of two from 2^7 to 2^13 with its neighbours.
inline std::vector<int> lengths(int first = 0) {
    std::vector<int> v;
    for (int n = first; n <= 70; ++n) v.push_back(n);
    for (int k = 7; k <= 13; ++k) v.insert(v.end(), {(1 << k) - 1, 1 << k, (1 << k) + 1});
    return v;
}

// Ordinary values of mixed sign and magnitude with the special ones
// sprinkled in: quiet and signalling NaNs with payloads, zeros of both
// signs, infinities, denormals, the extremes.
template <typename T> inline std::vector<T> values(size_t n, uint32_t seed) {
    std::mt19937_64 gen(seed);
    std::uniform_real_distribution<T> mant(-2, 2);
    std::uniform_int_distribution<int> expo(-30, 30);
    const T inf = std::numeric_limits<T>::infinity();
    T specials[] = {T(0), -T(0), inf, -inf, std::numeric_limits<T>::quiet_NaN(),
                    -std::numeric_limits<T>::quiet_NaN(), std::numeric_limits<T>::signaling_NaN(),
                    std::numeric_limits<T>::denorm_min(), -std::numeric_limits<T>::denorm_min() * 77,
                    std::numeric_limits<T>::max(), -std::numeric_limits<T>::min(), T(1), T(-1)};
    if (sizeof(T) == 4) specials[4] = (T)f32(0x7fc12345u), specials[6] = (T)f32(0x7f812345u);
    std::vector<T> v(n);
    for (T& x : v) x = gen() % 7 == 0 ? specials[gen() % std::size(specials)] : std::ldexp(mant(gen), expo(gen));
    return v;
}

// Guards bytewise; the values in the region bit for bit, or, when not
// exact, with any NaN matching any NaN.
template <typename T>
::testing::AssertionResult matches(const Region& r, const std::vector<uint8_t>& want, size_t count, bool exact) {
    const size_t end = r.offset + count * sizeof(T);
    for (size_t i = 0; i < r.raw.size(); ++i)
        if ((i < r.offset || i >= end) && r.raw[i] != want[i])
            return ::testing::AssertionFailure() << "guard byte " << (long long)i - (long long)r.offset;
    for (size_t i = 0; i < count; ++i) {
        const T g = get<T>(r.raw.data() + r.offset, i), w = get<T>(want.data() + r.offset, i);
        bool equal = std::memcmp(&g, &w, sizeof(T)) == 0;
        // Where two NaNs meet, which payload survives is the processor's
        // choice of operand order, not ours.
        if constexpr (std::is_floating_point_v<T>) equal = equal || (!exact && std::isnan(g) && std::isnan(w));
        if (!equal)
            return ::testing::AssertionFailure() << "value " << i << ": got " << +g << ", want " << +w;
    }
    return ::testing::AssertionSuccess();
}

// Every length and placement of sources and destination (aligned, one
// element, 12 bytes, one byte off); elements of `unit` values (2 for
// complex); in place the destination starts as source 0. call(sources,
// destination, len) returns the status; model(i) or model(i, len) is value
// i of the result.
template <typename T, typename Call, typename Model>
void sweep(const std::vector<std::vector<T>>& data, bool inplace, int unit, bool exact, Call call, Model model) {
    const size_t places[] = {0, unit * sizeof(T), 12, 1};
    for (size_t ps : places)
        for (size_t pd : places)
            for (int len : lengths()) {
                const size_t count = (size_t)len * unit;
                std::vector<Region> in;
                for (size_t k = 0; k < data.size(); ++k) in.emplace_back(count * sizeof(T), (ps + 5 * k * pd) % 16, 10 + k);
                Region out(count * sizeof(T), pd, 20);
                const T* src[3] = {};
                for (size_t k = 0; k < data.size(); ++k) {
                    Region& r = inplace && k == 0 ? out : in[k];
                    for (size_t i = 0; i < count; ++i) put<T>(r.data(), i, data[k][i]);
                    src[k] = r.as<T>();
                }
                auto want = out.raw;
                for (size_t i = 0; i < count; ++i)
                    if constexpr (std::is_invocable_v<Model, size_t, int>) put<T>(out.in(want), i, model(i, len));
                    else put<T>(out.in(want), i, model(i));
                ASSERT_EQ(call(src, out.as<T>(), len), len ? zorStsNoErr : zorStsSizeErr);
                ASSERT_TRUE(matches<T>(out, want, count, exact)) << "len " << len << " at " << ps << ", " << pd;
            }
}

// The whole buffer of r against want, byte for byte.
#define ASSERT_IMAGE(r, want) ASSERT_TRUE(vt::matches<uint8_t>((r), (want), (r).bytes, true))

// A copy (or move without overlap), or with flip a reversal, out of place
// and then in place, of elements of type T: every length and placement,
// compared as bytes; then the null check.
template <typename T> void copy_sweep(ZorStatus (*fn)(const T*, T*, int32_t), bool flip = false) {
    std::vector<std::vector<uint8_t>> d(1, std::vector<uint8_t>(8200 * sizeof(T)));
    for (size_t i = 0; i < d[0].size(); ++i) d[0][i] = (uint8_t)(i * 7 + i / 251);
    for (int inplace = 0; inplace <= flip; ++inplace)
        sweep<uint8_t>(d, inplace, sizeof(T), true,
                       [&](const uint8_t* const* s, uint8_t* o, int32_t n) { return fn((const T*)s[0], (T*)o, n); },
                       [&](size_t i, int len) {
                           return d[0][flip ? (len - 1 - i / sizeof(T)) * sizeof(T) + i % sizeof(T) : i];
                       });
    EXPECT_EQ(fn(nullptr, nullptr, 0), zorStsNullPtrErr);
}

}  // namespace vt

#endif
