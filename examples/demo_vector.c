/* Vector operations on every level: reductions and a chain of element-wise
 * operations whose checksum must not depend on the level. */
#include <stdio.h>
#include <string.h>

#include "zor.h"
#include "demo.h"

/* ---- vectors ---- */

typedef struct {
    Zor32f* a;
    Zor32f* b;
    int32_t len;
    Zor32f sum, sumFast, dot;
    ZorStatus status;
} VectorDemo;

static void vector_reduce(void* p) {
    VectorDemo* d = (VectorDemo*)p;
    d->status = zorsSum_32f(d->a, d->len, &d->sum, 0);
    zorsSum_32f(d->a, d->len, &d->sumFast, 1);
    zorsDotProd_32f(d->a, d->b, d->len, &d->dot);
}

static void vector_reduce_report(void* p, const char* level) {
    VectorDemo* d = (VectorDemo*)p;
    (void)level;
    printf("sum %.9g (fast %.9g)  dot %.9g  %s", d->sum, d->sumFast, d->dot,
           zorGetStatusString(d->status));
}

void demo_vectors(void) {
    VectorDemo d;
    d.len = 1 << 20;
    d.a = zorsMalloc_32f(d.len);
    d.b = zorsMalloc_32f(d.len);
    if (!d.a || !d.b) return;
    for (int32_t i = 0; i < d.len; ++i) {
        d.a[i] = (Zor32f)((i % 1000) * 0.001);
        d.b[i] = (Zor32f)(1.0 / (1 + i % 7));
    }
    on_every_level("sum (accurate and fast) and dot product of 2^20 floats:", vector_reduce,
                   vector_reduce_report, &d);
    zorsFree(d.a);
    zorsFree(d.b);
}

typedef struct {
    Zor32f* a;
    Zor32f* b;
    Zor32f* d;
    int32_t len;
    ZorStatus status;
} ElementDemo;

/* A chain of element-wise operations; the bit-level checksum of the result
 * is the same on every level. */
static void vector_elementwise(void* p) {
    ElementDemo* e = (ElementDemo*)p;
    e->status = zorsAdd_32f(e->a, e->b, e->d, e->len);
    zorsMulC_32f_I(e->d, e->len, 0.75f);
    zorsMaxEvery_32f(e->d, e->a, e->d, (uint32_t)e->len);
    zorsFlip_32f(e->d, e->d, e->len);
    zorsMove_32f(e->d, e->d + 3, e->len - 3);
}

static void vector_elementwise_report(void* p, const char* level) {
    ElementDemo* e = (ElementDemo*)p;
    uint32_t h = 2166136261u;
    (void)level;
    for (int32_t i = 0; i < e->len; ++i) {
        uint32_t u;
        memcpy(&u, &e->d[i], 4);
        h = (h ^ u) * 16777619u;
    }
    printf("checksum 0x%08x  %s", h, zorGetStatusString(e->status));
}

void demo_elementwise(void) {
    ElementDemo e;
    e.len = 1 << 20;
    e.a = zorsMalloc_32f(e.len);
    e.b = zorsMalloc_32f(e.len);
    e.d = zorsMalloc_32f(e.len);
    if (e.a && e.b && e.d) {
        for (int32_t i = 0; i < e.len; ++i) {
            e.a[i] = (Zor32f)((i % 997) * 0.01 - 3);
            e.b[i] = (Zor32f)(1.0 / (1 + i % 13));
        }
        on_every_level("add, multiply by a constant, maximum, flip and move of 2^20 floats:",
                       vector_elementwise, vector_elementwise_report, &e);
    }
    zorsFree(e.a);
    zorsFree(e.b);
    zorsFree(e.d);
}

