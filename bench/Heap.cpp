#include "Heap.h"

#include <atomic>
#include <cerrno>
#include <cstdint>

#include <malloc.h>

// glibc's own functions, which stay there under these names when a program brings its own malloc().
extern "C" {
void* __libc_malloc(std::size_t size);
void* __libc_calloc(std::size_t count, std::size_t size);
void* __libc_realloc(void* memory, std::size_t size);
void* __libc_memalign(std::size_t alignment, std::size_t size);
void __libc_free(void* memory);
}

namespace bench {
namespace {

constinit std::atomic<std::size_t> allocations{0};
constinit std::atomic<std::size_t> bytes{0};
constinit std::atomic<std::size_t> peak{0};

void* counted(void* memory) {
  if (memory == nullptr) return nullptr;
  allocations.fetch_add(1, std::memory_order_relaxed);
  const std::size_t size = malloc_usable_size(memory);
  const std::size_t now = bytes.fetch_add(size, std::memory_order_relaxed) + size;
  // Good enough where several threads run into each other; the benchmarks have one.
  if (now > peak.load(std::memory_order_relaxed)) peak.store(now, std::memory_order_relaxed);
  return memory;
}

void uncount(void* memory) {
  if (memory != nullptr) bytes.fetch_sub(malloc_usable_size(memory), std::memory_order_relaxed);
}

}  // namespace

HeapUse heapUse() { return {allocations, bytes, peak}; }

void startPeak() { peak = bytes.load(); }

}  // namespace bench

extern "C" {

void* malloc(std::size_t size) { return bench::counted(__libc_malloc(size)); }

void* calloc(std::size_t count, std::size_t size) {
  return bench::counted(__libc_calloc(count, size));
}

void* realloc(void* memory, std::size_t size) {
  const std::size_t before = memory == nullptr ? 0 : malloc_usable_size(memory);
  void* moved = __libc_realloc(memory, size);
  // Where there was no memory the old block is still there.
  if (moved != nullptr || size == 0) bench::bytes.fetch_sub(before, std::memory_order_relaxed);
  return bench::counted(moved);
}

void* memalign(std::size_t alignment, std::size_t size) {
  return bench::counted(__libc_memalign(alignment, size));
}

void* aligned_alloc(std::size_t alignment, std::size_t size) { return memalign(alignment, size); }

int posix_memalign(void** memory, std::size_t alignment, std::size_t size) {
  void* made = memalign(alignment, size);
  if (made == nullptr) return ENOMEM;
  *memory = made;
  return 0;
}

void free(void* memory) {
  bench::uncount(memory);
  __libc_free(memory);
}
}
