#include <algorithm>
#include <array>
#include <cstdint>
#include <filesystem>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include <fmt/format.h>

#include "cli/Csv.h"
#include "cli/Inputs.h"
#include "cli/JsonResults.h"
#include "cli/LookFolder.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/looks/LookFileRef.h"
#include "oxmv/looks/LookTableFile.h"
#include "oxmv/platform/WholeFile.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

namespace fs = std::filesystem;

// One look-table file.
struct Row {
  std::string file;
  std::optional<LookFileRef> look;      // nothing if it is none
  std::optional<std::uint32_t> points;  // nothing for files that have no header of ours
  std::string source;                   // the description beside it; empty: none
  std::optional<FileProblem> problem;
};

struct Contents {
  std::vector<std::string> tables;             // in the order of their names
  std::map<std::string, std::string> sources;  // descriptions by the names of their looks
};

// Answers what is there, as far as the folder can be read.
Contents contentsOf(const std::string& folder, std::error_code& error) {
  Contents contents;
  std::vector<std::string> others;
  auto entry = fs::directory_iterator(folder, error);
  for (; !error && entry != fs::directory_iterator(); entry.increment(error)) {
    const fs::path& path = entry->path();
    (path.extension() == ".oxlook" ? contents.tables : others).push_back(path.filename().string());
  }
  std::sort(contents.tables.begin(), contents.tables.end());
  std::sort(others.begin(), others.end());
  for (const std::string& other : others)
    contents.sources.emplace(cutDisplayName(withoutExtension(other)), other);
  return contents;
}

Row rowOf(const std::string& folder, const std::string& file) {
  Row row;
  row.file = file;
  const fs::path path = fs::path(folder) / file;
  std::error_code error;
  const auto start = readFileStart(path, lookHeaderSize, error);
  if (!start) {
    row.problem = problemOf(error);
    return row;
  }
  row.look = LookFileRef::initFromPath(path);
  if (!row.look) {
    row.problem = FileProblem{"bad-name", "its name does not begin with a CRC: no look"};
    return row;
  }
  if (const auto header = loadLookHeader(*start)) row.points = header->lutSize;
  if (!row.look->displayName())
    row.problem =
        FileProblem{"name-not-ascii", "the name in it is not ASCII: a look without a name"};
  return row;
}

// The names of a menu: hosts put numbers behind those that are there already.
class Menu {
 public:
  void add(LookFileRef& look) {
    const auto name = look.displayName();
    if (!name) return;  // equal to every other, whatever the number
    // A number that was taken once stays taken.
    int& number = next_[*name];
    while (!looks_.insert(look).second) look.makeNameUnique(++number);
  }

 private:
  struct Order {
    bool operator()(const LookFileRef& one, const LookFileRef& other) const {
      return one.lookNameCompare(other) < 0;
    }
  };
  std::set<LookFileRef, Order> looks_;
  std::map<std::string, int> next_;
};

std::vector<Row> rowsOf(Call& call, const std::string& folder, const Contents& contents) {
  std::vector<Row> rows;
  Menu menu;
  for (const std::string& file : contents.tables) {
    Row row = rowOf(folder, file);
    if (row.problem)
      call.messages.error((fs::path(folder) / file).string(), row.problem->message,
                          row.problem->code);
    if (row.look) {
      const auto source = contents.sources.find(row.look->displayName().value_or(""));
      if (source != contents.sources.end()) row.source = source->second;
      menu.add(*row.look);
    }
    rows.push_back(std::move(row));
  }
  return rows;
}

// What a table shows of a row: CRC, version, points, name, source.
std::array<std::string, 5> cellsOf(const Row& row) {
  if (!row.look) return {};
  return {fmt::format("{:08X}", row.look->CRC()), fmt::format("{}", row.look->version()),
          row.points ? fmt::format("{}", *row.points) : "", row.look->displayName().value_or(""),
          row.source};
}

