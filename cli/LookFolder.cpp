#include "cli/LookFolder.h"

#include <filesystem>
#include <system_error>

namespace oxmv::cli {

std::optional<FileProblem> problemOfLookFolder(const std::string& folder) {
  std::error_code error;
  if (std::filesystem::is_directory(folder, error)) return std::nullopt;
  if (std::filesystem::exists(folder, error)) return FileProblem{"not-a-folder", "is no folder"};
  return FileProblem{"missing", "there is no such look-table folder; oxmv look init makes it"};
}

}  // namespace oxmv::cli
