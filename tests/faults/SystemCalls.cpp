#include "tests/faults/SystemCalls.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdarg>
#include <string_view>

#include <dirent.h>
#include <dlfcn.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/random.h>
#include <sys/stat.h>
#include <unistd.h>

namespace oxmv::test {
namespace {

// No thread but the one under test makes calls meanwhile.
bool isArmed = false;
std::size_t calls = 0;
std::size_t faultyCall = 0;
Fault currentFault{};
std::string_view faulty;
std::vector<SystemCall> made;
CreationTimes creationTimes = CreationTimes::told;

// The function of that name in the C library.
template <class Function>
Function* original(const char* name) {
  return reinterpret_cast<Function*>(::dlsym(RTLD_NEXT, name));
}

// The C library has another function for the types of today where long is too short for them.
const char* today(const char* name, const char* nameForLongerTypes) {
  return sizeof(off_t) > sizeof(long) ? nameForLongerTypes : name;
}

// Makes a call, or what has been armed for it.
template <class Call>
auto pass(std::string_view name, Call call, int flags = 0, mode_t mode = 0) -> decltype(call()) {
  if (isArmed) made.push_back({std::string(name), flags, mode});
  if (!isArmed || (!currentFault.function.empty() && currentFault.function != name)) return call();
  const bool isIt = ++calls == faultyCall;
  if (isIt) faulty = name;
  const bool isLater = currentFault.isLasting && faulty == name;
  if (currentFault.kind == Fault::Kind::fail && (isIt || isLater)) {
    // Closing fails after the file is closed.
    if (name == "close") call();
    errno = currentFault.error;
    return -1;
  }
  if (isIt && currentFault.kind == Fault::Kind::killBefore) ::raise(SIGKILL);
  if ((isIt || isLater) && currentFault.kind == Fault::Kind::meanwhile) {
    isArmed = false;
    currentFault.action();
    isArmed = true;
  }
  const auto result = call();
  if (isIt && currentFault.kind == Fault::Kind::killAfter) ::raise(SIGKILL);
  return result;
}

}  // namespace

void armFault(std::size_t nth, const Fault& fault) {
  calls = 0;
  faultyCall = nth;
  currentFault = fault;
  faulty = {};
  made.clear();
  isArmed = true;
}

std::size_t disarmFault() {
  isArmed = false;
  return calls;
}

std::vector<SystemCall> systemCalls() { return made; }

std::string faultyFunction() { return std::string(faulty); }

void setCreationTimes(CreationTimes times) { creationTimes = times; }

}  // namespace oxmv::test

using oxmv::test::original;
using oxmv::test::pass;
using oxmv::test::today;

// Seen from outside, so that a shared library comes here, too.
#pragma GCC visibility push(default)
extern "C" {

int open(const char* path, int flags, ...) {
  static auto* const next = original<int(const char*, int, ...)>(today("open", "open64"));
  mode_t mode = 0;
  if ((flags & O_CREAT) != 0) {
    va_list arguments;
    va_start(arguments, flags);
    mode = va_arg(arguments, mode_t);
    va_end(arguments);
  }
  return pass(
      "open", [&] { return next(path, flags, mode); }, flags, mode);
}

int openat(int folder, const char* path, int flags, ...) {
  static auto* const next = original<int(int, const char*, int, ...)>(today("openat", "openat64"));
  mode_t mode = 0;
  if ((flags & O_CREAT) != 0) {
    va_list arguments;
    va_start(arguments, flags);
    mode = va_arg(arguments, mode_t);
    va_end(arguments);
  }
  return pass(
      "openat", [&] { return next(folder, path, flags, mode); }, flags, mode);
}

DIR* fdopendir(int folder) {
  static auto* const next = original<DIR*(int)>("fdopendir");
  DIR* opened = nullptr;
  pass("fdopendir", [&] { return (opened = next(folder)) != nullptr ? 0 : -1; });
  return opened;
}

dirent* readdir(DIR* folder) {
  static auto* const next = original<dirent*(DIR*)>(today("readdir", "readdir64"));
  dirent* entry = nullptr;
  pass("readdir", [&] { return (entry = next(folder)) != nullptr ? 0 : -1; });
  return entry;
}

int flock(int file, int operation) noexcept {
  static auto* const next = original<int(int, int)>("flock");
  return pass("flock", [&] { return next(file, operation); });
}

int close(int file) {
  static auto* const next = original<int(int)>("close");
  return pass("close", [&] { return next(file); });
}

ssize_t read(int file, void* buffer, size_t size) {
  static auto* const next = original<ssize_t(int, void*, size_t)>("read");
  return pass("read", [&] { return next(file, buffer, size); });
}

// In pieces of three bytes at most, so that the kill can come in the middle of a file.
ssize_t write(int file, const void* buffer, size_t size) {
  static auto* const next = original<ssize_t(int, const void*, size_t)>("write");
  const size_t piece = oxmv::test::isArmed && size > 3 ? 3 : size;
  return pass("write", [&] { return next(file, buffer, piece); });
}

ssize_t readlink(const char* path, char* target, size_t size) noexcept {
  static auto* const next = original<ssize_t(const char*, char*, size_t)>("readlink");
  return pass("readlink", [&] { return next(path, target, size); });
}

ssize_t getrandom(void* buffer, size_t size, unsigned flags) {
  static auto* const next = original<ssize_t(void*, size_t, unsigned)>("getrandom");
  return pass("getrandom", [&] { return next(buffer, size, flags); });
}

int fstat(int file, struct stat* status) noexcept {
  static auto* const next = original<int(int, struct stat*)>(today("fstat", "__fstat64_time64"));
  return pass("fstat", [&] { return next(file, status); });
}

int lstat(const char* path, struct stat* status) noexcept {
  static auto* const next =
      original<int(const char*, struct stat*)>(today("lstat", "__lstat64_time64"));
  return pass("lstat", [&] { return next(path, status); });
}

int statx(int folder, const char* path, int flags, unsigned mask, struct statx* status) noexcept {
  static auto* const next = original<int(int, const char*, int, unsigned, struct statx*)>("statx");
  const int result = next(folder, path, flags, mask, status);
  switch (oxmv::test::creationTimes) {
    case oxmv::test::CreationTimes::told: break;
    case oxmv::test::CreationTimes::hidden: status->stx_mask &= ~STATX_BTIME; break;
    case oxmv::test::CreationTimes::zero:
      status->stx_mask |= STATX_BTIME;
      status->stx_btime = {};
      break;
  }
  return result;
}

int fchown(int file, uid_t owner, gid_t group) noexcept {
  static auto* const next = original<int(int, uid_t, gid_t)>("fchown");
  return pass("fchown", [&] { return next(file, owner, group); });
}

int fchmod(int file, mode_t mode) noexcept {
  static auto* const next = original<int(int, mode_t)>("fchmod");
  return pass(
      "fchmod", [&] { return next(file, mode); }, 0, mode);
}

int fsync(int file) {
  static auto* const next = original<int(int)>("fsync");
  return pass("fsync", [&] { return next(file); });
}

int rename(const char* from, const char* to) noexcept {
  static auto* const next = original<int(const char*, const char*)>("rename");
  return pass("rename", [&] { return next(from, to); });
}

int unlink(const char* path) noexcept {
  static auto* const next = original<int(const char*)>("unlink");
  return pass("unlink", [&] { return next(path); });
}

}  // extern "C"
#pragma GCC visibility pop
