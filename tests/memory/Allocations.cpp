#include "tests/memory/Allocations.h"

#include <cerrno>

#include "tests/support/Memory.h"

namespace oxmv::test {
namespace {

struct Account {
  std::size_t left = 0;  // allocations to come before the one that fails; counted down
  bool isArmed = false;
  bool isLasting = false;
  bool wasFelt = false;
  std::ptrdiff_t held = 0;
};

// Constant-initialised: the first allocation comes before anything else.
constinit thread_local Account account;

}  // namespace

#ifdef OXMV_ALLOCATES_BY_SANITIZER

namespace {
thread_local std::optional<MemoryShortage> shortageOfNew;
}

void armShortage(std::size_t nth, Shortage) noexcept { shortageOfNew.emplace(nth - 1); }

bool disarmShortage() noexcept {
  account.wasFelt = shortageOfNew->wasFelt();
  shortageOfNew.reset();
  return account.wasFelt;
}

#else

void armShortage(std::size_t nth, Shortage shortage) noexcept {
  account = {nth, true, shortage == Shortage::lasting, false, 0};
}

bool disarmShortage() noexcept {
  account.isArmed = false;
  return account.wasFelt;
}

namespace {

// Calls `allocate` unless this allocation is to fail.
template <class Allocate>
void* take(Allocate allocate) noexcept {
  if (account.isArmed) {
    if (account.left > 0) --account.left;
    if (account.left == 0 && (account.isLasting || !account.wasFelt)) {
      account.wasFelt = true;
      errno = ENOMEM;
      return nullptr;
    }
  }
  void* const memory = allocate();
  if (memory != nullptr) ++account.held;
  return memory;
}

}  // namespace

#endif

std::ptrdiff_t piecesHeld() noexcept { return account.held; }

}  // namespace oxmv::test

#ifndef OXMV_ALLOCATES_BY_SANITIZER

using oxmv::test::account;
using oxmv::test::take;

// Those of the C library, under the names by which it lets others take their place. Seen from
// outside, so that shared libraries come here, too.
#pragma GCC visibility push(default)
extern "C" {

void* __libc_malloc(std::size_t size) noexcept;
void* __libc_calloc(std::size_t count, std::size_t size) noexcept;
void* __libc_realloc(void* memory, std::size_t size) noexcept;
void* __libc_memalign(std::size_t alignment, std::size_t size) noexcept;
void __libc_free(void* memory) noexcept;

void* malloc(std::size_t size) noexcept {
  return take([&] { return __libc_malloc(size); });
}

void* calloc(std::size_t count, std::size_t size) noexcept {
  return take([&] { return __libc_calloc(count, size); });
}

void* realloc(void* memory, std::size_t size) noexcept {
  const bool wasHeld = memory != nullptr;
  void* const moved = take([&] { return __libc_realloc(memory, size); });
  // Of size 0 it gives the memory back; else one piece takes the place of the other.
  if (wasHeld && (moved != nullptr || size == 0)) --account.held;
  return moved;
}

void* aligned_alloc(std::size_t alignment, std::size_t size) noexcept {
  return take([&] { return __libc_memalign(alignment, size); });
}

int posix_memalign(void** memory, std::size_t alignment, std::size_t size) noexcept {
  *memory = aligned_alloc(alignment, size);
  return *memory == nullptr ? ENOMEM : 0;
}

void free(void* memory) noexcept {
  if (memory != nullptr) --account.held;
  __libc_free(memory);
}

}  // extern "C"
#pragma GCC visibility pop

#endif
