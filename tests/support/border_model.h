// The border rules as the tests model them: which source index a position
// outside the image reads. Every border-frame test (copies, filters,
// median, morphology) takes its frame from here, so there is one reading
// of each rule.
#ifndef ZOR_TEST_BORDER_MODEL_H
#define ZOR_TEST_BORDER_MODEL_H

#include <stdint.h>

namespace zortest {

// Replicate: the nearest image index.
inline int64_t replicate_index(int64_t x, int64_t n) {
    return x < 0 ? 0 : x >= n ? n - 1 : x;
}

// Mirror: reflection about the edge pixel, edge not repeated, folding back
// and forth with period 2n - 2 however far out x lies. Next to the image
// this is always pixel 1 (or n - 2), whatever the frame's width.
inline int64_t mirror_index(int64_t x, int64_t n) {
    if (n == 1) return 0;
    const int64_t p = 2 * n - 2;
    int64_t t = ((x % p) + p) % p;
    return t >= n ? p - t : t;
}

// The index for border kind 1 (replicate) or 3 (mirror); -1 for a position
// that a constant border fills.
inline int64_t border_index(int kind, int64_t x, int64_t n) {
    if (x >= 0 && x < n) return x;
    if (kind == 1) return replicate_index(x, n);
    if (kind == 3) return mirror_index(x, n);
    return -1;
}

}  // namespace zortest

#endif
