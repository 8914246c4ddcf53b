// Median filter, shared by the driver and the kernel sources of one level:
// the job a kernel gets, the kernel table and the vector helpers of the
// min/max networks.
#ifndef ZOR_MEDIAN_INTERNAL_H
#define ZOR_MEDIAN_INTERNAL_H

#include <stddef.h>
#include <stdint.h>
#include <string.h>

#include "simd.h"
#include "variant.h"

ZOR_BEGIN
namespace median {

// A kernel reads every neighbour from memory without testing coordinates:
// src is the source pixel under output (0, 0), and rows -kh/2 .. height-1+kh/2
// and columns -kw/2 .. width-1+kw/2 around it must be readable. dst never
// overlaps the source. scratch is the mask class's share of the caller's
// buffer (4-byte aligned where the caller's buffer is).
template <typename T>
struct Job {
    const T* src;
    ptrdiff_t srcStep;  // bytes
    T* dst;
    ptrdiff_t dstStep;  // bytes
    int32_t width, height;
    int32_t kw, kh;
    uint8_t* scratch;
};

template <typename T>
using Kernel = void (*)(const Job<T>&);

// Fixed masks (pimedianfixed.cpp): 1x3, 1x5, 3x1, 5x1, 3x3, 5x5 for every
// type; the 16s 7-tap lines.
template <typename T> void fixed_1x3(const Job<T>& j);
template <typename T> void fixed_1x5(const Job<T>& j);
template <typename T> void fixed_3x1(const Job<T>& j);
template <typename T> void fixed_5x1(const Job<T>& j);
template <typename T> void fixed_3x3(const Job<T>& j);
template <typename T> void fixed_5x5(const Job<T>& j);
void fixed_1x7_16s(const Job<Zor16s>& j);
// 8u 7x7 on rows of at least one vector (a general mask with a network).
void square7_8u(const Job<Zor8u>& j);
void fixed_7x1_16s(const Job<Zor16s>& j);

// Any other mask (pimedianhist.cpp, pimedian32f.cpp).
void general_8u(const Job<Zor8u>& j);
void general_16u(const Job<Zor16u>& j);
void general_16s(const Job<Zor16s>& j);
void general_32f(const Job<Zor32f>& j);

// Scratch of the float masks of 625 values and more: the three counter
// tables of the key histogram, then the window's keys.
constexpr int32_t kKeyTableBytes = 28672;

// ---- vectors of the networks ----------------------------------------------
// simd::native<T>: integer networks run at the level's byte and word width
// (16 bytes on e9, 32 on n0), floats at the full width.

// One definition of min and max for scalars and vectors alike, so that a
// row's tail gives exactly what the vector body gives (NaN included: the
// second operand wins an unordered comparison, as minps/maxps do).
template <typename V> inline V vmin(V a, V b) { return a < b ? a : b; }
template <typename V> inline V vmax(V a, V b) { return a > b ? a : b; }
template <typename V> inline void cex(V& a, V& b) {
    const V lo = vmin(a, b);
    b = vmax(a, b);
    a = lo;
}
template <typename V> inline V med3(V a, V b, V c) {
    return vmax(vmin(a, b), vmin(vmax(a, b), c));
}

}  // namespace median
ZOR_END

#endif
