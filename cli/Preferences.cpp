#include "cli/Preferences.h"

#include <string>

#include <fmt/format.h>

#include "oxmv/host/LinuxHost.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {

std::vector<PreferencesFile> preferencesFiles() {
  return LinuxHost::preferencesFiles(preferencesAppID);
}

StoredPreference storedPreference(std::string_view key) {
  for (const PreferencesFile& file : preferencesFiles()) {
    if (file.values.contains(key)) return {file.values[key], file.path};
  }
  return {};
}

bool isBad(const PreferencesFile& file) {
  return file.state == PreferencesFile::State::unreadable ||
         file.state == PreferencesFile::State::notToml;
}

std::string describeProblem(const PreferencesFile& file) {
  if (file.state == PreferencesFile::State::unreadable) return file.error.message();
  return fmt::format("line {}: {}", file.problem.line, visible(file.problem.message));
}

void sayBadPreferencesFiles(Call& call) {
  for (const PreferencesFile& file : preferencesFiles()) {
    if (!isBad(file)) continue;
    const bool isUnreadable = file.state == PreferencesFile::State::unreadable;
    call.messages.error(file.path.string(), describeProblem(file) + "; nothing in this file counts",
                        isUnreadable ? "unreadable" : "not-toml");
  }
}

}  // namespace oxmv::cli
