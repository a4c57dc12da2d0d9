#include <algorithm>
#include <array>
#include <optional>
#include <stdexcept>
#include <string>
#include <system_error>
#include <utility>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/AllowedLosses.h"
#include "cli/ClipOutput.h"
#include "cli/Inputs.h"
#include "cli/JsonResults.h"
#include "cli/TagJson.h"
#include "cli/TagsAsTable.h"
#include "cli/Verb.h"
#include "oxmv/import/CameraStill.h"
#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/platform/CreationTime.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

using Harvest = std::variant<Dictionary, FileProblem>;

// Says the problem, and gives it back.
FileProblem said(Call& call, const std::string& file, FileProblem problem) {
  call.messages.error(file, visible(problem.message), problem.code);
  return problem;
}

std::variant<CameraTables, FileProblem> cameraTables(const Call& call) {
  if (!call.arguments.has(Flag::cameras)) return CameraTables::builtIn();
  const auto text = readInput(call.arguments.value(Flag::cameras));
  if (const auto* problem = std::get_if<FileProblem>(&text)) return *problem;
  auto tables = CameraTables::fromText(asText(std::get<Bytes>(text)));
  if (const auto* problem = std::get_if<CameraTablesProblem>(&tables))
    return FileProblem{"bad-cameras", problem->message};
  return std::get<CameraTables>(std::move(tables));
}

Harvest tagsOf(Call& call, const std::string& name, const CameraTables& tables) {
  const auto file = readInput(name);
  if (const auto* problem = std::get_if<FileProblem>(&file)) return said(call, name, *problem);
  // What comes through standard input was created nowhere.
  const auto created = name == "-" ? std::nullopt : creationTime(name);
  std::optional<Dictionary> tags;
  try {
    tags = tagsOfStill(std::get<Bytes>(file), created, call.arguments.value(Flag::reel), tables);
  } catch (const std::out_of_range& error) {
    return said(call, name, {"software-too-short", error.what()});
  }
  if (!tags) return said(call, name, {"not-an-image", "is no JPEG image that can be decoded"});
  if (!created)
    call.messages.warning(name, "it is not known when it was created; without STIM, SDAT and TIMC",
                          "no-creation-date");
  return *std::move(tags);
}

Harvest harvest(Call& call, const std::string& name) {
  const auto tables = cameraTables(call);
  if (const auto* problem = std::get_if<FileProblem>(&tables)) {
    const std::string cameras = call.arguments.value(Flag::cameras);
    said(call, cameras, *problem);
    // Of the still itself nothing is known.
    return FileProblem{"bad-cameras", fmt::format("{}: {}", cameras, problem->message)};
  }
  return tagsOf(call, name, std::get<CameraTables>(tables));
}

// Null tags: they are not known.
void showAsJson(Call& call, const std::string& name, const Dictionary* tags,
                const FileProblem* problem) {
  JsonResults results(call);
  results.add([&](JsonWriter& json) {
    beginResult(json, "oxmv.still/1", name);
    json.key("tags");
    if (tags == nullptr) {
      json.null();
    } else {
      writeTagJson(json, *tags);
    }
    endResult(json, problem);
  });
  results.finish();
}

bool isAllowed(const Loss& loss, const std::vector<LossCode>& allowed) {
  return std::find(allowed.begin(), allowed.end(), loss.code) != allowed.end();
}

// The field of view is in every still of use, and in no stream: that is told, not refused.
void takeOutFieldOfView(Call& call, const std::string& name, const Dictionary& tags,
                        std::vector<Loss>& losses, const std::vector<LossCode>& allowed) {
  const auto loss = std::find_if(losses.begin(), losses.end(), [](const Loss& candidate) {
    return candidate.path == fieldOfViewKey;
  });
  if (loss == losses.end()) return;
  const int letter = tags[fieldOfViewKey].array()[0].intValue();
  if (!isAllowed(*loss, allowed))
    call.messages.warning(
        name,
        fmt::format("the field of view, FOV {} ({}), is not stored: streams have no tag for it",
                    letter, static_cast<char>(letter)),
        codeOf(loss->code));
  losses.erase(loss);
}

