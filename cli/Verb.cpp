#include "cli/Verb.h"

#include <array>
#include <string>

#include <fmt/format.h>

#include "cli/Nearest.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

constexpr auto all = std::to_array<const Verb*>(
    {&showVerb,       &getVerb,      &setVerb,       &unsetVerb,    &diffVerb,     &dumpVerb,
     &checkVerb,      &encodeVerb,   &tagsVerb,      &dbListVerb,   &dbShowVerb,   &dbCheckVerb,
     &dbPathVerb,     &dbInitVerb,   &prefsVerb,     &pathsVerb,    &lookListVerb, &lookInfoVerb,
     &lookImportVerb, &lookLintVerb, &lookCheckVerb, &lookInitVerb, &stillVerb,    &demoVerb,
     &helpVerb,       &versionVerb});

std::string_view firstWord(std::string_view name) { return name.substr(0, name.find(' ')); }

std::string_view lastWord(std::string_view name) { return name.substr(name.rfind(' ') + 1); }

// Every first word once: verbs of a family stand together.
std::vector<std::string_view> firstWords() {
  std::vector<std::string_view> words;
  for (const Verb* verb : all) {
    if (words.empty() || words.back() != firstWord(verb->name))
      words.push_back(firstWord(verb->name));
  }
  return words;
}

[[noreturn]] void refuse(std::string_view typed, std::span<const std::string_view> known,
                         std::string_view help) {
  const std::string meant = didYouMean(nearest(typed, known));
  throw UsageError("unknown-verb",
                   fmt::format("no verb \"{}\"{}", visible(typed),
                               meant.empty() ? fmt::format("; {} lists them", help) : meant));
}

const Verb& verbOfFamily(std::span<const Verb* const> family, std::span<const std::string> words) {
  std::vector<std::string_view> names;
  for (const Verb* verb : family) names.push_back(lastWord(verb->name));
  if (words.size() < 2)
    throw UsageError("missing-verb", fmt::format("{} needs one of {} behind it", words.front(),
                                                 fmt::join(names, ", ")));
  for (std::size_t i = 0; i < names.size(); ++i) {
    if (names[i] == words[1]) return *family[i];
  }
  refuse(words[1], names, fmt::format("oxmv help {}", words.front()));
}

}  // namespace

std::size_t Verb::wordsInName() const { return firstWord(name) == name ? 1 : 2; }

std::span<const Verb* const> verbs() noexcept { return all; }

std::vector<const Verb*> familyOf(std::string_view word) {
  std::vector<const Verb*> family;
  for (const Verb* verb : all) {
    if (verb->wordsInName() == 2 && firstWord(verb->name) == word) family.push_back(verb);
  }
  return family;
}

const Verb& verbNamed(std::span<const std::string> words) {
  const std::string& first = words.front();
  if (const auto family = familyOf(first); !family.empty()) return verbOfFamily(family, words);
  for (const Verb* verb : all) {
    if (verb->name == first) return *verb;
  }
  refuse(first, firstWords(), "oxmv help");
}

}  // namespace oxmv::cli
