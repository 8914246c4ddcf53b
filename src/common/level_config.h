/* Per-level facts for variant code. Each variant source is compiled once
 * per level with ZOR_LEVEL_<name> defined and that level's instruction
 * flags; a level refuses to build without the instructions it promises. */
#ifndef ZOR_LEVEL_CONFIG_H
#define ZOR_LEVEL_CONFIG_H

#if defined(ZOR_LEVEL_m7)
#  if !defined(__SSE3__)
#    error "m7 needs SSE3"
#  endif
#  define ZOR_VECTOR_BYTES 16
#  define ZOR_LEVEL_TEXT "zorIP SSE3 (m7)"
#elif defined(ZOR_LEVEL_n8)
#  if !defined(__SSSE3__) || defined(__MOVBE__)
#    error "n8 is SSSE3 without MOVBE (a processor without MOVBE may be sent here)"
#  endif
#  define ZOR_VECTOR_BYTES 16
#  define ZOR_LEVEL_TEXT "zorIP Lark (n8)"
#elif defined(ZOR_LEVEL_y8)
#  if !defined(__SSE4_2__) || !defined(__POPCNT__)
#    error "y8 needs SSE4.2 and POPCNT"
#  endif
#  define ZOR_VECTOR_BYTES 16
#  define ZOR_LEVEL_TEXT "zorIP SSE4.2 (y8)"
#elif defined(ZOR_LEVEL_e9)
#  if !defined(__AVX__) || defined(__AVX2__)
#    error "e9 is exactly AVX"
#  endif
#  define ZOR_VECTOR_BYTES 32
#  define ZOR_LEVEL_TEXT "zorIP AVX (e9)"
#elif defined(ZOR_LEVEL_l9)
#  if !defined(__AVX2__) || !defined(__FMA__) || !defined(__BMI2__) || defined(__AVX512F__)
#    error "l9 is AVX2 with FMA, BMI1 and BMI2"
#  endif
#  define ZOR_VECTOR_BYTES 32
#  define ZOR_LEVEL_TEXT "zorIP AVX2 (l9)"
#elif defined(ZOR_LEVEL_n0)
/* F and CD only, so that this body runs on any AVX-512 processor. */
#  if !defined(__AVX512F__) || !defined(__AVX512CD__) || defined(__AVX512BW__) || defined(__AVX512DQ__) || defined(__AVX512VL__)
#    error "n0 is AVX-512F/CD without BW/DQ/VL"
#  endif
#  define ZOR_VECTOR_BYTES 64
#  define ZOR_LEVEL_TEXT "zorIP AVX-512F/CD/ER/PF (n0)"
#elif defined(ZOR_LEVEL_k0)
#  if !defined(__AVX512F__) || !defined(__AVX512CD__) || !defined(__AVX512BW__) || !defined(__AVX512DQ__) || !defined(__AVX512VL__)
#    error "k0 needs AVX-512F/CD/BW/DQ/VL"
#  endif
#  define ZOR_VECTOR_BYTES 64
#  define ZOR_LEVEL_TEXT "zorIP AVX-512F/CD/BW/DQ/VL (k0)"
#else
#  error "variant code must be built for one level"
#endif

/* What each level has, for kernels to test instead of level names.
 *   ZOR_VECTOR_BYTES      float (and 32/64-bit integer) vector width
 *   ZOR_INT_VECTOR_BYTES  widest native byte and word integer vectors: AVX
 *                         has none at 32 bytes, AVX-512F/CD none at 64
 *   ZOR_HAS_SSSE3, ZOR_HAS_SSE41, ZOR_HAS_AVX, ZOR_HAS_AVX2, ZOR_HAS_FMA,
 *   ZOR_HAS_AVX512 (F/CD: 512-bit float and dword work, mask registers),
 *   ZOR_HAS_AVX512BW (byte/word work at 64 bytes, with DQ and VL)
 *   ZOR_HAS_MASKED_TAILS  a row's tail can be loaded and stored under a mask
 * Each is 0 or 1, so they serve in #if and in if constexpr alike; they come
 * from the compiler's own instruction-set macros, so a capability can never
 * claim more than the level's flags allow. */
#if defined(__SSSE3__)
#  define ZOR_HAS_SSSE3 1
#else
#  define ZOR_HAS_SSSE3 0
#endif
#if defined(__SSE4_1__)
#  define ZOR_HAS_SSE41 1
#else
#  define ZOR_HAS_SSE41 0
#endif
#if defined(__AVX__)
#  define ZOR_HAS_AVX 1
#else
#  define ZOR_HAS_AVX 0
#endif
#if defined(__AVX2__)
#  define ZOR_HAS_AVX2 1
#else
#  define ZOR_HAS_AVX2 0
#endif
#if defined(__FMA__)
#  define ZOR_HAS_FMA 1
#else
#  define ZOR_HAS_FMA 0
#endif
#if defined(__AVX512F__)
#  define ZOR_HAS_AVX512 1
#else
#  define ZOR_HAS_AVX512 0
#endif
#if defined(__AVX512BW__)
#  define ZOR_HAS_AVX512BW 1
#else
#  define ZOR_HAS_AVX512BW 0
#endif
#define ZOR_HAS_MASKED_TAILS ZOR_HAS_AVX512
#if ZOR_HAS_AVX512BW
#  define ZOR_INT_VECTOR_BYTES 64
#elif ZOR_HAS_AVX2
#  define ZOR_INT_VECTOR_BYTES 32
#else
#  define ZOR_INT_VECTOR_BYTES 16
#endif

