/* Calls dispatched operations from the executable's pre-initialisation
 * array, before the library's own initialiser: the in_ entry must select a
 * level first, pass integer arguments through and return the call's own
 * result. */
#include <stdio.h>
#include <string.h>

#include "zor.h"

static int32_t index_before = 99, index_after = 99;
static const ZorLibraryVersion* early_version;
static Zor32f* early_block;

static void early(int argc, char** argv, char** envp) {
    (void)argc, (void)argv, (void)envp;
    index_before = zorJumpIndexForMergedLibs;
    early_version = zoriGetLibVersion();
    index_after = zorJumpIndexForMergedLibs;
    early_block = zorsMalloc_32f(1000);
}

__attribute__((section(".preinit_array"), used)) static void (*early_entry)(int, char**, char**) = early;

int main(void) {
    const int ok = index_before == -1 && index_after >= 0 && index_after <= 6 && early_version &&
                   zoriGetLibVersion() == early_version && early_block && ((uintptr_t)early_block & 63) == 0;
    printf("index %d before the first call, %d after; record %s; block %p\n", index_before, index_after,
           early_version ? early_version->targetCode : "none", (void*)early_block);
    if (early_block) memset(early_block, 0, 1000 * sizeof(Zor32f));
    zorsFree(early_block);
    return ok ? 0 : 1;
}
