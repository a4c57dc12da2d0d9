#include "cli/Clips.h"

#include <algorithm>

#include <fmt/format.h>

#include "cli/ValueText.h"

namespace oxmv::cli {
namespace {

// More warnings than this hide what they warn of.
constexpr std::size_t warningsSaid = 20;

}  // namespace

Clip decodeClip(const Bytes& bytes) {
  Clip clip{{}, {}, bytes.size()};
  FindingCollector collector(bytes);
  clip.metadata.initWithData(bytes, &collector);
  clip.losses = collector.finish();
  std::erase_if(clip.losses, [](const Finding& finding) { return !isLoss(finding); });
  return clip;
}

std::variant<Clip, FileProblem> readClip(Call& call, const std::string& name) {
  auto content = readInput(name);
  if (const auto* problem = std::get_if<FileProblem>(&content)) {
    call.messages.error(name, problem->message, problem->code);
    return *problem;
  }
  return decodeClip(std::get<Bytes>(content));
}

void warnOfLosses(Call& call, const std::string& name, const Clip& clip) {
  for (std::size_t i = 0; i < std::min(clip.losses.size(), warningsSaid); ++i)
    call.messages.warning(name, locate(clip.losses[i]), codeOf(clip.losses[i]));
  if (clip.losses.size() > warningsSaid)
    call.messages.warning(name, fmt::format("{} more; oxmv check lists them all",
                                            counted(clip.losses.size() - warningsSaid, "warning")));
}

}  // namespace oxmv::cli
