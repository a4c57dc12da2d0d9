// The command as a host of the library.

#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "cli/Flags.h"
#include "cli/Messages.h"
#include "oxmv/host/LinuxHost.h"

namespace oxmv::cli {

// A folder that the user named for one run.
struct NamedFolder {
  std::string path;
  std::string_view source;  // "--db", "$OXMV_DB"
};

// The folder of the clip database, and of the look tables, if named by flag or environment; the
// flag counts more. An empty variable names nothing; an empty flag throws UsageError.
std::optional<NamedFolder> namedDatabase(const Arguments& arguments);
std::optional<NamedFolder> namedLooks(const Arguments& arguments);

// Like every host on this system, but for the folders that were named for this run, a string table
// that lets looks and clips meet in one place, log lines as notes, and alerts, which wait for the
// verb that caused them. On a dry run preferences are not set.
class CommandHost final : public Host {
 public:
  CommandHost(const Arguments& arguments, Messages& messages)
      : database_(namedDatabase(arguments)),
        looks_(namedLooks(arguments)),
        isDryRun_(arguments.has(Flag::dryRun)),
        messages_(messages) {}

  Value copyPreference(std::string_view key, std::string_view appID) override;
  void setPreference(std::string_view key, const Value& value, std::string_view appID) override;
  bool synchronizePreferences(std::string_view appID, std::error_code* error = nullptr) override;
  std::string localizedString(std::string_view key, std::string_view builtIn) override;
  void alert(std::string_view message) override;
  void log(std::string_view line) override;

  // From here on the look-table folder is this one.
  void setLooks(NamedFolder folder) { looks_ = std::move(folder); }

  // The alerts since this was called last.
  std::vector<std::string> takeAlerts();

 private:
  LinuxHost system_;
  std::optional<NamedFolder> database_;
  std::optional<NamedFolder> looks_;
  bool isDryRun_;
  Messages& messages_;
  std::vector<std::string> alerts_;
};

}  // namespace oxmv::cli
