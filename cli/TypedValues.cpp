#include "cli/TypedValues.h"

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <limits>
#include <optional>
#include <system_error>
#include <utility>
#include <vector>

#include <fmt/format.h>

#include "cli/TagJson.h"
#include "cli/ValueText.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Characters.h"
#include "oxmv/values/Text.h"

namespace oxmv::cli {
namespace {

using Result = std::variant<Value, ValueProblem>;

constexpr std::string_view badValue = "bad-value";

std::string quoted(std::string_view text) {
  constexpr std::size_t shown = 40;
  const std::string_view start = firstCharacters(text, shown);
  return fmt::format("\"{}{}\"", visible(start), start.size() < text.size() ? "..." : "");
}

// All of `text` as a number; nothing if it is none, or out of range.
template <class Number, class... Base>
std::optional<Number> whole(std::string_view text, Base... base) {
  Number number{};
  const auto result = std::from_chars(text.data(), text.data() + text.size(), number, base...);
  const bool isAll = result.ec == std::errc() && result.ptr == text.data() + text.size();
  return isAll ? std::optional(number) : std::nullopt;
}

std::optional<Value> hexadecimalFrom(std::string_view digits, bool isNegative) {
  const auto bits = whole<std::uint64_t>(digits, 16);
  if (!bits || *bits > std::uint64_t{std::numeric_limits<std::int64_t>::max()}) return std::nullopt;
  const auto number = static_cast<std::int64_t>(*bits);
  if (isNegative) return Value(-number);
  // Who writes 0xDEADBEEF means these bits, whichever integer they are.
  const bool isWord = *bits > std::uint64_t{std::numeric_limits<std::int32_t>::max()} &&
                      *bits <= std::numeric_limits<std::uint32_t>::max();
  return isWord ? Value(static_cast<std::int32_t>(static_cast<std::uint32_t>(*bits)))
                : Value(number);
}

// Takes a '+' off; one that another sign follows stays, and makes the text no number.
std::string_view withoutPlus(std::string_view text) {
  const bool isPlus = text.starts_with('+') && !text.starts_with("+-");
  return text.substr(isPlus ? 1 : 0);
}

std::optional<Value> integerFrom(std::string_view text) {
  text = withoutPlus(text);
  const bool isNegative = text.starts_with('-');
  const std::string_view digits = text.substr(isNegative ? 1 : 0);
  if (digits.starts_with("0x") || digits.starts_with("0X"))
    return hexadecimalFrom(digits.substr(2), isNegative);
  const auto number = whole<std::int64_t>(text);
  return number ? std::optional<Value>(*number) : std::nullopt;
}

std::optional<Value> floatFrom(std::string_view text) {
  text = withoutPlus(text);
  const auto number = whole<float>(text);
  return number ? std::optional<Value>(*number) : std::nullopt;
}

Result number(std::optional<Value> (*read)(std::string_view), std::string_view kind,
              std::string_view text) {
  if (auto value = read(text)) return *std::move(value);
  return ValueProblem{badValue, fmt::format("needs {}, got {}", kind, quoted(text))};
}

// What stands between commas, or blanks, or both.
std::vector<std::string_view> elementsOf(std::string_view text) {
  constexpr std::string_view blanks = " \t\n";
  constexpr std::string_view ends = ", \t\n";
  const auto skipBlanks = [&] {
    text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
  };
  std::vector<std::string_view> elements;
  skipBlanks();
  bool isExpected = false;  // behind a comma there is always one more
  while (!text.empty() || isExpected) {
    const std::string_view element = text.substr(0, text.find_first_of(ends));
    elements.push_back(element);
    text.remove_prefix(element.size());
    skipBlanks();
    isExpected = text.starts_with(',');
    if (isExpected) text.remove_prefix(1);
    skipBlanks();
  }
  return elements;
}

Result numbers(std::optional<Value> (*read)(std::string_view), std::string_view kind,
               std::string_view text) {
  std::vector<Value> values;
  for (const std::string_view element : elementsOf(text)) {
    Result value = number(read, kind, element);
    if (std::holds_alternative<ValueProblem>(value)) return value;
    values.push_back(std::get<Value>(std::move(value)));
  }
  return Array(std::move(values));
}

Result floats(std::size_t count, std::string_view text) {
  Result list = numbers(floatFrom, fmt::format("{} numbers", count), text);
  const auto* value = std::get_if<Value>(&list);
  if (value == nullptr || value->array().size() == count) return list;
  const std::string got = value->array().empty() ? "" : fmt::format(" ({})", bare(*value));
  return ValueProblem{"list-count",
                      fmt::format("needs {} numbers, got {}{}", count, value->array().size(), got)};
}

// Lists keep texts by whole words of 4 bytes.
std::string filled(std::string_view text) {
  std::string whole(text);
  if (isAscii(text)) whole.resize((whole.size() + 3) / 4 * 4);
  return whole;
}

Result data(std::string_view digits) {
  std::vector<std::uint8_t> bytes;
  for (std::size_t i = 0; i + 1 < digits.size(); i += 2) {
    const auto byte = whole<std::uint8_t>(digits.substr(i, 2), 16);
    if (!byte) break;
    bytes.push_back(*byte);
  }
  if (bytes.size() * 2 == digits.size()) return Value::data(bytes);
  return ValueProblem{
      badValue, fmt::format("needs hexadecimal digits, two for each byte, got {}", quoted(digits))};
}

// The element of a list of dictionaries may stand without its brackets.
Result dictionaries(const TagPath& path, std::string_view json) {
  Result value = jsonValue(path, json);
  const auto* element = std::get_if<Value>(&value);
  const bool isBare = element != nullptr && element->kind() == Value::Kind::dictionary;
  return isBare ? Result(Array::of(*element)) : value;
}

// An entry keeps its kind. A new one is an integer only if it would be shown in the same
// characters: "007" is a text.
Result entry(std::string_view text, const Value& old) {
  if (old.isNumber()) {
    auto value = number(integerFrom, "an integer", text);
    if (auto* problem = std::get_if<ValueProblem>(&value))
      problem->message += "; := takes a text in quotes";
    return value;
  }
  const auto number = whole<std::int32_t>(text);
  const bool isNumber = number && fmt::format("{}", *number) == text;
  return isNumber && !old.isText() ? Value(*number) : Value(text);
}

// What every reader takes for a GUID. Others can be stored, and then it is not the clip's.
Result guid(std::string_view digits) {
  constexpr std::size_t guidSize = 16;
  Result value = data(digits);
  const auto* bytes = std::get_if<Value>(&value);
  if (bytes == nullptr || bytes->data().size() == guidSize) return value;
  return ValueProblem{"guid-length", fmt::format("needs 16 bytes, got {}", bytes->data().size())};
}

// By how the tag is read; where nobody reads it, by how it would be written.
Result byKind(const TagPath& path, std::string_view text) {
  switch (path.row->read) {
    case Read::int32:
    case Read::uint8:
    case Read::uint16: return number(integerFrom, "an integer", text);
    case Read::float32: return number(floatFrom, "a number", text);
    case Read::floats: return floats(path.row->count, text);
    case Read::integers:
    case Read::ints: return numbers(integerFrom, "integers", text);
    case Read::data: return data(text);
    case Read::guid: return guid(text);
    case Read::texts: return Array::of(filled(text));
    case Read::nested: return jsonValue(path, text);
    case Read::nestedList:
    case Read::controlPoint: return dictionaries(path, text);
    case Read::none:
      if (isGroup(*path.row)) return jsonValue(path, text);
      break;
    case Read::text:
    case Read::tagName:
    case Read::tagValue:
    case Read::regName:
    case Read::regValue: break;
  }
  return Value(text);
}

}  // namespace

Result typedValue(const TagPath& path, std::string_view text, const Value& old) {
  return path.isEntry ? entry(text, old) : byKind(path, text);
}

Result jsonValue(const TagPath& path, std::string_view json) {
  auto read = readTagJsonValue(path.keys.back(), json);
  if (const auto* error = std::get_if<JsonError>(&read)) {
    const std::string line = error->line == 1 ? "" : fmt::format("line {}, ", error->line);
    return ValueProblem{error->code, fmt::format("needs tag JSON; {}column {}: {}", line,
                                                 error->column, error->message)};
  }
  return std::get<Value>(std::move(read));
}

bool isAppendable(const TagPath& path) noexcept {
  const Read rule = path.row->read;
  return !path.isEntry && (rule == Read::texts || rule == Read::ints || rule == Read::nestedList ||
                           rule == Read::controlPoint);
}

}  // namespace oxmv::cli
