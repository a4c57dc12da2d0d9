#include "cli/TagsAsTable.h"

#include <algorithm>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include <fmt/format.h>

#include "cli/TagPaths.h"
#include "oxmv/import/CameraStill.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

struct Line {
  std::string name;  // indented
  std::string_view label;
  std::string value;
  bool isSize;  // the value only says how much follows
};

// A name that is longer moves its own label and value, not those of all others.
constexpr std::size_t widestName = 28;

// No row of the table of tags: it lives in dictionaries only.
constexpr std::string_view fieldOfViewLabel = "Field of view, not in clips";

class TableWriter {
 public:
  TableWriter(const Style& style, Extent extent) : style_(style), extent_(extent) {}

  // `hasLabels`: the keys are tags.
  void add(const Dictionary& dictionary, std::size_t depth, bool hasLabels) {
    for (const auto& [key, value] : dictionary) {
      const TagRow* row = hasLabels ? findTagRow(key) : nullptr;
      if (row == nullptr) {
        addValue(textInLine(key, extent_), key == fieldOfViewKey ? fieldOfViewLabel : "", value,
                 depth, true);
      } else {
        addValue(key, row->label, value, depth, !isGroup(*row));
      }
    }
  }

  void write(Sink& sink) const {
    std::size_t nameWidth = 0;
    std::size_t labelWidth = 0;
    for (const Line& line : lines_) {
      nameWidth = std::max(nameWidth, std::min(columns(line.name), widestName));
      labelWidth = std::max(labelWidth, line.label.size());
    }
    for (const Line& line : lines_) {
      const std::string label =
          labelWidth == 0 ? "" : "  " + padded(style_.label(line.label), line.label, labelWidth);
      sink.write(fmt::format("{}{}  {}\n", padded(style_.tag(line.name), line.name, nameWidth),
                             label, line.isSize ? style_.faint(line.value) : line.value));
    }
  }

 private:
  static std::string padded(std::string styled, std::string_view bare, std::size_t width) {
    const std::size_t taken = columns(bare);
    return styled.append(width > taken ? width - taken : 0, ' ');
  }

  void addLine(std::string_view name, std::string_view label, std::string value, std::size_t depth,
               bool isSize) {
    lines_.push_back(
        {std::string(2 * depth, ' ') + std::string(name), label, std::move(value), isSize});
  }

  void addValue(std::string_view name, std::string_view label, const Value& value,
                std::size_t depth, bool holdsTags) {
    if (value.kind() == Value::Kind::dictionary) {
      const Dictionary dictionary = value.dictionary();
      addLine(name, label,
              holdsTags ? counted(dictionary.size(), "tag")
                        : sizeOf(dictionary.size(), "entry", "entries"),
              depth, true);
      add(dictionary, depth + 1, holdsTags);
    } else if (value.kind() == Value::Kind::array && !holdsNumbers(value.array())) {
      addList(name, label, value.array(), depth);
    } else {
      addLine(name, label, inLine(value, extent_), depth, false);
    }
  }

  static std::string sizeOf(std::size_t count, std::string_view one, std::string_view many) {
    return fmt::format("{} {}", count, count == 1 ? one : many);
  }

  static bool holdsNumbers(const Array& array) {
    return std::all_of(array.begin(), array.end(), [](const Value& v) { return v.isNumber(); });
  }

  // One element a line.
  void addList(std::string_view name, std::string_view label, const Array& array,
               std::size_t depth) {
    addLine(name, label, counted(array.size(), "element"), depth, true);
    const std::size_t shown =
        extent_ == Extent::whole ? array.size() : std::min(array.size(), shownElements);
    for (std::size_t i = 0; i < shown; ++i)
      addValue(fmt::format("[{}]", i), {}, array[i], depth + 1, true);
    if (shown < array.size())
      addLine("...", {}, fmt::format("{} more", array.size() - shown), depth + 1, true);
  }

  const Style& style_;
  const Extent extent_;
  std::vector<Line> lines_;
};

}  // namespace

void writeTagsAsTable(Sink& sink, const Dictionary& tags, const Style& style, Extent extent) {
  TableWriter table(style, extent);
  table.add(tags, 0, true);
  table.write(sink);
}

}  // namespace oxmv::cli
