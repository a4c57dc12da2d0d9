#include "cli/Database.h"

#include <algorithm>
#include <tuple>
#include <utility>

#include <fmt/format.h>

#include "cli/ClipNames.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/store/Locations.h"

namespace oxmv::cli {
namespace {

// Sorts as the names do, but for eyes, which go by number.
auto orderOf(const ClipFileName& name) {
  return std::tuple(name.guid.Data1, name.guid.Data2, name.guid.Data3, name.guid.Data4, name.eye);
}

}  // namespace

std::optional<Database> Database::open(Call& call) {
  const std::string path = databaseFolderPath(preferencesAppID);
  std::error_code error;
  auto folder = Folder::open(path, error);
  if (!folder) {
    const FileProblem problem = problemOf(error);
    const bool isMissing = error == std::errc::no_such_file_or_directory;
    call.messages.error(
        path,
        isMissing ? fmt::format("{}; oxmv db init makes it", problem.message) : problem.message,
        problem.code);
    return std::nullopt;
  }
  Database database(path, *std::move(folder));
  const bool isComplete = database.folder_.forEachEntry(
      [&](std::string_view name, EntryKind kind) {
        if (const auto clip = ClipFileName::from(name)) {
          database.files_.push_back({*clip, kind});
        } else {
          database.strange_.push_back({std::string(name), kind});
        }
      },
      error);
  // What was found is good all the same.
  if (!isComplete) {
    const FileProblem problem = problemOf(error);
    call.messages.error(path, problem.message, problem.code);
  }
  std::sort(database.files_.begin(), database.files_.end(),
            [](const DatabaseFile& a, const DatabaseFile& b) {
              return orderOf(a.name) < orderOf(b.name);
            });
  std::sort(database.strange_.begin(), database.strange_.end(),
            [](const StrangeEntry& a, const StrangeEntry& b) { return a.name < b.name; });
  return database;
}

std::string Database::pathOf(std::string_view name) const {
  return std::string(path_).append(1, '/').append(name);
}

std::vector<std::span<const DatabaseFile>> Database::clips() const {
  std::vector<std::span<const DatabaseFile>> clips;
  for (auto rest = files(); !rest.empty();) {
    const auto other = std::find_if(rest.begin(), rest.end(), [&](const DatabaseFile& file) {
      return file.name.guid != rest.front().name.guid;
    });
    clips.push_back(rest.first(static_cast<std::size_t>(other - rest.begin())));
    rest = rest.subspan(clips.back().size());
  }
  return clips;
}

std::variant<std::span<const std::uint8_t>, FileProblem> Database::read(
    const DatabaseFile& file, std::vector<std::uint8_t>& buffer) const {
  std::error_code error;
  const auto content = folder_.read(file.name.text(), file.kind, buffer, error);
  if (!content) return problemOf(error);
  return *content;
}

std::string eyeText(const ClipFileName& name) { return name.eye ? eyeText(*name.eye) : "combined"; }

}  // namespace oxmv::cli
