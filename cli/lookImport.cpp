#include "oxmv/looks/LookImport.h"

#include <algorithm>
#include <array>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>
#include <utility>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/CommandHost.h"
#include "cli/Inputs.h"
#include "cli/JsonResults.h"
#include "cli/LookFindings.h"
#include "cli/LookFolder.h"
#include "cli/LookSpace.h"
#include "cli/TemporaryFolder.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/looks/LookTableFile.h"
#include "oxmv/platform/WholeFile.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

namespace fs = std::filesystem;
using Copy = LookTableReport::Copy;

// What became of one table.
struct Table {
  std::int32_t size;
  std::size_t values, missing, surplus, malformed;
  std::uint32_t crc;
  bool isWritten;  // on a dry run: would be
  std::error_code writeError;
};

// What an import did.
struct Imported final : LookImportObserver {
  std::optional<LookFileRef> reference;
  std::vector<Table> tables;
  Copy copy = Copy::notTried;  // of the last table that was new
  std::error_code copyError;
  std::optional<LookImportStop> stop;
  std::size_t endOffset = 0;  // where it stopped
  std::error_code readError;

  void onTable(const LookTableReport& report) override {
    tables.push_back({report.size, report.values.stored, report.missing(), report.surplus(),
                      report.values.malformed, report.crc, report.isNew && !report.writeError,
                      report.writeError});
    if (report.copy == Copy::notTried) return;
    // Of a description that was copied the copy is there for the next table.
    if (copy != Copy::copied) copy = report.copy;
    copyError = report.copyError;
  }
  void onStop(const LookImportEnd& end) override {
    stop = end.reason;
    endOffset = end.offset;
    readError = end.error;
  }

  bool wroteAny() const {
    return std::any_of(tables.begin(), tables.end(),
                       [](const Table& table) { return table.isWritten; });
  }
};

// The reference that an import answers, as JSON shows it.
struct Reference {
  std::uint32_t crc = 0;
  std::int32_t version = 0;
  std::optional<std::string> name;
};

// One description, from its reading to what is said of it.
class Import {
 public:
  Import(Call& call, const std::string& name, const std::string& folder)
      : call_(call), name_(name), folder_(folder), isDryRun_(call.arguments.has(Flag::dryRun)) {}

  void run() {
    auto content = readInput(name_);
    if (auto* problem = std::get_if<FileProblem>(&content)) {
      imported_.reference = LookFileRef();
      return fail(name_, *std::move(problem));
    }
    file_ = std::get<Bytes>(std::move(content));
    if (call_.arguments.has(Flag::stripSpace) && !strip()) return;
    judge();
    if (!findings_.empty() && findings_.front().code == "too-many-tables") {
      imported_.endOffset = *findings_.front().offset;
      return refuse();
    }
    if (!import()) return;
    sayOddities();
    sayTables();
    sayEnd();
    sayCopy();
  }

  // In place of run(): for a reason that is said already.
  void leaveOut(const FileProblem& reason) { problem_ = reason; }

  void writeJson(JsonResults& results) const {
    results.add([&](JsonWriter& json) {
      beginResult(json, "oxmv.look.import/1", name_);
      json.key("reference");
      writeReference(json);
      json.member("alert", alert_.empty() ? std::nullopt : std::optional<std::string_view>(alert_));
      json.key("copied");
      json.boolean(imported_.copy == Copy::copied);
      json.key("tables");
      json.beginArray();
      for (const Table& table : imported_.tables) writeTable(json, table);
      json.endArray();
      endResult(json, problem_ ? &*problem_ : nullptr);
    });
  }

 private:
  bool isJson() const { return wantsJson(call_); }

  // Says it, and keeps it for the result.
  void fail(const std::string& about, FileProblem problem) {
    call_.messages.error(about, visible(problem.message), problem.code);
    problem_ = std::move(problem);
  }

  void say(const std::string& what) {
    if (!isJson()) call_.output.write(fmt::format("{}: {}\n", visible(name_), what));
  }

  std::string fileName() const { return std::string(lastPathComponent(name_)); }

  // Puts the description without its white space under the same name where only we are.
  bool strip() {
    if (isUtf16(file_)) {
      fail(name_,
           {"not-stripped", "is in UTF-16, where white space is not found: save it as UTF-8"});
      return false;
    }
    auto stripped = withoutSpace(file_);
    if (!stripped || stripped->cuts.empty()) return true;  // imported as it is
    std::error_code error;
    temporary_ = TemporaryFolder::make(error);
    if (!temporary_ || !writeWholeFile(temporary_->path() / fileName(), stripped->bytes, error)) {
      fail(name_,
           {"write-failed", fmt::format("no temporary file can be written: {}", error.message())});
      return false;
    }
    stripped_ = std::move(stripped);
    return true;
  }

