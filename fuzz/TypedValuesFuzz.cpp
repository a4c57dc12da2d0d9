// Any bytes as what `set` takes: PATH=VALUE, or PATH:=JSON. What must hold for all of them:
//
// - a path is refused with words that can be shown, or is a path of tags, and its own text is the
//   same path again;
// - so is a value; one that is taken reads the same from its JSON and, if it is of numbers, from
//   the digits in which it is shown;
// - it stands where the path says, and nowhere else.

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <variant>

#include "cli/Flags.h"
#include "cli/TagJson.h"
#include "cli/TagPaths.h"
#include "cli/TypedValues.h"
#include "cli/ValueText.h"
#include "fuzz/Require.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Characters.h"

namespace {

using namespace oxmv;
using namespace oxmv::cli;
using fuzz::require;

using Result = std::variant<Value, ValueProblem>;

bool isValue(const Result& result, const Value& value) {
  const auto* held = std::get_if<Value>(&result);
  return held != nullptr && *held == value;
}

bool canBeShown(std::string_view message) {
  return !message.empty() && visible(message) == message;
}

std::optional<TagPath> pathFrom(std::string_view typed) {
  try {
    return tagPathFrom(typed);
  } catch (const UsageError& error) {
    require(!error.code().empty() && canBeShown(error.what()));
    return std::nullopt;
  }
}

// A number, or a list of them; not those whose bits their digits do not tell.
bool isOfFiniteNumbers(const Value& value) {
  if (value.isNumber()) return std::isfinite(value.doubleValue());
  const Array array = value.array();
  for (const Value& element : array) {
    if (!element.isNumber() || !std::isfinite(element.doubleValue())) return false;
  }
  return !array.empty();
}

void check(const TagPath& path, const Result& result) {
  if (const auto* problem = std::get_if<ValueProblem>(&result))
    return require(!problem->code.empty() && canBeShown(problem->message));
  const Value& value = std::get<Value>(result);
  require(!value.isNothing() && isValue(jsonValue(path, tagJsonOf(value)), value));
  require(visible(bare(value)) == bare(value));

  const Dictionary holder = holding(value, path);
  require(holder.size() == 1 && valueAt(holder, path) == value);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string argument(data, data + size);
  const std::size_t equals = argument.find('=');
  if (equals == std::string::npos) return 0;
  const bool isJson = equals > 0 && argument[equals - 1] == ':';
  const auto path = pathFrom(std::string_view(argument).substr(0, equals - (isJson ? 1 : 0)));
  if (!path) return 0;
  const auto again = pathFrom(path->text());
  require(again && again->keys == path->keys && again->row == path->row);
  require(again->isEntry == path->isEntry);

  const std::string_view text = std::string_view(argument).substr(equals + 1);
  check(*path, jsonValue(*path, text));
  const Result typed = typedValue(*path, text, {});
  check(*path, typed);
  if (const auto* value = std::get_if<Value>(&typed); value && isOfFiniteNumbers(*value))
    require(isValue(typedValue(*path, bare(*value), *value), *value));
  return 0;
}
