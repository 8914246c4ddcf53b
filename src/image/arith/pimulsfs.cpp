// Scaled integer products: zoriMul_8u/16u/16s_C1RSfs.
//
// The exact product p is formed in lanes wide enough for it (16-bit lanes
// for 8u, 32-bit for the 16-bit types), scaled by a rule chosen once per
// call from the scale factor s, then saturated. Right shifts round to
// nearest with ties to even: (p + 2^(s-1) - 1 + ((p >> s) & 1)) >> s,
// evaluated as q + ((r + (q & 1) + 2^(s-1) - 1) >> s) with q = p >> s and
// r = p mod 2^s where the plain sum could overflow its lane. Each rule is
// written once as a template that serves the vector lanes and the scalar
// tail alike, so every level and path gives the same integers.
#include "variant.h"

#include <type_traits>

#include "piinternal.h"

ZOR_BEGIN
namespace {

using arith::VB;

// A constant of V's element type (V a vector) or V itself.
template <typename V>
inline V bc(int64_t x) {
    if constexpr (std::is_arithmetic_v<V>)
        return (V)x;
    else
        return simd::broadcast<V>((typename simd::Lanes<V>::Element)x);
}

template <typename V>
inline V umin(V a, V b) {
    return a < b ? a : b;
}

template <typename V>
inline V clamp16s(V p) {
    p = p < bc<V>(-32768) ? bc<V>(-32768) : p;
    return p > bc<V>(32767) ? bc<V>(32767) : p;
}

// Round-half-even right shift by s >= 1 without overflowing the lane.
template <typename V>
inline V shift_even(V p, int s) {
    const V q = p >> s;
    const V r = p & bc<V>(((int64_t)1 << s) - 1);
    return q + ((r + (q & bc<V>(1)) + bc<V>(((int64_t)1 << (s - 1)) - 1)) >> s);
}

// ---- rules by range of the scale factor -----------------------------------

enum Rule { kPlain, kOne, kPos, kTop, kNeg, kBound };

// 8u: p < 2^16 in 16-bit lanes; the limits are 16 and -7.
template <int R, typename V>
inline V rule8u(V p, int s) {
    if constexpr (R == kPlain) return umin(p, bc<V>(255));
    if constexpr (R == kOne) return umin((p + ((p >> 1) & bc<V>(1))) >> 1, bc<V>(255));
    if constexpr (R == kPos) return umin(shift_even(p, s), bc<V>(255));
    // s == 16: (p + 32767) >> 16 overflows a 16-bit lane; it is 1 from 32769.
    if constexpr (R == kTop) return p > bc<V>(32768) ? bc<V>(1) : bc<V>(0);
    if constexpr (R == kNeg) return umin(umin(p, bc<V>(255)) << -s, bc<V>(255));
    if constexpr (R == kBound) return p != bc<V>(0) ? bc<V>(255) : bc<V>(0);
}

// 16u: p < 2^32 unsigned; limits 32 and -16 (below -15 every non-zero
// product saturates).
template <int R, typename V>
inline V rule16u(V p, int s) {
    if constexpr (R == kPlain) return umin(p, bc<V>(65535));
    if constexpr (R == kOne) return umin((p + ((p >> 1) & bc<V>(1))) >> 1, bc<V>(65535));
    if constexpr (R == kPos) return umin(shift_even(p, s), bc<V>(65535));
    // s == 32: the product's top bit, so 0x80000000 itself gives 1.
    if constexpr (R == kTop) return p >> 31;
    if constexpr (R == kNeg) return p > bc<V>(65535 >> -s) ? bc<V>(65535) : p << -s;
    if constexpr (R == kBound) return p != bc<V>(0) ? bc<V>(65535) : bc<V>(0);
}

// 16s: p signed in 32 bits, arithmetic shifts (ties to even below zero
// too); limits 30 and -14. Left scaling clips first, then again.
template <int R, typename V>
inline V rule16s(V p, int s) {
    if constexpr (R == kPlain) return clamp16s(p);
    if constexpr (R == kOne) return clamp16s((p + ((p >> 1) & bc<V>(1))) >> 1);
    if constexpr (R == kPos) return clamp16s((p + bc<V>(((int64_t)1 << (s - 1)) - 1) +
                                               ((p >> s) & bc<V>(1))) >> s);
    if constexpr (R == kNeg) return clamp16s(clamp16s(p) * bc<V>((int64_t)1 << -s));
    if constexpr (R == kBound)
        return p == bc<V>(0) ? bc<V>(0) : (p > bc<V>(0) ? bc<V>(32767) : bc<V>(-32768));
}

// ---- element types ---------------------------------------------------------

// 8u: one integer vector of bytes a round, as two vectors of 16-bit
// products.
struct U8 {
    typedef Zor8u T;
    typedef uint32_t S;
    static constexpr bool hasTop = true;
    template <int R, typename V>
    static V rule(V p, int s) {
        return rule8u<R>(p, s);
    }
    static constexpr int32_t kStep = ZOR_INT_VECTOR_BYTES;
    template <int R>
    static void block(const T* a, const T* b, T* d, int s) {
        arith::iu16 a0, a1, b0, b1;
        arith::widen_bytes(simd::load<arith::iu8>(a), a0, a1);
        arith::widen_bytes(simd::load<arith::iu8>(b), b0, b1);
        simd::store(d, arith::pack_bytes(rule<R>(a0 * b0, s), rule<R>(a1 * b1, s)));
    }
};

// The 16-bit types: products in 32-bit lanes of the integer width.
typedef simd::ivec<int32_t> is32;
typedef simd::ivec<uint32_t> iu32;

template <typename Elem, typename Lane, typename Wide, bool Signed>
struct Words {
    typedef Elem T;
    typedef Wide S;
    static constexpr bool hasTop = !Signed;
    template <int R, typename V>
    static V rule(V p, int s) {
        if constexpr (Signed)
            return rule16s<R>(p, s);
        else
            return rule16u<R>(p, s);
    }
    static constexpr int32_t kStep = ZOR_INT_VECTOR_BYTES / 4;
    template <int R>
    static void block(const T* a, const T* b, T* d, int s) {
        constexpr int W = ZOR_INT_VECTOR_BYTES;
        const Lane p = (Lane)arith::load_16_i32<W, Signed>(a) *
                       (Lane)arith::load_16_i32<W, Signed>(b);
        arith::store_i32_16<W, Signed>(d, (is32)rule<R>(p, s));
    }
};
typedef Words<Zor16u, iu32, uint32_t, false> U16;
typedef Words<Zor16s, is32, int32_t, true> S16;

template <typename E, int R>
void mul_rows(const typename E::T* pSrc1, int32_t src1Step, const typename E::T* pSrc2,
              int32_t src2Step, typename E::T* pDst, int32_t dstStep, ZoriSize roi, int s) {
    typedef typename E::T T;
    typedef typename E::S S;
    constexpr int32_t K = E::kStep;
    for (int32_t y = 0; y < roi.height; ++y) {
        const T* a = row_at(pSrc1, src1Step, y);
        const T* b = row_at(pSrc2, src2Step, y);
        T* d = row_at(pDst, dstStep, y);
        int32_t i = 0;
        for (; i + 2 * K <= roi.width; i += 2 * K) {
            E::template block<R>(a + i, b + i, d + i, s);
            E::template block<R>(a + i + K, b + i + K, d + i + K, s);
        }
        for (; i + K <= roi.width; i += K) E::template block<R>(a + i, b + i, d + i, s);
        for (; i < roi.width; ++i)
            simd::store(d + i, (T)E::template rule<R>((S)simd::load<T>(a + i) *
                                                          (S)simd::load<T>(b + i), s));
    }
}

template <typename E>
inline void mul_image(int rule, const typename E::T* pSrc1, int32_t src1Step,
                      const typename E::T* pSrc2, int32_t src2Step, typename E::T* pDst,
                      int32_t dstStep, ZoriSize roi, int s) {
    switch (rule) {
    case kPlain: return mul_rows<E, kPlain>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roi, s);
    case kOne: return mul_rows<E, kOne>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roi, s);
    case kPos: return mul_rows<E, kPos>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roi, s);
    case kNeg: return mul_rows<E, kNeg>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roi, s);
    case kBound:
        return mul_rows<E, kBound>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roi, s);
    default:
        if constexpr (E::hasTop)
            mul_rows<E, kTop>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roi, s);
        return;
    }
}

