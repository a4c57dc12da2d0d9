// Tags of many clips as a table for spreadsheets: comma-separated, one clip a line.

#pragma once

#include <initializer_list>
#include <span>
#include <string_view>
#include <vector>

#include "cli/Columns.h"
#include "cli/Sink.h"
#include "oxmv/values/Value.h"

namespace oxmv::cli {

// A text as a field: visible, and in quotes where it would end the field.
std::string csvField(std::string_view text);

class CsvWriter {
 public:
  // Writes the first line: what `leading` calls the fields before the tags, and the columns as they
  // were named.
  CsvWriter(Sink& to, std::initializer_list<std::string_view> leading, std::vector<Column> columns);

  // `leading` are the fields before the tags, `values` those of the columns. Nothing leaves its
  // field empty. Numbers and texts stand bare, lists of numbers with blanks between them,
  // everything else as tag JSON.
  void add(Sink& to, std::initializer_list<std::string_view> leading,
           std::span<const Value> values) const;

  const std::vector<Column>& columns() const { return columns_; }

 private:
  std::vector<Column> columns_;
};

}  // namespace oxmv::cli
