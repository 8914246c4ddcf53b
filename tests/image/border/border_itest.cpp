// The level-private border copies of every level: Const, Replicate and
// Mirror in each element width and channel count, copying and in place,
// against the shared border model.
#include "border_harness.h"
#include "zorinternal.h"

// The public forms' level bodies are in the static build as well; the
// private in-place forms are tested next to them.
#define BORDER_DECLARE(level, fn) extern "C" decltype(::fn) level##_##fn;
ZOR_LEVEL_NAMES(BORDER_DECLARE, zoriCopyReplicateBorder_8u_C1R)
#undef BORDER_DECLARE
#define LEVEL_BODY(fn) (ZOR_BODIES(fn)[level])

// The three channel counts of one family and type, with or without the
// in-place forms.
#define CONST3(t, T)                                                          \
    FORM_CONSTN(LEVEL_BODY, zoriCopyConstBorder_##t##_C3R, T, 3),             \
        FORM_CONSTN(LEVEL_BODY, zoriCopyConstBorder_##t##_C4R, T, 4)
#define BOTH3(kind, fam, t, T)                                                      \
    FORM_BOTH(LEVEL_BODY, kind, fam##_##t##_C1R, fam##_##t##_C1IR, T, 1),           \
        FORM_BOTH(LEVEL_BODY, kind, fam##_##t##_C3R, fam##_##t##_C3IR, T, 3),       \
        FORM_BOTH(LEVEL_BODY, kind, fam##_##t##_C4R, fam##_##t##_C4IR, T, 4)
#define COPY3(kind, fam, t, T)                                        \
    FORM_COPY(LEVEL_BODY, kind, fam##_##t##_C1R, T, 1),               \
        FORM_COPY(LEVEL_BODY, kind, fam##_##t##_C3R, T, 3),           \
        FORM_COPY(LEVEL_BODY, kind, fam##_##t##_C4R, T, 4)

namespace {

using namespace bordertest;

const std::vector<Form>& forms() {
    static const std::vector<Form> all = {
        CONST3(8u, Zor8u),
        FORM_CONST1(LEVEL_BODY, zoriCopyConstBorder_16s_C1R, Zor16s),
        CONST3(16s, Zor16s),
        FORM_CONST1(LEVEL_BODY, zoriCopyConstBorder_32s_C1R, Zor32s),
        CONST3(32s, Zor32s),
        CONST3(32f, Zor32f),
        BOTH3(kRepl, zoriCopyReplicateBorder, 8u, Zor8u),
        BOTH3(kRepl, zoriCopyReplicateBorder, 16s, Zor16s),
        BOTH3(kRepl, zoriCopyReplicateBorder, 32s, Zor32s),
        FORM_COPY(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_32f_C3R, Zor32f, 3),
        FORM_COPY(LEVEL_BODY, kRepl, zoriCopyReplicateBorder_32f_C4R, Zor32f, 4),
        BOTH3(kMirror, zoriCopyMirrorBorder, 8u, Zor8u),
        BOTH3(kMirror, zoriCopyMirrorBorder, 16u, Zor16u),
        BOTH3(kMirror, zoriCopyMirrorBorder, 32s, Zor32s),
        COPY3(kMirror, zoriCopyMirrorBorder, 16s, Zor16s),
        COPY3(kMirror, zoriCopyMirrorBorder, 32f, Zor32f),
    };
    return all;
}

using BorderPrivate = zortest::LevelTest;

TEST_P(BorderPrivate, EveryFormFramesLikeTheModel) { run_sweep(forms(), GetParam().index); }

TEST_P(BorderPrivate, ChecksInOrderAndWritesNothingOnError) {
    for (const Form& f : forms()) run_checks(f, GetParam().index);
}

ZOR_INSTANTIATE_LEVELS(BorderPrivate);

}  // namespace