  const Bytes& description() const { return stripped_ ? stripped_->bytes : file_; }

  // Places are those in the user's own file.
  void judge() {
    findings_ = findingsInLook(description(), fileName());
    XmlPositions positions(file_);
    for (const LookFinding& finding : findings_) {
      std::size_t offset = finding.offset.value_or(0);
      if (stripped_) offset = stripped_->offsetInFile(offset);
      places_.push_back(finding.offset ? positionText(positions.of(offset)) + ": " : "");
    }
  }

  bool import() {
    const std::string path = stripped_ ? (temporary_->path() / fileName()).string() : name_;
    if (isDryRun_) return importElsewhere(path);
    imported_.reference = LookFileRef::initFromLookFile(path, &imported_);
    return true;
  }

  // A dry run writes everything to a folder that is gone soon, and looks then what of it is not in
  // the true one.
  bool importElsewhere(const std::string& path) {
    std::error_code error;
    const auto elsewhere = TemporaryFolder::make(error);
    if (!elsewhere) {
      fail(name_, {"write-failed", fmt::format("no temporary folder: {}", error.message())});
      return false;
    }
    call_.host.setLooks({elsewhere->path().string(), "--dry-run"});
    imported_.reference = LookFileRef::initFromLookFile(path, &imported_);
    call_.host.setLooks({folder_, "--dry-run"});
    for (Table& table : imported_.tables) {
      const auto start =
          readFileStart(fs::path(folder_) / lookFileNameOf(table.crc), lookHeaderSize, error);
      if (start && isCurrentLookFile(*start)) table.isWritten = false;
    }
    std::error_code ignored;
    if (!imported_.wroteAny()) {
      imported_.copy = Copy::notTried;
    } else if (imported_.copy == Copy::copied &&
               fs::exists(fs::path(folder_) / fileName(), ignored)) {
      imported_.copy = Copy::alreadyThere;
    }
    return true;
  }

  // The number of the finding at which the import ended; that of all findings if there is none.
  std::size_t endingFinding() const {
    const auto found =
        std::find_if(findings_.begin(), findings_.end(), [this](const LookFinding& finding) {
          return finding.stops && finding.offset == imported_.endOffset;
        });
    return static_cast<std::size_t>(found - findings_.begin());
  }

  // What the import met before it ended.
  void sayOddities() {
    const std::size_t end = imported_.stop ? endingFinding() : findings_.size();
    for (std::size_t i = 0; i < end; ++i) {
      if (!findings_[i].stops)
        call_.messages.warning(name_, places_[i] + findings_[i].message, findings_[i].code);
    }
  }

  void sayTables() {
    if (stripped_)
      say(fmt::format("{} of white space left out; its copy will have none either",
                      counted(stripped_->cuts.size(), "piece")));
    for (const Table& table : imported_.tables) {
      const std::string file = lookFileNameOf(table.crc);
      if (table.writeError) {
        fail((fs::path(folder_) / file).string(), {"write-failed", table.writeError.message()});
        continue;
      }
      const std::string_view done = !table.isWritten ? "already there"
                                    : isDryRun_      ? "would be written"
                                                     : "written";
      say(fmt::format("{}, {} -> {} ({})", counted(static_cast<std::size_t>(table.size), "point"),
                      counted(table.values, "value"), file, done));
    }
    const bool failed = problem_.has_value();
    if (!imported_.tables.empty() && !imported_.wroteAny() && !imported_.stop && !failed)
      say("nothing to do: every look in it is already there");
    if (imported_.tables.empty() && !imported_.stop) say("nothing to do: it has no table");
  }

  void sayEnd() {
    if (!imported_.stop) return;
    for (const std::string& alert : call_.host.takeAlerts()) alert_ = alert;
    if (*imported_.stop == LookImportStop::unreadable)
      return fail(name_, problemOf(imported_.readError));
    refuse();
  }

  // Where the import ended, why, and how to mend that.
  void refuse() {
    const std::size_t end = endingFinding();
    if (end == findings_.size() && imported_.stop == LookImportStop::tooMuch) return refuseSoMany();
    if (end == findings_.size())
      return fail(name_, {"changed", "was changed while it was imported; import it again"});
    const LookFinding& finding = findings_[end];
    problem_ = FileProblem{finding.code, places_[end] + finding.message};
    if (imported_.stop == LookImportStop::notWellFormed)
      return call_.messages.error(name_, problem_->message, problem_->code);
    if (alert_.empty())
      return call_.messages.refused(name_, problem_->message, finding.code, done());
    call_.messages.refused(name_, places_[end] + visible(alert_), finding.code,
                           fmt::format("{}; {}", done(), finding.message));
  }

