#include <algorithm>
#include <array>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include <fmt/format.h>

#include "cli/Clips.h"
#include "cli/Findings.h"
#include "cli/JsonResults.h"
#include "cli/TagJson.h"
#include "cli/TagNames.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/values/Text.h"

namespace oxmv::cli {
namespace {

constexpr std::string_view schema = "oxmv.dump/1";

// A record and what became of it.
struct Telling {
  Record record;
  std::size_t length = 0;      // bytes that it takes of its stream, padding included
  std::optional<Value> value;  // none when it was not read, or holds a stream
  std::string remark;          // may be empty
  bool isOdd = false;          // the remark is on something that should not be so
};

// What the decoder met, in the order in which it stands in the file. The records of a nested stream
// come behind the one that holds it. Within one stream the lengths of the records, of the markers
// and of what was not read add up to all its bytes.
class Report {
 public:
  virtual ~Report() = default;
  virtual void addRecord(const Telling& telling) = 0;
  virtual void addMarker(std::size_t offset, std::uint32_t bytes, int level) = 0;
  virtual void addUnread(const Finding& stop) = 0;
  // `remark` is on the file; may be empty.
  virtual void finish(const std::string& remark) = 0;

 protected:
  Report() = default;
  Report(const Report&) = default;
  Report& operator=(const Report&) = default;
};

// Listens to a decoding that was listened to before: some remarks on a record come from what stands
// behind it. So the report can go out as it is made, however long it gets.
class Reporter final : public StreamObserver {
 public:
  Reporter(Report& report, std::span<const Finding> findings)
      : report_(report), findings_(findings) {}

  void onRecord(const Record& record) override {
    flush();
    telling_.emplace().record = record;
    ++records_;
  }
  void onValue(const Record&, const Value& value) override { telling_->value = value; }
  void onMarker(std::size_t offset, std::uint32_t bytes, int level) override {
    flush(offset);
    report_.addMarker(offset, bytes, level);
  }
  void finish() {
    flush();
    report_.finish(remark_);
  }

 private:
  // Reports what stands before the place that the decoder has come to.
  void flush(std::size_t place = static_cast<std::size_t>(-1)) {
    if (telling_) finishRecord(*telling_);
    telling_.reset();
    for (; !findings_.empty() && findings_[0].order <= 2 * records_; drop()) {
      if (findings_[0].offset > place) break;
      if (findings_[0].oddity == Oddity::stopped) {
        report_.addUnread(findings_[0]);
      } else {
        remark_ = describe(findings_[0]);
      }
    }
  }

  void finishRecord(Telling& telling) {
    const Record& record = telling.record;
    telling.length = record.length;
    const bool isCut = record.payload.size() < record.size;
    if (isCut) telling.length = std::min(telling.length, recordHeaderSize + record.payload.size());
    if (record.offset < zerosEnd_) remarkOn(telling, "zeros: ignored");
    for (; !findings_.empty() && findings_[0].order < 2 * records_; drop())
      remarkOn(telling, findings_[0]);
    report_.addRecord(telling);
  }

  static void remarkOn(Telling& telling, std::string_view remark) {
    if (!telling.remark.empty()) telling.remark += "; ";
    telling.remark += remark;
    telling.isOdd = true;
  }

  void remarkOn(Telling& telling, const Finding& finding) {
    remarkOn(telling, describe(finding));
    if (finding.oddity == Oddity::terminator) telling.isOdd = false;
    if (finding.oddity == Oddity::paddingMissing) telling.length -= finding.count;
    // The walk ended in this record: the rest of the stream is taken for it.
    if (finding.oddity == Oddity::stopped) telling.length = finding.count;
    if (finding.oddity == Oddity::zeros) zerosEnd_ = finding.offset + finding.count;
  }

  void drop() { findings_ = findings_.subspan(1); }

