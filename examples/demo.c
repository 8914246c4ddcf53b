/* Shows what the library found on this machine and which levels it can
 * run: detected features, the selected level and why, every level's
 * version record, cache and core answers. */
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <time.h>

#include "zor.h"
#include "zor_levels.h"

static const struct {
    uint64_t bit;
    const char* name;
} feature_names[] = {
    {zorFeatureMMX, "MMX"}, {zorFeatureSSE, "SSE"}, {zorFeatureSSE2, "SSE2"},
    {zorFeatureSSE3, "SSE3"}, {zorFeatureSSSE3, "SSSE3"}, {zorFeatureMOVBE, "MOVBE"},
    {zorFeatureSSE41, "SSE4.1"}, {zorFeatureSSE42, "SSE4.2"}, {zorFeatureAVX, "AVX"},
    {zorFeatureAVXState, "AVX-state"}, {zorFeatureAES, "AES"},
    {zorFeaturePCLMULQDQ, "PCLMULQDQ"}, {zorFeatureRDRAND, "RDRAND"}, {zorFeatureF16C, "F16C"},
    {zorFeatureAVX2, "AVX2+FMA+BMI"}, {zorFeatureADX, "ADX"}, {zorFeatureRDSEED, "RDSEED"},
    {zorFeaturePREFETCHW, "PREFETCHW"}, {zorFeatureSHA, "SHA"}, {zorFeatureAVX512F, "AVX512F"},
    {zorFeatureAVX512CD, "AVX512CD"}, {zorFeatureAVX512ER, "AVX512ER"},
    {zorFeatureAVX512PF, "AVX512PF"}, {zorFeatureAVX512BW, "AVX512BW"},
    {zorFeatureAVX512DQ, "AVX512DQ"}, {zorFeatureAVX512VL, "AVX512VL"},
    {zorFeatureAVX512VBMI, "AVX512VBMI"}, {zorFeatureMPX, "MPX"},
    {zorFeatureAVX5124FMAPS, "AVX5124FMAPS"}, {zorFeatureAVX5124VNNIW, "AVX5124VNNIW"},
    {zorFeatureCoprocessorB1, "CoprocessorB1"}, {zorFeatureAVX512IFMA, "AVX512IFMA"},
    {zorFeatureAVX512State, "AVX512-state"},
};

static const struct {
    int index;
    const char* name;
    uint64_t select;
    uint64_t need;
} levels[] = {
#define DEMO_LEVEL(index, name, select, need) {index, #name, select, need},
    ZOR_LEVEL_LIST(DEMO_LEVEL)
#undef DEMO_LEVEL
};

static double now_us(void) {
    struct timespec t;
    clock_gettime(CLOCK_MONOTONIC, &t);
    return t.tv_sec * 1e6 + t.tv_nsec / 1e3;
}

static int level_runs(size_t i, uint64_t detected) {
    return (detected & levels[i].need) == levels[i].need;
}

/* Runs `op` once per runnable level (forcing the level), printing the best
 * of a few timings and what `report` says about the result. */
typedef void (*DemoOp)(void* ctx);
typedef void (*DemoReport)(void* ctx, const char* level);
static void on_every_level(const char* title, DemoOp op, DemoReport report, void* ctx) {
    uint64_t detected = 0;
    zorGetCpuFeatures(&detected, NULL);
    printf("\n%s\n", title);
    for (size_t i = 0; i < sizeof levels / sizeof levels[0]; ++i) {
        if (!level_runs(i, detected)) continue;
        zorSetCpuFeatures(levels[i].select);
        double best = 1e30;
        for (int rep = 0; rep < 5; ++rep) {
            double t0 = now_us();
            op(ctx);
            double t = now_us() - t0;
            if (t < best) best = t;
        }
        printf("  %s %10.1f us  ", levels[i].name, best);
        report(ctx, levels[i].name);
        printf("\n");
    }
    zorInit();
}

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

static void demo_vectors(void) {
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

static void demo_elementwise(void) {
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

static void print_features(const char* title, uint64_t word) {
    printf("%-18s 0x%012llx ", title, (unsigned long long)word);
    for (size_t i = 0; i < sizeof feature_names / sizeof feature_names[0]; ++i)
        if (word & feature_names[i].bit) printf(" %s", feature_names[i].name);
    printf("\n");
}

int main(void) {
    uint64_t detected = 0;
    ZorStatus s = zorGetCpuFeatures(&detected, NULL);
    printf("zor demo\n========\n\n");
    print_features("detected features", detected);
    printf("  (zorGetCpuFeatures: %s)\n", zorGetStatusString(s));

    /* The selection the loader made, repeated here to show its status. */
    int32_t loaded = zorJumpIndexForMergedLibs;
    ZorStatus init = zorInit();
    print_features("enabled features", zorGetEnabledCpuFeatures());
    printf("selected level     %s (index %d, chosen at load time: %d)\n",
           zoriGetLibVersion()->targetCode, zorJumpIndexForMergedLibs, loaded);
    printf("  zorInit: %s\n", zorGetStatusString(init));
    printf("  why: the highest level whose required features the processor and the\n"
           "  operating system provide; bodies run unchanged on any vendor's processor.\n\n");

    printf("levels:\n");
    int32_t selected = zorJumpIndexForMergedLibs;
    for (size_t i = 0; i < sizeof levels / sizeof levels[0]; ++i) {
        int can_run = (detected & levels[i].need) == levels[i].need;
        const ZorLibraryVersion* v = NULL;
        ZorStatus fs = 0;
        if (can_run) {
            fs = zorSetCpuFeatures(levels[i].select);
            v = zoriGetLibVersion();
        }
        printf("  %d %s %-4s %s", levels[i].index, levels[i].name,
               can_run ? "runs" : "no", levels[i].index == selected ? "*" : " ");
        if (v)
            printf(" %-34s %s, built %s\n", v->libraryName, v->versionText, v->buildDate);
        else
            printf(" lacks 0x%llx\n", (unsigned long long)(levels[i].need & ~detected));
        /* n0 is selected by ER/PF, which few processors have; its code needs
         * only F/CD, so it is forced and reports the missing request bits. */
        if (v && fs) printf("         forced with status %d: %s\n", fs, zorGetStatusString(fs));
    }
    zorInit();

    int32_t cache = 0, line = 0;
    ZorStatus cs = zorGetMaxCacheSizeB(&cache);
    zor_get_cache_line_size(&line);
    printf("\nlargest cache      %d bytes, line %d (%s)\n", cache, line, zorGetStatusString(cs));
    printf("cores on die       %d (simple count %d)\n", zorGetNumCoresOnDie(),
           zor_get_cores_on_die());
    int32_t threads = 0;
    zorGetNumThreads(&threads);
    printf("threads            %d\n", threads);

    demo_vectors();
    demo_elementwise();
    return 0;
}
