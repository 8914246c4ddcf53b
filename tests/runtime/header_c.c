/* The public header must compile as strict C99. */
#include "zor.h"

int zor_c_header_smoke(void) {
    ZoriSize size = {3, 2};
    ZoriRect rect = {0, 0, 3, 2};
    ZoriPoint point = {1, 1};
    const ZorLibraryVersion* v = zoriGetLibVersion();
    ZorStatus s = zorStsNoErr;
    int32_t step = 0;
    Zor8u* image = zoriMalloc_8u_C1(size.width, size.height, &step);
    if (!image || step != 64 || !v) s = zorStsErr;
    zoriFree(image);
    return s + rect.x + point.x - 1 + (zorGetEnabledCpuFeatures() & zorFeatureSSE2 ? 0 : 1);
}
