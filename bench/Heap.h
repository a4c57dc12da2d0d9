// What the program takes from the heap. Linking Heap.cpp replaces malloc() and its kin by ones that
// count, in glibc's way; programs that measure times do without.

#pragma once

#include <cstddef>

namespace bench {

struct HeapUse {
  std::size_t allocations = 0;  // so far
  std::size_t bytes = 0;        // now, as handed out: what was asked for, rounded up
  std::size_t peak = 0;         // the most there were at once since startPeak()
};

HeapUse heapUse();

// From now on the peak counts; it begins with the bytes there are.
void startPeak();

}  // namespace bench
