#include <algorithm>
#include <array>
#include <string>
#include <vector>

#include <fmt/format.h>

#include "cli/Verb.h"

namespace oxmv::cli {
namespace {

constexpr std::string_view commandExamples =
    "oxmv show clip.colr\n"
    "oxmv show --csv --columns REEL,TIMC,TAKE *.colr > clips.csv\n"
    "oxmv set clip.colr REEL=A002 \"White balance=1,1.2,1,1.5\"\n"
    "oxmv check *.colr\n";

constexpr std::string_view exitCodes =
    "  0    done; nothing found\n"
    "  1    the answer is no: found something, differs, is not there\n"
    "  2    called in a way that means nothing; nothing was touched\n"
    "  3    a file could not be read or written; the others were done\n"
    "  4    refused, to protect data\n"
    "  70   a bug in oxmv\n";

// Each line, indented.
std::string indented(std::string_view lines) {
  std::string text;
  while (!lines.empty()) {
    const std::string_view line = lines.substr(0, lines.find('\n'));
    text += fmt::format("  {}\n", line);
    lines.remove_prefix(std::min(line.size() + 1, lines.size()));
  }
  return text;
}

std::string flagLines(std::span<const Flag> flags) {
  std::string text;
  for (const Flag flag : flags) {
    const FlagRow& row = rowOf(flag);
    const std::string name =
        fmt::format("{:>2}{} {}{}{}", row.letter, row.letter.empty() ? " " : ",", row.name,
                    row.argument.empty() ? "" : " ", row.argument);
    text += fmt::format("  {:<24}  {}\n", name, row.says);
  }
  return text;
}

std::string verbLines(std::span<const Verb* const> verbs) {
  std::string text;
  for (const Verb* verb : verbs) {
    const std::string name = fmt::format("{:<11} {}", verb->name, verb->words);
    text += fmt::format("  {:<33}  {}\n", name, verb->summary);
  }
  return text;
}

std::string commandHelp(const Style& style) {
  std::string text = style.heading("Examples") + '\n' + indented(commandExamples);
  text += '\n' + style.heading("Verbs") + '\n';
  text += verbLines(verbs());
  text += '\n' + style.heading("Flags for every verb, before or behind it") + '\n';
  text += flagLines(commonFlags);
  text += '\n' + style.heading("Exit codes") + '\n';
  text += exitCodes;
  return text + "\noxmv help VERB says more about one of them.\n";
}

std::string verbHelp(const Verb& verb, const Style& style) {
  std::string text = style.heading("Examples") + '\n' + indented(verb.examples);
  text += fmt::format("\n{}\n  oxmv {}{}{}\n  {}.\n", style.heading("Use"), verb.name,
                      verb.words.empty() ? "" : " ", verb.words, verb.summary);
  if (!verb.details.empty()) text += '\n' + indented(verb.details);
  text += '\n' + style.heading("Flags") + '\n' + flagLines(verb.flags) + flagLines(commonFlags);
  return text;
}

std::string familyHelp(std::span<const Verb* const> family, const Style& style) {
  std::string text = style.heading("Examples") + '\n';
  for (const Verb* verb : family)
    text += indented(verb->examples.substr(0, verb->examples.find('\n')));
  text += '\n' + style.heading("Verbs") + '\n' + verbLines(family);
  return text + fmt::format("\noxmv help {} says more about one of them.\n", family.front()->name);
}

std::string helpOn(std::span<const std::string> words, const Style& style) {
  if (words.empty()) return commandHelp(style);
  const auto family = familyOf(words.front());
  if (words.size() == 1 && !family.empty()) return familyHelp(family, style);
  const Verb& verb = verbNamed(words);
  if (words.size() > verb.wordsInName())
    throw UsageError("surplus-words", fmt::format("help takes one verb, not {}", words.size()));
  return verbHelp(verb, style);
}

void run(Call& call) { call.output.write(helpOn(call.words, call.style)); }

}  // namespace

const Verb helpVerb = {
    .name = "help",
    .words = "[VERB]",
    .summary = "show what the command can do, or all about a verb",
    .examples = "oxmv help\noxmv help show\noxmv help db list\n",
    .details = "",
    .flags = {},
    .fewestWords = 0,
    .mostWords = 2,
    .run = run,
};

}  // namespace oxmv::cli
