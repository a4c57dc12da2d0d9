#include "oxmv/host/LinuxHost.h"

#include <optional>

#include <libintl.h>

#include "oxmv/host/StandardError.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

namespace fs = std::filesystem;

// As it stands in a file, which is UTF-8.
std::string textOfKey(std::string_view key) {
  return isUtf8(key) ? std::string(key) : utf8FromLatin1(key);
}

std::vector<fs::path> allPreferencesPaths(std::string_view appID) {
  std::vector<fs::path> paths = systemPreferencesPaths(appID);
  if (auto path = userPreferencesPath(appID)) paths.insert(paths.begin(), std::move(*path));
  return paths;
}

}  // namespace

LinuxHost::FoundPreference LinuxHost::findPreference(std::string_view key, std::string_view appID) {
  const std::string name = textOfKey(key);
  const PreferencesChanges pending = pendingOf(appID);
  const auto change = pending.find(name);
  const bool isRemoved = change != pending.end() && change->second.isNothing();
  if (change != pending.end() && !isRemoved) return {change->second, {}};

  const auto users = userPreferencesPath(appID);
  for (const fs::path& path : allPreferencesPaths(appID)) {
    if (isRemoved && path == users) continue;
    const PreferencesFile file = readPreferencesFile(path);
    if (file.values.contains(name)) return {file.values[name], path};
  }
  return {};
}

Value LinuxHost::copyPreference(std::string_view key, std::string_view appID) {
  return findPreference(key, appID).value;
}

std::vector<PreferencesFile> LinuxHost::preferencesFiles(std::string_view appID) {
  std::vector<PreferencesFile> files;
  for (const fs::path& path : allPreferencesPaths(appID))
    files.push_back(readPreferencesFile(path));
  return files;
}

void LinuxHost::setPreference(std::string_view key, const Value& value, std::string_view appID) {
  const std::scoped_lock lock(guard_);
  pending_[std::string(appID)].insert_or_assign(textOfKey(key), value);
}

bool LinuxHost::synchronizePreferences(std::string_view appID, std::error_code* error) {
  // One after the other: else a thread that has taken its changes early could write them late, over
  // newer ones of another.
  const std::scoped_lock lock(synchronizing_);
  std::error_code failure;
  const PreferencesChanges changes = pendingOf(appID);
  if (!changes.empty()) {
    if (const auto path = userPreferencesPath(appID)) {
      if (updatePreferencesFile(*path, changes, failure)) forget(changes, appID);
    } else {
      failure = PreferencesError::noPlace;
    }
  }
  if (error != nullptr) *error = failure;
  return !failure;
}

std::string LinuxHost::localizedString(std::string_view key, std::string_view builtIn) {
  // The empty key would give the catalogue's own header; a NUL would cut a key to another one.
  if (key.empty() || key.find('\0') != key.npos) return std::string(builtIn);
  const std::string name(key);
  const char* const text = ::gettext(name.c_str());
  // No entry: gettext gives back the very key that it was given.
  return std::string(text == name.c_str() ? builtIn : std::string_view(text));
}

void LinuxHost::alert(std::string_view message) { writeToStandardError(message); }

void LinuxHost::log(std::string_view line) { writeToStandardError(line); }

PreferencesChanges LinuxHost::pendingOf(std::string_view appID) {
  const std::scoped_lock lock(guard_);
  const auto found = pending_.find(appID);
  return found == pending_.end() ? PreferencesChanges() : found->second;
}

// Of what was written, forgets what has not been set to something else meanwhile.
void LinuxHost::forget(const PreferencesChanges& written, std::string_view appID) {
  const std::scoped_lock lock(guard_);
  const auto found = pending_.find(appID);
  if (found == pending_.end()) return;
  for (const auto& [key, value] : written) {
    const auto change = found->second.find(key);
    if (change != found->second.end() && change->second == value) found->second.erase(change);
  }
  if (found->second.empty()) pending_.erase(found);
}

}  // namespace oxmv
