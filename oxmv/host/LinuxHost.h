// The host that answers where no other is installed.

#pragma once

#include <filesystem>
#include <map>
#include <mutex>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "oxmv/host/Host.h"
#include "oxmv/host/PreferencesFile.h"

namespace oxmv {

// Preferences in TOML files, localised strings from the process's message catalogues, alerts and
// log lines on standard error. Any threads may use it.
class LinuxHost final : public Host {
 public:
  // A preference, and the file that it was found in; no file when it was set here and is not
  // synchronised yet. Nothing when there is none.
  struct FoundPreference {
    Value value;
    std::filesystem::path file;
  };

  // A value that was set here and is not synchronised yet comes first. Then the user's file and
  // those of the system, each read afresh: the first that has the key counts, whatever it has
  // there. A file that cannot be read, or not as TOML, counts as one that has nothing. See TomlText
  // for what becomes of booleans and dates.
  FoundPreference findPreference(std::string_view key, std::string_view appID);
  Value copyPreference(std::string_view key, std::string_view appID) override;

  // Every file in which preferences are looked for, in that order, as it is now. The first is the
  // user's, and the one that is written, if userPreferencesPath() names it.
  static std::vector<PreferencesFile> preferencesFiles(std::string_view appID);

  // Kept until it is synchronised. Removed is what the user has set; what the system says shows
  // again. A key that is not valid UTF-8 is taken as ISO-8859-1.
  void setPreference(std::string_view key, const Value& value, std::string_view appID) override;

  // Writes what was set to the user's file, all of it or nothing: see updatePreferencesFile(). What
  // could not be written is still to be synchronised.
  bool synchronizePreferences(std::string_view appID, std::error_code* error = nullptr) override;

  // The message of that name in the text domain that the process has chosen (gettext). Its bytes
  // are passed on as they are: path templates go to the file system.
  std::string localizedString(std::string_view key, std::string_view builtIn) override;

  // One line each on standard error, without title or button.
  void alert(std::string_view message) override;
  void log(std::string_view line) override;

 private:
  PreferencesChanges pendingOf(std::string_view appID);
  void forget(const PreferencesChanges& written, std::string_view appID);

  std::mutex synchronizing_;  // held from before the changes are taken until they are written
  std::mutex guard_;          // of pending_; never held while anything waits
  std::map<std::string, PreferencesChanges, std::less<>> pending_;  // by application identifier
};

}  // namespace oxmv