/* Rules the library fixes per level on purpose, beyond what the
 * instructions allow; each is 0 or 1 unless it says otherwise.
 *   ZOR_DIV_TRUE           float quotients by the division instruction (n0,
 *                          k0); the others refine the reciprocal estimate
 *   ZOR_DIV_EXACT_ZERO_GROUPS  a group holding a zero divisor divides
 *                          exactly and its infinities take the numerator's
 *                          sign alone (m7, y8)
 *   ZOR_DIV_ZERO_BITS      only the bit pattern of +0 is a zero divisor; -0
 *                          goes through the estimate (e9, l9)
 *   ZOR_DIV_NAN_BITS       the quotient 0/0 and NaN/0 (a bit pattern)
 *   ZOR_COPY_POLICY        large copies and clears: ZOR_COPY_READAHEAD (m7,
 *                          n8, y8: cache from CPUID leaf 2, read-ahead and
 *                          streaming), ZOR_COPY_STRING (e9: string moves),
 *                          ZOR_COPY_PAGE (l9, n0, k0: page-offset test,
 *                          streaming beyond half the cache)
 *   ZOR_CACHE_TEST_ABSDIFF     absolute differences stream their stores
 *                          once the working set reaches the cache (m7, n8)
 *   ZOR_CACHE_TEST_ADDPRODUCT  the masked product accumulation takes its
 *                          wide loop beyond the cache (m7, n8, y8)
 *   ZOR_SQR_WORKING_SET    image squares choose prefetch and streaming by
 *                          the working set (k0) */
#define ZOR_COPY_READAHEAD 1
#define ZOR_COPY_STRING 2
#define ZOR_COPY_PAGE 3
#if defined(ZOR_LEVEL_m7) || defined(ZOR_LEVEL_n8) || defined(ZOR_LEVEL_y8)
#  define ZOR_COPY_POLICY ZOR_COPY_READAHEAD
#  define ZOR_CACHE_TEST_ADDPRODUCT 1
#elif defined(ZOR_LEVEL_e9)
#  define ZOR_COPY_POLICY ZOR_COPY_STRING
#  define ZOR_CACHE_TEST_ADDPRODUCT 0
#else
#  define ZOR_COPY_POLICY ZOR_COPY_PAGE
#  define ZOR_CACHE_TEST_ADDPRODUCT 0
#endif
#if defined(ZOR_LEVEL_m7) || defined(ZOR_LEVEL_y8)
#  define ZOR_DIV_EXACT_ZERO_GROUPS 1
#  define ZOR_DIV_NAN_BITS 0x7fc00000u
#else
#  define ZOR_DIV_EXACT_ZERO_GROUPS 0
#  define ZOR_DIV_NAN_BITS 0x7fbfffffu
#endif
#if defined(ZOR_LEVEL_e9) || defined(ZOR_LEVEL_l9)
#  define ZOR_DIV_ZERO_BITS 1
#else
#  define ZOR_DIV_ZERO_BITS 0
#endif
#if defined(ZOR_LEVEL_n0) || defined(ZOR_LEVEL_k0)
#  define ZOR_DIV_TRUE 1
#else
#  define ZOR_DIV_TRUE 0
#endif
#if defined(ZOR_LEVEL_m7) || defined(ZOR_LEVEL_n8)
#  define ZOR_CACHE_TEST_ABSDIFF 1
#else
#  define ZOR_CACHE_TEST_ABSDIFF 0
#endif
#if defined(ZOR_LEVEL_k0)
#  define ZOR_SQR_WORKING_SET 1
#else
#  define ZOR_SQR_WORKING_SET 0
#endif

/* Per-level rules of particular operations, named once here (they are
 * facts of the levels, not instruction sets):
 *   ZOR_FILTER_32F_SCALAR  the general filter takes its scalar path, even
 *                          and odd taps summed apart, for all 32f data
 *   ZOR_FILTER_REGS_TAPS   on the AVX levels, integer kernels of up to this
 *                          many taps keep every sum in registers (where the
 *                          turn lies was measured per level at 1920x1080) */
#if defined(ZOR_LEVEL_m7)
#  define ZOR_FILTER_32F_SCALAR 1
#else
#  define ZOR_FILTER_32F_SCALAR 0
#endif
#if defined(ZOR_LEVEL_l9)
#  define ZOR_FILTER_REGS_TAPS (1 << 30)
#else
#  define ZOR_FILTER_REGS_TAPS 9
#endif

#define ZOR_PASTE_(a, b) a##_##b
#define ZOR_PASTE(a, b) ZOR_PASTE_(a, b)
/* ZOR_NAME(zoriAdd_32f_C1R) is e9_zoriAdd_32f_C1R in the e9 build. */
#define ZOR_NAME(name) ZOR_PASTE(ZOR_LEVEL, name)
/* Namespace for everything else a variant defines; the partial link makes
 * it local as well, this keeps the names apart at compile time. */
#define ZOR_NS ZOR_PASTE(zor, ZOR_LEVEL)

#endif
