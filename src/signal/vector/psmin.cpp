// Smallest element, and its index. An element replaces the current minimum
// only if it is strictly below it: of equal minima (+0 and -0 included) the
// lowest index wins, and a NaN never replaces anything, so NaNs are passed
// over unless the first element is one, which then stands. The vector path
// starts every lane from the minimum so far and ends by the same rule, so
// it always agrees with the plain scan; Min is the value of that search.
#include "variant.h"

#include <stddef.h>
#include <stdint.h>
#include <utility>

#include "simd.h"

ZOR_BEGIN
namespace {
using simd::vf32;
using simd::vs32;

constexpr int kLanes = ZOR_VECTOR_BYTES / 4;
constexpr int32_t kVectorFrom = 34;

struct MinAt {
    float value;
    int32_t index;
};

inline void scan(const float* p, int32_t from, int32_t to, MinAt& m) {
    for (int32_t i = from; i < to; ++i) {
        if (p[i] < m.value) {
            m.value = p[i];
            m.index = i;
        }
    }
}

template <size_t... I> inline vs32 lane_numbers(std::index_sequence<I...>) {
    return vs32{(int32_t)I...};
}

// Vector compare with index lanes from i on; returns where it stopped.
int32_t scan_vector(const float* p, int32_t i, int32_t len, MinAt& m) {
    vf32 vmin = vf32{} + m.value;
    vs32 vidx = vs32{} + m.index;
    vs32 at = lane_numbers(std::make_index_sequence<kLanes>()) + i;
    for (; len - i >= kLanes; i += kLanes) {
        const vf32 x = simd::load<vf32>(p + i);
        const vs32 below = x < vmin;
        vmin = below ? x : vmin;
        vidx = below ? at : vidx;
        at += kLanes;
    }
    float value[kLanes];
    int32_t index[kLanes];
    simd::store(value, vmin);
    simd::store(index, vidx);
    // Each lane holds the minimum so far or something strictly below it.
    for (int k = 0; k < kLanes; ++k) {
        if (value[k] < m.value || (value[k] == m.value && index[k] < m.index)) {
            m.value = value[k];
            m.index = index[k];
        }
    }
    return i;
}

MinAt min_at(const float* p, int32_t len) {
    MinAt m = {p[0], 0};
    if (len < kVectorFrom) {
        scan(p, 1, len, m);
        return m;
    }
    const uintptr_t a = (uintptr_t)p;
    const int32_t head = (a & 3) != 0 ? 0 : (int32_t)(((16 - (a & 15)) & 15) >> 2);
    scan(p, 1, head, m);
    const int32_t i = scan_vector(p, head, len, m);
    scan(p, i, len, m);
    return m;
}

}  // namespace
ZOR_END

ZOR_INTERNAL ZorStatus ZOR_NAME(zorsMin_32f)(const Zor32f* pSrc, int32_t len, Zor32f* pMin) {
    if (pSrc == nullptr || pMin == nullptr) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    *pMin = ZOR_NS::min_at(pSrc, len).value;
    return zorStsNoErr;
}

ZOR_INTERNAL ZorStatus ZOR_NAME(zorsMinIndx_32f)(const Zor32f* pSrc, int32_t len, Zor32f* pMin,
                                                 int32_t* pIndx) {
    if (pSrc == nullptr || pMin == nullptr) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    const ZOR_NS::MinAt m = ZOR_NS::min_at(pSrc, len);
    *pMin = m.value;
    if (pIndx != nullptr) *pIndx = m.index;
    return zorStsNoErr;
}
