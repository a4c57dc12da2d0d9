#include <array>
#include <string>
#include <vector>

#include <fmt/format.h>

#include "cli/Findings.h"
#include "cli/Inputs.h"
#include "cli/JsonResults.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/metadata/MetadataDictionary.h"

namespace oxmv::cli {
namespace {

std::vector<Finding> findingsIn(const Bytes& bytes) {
  FindingCollector collector(bytes);
  MetadataDictionary().initWithData(bytes, &collector);
  std::vector<Finding> findings = collector.finish();
  std::erase_if(findings,
                [](const Finding& finding) { return finding.oddity == Oddity::terminator; });
  return findings;
}

void writeLines(Call& call, const std::string& name, const std::vector<Finding>& findings) {
  for (const Finding& finding : findings)
    call.output.write(fmt::format("{}: {} ({})\n", nameInMessages(name), locate(finding),
                                  call.style.warning(codeOf(finding))));
}

void writeResult(JsonResults& results, const std::string& name,
                 const std::vector<Finding>* findings, const FileProblem* problem) {
  results.add([&](JsonWriter& json) {
    beginResult(json, "oxmv.check/1", name);
    json.key("findings");
    if (findings == nullptr) {
      json.null();
    } else {
      json.beginArray();
      for (const Finding& finding : *findings) writeFinding(json, finding);
      json.endArray();
    }
    endResult(json, problem);
  });
}

void run(Call& call) {
  const bool isJson = wantsJson(call);
  JsonResults results(call);
  for (const std::string& name : namedInputs(call)) {
    const auto content = readInput(name);
    if (const auto* problem = std::get_if<FileProblem>(&content)) {
      call.messages.error(name, problem->message, problem->code);
      if (isJson) writeResult(results, name, nullptr, problem);
      continue;
    }
    const std::vector<Finding> findings = findingsIn(std::get<Bytes>(content));
    if (!findings.empty()) call.messages.raise(Outcome::no);
    if (isJson) {
      writeResult(results, name, &findings, nullptr);
    } else {
      writeLines(call, name, findings);
    }
    call.messages.note(name, counted(findings.size(), "finding"));
  }
  if (isJson) results.finish();
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
        "oxmv check clip.colr && echo well\n",
    .details =
        "One line for each finding: the file, the byte, what it is, and its code. Exit code 1\n"
        "when something was found. Findings are whatever readers leave out, and whatever a\n"
        "good writer would have written otherwise.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = anyNumber,
    .run = run,
};

}  // namespace oxmv::cli
