// Standard input and output, with every failure told.

#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "cli/Sink.h"

namespace oxmv::cli {

// Standard output takes no more. Ends the run: there is nobody left to work for.
struct OutputFailed {
  std::error_code error;
};

// Standard output, gathered until it is worth a write. What is written last goes out with flush(),
// not by itself. Both throw OutputFailed.
class StandardOutput final : public Sink {
 public:
  void write(std::string_view text) override;
  void flush();

  static bool isTerminal() noexcept;

 private:
  std::string waiting_;
};

// Whole; only as much as a file may have. Answers nothing, with the cause, if reading fails.
std::optional<std::vector<std::uint8_t>> readStandardInput(std::error_code& error);

// Not gathered, and never fails: nobody is left to hear of it.
void writeStandardError(std::string_view text) noexcept;
bool isStandardErrorTerminal() noexcept;

// A line on a terminal's standard error that stays until something is written, to either stream;
// that takes its place. An empty one only takes the last one away.
void showStatus(std::string_view line) noexcept;

// To be called first. Lets a closed pipe be an error like any other; and takes the places of
// standard streams that were not given to us, so that no file we open gets one of them and
// messages in it.
void prepareStandardStreams() noexcept;

}  // namespace oxmv::cli
