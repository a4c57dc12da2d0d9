#include <array>
#include <filesystem>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include <fmt/format.h>

#include "cli/ClipNames.h"
#include "cli/CommandHost.h"
#include "cli/Database.h"
#include "cli/ShownClips.h"
#include "cli/Verb.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/store/Locations.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

// The clip that the first word names.
ClipName clipOf(const Call& call) {
  const std::string& word = call.words.front();
  const ClipName name = clipNameFrom(word);
  if (name.isInDatabase()) return name;
  throw UsageError(
      "bad-guid",
      fmt::format("\"{}\" is no GUID; one is 8-4-4-4-12 hexadecimal digits", visible(word)));
}

// db show

// The files that the clip has. Of a clip that has none the combined file, which is missing.
std::vector<ClipName> filesOf(Call& call) {
  const ClipName clip = clipOf(call);
  if (clip.kind == ClipName::Kind::eye) return {clip};
  const auto database = Database::open(call);
  if (!database) return {};
  std::vector<ClipName> names;
  for (const DatabaseFile& file : database->files()) {
    if (file.name.guid != clip.guid) continue;
    names.push_back(file.name.eye ? eyeClipName(clip.guid, *file.name.eye)
                                  : combinedClipName(clip.guid));
  }
  if (names.empty()) names.push_back(clip);
  return names;
}

void runShow(Call& call) { showClips(call, filesOf); }

// db path

void runPath(Call& call) {
  ClipName clip = clipOf(call);
  if (call.arguments.has(Flag::eye)) {
    if (clip.kind == ClipName::Kind::eye)
      throw UsageError("bad-flags", "GUID/EYE and --eye do not go together");
    clip = eyeClipName(clip.guid, eyeFrom(call.arguments.value(Flag::eye), "--eye"));
  }
  call.output.write((StandardOutput::isTerminal() ? visible(clip.path) : clip.path) + '\n');
}

// db init

// Makes a folder and those above it, or says that it is there.
void makeFolder(Call& call, const std::string& path, std::string_view what) {
  std::error_code error;
  if (std::filesystem::is_directory(path, error))
    return call.messages.note(path, fmt::format("the {} is there", what));
  if (!call.arguments.has(Flag::dryRun)) {
    std::filesystem::create_directories(path, error);
    if (error) return call.messages.error(path, error.message(), "write-failed");
  }
  call.output.write(fmt::format("{}  {}\n", visible(path), call.style.faint(what)));
}

void runInit(Call& call) {
  makeFolder(call, databaseFolderPath(preferencesAppID), "clip database");
  // Who names a database for a run means that one, and not what all programs share.
  if (namedDatabase(call.arguments)) return;
  makeFolder(call, lookUp(overrideFolderSetting, call.host, preferencesAppID).value,
             "folder of the override file");
}

constexpr auto pathFlags = std::to_array({Flag::eye});
constexpr auto initFlags = std::to_array({Flag::dryRun});

}  // namespace

const Verb dbShowVerb = {
    .name = "db show",
    .words = "GUID",
    .summary = "show the tags of all files of a clip",
    .examples =
        "oxmv db show 0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F\n"
        "oxmv db show --ndjson 0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F\n",
    .details =
        "The combined file and those of the eyes, as far as they are there, each as oxmv show\n"
        "shows it.\n",
    .flags = showFlags,
    .fewestWords = 1,
    .mostWords = 1,
    .run = runShow,
};

const Verb dbPathVerb = {
    .name = "db path",
    .words = "GUID",
    .summary = "print where a file of a clip is",
    .examples =
        "oxmv db path 0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F\n"
        "oxmv db path 0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F --eye right\n",
    .details = "Of the combined file, or with --eye of an eye's; whether it is there or not.\n",
    .flags = pathFlags,
    .fewestWords = 1,
    .mostWords = 1,
    .run = runPath,
};

const Verb dbInitVerb = {
    .name = "db init",
    .words = "",
    .summary = "make the folders of the database",
    .examples =
        "oxmv db init\n"
        "oxmv db init --db clips\n"
        "oxmv db init --dry-run\n",
    .details =
        "Hosts make no folders: without them nothing can be saved. Makes the folder of the\n"
        "clip database and that of the override file, and says which were not there. With --db\n"
        "or OXMV_DB only that database.\n",
    .flags = initFlags,
    .fewestWords = 0,
    .mostWords = 0,
    .run = runInit,
};

}  // namespace oxmv::cli
