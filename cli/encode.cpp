#include <array>
#include <optional>
#include <string>
#include <utility>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/AllowedLosses.h"
#include "cli/ClipOutput.h"
#include "cli/Inputs.h"
#include "cli/TagJson.h"
#include "cli/Verb.h"
#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/TagStreamEncoder.h"

namespace oxmv::cli {
namespace {

std::optional<Dictionary> readTags(Call& call, const std::string& name) {
  const auto content = readInput(name);
  if (const auto* problem = std::get_if<FileProblem>(&content)) {
    call.messages.error(name, problem->message, problem->code);
    return std::nullopt;
  }
  auto tags = readTagJson(asText(std::get<Bytes>(content)));
  if (const auto* error = std::get_if<JsonError>(&tags)) {
    call.messages.error(
        name, fmt::format("line {}, column {}: {}", error->line, error->column, error->message),
        error->code);
    return std::nullopt;
  }
  return std::get<Dictionary>(std::move(tags));
}

void run(Call& call) {
  const std::string& input = call.words.front();
  const Layout layout = layoutOf(call.arguments);
  const std::vector<LossCode> allowed = allowedLosses(call.arguments);
  if (!call.arguments.has(Flag::output))
    throw UsageError("missing-output", "encode needs --output OUT; - is standard output");
  const ClipName output = clipOutput(call, {input});
  if (!mayGetClip(call, output)) return;

  const auto tags = readTags(call, input);
  if (!tags) return;
  if (!passes(call, input, findLosses(*tags, layout), allowed)) return;
  const auto stream = encodeStream(*tags, layout);
  if (!stream) return call.messages.error(input, "not enough memory", "no-memory");
  putClip(call, output, *stream);
}

constexpr auto flags = std::to_array({Flag::output, Flag::layout, Flag::allow, Flag::dryRun});

}  // namespace

const Verb encodeVerb = {
    .name = "encode",
    .words = "FILE.json",
    .summary = "make a clip of tags in JSON",
    .examples =
        "oxmv encode tags.json -o clip.colr\n"
        "oxmv encode tags.json -o clip.colr --layout readable\n"
        "oxmv encode tags.json -o 0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F\n",
    .details =
        "OUT names a clip as in oxmv help show, but for @last. Tags that would not read back as\n"
        "they are in FILE.json are refused, each with a code, and nothing is written; --allow\n"
        "CODE lets losses of that code through. The layout \"exact\" is what writers of clips\n"
        "have always made; \"readable\" pads all records, so that data of any size read back. A\n"
        "file that is there is replaced, whole or not at all; the file of an eye without tags is\n"
        "removed. What is wrong with FILE.json is said with its line and column.\n",
    .flags = flags,
    .fewestWords = 1,
    .mostWords = 1,
    .run = run,
};

}  // namespace oxmv::cli
