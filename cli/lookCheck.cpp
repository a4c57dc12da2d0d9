#include <algorithm>
#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/CheckReport.h"
#include "cli/Inputs.h"
#include "cli/JsonResults.h"
#include "cli/LookTables.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/values/Characters.h"
#include "oxmv/values/Text.h"

namespace oxmv::cli {
namespace {

struct LookTableFinding {
  std::string_view code;
  std::string message;
  std::optional<std::size_t> offset;  // nothing for what is about the file's name
};

class Check {
 public:
  // `name` as the user wrote it.
  Check(const std::string& name, const Bytes& file)
      : fileName_(name == "-" ? std::string_view() : lastPathComponent(name)), file_(file) {}

  std::vector<LookTableFinding> run() {
    if (file_.size() < lookHeaderSize) {
      add("short-file",
          fmt::format("{}, and the header alone has {}", counted(file_.size(), "byte"),
                      lookHeaderSize),
          file_.size());
      return std::move(findings_);
    }
    const auto header = loadLookHeader(file_);
    if (!header) {
      add("bad-magic",
          fmt::format("the file begins with \"{}\" and not with \"OXLK\"",
                      visible(asText(file_).substr(0, 4))),
          0);
      return std::move(findings_);
    }
    judgeName();
    judgeHeader(*header);
    if (hasUsableSize(*header)) judgeTable(*header);
    return std::move(findings_);
  }

 private:
  void add(std::string_view code, std::string message, std::optional<std::size_t> offset = {}) {
    findings_.push_back({code, std::move(message), offset});
  }

  void judgeName() {
    if (fileName_.empty()) return;
    crc_ = crcFromFileName(withoutExtension(fileName_));
    if (!crc_)
      return add("bad-name", "the file's name does not begin with a CRC: hosts do not list it");
    // An import looks for its look under this name only.
    if (fileName_ != lookFileNameOf(*crc_))
      add("odd-name", fmt::format("an import of this look does not find it under this name, but {}",
                                  lookFileNameOf(*crc_)));
  }

  void judgeHeader(const OXLOOK_HEADER& header) {
    if (header.version < lookVersion)
      add("old-version",
          fmt::format("version {}: hosts show the file's name, and an import replaces the file",
                      header.version),
          4);
    if (header.version > lookVersion)
      add("new-version",
          fmt::format("version {}, and {} is the newest known: an import replaces the file",
                      header.version, lookVersion),
          4);
    if (header.headerSize != lookHeaderSize)
      add("header-size",
          fmt::format("a header of {} bytes, and it has {}", header.headerSize, lookHeaderSize), 8);
    if (!hasUsableSize(header))
      add("bad-size",
          fmt::format("{} points per axis, and there are 1 to {}", header.lutSize, maxLookSize),
          12);
    const OXLOOK_HEADER usual;
    judgeConstant(header.constantA, usual.constantA, 16);
    judgeConstant(header.constantB, usual.constantB, 20);
    if (header.version >= lookVersion) judgeLookName(header);
  }

  void judgeConstant(std::uint32_t constant, std::uint32_t usual, std::size_t offset) {
    if (constant != usual)
      add("bad-constant",
          fmt::format("0x{:08X}, and every file has 0x{:08X} here", constant, usual), offset);
  }

  void judgeLookName(const OXLOOK_HEADER& header) {
    constexpr std::size_t offset = 24;
    const std::string_view field(header.lutName.data(), header.lutName.size());
    const std::string_view name = field.substr(0, field.find('\0'));
    if (name.empty())
      add("no-name", "there is no name in it: menus show the look without one", offset);
    if (name.size() == field.size()) add("name-without-end", "the name does not end", offset);
    if (!isAscii(name))
      add("name-not-ascii", "the name is not ASCII: menus show the look without one", offset);
  }

  void judgeTable(const OXLOOK_HEADER& header) {
    const std::size_t whole = lookFileSize(static_cast<std::int32_t>(header.lutSize));
    if (file_.size() < whole)
      add("short-file",
          fmt::format("ends after {}, and {} points per axis take {}",
                      counted(file_.size(), "byte"), header.lutSize, whole),
          file_.size());
    if (file_.size() > whole)
      add("long-file",
          fmt::format("goes on to {}, and {} points per axis take {}",
                      counted(file_.size(), "byte"), header.lutSize, whole),
          whole);
    const auto table = tableOf(header, file_);
    const TableValues values = valuesOf(header, table);
    // Of a table that is cut off every CRC is wrong.
    if (crc_ && file_.size() >= whole) judgeCrc(table, values.crc);
    if (values.notFinite > 0)
      add("not-finite",
          fmt::format("{} NaN or infinite, this one first",
                      values.notFinite == 1 ? std::string("1 value is")
                                            : fmt::format("{} values are", values.notFinite)),
          lookHeaderSize + values.firstNotFinite * 4);
  }

  void judgeCrc(std::span<const std::uint8_t> table, std::uint32_t crc) {
    if (*crc_ == crc) return;
    const auto given = valuesWithCrc(table, *crc_);
    if (given)
      return add("values-missing",
                 fmt::format("the description gave {} of {}, and those behind are 0",
                             counted(*given, "value"), table.size() / 4),
                 lookHeaderSize + *given * 4);
    add("crc-differs",
        fmt::format("the values have the CRC {:08X}, and the file is named {:08X}", crc, *crc_),
        lookHeaderSize);
  }

  const std::string_view fileName_;  // empty: none
  const Bytes& file_;
  std::optional<std::uint32_t> crc_;  // by the file's name
  std::vector<LookTableFinding> findings_;
};

std::string lineOf(const Call& call, const std::string& name, const LookTableFinding& finding) {
  const std::string place = finding.offset ? fmt::format("byte {}: ", *finding.offset) : "";
  return fmt::format("{}: {}{} ({})", nameInMessages(name), place, finding.message,
                     call.style.warning(finding.code));
}

void writeFinding(JsonWriter& json, const LookTableFinding& finding) {
  json.beginObject();
  json.member("code", finding.code);
  if (finding.offset) {
    json.member("offset", *finding.offset);
  } else {
    json.member("offset", std::nullopt);
  }
  json.member("message", finding.message);
  json.endObject();
}

void run(Call& call) {
  CheckReport report(call, "oxmv.look.check/1");
  for (const std::string& name : namedInputs(call)) {
    const auto content = readInput(name);
    if (const auto* problem = std::get_if<FileProblem>(&content)) {
      report.addProblem(name, *problem);
      continue;
    }
    const auto line = [&](const LookTableFinding& finding) { return lineOf(call, name, finding); };
    report.add(name, Check(name, std::get<Bytes>(content)).run(), line, writeFinding);
  }
  report.finish();
}

constexpr auto flags = std::to_array({Flag::json, Flag::ndjson, Flag::filesFrom, Flag::null});

}  // namespace

const Verb lookCheckVerb = {
    .name = "look check",
    .words = "FILE...",
    .summary = "find what is wrong with look-table files; say nothing when all is well",
    .examples =
        "oxmv look check *.oxlook\n"
        "oxmv look check --json 43B0C2CA.oxlook\n",
    .details =
        "One line for each finding: the file, the byte, what it is, and its code. Exit code 1\n"
        "when something was found. Looks at the header, the length of the file, the CRC of the\n"
        "values, which the file is named by, and for values that are NaN or infinite.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = anyNumber,
    .run = run,
};

}  // namespace oxmv::cli
