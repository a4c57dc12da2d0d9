// Lets the system calls of this process fail, or end the process. A program that links this passes
// the calls by which the library reads and writes files through here.

#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <vector>

namespace oxmv::test {

// What happens at a system call.
struct Fault {
  enum class Kind { fail, killBefore, killAfter, meanwhile };
  Kind kind;
  int error = 0;           // for `fail`: errno
  bool isLasting = false;  // for `fail`, `meanwhile`: so at every later call of that function
  std::function<void()> action{};  // for `meanwhile`: what somebody else does right before the call
  std::string function{};          // unless empty, only calls of this function are counted
};

// Arms the n-th call from now on, counted from 1. With 0 none: the calls are counted only.
void armFault(std::size_t nth, const Fault& fault);

// A call as it was made.
struct SystemCall {
  std::string function;
  int flags = 0;      // of open
  unsigned mode = 0;  // of open and fchmod

  bool operator==(const SystemCall&) const = default;
};

// The calls since the last fault was armed, also those that were not counted.
std::vector<SystemCall> systemCalls();

// How many calls there were since then; and the function of the faulty one, empty if it was not
// reached. Nothing is armed and counted any more.
std::size_t disarmFault();
std::string faultyFunction();

// What files tell of when they were created. Some file systems do not remember it; some of these
// say that they do, and answer zeros.
enum class CreationTimes { told, hidden, zero };
void setCreationTimes(CreationTimes times);

}  // namespace oxmv::test
