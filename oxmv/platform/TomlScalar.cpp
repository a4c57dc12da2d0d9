#include "oxmv/platform/TomlScalar.h"

#include <cstddef>

namespace oxmv {
namespace {

constexpr std::string_view decimal = "0123456789";

bool contains(std::string_view set, char c) { return set.find(c) != std::string_view::npos; }

// These take something off the start of `rest`, or leave it and answer false.

bool take(std::string_view& rest, std::string_view what) {
  const bool isThere = rest.starts_with(what);
  if (isThere) rest.remove_prefix(what.size());
  return isThere;
}

bool takeOneOf(std::string_view& rest, std::string_view set) {
  const bool isThere = !rest.empty() && contains(set, rest.front());
  if (isThere) rest.remove_prefix(1);
  return isThere;
}

// digits := digit ( "_"? digit )*
bool takeDigits(std::string_view& rest, std::string_view digits) {
  if (!takeOneOf(rest, digits)) return false;
  while (!rest.empty()) {
    std::string_view next = rest;
    take(next, "_");
    if (!takeOneOf(next, digits)) break;
    rest = next;
  }
  return true;
}

// The shape stands for itself, but for 0, which stands for a digit.
bool takeShape(std::string_view& rest, std::string_view shape) {
  if (rest.size() < shape.size()) return false;
  for (std::size_t i = 0; i < shape.size(); ++i) {
    if (shape[i] == '0' ? !contains(decimal, rest[i]) : rest[i] != shape[i]) return false;
  }
  rest.remove_prefix(shape.size());
  return true;
}

// time := 00:00:00 ( "." digit+ )?
bool takeTime(std::string_view& rest) {
  if (!takeShape(rest, "00:00:00")) return false;
  if (take(rest, ".")) {
    if (!takeOneOf(rest, decimal)) return false;
    while (takeOneOf(rest, decimal)) continue;
  }
  return true;
}

// date := 0000-00-00 ( [Tt ] time ( [Zz] | [+-] 00:00 )? )?  |  time
bool isDateOrTime(std::string_view rest) {
  if (!takeShape(rest, "0000-00-00")) return takeTime(rest) && rest.empty();
  if (rest.empty()) return true;
  if (!takeOneOf(rest, "Tt ") || !takeTime(rest)) return false;
  if (takeOneOf(rest, "+-")) return takeShape(rest, "00:00") && rest.empty();
  takeOneOf(rest, "Zz");
  return rest.empty();
}

// number := "0x" digits | "0o" digits | "0b" digits
//         | [+-]? ( "inf" | "nan" | digits ( "." digits )? ( [eE] [+-]? digits )? )
//
// Without needless zeros in front.
bool isNumber(std::string_view rest) {
  if (take(rest, "0x")) return takeDigits(rest, "0123456789ABCDEFabcdef") && rest.empty();
  if (take(rest, "0o")) return takeDigits(rest, "01234567") && rest.empty();
  if (take(rest, "0b")) return takeDigits(rest, "01") && rest.empty();
  takeOneOf(rest, "+-");
  if (rest == "inf" || rest == "nan") return true;
  if (rest.size() > 1 && rest[0] == '0' && (contains(decimal, rest[1]) || rest[1] == '_'))
    return false;
  if (!takeDigits(rest, decimal)) return false;
  if (take(rest, ".") && !takeDigits(rest, decimal)) return false;
  if (takeOneOf(rest, "eE")) {
    takeOneOf(rest, "+-");
    if (!takeDigits(rest, decimal)) return false;
  }
  return rest.empty();
}

}  // namespace

bool isTomlScalar(std::string_view text) noexcept {
  return text == "true" || text == "false" || isNumber(text) || isDateOrTime(text);
}

}  // namespace oxmv
