#include "cli/ClipNames.h"

#include <charconv>
#include <cstdint>
#include <filesystem>
#include <optional>
#include <system_error>
#include <utility>

#include <fmt/format.h>

#include "cli/Inputs.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/store/ClipFileName.h"
#include "oxmv/store/Locations.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

using Kind = ClipName::Kind;

constexpr std::size_t guidSize = 36;

std::optional<std::size_t> numberFrom(std::string_view text) {
  std::size_t number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
  return number;
}

}  // namespace

std::string eyeText(std::size_t eye) {
  return eye == 0 ? "left" : eye == 1 ? "right" : fmt::format("{}", eye);
}

std::size_t eyeFrom(std::string_view text, std::string_view what) {
  if (text == "left") return 0;
  if (text == "right") return 1;
  if (const auto number = numberFrom(text); number && *number <= ClipFileName::lastEye)
    return *number;
  throw UsageError("bad-eye",
                   fmt::format("{} takes left, right, or the index of an eye (0 left, 1 right), "
                               "not \"{}\"",
                               what, visible(text)));
}

ClipName combinedClipName(const myGUID& guid) {
  return {Kind::combined, guidText(guid), clipFilePath(guid, preferencesAppID), guid};
}

ClipName eyeClipName(const myGUID& guid, std::size_t eye) {
  return {Kind::eye, fmt::format("{}/{}", guidText(guid), eyeText(eye)),
          eyeFilePath(guid, eye, preferencesAppID), guid, eye};
}

ClipName clipNameFrom(const std::string& word) {
  if (word == "-") return {Kind::standardStream, word, word};
  if (word == "@override") return {Kind::overrideFile, word, overrideFilePath(preferencesAppID)};
  if (word == "@last") return {Kind::last, word, lastFilePath(preferencesAppID)};
  const std::string_view text = word;
  const auto guid = guidFromText(text.substr(0, guidSize));
  ClipName name{Kind::file, word, word};
  if (guid && text.size() == guidSize) {
    name = combinedClipName(*guid);
  } else if (guid && text[guidSize] == '/') {
    const std::string_view start = text.substr(0, guidSize + 1);
    name = eyeClipName(*guid, eyeFrom(text.substr(guidSize + 1), start));
  }
  name.word = word;
  return name;
}

ClipName writableClipNameFrom(const std::string& word) {
  ClipName name = clipNameFrom(word);
  if (name.kind == Kind::last)
    throw UsageError("read-only", "@last is for reading; a clip is written by its GUID");
  return name;
}

std::vector<ClipName> namedClips(Call& call) {
  std::vector<ClipName> names;
  for (const std::string& word : namedInputs(call)) names.push_back(clipNameFrom(word));
  return names;
}

std::string wayToFolder(const ClipName& name) {
  const bool isOurs = name.isInDatabase() || name.kind == Kind::overrideFile;
  if (!isOurs) return {};
  std::error_code ignored;  // what cannot be looked at is there
  const auto folder = std::filesystem::path(name.path).parent_path();
  if (std::filesystem::status(folder, ignored).type() != std::filesystem::file_type::not_found)
    return {};
  return "its folder is not there: oxmv db init makes it";
}

}  // namespace oxmv::cli
