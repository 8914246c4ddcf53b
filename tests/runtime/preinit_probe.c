/* Calls a dispatched operation from the executable's pre-initialisation
 * array, before the library's own initialiser: the in_ entry must select a
 * level first and the call must still return its own result. */
#include <stdio.h>
#include <string.h>

#include "zor.h"

static int32_t index_before = 99;
static int32_t index_after = 99;
static const ZorLibraryVersion* early_version;
static Zor32f* early_block;

static void early(int argc, char** argv, char** envp) {
    (void)argc, (void)argv, (void)envp;
    index_before = zorJumpIndexForMergedLibs;
    early_version = zoriGetLibVersion();
    index_after = zorJumpIndexForMergedLibs;
    /* An operation with integer arguments must receive them intact. */
    early_block = zorsMalloc_32f(1000);
}

__attribute__((section(".preinit_array"), used)) static void (*early_entry)(int, char**, char**) = early;

int main(void) {
    int ok = 1;
    if (index_before != -1) {
        printf("index before initialisation was %d, expected -1\n", index_before);
        ok = 0;
    }
    if (index_after < 0 || index_after > 6) {
        printf("index after the first call is %d\n", index_after);
        ok = 0;
    }
    if (!early_version || zoriGetLibVersion() != early_version) {
        printf("early call did not return the record of the selected level\n");
        ok = 0;
    }
    if (!early_block || ((uintptr_t)early_block & 63) != 0) {
        printf("early allocation failed or is misaligned\n");
        ok = 0;
    } else {
        memset(early_block, 0, 1000 * sizeof(Zor32f));
        zorsFree(early_block);
    }
    if (ok) printf("early call reached %s with index %d\n", early_version->targetCode, index_after);
    printf("%d passed, %d failed\n", ok, !ok);
    return ok ? 0 : 1;
}
