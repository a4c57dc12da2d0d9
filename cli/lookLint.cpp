#include <array>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/CheckReport.h"
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

std::string lineOf(const Call& call, const std::string& name, const Located& located) {
  const auto& [finding, position] = located;
  std::string place = nameInMessages(name);
  if (position) place += fmt::format(":{}:{}", position->line, position->column);
  return fmt::format("{}: {} ({})", place, finding.message, call.style.warning(finding.code));
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

void run(Call& call) {
  CheckReport report(call, "oxmv.look.lint/1");
  for (const std::string& name : namedInputs(call)) {
    const auto content = readInput(name);
    if (const auto* problem = std::get_if<FileProblem>(&content)) {
      report.addProblem(name, *problem);
      continue;
    }
    const auto line = [&](const Located& located) { return lineOf(call, name, located); };
    report.add(name, lint(name, std::get<Bytes>(content)), line, writeFinding);
  }
  report.finish();
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
