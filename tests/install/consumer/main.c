#include <stdio.h>
#include <zor.h>

int main(void) {
    const ZorLibraryVersion* v = zoriGetLibVersion();
    int32_t step = 0;
    Zor32f* image = zoriMalloc_32f_C1(17, 3, &step);
    int ok = v != NULL && image != NULL && step == 128 && zorJumpIndexForMergedLibs >= 0;
    printf("%s %s, step %d\n", v ? v->targetCode : "?", v ? v->versionText : "?", step);
    zoriFree(image);
    return ok ? 0 : 1;
}
