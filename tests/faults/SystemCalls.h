// Lets the system calls of this process fail, or end the process. A program that links this passes
// the calls by which the library reads and writes files through here.

#pragma once

#include <cstddef>
#include <functional>
#include <string>

namespace oxmv::test {

// What happens at a system call.
struct Fault {
  enum class Kind { fail, killBefore, killAfter, meanwhile };
  Kind kind;
  int error = 0;                   // for `fail`: errno
  bool isLasting = false;          // for `fail`: every later call of the same function fails, too
  std::function<void()> action{};  // for `meanwhile`: what somebody else does right before the call
};

// Arms the n-th call from now on, counted from 1. With 0 none: the calls are counted only.
void armFault(std::size_t nth, const Fault& fault);

// How many calls there were since then; and the function of the faulty one, empty if it was not
// reached. Nothing is armed and counted any more.
std::size_t disarmFault();
std::string faultyFunction();

// Whether files tell when they were created; some file systems do not remember it.
void hideCreationTimes(bool areHidden);

}  // namespace oxmv::test
