// Antialiased shrinking (linear kernel) against OpenCV's area average; the
// frame is in resize_bench.h.
#include "resize_bench.h"

namespace {

const std::vector<ZoriSize> kSizes = {{640, 360}, {480, 270}};
const int registered = zorbench::register_resize<zorbench::kResizeAntialiasing>(
    "resize_antialiasing", kSizes);
const int registeredC3 = (zorbench::register_resize_type<Zor8u, zorbench::kResizeAntialiasing, 3>(
                              "resize_antialiasing", "8u_C3", kSizes),
                          0);

}  // namespace
