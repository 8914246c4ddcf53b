/* zor: shared types, status codes and feature bits.
 * Plain C99; every other public header includes this one. */
#ifndef ZORTYPES_H
#define ZORTYPES_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef uint8_t  Zor8u;
typedef int8_t   Zor8s;
typedef uint16_t Zor16u;
typedef int16_t  Zor16s;
typedef uint32_t Zor32u;
typedef int32_t  Zor32s;
typedef int64_t  Zor64s;
typedef uint64_t Zor64u;
typedef float    Zor32f;
typedef double   Zor64f;
typedef struct { Zor32f re, im; } Zor32fc;
typedef struct { Zor64f re, im; } Zor64fc;

/* 0 success, > 0 warning (the output is complete), < 0 error (nothing written). */
typedef int32_t ZorStatus;

typedef struct { int32_t width, height; } ZoriSize;
typedef struct { int32_t x, y, width, height; } ZoriRect;
typedef struct { int32_t x, y; } ZoriPoint;

typedef enum {
    zor8u = 1,
    zor16u = 5,
    zor16s = 7,
    zor32f = 13,
    zor64f = 19
} ZorDataType;

/* Low four bits: the kind. Flags 16/32/64/128: the pixels above/below/left/
 * right of the ROI exist in memory and may be read. */
typedef enum {
    zorBorderRepl = 1,
    zorBorderMirror = 3,
    zorBorderDefault = 5,      /* neutral constant: morphology only */
    zorBorderConst = 6,
    zorBorderTransp = 7,       /* geometric operations only */
    zorBorderInMemTop = 16,
    zorBorderInMemBottom = 32,
    zorBorderInMemLeft = 64,
    zorBorderInMemRight = 128,
    zorBorderInMem = 240
} ZoriBorderType;

typedef enum {
    zoriInterNN = 1,
    zoriInterLinear = 2,
    zoriInterCubic2p = 4,      /* remap: Lagrange cubic */
    zoriInterCubic = 6,        /* remap: Catmull-Rom */
    zoriInterSuper = 8,        /* size query only */
    zoriInterLanczos = 16,
    zoriSmoothEdge = (int)0x80000000u
} ZoriInterpolationType;

typedef struct {
    int32_t versionMajor;
    int32_t versionMinor;
    int32_t versionUpdate;
    int32_t revision;
    char targetCode[4];
    const char* libraryName;
    const char* versionText;
    const char* buildDate;
} ZorLibraryVersion;

/* Feature word bits. */
#define zorFeatureMMX           0x1ULL
#define zorFeatureSSE           0x2ULL
#define zorFeatureSSE2          0x4ULL
#define zorFeatureSSE3          0x8ULL
#define zorFeatureSSSE3         0x10ULL
#define zorFeatureMOVBE         0x20ULL
#define zorFeatureSSE41         0x40ULL
#define zorFeatureSSE42         0x80ULL
#define zorFeatureAVX           0x100ULL
#define zorFeatureAVXState      0x200ULL
#define zorFeatureAES           0x400ULL
#define zorFeaturePCLMULQDQ     0x800ULL
#define zorFeatureRDRAND        0x2000ULL
#define zorFeatureF16C          0x4000ULL
#define zorFeatureAVX2          0x8000ULL
#define zorFeatureADX           0x10000ULL
#define zorFeatureRDSEED        0x20000ULL
#define zorFeaturePREFETCHW     0x40000ULL
#define zorFeatureSHA           0x80000ULL
#define zorFeatureAVX512F       0x100000ULL
#define zorFeatureAVX512CD      0x200000ULL
#define zorFeatureAVX512ER      0x400000ULL
#define zorFeatureAVX512PF      0x800000ULL
#define zorFeatureAVX512BW      0x1000000ULL
#define zorFeatureAVX512DQ      0x2000000ULL
#define zorFeatureAVX512VL      0x4000000ULL
#define zorFeatureAVX512VBMI    0x8000000ULL
#define zorFeatureMPX           0x10000000ULL
#define zorFeatureAVX5124FMAPS  0x20000000ULL
#define zorFeatureAVX5124VNNIW  0x40000000ULL
#define zorFeatureCoprocessorB1 0x80000000ULL
#define zorFeatureAVX512IFMA    0x100000000ULL
#define zorFeatureAVX512State   0x200000000ULL
/* Request bit of zorSetCpuFeatures: take the word as given, without
 * comparing it with the processor; it also replaces the detected word. */
#define zorFeatureNoCheck       0x8000000000000000ULL

