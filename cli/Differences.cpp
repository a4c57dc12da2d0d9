#include "cli/Differences.h"

#include <algorithm>
#include <string_view>
#include <utility>

#include <fmt/format.h>

#include "cli/TagJson.h"
#include "oxmv/values/Array.h"

namespace oxmv::cli {
namespace {

bool holdsNumbers(const Array& array) {
  return std::all_of(array.begin(), array.end(), [](const Value& v) { return v.isNumber(); });
}

// A value that is gone through rather than shown: it has values of its own that have places.
bool isOpened(const Value& value) {
  if (value.kind() == Value::Kind::dictionary) return !value.dictionary().empty();
  return value.kind() == Value::Kind::array && !holdsNumbers(value.array());
}

class Comparison {
 public:
  void compare(const Value& before, const Value& after, const std::string& path) {
    if (before == after) return;
    const bool areDictionaries = areOpened(before, after, Value::Kind::dictionary);
    if (areDictionaries) return compareEntries(before.dictionary(), after.dictionary(), path);
    if (areOpened(before, after, Value::Kind::array))
      return compareElements(before.array(), after.array(), path);
    found_.push_back({path, before, after});
  }

  void compareEntries(const Dictionary& before, const Dictionary& after, const std::string& path) {
    const auto inside = [&](std::string_view key) {
      return path.empty() ? std::string(key) : fmt::format("{}/{}", path, key);
    };
    for (const auto& [key, value] : before) compare(value, after[key], inside(key));
    for (const auto& [key, value] : after) {
      if (!before.contains(key)) compare({}, value, inside(key));
    }
  }

  std::vector<Difference> take() { return std::move(found_); }

 private:
  // Whether both are of that kind, or one is and the other is not there.
  static bool areOpened(const Value& before, const Value& after, Value::Kind kind) {
    const auto fits = [kind](const Value& value) {
      return value.isNothing() || (value.kind() == kind && isOpened(value));
    };
    return fits(before) && fits(after);
  }

  void compareElements(const Array& before, const Array& after, const std::string& path) {
    const auto at = [](const Array& array, std::size_t i) {
      return i < array.size() ? array[i] : Value();
    };
    for (std::size_t i = 0; i < std::max(before.size(), after.size()); ++i)
      compare(at(before, i), at(after, i), fmt::format("{}[{}]", path, i));
  }

  std::vector<Difference> found_;
};

}  // namespace

std::vector<Difference> differencesBetween(const Dictionary& before, const Dictionary& after) {
  Comparison comparison;
  comparison.compareEntries(before, after, "");
  return comparison.take();
}

ShownDifference show(const Difference& difference, Extent extent) {
  const auto& [path, before, after] = difference;
  ShownDifference shown{textInLine(path, Extent::whole), {}, {}};
  if (!before.isNothing()) shown.before = inLine(before, extent);
  if (!after.isNothing()) shown.after = inLine(after, extent);
  if (shown.before == shown.after) {
    shown.before = tagJsonOf(before);
    shown.after = tagJsonOf(after);
  }
  return shown;
}

}  // namespace oxmv::cli
