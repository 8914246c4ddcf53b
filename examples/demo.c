/* Shows what the library found on this machine and which levels it can
 * run: detected features, the selected level and why, every level's
 * version record, cache and core answers. */
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <time.h>

#include "zor.h"
#include "zor_levels.h"
#include "demo.h"

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

double now_us(void) {
    struct timespec t;
    clock_gettime(CLOCK_MONOTONIC, &t);
    return t.tv_sec * 1e6 + t.tv_nsec / 1e3;
}

static int level_runs(size_t i, uint64_t detected) {
    return (detected & levels[i].need) == levels[i].need;
}

void on_every_level(const char* title, DemoOp op, DemoReport report, void* ctx) {
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

int write_pgm(const char* path, const Zor8u* pixels, int32_t step, int32_t width, int32_t height) {
    FILE* f = fopen(path, "wb");
    if (!f) return -1;
    fprintf(f, "P5\n%d %d\n255\n", width, height);
    for (int32_t y = 0; y < height; ++y)
        fwrite((const char*)pixels + (size_t)y * step, 1, (size_t)width, f);
    if (fclose(f)) return -1;
    printf("  wrote %s\n", path);
    return 0;
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
    demo_point();
    demo_filter();
    demo_rank();
    demo_resize();
    return 0;
}
