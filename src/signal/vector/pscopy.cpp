// Copy, move and clear of byte ranges, and the vector operations on them.
//
// Copy and clear pick their way by length: short pieces, vector loops,
// string instructions, and for data larger than half the biggest cache
// non-temporal stores, so that one large copy does not evict the caller's
// working set. The three level families do this differently (see
// copy_policy); every way writes the same bytes.
#include "variant.h"

#include <cpuid.h>
#include <stddef.h>
#include <stdint.h>
#include <string.h>

#include "simd.h"

ZOR_BEGIN
namespace {

using simd::vu8;
constexpr size_t VB = ZOR_VECTOR_BYTES;

// ---- pieces ----------------------------------------------------------------

// A piece goes through a register: loaded whole before it is stored, so a
// piece is safe whatever the overlap.
template <size_t K> inline void piece(const Zor8u* s, Zor8u* d) {
    Zor8u t[K];
    memcpy(t, s, K);
    memcpy(d, t, K);
}

// n < 64 bytes in descending power-of-two pieces.
inline void copy_short(const Zor8u* s, Zor8u* d, size_t n) {
    if (n & 32) piece<32>(s, d), s += 32, d += 32;
    if (n & 16) piece<16>(s, d), s += 16, d += 16;
    if (n & 8) piece<8>(s, d), s += 8, d += 8;
    if (n & 4) piece<4>(s, d), s += 4, d += 4;
    if (n & 2) piece<2>(s, d), s += 2, d += 2;
    if (n & 1) *d = *s;
}

inline void zero_short(Zor8u* d, size_t n) {
    if (n & 32) memset(d, 0, 32), d += 32;
    if (n & 16) memset(d, 0, 16), d += 16;
    if (n & 8) memset(d, 0, 8), d += 8;
    if (n & 4) memset(d, 0, 4), d += 4;
    if (n & 2) memset(d, 0, 2), d += 2;
    if (n & 1) *d = 0;
}

// ---- per-level instructions ------------------------------------------------

inline void rep_movsb(const Zor8u* s, Zor8u* d, size_t n) {
    __asm__ volatile("rep movsb" : "+D"(d), "+S"(s), "+c"(n) : : "memory");
}

inline void rep_stosb(Zor8u* d, size_t n) {
    __asm__ volatile("rep stosb" : "+D"(d), "+c"(n) : "a"(0) : "memory");
}

// ---- kernels ---------------------------------------------------------------

// Straight vector copy: first and last vector unaligned, aligned stores in
// between (the first and last may overlap the middle).
void copy_vec(const Zor8u* s, Zor8u* d, size_t n) {
    if (n < 64) {
        copy_short(s, d, n);
        return;
    }
    const vu8 head = simd::load<vu8>(s), tail = simd::load<vu8>(s + n - VB);
    size_t i = VB - ((uintptr_t)d & (VB - 1));
    for (; i + 4 * VB <= n; i += 4 * VB) {
        const vu8 a = simd::load<vu8>(s + i), b = simd::load<vu8>(s + i + VB);
        const vu8 c = simd::load<vu8>(s + i + 2 * VB), e = simd::load<vu8>(s + i + 3 * VB);
        simd::store(d + i, a);
        simd::store(d + i + VB, b);
        simd::store(d + i + 2 * VB, c);
        simd::store(d + i + 3 * VB, e);
    }
    for (; i + VB <= n; i += VB) simd::store(d + i, simd::load<vu8>(s + i));
    simd::store(d, head);
    simd::store(d + n - VB, tail);
}

// 64-byte blocks of aligned destination d, source any, non-temporal.
inline void stream_blocks(const Zor8u* s, Zor8u* d, size_t blocks) {
    for (size_t b = 0; b < blocks; ++b, s += 64, d += 64) {
        vu8 v[64 / VB];
        for (size_t k = 0; k < 64 / VB; ++k) v[k] = simd::load<vu8>(s + k * VB);
        for (size_t k = 0; k < 64 / VB; ++k) simd::stream(d + k * VB, v[k]);
    }
}

// Head up to the destination's next 64-byte boundary, whole blocks
// non-temporal, tail, fence.
void copy_nt(const Zor8u* s, Zor8u* d, size_t n) {
    size_t head = (-(uintptr_t)d) & 63;
    if (head > n) head = n;
    copy_vec(s, d, head);
    const size_t blocks = (n - head) / 64;
    stream_blocks(s + head, d + head, blocks);
    const size_t done = head + 64 * blocks;
    copy_vec(s + done, d + done, n - done);
    simd::store_fence();
}

// For a destination a little ahead of the source in page offset, where a
// forward copy keeps loading from addresses that look like the ones just
// stored (4 KiB aliasing): the part behind the destination end's last
// 64-byte boundary, then whole blocks from the end downward, then the head.
void copy_inv(const Zor8u* s, Zor8u* d, size_t n) {
    size_t tail = (uintptr_t)(d + n) & 63;
    if (tail > n) tail = n;
    size_t r = n - tail;
    copy_vec(s + r, d + r, tail);
    for (; r >= 64; r -= 64) {
        vu8 v[64 / VB];
        for (size_t k = 0; k < 64 / VB; ++k) v[k] = simd::load<vu8>(s + r - 64 + k * VB);
        for (size_t k = 0; k < 64 / VB; ++k) simd::store(d + r - 64 + k * VB, v[k]);
    }
    copy_vec(s, d, r);
}

// Large copies of the SSE levels: chunks of 256 KiB, each first read at
// every 128th byte (the loads run ahead of the stores and pull the chunk
// in), then copied with non-temporal stores.
void copy_readahead(const Zor8u* s, Zor8u* d, size_t n) {
    if (n < 64) {
        copy_short(s, d, n);
        return;
    }
    const vu8 head = simd::load<vu8>(s), tail = simd::load<vu8>(s + n - VB);
    size_t i = VB - ((uintptr_t)d & (VB - 1));
    while (n - i >= VB) {
        size_t chunk = (n - i) & ~(VB - 1);
        if (chunk > 0x40000) chunk = 0x40000;
        Zor8u touched = 0;
        for (size_t k = 0; k < chunk; k += 128) touched |= ((const volatile Zor8u*)s)[i + k];
        __asm__ volatile("" : : "r"(touched));
        for (size_t k = 0; k < chunk; k += VB) simd::stream(d + i + k, simd::load<vu8>(s + i + k));
        i += chunk;
    }
    simd::store_fence();
    simd::store(d, head);
    simd::store(d + n - VB, tail);
}

// One unaligned vector at each end (they may overlap the middle), aligned
// vector stores between; ordinary or non-temporal.
template <bool NT> void zero_body(Zor8u* d, size_t n) {
    if (n < VB) {
        zero_short(d, n);
        return;
    }
    const vu8 z = vu8{};
    simd::store(d, z);
    simd::store(d + n - VB, z);
    Zor8u* p = d + VB - ((uintptr_t)d & (VB - 1));
    Zor8u* const end = d + n;
    for (; end - p >= (ptrdiff_t)(4 * VB); p += 4 * VB) {
        for (size_t k = 0; k < 4; ++k) {
            if (NT)
                simd::stream(p + k * VB, z);
            else
                simd::store(p + k * VB, z);
        }
    }
    for (; end - p >= (ptrdiff_t)VB; p += VB) {
        if (NT)
            simd::stream(p, z);
        else
            simd::store(p, z);
    }
    if (NT) simd::store_fence();
}

// ---- cache size for the SSE levels -----------------------------------------

// Leaf 2 descriptors and their sizes as code bytes: size = (code >> 4) <<
// (18 + (code & 15)). The rows and their order are those of the runtime's
// table; the few caches below 256 KiB, which the code cannot express, read
// as 256 KiB: the copy asks only from 512 KiB on, where any cache up to
// 1 MiB gives the same choice.
const Zor8u kLeaf2Codes[] = {
    236, 0x35, 235, 0x93, 77, 0x16, 234, 0x34, 76, 0x34,
    228, 0x15, 222, 0x15, 75, 0x15, 71, 0x15, 78, 0x33, 74, 0x33,
    227, 0x14, 221, 0x14, 216, 0x14, 73, 0x14, 41, 0x14, 70, 0x14, 72, 0x32,
    226, 0x13, 220, 0x13, 215, 0x13, 210, 0x13, 37, 0x13, 125, 0x13, 133, 0x13, 69, 0x13,
    214, 0x12, 209, 0x12, 35, 0x12, 135, 0x12, 124, 0x12, 120, 0x12, 132, 0x12, 68, 0x12,
    208, 0x11, 34, 0x11, 123, 0x11, 128, 0x11, 134, 0x11, 62, 0x11, 127, 0x11, 131, 0x11,
    67, 0x11, 61, 0x10,
    33, 0x10, 122, 0x10, 130, 0x10, 60, 0x10, 63, 0x10, 66, 0x10, 58, 0x10,
    121, 0x10, 57, 0x10, 59, 0x10, 65, 0x10,
    0, 0,
};

// The leaf 2 answer of a processor of this library's reference vendor,
// asked afresh on every call (nothing is kept); -1 when none.
[[maybe_unused]] int32_t leaf2_cache_size() {
    unsigned r[4], vendor[3];
    if (!__get_cpuid(0, &r[0], &vendor[0], &vendor[2], &vendor[1])) return -1;
    if (memcmp(vendor, "GenuineTarvo", 12) != 0 || r[0] < 2) return -1;
    __cpuid(2, r[0], r[1], r[2], r[3]);
    const uint32_t regs[4] = {r[0], r[1], r[2], r[3]};
    return ZOR_NAME(ownsCopyCacheSize)(regs);
}

}  // namespace

