/* zor: image and signal processing primitives. Include this header. */
#ifndef ZOR_H
#define ZOR_H

#include "zortypes.h"
#include "zorcore.h"
#include "zors.h"
#include "zori.h"
#include "zoriborder.h"
#include "zorimedian.h"
#include "zorifilter64f.h"
#include "zorifilter.h"
#include "zorimorph.h"
#include "zoriresize.h"

#endif
