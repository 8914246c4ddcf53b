// Work size of the direct double filter: only the column form with a
// kernel of at least 3 rows over a ROI of at least 16 pixels lays its taps
// out for vector loads, 32 bytes per kernel row.
#include "variant.h"

ZOR_ENTRY ZorStatus ZOR_NAME(zoriFilterGetBufSize_64f_C1R)(ZoriSize kernelSize, int32_t roiWidth,
                                                           int32_t* pBufSize) {
    if (!pBufSize) return zorStsNullPtrErr;
    if (kernelSize.width < 1 || kernelSize.height < 1 || roiWidth < 1) return zorStsSizeErr;
    if (kernelSize.width != 1 || kernelSize.height < 3 || roiWidth < 16) {
        *pBufSize = 0;
        return zorStsNoErr;
    }
    // A size beyond 32 bits cannot be handed back.
    if (kernelSize.height > INT32_MAX / 32) return zorStsSizeErr;
    *pBufSize = kernelSize.height * 32;
    return zorStsNoErr;
}
