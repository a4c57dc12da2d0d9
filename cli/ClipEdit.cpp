#include "cli/ClipEdit.h"

#include <filesystem>
#include <system_error>
#include <utility>
#include <variant>

#include <fmt/format.h>

#include "cli/AllowedLosses.h"
#include "cli/Differences.h"
#include "cli/ValueText.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/platform/WholeFile.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

Dictionary tagsOf(const Bytes& stream) {
  return MetadataDictionary().initWithData(stream).metadata();
}

void checkFlags(const Call& call, bool isStandard) {
  for (const Flag flag : {Flag::backup, Flag::create}) {
    if (isStandard && call.arguments.has(flag))
      throw UsageError("bad-flags", fmt::format("{} needs a file", rowOf(flag).name));
  }
}

// "REEL: A001 -> A002"
std::string inWords(const Difference& difference) {
  const ShownDifference shown = show(difference, Extent::abbreviated);
  const auto orAbsent = [](const Value& value, const std::string& text) {
    return value.isNothing() ? "(absent)" : text;
  };
  return fmt::format("{}: {} -> {}", shown.path, orAbsent(difference.before, shown.before),
                     orAbsent(difference.after, shown.after));
}

// Any file is a stream to a tolerant reader; one that gives it nothing is most likely something
// else.
void refuseNoClip(Call& call) {
  call.messages.refused(call.words.front(), "there is no tag in it: is it a clip?", "no-tags",
                        nothingWritten("oxmv encode makes a new one in its place"));
}

// Beside the clip, where nothing is yet.
std::filesystem::path backupPath(const std::string& name) {
  for (int i = 1;; ++i) {
    const std::filesystem::path path = i == 1 ? name + '~' : fmt::format("{}~{}", name, i);
    std::error_code ignored;  // what cannot be looked at cannot be written either, and is said then
    if (!std::filesystem::exists(std::filesystem::symlink_status(path, ignored))) return path;
  }
}

}  // namespace

ClipEdit::ClipEdit(Call& call, ClipName name, std::optional<Bytes> original, Layout layout)
    : call_(&call),
      name_(std::move(name)),
      original_(std::move(original)),
      editor_(original_.value_or(Bytes()), layout) {}

std::optional<ClipEdit> ClipEdit::begin(Call& call, std::string_view ifMissing) {
  const ClipName name = writableClipNameFrom(call.words.front());
  const bool isStandard = name.kind == ClipName::Kind::standardStream;
  const Layout layout = layoutOf(call.arguments);
  checkFlags(call, isStandard);
  if (isStandard && !call.arguments.has(Flag::dryRun) && StandardOutput::isTerminal()) {
    call.messages.refused("standard output", "a clip is binary, and this is a terminal",
                          "binary-to-terminal");
    return std::nullopt;
  }
  auto read = readStream(name);
  if (auto* stream = std::get_if<ClipStream>(&read)) {
    const Clip clip = decodeClip(name, *stream);
    if (!stream->bytes.empty() && clip.tags.empty()) return refuseNoClip(call), std::nullopt;
    warnOfLosses(call, name, clip);
    return ClipEdit(call, name, std::move(stream->bytes), layout);
  }
  const FileProblem& problem = std::get<FileProblem>(read);
  const bool isMissing = problem.code == "missing";
  if (isMissing && call.arguments.has(Flag::create))
    return ClipEdit(call, name, std::nullopt, layout);
  const bool isHelped = isMissing && !ifMissing.empty();
  call.messages.error(
      name.word, isHelped ? fmt::format("{}; {}", problem.message, ifMissing) : problem.message,
      problem.code);
  return std::nullopt;
}

Dictionary ClipEdit::tags() const { return tagsOf(editor_.stream()); }

void ClipEdit::sayRefused(const std::string& path, const EditError& error) {
  const bool isDamaged = error.refusal == EditRefusal::damagedStream;
  const std::string where = isDamaged ? fmt::format(" at byte {}", error.offset) : "";
  call_->messages.refused(
      name_.word, fmt::format("{}{}: {}", visible(path), where, error.message),
      codeOf(error.refusal),
      nothingWritten(isDamaged ? "oxmv check says what is wrong with the clip" : ""));
}

void ClipEdit::finish() {
  const bool isChanged = editor_.stream() != original_;
  if (!isChanged) call_->messages.note(name_.word, "nothing to change");
  if (isChanged) showChanges();
  if (call_->arguments.has(Flag::dryRun)) return;
  if (name_.kind == ClipName::Kind::standardStream)
    return call_->output.write(asText(editor_.stream()));
  if (isChanged) save();
}

// On a dry run they are what was asked for, and else no more than a note.
void ClipEdit::showChanges() {
  for (const Difference& difference :
       differencesBetween(tagsOf(original_.value_or(Bytes())), tags())) {
    const std::string line = inWords(difference);
    call_->arguments.has(Flag::dryRun) ? call_->output.write(line + '\n')
                                       : call_->messages.note(name_.word, line);
  }
}

// Kept on purpose: an eye without tags has no file.
bool ClipEdit::replace(std::error_code& error) const {
  if (name_.kind != ClipName::Kind::eye || !editor_.stream().empty())
    return replaceWholeFile(name_.path, original_, editor_.stream(), error);
  if (!original_) return true;
  const auto now = readWholeFile(name_.path, error);
  if (now != original_) return error = FileError::changed, false;
  return removeFile(name_.path, error);
}

// Whether the file is what it should be, though replacing it has failed.
bool ClipEdit::hasArrived() const {
  std::error_code ignored;
  return readWholeFile(name_.path, ignored) == editor_.stream();
}

void ClipEdit::save() {
  Messages& messages = call_->messages;
  std::optional<std::string> backup;
  if (original_ && call_->arguments.has(Flag::backup) && !(backup = backUp())) return;
  std::error_code error;
  if (replace(error)) {
    if (backup) messages.note(name_.word, fmt::format("the old file is {}", visible(*backup)));
    return messages.note(name_.word,
                         fmt::format("got {}", counted(editor_.stream().size(), "byte")));
  }
  // Unless the new content got there all the same, nothing was replaced that needs a copy.
  if (backup && !hasArrived()) {
    std::error_code ignored;
    std::filesystem::remove(*backup, ignored);
  }
  if (error == FileError::changed) {
    messages.refused(name_.word, "another program has changed it meanwhile", "file-changed",
                     nothingWritten("try again"));
  } else {
    sayWriteFailed(*call_, name_, error);
  }
}

// What was read, so that the copy is of what is replaced. Answers nothing when there is no copy,
// which is said then.
std::optional<std::string> ClipEdit::backUp() {
  const std::filesystem::path path = backupPath(name_.path);
  std::error_code error;
  if (replaceWholeFile(path, std::nullopt, *original_, error)) {
    std::error_code ignored;  // on a file system without permissions there are none to keep
    const auto permissions = std::filesystem::status(name_.path, ignored).permissions();
    std::filesystem::permissions(path, permissions, ignored);
    return path.string();
  }
  call_->messages.error(path.string(), error.message(), "write-failed");
  return std::nullopt;
}

}  // namespace oxmv::cli
