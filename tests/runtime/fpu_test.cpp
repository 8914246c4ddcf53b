// Floating-point control words, constants, tick counters, thread count.
#include <gtest/gtest.h>

#include <cfloat>
#include <cstring>
#include <limits>

#include "zor.h"

namespace {

uint32_t x87_cw() {
    uint16_t cw;
    __asm__ volatile("fnstcw %0" : "=m"(cw));
    return cw;
}

uint32_t x87_sw() {
    uint16_t sw;
    __asm__ volatile("fnstsw %0" : "=m"(sw));
    return sw;
}

uint32_t mxcsr() {
    uint32_t v;
    __asm__ volatile("stmxcsr %0" : "=m"(v));
    return v;
}

// 1/0 on the x87 stack: sets the zero-divide flag (masked, so no trap).
void raise_x87_zero_divide() {
    const double zero = 0.0;
    __asm__ volatile("fld1\n\tfdivl %0\n\tfstp %%st(0)" : : "m"(zero) : "st");
}

// Puts both control words back, and clears the flags a test raised.
class FpuTest : public ::testing::Test {
protected:
    void SetUp() override {
        cw_ = x87_cw();
        csr_ = mxcsr();
    }
    void TearDown() override {
        uint16_t cw = (uint16_t)cw_;
        uint32_t csr = csr_;
        __asm__ volatile("fnclex\n\tfldcw %0\n\tldmxcsr %1" : : "m"(cw), "m"(csr));
    }
    uint32_t cw_ = 0, csr_ = 0;
};

TEST(FpuConstants, BitPatterns) {
    const struct {
        const void* p;
        size_t size;
        uint64_t bits;
    } cases[] = {
        {&zorConstantOfNAN_64f, 8, 0xfff8000000000000ULL},
        {&zorConstantOfINF_64f, 8, 0x7ff0000000000000ULL},
        {&zorConstantOfINF_NEG_64f, 8, 0xfff0000000000000ULL},
        {&zorConstantOfNAN_32f, 4, 0xffc00000u},
        {&zorConstantOfINF_32f, 4, 0x7f800000u},
        {&zorConstantOfINF_NEG_32f, 4, 0xff800000u},
    };
    for (const auto& c : cases) {
        uint64_t bits = 0;
        std::memcpy(&bits, c.p, c.size);
        EXPECT_EQ(bits, c.bits);
    }
}

TEST(Threads, AlwaysOne) {
    EXPECT_EQ(zorGetNumThreads(nullptr), zorStsNullPtrErr);
    int32_t n = 0;
    EXPECT_EQ(zorGetNumThreads(&n), zorStsNoOperation);
    EXPECT_EQ(n, 1);
    EXPECT_EQ(zorSetNumThreads(8), 1);
    n = 0;
    EXPECT_EQ(zorGetNumThreads(&n), 1);
    EXPECT_EQ(n, 1);
    EXPECT_EQ(ownGetNumThreads(), 1);
}

TEST_F(FpuTest, X87ControlWordMergesUnderMask) {
    EXPECT_EQ(ps_get_cw_fpu(), cw_);
    EXPECT_EQ(ps_set_cw_fpu(0xffff, 0), cw_);  // mask 0 changes nothing
    EXPECT_EQ(x87_cw(), cw_);

    // Round toward zero; the value's bits outside the mask are ignored.
    EXPECT_EQ(ps_set_cw_fpu(0xfc00, 0x0c00), cw_);
    const uint32_t rz = (cw_ & ~0xc00u) | 0xc00u;
    EXPECT_EQ(x87_cw(), rz);
    EXPECT_EQ(ps_get_cw_fpu(), rz);
    EXPECT_EQ(ps_set_cw_fpu(0, 0x0300), rz);  // single precision
    EXPECT_EQ(x87_cw(), rz & ~0x300u);
    EXPECT_EQ(ps_set_cw_fpu(cw_, 0xffff), rz & ~0x300u);
    EXPECT_EQ(x87_cw(), cw_);
}

TEST_F(FpuTest, X87OtherSetters) {
    // zor_control87 answers with the new word, not the old one.
    const uint32_t down = (cw_ & ~0xc00u) | 0x400u;
    EXPECT_EQ(zor_control87(0x0400, 0x0c00), down);
    EXPECT_EQ(x87_cw(), down);
    EXPECT_EQ(zor_control87(0, 0), down);

    EXPECT_EQ(zor_set_cw_fpu(cw_), down);
    EXPECT_EQ(x87_cw(), cw_);

    // Rounding and precision fields only, whatever else the arguments hold.
    EXPECT_EQ(zor_set_rcpc_fpu(0xf4ff, 0xf2ff), cw_);
    EXPECT_EQ(x87_cw(), (cw_ & ~0xf00u) | 0x400u | 0x200u);
    EXPECT_EQ(zor_set_rcpc_fpu(cw_, cw_), (cw_ & ~0xf00u) | 0x600u);
    EXPECT_EQ(x87_cw(), cw_);
}

TEST_F(FpuTest, X87ExceptionFlagsAreClearedAndReported) {
    uint32_t (*const clears[])() = {ps_clear_fpu, zor_clear87,
                                    [] { return zorFpuSsx4TS(4, 0, 0); }};
    for (auto clear : clears) {
        raise_x87_zero_divide();
        const uint32_t sw = x87_sw();
        ASSERT_NE(sw & 0x4, 0u);
        EXPECT_EQ(ps_get_sw_fpu(), sw);
        EXPECT_EQ(zor_status87(), sw);
        EXPECT_EQ(zorFpuSsx4TS(3, 0, 0), sw);
        EXPECT_EQ(clear(), sw);
        EXPECT_EQ(x87_sw() & 0x80ff, 0u);
        EXPECT_EQ(x87_cw(), cw_);
    }
}

TEST_F(FpuTest, MxcsrMergesUnderMask) {
    EXPECT_EQ(ps_get_ssx(), csr_);
    EXPECT_EQ(ps_set_ssx(0xffffffff, 0), csr_);
    EXPECT_EQ(mxcsr(), csr_);
    // Reserved bits of the value would fault if they got through the mask.
    EXPECT_EQ(ps_set_ssx(0xffffffff, 0x6000), csr_);
    EXPECT_EQ(mxcsr(), csr_ | 0x6000u);
    EXPECT_EQ(ps_set_ssx(csr_, 0xffff), csr_ | 0x6000u);
    EXPECT_EQ(mxcsr(), csr_);

    zor_set_cw_ssx(csr_ | 0x8000u);  // flush to zero
    EXPECT_EQ(mxcsr(), csr_ | 0x8000u);
    zor_set_cw_ssx(csr_);
    EXPECT_EQ(mxcsr(), csr_);
}

TEST_F(FpuTest, MxcsrRoundingFieldInPlace) {
    const uint32_t base = csr_ & ~0x6000u;
    zor_set_cw_ssx(base);
    EXPECT_EQ(zor_set_rc_ssx(0x2000), base);  // round down, given in place
    EXPECT_EQ(mxcsr(), base | 0x2000u);
    // Only the rounding field of the mode is taken.
    EXPECT_EQ(zor_set_rc_ssx(0x4000 | 0x8000 | 0x3f), base | 0x2000u);
    EXPECT_EQ(mxcsr(), base | 0x4000u);
    EXPECT_EQ(zor_set_rc_ssx(0x4000), base | 0x4000u);  // same mode: unchanged
    EXPECT_EQ(mxcsr(), base | 0x4000u);
    EXPECT_EQ(zor_set_rc_ssx(0), base | 0x4000u);
    EXPECT_EQ(mxcsr(), base);
}

TEST_F(FpuTest, MxcsrFlagsAndDaz) {
    zor_set_cw_ssx(csr_ | 0x3f);  // every exception flag up
    EXPECT_EQ(zor_clear_ssx(), csr_ | 0x3fu);
    EXPECT_EQ(mxcsr(), csr_ & ~0x3fu);
    const int32_t daz = zor_tst_daz_ssx();
    EXPECT_TRUE(daz == 0 || daz == 1) << daz;
}

TEST_F(FpuTest, TableEntryMatchesDirectCalls) {
    ps_destroy_ssx();
    EXPECT_EQ(zorFpuSsx4TS(7, 0x1234, 0x5678), 0u);  // the vector state clear
    for (int32_t sel : {0, 8, -1, 100, INT32_MIN})
        EXPECT_EQ(zorFpuSsx4TS(sel, 0xffff, 0xffff), 0u) << sel;
    EXPECT_EQ(x87_cw(), cw_);
    EXPECT_EQ(mxcsr(), csr_);

    EXPECT_EQ(zorFpuSsx4TS(2, 0, 0), ps_get_cw_fpu());
    EXPECT_EQ(zorFpuSsx4TS(6, 0, 0), ps_get_ssx());
    EXPECT_EQ(zorFpuSsx4TS(1, 0x0c00, 0x0c00), cw_);
    EXPECT_EQ(x87_cw(), cw_ | 0xc00u);
    EXPECT_EQ(zorFpuSsx4TS(1, cw_, 0xffff), cw_ | 0xc00u);
    EXPECT_EQ(zorFpuSsx4TS(5, 0x6000, 0x6000), csr_);
    EXPECT_EQ(mxcsr(), csr_ | 0x6000u);
    EXPECT_EQ(zorFpuSsx4TS(5, csr_, 0xffff), csr_ | 0x6000u);
    EXPECT_EQ(mxcsr(), csr_);
}

double from_bits(uint64_t bits) {
    double d;
    std::memcpy(&d, &bits, 8);
    return d;
}

TEST(FpuClass, NanAndFinite) {
    const struct {
        const char* what;
        double x;
        int32_t isnan, finite;
    } cases[] = {
        {"+inf", from_bits(0x7ff0000000000000ULL), 0, 0}, {"-inf", from_bits(0xfff0000000000000ULL), 0, 0},
        {"quiet nan", from_bits(0x7ff8000000000000ULL), 1, 0}, {"negative nan", from_bits(0xfff8000000000000ULL), 1, 0},
        {"signalling nan", from_bits(0x7ff0000000000001ULL), 1, 0},
        {"nan, top mantissa bits clear", from_bits(0x7ff0000100000000ULL), 1, 0},
        {"smallest denormal", from_bits(1), 0, 1}, {"largest denormal", from_bits(0x000fffffffffffffULL), 0, 1},
        {"-0", from_bits(0x8000000000000000ULL), 0, 1}, {"0", 0.0, 0, 1}, {"max", DBL_MAX, 0, 1}, {"-1", -1.0, 0, 1},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(zor_isnan(c.x), c.isnan) << c.what;
        EXPECT_EQ(zor_finite(c.x), c.finite) << c.what;
    }
}

TEST(Ticks, CountersDoNotGoBackwards) {
    uint64_t (*const counters[])() = {zorGetCpuClocks, zor_get_quindle_counter, zorStartTsc,
                                      zorStopTsc, zorStartTscp, zorStopTscp};
    uint64_t last = 0;
    for (int round = 0; round < 3; ++round)
        for (auto counter : counters) {
            const uint64_t now = counter();
            EXPECT_GE(now, last);
            last = now;
        }
}

}  // namespace