// ---- the policies ------------------------------------------------------------
//
// cache: the largest cache in bytes, or negative when unknown. Each family
// asks for it only where its choice depends on it.

#if ZOR_COPY_POLICY == ZOR_COPY_READAHEAD

static void copy_policy(const Zor8u* s, Zor8u* d, size_t n, int64_t cache) {
    if (n >= 0x80000 && cache >= 0 && 2 * n >= (uint64_t)cache)
        copy_readahead(s, d, n);
    else
        copy_vec(s, d, n);
}
static int64_t copy_cache(size_t n) { return n >= 0x80000 ? leaf2_cache_size() : -1; }

static void zero_policy(Zor8u* d, size_t n, int64_t cache) {
    if (n > 0x80000 && cache >= 0 && 2 * n >= (uint64_t)cache)
        zero_body<true>(d, n);
    else
        zero_body<false>(d, n);
}
static int64_t zero_cache(size_t n) { return n > 0x80000 ? leaf2_cache_size() : -1; }

#elif ZOR_COPY_POLICY == ZOR_COPY_STRING

static void copy_policy(const Zor8u* s, Zor8u* d, size_t n, int64_t) {
    if (n >= 32768)
        rep_movsb(s, d, n);
    else
        copy_vec(s, d, n);
}
static int64_t copy_cache(size_t) { return -1; }

