// A folder for one run, gone with it.

#pragma once

#include <filesystem>
#include <optional>
#include <system_error>
#include <utility>

namespace oxmv::cli {

class TemporaryFolder {
 public:
  // Nobody else may look into it. Nothing, with the cause in `error`, when it cannot be made.
  static std::optional<TemporaryFolder> make(std::error_code& error);

  TemporaryFolder(TemporaryFolder&& other) noexcept : path_(std::exchange(other.path_, {})) {}
  TemporaryFolder& operator=(TemporaryFolder&& other) noexcept {
    std::swap(path_, other.path_);
    return *this;
  }
  ~TemporaryFolder();

  const std::filesystem::path& path() const { return path_; }

 private:
  explicit TemporaryFolder(std::filesystem::path path) : path_(std::move(path)) {}

  std::filesystem::path path_;
};

}  // namespace oxmv::cli
