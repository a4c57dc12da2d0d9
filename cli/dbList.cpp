#include <algorithm>
#include <array>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/Columns.h"
#include "cli/Csv.h"
#include "cli/Database.h"
#include "cli/JsonResults.h"
#include "cli/Progress.h"
#include "cli/TagJson.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/metadata/TagPicker.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

constexpr std::string_view defaultColumns = "REEL,TIMC,DATE,SCEN,SHOT,TAKE,LOOK";

std::vector<Column> columnsOf(const Call& call) {
  return columnsFrom(call.arguments.value(Flag::columns, defaultColumns));
}

// Reads what the columns need of each file, one after the other.
class ColumnReader {
 public:
  ColumnReader(Call& call, Database& database, const std::vector<Column>& columns)
      : call_(call), database_(database) {
    for (const Column& column : columns) tags_.push_back(column.row->tag);
  }

  // The values of a file's columns; they hold until the next file. What keeps it from being read is
  // said already.
  std::variant<std::span<const Value>, FileProblem> read(const DatabaseFile& file) {
    const auto content = database_.read(file);
    if (const auto* problem = std::get_if<FileProblem>(&content)) {
      call_.messages.error(database_.pathOf(file.name.text()), problem->message, problem->code);
      return *problem;
    }
    const auto stream = std::get<std::span<const std::uint8_t>>(content);
    pickTags(stream.size() < shortestData ? stream.first(0) : stream, tags_, values_);
    return values_;
  }

 private:
  Call& call_;
  Database& database_;
  std::vector<Tag> tags_;
  std::vector<Value> values_;
};

// "combined+left+right"
std::string eyesOf(std::span<const DatabaseFile> clip) {
  std::string eyes;
  for (const DatabaseFile& file : clip) {
    if (!eyes.empty()) eyes += '+';
    eyes += eyeText(file.name);
  }
  return eyes;
}

// What is made of the clips, one after the other. `values` are those of the columns; null for a clip
// whose file cannot be read.
class Listing {
 public:
  virtual ~Listing() = default;
  virtual void add(const std::string& guid, const std::string& eyes,
                   const std::span<const Value>* values) = 0;

 protected:
  Listing() = default;
  Listing(const Listing&) = default;
  Listing& operator=(const Listing&) = default;
};

// The widths are known before the first file is read, so each line goes out at once. A value that is
// wider moves the rest of its line.
class Table final : public Listing {
 public:
  Table(Call& call, const Database& database) : call_(call), columns_(columnsOf(call)) {
    for (auto files = database.files(); !files.empty();) {
      const auto clip = Database::firstClip(files);
      eyesWidth_ = std::max(eyesWidth_, eyesOf(clip).size());
      files = files.subspan(clip.size());
    }
    std::string line = fmt::format("{:<36}  {:<{}}", "GUID", "EYES", eyesWidth_);
    for (const Column& column : columns_)
      line += fmt::format("  {:<{}}", column.key, widthOf(column));
    writeLine(line, true);
  }

  void add(const std::string& guid, const std::string& eyes,
           const std::span<const Value>* values) override {
    std::string line = fmt::format("{}  {:<{}}", guid, eyes, eyesWidth_);
    if (values == nullptr) return writeLine(line + "  (not read)", false);
    for (std::size_t i = 0; i < columns_.size(); ++i) {
      const Value& value = (*values)[i];
      const std::string text = value.isNothing() ? "-" : inLine(value, Extent::abbreviated);
      const std::size_t missing =
          widthOf(columns_[i]) - std::min(widthOf(columns_[i]), columns(text));
      line.append("  ").append(text).append(missing, ' ');
    }
    writeLine(line, false);
  }

 private:
  static std::size_t widthOf(const Column& column) {
    const Read rule = column.row->read;
    return rule == Read::uint8 || rule == Read::uint16 ? 5 : 12;
  }

  void writeLine(std::string& line, bool isHeading) {
    line.resize(line.find_last_not_of(' ') + 1);
    call_.output.write((isHeading ? call_.style.faint(line) : line) + '\n');
  }
  void writeLine(std::string&& line, bool isHeading) { writeLine(line, isHeading); }

