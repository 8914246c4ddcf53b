// Ascending quicksort in place, without recursion. Median-of-three pivot,
// elements equal to the pivot taken out of both parts, the larger part
// stacked and the smaller one sorted on: the stack then never needs more
// than log2(len) < 32 entries. Short ranges are finished by selection.
// NaNs fail every comparison; where they end up is not defined, but the
// loops are bounded so that they cannot run away.
#include "variant.h"

#include <stdint.h>

ZOR_BEGIN
namespace {

constexpr int32_t kSelectionMax = 9;
constexpr int kStackDepth = 32;

inline void swap(float* a, int32_t i, int32_t j) {
    const float t = a[i];
    a[i] = a[j];
    a[j] = t;
}

inline void compare_exchange(float* a, int32_t i, int32_t j) {
    if (a[i] > a[j]) swap(a, i, j);
}

// Greatest to the end (the first of equals), shorten, repeat.
void selection_sort(float* a, int32_t first, int32_t last) {
    for (; last > first; --last) {
        int32_t top = first;
        for (int32_t k = first + 1; k <= last; ++k) {
            if (a[k] > a[top]) top = k;
        }
        swap(a, top, last);
    }
}

struct Range {
    int32_t first, last;
};

// Splits [first, last] (more than kSelectionMax elements) into a lower
// part [first, *lowEnd] of elements not above the pivot and an upper part
// [*highStart, last] of elements above it; pivot-equal elements at the top
// of the lower part drop out of both.
void partition(float* a, int32_t first, int32_t last, int32_t* lowEnd, int32_t* highStart) {
    const int32_t mid = first + (last - first + 1) / 2;
    compare_exchange(a, first, last);
    compare_exchange(a, mid, last);
    compare_exchange(a, first, mid);
    const float pivot = a[mid];

    int32_t i = first, j = last + 1;
    for (;;) {
        do {
            ++i;
        } while (i <= last && !(pivot < a[i]));
        do {
            --j;
        } while (j > first && a[j] > pivot);
        if (j < i) break;
        swap(a, i, j);
    }
    // The upper part already starts past everything the pivot is not
    // below; the lower part gives up its pivot-equal top.
    while (j >= first && !(a[j] < pivot)) --j;
    *lowEnd = j;
    *highStart = i;
}

void quicksort(float* a, int32_t len) {
    Range stack[kStackDepth];
    int depth = 0;
    int32_t first = 0, last = len - 1;
    for (;;) {
        while (last - first + 1 > kSelectionMax) {
            int32_t lowEnd, highStart;
            partition(a, first, last, &lowEnd, &highStart);
            const int32_t lowSize = lowEnd - first + 1;
            const int32_t highSize = last - highStart + 1;
            if (lowSize >= highSize) {
                if (lowSize > 0) stack[depth++] = {first, lowEnd};
                first = highStart;
            } else {
                stack[depth++] = {highStart, last};
                last = lowEnd;
            }
        }
        selection_sort(a, first, last);
        if (depth == 0) break;
        --depth;
        first = stack[depth].first;
        last = stack[depth].last;
    }
}

}  // namespace
ZOR_END

ZOR_INTERNAL ZorStatus ZOR_NAME(zorsSortAscend_32f_I)(Zor32f* pSrcDst, int32_t len) {
    if (pSrcDst == nullptr) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    if (len == 1) return zorStsNoErr;
    ZOR_NS::quicksort(pSrcDst, len);
    return zorStsNoErr;
}
