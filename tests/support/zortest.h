// Test harness: runs a test body once per processor level, forcing the
// level with zorSetCpuFeatures and restoring the processor's own choice
// afterwards. Levels this processor cannot run are reported as skipped.
#ifndef ZOR_TEST_HARNESS_H
#define ZOR_TEST_HARNESS_H

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "zor.h"
#include "zor_levels.h"

namespace zortest {

struct Level {
    int index;
    const char* name;
    uint64_t select;  // feature word that selects the level
    uint64_t need;    // bits the level's code needs from processor and system
};

const std::vector<Level>& all_levels();
uint64_t detected_features();
bool runnable(const Level& level);

// Fixture for per-level tests; GetParam() is the level in force.
class LevelTest : public ::testing::TestWithParam<Level> {
protected:
    void SetUp() override;
    void TearDown() override;
};

std::string level_test_name(const ::testing::TestParamInfo<Level>& info);

}  // namespace zortest

#define ZOR_INSTANTIATE_LEVELS(Suite)                                                    \
    INSTANTIATE_TEST_SUITE_P(Level, Suite, ::testing::ValuesIn(zortest::all_levels()), \
                             zortest::level_test_name)

#endif
