#include "cli/Flags.h"

#include <algorithm>
#include <utility>

#include <CLI/CLI.hpp>
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

CLI::Option* declare(CLI::App& app, const FlagRow& row) {
  const std::string names =
      fmt::format("{}{}{}", row.letter, row.letter.empty() ? "" : ",", row.name);
  if (row.argument.empty()) return app.add_flag(names)->disable_flag_override();
  // One value each time that it is given. Without this a flag takes the words behind it too.
  return app.add_option(names)->expected(1)->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
}

bool beginsLikeAFlag(std::string_view argument) { return argument.starts_with('-'); }

[[noreturn]] void refuseFlag(std::string_view typed) {
  const std::string_view name = typed.substr(0, typed.find('='));
  using Names = std::vector<std::string_view>;
  Names names;
  for (const FlagRow& row : rows) names.push_back(row.name);
  const std::string_view bare = name.substr(std::min(name.find_first_not_of('-'), name.size()));
  const auto choices = bare.size() > 1 ? nearest(fmt::format("--{}", bare), names) : Names{};
  throw UsageError("unknown-flag", fmt::format("no flag {}{}", visible(name), didYouMean(choices)));
}

// A flag has a value too few or too many.
[[noreturn]] void refuseValue(const CLI::ParseError& error) {
  // Of what the parser says only the name at its start is of use to a user: "--json" or "json".
  const std::string_view message = error.what();
  const std::string_view name = message.substr(0, message.find_first_of(": "));
  const auto row = std::find_if(rows.begin(), rows.end(), [&](const FlagRow& candidate) {
    return candidate.name == name || candidate.name.substr(2) == name;
  });
  if (row == rows.end()) throw UsageError("bad-arguments", "these arguments mean nothing");
  throw UsageError("bad-value", row->argument.empty() ? fmt::format("{} takes no value", row->name)
                                                      : fmt::format("{} needs {} behind it",
                                                                    row->name, row->argument));
}

// The words among what the parser had no flag for.
std::vector<std::string> wordsOf(const std::vector<std::string>& rest) {
  std::vector<std::string> words;
  bool isFlagPossible = true;
  for (const std::string& word : rest) {
    if (isFlagPossible && word == "--") {
      isFlagPossible = false;
    } else if (isFlagPossible && word.size() > 1 && word.starts_with('-')) {
      refuseFlag(word);
    } else {
      words.push_back(word);
    }
  }
  return words;
}

}  // namespace

std::span<const FlagRow> flagRows() noexcept { return rows; }

const FlagRow& rowOf(Flag flag) noexcept { return rows[static_cast<std::size_t>(flag)]; }

Arguments Arguments::parse(std::span<const char* const> argv) {
  Arguments arguments;
  if (std::none_of(argv.begin(), argv.end(), beginsLikeAFlag)) {
    // Nothing but words: declaring the flags would be most of what "oxmv version" does.
    if (!argv.empty()) arguments.words_.assign(argv.begin() + 1, argv.end());
    return arguments;
  }
  CLI::App app;
  app.set_help_flag();  // its own help knows nothing of verbs
  // Words are not declared: the parser would take "[a,b]" apart. They come with the unknown flags.
  app.allow_extras();
  std::vector<CLI::Option*> options;
  for (const FlagRow& row : rows) options.push_back(declare(app, row));
  try {
    // Wants them last to first, and without the program's name.
    std::vector<std::string> reversed(argv.rbegin(), argv.rend());
    if (!reversed.empty()) reversed.pop_back();
    app.parse(std::move(reversed));
  } catch (const CLI::ParseError& error) {
    refuseValue(error);
  }
  arguments.words_ = wordsOf(app.remaining());
  for (std::size_t i = 0; i < rows.size(); ++i) {
    arguments.given_[i] = options[i]->count() != 0;
    if (!rows[i].argument.empty()) arguments.values_[i] = options[i]->results();
  }
  return arguments;
}

std::size_t Arguments::choice(Flag flag, std::span<const std::string_view> choices) const {
  const std::string chosen = value(flag, choices.front());
  const auto found = std::find(choices.begin(), choices.end(), chosen);
  if (found != choices.end()) return static_cast<std::size_t>(found - choices.begin());
  throw UsageError("bad-value", fmt::format("{} is {}, not \"{}\"", rowOf(flag).name,
                                            fmt::join(choices, ", "), visible(chosen)));
}

}  // namespace oxmv::cli
