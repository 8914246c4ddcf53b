// Time-stamp counters and the thread count of a single-threaded library.
#include "runtime_internal.h"

namespace {

inline uint64_t rdtsc() {
    uint32_t lo, hi;
    __asm__ volatile("rdtsc" : "=a"(lo), "=d"(hi));
    return ((uint64_t)hi << 32) | lo;
}

inline uint64_t rdtscp() {
    uint32_t lo, hi, aux;
    __asm__ volatile("rdtscp" : "=a"(lo), "=d"(hi), "=c"(aux));
    return ((uint64_t)hi << 32) | lo;
}

// CPUID serialises: nothing before it is still in flight after it.
inline void barrier() {
    uint32_t r[4];
    own_cpuid(r, 0, 0);
    __asm__ volatile("" ::: "memory");
}

}  // namespace

ZOR_EXPORT uint64_t zor_get_quindle_counter(void) { return rdtsc(); }
ZOR_EXPORT uint64_t zorGetCpuClocks(void) { return zor_get_quindle_counter(); }

ZOR_EXPORT uint64_t zorStartTsc(void) {
    barrier();
    return rdtsc();
}

ZOR_EXPORT uint64_t zorStopTsc(void) {
    const uint64_t t = rdtsc();
    barrier();
    return t;
}

ZOR_EXPORT uint64_t zorStartTscp(void) {
    barrier();
    return rdtscp();
}

ZOR_EXPORT uint64_t zorStopTscp(void) {
    const uint64_t t = rdtscp();
    barrier();
    return t;
}

int32_t ownGetNumThreads(void) { return 1; }

ZOR_EXPORT ZorStatus zorGetNumThreads(int32_t* pNumThr) {
    if (!pNumThr) return zorStsNullPtrErr;
    *pNumThr = 1;
    return zorStsNoOperation;
}

ZOR_EXPORT ZorStatus zorSetNumThreads(int32_t) { return 1; }
