// Public stubs reach the body of the level in force.
#include <gtest/gtest.h>

#include <cstring>

#include "zortest.h"

#define DECLARE_BODY(index, name, select, need) \
    extern "C" decltype(zoriGetLibVersion) name##_zoriGetLibVersion;
ZOR_LEVEL_LIST(DECLARE_BODY)
#undef DECLARE_BODY

namespace {

using VersionFn = const ZorLibraryVersion* (*)();

VersionFn body_of(int index) {
#define BODY(index, name, select, need) name##_zoriGetLibVersion,
    static const VersionFn bodies[] = {ZOR_LEVEL_LIST(BODY)};
#undef BODY
    return bodies[index];
}

using Dispatch = zortest::LevelTest;

TEST_P(Dispatch, PublicNameReachesTheLevelBody) {
    const zortest::Level& level = GetParam();
    const ZorLibraryVersion* v = zoriGetLibVersion();
    ASSERT_NE(v, nullptr);
    EXPECT_EQ(v, body_of(level.index)());
    EXPECT_STREQ(v->targetCode, level.name);
    // Repeated calls keep landing on the same record.
    EXPECT_EQ(zoriGetLibVersion(), v);
}

TEST_P(Dispatch, SwitchingMovesTheNextCall) {
    const zortest::Level& level = GetParam();
    for (const zortest::Level& other : zortest::all_levels()) {
        if (!zortest::runnable(other)) continue;
        zorSetCpuFeatures(other.select);
        EXPECT_STREQ(zoriGetLibVersion()->targetCode, other.name);
    }
    zorSetCpuFeatures(level.select);
    EXPECT_STREQ(zoriGetLibVersion()->targetCode, level.name);
}

ZOR_INSTANTIATE_LEVELS(Dispatch);

TEST(Dispatch, IndexIsSetBeforeMain) {
    // The library's initialiser ran at load time.
    EXPECT_GE(zorJumpIndexForMergedLibs, 0);
    EXPECT_LE(zorJumpIndexForMergedLibs, 6);
}

TEST(Dispatch, LevelsAreDistinctBodies) {
    const auto& levels = zortest::all_levels();
    ASSERT_EQ(levels.size(), 7u);
    for (size_t i = 0; i < levels.size(); ++i) {
        EXPECT_EQ(levels[i].index, (int)i);
        for (size_t j = 0; j < i; ++j)
            EXPECT_NE((void*)body_of(i), (void*)body_of(j));
    }
}

}  // namespace
