// The register barrier of the complex products. GCC turns the shape
// (a*c - b*d, a*d + b*c) into fused multiply-adds on the FMA levels even
// with contraction off, which would make those levels differ from the
// others in the last bit. A product passed through rounded() is opaque to
// the compiler, so it is rounded on its own before the sum. It stands on
// the level frame of variant.h.
#ifndef ZOR_PSROUND_H
#define ZOR_PSROUND_H
#include "variant.h"
ZOR_BEGIN

template <typename T> inline T rounded(T x) {
    __asm__("" : "+x"(x));
    return x;
}

ZOR_END

#endif
