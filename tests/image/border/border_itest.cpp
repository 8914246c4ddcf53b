// The level-private border copies of every level: Const, Replicate and
// Mirror in each element width and channel count, copying and in place,
// against the model of border_harness.h.
#include "border_harness.h"
#include "zorinternal.h"

// The public forms' level bodies are in the static build as well; the
// private in-place forms are tested next to them.
#define BORDER_DECLARE(level, fn) extern "C" decltype(::fn) level##_##fn;
ZOR_LEVEL_NAMES(BORDER_DECLARE, zoriCopyReplicateBorder_8u_C1R)
#undef BORDER_DECLARE
#define BORDER_BODY(level, fn) &level##_##fn,
#define LEVEL_BODY(fn) \
    (std::array<decltype(&::fn), ZOR_LEVEL_COUNT>{ZOR_LEVEL_NAMES(BORDER_BODY, fn)}[level])

namespace {

using namespace bordertest;

const std::vector<Form>& forms() {
    static const std::vector<Form> all = {
        FORM_CONSTN(LEVEL_BODY, zoriCopyConstBorder_8u_C3R, Zor8u, 3),
        FORM_CONSTN(LEVEL_BODY, zoriCopyConstBorder_8u_C4R, Zor8u, 4),
        FORM_CONST1(LEVEL_BODY, zoriCopyConstBorder_16s_C1R, Zor16s),
        FORM_CONSTN(LEVEL_BODY, zoriCopyConstBorder_16s_C3R, Zor16s, 3),
        FORM_CONSTN(LEVEL_BODY, zoriCopyConstBorder_16s_C4R, Zor16s, 4),
        FORM_CONST1(LEVEL_BODY, zoriCopyConstBorder_32s_C1R, Zor32s),
        FORM_CONSTN(LEVEL_BODY, zoriCopyConstBorder_32s_C3R, Zor32s, 3),
        FORM_CONSTN(LEVEL_BODY, zoriCopyConstBorder_32s_C4R, Zor32s, 4),
        FORM_CONSTN(LEVEL_BODY, zoriCopyConstBorder_32f_C3R, Zor32f, 3),
        FORM_CONSTN(LEVEL_BODY, zoriCopyConstBorder_32f_C4R, Zor32f, 4),

        FORM_BOTH(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_8u_C1R,
                  zoriCopyReplicateBorder_8u_C1IR, Zor8u, 1),
        FORM_BOTH(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_8u_C3R,
                  zoriCopyReplicateBorder_8u_C3IR, Zor8u, 3),
        FORM_BOTH(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_8u_C4R,
                  zoriCopyReplicateBorder_8u_C4IR, Zor8u, 4),
        FORM_BOTH(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_16s_C1R,
                  zoriCopyReplicateBorder_16s_C1IR, Zor16s, 1),
        FORM_BOTH(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_16s_C3R,
                  zoriCopyReplicateBorder_16s_C3IR, Zor16s, 3),
        FORM_BOTH(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_16s_C4R,
                  zoriCopyReplicateBorder_16s_C4IR, Zor16s, 4),
        FORM_BOTH(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_32s_C1R,
                  zoriCopyReplicateBorder_32s_C1IR, Zor32s, 1),
        FORM_BOTH(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_32s_C3R,
                  zoriCopyReplicateBorder_32s_C3IR, Zor32s, 3),
        FORM_BOTH(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_32s_C4R,
                  zoriCopyReplicateBorder_32s_C4IR, Zor32s, 4),
        FORM_COPY(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_32f_C3R, Zor32f, 3),
        FORM_COPY(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_32f_C4R, Zor32f, 4),

        FORM_BOTH(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_8u_C1R, zoriCopyMirrorBorder_8u_C1IR,
                  Zor8u, 1),
        FORM_BOTH(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_8u_C3R, zoriCopyMirrorBorder_8u_C3IR,
                  Zor8u, 3),
        FORM_BOTH(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_8u_C4R, zoriCopyMirrorBorder_8u_C4IR,
                  Zor8u, 4),
        FORM_BOTH(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_16u_C1R, zoriCopyMirrorBorder_16u_C1IR,
                  Zor16u, 1),
        FORM_BOTH(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_16u_C3R, zoriCopyMirrorBorder_16u_C3IR,
                  Zor16u, 3),
        FORM_BOTH(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_16u_C4R, zoriCopyMirrorBorder_16u_C4IR,
                  Zor16u, 4),
        FORM_BOTH(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_32s_C1R, zoriCopyMirrorBorder_32s_C1IR,
                  Zor32s, 1),
        FORM_BOTH(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_32s_C3R, zoriCopyMirrorBorder_32s_C3IR,
                  Zor32s, 3),
        FORM_BOTH(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_32s_C4R, zoriCopyMirrorBorder_32s_C4IR,
                  Zor32s, 4),
        FORM_COPY(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_16s_C1R, Zor16s, 1),
        FORM_COPY(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_16s_C3R, Zor16s, 3),
        FORM_COPY(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_16s_C4R, Zor16s, 4),
        FORM_COPY(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_32f_C1R, Zor32f, 1),
        FORM_COPY(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_32f_C3R, Zor32f, 3),
        FORM_COPY(LEVEL_BODY, kMirror, zoriCopyMirrorBorder_32f_C4R, Zor32f, 4),
    };
    return all;
}

using BorderPrivate = zortest::LevelTest;

TEST_P(BorderPrivate, EveryFormFramesLikeTheModel) {
    const std::vector<Geometry> cases = geometries();
    for (const Form& f : forms()) {
        int seed = 0;
        for (const Geometry& g : cases)
            ASSERT_NO_FATAL_FAILURE(run_copy(f, GetParam().index, g, ++seed));
    }
}

TEST_P(BorderPrivate, InPlaceWritesOnlyTheFrame) {
    const std::vector<Geometry> cases = geometries();
    for (const Form& f : forms()) {
        if (f.kind == kConst) continue;
        int seed = 0;
        for (const Geometry& g : cases) {
            if (f.inPlace)
                ASSERT_NO_FATAL_FAILURE(run_in_place(f, GetParam().index, g, ++seed, false));
            // Every copying form of the two families has the equal-pointer branch.
            ASSERT_NO_FATAL_FAILURE(run_in_place(f, GetParam().index, g, ++seed, true));
        }
    }
}

TEST_P(BorderPrivate, ChecksInOrderAndWritesNothingOnError) {
    for (const Form& f : forms()) run_checks(f, GetParam().index);
}

// Pixels a b c with a left border of 5 give b c b a b, then a b c; the
// right border is its mirror image, the vertical axis the same rule.
TEST_P(BorderPrivate, MirrorBeyondTheImageReflectsBackAndForth) {
    const Zor8u abc[3] = {'a', 'b', 'c'};
    Zor8u row[13];
    memset(row, '.', sizeof row);
    ASSERT_EQ(ZOR_BODY(zoriCopyMirrorBorder_8u_C1R)(abc, 3, {3, 1}, row, 13, {8, 1}, 0, 5),
              zorStsNoErr);
    EXPECT_EQ(std::string((const char*)row, 13), "bcbababc.....");
    ASSERT_EQ(ZOR_BODY(zoriCopyMirrorBorder_8u_C1R)(abc, 3, {3, 1}, row, 13, {13, 1}, 0, 5),
              zorStsNoErr);
    EXPECT_EQ(std::string((const char*)row, 13), "bcbababcbcbab");

    Zor8u column[8];
    ASSERT_EQ(ZOR_BODY(zoriCopyMirrorBorder_8u_C1R)(abc, 1, {1, 3}, column, 1, {1, 8}, 5, 0),
              zorStsNoErr);
    EXPECT_EQ(std::string((const char*)column, 8), "bcbababc");
}

ZOR_INSTANTIATE_LEVELS(BorderPrivate);

}  // namespace
