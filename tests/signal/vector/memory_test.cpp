// Copies and moves through the public names on every level: every small
// length and placement, lengths around the thresholds where the copy
// changes its way (64 bytes, 32 KiB, 512 KiB, 4 MiB) with destinations a
// little behind, level with and ahead of the source in page offset, and
// overlapping moves in both directions. Whole buffers compared, guards
// included.

#include "vector_support.h"
#include "zors.h"

namespace {

using vt::Region;
using Copy = zortest::LevelTest;
using Move = zortest::LevelTest;

TEST_P(Copy, EveryTypeEveryLengthAndPlacement) {
    vt::copy_sweep(zorsCopy_32f);
    vt::copy_sweep(zorsCopy_32fc);
    vt::copy_sweep(zorsCopy_64f);
    vt::copy_sweep(zorsCopy_64fc);
    vt::copy_sweep(zorsMove_32f);
    vt::copy_sweep(zorsMove_32fc);
    vt::copy_sweep(zorsMove_64f);
    vt::copy_sweep(zorsMove_64fc);
}

// Every copy is the same byte copy: two element sizes suffice. The large
// lengths at a few placements only: they cost.
template <typename T> void around_thresholds(ZorStatus (*fn)(const T*, T*, int32_t)) {
    const size_t placements[][2] = {{0, 0}, {0, 0x9c}, {0, 0xa0}, {4, 0xa0}, {0xa4, 0}, {1, 0x3f}, {17, 5}};
    for (size_t th : {64, 128, 4096, 0x8000, 0x80000, 0x400000})
        for (long d : {-1L, 0L, 1L}) {
            const long len = (long)(th / sizeof(T)) + d;
            for (size_t k = 0; k < (th > 0x8000 ? 3 : 7); ++k) {
                Region rs(len * sizeof(T), placements[k][0], 11, 4096), rd(len * sizeof(T), placements[k][1], 12, 4096);
                auto want = rd.raw;
                std::memcpy(rd.in(want), rs.data(), len * sizeof(T));
                ASSERT_EQ(fn(rs.as<T>(), rd.as<T>(), (int32_t)len), zorStsNoErr);
                ASSERT_IMAGE(rd, want) << "len " << len << " at " << placements[k][0] << ", " << placements[k][1];
            }
        }
}

TEST_P(Copy, AroundEveryThreshold) {
    around_thresholds(zorsCopy_32f);
    around_thresholds(zorsCopy_64fc);
}

// A range moved onto itself shifted by a few bytes either way: the result
// is the source's former content.
template <typename T> void overlap(ZorStatus (*fn)(const T*, T*, int32_t)) {
    for (int len : {1, 2, 3, 7, 15, 16, 17, 31, 64, 65, 100, 1000, 5000})
        for (long shift : {-129L, -64L, -33L, -16L, -9L, -4L, -1L, 1L, 4L, 8L, 9L, 16L, 31L, 32L, 100L, 0L})
            for (size_t base : {(size_t)0, (size_t)5}) {
                const size_t bytes = len * sizeof(T);
                Region r(bytes + 300, base, 21);
                uint8_t* src = r.data() + 150;
                auto want = r.raw;
                std::memmove(r.in(want) + 150 + shift, r.in(want) + 150, bytes);
                ASSERT_EQ(fn((const T*)src, (T*)(src + shift), len), zorStsNoErr);
                ASSERT_IMAGE(r, want) << "len " << len << " shift " << shift << " base " << base;
            }
}

TEST_P(Move, OverlapInBothDirections) {
    overlap(zorsMove_32f);
    overlap(zorsMove_32fc);
    overlap(zorsMove_64f);
    overlap(zorsMove_64fc);
}

ZOR_INSTANTIATE_LEVELS(Copy);
ZOR_INSTANTIATE_LEVELS(Move);

}  // namespace
