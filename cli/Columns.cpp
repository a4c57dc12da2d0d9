#include "cli/Columns.h"

#include <algorithm>

#include "cli/TagNames.h"

namespace oxmv::cli {
namespace {

// A blank in front of a name is the user's way to write a list.
std::string_view withoutLeadingBlanks(std::string_view text) {
  return text.substr(std::min(text.find_first_not_of(' '), text.size()));
}

}  // namespace

std::vector<Column> columnsFrom(std::string_view list) {
  std::vector<Column> columns;
  for (bool isLast = false; !isLast;) {
    const std::size_t comma = list.find(',');
    isLast = comma == std::string_view::npos;
    const std::string_view name = withoutLeadingBlanks(list.substr(0, comma));
    const TagRow& row = tagNamed(name);
    const auto characters = charactersOf(row.tag);
    columns.push_back({&row, {characters.data(), characters.size()}, std::string(name)});
    list.remove_prefix(isLast ? list.size() : comma + 1);
  }
  return columns;
}

std::vector<Value> valuesOf(const std::vector<Column>& columns, const Dictionary& tags) {
  std::vector<Value> values;
  for (const Column& column : columns) values.push_back(tags[column.key]);
  return values;
}

}  // namespace oxmv::cli
