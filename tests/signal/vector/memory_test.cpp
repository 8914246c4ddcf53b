// Copies and moves through the public names on every level: every small
// length at every relative alignment, lengths around the thresholds where
// the copy changes its way (64 bytes, 32 KiB, 512 KiB, 4 MiB), destinations
// a little ahead of the source in page offset, and overlapping moves in
// both directions. Whole buffers compared, guards included.
#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <vector>

#include "vector_support.h"
#include "zors.h"
#include "zortest.h"

namespace {

using vt::Region;
using Copy = zortest::LevelTest;
using Move = zortest::LevelTest;

typedef ZorStatus (*CopyFn)(const void*, void*, int32_t);

struct Typed {
    CopyFn copy, move;
    size_t size;
    const char* name;
};

// The four element types, called through their own signatures.
template <typename T> ZorStatus call(ZorStatus (*fn)(const T*, T*, int32_t), const void* s, void* d, int32_t n) {
    return fn(static_cast<const T*>(s), static_cast<T*>(d), n);
}
const Typed kTypes[] = {
    {[](const void* s, void* d, int32_t n) { return call(zorsCopy_32f, s, d, n); },
     [](const void* s, void* d, int32_t n) { return call(zorsMove_32f, s, d, n); }, 4, "32f"},
    {[](const void* s, void* d, int32_t n) { return call(zorsCopy_64f, s, d, n); },
     [](const void* s, void* d, int32_t n) { return call(zorsMove_64f, s, d, n); }, 8, "64f"},
    {[](const void* s, void* d, int32_t n) { return call(zorsCopy_32fc, s, d, n); },
     [](const void* s, void* d, int32_t n) { return call(zorsMove_32fc, s, d, n); }, 8, "32fc"},
    {[](const void* s, void* d, int32_t n) { return call(zorsCopy_64fc, s, d, n); },
     [](const void* s, void* d, int32_t n) { return call(zorsMove_64fc, s, d, n); }, 16, "64fc"},
};

void copy_case(const Typed& t, CopyFn fn, int len, size_t os, size_t od, size_t align = 64) {
    const size_t bytes = len * t.size;
    Region rs(bytes, os, 11, align), rd(bytes, od, 12, align);
    auto want = rd.raw;
    std::memcpy(rd.in(want), rs.data(), bytes);
    ASSERT_EQ(fn(rs.data(), rd.data(), len), len ? zorStsNoErr : zorStsSizeErr);
    ASSERT_IMAGE(rd, want) << t.name << " len " << len << " at " << os << ", " << od;
}

TEST_P(Copy, SmallLengthsAtEveryAlignment) {
    for (const Typed& t : kTypes)
        for (int len = 0; len <= 70; ++len)
            for (size_t os = 0; os < 16; os += 3)
                for (size_t od = 0; od < 64; od += (od < 16 ? 1 : 7)) {
                    copy_case(t, t.copy, len, os, od);
                    copy_case(t, t.move, len, os, od);
                }
}

// Byte counts around each threshold, at page offsets that put the
// destination just behind, level with and just ahead of the source.
TEST_P(Copy, AroundEveryThreshold) {
    const size_t thresholds[] = {64, 128, 4096, 0x8000, 0x80000, 0x400000};
    const size_t placements[][2] = {{0, 0}, {0, 0x9c}, {0, 0xa0}, {4, 0xa0}, {0xa4, 0}, {1, 0x3f}, {17, 5}};
    // Every copy is the same byte copy: two element sizes suffice.
    for (const Typed& t : {kTypes[0], kTypes[3]})
        for (size_t th : thresholds)
            for (long d : {-1L, 0L, 1L}) {
                const long len = (long)(th / t.size) + d;
                if (len < 1) continue;
                // The large ones at a few placements only: they cost.
                const size_t count = th > 0x8000 ? 3 : sizeof placements / sizeof placements[0];
                for (size_t k = 0; k < count; ++k)
                    copy_case(t, t.copy, (int)len, placements[k][0], placements[k][1], 4096);
            }
}

// A range moved onto itself shifted by a few bytes either way: the result
// is the source's former content.
TEST_P(Move, OverlapInBothDirections) {
    for (const Typed& t : kTypes)
        for (int len : {1, 2, 3, 7, 15, 16, 17, 31, 64, 65, 100, 1000, 5000})
            for (long shift : {-129L, -64L, -33L, -16L, -9L, -4L, -1L, 1L, 4L, 8L, 9L, 16L, 31L, 32L, 100L, 0L}) {
                const size_t bytes = len * t.size;
                for (size_t base : {(size_t)0, (size_t)5}) {
                    Region r(bytes + 300, base, 21);
                    uint8_t* src = r.data() + 150;
                    uint8_t* dst = src + shift;
                    auto want = r.raw;
                    std::memmove(r.in(want) + 150 + shift, r.in(want) + 150, bytes);
                    ASSERT_EQ(t.move(src, dst, len), zorStsNoErr);
                    ASSERT_IMAGE(r, want) << t.name << " len " << len << " shift " << shift << " base " << base;
                }
            }
}

ZOR_INSTANTIATE_LEVELS(Copy);
ZOR_INSTANTIATE_LEVELS(Move);

}  // namespace
