// What the resize tests share: records and work buffers placed as a
// caller would (odd addresses, guard bytes behind), and tilings of a
// destination.
#ifndef ZOR_TEST_RESIZE_SUPPORT_H
#define ZOR_TEST_RESIZE_SUPPORT_H

#include <algorithm>
#include <vector>

#include "image.h"

namespace zortest {

// A record block of the size the query gives, starting `misalign` bytes
// past a 64-byte boundary, with guard bytes behind; and its init buffer.
struct ResizeRecord {
    std::vector<uint8_t> mem, init;
    size_t offset = 0;  // of the record in mem
    int32_t specSize = 0, initSize = 0;
    ZoriResizeSpec* record() { return (ZoriResizeSpec*)(mem.data() + offset); }
    Zor8u* initBuf() { return init.data(); }
};

inline ResizeRecord resize_record(ZoriSize src, ZoriSize dst, ZoriInterpolationType method,
                                  size_t misalign = 13) {
    ResizeRecord r;
    EXPECT_EQ(zoriResizeGetSize_8u(src, dst, method, 0, &r.specSize, &r.initSize), zorStsNoErr);
    // Over-allocate, then pick the start so that it sits `misalign` past a
    // 64-byte boundary; everything behind the record keeps the guard byte.
    r.mem = guarded((size_t)r.specSize + 128);
    r.offset = ((64 - ((uintptr_t)r.mem.data() & 63)) + misalign) & 63;
    r.init = guarded((size_t)r.initSize);
    return r;
}

// Whether nothing was written past the record's or init buffer's size.
inline bool record_guards_intact(const ResizeRecord& r) {
    return guard_intact(r.mem, r.offset + (size_t)r.specSize) &&
           guard_intact(r.init, (size_t)r.initSize);
}

// A work buffer of the queried size for tiles up to `tile`, guard behind.
inline std::vector<uint8_t> resize_buffer(const ZoriResizeSpec* record, ZoriSize tile,
                                          int32_t* size = nullptr) {
    int32_t n = 0;
    const ZorStatus st = zoriResizeGetBufferSize_8u(record, tile, 1, &n);
    EXPECT_TRUE(st == zorStsNoErr || st == zorStsSizeWrn) << st;
    if (size) *size = n;
    return guarded((size_t)n);
}

// A random partition of a w x h destination into rectangles: random cuts
// of the columns and of the rows, each band pair a tile.
inline std::vector<ZoriRect> random_tiles(ZoriSize dst, Rng& rng, int32_t maxCuts = 4) {
    auto cuts = [&](int32_t len) {
        std::vector<int32_t> c{0};
        const int32_t n = (int32_t)rng.below((uint32_t)maxCuts + 1);
        for (int32_t i = 0; i < n && len > 1; ++i) c.push_back(1 + (int32_t)rng.below((uint32_t)len - 1));
        c.push_back(len);
        std::sort(c.begin(), c.end());
        c.erase(std::unique(c.begin(), c.end()), c.end());
        return c;
    };
    const std::vector<int32_t> xs = cuts(dst.width), ys = cuts(dst.height);
    std::vector<ZoriRect> tiles;
    for (size_t j = 0; j + 1 < ys.size(); ++j)
        for (size_t i = 0; i + 1 < xs.size(); ++i)
            tiles.push_back({xs[i], ys[j], xs[i + 1] - xs[i], ys[j + 1] - ys[j]});
    return tiles;
}

}  // namespace zortest

#endif
