#include <algorithm>
#include <array>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include <fmt/format.h>

#include "cli/CommandHost.h"
#include "cli/JsonResults.h"
#include "cli/Preferences.h"
#include "cli/Verb.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/store/Locations.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

struct Place {
  std::string_view what;
  std::string path;
  std::string source;  // "preference LUTsPath, built-in"
  std::string state;   // "there", "missing", or what is wrong with it; empty for a template
};

std::string stateOf(const std::string& path, std::filesystem::file_type good) {
  using Type = std::filesystem::file_type;
  std::error_code error;
  const Type type = std::filesystem::status(path, error).type();
  if (type == good) return "there";
  if (type == Type::not_found) return "missing";
  if (type == Type::none) return error.message();
  return good == Type::directory ? "not a folder" : "not a file";
}

Place folder(std::string_view what, std::string path, std::string source) {
  std::string state = stateOf(path, std::filesystem::file_type::directory);
  return {what, std::move(path), std::move(source), std::move(state)};
}

Place file(std::string_view what, std::string path, std::string source) {
  std::string state = stateOf(path, std::filesystem::file_type::regular);
  return {what, std::move(path), std::move(source), std::move(state)};
}

std::string inWords(SettingSource source, const SettingRow& row) {
  switch (source) {
    case SettingSource::preference: return fmt::format("preference {}", row.preference);
    case SettingSource::localizedString: return fmt::format("localized string {}", row.string);
    case SettingSource::builtIn: return "built-in";
  }
  return {};
}

std::string sourceOf(const SettingRow& row) {
  const bool isPreference =
      !row.preference.empty() && storedPreference(row.preference).value.isText();
  return inWords(isPreference ? SettingSource::preference : SettingSource::builtIn, row);
}

std::string sourceOfDatabase(const Arguments& arguments) {
  if (const auto named = namedDatabase(arguments)) return std::string(named->source);
  const std::string root = sourceOf(lutsFolderSetting);
  const std::string name = sourceOf(databaseFolderSetting);
  return root == name ? root : fmt::format("{}, {}", root, name);
}

// The paths of clips: their templates, filled in as far as they are the same for all clips.
std::string templatePath(const std::string& path) {
  const std::string zeros = guidText({});
  std::string shown = path;
  if (const std::size_t at = shown.rfind(zeros); at != std::string::npos)
    shown.replace(at, zeros.size(), "GUID");
  return shown;
}

std::string eyeTemplatePath() {
  std::string path = templatePath(eyeFilePath({}, 0, preferencesAppID));
  if (path.ends_with(".col1")) path.back() = 'N';
  return path;
}

std::string sourceOfTemplate(Call& call, const SettingRow& row) {
  return inWords(lookUp(row, call.host, preferencesAppID).source, row);
}

// Kept on purpose: other hosts have a text of their own for the folder of the look tables; what is
// built in for them all is the command's own string.
Place lookFolder(Call& call) {
  const SettingRow& row = lutsFolderSetting;
  const auto named = namedLooks(call.arguments);
  return folder("look tables", call.host.localizedString(row.string, row.builtIn),
                named ? std::string(named->source) : inWords(SettingSource::localizedString, row));
}

std::vector<Place> places(Call& call) {
  const std::string overrideFolder =
      lookUp(overrideFolderSetting, call.host, preferencesAppID).value;
  const std::string overrideSource = sourceOf(overrideFolderSetting);
  std::vector<Place> all;
  all.push_back(folder("clip database", databaseFolderPath(preferencesAppID),
                       sourceOfDatabase(call.arguments)));
  all.push_back({"combined clips",
                 templatePath(clipFilePath({}, preferencesAppID)),
                 sourceOfTemplate(call, clipTemplateSetting),
                 {}});
  all.push_back(
      {"clips of an eye", eyeTemplatePath(), sourceOfTemplate(call, eyeTemplateSetting), {}});
  all.push_back(file("override file", overrideFilePathIn(overrideFolder), overrideSource));
  all.push_back(file("last file", lastFilePathIn(overrideFolder), overrideSource));
  all.push_back(lookFolder(call));
  const auto users = userPreferencesPath(preferencesAppID);
  for (const PreferencesFile& one : preferencesFiles()) {
    const bool isUsers = users && one.path == *users;
    const bool isAbsent = one.state == PreferencesFile::State::absent;
    all.push_back({"preferences", one.path.string(), isUsers ? "of the user" : "of the system",
                   isBad(one) ? describeProblem(one)
                   : isAbsent ? "missing"
                              : "there"});
  }
  return all;
}

void writeTable(Call& call, const std::vector<Place>& all) {
  std::size_t widths[] = {4, 5, 5};
  for (const Place& place : all) {
    widths[0] = std::max(widths[0], place.what.size());
    widths[1] = std::max(widths[1], columns(visible(place.path)));
    widths[2] = std::max(widths[2], columns(visible(place.source)));
  }
  const auto line = [&](std::string_view what, std::string_view path, std::string_view source,
                        std::string_view state) {
    std::string text(what);
    text.append(widths[0] - what.size(), ' ').append("  ");
    text.append(path).append(widths[1] - columns(path), ' ').append("  ");
    text.append(source).append(widths[2] - columns(source), ' ').append("  ");
    text.append(state);
    text.resize(text.find_last_not_of(' ') + 1);
    return text;
  };
  call.output.write(call.style.faint(line("WHAT", "WHERE", "FROM", "STATE")) + '\n');
  for (const Place& place : all)
    call.output.write(line(place.what, visible(place.path), visible(place.source), place.state) +
                      '\n');
}

void writeJson(Call& call, const std::vector<Place>& all) {
  JsonResults results(call);
  for (const Place& place : all) {
    results.add([&](JsonWriter& json) {
      beginResult(json, "oxmv.paths/1", place.path);
      json.member("what", place.what);
      json.member("source", place.source);
      json.member("state", place.state.empty() ? std::nullopt
                                               : std::optional<std::string_view>(place.state));
      endResult(json, nullptr);
    });
  }
  results.finish();
}

void run(Call& call) {
  const std::vector<Place> all = places(call);
  wantsJson(call) ? writeJson(call, all) : writeTable(call, all);
}

constexpr auto flags = std::to_array({Flag::json, Flag::ndjson});

}  // namespace

const Verb pathsVerb = {
    .name = "paths",
    .words = "",
    .summary = "show every place that is used, and where each comes from",
    .examples =
        "oxmv paths\n"
        "oxmv paths --json\n"
        "oxmv paths --db /mnt/clips\n",
    .details =
        "Looks only: neither folders nor preferences are made. FROM is a preference, a\n"
        "localized string, what is built in, or the flag or variable that names a folder for\n"
        "this run. STATE is there, missing, or what is wrong.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = 0,
    .run = run,
};

}  // namespace oxmv::cli
