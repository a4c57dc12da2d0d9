#include "cli/Csv.h"

#include <algorithm>

#include <fmt/format.h>

#include "cli/Characters.h"
#include "cli/Flags.h"
#include "cli/TagNames.h"
#include "cli/ValueText.h"

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

// A blank in front of a name is the user's way to write a list.
std::string_view withoutLeadingBlanks(std::string_view text) {
  return text.substr(std::min(text.find_first_not_of(' '), text.size()));
}

}  // namespace

std::string csvField(std::string_view text) { return field(visible(text)); }

CsvWriter::CsvWriter(Sink& sink, std::string_view columns) : sink_(sink) {
  std::string line = "file";
  for (bool isLast = false; !isLast;) {
    const std::size_t comma = columns.find(',');
    isLast = comma == std::string_view::npos;
    const std::string_view name = withoutLeadingBlanks(columns.substr(0, comma));
    columns_.push_back(&tagNamed(name));
    line += fmt::format(",{}", field(name));
    columns.remove_prefix(isLast ? columns.size() : comma + 1);
  }
  sink_.write(line + '\n');
}

void CsvWriter::add(std::string_view file, const Dictionary& tags) {
  std::string line = field(visible(file));
  for (const TagRow* column : columns_) {
    const auto characters = charactersOf(column->tag);
    const std::string_view key(characters.data(), characters.size());
    line += fmt::format(",{}", field(bare(tags[key])));
  }
  sink_.write(line + '\n');
}

}  // namespace oxmv::cli
