// The host that answers where no other is installed.

#pragma once

#include <filesystem>
#include <map>
#include <mutex>
#include <string>
#include <string_view>
#include <system_error>

#include "oxmv/host/Host.h"

namespace oxmv {

// Preferences in TOML files, localised strings from the process's message catalogues, alerts and log
// lines on standard error.
class LinuxHost final : public Host {
 public:
  Value copyPreference(std::string_view key, std::string_view appID) override;
  void setPreference(std::string_view key, const Value& value, std::string_view appID) override;
  bool synchronizePreferences(std::string_view appID, std::error_code* error = nullptr) override;
  std::string localizedString(std::string_view key, std::string_view builtIn) override;
  void alert(std::string_view message) override;
  void log(std::string_view line) override;
};

}  // namespace oxmv
