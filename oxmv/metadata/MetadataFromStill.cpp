// Stands apart from the rest of the class, which needs no files.

#include "oxmv/import/CameraStill.h"
#include "oxmv/metadata/MetadataDictionary.h"

namespace oxmv {

std::optional<Dictionary> MetadataDictionary::metadataFromJPEGFile(
    const std::optional<std::filesystem::path>& path, std::string_view reelName,
    const CameraTables* tables) {
  if (!path) return std::nullopt;
  return tagsOfStillFile(*path, reelName, tables == nullptr ? CameraTables::builtIn() : *tables);
}

}  // namespace oxmv
