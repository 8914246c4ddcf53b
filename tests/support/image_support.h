// Guard bytes behind plain buffers; new tests use image.h directly.
#ifndef ZOR_TEST_IMAGE_SUPPORT_H
#define ZOR_TEST_IMAGE_SUPPORT_H

#include <stddef.h>
#include <stdint.h>

#include <vector>

#include "image.h"
#include "zor.h"

namespace zortest {

constexpr uint8_t kGuardByte = 0xA5;

// A block of `size` bytes followed by `guard` bytes, all holding the guard
// byte.
inline std::vector<uint8_t> guarded(size_t size, size_t guard = 64) {
    return std::vector<uint8_t>(size + guard, kGuardByte);
}

// Every byte from `from` to the end still holds the guard byte.
inline bool guard_intact(const std::vector<uint8_t>& mem, size_t from) {
    for (size_t i = from; i < mem.size(); ++i)
        if (mem[i] != kGuardByte) return false;
    return true;
}

}  // namespace zortest

#endif
