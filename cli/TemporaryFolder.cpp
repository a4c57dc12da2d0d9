#include "cli/TemporaryFolder.h"

#include <cerrno>
#include <cstdlib>
#include <string>

namespace oxmv::cli {

std::optional<TemporaryFolder> TemporaryFolder::make(std::error_code& error) {
  const std::filesystem::path parent = std::filesystem::temp_directory_path(error);
  if (error) return std::nullopt;
  std::string path = (parent / "oxmv-XXXXXX").string();
  if (::mkdtemp(path.data()) == nullptr) {
    error.assign(errno, std::generic_category());
    return std::nullopt;
  }
  return TemporaryFolder(path);
}

TemporaryFolder::~TemporaryFolder() {
  std::error_code ignored;  // what cannot be removed is left to the system
  if (!path_.empty()) std::filesystem::remove_all(path_, ignored);
}

}  // namespace oxmv::cli