  std::string_view done() const {
    return isDryRun_ || !imported_.wroteAny() ? "nothing written"
                                              : "the tables before it are written";
  }

  // How many files a description makes is known only when they are made.
  void refuseSoMany() {
    problem_ = FileProblem{
        "too-much",
        fmt::format("more than {} new tables: divide the description", maxImportedFiles)};
    call_.messages.refused(name_, problem_->message, problem_->code, done());
  }

  // The library is silent when it leaves a description alone that is there.
  void sayCopy() {
    const std::string there = (fs::path(folder_) / fileName()).string();
    if (imported_.copy == Copy::failed)
      call_.messages.warning(name_,
                             fmt::format("could not be copied to {}: {}", visible(there),
                                         imported_.copyError.message()),
                             "not-copied");
    if (imported_.copy != Copy::alreadyThere) return;
    std::error_code error;
    const auto old = readWholeFile(there, error);
    if (old && *old == description()) return;
    call_.messages.warning(
        name_, fmt::format("not copied: {} is there already and differs", visible(there)),
        "copy-differs");
  }

  // On a dry run the looks that are in the true folder do not count.
  std::optional<Reference> reference() const {
    if (!imported_.reference) return std::nullopt;
    const LookFileRef& look = *imported_.reference;
    if (!isDryRun_) return Reference{look.CRC(), look.version(), look.displayName()};
    Reference last;
    for (const Table& table : imported_.tables) {
      if (table.isWritten) last = {table.crc, look.version(), look.displayName()};
    }
    return last;
  }

  void writeReference(JsonWriter& json) const {
    const auto answer = reference();
    if (!answer) return json.null();
    json.beginObject();
    json.member("crc", fmt::format("{:08X}", answer->crc));
    json.key("version");
    json.integer(answer->version);
    json.member("name",
                answer->name ? std::optional<std::string_view>(*answer->name) : std::nullopt);
    json.endObject();
  }

  static void writeTable(JsonWriter& json, const Table& table) {
    json.beginObject();
    json.key("size");
    json.integer(table.size);
    json.member("values", table.values);
    json.member("missing", table.missing);
    json.member("surplus", table.surplus);
    json.member("malformed", table.malformed);
    json.member("crc", fmt::format("{:08X}", table.crc));
    json.member("file", lookFileNameOf(table.crc));
    json.key("written");
    json.boolean(table.isWritten);
    json.endObject();
  }

  Call& call_;
  const std::string& name_;
  const std::string& folder_;
  const bool isDryRun_;

  Bytes file_;
  std::optional<StrippedLook> stripped_;
  std::optional<TemporaryFolder> temporary_;
  std::vector<LookFinding> findings_;
  std::vector<std::string> places_;  // of the findings: "line 3, column 7: "
  Imported imported_;
  std::string alert_;
  std::optional<FileProblem> problem_;
};

void run(Call& call) {
  const std::vector<std::string> names = namedInputs(call);
  if (std::find(names.begin(), names.end(), "-") != names.end())
    throw UsageError("standard-input", "a look has the name of its file, and - has none");
  const std::string folder = lookTableFolder();
  const auto folderProblem = problemOfLookFolder(folder);
  if (folderProblem) call.messages.error(folder, folderProblem->message, folderProblem->code);
  JsonResults results(call);
  for (const std::string& name : names) {
    Import import(call, name, folder);
    if (folderProblem) {
      import.leaveOut(*folderProblem);
    } else {
      import.run();
    }
    if (wantsJson(call)) import.writeJson(results);
  }
  if (wantsJson(call)) results.finish();
}

constexpr auto flags = std::to_array({Flag::stripSpace, Flag::dryRun, Flag::json, Flag::ndjson,
                                      Flag::filesFrom, Flag::null, Flag::strict});

}  // namespace

const Verb lookImportVerb = {
    .name = "look import",
    .words = "XML...",
    .summary = "make look-table files of look descriptions",
    .examples =
        "oxmv look import warm.xml\n"
        "oxmv look import --strip-space indented.xml\n"
        "oxmv look import --dry-run --looks looks *.xml\n"
        "oxmv look import --json warm.xml | jq -r '.[].reference.crc'\n",
    .details =
        "Each table becomes a file in the look-table folder, named by the CRC of its values, and\n"
        "the description is copied beside it. A look that is there already is left alone, and\n"
        "so is another description of the same name. White space in a <LUT> counts as a table:\n"
        "--strip-space imports the description without it, and that is what is copied then.\n"
        "What is odd is said as a warning, with line and column; oxmv look lint says it without\n"
        "importing. Exit code 4 when the import was refused on the way: the tables before that\n"
        "place are written. --dry-run says what would be written.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = anyNumber,
    .run = run,
};

}  // namespace oxmv::cli
