#include "tests/support/Memory.h"

#include <algorithm>
#include <cstddef>
#include <cstdlib>
#include <limits>
#include <new>

#include <malloc.h>

namespace {

struct Account {
  bool isMeasured = false;
  std::ptrdiff_t held = 0;  // negative: memory from before the meter was given back
  std::ptrdiff_t peak = 0;
  std::size_t allocations = 0;
  bool isLimited = false;
  bool shortageFelt = false;
  std::size_t granted = 0;
  std::size_t largest = std::numeric_limits<std::size_t>::max();
};

thread_local Account account;

void* take(std::size_t size, std::align_val_t alignment = {}) noexcept {
  if (size > account.largest) return nullptr;
  if (account.isLimited) {
    if (account.granted == 0) {
      account.shortageFelt = true;
      return nullptr;
    }
    --account.granted;
  }
  const auto align = static_cast<std::size_t>(alignment);
  const std::size_t wanted = std::max<std::size_t>(size, 1);
  void* memory = nullptr;
  if (align <= alignof(std::max_align_t)) {
    memory = std::malloc(wanted);
  } else if (posix_memalign(&memory, align, wanted) != 0) {
    memory = nullptr;
  }
  if (account.isMeasured && memory != nullptr) {
    account.held += static_cast<std::ptrdiff_t>(malloc_usable_size(memory));
    account.peak = std::max(account.peak, account.held);
    ++account.allocations;
  }
  return memory;
}

void* takeOrThrow(std::size_t size, std::align_val_t alignment = {}) {
  for (;;) {
    if (void* memory = take(size, alignment)) return memory;
    const std::new_handler handler = std::get_new_handler();
    if (handler == nullptr) throw std::bad_alloc();
    handler();
  }
}

void giveBack(void* memory) noexcept {
  if (account.isMeasured && memory != nullptr)
    account.held -= static_cast<std::ptrdiff_t>(malloc_usable_size(memory));
  std::free(memory);
}

}  // namespace

// Every form: a sanitizer brings its own in place of those that are left out, and would see memory
// of the one given to the other.
using Alignment = std::align_val_t;
using NoThrow = std::nothrow_t;

void* operator new(std::size_t size) { return takeOrThrow(size); }
void* operator new[](std::size_t size) { return takeOrThrow(size); }
void* operator new(std::size_t size, Alignment alignment) { return takeOrThrow(size, alignment); }
void* operator new[](std::size_t size, Alignment alignment) { return takeOrThrow(size, alignment); }
void* operator new(std::size_t size, const NoThrow&) noexcept { return take(size); }
void* operator new[](std::size_t size, const NoThrow&) noexcept { return take(size); }
void* operator new(std::size_t size, Alignment alignment, const NoThrow&) noexcept {
  return take(size, alignment);
}
void* operator new[](std::size_t size, Alignment alignment, const NoThrow&) noexcept {
  return take(size, alignment);
}
void operator delete(void* memory) noexcept { giveBack(memory); }
void operator delete[](void* memory) noexcept { giveBack(memory); }
void operator delete(void* memory, std::size_t) noexcept { giveBack(memory); }
void operator delete[](void* memory, std::size_t) noexcept { giveBack(memory); }
void operator delete(void* memory, Alignment) noexcept { giveBack(memory); }
void operator delete[](void* memory, Alignment) noexcept { giveBack(memory); }
void operator delete(void* memory, std::size_t, Alignment) noexcept { giveBack(memory); }
void operator delete[](void* memory, std::size_t, Alignment) noexcept { giveBack(memory); }
void operator delete(void* memory, const NoThrow&) noexcept { giveBack(memory); }
void operator delete[](void* memory, const NoThrow&) noexcept { giveBack(memory); }
void operator delete(void* memory, Alignment, const NoThrow&) noexcept { giveBack(memory); }
void operator delete[](void* memory, Alignment, const NoThrow&) noexcept { giveBack(memory); }

namespace oxmv::test {

MemoryMeter::MemoryMeter() {
  account.held = 0;
  account.peak = 0;
  account.allocations = 0;
  account.isMeasured = true;
}

MemoryMeter::~MemoryMeter() { account.isMeasured = false; }

std::size_t MemoryMeter::peak() const { return static_cast<std::size_t>(account.peak); }

std::size_t MemoryMeter::held() const {
  return static_cast<std::size_t>(std::max<std::ptrdiff_t>(account.held, 0));
}

std::size_t MemoryMeter::allocations() const { return account.allocations; }

MemoryShortage::MemoryShortage(std::size_t granted) {
  account.granted = granted;
  account.shortageFelt = false;
  account.isLimited = true;
}

MemoryShortage::~MemoryShortage() { account.isLimited = false; }

bool MemoryShortage::wasFelt() const { return account.shortageFelt; }

LargeMemoryShortage::LargeMemoryShortage(std::size_t most) { account.largest = most; }

LargeMemoryShortage::~LargeMemoryShortage() {
  account.largest = std::numeric_limits<std::size_t>::max();
}

}  // namespace oxmv::test
