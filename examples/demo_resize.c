/* Resize on every level: a 640x480 picture of rings and fine stripes made
 * 1.5 times larger by nearest neighbour, linear, cubic and three-lobe
 * Lanczos interpolation, and 3.2 times smaller with antialiasing (the
 * linear kernel widened to the reduction), 8u and 32f. Nearest copies pixels and the 8u linear path is fixed point,
 * so their checksums agree on every level; the float paths of the levels
 * with fused multiply-add (l9, n0, k0) may differ in the last bit from the
 * others, which the output says instead of calling it a difference. */
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include "demo.h"
#include "zor.h"

enum { kSW = 640, kSH = 480, kDW = 960, kDH = 720, kAW = 200, kAH = 150 };

typedef enum { kNearest, kLinear, kCubic, kLanczos, kAntialiasing } Method;

static ZoriSize dst_size(Method m) {
    const ZoriSize grown = {kDW, kDH}, shrunk = {kAW, kAH};
    return m == kAntialiasing ? shrunk : grown;
}

typedef struct {
    Method method;
    int isFloat;
    const void* src;
    void* dst;
    const ZoriResizeSpec* record;
    Zor8u* buffer;
    ZorStatus status;
    uint32_t first[2]; /* first checksum of the levels without and with FMA */
    int seen[2];
    int differ;
} ResizeDemo;

static uint32_t checksum(const void* p, size_t n) {
    const Zor8u* b = (const Zor8u*)p;
    uint32_t h = 2166136261u;
    for (size_t i = 0; i < n; ++i) h = (h ^ b[i]) * 16777619u;
    return h;
}

static int fused(const char* level) {
    return !strcmp(level, "l9") || !strcmp(level, "n0") || !strcmp(level, "k0");
}

static void run_resize(void* ctx) {
    ResizeDemo* d = (ResizeDemo*)ctx;
    const ZoriPoint at = {0, 0};
    const ZoriSize size = dst_size(d->method);
    const int32_t ss = kSW * (d->isFloat ? 4 : 1), ds = size.width * (d->isFloat ? 4 : 1);
    const Method m = d->method;
    if (d->isFloat) {
        const Zor32f* s = (const Zor32f*)d->src;
        Zor32f* o = (Zor32f*)d->dst;
        if (m == kNearest) {
            d->status = zoriResizeNearest_32f_C1R(s, ss, o, ds, at, size, d->record, d->buffer);
            return;
        }
        d->status = (m == kLinear    ? zoriResizeLinear_32f_C1R
                     : m == kCubic   ? zoriResizeCubic_32f_C1R
                     : m == kLanczos ? zoriResizeLanczos_32f_C1R
                                     : zoriResizeAntialiasing_32f_C1R)(
            s, ss, o, ds, at, size, zorBorderRepl, NULL, d->record, d->buffer);
    } else {
        const Zor8u* s = (const Zor8u*)d->src;
        Zor8u* o = (Zor8u*)d->dst;
        if (m == kNearest) {
            d->status = zoriResizeNearest_8u_C1R(s, ss, o, ds, at, size, d->record, d->buffer);
            return;
        }
        d->status = (m == kLinear    ? zoriResizeLinear_8u_C1R
                     : m == kCubic   ? zoriResizeCubic_8u_C1R
                     : m == kLanczos ? zoriResizeLanczos_8u_C1R
                                     : zoriResizeAntialiasing_8u_C1R)(
            s, ss, o, ds, at, size, zorBorderRepl, NULL, d->record, d->buffer);
    }
}

/* Exact methods compare every level with the first; float ones compare
 * within the levels with FMA and within those without. */
static void report(void* ctx, const char* level) {
    ResizeDemo* d = (ResizeDemo*)ctx;
    const ZoriSize size = dst_size(d->method);
    const uint32_t sum =
        checksum(d->dst, (size_t)size.width * size.height * (d->isFloat ? 4 : 1));
    const int exact = d->method == kNearest || (d->method == kLinear && !d->isFloat);
    const int group = exact ? 0 : fused(level);
    const char* note = "";
    if (!d->seen[group]) {
        d->seen[group] = 1;
        d->first[group] = sum;
        if (group && d->seen[0] && sum != d->first[0])
            note = "  (FMA levels: may differ in the last bit)";
    } else if (sum != d->first[group]) {
        note = "  DIFFERS";
        d->differ = 1;
    }
    printf("status %d  checksum %08x%s", (int)d->status, (unsigned)sum, note);
}

/* 32f results in 0..255 shown as 8u, rounded and clamped. */
static void to_8u(const Zor32f* f, Zor8u* out, size_t n) {
    for (size_t i = 0; i < n; ++i) {
        const float v = f[i] + 0.5f;
        out[i] = (Zor8u)(v <= 0 ? 0 : v >= 255 ? 255 : (int)v);
    }
}

