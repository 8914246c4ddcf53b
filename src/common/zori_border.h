/* Border-extending copies that every level has but does not export; the
 * filter, rank and geometry operations of the same level call them by
 * ZOR_NAME(name). */
#ifndef ZORI_BORDER_H
#define ZORI_BORDER_H

#include "zortypes.h"

#ifdef __cplusplus
extern "C" {
#endif

#ifdef __cplusplus
}
#endif

#endif
