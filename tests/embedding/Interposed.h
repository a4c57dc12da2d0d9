// What the process asks of the C library that a guest has no business with. A program that links
// this passes such calls through here.

#pragma once

#include <set>
#include <string>

namespace oxmv::test {

struct Intrusions {
  std::set<std::string> variables;  // of the environment, that were asked for
  int localeChanges = 0;            // of the process or of a thread, also if taken back
  int exitHandlers = 0;             // what is to run when the process ends
};

// Counts from now on.
void watchForIntrusions();

// What there was since then. Counts no more.
Intrusions intrusions();

}  // namespace oxmv::test
