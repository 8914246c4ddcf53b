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
        FORM_COPY(PUBLIC_NAME, kRepl, zoriCopyReplicateBorder_8u_C1R, Zor8u, 1),
        FORM_COPY(PUBLIC_NAME, kRepl, zoriCopyReplicateBorder_16u_C1R, Zor16u, 1),
        FORM_COPY(PUBLIC_NAME, kRepl, zoriCopyReplicateBorder_32f_C1R, Zor32f, 1),
    };
    return all;
}

using BorderPublic = zortest::LevelTest;

// Replicate with equal pointers frames in place.
TEST_P(BorderPublic, FramesLikeTheModel) { run_sweep(forms(), GetParam().index); }

TEST_P(BorderPublic, ChecksInOrderAndWritesNothingOnError) {
    for (const Form& f : forms()) run_checks(f, GetParam().index);
}

ZOR_INSTANTIATE_LEVELS(BorderPublic);

// ---- border-type values -------------------------------------------------

const uint32_t kReplMirrorConst =
    zorBorderAcceptRepl | zorBorderAcceptMirror | zorBorderAcceptConst;

TEST(BorderType, KindMustBeInTheCallersSet) {
    struct Case {
        int32_t value;
        uint32_t accepted, limit;
        ZorStatus expect;
    } cases[] = {
        {zorBorderRepl, kReplMirrorConst, zorBorderLimit, zorStsNoErr},
        {zorBorderMirror, kReplMirrorConst, zorBorderLimit, zorStsNoErr},
        {zorBorderConst, kReplMirrorConst, zorBorderLimit, zorStsNoErr},
        {zorBorderTransp, kReplMirrorConst, zorBorderLimit, zorStsBorderErr},
        {zorBorderTransp, zorBorderAcceptTransp, zorBorderLimit, zorStsNoErr},
        {zorBorderDefault, kReplMirrorConst, zorBorderLimit, zorStsBorderErr},
        {zorBorderDefault, zorBorderAcceptDefault, zorBorderLimitMorph, zorStsNoErr},
        // Kinds no operation takes, whatever the set says.
        {0, kReplMirrorConst, zorBorderLimit, zorStsBorderErr},
        {2, kReplMirrorConst, zorBorderLimit, zorStsBorderErr},
        {4, kReplMirrorConst, zorBorderLimit, zorStsBorderErr},
        {8, kReplMirrorConst, zorBorderLimit, zorStsBorderErr},
        {15, kReplMirrorConst, zorBorderLimit, zorStsBorderErr},
        // Flags go with any accepted kind; alone only as the full 240.
        {zorBorderRepl | zorBorderInMemTop | zorBorderInMemLeft, kReplMirrorConst, zorBorderLimit,
         zorStsNoErr},
        {zorBorderConst | zorBorderInMem, kReplMirrorConst, zorBorderLimit, zorStsNoErr},
        {zorBorderInMem, kReplMirrorConst, zorBorderLimit, zorStsNoErr},
        {zorBorderInMem, 0, zorBorderLimit, zorStsNoErr},
        {zorBorderInMemTop, kReplMirrorConst, zorBorderLimit, zorStsBorderErr},
        {zorBorderInMemTop | zorBorderInMemBottom | zorBorderInMemLeft, kReplMirrorConst,
         zorBorderLimit, zorStsBorderErr},
        // The range comes first: morphology's wider limit, negative values.
        {256 + zorBorderRepl, kReplMirrorConst, zorBorderLimit, zorStsBorderErr},
        {256 + zorBorderRepl, kReplMirrorConst, zorBorderLimitMorph, zorStsNoErr},
        {4096 + zorBorderRepl, kReplMirrorConst, zorBorderLimitMorph, zorStsBorderErr},
        {256 + zorBorderInMem, kReplMirrorConst, zorBorderLimitMorph, zorStsBorderErr},
        {-1, ~0u, zorBorderLimitMorph, zorStsBorderErr},
        {INT32_MIN | zorBorderRepl, kReplMirrorConst, zorBorderLimitMorph, zorStsBorderErr},
    };
    for (const Case& c : cases)
        EXPECT_EQ(zorBorderTypeCheck(c.value, c.accepted, c.limit), c.expect)
            << "value " << c.value << " set 0x" << std::hex << c.accepted << " limit " << std::dec
            << c.limit;
}

TEST(BorderType, KindAndSides) {
    const int32_t v = zorBorderMirror | zorBorderInMemTop | zorBorderInMemRight;
    EXPECT_EQ(zorBorderKind(v), zorBorderMirror);
    EXPECT_EQ(zorBorderKind(zorBorderInMem), 0);
    EXPECT_TRUE(zorBorderSideInMem(v, zorBorderInMemTop));
    EXPECT_TRUE(zorBorderSideInMem(v, zorBorderInMemRight));
    EXPECT_FALSE(zorBorderSideInMem(v, zorBorderInMemBottom));
    EXPECT_FALSE(zorBorderSideInMem(v, zorBorderInMemLeft));
    EXPECT_FALSE(zorBorderSideInMem(zorBorderTransp, 4));  // a kind bit is no side
}

}  // namespace
