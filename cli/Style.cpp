#include "cli/Style.h"

#include <array>
#include <cstdlib>

#include <fmt/format.h>

namespace oxmv::cli {
namespace {

std::string_view environment(const char* name) {
  const char* value = std::getenv(name);
  return value == nullptr ? std::string_view() : value;
}

}  // namespace

std::string Style::in(std::string_view colour, std::string_view text) const {
  if (!hasColour_ || text.empty()) return std::string(text);
  return fmt::format("\x1B[{}m{}\x1B[0m", colour, text);
}

Style styleFor(bool isTerminal, const Arguments& arguments) {
  constexpr auto choices = std::to_array<std::string_view>({"auto", "always", "never"});
  const std::size_t choice = arguments.choice(Flag::color, choices);
  if (choice != 0) return Style(choice == 1);
  return Style(isTerminal && environment("NO_COLOR").empty() && environment("TERM") != "dumb");
}

}  // namespace oxmv::cli
