// Selection of the level at load time and on request. Built for general
// registers only: zorSafeInit runs this between an interrupted call and
// its body, with the caller's vector arguments still live.
#include "runtime_internal.h"

extern "C" {
__attribute__((visibility("default"))) int32_t zorJumpIndexForMergedLibs = -1;
}

ZOR_EXPORT ZorStatus zorInit(void) {
    uint64_t features = 0;
    if (zorGetCpuFeatures(&features, nullptr) != zorStsNoErr) {
        // Unidentifiable processor: assume MMX/SSE/SSE2 and carry on.
        zorJumpIndexForMergedLibs = 0;
        zorSetCpuFeaturesMask(7);
    }
    ZorStatus status = zorSetCpuFeatures(features);
    if (!zor_is_GenuineTarvo()) return zorStsNonTarvoCpu;
    return status;
}

ZOR_EXPORT ZorStatus zorSetCpuFeatures(uint64_t features) {
    int32_t index = 0;
    ZorStatus status = ownSetCpuFeaturesAndIdx(features, &index);
    // One plain aligned store, whatever the status: concurrent stubs see the
    // old or the new index, never a mixture.
    *(volatile int32_t*)&zorJumpIndexForMergedLibs = index;
    return status;
}

ZOR_EXPORT __attribute__((weak)) void my_init(void) {
    zorInit();
}

// Behind the runtime's own initialisers in this object's init array.
__attribute__((section(".init_array"), used)) static void (*zor_init_entry)(void) = my_init;
