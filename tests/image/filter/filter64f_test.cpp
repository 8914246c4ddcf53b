// The direct double filter through the public stubs, every level forced in
// turn.
#include <stdint.h>
#include <string.h>

#include <vector>

#include "zortest.h"

namespace {

using Filter64fSize = zortest::LevelTest;

TEST_P(Filter64fSize, AsksForABufferOnlyForTallColumnsOverWideRows) {
    int32_t size = -1;
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({1, 3}, 16, &size), zorStsNoErr);
    EXPECT_EQ(size, 96);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({1, 7}, 1000, &size), zorStsNoErr);
    EXPECT_EQ(size, 7 * 32);
    const struct {
        ZoriSize kernel;
        int32_t width;
    } none[] = {{{1, 3}, 15}, {{3, 1}, 16}, {{1, 2}, 16}, {{1, 1}, 100}, {{2, 5}, 16}, {{5, 5}, 64}};
    for (const auto& c : none) {
        size = -1;
        EXPECT_EQ(zoriFilterGetBufSize_64f_C1R(c.kernel, c.width, &size), zorStsNoErr);
        EXPECT_EQ(size, 0) << c.kernel.width << "x" << c.kernel.height << " over " << c.width;
    }
}

TEST_P(Filter64fSize, ChecksPointerThenSizes) {
    int32_t size = 77;
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({0, 3}, 0, nullptr), zorStsNullPtrErr);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({0, 3}, 16, &size), zorStsSizeErr);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({1, 0}, 16, &size), zorStsSizeErr);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({1, 3}, 0, &size), zorStsSizeErr);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({-1, 3}, 16, &size), zorStsSizeErr);
    EXPECT_EQ(zoriFilterGetBufSize_64f_C1R({1, INT32_MAX}, 16, &size), zorStsSizeErr);
    EXPECT_EQ(size, 77);
}

ZOR_INSTANTIATE_LEVELS(Filter64fSize);

}  // namespace
