// Nearest-neighbour resize against OpenCV's; the frame is in resize_bench.h.
#include "resize_bench.h"

namespace {

const int registered = zorbench::register_resize<zoriInterNN>("resize_nearest");

}  // namespace
