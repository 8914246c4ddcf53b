// The general filter's record and the kernels the driver runs on each
// rectangle. A record is laid out the same on every level (it may be made
// under one level and used under another), so its head is a fixed struct
// of 128 bytes at the first 64-byte boundary of the caller's block.
// Included by variant sources only.
#ifndef ZOR_PIFILTER_H
#define ZOR_PIFILTER_H

#include <stddef.h>
#include <stdint.h>
#include "variant.h"
#include "simd.h"

ZOR_BEGIN
namespace filt {

struct Record {
    int32_t specId;         // 3 8u, 5 16u, 4 16s, 6 32f; 0 and 1 mark integer-tap records
    int32_t kernelWidth;
    int32_t kernelHeight;
    int32_t intDivisor;     // integer-tap fields: never written by the float Init
    int32_t intShift;
    int32_t intCvtOffset;
    int32_t intCvtMode;
    int32_t roundMode;      // 0 truncate, 1 nearest even, 2 half away from zero
    uint32_t bias[2];       // word 0: float added to each sum (zero from Init)
    int16_t* pIntTaps;      // integer-tap path only
    float* pTaps;           // reversed taps, head + 128
    float* pBroadcastTaps;  // four copies of each tap, caller's order (not for 32f)
    int32_t numChannels;
    uint8_t reserved[128 - 68];
};
static_assert(sizeof(Record) == 128, "record head is 128 bytes");
static_assert(offsetof(Record, pTaps) == 48 && offsetof(Record, numChannels) == 64,
              "record layout is shared by all levels");

constexpr int32_t kHeadBytes = 128;

inline const Record* record_of(const void* p) { return align_up((const Record*)p, 64); }

// Tap (j, i) of the caller's kernel, from the reversed store.
inline float tap(const Record& s, int32_t j, int32_t i) {
    const int32_t n = s.kernelWidth * s.kernelHeight;
    return s.pTaps[n - 1 - (j * s.kernelWidth + i)];
}

inline float bias_of(const Record& s) {
    float b;
    __builtin_memcpy(&b, &s.bias[0], sizeof b);
    return b;
}

// ---- kernels ---------------------------------------------------------------
// src is the top-left pixel of the first output pixel's window; the kernel
// writes w by h pixels at dst and reads (w + kw - 1) by (h + kh - 1) pixels
// at src, nothing outside. work is the 64-byte aligned kernel work area.

// The entry per element type: chooses the level's path (pifilterkern.cpp).
void run(const Zor8u* src, int32_t srcStep, Zor8u* dst, int32_t dstStep, int32_t w, int32_t h,
         const Record& s, float* work);
void run(const Zor16u* src, int32_t srcStep, Zor16u* dst, int32_t dstStep, int32_t w, int32_t h,
         const Record& s, float* work);
void run(const Zor16s* src, int32_t srcStep, Zor16s* dst, int32_t dstStep, int32_t w, int32_t h,
         const Record& s, float* work);
void run(const Zor32f* src, int32_t srcStep, Zor32f* dst, int32_t dstStep, int32_t w, int32_t h,
         const Record& s, float* work);

// SSE levels (pifiltersse.cpp): integer rows two at a time through float
// lines, converted to nearest; the 32f vector kernel of n8 and y8.
void rowacc(const Zor8u* src, int32_t srcStep, Zor8u* dst, int32_t dstStep, int32_t w, int32_t h,
            const Record& s, float* work);
void rowacc(const Zor16u* src, int32_t srcStep, Zor16u* dst, int32_t dstStep, int32_t w,
            int32_t h, const Record& s, float* work);
void rowacc(const Zor16s* src, int32_t srcStep, Zor16s* dst, int32_t dstStep, int32_t w,
            int32_t h, const Record& s, float* work);
void vec_32f_sse(const Zor32f* src, int32_t srcStep, Zor32f* dst, int32_t dstStep, int32_t w,
                 int32_t h, const Record& s);

// AVX levels (pifilterrow32fg9e9.cpp): sums in registers or through float
// lines; integers convert to nearest.
void vec_avx(const Zor8u* src, int32_t srcStep, Zor8u* dst, int32_t dstStep, int32_t w, int32_t h,
             const Record& s, float* work);
void vec_avx(const Zor16u* src, int32_t srcStep, Zor16u* dst, int32_t dstStep, int32_t w,
             int32_t h, const Record& s, float* work);
void vec_avx(const Zor16s* src, int32_t srcStep, Zor16s* dst, int32_t dstStep, int32_t w,
             int32_t h, const Record& s, float* work);
void vec_avx(const Zor32f* src, int32_t srcStep, Zor32f* dst, int32_t dstStep, int32_t w,
             int32_t h, const Record& s, float* work);

}  // namespace filt
ZOR_END

#endif
