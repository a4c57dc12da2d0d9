#include "cli/Nearest.h"

#include <algorithm>
#include <cstddef>
#include <numeric>
#include <utility>

#include <fmt/format.h>

namespace oxmv::cli {
namespace {

constexpr std::size_t mostChoices = 3;

char lower(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c; }

// How many characters have to be put in, left out, changed or swapped with their neighbour.
std::size_t distance(std::string_view a, std::string_view b) {
  std::vector<std::size_t> twoAgo;
  std::vector<std::size_t> last(b.size() + 1);
  std::iota(last.begin(), last.end(), std::size_t{0});
  for (std::size_t i = 0; i < a.size(); ++i) {
    std::vector<std::size_t> row(b.size() + 1, i + 1);
    for (std::size_t k = 0; k < b.size(); ++k) {
      const bool isSame = lower(a[i]) == lower(b[k]);
      row[k + 1] = std::min({last[k] + (isSame ? 0 : 1), last[k + 1] + 1, row[k] + 1});
      const bool isSwap =
          i > 0 && k > 0 && lower(a[i]) == lower(b[k - 1]) && lower(a[i - 1]) == lower(b[k]);
      if (isSwap) row[k + 1] = std::min(row[k + 1], twoAgo[k - 1] + 1);
    }
    twoAgo = std::exchange(last, std::move(row));
  }
  return last.back();
}

bool startsAlike(std::string_view whole, std::string_view start) {
  return start.size() <= whole.size() &&
         std::equal(start.begin(), start.end(), whole.begin(),
                    [](char a, char b) { return lower(a) == lower(b); });
}

}  // namespace

std::vector<std::string_view> nearest(std::string_view typed,
                                      std::span<const std::string_view> candidates) {
  constexpr std::size_t longest = 64;  // nobody mistypes more, and the work grows with the square
  if (typed.empty() || typed.size() > longest) return {};
  const std::size_t farthest = std::max<std::size_t>(1, typed.size() / 3);
  std::vector<std::pair<std::size_t, std::string_view>> found;
  for (const std::string_view candidate : candidates) {
    const std::size_t away = distance(typed, candidate);
    if (away <= farthest || startsAlike(candidate, typed)) found.emplace_back(away, candidate);
  }
  std::stable_sort(found.begin(), found.end(),
                   [](const auto& a, const auto& b) { return a.first < b.first; });
  std::vector<std::string_view> choices;
  for (const auto& [away, choice] : found) {
    if (choices.size() < mostChoices) choices.push_back(choice);
  }
  return choices;
}

std::string didYouMean(std::span<const std::string_view> choices) {
  if (choices.empty()) return {};
  const std::span<const std::string_view> first = choices.first(choices.size() - 1);
  return fmt::format("; did you mean {}{}{}?", fmt::join(first, ", "), first.empty() ? "" : " or ",
                     choices.back());
}

}  // namespace oxmv::cli
