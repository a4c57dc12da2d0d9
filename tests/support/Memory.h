// Watches and limits what the library takes from the heap. Every program that links this counts its
// allocations; only threads with one of these objects are measured or limited.

#pragma once

#include <cstddef>

namespace oxmv::test {

// Measures this thread's heap while it lives. One at a time on a thread.
class MemoryMeter {
 public:
  MemoryMeter();
  ~MemoryMeter();
  MemoryMeter(const MemoryMeter&) = delete;
  MemoryMeter& operator=(const MemoryMeter&) = delete;

  // The most bytes held at one time of what was taken since the meter was made.
  std::size_t peak() const;
  // Bytes still held.
  std::size_t held() const;
  // How often memory was taken.
  std::size_t allocations() const;
};

// While it lives, the first `granted` allocations of this thread succeed and all later ones fail.
// Nothing but the code under test should run meanwhile. One at a time on a thread.
class MemoryShortage {
 public:
  explicit MemoryShortage(std::size_t granted);
  ~MemoryShortage();
  MemoryShortage(const MemoryShortage&) = delete;
  MemoryShortage& operator=(const MemoryShortage&) = delete;

  // Whether an allocation has failed.
  bool wasFelt() const;
};

// While it lives, allocations of this thread of more than `most` bytes fail. One at a time on a
// thread.
class LargeMemoryShortage {
 public:
  explicit LargeMemoryShortage(std::size_t most);
  ~LargeMemoryShortage();
  LargeMemoryShortage(const LargeMemoryShortage&) = delete;
  LargeMemoryShortage& operator=(const LargeMemoryShortage&) = delete;
};

}  // namespace oxmv::test
