// Colours, where somebody sees them.

#pragma once

#include <string>
#include <string_view>

#include "cli/Flags.h"

namespace oxmv::cli {

// How text stands out on one stream; without colour it stays as it is.
class Style {
 public:
  explicit Style(bool hasColour) : hasColour_(hasColour) {}

  std::string tag(std::string_view text) const { return in("36", text); }
  std::string label(std::string_view text) const { return in("2", text); }
  std::string faint(std::string_view text) const { return in("2", text); }
  std::string heading(std::string_view text) const { return in("1", text); }
  std::string warning(std::string_view text) const { return in("33", text); }
  std::string error(std::string_view text) const { return in("31", text); }

 private:
  std::string in(std::string_view colour, std::string_view text) const;

  bool hasColour_;
};

// What --color says, and without it NO_COLOR, TERM=dumb and whether the stream is a terminal.
Style styleFor(bool isTerminal, const Arguments& arguments);

}  // namespace oxmv::cli
