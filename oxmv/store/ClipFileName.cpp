#include "oxmv/store/ClipFileName.h"

#include <algorithm>
#include <charconv>
#include <system_error>

namespace oxmv {
namespace {

constexpr std::size_t guidSize = 36;
constexpr std::string_view combined = ".colr";
constexpr std::string_view eyePrefix = ".col";

// A number as it is written: without a sign or zeros in front.
std::optional<std::size_t> numberFrom(std::string_view text) {
  if (text.empty() || text.front() < '1' || text.front() > '9') return std::nullopt;
  std::size_t number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
  return number;
}

}  // namespace

std::optional<ClipFileName> ClipFileName::from(std::string_view name) noexcept {
  const std::string_view digits = name.substr(0, guidSize);
  const auto guid = guidFromText(digits);
  const bool isUpperCase =
      std::none_of(digits.begin(), digits.end(), [](char c) { return c >= 'a' && c <= 'f'; });
  if (!guid || !isUpperCase) return std::nullopt;
  const std::string_view extension = name.substr(guidSize);
  if (extension == combined) return ClipFileName{*guid, std::nullopt};
  if (!extension.starts_with(eyePrefix)) return std::nullopt;
  const auto number = numberFrom(extension.substr(eyePrefix.size()));
  if (!number || *number > lastEye + 1) return std::nullopt;
  return ClipFileName{*guid, *number - 1};
}

std::string ClipFileName::text() const {
  std::string name;
  name.reserve(guidSize + eyePrefix.size() + 10);
  name += guidText(guid);
  if (!eye) return name += combined;
  return (name += eyePrefix) += std::to_string(*eye + 1);
}

}  // namespace oxmv
