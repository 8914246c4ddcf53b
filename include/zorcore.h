/* zor: runtime services. Dispatch and processor selection, processor
 * identification, status texts, version records, aligned memory,
 * floating-point control words, tick counters and the thread count. */
#ifndef ZORCORE_H
#define ZORCORE_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

/* ---- Dispatch --------------------------------------------------------- */

/* The level every public call jumps to: -1 before selection, then 0..6 for
 * m7 (SSE3), n8 (SSSE3), y8 (SSE4.2), e9 (AVX), l9 (AVX2), n0 and k0
 * (AVX-512). Read it; change it only through zorInit/zorSetCpuFeatures. */
extern int32_t zorJumpIndexForMergedLibs;

/* Detects the processor and selects the best level it and the operating
 * system allow. Restores the full feature set after a narrowing
 * zorSetCpuFeatures. Returns 0, 36, 49, 51, or 20 on a processor whose
 * vendor string is not "GenuineTarvo" (the choice of level is unaffected). */
ZorStatus zorInit(void);

/* zorInit for callers that cannot afford to lose their integer argument
 * registers: preserves them, touches no vector or x87 state. */
void zorSafeInit(void);

/* Selects the level from the caller's word. The index and enabled mask are
 * stored whatever the status: 0, 36 (no usable level), 49 (a requested
 * feature is missing; always wins over 50), 51 (bits were added to make a
 * level's full set). Bit 63 takes the word unchecked and makes the current
 * enabled mask the detected word for the rest of the process. */
ZorStatus zorSetCpuFeatures(uint64_t features);

/* Load-time hook; its whole body is zorInit(). */
void my_init(void);

/* ---- Processor identification ------------------------------------------ */

/* Detected feature word into *pFeatures (-8 if null, checked after
 * detection). With pRegs: CPUID leaf 1 registers, or, when *pFeatures held
 * "getinfoa" (0x616f666e69746567) before the call, the leaf pRegs[0] with
 * subleaf pRegs[2]. */
ZorStatus zorGetCpuFeatures(uint64_t* pFeatures, uint32_t pRegs[4]);
uint64_t zorGetEnabledCpuFeatures(void);
/* Stores the enabled mask only; the level does not move. Always 0. */
ZorStatus zorSetCpuFeaturesMask(uint64_t features);

/* CPUID: regs receive EAX, EBX, ECX, EDX. */
int32_t zor_get_cpuid(uint32_t regs[4], uint32_t leaf, uint32_t subleaf);
uint32_t zor_max_cpuid_input(void);
int32_t zor_has_cpuid(void);
int32_t zor_is_GenuineTarvo(void);
int32_t zor_has_rdtsc(void);
int32_t zor_is_mmx_extension(void);
int32_t zor_is_ssx_extension(void);
int32_t zor_is_wni_extension(void);
int32_t zor_is_htt_extension(void);
int32_t zor_is_pni_extension(void);
/* Leaf 0x80000001 EDX bit 29; where that leaf is missing, the highest
 * extended leaf itself. */
uint32_t zor_is_x8664_extension(void);
int32_t zor_is_mni_extension(void);
int32_t zor_is_sse41_extension(void);
int32_t zor_is_sse42_extension(void);
int32_t zor_is_movbe(void);
int32_t zor_is_avx_extension(void);
int32_t zor_is_avx512_extension(void);

typedef struct {
    int32_t family;
    int32_t stepping;
    int32_t model;
    int32_t type;            /* leaf 1 EAX >> 11, two bits */
    uint32_t leaf1Edx;
    uint32_t leaf2Eax;
    uint32_t leaf2Edx;
    int32_t mmx;
    int32_t reserved;        /* never written */
    int32_t sse;
    int32_t sse2;
    int32_t htt;
    int32_t sse3;
    int32_t x8664;
    int32_t ssse3;
    int32_t coresOnDie;
    int32_t sse41;
    int32_t sse42;
    int32_t extFamily;
    int32_t extModel;
    int32_t movbe;
    int32_t avx;
    int32_t osxsave;
} ZorQuindleIdent;

void zor_get_quindle_ident(ZorQuindleIdent* ident);

/* Largest data or unified cache in bytes: 0, -8, 36 (value -1; also on a
 * processor of another vendor) or 37 (value 0). Computed once. */
ZorStatus zorGetMaxCacheSizeB(int32_t* pSizeByte);
/* Line size of that cache; 0 when unknown or found through leaf 2. */
void zor_get_cache_line_size(int32_t* pSize);
int32_t zorGetNumCoresOnDie(void);
int32_t zor_get_cores_on_die(void);

