/* Linear filtering on every level: a generated test card (rings, bars of
 * text-like strokes and a hard-edged box) smoothed by a 5x5 binomial
 * kernel and run through a 3x3 sharpen and an emboss (edge) kernel. Integer results
 * of the vector paths round to nearest on every level, so the checksums of
 * the 8u results agree across levels. */
#include <stdio.h>
#include <stdlib.h>

#include "zor.h"
#include "demo.h"

enum { kW = 640, kH = 400 };

typedef struct {
    const char* name;
    const Zor8u* src;
    Zor8u* dst;
    const ZoriFilterBorderSpec* rec;
    Zor8u* buffer;
    ZorStatus status;
} FilterRun;

static void make_card(Zor8u* img) {
    for (int y = 0; y < kH; ++y)
        for (int x = 0; x < kW; ++x) {
            /* Rings that get closer outwards: a triangle wave of r^2. */
            const int dx = x - kW * 35 / 100, dy = y - kH / 2;
            const int phase = (dx * dx + dy * dy) * 3 / 20 % 512;
            int v = 28 + (phase < 256 ? phase : 511 - phase) * 200 / 255;
            /* "Text": rows of short strokes of varying width at the right. */
            if (x > kW * 0.65 && x < kW - 20 && (y / 14) % 2 == 0 && y % 14 > 2) {
                const int glyph = (x / 9) * 7 + y / 28;
                if ((x % 9) < 1 + glyph % 4 && glyph % 5 != 0) v = 20;
            }
            if (x > 30 && x < 90 && y > kH - 90 && y < kH - 30) v = 240;
            img[y * kW + x] = (Zor8u)v;
        }
}

static void run_filter(void* ctx) {
    FilterRun* f = (FilterRun*)ctx;
    f->status = zoriFilterBorder_8u_C1R(f->src, kW, f->dst, kW, (ZoriSize){kW, kH},
                                        zorBorderRepl, NULL, f->rec, f->buffer);
}

static void report_filter(void* ctx, const char* level) {
    const FilterRun* f = (const FilterRun*)ctx;
    unsigned long sum = 0, weighted = 0;
    (void)level;
    for (int i = 0; i < kW * kH; ++i) {
        sum += f->dst[i];
        weighted = (weighted * 31u + f->dst[i]) % 1000000007u;
    }
    printf("status %d  sum %lu  checksum %lu", (int)f->status, sum, weighted);
}

/* Makes the record for one kernel, runs it on every level and writes the
 * last level's result. */
static void one_kernel(const char* title, const char* file, const float* taps, int k,
                       const Zor8u* src, Zor8u* dst) {
    int32_t specSize = 0, bufSize = 0;
    ZorStatus st = zoriFilterBorderGetSize((ZoriSize){k, k}, (ZoriSize){kW, kH}, zor8u, zor32f,
                                           1, &specSize, &bufSize);
    Zor8u* rec = st == zorStsNoErr ? (Zor8u*)zorMalloc(specSize) : NULL;
    Zor8u* buffer = st == zorStsNoErr ? (Zor8u*)zorMalloc(bufSize) : NULL;
    if (!rec || !buffer) {
        printf("%s: no memory (%s)\n", title, zorGetStatusString(st));
    } else if ((st = zoriFilterBorderInit_32f(taps, (ZoriSize){k, k}, zor8u, 1, 1,
                                              (ZoriFilterBorderSpec*)rec)) != zorStsNoErr) {
        printf("%s: %s\n", title, zorGetStatusString(st));
    } else {
        FilterRun f = {title, src, dst, (const ZoriFilterBorderSpec*)rec, buffer, 0};
        on_every_level(title, run_filter, report_filter, &f);
        write_pgm(file, dst, kW, kW, kH);
    }
    zorFree(rec);
    zorFree(buffer);
}

void demo_filter(void) {
    static const float binomial[5] = {1, 4, 6, 4, 1};
    float blur[25];
    for (int j = 0; j < 5; ++j)
        for (int i = 0; i < 5; ++i) blur[j * 5 + i] = binomial[j] * binomial[i] / 256.0f;
    static const float sharpen[9] = {0, -1, 0, -1, 5, -1, 0, -1, 0};
    /* Emboss: the pixel plus its difference along the diagonal. */
    static const float emboss[9] = {-1, -1, 0, -1, 1, 1, 0, 1, 1};

    Zor8u* card = (Zor8u*)zorMalloc(kW * kH);
    Zor8u* out = (Zor8u*)zorMalloc(kW * kH);
    if (!card || !out) {
        printf("filter demo: no memory\n");
    } else {
        make_card(card);
        write_pgm("filter_input.pgm", card, kW, kW, kH);
        one_kernel("filter 5x5 binomial blur, 8u, replicated border", "filter_blur5x5.pgm",
                   blur, 5, card, out);
        one_kernel("filter 3x3 sharpen, 8u, replicated border", "filter_sharpen3x3.pgm", sharpen,
                   3, card, out);
        one_kernel("filter 3x3 emboss, 8u, replicated border", "filter_emboss3x3.pgm", emboss,
                   3, card, out);
    }
    zorFree(card);
    zorFree(out);
}
