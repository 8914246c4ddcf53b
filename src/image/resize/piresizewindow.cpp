// The general resize window: any number of taps per axis, for three-lobe
// Lanczos and the antialiasing kernels.
#include "resize_spec.h"

ZOR_BEGIN

void resize_window(const ResizeJob&, const Zor8u*, int32_t, Zor8u*, int32_t, int32_t) {}
void resize_window(const ResizeJob&, const Zor32f*, int32_t, Zor32f*, int32_t, int32_t) {}

ZOR_END
