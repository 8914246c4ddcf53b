// Copies and moves through the public names on every level: every small
// length and placement, and overlapping moves in both directions. The
// thresholds where the copy changes its way are the kernel tests' part.
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
    // Every move is the same byte move: two element sizes suffice.
    overlap(zorsMove_32f);
    overlap(zorsMove_64fc);
}

ZOR_INSTANTIATE_LEVELS(Copy);
ZOR_INSTANTIATE_LEVELS(Move);

}  // namespace
