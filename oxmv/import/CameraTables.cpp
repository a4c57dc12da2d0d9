#include "oxmv/import/CameraTables.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "oxmv/platform/TomlText.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Dictionary.h"

namespace oxmv {

// Generated: the text of cameras.toml. See CMakeLists.txt.
[[gnu::visibility("hidden")]] extern const std::string_view builtInCameras;

namespace {

using Problem = CameraTablesProblem;

bool isLetter(char c) { return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z'); }
bool isDigit(char c) { return c >= '0' && c <= '9'; }
bool isPrintable(char c) { return c >= 0x20 && c < 0x7F; }

bool isLongPrefix(std::string_view text) {
  return text.size() == CameraTables::longPrefix && isLetter(text[0]) && isLetter(text[1]) &&
         isDigit(text[2]) && text[3] == '.' && isDigit(text[4]) && isDigit(text[5]);
}

// One row, read key by key. The first thing that is wrong with it stays.
class RowReader {
 public:
  RowReader(std::string where, const Value& row) : where_(std::move(where)) {
    if (row.kind() == Value::Kind::dictionary) {
      row_ = row.dictionary();
    } else {
      refuse("is not like {prefix = \"QX1\", name = \"QX Alpha\"}");
    }
  }

  std::string text(std::string_view key) {
    ++keysRead_;
    const Value value = row_[key];
    const std::string text(value.text());
    if (!value.isText() || text.empty()) {
      refuse(std::string(key) + " is missing, or is no text");
    } else if (!std::all_of(text.begin(), text.end(), isPrintable)) {
      refuse(std::string(key) + " has other characters than printable ASCII");
    }
    return text;
  }

  enum class Prefix { shortOne, longOne, either };
  std::string prefix(Prefix wanted) {
    std::string prefix = text("prefix");
    const bool isGood = (wanted != Prefix::longOne && prefix.size() == CameraTables::shortPrefix) ||
                        (wanted != Prefix::shortOne && isLongPrefix(prefix));
    if (!isGood) refuse("prefix \"" + prefix + "\" is " + wantingIn(wanted));
    return prefix;
  }

  // To be asked behind the last key.
  std::optional<Problem> problem() {
    if (row_.size() > keysRead_) refuse("has keys that have no place in it");
    return problem_;
  }

 private:
  static std::string wantingIn(Prefix wanted) {
    switch (wanted) {
      case Prefix::shortOne: return "not of 3 characters";
      case Prefix::longOne: return "not like QX3.01";
      case Prefix::either: return "neither of 3 characters nor like QX3.01";
    }
    return {};  // Not reached: every case is above.
  }

  void refuse(const std::string& what) {
    if (!problem_) problem_ = Problem{where_ + ": " + what};
  }

  std::string where_;
  Dictionary row_;
  std::size_t keysRead_ = 0;
  std::optional<Problem> problem_;
};

using FirmwareRow = CameraTables::FirmwareRow;
using ModelRow = CameraTables::ModelRow;

using Prefix = RowReader::Prefix;

FirmwareRow shortRow(RowReader& row) { return {row.prefix(Prefix::shortOne), row.text("name")}; }
FirmwareRow longRow(RowReader& row) { return {row.prefix(Prefix::longOne), row.text("name")}; }
ModelRow modelRow(RowReader& row) {
  std::string text = row.text("text");
  const std::string prefix = row.prefix(Prefix::either);
  const bool isShort = prefix.size() == CameraTables::shortPrefix;
  return {std::move(text), prefix + (isShort ? ".00.00.00" : ".00.00"), row.text("name")};
}

template <class Row, std::size_t count>
std::optional<Problem> readTable(const Dictionary& document, const std::string& name,
                                 std::array<Row, count>& rows, Row (*read)(RowReader&)) {
  const Array table = document[name].array();
  if (table.size() != count)
    return Problem{name + " has " + std::to_string(table.size()) +
                   (table.size() == 1 ? " row, not " : " rows, not ") + std::to_string(count)};
  for (std::size_t i = 0; i < count; ++i) {
    RowReader row(name + ", row " + std::to_string(i + 1), table[i]);
    rows[i] = read(row);
    if (auto problem = row.problem()) return problem;
  }
  return std::nullopt;
}

}  // namespace

const CameraTables& CameraTables::builtIn() {
  // A test reads the same text: that it holds tables is known before anybody comes here. Never
  // destroyed, for a host may import while the process ends.
  static const auto* const tables =
      new CameraTables(std::get<CameraTables>(fromText(builtInCameras)));
  return *tables;
}

std::variant<CameraTables, CameraTablesProblem> CameraTables::fromText(std::string_view toml) {
  if (toml.size() > maxCameraTablesSize) return Problem{"larger than 64 KiB"};
  TomlProblem mistake;
  const auto text = TomlText::parse(std::string(toml), &mistake);
  if (!text) return Problem{"line " + std::to_string(mistake.line) + ": " + mistake.message};
  const Dictionary& document = text->values();

  CameraTables tables;
  auto problem = readTable(document, "short-prefixes", tables.shortPrefixes_, shortRow);
  if (!problem) problem = readTable(document, "long-prefixes", tables.longPrefixes_, longRow);
  if (!problem) problem = readTable(document, "model-texts", tables.modelTexts_, modelRow);
  if (!problem && document.size() > 3)
    problem = Problem{"something stands beside the three tables"};
  if (problem) return *std::move(problem);
  return tables;
}

}  // namespace oxmv
