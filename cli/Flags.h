// The flags of the command line. They mean the same for every verb that takes them.

#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace oxmv::cli {

enum class Flag : std::uint8_t {
  help,
  version,
  quiet,
  verbose,
  json,
  ndjson,
  csv,
  columns,
  filesFrom,
  null,
  strict,
  output,
  layout,
  allow,
  dryRun,
  backup,
  create,
  raw,
  eye,
  noProgress,
  db,
  looks,
  reel,
  cameras,
  stripSpace,
  color,
};

struct FlagRow {
  Flag flag;
  std::string_view letter;    // "-q"; empty when it has none
  std::string_view name;      // "--quiet"
  std::string_view argument;  // what follows it, in capitals; empty when nothing does
  std::string_view says;      // what it does, in a line
};

// Every flag, in the order of the enumeration.
std::span<const FlagRow> flagRows() noexcept;
const FlagRow& rowOf(Flag flag) noexcept;

// The flags that go with every verb.
constexpr auto commonFlags = std::to_array(
    {Flag::quiet, Flag::verbose, Flag::db, Flag::looks, Flag::color, Flag::help, Flag::version});

// The command was called in a way that means nothing. Thrown before anything is done; ends the run.
class UsageError : public std::runtime_error {
 public:
  UsageError(std::string_view code, const std::string& what)
      : std::runtime_error(what), code_(code) {}
  std::string_view code() const { return code_; }

 private:
  std::string_view code_;
};

// What stood on the command line.
class Arguments {
 public:
  // Takes main's own arguments, the first of which is the program's name. Throws UsageError for a
  // flag that does not exist, and for one without the value that it needs.
  static Arguments parse(std::span<const char* const> argv);

  // Everything that is no flag and no flag's value: the verb and what it works on.
  const std::vector<std::string>& words() const { return words_; }

  bool has(Flag flag) const { return given_[static_cast<std::size_t>(flag)]; }
  // The values of a flag, in order; the last one counts for flags that have only one.
  const std::vector<std::string>& values(Flag flag) const {
    return values_[static_cast<std::size_t>(flag)];
  }
  // `fallback` when the flag was not given.
  std::string value(Flag flag, std::string_view fallback = {}) const {
    return has(flag) ? values(flag).back() : std::string(fallback);
  }
  // The same, as the index of the value in `choices`, whose first one is the fallback. Throws
  // UsageError when it is none of them.
  std::size_t choice(Flag flag, std::span<const std::string_view> choices) const;

 private:
  // "--eye=left", "--eye left"; `rest` are the arguments behind it, of which it may take the first.
  void takeName(std::string_view word, std::span<const char* const>& rest);
  // "-q", "-vn", "-oOUT", "-o OUT".
  void takeLetters(std::string_view word, std::span<const char* const>& rest);
  // Notes the flag, with the value that stood at it or else the argument behind it, if it takes one.
  void give(const FlagRow& row, std::optional<std::string_view> value,
            std::span<const char* const>& rest);

  static constexpr std::size_t flagCount = static_cast<std::size_t>(Flag::color) + 1;

  std::vector<std::string> words_;
  std::array<bool, flagCount> given_{};
  std::array<std::vector<std::string>, flagCount> values_;
};

}  // namespace oxmv::cli
