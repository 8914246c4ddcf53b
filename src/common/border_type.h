/* The border-type argument of the filter, rank and geometry operations:
 * the low four bits are the kind, bits 4 to 7 say which sides of the ROI
 * have real pixels in memory. One validity test for all of them, so that
 * they reject the same values with the same status. Level-neutral: no
 * instructions beyond the base set, usable from C and C++. */
#ifndef ZOR_BORDER_TYPE_H
#define ZOR_BORDER_TYPE_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

enum {
    zorBorderKindMask = 0x0F,  /* the kind field */
    zorBorderFlagMask = 0xF0,  /* the in-memory flags */
    zorBorderLimit = 255,      /* largest value of the ordinary operations */
    zorBorderLimitMorph = 4095 /* morphology keeps a second flag field in bits 8-11 */
};

/* One bit per kind, for the accepted set a caller passes. */
#define ZOR_BORDER_KIND_BIT(kind) (1u << (kind))
#define zorBorderAcceptRepl ZOR_BORDER_KIND_BIT(zorBorderRepl)
#define zorBorderAcceptMirror ZOR_BORDER_KIND_BIT(zorBorderMirror)
#define zorBorderAcceptDefault ZOR_BORDER_KIND_BIT(zorBorderDefault)
#define zorBorderAcceptConst ZOR_BORDER_KIND_BIT(zorBorderConst)
#define zorBorderAcceptTransp ZOR_BORDER_KIND_BIT(zorBorderTransp)

/* zorStsNoErr if borderType is acceptable, else zorStsBorderErr:
 *   - above `limit` (zorBorderLimit, or zorBorderLimitMorph): rejected;
 *     negative values count as huge;
 *   - exactly zorBorderInMem (all four sides in memory): accepted;
 *   - otherwise the kind must be in `acceptedKinds` (zorBorderAccept*
 *     bits or-ed together); flags may come with any accepted kind.
 * Kinds 0, 2, 4 and 8-15 are never in a set this library passes. */
static inline ZorStatus zorBorderTypeCheck(int32_t borderType, uint32_t acceptedKinds,
                                           uint32_t limit) {
    if ((uint32_t)borderType > limit) return zorStsBorderErr;
    if (borderType == zorBorderInMem) return zorStsNoErr;
    if (!(acceptedKinds & ZOR_BORDER_KIND_BIT((uint32_t)borderType & zorBorderKindMask)))
        return zorStsBorderErr;
    return zorStsNoErr;
}

/* The kind field; 0 for the bare zorBorderInMem. */
static inline int32_t zorBorderKind(int32_t borderType) { return borderType & zorBorderKindMask; }

/* Non-zero if the side named by `flag` (zorBorderInMemTop .. Right) has its
 * pixels in memory. */
static inline int zorBorderSideInMem(int32_t borderType, int32_t flag) {
    return (borderType & flag & zorBorderFlagMask) != 0;
}

#ifdef __cplusplus
}
#endif

#endif
