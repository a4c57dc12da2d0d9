#include "cli/Messages.h"

#include <fmt/format.h>

#include "oxmv/values/Characters.h"

namespace oxmv::cli {

void Messages::error(std::string_view file, std::string_view what, std::string_view code,
                     Outcome outcome) {
  raise(outcome);
  say(style_.error("error"), file, what, code);
}

void Messages::refused(std::string_view file, std::string_view what, std::string_view code,
                       std::string_view aftermath) {
  raise(Outcome::refused);
  say(style_.error("refused"), file, what, code, aftermath);
}

void Messages::warning(std::string_view file, std::string_view what, std::string_view code) {
  if (isStrict_) raise(Outcome::no);
  if (!isQuiet_) say(style_.warning("warning"), file, what, code);
}

void Messages::note(std::string_view file, std::string_view what) {
  if (isVerbose_) say(style_.faint("note"), file, what, {});
}

void Messages::say(const std::string& severity, std::string_view file, std::string_view what,
                   std::string_view code, std::string_view aftermath) {
  output_.flush();  // where both go to one terminal they stand in the order in which they came
  std::string line = fmt::format("oxmv: {}: ", severity);
  if (!file.empty()) line += fmt::format("{}: ", nameInMessages(file));
  line += what;
  if (!code.empty()) line += fmt::format(" ({})", code);
  if (!aftermath.empty()) line += fmt::format("; {}", aftermath);
  line += '\n';
  writeStandardError(line);
}

std::string nameInMessages(std::string_view file) {
  return file == "-" ? "standard input" : visible(file);
}

}  // namespace oxmv::cli