// What keeps the clip from being stored is said, and answered.
std::optional<FileProblem> store(Call& call, const std::string& name, const Dictionary& tags,
                                 Layout layout, const std::vector<LossCode>& allowed,
                                 const ClipName& output) {
  std::vector<Loss> losses = findLosses(tags, layout);
  takeOutFieldOfView(call, name, tags, losses, allowed);
  if (!passes(call, name, losses, allowed)) {
    const auto loss = std::find_if(losses.begin(), losses.end(), [&](const Loss& candidate) {
      return !isAllowed(candidate, allowed);
    });
    return FileProblem{codeOf(loss->code),
                       fmt::format("{} {}; nothing written", loss->path, loss->message)};
  }
  const auto stream = encodeStream(tags, layout);
  if (!stream) return said(call, name, {"no-memory", "not enough memory"});
  auto problem = putClip(call, output, *stream);
  if (problem) problem->message = fmt::format("{}: {}", output.word, problem->message);
  return problem;
}

void checkFlags(const Call& call, const std::string& name) {
  const Arguments& arguments = call.arguments;
  for (const Flag flag : {Flag::layout, Flag::allow, Flag::dryRun}) {
    if (arguments.has(flag) && !arguments.has(Flag::output))
      throw UsageError("bad-flags", fmt::format("{} goes with --output", rowOf(flag).name));
  }
  if (wantsJson(call) && arguments.value(Flag::output) == "-")
    throw UsageError("bad-flags", "JSON and the clip cannot both go to standard output");
  if (name == "-" && arguments.value(Flag::cameras) == "-")
    throw UsageError("standard-input-twice", "standard input can be read only once");
}

void run(Call& call) {
  const std::string& name = call.words.front();
  checkFlags(call, name);
  const Layout layout = layoutOf(call.arguments);
  const std::vector<LossCode> allowed = allowedLosses(call.arguments);
  std::optional<ClipName> output;
  if (call.arguments.has(Flag::output)) {
    output = clipOutput(call, {name, call.arguments.value(Flag::cameras)});
    if (!mayGetClip(call, *output)) return;
  }

  const Harvest harvested = harvest(call, name);
  const auto* tags = std::get_if<Dictionary>(&harvested);
  std::optional<FileProblem> problem;
  if (tags == nullptr) {
    problem = std::get<FileProblem>(harvested);
  } else if (output) {
    problem = store(call, name, *tags, layout, allowed, *output);
  }
  if (wantsJson(call)) {
    showAsJson(call, name, tags, problem ? &*problem : nullptr);
  } else if (tags != nullptr && !output) {
    writeTagsAsTable(call.output, *tags, call.style, Extent::whole);
  }
}

constexpr auto flags =
    std::to_array({Flag::reel, Flag::cameras, Flag::output, Flag::layout, Flag::allow, Flag::dryRun,
                   Flag::json, Flag::ndjson, Flag::strict});

}  // namespace

const Verb stillVerb = {
    .name = "still",
    .words = "FILE.jpg",
    .summary = "show the tags that a camera still tells of its clip, or make a clip of them",
    .examples =
        "oxmv still still.jpg\n"
        "oxmv still --reel A001 still.jpg -o clip.colr\n"
        "oxmv still --cameras mine.toml --json still.jpg\n",
    .details =
        "Times come from when the file was created, if its file system remembers that; model\n"
        "and firmware from the texts in the file, by the tables of cameras; the field of view\n"
        "from the focal length. With --output the tags go into a clip, all but the field of\n"
        "view, for which streams have no tag: a warning says so, unless unknown-tag is allowed. A\n"
        "file that is there is replaced, whole or not at all. Other tags that would not read back\n"
        "are refused; --allow CODE lets them through.\n",
    .flags = flags,
    .fewestWords = 1,
    .mostWords = 1,
    .run = run,
};

}  // namespace oxmv::cli
