// Many small things, done in batches on two threads.

#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <future>

namespace oxmv::cli {

// Whether the system lets this process run on more than one processor; on one a second thread is only in
// the way.
bool haveTwoProcessors() noexcept;

// Calls make(first, last) for one part of the things 0 ... count - 1 after the other, on this thread
// and on another, and take() with what it answers: on this thread, and in the order of the things. What
// one of them throws reaches the caller when nobody works any more.
//
// Batches grow and shrink until both are done after some milliseconds: that is worth a thread, and on a
// slow disk nobody waits for long for what is there.
template <class Make, class Take>
void inBatches(std::size_t count, Make make, Take take) {
  using Clock = std::chrono::steady_clock;
  constexpr std::chrono::milliseconds least{5}, most{20};
  const bool isAlone = !haveTwoProcessors();
  std::size_t size = 16;
  for (std::size_t first = 0; first < count;) {
    const auto start = Clock::now();
    const std::size_t middle = first + std::min(size, count - first);
    const std::size_t last = middle + (isAlone ? 0 : std::min(size, count - middle));
    std::future<decltype(make(first, middle))> other;
    // Where the system has no thread left to give, get() does it.
    if (middle < last) other = std::async([&] { return make(middle, last); });
    take(make(first, middle));
    if (middle < last) take(other.get());
    first = last;
    const auto taken = Clock::now() - start;
    if (taken < least) size *= 2;
    if (taken > most) size = std::max<std::size_t>(size / 2, 1);
  }
}

}  // namespace oxmv::cli
