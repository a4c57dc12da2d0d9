#include "cli/Inputs.h"

#include <algorithm>
#include <optional>
#include <system_error>

#include <fmt/format.h>

#include "cli/StandardStreams.h"
#include "oxmv/platform/WholeFile.h"

namespace oxmv::cli {
namespace {

constexpr std::string_view standardInput = "-";

// Each name ends with `end`; the last one may lack it.
std::vector<std::string> split(std::string_view list, char end) {
  std::vector<std::string> names;
  while (!list.empty()) {
    const std::string_view name = list.substr(0, list.find(end));
    if (!name.empty()) names.emplace_back(name);
    list.remove_prefix(std::min(name.size() + 1, list.size()));
  }
  return names;
}

void refuseStandardInputTwice(const Call& call) {
  auto count = std::count(call.words.begin(), call.words.end(), standardInput);
  count += call.arguments.value(Flag::filesFrom) == standardInput;
  if (count > 1) throw UsageError("standard-input-twice", "standard input can be read only once");
}

}  // namespace

FileProblem problemOf(const std::error_code& error) {
  const auto code = [&]() -> std::string_view {
    if (error == std::errc::no_such_file_or_directory || error == std::errc::not_a_directory)
      return "missing";
    if (error == std::errc::is_a_directory || error == FileError::notRegular) return "not-a-file";
    if (error == FileError::tooLarge) return "too-large";
    return "unreadable";
  };
  return {code(), error.message()};
}

std::variant<Bytes, FileProblem> readInput(const std::string& name) {
  std::error_code error;
  auto bytes = name == standardInput ? readStandardInput(error) : readWholeFile(name, error);
  if (!bytes) return problemOf(error);
  return *std::move(bytes);
}

std::vector<std::string> namedInputs(Call& call) {
  const Arguments& arguments = call.arguments;
  if (arguments.has(Flag::null) && !arguments.has(Flag::filesFrom))
    throw UsageError("bad-flags", "--null goes with --files-from");
  if (call.words.empty() && !arguments.has(Flag::filesFrom))
    throw UsageError("missing-file", "name a file, or several; - is standard input");
  refuseStandardInputTwice(call);

  std::vector<std::string> names(call.words.begin(), call.words.end());
  if (!arguments.has(Flag::filesFrom)) return names;
  const std::string list = arguments.value(Flag::filesFrom);
  const auto content = readInput(list);
  if (const auto* problem = std::get_if<FileProblem>(&content)) {
    call.messages.error(list, problem->message, problem->code);
    return names;
  }
  const char end = arguments.has(Flag::null) ? '\0' : '\n';
  for (std::string& name : split(asText(std::get<Bytes>(content)), end)) {
    // The list may have come from there, and a list is no place to ask for it.
    names.push_back(name == standardInput ? "./-" : std::move(name));
  }
  return names;
}

std::string_view asText(const Bytes& bytes) {
  return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

}  // namespace oxmv::cli
