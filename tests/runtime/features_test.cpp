// Level selection: the row table, the checks of a request against the
// detected word, and what is stored whatever the status.
#include <gtest/gtest.h>

#include <cstdlib>

#include "zortest.h"

namespace {

struct RowCase {
    uint64_t request;
    int32_t index;
    uint64_t word;
    ZorStatus status;
};

TEST(FeaturesToIdx, EveryRowInOrder) {
    const RowCase cases[] = {
        {0x7300000, 6, 0x73081df | 0x7300000, zorStsFeaturesCombination},
        {0x73081df, 6, 0x73081df, zorStsNoErr},
        {0x7f00000, 6, 0x7f081df, zorStsFeaturesCombination},  // both AVX-512 sets: row 1 first
        {0xf00000, 5, 0xf081df, zorStsFeaturesCombination},
        {0xf081df, 5, 0xf081df, zorStsNoErr},
        {0x8000, 4, 0x81df, zorStsFeaturesCombination},
        {0x81df, 4, 0x81df, zorStsNoErr},
        {0x8100, 4, 0x81df, zorStsFeaturesCombination},
        {0x100, 3, 0x1df, zorStsFeaturesCombination},
        {0x3df, 3, 0x3df, zorStsNoErr},
        {0x80, 2, 0xdf, zorStsFeaturesCombination},
        {0xff, 2, 0xff, zorStsNoErr},  // MOVBE kept, not required
        {0x40, 1, 0x5f, zorStsFeaturesCombination},
        {0x20, 1, 0x3f, zorStsFeaturesCombination},  // MOVBE pulls in SSSE3, not SSE4.1
        {0x10, 1, 0x1f, zorStsFeaturesCombination},
        {0x1f, 1, 0x1f, zorStsNoErr},
        {0x8, 0, 0xf, zorStsFeaturesCombination},
        {0xf, 0, 0xf, zorStsNoErr},
        {0x4, 0, 0x7, zorStsFeaturesCombination},
        {0x7, 0, 0x7, zorStsNoErr},  // SSE2 alone: index 0, no complaint
        {0x100000, 0, 0x100001, zorStsNotSupportedCpu},  // AVX-512F alone matches no row
        {0x300000 | 0x81df, 4, 0x3081df, zorStsNoErr},   // F/CD without BW/DQ/VL or ER/PF
        {0, 0, 1, zorStsNotSupportedCpu},
        {1, 0, 1, zorStsNotSupportedCpu},
        {2, 0, 3, zorStsNotSupportedCpu},
        {0x10000000000ULL, 0, 0x10000000001ULL, zorStsNotSupportedCpu},
    };
    for (const RowCase& c : cases) {
        uint64_t word = c.request;
        int32_t index = -7;
        EXPECT_EQ(ownFeaturesToIdx(&word, &index), c.status) << std::hex << c.request;
        EXPECT_EQ(index, c.index) << std::hex << c.request;
        EXPECT_EQ(word, c.word) << std::hex << c.request;
    }
}

// The level the processor's own word earns, by the row table.
int32_t expected_index(uint64_t detected) {
    uint64_t word = detected;
    if (!(detected & zorFeatureAVXState)) word &= ~(zorFeatureAVX | zorFeatureAVX2);
    if (!(detected & zorFeatureAVX512State)) word &= ~0x6ff00000ULL;
    int32_t index = 0;
    ownFeaturesToIdx(&word, &index);
    return index;
}

class Selection : public ::testing::Test {
protected:
    void TearDown() override { zorInit(); }
    uint64_t detected = zortest::detected_features();
};

TEST_F(Selection, InitPicksTheBestLevelWhateverTheVendor) {
    const ZorStatus status = zorInit();
    EXPECT_EQ(zorJumpIndexForMergedLibs, expected_index(detected));
    if (!zor_is_GenuineTarvo()) EXPECT_EQ(status, zorStsNonTarvoCpu);
    EXPECT_STREQ(zoriGetLibVersion()->targetCode, zortest::all_levels()[expected_index(detected)].name);
}

TEST_F(Selection, EmptyRequestGivesLevelZeroAndMaskOne) {
    EXPECT_EQ(zorSetCpuFeatures(0), zorStsNotSupportedCpu);
    EXPECT_EQ(zorJumpIndexForMergedLibs, 0);
    EXPECT_EQ(zorGetEnabledCpuFeatures(), 1u);
}

TEST_F(Selection, IncompleteRequestIsCompletedAndReported) {
    if ((detected & 0x83df) != 0x83df) GTEST_SKIP() << "needs AVX2";
    EXPECT_EQ(zorSetCpuFeatures(zorFeatureAVX2), zorStsFeaturesCombination);
    EXPECT_EQ(zorJumpIndexForMergedLibs, 4);
    EXPECT_EQ(zorGetEnabledCpuFeatures(), 0x81dfu);
    EXPECT_EQ(zorSetCpuFeatures(0x81df), zorStsNoErr);
    EXPECT_EQ(zorJumpIndexForMergedLibs, 4);
    EXPECT_STREQ(zoriGetLibVersion()->targetCode, "l9");
}

TEST_F(Selection, UnknownBitEndsAsNotSupportedAndStays) {
    const uint64_t bit40 = 1ULL << 40;
    EXPECT_EQ(zorSetCpuFeatures(0xf | bit40), zorStsFeatureNotSupported);
    EXPECT_EQ(zorJumpIndexForMergedLibs, 0);
    EXPECT_EQ(zorGetEnabledCpuFeatures(), 0xf | bit40);
}

TEST_F(Selection, MissingFeatureStillSwitches) {
    // A bit the processor lacks: the status says so, the request is honoured.
    // Bits of the AVX and AVX-512 groups are dropped instead when the system
    // does not keep their state, so they are not asked for here.
    uint64_t missing = 0;
    for (uint64_t bit = 1; bit < (1ULL << 33) && !missing; bit <<= 1)
        if (!(detected & bit) && bit != 0x1000 && !(bit & 0x6ff08100)) missing = bit;
    if (!missing) GTEST_SKIP() << "processor has every feature";
    EXPECT_EQ(zorSetCpuFeatures(0xdf | missing), zorStsFeatureNotSupported);
    EXPECT_TRUE(zorGetEnabledCpuFeatures() & missing);
}

TEST_F(Selection, InitUndoesNarrowing) {
    zorSetCpuFeatures(0xf);
    EXPECT_EQ(zorJumpIndexForMergedLibs, 0);
    EXPECT_STREQ(zoriGetLibVersion()->targetCode, "m7");
    zorInit();
    EXPECT_EQ(zorJumpIndexForMergedLibs, expected_index(detected));
}

// The no-check bit rewrites the detected word for good, so each of these
// runs in a child process. The child exits 0 when every expectation held.
#define IN_CHILD(body)                                          \
    EXPECT_EXIT(                                                \
        {                                                       \
            body;                                               \
            std::exit(::testing::Test::HasFailure() ? 1 : 0);   \
        },                                                      \
        ::testing::ExitedWithCode(0), "")

// Makes `word` the detected word of this process.
void pretend_processor(uint64_t word) {
    zorSetCpuFeaturesMask(word);
    int32_t index = 0;
    ownSetCpuFeaturesAndIdx(zorFeatureNoCheck, &index);
}

TEST(SelectionDeathTest, NoCheckTakesTheWordAndReplacesDetection) {
    IN_CHILD({
        const uint64_t before = zorGetEnabledCpuFeatures();
        zorSetCpuFeaturesMask(0x7);  // as if the processor had SSE2 only
        EXPECT_EQ(zorSetCpuFeatures(zorFeatureNoCheck | 0x81df), zorStsNoErr);
        EXPECT_EQ(zorJumpIndexForMergedLibs, 4);
        EXPECT_EQ(zorGetEnabledCpuFeatures(), 0x81dfu);
        uint64_t now = 0;
        zorGetCpuFeatures(&now, nullptr);
        EXPECT_EQ(now, 0x7u);
        // From now on selection works from that word, not the hardware.
        zorInit();
        EXPECT_EQ(zorJumpIndexForMergedLibs, 0);
        EXPECT_EQ(zorGetEnabledCpuFeatures(), 0x7u);
        (void)before;
    });
}

TEST(SelectionDeathTest, AvxWithoutSystemStateIsDropped) {
    IN_CHILD({
        pretend_processor(0x81df);  // AVX and AVX2, but no AVX state bit
        EXPECT_EQ(zorSetCpuFeatures(0x81df), zorStsFeatureNotSupported);
        EXPECT_EQ(zorJumpIndexForMergedLibs, 2);  // 0x81df less AVX/AVX2 is SSE4.2
        EXPECT_EQ(zorGetEnabledCpuFeatures(), 0xdfu);
        // The detected word still shows the processor's AVX bits.
        uint64_t now = 0;
        zorGetCpuFeatures(&now, nullptr);
        EXPECT_EQ(now, 0x81dfu);
        const ZorStatus status = zorInit();
        EXPECT_EQ(status, zor_is_GenuineTarvo() ? zorStsFeatureNotSupported : zorStsNonTarvoCpu);
        EXPECT_EQ(zorJumpIndexForMergedLibs, 2);
    });
}

TEST(SelectionDeathTest, Avx512WithoutSystemStateKeepsMpx) {
    IN_CHILD({
        pretend_processor(0x3ff083df | zorFeatureMPX);  // no AVX512State bit
        EXPECT_EQ(zorSetCpuFeatures(0x73081df | zorFeatureMPX), zorStsFeatureNotSupported);
        EXPECT_EQ(zorJumpIndexForMergedLibs, 4);
        EXPECT_EQ(zorGetEnabledCpuFeatures(), 0x81df | zorFeatureMPX);
    });
}

TEST(SelectionDeathTest, ProcessorWithoutSse2) {
    IN_CHILD({
        pretend_processor(0x3);
        const ZorStatus status = zorInit();
        EXPECT_EQ(status, zor_is_GenuineTarvo() ? zorStsNotSupportedCpu : zorStsNonTarvoCpu);
        EXPECT_EQ(zorJumpIndexForMergedLibs, 0);
        EXPECT_EQ(zorGetEnabledCpuFeatures(), 0x3u);
        // Nothing refuses the call: the m7 body runs.
        EXPECT_STREQ(zoriGetLibVersion()->targetCode, "m7");
    });
}

TEST(SelectionDeathTest, UnknownBitBeatsNothingButItself) {
    IN_CHILD({
        // With the unknown bit "present" in the detected word the walk finds
        // nothing missing, and 50 survives.
        const uint64_t bit40 = 1ULL << 40;
        pretend_processor(0xf | bit40);
        EXPECT_EQ(zorSetCpuFeatures(0xf | bit40), zorStsUnknownFeature);
        EXPECT_EQ(zorJumpIndexForMergedLibs, 0);
    });
}

}  // namespace
