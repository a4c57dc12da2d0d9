#include "cli/Flags.h"

#include <algorithm>
#include <optional>

#include <fmt/format.h>

#include "cli/Nearest.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

constexpr auto rows = std::to_array<FlagRow>({
    {Flag::help, "-h", "--help", "", "show help, of the verb if there is one"},
    {Flag::version, "", "--version", "", "show the version"},
    {Flag::quiet, "-q", "--quiet", "", "no warnings and no notes"},
    {Flag::verbose, "-v", "--verbose", "", "say more, and show long values whole"},
    {Flag::json, "", "--json", "", "JSON: an array of results"},
    {Flag::ndjson, "", "--ndjson", "", "JSON: one result per line, as soon as it is there"},
    {Flag::csv, "", "--csv", "", "a table for spreadsheets: comma-separated"},
    {Flag::columns, "", "--columns", "TAG,...", "the tags of the columns, by letters or label"},
    {Flag::filesFrom, "", "--files-from", "FILE", "also the files named in FILE, one per line"},
    {Flag::null, "-0", "--null", "", "names in --files-from end with NUL, not with the line"},
    {Flag::strict, "", "--strict", "", "warnings count: exit code 1"},
    {Flag::output, "-o", "--output", "OUT", "the file to write; - is standard output"},
    {Flag::layout, "", "--layout", "LAYOUT", "exact (default) or readable"},
    {Flag::allow, "", "--allow", "CODE", "let this kind of loss through; may be repeated"},
    {Flag::dryRun, "-n", "--dry-run", "", "do everything but write"},
    {Flag::backup, "", "--backup", "", "keep the old file beside it: CLIP~, or CLIP~2 and so on"},
    {Flag::create, "", "--create", "", "make a clip that does not exist"},
    {Flag::raw, "", "--raw", "", "values as they are: nothing escaped, data as bytes"},
    {Flag::eye, "", "--eye", "EYE", "of one eye: left, right, or its index (0 left, 1 right)"},
    {Flag::noProgress, "", "--no-progress", "", "show no progress, also on a terminal"},
    {Flag::db, "", "--db", "DIR", "the clip database is in DIR (or in $OXMV_DB)"},
    {Flag::looks, "", "--looks", "DIR", "the look tables are in DIR (or in $OXMV_LOOKS)"},
    {Flag::reel, "", "--reel", "NAME", "the name of the reel"},
    {Flag::cameras, "", "--cameras", "FILE", "recognise the cameras in FILE, not those built in"},
    {Flag::stripSpace, "", "--strip-space", "", "leave out the white space that counts as tables"},
    {Flag::color, "", "--color", "WHEN", "auto (default), always or never"},
});

constexpr bool standsInOrder() {
  for (std::size_t i = 0; i < rows.size(); ++i) {
    if (static_cast<std::size_t>(rows[i].flag) != i) return false;
  }
  return true;
}
static_assert(standsInOrder(), "every flag, in the order of the enumeration");

[[noreturn]] void refuseFlag(std::string_view typed) {
  const std::string_view name = typed.substr(0, typed.find('='));
  using Names = std::vector<std::string_view>;
  Names names;
  for (const FlagRow& row : rows) names.push_back(row.name);
  const std::string_view bare = name.substr(std::min(name.find_first_not_of('-'), name.size()));
  const auto choices = bare.size() > 1 ? nearest(fmt::format("--{}", bare), names) : Names{};
  throw UsageError("unknown-flag", fmt::format("no flag {}{}", visible(name), didYouMean(choices)));
}

const FlagRow* rowNamed(std::string_view name) {
  const auto row = std::find_if(rows.begin(), rows.end(),
                                [&](const FlagRow& candidate) { return candidate.name == name; });
  return row == rows.end() ? nullptr : &*row;
}

const FlagRow* rowOfLetter(char letter) {
  const auto row = std::find_if(rows.begin(), rows.end(), [&](const FlagRow& candidate) {
    return !candidate.letter.empty() && candidate.letter.back() == letter;
  });
  return row == rows.end() ? nullptr : &*row;
}

}  // namespace

std::span<const FlagRow> flagRows() noexcept { return rows; }

const FlagRow& rowOf(Flag flag) noexcept { return rows[static_cast<std::size_t>(flag)]; }

Arguments Arguments::parse(std::span<const char* const> argv) {
  Arguments arguments;
  bool isFlagPossible = true;
  for (auto rest = argv.subspan(std::min<std::size_t>(argv.size(), 1)); !rest.empty();) {
    const std::string_view word = rest.front();
    rest = rest.subspan(1);
    if (!isFlagPossible || word.size() < 2 || word.front() != '-') {
      arguments.words_.emplace_back(word);
    } else if (word == "--") {
      isFlagPossible = false;
    } else if (word.starts_with("--")) {
      arguments.takeName(word, rest);
    } else {
      arguments.takeLetters(word, rest);
    }
  }
  return arguments;
}

void Arguments::takeName(std::string_view word, std::span<const char* const>& rest) {
  const std::size_t end = std::min(word.find('='), word.size());
  const FlagRow* const row = rowNamed(word.substr(0, end));
  if (row == nullptr) refuseFlag(word);
  std::optional<std::string_view> value;
  if (end < word.size()) value = word.substr(end + 1);
  if (value && row->argument.empty())
    throw UsageError("bad-value", fmt::format("{} takes no value", row->name));
  give(*row, value, rest);
}

void Arguments::takeLetters(std::string_view word, std::span<const char* const>& rest) {
  for (std::size_t i = 1; i < word.size(); ++i) {
    const FlagRow* const row = rowOfLetter(word[i]);
    // Those before it were good, and would only be in the way of finding the one that was meant.
    if (row == nullptr) refuseFlag(fmt::format("-{}", word.substr(i)));
    const std::string_view behind = word.substr(i + 1);
    if (row->argument.empty()) {
      give(*row, std::nullopt, rest);
    } else {
      return give(*row, behind.empty() ? std::nullopt : std::optional(behind), rest);
    }
  }
}

void Arguments::give(const FlagRow& row, std::optional<std::string_view> value,
                     std::span<const char* const>& rest) {
  const auto index = static_cast<std::size_t>(row.flag);
  given_[index] = true;
  if (row.argument.empty()) return;
  if (!value) {
    if (rest.empty())
      throw UsageError("bad-value", fmt::format("{} needs {} behind it", row.name, row.argument));
    value = rest.front();
    rest = rest.subspan(1);
  }
  values_[index].emplace_back(*value);
}

std::size_t Arguments::choice(Flag flag, std::span<const std::string_view> choices) const {
  const std::string chosen = value(flag, choices.front());
  const auto found = std::find(choices.begin(), choices.end(), chosen);
  if (found != choices.end()) return static_cast<std::size_t>(found - choices.begin());
  throw UsageError("bad-value", fmt::format("{} is {}, not \"{}\"", rowOf(flag).name,
                                            fmt::join(choices, ", "), visible(chosen)));
}

}  // namespace oxmv::cli
