// Overlapping moves through the public names on every level (the copies
// and plain moves are swept with the reversals). A range moved onto itself
// shifted by every byte count up to 70 either way gives the source's former
// content; every move is the same byte move, so two element sizes suffice.
#include "vector_support.h"
#include "zors.h"

namespace {

using Move = zortest::LevelTest;

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

TEST_P(Move, OverlapInBothDirections) {
    overlap(zorsMove_32f);
    overlap(zorsMove_64fc);
}

ZOR_INSTANTIATE_LEVELS(Move);

}  // namespace
