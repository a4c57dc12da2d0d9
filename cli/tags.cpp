#include <algorithm>
#include <array>
#include <optional>
#include <string>
#include <vector>

#include <fmt/format.h>

#include "cli/JsonResults.h"
#include "cli/TagNames.h"
#include "cli/Verb.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

std::vector<const TagRow*> rowsThatContain(std::string_view text) {
  std::vector<const TagRow*> rows;
  for (const TagRow& row : tagRows()) {
    if (containsIgnoringCase(visibleTag(row.tag), text) || containsIgnoringCase(row.label, text))
      rows.push_back(&row);
  }
  return rows;
}

void writeTable(Call& call, const std::vector<const TagRow*>& rows) {
  const auto line = [](std::string_view tag, std::string_view label, std::string_view reads,
                       std::string_view writes, std::string_view accepts) {
    return fmt::format("{:<4}  {:<18}  {:<23}  {:<18}  {}\n", tag, label, reads, writes, accepts);
  };
  std::string heading = line("TAG", "LABEL", "READ AS", "WRITTEN AS", "ACCEPTS BY KEY");
  heading.pop_back();
  call.output.write(call.style.faint(heading) + '\n');
  for (const TagRow* row : rows) {
    const std::string text = line("", row->label, readsAs(*row), writesAs(*row), acceptsAs(*row));
    call.output.write(call.style.tag(visibleTag(row->tag)) + text.substr(4));
  }
}

// The words of a rule; none for one that does nothing.
std::optional<std::string> ruleOf(const std::string& words) {
  return words == "-" ? std::nullopt : std::optional(words);
}

void writeJson(Call& call, const std::vector<const TagRow*>& rows) {
  JsonResults results(call);
  for (const TagRow* row : rows) {
    results.add([&](JsonWriter& json) {
      json.beginObject();
      json.member("tag", tagInJson(row->tag));
      json.member("label", row->label.empty() ? std::nullopt : std::optional(row->label));
      json.member("reads", ruleOf(readsAs(*row)));
      json.member("writes", ruleOf(writesAs(*row)));
      json.member("accepts", ruleOf(acceptsAs(*row)));
      json.endObject();
    });
  }
  results.finish();
}

void run(Call& call) {
  const std::string text = call.words.empty() ? std::string() : call.words.front();
  const std::vector<const TagRow*> rows = rowsThatContain(text);
  if (wantsJson(call)) {
    writeJson(call, rows);
  } else if (!rows.empty()) {
    writeTable(call, rows);
  }
  if (rows.empty())
    call.messages.error(
        {}, fmt::format("no tag or label contains \"{}\"{}", visible(text), tagsMeantBy(text)),
        "unknown-tag", Outcome::no);
}

constexpr auto flags = std::to_array({Flag::json, Flag::ndjson});

}  // namespace

const Verb tagsVerb = {
    .name = "tags",
    .words = "[TEXT]",
    .summary = "list the tags: label, how they are read and written, what they accept",
    .examples =
        "oxmv tags\n"
        "oxmv tags balance\n"
        "oxmv tags --json | jq -r '.[].tag'\n",
    .details = "With TEXT only the tags that have it in their letters or their label.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = 1,
    .run = run,
};

}  // namespace oxmv::cli
