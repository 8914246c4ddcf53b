// The exported border copies through the public stubs, every level forced
// in turn, against the shared border model; and the shared test of
// border-type values.
#include "border_harness.h"
#include "border_type.h"
#include "zortest.h"

#define PUBLIC_NAME(fn) fn

namespace {

using namespace bordertest;

const std::vector<Form>& forms() {
    static const std::vector<Form> all = {
        FORM_CONST1(PUBLIC_NAME, zoriCopyConstBorder_8u_C1R, Zor8u),
        FORM_CONST1(PUBLIC_NAME, zoriCopyConstBorder_16u_C1R, Zor16u),
        FORM_CONST1(PUBLIC_NAME, zoriCopyConstBorder_32f_C1R, Zor32f),
        FORM_COPY(PUBLIC_NAME, kRepl, zoriCopyReplicateBorder_16u_C1R, Zor16u, 1),
        FORM_COPY(PUBLIC_NAME, kRepl, zoriCopyReplicateBorder_32f_C1R, Zor32f, 1),
    };
    return all;
}

using BorderPublic = zortest::LevelTest;

// Replicate with equal pointers frames in place (the 8u form is swept by
// level next to its in-place form).
TEST_P(BorderPublic, FramesLikeTheModel) { run_sweep(forms(), GetParam().index); }

TEST_P(BorderPublic, ChecksInOrderAndWritesNothingOnError) {
    for (const Form& f : forms()) run_checks(f, GetParam().index);
}

ZOR_INSTANTIATE_LEVELS(BorderPublic);

// ---- border-type values -------------------------------------------------

TEST(BorderType, KindMustBeInTheCallersSet) {
    const uint32_t rmc = zorBorderAcceptRepl | zorBorderAcceptMirror | zorBorderAcceptConst;
    const int32_t L = zorBorderLimit, LM = zorBorderLimitMorph, T = zorBorderInMemTop;
    const ZorStatus E = zorStsBorderErr;
    const struct {
        int32_t value;
        uint32_t accepted;
        int32_t limit;
        ZorStatus expect;
    } cases[] = {
        {1, rmc, L, 0}, {3, rmc, L, 0}, {6, rmc, L, 0}, {7, rmc, L, E}, {7, zorBorderAcceptTransp, L, 0},
        {5, rmc, L, E}, {5, zorBorderAcceptDefault, LM, 0},
        // Kinds no operation takes, whatever the set says.
        {0, rmc, L, E}, {2, rmc, L, E}, {4, rmc, L, E}, {8, rmc, L, E}, {15, rmc, L, E},
        // Flags go with any accepted kind; alone only as the full 240.
        {1 | T | zorBorderInMemLeft, rmc, L, 0}, {6 | 240, rmc, L, 0}, {240, 0, L, 0},
        {T, rmc, L, E}, {T | zorBorderInMemBottom | zorBorderInMemLeft, rmc, L, E},
        // The range comes first: morphology's wider limit, negative values.
        {256 + 1, rmc, L, E}, {256 + 1, rmc, LM, 0}, {4096 + 1, rmc, LM, E},
        {256 + 240, rmc, LM, E}, {-1, ~0u, LM, E}, {INT32_MIN | 1, rmc, LM, E},
    };
    for (const auto& c : cases)
        EXPECT_EQ(zorBorderTypeCheck(c.value, c.accepted, (uint32_t)c.limit), c.expect)
            << "value " << c.value << " set 0x" << std::hex << c.accepted << " limit " << std::dec
            << c.limit;
    const int32_t v = zorBorderMirror | T | zorBorderInMemRight;
    EXPECT_EQ(zorBorderKind(v), zorBorderMirror);
    EXPECT_EQ(zorBorderKind(zorBorderInMem), 0);
    EXPECT_TRUE(zorBorderSideInMem(v, T) && zorBorderSideInMem(v, zorBorderInMemRight));
    EXPECT_FALSE(zorBorderSideInMem(v, zorBorderInMemBottom) || zorBorderSideInMem(v, zorBorderInMemLeft));
    EXPECT_FALSE(zorBorderSideInMem(zorBorderTransp, 4));  // a kind bit is no side
}

}  // namespace
