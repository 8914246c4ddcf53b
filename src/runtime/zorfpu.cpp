// The x87 control/status words and MXCSR of the calling thread.
#include "runtime_internal.h"

namespace {

inline uint32_t get_cw() {
    uint16_t cw;
    __asm__ volatile("fnstcw %0" : "=m"(cw));
    return cw;
}

inline void set_cw(uint32_t value) {
    uint16_t cw = (uint16_t)value;
    __asm__ volatile("fldcw %0" : : "m"(cw));
}

inline uint32_t get_sw() {
    uint16_t sw;
    __asm__ volatile("fnstsw %0" : "=m"(sw));
    return sw;
}

inline uint32_t get_mxcsr() {
    uint32_t v;
    __asm__ volatile("stmxcsr %0" : "=m"(v));
    return v;
}

inline void set_mxcsr(uint32_t v) {
    __asm__ volatile("ldmxcsr %0" : : "m"(v));
}

inline uint32_t merge(uint32_t old, uint32_t value, uint32_t mask) {
    return (old & ~mask) | (value & mask);
}

}  // namespace

ZOR_EXPORT uint32_t ps_get_cw_fpu(void) { return get_cw(); }

ZOR_EXPORT uint32_t ps_set_cw_fpu(uint32_t value, uint32_t mask) {
    const uint32_t old = get_cw();
    set_cw(merge(old, value, mask));
    return old;
}

ZOR_EXPORT uint32_t ps_get_sw_fpu(void) { return get_sw(); }

ZOR_EXPORT uint32_t ps_clear_fpu(void) {
    const uint32_t sw = get_sw();
    __asm__ volatile("fnclex");
    return sw;
}

ZOR_EXPORT uint32_t ps_get_ssx(void) { return get_mxcsr(); }

ZOR_EXPORT uint32_t ps_set_ssx(uint32_t value, uint32_t mask) {
    const uint32_t old = get_mxcsr();
    set_mxcsr(merge(old, value, mask));
    return old;
}

ZOR_EXPORT void ps_destroy_ssx(void) {
    // AVX-wide clear only where the processor and the system keep that state.
    if (zor_is_avx_extension()) {
        __asm__ volatile("vzeroall" ::: "xmm0", "xmm1", "xmm2", "xmm3", "xmm4", "xmm5", "xmm6",
                         "xmm7", "xmm8", "xmm9", "xmm10", "xmm11", "xmm12", "xmm13", "xmm14",
                         "xmm15");
    } else {
        __asm__ volatile(
            "xorps %%xmm0, %%xmm0\n\txorps %%xmm1, %%xmm1\n\txorps %%xmm2, %%xmm2\n\t"
            "xorps %%xmm3, %%xmm3\n\txorps %%xmm4, %%xmm4\n\txorps %%xmm5, %%xmm5\n\t"
            "xorps %%xmm6, %%xmm6\n\txorps %%xmm7, %%xmm7\n\txorps %%xmm8, %%xmm8\n\t"
            "xorps %%xmm9, %%xmm9\n\txorps %%xmm10, %%xmm10\n\txorps %%xmm11, %%xmm11\n\t"
            "xorps %%xmm12, %%xmm12\n\txorps %%xmm13, %%xmm13\n\txorps %%xmm14, %%xmm14\n\t"
            "xorps %%xmm15, %%xmm15" ::: "xmm0", "xmm1", "xmm2", "xmm3", "xmm4", "xmm5",
            "xmm6", "xmm7", "xmm8", "xmm9", "xmm10", "xmm11", "xmm12", "xmm13", "xmm14",
            "xmm15");
    }
}

ZOR_EXPORT void zor_set_cw_ssx(uint32_t value) { set_mxcsr(value); }

ZOR_EXPORT uint32_t zor_set_rc_ssx(uint32_t mode) {
    const uint32_t old = get_mxcsr();
    if ((old & 0x6000u) != (mode & 0x6000u)) set_mxcsr(merge(old, mode, 0x6000u));
    return old;
}

ZOR_EXPORT uint32_t zor_clear_ssx(void) {
    const uint32_t old = get_mxcsr();
    set_mxcsr(old & ~0x3fu);
    return old;
}

ZOR_EXPORT int32_t zor_tst_daz_ssx(void) {
    alignas(16) uint8_t area[512] = {};
    __asm__ volatile("fxsave %0" : "=m"(area));
    uint32_t mask;
    __builtin_memcpy(&mask, area + 28, 4);
    if (mask == 0) mask = 0xffbf;  // processors that leave it 0 lack DAZ
    return (mask >> 6) & 1;
}

ZOR_EXPORT uint32_t zor_control87(uint32_t value, uint32_t mask) {
    const uint32_t cw = merge(get_cw(), value, mask);
    set_cw(cw);
    return cw;
}

ZOR_EXPORT uint32_t zor_status87(void) { return get_sw(); }

ZOR_EXPORT uint32_t zor_clear87(void) { return ps_clear_fpu(); }

ZOR_EXPORT uint32_t zor_set_rcpc_fpu(uint32_t rc, uint32_t pc) {
    const uint32_t old = get_cw();
    set_cw((old & ~0xf00u) | (rc & 0xc00u) | (pc & 0x300u));
    return old;
}

ZOR_EXPORT uint32_t zor_set_cw_fpu(uint32_t value) {
    const uint32_t old = get_cw();
    set_cw(value);
    return old;
}

ZOR_EXPORT int32_t zor_isnan(double x) {
    uint64_t bits;
    __builtin_memcpy(&bits, &x, 8);
    return ((bits >> 52) & 0x7ff) == 0x7ff && (bits & 0xfffffffffffffULL) != 0;
}

ZOR_EXPORT int32_t zor_finite(double x) {
    uint64_t bits;
    __builtin_memcpy(&bits, &x, 8);
    return ((bits >> 52) & 0x7ff) != 0x7ff;
}

ZOR_EXPORT uint32_t zorFpuSsx4TS(int32_t selector, uint32_t a, uint32_t b) {
    switch (selector) {
        case 1: return ps_set_cw_fpu(a, b);
        case 2: return ps_get_cw_fpu();
        case 3: return ps_get_sw_fpu();
        case 4: return ps_clear_fpu();
        case 5: return ps_set_ssx(a, b);
        case 6: return ps_get_ssx();
        case 7: ps_destroy_ssx(); return 0;
        default: return 0;
    }
}