#else  // ZOR_COPY_PAGE

static void copy_policy(const Zor8u* s, Zor8u* d, size_t n, int64_t cache) {
    if (n < 0x8000) {
        copy_vec(s, d, n);
    } else if (n > 0x400000 && cache >= 0 && 2 * n >= (uint64_t)cache) {
        copy_nt(s, d, n);
    } else {
        const uint32_t ahead = (uint32_t)((uintptr_t)d & 0xfff) - (uint32_t)((uintptr_t)s & 0xfff);
        if (ahead >= 0xa0)
            rep_movsb(s, d, n);
        else
            copy_inv(s, d, n);
    }
}
static int64_t copy_cache(size_t n) {
    int32_t size = -1;
    if (n > 0x400000 && zorGetMaxCacheSizeB(&size) == zorStsNoErr) return size;
    return -1;
}

#endif

#if ZOR_COPY_POLICY != ZOR_COPY_READAHEAD
// The AVX levels clear large ranges with the string store.
static void zero_policy(Zor8u* d, size_t n, int64_t) {
    if (n >= 32768)
        rep_stosb(d, n);
    else
        zero_body<false>(d, n);
}
static int64_t zero_cache(size_t) { return -1; }
#endif


// Overlap is safe because every piece and block is loaded whole before it
// is stored, walking away from the side the destination overlaps: down from
// the end when the source lies below the destination, else up.
void move_any(const Zor8u* s, Zor8u* d, size_t n) {
    if (s == d) return;
    if (s > d) {
        if (n >= 64) {
            while ((uintptr_t)d & 3) piece<1>(s++, d++), --n;
            while ((uintptr_t)d & 7) piece<4>(s, d), s += 4, d += 4, n -= 4;
            while ((uintptr_t)d & (VB - 1)) piece<8>(s, d), s += 8, d += 8, n -= 8;
            for (; n >= 2 * VB; n -= 2 * VB, s += 2 * VB, d += 2 * VB) piece<2 * VB>(s, d);
        }
        for (; n >= VB; n -= VB, s += VB, d += VB) piece<VB>(s, d);
        for (; n >= 8; n -= 8, s += 8, d += 8) piece<8>(s, d);
        for (; n >= 1; --n) piece<1>(s++, d++);
    } else {
        const Zor8u* se = s + n;
        Zor8u* de = d + n;
        if (n >= 64) {
            while ((uintptr_t)de & 3) piece<1>(--se, --de), --n;
            while ((uintptr_t)de & 7) se -= 4, de -= 4, piece<4>(se, de), n -= 4;
            while ((uintptr_t)de & (VB - 1)) se -= 8, de -= 8, piece<8>(se, de), n -= 8;
            for (; n >= 2 * VB; n -= 2 * VB) se -= 2 * VB, de -= 2 * VB, piece<2 * VB>(se, de);
        }
        for (; n >= VB; n -= VB) se -= VB, de -= VB, piece<VB>(se, de);
        for (; n >= 8; n -= 8) se -= 8, de -= 8, piece<8>(se, de);
        for (; n >= 1; --n) piece<1>(--se, --de);
    }
}

