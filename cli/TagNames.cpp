#include "cli/TagNames.h"

#include <algorithm>
#include <string_view>
#include <vector>

#include <fmt/format.h>

#include "cli/Flags.h"
#include "cli/Nearest.h"
#include "oxmv/values/Characters.h"
#include "oxmv/values/Text.h"

namespace oxmv::cli {
namespace {

std::string letters(Tag tag) {
  const auto characters = charactersOf(tag);
  return {characters.begin(), characters.end()};
}

bool isSameLetter(char a, char b) {
  const auto lower = [](char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c;
  };
  return lower(a) == lower(b);
}

bool isSameText(std::string_view a, std::string_view b) {
  return std::equal(a.begin(), a.end(), b.begin(), b.end(), isSameLetter);
}

std::string withLabel(const TagRow& row) {
  return row.label.empty() ? letters(row.tag) : fmt::format("{} ({})", letters(row.tag), row.label);
}

}  // namespace

std::string visibleTag(Tag tag) { return visible(letters(tag)); }

std::string tagInJson(Tag tag) { return utf8FromLatin1(letters(tag)); }

const TagRow& tagNamed(std::string_view typed) {
  if (const TagRow* row = findTagRow(typed)) return *row;
  if (const TagRow* row = findTagRow(fmt::format("{} ", typed))) return *row;
  for (const TagRow& row : tagRows()) {
    if (!row.label.empty() && isSameText(row.label, typed)) return row;
  }
  throw UsageError("unknown-tag",
                   fmt::format("no tag \"{}\"{}", visible(typed), tagsMeantBy(typed)));
}

std::string tagsMeantBy(std::string_view typed) {
  std::vector<std::string> names;
  for (const TagRow& row : tagRows()) {
    names.push_back(letters(row.tag));
    if (!row.label.empty()) names.emplace_back(row.label);
  }
  const std::vector<std::string_view> candidates(names.begin(), names.end());
  std::vector<std::string> meant;
  for (const std::string_view name : nearest(typed, candidates)) {
    const std::string choice = withLabel(tagNamed(name));
    if (std::find(meant.begin(), meant.end(), choice) == meant.end()) meant.push_back(choice);
  }
  return didYouMean(std::vector<std::string_view>(meant.begin(), meant.end()));
}

bool containsIgnoringCase(std::string_view text, std::string_view part) {
  return std::search(text.begin(), text.end(), part.begin(), part.end(), isSameLetter) !=
         text.end();
}

}  // namespace oxmv::cli
