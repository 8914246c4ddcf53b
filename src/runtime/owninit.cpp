// From a feature word to a level index. General registers only.
#include "runtime_internal.h"

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
const LevelRow levelRows[] = {
    {0x7300000, 6, 0x73081df},
    {0xf00000, 5, 0xf081df},
    {0x8000, 4, 0x81df},
    {0x100, 3, 0x1df},
    {0x80, 2, 0xdf},
    {0x40, 1, 0x5f},
    {0x20, 1, 0x3f},
    {0x10, 1, 0x1f},
    {0x8, 0, 0xf},
    {0x4, 0, 0x7},
};

}  // namespace

ZOR_EXPORT ZorStatus ownFeaturesToIdx(uint64_t* features, int32_t* index) {
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

ZOR_EXPORT ZorStatus ownSetCpuFeaturesAndIdx(uint64_t features, int32_t* index) {
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