ZOR_END

// (Not the whole namespace: the C names of the kernels below would clash.)
using ZOR_NS::copy_inv;
using ZOR_NS::copy_nt;
using ZOR_NS::copy_policy;
using ZOR_NS::copy_readahead;
using ZOR_NS::copy_vec;
using ZOR_NS::copy_cache;
using ZOR_NS::kLeaf2Codes;
using ZOR_NS::move_any;
using ZOR_NS::rep_movsb;
using ZOR_NS::rep_stosb;
using ZOR_NS::zero_body;
using ZOR_NS::zero_cache;
using ZOR_NS::zero_policy;

// The whole policy of the level, with the cache size asked where the choice
// depends on it.
ZOR_INTERNAL void ZOR_NAME(ownsCopy_8u)(const Zor8u* pSrc, Zor8u* pDst, size_t len) {
    copy_policy(pSrc, pDst, len, copy_cache(len));
}
ZOR_INTERNAL void ZOR_NAME(ownsZero_8u)(Zor8u* pDst, size_t len) {
    zero_policy(pDst, len, zero_cache(len));
}

// ---- the kernels, reachable one by one for tests -----------------------------

ZOR_INTERNAL void ZOR_NAME(ownsCopy_8u_E9)(const Zor8u* pSrc, Zor8u* pDst, size_t len) {
    copy_vec(pSrc, pDst, len);
}
ZOR_INTERNAL void ZOR_NAME(ownsCopy_8u_repE9)(const Zor8u* pSrc, Zor8u* pDst, size_t len) {
    rep_movsb(pSrc, pDst, len);
}
ZOR_INTERNAL void ZOR_NAME(ownsCopy_8u_nt)(const Zor8u* pSrc, Zor8u* pDst, size_t len) {
    copy_nt(pSrc, pDst, len);
}
ZOR_INTERNAL void ZOR_NAME(ownsCopy_8u_inv)(const Zor8u* pSrc, Zor8u* pDst, size_t len) {
    copy_inv(pSrc, pDst, len);
}
ZOR_INTERNAL void ZOR_NAME(ownsCopy_8u_ra)(const Zor8u* pSrc, Zor8u* pDst, size_t len) {
    copy_readahead(pSrc, pDst, len);
}
ZOR_INTERNAL void ZOR_NAME(ownsCopy_8u_cache)(const Zor8u* pSrc, Zor8u* pDst, size_t len,
                                              int64_t cacheBytes) {
    copy_policy(pSrc, pDst, len, cacheBytes);
}
ZOR_INTERNAL void ZOR_NAME(ownsZero_8u_E9)(Zor8u* pDst, size_t len) { zero_body<false>(pDst, len); }
ZOR_INTERNAL void ZOR_NAME(ownsZero_8u_repE9)(Zor8u* pDst, size_t len) { rep_stosb(pDst, len); }
ZOR_INTERNAL void ZOR_NAME(ownsZero_8u_nt)(Zor8u* pDst, size_t len) { zero_body<true>(pDst, len); }
ZOR_INTERNAL void ZOR_NAME(ownsZero_8u_cache)(Zor8u* pDst, size_t len, int64_t cacheBytes) {
    zero_policy(pDst, len, cacheBytes);
}
ZOR_INTERNAL void ZOR_NAME(ownsMove_8u)(const Zor8u* pSrc, Zor8u* pDst, size_t len) {
    move_any(pSrc, pDst, len);
}

