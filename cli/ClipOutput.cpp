#include "cli/ClipOutput.h"

#include <filesystem>
#include <string_view>
#include <system_error>

#include <fmt/format.h>

#include "cli/ValueText.h"
#include "oxmv/platform/WholeFile.h"

namespace oxmv::cli {
namespace {

constexpr std::string_view standardOutput = "-";

}  // namespace

std::string clipOutput(const Call& call, std::initializer_list<std::string> inputs) {
  const std::string output = call.arguments.value(Flag::output);
  for (const std::string& input : inputs) {
    std::error_code ignored;  // what is not there is not the same
    if (std::filesystem::equivalent(input, output, ignored))
      throw UsageError("same-file", "the output would take the place of the input");
  }
  return output;
}

bool mayGetClip(Call& call, const std::string& output) {
  if (output != standardOutput || !StandardOutput::isTerminal()) return true;
  call.messages.refused("standard output", "a clip is binary, and this is a terminal",
                        "binary-to-terminal");
  return false;
}

void writeClip(Call& call, const std::string& output, const Bytes& stream) {
  if (call.arguments.has(Flag::dryRun))
    return call.messages.note(output, fmt::format("would get {}", counted(stream.size(), "byte")));
  if (output == standardOutput) return call.output.write(asText(stream));
  std::error_code error;
  if (!writeWholeFile(output, stream, error))
    return call.messages.error(output, error.message(), "write-failed");
  call.messages.note(output, fmt::format("got {}", counted(stream.size(), "byte")));
}

}  // namespace oxmv::cli
