#include "cli/Clips.h"

#include <algorithm>
#include <cstdint>
#include <string>
#include <string_view>
#include <system_error>
#include <utility>

#include <fmt/format.h>

#include "cli/ValueText.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/platform/WholeFile.h"
#include "oxmv/store/LastRecord.h"

namespace oxmv::cli {
namespace {

using Kind = ClipName::Kind;

// More warnings than this hide what they warn of.
constexpr std::size_t warningsSaid = 20;

struct Decoded {
  Dictionary tags;
  myGUID guid;
  std::vector<Finding> findings;
};

Decoded decode(const ClipName& name, const ClipStream& stream) {
  const Bytes& bytes = stream.bytes;
  const bool isLast = name.kind == Kind::last;
  Decoded decoded{{}, stream.guid, {}};
  FindingCollector collector(bytes);
  // Kept on purpose: all other files need the length of a record with a number to count as a
  // stream, the "last" file does not.
  if (isLast || bytes.size() >= shortestData)
    // maxFileSize is far below what the length can say.
    decoded.tags =
        decodeStream(bytes, static_cast<std::int32_t>(bytes.size()), &decoded.guid, &collector);
  decoded.findings = collector.finish();
  if (isLast)
    std::erase_if(decoded.findings,
                  [](const Finding& finding) { return finding.oddity == Oddity::tooShort; });
  if (name.kind == Kind::combined) decoded.guid = name.guid;
  return decoded;
}

std::variant<ClipStream, FileProblem> readLast(const ClipName& name) {
  std::error_code error;
  LastRecord last = readLastRecord(name.path, error);
  if (error) return problemOf(error);
  if (!last.stream)
    return FileProblem{"too-short", fmt::format("{} are too few for the GUID that it begins with",
                                                counted(last.guidSize, "byte"))};
  return ClipStream{*std::move(last.stream), last.guid, sizeof(myGUID)};
}

}  // namespace

std::variant<ClipStream, FileProblem> readStream(const ClipName& name) {
  if (name.kind == Kind::last) return readLast(name);
  auto content = readInput(name.path);
  if (auto* problem = std::get_if<FileProblem>(&content)) return std::move(*problem);
  return ClipStream{std::get<Bytes>(std::move(content)), name.guid};
}

Clip decodeClip(const ClipName& name, const ClipStream& stream) {
  Decoded decoded = decode(name, stream);
  std::erase_if(decoded.findings, [](const Finding& finding) { return !isLoss(finding); });
  return {std::move(decoded.tags), decoded.guid, std::move(decoded.findings), stream.bytes.size()};
}

std::vector<Finding> findingsIn(const ClipName& name, const ClipStream& stream) {
  return decode(name, stream).findings;
}

std::variant<Clip, FileProblem> readClip(Call& call, const ClipName& name) {
  auto read = readStream(name);
  if (auto* problem = std::get_if<FileProblem>(&read)) {
    call.messages.error(name.word, problem->message, problem->code);
    return std::move(*problem);
  }
  return decodeClip(name, std::get<ClipStream>(read));
}

bool writeClip(const ClipName& name, const Bytes& stream, std::error_code& error) {
  if (name.kind != Kind::eye || !stream.empty()) return writeWholeFile(name.path, stream, error);
  return removeFile(name.path, error) || error == std::errc::no_such_file_or_directory;
}

FileProblem sayWriteFailed(Call& call, const ClipName& name, const std::error_code& error) {
  const std::string way =
      error == std::errc::no_such_file_or_directory ? wayToFolder(name) : std::string();
  FileProblem problem = {
      "write-failed",
      way.empty() ? error.message() : fmt::format("{}; {}", error.message(), way),
  };
  call.messages.error(name.word, problem.message, problem.code);
  return problem;
}

void warnOfLosses(Call& call, const ClipName& name, const Clip& clip) {
  for (std::size_t i = 0; i < std::min(clip.losses.size(), warningsSaid); ++i)
    call.messages.warning(name.word, locate(clip.losses[i]), codeOf(clip.losses[i]));
  if (clip.losses.size() > warningsSaid)
    call.messages.warning(name.word,
                          fmt::format("{} more; oxmv check lists them all",
                                      counted(clip.losses.size() - warningsSaid, "warning")));
}

}  // namespace oxmv::cli
