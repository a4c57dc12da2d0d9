#include "cli/Progress.h"

#include <cstdlib>

#include <fmt/format.h>

#include "cli/StandardStreams.h"

namespace oxmv::cli {
namespace {

constexpr std::chrono::milliseconds pause{100};

bool isWanted(const Arguments& arguments) {
  if (arguments.has(Flag::quiet) || arguments.has(Flag::noProgress)) return false;
  const char* const terminal = std::getenv("TERM");
  const bool isDumb = terminal == nullptr || std::string_view(terminal) == "dumb";
  return isStandardErrorTerminal() && !isDumb;
}

}  // namespace

Progress::Progress(const Call& call, std::size_t total, std::string_view things)
    : total_(total), things_(things), isShown_(isWanted(call.arguments)) {}

Progress::~Progress() {
  if (isShown_) showStatus({});
}

void Progress::draw() {
  const Clock::time_point now = Clock::now();
  if (now < next_) return;
  next_ = now + pause;
  showStatus(fmt::format("{} of {} {}", done_, total_, things_));
}

}  // namespace oxmv::cli
