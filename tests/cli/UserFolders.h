// The folders of a user of the command, for one test: preferences, and whatever they name.

#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

#include "tests/cli/CommandRunner.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {

class UserFolders {
 public:
  UserFolders() {}  // so that one may be const without an initialiser

  std::filesystem::path root() const { return root_.path(); }
  // The user's preferences file, and the one for all users.
  std::filesystem::path preferences() const { return root_ / "user/com.ombrix.oxmv.toml"; }
  std::filesystem::path systemPreferences() const { return root_ / "system/com.ombrix.oxmv.toml"; }

  void setPreferences(std::string_view toml) const { put(preferences(), toml); }
  void setSystemPreferences(std::string_view toml) const { put(systemPreferences(), toml); }

  // The command as this user.
  Outcome run(const std::vector<std::string>& arguments, std::string_view input = {}) const {
    return runWith({"XDG_CONFIG_HOME=" + (root_ / "user").string(),
                    "XDG_CONFIG_DIRS=" + (root_ / "system").string()},
                   arguments, input);
  }

 private:
  static void put(const std::filesystem::path& path, std::string_view toml) {
    std::filesystem::create_directories(path.parent_path());
    writeFile(path, toml);
  }

  oxmv::test::TempDir root_;
};

}  // namespace oxmv::cli::test
