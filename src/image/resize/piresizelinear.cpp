// Linear resize: placeholder until the method lands.
#include "resize_spec.h"

using namespace ZOR_NS;

ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLinearInit_8u)(ZoriSize, ZoriSize, ZoriResizeSpec*) {
    return zorStsNotSupportedModeErr;
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLinearInit_32f)(ZoriSize, ZoriSize, ZoriResizeSpec*) {
    return zorStsNotSupportedModeErr;
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLinear_8u_C1R)(const Zor8u*, int32_t, Zor8u*, int32_t,
                                                      ZoriPoint, ZoriSize, ZoriBorderType,
                                                      const Zor8u*, const ZoriResizeSpec*,
                                                      Zor8u*) {
    return zorStsNotSupportedModeErr;
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriResizeLinear_32f_C1R)(const Zor32f*, int32_t, Zor32f*, int32_t,
                                                       ZoriPoint, ZoriSize, ZoriBorderType,
                                                       const Zor32f*, const ZoriResizeSpec*,
                                                       Zor8u*) {
    return zorStsNotSupportedModeErr;
}
