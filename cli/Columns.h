// The columns of tables: tags that the user chose.

#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/Value.h"

namespace oxmv::cli {

struct Column {
  const TagRow* row;
  std::string key;   // of dictionaries: the tag's four characters
  std::string name;  // as the user wrote it
};

// `list`: tags or labels, with commas between them. Throws UsageError, with the nearest tags in it,
// when one is neither.
std::vector<Column> columnsFrom(std::string_view list);

// Their values, one a column; nothing for a tag that is not there.
std::vector<Value> valuesOf(const std::vector<Column>& columns, const Dictionary& tags);

}  // namespace oxmv::cli
