#include "oxmv/values/Numbers.h"

#include <algorithm>
#include <charconv>
#include <system_error>

namespace oxmv {
namespace {

bool isDigit(char c) { return c >= '0' && c <= '9'; }

// A number's text with white space and sign taken off. std::from_chars knows neither, and would
// take "inf", "nan".
struct Unsigned {
  std::string_view digits;
  bool negative;
};

Unsigned withoutSign(std::string_view text) {
  const std::size_t start = text.find_first_not_of(" \t\n\v\f\r");
  text.remove_prefix(start == std::string_view::npos ? text.size() : start);
  const bool negative = text.starts_with('-');
  if (negative || text.starts_with('+')) text.remove_prefix(1);
  return {text, negative};
}

// Whether std::from_chars, out of range, met a number too large (and not one too small): where the
// first digit that counts stands, seen from the decimal point.
bool isHuge(std::string_view number) {
  const std::size_t end = std::min(number.find_first_not_of("0123456789."), number.size());
  const std::size_t point = std::min(number.find('.'), end);
  const std::size_t first = std::min(number.find_first_of("123456789"), end);
  auto magnitude = static_cast<std::int64_t>(point) - static_cast<std::int64_t>(first);
  if (end < number.size() && (number[end] == 'e' || number[end] == 'E')) {
    constexpr std::int64_t most = std::int64_t{1} << 60;  // so that the sum cannot overflow
    magnitude += std::clamp(leadingInteger(number.substr(end + 1)), -most, most);
  }
  return magnitude > 0;
}

template <class Float>
Float leadingFloating(std::string_view text) {
  const auto [digits, negative] = withoutSign(text);
  const bool isNumber =
      !digits.empty() &&
      (isDigit(digits[0]) || (digits.size() > 1 && digits[0] == '.' && isDigit(digits[1])));
  if (!isNumber) return 0;
  Float number = 0;
  const auto result = std::from_chars(digits.data(), digits.data() + digits.size(), number);
  if (result.ec == std::errc::result_out_of_range) {
    number = isHuge(digits) ? std::numeric_limits<Float>::infinity() : Float{0};
  }
  return negative ? -number : number;
}

}  // namespace

std::int64_t leadingInteger(std::string_view text) noexcept {
  const auto [digits, negative] = withoutSign(text);
  // Gathered as a negative number, because that end of the range reaches one further.
  constexpr std::int64_t lowest = std::numeric_limits<std::int64_t>::min();
  std::int64_t number = 0;
  for (const char c : digits) {
    if (!isDigit(c)) break;
    const int digit = c - '0';
    if (number < (lowest + digit) / 10) {
      number = lowest;
      break;
    }
    number = number * 10 - digit;
  }
  if (negative) return number;
  return number == lowest ? std::numeric_limits<std::int64_t>::max() : -number;
}

float leadingFloat(std::string_view text) noexcept { return leadingFloating<float>(text); }

double leadingDouble(std::string_view text) noexcept { return leadingFloating<double>(text); }

}  // namespace oxmv
