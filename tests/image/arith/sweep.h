// The layouts every point-operation test sweeps: ROI sizes around the
// kernels' block sizes, row steps by the operation's step rule, and first
// pixels off a 64-byte boundary.
#ifndef ZOR_ARITH_SWEEP_H
#define ZOR_ARITH_SWEEP_H

#include <stdint.h>

#include <vector>

#include "image.h"

namespace arithtest {

using namespace zortest;

enum StepRule {
    kFree,      // no test: zero, negative and odd steps run
    kPositive,  // at least 1, used as it stands
    kRounded,   // at least 1, two low bits cleared before use
    kRow,       // at least a row, a multiple of the element size
};

// Widths 1 to 70 with heights 1 to 3, then a few around 128 and 256
// elements, and tall narrow ones.
inline std::vector<ZoriSize> geometries() {
    std::vector<ZoriSize> g;
    for (int32_t w = 1; w <= 70; ++w) g.push_back({w, 1 + w % 3});
    for (int32_t w : {95, 127, 128, 129, 255, 256, 257, 300}) g.push_back({w, w % 2 ? 5 : 4});
    g.push_back({3, 40});
    g.push_back({17, 33});
    return g;
}

// Steps the rule accepts for a row of `row` bytes of e-byte elements: the
// exact row (merged rows), padded, odd where allowed, negative and zero
// where there is no test.
inline std::vector<int32_t> steps_for(int32_t row, int32_t e, StepRule rule) {
    std::vector<int32_t> s = {row, row + 64, row + 4 * e};
    if (rule != kRow || e == 1) s.push_back(row + 3);
    if (rule == kFree) {
        s.push_back(-row);
        s.push_back(-(row + 16));
        s.push_back(0);
    }
    return s;
}

// Offsets of the first pixel from a 64-byte boundary; odd only where the
// element may sit anywhere.
inline size_t misalign(int32_t e, bool odd, size_t turn) {
    const size_t m[5] = {0, (size_t)e, 16 + (size_t)e, 60, 1};
    return m[turn % (odd ? 5 : 4)];
}

// An image with any step, zero included (the rows then coincide).
template <typename T>
Image<T> image(int32_t w, int32_t h, int32_t step, size_t off) {
    Image<T> im(w, h, step ? step : w * (int32_t)sizeof(T), off);
    im.step = step;
    return im;
}

}  // namespace arithtest

#endif
