#include "oxmv/platform/TomlReader.h"

#include <algorithm>
#include <optional>
#include <utility>
#include <vector>

// Answers with its errors instead of throwing them.
#define TOML_EXCEPTIONS 0
#include <toml++/toml.h>

#include "oxmv/values/Array.h"

namespace oxmv {
namespace {

TomlProblem problemAt(const toml::source_region& source, std::string message) {
  return {std::move(message), source.begin.line, source.begin.column};
}

// Nothing with the problem said, if a value has no place here.
std::optional<Value> valueOf(const toml::node& node, TomlProblem& problem);

std::optional<Dictionary> dictionaryOf(const toml::table& table, TomlProblem& problem) {
  Dictionary entries;
  for (const auto& [key, node] : table) {
    auto value = valueOf(node, problem);
    if (!value) return std::nullopt;
    entries.set(key.str(), std::move(*value));
  }
  return entries;
}

std::optional<Array> arrayOf(const toml::array& array, TomlProblem& problem) {
  std::vector<Value> elements;
  elements.reserve(array.size());
  for (const toml::node& node : array) {
    auto value = valueOf(node, problem);
    if (!value) return std::nullopt;
    elements.push_back(std::move(*value));
  }
  return Array(std::move(elements));
}

std::optional<Value> valueOf(const toml::node& node, TomlProblem& problem) {
  if (const auto* text = node.as_string()) return Value(text->get());
  if (const auto* integer = node.as_integer()) return Value(integer->get());
  if (const auto* number = node.as_floating_point()) return Value(number->get());
  if (const auto* array = node.as_array()) return arrayOf(*array, problem);
  if (const auto* table = node.as_table()) return dictionaryOf(*table, problem);
  problem = problemAt(node.source(), node.is_boolean() ? "a boolean has no place here"
                                                       : "a date or time has no place here");
  return std::nullopt;
}

bool opens(char c) { return c == '.' || c == '[' || c == '{'; }

}  // namespace

std::variant<Dictionary, TomlProblem> readToml(std::string_view text) {
  static_assert(maxTomlSize == 64 * 1024 && maxTomlOpenings == 256, "the messages name them");
  if (text.size() > maxTomlSize) return TomlProblem{"larger than 64 KiB", 0, 0};
  if (std::count_if(text.begin(), text.end(), opens) > std::ptrdiff_t{maxTomlOpenings})
    return TomlProblem{"more than 256 points and opening brackets", 0, 0};
  const toml::parse_result result = toml::parse(text);
  if (!result) return problemAt(result.error().source(), std::string(result.error().description()));
  TomlProblem problem;
  if (auto document = dictionaryOf(result.table(), problem)) return *std::move(document);
  return problem;
}

}  // namespace oxmv
