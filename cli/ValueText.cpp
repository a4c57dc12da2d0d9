#include "cli/ValueText.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include <fmt/format.h>

#include "cli/TagJson.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Characters.h"
#include "oxmv/values/Dictionary.h"

namespace oxmv::cli {
namespace {

// Longer texts are no names or comments any more.
constexpr std::size_t shownCharacters = 256;
constexpr std::size_t shownBytes = 16;

std::string numberInLine(const Value& value) {
  if (value.kind() == Value::Kind::integer) return std::to_string(value.int64Value());
  const double number = value.doubleValue();
  if (std::isnan(number)) return "nan";
  if (std::isinf(number)) return number < 0 ? "-inf" : "inf";
  return value.kind() == Value::Kind::float32 ? digitsOf(value.floatValue()) : digitsOf(number);
}

std::string dataInLine(std::span<const std::uint8_t> bytes, Extent extent) {
  const bool isCut = extent == Extent::abbreviated && bytes.size() > shownBytes;
  const auto shown = isCut ? bytes.first(shownBytes) : bytes;
  return fmt::format("{:02x}{}({})", fmt::join(shown, ""),
                     isCut           ? "... "
                     : shown.empty() ? ""
                                     : " ",
                     counted(bytes.size(), "byte"));
}

bool holdsNumbers(const Array& array) {
  return !array.empty() &&
         std::all_of(array.begin(), array.end(), [](const Value& v) { return v.isNumber(); });
}

std::string arrayInLine(const Array& array, Extent extent) {
  if (!holdsNumbers(array)) return counted(array.size(), "element");
  const bool isCut = extent == Extent::abbreviated && array.size() > shownElements;
  std::vector<std::string> numbers;
  for (const Value& element : array) {
    if (isCut && numbers.size() == shownElements) break;
    numbers.push_back(numberInLine(element));
  }
  return fmt::format("{}{}", fmt::join(numbers, " "),
                     isCut ? fmt::format(" ... ({})", counted(array.size(), "number")) : "");
}

}  // namespace

std::string inLine(const Value& value, Extent extent) {
  switch (value.kind()) {
    case Value::Kind::nothing: return "nothing";
    case Value::Kind::integer:
    case Value::Kind::float32:
    case Value::Kind::float64: return numberInLine(value);
    case Value::Kind::text: return textInLine(value.text(), extent);
    case Value::Kind::data: return dataInLine(value.data(), extent);
    case Value::Kind::array: return arrayInLine(value.array(), extent);
    case Value::Kind::dictionary: return counted(value.dictionary().size(), "tag");
  }
  return {};
}

std::string bare(const Value& value) {
  if (value.isNothing()) return {};
  if (value.isText()) return visible(value.text());
  if (value.isNumber() || holdsNumbers(value.array())) return inLine(value, Extent::whole);
  return tagJsonOf(value);
}

std::string textInLine(std::string_view text, Extent extent) {
  const std::size_t kept = text.find_last_not_of('\0') + 1;  // npos + 1 is 0: nothing but NULs
  const std::size_t nuls = text.size() - kept;
  const std::string_view bare = text.substr(0, kept);
  // No text has more characters than bytes.
  const bool isShort = extent == Extent::whole || bare.size() <= shownCharacters;
  const std::string_view shown = isShort ? bare : firstCharacters(bare, shownCharacters);
  const bool needsQuotes = bare.empty() || bare.front() == ' ' || bare.back() == ' ';
  std::string line = visible(shown);
  if (needsQuotes) line = fmt::format("\"{}\"", line);
  if (shown.size() < bare.size()) line += fmt::format("... ({})", counted(bare.size(), "byte"));
  if (nuls > 0) line += fmt::format(" (+{} NUL)", nuls);
  return line;
}

std::string counted(std::size_t count, std::string_view thing) {
  return fmt::format("{} {}{}", count, thing, count == 1 ? "" : "s");
}

}  // namespace oxmv::cli
