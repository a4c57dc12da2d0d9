// Runs code on a stack of known size, and measures how much of it the code takes.

#pragma once

#include <cstddef>
#include <functional>

// Whether the address sanitizer is at work, which needs several times as much of a stack.
#if defined(__SANITIZE_ADDRESS__)
#define OXMV_ADDRESS_SANITIZER
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define OXMV_ADDRESS_SANITIZER
#endif
#endif

namespace oxmv::test {

// Runs `work` on a thread of its own with a stack of `size` bytes, and answers how many of them
// were used, the thread's own needs included. `size` is a multiple of the page size. A stack that
// is too small ends the program.
std::size_t stackUsedBy(const std::function<void()>& work, std::size_t size);

}  // namespace oxmv::test
