#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/Columns.h"
#include "cli/Csv.h"
#include "cli/Database.h"
#include "cli/InBatches.h"
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

// The values of a file's columns, or why there are none.
using Picked = std::variant<std::span<const Value>, FileProblem>;

// Reads what the columns need of each file, one after the other.
class ColumnReader {
 public:
  ColumnReader(const Database& database, const std::vector<Column>& columns) : database_(database) {
    for (const Column& column : columns) tags_.push_back(column.row->tag);
  }

  // The values hold until the next file.
  Picked read(const DatabaseFile& file) {
    const auto content = database_.read(file, buffer_);
    if (const auto* problem = std::get_if<FileProblem>(&content)) return *problem;
    const auto stream = std::get<std::span<const std::uint8_t>>(content);
    pickTags(stream.size() < shortestData ? stream.first(0) : stream, tags_, values_);
    return values_;
  }

 private:
  const Database& database_;
  std::vector<Tag> tags_;
  std::vector<Value> values_;
  std::vector<std::uint8_t> buffer_;
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

// What is made of the clips. Several threads write their parts, and the parts are put together.
class Listing {
 public:
  virtual ~Listing() = default;
  // Writes one item: those files, of which the first was read.
  virtual void write(Sink& to, std::span<const DatabaseFile> files, const Picked& picked) const = 0;
  // What was written of an item goes out.
  virtual void put(std::string_view item) = 0;
  // Some items are out, and it may take a while until the next.
  virtual void pause() {}

 protected:
  Listing() = default;
  Listing(const Listing&) = default;
  Listing& operator=(const Listing&) = default;
};

// The widths are known before the first file is read, so lines go out as they come. A value that is
// wider moves the rest of its line.
class Table final : public Listing {
 public:
  Table(Call& call, const std::vector<Column>& columns,
        std::span<const std::span<const DatabaseFile>> clips)
      : output_(call.output), columns_(columns) {
    for (const auto& clip : clips) eyesWidth_ = std::max(eyesWidth_, eyesOf(clip).size());
    std::string line = fmt::format("{:<36}  {:<{}}", "GUID", "EYES", eyesWidth_);
    for (const Column& column : columns_)
      line += fmt::format("  {:<{}}", column.key, widthOf(column));
    endLine(line);
    output_.write(call.style.faint(line) + '\n');
  }

  void write(Sink& to, std::span<const DatabaseFile> files, const Picked& picked) const override {
    std::string line;
    line.reserve(ordinaryLine);
    line += guidText(files.front().name.guid);
    addCell(line, eyesOf(files), eyesWidth_);
    if (const auto* values = std::get_if<std::span<const Value>>(&picked)) {
      for (std::size_t i = 0; i < columns_.size(); ++i) {
        const Value& value = (*values)[i];
        addCell(line, value.isNothing() ? "-" : inLine(value, Extent::abbreviated),
                widthOf(columns_[i]));
      }
    } else {
      line += "  (not read)";
    }
    endLine(line);
    to.write(line += '\n');
  }

  void put(std::string_view item) override { output_.write(item); }

 private:
  static constexpr std::size_t ordinaryLine = 160;

  static std::size_t widthOf(const Column& column) {
    const Read rule = column.row->read;
    return rule == Read::uint8 || rule == Read::uint16 ? 5 : 12;
  }

  static void addCell(std::string& line, const std::string& text, std::size_t width) {
    const std::size_t missing = width - std::min(width, columns(text));
    line.append("  ").append(text).append(missing, ' ');
  }

  static void endLine(std::string& line) { line.resize(line.find_last_not_of(' ') + 1); }

  Sink& output_;
  const std::vector<Column>& columns_;
  std::size_t eyesWidth_ = 4;
};

class Csv final : public Listing {
 public:
  Csv(Call& call, const std::vector<Column>& columns)
      : output_(call.output), csv_(call.output, {"guid", "eyes"}, columns) {}

  void write(Sink& to, std::span<const DatabaseFile> files, const Picked& picked) const override {
    const auto* values = std::get_if<std::span<const Value>>(&picked);
    const std::vector<Value> none(csv_.columns().size());
    csv_.add(to, {guidText(files.front().name.guid), eyesOf(files)},
             values != nullptr ? *values : none);
  }