void writeTable(Call& call, const std::vector<Row>& rows) {
  std::vector<std::array<std::string, 5>> lines = {{"CRC", "VERSION", "POINTS", "NAME", "SOURCE"}};
  for (const Row& row : rows) {
    if (!row.look) continue;
    lines.push_back(cellsOf(row));
    for (std::string& cell : lines.back()) cell = cell.empty() ? "-" : visible(cell);
  }
  std::array<std::size_t, 5> widths = {};
  for (const auto& line : lines) {
    for (std::size_t i = 0; i < line.size(); ++i) widths[i] = std::max(widths[i], columns(line[i]));
  }
  if (lines.size() == 1) return;
  for (std::size_t row = 0; row < lines.size(); ++row) {
    std::string text;
    for (std::size_t i = 0; i < widths.size(); ++i) {
      const std::string& cell = lines[row][i];
      const bool isLast = i + 1 == widths.size();
      text += cell;
      if (!isLast) text.append(widths[i] - columns(cell) + 2, ' ');
    }
    call.output.write((row == 0 ? call.style.faint(text) : text) + '\n');
  }
}

void writeCsv(Call& call, const std::vector<Row>& rows) {
  call.output.write("file,crc,version,points,name,source\n");
  for (const Row& row : rows) {
    std::string line = csvField(row.file);
    for (const std::string& cell : cellsOf(row)) line += ',' + csvField(cell);
    call.output.write(line + '\n');
  }
}

void writeJson(Call& call, const std::vector<Row>& rows) {
  JsonResults results(call);
  for (const Row& row : rows) {
    results.add([&](JsonWriter& json) {
      const auto name = row.look ? row.look->displayName() : std::nullopt;
      beginResult(json, "oxmv.look/1", row.file);
      json.key("crc");
      row.look ? json.text(fmt::format("{:08X}", row.look->CRC())) : json.null();
      json.key("version");
      row.look ? json.integer(row.look->version()) : json.null();
      json.key("size");
      row.points ? json.integer(*row.points) : json.null();
      json.key("name");
      name ? json.text(*name) : json.null();
      endResult(json, row.problem ? &*row.problem : nullptr);
    });
  }
  results.finish();
}

void run(Call& call) {
  const std::string folder = lookTableFolder();
  Contents contents;
  if (const auto problem = problemOfLookFolder(folder)) {
    call.messages.error(folder, problem->message, problem->code);
  } else {
    std::error_code error;
    contents = contentsOf(folder, error);
    if (error) call.messages.error(folder, error.message(), "unreadable");
  }
  const std::vector<Row> rows = rowsOf(call, folder, contents);
  if (wantsJson(call)) {
    writeJson(call, rows);
  } else if (call.arguments.has(Flag::csv)) {
    writeCsv(call, rows);
  } else {
    writeTable(call, rows);
  }
  call.messages.note(folder, counted(rows.size(), "look-table file"));
}

constexpr auto flags = std::to_array({Flag::json, Flag::ndjson, Flag::csv});

}  // namespace

const Verb lookListVerb = {
    .name = "look list",
    .words = "",
    .summary = "list the looks in the look-table folder",
    .examples =
        "oxmv look list\n"
        "oxmv look list --looks looks\n"
        "oxmv look list --csv > looks.csv\n"
        "oxmv look list --json | jq -r '.[] | .crc + \" \" + .name'\n",
    .details =
        "One line for each look-table file, ordered by file name: the CRC in that name, the\n"
        "version of the file, its points per axis, the name of the look, and the description\n"
        "beside it that it was made of, if that is there. Names that are there already get a\n"
        "number behind them, as in the menus of hosts. Files that cannot be read, whose names\n"
        "hold no CRC or that have a name that is not ASCII are errors, and the others are listed.\n"
        "--csv has a table with a column for the file name, too.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = 0,
    .run = run,
};

}  // namespace oxmv::cli
