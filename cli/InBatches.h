// Many small things, done in batches on two threads.

#pragma once

#include <algorithm>
#include <array>
#include <chrono>
#include <cstddef>
#include <future>

namespace oxmv::cli {

// Whether the system lets this process run on more than one processor; on one a second thread is
// only in the way.
bool haveTwoProcessors() noexcept;

// Calls make(worker, first, last) for one part of the things 0 ... count - 1 after the other, on
// this thread and on another, and take() with what it answers: on this thread, and in the order of
// the things. What one of them throws reaches the caller when nobody works any more.
//
// Each of the two threads has a worker, which keeps from batch to batch what make() can use again.
//
// The first batch is of one thing for each thread. They grow and shrink until both are done after
// some milliseconds: that is worth a thread, and where even one thing takes longer, as on a slow
// disk, each is taken as soon as it is there.
template <class Worker, class Make, class Take>
void inBatches(std::size_t count, std::array<Worker, 2> workers, Make make, Take take) {
  using Clock = std::chrono::steady_clock;
  constexpr std::chrono::milliseconds least{5}, most{20};
  const bool isAlone = !haveTwoProcessors();
  std::size_t size = 1;
  for (std::size_t first = 0; first < count;) {
    const auto start = Clock::now();
    const std::size_t middle = first + std::min(size, count - first);
    const std::size_t last = middle + (isAlone ? 0 : std::min(size, count - middle));
    std::future<decltype(make(workers[0], first, middle))> other;
    // Where the system has no thread left to give, get() does it.
    if (middle < last) other = std::async([&] { return make(workers[1], middle, last); });
    take(make(workers[0], first, middle));
    if (middle < last) take(other.get());
    first = last;
    const auto taken = Clock::now() - start;
    if (taken < least) size *= 2;
    if (taken > most) size = std::max<std::size_t>(size / 2, 1);
  }
}

}  // namespace oxmv::cli