  Call& call_;
  const std::vector<Column> columns_;
  std::size_t eyesWidth_ = 4;
};

class Csv final : public Listing {
 public:
  explicit Csv(Call& call) : csv_(call.output, {"guid", "eyes"}, columnsOf(call)) {}

  void add(const std::string& guid, const std::string& eyes,
           const std::span<const Value>* values) override {
    const std::vector<Value> none(csv_.columns().size());
    csv_.add({guid, eyes}, values != nullptr ? *values : none);
  }

 private:
  CsvWriter csv_;
};

// One line a clip: what its combined file holds, or else that of its first eye.
void listClips(Call& call, Database& database, Listing& listing) {
  ColumnReader reader(call, database, columnsOf(call));
  Progress progress(call, database.files().size(), "files");
  std::size_t count = 0;
  for (auto files = database.files(); !files.empty(); ++count) {
    const auto clip = Database::firstClip(files);
    for (std::size_t i = 0; i < clip.size(); ++i) progress.advance();
    const auto read = reader.read(clip.front());
    listing.add(guidText(clip.front().name.guid), eyesOf(clip),
                std::get_if<std::span<const Value>>(&read));
    files = files.subspan(clip.size());
  }
  call.messages.note(database.path(), fmt::format("{}, {}", counted(count, "clip"),
                                                  counted(database.files().size(), "file")));
}

void writeResult(JsonResults& results, const Database& database, const DatabaseFile& file,
                 const std::vector<Column>& columns,
                 const std::variant<std::span<const Value>, FileProblem>& read) {
  results.add([&](JsonWriter& json) {
    json.beginObject();
    json.member("schema", "oxmv.clip/1");
    json.member("guid", guidText(file.name.guid));
    json.member("eye", eyeText(file.name));
    json.member("file", database.pathOf(file.name.text()));
    json.key("tags");
    const auto* values = std::get_if<std::span<const Value>>(&read);
    if (values == nullptr) {
      json.null();
    } else {
      json.beginObject();
      for (std::size_t i = 0; i < columns.size(); ++i) {
        if ((*values)[i].isNothing()) continue;
        json.key(columns[i].key);
        writeTagJson(json, (*values)[i]);
      }
      json.endObject();
    }
    endResult(json, std::get_if<FileProblem>(&read));
  });
}

// One object a file.
void listFiles(Call& call, Database& database) {
  const std::vector<Column> columns = columnsOf(call);
  ColumnReader reader(call, database, columns);
  JsonResults results(call);
  Progress progress(call, database.files().size(), "files");
  for (const DatabaseFile& file : database.files()) {
    progress.advance();
    writeResult(results, database, file, columns, reader.read(file));
  }
  results.finish();
}

void run(Call& call) {
  columnsOf(call);  // refuses bad columns before anything is read
  auto database = Database::open(call);
  if (!database) {
    if (wantsJson(call)) JsonResults(call).finish();
    return;
  }
  if (wantsJson(call)) return listFiles(call, *database);
  if (call.arguments.has(Flag::csv)) {
    Csv csv(call);
    return listClips(call, *database, csv);
  }
  Table table(call, *database);
  listClips(call, *database, table);
}

constexpr auto flags =
    std::to_array({Flag::json, Flag::ndjson, Flag::csv, Flag::columns, Flag::noProgress});

}  // namespace

const Verb dbListVerb = {
    .name = "db list",
    .words = "",
    .summary = "list the clips of the database",
    .examples =
        "oxmv db list\n"
        "oxmv db list --csv --columns REEL,TIMC,\"White balance\" > clips.csv\n"
        "oxmv db list --ndjson --db /mnt/clips | jq -r 'select(.tags.REEL == \"A001\").file'\n",
    .details =
        "One line for each clip, ordered by GUID: which files it has, and tags of its combined\n"
        "file, or else of its first eye. JSON has an object for each file. Without --columns\n"
        "the tags are REEL, TIMC, DATE, SCEN, SHOT, TAKE and LOOK; oxmv db show has them all.\n"
        "A clip that cannot be read is named, and the others are listed.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = 0,
    .run = run,
};

}  // namespace oxmv::cli
