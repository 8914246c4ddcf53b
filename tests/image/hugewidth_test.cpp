// Widths whose row length in bytes is near 2^29, 2^30 and 2^31 against
// every image operation that tests its steps: the step test must see the
// true row length (a 32-bit product wraps and lets a huge row through),
// refuse with the documented status and write nothing. Buffers are small:
// an operation that gets past its checks reads and writes far out of them.
#include <limits.h>

#include <functional>
#include <string>
#include <vector>

#include "zor.h"
#include "zortest.h"

namespace {

enum Rule {
    kRow,       // at least width * bytes, -16
    kRowEven,   // the same, then a multiple of the element size, -108
    kPositive,  // at least 1, -16
    kEven,      // only a multiple of the element size, -108
};

struct Slot {
    Rule rule;
    int bytes;  // per pixel of the row this step is compared with
};

typedef std::function<ZorStatus(ZoriSize, const int32_t*, uint8_t*)> Call;

struct Op {
    const char* name;
    std::vector<Slot> slots;  // in argument order
    Call call;
};

constexpr Slot R1{kRow, 1}, R2E{kRowEven, 2}, R4E{kRowEven, 4}, R2{kRow, 2}, R4{kRow, 4},
    R8{kRow, 8}, P{kPositive, 1}, E2{kEven, 2}, E4{kEven, 4};

// p: a small zero-filled area standing in for every image, record and buffer.
#define A(T) ((T*)p)
#define S(i) s[i]
#define CALL(...) [=](ZoriSize r, const int32_t* s, uint8_t* p) { return __VA_ARGS__; }

std::vector<Op> ops() {
    const int repl = zorBorderRepl;
    return {
        {"AbsDiff_8u", {R1, R1, R1}, CALL(zoriAbsDiff_8u_C1R(A(Zor8u), S(0), A(Zor8u), S(1), A(Zor8u), S(2), r))},
        {"AbsDiff_16u", {R2E, R2E, R2E}, CALL(zoriAbsDiff_16u_C1R(A(Zor16u), S(0), A(Zor16u), S(1), A(Zor16u), S(2), r))},
        {"AbsDiff_32f", {R4E, R4E, R4E}, CALL(zoriAbsDiff_32f_C1R(A(Zor32f), S(0), A(Zor32f), S(1), A(Zor32f), S(2), r))},
        {"AbsDiffC_32f", {R4E, R4E}, CALL(zoriAbsDiffC_32f_C1R(A(Zor32f), S(0), A(Zor32f), S(1), r, 1.0f))},
        {"AddProduct_32f", {R4E, R4E, R1, R4E}, CALL(zoriAddProduct_32f_C1IMR(A(Zor32f), S(0), A(Zor32f), S(1), A(Zor8u), S(2), A(Zor32f), S(3), r))},
        {"Div_32f", {P, P, P}, CALL(zoriDiv_32f_C1R(A(Zor32f), S(0), A(Zor32f), S(1), A(Zor32f), S(2), r))},
        {"DivC_32f", {P, P}, CALL(zoriDivC_32f_C1R(A(Zor32f), S(0), A(Zor32f), S(1), r, 2.0f))},
        {"Abs_32f", {P, P}, CALL(zoriAbs_32f_C1R(A(Zor32f), S(0), A(Zor32f), S(1), r))},
        {"Sqr_32f", {P, P}, CALL(zoriSqr_32f_C1R(A(Zor32f), S(0), A(Zor32f), S(1), r))},
        {"Div_8u_Sfs", {P, P, P}, CALL(zoriDiv_8u_C1RSfs(A(Zor8u), S(0), A(Zor8u), S(1), A(Zor8u), S(2), r, 0))},
        {"CompareC_32f", {P, P}, CALL(zoriCompareC_32f_C1R(A(Zor32f), S(0), A(Zor8u), S(1), r, 0, 1.0f))},
        // The thresholds share one check; so do the scaled divisions, and
        // the morphology and filter forms across types of one width rule.
        {"Threshold_GT_32f", {P, P}, CALL(zoriThreshold_GT_32f_C1R(A(Zor32f), S(0), A(Zor32f), S(1), r, 1.0f))},
        {"Not_8u", {P, P}, CALL(zoriNot_8u_C1R(A(Zor8u), S(0), A(Zor8u), S(1), r))},
        {"CopyConstBorder_8u", {P, P}, CALL(zoriCopyConstBorder_8u_C1R(A(Zor8u), S(0), r, A(Zor8u), S(1), r, 0, 0, 7))},
        {"CopyConstBorder_32f", {P, P}, CALL(zoriCopyConstBorder_32f_C1R(A(Zor32f), S(0), r, A(Zor32f) + 4, S(1), r, 0, 0, 7.0f))},
        {"CopyReplicateBorder_16u", {P, P}, CALL(zoriCopyReplicateBorder_16u_C1R(A(Zor16u), S(0), r, A(Zor16u) + 8, S(1), r, 0, 0))},
        {"FilterMedianBorder_16u", {E2, E2}, CALL(zoriFilterMedianBorder_16u_C1R(A(Zor16u), S(0), A(Zor16u), S(1), r, {3, 3}, (ZoriBorderType)repl, 0, p))},
        {"FilterMedianBorder_32f", {E4, E4}, CALL(zoriFilterMedianBorder_32f_C1R(A(Zor32f), S(0), A(Zor32f), S(1), r, {3, 3}, (ZoriBorderType)repl, 0, p))},
        {"FilterBorder_8u", {P, R1}, CALL(zoriFilterBorder_8u_C1R(A(Zor8u), S(0), A(Zor8u), S(1), r, repl, A(Zor8u), A(const ZoriFilterBorderSpec), p))},
        {"FilterBorder_32f", {P, R4}, CALL(zoriFilterBorder_32f_C1R(A(Zor32f), S(0), A(Zor32f), S(1), r, repl, A(Zor32f), A(const ZoriFilterBorderSpec), p))},
        // A one-pixel kernel: the source row is as long as the destination's.
        {"Filter_64f", {R8, R8}, CALL(zoriFilter_64f_C1R(A(Zor64f), S(0), A(Zor64f), S(1), r, A(Zor64f), {1, 1}, {0, 0}, p))},
        {"ErodeBorder_8u", {R1, R1}, CALL(zoriErodeBorder_8u_C1R(A(Zor8u), S(0), A(Zor8u), S(1), r, repl, 0, A(const ZoriMorphState), p))},
        {"DilateBorder_16u", {R2E, R2E}, CALL(zoriDilateBorder_16u_C1R(A(Zor16u), S(0), A(Zor16u) + 8, S(1), r, repl, 0, A(const ZoriMorphState), p))},
        {"DilateBorder_32f", {R4E, R4E}, CALL(zoriDilateBorder_32f_C1R(A(Zor32f), S(0), A(Zor32f) + 4, S(1), r, repl, 0, A(const ZoriMorphState), p))},
    };
}
#undef A
#undef S
#undef CALL

// Widths with 2^29, 2^30 and 2^31 bytes a row, one either side, for rows
// of 1, 2, 4 and 8 bytes a pixel.
std::vector<int32_t> widths() {
    std::vector<int32_t> w;
    for (int64_t bytes : {1ll << 29, 1ll << 30, 1ll << 31})
        for (int64_t e : {1, 2, 4, 8})
            for (int64_t d : {-1, 0, 1})
                if (bytes / e + d <= INT32_MAX) w.push_back((int32_t)(bytes / e + d));
    return w;
}

// The greatest step that is a multiple of e.
int32_t top_step(int e) { return INT32_MAX / e * e; }

struct Case {
    int32_t step;
    ZorStatus want;
};

// Steps one slot may take that its test refuses, for a ROI width w.
std::vector<Case> refused(Slot slot, int32_t w) {
    const int64_t row = (int64_t)w * slot.bytes;
    const int e = slot.bytes;
    switch (slot.rule) {
    case kRow:
    case kRowEven: {
        // Just short of the row, or the greatest step where no step fits.
        std::vector<Case> c = {{(int32_t)(row - e <= top_step(e) ? row - e : top_step(e)),
                                zorStsStepErr}};
        if (slot.rule == kRowEven && row + 1 <= INT32_MAX)
            c.push_back({(int32_t)(row + 1), zorStsNotEvenStepErr});
        return c;
    }
    case kPositive:
        return {{0, zorStsStepErr}, {-e, zorStsStepErr}};
    case kEven:
        return {{top_step(e) - e + 1, zorStsNotEvenStepErr}};
    }
    return {};
}

// A step the slot's test accepts wherever one exists.
int32_t accepted(Slot slot) { return top_step(slot.bytes); }

using HugeWidth = zortest::LevelTest;

TEST_P(HugeWidth, StepTestsSeeTheWholeRow) {
    std::vector<uint8_t> mem(4096, 0);
    for (const Op& op : ops())
        for (int32_t w : widths())
            for (int32_t h : {1, 3})
                for (size_t k = 0; k < op.slots.size(); ++k)
                    for (const Case& c : refused(op.slots[k], w)) {
                        int32_t steps[4];
                        for (size_t j = 0; j < op.slots.size(); ++j)
                            steps[j] = j == k ? c.step : accepted(op.slots[j]);
                        // Where no accepted step exists for another slot, that
                        // slot fails first with the plain step error.
                        ZorStatus want = c.want;
                        for (size_t j = 0; j < op.slots.size(); ++j)
                            if (j != k && op.slots[j].rule <= kRowEven &&
                                (int64_t)w * op.slots[j].bytes > steps[j])
                                want = zorStsStepErr;
                        ASSERT_EQ(op.call({w, h}, steps, mem.data()), want)
                            << op.name << " width " << w << " height " << h << " step " << k
                            << " = " << c.step;
                        ASSERT_EQ(std::vector<uint8_t>(4096, 0), mem) << op.name << " wrote";
                    }
}

ZOR_INSTANTIATE_LEVELS(HugeWidth);

}  // namespace
