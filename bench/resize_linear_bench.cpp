// Linear resize against OpenCV's; the frame is in resize_bench.h.
#include "resize_bench.h"

namespace {

const int registered = zorbench::register_resize<zoriInterLinear>("resize_linear");

}  // namespace
