// How far a long run has come, for whoever waits.

#pragma once

#include <chrono>
#include <cstddef>
#include <string_view>

#include "cli/Verb.h"

namespace oxmv::cli {

// A line on standard error, drawn anew some ten times a second and gone in the end. Only on a
// terminal that can erase a line, and neither with --quiet nor --no-progress.
//
//   1200 of 20000 files
class Progress {
 public:
  // `things` outlives it.
  Progress(const Call& call, std::size_t total, std::string_view things);
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;
  ~Progress();

  // One more is about to be done.
  void advance() {
    if (isShown_) draw();
    ++done_;
  }

 private:
  void draw();

  using Clock = std::chrono::steady_clock;

  const std::size_t total_;
  const std::string_view things_;
  const bool isShown_;
  std::size_t done_ = 0;
  Clock::time_point next_{};  // nothing is drawn before
};

}  // namespace oxmv::cli
