// A plug-in of somebody else that the library becomes part of.

#include <cstdint>
#include <filesystem>
#include <span>
#include <string>
#include <string_view>

#include "oxmv/looks/LookFileRef.h"
#include "oxmv/metadata/MetadataDictionary.h"

// The one name that it shows to the application that loads it: reads and writes whatever is there,
// so that all of the library is linked. Answers how many tags it has found.
extern "C" [[gnu::visibility("default")]] int tagsOfEverything(const char* still,
                                                               const char* look) {
  auto clip = oxmv::MetadataDictionary::initFromOverride();
  if (auto tags = oxmv::MetadataDictionary::metadataFromJPEGFile(still, "A001")) {
    clip.setMetadata(tags);
  }
  if (oxmv::LookFileRef::initFromLookFile(look)) clip.addObject(1, "TAKE");
  const bool isSaved = clip.writeToOverride();
  return isSaved ? static_cast<int>(clip.metadata().size()) : -1;
}
