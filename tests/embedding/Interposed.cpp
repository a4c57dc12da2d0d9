#include "tests/embedding/Interposed.h"

#include <atomic>
#include <clocale>
#include <cstdlib>
#include <mutex>
#include <utility>

#include <dlfcn.h>
#include <locale.h>

namespace oxmv::test {
namespace {

// Plain, so that it is there whenever the first call comes: long before main().
std::atomic<bool> isWatching = false;

std::mutex guard;
Intrusions& seen() {
  static Intrusions intrusions;
  return intrusions;
}

template <class Function>
Function* original(const char* name) {
  return reinterpret_cast<Function*>(::dlsym(RTLD_NEXT, name));
}

template <class Remember>
void remember(Remember how) {
  if (!isWatching) return;
  const std::scoped_lock lock(guard);
  how(seen());
}

}  // namespace

void watchForIntrusions() {
  seen() = {};
  isWatching = true;
}

Intrusions intrusions() {
  isWatching = false;
  return std::exchange(seen(), {});
}

}  // namespace oxmv::test

using oxmv::test::Intrusions;
using oxmv::test::original;
using oxmv::test::remember;

// Seen from outside, so that shared libraries come here, too.
#pragma GCC visibility push(default)
extern "C" {

char* getenv(const char* name) noexcept {
  static auto* const next = original<char*(const char*)>("getenv");
  remember([&](Intrusions& seen) { seen.variables.insert(name); });
  return next(name);
}

char* secure_getenv(const char* name) noexcept {
  static auto* const next = original<char*(const char*)>("secure_getenv");
  remember([&](Intrusions& seen) { seen.variables.insert(name); });
  return next(name);
}

char* setlocale(int category, const char* name) noexcept {
  static auto* const next = original<char*(int, const char*)>("setlocale");
  if (name != nullptr) remember([](Intrusions& seen) { ++seen.localeChanges; });
  return next(category, name);
}

locale_t uselocale(locale_t locale) noexcept {
  static auto* const next = original<locale_t(locale_t)>("uselocale");
  if (locale != nullptr) remember([](Intrusions& seen) { ++seen.localeChanges; });
  return next(locale);
}

// What destructors of static objects, and atexit(), come down to.
int __cxa_atexit(void (*function)(void*), void* argument, void* object) noexcept {
  static auto* const next = original<int(void (*)(void*), void*, void*)>("__cxa_atexit");
  remember([](Intrusions& seen) { ++seen.exitHandlers; });
  return next(function, argument, object);
}

}  // extern "C"
#pragma GCC visibility pop
