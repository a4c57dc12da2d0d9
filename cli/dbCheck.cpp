#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/Database.h"
#include "cli/Findings.h"
#include "cli/InBatches.h"
#include "cli/JsonResults.h"
#include "cli/Progress.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/LittleEndian.h"
#include "oxmv/values/myGUID.h"

namespace oxmv::cli {
namespace {

// What is wrong with an entry of the database's folder.
struct Fault {
  std::string_view code;  // stable: "orphan-eye"
  std::string message;
};

// What a name looks like that is no clip's.

bool isTemporary(std::string_view name) {
  return name.starts_with(".oxmv-") && name.ends_with(".tmp");
}

// "CLIP~", "CLIP~2": what --backup leaves.
bool isBackup(std::string_view name) {
  const std::string_view clip = name.substr(0, name.rfind('~'));
  const std::string_view number = name.substr(std::min(clip.size() + 1, name.size()));
  return clip.size() < name.size() && ClipFileName::from(clip).has_value() &&
         number.find_first_not_of("0123456789") == std::string_view::npos;
}

std::string upperCase(std::string_view text) {
  std::string upper(text);
  std::transform(upper.begin(), upper.end(), upper.begin(), [](char c) {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
  });
  return upper;
}

std::string lowerCase(std::string_view text) {
  std::string lower(text);
  std::transform(lower.begin(), lower.end(), lower.begin(), [](char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
  });
  return lower;
}

// Nothing for what has a right to be there.
std::optional<Fault> faultOf(const StrangeEntry& entry) {
  const std::string& name = entry.name;
  if (entry.kind == EntryKind::folder || isBackup(name)) return std::nullopt;
  if (isTemporary(name))
    return Fault{"leftover", "was left behind when a write was cut short; it can be removed"};
  const std::size_t dot = std::min(name.rfind('.'), name.size());
  const std::string meant = upperCase(name.substr(0, dot)) + lowerCase(name.substr(dot));
  if (ClipFileName::from(meant))
    return Fault{"wrong-name", fmt::format("would be found under the name {} only", meant)};
  if (guidFromText(name.substr(0, dot)))
    return Fault{"wrong-name", "has the extension of no clip: colr, or col1, col2 ... of an eye"};
  return Fault{"wrong-name", "is the name of no clip: a GUID, and colr, col1, col2 ... behind it"};
}

// What is wrong with a clip's file: where it stands, and what it holds.

bool isDamage(const Finding& finding) {
  return finding.oddity == Oddity::stopped || finding.oddity == Oddity::cutPayload ||
         (finding.oddity == Oddity::tooShort && finding.count > 0);
}

// Whether a walk over the records of a stream, and those within, meets nothing but whole ones, and
// no GUID. Nearly every stream is like that, has no fault then, and need not be decoded, which
// takes ten times as long.
bool isPlainlyWhole(std::span<const std::uint8_t> stream, int level = 0) {
  for (std::size_t at = 0; at < stream.size();) {
    const std::size_t left = stream.size() - at;
    if (left < recordHeaderSize || level >= maxNesting) return false;
    const std::uint8_t* const header = stream.data() + at;
    const std::uint32_t size = loadLe24(header + 4);
    const bool isMarker = at > 0 && header[0] == markerBytes[0] && header[1] == markerBytes[1];
    if (isMarker || size > longestRecord || size > left - recordHeaderSize) return false;
    const TagRow* const row = findTagRow(Tag{loadLe32(header)});
    const auto payload = stream.subspan(at + recordHeaderSize, size);
    const Read rule = row == nullptr ? Read::none : row->read;
    if (rule == Read::guid) return false;
    if (rule == Read::controlPoint && size < controlPointSize) return false;
    if (rule == Read::nested || rule == Read::nestedList || rule == Read::controlPoint) {
      const std::uint32_t before = rule == Read::controlPoint ? controlPointSize : 0;
      if (!isPlainlyWhole(payload.subspan(before), level + 1)) return false;
    }
    at += recordLength(size);
  }
  return true;
}

void addFaultsOf(std::span<const std::uint8_t> stream, const DatabaseFile& file,
                 std::vector<Fault>& faults) {
  if (stream.size() >= shortestData && isPlainlyWhole(stream)) return;
  const myGUID& named = file.name.guid;
  myGUID guid = named;
  FindingCollector collector(stream);
  if (stream.size() >= shortestData)
    decodeStream(stream, static_cast<std::int32_t>(stream.size()), &guid, &collector);
  // A name has 32 bits of Data1.
  if (guidText(guid) != guidText(named))
    faults.push_back({"guid-differs", fmt::format("its GUID record says {}", guidText(guid))});
  const std::vector<Finding> findings = collector.finish();
  const auto damage = std::find_if(findings.begin(), findings.end(), isDamage);
  if (damage == findings.end()) return;
  std::string message = locate(*damage);
  if (findings.size() > 1)
    message += fmt::format(", and {} more; oxmv check has them all", findings.size() - 1);
  faults.push_back({"damaged", std::move(message)});
}

std::vector<Fault> faultsOf(const Database& database, const DatabaseFile& file,
                            std::span<const DatabaseFile> clip, Bytes& buffer) {
  std::vector<Fault> faults;
  if (file.name.eye && clip.size() == 1)
    faults.push_back({"orphan-eye", "is all there is of its clip: no combined file, no other eye"});
  const auto read = database.read(file, buffer);
  if (const auto* problem = std::get_if<FileProblem>(&read)) {
    faults.push_back({"unreadable", problem->message});
    return faults;
  }
  const auto stream = std::get<std::span<const std::uint8_t>>(read);
  // A combined file may be empty: that is a clip without tags.
  if (file.name.eye && stream.empty())
    faults.push_back({"empty", "is empty: an eye without tags has no file"});
  if (!stream.empty()) addFaultsOf(stream, file, faults);
  return faults;
}

class Report {
 public:
  explicit Report(Call& call) : call_(call), results_(call) {}

