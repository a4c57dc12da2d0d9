#include "cli/CommandHost.h"

#include <cstdlib>
#include <utility>

#include <fmt/format.h>

#include "oxmv/store/Locations.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

std::optional<NamedFolder> namedFolder(const Arguments& arguments, Flag flag, const char* variable,
                                       std::string_view source) {
  if (arguments.has(flag)) {
    const std::string path = arguments.value(flag);
    if (path.empty())
      throw UsageError("bad-value", fmt::format("{} needs the name of a folder", rowOf(flag).name));
    return NamedFolder{path, rowOf(flag).name};
  }
  const char* const path = std::getenv(variable);
  if (path == nullptr || *path == '\0') return std::nullopt;
  return NamedFolder{path, source};
}

// A folder as its parent and its name in there, which is how the library puts the path of the
// database together.
std::pair<std::string, std::string> split(std::string path) {
  while (path.size() > 1 && path.ends_with('/')) path.pop_back();
  const std::size_t slash = path.rfind('/');
  if (slash == std::string::npos) return {".", path};
  return {path.substr(0, slash), path.substr(slash + 1)};
}

}  // namespace

std::optional<NamedFolder> namedDatabase(const Arguments& arguments) {
  return namedFolder(arguments, Flag::db, "OXMV_DB", "$OXMV_DB");
}

std::optional<NamedFolder> namedLooks(const Arguments& arguments) {
  return namedFolder(arguments, Flag::looks, "OXMV_LOOKS", "$OXMV_LOOKS");
}

Value CommandHost::copyPreference(std::string_view key, std::string_view appID) {
  if (database_ && key == lutsFolderSetting.preference) return split(database_->path).first;
  if (database_ && key == databaseFolderSetting.preference) return split(database_->path).second;
  Value value = system_.copyPreference(key, appID);
  // The folder of the look tables alone was named: the clips stay where they are.
  if (looks_ && key == lutsFolderSetting.preference && !value.isText())
    return lutsFolderSetting.builtIn;
  return value;
}

void CommandHost::setPreference(std::string_view key, const Value& value, std::string_view appID) {
  if (!isDryRun_) system_.setPreference(key, value, appID);
}

bool CommandHost::synchronizePreferences(std::string_view appID, std::error_code* error) {
  return isDryRun_ || system_.synchronizePreferences(appID, error);
}

std::string CommandHost::localizedString(std::string_view key, std::string_view builtIn) {
  if (key == lutsFolderSetting.string)
    return looks_ ? looks_->path : std::string(lutsFolderSetting.builtIn);
  return std::string(builtIn);
}

void CommandHost::alert(std::string_view message) { alerts_.emplace_back(message); }

void CommandHost::log(std::string_view line) { messages_.note({}, visible(line)); }

std::vector<std::string> CommandHost::takeAlerts() { return std::exchange(alerts_, {}); }

}  // namespace oxmv::cli