  void put(std::string_view item) override { output_.write(item); }

 private:
  Sink& output_;
  const CsvWriter csv_;
};

class Json final : public Listing {
 public:
  Json(JsonResults& results, const Database& database, const std::vector<Column>& columns)
      : results_(results), database_(database), columns_(columns) {}

  void write(Sink& to, std::span<const DatabaseFile> files, const Picked& picked) const override {
    const ClipFileName& name = files.front().name;
    JsonWriter json(to);
    json.beginObject();
    json.member("schema", "oxmv.clip/1");
    json.member("guid", guidText(name.guid));
    json.member("eye", eyeText(name));
    json.member("file", database_.pathOf(name.text()));
    json.key("tags");
    if (const auto* values = std::get_if<std::span<const Value>>(&picked)) {
      json.beginObject();
      for (std::size_t i = 0; i < columns_.size(); ++i) {
        if ((*values)[i].isNothing()) continue;
        json.key(columns_[i].key);
        writeTagJson(json, (*values)[i]);
      }
      json.endObject();
    } else {
      json.null();
    }
    endResult(json, std::get_if<FileProblem>(&picked));
  }

  void put(std::string_view item) override { results_.add(item); }
  void pause() override { results_.flush(); }

 private:
  JsonResults& results_;
  const Database& database_;
  const std::vector<Column>& columns_;
};

// Some items as they were written, one after the other.
struct Batch {
  struct Item {
    std::size_t end;  // in the text
    std::optional<FileProblem> problem;
  };
  StringSink written;
  std::vector<Item> items;
};

// Reads the first file of each item.
void list(Call& call, const Database& database, const std::vector<Column>& columns,
          std::span<const std::span<const DatabaseFile>> items, Listing& listing) {
  Progress progress(call, database.files().size(), "files");
  const auto make = [&](ColumnReader& reader, std::size_t first, std::size_t last) {
    Batch batch;
    for (const auto& files : items.subspan(first, last - first)) {
      const Picked picked = reader.read(files.front());
      listing.write(batch.written, files, picked);
      const auto* problem = std::get_if<FileProblem>(&picked);
      batch.items.push_back(
          {batch.written.text.size(), problem != nullptr ? std::optional(*problem) : std::nullopt});
    }
    return batch;
  };
  auto next = items.begin();
  const auto take = [&](const Batch& batch) {
    std::size_t start = 0;
    for (const auto& [end, problem] : batch.items) {
      const auto& files = *next++;
      for (std::size_t i = 0; i < files.size(); ++i) progress.advance();
      if (problem)
        call.messages.error(database.pathOf(files.front().name.text()), problem->message,
                            problem->code);
      listing.put(std::string_view(batch.written.text).substr(start, end - start));
      start = end;
    }
    listing.pause();
  };
  const ColumnReader reader(database, columns);
  inBatches(items.size(), std::array{reader, reader}, make, take);
}

// One line a clip: what its combined file holds, or else that of its first eye.
void listClips(Call& call, const Database& database, const std::vector<Column>& columns) {
  const auto clips = database.clips();
  if (call.arguments.has(Flag::csv)) {
    Csv csv(call, columns);
    list(call, database, columns, clips, csv);
  } else {
    Table table(call, columns, clips);
    list(call, database, columns, clips, table);
  }
  call.messages.note(database.path(), fmt::format("{}, {}", counted(clips.size(), "clip"),
                                                  counted(database.files().size(), "file")));
}

// One object a file.
void listFiles(Call& call, const Database& database, const std::vector<Column>& columns) {
  std::vector<std::span<const DatabaseFile>> files;
  for (const DatabaseFile& file : database.files()) files.emplace_back(&file, 1);
  JsonResults results(call);
  Json json(results, database, columns);
  list(call, database, columns, files, json);
  results.finish();
}

void run(Call& call) {
  const std::vector<Column> columns = columnsOf(call);  // refuses bad ones before anything is read
  const auto database = Database::open(call);
  if (!database) {
    if (wantsJson(call)) JsonResults(call).finish();
    return;
  }
  if (wantsJson(call)) return listFiles(call, *database, columns);
  listClips(call, *database, columns);
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
