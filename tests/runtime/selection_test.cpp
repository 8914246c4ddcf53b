// Processor identification against a direct reading of CPUID and XGETBV
// made here, and level selection through the public calls.
#include <cpuid.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <iterator>
#include <string>

#include "zortest.h"

namespace {

struct Regs {
    uint32_t r[4];  // EAX, EBX, ECX, EDX
};

Regs cpuid(uint32_t leaf, uint32_t subleaf = 0) {
    Regs x;
    __cpuid_count(leaf, subleaf, x.r[0], x.r[1], x.r[2], x.r[3]);
    if (leaf == 1) x.r[1] &= 0x00ffffffu;  // APIC id of whichever core runs us
    return x;
}

uint32_t bit(uint32_t reg, int n) { return (reg >> n) & 1u; }
uint32_t max_leaf() { return cpuid(0).r[0]; }
uint32_t max_ext_leaf() { return cpuid(0x80000000u).r[0]; }

std::string vendor_of(const uint32_t r[4]) {  // EBX, EDX, ECX
    char s[13] = {};
    std::memcpy(s, &r[1], 4);
    std::memcpy(s + 4, &r[3], 4);
    std::memcpy(s + 8, &r[2], 4);
    return s;
}
bool tarvo() { return vendor_of(cpuid(0).r) == "GenuineTarvo"; }

uint64_t xcr0() {
    uint32_t lo, hi;
    __asm__ volatile("xgetbv" : "=a"(lo), "=d"(hi) : "c"(0));
    return ((uint64_t)hi << 32) | lo;
}
bool avx_state() { return (cpuid(1).r[2] & 0x18000000u) == 0x18000000u && (xcr0() & 6) == 6; }
bool avx512_state() { return bit(cpuid(1).r[2], 27) && (xcr0() & 0xe0) == 0xe0; }

// The feature word from the bit table of the description.
uint64_t model_features() {
    static const struct {
        uint32_t leaf;
        int reg, bit;
        uint64_t value;
    } rules[] = {
        {1, 3, 23, 0x1}, {1, 3, 25, 0x2}, {1, 3, 26, 0x4}, {1, 2, 0, 0x8}, {1, 2, 9, 0x10},
        {1, 2, 22, 0x20}, {1, 2, 19, 0x40}, {1, 2, 20, 0x80}, {1, 2, 28, 0x100}, {1, 2, 25, 0x400},
        {1, 2, 1, 0x800}, {1, 2, 30, 0x2000}, {1, 2, 29, 0x4000}, {7, 1, 19, 0x10000},
        {7, 1, 18, 0x20000}, {7, 1, 29, 0x80000}, {7, 1, 16, 0x100000}, {7, 1, 28, 0x200000},
        {7, 1, 27, 0x400000}, {7, 1, 26, 0x800000}, {7, 1, 30, 0x1000000}, {7, 1, 17, 0x2000000},
        {7, 1, 31, 0x4000000}, {7, 2, 1, 0x8000000}, {7, 1, 14, 0x10000000}, {7, 3, 3, 0x20000000},
        {7, 3, 2, 0x40000000}, {7, 1, 21, 0x100000000ULL},
    };
    const Regs l1 = cpuid(1);
    uint64_t w = avx_state() ? 0x200 : 0;
    for (const auto& b : rules)
        if ((b.leaf == 1 || max_leaf() >= 7) && bit(cpuid(b.leaf).r[b.reg], b.bit)) w |= b.value;
    if (max_leaf() >= 7) {
        const uint32_t ebx7 = cpuid(7).r[1];
        if (bit(l1.r[2], 12) && bit(ebx7, 5) && bit(ebx7, 3) && bit(ebx7, 8)) w |= 0x8000;
        if (avx512_state()) w |= 0x200000000ULL;
    }
    if (max_ext_leaf() >= 0x80000001u && bit(cpuid(0x80000001u).r[2], 8)) w |= 0x40000;
    if ((l1.r[0] & 0xff0) == 0xb10) w |= 0x80000000ULL;
    return w;
}

TEST(Cpu, DetectedWordAndRegisters) {
    const uint64_t getinfo = 0x616f666e69746567ULL;  // "getinfoa"
    uint32_t regs[4] = {0xa5u, 1, 2, 3};
    EXPECT_EQ(zorGetCpuFeatures(nullptr, regs), zorStsNullPtrErr);
    EXPECT_TRUE(regs[0] == 0xa5u && regs[1] == 1 && regs[2] == 2 && regs[3] == 3);
    // Leaf 1 without the request word; leaf pRegs[0], subleaf pRegs[2] with it.
    const struct {
        uint64_t word;
        uint32_t leaf, subleaf;
        Regs want;
    } cases[] = {{getinfo + 1, 0, 0, cpuid(1)}, {getinfo, 0, 0, cpuid(0)}, {getinfo, 4, 1, cpuid(4, 1)}};
    for (const auto& c : cases) {
        uint64_t word = c.word;
        uint32_t r[4] = {c.leaf, 0, c.subleaf, 0};
        ASSERT_EQ(zorGetCpuFeatures(&word, r), zorStsNoErr);
        EXPECT_EQ(word, model_features()) << std::hex << "differs in 0x" << (word ^ model_features());
        if (c.word != getinfo) r[1] &= 0x00ffffffu;  // leaf 1: APIC id
        EXPECT_EQ(std::memcmp(r, c.want.r, 16), 0) << std::hex << c.word << " leaf " << c.leaf;
    }
    for (uint32_t leaf : {0u, 1u, 7u, 0x80000000u}) {
        uint32_t raw[4];
        EXPECT_EQ(zor_get_cpuid(raw, leaf, 0), 0);
        raw[1] &= leaf == 1 ? 0x00ffffffu : ~0u;
        EXPECT_EQ(std::memcmp(raw, cpuid(leaf).r, 16), 0) << std::hex << leaf;
    }
}

TEST(Cpu, SingleBitTestsAndIdentity) {
    const Regs l1 = cpuid(1), l2 = cpuid(2);
    const uint32_t eax = l1.r[0], ecx = l1.r[2], edx = l1.r[3], maxExt = max_ext_leaf();
    const uint32_t x8664 = maxExt >= 0x80000001u ? bit(cpuid(0x80000001u).r[3], 29) : 0;
    const uint32_t htt = bit(edx, 28) && ((l1.r[1] >> 16) & 0xff) > 1;
    const int64_t tests[][2] = {
        {zor_has_cpuid(), 1}, {zor_has_rdtsc(), bit(edx, 4)}, {zor_is_mmx_extension(), bit(edx, 23)},
        {zor_is_ssx_extension(), bit(edx, 25)}, {zor_is_wni_extension(), bit(edx, 26)},
        {zor_is_pni_extension(), bit(ecx, 0)}, {zor_is_htt_extension(), htt}, {zor_is_mni_extension(), bit(ecx, 9)},
        {zor_is_sse41_extension(), bit(ecx, 19)}, {zor_is_sse42_extension(), bit(ecx, 20)},
        {zor_is_movbe(), bit(ecx, 22)}, {zor_is_avx_extension(), avx_state()},
        {zor_is_avx512_extension(), avx512_state()}, {zor_is_GenuineTarvo(), tarvo()},
        {zor_max_cpuid_input(), max_leaf()}, {zor_is_x8664_extension(), maxExt >= 0x80000001u ? x8664 : maxExt},
    };
    for (size_t i = 0; i < std::size(tests); ++i) EXPECT_EQ(tests[i][0], tests[i][1]) << "test " << i;
    // The record's words in order; the ninth is never written.
    const uint32_t want[] = {(eax >> 8) & 0xf, eax & 0xf, (eax >> 4) & 0xf, (eax >> 11) & 3, edx, l2.r[0],
                             l2.r[3], bit(edx, 23), 0x5a5a5a5a, bit(edx, 25), bit(edx, 26), htt, bit(ecx, 0),
                             x8664, bit(ecx, 9), (uint32_t)zor_get_cores_on_die(), bit(ecx, 19), bit(ecx, 20),
                             (eax >> 20) & 0xff, (eax >> 16) & 0xf, bit(ecx, 22), bit(ecx, 28), bit(ecx, 27)};
    static_assert(sizeof want == sizeof(ZorQuindleIdent), "one word per field");
    uint32_t got[std::size(want)];
    std::memset(got, 0x5a, sizeof got);
    zor_get_quindle_ident((ZorQuindleIdent*)got);
    for (size_t i = 0; i < std::size(want); ++i) EXPECT_EQ(got[i], want[i]) << "word " << i;
}

TEST(Cpu, CacheAndCoresFollowVendorRules) {
    EXPECT_EQ(zorGetMaxCacheSizeB(nullptr), zorStsNullPtrErr);
    if (tarvo() && max_leaf() >= 2 && max_leaf() < 4) GTEST_SKIP() << "leaf 2 decoding: internal test";
    int32_t wantSize = -1, wantLine = 0;  // other vendors: -1 and 36, every time
    ZorStatus wantStatus = zorStsNotSupportedCpu;
    if (tarvo()) {
        for (uint32_t sub = 0; sub < 32; ++sub) {
            const Regs c = cpuid(4, sub);
            if ((c.r[0] & 0x1f) == 0) break;
            const int32_t size = (int32_t)(((c.r[1] >> 22) + 1) * (((c.r[1] >> 12) & 0x3ff) + 1) *
                                           ((c.r[1] & 0xfff) + 1) * (c.r[2] + 1));
            if ((c.r[0] & 0x1f) != 2 && size > wantSize) wantSize = size, wantLine = (c.r[1] & 0xfff) + 1;
        }
        wantStatus = wantSize >= 0 ? zorStsNoErr : zorStsUnknownCacheSize;
        wantSize = wantSize < 0 ? 0 : wantSize;
    }
    for (int round = 0; round < 2; ++round) {
        int32_t size = 12345, line = 12345;
        EXPECT_EQ(zorGetMaxCacheSizeB(&size), wantStatus);
        zor_get_cache_line_size(&line);
        EXPECT_EQ(size, wantSize);
        EXPECT_EQ(line, wantLine);
    }
    const int32_t simple = max_leaf() >= 4 ? (int32_t)(cpuid(4).r[0] >> 26) + 1 : 1;
    int32_t cores = 1;
    if (tarvo() && max_leaf() >= 11 && cpuid(11).r[1] != 0)
        cores = (int32_t)(cpuid(11, 1).r[1] >> bit(cpuid(11).r[1], 1));
    else if (tarvo())
        cores = simple;
    else if (cpuid(0).r[2] == 0x444d4163u && (max_ext_leaf() & 0xf) >= 8)
        cores = (int32_t)cpuid(0x80000008u).r[2] + 1;  // the whole register
    EXPECT_EQ(zor_get_cores_on_die(), simple);
    EXPECT_EQ(zorGetNumCoresOnDie(), cores);
}

// The level the processor earns: the highest whose full word it has.
int32_t expected_index() {
    int32_t best = 0;
    for (const zortest::Level& level : zortest::all_levels())
        if (zortest::runnable(level) && (zortest::detected_features() & level.select) == level.select)
            best = level.index;
    return best;
}

class Selection : public ::testing::Test {
protected:
    void TearDown() override { zorInit(); }
    const uint64_t detected = zortest::detected_features();
};

TEST_F(Selection, RequestsSwitchWhateverTheStatus) {
    const ZorStatus init = zorInit();
    if (!tarvo()) EXPECT_EQ(init, zorStsNonTarvoCpu);
    EXPECT_EQ(zorJumpIndexForMergedLibs, expected_index());
    EXPECT_STREQ(zoriGetLibVersion()->targetCode, zortest::all_levels()[expected_index()].name);
    const uint64_t bit40 = 1ULL << 40;
    uint64_t missing = 0;  // a bit the processor lacks, outside the AVX groups
    for (uint64_t b = 1; b < (1ULL << 33) && !missing; b <<= 1)
        if (!(detected & b) && b != 0x1000 && !(b & 0x6ff08100)) missing = b;
    const struct {
        uint64_t request;
        ZorStatus status;
        int32_t index;
        uint64_t mask;
    } cases[] = {
        {0, zorStsNotSupportedCpu, 0, 1},
        {0xf, zorStsNoErr, 0, 0xf},
        {0xf | bit40, zorStsFeatureNotSupported, 0, 0xf | bit40},  // 49 beats 50, the bit stays
        {missing ? 0xdf | missing : 0xdf, missing ? zorStsFeatureNotSupported : zorStsNoErr, 2, 0xdf | missing},
        {0x8000, zorStsFeaturesCombination, 4, 0x81df},
        {0x81df, zorStsNoErr, 4, 0x81df},
    };
    for (const auto& c : cases) {
        if ((c.mask & 0x8000) && (detected & 0x83df) != 0x83df) continue;
        EXPECT_EQ(zorSetCpuFeatures(c.request), c.status) << std::hex << c.request;
        EXPECT_EQ(zorJumpIndexForMergedLibs, c.index) << std::hex << c.request;
        EXPECT_EQ(zorGetEnabledCpuFeatures(), c.mask) << std::hex << c.request;
        EXPECT_STREQ(zoriGetLibVersion()->targetCode, zortest::all_levels()[c.index].name);
    }
    zorInit();  // undoes the narrowing
    EXPECT_EQ(zorJumpIndexForMergedLibs, expected_index());
}

TEST_F(Selection, MaskAloneLeavesDispatch) {
    const int32_t index = zorJumpIndexForMergedLibs;
    const ZorLibraryVersion* level = zoriGetLibVersion();
    EXPECT_EQ(zorSetCpuFeaturesMask(0), zorStsNoErr);
    EXPECT_EQ(zorGetEnabledCpuFeatures(), 0u);
    EXPECT_EQ(zorJumpIndexForMergedLibs, index);
    EXPECT_EQ(zoriGetLibVersion(), level);
}

// The no-check bit rewrites the detected word for good, so each case runs
// in a child process that exits 0 when every expectation held.
#define IN_CHILD(body) \
    EXPECT_EXIT({ body; std::exit(::testing::Test::HasFailure()); }, ::testing::ExitedWithCode(0), "")

TEST(SelectionDeathTest, PretendedProcessors) {
    const ZorStatus nonTarvo = zorStsNonTarvoCpu;
    const struct {
        uint64_t processor, request;
        ZorStatus status, init;
        int32_t index;
        uint64_t mask;
    } cases[] = {
        // No check: the request is taken as it is, the old mask becomes detection.
        {0x7, zorFeatureNoCheck | 0x81df, zorStsNoErr, zorStsNoErr, 4, 0x81df},
        // AVX without its system state: dropped, the level falls to SSE4.2.
        {0x81df, 0x81df, zorStsFeatureNotSupported, zorStsFeatureNotSupported, 2, 0xdf},
        // AVX-512 without its state: the group goes, MPX stays.
        {0x3ff083df | zorFeatureMPX, 0x73081df | zorFeatureMPX, zorStsFeatureNotSupported,
         zorStsFeatureNotSupported, 4, 0x81df | zorFeatureMPX},
        // No SSE2: level 0 all the same, and the m7 body runs.
        {0x3, 0x3, zorStsNotSupportedCpu, zorStsNotSupportedCpu, 0, 0x3},
        // An unknown bit the "processor" has: nothing missing, so 50 survives.
        {0xf | 1ULL << 40, 0xf | 1ULL << 40, zorStsUnknownFeature, zorStsUnknownFeature, 0, 0xf | 1ULL << 40},
    };
    for (const auto& c : cases) {
        IN_CHILD({
            zorSetCpuFeaturesMask(c.processor);  // becomes the detected word:
            if (!(c.request & zorFeatureNoCheck)) zorSetCpuFeatures(zorFeatureNoCheck);
            EXPECT_EQ(zorSetCpuFeatures(c.request), c.status);
            EXPECT_EQ(zorJumpIndexForMergedLibs, c.index);
            EXPECT_EQ(zorGetEnabledCpuFeatures(), c.mask);
            uint64_t now = 0;
            zorGetCpuFeatures(&now, nullptr);
            EXPECT_EQ(now, c.processor);  // the processor's bits stay detected
            if (!(c.request & zorFeatureNoCheck)) {
                EXPECT_EQ(zorInit(), tarvo() ? c.init : nonTarvo);
                EXPECT_EQ(zorJumpIndexForMergedLibs, c.index);
                EXPECT_STREQ(zoriGetLibVersion()->targetCode, zortest::all_levels()[c.index].name);
            }
        });
    }
}

}  // namespace
