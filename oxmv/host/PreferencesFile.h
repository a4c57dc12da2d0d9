// Where the preferences of an application lie, and how they get there. One file for an identifier,
// in TOML:
//
//   $XDG_CONFIG_HOME/com.ombrix.oxmv.toml      the user's; ~/.config where that is not set
//   /etc/xdg/com.ombrix.oxmv.toml              the system's, in each of $XDG_CONFIG_DIRS
//
//   # our looks live on the server
//   LUTsPath = "/mnt/looks"
//   OverridePath = "/Library/Application Support/Ombrix"
//
// The environment is read at every call, by the rules of the XDG base directories: unset and empty
// are the same, folders that are not absolute are ignored.

#pragma once

#include <chrono>
#include <cstddef>
#include <filesystem>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "oxmv/platform/TomlText.h"
#include "oxmv/values/Dictionary.h"

namespace oxmv {

// The largest file that is read. Preferences are some lines; the parser's time grows with the
// square of what a hostile file has of them.
constexpr std::size_t maxPreferencesFileSize = std::size_t{256} << 10;

// Why preferences are not read or kept. Everything else comes as the system's own error, or as one
// of FileError.
enum class PreferencesError {
  noPlace = 1,  // no folder for them is known, or the identifier names no file
  notToml,      // the file there is no TOML: it stays as it is
  tooLarge,     // or has more than maxPreferencesFileSize: likewise
  noForm,       // a value that TOML has no form for
  busy,         // another program has held the folder's lock all the time
};
std::error_code make_error_code(PreferencesError error) noexcept;

// One file, as it is now.
struct PreferencesFile {
  enum class State {
    absent,
    unreadable,  // for the reason in `error`
    notToml,     // for the reason in `problem`
    good         // `values` are what it says
  };

  std::filesystem::path path;
  State state = State::absent;
  std::error_code error;
  TomlProblem problem;
  Dictionary values;
};

// The user's file for an identifier. None when neither XDG_CONFIG_HOME nor HOME names a folder, or
// when the identifier is empty or has a '/' or a NUL in it.
std::optional<std::filesystem::path> userPreferencesPath(std::string_view appID);

// The files of all users, in the order in which they are looked at after the user's own.
std::vector<std::filesystem::path> systemPreferencesPaths(std::string_view appID);

PreferencesFile readPreferencesFile(const std::filesystem::path& path);

// New values by key; nothing removes the key.
using PreferencesChanges = std::map<std::string, Value, std::less<>>;

// Makes the changes in a file, all or none, and no others: see TomlText::with(). A file is made
// when there is none, its folder too (for the user alone), but not the folders above. Changes that
// are made already touch nothing. A file that cannot be read, or not as TOML, stays as it is.
//
// Programs that do this at the same time lose nothing of each other's. They lock the folder, by
// which no file is left behind and no lock outlives its program, and wait for each other up to
// `patience`; where folders cannot be locked (NFS), and against those who do not, a file that has
// changed since it was read is read again. Answers false with the cause in `error` when it fails.
[[nodiscard]] bool updatePreferencesFile(
    const std::filesystem::path& path, const PreferencesChanges& changes, std::error_code& error,
    std::chrono::milliseconds patience = std::chrono::seconds(5));

}  // namespace oxmv

template <>
struct std::is_error_code_enum<oxmv::PreferencesError> : std::true_type {};
