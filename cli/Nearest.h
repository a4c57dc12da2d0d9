// "Did you mean ...?"

#pragma once

#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace oxmv::cli {

// Those of `candidates` that somebody may have meant by `typed`, the nearest first, at most three.
// Upper and lower case count as the same.
std::vector<std::string_view> nearest(std::string_view typed,
                                      std::span<const std::string_view> candidates);

// "; did you mean a, b or c?"; empty when there are none.
std::string didYouMean(std::span<const std::string_view> choices);

}  // namespace oxmv::cli