inline bool bad_args(const void* a, const void* b, const void* d, ZoriSize roi, ZorStatus* st) {
    if (!a || !b || !d) {
        *st = zorStsNullPtrErr;
        return true;
    }
    if (roi.width < 1 || roi.height < 1) {
        *st = zorStsSizeErr;
        return true;
    }
    return false;
}

}  // namespace
ZOR_END

ZOR_ENTRY ZorStatus ZOR_NAME(zoriMul_8u_C1RSfs)(const Zor8u* pSrc1, int32_t src1Step,
                                                const Zor8u* pSrc2, int32_t src2Step, Zor8u* pDst,
                                                int32_t dstStep, ZoriSize roiSize,
                                                int32_t scaleFactor) {
    using namespace ZOR_NS;
    ZorStatus st;
    if (bad_args(pSrc1, pSrc2, pDst, roiSize, &st)) return st;
    const int s = scaleFactor;
    // Beyond 16 every product shifts to 0.
    if (s > 16) return ZOR_NAME(zoriSet_8u_C1R)(0, pDst, dstStep, roiSize);
    const int rule = s == 0    ? kPlain
                     : s == 1  ? kOne
                     : s == 16 ? kTop
                     : s > 1   ? kPos
                     : s >= -7 ? kNeg
                               : kBound;
    mul_image<U8>(rule, pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, s);
    return zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriMul_16u_C1RSfs)(const Zor16u* pSrc1, int32_t src1Step,
                                                 const Zor16u* pSrc2, int32_t src2Step,
                                                 Zor16u* pDst, int32_t dstStep, ZoriSize roiSize,
                                                 int32_t scaleFactor) {
    using namespace ZOR_NS;
    ZorStatus st;
    if (bad_args(pSrc1, pSrc2, pDst, roiSize, &st)) return st;
    const int s = scaleFactor;
    if (s > 32) return ZOR_NAME(zoriSet_16s_C1R)(0, (Zor16s*)pDst, dstStep, roiSize);
    const int rule = s == 0     ? kPlain
                     : s == 1   ? kOne
                     : s == 32  ? kTop
                     : s > 1    ? kPos
                     : s >= -15 ? kNeg
                                : kBound;
    mul_image<U16>(rule, pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, s);
    return zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriMul_16s_C1RSfs)(const Zor16s* pSrc1, int32_t src1Step,
                                                 const Zor16s* pSrc2, int32_t src2Step,
                                                 Zor16s* pDst, int32_t dstStep, ZoriSize roiSize,
                                                 int32_t scaleFactor) {
    using namespace ZOR_NS;
    ZorStatus st;
    if (bad_args(pSrc1, pSrc2, pDst, roiSize, &st)) return st;
    const int s = scaleFactor;
    if (s > 30) return ZOR_NAME(zoriSet_16s_C1R)(0, pDst, dstStep, roiSize);
    const int rule = s == 0     ? kPlain
                     : s == 1   ? kOne
                     : s > 1    ? kPos
                     : s >= -14 ? kNeg
                                : kBound;
    mul_image<S16>(rule, pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, s);
    return zorStsNoErr;
}
