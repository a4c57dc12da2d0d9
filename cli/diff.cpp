#include <array>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/Clips.h"
#include "cli/Differences.h"
#include "cli/JsonResults.h"
#include "cli/TagJson.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"

namespace oxmv::cli {
namespace {

void writeLines(Call& call, const std::vector<Difference>& differences) {
  const auto extent = call.arguments.has(Flag::verbose) ? Extent::whole : Extent::abbreviated;
  for (const Difference& difference : differences) {
    const ShownDifference shown = show(difference, extent);
    const std::string path = call.style.tag(shown.path);
    if (difference.before.isNothing()) {
      call.output.write(fmt::format("+ {}: {}\n", path, shown.after));
    } else if (difference.after.isNothing()) {
      call.output.write(fmt::format("- {}: {}\n", path, shown.before));
    } else {
      call.output.write(fmt::format("~ {}: {} -> {}\n", path, shown.before, shown.after));
    }
  }
}

std::string_view changeOf(const Difference& difference) {
  if (difference.before.isNothing()) return "added";
  return difference.after.isNothing() ? "removed" : "changed";
}

// `differences` is null where there is a problem.
void writeResult(Call& call, const std::vector<Difference>* differences,
                 const FileProblem* problem) {
  JsonResults results(call);
  results.add([&](JsonWriter& json) {
    beginResult(json, "oxmv.diff/1", call.words[0]);
    json.member("other", call.words[1]);
    json.key("differences");
    if (differences == nullptr) {
      json.null();
    } else {
      json.beginArray();
      for (const Difference& difference : *differences) {
        json.beginObject();
        json.member("tag", difference.path);
        json.member("change", changeOf(difference));
        json.key("before");
        writeTagJson(json, difference.before);
        json.key("after");
        writeTagJson(json, difference.after);
        json.endObject();
      }
      json.endArray();
    }
    endResult(json, problem);
  });
  results.finish();
}

void run(Call& call) {
  const bool isJson = wantsJson(call);
  const std::vector<ClipName> names = namedClips(call);
  std::optional<FileProblem> problem;
  std::vector<Dictionary> tags;
  for (const ClipName& name : names) {
    const auto read = readClip(call, name);
    if (const auto* clip = std::get_if<Clip>(&read)) {
      warnOfLosses(call, name, *clip);
      tags.push_back(clip->tags);
    } else if (!problem) {
      problem = std::get<FileProblem>(read);
    }
  }
  if (problem) {
    if (isJson) writeResult(call, nullptr, &*problem);
    return;
  }
  const std::vector<Difference> differences = differencesBetween(tags[0], tags[1]);
  if (!differences.empty()) call.messages.raise(Outcome::no);
  if (isJson) {
    writeResult(call, &differences, nullptr);
  } else {
    writeLines(call, differences);
  }
}

constexpr auto flags = std::to_array({Flag::json, Flag::ndjson, Flag::strict});

}  // namespace

const Verb diffVerb = {
    .name = "diff",
    .words = "A B",
    .summary = "show in which tags two clips differ",
    .examples =
        "oxmv diff before.colr after.colr\n"
        "oxmv diff --json before.colr after.colr\n"
        "oxmv diff @last @override\n"
        "oxmv diff -q a.colr b.colr > /dev/null && echo the same tags\n",
    .details =
        "A and B name clips as in oxmv help show. One line for each tag: + is in B only, - in A\n"
        "only, ~ in both with another value. The order of the tags does not count. Exit code 1\n"
        "when there is a difference. What either clip holds and readers ignore is said as a\n"
        "warning.\n",
    .flags = flags,
    .fewestWords = 2,
    .mostWords = 2,
    .run = run,
};

}  // namespace oxmv::cli
