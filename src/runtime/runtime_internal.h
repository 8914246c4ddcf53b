// Shared by the runtime's own sources (not by variant code).
#ifndef ZOR_RUNTIME_INTERNAL_H
#define ZOR_RUNTIME_INTERNAL_H

#include <stdint.h>
#include "zor.h"

// Services are exported by this mark; everything else stays hidden.
#define ZOR_EXPORT extern "C" __attribute__((visibility("default")))

// Internal steps, hidden from the library's users (the build hides
// every name it does not export).
extern "C" {
// Below zorSetCpuFeatures: validation against the detected word, and the
// row table from a word to a level (may add bits to *features).
ZorStatus ownSetCpuFeaturesAndIdx(uint64_t features, int32_t* index);
ZorStatus ownFeaturesToIdx(uint64_t* features, int32_t* index);
int32_t ownSetFeatureMask(uint64_t features);
// 1 if all given bits are enabled (so 1 for 0).
int32_t ownGetFeature(uint64_t features);
// Detection, cached for the process; 1 on success.
int32_t ownGetMaskFeatures(uint64_t* features);
// The enabled mask becomes the detected word.
void ownMaskIsFeatures(void);
// CPUID: regs receive EAX, EBX, ECX, EDX.
void ownGetReg(uint32_t regs[4], uint32_t leaf, uint32_t subleaf);
int32_t ownGetNumThreads(void);
}

// Process-wide feature words (owncpufeatures.cpp).
extern "C" uint64_t ownFeatures;
extern "C" int32_t ownFeaturesAreValid;
extern "C" uint64_t ownFeaturesMask;

// Raw instructions. Integer registers only: these stand on the path below
// zorSafeInit.
static inline void own_cpuid(uint32_t regs[4], uint32_t leaf, uint32_t subleaf) {
    uint32_t a, b, c, d;
    __asm__ volatile("cpuid" : "=a"(a), "=b"(b), "=c"(c), "=d"(d) : "a"(leaf), "c"(subleaf));
    regs[0] = a;
    regs[1] = b;
    regs[2] = c;
    regs[3] = d;
}

// Only valid when CPUID leaf 1 ECX bit 27 (OSXSAVE) is set.
static inline uint64_t own_xgetbv0(void) {
    uint32_t lo, hi;
    __asm__ volatile("xgetbv" : "=a"(lo), "=d"(hi) : "c"(0));
    return ((uint64_t)hi << 32) | lo;
}

static inline uint32_t own_bit(uint32_t reg, int bit) { return (reg >> bit) & 1u; }

// A CPUID source, so that the cache decoding can be fed recorded answers.
typedef void (*OwnCpuidFn)(uint32_t regs[4], uint32_t leaf, uint32_t subleaf);

// Largest non-instruction cache named by leaf 4; line size into *line.
// Returns -1 when leaf 4 names none.
extern "C" int32_t ownCacheSizeLeaf4(OwnCpuidFn cpuid, int32_t* line);
// Largest cache named by a leaf 2 answer, from a (descriptor, size) table
// ending in (0, 0); -1 when none matches.
extern "C" int32_t ownCacheSizeLeaf2(const uint32_t regs[4], const int32_t* table);
extern "C" const int32_t ownCacheTable[];

#endif