  Report& report_;
  std::span<const Finding> findings_;  // those still to come
  std::uint32_t records_ = 0;
  std::optional<Telling> telling_;
  std::size_t zerosEnd_ = 0;
  std::string remark_;
};

// Always four columns: what cannot be seen is a point.
std::string tagInColumn(Tag tag) {
  std::string letters;
  for (const char c : charactersOf(tag)) letters += c >= ' ' && c < 0x7F ? c : '.';
  return letters;
}

// The type as a character, or in two hexadecimal digits where it is none that can be seen.
std::string visibleType(std::uint8_t type) {
  if (type > ' ' && type < 0x7F) return {static_cast<char>(type)};
  return fmt::format("{:02X}", type);
}

class TextReport final : public Report {
 public:
  TextReport(Call& call, const ClipStream& stream, int deepest)
      : output_(call.output),
        style_(call.style),
        extent_(call.arguments.has(Flag::verbose) ? Extent::whole : Extent::abbreviated),
        bytes_(stream.bytes.size()),
        offsetWidth_(std::max<std::size_t>(6, fmt::format("{}", bytes_).size())),
        tagWidth_(4 + 2 * static_cast<std::size_t>(std::min(deepest, 8))) {
    if (stream.head > 0)
      writeLine(fmt::format("{} before the stream: clip GUID {}", counted(stream.head, "byte"),
                            guidText(stream.guid)));
    writeLine(style_.faint(fmt::format("{:>{}}  {:<{}}  {:>8}  TYPE  {:<14}  VALUE", "OFFSET",
                                       offsetWidth_, "TAG", tagWidth_, "SIZE", "READ AS")));
  }

  void addRecord(const Telling& telling) override {
    const Record& record = telling.record;
    ++records_;
    const std::string tag = indent(record.level) + tagInColumn(record.tag);
    const std::string value = telling.value ? inLine(*telling.value, extent_) : std::string();
    std::string line = fmt::format(
        "{:>{}}  {}{:<{}}  {:>8}  {:<4}  {:<14}  {}", record.offset, offsetWidth_, style_.tag(tag),
        "", tagWidth_ - std::min(tagWidth_, tag.size()), record.size, visibleType(record.type),
        record.row == nullptr ? "-" : readsAs(*record.row), value);
    if (!value.empty() && !telling.remark.empty()) line += "  ";
    line += telling.isOdd ? style_.warning("! " + telling.remark) : style_.faint(telling.remark);
    writeLine(line);
  }

  void addMarker(std::size_t offset, std::uint32_t bytes, int level) override {
    writeLine(fmt::format("{:>{}}  {}marker: {} more", offset, offsetWidth_, indent(level),
                          counted(bytes, "byte")));
  }

  void addUnread(const Finding& stop) override {
    if (stop.level == 0) unread_ = stop.count;
    writeLine(fmt::format("{:>{}}  {}{}", stop.offset, offsetWidth_, indent(stop.level),
                          style_.warning(fmt::format(
                              "! {} not read: {}", counted(stop.count, "byte"), describe(stop)))));
  }

  void finish(const std::string& remark) override {
    if (!remark.empty()) writeLine(style_.warning("! " + remark));
    writeLine(fmt::format("{}, {}, {} not read", counted(records_, "record"),
                          counted(bytes_, "byte"), unread_));
  }

 private:
  static std::string indent(int level) {
    return std::string(2 * static_cast<std::size_t>(level), ' ');
  }

  void writeLine(std::string line) {
    line.resize(line.find_last_not_of(' ') + 1);
    output_.write(line + '\n');
  }

  StandardOutput& output_;
  const Style& style_;
  const Extent extent_;
  const std::size_t bytes_;
  const std::size_t offsetWidth_;
  const std::size_t tagWidth_;
  std::size_t records_ = 0;
  std::size_t unread_ = 0;
};

class JsonReport final : public Report {
 public:
  JsonReport(Call& call, const std::string& file, const ClipStream& stream)
      : output_(call.output), json_(call.output) {
    beginResult(json_, schema, file);
    json_.member("bytes", stream.bytes.size());
    if (stream.head > 0) {
      json_.member("head", stream.head);
      json_.member("guid", guidText(stream.guid));
    }
    json_.key("records");
    json_.beginArray();
  }

  void addRecord(const Telling& telling) override {
    const Record& record = telling.record;
    output_.write("\n ");
    json_.beginObject();
    json_.member("offset", record.offset);
    json_.member("tag", tagInJson(record.tag));
    json_.member("size", std::size_t{record.size});
    json_.member("type", utf8FromLatin1(std::string(1, static_cast<char>(record.type))));
    json_.member("length", telling.length);
    json_.member("level", static_cast<std::size_t>(record.level));
    json_.member("reads",
                 record.row == nullptr ? std::nullopt : std::optional(readsAs(*record.row)));
    json_.key("value");
    writeTagJson(json_, telling.value.value_or(Value()));
    json_.member("remark", telling.remark.empty() ? std::nullopt : std::optional(telling.remark));
    json_.endObject();
  }

