#include "oxmv/looks/LookNames.h"

#include <algorithm>
#include <string>

#include "oxmv/platform/Unicode.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

char lowerCase(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; }

std::string asciiFolded(std::string_view bytes) {
  std::string folded(bytes);
  std::transform(folded.begin(), folded.end(), folded.begin(), lowerCase);
  return folded;
}

// Each name has one key whatever it is compared with, so the order holds among any three names.
std::string keyOf(std::string_view name) {
  if (isAscii(name)) return asciiFolded(name);
  auto folded = caseFolded(name);
  return folded ? *std::move(folded) : asciiFolded(name);
}

}  // namespace

std::weak_ordering compareLookNames(std::string_view one, std::string_view other) {
  return keyOf(one) <=> keyOf(other);
}

}  // namespace oxmv
