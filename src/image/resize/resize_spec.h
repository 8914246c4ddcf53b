// The resize record and what every resize method shares: where the record
// and its tables lie in the caller's block, the argument checks of the
// operations, the tile rule and the border strips.
#ifndef ZOR_RESIZE_SPEC_H
#define ZOR_RESIZE_SPEC_H

#include <math.h>
#include <stddef.h>
#include <stdint.h>

#include "variant.h"
#include "simd.h"

ZOR_BEGIN

constexpr uint32_t kResizeId = 0x4B617389u;
constexpr int32_t kInterNearest = 1, kInterLinear = 2, kInterCubic = 6, kInterLanczos = 16,
                  kInterSuper = 8;
constexpr int32_t kHintQ14 = 1, kHintFloat = 2;

struct ResizeAxis {
    int32_t srcLen, dstLen, srcRed, dstRed;
    int32_t* indexTable;  // one source index per destination position
    float* coef32f;
    double* coef64f;
    uint16_t* coefQ14;
    int32_t lowCount;   // positions whose window reaches below source 0
    int32_t highCount;  // positions whose window reaches past the last source
};

struct ResizeSpec {
    uint32_t id;
    int32_t workType;  // ZorDataType of the tables: 13 float, 7 Q14, 19 double
    int32_t interpolation;
    int32_t tapsX, tapsY;
    int32_t antialiasing;
    int32_t reach[4];
    ResizeAxis axisY, axisX;
    int32_t hint;  // 1 Q14 tables, 2 float tables
    int64_t srcWidth, srcHeight, dstWidth, dstHeight;
    int32_t dataType;
    float cubicB, cubicC;
    void* initBuffer;
    int32_t lobes;
    // Antialiasing records with tapsX 1: the second weight of each column's
    // pair, so the linear row form a + (b - a) * w applies.
    float* coefSecond;
};

// Tables start this far into the aligned record; the size formulas keep
// 368 - 64 bytes for the record itself.
constexpr size_t kResizeTablesAt = 256;
static_assert(sizeof(ResizeSpec) <= kResizeTablesAt, "record fits before its tables");

inline int64_t a32(int64_t n) { return (n + 31) & ~(int64_t)31; }

inline ResizeSpec* resize_spec(const ZoriResizeSpec* p) {
    return (ResizeSpec*)align_up((uint8_t*)p, 64);
}

// Bump allocation of tables behind the record: each 32-byte aligned.
template <typename T> inline T* take(uint8_t*& at, int64_t count) {
    T* p = (T*)at;
    at += a32(count * (int64_t)sizeof(T));
    return p;
}

inline int64_t gcd64(int64_t a, int64_t b) {
    while (b) {
        const int64_t t = a % b;
        a = b;
        b = t;
    }
    return a;
}

// Zeroes the record and fills the common fields and both axes' lengths;
// returns where the tables may start (index tables first, vertical then
// horizontal, already placed).
uint8_t* resize_spec_begin(ResizeSpec* s, ZoriSize src, ZoriSize dst, int32_t interpolation,
                           int32_t taps, int32_t hint, int32_t workType);

inline double axis_ratio(const ResizeAxis& a) { return (double)a.srcRed / (double)a.dstRed; }

// The filtering methods' mapping of one axis: pos = (i + 0.5) * ratio - 0.5
// and index = floor(pos) in double, the index to the table, the fraction
// pos - index to `fractions` (float or double), and the strip counts of a
// window of `taps` a side: low when index < taps - 1, high when
// index >= srcLen - taps (the same on pos, the bounds being integers).
template <typename F> void resize_map_axis(ResizeAxis* a, int64_t taps, F* fractions) {
    const double ratio = axis_ratio(*a);
    a->lowCount = a->highCount = 0;
    for (int32_t i = 0; i < a->dstLen; ++i) {
        const double pos = ((double)i + 0.5) * ratio - 0.5;
        const double index = floor(pos);
        a->indexTable[i] = (int32_t)index;
        fractions[i] = (F)(pos - index);
        a->lowCount += index < (double)(taps - 1);
        a->highCount += index >= (double)(a->srcLen - taps);
    }
}

// The (B, C) cubic family at distance x >= 0 in double; NaN weighs 1.
inline double resize_cubic_weight(double x, double B, double C) {
    if (x >= 2) return 0;
    if (x < 1) return ((2 - 1.5 * B - C) * x + (-3 + 2 * B + C)) * (x * x) + (1 - B / 3);
    if (x < 2)
        return (((-B / 6 - C) * x + (B + 5 * C)) * x - (2 * B + 8 * C)) * x + (4 * B / 3 + 4 * C);
    return 1.0;
}

