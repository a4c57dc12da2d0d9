#include "oxmv/host/PreferencesFile.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <thread>
#include <utility>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "oxmv/platform/WholeFile.h"

namespace oxmv {
namespace {

namespace fs = std::filesystem;
using Bytes = std::vector<std::uint8_t>;

class PreferencesCategory final : public std::error_category {
 public:
  const char* name() const noexcept override { return "oxmv.preferences"; }
  std::string message(int code) const override {
    switch (PreferencesError{code}) {
      case PreferencesError::noPlace: return "There is no folder for preferences";
      case PreferencesError::notToml: return "The preferences file cannot be read as TOML";
      case PreferencesError::tooLarge: return "The preferences file is larger than 256 KiB";
      case PreferencesError::noForm: return "The value cannot be kept in a preferences file";
      case PreferencesError::busy: return "Another program keeps the preferences folder locked";
    }
    return "Unknown error";
  }
};
static_assert(maxPreferencesFileSize == std::size_t{256} * 1024, "the message names it");

std::error_code lastError() { return {errno, std::generic_category()}; }

std::string environment(const char* name) {
  const char* const value = std::getenv(name);
  return value != nullptr ? value : "";
}

// None when the identifier names no file.
std::optional<std::string> fileNameFor(std::string_view appID) {
  if (appID.empty() || appID.find('/') != appID.npos || appID.find('\0') != appID.npos)
    return std::nullopt;
  return std::string(appID) + ".toml";
}

// The bytes of the file; none, without an error, when there is no file.
std::optional<Bytes> readIfThere(const fs::path& path, std::error_code& error) {
  auto bytes = readFileStart(path, maxPreferencesFileSize + 1, error);
  const bool isAbsent =
      error == std::errc::no_such_file_or_directory || error == std::errc::not_a_directory;
  if (isAbsent) error.clear();
  if (bytes && bytes->size() > maxPreferencesFileSize) {
    error = PreferencesError::tooLarge;
    bytes.reset();
  }
  return bytes;
}

std::string textOf(const Bytes& bytes) { return {bytes.begin(), bytes.end()}; }

// A file before and after a change.
struct Edit {
  std::optional<Bytes> before;
  Bytes after;

  bool changesNothing() const { return before ? *before == after : after.empty(); }
};

std::optional<Edit> edit(const fs::path& path, const PreferencesChanges& changes,
                         std::error_code& error) {
  Edit result;
  result.before = readIfThere(path, error);
  if (error) return std::nullopt;
  auto text = TomlText::parse(result.before ? textOf(*result.before) : std::string());
  if (!text) return error = PreferencesError::notToml, std::nullopt;
  for (const auto& [key, value] : changes) {
    text = text->with(key, value);
    if (!text) return error = PreferencesError::noForm, std::nullopt;
  }
  result.after.assign(text->text().begin(), text->text().end());
  // What we would not read again must not be written.
  if (result.after.size() > maxPreferencesFileSize)
    return error = PreferencesError::tooLarge, std::nullopt;
  return result;
}

// A folder that is ours alone until this goes, as far as its file system can promise that.
class FolderLock {
 public:
  FolderLock(const fs::path& folder, std::chrono::milliseconds patience, std::error_code& error)
      : folder_(::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)) {
    error.clear();
    if (folder_ < 0) {
      if (errno != EACCES) error = lastError();  // may be written, not read: nothing to lock by
      return;
    }
    constexpr std::chrono::milliseconds pause{5};
    while (::flock(folder_, LOCK_EX | LOCK_NB) != 0) {
      if (errno == EINTR) continue;
      if (errno != EWOULDBLOCK) return;  // folders have no locks here
      if (patience <= std::chrono::milliseconds::zero()) {
        error = PreferencesError::busy;
        return;
      }
      std::this_thread::sleep_for(pause);
      patience -= pause;
    }
  }
  ~FolderLock() {
    if (folder_ >= 0) ::close(folder_);
  }
  FolderLock(const FolderLock&) = delete;
  FolderLock& operator=(const FolderLock&) = delete;

 private:
  int folder_;
};

bool makeFolder(const fs::path& folder, std::error_code& error) {
  error.clear();
  if (::mkdir(folder.c_str(), 0700) != 0 && errno != EEXIST) error = lastError();
  return !error;
}

}  // namespace

std::error_code make_error_code(PreferencesError error) noexcept {
  static const PreferencesCategory category;
  return {static_cast<int>(error), category};
}

std::optional<fs::path> userPreferencesPath(std::string_view appID) {
  const auto name = fileNameFor(appID);
  if (!name) return std::nullopt;
  const fs::path folder = environment("XDG_CONFIG_HOME");
  if (folder.is_absolute()) return folder / *name;
  const fs::path home = environment("HOME");
  if (home.is_absolute()) return home / ".config" / *name;
  return std::nullopt;
}

std::vector<fs::path> systemPreferencesPaths(std::string_view appID) {
  const auto name = fileNameFor(appID);
  if (!name) return {};
  std::string folders = environment("XDG_CONFIG_DIRS");
  if (folders.empty()) folders = "/etc/xdg";
  std::vector<fs::path> paths;
  for (std::size_t begin = 0; begin <= folders.size();) {
    const std::size_t end = std::min(folders.find(':', begin), folders.size());
    const fs::path folder = folders.substr(begin, end - begin);
    if (folder.is_absolute()) paths.push_back(folder / *name);
    begin = end + 1;
  }
  return paths;
}

PreferencesFile readPreferencesFile(const fs::path& path) {
  PreferencesFile file;
  file.path = path;
  const auto bytes = readIfThere(path, file.error);
  if (file.error) {
    file.state = PreferencesFile::State::unreadable;
  } else if (bytes) {
    const auto text = TomlText::parse(textOf(*bytes), &file.problem);
    file.state = text ? PreferencesFile::State::good : PreferencesFile::State::notToml;
    if (text) file.values = text->values();
  }
  return file;
}

bool updatePreferencesFile(const fs::path& path, const PreferencesChanges& changes,
                           std::error_code& error, std::chrono::milliseconds patience) {
  // Looked at first without making or locking anything: mostly nothing is to be done.
  const auto first = edit(path, changes, error);
  if (!first) return false;
  if (first->changesNothing()) return true;

  const fs::path folder = path.parent_path();
  if (!makeFolder(folder, error)) return false;
  const FolderLock lock(folder, patience, error);
  if (error) return false;
  constexpr int mostAttempts = 10;  // against programs that do not lock
  for (int attempt = 0; attempt < mostAttempts; ++attempt) {
    const auto next = edit(path, changes, error);
    if (!next) return false;
    if (next->changesNothing()) return true;
    if (replaceWholeFile(path, next->before, next->after, error)) return true;
    if (error != FileError::changed) return false;
  }
  return false;
}

}  // namespace oxmv
