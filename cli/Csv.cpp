#include "cli/Csv.h"

#include <string>
#include <utility>

#include "cli/ValueText.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

// In quotes where the text would end the field, or lose the blanks at its ends.
std::string field(std::string_view text) {
  const bool needsQuotes = text.find_first_of(",\"") != std::string_view::npos ||
                           text.starts_with(' ') || text.ends_with(' ');
  if (!needsQuotes) return std::string(text);
  std::string quoted = "\"";
  for (const char c : text) {
    if (c == '"') quoted += '"';
    quoted += c;
  }
  return quoted + '"';
}

// Each with a comma behind it.
std::string fields(std::initializer_list<std::string_view> texts) {
  std::string line;
  for (const std::string_view text : texts) line += field(visible(text)) + ',';
  return line;
}

void endLine(std::string& line) {
  line.back() = '\n';  // in place of the last comma
}

}  // namespace

std::string csvField(std::string_view text) { return field(visible(text)); }

CsvWriter::CsvWriter(Sink& to, std::initializer_list<std::string_view> leading,
                     std::vector<Column> columns)
    : columns_(std::move(columns)) {
  std::string line = fields(leading);
  for (const Column& column : columns_) line += field(column.name) + ',';
  endLine(line);
  to.write(line);
}

void CsvWriter::add(Sink& to, std::initializer_list<std::string_view> leading,
                    std::span<const Value> values) const {
  std::string line = fields(leading);
  for (const Value& value : values) line += field(bare(value)) + ',';
  endLine(line);
  to.write(line);
}

}  // namespace oxmv::cli