  // `name` is null for what is no clip's file.
  void add(const std::string& path, const ClipFileName* name, const std::vector<Fault>& faults) {
    if (faults.empty()) return;
    count_ += faults.size();
    call_.messages.raise(Outcome::no);
    if (wantsJson(call_)) return writeResult(path, name, faults);
    for (const Fault& fault : faults)
      call_.output.write(fmt::format("{}: {} ({})\n", nameInMessages(path), fault.message,
                                     call_.style.warning(fault.code)));
  }

  void finish(const Database& database) {
    if (wantsJson(call_)) results_.finish();
    call_.messages.note(database.path(),
                        fmt::format("{}, {}", counted(database.files().size(), "file"),
                                    counted(count_, "finding")));
  }

 private:
  void writeResult(const std::string& path, const ClipFileName* name,
                   const std::vector<Fault>& faults) {
    results_.add([&](JsonWriter& json) {
      beginResult(json, "oxmv.db.check/1", path);
      json.member("guid", name == nullptr ? std::nullopt : std::optional(guidText(name->guid)));
      json.member("eye", name == nullptr ? std::nullopt : std::optional(eyeText(*name)));
      json.key("findings");
      json.beginArray();
      for (const Fault& fault : faults) {
        json.beginObject();
        json.member("code", fault.code);
        json.member("message", fault.message);
        json.endObject();
      }
      json.endArray();
      endResult(json, nullptr);
    });
  }

  Call& call_;
  JsonResults results_;
  std::size_t count_ = 0;
};

// What is wrong with some clips.
struct Batch {
  std::size_t files = 0;  // that were looked at
  std::vector<std::pair<const DatabaseFile*, std::vector<Fault>>> faulty;
};

void checkFiles(Call& call, const Database& database, Report& report) {
  const auto clips = database.clips();
  Progress progress(call, database.files().size(), "files");
  const auto make = [&](Bytes& buffer, std::size_t first, std::size_t last) {
    Batch batch;
    for (; first < last; ++first) {
      for (const DatabaseFile& file : clips[first]) {
        auto faults = faultsOf(database, file, clips[first], buffer);
        if (!faults.empty()) batch.faulty.emplace_back(&file, std::move(faults));
      }
      batch.files += clips[first].size();
    }
    return batch;
  };
  inBatches(clips.size(), std::array<Bytes, 2>(), make, [&](const Batch& batch) {
    for (std::size_t i = 0; i < batch.files; ++i) progress.advance();
    for (const auto& [file, faults] : batch.faulty)
      report.add(database.pathOf(file->name.text()), &file->name, faults);
  });
}

void run(Call& call) {
  const auto database = Database::open(call);
  if (!database) {
    if (wantsJson(call)) JsonResults(call).finish();
    return;
  }
  Report report(call);
  checkFiles(call, *database, report);
  for (const StrangeEntry& entry : database->strangeEntries()) {
    if (auto fault = faultOf(entry))
      report.add(database->pathOf(entry.name), nullptr, {*std::move(fault)});
  }
  report.finish(*database);
}

constexpr auto flags = std::to_array({Flag::json, Flag::ndjson, Flag::noProgress});

}  // namespace

const Verb dbCheckVerb = {
    .name = "db check",
    .words = "",
    .summary = "find what is wrong with the database; say nothing when all is well",
    .examples =
        "oxmv db check\n"
        "oxmv db check --json --db /mnt/clips\n",
    .details =
        "One line for each finding, with its code; exit code 1 when there is one.\n"
        "  unreadable    a clip's file cannot be read\n"
        "  empty         an eye's file has no bytes\n"
        "  orphan-eye    an eye's file, without a combined file or another eye\n"
        "  guid-differs  the GUID record in a file is not the GUID in its name\n"
        "  damaged       a stream ends in its middle; oxmv check says more\n"
        "  wrong-name    a file that no host will find: in small letters, of another extension\n"
        "  leftover      a temporary file of a write that was cut short\n"
        "Folders, and the copies that --backup makes, may be there.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = 0,
    .run = run,
};

}  // namespace oxmv::cli
