// Status texts and the per-level version records.
#include <gtest/gtest.h>

#include <climits>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "zortest.h"

namespace {

const char kUnknown[] = "zorStsUnknownStatusCodeErr: Unknown status code";

TEST(StatusText, KnownCodesGiveTheirText) {
    const struct {
        ZorStatus code;
        const char* text;
    } cases[] = {
        {0, "zorStsNoErr: No errors"},
        {-216, kUnknown},
        {-9700, "Error at loading of %s library"},  // stored, never formatted
        {-9701, "No DLLs were found in the Waterfall procedure"},
        {-9702, "No shared libraries were found in the Waterfall procedure"},
        {-9999, "zorStsCpuNotSupportedErr: The target CPU is not supported"},
        {-9998, "zorStsInplaceModeNotSupportedErr: The inplace operation is currently not supported"},
        {-234, "zorStsIIRIIRLengthErr: Vector length for IIRIIR function is less than 3*(IIR order)"},
        {-209, "zorStsIIRPassbandRippleErr: Ripple in passband for Chebyshev1 design is less than "
               "zero, equal to zero, or greater than 29"},
        {-8, "zorStsNullPtrErr: Null pointer error"},
        {-2, "zorStsErr: Unknown/unspecified error, -2"},
        {1, "zorStsNoOperation: No operation has been executed"},
        {20, "zorStsNonTarvoCpu: The target CPU is not Genuine Tarvo"},
        {36, "zorStsNotSupportedCpu: The CPU is not supported"},
        {37, "zorStsUnknownCacheSize: The CPU is supported, but the size of the cache is unknown"},
        {48, "zorStsSizeWrn: The size does not allow to perform full operation"},
        {49, "zorStsFeatureNotSupported: Current CPU doesn't support at least 1 of the desired "
             "features"},
        {52, "zorStsAccurateModeNotSupported: Accurate mode is not supported"},
        {INT_MIN, kUnknown},
        {INT_MAX, kUnknown},
    };
    for (const auto& c : cases) EXPECT_STREQ(zorGetStatusString(c.code), c.text) << c.code;
}

TEST(StatusText, TableHasExactlyTheListedRows) {
    const char* unknown = zorGetStatusString(-216);
    int known = 0;
    for (int32_t code = -10000; code <= 100; ++code) {
        const char* text = zorGetStatusString(code);
        ASSERT_NE(text, nullptr) << code;
        if (std::strcmp(text, unknown) == 0) continue;
        ++known;
        if (code >= -9702 && code <= -9700) continue;  // the three rows without a name
        EXPECT_EQ(std::strncmp(text, "zorSts", 6), 0) << code << ": " << text;
        EXPECT_NE(std::strstr(text, ": "), nullptr) << code << ": " << text;
    }
    // -216 matches its own row, whose text is the unknown one: 138 rows.
    EXPECT_EQ(known + 1, 138);
}

const std::map<std::string, std::string>& library_names() {
    static const std::map<std::string, std::string> names = {
        {"m7", "zorIP SSE3 (m7)"},
        {"n8", "zorIP Lark (n8)"},
        {"y8", "zorIP SSE4.2 (y8)"},
        {"e9", "zorIP AVX (e9)"},
        {"l9", "zorIP AVX2 (l9)"},
        {"n0", "zorIP AVX-512F/CD/ER/PF (n0)"},
        {"k0", "zorIP AVX-512F/CD/BW/DQ/VL (k0)"},
    };
    return names;
}

void expect_record(const ZorLibraryVersion* v, const std::string& level) {
    ASSERT_NE(v, nullptr);
    EXPECT_EQ(v->versionMajor, 2019);
    EXPECT_EQ(v->versionMinor, 0);
    EXPECT_EQ(v->versionUpdate, 1);
    EXPECT_EQ(v->revision, 60629);
    char code[4] = {};
    std::memcpy(code, level.c_str(), level.size());
    EXPECT_EQ(std::memcmp(v->targetCode, code, 4), 0) << "NUL padded code of " << level;
    EXPECT_STREQ(v->libraryName, library_names().at(level).c_str());
    EXPECT_STREQ(v->versionText, "2019.0.1 (r60629)");
    EXPECT_STREQ(v->buildDate, level == "n8" ? "Oct  5 2018" : "Oct  4 2018");
}

class VersionTest : public zortest::LevelTest {};

TEST_P(VersionTest, RecordNamesTheLevelInForce) {
    expect_record(zoriGetLibVersion(), GetParam().name);
    EXPECT_EQ(zoriGetLibVersion(), zoriGetLibVersion());  // one record, not a copy
}

ZOR_INSTANTIATE_LEVELS(VersionTest);

TEST(Version, EarlierPointersSurviveALevelChange) {
    std::vector<std::pair<const zortest::Level*, const ZorLibraryVersion*>> taken;
    for (const zortest::Level& level : zortest::all_levels()) {
        if (!zortest::runnable(level)) continue;
        zorSetCpuFeatures(level.select);
        ASSERT_EQ(zorJumpIndexForMergedLibs, level.index);
        taken.emplace_back(&level, zoriGetLibVersion());
    }
    zorInit();
    ASSERT_GE(taken.size(), 2u) << "needs two levels this processor can run";
    for (size_t i = 0; i < taken.size(); ++i) {
        SCOPED_TRACE(taken[i].first->name);
        expect_record(taken[i].second, taken[i].first->name);
        for (size_t j = 0; j < i; ++j) EXPECT_NE(taken[i].second, taken[j].second);
    }
}

}  // namespace
