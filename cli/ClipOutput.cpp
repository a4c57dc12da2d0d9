#include "cli/ClipOutput.h"

#include <filesystem>
#include <system_error>

#include <fmt/format.h>

#include "cli/Clips.h"
#include "cli/ValueText.h"

namespace oxmv::cli {

ClipName clipOutput(const Call& call, std::initializer_list<std::string> inputs) {
  ClipName output = writableClipNameFrom(call.arguments.value(Flag::output));
  for (const std::string& input : inputs) {
    std::error_code ignored;  // what is not there is not the same
    if (std::filesystem::equivalent(input, output.path, ignored))
      throw UsageError("same-file", "the output would take the place of the input");
  }
  return output;
}

bool mayGetClip(Call& call, const ClipName& output) {
  if (output.kind != ClipName::Kind::standardStream || !StandardOutput::isTerminal()) return true;
  call.messages.refused("standard output", "a clip is binary, and this is a terminal",
                        "binary-to-terminal");
  return false;
}

std::optional<FileProblem> putClip(Call& call, const ClipName& output, const Bytes& stream) {
  const std::string size = counted(stream.size(), "byte");
  if (call.arguments.has(Flag::dryRun)) {
    call.messages.note(output.word, fmt::format("would get {}", size));
    return std::nullopt;
  }
  if (output.kind == ClipName::Kind::standardStream) {
    call.output.write(asText(stream));
    return std::nullopt;
  }
  std::error_code error;
  if (!writeClip(output, stream, error)) return sayWriteFailed(call, output, error);
  call.messages.note(output.word, fmt::format("got {}", size));
  return std::nullopt;
}

}  // namespace oxmv::cli
