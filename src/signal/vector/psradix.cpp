// Stable least-significant-digit radix sort of floats by bit pattern, in
// three passes of 11, 11 and 10 bits. The floats are first turned into
// unsigned keys that order like the numbers (-0 below +0; NaNs beyond the
// infinities on their sign's side), all three histograms come from that
// same scan, and the last pass turns the keys back into floats. The work
// buffer holds the counters, then a second copy of the data.
#include "variant.h"

#include <stdint.h>

ZOR_BEGIN
namespace {

// The caller's byte buffer carries no alignment promise.
typedef uint32_t u32_any __attribute__((aligned(1), may_alias));

constexpr int kCounters0 = 2048, kCounters1 = 2048, kCounters2 = 1024;
constexpr int kCounters = kCounters0 + kCounters1 + kCounters2;

inline uint32_t to_key(uint32_t v) {
    // Negative: all bits inverted; positive: only the sign.
    return v ^ ((uint32_t)((int32_t)v >> 31) | 0x80000000u);
}

inline uint32_t from_key(uint32_t k) {
    return k ^ (((k >> 31) - 1) | 0x80000000u);
}

// Keys in place and all three histograms in one scan.
void keys_and_counts(u32_any* data, int32_t len, u32_any* c0, u32_any* c1, u32_any* c2) {
    int32_t i = 0;
    for (; len - i >= 12; i += 12) {
        for (int k = 0; k < 12; ++k) {
            const uint32_t key = to_key(data[i + k]);
            data[i + k] = key;
            ++c0[key & 0x7FF];
            ++c1[(key >> 11) & 0x7FF];
            ++c2[key >> 22];
        }
    }
    for (; i < len; ++i) {
        const uint32_t key = to_key(data[i]);
        data[i] = key;
        ++c0[key & 0x7FF];
        ++c1[(key >> 11) & 0x7FF];
        ++c2[key >> 22];
    }
}

// Counts to running positions that start at -1: a pass increments a
// position first, then stores at it.
void running_positions(u32_any* c, int n) {
    uint32_t pos = 0xFFFFFFFFu;
    for (int d = 0; d < n; ++d) {
        const uint32_t count = c[d];
        c[d] = pos;
        pos += count;
    }
}

template <int Shift, uint32_t Mask>
void scatter(const u32_any* src, u32_any* dst, int32_t len, u32_any* pos) {
    int32_t i = 0;
    for (; len - i >= 2; i += 2) {
        const uint32_t a = src[i], b = src[i + 1];
        dst[++pos[(a >> Shift) & Mask]] = a;
        dst[++pos[(b >> Shift) & Mask]] = b;
    }
    if (i < len) {
        const uint32_t a = src[i];
        dst[++pos[(a >> Shift) & Mask]] = a;
    }
}

// The top digit's pass, storing floats again.
void scatter_last(const u32_any* src, u32_any* dst, int32_t len, u32_any* pos) {
    int32_t i = 0;
    for (; len - i >= 2; i += 2) {
        const uint32_t a = src[i], b = src[i + 1];
        dst[++pos[a >> 22]] = from_key(a);
        dst[++pos[b >> 22]] = from_key(b);
    }
    if (i < len) {
        const uint32_t a = src[i];
        dst[++pos[a >> 22]] = from_key(a);
    }
}

}  // namespace
ZOR_END

ZOR_INTERNAL ZorStatus ZOR_NAME(zorsSortRadixGetBufferSize)(int32_t len, ZorDataType dataType,
                                                            int32_t* pBufSize) {
    if (pBufSize == nullptr) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    int64_t bytes;
    switch ((int)dataType) {
        case 1: bytes = (int64_t)len + 1024; break;
        case 5: case 7: bytes = 2 * (int64_t)len + 2048; break;
        case 9: case 11: case 13: bytes = 4 * (int64_t)len + 20480; break;
        case 15: case 17: bytes = 8 * (int64_t)len + 81920; break;
        case 19: bytes = 8 * (int64_t)len + 40960; break;
        default:
            *pBufSize = 0;
            return zorStsDataTypeErr;
    }
    // A size that a 32-bit count cannot carry is refused, nothing stored.
    if (bytes > INT32_MAX) return zorStsSizeErr;
    *pBufSize = (int32_t)bytes;
    return zorStsNoErr;
}

ZOR_INTERNAL ZorStatus ZOR_NAME(zorsSortRadixAscend_32f_I)(Zor32f* pSrcDst, int32_t len, Zor8u* pBuffer) {
    using namespace ZOR_NS;
    if (pSrcDst == nullptr || pBuffer == nullptr) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    u32_any* c0 = (u32_any*)pBuffer;
    u32_any* c1 = c0 + kCounters0;
    u32_any* c2 = c1 + kCounters1;
    u32_any* copy = c2 + kCounters2;
    u32_any* data = (u32_any*)pSrcDst;

    ZOR_NAME(zorsZero_32s)((Zor32s*)pBuffer, kCounters);
    keys_and_counts(data, len, c0, c1, c2);
    running_positions(c0, kCounters0);
    running_positions(c1, kCounters1);
    running_positions(c2, kCounters2);
    scatter<0, 0x7FF>(data, copy, len, c0);
    scatter<11, 0x7FF>(copy, data, len, c1);
    scatter_last(data, copy, len, c2);
    ZOR_NAME(zorsCopy_32f)((const Zor32f*)copy, pSrcDst, len);
    return zorStsNoErr;
}