// Same matching as the runtime's leaf 2 decoding: the low byte of EAX must
// be 1, a register with bit 31 set holds no descriptors, the first byte is
// the iteration count, and the first table row found wins.
ZOR_INTERNAL int32_t ZOR_NAME(ownsCopyCacheSize)(const uint32_t regs[4]) {
    if ((regs[0] & 0xff) != 1) return -1;
    Zor8u bytes[16];
    int count = 0;
    for (int i = 0; i < 4; ++i) {
        if (regs[i] & 0x80000000u) continue;
        for (int b = 0; b < 4; ++b) bytes[count++] = (Zor8u)(regs[i] >> (8 * b));
    }
    for (const Zor8u* row = kLeaf2Codes; row[0] != 0; row += 2) {
        for (int i = 1; i < count; ++i)
            if (bytes[i] == row[0]) return (int32_t)(row[1] >> 4) << (18 + (row[1] & 15));
    }
    return -1;
}

// ---- the vector operations -----------------------------------------------------
//
// Byte counts are formed in 64 bits: a vector of more than 2 GiB is copied
// or cleared whole.

#define COPY_LIKE(link, name, T, fn)                                           \
    link ZorStatus ZOR_NAME(name)(const T* pSrc, T* pDst, int32_t len) {        \
        if (pSrc == nullptr || pDst == nullptr) return zorStsNullPtrErr;        \
        if (len < 1) return zorStsSizeErr;                                      \
        fn((const Zor8u*)pSrc, (Zor8u*)pDst, (size_t)len * sizeof(T));          \
        return zorStsNoErr;                                                     \
    }

COPY_LIKE(ZOR_ENTRY, zorsCopy_32f, Zor32f, ZOR_NAME(ownsCopy_8u))
COPY_LIKE(ZOR_ENTRY, zorsCopy_32fc, Zor32fc, ZOR_NAME(ownsCopy_8u))
COPY_LIKE(ZOR_ENTRY, zorsCopy_64f, Zor64f, ZOR_NAME(ownsCopy_8u))
COPY_LIKE(ZOR_ENTRY, zorsCopy_64fc, Zor64fc, ZOR_NAME(ownsCopy_8u))
COPY_LIKE(ZOR_INTERNAL, zorsCopy_8u, Zor8u, ZOR_NAME(ownsCopy_8u))
COPY_LIKE(ZOR_INTERNAL, zorsCopy_16s, Zor16s, ZOR_NAME(ownsCopy_8u))
COPY_LIKE(ZOR_INTERNAL, zorsCopy_32s, Zor32s, ZOR_NAME(ownsCopy_8u))
COPY_LIKE(ZOR_ENTRY, zorsMove_32f, Zor32f, move_any)
COPY_LIKE(ZOR_ENTRY, zorsMove_32fc, Zor32fc, move_any)
COPY_LIKE(ZOR_ENTRY, zorsMove_64f, Zor64f, move_any)
COPY_LIKE(ZOR_ENTRY, zorsMove_64fc, Zor64fc, move_any)
#undef COPY_LIKE

#define ZERO(name, T)                                                  \
    ZOR_INTERNAL ZorStatus ZOR_NAME(name)(T* pDst, int32_t len) {      \
        if (pDst == nullptr) return zorStsNullPtrErr;                  \
        if (len < 1) return zorStsSizeErr;                             \
        ZOR_NAME(ownsZero_8u)((Zor8u*)pDst, (size_t)len * sizeof(T));            \
        return zorStsNoErr;                                            \
    }

ZERO(zorsZero_8u, Zor8u)
ZERO(zorsZero_32s, Zor32s)
ZERO(zorsZero_32f, Zor32f)
ZERO(zorsZero_64f, Zor64f)
ZERO(zorsZero_32fc, Zor32fc)
ZERO(zorsZero_64fc, Zor64fc)
#undef ZERO
