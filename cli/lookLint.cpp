#include <array>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/Inputs.h"
#include "cli/JsonResults.h"
#include "cli/LookFindings.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/looks/LookTableFile.h"

namespace oxmv::cli {
namespace {

// With its place, if it has one.
struct Located {
  LookFinding finding;
  std::optional<XmlPosition> position;
};

std::vector<Located> lint(const std::string& name, const Bytes& file) {
  XmlPositions positions(file);
  std::vector<Located> located;
  for (LookFinding& finding : findingsInLook(file, name == "-" ? "" : lastPathComponent(name))) {
    std::optional<XmlPosition> position;
    if (finding.offset) position = positions.of(*finding.offset);
    located.push_back({std::move(finding), position});
  }
  return located;
}

void writeLines(Call& call, const std::string& name, const std::vector<Located>& findings) {
  for (const auto& [finding, position] : findings) {
    std::string place = nameInMessages(name);
    if (position) place += fmt::format(":{}:{}", position->line, position->column);
    call.output.write(
        fmt::format("{}: {} ({})\n", place, finding.message, call.style.warning(finding.code)));
  }
}

void writeFinding(JsonWriter& json, const Located& located) {
  const auto number = [&](std::string_view key, std::size_t XmlPosition::*part) {
    if (located.position) return json.member(key, (*located.position).*part);
    json.member(key, std::nullopt);
  };
  json.beginObject();
  json.member("code", located.finding.code);
  number("line", &XmlPosition::line);
  number("column", &XmlPosition::column);
  json.key("stops");
  json.boolean(located.finding.stops);
  json.member("message", located.finding.message);
  json.endObject();
}

void writeResult(JsonResults& results, const std::string& name,
                 const std::vector<Located>* findings, const FileProblem* problem) {
  results.add([&](JsonWriter& json) {
    beginResult(json, "oxmv.look.lint/1", name);
    json.key("findings");
    if (findings == nullptr) {
      json.null();
    } else {
      json.beginArray();
      for (const Located& finding : *findings) writeFinding(json, finding);
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
    const std::vector<Located> findings = lint(name, std::get<Bytes>(content));
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

const Verb lookLintVerb = {
    .name = "look lint",
    .words = "XML...",
    .summary = "find what is wrong with look descriptions; say nothing when all is well",
    .examples =
        "oxmv look lint warm.xml\n"
        "oxmv look lint --json *.xml\n"
        "oxmv look lint warm.xml && oxmv look import warm.xml\n",
    .details =
        "Reads a description as its import does, but on to the end, and writes nothing. One line\n"
        "for each finding: file, line, column, what it is and how to mend it, and its code. Exit\n"
        "code 1 when something was found: what ends an import (\"stops\" in JSON), and what makes\n"
        "another look of it than was meant.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = anyNumber,
    .run = run,
};

}  // namespace oxmv::cli