/* Status codes; zorGetStatusString gives the text of each. */
enum {
    zorStsCpuNotSupportedErr = -9999,
    zorStsInplaceModeNotSupportedErr = -9998,
    zorStsIIRIIRLengthErr = -234,
    zorStsWarpTransformTypeErr = -233,
    zorStsExceededSizeErr = -232,
    zorStsWarpDirectionErr = -231,
    zorStsFilterTypeErr = -230,
    zorStsNormErr = -229,
    zorStsAlgTypeErr = -228,
    zorStsMisalignedOffsetErr = -227,
    zorStsBorderErr = -225,
    zorStsDitherTypeErr = -224,
    zorStsLoadDynErr = -221,
    zorStsUnknownStatusCodeErr = -216,
    zorStsLzoBrokenStreamErr = -214,
    zorStsRoundModeNotSupportedErr = -213,
    zorStsDecimateFractionErr = -212,
    zorStsWeightErr = -211,
    zorStsQualityIndexErr = -210,
    zorStsIIRPassbandRippleErr = -209,
    zorStsFilterFrequencyErr = -208,
    zorStsIIRGenOrderErr = -206,
    zorStsConvergeErr = -205,
    zorStsSizeMatchMatrixErr = -204,
    zorStsCountMatrixErr = -203,
    zorStsRoiShiftMatrixErr = -202,
    zorStsSrcDataErr = -200,
    zorStsSingularErr = -195,
    zorStsSparseErr = -194,
    zorStsRegExpOptionsErr = -190,
    zorStsRegExpErr = -189,
    zorStsRegExpMatchLimitErr = -188,
    zorStsRegExpQuantifierErr = -187,
    zorStsRegExpGroupingErr = -186,
    zorStsRegExpBackRefErr = -185,
    zorStsRegExpChClassErr = -184,
    zorStsRegExpMetaChErr = -183,
    zorStsStrideMatrixErr = -182,
    zorStsNoiseRangeErr = -125,
    zorStsNotEvenStepErr = -108,
    zorStsHistoNofLevelsErr = -107,
    zorStsLUTNofLevelsErr = -106,
    zorStsChannelOrderErr = -60,
    zorStsDataTypeErr = -59,
    zorStsQuadErr = -58,
    zorStsRectErr = -57,
    zorStsCoeffErr = -56,
    zorStsNoiseValErr = -55,
    zorStsDitherLevelsErr = -54,
    zorStsNumChannelsErr = -53,
    zorStsCOIErr = -52,
    zorStsDivisorErr = -51,
    zorStsAlphaTypeErr = -50,
    zorStsGammaRangeErr = -49,
    zorStsChannelErr = -47,
    zorStsToneMagnErr = -46,
    zorStsToneFreqErr = -45,
    zorStsTonePhaseErr = -44,
    zorStsTrnglMagnErr = -43,
    zorStsTrnglFreqErr = -42,
    zorStsTrnglPhaseErr = -41,
    zorStsTrnglAsymErr = -40,
    zorStsHugeWinErr = -39,
    zorStsJaehneErr = -38,
    zorStsStrideErr = -37,
    zorStsEpsValErr = -36,
    zorStsWtOffsetErr = -35,
    zorStsAnchorErr = -34,
    zorStsMaskSizeErr = -33,
    zorStsShiftErr = -32,
    zorStsSampleFactorErr = -31,
    zorStsSamplePhaseErr = -30,
    zorStsFIRMRFactorErr = -29,
    zorStsFIRMRPhaseErr = -28,
    zorStsRelFreqErr = -27,
    zorStsFIRLenErr = -26,
    zorStsIIROrderErr = -25,
    zorStsResizeFactorErr = -24,
    zorStsInterpolationErr = -23,
    zorStsMirrorFlipErr = -22,
    zorStsMoment00ZeroErr = -21,
    zorStsThreshNegLevelErr = -20,
    zorStsThresholdErr = -19,
    zorStsFftFlagErr = -18,
    zorStsFftOrderErr = -17,
    zorStsStepErr = -16,
    zorStsLengthErr = -15,
    zorStsNotSupportedModeErr = -14,
    zorStsContextMatchErr = -13,
    zorStsScaleRangeErr = -12,
    zorStsOutOfRangeErr = -11,
    zorStsDivByZeroErr = -10,
    zorStsMemAllocErr = -9,
    zorStsNullPtrErr = -8,
    zorStsRangeErr = -7,
    zorStsSizeErr = -6,
    zorStsBadArgErr = -5,
    zorStsNoMemErr = -4,
    zorStsErr = -2,
    zorStsNoErr = 0,
    zorStsNoOperation = 1,
    zorStsDivByZero = 2,
    zorStsSqrtNegArg = 3,
    zorStsInvZero = 4,
    zorStsEvenMedianMaskSize = 5,
    zorStsLnZeroArg = 7,
    zorStsLnNegArg = 8,
    zorStsNanArg = 9,
    zorStsOverflow = 12,
    zorStsUnderflow = 17,
    zorStsSingularity = 18,
    zorStsDomain = 19,
    zorStsNonTarvoCpu = 20,
    zorStsCpuMismatch = 21,
    zorStsOvermuchStrings = 26,
    zorStsOverlongString = 27,
    zorStsAffineQuadChanged = 28,
    zorStsWrongIntersectROI = 29,
    zorStsWrongIntersectQuad = 30,
    zorStsSrcSizeLessExpected = 32,
    zorStsDstSizeLessExpected = 33,
    zorStsDoubleSize = 35,
    zorStsNotSupportedCpu = 36,
    zorStsUnknownCacheSize = 37,
    zorStsSymKernelExpected = 38,
    zorStsEvenMedianWeight = 39,
    zorStsWrongIntersectVOI = 40,
    zorStsWaterfall = 43,
    zorStsNoAntialiasing = 46,
    zorStsRepetitiveSrcData = 47,
    zorStsSizeWrn = 48,
    zorStsFeatureNotSupported = 49,
    zorStsUnknownFeature = 50,
    zorStsFeaturesCombination = 51,
    zorStsAccurateModeNotSupported = 52,
};

#ifdef __cplusplus
}
#endif

#endif
