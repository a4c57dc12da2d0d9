#include "oxmv/platform/TomlReader.h"

#include <algorithm>
#include <optional>
#include <utility>
#include <vector>

// Its assertions do not hold for every text (the two characters "[(" break one), though the code
// behind them copes with all. Without them, and without NDEBUG, which makes assumptions of them.
#define TOML_ASSERT(condition) static_cast<void>(0)
#pragma push_macro("NDEBUG")
#undef NDEBUG
#include <toml++/toml.h>
#pragma pop_macro("NDEBUG")

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

// The first byte that is not ASCII, if there is one. Some such characters, where the reader looks for
// white space, lead it to where its authors thought that nobody comes.
std::optional<TomlProblem> problemOfBytes(std::string_view text) {
  const auto odd = std::find_if(text.begin(), text.end(),
                                [](char c) { return static_cast<unsigned char>(c) >= 0x80; });
  if (odd == text.end()) return std::nullopt;
  const std::string_view before(text.data(), static_cast<std::size_t>(odd - text.begin()));
  const auto lines = static_cast<std::size_t>(std::count(before.begin(), before.end(), '\n'));
  // Without a line before it, npos + 1 is 0.
  return TomlProblem{"only ASCII has a place here", lines + 1,
                     before.size() - (before.rfind('\n') + 1) + 1};
}

bool opens(char c) { return c == '.' || c == '[' || c == '{'; }

}  // namespace

std::variant<Dictionary, TomlProblem> readToml(std::string_view text) {
  static_assert(maxTomlSize == 64 * 1024 && maxTomlOpenings == 256, "the messages name them");
  if (text.size() > maxTomlSize) return TomlProblem{"larger than 64 KiB", 0, 0};
  if (std::count_if(text.begin(), text.end(), opens) > std::ptrdiff_t{maxTomlOpenings})
    return TomlProblem{"more than 256 points and opening brackets", 0, 0};
  if (auto problem = problemOfBytes(text)) return *std::move(problem);
  try {
    TomlProblem problem;
    if (auto document = dictionaryOf(toml::parse(text), problem)) return *std::move(document);
    return problem;
  } catch (const toml::parse_error& error) {
    return problemAt(error.source(), std::string(error.description()));
  }
}

}  // namespace oxmv
