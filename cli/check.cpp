#include <array>
#include <string>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/CheckReport.h"
#include "cli/Clips.h"
#include "cli/Findings.h"
#include "cli/JsonResults.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"

namespace oxmv::cli {
namespace {

std::vector<Finding> findingsToSay(const ClipName& name, const ClipStream& stream) {
  std::vector<Finding> findings = findingsIn(name, stream);
  std::erase_if(findings,
                [](const Finding& finding) { return finding.oddity == Oddity::terminator; });
  return findings;
}

void run(Call& call) {
  CheckReport report(call, "oxmv.check/1");
  for (const ClipName& clip : namedClips(call)) {
    const auto read = readStream(clip);
    if (const auto* problem = std::get_if<FileProblem>(&read)) {
      report.addProblem(clip.word, *problem);
      continue;
    }
    const auto line = [&](const Finding& finding) {
      return fmt::format("{}: {} ({})", nameInMessages(clip.word), locate(finding),
                         call.style.warning(codeOf(finding)));
    };
    report.add(clip.word, findingsToSay(clip, std::get<ClipStream>(read)), line, writeFinding);
  }
  report.finish();
}

constexpr auto flags = std::to_array({Flag::json, Flag::ndjson, Flag::filesFrom, Flag::null});

}  // namespace

const Verb checkVerb = {
    .name = "check",
    .words = "FILE...",
    .summary = "find what is wrong with clips; say nothing when all is well",
    .examples =
        "oxmv check *.colr\n"
        "oxmv check --json clip.colr\n"
        "oxmv check clip.colr && echo well\n"
        "oxmv check 0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F @override\n",
    .details =
        "FILE names a clip as in oxmv help show. One line for each finding: the file, the byte,\n"
        "what it is, and its code. Exit code 1 when something was found. Findings are whatever\n"
        "readers leave out, and whatever a good writer would have written otherwise. Bytes are\n"
        "counted from the start of the stream: of @last, from behind the GUID.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = anyNumber,
    .run = run,
};

}  // namespace oxmv::cli
