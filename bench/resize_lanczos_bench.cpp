// Three-lobe Lanczos resize against OpenCV's four-lobe one (the nearest it
// has); the frame is in resize_bench.h.
#include "resize_bench.h"

namespace {

const int registered =
    zorbench::register_resize<zoriInterLanczos>("resize_lanczos", {{960, 540}, {3840, 2160}});

}  // namespace
