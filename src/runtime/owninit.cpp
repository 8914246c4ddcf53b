// From a feature word to a level index. General registers only.
#include "runtime_internal.h"
#include "zor_levels.h"

namespace {

const uint64_t unknownBits = 0x7ffffffc00000000ULL;
const uint64_t avxGroup = zorFeatureAVX | zorFeatureAVX2;
const uint64_t avx512Group = 0x6ff00000ULL;  // F..VBMI, 4FMAPS, 4VNNIW; not MPX

struct LevelRow {
    uint64_t test;      // all of these bits select the row
    int32_t index;
    uint64_t required;  // everything that level's code relies on
};

// First matching row wins; AVX-512 with BW/DQ/VL is preferred over ER/PF.
#define ZOR_ROW(test, index, required) {test, index, required},
const LevelRow levelRows[] = {ZOR_SELECT_ROWS(ZOR_ROW)};
#undef ZOR_ROW

}  // namespace

ZorStatus ownFeaturesToIdx(uint64_t* features, int32_t* index) {
    uint64_t f = *features;
    for (const LevelRow& row : levelRows) {
        if ((f & row.test) == row.test) {
            *index = row.index;
            *features = f | row.required;
            return (f & row.required) == row.required ? zorStsNoErr : zorStsFeaturesCombination;
        }
    }
    *index = 0;
    *features = f | ((f & zorFeatureSSE) ? 3 : 1);
    return zorStsNotSupportedCpu;
}

ZorStatus ownSetCpuFeaturesAndIdx(uint64_t features, int32_t* index) {
    uint64_t f = features;
    ZorStatus status = zorStsNoErr;
    *index = 0;
    if (f & zorFeatureNoCheck) {
        f &= ~zorFeatureNoCheck;
        ownMaskIsFeatures();
    } else {
        uint64_t detected = 0;
        ownGetMaskFeatures(&detected);
        if (f & unknownBits) status = zorStsUnknownFeature;
        if ((f & avxGroup) && !(detected & zorFeatureAVXState)) {
            f &= ~avxGroup;
            status = zorStsFeatureNotSupported;
        }
        if ((f & avx512Group) && !(detected & zorFeatureAVX512State)) {
            f &= ~avx512Group;
            status = zorStsFeatureNotSupported;
        }
        // Detection never sets the unknown bits, so they end here as 49.
        if (f & ~detected) status = zorStsFeatureNotSupported;
    }
    ZorStatus rowStatus = ownFeaturesToIdx(&f, index);
    zorSetCpuFeaturesMask(f);
    return status != zorStsNoErr ? status : rowStatus;
}
