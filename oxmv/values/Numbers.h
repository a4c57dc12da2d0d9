// Conversions between numbers and text that never fail and never ask the C locale.

#pragma once

#include <cmath>
#include <cstdint>
#include <limits>
#include <string_view>
#include <type_traits>

namespace oxmv {

// Truncates toward zero and saturates at the ends of Integer; not a number gives 0.
template <class Integer>
Integer truncated(double number) noexcept {
  static_assert(std::is_signed_v<Integer>);
  // Both ends are powers of two (the upper one by adding 1), so the comparisons are exact.
  constexpr double lowest = static_cast<double>(std::numeric_limits<Integer>::min());
  if (std::isnan(number)) return 0;
  if (number < lowest) return std::numeric_limits<Integer>::min();
  if (number >= -lowest) return std::numeric_limits<Integer>::max();
  return static_cast<Integer>(number);
}

// The number at the start of `text`: white space, a sign, digits (for the floating kinds also a
// fraction and an exponent). What follows is ignored; no number gives 0; a number out of range
// gives the nearest end of the integer range, or infinity; one too small gives 0 with its sign.
std::int64_t leadingInteger(std::string_view text) noexcept;
float leadingFloat(std::string_view text) noexcept;
double leadingDouble(std::string_view text) noexcept;

}  // namespace oxmv
