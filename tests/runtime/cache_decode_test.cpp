// Cache size decoding from recorded CPUID answers: the leaf 2 descriptor
// table and the leaf 4 walk.
#include <gtest/gtest.h>

#include <vector>

#include "runtime_internal.h"

namespace {

// Leaf 2 descriptors by size, largest first, in table order.
struct SizeGroup {
    int32_t bytes;
    std::vector<int32_t> descriptors;
};

const std::vector<SizeGroup>& groups() {
    static const std::vector<SizeGroup> g = {
        {25165824, {236}},
        {18874368, {235}},
        {16777216, {77}},
        {12582912, {234, 76}},
        {8388608, {228, 222, 75, 71}},
        {6291456, {78, 74}},
        {4194304, {227, 221, 216, 73, 41, 70}},
        {3145728, {72}},
        {2097152, {226, 220, 215, 210, 37, 125, 133, 69}},
        {1048576, {214, 209, 35, 135, 124, 120, 132, 68}},
        {524288, {208, 34, 123, 128, 134, 62, 127, 131, 67}},
        {393216, {61}},
        {262144, {33, 122, 130, 60, 63, 66}},
        {196608, {58}},
        {131072, {121, 57, 59, 65}},
    };
    return g;
}

int32_t leaf2(uint32_t eax, uint32_t ebx = 0, uint32_t ecx = 0, uint32_t edx = 0) {
    const uint32_t regs[4] = {eax, ebx, ecx, edx};
    return ownCacheSizeLeaf2(regs, ownCacheTable);
}

// The table holds every descriptor in order, and each decodes wherever it
// stands in the answer.
TEST(CacheLeaf2, EveryDescriptorInOrderAndInEveryPosition) {
    int row = 0;
    for (const SizeGroup& g : groups())
        for (int32_t d : g.descriptors) {
            EXPECT_EQ(ownCacheTable[2 * row], d) << "row " << row;
            EXPECT_EQ(ownCacheTable[2 * row + 1], g.bytes) << "row " << row;
            ++row;
            for (int reg = 0; reg < 4; ++reg)
                for (int shift = reg ? 0 : 8; shift <= 24; shift += 8) {
                    if (shift == 24 && (uint32_t)d >= 0x80) continue;  // would set bit 31
                    uint32_t regs[4] = {1, 0, 0, 0};
                    regs[reg] |= (uint32_t)d << shift;
                    EXPECT_EQ(ownCacheSizeLeaf2(regs, ownCacheTable), g.bytes)
                        << d << " in register " << reg << " << " << shift;
                }
        }
    EXPECT_EQ(row, 55);
    EXPECT_EQ(ownCacheTable[2 * row], 0);  // row 56 ends the table
    EXPECT_EQ(ownCacheTable[2 * row + 1], 0);
}

TEST(CacheLeaf2, DecodingRules) {
    const struct {
        const char* what;
        uint32_t eax, ebx, ecx, edx;
        int32_t bytes;
    } cases[] = {
        {"iteration count must be 1", 0x00004d02, 0, 0, 0, -1},
        {"iteration count 0", 0x00004d00, 0x4d, 0, 0, -1},
        {"count 1 in the low byte only", 0x00014d01, 0, 0, 0, 16777216},
        {"largest wins across registers", 0x00797901, 0x3a, 0x49, 0x4d000000, 16777216},
        {"largest wins within a register", 0x004d4101, 0, 0, 0, 16777216},
        {"24 MiB in EDX beats the rest", 0x00797901, 0, 0x49, 0x000000ec, 25165824},
        {"unknown descriptors", 0x00fffe01, 0x2c2b2a28, 0x10203040, 0x0f0e0d0c, -1},
        {"nothing but the count", 0x00000001, 0, 0, 0, -1},
        {"bit 31 hides EBX", 0x00000001, 0x8000004d, 0x79, 0, 131072},
        {"bit 31 hides EDX, descriptor 236 in its top byte", 0x00000001, 0, 0, 0xec000000, -1},
        {"a zero register is absent too", 0x80000001, 0, 0x00000049, 0, -1},
        {"all absent", 0x80000001, 0x80000000, 0xffffffff, 0x80000000, -1},
        // With EAX absent the string starts at EBX, and its first byte is
        // still taken for the count.
        {"EAX absent, first byte skipped", 0x80004d01, 0x00000049, 0, 0, -1},
        {"EAX absent, later bytes used", 0x80004d01, 0x00004900, 0, 0, 4194304},
        {"EAX absent, descriptor in ECX", 0x80004d01, 0x00000049, 0x3a, 0, 196608},
    };
    for (const auto& c : cases) EXPECT_EQ(leaf2(c.eax, c.ebx, c.ecx, c.edx), c.bytes) << c.what;
}

TEST(CacheLeaf2, WalkUsesTheGivenTableAndStopsAtItsEnd) {
    const int32_t table[] = {1, 999, 0x49, 7, 0, 0, 0x4d, 5};
    const uint32_t countOnly[4] = {0x00000001, 0, 0, 0};
    const uint32_t one[4] = {0x00000101, 0, 0, 0};
    const uint32_t pastEnd[4] = {0x00004d01, 0, 0, 0};
    const uint32_t both[4] = {0x00490101, 0, 0, 0};
    EXPECT_EQ(ownCacheSizeLeaf2(countOnly, table), -1);  // byte 0 is never a descriptor
    EXPECT_EQ(ownCacheSizeLeaf2(one, table), 999);
    EXPECT_EQ(ownCacheSizeLeaf2(pastEnd, table), -1);
    EXPECT_EQ(ownCacheSizeLeaf2(both, table), 999);  // first row that matches, not largest
}

// Leaf 4 answers for the fake CPUID, by subleaf; zeros past the end.
std::vector<std::vector<uint32_t>> fakeLeaf4;
uint32_t highestSubleaf;
bool otherLeafAsked;

void fake_cpuid(uint32_t regs[4], uint32_t leaf, uint32_t subleaf) {
    if (leaf != 4) otherLeafAsked = true;
    if (subleaf > highestSubleaf) highestSubleaf = subleaf;
    for (int i = 0; i < 4; ++i)
        regs[i] = subleaf < fakeLeaf4.size() ? fakeLeaf4[subleaf][i] : 0;
}

std::vector<uint32_t> cache(uint32_t type, uint32_t ways, uint32_t parts, uint32_t line,
                            uint32_t sets) {
    // Level and flag bits above the type field must not disturb it.
    return {type | 2u << 5 | 1u << 8 | 5u << 26, (ways - 1) << 22 | (parts - 1) << 12 | (line - 1),
            sets - 1, 0x2};
}

const std::vector<uint32_t> kEnd = {0x00000120, 0x01c0003f, 0x3f, 0};  // type 0

struct Leaf4Case {
    const char* what;
    std::vector<std::vector<uint32_t>> leaves;
    int32_t bytes;
    int32_t line;  // checked only when a cache is found
    uint32_t lastSubleaf;
};

TEST(CacheLeaf4, WalkFindsLargestDataOrUnifiedCache) {
    const Leaf4Case cases[] = {
        {"usual hierarchy, large instruction cache skipped",
         {cache(1, 8, 1, 64, 64), cache(2, 64, 4, 64, 16384), cache(3, 16, 1, 64, 2048),
          cache(3, 12, 1, 64, 16384), kEnd},
         12582912, 64, 4},
        {"stops at type 0",
         {cache(1, 8, 1, 64, 64), kEnd, cache(3, 16, 1, 64, 65536)}, 32768, 64, 1},
        {"equal size keeps the first line size",
         {cache(1, 8, 1, 64, 64), cache(3, 8, 1, 128, 32), kEnd}, 32768, 64, 2},
        {"partitions and unknown types count",
         {cache(1, 8, 1, 64, 64), cache(4, 8, 2, 32, 256), kEnd}, 131072, 32, 2},
        {"smaller later cache ignored",
         {cache(3, 16, 1, 128, 1024), cache(1, 8, 1, 64, 64), kEnd}, 2097152, 128, 2},
        {"instruction caches only", {cache(2, 8, 1, 64, 64), kEnd}, -1, 0, 1},
        {"no caches at all", {kEnd}, -1, 0, 0},
    };
    for (const Leaf4Case& c : cases) {
        fakeLeaf4 = c.leaves;
        highestSubleaf = 0;
        otherLeafAsked = false;
        int32_t line = -2;
        EXPECT_EQ(ownCacheSizeLeaf4(fake_cpuid, &line), c.bytes) << c.what;
        if (c.bytes >= 0) {
            EXPECT_EQ(line, c.line) << c.what;
        }
        EXPECT_EQ(highestSubleaf, c.lastSubleaf) << c.what;
        EXPECT_FALSE(otherLeafAsked) << c.what;
    }
}

TEST(CacheLeaf4, WalkEndsAfterSubleaf31) {
    fakeLeaf4.clear();
    for (uint32_t i = 0; i < 40; ++i) fakeLeaf4.push_back(cache(3, 1, 1, 64, i + 1));
    highestSubleaf = 0;
    int32_t line = 0;
    EXPECT_EQ(ownCacheSizeLeaf4(fake_cpuid, &line), 64 * 32);
    EXPECT_EQ(highestSubleaf, 31u);
}

}  // namespace
