// Internal steps of the runtime, linked from its objects: the selection
// rows, the mask test, and cache decoding fed with recorded answers.
#include <gtest/gtest.h>

#include <vector>

#include "runtime_internal.h"
#include "zor_levels.h"

namespace {

TEST(FeaturesToIdx, RowsOfTheLevelTable) {
    struct Case {
        uint64_t request;
        int32_t index;
        uint64_t word;
        ZorStatus status;
    };
    std::vector<Case> cases = {
        // Facts of the description the table must keep.
        {0x8000, 4, 0x81df, zorStsFeaturesCombination},
        {0x7f00000, 6, 0x7f081df, zorStsFeaturesCombination},  // both AVX-512 sets: row 1 first
        {0x20, 1, 0x3f, zorStsFeaturesCombination},            // MOVBE pulls in SSSE3 only
        {0xff, 2, 0xff, zorStsNoErr},                          // MOVBE kept, not required
        {0x7, 0, 0x7, zorStsNoErr},                            // SSE2 alone: no complaint
        {0x300000 | 0x81df, 4, 0x3081df, zorStsNoErr},         // F/CD alone is no AVX-512 row
        {0x100000, 0, 0x100001, zorStsNotSupportedCpu},
        {0, 0, 1, zorStsNotSupportedCpu},
        {2, 0, 3, zorStsNotSupportedCpu},
        {1ULL << 40, 0, (1ULL << 40) | 1, zorStsNotSupportedCpu},
    };
    // Every row: its test bits alone are completed, its required word is not.
#define ROW_CASES(test, index, required)                                                          \
    cases.push_back({test, index, (test) | (required),                                             \
                     ((test) & (required)) == (required) ? zorStsNoErr : zorStsFeaturesCombination}); \
    cases.push_back({required, index, required, zorStsNoErr});
    ZOR_SELECT_ROWS(ROW_CASES)
#undef ROW_CASES
    for (const Case& c : cases) {
        uint64_t word = c.request;
        int32_t index = -7;
        EXPECT_EQ(ownFeaturesToIdx(&word, &index), c.status) << std::hex << c.request;
        EXPECT_EQ(index, c.index) << std::hex << c.request;
        EXPECT_EQ(word, c.word) << std::hex << c.request;
    }
}

TEST(FeatureMask, AllGivenBitsMustBeEnabled) {
    ownSetFeatureMask(0x10008000);
    EXPECT_EQ(ownGetFeature(0), 1);
    EXPECT_EQ(ownGetFeature(0x10008000), 1);
    EXPECT_EQ(ownGetFeature(0x8000), 1);
    EXPECT_EQ(ownGetFeature(0x10008001), 0);
    ownSetFeatureMask(7);
}

int32_t leaf2(uint32_t eax, uint32_t ebx = 0, uint32_t ecx = 0, uint32_t edx = 0) {
    const uint32_t regs[4] = {eax, ebx, ecx, edx};
    return ownCacheSizeLeaf2(regs, ownCacheTable);
}

// The table in the order of the description, each descriptor decoded
// wherever it stands in the answer.
TEST(CacheLeaf2, EveryDescriptorInOrderAndInEveryPosition) {
    const struct {
        int32_t bytes;
        std::vector<int32_t> descriptors;
    } groups[] = {
        {25165824, {236}}, {18874368, {235}}, {16777216, {77}}, {12582912, {234, 76}},
        {8388608, {228, 222, 75, 71}}, {6291456, {78, 74}}, {4194304, {227, 221, 216, 73, 41, 70}},
        {3145728, {72}}, {2097152, {226, 220, 215, 210, 37, 125, 133, 69}},
        {1048576, {214, 209, 35, 135, 124, 120, 132, 68}},
        {524288, {208, 34, 123, 128, 134, 62, 127, 131, 67}}, {393216, {61}},
        {262144, {33, 122, 130, 60, 63, 66}}, {196608, {58}}, {131072, {121, 57, 59, 65}},
    };
    int row = 0;
    for (const auto& g : groups)
        for (int32_t d : g.descriptors) {
            EXPECT_EQ(ownCacheTable[2 * row], d) << "row " << row;
            EXPECT_EQ(ownCacheTable[2 * row + 1], g.bytes) << "row " << row;
            ++row;
            for (int at = 1; at < 16; ++at) {  // byte 0 is the count
                if (at % 4 == 3 && d >= 0x80) continue;  // would set bit 31
                uint32_t regs[4] = {1, 0, 0, 0};
                regs[at / 4] |= (uint32_t)d << (8 * (at % 4));
                EXPECT_EQ(ownCacheSizeLeaf2(regs, ownCacheTable), g.bytes) << d << " at byte " << at;
            }
        }
    EXPECT_EQ(row, 55);
    EXPECT_TRUE(ownCacheTable[110] == 0 && ownCacheTable[111] == 0);  // row 56 ends it
}

TEST(CacheLeaf2, DecodingRules) {
    const struct {
        const char* what;
        uint32_t eax, ebx, ecx, edx;
        int32_t bytes;
    } cases[] = {
        {"iteration count must be 1", 0x00004d02, 0, 0, 0, -1},
        {"count 1 in the low byte only", 0x00014d01, 0, 0, 0, 16777216},
        {"largest wins across registers", 0x00797901, 0x3a, 0x49, 0x4d000000, 16777216},
        {"unknown descriptors", 0x00fffe01, 0x2c2b2a28, 0x10203040, 0x0f0e0d0c, -1},
        {"bit 31 hides EBX", 0x00000001, 0x8000004d, 0x79, 0, 131072},
        {"bit 31 hides EDX", 0x00000001, 0, 0, 0xec000000, -1},
        {"all absent", 0x80000001, 0x80000000, 0xffffffff, 0x80000000, -1},
        // With EAX absent the string starts at EBX, whose first byte is
        // still taken for the count.
        {"EAX absent, first byte skipped", 0x80004d01, 0x00000049, 0, 0, -1},
        {"EAX absent, later bytes used", 0x80004d01, 0x00004900, 0, 0, 4194304},
    };
    for (const auto& c : cases) EXPECT_EQ(leaf2(c.eax, c.ebx, c.ecx, c.edx), c.bytes) << c.what;
    // The first matching row of the given table wins, and its (0, 0) row ends it.
    const int32_t table[] = {1, 999, 0x49, 7, 0, 0, 0x4d, 5};
    const uint32_t both[4] = {0x00490101, 0, 0, 0}, pastEnd[4] = {0x00004d01, 0, 0, 0};
    EXPECT_EQ(ownCacheSizeLeaf2(both, table), 999);
    EXPECT_EQ(ownCacheSizeLeaf2(pastEnd, table), -1);
}

// Leaf 4 answers by subleaf for the fake CPUID; zeros past the end.
std::vector<std::vector<uint32_t>> fakeLeaf4;
uint32_t highestSubleaf;

void fake_cpuid(uint32_t regs[4], uint32_t leaf, uint32_t subleaf) {
    EXPECT_EQ(leaf, 4u);
    highestSubleaf = subleaf > highestSubleaf ? subleaf : highestSubleaf;
    for (int i = 0; i < 4; ++i) regs[i] = subleaf < fakeLeaf4.size() ? fakeLeaf4[subleaf][i] : 0;
}

std::vector<uint32_t> cache(uint32_t type, uint32_t ways, uint32_t parts, uint32_t line, uint32_t sets) {
    // Level and flag bits above the type field must not disturb it.
    return {type | 2u << 5 | 1u << 8 | 5u << 26, (ways - 1) << 22 | (parts - 1) << 12 | (line - 1),
            sets - 1, 0x2};
}

TEST(CacheLeaf4, WalkFindsLargestDataOrUnifiedCache) {
    const std::vector<uint32_t> end = {0x00000120, 0x01c0003f, 0x3f, 0};  // type 0
    std::vector<std::vector<uint32_t>> many;
    for (uint32_t i = 0; i < 40; ++i) many.push_back(cache(3, 1, 1, 64, i + 1));
    const struct {
        const char* what;
        std::vector<std::vector<uint32_t>> leaves;
        int32_t bytes, line;
        uint32_t lastSubleaf;
    } cases[] = {
        {"instruction cache skipped", {cache(1, 8, 1, 64, 64), cache(2, 64, 4, 64, 16384),
                                        cache(3, 12, 1, 64, 16384), end}, 12582912, 64, 3},
        {"stops at type 0", {cache(1, 8, 1, 64, 64), end, cache(3, 16, 1, 64, 65536)}, 32768, 64, 1},
        {"equal size keeps the first", {cache(1, 8, 1, 64, 64), cache(3, 8, 1, 128, 32), end}, 32768, 64, 2},
        {"partitions, other types", {cache(1, 8, 1, 64, 64), cache(4, 8, 2, 32, 256), end}, 131072, 32, 2},
        {"instruction caches only", {cache(2, 8, 1, 64, 64), end}, -1, -2, 1},
        {"ends after subleaf 31", many, 64 * 32, 64, 31},
    };
    for (const auto& c : cases) {
        fakeLeaf4 = c.leaves;
        highestSubleaf = 0;
        int32_t line = -2;
        EXPECT_EQ(ownCacheSizeLeaf4(fake_cpuid, &line), c.bytes) << c.what;
        EXPECT_EQ(line, c.line) << c.what;
        EXPECT_EQ(highestSubleaf, c.lastSubleaf) << c.what;
    }
}

}  // namespace
