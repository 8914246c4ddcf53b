// Status texts, version records, aligned allocators, floating-point
// control words, constants, tick counters and the thread count.
#include <gtest/gtest.h>
#include <malloc.h>

#include <climits>
#include <cstring>
#include <string>

#include "zortest.h"

namespace {

TEST(Status, TextsAndTableSize) {
    const char* unknown = "zorStsUnknownStatusCodeErr: Unknown status code";
    const struct {
        ZorStatus code;
        const char* text;
    } cases[] = {
        {0, "zorStsNoErr: No errors"}, {-216, unknown}, {INT_MIN, unknown}, {INT_MAX, unknown},
        {-9700, "Error at loading of %s library"},  // stored, never formatted
        {-9999, "zorStsCpuNotSupportedErr: The target CPU is not supported"},
        {-8, "zorStsNullPtrErr: Null pointer error"},
        {20, "zorStsNonTarvoCpu: The target CPU is not Genuine Tarvo"},
        {49, "zorStsFeatureNotSupported: Current CPU doesn't support at least 1 of the desired features"},
        {52, "zorStsAccurateModeNotSupported: Accurate mode is not supported"},
    };
    for (const auto& c : cases) EXPECT_STREQ(zorGetStatusString(c.code), c.text) << c.code;
    int known = 1;  // -216 matches its own row, whose text is the unknown one
    for (int32_t code = -10000; code <= 100; ++code) {
        const char* text = zorGetStatusString(code);
        if (std::strcmp(text, unknown) == 0) continue;
        ++known;
        if (code < -9702 || code > -9700)  // the three rows without a name
            EXPECT_TRUE(std::strncmp(text, "zorSts", 6) == 0 && std::strstr(text, ": ")) << code << text;
    }
    EXPECT_EQ(known, 138);
}

class LevelServices : public zortest::LevelTest {};

TEST_P(LevelServices, VersionRecordNamesTheLevel) {
    static const char* const names[] = {"zorIP SSE3 (m7)", "zorIP Lark (n8)", "zorIP SSE4.2 (y8)",
                                        "zorIP AVX (e9)", "zorIP AVX2 (l9)", "zorIP AVX-512F/CD/ER/PF (n0)",
                                        "zorIP AVX-512F/CD/BW/DQ/VL (k0)"};
    const std::string level = GetParam().name;
    const ZorLibraryVersion* v = zoriGetLibVersion();
    ASSERT_EQ(v, zoriGetLibVersion());  // one record, not a copy
    EXPECT_TRUE(v->versionMajor == 2019 && v->versionMinor == 0 && v->versionUpdate == 1 && v->revision == 60629);
    char code[4] = {};
    std::memcpy(code, level.c_str(), level.size());
    EXPECT_EQ(std::memcmp(v->targetCode, code, 4), 0) << "NUL padded code of " << level;
    EXPECT_STREQ(v->libraryName, names[GetParam().index]);
    EXPECT_STREQ(v->versionText, "2019.0.1 (r60629)");
    EXPECT_STREQ(v->buildDate, level == "n8" ? "Oct  5 2018" : "Oct  4 2018");
}

// A block as promised: 64-byte aligned, the malloc pointer just below it,
// length + 72 bytes underneath, every byte writable.
void expect_block(void* p, size_t bytes) {
    ASSERT_NE(p, nullptr) << bytes;
    const uintptr_t user = (uintptr_t)p, block = (uintptr_t)((void**)p)[-1];
    EXPECT_EQ(user % 64, 0u) << bytes;
    EXPECT_TRUE(user - block >= 8 && user - block <= 71) << bytes;
    EXPECT_GE(malloc_usable_size((void*)block), bytes + 72) << bytes;
    std::memset(p, 0xa5, bytes);
}

TEST_P(LevelServices, Allocators) {
    for (int32_t n : {1, 2, 63, 64, 65, 300, 4097, (1 << 20) + 7}) {
        void* p = n % 2 ? zorMalloc(n) : zorsMalloc_8u(n);
        expect_block(p, n);
        n % 3 ? zorFree(p) : zorsFree(p);  // any free takes any block
    }
    const struct {
        void* p;
        size_t bytes;  // 0: must fail
    } vectors[] = {
        {zorsMalloc_16u(3), 6}, {zorsMalloc_32f(17), 68}, {zorsMalloc_64f(0x0ffffff6), 0x7fffffb0},
        {zorMalloc(0x7fffffff - 72), 0x7fffffff - 72}, {zorMalloc(0x7fffffff - 71), 0},  // 72 added first
        {zorMalloc(0), 0}, {zorMalloc(INT32_MIN), 0}, {zorsMalloc_16u(-1), 0}, {zorsMalloc_32f(0), 0},
        {zorsMalloc_64f(0x10000000), 0}, {zorsMalloc_16u(0x7fffffff), 0},  // would wrap in 32 bits
        {zorsMalloc_64f(0x0ffffff7), 0},  // below 2 GiB, over it with the 72 bytes
    };
    for (const auto& v : vectors) {
        if (v.bytes) {
            ASSERT_NE(v.p, nullptr) << v.bytes;
            EXPECT_EQ((uintptr_t)v.p % 64, 0u);
            ((char*)v.p)[0] = ((char*)v.p)[v.bytes - 1] = 1;
        } else {
            EXPECT_EQ(v.p, nullptr);
        }
        zorsFree(v.p);
    }
    // Rows on 64-byte boundaries in one block; the step stays set once the row fits.
    const struct {
        bool is32f, fails;
        int32_t width, height, step;
    } images[] = {
        {false, false, 1, 1, 64}, {false, false, 65, 3, 128}, {true, false, 17, 5, 128}, {true, false, 300, 2, 1216},
        {false, true, 0, 1, 0}, {true, true, 3, -1, 0}, {false, true, 64, 0x2000000, 64},
        {false, true, 0x7fffffc0, 1, 0x7fffffc0}, {true, true, 0x20000000, 1, 0},
    };
    for (const auto& c : images) {
        int32_t step = -1;
        void* p = c.is32f ? (void*)zoriMalloc_32f_C1(c.width, c.height, &step)
                          : (void*)zoriMalloc_8u_C1(c.width, c.height, &step);
        EXPECT_EQ(step, c.step) << c.width << "x" << c.height;
        if (c.fails) EXPECT_EQ(p, nullptr) << c.width << "x" << c.height;
        else expect_block(p, (size_t)c.step * c.height);
        c.is32f ? zoriFree(p) : zorFree(p);
    }
    EXPECT_EQ(zoriMalloc_8u_C1(16, 16, nullptr), nullptr);
    zoriFree(nullptr);
}

ZOR_INSTANTIATE_LEVELS(LevelServices);

uint32_t x87_cw() {
    uint16_t cw;
    __asm__ volatile("fnstcw %0" : "=m"(cw));
    return cw;
}
uint32_t mxcsr() {
    uint32_t v;
    __asm__ volatile("stmxcsr %0" : "=m"(v));
    return v;
}

// Each step: a call, what it returns, and the control words after it.
TEST(Fpu, ControlWordsMergeUnderMask) {
    const uint32_t cw = x87_cw(), csr = mxcsr();
    const uint32_t rz = cw | 0xc00u, down = (cw & ~0xc00u) | 0x400u, base = csr & ~0x6000u;
#define STEP(what, call, want, cwWant, csrWant) {what, call, want, x87_cw(), cwWant, mxcsr(), csrWant}
    const struct {
        const char* what;
        uint32_t got, want, cw, cwWant, csr, csrWant;
    } steps[] = {
        STEP("get cw", ps_get_cw_fpu(), cw, cw, csr),
        STEP("mask 0", ps_set_cw_fpu(0xffff, 0), cw, cw, csr),
        STEP("round to zero", ps_set_cw_fpu(0xfc00, 0x0c00), cw, rz, csr),
        STEP("single precision", ps_set_cw_fpu(0, 0x0300), rz, rz & ~0x300u, csr),
        STEP("restore", zorFpuSsx4TS(1, cw, 0xffff), rz & ~0x300u, cw, csr),
        STEP("control87 gives the new word", zor_control87(0x0400, 0x0c00), down, down, csr),
        STEP("set cw", zor_set_cw_fpu(cw), down, cw, csr),
        STEP("rounding and precision only", zor_set_rcpc_fpu(0xf4ff, 0xf2ff), cw, (cw & ~0xf00u) | 0x600u, csr),
        STEP("back", zor_set_rcpc_fpu(cw, cw), (cw & ~0xf00u) | 0x600u, cw, csr),
        STEP("get ssx", zorFpuSsx4TS(6, 0, 0), csr, cw, csr),
        STEP("reserved bits stay out", ps_set_ssx(0xffffffff, 0x6000), csr, cw, csr | 0x6000u),
        STEP("restore ssx", zorFpuSsx4TS(5, base, 0xffff), csr | 0x6000u, cw, base),
        STEP("round down in place", zor_set_rc_ssx(0x2000 | 0x8000 | 0x3f), base, cw, base | 0x2000u),
        STEP("same mode", zor_set_rc_ssx(0x2000), base | 0x2000u, cw, base | 0x2000u),
        STEP("nearest", zor_set_rc_ssx(0), base | 0x2000u, cw, base),
        STEP("bad selector", zorFpuSsx4TS(8, 0xffff, 0xffff) + zorFpuSsx4TS(0, 0xffff, 0xffff), 0, cw, base),
        STEP("vector state clear", zorFpuSsx4TS(7, 0x1234, 0x5678), 0, cw, base),
    };
#undef STEP
    for (const auto& s : steps) {
        EXPECT_EQ(s.got, s.want) << s.what;
        EXPECT_EQ(s.cw, s.cwWant) << s.what;
        EXPECT_EQ(s.csr, s.csrWant) << s.what;
    }
    EXPECT_EQ(x87_cw(), cw);
    zor_set_cw_ssx(csr | 0x3f);  // every exception flag up
    EXPECT_EQ(zor_clear_ssx(), csr | 0x3fu);
    EXPECT_EQ(mxcsr(), csr & ~0x3fu);
    zor_set_cw_ssx(csr);
    EXPECT_EQ(mxcsr(), csr);
    EXPECT_EQ(zor_tst_daz_ssx() & ~1, 0);
}

TEST(Fpu, X87ExceptionFlagsAreClearedAndReported) {
    for (uint32_t (*clear)() : {ps_clear_fpu, zor_clear87, +[] { return zorFpuSsx4TS(4, 0, 0); }}) {
        const double zero = 0.0;
        __asm__ volatile("fld1\n\tfdivl %0\n\tfstp %%st(0)" : : "m"(zero) : "st");  // masked 1/0
        const uint32_t sw = ps_get_sw_fpu();
        ASSERT_NE(sw & 0x4, 0u);
        EXPECT_TRUE(zor_status87() == sw && zorFpuSsx4TS(3, 0, 0) == sw && clear() == sw);
        EXPECT_EQ(ps_get_sw_fpu() & 0x80ff, 0u);
    }
}

TEST(Fpu, ConstantsClassesTicksAndThreads) {
    const uint64_t d[] = {0xfff8000000000000ULL, 0x7ff0000000000000ULL, 0xfff0000000000000ULL};
    const uint32_t f[] = {0xffc00000u, 0x7f800000u, 0xff800000u};
    EXPECT_EQ(std::memcmp(&zorConstantOfNAN_64f, &d[0], 8) | std::memcmp(&zorConstantOfINF_64f, &d[1], 8) |
                  std::memcmp(&zorConstantOfINF_NEG_64f, &d[2], 8) | std::memcmp(&zorConstantOfNAN_32f, &f[0], 4) |
                  std::memcmp(&zorConstantOfINF_32f, &f[1], 4) | std::memcmp(&zorConstantOfINF_NEG_32f, &f[2], 4),
              0);
    const struct {
        uint64_t bits;
        int32_t isnan, finite;
    } classes[] = {
        {0x7ff0000000000000ULL, 0, 0}, {0xfff8000000000000ULL, 1, 0}, {0x7ff0000000000001ULL, 1, 0},
        {0x7ff0000100000000ULL, 1, 0}, {1, 0, 1}, {0x8000000000000000ULL, 0, 1}, {0x7fefffffffffffffULL, 0, 1},
    };
    for (const auto& c : classes) {
        double x;
        std::memcpy(&x, &c.bits, 8);
        EXPECT_TRUE(zor_isnan(x) == c.isnan && zor_finite(x) == c.finite) << std::hex << c.bits;
    }
    uint64_t last = 0;
    for (uint64_t (*counter)() : {zorGetCpuClocks, zor_get_quindle_counter, zorStartTsc, zorStopTsc,
                                  zorStartTscp, zorStopTscp}) {
        const uint64_t now = counter();
        EXPECT_GE(now, last);
        last = now;
    }
    int32_t n = 0;
    EXPECT_EQ(zorGetNumThreads(nullptr), zorStsNullPtrErr);
    EXPECT_EQ(zorSetNumThreads(8), 1);
    EXPECT_EQ(zorGetNumThreads(&n), zorStsNoOperation);
    EXPECT_EQ(n, 1);
}

}  // namespace
