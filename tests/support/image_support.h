// Small pieces the image tests share: running one templated body for each
// element type of the image operations, and guard bytes behind buffers.
#ifndef ZOR_TEST_IMAGE_SUPPORT_H
#define ZOR_TEST_IMAGE_SUPPORT_H

#include <stddef.h>
#include <stdint.h>

#include <vector>

#include "zor.h"

namespace zortest {

// f(T()) for 8u, 16u, 16s and 32f in turn; the body takes its type from
// the argument (decltype), so one generic lambda serves every type.
template <typename F>
void for_each_type(F f) {
    f(Zor8u());
    f(Zor16u());
    f(Zor16s());
    f(Zor32f());
}

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
