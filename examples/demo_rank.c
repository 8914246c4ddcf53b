/* Median and morphology on every level: a pattern spoilt by salt-and-pepper
 * noise is cleaned by a 5x5 median and thickened by a dilation with a 5x5
 * disc; each level must give the same pixels, which the checksums show. */
#include <stdio.h>
#include <stdlib.h>

#include "zor.h"
#include "demo.h"

enum { kW = 640, kH = 480 };

typedef struct {
    const Zor8u* src;
    Zor8u* dst;
    Zor8u* buffer;
    ZoriMorphState* state;
    ZorStatus status;
    uint32_t first;  /* checksum of the first level */
    int levels;
    int differ;
} RankDemo;

static uint32_t checksum(const Zor8u* p, size_t n) {
    uint32_t h = 2166136261u;
    for (size_t i = 0; i < n; ++i) h = (h ^ p[i]) * 16777619u;
    return h;
}

static void run_median(void* ctx) {
    RankDemo* d = (RankDemo*)ctx;
    ZoriSize roi = {kW, kH}, mask = {5, 5};
    d->status = zoriFilterMedianBorder_8u_C1R(d->src, kW, d->dst, kW, roi, mask, zorBorderRepl, 0,
                                              d->buffer);
}

static void run_dilate(void* ctx) {
    RankDemo* d = (RankDemo*)ctx;
    ZoriSize roi = {kW, kH};
    d->status =
        zoriDilateBorder_8u_C1R(d->src, kW, d->dst, kW, roi, zorBorderRepl, 0, d->state, d->buffer);
}

static void report(void* ctx, const char* level) {
    RankDemo* d = (RankDemo*)ctx;
    const uint32_t sum = checksum(d->dst, (size_t)kW * kH);
    (void)level;
    if (d->levels++ == 0) d->first = sum;
    else if (sum != d->first) d->differ = 1;
    printf("status %d  checksum %08x%s", (int)d->status, (unsigned)sum,
           sum == d->first ? "" : "  DIFFERS");
}

/* Rings of equal width need the radius itself; the demo links no libm. */
static int32_t isqrt(uint32_t v) {
    uint32_t r = 0;
    while ((r + 1) * (r + 1) <= v) ++r;
    return (int32_t)r;
}

static void rank_images(Zor8u* src, Zor8u* median, Zor8u* dilated, Zor8u* buffer,
                        ZoriMorphState* state) {
    static const Zor8u disc[25] = {0, 1, 1, 1, 0, 1, 1, 1, 1, 1, 1, 1, 1,
                                   1, 1, 1, 1, 1, 1, 1, 0, 1, 1, 1, 0};
    const ZoriSize roi = {kW, kH}, mask = {5, 5};
    /* Rings and a diagonal ramp, then one pixel in ten made black or white. */
    uint32_t rng = 12345;
    for (int32_t y = 0; y < kH; ++y)
        for (int32_t x = 0; x < kW; ++x) {
            const int32_t dx = x - kW / 2, dy = y - kH / 2;
            const int32_t ring = (isqrt((uint32_t)(dx * dx + dy * dy)) / 24) & 1;
            Zor8u v = (Zor8u)(ring ? 200 - (x + y) / 8 : 40 + (x + y) / 8);
            rng = rng * 1103515245u + 12345u;
            const uint32_t r = (rng >> 16) % 20;
            if (r == 0) v = 0;
            else if (r == 1) v = 255;
            src[(size_t)y * kW + x] = v;
        }
    write_pgm("rank_noisy.pgm", src, kW, kW, kH);

    RankDemo d = {src, median, buffer, state, zorStsNoErr, 0, 0, 0};
    on_every_level("Median 5x5, 640x480 8u, replicated border", run_median, report, &d);
    if (d.differ) printf("  levels differ!\n");
    write_pgm("rank_median.pgm", median, kW, kW, kH);

    zoriMorphologyBorderInit_8u_C1R(roi, disc, mask, state, buffer);
    RankDemo m = {median, dilated, buffer, state, zorStsNoErr, 0, 0, 0};
    on_every_level("Dilation of the median by a 5x5 disc", run_dilate, report, &m);
    if (m.differ) printf("  levels differ!\n");
    write_pgm("rank_dilated.pgm", dilated, kW, kW, kH);
}

void demo_rank(void) {
    const ZoriSize roi = {kW, kH}, mask = {5, 5};
    int32_t medianSize = 0, specSize = 0, morphSize = 0;
    zoriFilterMedianBorderGetBufferSize(roi, mask, zor8u, 1, &medianSize);
    zoriMorphologyBorderGetSize_8u_C1R(roi, mask, &specSize, &morphSize);
    Zor8u* src = (Zor8u*)malloc((size_t)kW * kH);
    Zor8u* median = (Zor8u*)malloc((size_t)kW * kH);
    Zor8u* dilated = (Zor8u*)malloc((size_t)kW * kH);
    Zor8u* buffer = (Zor8u*)malloc((size_t)(medianSize > morphSize ? medianSize : morphSize));
    ZoriMorphState* state = (ZoriMorphState*)malloc((size_t)specSize);
    if (src && median && dilated && buffer && state)
        rank_images(src, median, dilated, buffer, state);
    else
        printf("demo_rank: out of memory\n");
    free(state);
    free(buffer);
    free(dilated);
    free(median);
    free(src);
}
