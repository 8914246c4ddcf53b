// Size and line of the largest data or unified cache, computed once.
#include "runtime_internal.h"

namespace {

int32_t szCacheLine = -1;
int32_t szCacheMax = -1;
int32_t ownStatus = 1;  // 1: not computed yet

void hardware_cpuid(uint32_t regs[4], uint32_t leaf, uint32_t subleaf) {
    own_cpuid(regs, leaf, subleaf);
}

// Leaf 2 answer straight from the processor.
int32_t ownGetCacheSize(const int32_t* table) {
    uint32_t regs[4];
    own_cpuid(regs, 2, 0);
    return ownCacheSizeLeaf2(regs, table);
}

}  // namespace

// (descriptor, bytes), largest first, so the first match is the largest
// cache leaf 2 names.
extern "C" const int32_t ownCacheTable[] = {
    236, 25165824, 235, 18874368, 77, 16777216, 234, 12582912, 76, 12582912,
    228, 8388608, 222, 8388608, 75, 8388608, 71, 8388608,
    78, 6291456, 74, 6291456,
    227, 4194304, 221, 4194304, 216, 4194304, 73, 4194304, 41, 4194304, 70, 4194304,
    72, 3145728,
    226, 2097152, 220, 2097152, 215, 2097152, 210, 2097152, 37, 2097152, 125, 2097152,
    133, 2097152, 69, 2097152,
    214, 1048576, 209, 1048576, 35, 1048576, 135, 1048576, 124, 1048576, 120, 1048576,
    132, 1048576, 68, 1048576,
    208, 524288, 34, 524288, 123, 524288, 128, 524288, 134, 524288, 62, 524288,
    127, 524288, 131, 524288, 67, 524288,
    61, 393216,
    33, 262144, 122, 262144, 130, 262144, 60, 262144, 63, 262144, 66, 262144,
    58, 196608,
    121, 131072, 57, 131072, 59, 131072, 65, 131072,
    0, 0,
};

extern "C" int32_t ownCacheSizeLeaf2(const uint32_t regs[4], const int32_t* table) {
    if ((regs[0] & 0xff) != 1) return -1;
    uint8_t bytes[16];
    int count = 0;
    for (int i = 0; i < 4; ++i) {
        const uint32_t r = (regs[i] & 0x80000000u) ? 0 : regs[i];
        if (r == 0) continue;  // bit 31 marks a register without descriptors
        for (int b = 0; b < 4; ++b) bytes[count++] = (uint8_t)(r >> (8 * b));
    }
    if (count == 0) return -1;
    for (const int32_t* row = table;; row += 2) {
        if (row[0] == 0) return -1;
        // The first byte is the iteration count, not a descriptor.
        for (int i = 1; i < count; ++i)
            if (bytes[i] == (uint32_t)row[0]) return row[1];
    }
}

extern "C" int32_t ownCacheSizeLeaf4(OwnCpuidFn cpuid, int32_t* line) {
    int32_t best = -1;
    for (uint32_t sub = 0; sub < 32; ++sub) {
        uint32_t r[4];
        cpuid(r, 4, sub);
        const uint32_t type = r[0] & 0x1f;
        if (type == 0) break;
        if (type == 2) continue;  // instruction cache
        const uint32_t ways = (r[1] >> 22) + 1, partitions = ((r[1] >> 12) & 0x3ff) + 1;
        const uint32_t lineSize = (r[1] & 0xfff) + 1, sets = r[2] + 1;
        // 32-bit signed arithmetic as the library always had; wraps the same.
        const int32_t size = (int32_t)(ways * partitions * lineSize * sets);
        if (best < 0 || size > best) {
            best = size;
            *line = (int32_t)lineSize;
        }
    }
    return best;
}

ZOR_EXPORT ZorStatus zorGetMaxCacheSizeB(int32_t* pSizeByte) {
    if (!pSizeByte) return zorStsNullPtrErr;
    if (szCacheMax >= 0) {
        *pSizeByte = szCacheMax;
        return ownStatus;
    }
    if (ownStatus != 1) {
        *pSizeByte = szCacheMax;
        szCacheLine = 0;
        return ownStatus;
    }
    const uint32_t maxLeaf = zor_max_cpuid_input();
    if (!zor_has_cpuid() || maxLeaf < 2 || !zor_is_GenuineTarvo()) {
        ownStatus = zorStsNotSupportedCpu;
        *pSizeByte = szCacheMax;
        szCacheLine = 0;
        return ownStatus;
    }
    int32_t size = -1, line = 0;
    if (maxLeaf >= 4) {
        size = ownCacheSizeLeaf4(hardware_cpuid, &line);
    } else {
        size = ownGetCacheSize(ownCacheTable);
    }
    if (size >= 0) {
        ownStatus = zorStsNoErr;
        szCacheLine = line;  // before the size: a reader of the size sees a line
        __asm__ volatile("" ::: "memory");
        szCacheMax = size;
        *pSizeByte = size;
        return zorStsNoErr;
    }
    ownStatus = zorStsUnknownCacheSize;
    szCacheMax = 0;
    szCacheLine = 0;
    *pSizeByte = 0;
    return ownStatus;
}

ZOR_EXPORT void zor_get_cache_line_size(int32_t* pSize) {
    if (szCacheLine < 0) {
        int32_t size;
        zorGetMaxCacheSizeB(&size);
    }
    if (pSize) *pSize = szCacheLine;
}
