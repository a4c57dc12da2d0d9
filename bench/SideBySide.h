// Things that take long enough for a clock, measured side by side: each in turn, in every round, so
// that a machine that is slow for a while is slow for all of them.

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

// A folder of its own, gone with it: where temporary files are, or in memory where the system has
// such a place, because a disk's fsync takes longer than all that is measured.
class OwnFolder {
 public:
  explicit OwnFolder(bool inMemory);
  OwnFolder(const OwnFolder&) = delete;
  OwnFolder& operator=(const OwnFolder&) = delete;
  ~OwnFolder();

  const std::string& path() const { return path_; }

 private:
  std::string path_;
};

}  // namespace bench
