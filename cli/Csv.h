// Tags of many clips as a table for spreadsheets: comma-separated, one clip a line.

#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "cli/Sink.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Dictionary.h"

namespace oxmv::cli {

// A text as a field: visible, and in quotes where it would end the field.
std::string csvField(std::string_view text);

class CsvWriter {
 public:
  // `columns`: tags or labels, with commas between them. Throws UsageError when one is neither.
  // Writes the first line: "file", and the columns as they were named.
  CsvWriter(Sink& sink, std::string_view columns);

  // A tag that is not there leaves its field empty. Numbers and texts stand bare, lists of numbers
  // with blanks between them, everything else as tag JSON.
  void add(std::string_view file, const Dictionary& tags);

 private:
  Sink& sink_;
  std::vector<const TagRow*> columns_;
};

}  // namespace oxmv::cli