  void addMarker(std::size_t offset, std::uint32_t bytes, int level) override {
    markers_.push_back({offset, bytes, level});
  }

  void addUnread(const Finding& stop) override { stops_.push_back(stop); }

  void finish(const std::string& remark) override {
    json_.endArray();
    writeMarkers();
    std::size_t trailing = 0;
    for (const Finding& stop : stops_) trailing += stop.level == 0 ? stop.count : 0;
    writeStops();
    json_.member("trailing", trailing);
    json_.member("remark", remark.empty() ? std::nullopt : std::optional(remark));
    endResult(json_, nullptr);
    output_.write("\n");
  }

 private:
  struct Marker {
    std::size_t offset;
    std::uint32_t bytes;
    int level;
  };

  void writeMarkers() {
    json_.key("markers");
    json_.beginArray();
    for (const Marker& marker : markers_) {
      json_.beginObject();
      json_.member("offset", marker.offset);
      json_.member("length", markerSize);
      json_.member("level", static_cast<std::size_t>(marker.level));
      json_.member("more", std::size_t{marker.bytes});
      json_.endObject();
    }
    json_.endArray();
  }

  void writeStops() {
    json_.key("unread");
    json_.beginArray();
    for (const Finding& stop : stops_) {
      json_.beginObject();
      json_.member("offset", std::size_t{stop.offset});
      json_.member("length", std::size_t{stop.count});
      json_.member("level", std::size_t{stop.level});
      json_.member("code", codeOf(stop));
      json_.member("message", describe(stop));
      json_.endObject();
    }
    json_.endArray();
  }

  StandardOutput& output_;
  JsonWriter json_;
  std::vector<Marker> markers_;
  std::vector<Finding> stops_;
};

void decode(const Bytes& bytes, StreamObserver& observer) {
  decodeStream(bytes, static_cast<std::int32_t>(bytes.size()), nullptr, &observer);
}

void report(const Bytes& bytes, std::span<const Finding> findings, Report& report) {
  Reporter reporter(report, findings);
  decode(bytes, reporter);
  reporter.finish();
}

void reportProblem(Call& call, const std::string& name, const FileProblem& problem) {
  call.messages.error(name, problem.message, problem.code);
  if (!wantsJson(call)) return;
  JsonWriter json(call.output);
  beginResult(json, schema, name);
  for (const char* member : {"bytes", "records", "markers", "unread", "trailing", "remark"})
    json.member(member, std::nullopt);
  endResult(json, &problem);
  call.output.write("\n");
}

void run(Call& call) {
  const ClipName name = clipNameFrom(call.words.front());
  const auto read = readStream(name);
  if (const auto* problem = std::get_if<FileProblem>(&read))
    return reportProblem(call, name.word, *problem);
  const ClipStream& stream = std::get<ClipStream>(read);
  const Bytes& bytes = stream.bytes;
  FindingCollector collector(bytes);
  decode(bytes, collector);
  std::vector<Finding> findings = collector.finish();
  if (stream.head > 0)  // no stream is too short behind a head
    std::erase_if(findings, [](const Finding& one) { return one.oddity == Oddity::tooShort; });
  if (wantsJson(call)) {
    JsonReport json(call, name.word, stream);
    report(bytes, findings, json);
  } else {
    TextReport text(call, stream, collector.deepest());
    report(bytes, findings, text);
  }
}

constexpr auto flags = std::to_array({Flag::json});

}  // namespace

const Verb dumpVerb = {
    .name = "dump",
    .words = "FILE",
    .summary = "show every record of a file, and what readers make of it",
    .examples =
        "oxmv dump clip.colr\n"
        "oxmv dump --json clip.colr\n"
        "oxmv dump damaged.colr | grep '!'\n",
    .details =
        "Each record has its offset, tag, size and type, how its tag is read, its value, and\n"
        "behind a ! what is odd about it. Records of a nested stream are indented. Markers and\n"
        "bytes that no reader gets to are shown too: no byte of the file is left out. FILE names\n"
        "a clip as in oxmv help show; offsets count from the start of its stream, of @last from\n"
        "behind the GUID.\n",
    .flags = flags,
    .fewestWords = 1,
    .mostWords = 1,
    .run = run,
};

}  // namespace oxmv::cli
