// Resizing one large image on several threads: one record for the whole
// image, one work buffer per thread, the destination cut into tiles that
// the threads take in turn. Each tile's source pointer comes from
// zoriResizeGetSrcOffset_*; the tiles together must give exactly what one
// call over the whole image gives, which this program checks. It exits
// with 1 on any difference or error, 0 otherwise (a method this build
// does not offer yet is reported and skipped).
#include <stdio.h>
#include <string.h>

#include <algorithm>
#include <atomic>
#include <thread>
#include <vector>

#include "zor.h"

namespace {

constexpr int32_t kSW = 4000, kSH = 3000, kDW = 2560, kDH = 1440;
constexpr int32_t kTileW = 512, kTileH = 96;

enum class Method { nearest, linear, cubic };

const char* name(Method m) {
    return m == Method::nearest ? "nearest" : m == Method::linear ? "linear" : "cubic";
}

// One tile through the operation of the method; p points at the tile's
// first source pixel.
ZorStatus run(Method m, const Zor8u* p, Zor8u* d, ZoriPoint o, ZoriSize z,
              const ZoriResizeSpec* record, Zor8u* buf) {
    if (m == Method::nearest) return zoriResizeNearest_8u_C1R(p, kSW, d, kDW, o, z, record, buf);
    if (m == Method::linear)
        return zoriResizeLinear_8u_C1R(p, kSW, d, kDW, o, z, zorBorderRepl, nullptr, record, buf);
    return zoriResizeCubic_8u_C1R(p, kSW, d, kDW, o, z, zorBorderRepl, nullptr, record, buf);
}
ZorStatus run(Method m, const Zor32f* p, Zor32f* d, ZoriPoint o, ZoriSize z,
              const ZoriResizeSpec* record, Zor8u* buf) {
    const int32_t ss = kSW * 4, ds = kDW * 4;
    if (m == Method::nearest) return zoriResizeNearest_32f_C1R(p, ss, d, ds, o, z, record, buf);
    if (m == Method::linear)
        return zoriResizeLinear_32f_C1R(p, ss, d, ds, o, z, zorBorderRepl, nullptr, record, buf);
    return zoriResizeCubic_32f_C1R(p, ss, d, ds, o, z, zorBorderRepl, nullptr, record, buf);
}

ZorStatus init(Method m, bool isFloat, ZoriResizeSpec* record, Zor8u* initBuf) {
    const ZoriSize s{kSW, kSH}, d{kDW, kDH};
    if (m == Method::nearest) return zoriResizeNearestInit_8u(s, d, record);
    if (m == Method::linear)
        return isFloat ? zoriResizeLinearInit_32f(s, d, record) : zoriResizeLinearInit_8u(s, d, record);
    return isFloat ? zoriResizeCubicInit_32f(s, d, 0.0f, 0.5f, record, initBuf)
                   : zoriResizeCubicInit_8u(s, d, 0.0f, 0.5f, record, initBuf);
}

// 0 when the tiles equal the single call, 1 on a difference or an error,
// -1 when the method is not available.
template <typename T>
int check(Method m, unsigned threads) {
    const bool isFloat = sizeof(T) == 4;
    const ZoriInterpolationType kind = m == Method::nearest  ? zoriInterNN
                                       : m == Method::linear ? zoriInterLinear
                                                             : zoriInterCubic;
    printf("%s %s, %dx%d -> %dx%d, %u threads: ", name(m), isFloat ? "32f" : "8u", kSW, kSH, kDW,
           kDH, threads);
    int32_t specSize = 0, initSize = 0;
    ZorStatus st = zoriResizeGetSize_8u({kSW, kSH}, {kDW, kDH}, kind, 0, &specSize, &initSize);
    std::vector<Zor8u> rec(specSize > 0 ? specSize : 1), initBuf(initSize > 0 ? initSize : 1);
    ZoriResizeSpec* record = (ZoriResizeSpec*)rec.data();
    if (st == zorStsNoErr) st = init(m, isFloat, record, initBuf.data());
    if (st != zorStsNoErr) {
        printf("not available (%d: %s)\n", (int)st, zorGetStatusString(st));
        return -1;
    }

    // A picture with detail at every scale: a ramp crossed by a pattern.
    std::vector<T> src((size_t)kSW * kSH);
    for (int32_t y = 0; y < kSH; ++y)
        for (int32_t x = 0; x < kSW; ++x)
            src[(size_t)y * kSW + x] = (T)(((x * 7 + y * 3) & 255) ^ ((x * y) >> 9 & 63));

    // The reference: the whole destination in one call.
    int32_t bufSize = 0;
    zoriResizeGetBufferSize_8u(record, {kDW, kDH}, 1, &bufSize);
    std::vector<Zor8u> whole(bufSize);
    std::vector<T> once((size_t)kDW * kDH), tiled((size_t)kDW * kDH);
    st = run(m, src.data(), once.data(), {0, 0}, {kDW, kDH}, record, whole.data());
    if (st != zorStsNoErr) {
        printf("single call failed (%d: %s)\n", (int)st, zorGetStatusString(st));
        return 1;
    }

    // The tiles: a shared counter hands them out; each thread keeps its
    // own buffer, sized once for the largest tile.
    const int32_t across = (kDW + kTileW - 1) / kTileW, down = (kDH + kTileH - 1) / kTileH;
    zoriResizeGetBufferSize_8u(record, {kTileW, kTileH}, 1, &bufSize);
    std::atomic<int32_t> next{0};
    std::atomic<int32_t> failed{zorStsNoErr};
    auto worker = [&] {
        std::vector<Zor8u> buf(bufSize);
        for (int32_t k; (k = next++) < across * down;) {
            const ZoriPoint o{k % across * kTileW, k / across * kTileH};
            const ZoriSize z{std::min(kTileW, kDW - o.x), std::min(kTileH, kDH - o.y)};
            ZoriPoint at{0, 0};
            ZorStatus s = zoriResizeGetSrcOffset_8u(record, o, &at);
            if (s == zorStsNoErr)
                s = run(m, src.data() + (size_t)at.y * kSW + at.x,
                        tiled.data() + (size_t)o.y * kDW + o.x, o, z, record, buf.data());
            if (s != zorStsNoErr) failed = s;
        }
    };
    std::vector<std::thread> pool;
    for (unsigned t = 0; t < threads; ++t) pool.emplace_back(worker);
    for (std::thread& t : pool) t.join();
    if (failed != zorStsNoErr) {
        printf("a tile failed (%d: %s)\n", (int)failed, zorGetStatusString(failed));
        return 1;
    }
    // Bytes, not values: float results must match bit for bit.
    if (memcmp(once.data(), tiled.data(), once.size() * sizeof(T))) {
        size_t i = 0;
        while (!memcmp(&once[i], &tiled[i], sizeof(T))) ++i;
        printf("MISMATCH at (%d, %d)\n", (int)(i % kDW), (int)(i / kDW));
        return 1;
    }
    printf("%d tiles equal the single call\n", across * down);
    return 0;
}

}  // namespace

int main() {
    const unsigned threads = std::max(2u, std::min(8u, std::thread::hardware_concurrency()));
    printf("Tiled resize on several threads, one record, a buffer per thread\n");
    int bad = 0;
    for (Method m : {Method::nearest, Method::linear, Method::cubic}) {
        // Linear in 8u (fixed point), cubic in 32f, and nearest in both.
        if (m != Method::cubic) bad |= check<Zor8u>(m, threads) > 0;
        if (m != Method::linear) bad |= check<Zor32f>(m, threads) > 0;
    }
    printf(bad ? "tiled resize: FAILED\n" : "tiled resize: ok\n");
    return bad;
}