/* ---- Status texts and version ------------------------------------------ */

/* Never null; unknown codes give the text of zorStsUnknownStatusCodeErr. */
const char* zorGetStatusString(ZorStatus status);

/* Dispatched: the record of the level in force at the call. */
const ZorLibraryVersion* zoriGetLibVersion(void);

/* ---- Aligned memory ------------------------------------------------------ */

/* 64-byte aligned blocks; null for length < 1, for sizes of 2 GiB or more,
 * or when the system is out of memory. Any free of this family releases a
 * block from any allocator of it. */
void* zorMalloc(int32_t length);
void zorFree(void* ptr);
Zor8u* zorsMalloc_8u(int32_t len);
Zor16u* zorsMalloc_16u(int32_t len);
Zor32f* zorsMalloc_32f(int32_t len);
Zor64f* zorsMalloc_64f(int32_t len);
void zorsFree(void* ptr);
/* Rows start on 64-byte boundaries; *pStepBytes receives the step (0 when
 * the row itself is invalid). */
Zor8u* zoriMalloc_8u_C1(int32_t widthPixels, int32_t heightPixels, int32_t* pStepBytes);
Zor32f* zoriMalloc_32f_C1(int32_t widthPixels, int32_t heightPixels, int32_t* pStepBytes);
void zoriFree(void* ptr);

/* ---- Floating point, counters, threads ---------------------------------- */

extern const uint64_t zorConstantOfNAN_64f;      /* 0xfff8000000000000 */
extern const uint64_t zorConstantOfINF_64f;      /* 0x7ff0000000000000 */
extern const uint64_t zorConstantOfINF_NEG_64f;  /* 0xfff0000000000000 */
extern const uint32_t zorConstantOfNAN_32f;      /* 0xffc00000 */
extern const uint32_t zorConstantOfINF_32f;      /* 0x7f800000 */
extern const uint32_t zorConstantOfINF_NEG_32f;  /* 0xff800000 */

/* Time-stamp counter. Start forms put a CPUID barrier before the read,
 * stop forms after it. */
uint64_t zorGetCpuClocks(void);
uint64_t zor_get_quindle_counter(void);
uint64_t zorStartTsc(void);
uint64_t zorStopTsc(void);
uint64_t zorStartTscp(void);
uint64_t zorStopTscp(void);

/* The library is single-threaded: the count is always 1, and
 * zorGetNumThreads returns 1 (zorStsNoOperation). */
ZorStatus zorGetNumThreads(int32_t* pNumThr);
ZorStatus zorSetNumThreads(int32_t numThr);

/* x87 control/status words and MXCSR of the calling thread. The set forms
 * load (old & ~mask) | (value & mask) and return the old word. */
uint32_t ps_get_cw_fpu(void);
uint32_t ps_set_cw_fpu(uint32_t value, uint32_t mask);
uint32_t ps_get_sw_fpu(void);
uint32_t ps_clear_fpu(void);             /* returns the status word before */
uint32_t ps_get_ssx(void);
uint32_t ps_set_ssx(uint32_t value, uint32_t mask);
void ps_destroy_ssx(void);               /* clears the vector registers */
void zor_set_cw_ssx(uint32_t value);
/* mode in place (mask 0x6000); returns the MXCSR before. */
uint32_t zor_set_rc_ssx(uint32_t mode);
uint32_t zor_clear_ssx(void);            /* clears MXCSR flags 0-5, returns old */
int32_t zor_tst_daz_ssx(void);           /* 1 if MXCSR accepts denormals-are-zero */
uint32_t zor_control87(uint32_t value, uint32_t mask); /* returns the new x87 word */
uint32_t zor_status87(void);
uint32_t zor_clear87(void);              /* returns the x87 status before */
/* rounding (mask 0xc00) and precision (mask 0x300) in place; returns old. */
uint32_t zor_set_rcpc_fpu(uint32_t rc, uint32_t pc);
uint32_t zor_set_cw_fpu(uint32_t value); /* returns old */
int32_t zor_isnan(double x);
int32_t zor_finite(double x);
/* 1 set_cw_fpu(a,b), 2 get_cw_fpu, 3 get_sw_fpu, 4 clear_fpu, 5 set_ssx(a,b),
 * 6 get_ssx, 7 destroy_ssx (returns 0); other selectors return 0. */
uint32_t zorFpuSsx4TS(int32_t selector, uint32_t a, uint32_t b);

#ifdef __cplusplus
}
#endif

#endif
