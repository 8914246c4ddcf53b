// The memory kernels behind copies and clears, called one by one on every
// level (the machine's own cache answer may never lead the public calls to
// some of them), the level's whole choice for given cache sizes, and the
// copy's own cache table against the runtime's.

#include <array>

#include "vector_support.h"
#include "zorinternal.h"

extern "C" const int32_t ownCacheTable[];

namespace {

using vt::Region;
using MemKernel = zortest::LevelTest;

typedef void (*CopyKernel)(const Zor8u*, Zor8u*, size_t);
typedef void (*ZeroKernel)(Zor8u*, size_t);

// Kernel k (a copy, or with a null source a clear) of n bytes from offset
// os to offset od, against memcpy or memset over the whole guarded buffer.
void kernel_case(CopyKernel copy, ZeroKernel zero, size_t n, size_t os, size_t od) {
    Region rs(n, os, 1), rd(n, od, 2);
    auto want = rd.raw;
    copy ? (void)std::memcpy(rd.in(want), rs.data(), n) : (void)std::memset(rd.in(want), 0, n);
    copy ? copy(rs.data(), rd.data(), n) : zero(rd.data(), n);
    ASSERT_IMAGE(rd, want) << (copy ? "copy " : "clear ") << n << " bytes at " << os << ", " << od;
}

// Every small length at many relative alignments; lengths around multiples
// of 64 and the 256 KiB chunk at a few.
TEST_P(MemKernel, EveryCopyAndClearKernel) {
    const CopyKernel copies[] = {ZOR_BODY(ownsCopy_8u_E9), ZOR_BODY(ownsCopy_8u_repE9), ZOR_BODY(ownsCopy_8u_nt),
                                 ZOR_BODY(ownsCopy_8u_inv), ZOR_BODY(ownsCopy_8u_ra), nullptr, nullptr, nullptr};
    const ZeroKernel zeros[] = {ZOR_BODY(ownsZero_8u_E9), ZOR_BODY(ownsZero_8u_repE9), ZOR_BODY(ownsZero_8u_nt)};
    std::vector<size_t> lengths;
    for (size_t n = 0; n <= 200; ++n) lengths.push_back(n);
    for (size_t base : {(size_t)4096, (size_t)0x8000, (size_t)0x40000, (size_t)0x80000})
        for (long d : {-65L, -64L, -63L, -1L, 0L, 1L, 63L, 64L, 65L, 129L}) lengths.push_back(base + d);
    for (int k = 0; k < 8; ++k)
        for (size_t n : lengths) {
            const CopyKernel c = copies[k];
            const ZeroKernel z = k < 5 ? nullptr : zeros[k - 5];
            if (n > 200)
                for (const auto& p : {std::array<size_t, 2>{0, 0}, {7, 33}, {63, 1}}) kernel_case(c, z, n, p[0], p[1]);
            else
                for (size_t os : {0, 1, 3, 8, 17, 33, 63})
                    for (size_t od : {0, 1, 2, 3, 4, 7, 8, 15, 16, 17, 31, 32, 33, 48, 63}) kernel_case(c, z, n, os, od);
        }
}

// The level's own choice with a cache answer handed in: unknown, 0, and
// sizes that put half the cache below, at and above the length.
TEST_P(MemKernel, WholeChoiceForGivenCacheSizes) {
    const auto copy = ZOR_BODY(ownsCopy_8u_cache);
    const auto zero = ZOR_BODY(ownsZero_8u_cache);
    const size_t lengths[] = {63, 64, 0x7fff, 0x8000, 0x8001, 0x7ffff, 0x80000, 0x80001, 0x400000, 0x400001, 0x400041};
    // Source and destination page offsets: level, a little ahead, at 0xa0,
    // behind (a wrapping difference).
    const size_t places[][2] = {{0, 0}, {0, 0x5f}, {8, 0xa8}, {0xa1, 1}};
    for (size_t n : lengths)
        for (int64_t cache : {(int64_t)-1, (int64_t)0, (int64_t)(2 * n), (int64_t)(2 * n + 2)})
            for (const auto& p : places) {
                Region rs(n, p[0], 1, 4096), rd(n, p[1], 2, 4096);
                auto want = rd.raw;
                std::memcpy(rd.in(want), rs.data(), n);
                copy(rs.data(), rd.data(), n, cache);
                ASSERT_IMAGE(rd, want) << "copy " << n << " cache " << cache << " at " << p[0] << ", " << p[1];
                want = rs.raw;
                std::memset(rs.in(want), 0, n);
                zero(rs.data(), n, cache);
                ASSERT_IMAGE(rs, want) << "clear " << n << " cache " << cache << " at " << p[0];
            }
}

// Every descriptor of the runtime's table decodes to its size (those below
// 256 KiB, which the copy's code cannot hold, to 256 KiB), wherever in the
// answer it stands; the decoding rules are the runtime's.
TEST_P(MemKernel, CacheTableAgreesWithTheRuntime) {
    const auto decode = ZOR_BODY(ownsCopyCacheSize);
    int rows = 0;
    for (const int32_t* row = ownCacheTable; row[0] != 0; row += 2, ++rows) {
        const uint32_t d = (uint32_t)row[0];
        // Sizes the code cannot hold (384 KiB and below 256 KiB) read as 256 KiB.
        const int32_t want = row[1] % 262144 ? 262144 : row[1];
        // (Not in EAX's top byte from 0x80 on: that would be the bit that
        // marks a register without descriptors.)
        const uint32_t places[][4] = {{0x01u | d << 8, 0, 0, 0}, {0x01u | d << 24, 0, 0, 0},
                                      {0x01u, d, 0, 0}, {0x01u, 0, d << 16, 0}, {0x01u, 0, 0, d << 8}};
        for (int k = 0; k < 5; ++k)
            if (k != 1 || d < 0x80) EXPECT_EQ(decode(places[k]), want) << "descriptor " << d << " place " << k;
    }
    EXPECT_EQ(rows, 55);
    // The first byte is the count, which must be 1; a register with bit 31
    // set holds no descriptors; of several, the largest.
    const uint32_t rules[][5] = {{0x00000001u, 0, 0, 0, (uint32_t)-1},       {0x00004902u, 0, 0, 0, (uint32_t)-1},
                                 {0x01u, 0x80000049u, 0, 0, (uint32_t)-1},   {0x00492201u, 0x00ec0000u, 0, 0x44u, 25165824},
                                 {0x0000ff01u, 0x01020304u, 0, 0, (uint32_t)-1}};
    for (const auto& r : rules) EXPECT_EQ(decode(r), (int32_t)r[4]) << std::hex << r[0] << " " << r[1];
}

ZOR_INSTANTIATE_LEVELS(MemKernel);

}  // namespace
