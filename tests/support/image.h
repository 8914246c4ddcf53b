// What every image test needs: one image type whose bytes around and
// between the rows are compared whole after a call, images fenced by an
// unreadable page, one trait per element type, and the runner for
// argument checks in their order.
#ifndef ZOR_TEST_IMAGE_H
#define ZOR_TEST_IMAGE_H

#include <gtest/gtest.h>

#include <stddef.h>
#include <stdint.h>
#include <string.h>
#include <sys/mman.h>
#include <unistd.h>

#include <functional>
#include <string>
#include <vector>

#include "zor.h"

namespace zortest {

// ---- random numbers -----------------------------------------------------------

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

// ---- element types --------------------------------------------------------------

// Type<T>::name, and random() values that make comparisons interesting:
// the whole range for integers; for floats mostly small values on a coarse
// grid (so that ties happen) and now and then a zero of either sign, an
// infinity or a NaN.
template <typename T> struct Type;
template <> struct Type<Zor8u> {
    static constexpr const char* name = "8u";
    static Zor8u random(Rng& r) { return (Zor8u)r.next(); }
};
template <> struct Type<Zor16u> {
    static constexpr const char* name = "16u";
    static Zor16u random(Rng& r) { return (Zor16u)r.next(); }
};
template <> struct Type<Zor16s> {
    static constexpr const char* name = "16s";
    static Zor16s random(Rng& r) { return (Zor16s)r.next(); }
};
template <> struct Type<Zor32s> {
    static constexpr const char* name = "32s";
    static Zor32s random(Rng& r) { return (Zor32s)r.next(); }
};
template <> struct Type<Zor32f> {
    static constexpr const char* name = "32f";
    static Zor32f random(Rng& r) {
        static const uint32_t special[] = {0x00000000u, 0x80000000u, 0x7f800000u,
                                           0xff800000u, 0x7fc00000u, 0x00000001u};
        if (r.below(16) == 0) return bits_f(special[r.below(6)]);
        return (float)((int)r.below(64) - 32) * 0.25f;
    }
};
template <> struct Type<Zor64f> {
    static constexpr const char* name = "64f";
    static Zor64f random(Rng& r) { return (double)((int)r.below(64) - 32) * 0.25; }
};

// f(T()) for 8u, 16u, 16s and 32f in turn; the body takes its type from
// the argument (decltype), so one generic lambda serves every type.
template <typename F> void for_each_type(F f) {
    f(Zor8u());
    f(Zor16u());
    f(Zor16s());
    f(Zor32f());
}

// ---- records and work buffers behind guard bytes ---------------------------------

constexpr uint8_t kGuardByte = 0xA5;

// A block of `size` bytes followed by `guard` bytes, all holding the guard
// byte; guard_intact tells whether every byte from `from` on still does.
inline std::vector<uint8_t> guarded(size_t size, size_t guard = 64) {
    return std::vector<uint8_t>(size + guard, kGuardByte);
}
inline bool guard_intact(const std::vector<uint8_t>& mem, size_t from) {
    for (size_t i = from; i < mem.size(); ++i)
        if (mem[i] != kGuardByte) return false;
    return true;
}

// ---- images in guard bytes ------------------------------------------------------

// w x h pixels of T, rows `step` bytes apart (any step, negative too: then
// the rows go down in memory), the first pixel `misalign` bytes past a
// 64-byte boundary of the block, `guard` bytes before and after. Pixels go
// through memcpy, so misaligned rows are fine. Compare two images' bytes
// whole (same_bytes) to catch writes into the guards or between rows. A
// copy serves as the expected image; it need not keep the alignment.
template <typename T> struct Image {
    int32_t w = 0, h = 0, step = 0;
    size_t origin = 0;
    std::vector<uint8_t> mem;

    Image() = default;
    Image(int32_t w_, int32_t h_, int32_t step_ = 0, size_t misalign = 0, size_t guard = 64)
        : w(w_), h(h_), step(step_ ? step_ : w_ * (int32_t)sizeof(T)) {
        const int64_t last = (int64_t)(h - 1) * step;
        const int64_t lo = last < 0 ? last : 0;
        const int64_t hi = (last > 0 ? last : 0) + (int64_t)w * (int64_t)sizeof(T);
        origin = guard + misalign - (size_t)lo;
        mem.assign(origin + (size_t)hi + guard, kGuardByte);
        // Keep the block's start 64-byte aligned so misalign means what it says.
        const size_t shift = (64 - ((uintptr_t)mem.data() & 63)) & 63;
        if (shift) {
            mem.insert(mem.begin(), shift, kGuardByte);
            origin += shift;
        }
    }

    uint8_t* bytes(int32_t x, int32_t y) {
        return mem.data() + origin + (ptrdiff_t)y * step + (ptrdiff_t)x * (ptrdiff_t)sizeof(T);
    }
    const uint8_t* bytes(int32_t x, int32_t y) const {
        return mem.data() + origin + (ptrdiff_t)y * step + (ptrdiff_t)x * (ptrdiff_t)sizeof(T);
    }
    T* ptr(int32_t x = 0, int32_t y = 0) { return (T*)bytes(x, y); }
    const T* ptr(int32_t x = 0, int32_t y = 0) const { return (const T*)bytes(x, y); }
    T get(int32_t x, int32_t y) const {
        T v;
        memcpy(&v, bytes(x, y), sizeof v);
        return v;
    }
    void set(int32_t x, int32_t y, T v) { memcpy(bytes(x, y), &v, sizeof v); }
    ZoriSize size() const { return {w, h}; }

    // Random pixels; the bytes around them keep the guard pattern.
    Image& randomize(Rng& r) {
        for (int32_t y = 0; y < h; ++y)
            for (int32_t x = 0; x < w; ++x) set(x, y, Type<T>::random(r));
        return *this;
    }
    template <typename F> Image& fill(F f) {
        for (int32_t y = 0; y < h; ++y)
            for (int32_t x = 0; x < w; ++x) set(x, y, (T)f(x, y));
        return *this;
    }
};

// Byte for byte, with the first difference named: a pixel by (x, y) or a
// guard byte by its offset from the first pixel.
template <typename T>
::testing::AssertionResult same_bytes(const Image<T>& got, const Image<T>& want) {
    if (got.mem.size() != want.mem.size()) return ::testing::AssertionFailure() << "sizes differ";
    for (size_t i = 0; i < got.mem.size(); ++i) {
        if (got.mem[i] == want.mem[i]) continue;
        const ptrdiff_t off = (ptrdiff_t)i - (ptrdiff_t)got.origin;
        for (int32_t y = 0; y < got.h; ++y) {
            const ptrdiff_t x = off - (ptrdiff_t)y * got.step;
            if (x >= 0 && x < (ptrdiff_t)got.w * (ptrdiff_t)sizeof(T)) {
                const int32_t px = (int32_t)(x / (ptrdiff_t)sizeof(T));
                return ::testing::AssertionFailure()
                       << Type<T>::name << " pixel (" << px << ", " << y << ") of " << got.w
                       << "x" << got.h << ": got " << +got.get(px, y) << ", want "
                       << +want.get(px, y);
            }
        }
        return ::testing::AssertionFailure()
               << "byte " << off << " from the first pixel (outside the ROI) was written";
    }
    return ::testing::AssertionSuccess();
}

// ---- images against unreadable pages ---------------------------------------------

// An image whose first pixel follows an unreadable page (atEnd false) or
// whose last pixel is followed by one (atEnd true): a kernel that reads
// left of the first row or right of the last one faults.
template <typename T> struct Fenced {
    int32_t w, h, step;
    uint8_t* map = nullptr;
    size_t mapBytes = 0;
    T* first = nullptr;

    Fenced(int32_t w_, int32_t h_, bool atEnd, int32_t step_ = 0)
        : w(w_), h(h_), step(step_ ? step_ : w_ * (int32_t)sizeof(T)) {
        const size_t page = (size_t)sysconf(_SC_PAGESIZE);
        const size_t span = (size_t)(h - 1) * (size_t)step + (size_t)w * sizeof(T);
        const size_t body = (span + page - 1) / page * page;
        mapBytes = body + 2 * page;
        map = (uint8_t*)mmap(nullptr, mapBytes, PROT_READ | PROT_WRITE,
                             MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
        if (map == (uint8_t*)MAP_FAILED) {
            map = nullptr;
            return;
        }
        mprotect(map, page, PROT_NONE);
        mprotect(map + page + body, page, PROT_NONE);
        first = (T*)(map + page + (atEnd ? body - span : 0));
    }
    ~Fenced() {
        if (map) munmap(map, mapBytes);
    }
    Fenced(const Fenced&) = delete;
    Fenced& operator=(const Fenced&) = delete;

    T* ptr(int32_t x = 0, int32_t y = 0) {
        return (T*)((uint8_t*)first + (ptrdiff_t)y * step + (ptrdiff_t)x * (ptrdiff_t)sizeof(T));
    }
    template <typename F> void fill(F f) {
        for (int32_t y = 0; y < h; ++y)
            for (int32_t x = 0; x < w; ++x) {
                const T v = (T)f(x, y);
                memcpy(ptr(x, y), &v, sizeof v);
            }
    }
};

// ---- argument checks in their order ------------------------------------------------

// One row: the status a call must give. Rows are listed in the order the
// operation tests its arguments, each failing only the check it names
// and passing every earlier one.
struct CheckRow {
    ZorStatus expected;
    const char* what;
    std::function<ZorStatus()> call;
};

// Runs the rows in order; after each, `untouched()` must still hold
// (nothing written on failure).
inline void run_checks(const std::vector<CheckRow>& rows,
                       const std::function<bool()>& untouched = [] { return true; }) {
    for (const CheckRow& r : rows) {
        EXPECT_EQ(r.call(), r.expected) << r.what;
        EXPECT_TRUE(untouched()) << r.what << ": a failing call wrote";
    }
}

}  // namespace zortest

#endif
