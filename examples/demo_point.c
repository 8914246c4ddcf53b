/* Image point operations on every level: a chain of float arithmetic whose
 * checksum does not depend on the level, and the float division, whose
 * quotients differ by level by design (reciprocal estimates on the SSE and
 * AVX levels, true division on AVX-512). */
#include <stdio.h>
#include <string.h>

#include "zor.h"
#include "demo.h"

typedef struct {
    Zor32f *a, *b, *d, *q;
    Zor8u *mask, *a8, *b8, *d8;
    int32_t step, step8;
    ZoriSize roi;
    ZorStatus status, divStatus;
} PointDemo;

static uint32_t checksum(const void* p, size_t bytes) {
    const unsigned char* c = (const unsigned char*)p;
    uint32_t h = 2166136261u;
    for (size_t i = 0; i < bytes; ++i) h = (h ^ c[i]) * 16777619u;
    return h;
}

static void point_chain(void* p) {
    PointDemo* e = (PointDemo*)p;
    const int32_t s = e->step;
    e->status = zoriSub_32f_C1R(e->a, s, e->b, s, e->d, s, e->roi);        /* b - a */
    zoriMulC_32f_C1R(e->d, s, e->d, s, e->roi, 0.75f);
    zoriAbsDiffC_32f_C1R(e->d, s, e->d, s, e->roi, 0.5f);
    zoriSqr_32f_C1R(e->d, s, e->d, s, e->roi);
    zoriAddProduct_32f_C1IMR(e->a, s, e->b, s, e->mask, e->step8, e->d, s, e->roi);
    zoriDivC_32f_C1R(e->d, s, e->d, s, e->roi, 3.0f);
    zoriAbsDiff_8u_C1R(e->a8, e->step8, e->b8, e->step8, e->d8, e->step8, e->roi);
    e->divStatus = zoriDiv_32f_C1R(e->a, s, e->b, s, e->q, s, e->roi);     /* b / a */
}

static void point_report(void* p, const char* level) {
    PointDemo* e = (PointDemo*)p;
    const size_t n = (size_t)e->roi.width * (size_t)e->roi.height;
    double worst = 0;
    (void)level;
    for (size_t i = 0; i < n; ++i) {
        if (e->a[i] == 0 || e->b[i] == 0) continue;
        const double exact = (double)e->b[i] / e->a[i];
        double err = (e->q[i] - exact) / exact;
        if (err < 0) err = -err;
        if (err > worst) worst = err;
    }
    printf("chain 0x%08x (same everywhere)  div 0x%08x, worst relative error %.2g (by level)  %s",
           checksum(e->d, n * 4) ^ checksum(e->d8, n), checksum(e->q, n * 4), worst,
           zorGetStatusString(e->status));
}

void demo_point(void) {
    PointDemo e;
    memset(&e, 0, sizeof e);
    e.roi.width = 640;
    e.roi.height = 480;
    e.a = zoriMalloc_32f_C1(640, 480, &e.step);
    e.b = zoriMalloc_32f_C1(640, 480, &e.step);
    e.d = zoriMalloc_32f_C1(640, 480, &e.step);
    e.q = zoriMalloc_32f_C1(640, 480, &e.step);
    e.mask = zoriMalloc_8u_C1(640, 480, &e.step8);
    e.a8 = zoriMalloc_8u_C1(640, 480, &e.step8);
    e.b8 = zoriMalloc_8u_C1(640, 480, &e.step8);
    e.d8 = zoriMalloc_8u_C1(640, 480, &e.step8);
    if (e.a && e.b && e.d && e.q && e.mask && e.a8 && e.b8 && e.d8) {
        for (int32_t y = 0; y < 480; ++y)
            for (int32_t x = 0; x < 640; ++x) {
                Zor32f* a = (Zor32f*)((char*)e.a + (size_t)y * e.step);
                Zor32f* b = (Zor32f*)((char*)e.b + (size_t)y * e.step);
                a[x] = (Zor32f)((x - 320) * 0.01 + y * 0.003);
                b[x] = (Zor32f)(((x * 7 + y * 13) % 101 - 50) * 0.08);
                e.mask[(size_t)y * e.step8 + x] = (Zor8u)((x ^ y) & 4);
                e.a8[(size_t)y * e.step8 + x] = (Zor8u)(x + y);
                e.b8[(size_t)y * e.step8 + x] = (Zor8u)(x * y >> 4);
            }
        /* Rows are contiguous for the checksums: steps of exactly a row. */
        if (e.step == 640 * 4 && e.step8 == 640)
            on_every_level("point chain on 640x480 (sub, mul by constant, abs difference, square, "
                           "masked product, divide by constant, 8u abs difference) and b / a:",
                           point_chain, point_report, &e);
        else
            printf("\npoint chain skipped: padded rows\n");
        (void)e.divStatus;
    }
    zoriFree(e.a);
    zoriFree(e.b);
    zoriFree(e.d);
    zoriFree(e.q);
    zoriFree(e.mask);
    zoriFree(e.a8);
    zoriFree(e.b8);
    zoriFree(e.d8);
}
