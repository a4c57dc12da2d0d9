// Things that take long enough for a clock, measured side by side: each in turn, in every round, so that
// a machine that is slow for a while is slow for all of them.

#pragma once

#include <functional>
#include <span>
#include <string>

namespace bench {

struct Measured {
  std::string name;
  std::function<void()> run;
  std::function<void()> prepare = nullptr;  // before each run, and not measured; may be null

  double cpu = 0;   // ns of processor time, of all threads: the median of the rounds
  double wall = 0;  // ns on the clock on the wall, likewise
};

// Measures them all, after a round that nobody counts.
void measureSideBySide(std::span<Measured> all, int rounds);

// A folder of its own, gone with it: in memory where the system has such a place, because a disk's
// fsync takes longer than all that is measured.
class MemoryFolder {
 public:
  MemoryFolder();
  MemoryFolder(const MemoryFolder&) = delete;
  MemoryFolder& operator=(const MemoryFolder&) = delete;
  ~MemoryFolder();

  const std::string& path() const { return path_; }

 private:
  std::string path_;
};

}  // namespace bench
