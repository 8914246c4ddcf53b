// Floating-point constants by bit pattern.
#include "runtime_internal.h"

ZOR_EXPORT const uint64_t zorConstantOfNAN_64f = 0xfff8000000000000ULL;
ZOR_EXPORT const uint64_t zorConstantOfINF_64f = 0x7ff0000000000000ULL;
ZOR_EXPORT const uint64_t zorConstantOfINF_NEG_64f = 0xfff0000000000000ULL;
ZOR_EXPORT const uint32_t zorConstantOfNAN_32f = 0xffc00000u;
ZOR_EXPORT const uint32_t zorConstantOfINF_32f = 0x7f800000u;
ZOR_EXPORT const uint32_t zorConstantOfINF_NEG_32f = 0xff800000u;
