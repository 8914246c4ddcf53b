#include "zortest.h"

namespace zortest {

const std::vector<Level>& all_levels() {
#define ZOR_TEST_LEVEL(index, name, select, need) {index, #name, select, need},
    static const std::vector<Level> levels = {ZOR_LEVEL_LIST(ZOR_TEST_LEVEL)};
#undef ZOR_TEST_LEVEL
    return levels;
}

uint64_t detected_features() {
    uint64_t features = 0;
    zorGetCpuFeatures(&features, nullptr);
    return features;
}

bool runnable(const Level& level) {
    return (detected_features() & level.need) == level.need;
}

void LevelTest::SetUp() {
    const Level& level = GetParam();
    if (!runnable(level)) {
        GTEST_SKIP() << "processor or system lacks features 0x" << std::hex
                     << (level.need & ~detected_features()) << " of level " << level.name;
    }
    zorSetCpuFeatures(level.select);
    ASSERT_EQ(zorJumpIndexForMergedLibs, level.index) << "could not force level " << level.name;
}

void LevelTest::TearDown() {
    zorInit();
}

std::string level_test_name(const ::testing::TestParamInfo<Level>& info) {
    return info.param.name;
}

}  // namespace zortest
