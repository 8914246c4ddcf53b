// Cubic resize against OpenCV's; the frame is in resize_bench.h.
#include "resize_bench.h"

namespace {

const int registered = zorbench::register_resize<zoriInterCubic>("resize_cubic");

}  // namespace
