// Images inside guard bytes for the point-operation tests: any step (zero,
// negative, odd), any start offset, pixels read and written by memcpy so
// that misaligned rows are fine, and the whole buffer compared after a
// call, so that a write outside the ROI shows as well as a wrong pixel.
#ifndef ZOR_ARITH_HARNESS_H
#define ZOR_ARITH_HARNESS_H

#include <gtest/gtest.h>
#include <stddef.h>
#include <stdint.h>
#include <string.h>

#include <string>
#include <vector>

#include "zor.h"

namespace arithtest {

struct Rng {
    uint64_t s;
    explicit Rng(uint64_t seed) : s(seed * 0x9E3779B97F4A7C15ull + 0x1234567ull) {}
    uint32_t next() {
        s ^= s << 13;
        s ^= s >> 7;
        s ^= s << 17;
        return (uint32_t)(s >> 11);
    }
    uint32_t below(uint32_t n) { return next() % n; }
};

inline float bits_f(uint32_t b) {
    float f;
    memcpy(&f, &b, 4);
    return f;
}
inline uint32_t f_bits(float f) {
    uint32_t b;
    memcpy(&b, &f, 4);
    return b;
}

// Floats that make comparisons and clipping interesting.
inline const std::vector<uint32_t>& special_bits() {
    static const std::vector<uint32_t> v = {
        0x00000000u, 0x80000000u,  // +0, -0
        0x3f800000u, 0xbf800000u,  // +1, -1
        0x7f800000u, 0xff800000u,  // +inf, -inf
        0x7fc00000u, 0xffc00000u,  // quiet NaNs
        0x7f800001u, 0x7fbfffffu,  // signalling NaNs
        0x00000001u, 0x807fffffu,  // denormals
        0x7f7fffffu, 0xff7fffffu,  // +-FLT_MAX
        0x40490fdbu, 0xc2f6e979u,
    };
    return v;
}

// A random float: mostly ordinary values in [-8, 8) on a coarse grid (so
// that ties with a threshold happen), sometimes a special one.
inline float random_float(Rng& r) {
    if (r.below(8) == 0) {
        const std::vector<uint32_t>& s = special_bits();
        return bits_f(s[r.below((uint32_t)s.size())]);
    }
    return (float)((int)r.below(64) - 32) * 0.25f;
}

// One image of w x h pixels of E bytes in a buffer with guard bytes on
// both sides. origin is the byte offset of pixel (0, 0); with a negative
// step the rows go down in memory.
struct Plane {
    int32_t w, h, esize, step;
    size_t origin;
    std::vector<uint8_t> mem;

    Plane(int32_t w_, int32_t h_, int32_t esize_, int32_t step_, size_t misalign, Rng& r)
        : w(w_), h(h_), esize(esize_), step(step_) {
        const int64_t last = (int64_t)(h - 1) * step;
        const int64_t lo = last < 0 ? last : 0;
        const int64_t hi = (last > 0 ? last : 0) + (int64_t)w * esize;
        const size_t guard = 64;
        origin = guard + misalign - (size_t)lo;
        mem.resize(origin + (size_t)hi + guard);
        for (size_t i = 0; i < mem.size(); i += 4) {
            const uint32_t v = r.next();
            memcpy(mem.data() + i, &v, mem.size() - i < 4 ? mem.size() - i : 4);
        }
    }
    uint8_t* at(int32_t x, int32_t y) {
        return mem.data() + origin + (ptrdiff_t)y * step + (ptrdiff_t)x * esize;
    }
    template <typename T>
    T* ptr() {
        return (T*)at(0, 0);
    }
    template <typename T>
    T get(int32_t x, int32_t y) {
        T v;
        memcpy(&v, at(x, y), sizeof v);
        return v;
    }
    template <typename T>
    void put(int32_t x, int32_t y, T v) {
        memcpy(at(x, y), &v, sizeof v);
    }
};

// Row steps to try for a row of rowBytes: the exact row (one run where the
// operation merges rows), padded, odd, and mirrored when negative ones are
// allowed. Steps below the row only where the operation takes them.
inline std::vector<int32_t> steps_for(int32_t rowBytes, int32_t esize, bool negative, bool odd) {
    std::vector<int32_t> s = {rowBytes, rowBytes + 64, rowBytes + 4 * esize};
    if (odd) s.push_back(rowBytes + 3);
    if (negative) {
        s.push_back(-rowBytes);
        s.push_back(-(rowBytes + 16));
    }
    return s;
}

struct Geometry {
    int32_t w, h;
};

// Widths 1 to 70 with heights 1 to 3, and a few wider and taller ones
// around the block sizes of the kernels (16, 32, 64 and 128 elements).
inline std::vector<Geometry> geometries() {
    std::vector<Geometry> g;
    for (int32_t w = 1; w <= 70; ++w) g.push_back({w, 1 + w % 3});
    for (int32_t w : {95, 96, 97, 127, 128, 129, 255, 256, 257, 300})
        g.push_back({w, w % 2 ? 5 : 4});
    g.push_back({3, 40});
    g.push_back({17, 33});
    return g;
}

// Byte offsets of the first pixel from a 64-byte boundary, multiples of the
// element size, plus an odd one where the element may stand anywhere.
inline std::vector<size_t> misaligns(int32_t esize, bool odd) {
    std::vector<size_t> m = {0, (size_t)esize, 16 + (size_t)esize, 60};
    if (odd) m.push_back(1);
    return m;
}

inline std::string where(const Plane& p) {
    return "w=" + std::to_string(p.w) + " h=" + std::to_string(p.h) +
           " step=" + std::to_string(p.step) + " origin%64=" + std::to_string(p.origin % 64);
}

// The buffer equals the expected one; the first differing byte is named.
inline ::testing::AssertionResult same_bytes(const std::vector<uint8_t>& got,
                                             const std::vector<uint8_t>& want, const Plane& p) {
    if (got == want) return ::testing::AssertionSuccess();
    size_t i = 0;
    while (i < got.size() && got[i] == want[i]) ++i;
    const ptrdiff_t rel = (ptrdiff_t)i - (ptrdiff_t)p.origin;
    return ::testing::AssertionFailure()
           << where(p) << ": byte " << rel << " from the first pixel is " << (int)got[i]
           << ", expected " << (int)want[i];
}

}  // namespace arithtest

#endif
