// Public access to the feature words. General registers only.
#include "runtime_internal.h"

// "getinfoa", least significant byte first: asks for an arbitrary leaf.
static const uint64_t getInfoWord = 0x616f666e69746567ULL;

ZOR_EXPORT ZorStatus zorGetCpuFeatures(uint64_t* pFeatures, uint32_t pRegs[4]) {
    uint64_t detected = 0;
    if (!ownGetMaskFeatures(&detected)) return zorStsNotSupportedCpu;
    if (!pFeatures) return zorStsNullPtrErr;
    const uint64_t request = *pFeatures;
    *pFeatures = detected;
    if (!pRegs) return zorStsNoErr;
    if (request == getInfoWord)
        own_cpuid(pRegs, pRegs[0], pRegs[2]);
    else
        own_cpuid(pRegs, 1, 0);
    return zorStsNoErr;
}

ZOR_EXPORT uint64_t zorGetEnabledCpuFeatures(void) {
    return ownFeaturesMask;
}

ZOR_EXPORT ZorStatus zorSetCpuFeaturesMask(uint64_t features) {
    ownSetFeatureMask(features);
    return zorStsNoErr;
}