/* Fills the record for one method and type; returns the Init status. */
static ZorStatus make_record(Method m, int isFloat, ZoriResizeSpec* record, Zor8u* init) {
    const ZoriSize s = {kSW, kSH}, d = dst_size(m);
    if (m == kNearest) return zoriResizeNearestInit_8u(s, d, record);
    if (m == kLinear)
        return isFloat ? zoriResizeLinearInit_32f(s, d, record) : zoriResizeLinearInit_8u(s, d, record);
    if (m == kLanczos) return zoriResizeLanczosInit_8u(s, d, 3, record, init);
    if (m == kAntialiasing) return zoriResizeAntialiasingLinearInit(s, d, record, init);
    /* Catmull-Rom. */
    return isFloat ? zoriResizeCubicInit_32f(s, d, 0.0f, 0.5f, record, init)
                   : zoriResizeCubicInit_8u(s, d, 0.0f, 0.5f, record, init);
}

static void resize_method(Method m, int isFloat, const void* src, void* dst, Zor8u* view) {
    static const char* names[] = {"nearest", "linear", "cubic", "lanczos", "antialiasing"};
    static const ZoriInterpolationType kinds[] = {zoriInterNN, zoriInterLinear, zoriInterCubic,
                                                  zoriInterLanczos, zoriInterLinear};
    const ZoriSize s = {kSW, kSH}, d = dst_size(m);
    int32_t specSize = 0, initSize = 0, bufSize = 0;
    char title[96], file[64];
    snprintf(title, sizeof title, "Resize %s %s, %dx%d -> %dx%d", names[m], isFloat ? "32f" : "8u",
             kSW, kSH, d.width, d.height);
    ZorStatus st = zoriResizeGetSize_8u(s, d, kinds[m], m == kAntialiasing, &specSize, &initSize);
    Zor8u* rec = st == zorStsNoErr ? (Zor8u*)malloc((size_t)specSize) : NULL;
    Zor8u* init = st == zorStsNoErr ? (Zor8u*)malloc((size_t)initSize) : NULL;
    if (rec && init) st = make_record(m, isFloat, (ZoriResizeSpec*)rec, init);
    if (st == zorStsNoErr) st = zoriResizeGetBufferSize_8u((ZoriResizeSpec*)rec, d, 1, &bufSize);
    Zor8u* buffer = st == zorStsNoErr ? (Zor8u*)malloc((size_t)bufSize) : NULL;
    if (!buffer) {
        printf("\n%s\n  not run: %s (%d)\n", title, zorGetStatusString(st), (int)st);
    } else {
        ResizeDemo r = {m, isFloat, src, dst, (ZoriResizeSpec*)rec, buffer, 0, {0, 0}, {0, 0}, 0};
        on_every_level(title, run_resize, report, &r);
        if (r.differ) printf("  levels differ!\n");
        if (isFloat) to_8u((const Zor32f*)dst, view, (size_t)d.width * d.height);
        snprintf(file, sizeof file, "resize_%s_%s.pgm", names[m], isFloat ? "32f" : "8u");
        if (r.status == zorStsNoErr)
            write_pgm(file, isFloat ? view : (Zor8u*)dst, d.width, d.width, d.height);
    }
    free(buffer);
    free(init);
    free(rec);
}

void demo_resize(void) {
    Zor8u* src = (Zor8u*)malloc((size_t)kSW * kSH);
    Zor32f* srcf = (Zor32f*)malloc((size_t)kSW * kSH * 4);
    void* dst = malloc((size_t)kDW * kDH * 4);
    Zor8u* view = (Zor8u*)malloc((size_t)kDW * kDH);
    if (!src || !srcf || !dst || !view) {
        printf("demo_resize: out of memory\n");
    } else {
        /* Rings by squared radius (no libm), with stripes one pixel wide in
         * the left third, where nearest and the filters part most. */
        for (int32_t y = 0; y < kSH; ++y)
            for (int32_t x = 0; x < kSW; ++x) {
                const int32_t dx = x - kSW / 2, dy = y - kSH / 2;
                Zor8u v = (Zor8u)((((dx * dx + dy * dy) >> 9) & 1) ? 220 : 30);
                if (x < kSW / 3) v = (Zor8u)((x & 1) ? 200 : 60);
                src[(size_t)y * kSW + x] = v;
                srcf[(size_t)y * kSW + x] = (Zor32f)v;
            }
        write_pgm("resize_source.pgm", src, kSW, kSW, kSH);
        for (int m = kNearest; m <= kAntialiasing; ++m) {
            resize_method((Method)m, 0, src, dst, view);
            resize_method((Method)m, 1, srcf, dst, view);
        }
    }
    free(view);
    free(dst);
    free(srcf);
    free(src);
}
