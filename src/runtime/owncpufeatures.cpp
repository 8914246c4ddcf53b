// The detected and enabled feature words. General registers only.
#include "runtime_internal.h"

extern "C" {
uint64_t ownFeatures = 0;
int32_t ownFeaturesAreValid = 0;
uint64_t ownFeaturesMask = 7;
}

namespace {

// Sets `value` in `word` when bit `bit` of `reg` is set.
inline void take(uint64_t& word, uint32_t reg, int bit, uint64_t value) {
    if (own_bit(reg, bit)) word |= value;
}

}  // namespace

int32_t ownGetMaskFeatures(uint64_t* features) {
    if (ownFeaturesAreValid) {
        *features = ownFeatures;
        return 1;
    }
    if (!zor_has_cpuid()) return ownFeaturesAreValid;

    uint32_t r0[4], rx[4], r1[4];
    own_cpuid(r0, 0, 0);
    own_cpuid(rx, 0x80000000u, 0);
    own_cpuid(r1, 1, 0);
    const uint32_t maxLeaf = r0[0], maxExtLeaf = rx[0];
    const uint32_t eax1 = r1[0], ecx1 = r1[2], edx1 = r1[3];

    uint64_t w = 0;
    take(w, edx1, 23, zorFeatureMMX);
    take(w, edx1, 25, zorFeatureSSE);
    take(w, edx1, 26, zorFeatureSSE2);
    take(w, ecx1, 0, zorFeatureSSE3);
    take(w, ecx1, 9, zorFeatureSSSE3);
    take(w, ecx1, 22, zorFeatureMOVBE);
    take(w, ecx1, 19, zorFeatureSSE41);
    take(w, ecx1, 20, zorFeatureSSE42);
    take(w, ecx1, 28, zorFeatureAVX);
    if (own_bit(ecx1, 27) && own_bit(ecx1, 28) && zor_is_avx_extension()) w |= zorFeatureAVXState;
    take(w, ecx1, 25, zorFeatureAES);
    take(w, ecx1, 1, zorFeaturePCLMULQDQ);
    take(w, ecx1, 30, zorFeatureRDRAND);
    take(w, ecx1, 29, zorFeatureF16C);

    if (maxLeaf >= 7) {
        uint32_t r7[4];
        own_cpuid(r7, 7, 0);
        const uint32_t ebx7 = r7[1], ecx7 = r7[2], edx7 = r7[3];
        // AVX2 only counts together with FMA, BMI1 and BMI2.
        if (own_bit(ecx1, 12) && own_bit(ebx7, 5) && own_bit(ebx7, 3) && own_bit(ebx7, 8))
            w |= zorFeatureAVX2;
        take(w, ebx7, 19, zorFeatureADX);
        take(w, ebx7, 18, zorFeatureRDSEED);
        take(w, ebx7, 29, zorFeatureSHA);
        take(w, ebx7, 16, zorFeatureAVX512F);
        take(w, ebx7, 28, zorFeatureAVX512CD);
        take(w, ebx7, 27, zorFeatureAVX512ER);
        take(w, ebx7, 26, zorFeatureAVX512PF);
        take(w, ebx7, 30, zorFeatureAVX512BW);
        take(w, ebx7, 17, zorFeatureAVX512DQ);
        take(w, ebx7, 31, zorFeatureAVX512VL);
        take(w, ecx7, 1, zorFeatureAVX512VBMI);
        take(w, ebx7, 14, zorFeatureMPX);
        take(w, edx7, 3, zorFeatureAVX5124FMAPS);
        take(w, edx7, 2, zorFeatureAVX5124VNNIW);
        take(w, ebx7, 21, zorFeatureAVX512IFMA);
        if (zor_is_avx512_extension()) w |= zorFeatureAVX512State;
    }
    if (maxExtLeaf >= 0x80000001u) {
        uint32_t rx1[4];
        own_cpuid(rx1, 0x80000001u, 0);
        take(w, rx1[2], 8, zorFeaturePREFETCHW);
    }

    // The flag goes out before the word; nothing else orders the two.
    ownFeaturesAreValid = 1;
    __asm__ volatile("" ::: "memory");
    if ((eax1 & 0xff0) == 0xb10) w |= zorFeatureCoprocessorB1;
    ownFeatures = w;
    *features = w;
    return 1;
}

void ownMaskIsFeatures(void) {
    ownFeatures = ownFeaturesMask;
    ownFeaturesAreValid = 1;
}

int32_t ownSetFeatureMask(uint64_t features) {
    ownFeaturesMask = features;
    return 1;
}

int32_t ownGetFeature(uint64_t features) {
    return (ownFeaturesMask & features) == features ? 1 : 0;
}
