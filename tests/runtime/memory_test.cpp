// Aligned allocators: the core pair and the typed forms of every level.
#include <gtest/gtest.h>
#include <malloc.h>

#include <cstring>

#include "zortest.h"

namespace {

// A block as the allocator promises it: 64-byte aligned, the malloc pointer
// just below it, length + 72 bytes underneath, every byte writable.
void expect_block(void* p, size_t bytes) {
    ASSERT_NE(p, nullptr) << bytes;
    const uintptr_t user = (uintptr_t)p;
    EXPECT_EQ(user % 64, 0u) << bytes;
    const uintptr_t block = (uintptr_t)((void**)p)[-1];
    EXPECT_GE(user - block, 8u) << bytes;
    EXPECT_LE(user - block, 71u) << bytes;
    EXPECT_GE(malloc_usable_size((void*)block), bytes + 72) << bytes;
    std::memset(p, 0xa5, bytes);
}

TEST(Memory, CoreAllocatorTakesTheLargestLength) {
    void* p = zorMalloc(0x7fffffff - 72);
    ASSERT_NE(p, nullptr);
    EXPECT_EQ((uintptr_t)p % 64, 0u);
    static_cast<char*>(p)[0] = 1;  // both ends are ours
    static_cast<char*>(p)[0x7fffffff - 73] = 1;
    zorFree(p);
}

TEST(Memory, BlocksAreAlignedWithThePointerBelow) {
    for (int32_t n = 1; n <= 300; ++n) {
        void* p = zorMalloc(n);
        expect_block(p, n);
        zorFree(p);
    }
    for (int32_t n : {511, 4096, 4097, 65536 + 7, 1 << 20, (1 << 24) + 1}) {
        void* p = zorMalloc(n);
        expect_block(p, n);
        zorFree(p);
    }
}

TEST(Memory, FreeingNullDoesNothing) {
    zorFree(nullptr);
    zorsFree(nullptr);
    zoriFree(nullptr);
}

class MemoryTest : public zortest::LevelTest {};

TEST_P(MemoryTest, AllocatorsCheckLengthInElements) {
    const struct {
        void* p;
        size_t bytes;
    } blocks[] = {{zorsMalloc_8u(1), 1},
                  {zorsMalloc_16u(3), 6},
                  {zorsMalloc_32f(17), 68},
                  {zorsMalloc_64f(1000), 8000}};
    for (const auto& b : blocks) {
        expect_block(b.p, b.bytes);
        zorsFree(b.p);
    }
    const struct {
        const char* what;
        void* p;
    } nulls[] = {
        {"0", zorMalloc(0)}, {"-1", zorMalloc(-1)}, {"INT32_MIN", zorMalloc(INT32_MIN)},
        // The 72 spare bytes are added before the 2 GiB test.
        {"2 GiB - 71", zorMalloc(0x7fffffff - 71)}, {"2 GiB", zorMalloc(0x7fffffff)},
        {"8u 0", zorsMalloc_8u(0)},
        {"16u -1", zorsMalloc_16u(-1)},
        {"32f 0", zorsMalloc_32f(0)},
        {"64f -5", zorsMalloc_64f(-5)},
        {"8u 2 GiB - 71", zorsMalloc_8u(0x7fffffff - 71)},
        {"16u 2 GiB", zorsMalloc_16u(0x40000000)},
        {"32f 2 GiB", zorsMalloc_32f(0x20000000)},
        {"64f 2 GiB", zorsMalloc_64f(0x10000000)},
        // Products that wrap to small values in 32 bits.
        {"16u 8 GiB + 2", zorsMalloc_16u(0x7fffffff)},
        {"32f 4 GiB + 4", zorsMalloc_32f(0x40000001)},
        {"64f 4 GiB + 8", zorsMalloc_64f(0x20000001)},
        // Below 2 GiB, but over it once the 72 spare bytes are added.
        {"64f 2 GiB - 72", zorsMalloc_64f(0x0ffffff7)},
    };
    for (const auto& c : nulls) {
        EXPECT_EQ(c.p, nullptr) << c.what;
        zorsFree(c.p);
    }
}

TEST_P(MemoryTest, VectorAllocatorReachesTheLimit) {
    Zor64f* p = zorsMalloc_64f(0x0ffffff6);  // 0x7fffffb0 bytes
    ASSERT_NE(p, nullptr);
    p[0] = 1.0;
    p[0x0ffffff5] = 2.0;
    zorsFree(p);
}

// Rows start on 64-byte boundaries in one block; on failure the step is
// still set once the row is known to fit.
TEST_P(MemoryTest, ImageAllocators) {
    const struct {
        bool is32f, fails;
        int32_t width, height, step;
    } cases[] = {
        {false, false, 1, 1, 64},  {false, false, 64, 1, 64},  {false, false, 65, 3, 128},
        {false, false, 1000, 7, 1024}, {true, false, 16, 1, 64},  {true, false, 17, 1, 128},
        {true, false, 17, 5, 128},  {true, false, 300, 2, 1216},
        {false, true, 0, 1, 0}, {false, true, 1, 0, 0}, {true, true, -5, 3, 0}, {true, true, 3, -1, 0},
        {false, true, 64, 0x2000000, 64}, {true, true, 16, 0x2000000, 64},
        {false, true, 0x7fffffc0, 1, 0x7fffffc0},  // too large once 72 bytes are added
        // A 32f row of more than 0x7fffffff bytes is refused before the step.
        {true, true, 0x20000000, 1, 0}, {true, true, 0x7fffffff, 1, 0},
    };
    for (const auto& c : cases) {
        int32_t step = -1;
        void* p = c.is32f ? (void*)zoriMalloc_32f_C1(c.width, c.height, &step)
                          : (void*)zoriMalloc_8u_C1(c.width, c.height, &step);
        EXPECT_EQ(step, c.step) << c.width << "x" << c.height;
        if (c.fails) EXPECT_EQ(p, nullptr) << c.width << "x" << c.height;
        else expect_block(p, (size_t)c.step * c.height);  // one block, no extra rows
        zoriFree(p);
    }
    // Without a step pointer nothing is allocated.
    EXPECT_EQ(zoriMalloc_8u_C1(16, 16, nullptr), nullptr);
    EXPECT_EQ(zoriMalloc_32f_C1(16, 16, nullptr), nullptr);
}

TEST_P(MemoryTest, AnyFreeReleasesAnyBlock) {
    int32_t step = 0;
    zoriFree(zorsMalloc_8u(100));
    zoriFree(zorMalloc(100));
    zorsFree(zoriMalloc_8u_C1(10, 10, &step));
    zorsFree(zorMalloc(100));
    zorFree(zorsMalloc_32f(100));
    zorFree(zoriMalloc_32f_C1(10, 10, &step));
    // The heap must still be sound after the mixed frees.
    void* p = zorMalloc(4096);
    expect_block(p, 4096);
    zorFree(p);
}

ZOR_INSTANTIATE_LEVELS(MemoryTest);

}  // namespace
