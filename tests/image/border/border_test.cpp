// The exported border copies through the public stubs, every level forced
// in turn, against the model of border_harness.h; and the shared test of
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

TEST_P(BorderPublic, FramesLikeTheModel) {
    const std::vector<Geometry> cases = geometries();
    for (const Form& f : forms()) {
        int seed = 0;
        for (const Geometry& g : cases)
            ASSERT_NO_FATAL_FAILURE(run_copy(f, GetParam().index, g, ++seed));
    }
}

TEST_P(BorderPublic, ReplicateWithEqualPointersFramesInPlace) {
    const std::vector<Geometry> cases = geometries();
    for (const Form& f : forms()) {
        if (f.kind != kRepl) continue;
        int seed = 0;
        for (const Geometry& g : cases)
            ASSERT_NO_FATAL_FAILURE(run_in_place(f, GetParam().index, g, ++seed, true));
    }
}

TEST_P(BorderPublic, ChecksInOrderAndWritesNothingOnError) {
    for (const Form& f : forms()) run_checks(f, GetParam().index);
}

// Same sizes and no border: a plain copy, and in place nothing at all.
TEST_P(BorderPublic, NoBorderIsAPlainCopy) {
    const Zor16u src[2][3] = {{1, 2, 3}, {4, 5, 6}};
    Zor16u dst[2][4] = {{9, 9, 9, 9}, {9, 9, 9, 9}};
    ASSERT_EQ(zoriCopyConstBorder_16u_C1R(&src[0][0], 6, {3, 2}, &dst[0][0], 8, {3, 2}, 0, 0, 7),
              zorStsNoErr);
    const Zor16u want[2][4] = {{1, 2, 3, 9}, {4, 5, 6, 9}};
    EXPECT_EQ(memcmp(dst, want, sizeof dst), 0);
    ASSERT_EQ(zoriCopyReplicateBorder_16u_C1R(&dst[0][0], 8, {3, 2}, &dst[0][0], 8, {3, 2}, 0, 0),
              zorStsNoErr);
    EXPECT_EQ(memcmp(dst, want, sizeof dst), 0);
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