// ---- operations -------------------------------------------------------------------

// Border values the filtering methods accept: 240, or replicate (low four
// bits 1) with any of the four in-memory flags, at most 255.
inline bool resize_border_ok(int32_t border) {
    return (uint32_t)border <= 255u && (border == 240 || (border & 15) == 1);
}

// Checks 2 to 9 of an operation, in their order (the border, where there is
// one, is checked before). On success *record is the record. The
// antialiasing operations pass kAntialiasingOp: after check 7 they refuse
// plain records and look no further.
constexpr int32_t kAntialiasingOp = -1;
ZorStatus resize_check(const void* pSrc, int32_t srcStep, const void* pDst, int32_t dstStep,
                       ZoriPoint dstOffset, ZoriSize dstSize, const ZoriResizeSpec* pSpec,
                       const void* pBuffer, bool stepsInFloats, int32_t interpolation,
                       const ResizeSpec** record);

// A tile after clipping, with its local index tables (relative to the
// tile's source pointer) at the start of the work buffer.
struct ResizeTile {
    int32_t x0, y0;  // dstOffset
    int32_t w, h;    // clipped size
    int32_t shiftX, shiftY;
    bool clipped;    // dstSize ran past the destination: the call says 48
    int32_t* localX;
    int32_t* localY;
    uint8_t* rows;  // first row buffer, 32-byte aligned behind the tables
};

// Tile origin in the source for a destination offset (both axes).
inline int32_t tile_shift(const ResizeAxis& a, int32_t offset) {
    return (int32_t)floor((double)offset * axis_ratio(a));
}

void resize_tile(const ResizeSpec* s, ZoriPoint dstOffset, ZoriSize dstSize, uint8_t* pBuffer,
                 ResizeTile* t);

// Bytes of one row buffer of the tile (A32 of four bytes per element and
// channel).
inline int64_t tile_row_bytes(const ResizeTile& t, int32_t channels = 1) {
    return a32(4 * (int64_t)channels * t.w);
}

// The strips of a tile computed by the border pass of a filtering method;
// all zero for border 240. Each is limited to the tile.
struct ResizeStrips {
    int32_t top, bottom, left, right;
};
ResizeStrips resize_strips(const ResizeSpec* s, const ResizeTile& t, int32_t border);

// Where the four-tap machinery (cubic, two-lobe Lanczos) and the general
// window (three-lobe Lanczos, antialiasing) start: checks done, tile made.
struct ResizeJob {
    const ResizeSpec* s;
    ResizeTile t;
    ResizeStrips st;
};

// The border (check 1), checks 2 to 9 and the tile with its strips: what
// every filtering operation does before its passes.
ZorStatus resize_job(const void* pSrc, int32_t srcStep, const void* pDst, int32_t dstStep,
                     ZoriPoint dstOffset, ZoriSize dstSize, int32_t border,
                     const ZoriResizeSpec* pSpec, Zor8u* pBuffer, bool stepsInFloats,
                     int32_t interpolation, ResizeJob* job);

// Cubic passes over a four-tap record (the border pass and the four-row
// ring), for an operation whose checks are done.
void resize_four_taps(const ResizeJob& k, const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                      int32_t dstStep);
void resize_four_taps(const ResizeJob& k, const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                      int32_t dstStep);

// The general window: 2 * tapsX taps per destination column from
// index + 1 - tapsX on, 2 * tapsY rows likewise, each pixel summed in
// groups of four taps; tapsX 1 takes the linear row form on coefSecond.
// Strip pixels read taps clamped into the image. Channels 1 or 3 (8u).
// Behind the 2 * tapsY row buffers an antialiasing record's work buffer
// has, in order: the ring's pointers A32(16 tapsY + 8), the border tap
// tables (X low, X high, Y low, Y high: A32(16 count taps) each) and one
// line buffer A32(4 c w); a three-lobe record has none of these.
void resize_window(const ResizeJob& k, const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                   int32_t dstStep, int32_t channels);
void resize_window(const ResizeJob& k, const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                   int32_t dstStep, int32_t channels);

// The operation's final status: 48 when the tile was clipped.
inline ZorStatus tile_status(const ResizeTile& t, ZorStatus worker) {
    return t.clipped ? zorStsSizeWrn : worker;
}

ZOR_END

#endif
