#include "tests/support/SmallStack.h"

#include <algorithm>
#include <cstdint>
#include <stdexcept>

#include <pthread.h>
#include <sys/mman.h>

namespace oxmv::test {
namespace {

// Fresh memory is zero, and so is much of what code leaves on a stack.
constexpr std::uint8_t paint = 0xA5;

constexpr std::size_t guardSize = 4096;

void* run(void* work) {
  (*static_cast<const std::function<void()>*>(work))();
  return nullptr;
}

}  // namespace

std::size_t stackUsedBy(const std::function<void()>& work, std::size_t size) {
  // A page that nothing may touch below the stack: running over ends at once, not somewhere else.
  void* memory = mmap(nullptr, guardSize + size, PROT_READ | PROT_WRITE,
                      MAP_PRIVATE | MAP_ANONYMOUS | MAP_STACK, -1, 0);
  if (memory == MAP_FAILED) throw std::runtime_error("no memory for a stack");
  auto* stack = static_cast<std::uint8_t*>(memory) + guardSize;
  std::fill_n(stack, size, paint);

  pthread_attr_t attributes;
  pthread_attr_init(&attributes);
  pthread_t thread{};
  const bool runs =
      mprotect(memory, guardSize, PROT_NONE) == 0 &&
      pthread_attr_setstack(&attributes, stack, size) == 0 &&
      pthread_create(&thread, &attributes, run, const_cast<std::function<void()>*>(&work)) == 0 &&
      pthread_join(thread, nullptr) == 0;
  pthread_attr_destroy(&attributes);

  const std::uint8_t* lowest =
      std::find_if(stack, stack + size, [](std::uint8_t byte) { return byte != paint; });
  const auto unused = static_cast<std::size_t>(lowest - stack);
  munmap(memory, guardSize + size);
  if (!runs) throw std::runtime_error("no thread on a stack of its own");
  return size - unused;
}

}  // namespace oxmv::test
